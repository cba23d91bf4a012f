// Directories whose records carry the names: "MHX XS V1.0", "DIR",
// "FAR!byAZ", "MageGold", "DFP1", "PFF2", "PFF3", "CMPR" and "PVOL".
#include <gtest/gtest.h>

#include <string>

#include "readers_sample.h"

namespace cairn::test {
namespace {

constexpr FormatId kMhx = 1, kDir = 2, kFar = 3, kMageGold = 12, kDfp1 = 18, kPff2 = 19, kPff3 = 20,
                   kCmpr = 30, kPvol = 38;

// "MHX XS V1.0": the word at 48 lies 448 bytes past the end of the 64-byte
// records that start at 64.
ArchiveBuilder MhxHeader(uint32_t end) {
  ArchiveBuilder w;
  w.text("MHX XS V1.0").u8(0).padTo(48).u32(end).padTo(64);
  return w;
}

ReaderSample MhxSample() {
  const Bytes a = Pattern(5, 1), b = Pattern(70, 2);
  const std::string full(48, 'N');  // fills its field: no terminator stored
  ArchiveBuilder w = MhxHeader(448 + 3 * 64);
  w.name("ALPHA.TXT", 48).u32(256).u32(5).fill(8, 0xEE);
  w.name("sub/beta.bin", 48).u32(261).u32(70).fill(8, 0xEE);
  w.name(full, 48).u32(261).u32(0).fill(8, 0xEE);
  w.bytes(a).bytes(b);
  return {"game.mhx",
          w.get(),
          {{"ALPHA.TXT", 256, 5, 5, 0, 0},
           {"sub\\beta.bin", 261, 70, 70, 0, 0},
           {full, 261, 0, 0, 0, 0}},
          {a, b, {}}};
}

// "MageGold": directory offset and size at 40 and 44.
ArchiveBuilder MageGoldHeader(uint32_t directory, uint32_t size) {
  ArchiveBuilder w;
  w.text("MageGold").padTo(40).u32(directory).u32(size);
  return w;
}

ReaderSample MageGoldSample() {
  const Bytes a = Pattern(33, 3), b = Pattern(7, 4);
  const std::string full(56, 'm');
  ArchiveBuilder w = MageGoldHeader(104, 2 * 64 + 20);
  w.padTo(104).name("readme.txt", 56).u32(252).u32(33).name(full, 56).u32(285).u32(7);
  w.fill(20, 0xAA);  // a trailing partial record is not listed
  w.bytes(a).bytes(b);
  return {"x.mgd", w.get(), {{"readme.txt", 252, 33, 33, 0, 0}, {full, 285, 7, 7, 0, 0}}, {a, b}};
}

// "PFF2"/"PFF3": count, record size and directory offset at 8, 12, 16.
ArchiveBuilder PffHeader(char version, uint32_t count, uint32_t recordSize, uint32_t directory) {
  ArchiveBuilder w;
  w.u32(20).text("PFF").u8(static_cast<uint8_t>(version));
  w.u32(count).u32(recordSize).u32(directory);
  return w;
}

ReaderSample PffSample(char version) {
  const Bytes a = Pattern(10, 5), b = Pattern(100, 6);
  ArchiveBuilder w = PffHeader(version, 2, 32, 130);
  w.bytes(a).bytes(b);
  w.u32(0x11111111).u32(20).u32(10).u32(0x22222222).name("TITLE.BMP", 16);
  w.u32(0x33333333).u32(30).u32(100).u32(0x44444444).name("snd/b.wav", 16);
  return {"data.pff",
          w.get(),
          {{"TITLE.BMP", 20, 10, 10, 0, 0}, {"snd\\b.wav", 30, 100, 100, 0, 0}},
          {a, b}};
}

// "DIR": the directory runs from 4104 past the word at 8 to the word at 4.
ArchiveBuilder DirHeader(uint32_t end, uint32_t startLess4104 = 0) {
  ArchiveBuilder w;
  w.text("DIR").u8(0).u32(end).u32(startLess4104);
  return w;
}

ReaderSample DirSample() {
  const Bytes a = Pattern(6, 7), b = Pattern(3000, 8);
  ArchiveBuilder w = DirHeader(4104 + 64);
  w.bytes(a).bytes(b).padTo(4104);
  // Names padded to a multiple of 4 with at least one zero; 4 spare bytes.
  w.u32(12).u32(6).text("abc").u8(0).u32(0xDEADBEEF);
  w.u32(18).u32(3000).text("docs/read.me").u32(0).u32(0xDEADBEEF);
  w.u32(4104).u32(0).text("abcd").u32(0).u32(0xDEADBEEF);
  return {"data.dir",
          w.get(),
          {{"abc", 12, 6, 6, 0, 0},
           {"docs\\read.me", 18, 3000, 3000, 0, 0},
           {"abcd", 4104, 0, 0, 0, 0}},
          {a, b, {}}};
}

// "FAR!byAZ": directory offset at 12; a count, then records of size, a spare
// word, offset, name length and the name.
ArchiveBuilder FarHeader(uint32_t directory) {
  ArchiveBuilder w;
  w.text("FAR!byAZ").u32(0).u32(directory);
  return w;
}

ReaderSample FarSample() {
  const Bytes a = Pattern(20, 9), b = Pattern(33, 10);
  ArchiveBuilder w = FarHeader(69);
  w.bytes(a).bytes(b).u32(2);
  w.u32(20).u32(0x99).u32(16).u32(8).text("FIRST.DA");  // no terminator stored
  w.u32(33).u32(0x99).u32(36).u32(10).text("dir/second");
  return {"x.far",
          w.get(),
          {{"FIRST.DA", 16, 20, 20, 0, 0}, {"dir\\second", 36, 33, 33, 0, 0}},
          {a, b}};
}

Bytes FarWithName(uint32_t length) {
  ArchiveBuilder w = FarHeader(16);
  w.u32(1).u32(4).u32(0).u32(0).u32(length).text(std::string(length, 'F'));
  return w.get();
}

// "DFP1": directory offset at 4, count at 8, directory end at 25.
ArchiveBuilder Dfp1Header(uint32_t start, uint32_t count, uint32_t end) {
  ArchiveBuilder w;
  w.text("DFP1").u32(start).u32(count).padTo(25).u32(end);
  return w;
}

ReaderSample Dfp1Sample() {
  const Bytes a = Pattern(40, 11), b = Pattern(50, 12);
  ArchiveBuilder w = Dfp1Header(119, 2, 157);
  w.bytes(a).bytes(b);
  w.text("one.txt").u8(0).u32(40).u32(29);
  w.text("two/three.dat").u8(0).u32(50).u32(69);
  w.fill(9, 0x5A);  // after the directory's end
  return {"x.dfp",
          w.get(),
          {{"one.txt", 29, 40, 40, 0, 0}, {"two\\three.dat", 69, 50, 50, 0, 0}},
          {a, b}};
}

// "CMPR": the directory ends 4 bytes past the word at 4; the word stored
// there, plus 8, is its start.
ReaderSample CmprSample() {
  const Bytes a = Pattern(50, 13), b = Pattern(17, 14);
  ArchiveBuilder w;
  w.text("CMPR").u32(115 - 4).bytes(a).bytes(b);
  w.u32(50).u32(8 - 8).u32(5).text("a.bin").fill(3);
  w.u32(17).u32(58 - 8).u32(8).text("data/b.x");
  w.u32(75 - 8);
  return {"x.cmp", w.get(), {{"a.bin", 8, 50, 50, 0, 0}, {"data\\b.x", 58, 17, 17, 0, 0}}, {a, b}};
}

// "PVOL": a names block and a records block at the word at 4; the records
// start on an even file position.
Bytes PvolArchive(const Bytes& data, const std::vector<std::string>& names,
                  const std::vector<std::pair<uint32_t, uint32_t>>& records) {
  ArchiveBuilder w;
  const auto start = static_cast<uint32_t>(8 + data.size());
  w.text("PVOL").u32(start).bytes(data);
  uint32_t length = 0;
  for (const std::string& n : names) length += static_cast<uint32_t>(n.size() + 1);
  w.text("vols").u32(length);
  for (const std::string& n : names) w.text(n).u8(0);
  if ((start + length) % 2 != 0) w.u8(0);
  w.text("voli").u32(static_cast<uint32_t>(records.size() * 17));
  for (const auto& [offset, size] : records) w.fill(8, 0x77).u32(offset - 8).u32(size).u8(0x77);
  return w.get();
}

ReaderSample PvolSample() {
  const Bytes a = Pattern(25, 15), b = Pattern(12, 16);
  // The block starts at 45 and its names take 16 bytes: one byte of padding.
  return {"x.vol",
          PvolArchive(ArchiveBuilder().bytes(a).bytes(b).get(), {"x.dat", "sub/y.txt"},
                      {{8, 25}, {33, 12}}),
          {{"x.dat", 8, 25, 25, 0, 0}, {"sub\\y.txt", 33, 12, 12, 0, 0}},
          {a, b}};
}

TEST(InlineNames, EachFormatListsAndExtractsExactly) {
  const std::pair<FormatId, ReaderSample> samples[] = {
      {kMhx, MhxSample()},     {kMageGold, MageGoldSample()}, {kPff2, PffSample('2')},
      {kPff3, PffSample('3')}, {kDir, DirSample()},           {kFar, FarSample()},
      {kDfp1, Dfp1Sample()},   {kCmpr, CmprSample()},         {kPvol, PvolSample()}};
  for (const auto& [format, sample] : samples) {
    SCOPED_TRACE(format);
    ExpectSample(format, sample);
  }
}

TEST(InlineNames, EdgeCasesListExactly) {
  const std::string full(20, 'q');  // a 36-byte record leaves 20 bytes for the name
  ArchiveBuilder pff = PffHeader('3', 2, 36, 104);
  pff.padTo(104).u32(1).u32(5).u32(6).u32(0).name(full, 20);
  pff.u32(0xFFFFFFFF).u32(5).u32(6).u32(0).name(full, 20);
  // A 255-character name fills a 256-byte field: field and spare bytes take
  // the 260 bytes there is room for.
  const std::string longest(255, 'L');
  ArchiveBuilder dir = DirHeader(4104 + 8 + 256 + 4);
  dir.padTo(4104).u32(0).u32(4).text(longest).u8(0).u32(0);
  ExpectListings({
      {"MHX region of 448 bytes", kMhx, Padded(MhxHeader(448), 200), {}},
      {"PFF count of 0", kPff2, Padded(PffHeader('2', 0, 32, 20)), {}},
      {"PFF first word ignored", kPff3, pff.get(), {{full, 5, 6, 6, 0, 0}, {full, 5, 6, 6, 0, 0}}},
      {"DIR of 0 bytes", kDir, Padded(DirHeader(4104 + 100, 100), 4300), {}},
      {"DIR longest name", kDir, dir.get(), {{longest, 0, 4, 4, 0, 0}}},
      {"FAR name of 259", kFar, FarWithName(259), {{std::string(259, 'F'), 0, 4, 4, 0, 0}}},
      {"PVOL names ending on an even position",
       kPvol,
       PvolArchive(Pattern(24), {"x.dat", "sub/y.txt", "z"}, {{8, 24}, {8, 10}, {20, 4}}),
       {{"x.dat", 8, 24, 24, 0, 0}, {"sub\\y.txt", 8, 10, 10, 0, 0}, {"z", 20, 4, 4, 0, 0}}},
  });
}

TEST(InlineNames, RefusesBadDirectories) {
  ArchiveBuilder cmprLong;
  cmprLong.text("CMPR").u32(8 + 12 + 260 - 4).u32(1).u32(0).u32(260);
  cmprLong.text(std::string(260, 'c')).u32(0);
  ArchiveBuilder dfp1Long = Dfp1Header(29, 1, 29 + 261 + 8);
  dfp1Long.text(std::string(260, 'd')).u8(0).u32(1).u32(2);
  ArchiveBuilder pffLong = PffHeader('3', 1, 16 + 300, 20);
  pffLong.fill(16).name(std::string(260, 'n'), 300);
  ArchiveBuilder dirLong = DirHeader(4104 + 8 + 260 + 4);
  dirLong.padTo(4104).u32(0).u32(4).text(std::string(256, 'L')).u32(0).u32(0);
  ArchiveBuilder dirOpen = DirHeader(4104 + 12);
  dirOpen.padTo(4104).u32(0).u32(4).text("abcd");
  Bytes pvolCut = PvolArchive(Pattern(100), {"a", "b"}, {{8, 1}, {9, 1}});
  pvolCut.resize(pvolCut.size() - 5);
  ExpectRefused({
      {"MHX end below 448", kMhx, Padded(MhxHeader(447), 200)},
      {"MHX records past the end", kMhx, Padded(MhxHeader(448 + 2 * 64), 64 + 64 + 10)},
      {"MageGold directory past the end", kMageGold, Padded(MageGoldHeader(104, 64), 150)},
      {"MageGold directory offset wraps", kMageGold, Padded(MageGoldHeader(0xFFFFFFF0, 64), 150)},
      // One whole record, then a partial one that the end of the file cuts.
      {"MHX partial record past the end", kMhx, Padded(MhxHeader(448 + 64 + 32), 64 + 64 + 16)},
      {"MageGold partial record past the end", kMageGold,
       Padded(MageGoldHeader(104, 64 + 32), 104 + 64 + 16)},
      {"PFF record too short for a name", kPff3, Padded(PffHeader('3', 1, 15, 20), 120)},
      {"PFF count that cannot fit", kPff2, Padded(PffHeader('2', 0x10000000, 32, 20), 120)},
      {"PFF name of 260", kPff3, pffLong.get()},
      {"DIR end before the start", kDir, Padded(DirHeader(4000), 4200)},
      {"DIR directory past the end", kDir, Padded(DirHeader(4104 + 64), 4110)},
      {"DIR name of 256", kDir, dirLong.get()},
      {"DIR name unterminated", kDir, dirOpen.get()},
      {"FAR directory past the end", kFar, Padded(FarHeader(5000), 120)},
      {"FAR count that cannot fit", kFar, Padded(FarHeader(16).u32(0x40000000), 120)},
      {"FAR name of 260", kFar, FarWithName(260)},
      {"FAR name past the end", kFar, Padded(FarHeader(16).u32(1).fill(12).u32(200), 120)},
      {"DFP1 end before the start", kDfp1, Padded(Dfp1Header(60, 1, 50), 120)},
      {"DFP1 count that cannot fit", kDfp1, Padded(Dfp1Header(29, 20, 120), 120)},
      {"DFP1 last record past the end", kDfp1,
       Padded(Dfp1Header(29, 2, 48).text("a").u8(0).u32(1).u32(2).text("b").u8(0).u32(1), 120)},
      {"DFP1 name of 260", kDfp1, dfp1Long.get()},
      {"CMPR start word past the end", kCmpr, Padded(ArchiveBuilder().text("CMPR").u32(200), 120)},
      {"CMPR start after the end", kCmpr,
       Padded(ArchiveBuilder().text("CMPR").u32(100 - 4).padTo(100).u32(200), 120)},
      {"CMPR name of 260", kCmpr, cmprLong.get()},
      {"CMPR name past the directory", kCmpr,
       Padded(ArchiveBuilder().text("CMPR").u32(24 - 4).u32(1).u32(0).u32(9).text("abcd").u32(0),
              120)},
      {"PVOL block past the end", kPvol, Padded(ArchiveBuilder().text("PVOL").u32(500), 120)},
      {"PVOL more records than names", kPvol,
       PvolArchive(Pattern(100), {"only"}, {{8, 1}, {9, 1}})},
      {"PVOL records past the end", kPvol, pvolCut},
  });
}

// clang-format off
CAIRN_FIXTURE(MhxFixture) { return SampleFixture("MHX XS V1.0", kMhx, MhxSample()); }
CAIRN_FIXTURE(DirFixture) { return SampleFixture("DIR", kDir, DirSample()); }
CAIRN_FIXTURE(FarFixture) { return SampleFixture("FAR!byAZ", kFar, FarSample()); }
CAIRN_FIXTURE(MageGoldFixture) { return SampleFixture("MageGold", kMageGold, MageGoldSample()); }
CAIRN_FIXTURE(Dfp1Fixture) { return SampleFixture("DFP1", kDfp1, Dfp1Sample()); }
CAIRN_FIXTURE(Pff2Fixture) { return SampleFixture("PFF2", kPff2, PffSample('2')); }
CAIRN_FIXTURE(Pff3Fixture) { return SampleFixture("PFF3", kPff3, PffSample('3')); }
CAIRN_FIXTURE(CmprFixture) { return SampleFixture("CMPR", kCmpr, CmprSample()); }
CAIRN_FIXTURE(PvolFixture) { return SampleFixture("PVOL", kPvol, PvolSample()); }
// clang-format on

}  // namespace
}  // namespace cairn::test
