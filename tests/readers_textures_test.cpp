// Lump archives with TGA copies of their pictures: "WAD2", "WAD3" and the
// "PACK" directory archive (reachable only when opened as FormatId 70).
#include <gtest/gtest.h>

#include <string>

#include "samples.h"

namespace cairn::test {
namespace {

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
Sample Wad2() {
  const Bytes indices = {0, 1, 2, 3, 15, 14, 13, 12};
  const Bytes picture = ArchiveBuilder().u32(4).u32(2).bytes(indices).get();
  const Bytes other = Pattern(10, 20), empty(8, 0);
  ArchiveBuilder w;
  w.text("WAD2").u32(3).u32(12 + 16 + 10 + 8).bytes(picture).bytes(other).bytes(empty);
  WadRecord(w, 12, 16, "PICTURE");
  WadRecord(w, 28, 10, "colormap");
  WadRecord(w, 38, 8, "0123456789abcdef");  // fills the field
  return {"WAD2",
          4,
          "gfx.wad",
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

// "WAD3": a mip texture (pixels at 40), a plain picture (pixels at 8) and a
// lump that is neither. The mip texture's first words pass the plain test as
// well (1 x 36 + 780 is its size): the mip test comes first and wins.
Sample Wad3() {
  const Bytes indices = {5, 6, 7, 200};
  ArchiveBuilder mip;
  mip.u32(1).u32(36).fill(8).u32(2).u32(2).u32(40).u32(44).fill(8).bytes(indices);
  const Bytes mipTexture = mip.bytes(Wad3Tail()).get();  // 40 + 4 + 772 bytes
  const Bytes plain = ArchiveBuilder().u32(2).u32(2).bytes(indices).bytes(Wad3Tail()).get();
  const Bytes other = Pattern(50, 21);
  const Bytes tga =
      GreyTga(2, 2, 0x20, indices, [](uint8_t i) { return static_cast<uint8_t>(255 - i); });
  const uint32_t atMip = 12, atPlain = atMip + 816, atOther = atPlain + 784;
  ArchiveBuilder w;
  w.text("WAD3").u32(3).u32(atOther + 50).bytes(mipTexture).bytes(plain).bytes(other);
  WadRecord(w, atMip, 816, "brick");
  WadRecord(w, atPlain, 784, "conchars");
  WadRecord(w, atOther, 50, "other");
  return {"WAD3",
          5,
          "halflife.wad",
          w.get(),
          {{"brick", atMip, 816, 816, 0, 0},
           {"_TO_TGA_\\brick.tga", atMip, 2 * 2 * 3 + 18, 816, 2 | 2 << 16, 1},
           {"conchars", atPlain, 784, 784, 0, 0},
           {"_TO_TGA_\\conchars.tga", atPlain, 2 * 2 * 3 + 18, 784, 2 | 2 << 16, 2},
           {"other", atOther, 50, 50, 0, 0}},
          {mipTexture, tga, plain, tga, other}};
}

// The "PACK" directory archive: a picture with its size at 0 and 4, one
// with its size at 32 and 36, and a lump that is no picture.
Sample Pack() {
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
      "PACK directory",
      70,
      "pak0.pak",
      w.get(),
      {{"gfx\\first.lmp", atFirst, 14, 14, 0, 0},
       {"_TO_TGA_\\gfx\\first.lmp.tga", atFirst, 3 * 2 * 3 + 18, 14, 3 | 2 << 16, 1},
       {"second", atSecond, 108, 108, 0, 0},
       {"_TO_TGA_\\second.tga", atSecond, 2 * 4 * 3 + 18, 108, 2 | 4 << 16, 2},
       {full, atOther, 60, 60, 0, 0}},
      {first, BuiltInGreyTga(3, 2, indices1), second.get(), BuiltInGreyTga(2, 4, indices2), other},
      {},
      false};
}

CAIRN_SAMPLES(TextureSamples) {
  return {Wad2(), Wad3(), Pack()};
}

TEST(TextureArchives, ALumpWhoseStartCannotBeReadGetsNoCopy) {
  // An 8-byte lump 4 bytes before the end of the file.
  ArchiveBuilder cut;
  cut.text("WAD2").u32(1).u32(12);
  WadRecord(cut, 104, 8, "cut");
  auto o = OpenBytesAs(4, cut.padTo(108).get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (std::vector<Listed>{{"cut", 104, 8, 8, 0, 0}}));
}

TEST(TextureArchives, RefusesBadDirectories) {
  ExpectRefused({
      {"WAD directory past the end", 4,
       ArchiveBuilder().text("WAD2").u32(1).u32(500).padTo(120).get()},
      {"WAD count that cannot fit", 5,
       ArchiveBuilder().text("WAD3").u32(4).u32(12).padTo(12 + 3 * 32 + 31).get()},
      {"PACK directory past the end", 70,
       ArchiveBuilder().text("PACK").u32(12).u32(128).padTo(120).get()},
      {"PACK directory offset wraps", 70,
       ArchiveBuilder().text("PACK").u32(0xFFFFFFC0).u32(64).padTo(120).get()},
  });
}

}  // namespace
}  // namespace cairn::test
