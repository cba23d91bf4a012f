// Files of one picture or one stream, listed as the file they convert to.
#include <gtest/gtest.h>

#include "media/media.h"
#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

// A 9 x 5 picture of 16-bit pixels as a BMP file: bottom row first, rows
// padded from 18 to 20 bytes.
Bytes Bmp9x5(const Bytes& pixels) {
  Bytes b = BmpHeader(166, 9, 5, 16);
  for (size_t r = 5; r-- > 0;) b = Cat({b, Slice(pixels, r * 18, 18), {0, 0}});
  return b;
}

CAIRN_SAMPLES(SinglePictureSamples) {
  const Bytes px = Pattern(90, 3), jpeg = Pattern(150, 4), inner = Cat({B().u32(150).get(), jpeg});
  const Bytes syj = B().u16(256).bytes(Pattern(200)).get(),
              r555 = B().u32(9).bytes(px).fill(10).get();
  const Bytes tex = B().text("TEX").bytes({0, 1, 0}).u32(9).u32(5).padTo(22).bytes(px).get();
  const Bytes anm = B().u32(100).u32(4).bytes(px).padTo(108).get();
  const Bytes rsb = B().u32(1).u32(9).u32(5).padTo(28).bytes(px).get();
  const Bytes nif = B().text("NetImmerse File Format, ")
                        .padTo(52)
                        .text("NiPixelData")
                        .padTo(83)
                        .u8(24)
                        .padTo(107)
                        .u32(2)
                        .u32(2)
                        .padTo(125)
                        .bytes(Pattern(12))
                        .get();
  const Bytes olz = Cat({{0xFB}, Pattern(112), {0, 0, 0xFC}}),
              decoded = Cat({Pattern(112), Bytes(3, Pattern(112)[111])});
  const Bytes z = Compress(inner, 0);
  const Bytes jaz = B().u8(1).u32(uint32_t(z.size())).u32(154).bytes(z).get();
  const uint32_t zs = uint32_t(z.size());
  auto Qfs = [&](uint8_t kind, size_t spare) {
    const Bytes f = B().u8(kind).u8(0xFB).u16be(0).u8(115).fill(spare).bytes(olz).get();
    return Entries({"coded stream", 125, "car.qfs", f},
                   {{{"car.fsh", uint32_t(5 + spare), 115, 116, 0, 0}, decoded}});
  };
  return {
      Entries({"JPEG without its start", 131, "photo01.syj", syj},
              {{{"photo01.jpg", 0, 212, 202, 0, 0}, Cat({JpegStart(), syj})}}),
      Entries({"headerless 16-bit picture", 134, "sky.555", r555},
              {{{"sky.tga", 0, 122, 104, 0, 16}, Cat({TgaHeader(0, 16, 0x20), r555})}}),
      Entries({"TEX picture as TGA", 139, "wall.tex", tex},
              {{{"wall.tga", 22, 108, 90, 0x50009, 16}, Cat({TgaHeader(0x50009, 16, 0x20), px})}}),
      Entries({"TEX picture as BMP", 140, "wall.565", tex},
              {{{"wall.bmp", 22, 166, 90, 0x50009, 0}, Bmp9x5(px)}}),
      Entries({"width-only picture", 141, "walk.anm", anm},
              {{{"walk.tga", 12, 114, 96, 0xD0004, 16},
                Cat({TgaHeader(0xD0004, 16, 0x20), Slice(anm, 12, 96)})}}),
      Entries({"pixel-data object", 145, "tex.nif", nif},
              {{{"tex.nif.tga", 0, 30, 137, 0x20002, 2},
                Cat({TgaHeader(0x20002, 24, 0x20), Pattern(12)})}}),
      Entries({"28-byte header picture", 149, "picture.rsb", rsb},
              {{{"picture.rsb.bmp", 28, 166, 90, 0x50009, 0}, Bmp9x5(px)}}),
      Qfs(16, 0),
      Qfs(17, 3),
      Entries(
          {"compressed JPEG container", 109, "pic.jaz", jaz},
          {{{"pic", 9, 154, zs, 0, 0}, inner}, {{"_TO_JPG_\\pic.jpg", 9, 150, zs, 154, 1}, jpeg}}),
  };
}

TEST(SinglePictureReaders, TakeTheirGeometryOrRefuse) {
  ExpectLists(134, Bytes(614400, 1), {{"test.tga", 0, 614418, 614400, 0x01E00280, 16}});
  const SampleTable rows = SinglePictureSamples();
  ExpectRefused({
      {"side beyond 16 bits", 139, With(rows[2], 6, 0x10000)},
      {"width 0", 141, With(rows[4], 4, 0)},
      {"pixels past 4 GiB", 149,
       B().bytes(rows[6].bytes).patch32(4, 0xFFFF).patch32(8, 0xFFFF).get()},
      {"stream that inflates to less than its length", 109,
       B().u8(1).u32(95).u32(3).bytes(Compress({1, 2, 3}, 0)).padTo(104).get()},
  });
}

}  // namespace
}  // namespace cairn::test
