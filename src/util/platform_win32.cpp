// Win32 implementation of the platform layer, on the kernel32 file services.
#include <windows.h>

#include <string>

#include "util/platform.h"

namespace cairn::os {
namespace {

// Per thread: each call of the plug-in sets it for its own length.
thread_local PathEncoding g_encoding = PathEncoding::Ansi;

HANDLE H(Handle h) {
  return reinterpret_cast<HANDLE>(h);
}

Handle FromHandle(HANDLE h) {
  return h == INVALID_HANDLE_VALUE ? kNoFile : reinterpret_cast<Handle>(h);
}

std::wstring Wide(const char* utf8) {
  const int n = MultiByteToWideChar(CP_UTF8, 0, utf8, -1, nullptr, 0);
  if (n <= 0) return {};
  std::wstring w(static_cast<size_t>(n), L'\0');
  MultiByteToWideChar(CP_UTF8, 0, utf8, -1, w.data(), n);
  w.resize(static_cast<size_t>(n - 1));
  return w;
}

Handle Open(const char* path, DWORD access, DWORD share, DWORD disposition, DWORD flags) {
  if (path == nullptr || *path == 0) return kNoFile;
  if (g_encoding == PathEncoding::Utf8)
    return FromHandle(
        CreateFileW(Wide(path).c_str(), access, share, nullptr, disposition, flags, nullptr));
  return FromHandle(CreateFileA(path, access, share, nullptr, disposition, flags, nullptr));
}

}  // namespace

std::string Utf8FromWide(const wchar_t* wide) {
  if (wide == nullptr) return {};
  const int n = WideCharToMultiByte(CP_UTF8, 0, wide, -1, nullptr, 0, nullptr, nullptr);
  if (n <= 0) return {};
  std::string s(static_cast<size_t>(n), '\0');
  WideCharToMultiByte(CP_UTF8, 0, wide, -1, s.data(), n, nullptr, nullptr);
  s.resize(static_cast<size_t>(n - 1));
  return s;
}

std::wstring WideFromAnsi(const std::string& ansi) {
  const int n = MultiByteToWideChar(CP_ACP, 0, ansi.c_str(), -1, nullptr, 0);
  if (n <= 0) return {};
  std::wstring w(static_cast<size_t>(n), L'\0');
  MultiByteToWideChar(CP_ACP, 0, ansi.c_str(), -1, w.data(), n);
  w.resize(static_cast<size_t>(n - 1));
  return w;
}

PathEncoding SetPathEncoding(PathEncoding e) {
  const PathEncoding old = g_encoding;
  g_encoding = e;
  return old;
}

Handle OpenShared(const char* path) {
  return Open(path, GENERIC_READ, FILE_SHARE_READ, OPEN_EXISTING, FILE_FLAG_SEQUENTIAL_SCAN);
}

Handle CreateAlways(const char* path) {
  return Open(path, GENERIC_READ | GENERIC_WRITE, FILE_SHARE_READ | FILE_SHARE_WRITE, CREATE_ALWAYS,
              FILE_FLAG_RANDOM_ACCESS);
}

Handle OpenExisting(const char* path) {
  return Open(path, GENERIC_READ | GENERIC_WRITE, FILE_SHARE_READ | FILE_SHARE_WRITE, OPEN_EXISTING,
              FILE_FLAG_RANDOM_ACCESS);
}

void Close(Handle h) {
  if (h != kNoFile) CloseHandle(H(h));
}

bool Seek(Handle h, uint32_t position) {
  // No high part: the distance is a signed 32-bit value.
  if (position > 0x7FFFFFFFu) return false;
  return SetFilePointer(H(h), static_cast<LONG>(position), nullptr, FILE_BEGIN) == position;
}

uint32_t Read(Handle h, void* buffer, uint32_t count) {
  DWORD got = 0;
  ReadFile(H(h), buffer, count, &got, nullptr);  // only the count decides
  return got;
}

uint32_t Write(Handle h, const void* buffer, uint32_t count) {
  DWORD put = 0;
  if (WriteFile(H(h), buffer, count, &put, nullptr) != 0 && put < count)
    SetLastError(ERROR_DISK_FULL);
  return put;
}

int LastError() {
  return static_cast<int>(GetLastError());
}

std::string ErrorText(int code) {
  char* text = nullptr;
  const DWORD n = FormatMessageA(
      FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS,
      nullptr, static_cast<DWORD>(code), 0, reinterpret_cast<char*>(&text), 0, nullptr);
  std::string words = n != 0 && text != nullptr ? std::string(text, n) : std::string();
  LocalFree(text);
  while (!words.empty() && (words.back() == '\n' || words.back() == '\r' || words.back() == '.'))
    words.pop_back();
  return words.empty() ? "system error " + std::to_string(code) : words;
}

uint32_t SizeLow(Handle h) {
  return GetFileSize(H(h), nullptr);
}

namespace {

uint64_t Ticks(const FILETIME& t) {
  return static_cast<uint64_t>(t.dwHighDateTime) << 32 | t.dwLowDateTime;
}

FILETIME Filetime(uint64_t ticks) {
  FILETIME t;
  t.dwLowDateTime = static_cast<DWORD>(ticks);
  t.dwHighDateTime = static_cast<DWORD>(ticks >> 32);
  return t;
}

}  // namespace

bool GetTimes(Handle h, FileTimes& times) {
  FILETIME c, a, w;
  if (!GetFileTime(H(h), &c, &a, &w)) return false;
  times.creation = Ticks(c);
  times.access = Ticks(a);
  times.write = Ticks(w);
  return true;
}

bool SetTimes(Handle h, const FileTimes& times) {
  const FILETIME c = Filetime(times.creation), a = Filetime(times.access),
                 w = Filetime(times.write);
  return SetFileTime(H(h), &c, &a, &w) != 0;
}

uint32_t DosTime(const FileTimes& times) {
  const FILETIME utc = Filetime(times.write);
  FILETIME local;
  WORD date = 0, time = 0;
  if (!FileTimeToLocalFileTime(&utc, &local) || !FileTimeToDosDateTime(&local, &date, &time))
    return 0;
  return static_cast<uint32_t>(date) << 16 | time;
}

int64_t UnixTime(const FileTimes& times) {
  return (static_cast<int64_t>(times.write) - 116444736000000000LL) / 10000000;
}

bool IdentifyFile(Handle h, FileId& id) {
  BY_HANDLE_FILE_INFORMATION info{};
  if (GetFileInformationByHandle(H(h), &info) == 0) return false;
  id = {info.dwVolumeSerialNumber,
        static_cast<uint64_t>(info.nFileIndexHigh) << 32 | info.nFileIndexLow};
  return true;
}

bool IdentifyPath(const char* path, FileId& id) {
  // No access asked and every sharing allowed: this opens whatever is open
  // elsewhere, folders included, and changes nothing.
  const Handle h = Open(path, 0, FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE,
                        OPEN_EXISTING, FILE_FLAG_BACKUP_SEMANTICS);
  if (h == kNoFile) return false;
  const bool known = IdentifyFile(h, id);
  CloseHandle(H(h));
  return known;
}

bool Delete(const char* path) {
  if (path == nullptr) return false;
  if (g_encoding == PathEncoding::Utf8) return DeleteFileW(Wide(path).c_str()) != 0;
  return DeleteFileA(path) != 0;
}

}  // namespace cairn::os
