// Offset tables and the directory kept in a companion file.
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

CAIRN_SAMPLES(CompanionSamples) {
  const Bytes a = Pattern(5, 1), b = Pattern(70, 2), sectors = Pattern(6144, 3);
  const std::string full(16, 'n');
  B derived, heads, unnamed, bigf, wd, ended;
  derived.u32(17).text("A").u8(0).u32(50).text("BC").fill(5).bytes(Pattern(33)).bytes(b);
  heads.u32(2).u32(12).u32(57).fill(4).u32(5).name("first", 16).fill(16).bytes(a);
  heads.fill(4).u32(70).text(full).text("cut").fill(13).bytes(b);
  unnamed.fill(8).u32(2).padTo(28).u32(56).u32(5).fill(8).u32(61).u32(70).fill(4).bytes(a).bytes(b);
  // The byte after the last record is spare; the data starts behind it.
  bigf.text("BIGF").padTo(80).text("one").u8(0).u32(5).u32(0).text("two").u8(0).u32(250).u32(5);
  bigf.u8(0xEE).bytes(a).bytes(Pattern(250, 4));
  wd.u32(2).u32(72).u32(5).fill(12).u32(10).u32(77).u32(70).fill(12).u32(0).u32(16);
  wd.text("dir/b.bin").u8(0).text("a.txt").u8(0).bytes(a).bytes(b);
  ended.u32(21).text("A").u8(0).u32(31).text("B").u8(0).u32(111).fill(5);
  ended.bytes(Pattern(10)).bytes(Pattern(80));
  const Bytes dir =
      B().u32(0).u32(1).name("a.bin", 24).u32(1).u32(2).name("b.bin", 24).u32(3).get();
  Sample sector =
      Row({"sector archive", 98, "disc.img", sectors}, {{"a.bin", 0, Slice(sectors, 0, 2048)},
                                                        {"b.bin", 2048, Slice(sectors, 2048, 4096)},
                                                        {"c", 6144, {}}});
  sector.companions = {{"disc.dir", Cat({dir, B().u32(0).name("c", 28).get()})}};
  Sample records = Row({"unnamed 16-byte records", 130, "x.rec", unnamed.get()},
                       {{"x.rec.000000", 56, a}, {"x.rec.000001", 61, b}});
  records.recognised = false;  // the rule taking every first word of 0 comes first
  return {
      Row({"offsets and names", 90, "game.dat", derived.get()},
          {{"A", 17, Pattern(33)}, {"BC", 50, b}}),
      sector,
      Row({"named 40-byte heads", 110, "game.hdr", heads.get()}, {{"first", 52, a}, {full, 97, b}}),
      records,
      Row({"names before the data", 133, "game.big", bigf.get()},
          {{"one", 105, a}, {"two", 110, Pattern(250, 4)}}),
      Row({"separate name block", 148, "game.wd", wd.get()},
          {{"a.txt", 72, a}, {"dir\\b.bin", 77, b}}),
      Row({"ending in an empty name", 153, "game.dat", ended.get()},
          {{"A", 21, Pattern(10)}, {"B", 31, Pattern(80)}}),
  };
}

TEST(CompanionReaders, RefuseWhatCannotHoldTogether) {
  const SampleTable rows = CompanionSamples();
  ExpectRefused({
      {"offsets going back", 90, With(rows[0], 6, 10)},
      {"head past the end", 110, With(rows[2], 8, 150)},
      {"walk never reaching the end of the file", 133, With(rows[4], 96, 0)},
      {"name past its block", 148, With(rows[5], 24, 16)},
      {"sizes going back", 153, With(rows[6], 6, 5)},
      {"records past the directory", 153, With(rows[6], 0, 16)},
  });
  ExpectRefused(98, rows[1].bytes, "lone.img");
  Sample far = rows[1];
  far.companions[0].second = B().u32(0x200000).u32(1).name("far", 24).get();
  Opened o;
  EXPECT_EQ(OpenArchiveAs(o.session, WriteSample(far, o.dir.dir()), 98), kBadData);
}

}  // namespace
}  // namespace cairn::test
