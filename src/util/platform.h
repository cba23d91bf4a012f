// The platform layer: the few file services the core needs, with one POSIX
// and one Win32 implementation. Nothing outside src/util includes a platform
// header. Positions and counts are 32-bit, as everywhere in the core.
#pragma once

#include <cstdint>
#include <string>

namespace cairn::os {

// A file descriptor on POSIX, a HANDLE on Win32.
using Handle = std::intptr_t;
inline constexpr Handle kNoFile = -1;

// The three time stamps of a file in the platform's own units: 100 ns since
// 1601 on Win32 (FILETIME), nanoseconds since 1970 on POSIX.
struct FileTimes {
  uint64_t creation = 0;
  uint64_t access = 0;
  uint64_t write = 0;
};

// How the core's paths are spelled: in the system's code page (the ANSI
// entry points) or in UTF-8 (the wide ones on Windows). The entry point that
// receives a path sets it; POSIX paths are bytes and ignore it.
enum class PathEncoding { Ansi, Utf8 };
PathEncoding SetPathEncoding(PathEncoding e);

#ifdef _WIN32
// Conversions for the wide entry points of the Windows plug-in.
std::string Utf8FromWide(const wchar_t* wide);
std::wstring WideFromAnsi(const std::string& ansi);
#endif

// Opens an existing regular file for reading, sharing reads with others
// (archives and their companion files). kNoFile on failure.
Handle OpenShared(const char* path);
// Creates or truncates an output file for reading and writing.
Handle CreateAlways(const char* path);
// Opens an existing output file again for reading and writing.
Handle OpenExisting(const char* path);
void Close(Handle h);

// The system's code for why the last call of this thread failed (errno,
// GetLastError), and the system's words for a code.
int LastError();
std::string ErrorText(int code);

// Moves to an absolute position; positions beyond 2^31 - 1 cannot be reached.
bool Seek(Handle h, uint32_t position);
// Transfer at the current position; the result is the number of bytes moved.
uint32_t Read(Handle h, void* buffer, uint32_t count);
uint32_t Write(Handle h, const void* buffer, uint32_t count);
// The low 32 bits of the file size.
uint32_t SizeLow(Handle h);

bool GetTimes(Handle h, FileTimes& times);
bool SetTimes(Handle h, const FileTimes& times);
// The last-write time in local time as DOS date (high 16 bits) and time.
uint32_t DosTime(const FileTimes& times);
// The last-write time in seconds since 1970 (UTC).
int64_t UnixTime(const FileTimes& times);

bool Delete(const char* path);

// What tells two names of one file apart from two files: device and inode on
// POSIX, volume serial and file index on Win32.
struct FileId {
  uint64_t volume = 0;
  uint64_t index = 0;
  bool operator==(const FileId&) const = default;
};
// The identity of an open file, or of the file at `path` (links followed);
// false when there is none, e.g. nothing exists at the path.
bool IdentifyFile(Handle h, FileId& id);
bool IdentifyPath(const char* path, FileId& id);

}  // namespace cairn::os
