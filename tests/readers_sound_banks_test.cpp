// Samples and bounds of the enciphered sound banks (65, 66).
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "samples.h"

namespace cairn::test {
namespace {

uint8_t KeyAt(uint64_t position) {
  return kPositionKeyTable[position % 16] & 0xFF;
}

// The plain bytes of a bank, enciphered by file position as the banks store them.
Bytes Enciphered(Bytes plain) {
  for (size_t p = 0; p < plain.size(); ++p) plain[p] ^= KeyAt(p);
  return plain;
}

// An item: 8000 bytes (the bank's first begins with the deciphered signature
// `sig`), the length, 4 bytes, the second length, 56 bytes, the data.
ArchiveBuilder& Item(ArchiveBuilder& b, const Bytes& sig, uint32_t length, uint32_t second,
                     const Bytes& data) {
  return b.bytes(sig).fill(8000 - sig.size()).u32(length).u32(0).u32(second).fill(56).bytes(data);
}

CAIRN_SAMPLES(SoundBankSamples) {
  const Bytes a = Pattern(30, 2), b = Pattern(70, 5), c = Pattern(9, 8);
  const Bytes sig65 = ArchiveBuilder().u32(0xFFFFFFFF).u32(0).get();
  const Bytes sig66 = ArchiveBuilder().u32(0x4798).u32(4).get();
  // 65 knows no second length: the 0xCDCDCDCD of 66 is not special to it.
  ArchiveBuilder s65, s66;
  Item(Item(s65, sig65, 30, 99, a), {}, 70, 0xCDCDCDCD, b);
  Item(Item(Item(s66, sig66, 0xCDCDCDCD, 30, a), {}, 70, 0, b), {}, 0, 0, {});
  const Bytes bank66 = Item(s66, {}, 9, 0, c).get();
  // Every item has Flag 1: deciphered on extraction.
  SampleTable rows = {
      Row({"station bank", 65, "music.dat", Enciphered(s65.get())},
          {{"music.da.000000.ogg", 8068, a}, {"music.da.000001.ogg", 16166, b}}),
      Row({"sound bank", 66, "SFX.RAW", Enciphered(bank66)}, {{"SFX.RA.000000.ogg", 8068, a},
                                                              {"SFX.RA.000001.ogg", 16166, b},
                                                              {"SFX.RA.000002.ogg", 24304, {}},
                                                              {"SFX.RA.000003.ogg", 32372, c}}),
  };
  for (Sample& r : rows)
    for (Listed& l : r.listing) l.flag = 1;
  return rows;
}

// A bank of 8000 bytes lists nothing; a length cut by the end of the file
// refuses the bank; one reaching past 4 GiB ends the walk.
TEST(SoundBanks, FlagsBoundsAndTheEndOfTheWalk) {
  const SampleTable rows = SoundBankSamples();
  EXPECT_TRUE(OpenBytesAs(65, Slice(rows[0].bytes, 0, 8000))->session.entries.empty());
  Bytes wraps = rows[0].bytes;
  for (int k = 0; k < 4; ++k) wraps[8000 + k] ^= 0xFF;
  EXPECT_EQ(OpenBytesAs(65, wraps)->listing(),
            (std::vector<Listed>{{"test.bi.000000.ogg", 8068, ~30u, ~30u, 0, 1}}));
  ExpectRefused({{"length cut", 65, Slice(rows[0].bytes, 0, 8003)},
                 {"second length cut", 66, Slice(rows[1].bytes, 0, 8010)}});
}

// A station bank of its catalogue name and size lists 17 tracks after its
// items; each track is three items joined. The bank is a sparse file of 180
// items whose data deciphers to the key.
TEST(SoundBanks, StationBankListsCatalogueTracks) {
  TempDir dir;
  const std::string path = dir.path("DS.");
  { std::ofstream(path, std::ios::binary).put(0); }
  std::filesystem::resize_file(path, 96057329);
  std::fstream f(path, std::ios::binary | std::ios::in | std::ios::out);
  uint64_t q = 0;
  for (int i = 0; i < 180; ++i, q += 8068 + 525000) {
    const uint32_t length = i < 179 ? 525000 : 96057329 - 8068 - q;
    f.seekp(static_cast<std::streamoff>(q + 8000));
    for (int k = 0; k < 4; ++k)
      f.put(static_cast<char>((length >> 8 * k & 0xFF) ^ KeyAt(q + 8000 + k)));
  }
  f.close();
  ArchiveSession s;
  ASSERT_EQ(OpenArchiveAs(s, path, 65), kOk);
  ASSERT_EQ(s.entries.size(), 197u);
  const ArchiveEntry& track = s.entries[180];
  EXPECT_EQ(track.Name, "Bounce FM\\Track 01.ogg");
  EXPECT_EQ(track.PackedSize, 3 * 525000u);
  EXPECT_EQ(track.Flag, 2);
  EXPECT_EQ(s.entries[196].Name, "Bounce FM\\Track 17.ogg");
  const std::string out = dir.path("track");
  ASSERT_EQ(ExtractEntry(s, 180, out), kOk);
  Bytes want;  // items 61, 60 and 64, their zeros deciphered
  for (size_t part : {61, 60, 64})
    for (uint32_t p = 0; p < 525000; ++p) want.push_back(KeyAt(s.entries[part].Offset + p));
  EXPECT_EQ(ReadFile(out), want);
  CloseArchiveSession(s);
  std::filesystem::resize_file(path, 96057328);  // another size: no tracks
  ASSERT_EQ(OpenArchiveAs(s, path, 65), kOk);
  EXPECT_EQ(s.entries.size(), 180u);
  CloseArchiveSession(s);
}

}  // namespace
}  // namespace cairn::test
