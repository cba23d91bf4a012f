// The BMP writers: headers, row order and padding, palettes and the colour
// table lookup, every variant through the extraction frame, and a real
// decoder reading the results back.
#include <gtest/gtest.h>

#include <algorithm>

#include "media/media.h"
#include "media/palettes.h"
#include "media_support.h"

namespace cairn::test {
namespace {

Bytes Palette4() {
  return Bytes(kBuiltInPalette4.begin(), kBuiltInPalette4.end());
}
Bytes Palette3() {
  return Bytes(kBuiltInPalette3.begin(), kBuiltInPalette3.end());
}

// An ".act" table: colour i is (i, i / 2, 255 - i); as BMP entries blue first.
Bytes Act() {
  Bytes b;
  for (int i = 0; i < 256; ++i)
    b.insert(b.end(),
             {static_cast<uint8_t>(i), static_cast<uint8_t>(i / 2), static_cast<uint8_t>(255 - i)});
  return b;
}
Bytes ActAsBmp() {
  Bytes b;
  for (int i = 0; i < 256; ++i)
    b.insert(b.end(), {static_cast<uint8_t>(255 - i), static_cast<uint8_t>(i / 2),
                       static_cast<uint8_t>(i), 0});
  return b;
}

// `rows` rows of `rowBytes`, top row first, as BMP stores them.
Bytes BmpRows(const Bytes& src, size_t rowBytes, size_t rows) {
  Bytes out;
  for (size_t r = rows; r-- > 0;) {
    out = Join(out, Slice(src, r * rowBytes, rowBytes));
    out.resize(out.size() + (4 - rowBytes % 4) % 4, 0);
  }
  return out;
}

TEST(BmpBuild, HeadersCarryEveryFieldInPlace) {
  EXPECT_EQ(BmpHeader(1094, 4, 4, 8), (ArchiveBuilder()
                                           .text("BM")
                                           .u32(1094)
                                           .u32(0)
                                           .u32(1078)
                                           .u32(40)
                                           .u32(4)
                                           .u32(4)
                                           .u16(1)
                                           .u16(8)
                                           .u32(0)
                                           .u32(0)
                                           .u32(0)
                                           .u32(0)
                                           .u32(0)
                                           .u32(0)
                                           .get()));
  EXPECT_EQ(BmpHeader(78, 3, 2, 16), (ArchiveBuilder()
                                          .text("BM")
                                          .u32(78)
                                          .u32(0)
                                          .u32(66)
                                          .u32(40)
                                          .u32(3)
                                          .u32(2)
                                          .u16(1)
                                          .u16(16)
                                          .u32(3)
                                          .u32(0)
                                          .u32(0)
                                          .u32(0)
                                          .u32(0)
                                          .u32(0)
                                          .u32(0xF800)
                                          .u32(0x07E0)
                                          .u32(0x001F)
                                          .get()));

  EXPECT_EQ(Slice(BmpPaletteFromRgb(Act()), 0, 8), (Bytes{255, 0, 0, 0, 254, 0, 1, 0}));
  EXPECT_EQ(BmpPaletteFromRgb(Act()), ActAsBmp());
  EXPECT_THROW(BmpPaletteFromRgb(Bytes(767, 0)), BadData);

  const std::pair<uint32_t, std::pair<uint32_t, uint32_t>> sizes[] = {
      {307200, {640, 480}}, {256000, {640, 400}}, {128000, {640, 200}},
      {65536, {256, 256}},  {64000, {320, 200}},  {27648, {256, 108}},
      {20480, {320, 64}},   {8000, {320, 25}},    {4096, {64, 64}}};
  for (const auto& [bytes, size] : sizes) EXPECT_EQ(RawPictureSize(bytes), size) << bytes;
  EXPECT_FALSE(RawPictureSize(64001));
  EXPECT_FALSE(RawPictureSize(0));
}

TEST(BmpBuild, RowsAreReversedAndPadded) {
  Bytes a = {1, 2, 3, 4, 5, 6, 0xEE, 0xEE};  // two rows of 3, room for padding
  ArrangeBmpRows(a, 3, 2);
  EXPECT_EQ(a, (Bytes{4, 5, 6, 0, 1, 2, 3, 0}));

  Bytes b = {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12};  // an odd height keeps its middle row
  ArrangeBmpRows(b, 4, 3);
  EXPECT_EQ(b, (Bytes{9, 10, 11, 12, 5, 6, 7, 8, 1, 2, 3, 4}));

  Bytes c = Join(Pattern(5 * 7), Bytes(7 * 3, 0xEE));  // rows of 5 in strides of 8
  ArrangeBmpRows(c, 5, 7);
  EXPECT_EQ(c, BmpRows(Pattern(5 * 7), 5, 7));

  Bytes one = {9, 8};
  EXPECT_THROW(ArrangeBmpRows(one, 2, 1), BadData);  // no room for the padding
  Bytes none;
  ArrangeBmpRows(none, 3, 0);
  EXPECT_TRUE(none.empty());
}

TEST(BmpMethods, FixedLayoutPicturesOfBothHeights) {
  // Palette at 140 (red and blue exchanged on the way), pixels at 1168.
  Bytes file = ArchiveBuilder().fill(140, 0x77).bytes(Pattern(1024, 3)).fill(4, 0x66).get();
  const Bytes pixels = Pattern(512 * 256, 9);
  file = Join(file, pixels);
  MediaArchive a(100, file);
  a.add("name.bmp", 0, 132150, 132150, 0, 0);
  const Bytes got = a.extract(0);
  ASSERT_EQ(got.size(), 132150u);
  EXPECT_EQ(Slice(got, 0, 54), BmpHeader(132150, 512, 256, 8));
  Bytes palette = Pattern(1024, 3);
  SwapRedBlue(palette);
  EXPECT_EQ(Slice(got, 54, 1024), palette);
  EXPECT_EQ(Slice(got, 1078, 512), Slice(pixels, 255 * 512, 512));
  EXPECT_EQ(Slice(got, 1078 + 255 * 512, 512), Slice(pixels, 0, 512));

  // The same file is too short for a 512 x 512 picture.
  MediaArchive b(99, file);
  b.add("name.bmp", 0, 263222, 263222, 0, 0);
  Bytes out;
  EXPECT_EQ(b.extract(0, out), kBadData);
}

TEST(BmpMethods, RawPicturesFindTheirColourTable) {
  // A 64 x 64 picture, its ".act" in another letter case, "art\vga.act",
  // and conversions with and without a companion.
  const Bytes pixels = Pattern(4096, 5);
  Bytes vga = Act();
  std::reverse(vga.begin(), vga.end());
  ArchiveBuilder file;
  file.bytes(pixels).bytes(Act()).bytes(vga).fill(100, 0x44);
  MediaArchive a(104, file.get());
  a.add("gfx\\title.raw", 0, 4096, 4096, 0, 0)
      .add("_TO_BMP_\\gfx\\title.raw.bmp", 0, 5174, 4096, 0, 1)
      .add("GFX\\TITLE.ACT", 4096, 768, 768, 0, 0)
      .add("_TO_BMP_\\other.raw.bmp", 0, 5174, 4096, 0, 1)
      .add("ART\\VGA.ACT", 4096 + 768, 768, 768, 0, 0)
      .add("_TO_BMP_\\odd.raw.bmp", 0, 5174, 4095, 0, 1);
  const Bytes rows = BmpRows(pixels, 64, 64);
  EXPECT_EQ(a.extract(0), pixels);
  EXPECT_EQ(a.extract(1), Join(Join(BmpHeader(5174, 64, 64, 8), ActAsBmp()), rows));
  Bytes vgaPalette = BmpPaletteFromRgb(vga);
  EXPECT_EQ(a.extract(3), Join(Join(BmpHeader(5174, 64, 64, 8), vgaPalette), rows));
  Bytes out;
  EXPECT_EQ(a.extract(5, out), kBadData);  // no picture has 4095 bytes

  // Without any colour table, and with a table too short to be one, the
  // built-in palette draws the picture; a name too short to hold a
  // companion's goes straight on to the fallback.
  MediaArchive b(104, file.get());
  b.add("_TO_BMP_\\pic.raw.bmp", 0, 5174, 4096, 0, 1)
      .add("pic.act", 4096, 700, 700, 0, 0)
      .add("_TO_BMP_.bmp", 0, 5174, 4096, 0, 1);
  EXPECT_EQ(b.extract(0), Join(Join(BmpHeader(5174, 64, 64, 8), Palette4()), rows));
  EXPECT_EQ(b.extract(2), Join(Join(BmpHeader(5174, 64, 64, 8), Palette4()), rows));
}

TEST(BmpMethods, ImageSequencePicturesTakePalette3AndTheirOwnHeader) {
  // A 29-byte image header (type, width, height, ...) in front of 3 x 2
  // pixels, whose rows need one byte of padding each.
  const Bytes file =
      ArchiveBuilder().u8(2).u32(3).u32(2).fill(20).u8(1).u8(2).u8(3).u8(4).u8(5).u8(6).get();
  MediaArchive a(135, file);
  a.add("_TO_BMP_\\s.r8.000000.bmp", 29, 1086, 6, 0, 2)
      .add("_TO_BMP_\\early.bmp", 28, 1086, 6, 0, 2)
      .add("_TO_BMP_\\short.bmp", 29, 1086, 5, 0, 2);
  EXPECT_EQ(a.extract(0),
            Join(Join(BmpHeader(1086, 3, 2, 8), Palette3()), {4, 5, 6, 0, 1, 2, 3, 0}));
  Bytes out;
  EXPECT_EQ(a.extract(1, out), kBadData);  // no room for an image header in front
  EXPECT_EQ(a.extract(2, out), kBadData);  // fewer pixels than the header says
}

TEST(BmpMethods, SixteenBitPicturesAreFlippedAndPadded) {
  // Three rows: the middle one stays; a one-pixel row is padded to 4 bytes.
  const Bytes rows3 = ArchiveBuilder().u16(1).u16(2).u16(3).u16(4).u16(5).u16(6).get();
  for (FormatId id : {140u, 149u}) {
    MediaArchive a(id, Join(Bytes(22, 0xAB), rows3));
    a.add("p.bmp", 22, 78, 12, 0x00030002, 0)
        .add("q.bmp", 22, 72, 6, 0x00030001, 0)
        .add("r.bmp", 22, 66, 0, 0x00000005, 0)
        .add("s.bmp", 24, 78, 12, 0x00030002, 0);
    EXPECT_EQ(a.extract(0), Join(BmpHeader(78, 2, 3, 16),
                                 ArchiveBuilder().u16(5).u16(6).u16(3).u16(4).u16(1).u16(2).get()));
    EXPECT_EQ(a.extract(1), Join(BmpHeader(78, 1, 3, 16),
                                 ArchiveBuilder().u16(3).u16(0).u16(2).u16(0).u16(1).u16(0).get()));
    EXPECT_EQ(a.extract(2), BmpHeader(66, 5, 0, 16));
    Bytes out;
    EXPECT_EQ(a.extract(3, out), kBadData);  // the pixels run past the end
  }
}

// ---- A real decoder reads what was written --------------------------------

TEST(BmpDecoded, ImageMagickSeesTheExpectedPixels) {
  CAIRN_NEED_TOOL("convert");
  // 8-bit through an ".act" table, 3 x 2 with padding.
  const Bytes seq =
      ArchiveBuilder().u8(2).u32(3).u32(2).fill(20).u8(0).u8(1).u8(2).u8(3).u8(0).u8(1).get();
  MediaArchive a(135, seq);
  a.add("s.bmp", 29, 1086, 6, 0, 2);
  const std::string s = a.dir.path("s.bmp");
  ASSERT_EQ(a.extractTo(0, s), kOk);
  // Palette 3: black, 58 28 28, F0 A0 A8, 40 08 18 (red, green, blue).
  EXPECT_EQ(DecodeRgba(s),
            (Bytes{0,    0,    0,    255, 0x58, 0x28, 0x28, 255, 0xF0, 0xA0, 0xA8, 255,
                   0x40, 0x08, 0x18, 255, 0,    0,    0,    255, 0x58, 0x28, 0x28, 255}));

  const Bytes pixels = Pattern(4096, 5);
  MediaArchive b(104, Join(pixels, Act()));
  b.add("_TO_BMP_\\t.raw.bmp", 0, 5174, 4096, 0, 1).add("t.act", 4096, 768, 768, 0, 0);
  const std::string t = b.dir.path("t.bmp");
  ASSERT_EQ(b.extractTo(0, t), kOk);
  Bytes expected;
  for (uint8_t i : pixels)
    expected.insert(expected.end(),
                    {i, static_cast<uint8_t>(i / 2), static_cast<uint8_t>(255 - i), 255});
  EXPECT_EQ(DecodeRgba(t), expected);

  // 16-bit 5-6-5, 3 x 2: red, green, blue / white, black, red.
  MediaArchive c(
      140,
      ArchiveBuilder().u16(0xF800).u16(0x07E0).u16(0x001F).u16(0xFFFF).u16(0).u16(0xF800).get());
  c.add("c.bmp", 0, 78, 12, 0x00020003, 0);
  const std::string p = c.dir.path("c.bmp");
  ASSERT_EQ(c.extractTo(0, p), kOk);
  EXPECT_EQ(DecodeRgba(p), (Bytes{255, 0,   0,   255, 0, 255, 0, 255, 0,   0, 255, 255,
                                  255, 255, 255, 255, 0, 0,   0, 255, 255, 0, 0,   255}));
}

}  // namespace
}  // namespace cairn::test
