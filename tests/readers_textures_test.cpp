// Lump archives with TGA copies of their pictures: "WAD2", "WAD3" and the
// "PACK" directory archive (reachable only when opened as FormatId 70).
#include <gtest/gtest.h>

#include <string>

#include "readers_sample.h"

namespace cairn::test {
namespace {

constexpr FormatId kWad2 = 4, kWad3 = 5, kPackDirectory = 70;

// A TGA file of 24-bit pixels, each index turned into the grey `shade(i)`.
template <typename Shade>
Bytes GreyTga(uint16_t width, uint16_t height, uint8_t descriptor, const Bytes& indices,
              Shade shade) {
  ArchiveBuilder w;
  w.fill(2).u8(2).fill(9).u16(width).u16(height).u8(24).u8(descriptor);
  for (uint8_t i : indices) w.fill(3, shade(i));
  return w.get();
}

// Both built-in palettes begin with 16 greys.
Bytes BuiltInGreyTga(uint16_t width, uint16_t height, const Bytes& indices) {
  static constexpr uint8_t kGreys[16] = {0x00, 0x0F, 0x1F, 0x2F, 0x3F, 0x4B, 0x5B, 0x6B,
                                         0x7B, 0x8B, 0x9B, 0xAB, 0xBB, 0xCB, 0xDB, 0xEB};
  return GreyTga(width, height, 0x21, indices, [](uint8_t i) { return kGreys[i]; });
}

// A WAD directory record: offset, size, 8 bytes the listing skips, name[16].
void WadRecord(ArchiveBuilder& w, uint32_t offset, uint32_t size, std::string_view name) {
  w.u32(offset).u32(size).u32(size).u8(0x44).u8(0).u16(0).name(name, 16);
}

// "WAD2": a 4 x 2 picture, a lump that is no picture, a 0 x 0 picture.
ReaderSample Wad2Sample() {
  const Bytes indices = {0, 1, 2, 3, 15, 14, 13, 12};
  const Bytes picture = ArchiveBuilder().u32(4).u32(2).bytes(indices).get();
  const Bytes other = Pattern(10, 20);
  const Bytes empty(8, 0);
  ArchiveBuilder w;
  w.text("WAD2").u32(3).u32(12 + 16 + 10 + 8).bytes(picture).bytes(other).bytes(empty);
  WadRecord(w, 12, 16, "PICTURE");
  WadRecord(w, 28, 10, "colormap");
  WadRecord(w, 38, 8, "0123456789abcdef");  // fills the field
  return {"gfx.wad",
          w.get(),
          {{"PICTURE", 12, 16, 16, 0, 0},
           {"_TO_TGA_\\PICTURE.tga", 12, 4 * 2 * 3 + 18, 16, 4 | 2 << 16, 1},
           {"colormap", 28, 10, 10, 0, 0},
           {"0123456789abcdef", 38, 8, 8, 0, 0},
           {"_TO_TGA_\\0123456789abcdef.tga", 38, 18, 8, 0, 1}},
          {picture, BuiltInGreyTga(4, 2, indices), other, empty, BuiltInGreyTga(0, 0, {})}};
}

// The tail of a "WAD3" picture lump: colour count, 256 red-green-blue
// colours (greys, so that the channel order does not matter), 2 bytes.
Bytes Wad3Tail() {
  ArchiveBuilder w;
  w.u16(256);
  for (int i = 0; i < 256; ++i) w.fill(3, static_cast<uint8_t>(255 - i));
  return w.u16(0).get();
}

Bytes Wad3Tga(const Bytes& indices) {
  return GreyTga(2, 2, 0x20, indices, [](uint8_t i) { return static_cast<uint8_t>(255 - i); });
}

// "WAD3": a mip texture (pixels at 40), a plain picture (pixels at 8) and a
// lump that is neither.
ReaderSample Wad3Sample() {
  const Bytes indices = {5, 6, 7, 200};
  ArchiveBuilder mip;
  mip.name("brick", 16).u32(2).u32(2).u32(40).u32(44).u32(0).u32(0).bytes(indices);
  const Bytes mipTexture = mip.bytes(Wad3Tail()).get();  // 40 + 4 + 772 bytes
  const Bytes plain = ArchiveBuilder().u32(2).u32(2).bytes(indices).bytes(Wad3Tail()).get();
  const Bytes other = Pattern(50, 21);
  const uint32_t atMip = 12, atPlain = atMip + 816, atOther = atPlain + 784;
  ArchiveBuilder w;
  w.text("WAD3").u32(3).u32(atOther + 50).bytes(mipTexture).bytes(plain).bytes(other);
  WadRecord(w, atMip, 816, "brick");
  WadRecord(w, atPlain, 784, "conchars");
  WadRecord(w, atOther, 50, "other");
  return {"halflife.wad",
          w.get(),
          {{"brick", atMip, 816, 816, 0, 0},
           {"_TO_TGA_\\brick.tga", atMip, 2 * 2 * 3 + 18, 816, 2 | 2 << 16, 1},
           {"conchars", atPlain, 784, 784, 0, 0},
           {"_TO_TGA_\\conchars.tga", atPlain, 2 * 2 * 3 + 18, 784, 2 | 2 << 16, 2},
           {"other", atOther, 50, 50, 0, 0}},
          {mipTexture, Wad3Tga(indices), plain, Wad3Tga(indices), other}};
}

// The "PACK" directory archive: a picture with its size at 0 and 4, one
// with its size at 32 and 36, and a lump that is no picture.
ReaderSample PackSample() {
  const Bytes indices1 = {1, 2, 3, 4, 5, 6}, indices2 = {9, 8, 7, 6, 5, 4, 3, 2};
  const Bytes first = ArchiveBuilder().u32(3).u32(2).bytes(indices1).get();  // 14 bytes
  ArchiveBuilder second;                                                     // 108 bytes
  second.name("second", 32).u32(2).u32(4).u32(100).u32(108).padTo(100).bytes(indices2);
  const Bytes other = Pattern(60, 22);
  const std::string full(56, 'p');
  const uint32_t atFirst = 12, atSecond = 26, atOther = 134, atDirectory = 194;
  ArchiveBuilder w;
  w.text("PACK").u32(atDirectory).u32(3 * 64 + 40).bytes(first).bytes(second.get()).bytes(other);
  w.name("gfx/first.lmp", 56).u32(atFirst).u32(14);
  w.name("second", 56).u32(atSecond).u32(108);
  w.name(full, 56).u32(atOther).u32(60);
  w.fill(40, 0x13);  // not a whole record: ignored
  return {
      "pak0.pak",
      w.get(),
      {{"gfx\\first.lmp", atFirst, 14, 14, 0, 0},
       {"_TO_TGA_\\gfx\\first.lmp.tga", atFirst, 3 * 2 * 3 + 18, 14, 3 | 2 << 16, 1},
       {"second", atSecond, 108, 108, 0, 0},
       {"_TO_TGA_\\second.tga", atSecond, 2 * 4 * 3 + 18, 108, 2 | 4 << 16, 2},
       {full, atOther, 60, 60, 0, 0}},
      {first, BuiltInGreyTga(3, 2, indices1), second.get(), BuiltInGreyTga(2, 4, indices2), other}};
}

TEST(TextureArchives, EachFormatListsAndExtractsExactly) {
  ExpectSample(kWad2, Wad2Sample());
  ExpectSample(kWad3, Wad3Sample());
  ExpectSample(kPackDirectory, PackSample());
}

TEST(TextureArchives, EdgeCasesListExactly) {
  // Width 1 at 0 and height 36 at 4 make 1 x 36 + 780 the lump's size, and
  // the words at 16..28 describe a 2 x 2 mip texture as well: the first
  // test wins.
  ArchiveBuilder both;
  both.text("WAD3").u32(1).u32(12 + 816);
  both.u32(1).u32(36).padTo(12 + 16).u32(2).u32(2).u32(40).u32(44).padTo(12 + 816);
  WadRecord(both, 12, 816, "both");
  // An 8-byte lump that starts 4 bytes before the end of the file cannot be
  // looked at: no copy.
  ArchiveBuilder cut;
  cut.text("WAD2").u32(1).u32(12);
  WadRecord(cut, 104, 8, "cut");
  ExpectListings({
      {"first WAD3 test wins",
       kWad3,
       both.get(),
       {{"both", 12, 816, 816, 0, 0}, {"_TO_TGA_\\both.tga", 12, 30, 816, 2 | 2 << 16, 1}}},
      {"lump past the end", kWad2, Padded(cut, 108), {{"cut", 104, 8, 8, 0, 0}}},
      {"count of 0", kWad3, Padded(ArchiveBuilder().text("WAD3").u32(0).u32(12)), {}},
  });
}

TEST(TextureArchives, RefusesBadDirectories) {
  ExpectRefused({
      {"WAD directory past the end", kWad2,
       Padded(ArchiveBuilder().text("WAD2").u32(1).u32(500), 120)},
      {"WAD count that cannot fit", kWad3,
       Padded(ArchiveBuilder().text("WAD3").u32(4).u32(12), 12 + 3 * 32 + 31)},
      {"PACK directory past the end", kPackDirectory,
       Padded(ArchiveBuilder().text("PACK").u32(12).u32(128), 120)},
      {"PACK directory offset wraps", kPackDirectory,
       Padded(ArchiveBuilder().text("PACK").u32(0xFFFFFFC0).u32(64), 120)},
  });
}

// clang-format off
CAIRN_FIXTURE(Wad2Fixture) { return SampleFixture("WAD2", kWad2, Wad2Sample()); }
CAIRN_FIXTURE(Wad3Fixture) { return SampleFixture("WAD3", kWad3, Wad3Sample()); }
// clang-format on

}  // namespace
}  // namespace cairn::test
