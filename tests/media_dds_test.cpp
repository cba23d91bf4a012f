// The DDS writers: the three header templates and their patches, stored and
// "JDLZ"-coded textures through the extraction frame, and a real decoder
// reading the results back.
#include <gtest/gtest.h>

#include "codecs/codecs.h"
#include "media/media.h"
#include "media_support.h"

namespace cairn::test {
namespace {

// Everything up to the pixel format, then the pixel format and the caps.
ArchiveBuilder DdsStart(uint32_t height, uint32_t width, uint32_t mipmaps) {
  ArchiveBuilder b;
  b.text("DDS ").u32(124).u32(0x000A1007).u32(height).u32(width).u32(0).u32(0).u32(mipmaps);
  b.fill(44).u32(32);
  return b;
}

TEST(DdsBuild, TemplatesAndTheirPatches) {
  EXPECT_EQ(DdsHeader(79, '1', 0x00400080),
            DdsStart(64, 128, 0).u32(4).text("DXT1").fill(20).u32(0x00401008).fill(16).get());
  EXPECT_EQ(DdsHeader(79, '3', 0x00400080),
            DdsStart(64, 128, 0).u32(4).text("DXT3").fill(20).u32(0x00401008).fill(16).get());
  // 6 gives 24 bits with the 32-bit masks of the RGBA template.
  const auto rgba = [](uint32_t height, uint32_t width, uint32_t mipmaps, uint32_t bits) {
    return DdsStart(height, width, mipmaps)
        .u32(0x41)
        .u32(0)
        .u32(bits)
        .u32(0x00FF0000)
        .u32(0x0000FF00)
        .u32(0x000000FF)
        .u32(0xFF000000)
        .u32(0x00401008)
        .u32(0x3B000000)
        .u32(0x3B000000)
        .u32(0x3B000000)
        .u32(0x3B000000)
        .get();
  };
  EXPECT_EQ(DdsHeader(79, 6, 0x00020004), rgba(2, 4, 0, 24));
  EXPECT_EQ(DdsHeader(79, 8, 0x00020004), rgba(2, 4, 0, 32));

  // The bundles: low nibble the pixel format, high nibble the mipmap count.
  EXPECT_EQ(DdsHeader(124, 0x12, 0x01000200), rgba(256, 512, 1, 32));
  EXPECT_EQ(DdsHeader(123, 0x25, 0x00100010),
            DdsStart(16, 16, 2).u32(4).text("DXT5").fill(20).u32(0x00401008).fill(16).get());
  EXPECT_EQ(DdsHeader(157, 0xF3, 0x00100010),
            DdsStart(16, 16, 15).u32(4).text("DXT1").fill(20).u32(0x00401008).fill(16).get());
  EXPECT_EQ(DdsHeader(157, 0x04, 0x00100010),
            DdsStart(16, 16, 0).u32(4).text("DXT3").fill(20).u32(0x00401008).fill(16).get());
  EXPECT_EQ(DdsHeader(124, 0x31, 0x00080008),
            DdsStart(8, 8, 3).u32(0x20).u32(0).u32(8).fill(16).u32(0x00401008).fill(16).get());
  // The height is a signed 16-bit number.
  EXPECT_EQ(ByteView(DdsHeader(124, 0x01, 0x8000FFFF)).u32le(12), 0xFFFF8000u);
  EXPECT_EQ(ByteView(DdsHeader(124, 0x01, 0x8000FFFF)).u32le(16), 0xFFFFu);

  // Flags that name no pixel format.
  for (uint8_t flag : {0, 0xD5, 7, 0x32, 0x35}) EXPECT_THROW(DdsHeader(79, flag, 0), BadData);
  for (uint8_t flag : {0x00, 0x10, 0x06, 0x0F})
    for (FormatId id : {123u, 124u, 157u}) EXPECT_THROW(DdsHeader(id, flag, 0), BadData);
}

TEST(DdsMethods, StoredTexturesFollowTheHeader) {
  const Bytes data = Pattern(40);
  for (FormatId id : {79u, 124u, 157u, 123u}) {
    MediaArchive a(id, data);
    const uint8_t flag = id == 79 ? '1' : 0x13;
    a.add("t.dds", 4, 128 + 32, 32, 0x00080008, flag).add("bad.dds", 4, 160, 32, 0x00080008, 0);
    EXPECT_EQ(a.extract(0), Join(DdsHeader(id, flag, 0x00080008), Slice(data, 4, 32))) << id;
    Bytes out;
    EXPECT_EQ(a.extract(1, out), kBadData) << id;
  }
}

// "JDLZ", 4 bytes, the decoded size, the block size, the coded bytes.
Bytes JdlzBlock(uint32_t decoded, const Bytes& coded) {
  return ArchiveBuilder()
      .text("JDLZ")
      .u32(0)
      .u32(decoded)
      .u32(16 + static_cast<uint32_t>(coded.size()))
      .bytes(coded)
      .get();
}

// 16 bytes of 0x11 then 1024 of 0x22: literal, match of 15 at distance 1,
// literal, match of 1023 at distance 1.
const Bytes kCoded = {0x0A, 0x03, 0x11, 0x00, 0x0C, 0x22, 0x30, 0xFC};

TEST(DdsMethods, CodedTexturesAreDecodedAndTheirPaletteMovedFirst) {
  const Bytes block = JdlzBlock(1040, kCoded);
  MediaArchive a(123, block);
  a.add("pal.dds", 0, 128 + 16 + 1024, static_cast<uint32_t>(block.size()), 0x00040004, 0x11)
      .add("rgba.dds", 0, 128 + 1040, static_cast<uint32_t>(block.size()), 0x00040004, 0x02);
  EXPECT_EQ(a.extract(0),
            Join(Join(DdsHeader(123, 0x11, 0x00040004), Bytes(1024, 0x22)), Bytes(16, 0x11)));
  EXPECT_EQ(a.extract(1),
            Join(Join(DdsHeader(123, 0x02, 0x00040004), Bytes(16, 0x11)), Bytes(1024, 0x22)));

  // A palette texture that decodes to less than a palette.
  const Bytes small = JdlzBlock(1, {0x00, 0x00, 0x11});
  MediaArchive b(123, small);
  b.add("p.dds", 0, 129, static_cast<uint32_t>(small.size()), 0x00010001, 0x01);
  Bytes out;
  EXPECT_EQ(b.extract(0, out), kBadData);
}

TEST(DdsMethods, CodedBlocksThatCannotHoldTheirTextureAreRefused) {
  // More than the coded bytes can give, a block shorter than its header, a
  // block past the end of the archive.
  const Bytes tooBig = JdlzBlock(8 * 2049 + 1, Bytes(8, 0));
  const Bytes shortBlock = ArchiveBuilder().text("JDLZ").u32(0).u32(4).u32(15).fill(8).get();
  const Bytes pastEnd = ArchiveBuilder().text("JDLZ").u32(0).u32(4).u32(100).fill(8).get();
  for (const Bytes& block : {tooBig, shortBlock, pastEnd}) {
    MediaArchive a(123, block);
    a.add("t.dds", 0, 200, static_cast<uint32_t>(block.size()), 0x00040004, 0x02);
    Bytes out;
    EXPECT_EQ(a.extract(0, out), kBadData);
  }
  // Too short to carry the tag: stored.
  MediaArchive c(123, Bytes{'J', 'D', 'L', 'Z', 0, 0, 0, 0});
  c.add("t.dds", 0, 136, 8, 0x00010001, 0x02);
  EXPECT_EQ(c.extract(0), Join(DdsHeader(123, 0x02, 0x00010001), {'J', 'D', 'L', 'Z', 0, 0, 0, 0}));
}

// ---- A real decoder reads what was written --------------------------------

TEST(DdsDecoded, ImageMagickSeesTheExpectedPixels) {
  CAIRN_NEED_TOOL("convert");
  // One DXT1 block: colour 0 pure red, every index 0.
  MediaArchive a(79, ArchiveBuilder().u16(0xF800).u16(0x001F).u32(0).get());
  a.add("t.dds", 0, 136, 8, 0x00040004, '1');
  const std::string t = a.dir.path("t.dds");
  ASSERT_EQ(a.extractTo(0, t), kOk);
  Bytes red;
  for (int i = 0; i < 16; ++i) red = Join(red, {255, 0, 0, 255});
  EXPECT_EQ(DecodeRgba(t), red);

  // 32-bit pixels stored blue, green, red, alpha.
  MediaArchive b(124, Bytes{30, 20, 10, 255, 60, 50, 40, 128});
  b.add("u.dds", 0, 136, 8, 0x00010002, 0x02);
  const std::string u = b.dir.path("u.dds");
  ASSERT_EQ(b.extractTo(0, u), kOk);
  EXPECT_EQ(DecodeRgba(u), (Bytes{10, 20, 30, 255, 40, 50, 60, 128}));
}

}  // namespace
}  // namespace cairn::test
