// Readers whose records carry the names.
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

CAIRN_SAMPLES(InlineNameSamples) {
  const Bytes a = Pattern(5, 1), b = Pattern(70, 2);
  const std::string full(48, 'N'), q(20, 'q');  // names filling their fields: no terminator
  ArchiveBuilder mhx;
  mhx.text("MHX XS V1.0").padTo(48).u32(448 + 2 * 64).padTo(64);
  mhx.name("sub/beta.bin", 48).u32(192).u32(70).fill(8, 0xEE);
  mhx.name(full, 48).u32(262).u32(0).fill(8, 0xEE).bytes(b);
  ArchiveBuilder mage;
  mage.text("MageGold").padTo(40).u32(104).u32(2 * 64 + 20).padTo(104);
  mage.name("readme.txt", 56).u32(252).u32(5).name("dir/x.bin", 56).u32(257).u32(70);
  mage.fill(20, 0xAA).bytes(a).bytes(b);
  const auto pff = [&](char version, uint32_t width, std::string_view second) {
    ArchiveBuilder w;
    w.u32(20).text("PFF").u8(version).u32(2).u32(16 + width).u32(95).bytes(a).bytes(b);
    w.u32(0x11111111).u32(20).u32(5).u32(0).name("TITLE.BMP", width);
    return w.u32(0xFFFFFFFF).u32(25).u32(70).u32(0x2222).name(second, width).get();
  };
  ArchiveBuilder dir;
  dir.text("DIR").u8(0).u32(4104 + 44).u32(0).bytes(a).bytes(b).padTo(4104);
  dir.u32(12).u32(5).text("abc").u8(0).u32(0xDEADBEEF);
  dir.u32(17).u32(70).text("docs/read.me").u32(0).u32(0xDEADBEEF);
  ArchiveBuilder far;
  far.text("FAR!byAZ").u32(0).u32(91).bytes(a).bytes(b).u32(2);
  far.u32(5).u32(0x99).u32(16).u32(8).text("FIRST.DA");
  far.u32(70).u32(0x99).u32(21).u32(10).text("dir/second");
  ArchiveBuilder dfp1;
  dfp1.text("DFP1").u32(104).u32(2).padTo(25).u32(142).bytes(a).bytes(b);
  dfp1.text("one.txt").u8(0).u32(5).u32(29).text("two/three.dat").u8(0).u32(70).u32(34);
  dfp1.fill(9, 0x5A);
  ArchiveBuilder cmpr;
  cmpr.text("CMPR").u32(123 - 4).bytes(a).bytes(b).u32(5).u32(0).u32(5).text("a.bin").fill(3);
  cmpr.u32(70).u32(5).u32(8).text("data/b.x").u32(83 - 8);
  ArchiveBuilder pvol;
  pvol.text("PVOL").u32(83).bytes(a).bytes(b).text("vols").u32(16).text("x.dat").u8(0);
  pvol.text("sub/y.txt").u8(0).u8(0).text("voli").u32(34).fill(8).u32(0).u32(5).u8(0);
  pvol.fill(8).u32(13 - 8).u32(70).u8(0).fill(17);
  return {
      Row({"MHX XS V1.0", 1, "game.mhx", mhx.get()}, {{"sub\\beta.bin", 192, b}, {full, 262, {}}}),
      Row({"MageGold", 12, "x.mgd", mage.get()}, {{"readme.txt", 252, a}, {"dir\\x.bin", 257, b}}),
      Row({"PFF2", 19, "data.pff", pff('2', 16, "snd/b.wav")},
          {{"TITLE.BMP", 20, a}, {"snd\\b.wav", 25, b}}),
      Row({"PFF3", 20, "data.pff", pff('3', 20, q)}, {{"TITLE.BMP", 20, a}, {q, 25, b}}),
      Row({"DIR", 2, "data.dir", dir.get()}, {{"abc", 12, a}, {"docs\\read.me", 17, b}}),
      Row({"FAR!byAZ", 3, "x.far", far.get()}, {{"FIRST.DA", 16, a}, {"dir\\second", 21, b}}),
      Row({"DFP1", 18, "x.dfp", dfp1.get()}, {{"one.txt", 29, a}, {"two\\three.dat", 34, b}}),
      Row({"CMPR", 30, "x.cmp", cmpr.get()}, {{"a.bin", 8, a}, {"data\\b.x", 13, b}}),
      Row({"PVOL", 38, "x.vol", pvol.get()}, {{"x.dat", 8, a}, {"sub\\y.txt", 13, b}}),
  };
}

TEST(InlineNames, RefusesBadDirectories) {
  const SampleTable rows = InlineNameSamples();
  const auto far = [](uint32_t n) {
    ArchiveBuilder w;
    w.text("FAR!byAZ").u32(0).u32(16).u32(1).u32(4).u32(0).u32(0).u32(n);
    return w.text(std::string(n, 'F')).get();
  };
  ExpectLists(3, far(259), {{std::string(259, 'F'), 0, 4, 4, 0, 0}});
  ExpectRefused({
      {"FAR name of 260", 3, far(260)},
      {"FAR count that cannot fit", 3, With(rows[5], 91, 0x40000000)},
  });
}

}  // namespace
}  // namespace cairn::test
