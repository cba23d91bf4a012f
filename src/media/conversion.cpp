#include "media/conversion.h"

#include <string>

namespace cairn {

bool AddConvertedEntry(ReaderContext& c, std::string_view folder, std::string_view name,
                       std::string_view extension, uint32_t offset, uint64_t unpacked,
                       uint32_t packed, uint32_t extra, uint8_t flag) {
  if (folder.size() + name.size() + extension.size() > kMaxNameLength) return false;
  if (unpacked > UINT32_MAX) return false;
  std::string full;
  full.reserve(folder.size() + name.size() + extension.size());
  full.append(folder).append(name).append(extension);
  AddEntry(c, full, offset, static_cast<uint32_t>(unpacked), packed, flag, extra);
  return true;
}

bool AddTgaEntry(ReaderContext& c, std::string_view name, uint32_t offset, uint32_t packedSize,
                 uint32_t width, uint32_t height, uint8_t bytesPerPixel, uint8_t flag) {
  const uint64_t unpacked = uint64_t{width} * height * bytesPerPixel + 18;
  return AddConvertedEntry(c, kTgaFolder, name, ".tga", offset, unpacked, packedSize,
                           width | height << 16, flag);
}

}  // namespace cairn
