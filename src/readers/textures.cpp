// Lump archives that hold pictures among other data: "WAD2", "WAD3" and the
// "PACK" directory archive. Every lump is listed as stored; a lump whose
// first bytes describe a picture that fits it exactly is followed in the
// listing by a TGA copy in the "_TO_TGA_\" folder, whose Flag tells the
// converter where the pixels and the palette are.
//
//   "WAD2", "WAD3"  count at header 4, directory from the header word at 8
//                   to the end of the file; 32-byte records: offset, size,
//                   8 bytes the listing does not use, name[16].
//   "PACK"          directory offset and byte size at header 4 and 8; as
//                   many 64-byte records as fit: name[56], offset, size.
//
// The picture tests look at the first bytes of each lump (little-endian
// words; w and h are the width and height found):
//   "WAD2"  w at 0, h at 4, and w * h + 8 is the lump's size.
//   "WAD3"  a mip texture: w at 16, h at 20, the words at 24 and 28 are 40
//           and w * h + 40; or else a plain picture: w at 0, h at 4, and
//           w * h + 780 is the lump's size (pixels, then the palette).
//   "PACK"  w at 0, h at 4, and w * h + 8 is the lump's size; or else w at
//           32, h at 36, the words at 40 and 44 are 100 and w * h + 100.
// Products wrap at 32 bits.
#include <array>
#include <cstdint>
#include <vector>

#include "media/conversion.h"
#include "readers/readers.h"

namespace cairn {
namespace {

constexpr int kNone = -1;

struct PictureTest {
  int widthAt, heightAt;
  uint32_t extra;  // bytes of the lump beside the pixels
  int markAt;      // a word that must equal `extra`, or kNone
  int totalAt;     // the word that must equal w * h + extra; kNone: the lump's size
  uint8_t flag;    // the picture layout handed to the converter
};

struct TextureLayout {
  bool counted;  // count and directory offset in the header, directory to the end
  uint32_t recordSize, nameAt, nameWidth, offsetAt, sizeAt;
  uint32_t peek;  // bytes of each lump the tests look at
  std::array<PictureTest, 2> tests;
  unsigned testCount;
};

constexpr std::array<TextureLayout, 3> kTextureLayouts = {{
    // "WAD2"
    {true, 32, 16, 16, 0, 4, 8, {{{0, 4, 8, kNone, kNone, 1}}}, 1},
    // "WAD3"
    {true, 32, 16, 16, 0, 4, 40, {{{16, 20, 40, 24, 28, 1}, {0, 4, 780, kNone, kNone, 2}}}, 2},
    // "PACK" directory archive
    {false, 64, 0, 56, 56, 60, 48, {{{0, 4, 8, kNone, kNone, 1}, {32, 36, 100, 40, 44, 2}}}, 2},
}};

constexpr uint32_t kLargestPeek = 48;

// Adds the TGA copy of the lump when one of the tests holds. A lump whose
// first bytes cannot be read is listed without a copy.
void OfferPicture(ReaderContext& c, const TextureLayout& l, std::string_view name, uint32_t offset,
                  uint32_t size) {
  std::array<uint8_t, kLargestPeek> buffer{};
  if (uint64_t{offset} + l.peek > c.fileSize || !ReadAt(c.archive, buffer.data(), offset, l.peek))
    return;
  const ByteView peek(buffer.data(), l.peek);
  for (unsigned i = 0; i < l.testCount; ++i) {
    const PictureTest& t = l.tests[i];
    const uint32_t width = peek.u32le(t.widthAt);
    const uint32_t height = peek.u32le(t.heightAt);
    const uint32_t total = width * height + t.extra;
    if (t.markAt != kNone && peek.u32le(t.markAt) != t.extra) continue;
    if (total != (t.totalAt == kNone ? size : peek.u32le(t.totalAt))) continue;
    // A copy whose size would not fit 32 bits is left out.
    AddTgaEntry(c, name, offset, size, width, height, 3, t.flag);
    return;
  }
}

}  // namespace

void TextureArchiveReader(ReaderContext& c, unsigned row) {
  const TextureLayout& l = kTextureLayouts.at(row);
  uint32_t start, length;
  uint64_t count;
  if (l.counted) {
    count = c.header.u32le(4);
    start = c.header.u32le(8);
    if (start > c.fileSize) throw BadData("directory past the end");
    length = c.fileSize - start;
    if (count > length / l.recordSize) throw BadData("more records than the directory holds");
  } else {
    start = c.header.u32le(4);
    length = c.header.u32le(8);
    count = length / l.recordSize;  // trailing bytes of a last partial record are ignored
  }
  const std::vector<uint8_t> block = ReadBlock(c, start, length);
  const ByteView dir(block);
  c.entries.reserve(static_cast<size_t>(count));
  for (uint64_t i = 0; i < count; ++i) {
    const ByteView record = dir.sub(i * l.recordSize, l.recordSize);
    const std::string_view name = record.field(l.nameAt, l.nameWidth);
    const uint32_t offset = record.u32le(l.offsetAt);
    const uint32_t size = record.u32le(l.sizeAt);
    AddEntry(c, name, offset, size, size);
    OfferPicture(c, l, name, offset, size);
  }
}

}  // namespace cairn
