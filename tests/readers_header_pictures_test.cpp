// Samples and refusals of the nested folders (150), the compressed trailing
// directory (142), the image bank (115) and the pictures whose entry comes
// from their header (78, 79).
#include <gtest/gtest.h>

#include "media/media.h"
#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

B& Folder(B& b, std::string_view name, uint8_t type, uint32_t size, uint32_t at) {
  return b.name(name, 32).fill(4).u8(type).fill(3).u32(size).u32(at);
}

Bytes Vtf(uint32_t flags) {
  return B()
      .text(std::string("VTF\0\x07\0\0\0", 8))
      .padTo(16)
      .u32(0x40004)
      .u32(flags)
      .bytes(Pattern(80))
      .get();
}

CAIRN_SAMPLES(HeaderPictureSamples) {
  // The end record (255) closes "maps"; the empty name closes the top.
  const Bytes p = Pattern(15);
  B pck;
  Folder(Folder(Folder(Folder(pck, "maps", 1, 0, 48), "a", 0, 5, 288), "b", 0, 7, 293), "x", 255, 0,
         0);
  Folder(pck, "top.txt", 0, 3, 300).fill(48).bytes(p);
  // A folder record with 20 bytes after its name, a record with a zero byte in its name.
  const Bytes x = Pattern(64), zx = Compress(x), y = Pattern(40, 3);
  const auto zxs = uint32_t(zx.size());
  B dir = B().fill(8).u16(2).u8(4).text("maps").fill(20).u8(2).text("a").u8(0).u8(9);
  dir.u8(8).text("maps\\x.z").u8(1).u32(0).u32(zxs).u32(64).u8(5).text("y.txt").u8(0).u32(zxs);
  const Bytes zd = Compress(dir.u32(40).u32(40).get());
  const Bytes wd = Cat({zx, y, zd, B().u32(uint32_t(zd.size()) + 4).get()});
  // An empty image, a stored one and a compressed one.
  const Bytes z = Compress(Pattern(100));
  const auto zs = uint32_t(z.size());
  B mult = B().u32(3).u32(2).bytes(Pattern(8)).padTo(16384).u32(0).u32(0).u32(73).u32(1).fill(64);
  mult.bytes(Pattern(5)).u32(68 + zs).u32(1).fill(64).bytes(z);
  const Bytes rgb = Pattern(6);
  const Bytes img = B().text("IMG\x1A")
                        .fill(4)
                        .text("logo")
                        .u8(0)
                        .u8(8)
                        .u8(0)
                        .u16(2)
                        .bytes(rgb)
                        .u32(0x10002)
                        .fill(82, 7)
                        .get();
  return {
      Row({"nested folders", 150, "data.pck", pck.get()}, {{"maps\\a", 288, Slice(p, 0, 5)},
                                                           {"maps\\b", 293, Slice(p, 5, 7)},
                                                           {"top.txt", 300, Slice(p, 12, 3)}}),
      Entries({"compressed trailing directory", 142, "game.wd", wd},
              {{{"maps\\x.z", 0, 64, zxs, 0, 1}, x}, {{"y.txt", zxs, 40, 40, 0, 0}, y}}),
      Entries({"palette and image bank", 115, "pics.mult", mult.get()},
              {{{"_palette_", 8, 8, 8, 0, 0}, Pattern(8)},
               {{"pics.mult.000000", 0, 0, 0, 0, 0}, {}},
               {{"pics.mult.000001", 16464, 5, 5, 0, 0}, Pattern(5)},
               {{"pics.mult.000002", 16541, 0, zs, 0, 1}, Pattern(100)}}),
      Entries({"named palette picture", 78, "pic.img", img},
              {{{"logo.pic.tga", 15, 868, 94, 0x10002, 8},
                Cat({TgaColourMappedStart(0x10002, 8, rgb, 2), Bytes(82, 7)})}}),
      Entries({"texture, DXT3", 79, "wall.vtf", Vtf(0x2000)},
              {{{"wall.dds", 88, 144, 16, 0x40004, '3'},
                Cat({DdsHeader(79, '3', 0x40004), Slice(Vtf(0x2000), 88, 16)})}}),
      Entries({"texture, 24 bits", 79, "wall.vtf", Vtf(0x1C0)},
              {{{"wall.dds", 56, 176, 48, 0x40004, 6},
                Cat({DdsHeader(79, 6, 0x40004), Slice(Vtf(0x1C0), 56, 48)})}}),
  };
}

TEST(HeaderPictures, RefusesWhatTheHeadersCannotHold) {
  const SampleTable rows = HeaderPictureSamples();
  const Bytes& wd = rows[1].bytes;
  ExpectRefused({
      {"folder inside itself", 150, With(rows[0], 44, 0)},
      {"directory longer than the file", 142,
       With(rows[1], wd.size() - 4, uint32_t(wd.size()) + 1)},
      {"image shorter than its head", 115, With(rows[2], 16392, 67)},
      {"picture name of 64 bytes", 78, B().text("IMG\x1A").fill(4).fill(64, 'a').fill(40).get()},
      {"texture larger than the file", 79, With(rows[4], 16, 0x400040)},
  });
}

}  // namespace
}  // namespace cairn::test
