#include "util/file.h"

namespace cairn {

bool SeekTo(os::Handle h, uint32_t position) {
  return os::Seek(h, position);
}

bool ReadExact(os::Handle h, void* buffer, uint32_t count) {
  return os::Read(h, buffer, count) == count;
}

bool WriteExact(os::Handle h, const void* buffer, uint32_t count) {
  return os::Write(h, buffer, count) == count;
}

bool ReadAt(os::Handle h, void* buffer, uint32_t position, uint32_t count) {
  return SeekTo(h, position) && ReadExact(h, buffer, count);
}

bool WriteAt(os::Handle h, const void* buffer, uint32_t position, uint32_t count) {
  return SeekTo(h, position) && WriteExact(h, buffer, count);
}

}  // namespace cairn
