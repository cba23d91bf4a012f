// A minimal WCX host: loads a packer plug-in as a file manager does, lists
// archives and extracts every entry, and prints what it saw in one form on
// Linux and Windows, so that two builds of the plug-in can be compared.
//
//   wcx_host [--ansi] [--unwritable] PLUGIN OUTROOT ARCHIVE...
//
// For archive k it prints "archive k open R", then per entry
// "entry NAME PACK UNP DOSTIME", "result R progress CALLS BYTES", and writes
// the entry to OUTROOT/k/INDEX. Names are printed with '\' between parts and
// FileTime as a DOS date and time. Windows hosts use the wide entry points
// when the plug-in has them, unless --ansi; --unwritable sends the first
// entry of each archive to a folder that does not exist.
#include <cstdint>
#include <cstdio>
#include <ctime>
#include <string>
#include <vector>

#ifdef _WIN32
#include <windows.h>
#define HOST_API __stdcall
#else
#include <dlfcn.h>
#define HOST_API
#endif

namespace {

struct OpenData {
  char* ArcName;
  int OpenMode, OpenResult;
  char* CmtBuf;
  int CmtBufSize, CmtSize, CmtState;
};
struct Header {
  char ArcName[260], FileName[260];
  int Flags, PackSize, UnpSize, HostOS, FileCRC, FileTime, UnpVer, Method, FileAttr;
  char* CmtBuf;
  int CmtBufSize, CmtSize, CmtState;
};

using ProgressProc = int(HOST_API*)(char*, int);
using OpenFn = void*(HOST_API*)(OpenData*);
using ReadFn = int(HOST_API*)(void*, Header*);
using ProcessFn = int(HOST_API*)(void*, int, char*, char*);
using CloseFn = int(HOST_API*)(void*);
using SetProgressFn = void(HOST_API*)(void*, ProgressProc);

#ifdef _WIN32
struct OpenDataW {
  wchar_t* ArcName;
  int OpenMode, OpenResult;
  wchar_t* CmtBuf;
  int CmtBufSize, CmtSize, CmtState;
};
struct HeaderExW {
  wchar_t ArcName[1024], FileName[1024];
  int Flags;
  unsigned PackSize, PackSizeHigh, UnpSize, UnpSizeHigh;
  int HostOS, FileCRC, FileTime, UnpVer, Method, FileAttr;
  char* CmtBuf;
  int CmtBufSize, CmtSize, CmtState;
  char Reserved[1024];
};
using OpenWFn = void*(HOST_API*)(OpenDataW*);
using ReadExWFn = int(HOST_API*)(void*, HeaderExW*);
using ProcessWFn = int(HOST_API*)(void*, int, wchar_t*, wchar_t*);
using ProgressProcW = int(HOST_API*)(wchar_t*, int);
#endif

long g_calls = 0;
long long g_bytes = 0;

int HOST_API Progress(char*, int size) {
  ++g_calls;
  g_bytes += size;
  return 1;
}

#ifdef _WIN32
using Text = std::wstring;
#define T(s) L##s
void* Symbol(void* lib, const char* name) {
  return reinterpret_cast<void*>(GetProcAddress(static_cast<HMODULE>(lib), name));
}
std::string Utf8(const std::wstring& w) {
  const int n = WideCharToMultiByte(CP_UTF8, 0, w.c_str(), -1, nullptr, 0, nullptr, nullptr);
  std::string s(n > 0 ? n - 1 : 0, '\0');
  WideCharToMultiByte(CP_UTF8, 0, w.c_str(), -1, s.data(), n, nullptr, nullptr);
  return s;
}
std::string Ansi(const std::wstring& w) {
  const int n = WideCharToMultiByte(CP_ACP, 0, w.c_str(), -1, nullptr, 0, nullptr, nullptr);
  std::string s(n > 0 ? n - 1 : 0, '\0');
  WideCharToMultiByte(CP_ACP, 0, w.c_str(), -1, s.data(), n, nullptr, nullptr);
  return s;
}
void MakeDir(const Text& p) {
  CreateDirectoryW(p.c_str(), nullptr);
}
uint32_t DosTime(int fileTime) {
  return static_cast<uint32_t>(fileTime);
}
#else
using Text = std::string;
#define T(s) s
void* Symbol(void* lib, const char* name) {
  return dlsym(lib, name);
}
std::string Utf8(const std::string& s) {
  return s;
}
std::string Ansi(const std::string& s) {
  return s;
}
void MakeDir(const Text& p) {
  std::system(("mkdir -p '" + p + "'").c_str());
}
// The Linux plug-in reports Unix seconds; show them as the DOS time a
// Windows host would get.
uint32_t DosTime(int fileTime) {
  const time_t t = static_cast<time_t>(static_cast<uint32_t>(fileTime));
  tm l{};
  localtime_r(&t, &l);
  return static_cast<uint32_t>((l.tm_year - 80) << 25 | (l.tm_mon + 1) << 21 | l.tm_mday << 16 |
                               l.tm_hour << 11 | l.tm_min << 5 | l.tm_sec / 2);
}
#endif

Text Digits(size_t n) {
  Text t;
  do {
    t.insert(t.begin(), static_cast<Text::value_type>(T('0') + n % 10));
    n /= 10;
  } while (n != 0);
  return t;
}

std::string Backslashes(std::string s) {
  for (char& c : s)
    if (c == '/') c = '\\';
  return s;
}

int Run(const std::vector<Text>& args) {
  bool ansi = false, unwritable = false;
  size_t i = 1;
  for (; i < args.size() && args[i].rfind(T("--"), 0) == 0; ++i) {
    if (args[i] == T("--ansi")) ansi = true;
    if (args[i] == T("--unwritable")) unwritable = true;
  }
  if (args.size() < i + 2) {
    std::fprintf(stderr, "usage: wcx_host [--ansi] [--unwritable] PLUGIN OUTROOT ARCHIVE...\n");
    return 2;
  }
#ifdef _WIN32
  void* lib = LoadLibraryW(args[i].c_str());
#else
  void* lib = dlopen(args[i].c_str(), RTLD_NOW);
#endif
  if (lib == nullptr) {
    std::fprintf(stderr, "cannot load %s\n", Utf8(args[i]).c_str());
    return 2;
  }
  auto caps = reinterpret_cast<int(HOST_API*)()>(Symbol(lib, "GetPackerCaps"));
  auto open = reinterpret_cast<OpenFn>(Symbol(lib, "OpenArchive"));
  auto read = reinterpret_cast<ReadFn>(Symbol(lib, "ReadHeader"));
  auto process = reinterpret_cast<ProcessFn>(Symbol(lib, "ProcessFile"));
  auto close = reinterpret_cast<CloseFn>(Symbol(lib, "CloseArchive"));
  auto setProgress = reinterpret_cast<SetProgressFn>(Symbol(lib, "SetProcessDataProc"));
  if (!caps || !open || !read || !process || !close || !setProgress) {
    std::fprintf(stderr, "missing exports\n");
    return 2;
  }
#ifdef _WIN32
  auto openW = reinterpret_cast<OpenWFn>(Symbol(lib, "OpenArchiveW"));
  auto readW = reinterpret_cast<ReadExWFn>(Symbol(lib, "ReadHeaderExW"));
  auto processW = reinterpret_cast<ProcessWFn>(Symbol(lib, "ProcessFileW"));
  const bool wide = !ansi && openW && readW && processW;
#else
  const bool wide = false;
#endif
  std::printf("caps %d\n", caps());
  const Text root = args[i + 1];
  for (size_t k = i + 2; k < args.size(); ++k) {
    const size_t n = k - i - 2;
    const Text outDir = root + T("/") + Digits(n);
    MakeDir(root);
    MakeDir(outDir);
    void* h = nullptr;
    int openResult = 0;
    std::string ansiPath = Ansi(args[k]);
#ifdef _WIN32
    Text arcW = args[k];
    if (wide) {
      OpenDataW od{};
      od.ArcName = arcW.data();
      h = openW(&od);
      openResult = od.OpenResult;
    } else
#endif
    {
      OpenData od{};
      od.ArcName = ansiPath.data();
      h = open(&od);
      openResult = od.OpenResult;
    }
    std::printf("archive %zu open %d\n", n, h ? 0 : openResult);
    if (h == nullptr) continue;
    setProgress(h, Progress);
    for (int e = 0; e < 100000; ++e) {
      std::string name;
      long long pack = 0, unp = 0;
      int fileTime = 0, r = 0;
#ifdef _WIN32
      if (wide) {
        HeaderExW hd{};
        r = readW(h, &hd);
        name = Utf8(hd.FileName);
        pack = static_cast<long long>(hd.PackSizeHigh) << 32 | hd.PackSize;
        unp = static_cast<long long>(hd.UnpSizeHigh) << 32 | hd.UnpSize;
        fileTime = hd.FileTime;
      } else
#endif
      {
        Header hd{};
        r = read(h, &hd);
        name = hd.FileName;
        pack = static_cast<unsigned>(hd.PackSize);
        unp = static_cast<unsigned>(hd.UnpSize);
        fileTime = hd.FileTime;
      }
      if (r != 0) {
        std::printf("end %d\n", r);
        break;
      }
      std::printf("entry %s %lld %lld %08x\n", Backslashes(name).c_str(), pack, unp,
                  DosTime(fileTime));
      Text dest = outDir + T("/") + (e == 0 && unwritable ? T("missing/") : T("")) +
                  Digits(static_cast<size_t>(e));
      g_calls = 0;
      g_bytes = 0;
      int result;
#ifdef _WIN32
      if (wide) {
        result = processW(h, 2, nullptr, dest.data());
      } else
#endif
      {
        std::string d = Ansi(dest);
        result = process(h, 2, nullptr, d.data());
      }
      std::printf("result %d progress %ld %lld\n", result, g_calls, g_bytes);
    }
    close(h);
  }
  return 0;
}

}  // namespace

#ifdef _WIN32
int wmain(int argc, wchar_t** argv) {
  return Run(std::vector<Text>(argv, argv + argc));
}
#else
int main(int argc, char** argv) {
  return Run(std::vector<Text>(argv, argv + argc));
}
#endif
