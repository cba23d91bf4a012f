// The records and exports of the WCX packer-plug-in interface.
#pragma once

#if defined(_WIN32) && !defined(_WIN64)
#define WCX_API __stdcall
#else
#define WCX_API
#endif

#if defined(_WIN32)
// The .def files name the exports, undecorated.
#define WCX_EXPORT extern "C"
#else
#define WCX_EXPORT extern "C" __attribute__((visibility("default")))
#endif

// The open record, with the archive's path in 8-bit or (Windows' wide entry
// points) 16-bit characters.
template <typename Char>
struct tOpenArchiveDataOf {
  Char* ArcName;
  int OpenMode;
  int OpenResult;
  Char* CmtBuf;
  int CmtBufSize;
  int CmtSize;
  int CmtState;
};
using tOpenArchiveData = tOpenArchiveDataOf<char>;

struct tHeaderData {
  char ArcName[260];
  char FileName[260];
  int Flags;
  int PackSize;
  int UnpSize;
  int HostOS;
  int FileCRC;
  int FileTime;
  int UnpVer;
  int Method;
  int FileAttr;
  char* CmtBuf;
  int CmtBufSize;
  int CmtSize;
  int CmtState;
};

#ifdef _WIN32
using tOpenArchiveDataW = tOpenArchiveDataOf<wchar_t>;

// The extended header records: 1024-character names and 64-bit sizes.
template <typename Char>
struct tHeaderDataExOf {
  Char ArcName[1024];
  Char FileName[1024];
  int Flags;
  unsigned int PackSize;
  unsigned int PackSizeHigh;
  unsigned int UnpSize;
  unsigned int UnpSizeHigh;
  int HostOS;
  int FileCRC;
  int FileTime;
  int UnpVer;
  int Method;
  int FileAttr;
  char* CmtBuf;
  int CmtBufSize;
  int CmtSize;
  int CmtState;
  char Reserved[1024];
};
using tHeaderDataEx = tHeaderDataExOf<char>;
using tHeaderDataExW = tHeaderDataExOf<wchar_t>;
#endif

typedef int(WCX_API* tProcessDataProc)(char* FileName, int Size);
typedef int(WCX_API* tChangeVolProc)(char* ArcName, int Mode);

enum { PK_SKIP = 0, PK_TEST = 1, PK_EXTRACT = 2 };
enum { PK_CAPS_MULTIPLE = 4, PK_CAPS_BY_CONTENT = 64 };
enum { BACKGROUND_UNPACK = 1 };

WCX_EXPORT void* WCX_API OpenArchive(tOpenArchiveData* ArchiveData);
WCX_EXPORT int WCX_API ReadHeader(void* hArcData, tHeaderData* HeaderData);
WCX_EXPORT int WCX_API ProcessFile(void* hArcData, int Operation, char* DestPath, char* DestName);
WCX_EXPORT int WCX_API CloseArchive(void* hArcData);
WCX_EXPORT void WCX_API SetChangeVolProc(void* hArcData, tChangeVolProc pChangeVolProc);
WCX_EXPORT void WCX_API SetProcessDataProc(void* hArcData, tProcessDataProc pProcessDataProc);
WCX_EXPORT int WCX_API CanYouHandleThisFile(char* FileName);
WCX_EXPORT int WCX_API GetPackerCaps(void);
WCX_EXPORT int WCX_API GetBackgroundFlags(void);

#ifdef _WIN32
WCX_EXPORT void* WCX_API OpenArchiveW(tOpenArchiveDataW* ArchiveData);
WCX_EXPORT int WCX_API ReadHeaderEx(void* hArcData, tHeaderDataEx* HeaderData);
WCX_EXPORT int WCX_API ReadHeaderExW(void* hArcData, tHeaderDataExW* HeaderData);
WCX_EXPORT int WCX_API ProcessFileW(void* hArcData, int Operation, wchar_t* DestPath,
                                    wchar_t* DestName);
WCX_EXPORT int WCX_API CanYouHandleThisFileW(wchar_t* FileName);
#endif
