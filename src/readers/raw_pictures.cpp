// Files of bare pixels without a directory: each picture is listed under a
// made-up name, with a converted copy where the stored bytes are not a
// picture file already.
//
//   named palette images (99, 100)  a fixed 56-byte head, the picture's name
//       in the 24 bytes at 60, the palette at 140 and 512 x 512 or 512 x 256
//       pixels at 1168; listed once, as the BMP file extraction builds.
//   headerless images (151, 152)    pixel bytes, width and height as three
//       u32, the pixels from 12 (8-bit indices with 256 RGB colours behind
//       them, or 24-bit colours); listed once, as a TGA file.
//   image sequences (135 to 138)    pictures one after another, each a 29-byte
//       head (type byte, width at 1, height at 5, palette word at 21, bits per
//       pixel at 25) and its data: bits x width x height / 8 bytes, 520 more
//       for a type-1 picture whose palette word is not 0. Zero bytes, or
//       8-byte steps whose type byte is neither 1 nor 2, lie between them.
#include <algorithm>
#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "media/conversion.h"
#include "media/media.h"
#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

constexpr uint32_t kImageHead = 29;
constexpr uint32_t kOwnPalette = 520;
constexpr uint32_t kWindow = 65536;

uint32_t Fit32(uint64_t size) {
  if (size > UINT32_MAX) throw BadData("picture larger than 4 GiB");
  return static_cast<uint32_t>(size);
}

// The archive seen through a window of 64 KiB, so that scanning for the next
// picture costs no read per byte.
struct Window {
  const ReaderContext& c;
  std::vector<uint8_t> bytes;
  uint64_t start = 0;

  // The `length` bytes at `position`; bytes past the end of the file are refused.
  ByteView at(uint64_t position, uint32_t length) {
    if (position > c.fileSize || length > c.fileSize - position)
      throw BadData("picture head past the end");
    if (position < start || position + length > start + bytes.size()) {
      bytes = ReadBlock(c, position, std::min<uint64_t>(kWindow, c.fileSize - position));
      start = position;
    }
    return ByteView(bytes).sub(position - start, length);
  }
};

}  // namespace

void NamedImageReader(ReaderContext& c, unsigned row) {
  constexpr std::array<uint32_t, 2> kHeights = {512, 256};
  const uint32_t size = 512 * kHeights.at(row) + kBmpHeaderSize8;
  AddEntry(c, std::string(c.header.field(60, 24)) + ".bmp", 0, size, size);
}

void HeaderlessImageReader(ReaderContext& c, unsigned row) {
  // Row 0: 8-bit indices, their palette listed in front of them in the TGA
  // file; row 1: 24-bit pixels.
  const uint32_t width = c.header.u32le(4), height = c.header.u32le(8);
  const uint64_t packed = uint64_t{Fit32(uint64_t{width} * height)} * (row == 0 ? 1 : 3);
  const uint64_t head = row == 0 ? kTgaHeaderSize + kTgaColourMapSize : kTgaHeaderSize;
  std::string_view base = StripExtension(c.archiveFileName);
  if (base.empty()) base = c.archiveFileName;
  AddEntry(c, std::string(base) + ".tga", 12, Fit32(packed + head), Fit32(packed), 24,
           width | height << 16);
}

void ImageSequenceReader(ReaderContext& c, unsigned row) {
  // Row 0: a picture starts at the next non-zero byte; row 1: at the next
  // 8-byte step whose type byte is 1 or 2.
  const bool grid = row == 1;
  Window w{c, {}, 0};
  uint32_t number = 0;
  for (uint64_t position = 0; position < c.fileSize; ++number) {
    ByteView head = w.at(position, kImageHead);
    while (grid ? (head.u8(0) != 1 && head.u8(0) != 2) : head.u8(0) == 0) {
      position += grid ? 8 : 1;
      head = w.at(position, kImageHead);
    }
    const uint32_t width = head.u32le(1), height = head.u32le(5);
    const uint8_t bits = head.u8(25);
    const bool ownPalette = head.u8(0) == 1 && head.u32le(21) != 0;
    const uint64_t rowBits = uint64_t{bits} * width;
    if (height != 0 && rowBits > UINT64_MAX / height) throw BadData("picture larger than 4 GiB");
    const uint64_t data = rowBits * height / 8 + (ownPalette ? kOwnPalette : 0);
    const uint32_t size = Fit32(kImageHead + data);
    const std::string name = NumberedName(c.archiveFileName, number);
    const auto offset = static_cast<uint32_t>(position);  // inside the file
    AddEntry(c, name, offset, size, size);
    const uint32_t pixels = offset + kImageHead, stored = size - kImageHead;
    if (bits == 8 && ownPalette)
      AddTgaEntry(c, name, pixels, stored, width, height, 2, 1);
    else if (bits == 8)
      AddConvertedEntry(c, kBmpFolder, name, ".bmp", pixels,
                        BmpStride(width) * height + kBmpHeaderSize8, stored, 0, 2);
    else
      AddTgaEntry(c, name, pixels, stored, width, height, 2, 3);
    position += size;
  }
}

}  // namespace cairn
