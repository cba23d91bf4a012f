// Samples and refusals of the sequential name directories and item chains.
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

CAIRN_SAMPLES(SequentialNameSamples) {
  const Bytes a = Pattern(5, 1), b = Pattern(70, 2), c = Pattern(10, 3), d = Pattern(20, 4);
  B lgr, zd, nt, pbo, r20, ch, psv, bf, big4;
  lgr.text("LGR12M").padTo(1344).name("a", 12).fill(7).u32(5).bytes(a).u8(0).name("b", 12).fill(7);
  lgr.u32(20).bytes(d).u8(0);
  zd.u32(26).text("a").u8(0).u32(30).u32(5).text("x/b.dat").u8(0).u32(35).u32(70).bytes(a).bytes(b);
  nt.name("a.txt", 12).u32(80).u32(5).name("b.dat", 12).u32(85).u32(70).name("", 12).u32(155);
  nt.u32(10).name("d", 12).u32(165).u32(20).bytes(a).bytes(b).bytes(c).bytes(d);
  pbo.text("A").fill(17).u32(10).text("BB").fill(17).u32(5).fill(21).bytes(c).bytes(a).padTo(305);
  r20.u32(0x80C381D7).fill(12).u32(64).u32(5).fill(12).u32(69).u32(70).fill(20).bytes(a).bytes(b);
  const Bytes bz = Compress(b), dz = Compress(d);
  const uint32_t bzs = bz.size(), dzs = dz.size();
  ch.u32(0xDD72DD12).u32(3).u32(0).u32(2).u32(0).fill(6).u32(bzs).fill(2).u32(70).bytes(bz);
  ch.fill(6).u32(dzs).fill(2).u32(20).bytes(dz).padTo(104);
  psv.bytes(Pattern(256)).text("PSVDSC_V2.00\r\n\r\n").padTo(296).text("a ").padTo(360).u32(456);
  psv.u32(5).padTo(376).text("x/b ").padTo(440).u32(461).u32(70).u32(0x40000000).padTo(456);
  psv.bytes(a).bytes(b);
  bf.u32(52).u32(0).u32(0).u32(5).u32(0).u32(5).text("a.txt").u32(0).u32(5).u32(70).u32(0);
  bf.u32(7).text("x/b.dat").bytes(a).bytes(b);
  big4.text("BIG4").u32(0).u32be(2).u32be(41).u32be(41).u32be(5).text("x/a.txt").u8(0).u32be(46);
  Bytes bigf = big4.u32be(70).u8(0).bytes(a).bytes(b).get();
  bigf[3] = 'F';
  return {
      Row({"LGR chain", 77, "game.lgr", lgr.get()}, {{"a", 1367, a}, {"b", 1396, d}}),
      Row({"zero ends", 96, "z.dat", zd.get()}, {{"a", 30, a}, {"x\\b.dat", 35, b}}),
      Row({"to an empty name", 103, "n.dat", nt.get()}, {{"a.txt", 80, a}, {"b.dat", 85, b}}),
      Row({"inline names", 107, "game.pbo", pbo.get()}, {{"A", 66, c}, {"BB", 76, a}}),
      Row({"20-byte", 113, "s", r20.get()}, {{"s.000000", 64, a}, {"s.000001", 69, b}}),
      Entries({"chain", 117, "c", ch.get()},
              {{{"c.000000", 36, 70, bzs, 0, 0}, b}, {{"c.000001", 52 + bzs, 20, dzs, 0, 0}, d}}),
      Row({"spaces", 119, "g.psv", psv.get()},
          {{"_description_", 0, Pattern(256)}, {"a", 456, a}, {"x\\b", 461, b}}),
      Row({"counted", 144, "g.bf", bf.get()}, {{"a.txt", 56, a}, {"x\\b.dat", 61, b}}),
      Row({"BIG4", 16, "x.big", big4.get()}, {{"x\\a.txt", 41, a}, {"x.big.000001", 46, b}}),
      Row({"BIGF", 132, "x.big", bigf}, {{"x\\a.txt", 41, a}, {"x.big.000001", 46, b}}),
  };
}

TEST(SequentialNames, RefusesBrokenDirectories) {
  const SampleTable s = SequentialNameSamples();
  ExpectRefused({
      {"offset past 4 GiB", 107, With(s[3], 18, 0xFFFFFFF0)},
      {"more items than the file holds", 117, With(s[5], 12, 0x10000000)},
      {"name of 260", 144, With(s[7], 20, 260)},
      {"more records than the directory holds", 132, With(s[9], 8, 0x03000000)},
  });
}

}  // namespace
}  // namespace cairn::test
