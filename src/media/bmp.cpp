// The BMP writers: 8-bit pictures with a 256-colour palette (54 header bytes,
// 1024 palette bytes) and 16-bit 5-6-5 pictures with bit-field masks (66
// header bytes). The source pictures are stored top row first; BMP files
// hold the bottom row first, every row padded to a multiple of 4 bytes.
#include <algorithm>
#include <array>
#include <cstring>
#include <string>
#include <string_view>

#include "core/stored.h"
#include "media/media.h"
#include "media/palettes.h"
#include "util/names.h"

namespace cairn {
namespace {

// Raw 8-bit pictures are recognised by their size alone.
struct RawPicture {
  uint32_t bytes, width, height;
};
constexpr std::array<RawPicture, 9> kRawPictures = {{
    {307200, 640, 480},
    {256000, 640, 400},
    {128000, 640, 200},
    {65536, 256, 256},
    {64000, 320, 200},
    {27648, 256, 108},
    {20480, 320, 64},
    {8000, 320, 25},
    {4096, 64, 64},
}};

// Writes an 8-bit BMP: header, `palette`, then the `width` x `height` stored
// pixels at `position`, rows reversed and padded.
void WriteBmp8(ExtractionFrame& f, ByteView palette, uint64_t position, uint32_t width,
               uint32_t height) {
  const uint64_t stored = uint64_t{width} * height;
  const uint64_t area = BmpStride(width) * height;
  NeedStored(f, position, stored);  // before the area, which the stored bytes bound
  std::vector<uint8_t> pixels(static_cast<size_t>(area));
  ReadStoredInto(f, std::span(pixels).first(static_cast<size_t>(stored)), position);
  ArrangeBmpRows(pixels, width, height);
  if (kBmpHeaderSize8 + area > UINT32_MAX) throw BadData("picture too large");
  f.Write(BmpHeader(static_cast<uint32_t>(kBmpHeaderSize8 + area), width, height, 8));
  f.Write(palette);
  f.Write(pixels);
}

// The entry's colour table: the ".act" entry named like the picture, else
// "art\vga.act", each only when it holds 256 colours.
const ArchiveEntry* FindColourTable(const ExtractionFrame& f) {
  const auto find = [&](std::string_view name) -> const ArchiveEntry* {
    for (const ArchiveEntry& e : f.session.entries)
      if (e.PackedSize >= 768 && CompareNamesNoCase(e.Name, name) == 0) return &e;
    return nullptr;
  };
  // "_TO_BMP_\" + name + ".bmp", where the name ends in a 4-character
  // extension such as ".raw".
  const std::string_view name = f.entry.Name;
  if (name.size() >= 17) {
    std::string companion(name.substr(9, name.size() - 17));
    companion += ".act";
    if (const ArchiveEntry* e = find(companion)) return e;
  }
  return find("art\\vga.act");
}

}  // namespace

std::vector<uint8_t> BmpHeader(uint32_t fileSize, uint32_t width, uint32_t height,
                               unsigned bitsPerPixel) {
  const bool bitFields = bitsPerPixel == 16;
  std::vector<uint8_t> h(bitFields ? kBmpHeaderSize16 : 54, 0);
  h[0] = 'B';
  h[1] = 'M';
  PutU32le(h, 2, fileSize);
  PutU32le(h, 10, bitFields ? kBmpHeaderSize16 : kBmpHeaderSize8);
  PutU32le(h, 14, 40);
  PutU32le(h, 18, width);
  PutU32le(h, 22, height);
  PutU16le(h, 26, 1);
  PutU16le(h, 28, static_cast<uint16_t>(bitsPerPixel));
  if (bitFields) {
    PutU32le(h, 30, 3);
    PutU32le(h, 54, 0xF800);
    PutU32le(h, 58, 0x07E0);
    PutU32le(h, 62, 0x001F);
  }
  return h;
}

std::vector<uint8_t> BmpPaletteFromRgb(ByteView rgb) {
  std::vector<uint8_t> p(1024, 0);
  for (size_t i = 0; i < 256; ++i) {
    p[4 * i] = rgb.u8(3 * i + 2);
    p[4 * i + 1] = rgb.u8(3 * i + 1);
    p[4 * i + 2] = rgb.u8(3 * i);
  }
  return p;
}

void ArrangeBmpRows(std::span<uint8_t> area, size_t rowBytes, size_t rows) {
  const size_t stride = static_cast<size_t>(BmpStride(rowBytes));
  if (area.size() != stride * rows) throw BadData("pixel area of the wrong size");
  uint8_t* p = area.data();
  // Reverse the packed rows, then spread them out from the last one down, so
  // that no row is overwritten before it has moved.
  for (size_t top = 0, bottom = rows; top + 1 < bottom; ++top, --bottom)
    std::swap_ranges(p + top * rowBytes, p + (top + 1) * rowBytes, p + (bottom - 1) * rowBytes);
  if (stride == rowBytes) return;
  for (size_t r = rows; r-- > 0;) {
    std::memmove(p + r * stride, p + r * rowBytes, rowBytes);
    std::memset(p + r * stride + rowBytes, 0, stride - rowBytes);
  }
}

std::optional<std::pair<uint32_t, uint32_t>> RawPictureSize(uint32_t packedSize) {
  for (const RawPicture& r : kRawPictures)
    if (r.bytes == packedSize) return std::pair(r.width, r.height);
  return std::nullopt;
}

void BmpFixedLayout(ExtractionFrame& f) {
  // A 512-pixel-wide picture with its palette at file position 140 (red and
  // blue exchanged) and its pixels at 1168, whatever Offset says.
  const uint32_t height = f.session.format == 99 ? 512 : 256;
  std::vector<uint8_t> palette = ReadStored(f, 140, 1024);
  SwapRedBlue(palette);
  WriteBmp8(f, palette, 1168, 512, height);
}

void BmpWithColourTable(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  if (e.Flag == 0) return RawCopy(f);
  const auto size = RawPictureSize(e.PackedSize);
  if (!size) throw BadData("not a known picture size");
  std::vector<uint8_t> palette;
  if (const ArchiveEntry* table = FindColourTable(f))
    palette = BmpPaletteFromRgb(ReadStored(f, table->Offset, 768));
  else
    palette.assign(kBuiltInPalette4.begin(), kBuiltInPalette4.end());
  WriteBmp8(f, palette, e.Offset, size->first, size->second);
}

void ImageSequencePicture(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  switch (e.Flag) {
    case 0:
      return RawCopy(f);
    case 1:
      return TgaFromOwnPalette16(f);
    case 2: {
      // The size comes from the 29-byte image header in front of the pixels.
      if (e.Offset < 29) throw BadData("no image header");
      const std::vector<uint8_t> header = ReadStored(f, e.Offset - 29, 29);
      const uint32_t width = ByteView(header).u32le(1);
      const uint32_t height = ByteView(header).u32le(5);
      if (uint64_t{width} * height > e.PackedSize) throw BadData("fewer pixels than the picture");
      WriteBmp8(f, ByteView(kBuiltInPalette3.data(), kBuiltInPalette3.size()), e.Offset, width,
                height);
      return;
    }
    case 3:
      f.Write(TgaHeader(e.Extra, 16, 0x20));
      return CopyStored(f, e.Offset, e.PackedSize);
    default:
      return;  // nothing to convert: the empty file is the result
  }
}

void Bmp565(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  const uint32_t width = e.Extra & 0xFFFF;
  const uint32_t height = e.Extra >> 16;
  const uint64_t rowBytes = 2 * uint64_t{width};
  const uint64_t area = BmpStride(rowBytes) * height;
  NeedStored(f, e.Offset, rowBytes * height);
  std::vector<uint8_t> pixels(static_cast<size_t>(area));
  ReadStoredInto(f, std::span(pixels).first(static_cast<size_t>(rowBytes * height)), e.Offset);
  ArrangeBmpRows(pixels, static_cast<size_t>(rowBytes), height);
  if (kBmpHeaderSize16 + area > UINT32_MAX) throw BadData("picture too large");
  f.Write(BmpHeader(static_cast<uint32_t>(kBmpHeaderSize16 + area), width, height, 16));
  f.Write(pixels);
}

}  // namespace cairn
