// POSIX implementation of the platform layer.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <ctime>
#include <system_error>

#include "util/platform.h"

namespace cairn::os {
namespace {

int Fd(Handle h) {
  return static_cast<int>(h);
}

uint64_t Nanoseconds(const timespec& t) {
  return static_cast<uint64_t>(t.tv_sec) * 1000000000u + static_cast<uint64_t>(t.tv_nsec);
}

timespec Timespec(uint64_t ns) {
  timespec t{};
  t.tv_sec = static_cast<time_t>(ns / 1000000000u);
  t.tv_nsec = static_cast<long>(ns % 1000000000u);
  return t;
}

// Opens without blocking (a FIFO would otherwise wait for a writer) and keeps
// the descriptor only when it names a regular file.
Handle OpenRegular(const char* path, int flags) {
  if (path == nullptr || *path == 0) return kNoFile;
  int fd = ::open(path, flags | O_NONBLOCK | O_CLOEXEC, 0644);
  if (fd < 0) return kNoFile;
  struct stat st {};
  if (::fstat(fd, &st) != 0 || !S_ISREG(st.st_mode)) {
    ::close(fd);
    return kNoFile;
  }
  ::fcntl(fd, F_SETFL, ::fcntl(fd, F_GETFL) & ~O_NONBLOCK);
  return fd;
}

}  // namespace

PathEncoding SetPathEncoding(PathEncoding e) {
  return e;
}

Handle OpenShared(const char* path) {
  return OpenRegular(path, O_RDONLY);
}
Handle CreateAlways(const char* path) {
  return OpenRegular(path, O_RDWR | O_CREAT | O_TRUNC);
}
Handle OpenExisting(const char* path) {
  return OpenRegular(path, O_RDWR);
}

void Close(Handle h) {
  if (h != kNoFile) ::close(Fd(h));
}

int LastError() {
  return errno;
}

std::string ErrorText(int code) {
  return std::system_category().message(code);
}

bool Seek(Handle h, uint32_t position) {
  if (position > static_cast<uint32_t>(INT32_MAX)) return false;
  return ::lseek(Fd(h), static_cast<off_t>(position), SEEK_SET) == static_cast<off_t>(position);
}

uint32_t Read(Handle h, void* buffer, uint32_t count) {
  uint32_t done = 0;
  auto* p = static_cast<char*>(buffer);
  while (done < count) {
    ssize_t n = ::read(Fd(h), p + done, count - done);
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) break;
    done += static_cast<uint32_t>(n);
  }
  return done;
}

uint32_t Write(Handle h, const void* buffer, uint32_t count) {
  uint32_t done = 0;
  const auto* p = static_cast<const char*>(buffer);
  while (done < count) {
    ssize_t n = ::write(Fd(h), p + done, count - done);
    if (n < 0 && errno == EINTR) continue;
    if (n == 0) errno = ENOSPC;  // a file that takes no more says nothing else
    if (n <= 0) break;
    done += static_cast<uint32_t>(n);
  }
  return done;
}

uint32_t SizeLow(Handle h) {
  struct stat st {};
  if (::fstat(Fd(h), &st) != 0) return 0;
  return static_cast<uint32_t>(static_cast<uint64_t>(st.st_size));
}

bool GetTimes(Handle h, FileTimes& times) {
  struct stat st {};
  if (::fstat(Fd(h), &st) != 0) return false;
  // POSIX keeps no creation time; the status-change time stands in for it.
  times.creation = Nanoseconds(st.st_ctim);
  times.access = Nanoseconds(st.st_atim);
  times.write = Nanoseconds(st.st_mtim);
  return true;
}

bool SetTimes(Handle h, const FileTimes& times) {
  const timespec ts[2] = {Timespec(times.access), Timespec(times.write)};
  return ::futimens(Fd(h), ts) == 0;
}

uint32_t DosTime(const FileTimes& times) {
  const time_t t = static_cast<time_t>(times.write / 1000000000u);
  tm local{};
  if (::localtime_r(&t, &local) == nullptr) return 0;
  int year = local.tm_year + 1900;
  if (year < 1980) return (0u << 25) | (1u << 21) | (1u << 16);  // 1980-01-01 00:00:00
  if (year > 2107) year = 2107;
  const uint32_t date =
      static_cast<uint32_t>((year - 1980) << 9 | (local.tm_mon + 1) << 5 | local.tm_mday);
  const uint32_t clock =
      static_cast<uint32_t>(local.tm_hour << 11 | local.tm_min << 5 | local.tm_sec / 2);
  return date << 16 | clock;
}

int64_t UnixTime(const FileTimes& times) {
  return static_cast<int64_t>(times.write / 1000000000u);
}

bool IdentifyFile(Handle h, FileId& id) {
  struct stat st {};
  if (::fstat(Fd(h), &st) != 0) return false;
  id = {static_cast<uint64_t>(st.st_dev), static_cast<uint64_t>(st.st_ino)};
  return true;
}

bool IdentifyPath(const char* path, FileId& id) {
  struct stat st {};
  if (path == nullptr || *path == 0 || ::stat(path, &st) != 0) return false;
  id = {static_cast<uint64_t>(st.st_dev), static_cast<uint64_t>(st.st_ino)};
  return true;
}

bool Delete(const char* path) {
  return path != nullptr && ::unlink(path) == 0;
}

}  // namespace cairn::os
