// The TGA writers: headers, index conversion, and every variant through the
// extraction frame; a real decoder reads the results back.
#include <gtest/gtest.h>
#include <zlib.h>

#include "media/media.h"
#include "media_support.h"

namespace cairn::test {
namespace {

Bytes Header(uint16_t w, uint16_t h, uint8_t type, uint8_t bits, uint8_t descriptor) {
  return ArchiveBuilder().u8(0).u8(0).u8(type).fill(9).u16(w).u16(h).u8(bits).u8(descriptor).get();
}

// 256 red-green-blue colours: colour i is (i, 255 - i, i ^ 0x5A).
Bytes RgbPalette() {
  Bytes p;
  for (int i = 0; i < 256; ++i) {
    p.push_back(static_cast<uint8_t>(i));
    p.push_back(static_cast<uint8_t>(255 - i));
    p.push_back(static_cast<uint8_t>(i ^ 0x5A));
  }
  return p;
}
Bytes Bgr(int i) {
  return {static_cast<uint8_t>(i ^ 0x5A), static_cast<uint8_t>(255 - i), static_cast<uint8_t>(i)};
}

TEST(TgaBuild, HeadersCarryEveryFieldInPlace) {
  EXPECT_EQ(TgaHeader(0x00200040, 24, 0x21),
            (Bytes{0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0x40, 0, 0x20, 0, 24, 0x21}));
  // The whole Extra lands at 12, width low and height high.
  EXPECT_EQ(TgaHeader(0x12345678, 16, 0),
            (Bytes{0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0x78, 0x56, 0x34, 0x12, 16, 0}));

  const Bytes start = TgaColourMappedStart(0x00030002, 8, Bytes{10, 20, 30, 1, 2, 3}, 2);
  ASSERT_EQ(start.size(), 786u);
  EXPECT_EQ(Slice(start, 0, 18), (Bytes{0, 1, 1, 0, 0, 0, 1, 24, 0, 0, 0, 0, 2, 0, 3, 0, 8, 0x20}));
  EXPECT_EQ(Slice(start, 18, 7), (Bytes{30, 20, 10, 3, 2, 1, 0}));
  EXPECT_EQ(Slice(start, 25, 761), Bytes(761, 0));
  // More colours than the map holds: the first 256 fill it.
  const Bytes full = TgaColourMappedStart(0, 16, Pattern(900), 300);
  EXPECT_EQ(full[16], 16);
  EXPECT_EQ(Slice(full, 18 + 765, 3),
            (Bytes{Pattern(900)[767], Pattern(900)[766], Pattern(900)[765]}));
  // Fewer colours stored than claimed is an error, not a read past them.
  EXPECT_THROW(TgaColourMappedStart(0, 8, Bytes{1, 2, 3}, 2), BadData);
}

TEST(TgaBuild, IndicesBecomeColoursAndUnknownOnesBlack) {
  const Bytes palette = {1, 2, 3, 4, 5, 6, 7, 8};  // two 4-byte entries
  EXPECT_EQ(ExpandIndices(Bytes{1, 0, 2, 1}, palette, 4, 3),
            (Bytes{5, 6, 7, 1, 2, 3, 0, 0, 0, 5, 6, 7}));
  EXPECT_EQ(ExpandIndices(Bytes{1, 9}, palette, 4, 4), (Bytes{5, 6, 7, 8, 0, 0, 0, 0}));
  EXPECT_EQ(ExpandIndices(Bytes{2}, Bytes{1, 2, 3, 4, 5, 6}, 2, 2), (Bytes{5, 6}));
  EXPECT_TRUE(ExpandIndices(Bytes{}, palette, 4, 3).empty());

  Bytes pixels = {1, 2, 3, 4, 5, 6, 7, 8, 9, 10};
  SwapRedBlue(pixels);
  EXPECT_EQ(pixels, (Bytes{3, 2, 1, 4, 7, 6, 5, 8, 9, 10}));
  EXPECT_EQ(BgrFromRgb(Bytes{1, 2, 3, 4, 5, 6}), (Bytes{3, 2, 1, 6, 5, 4}));
}

TEST(TgaMethods, BuiltInPalettesDrawWad2AndPackPictures) {
  // A "WAD2" picture: width and height, then one index a pixel.
  const Bytes wad2 = ArchiveBuilder().u32(2).u32(2).u8(0).u8(15).u8(255).u8(16).get();
  // A "PACK" picture: 100 bytes of head, then the indices.
  const Bytes pack = ArchiveBuilder().fill(100, 0xEE).u8(1).u8(14).u8(255).u8(0).get();
  MediaArchive a(4, ArchiveBuilder().u32(0).bytes(wad2).bytes(pack).get());
  a.add("pic", 4, 12, 12, 0, 0)
      .add("_TO_TGA_\\pic.tga", 4, 30, 12, 0x00020002, 1)
      .add("_TO_TGA_\\pack.tga", 16, 30, 104, 0x00020002, 2)
      .add("_TO_TGA_\\short.tga", 16, 30, 103, 0x00020002, 2);
  EXPECT_EQ(a.extract(0), wad2);
  EXPECT_EQ(a.extract(1), Join(Header(2, 2, 2, 24, 0x21),
                               {0, 0, 0, 0xEB, 0xEB, 0xEB, 0x53, 0x5B, 0x9F, 0x07, 0x0B, 0x0F}));
  EXPECT_EQ(a.extract(2), Join(Header(2, 2, 2, 24, 0x21),
                               {0x0F, 0x0F, 0x0F, 0xDB, 0xDB, 0xDB, 0x53, 0x5B, 0x9F, 0, 0, 0}));
  Bytes out;
  EXPECT_EQ(a.extract(3, out), kBadData);  // three indices for four pixels
}

TEST(TgaMethods, Wad3PicturesUseThePaletteAtTheirEnd) {
  const auto picture = [](size_t head) {
    return ArchiveBuilder()
        .fill(head, 0xAA)
        .u8(3)
        .u8(200)
        .u8(0)
        .u8(255)
        .fill(5, 0xBB)
        .u16(256)
        .bytes(RgbPalette())
        .u16(0)
        .get();
  };
  const Bytes first = picture(40), second = picture(8);
  MediaArchive a(5, Join(first, second));
  a.add("a.tga", 0, 30, static_cast<uint32_t>(first.size()), 0x00010004, 1)
      .add("b.tga", static_cast<uint32_t>(first.size()), 18 + 6,
           static_cast<uint32_t>(second.size()), 0x00010002, 2)
      .add("tiny.tga", 0, 30, 769, 0x00010004, 1);
  Bytes pixels = Join(Join(Bgr(3), Bgr(200)), Join(Bgr(0), Bgr(255)));
  EXPECT_EQ(a.extract(0), Join(Header(4, 1, 2, 24, 0x20), pixels));
  EXPECT_EQ(a.extract(1), Join(Header(2, 1, 2, 24, 0x20), Slice(pixels, 0, 6)));
  Bytes out;
  EXPECT_EQ(a.extract(2, out), kBadData);  // too short to hold a palette
}

TEST(TgaMethods, AtlasHeaderThenInflatedPixels) {
  const Bytes pixels = Pattern(64);
  const Bytes z = Compress(pixels);
  const auto size = static_cast<uint32_t>(z.size());
  MediaArchive tr4(39, z);
  tr4.add("c0", 0, 64, size, 0, 0)
      .add("c1", 0, 64, size, 0, 1)
      .add("t32", 0, 82, size, 0x00040004, 2)
      .add("t16", 0, 82, size, 0x00040008, 4)
      .add("small", 0, 81, size, 0x00040004, 3);
  EXPECT_EQ(tr4.extract(0), z);
  EXPECT_EQ(tr4.extract(1), pixels);
  EXPECT_EQ(tr4.extract(2), Join(Header(4, 4, 2, 32, 0x20), pixels));
  EXPECT_EQ(tr4.extract(3), Join(Header(8, 4, 2, 16, 0x20), pixels));
  Bytes out;
  EXPECT_EQ(tr4.extract(4, out), kBadData);  // inflates to more than the picture

  MediaArchive tex(120, z);
  tex.add("x.TEX24", 0, 82, size, 0x00010010, 2);
  EXPECT_EQ(tex.extract(0), Join(Header(16, 1, 2, 24, 0x20), pixels));
}

TEST(TgaMethods, StoredPixelsFollowTheHeader) {
  // "1XFG": the picture is exactly what the header describes, even when the
  // chunk holds no more than its pixels.
  const Bytes data = Pattern(13);
  MediaArchive a(40, data);
  a.add("IMGE", 0, 13, 13, 0, 0)
      .add("_TO_TGA_\\IMGE.tga", 0, 26, 13, 0x00020002, 1)
      .add("_TO_TGA_\\exact.tga", 0, 26, 8, 0x00020002, 1)
      .add("_TO_TGA_\\short.tga", 0, 26, 7, 0x00020002, 1);
  EXPECT_EQ(a.extract(0), data);
  EXPECT_EQ(a.extract(1), Join(Header(2, 2, 2, 16, 0x20), Slice(data, 0, 8)));
  EXPECT_EQ(a.extract(2), Join(Header(2, 2, 2, 16, 0x20), Slice(data, 0, 8)));
  Bytes out;
  EXPECT_EQ(a.extract(3, out), kBadData);

  for (FormatId id : {47u, 71u, 72u, 134u, 139u, 141u, 152u}) {
    MediaArchive b(id, data);
    b.add("raw", 0, 13, 13, 0, 0).add("p.tga", 1, 30, 12, 0x00010004, 24);
    EXPECT_EQ(b.extract(0), data) << id;
    EXPECT_EQ(b.extract(1), Join(Header(4, 1, 2, 24, 0x20), Slice(data, 1, 12))) << id;
  }
}

TEST(TgaMethods, LeadingPaletteBecomesTheColourMap) {
  // u16 count, the colours, the picture size, the pixels.
  const Bytes data = ArchiveBuilder()
                         .u16(2)
                         .u8(10)
                         .u8(20)
                         .u8(30)
                         .u8(40)
                         .u8(50)
                         .u8(60)
                         .u32(0x00010003)
                         .u8(1)
                         .u8(0)
                         .u8(1)
                         .get();
  MediaArchive a(78, ArchiveBuilder().fill(5).bytes(data).get());
  a.add("p.x.tga", 5, 789, static_cast<uint32_t>(data.size()), 0x00010003, 8)
      .add("bad.tga", 5, 789, 11, 0x00010003, 8);
  Bytes expected = Join(ArchiveBuilder()
                            .u8(0)
                            .u8(1)
                            .u8(1)
                            .u16(0)
                            .u16(256)
                            .u8(24)
                            .fill(4)
                            .u16(3)
                            .u16(1)
                            .u8(8)
                            .u8(0x20)
                            .get(),
                        {30, 20, 10, 60, 50, 40});
  expected.resize(786, 0);
  expected = Join(expected, {1, 0, 1});
  EXPECT_EQ(a.extract(0), expected);
  EXPECT_EQ(a.extract(0), expected);  // the entry is left as it was
  Bytes out;
  EXPECT_EQ(a.extract(1, out), kBadData);  // the palette runs past the entry

  // More colours than a byte can index: the map takes 256, the pixels still
  // start behind all of them.
  ArchiveBuilder big;
  big.u16(300).bytes(Pattern(900)).u32(0x00010001).u8(7);
  MediaArchive b(78, big.get());
  b.add("big.tga", 0, 787, static_cast<uint32_t>(big.size()), 0x00010001, 8);
  const Bytes got = b.extract(0);
  ASSERT_EQ(got.size(), 787u);
  EXPECT_EQ(Slice(got, 18, 3), (Bytes{Pattern(900)[2], Pattern(900)[1], Pattern(900)[0]}));
  EXPECT_EQ(got.back(), 7);
}

TEST(TgaMethods, ChunkPicturesOfBothLayouts) {
  // FormatId 92: the pixels start 41 bytes plus the name's length into the
  // chunk; FormatId 111: 33 bytes in, width and height exchanged.
  const Bytes pixels = {1, 2, 3, 4, 5, 6, 7, 8};
  Bytes chunk92 = ArchiveBuilder().fill(36, 0xCC).text("tex").u8(0).padTo(44).bytes(pixels).get();
  chunk92.resize(104, 0xCC);
  MediaArchive a(92, Join(Bytes(3, 0), chunk92));
  a.add("tex.ABGR", 3, 104, 104, 0, 0).add("tex.tga", 3, 26, 0, 0x00010002, 1);
  EXPECT_EQ(a.extract(1), Join(Header(2, 1, 2, 32, 0x21), {3, 2, 1, 4, 7, 6, 5, 8}));

  Bytes noName = Bytes(104, 0xCC);  // no terminator inside the chunk head
  MediaArchive bad(92, noName);
  bad.add("x.tga", 0, 26, 0, 0x00010002, 1);
  Bytes out;
  EXPECT_EQ(bad.extract(0, out), kBadData);

  const Bytes indexed = ArchiveBuilder()
                            .fill(33, 0xDD)
                            .u8(0)
                            .u8(1)
                            .u8(2)
                            .u8(1)
                            .u32(2)
                            .u8(10)
                            .u8(20)
                            .u8(30)
                            .u8(40)
                            .u8(50)
                            .u8(60)
                            .u8(70)
                            .u8(80)
                            .get();
  MediaArchive b(111, indexed);
  b.add("p.tga", 0, 34, 0, 0x00010004, 2).add("q.tga", 0, 34, 0, 0x00020002, 1);
  EXPECT_EQ(b.extract(0), Join(Header(1, 4, 2, 32, 0),
                               {30, 20, 10, 40, 70, 60, 50, 80, 0, 0, 0, 0, 70, 60, 50, 80}));
  EXPECT_EQ(b.extract(1),
            Join(Header(2, 2, 2, 32, 0), {2, 1, 0, 1, 0, 0, 2, 0, 30, 20, 10, 40, 70, 60, 50, 80}));

  // Pixels that would lie past the end of the archive are refused before
  // anything is allocated for them.
  MediaArchive huge(111, indexed);
  huge.add("h.tga", 0, 18, 0, 0xFFFFFFFF, 1);
  EXPECT_EQ(huge.extract(0, out), kBadData);
}

TEST(TgaMethods, PixelObjectReadsFromPosition125) {
  Bytes file = ArchiveBuilder().fill(125, 0x11).u8(0).u8(249).u8(250).u8(255).get();
  file.resize(4 + 140, 0x22);
  file = Join(file, Pattern(1000));
  file.resize(file.size() + 8, 0x33);
  MediaArchive a(145, file);
  a.add("a.tga", 7, 34, 9, 0x00020002, 1)
      .add("b.tga", 7, 30, 9, 0x00020002, 2)
      .add("c.tga", 7, 34, 9, 0x00020002, 3)
      .add("d.tga", 7, 34, 9, 0x04000400, 3);
  const Bytes p = Pattern(1000);
  EXPECT_EQ(a.extract(0), Join(Header(2, 2, 2, 32, 0x20),
                               Join(Join(Slice(p, 0, 4), Slice(p, 996, 4)), Bytes(8, 0))));
  EXPECT_EQ(a.extract(1), Join(Header(2, 2, 2, 24, 0x20), Slice(file, 125, 12)));
  EXPECT_EQ(a.extract(2), Join(Header(2, 2, 2, 32, 0x20), Slice(file, 125, 16)));
  Bytes out;
  EXPECT_EQ(a.extract(3, out), kBadData);
}

TEST(TgaMethods, TrailingPaletteFollowsThePixels) {
  const Bytes file = ArchiveBuilder()
                         .u32(4)
                         .u32(2)
                         .u32(2)
                         .u8(0)
                         .u8(1)
                         .u8(0)
                         .u8(255)
                         .u8(10)
                         .u8(20)
                         .u8(30)
                         .fill(762)
                         .u8(1)
                         .u8(2)
                         .u8(3)
                         .get();
  MediaArchive a(151, file);
  a.add("p.tga", 12, 790, 4, 0x00020002, 24);
  const Bytes got = a.extract(0);
  ASSERT_EQ(got.size(), 790u);
  EXPECT_EQ(Slice(got, 0, 18), (Bytes{0, 1, 1, 0, 0, 0, 1, 24, 0, 0, 0, 0, 2, 0, 2, 0, 8, 0x20}));
  EXPECT_EQ(Slice(got, 18, 3), (Bytes{30, 20, 10}));
  EXPECT_EQ(Slice(got, 18 + 765, 3), (Bytes{3, 2, 1}));
  EXPECT_EQ(Slice(got, 786, 4), (Bytes{0, 1, 0, 255}));

  MediaArchive cut(151, Slice(file, 0, file.size() - 1));
  cut.add("p.tga", 12, 790, 4, 0x00020002, 24);
  Bytes out;
  EXPECT_EQ(cut.extract(0, out), kBadData);
}

TEST(TgaMethods, ImageSequencePicturesByFlag) {
  // Flag 1: indices, 8 spare bytes, 256 colours of 16 bits.
  ArchiveBuilder b;
  b.u8(2).u8(0).u8(255).u8(1).fill(8, 0x99);
  for (int i = 0; i < 256; ++i) b.u16(static_cast<uint16_t>(0x1000 + i));
  const Bytes data = b.get();
  MediaArchive a(137, data);
  a.add("img.000000", 0, 524, 524, 0, 0)
      .add("pal.tga", 0, 26, 524, 0x00020002, 1)
      .add("raw16.tga", 0, 22, 4, 0x00010002, 3)
      .add("none.tga", 0, 26, 524, 0x00020002, 4)
      .add("few.tga", 0, 36, 524, 0x00020003, 1);
  EXPECT_EQ(a.extract(0), data);
  EXPECT_EQ(a.extract(1), Join(Header(2, 2, 2, 16, 0x20), {2, 0x10, 0, 0x10, 0xFF, 0x10, 1, 0x10}));
  EXPECT_EQ(a.extract(2), Join(Header(2, 1, 2, 16, 0x20), Slice(data, 0, 4)));
  EXPECT_EQ(a.extract(3), Bytes{});
  Bytes out;
  EXPECT_EQ(a.extract(4, out), kBadData);
}

// ---- A real decoder reads what was written --------------------------------

TEST(TgaDecoded, ImageMagickSeesTheExpectedPixels) {
  CAIRN_NEED_TOOL("convert");
  // 24-bit from built-in palette 2 (descriptor 0x21), colour-mapped with a
  // trailing palette, 32-bit with red and blue exchanged, 16-bit.
  MediaArchive wad(4, ArchiveBuilder().u32(2).u32(1).u8(15).u8(255).get());
  wad.add("w.tga", 0, 24, 10, 0x00010002, 1);
  const std::string w = wad.dir.path("w.tga");
  ASSERT_EQ(wad.extractTo(0, w), kOk);
  EXPECT_EQ(DecodeRgba(w), (Bytes{0xEB, 0xEB, 0xEB, 255, 0x9F, 0x5B, 0x53, 255}));

  const Bytes file = ArchiveBuilder()
                         .u32(4)
                         .u32(2)
                         .u32(2)
                         .u8(0)
                         .u8(1)
                         .u8(1)
                         .u8(0)
                         .u8(10)
                         .u8(20)
                         .u8(30)
                         .u8(200)
                         .u8(100)
                         .u8(50)
                         .fill(762)
                         .get();
  MediaArchive pal(151, file);
  pal.add("p.tga", 12, 790, 4, 0x00020002, 24);
  const std::string p = pal.dir.path("p.tga");
  ASSERT_EQ(pal.extractTo(0, p), kOk);
  EXPECT_EQ(DecodeRgba(p),
            (Bytes{10, 20, 30, 255, 200, 100, 50, 255, 200, 100, 50, 255, 10, 20, 30, 255}));

  // Stored as red, green, blue, alpha; the file holds blue first.
  MediaArchive chunk(
      111,
      ArchiveBuilder().fill(33).u8(10).u8(20).u8(30).u8(255).u8(40).u8(50).u8(60).u8(255).get());
  chunk.add("c.tga", 0, 26, 0, 0x00010002, 1);  // 1 wide, 2 high once exchanged
  const std::string c = chunk.dir.path("c.tga");
  ASSERT_EQ(chunk.extractTo(0, c), kOk);
  // Descriptor 0: bottom row first.
  EXPECT_EQ(DecodeRgba(c), (Bytes{40, 50, 60, 255, 10, 20, 30, 255}));

  // 16-bit pixels of 5-5-5: pure red, green, blue and white.
  MediaArchive seq(137, ArchiveBuilder().u16(0x7C00).u16(0x03E0).u16(0x001F).u16(0x7FFF).get());
  seq.add("s.tga", 0, 26, 8, 0x00020002, 3);
  const std::string s = seq.dir.path("s.tga");
  ASSERT_EQ(seq.extractTo(0, s), kOk);
  EXPECT_EQ(DecodeRgba(s),
            (Bytes{255, 0, 0, 255, 0, 255, 0, 255, 0, 0, 255, 255, 255, 255, 255, 255}));
}

}  // namespace
}  // namespace cairn::test
