// Offset tables, the directory kept in a companion file, and files of one
// picture or one stream.
#include <gtest/gtest.h>

#include "media/media.h"
#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

Sample One(std::string file, FormatId id, const Bytes& b, const Listed& l, const Bytes& out) {
  return Entries({file, id, file, b}, {{l, out}});
}

CAIRN_SAMPLES(CompanionSamples) {
  const Bytes a = Pattern(5, 1), b = Pattern(70, 2), c = Pattern(250, 4), s = Pattern(6144, 3);
  const std::string n16(16, 'n');
  B derived, heads, unnamed, bigf, wd, ended;
  derived.u32(17).text("A").u8(0).u32(50).text("BC").fill(5).bytes(Pattern(33)).bytes(b);
  heads.u32(2).u32(12).u32(57).fill(4).u32(5).name("first", 16).fill(16).bytes(a);
  heads.fill(4).u32(70).text(n16).text("cut").fill(13).bytes(b);
  unnamed.fill(8).u32(2).padTo(28).u32(56).u32(5).fill(8).u32(61).u32(70).fill(4).bytes(a).bytes(b);
  bigf.text("BIGF").padTo(80).text("one").u8(0).u32(5).u32(0).text("two").u8(0).u32(250).u32(5);
  bigf.u8(0xEE).bytes(a).bytes(c);
  wd.u32(2).u32(72).u32(5).fill(12).u32(10).u32(77).u32(70).fill(12).u32(0).u32(16);
  wd.text("dir/b.bin").u8(0).text("a.txt").u8(0).bytes(a).bytes(b);
  ended.u32(21).text("A").u8(0).u32(26).text("B").u8(0).u32(276).fill(5).bytes(a).bytes(c);
  const Bytes dir = B().u32(1).u32(2).name("b.bin", 24).u32(3).u32(0).name("c", 28).get();
  return {
      Row({"offsets", 90, "game.dat", derived.get()}, {{"A", 17, Pattern(33)}, {"BC", 50, b}}),
      Row({"sectors", 98, "disc.img", s, {}, {}, {{"disc.dir", dir}}},
          {{"b.bin", 2048, Slice(s, 2048, 4096)}, {"c", 6144, {}}}),
      Row({"40-byte heads", 110, "game.hdr", heads.get()}, {{"first", 52, a}, {n16, 97, b}}),
      Row({"16-byte records", 130, "x.rec", unnamed.get(), {}, {}, {}, false},
          {{"x.rec.000000", 56, a}, {"x.rec.000001", 61, b}}),
      Row({"data behind", 133, "game.big", bigf.get()}, {{"one", 105, a}, {"two", 110, c}}),
      Row({"name block", 148, "game.wd", wd.get()}, {{"a.txt", 72, a}, {"dir\\b.bin", 77, b}}),
      Row({"empty name", 153, "game.dat", ended.get()}, {{"A", 21, a}, {"B", 26, c}}),
  };
}

CAIRN_SAMPLES(SinglePictureSamples) {
  const Bytes px = Pattern(90, 3), jpeg = Pattern(150, 4), inner = Cat({B().u32(150).get(), jpeg});
  const Bytes syj = B().u16(256).bytes(Pattern(200)).get(),
              r555 = Cat({{9, 0, 0, 0}, px, Bytes(10)});
  const Bytes tex = B().text("TEX").bytes({0, 1, 0}).u32(9).u32(5).padTo(22).bytes(px).get();
  const Bytes anm = B().u32(100).u32(4).bytes(px).padTo(108).get();
  const Bytes rsb = B().u32(1).u32(9).u32(5).padTo(28).bytes(px).get();
  B nif = B().text("NetImmerse File Format, ").padTo(52).text("NiPixelData").padTo(83).u8(24);
  nif.padTo(107).u32(2).u32(2).padTo(125).bytes(Pattern(12));
  const Bytes olz = Cat({{0xFB}, Pattern(112), {0, 0, 0xFC}}), z = Compress(inner, 0);
  const auto zs = uint32_t(z.size());
  B bmp = B().bytes(BmpHeader(166, 9, 5, 16));
  for (int row = 4; row >= 0; --row) bmp.bytes(Slice(px, row * 18, 18)).fill(2);
  return {
      One("photo01.syj", 131, syj, {"photo01.jpg", 0, 212, 202, 0, 0}, Cat({JpegStart(), syj})),
      One("sky.555", 134, r555, {"sky.tga", 0, 122, 104, 0, 16}, Cat({TgaHeader(0, 16, 32), r555})),
      One("wall.tex", 139, tex, {"wall.tga", 22, 108, 90, 0x50009, 16},
          Cat({TgaHeader(0x50009, 16, 32), px})),
      One("wall.565", 140, tex, {"wall.bmp", 22, 166, 90, 0x50009, 0}, bmp.get()),
      One("walk.anm", 141, anm, {"walk.tga", 12, 114, 96, 0xD0004, 16},
          Cat({TgaHeader(0xD0004, 16, 32), Slice(anm, 12, 96)})),
      One("tex.nif", 145, nif.get(), {"tex.nif.tga", 0, 30, 137, 0x20002, 2},
          Cat({TgaHeader(0x20002, 24, 32), Pattern(12)})),
      One("picture.rsb", 149, rsb, {"picture.rsb.bmp", 28, 166, 90, 0x50009, 0}, bmp.get()),
      One("car.qfs", 125, Cat({{16, 0xFB, 0, 0, 115}, olz}), {"car.fsh", 5, 115, 116, 0, 0},
          Cat({Pattern(112), Bytes(3, 0x0A)})),
      Entries(
          {"pic.jaz", 109, "pic.jaz", B().u8(1).u32(zs).u32(154).bytes(z).get()},
          {{{"pic", 9, 154, zs, 0, 0}, inner}, {{"_TO_JPG_\\pic.jpg", 9, 150, zs, 154, 1}, jpeg}}),
  };
}

TEST(OffsetTablesAndPictures, RefuseWhatCannotHoldTogether) {
  const SampleTable rows = CompanionSamples(), pictures = SinglePictureSamples();
  ExpectRefused({
      {"walk never reaching the end of the file", 133, With(rows[4], 96, 0)},
      {"pixels past 4 GiB", 149, B().bytes(With(pictures[6], 4, 0xFFFF)).patch32(8, 0xFFFF).get()},
  });
  Sample far = rows[1];
  far.companions[0].second = B().u32(0x200000).u32(1).name("far", 24).get();
  Opened o;
  EXPECT_EQ(OpenArchiveAs(o.session, WriteSample(far, o.dir.dir()), 98), kBadData);
}

}  // namespace
}  // namespace cairn::test
