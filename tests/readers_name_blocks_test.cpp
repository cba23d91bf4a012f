// Readers with a separate name block.
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

CAIRN_SAMPLES(NameBlockSamples) {
  const Bytes a = Pattern(5, 1), b = Pattern(70, 2), c = Pattern(10, 3);
  const std::string full(32, 'n');  // fills its field: no terminator
  ArchiveBuilder afs;
  afs.text("AFS").u8(0).u32(2).u32(64).u32(5).u32(69).u32(70).u32(139).u32(96).padTo(64);
  afs.bytes(a).bytes(b).name("first.adx", 32).fill(16, 0x77).name(full, 32).fill(16, 0x77);
  ArchiveBuilder arc;
  arc.text("archive  V2.2").u8(0).fill(2).u32(2).u32(44).u32(90).u32(5).u32(54).u32(95).u32(10);
  arc.text("alpha.txt").u8(0).text("beta/b.dat").u8(0).padTo(90).bytes(a).bytes(c);
  ArchiveBuilder stor;
  stor.text("StOR").u32(83).bytes(a).bytes(b).u32(3);
  stor.u32(0).u32(8).u32(0).u32(0).u32(13).u32(0).u32(0).u32(13).u32(0);
  stor.text("one").u8(0).text("two").u8(0).text("three").u8(0);
  ArchiveBuilder hak;
  hak.text("HAK V1.0").padTo(16).u32(2).u32(0).u32(178).padTo(168).bytes(c);
  hak.name("map01.lvl", 16).fill(8, 0x33).name("sixteen_chars_ab", 16).fill(8, 0x33);
  hak.u32(242).u32(5).u32(247).u32(70).bytes(a).bytes(b);
  ArchiveBuilder dwfb;
  dwfb.text("DWFB").u32(2).padTo(72).u32(2).u32(168).u32(24).padTo(88);
  dwfb.u32(0x99).u32(168).u32(14).u32(192).u32(5).fill(20, 0x44);
  dwfb.u32(0x99).u32(182).u32(10).u32(197).u32(70).fill(20, 0x44);
  dwfb.text("bank/kick.wav").u8(0).text("snare.wav").u8(0).bytes(a).bytes(b);
  return {
      Row({"AFS", 9, "voice.afs", afs.get()}, {{"first.adx", 64, a}, {full, 69, b}}),
      Row({"archive  V2.2", 13, "data.arc", arc.get()},
          {{"alpha.txt", 90, a}, {"beta\\b.dat", 95, c}}),
      Row({"StOR", 14, "data.stor", stor.get()},
          {{"one", 8, a}, {"two", 13, {}}, {"three", 13, b}}),
      Row({"HAK V1.0", 29, "module.hak", hak.get()},
          {{"_description_", 168, c}, {"map01.lvl", 242, a}, {"sixteen_chars_ab", 247, b}}),
      Row({"DWFB", 31, "drums.dwfb", dwfb.get()},
          {{"bank\\kick.wav", 192, a}, {"snare.wav", 197, b}}),
  };
}

TEST(NameBlocks, RefusesNamesOutsideTheirBlocks) {
  const SampleTable rows = NameBlockSamples();
  ExpectRefused({
      {"AFS name block too small for the second name", 9, With(rows[0], 28, 79)},
      {"DWFB name of 260", 31, With(rows[4], 96, 261)},
  });
}

}  // namespace
}  // namespace cairn::test
