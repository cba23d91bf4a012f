// Samples and refusals of the counted record directories, FormatIds 59 to 74.
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

CAIRN_SAMPLES(CountedRecordSamples) {
  const Bytes a = Pattern(5, 1), b = Pattern(70, 2), c = Pattern(10, 3), sector = Pattern(2048, 4);
  const std::string full(16, 'n'), name24 = std::string(20, 'v') + ".dat";
  B awad, mjz, mh3, ver, mqdb, ezd, mix, thu, sdpa, lp;
  awad.text("AWAD").u32be(2).name("title.pcx", 16).u32be(5).u32be(64).u32(0);
  awad.name(full, 16).u32be(70).u32be(69).u32(0).bytes(a).bytes(b);
  mjz.text("MJZ0").u32(0).u32(3).padTo(16).name("a.txt", 128).u32(0).u32(448).u32(5).u32(0);
  mjz.name("gone", 128).u32(1).u32(453).u32(10).u32(0).name("c.dat", 128).u32(2).u32(453);
  mjz.u32(10).u32(0).bytes(a).bytes(c);
  mh3.text("MH3 V1.0 ").padTo(48).u32(320).padTo(64).name("one", 48).u32(320).u32(5).fill(8);
  mh3.name("two", 48).u32(325).u32(10).fill(8).name("****", 64).name("three", 64).bytes(a).bytes(c);
  ver.text("VER2").u32(2).u32(1).u32(1).name(name24, 24).u32(2).u32(0).name("empty", 24);
  ver.padTo(2048).bytes(sector);
  const Bytes riff = Cat({Text("RIFF"), a}), png = Cat({Text("\x89PNG"), c});
  mqdb.text("MQDB").padTo(24).u32(28).u32(3).u32(0).u32(9).u32(52).u32(0).u32(0).u32(14).u32(61);
  mqdb.u32(0).u32(0).u32(5).u32(75).u32(0).bytes(riff).bytes(png).bytes(a);
  const Bytes az = Compress(a), bz = Compress(b);
  const auto azSize = uint32_t(az.size()), bzSize = uint32_t(bz.size());
  ezd.text("ezd\xFF").u32(2).u32(60).padTo(16).text("a.txt").u8(0).fill(5).u32(60).u32(5);
  ezd.u32(azSize).text("x/b").u8(0).fill(5).u32(60 + azSize).u32(70).u32(bzSize);
  ezd.bytes(az).bytes(bz);
  mix.text("MIX1").u32(16).u32(44).padTo(16).u32(2).u32(0).u32(61).u32(5).u32(0).u32(66).u32(70);
  mix.u32(0).u8(5).text("a.txt").u8(6).text("b.d").fill(3, 0).bytes(a).bytes(b);
  thu.text("THU3").u32(3).u32(108).padTo(16).u32(0).u32(111).fill(16).u32(3).text("one").u32(0);
  thu.u32(116).fill(16).u32(7).text("two.wav").u32(0).u32(116).fill(16).u32(1).text("x").bytes(a);
  thu.bytes(b);
  sdpa.text("SDPA").u32(2).u32(32).u32(5).u32(0).u32(37).u32(70).u32(0).bytes(a).bytes(b);
  lp.text("LP1C").u32(0).u32(2).u8(9).text("intro.smk").u32(5).u32(62).fill(8);
  lp.u8(7).text("x/y.txt").u32(70).u32(67).fill(8).bytes(a).bytes(b);
  return {
      Row({"AWAD", 59, "game.awd", awad.get()}, {{"title.pcx", 64, a}, {full, 69, b}}),
      Row({"MJZ0", 60, "game.mjz", mjz.get()}, {{"a.txt", 448, a}, {"c.dat", 453, c}}),
      Row({"MH3 V1.0", 61, "game.mh3", mh3.get()}, {{"one", 320, a}, {"two", 325, c}}),
      Row({"VER2", 62, "game.ver", ver.get()}, {{name24, 2048, sector}, {"empty", 4096, {}}}),
      Row({"MQDB", 63, "m.db", mqdb.get()},
          {{"m.db.000000.wav", 80, riff}, {"m.db.000001.png", 89, png}, {"m.db.000002", 103, a}}),
      Entries({"ezd", 64, "data.ezd", ezd.get()},
              {{{"a.txt", 60, 5, azSize, 0, 0}, a}, {{"x\\b", 60 + azSize, 70, bzSize, 0, 0}, b}}),
      Row({"MIX1", 67, "game.mix", mix.get()}, {{"a.txt", 61, a}, {"b.d", 66, b}}),
      Row({"THU3", 68, "a.thu", thu.get()}, {{"one", 111, a}, {"two.wav", 116, {}}, {"x", 116, b}}),
      Row({"SDPA", 69, "v", sdpa.get()}, {{"v.000000.wav", 32, a}, {"v.000001.wav", 37, b}}),
      Row({"LP1C", 74, "game.lp", lp.get()}, {{"intro.smk", 62, a}, {"x\\y.txt", 67, b}}),
  };
}

TEST(CountedRecords, RefusesBrokenDirectories) {
  const SampleTable rows = CountedRecordSamples();
  ExpectRefused({
      {"VER2 sector beyond 4 GiB", 62, With(rows[3], 8, 0x200000)},
      {"THU3 name of 260", 68, With(rows[7], 40, 260)},
  });
}

}  // namespace
}  // namespace cairn::test
