// Samples and bounds of the enciphered sound banks, the object package, the
// reworked directories and the enciphered record list.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "readers/readers.h"
#include "samples.h"

namespace cairn::test {
namespace {

const auto KeyAt = [](uint64_t position) { return kPositionKeyTable[position % 16] & 0xFF; };

Bytes Bank(const Bytes& signature,
           const std::vector<std::tuple<uint32_t, uint32_t, Bytes>>& items) {
  ArchiveBuilder b;
  b.bytes(signature);
  for (size_t q = 0; const auto& [length, second, data] : items)
    q = b.padTo(q + 8000).u32(length).u32(0).u32(second).fill(56).bytes(data).size();
  Bytes bank = b.get();
  for (size_t p = 0; p < bank.size(); ++p) bank[p] ^= KeyAt(p);
  return bank;
}

CAIRN_SAMPLES(SoundBankSamples) {
  const Bytes a = Pattern(30, 2), b = Pattern(70, 5), c = Pattern(9, 8);
  // 65 knows no second length: the 0xCDCDCDCD of 66 is not special to it.
  SampleTable rows = {
      Row({"station bank", 65, "music.dat",
           Bank({0xFF, 0xFF, 0xFF, 0xFF}, {{30, 99, a}, {70, 0xCDCDCDCD, b}})},
          {{"music.da.000000.ogg", 8068, a}, {"music.da.000001.ogg", 16166, b}}),
      Row({"sound bank", 66, "SFX.RAW",
           Bank({0x98, 0x47, 0, 0, 4}, {{0xCDCDCDCD, 30, a}, {9, 0, c}})},
          {{"SFX.RA.000000.ogg", 8068, a}, {"SFX.RA.000001.ogg", 16166, c}}),
  };
  for (Sample& r : rows)
    for (Listed& l : r.listing) l.flag = 1;  // deciphered on extraction
  return rows;
}

// The 17 tracks of a catalogue bank, each as long as the three items it joins.
TEST(SoundBanks, StationBankListsCatalogueTracks) {
  TempDir dir;
  const std::string path = dir.write("DS.", {});
  std::filesystem::resize_file(path, 96057329);
  std::fstream f(path, std::ios::binary | std::ios::in | std::ios::out);
  for (uint32_t i = 0, q = 0; i < 180; ++i, q += 8068 + 525000) {
    const uint32_t length = i < 179 ? 525000 : 96057329 - 8068 - q;
    f.seekp(q + 8000);
    for (int k = 0; k < 4; ++k) f.put(static_cast<char>((length >> 8 * k) ^ KeyAt(q + 8000 + k)));
  }
  f.close();
  ArchiveSession s;
  ASSERT_EQ(OpenArchiveAs(s, path, 65), kOk);
  ASSERT_EQ(s.entries.size(), 197u);
  const ArchiveEntry& e = s.entries.back();
  EXPECT_EQ(std::tie(e.Name, e.Offset, e.PackedSize, e.UnpackedSize, e.Flag),
            std::tuple("Bounce FM\\Track 17.ogg", 0u, 1575000u, 1575000u, uint8_t{18}));
  CloseArchiveSession(s);
}

Bytes Compact(int32_t v) {
  uint32_t m = v < 0 ? 0u - static_cast<uint32_t>(v) : static_cast<uint32_t>(v);
  Bytes b{uint8_t((v < 0 ? 0x80 : 0) | (m >= 0x40 ? 0x40 : 0) | (m & 0x3F))};
  for (m >>= 6; m > 0; m >>= 7) b.push_back(uint8_t((m >= 0x80 ? 0x80 : 0) | (m & 0x7F)));
  return b;
}

CAIRN_SAMPLES(PackageSamples) {
  const Bytes music = Pattern(20, 1), sound = Pattern(30, 2), text = Pattern(12, 3);
  const Bytes thing = Pattern(10, 4);
  ArchiveBuilder a;
  a.u32(0x9E2A83C1).u16(69).u16(0).u32(0).u32(9).u32(36).u32(5).u32(0).u32(3).u32(0);
  for (auto n : {"mod", "Music", "Sound", "TextBuffer", "wav", "t", "b", "n", "T"})
    a.u8(0).text(n).u8(0).u32(0);
  a.patch32(32, a.size());
  for (uint8_t n : {1, 2, 3}) a.u8(0).u8(0).u32(0).u8(n);
  const uint32_t o0 = a.fill(6).u8(20).bytes(music).size() - 27;
  const uint32_t o1 = a.u8(0).u8(4).fill(4).u8(0).u8(5).bytes(sound).size() - 38;
  const uint32_t o2 = a.fill(9).u8(13).bytes(text).size() - 22, o3 = a.bytes(thing).size() - 10;
  a.patch32(24, a.size());
  const std::tuple<int, int, uint32_t, uint32_t> exports[] = {
      {-1, 5, 27, o0}, {-2, 6, 38, o1}, {-3, 7, 22, o2}, {0, 8, 10, o3}, {4, 7, 0, 0}};
  for (auto [cls, name, size, offset] : exports) {
    a.bytes(Compact(cls)).u8(0).u32(0).bytes(Compact(name)).u32(0).bytes(Compact(size));
    if (size > 0) a.bytes(Compact(offset));
  }
  return {
      Row({"object package 69", 36, "map.unr", a.get()}, {{"000000_t.mod", o0 + 7, music},
                                                          {"000001_b.wav", o1 + 8, sound},
                                                          {"000002_n.txt", o2 + 10, text},
                                                          {"000003_T.mod", o3, thing},
                                                          {"000004_n.T", 0, {}}}),
  };
}

CAIRN_SAMPLES(ReworkedDirectorySamples) {
  const Bytes readme = Pattern(12, 1), boom = Pattern(20, 2), theme = Pattern(9, 3);
  ArchiveBuilder m;
  m.u32(4).text("MASSIVE PAKFILE V 4.0\r\n").fill(5).padTo(76).u32(3).fill(12);
  m.u32(12).u32(30).fill(8).u32(20).u32(10).fill(8).u32(9).u32(20).fill(8).u16(0);
  for (std::string_view n : {"readme.txt", "sounds", "boom.wav", "music", "theme.ogg"})
    m.bytes(Bytes(n.rbegin(), n.rend())).u8(0).u16(0xBEEF);
  const uint32_t s = m.patch32(84, m.size()).bytes(boom).bytes(theme).bytes(readme).size() - 41;
  const Bytes z1 = Compress(readme, 0), z2 = Compress(boom);
  const auto n1 = static_cast<uint32_t>(z1.size()), n2 = static_cast<uint32_t>(z2.size());
  ArchiveBuilder pk;
  pk.text("PK").u8(4).u8(0).fill(16).u32(~(100u + 64)).padTo(64);
  pk.u32(5000).u32(0).u32(112).fill(20).text("first.bin").u8(0).u8(0).fill(20);
  pk.u32(5000 + n1).u32(0).u32(120).fill(20).text("dir/second.dat").u8(0).u8(0);
  const uint32_t e = pk.size();
  Sample list = Row({"PK header list", 76, "game.pk", pk.bytes(z1).bytes(z2).get()},
                    {{"first.bin", e, readme}, {"dir\\second.dat", e + n1, boom}});
  list.listing[0].packed = n1, list.listing[1].packed = n2;
  return {Row({"MASSIVE PAKFILE", 23, "data.pak", m.get()}, {{"sounds\\boom.wav", s, boom},
                                                             {"music\\theme.ogg", s + 20, theme},
                                                             {"readme.txt", s + 29, readme}}),
          list};
}

Bytes Isd0(const std::vector<std::tuple<std::string, uint32_t, Bytes>>& records) {
  const uint8_t key[8] = {0x34, 0x12, 0x68, 0x24, 0xDF, 0x9B, 0x57, 0x13};
  const uint32_t n = records.size();
  ArchiveBuilder b;
  b.text("ISD0").u32(0x24680000 | (n ^ 0x1234)).u32(0).u32((n * 28) ^ 0x24681234).u32(0);
  for (const auto& [name, size, data] : records) {
    ArchiveBuilder r;
    r.u32(32 + name.size() + data.size()).u32(kIsd0KeyConstant).fill(8).u32(size).u32(0);
    Bytes head = r.u16(name.size()).fill(6).text(name).get();
    for (size_t j = 0; j < head.size(); ++j) head[j] ^= key[j % 8];
    b.bytes(head).bytes(data);
  }
  return b.padTo(104).get();
}

CAIRN_SAMPLES(EncipheredRecordSamples) {
  const Bytes one = ArchiveBuilder().u16(4).fill(3).text("abc").u16(3).fill(3).text("de").get();
  const Bytes two = ArchiveBuilder().u16(3).fill(3).text("fg").u16(3).fill(3).text("hi").get();
  Sample list =
      Row({"ISD0", 75, "voice.isd", Isd0({{"intro.txt", 7, one}, {"sub/level.dat", 6, two}})},
          {{"intro.txt", 61, Text("abcde")}, {"sub\\level.dat", 121, Text("fghi")}});
  for (Listed& l : list.listing) l.packed = l.unpacked += 2;  // the block lengths
  return {list};
}

TEST(BanksAndPackages, RefuseWhatTheirDirectoriesCannotHold) {
  const SampleTable p = PackageSamples(), m = ReworkedDirectorySamples();
  ExpectRefused({
      {"sound length cut", 65, Slice(Bank({0xFF}, {{0, 0, {}}}), 0, 8003)},
      {"name index outside", 36, With(p[0], 12, 8)},
      {"export table past the end", 36, With(p[0], 24, 0xFFFF0000)},
      {"data area inside the header", 23, With(m[0], 84, 91)},
      {"fewer names than records", 23, With(m[0], 76, 4)},
      {"ISD0 name of 260", 75, Isd0({{std::string(260, 'n'), 0, {}}})},
  });
}

}  // namespace
}  // namespace cairn::test
