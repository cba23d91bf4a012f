#include "core/stored.h"

#include "util/file.h"

namespace cairn {

void NeedStored(const ExtractionFrame& f, uint64_t position, uint64_t length) {
  const uint64_t size = os::SizeLow(f.archive);
  if (position > size || length > size - position) throw BadData("stored bytes past the end");
}

std::vector<uint8_t> ReadStored(const ExtractionFrame& f, uint64_t position, uint64_t length) {
  NeedStored(f, position, length);
  std::vector<uint8_t> bytes(static_cast<size_t>(length));
  ReadStoredInto(f, bytes, position);
  return bytes;
}

void ReadStoredInto(const ExtractionFrame& f, std::span<uint8_t> into, uint64_t position) {
  NeedStored(f, position, into.size());
  if (into.empty()) return;
  if (!ReadAt(f.archive, into.data(), static_cast<uint32_t>(position),
              static_cast<uint32_t>(into.size())))
    throw BadData("archive ends early");
}

}  // namespace cairn
