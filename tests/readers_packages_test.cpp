// Samples and refusals of the object package (36), the reversed-name
// directory (23), the rebased header list (76) and the enciphered record
// list (75).
#include <gtest/gtest.h>

#include "readers/readers.h"
#include "samples.h"

namespace cairn::test {
namespace {

// A compact integer: sign, more and six bits, then seven bits and more a byte.
Bytes Compact(int32_t v) {
  uint32_t m = v < 0 ? 0u - static_cast<uint32_t>(v) : static_cast<uint32_t>(v);
  Bytes b{uint8_t((v < 0 ? 0x80 : 0) | (m >= 0x40 ? 0x40 : 0) | (m & 0x3F))};
  for (m >>= 6; m > 0; m >>= 7) b.push_back(uint8_t((m >= 0x80 ? 0x80 : 0) | (m & 0x7F)));
  return b;
}

CAIRN_SAMPLES(PackageSamples) {
  const Bytes music = Pattern(20, 1), sound = Pattern(30, 2), text = Pattern(12, 3);
  const Bytes thing = Pattern(10, 4), ogg = Pattern(25, 5), object = Pattern(16, 6);
  // Version 69: compact values, one byte before each name; the classes are
  // imports, the first name or an export.
  ArchiveBuilder a;
  a.u32(0x9E2A83C1).u16(69).u16(0).u32(0).u32(9).u32(36).u32(5).u32(0).u32(3).u32(0);
  for (const char* n :
       {"mod", "Music", "Sound", "TextBuffer", "wav", "tune", "boom", "notes", "Thing"})
    a.u8(0).text(n).u8(0).u32(0);
  a.patch32(32, a.size());
  for (uint8_t n : {1, 2, 3}) a.u8(0).u8(0).u32(0).u8(n);
  const uint32_t o0 = a.fill(6).u8(20).bytes(music).size() - 27;
  const uint32_t o1 = a.u8(0).u8(4).fill(4).u8(0).u8(5).bytes(sound).size() - 38;
  const uint32_t o2 = a.fill(9).u8(13).bytes(text).size() - 22, o3 = a.bytes(thing).size() - 10;
  a.patch32(24, a.size());
  for (auto [cls, name, size, offset] : {std::tuple{-1, 5, 27u, o0},
                                         {-2, 6, 38u, o1},
                                         {-3, 7, 22u, o2},
                                         {0, 8, 10u, o3},
                                         {4, 7, 0u, 0u}}) {
    a.bytes(Compact(cls)).u8(0).u32(0).bytes(Compact(name)).u32(0).bytes(Compact(size));
    if (size > 0) a.bytes(Compact(offset));
  }
  // Version 128: 32-bit values, four bytes before each name; the export
  // table ends the file, inside the window read for it.
  ArchiveBuilder b;
  b.u32(0x9E2A83C1).u16(128).u16(0).u32(0).u32(5).u32(36).u32(2).u32(0).u32(1).u32(0);
  for (const char* n : {"None", "Sound", "ogg", "hit", "Object"}) b.u32(0).text(n).u8(0).u32(0);
  b.patch32(32, b.size()).u32(0).u32(0).u32(0).u32(1);
  const uint32_t p0 = b.u8(0).u8(2).fill(6).u32(3).fill(11).bytes(ogg).size() - 48;
  const uint32_t p1 = b.bytes(object).size() - 16;
  b.patch32(24, b.size()).u32(-1).u32(0).u32(0).u32(3).u32(0).u32(48).u32(p0);
  b.u32(0).u32(0).u32(0).u32(4).u32(0).u32(16).u32(p1);
  return {
      Row({"object package 69", 36, "map.unr", a.get()}, {{"000000_tune.mod", o0 + 7, music},
                                                          {"000001_boom.wav", o1 + 8, sound},
                                                          {"000002_notes.txt", o2 + 10, text},
                                                          {"000003_Thing.mod", o3, thing},
                                                          {"000004_notes.Thing", 0, {}}}),
      Row({"object package 128", 36, "sounds.uax", b.get()},
          {{"000000_hit.ogg", p0 + 23, ogg}, {"000001_Object.None", p1, object}}),
  };
}

Bytes Reversed(std::string_view s) {
  return Bytes(s.rbegin(), s.rend());
}

CAIRN_SAMPLES(ReworkedDirectorySamples) {
  const Bytes readme = Pattern(12, 1), boom = Pattern(20, 2), theme = Pattern(9, 3);
  // Records: size, order key; names back to front, each followed by 2 bytes
  // of no name; folders replace each other. The data follows the keys.
  ArchiveBuilder m;
  m.u32(4).text("MASSIVE PAKFILE V 4.0\r\n").fill(5).padTo(76).u32(3).fill(12);
  m.u32(12).u32(30).fill(8).u32(20).u32(10).fill(8).u32(9).u32(20).fill(8).u16(0);
  for (const char* n : {"readme.txt", "sounds", "boom.wav", "music", "theme.ogg"})
    m.bytes(Reversed(n)).u8(0).u16(0xBEEF);
  const uint32_t s = m.patch32(84, m.size()).bytes(boom).bytes(theme).bytes(readme).size() - 41;
  // Stored offsets from 5000 and sizes 100 over the inflated ones; the data
  // starts 20 bytes before the first window that is no record.
  const Bytes one = Pattern(300, 11), two = Pattern(40, 12);
  const Bytes z1 = Compress(one, 0), z2 = Compress(two);
  const auto n1 = static_cast<uint32_t>(z1.size()), n2 = static_cast<uint32_t>(z2.size());
  ArchiveBuilder pk;
  pk.text("PK").u8(4).u8(0).fill(16).u32(~(100u + 64)).padTo(64);
  pk.u32(5000).u32(0).u32(400).fill(20).text("first.bin").u8(0).u8(0).fill(20);
  pk.u32(5000 + n1).u32(0).u32(140).fill(20).text("dir/second.dat").u8(0).u8(0);
  const uint32_t e = pk.size();
  return {
      Row({"MASSIVE PAKFILE", 23, "data.pak", m.get()}, {{"sounds\\boom.wav", s, boom},
                                                         {"music\\theme.ogg", s + 20, theme},
                                                         {"readme.txt", s + 29, readme}}),
      {"PK header list",
       76,
       "game.pk",
       pk.bytes(z1).bytes(z2).get(),
       {{"first.bin", e, 300, n1, 0, 0}, {"dir\\second.dat", e + n1, 40, n2, 0, 0}},
       {one, two}},
  };
}

// An "ISD0" list whose key is 34 12 68 24 DF 9B 57 13: bytes 0 and 1 are
// what the search finds, 2 and 3 the header's at 6, 4 to 7 the first record's
// bytes 4 to 7 (which decipher to the key constant).
Bytes Isd0(const std::vector<std::tuple<std::string, uint32_t, Bytes>>& records) {
  const uint8_t key[8] = {0x34, 0x12, 0x68, 0x24, 0xDF, 0x9B, 0x57, 0x13};
  const auto n = static_cast<uint32_t>(records.size());
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
  // Each entry's data is a chain of blocks: L (bytes + 1), 3 bytes, the bytes.
  const Bytes one = ArchiveBuilder().u16(4).fill(3).text("abc").u16(3).fill(3).text("de").get();
  const Bytes two = ArchiveBuilder().u16(5).fill(3).text("fghi").get();
  return {{"ISD0",
           75,
           "voice.isd",
           Isd0({{"intro.txt", 7, one}, {"sub/level.dat", 5, two}}),
           {{"intro.txt", 61, 7, 7, 0, 0}, {"sub\\level.dat", 121, 5, 5, 0, 0}},
           {Text("abcde"), Text("fghi")}}};
}

TEST(EncipheredRecords, NameLengthsAndRecordLengthsAreBounded) {
  EXPECT_EQ(OpenBytesAs(75, Isd0({{std::string(259, 'n'), 0, {}}}))->listing(),
            (std::vector<Listed>{{std::string(259, 'n'), 311, 0, 0, 0, 0}}));
  Bytes looped = Isd0({{"a", 0, {}}, {"b", 0, {}}});
  looped[20] ^= 33;  // the first record's length deciphers to 0
  ExpectRefused({{"name of 260", 75, Isd0({{std::string(260, 'n'), 0, {}}})},
                 {"record of no length", 75, looped}});
}

TEST(ReworkedDirectories, RefuseWhatTheirDirectoryCannotHold) {
  const Bytes m = ReworkedDirectorySamples()[0].bytes;
  const auto with = [&](size_t at, uint32_t v) {
    return ArchiveBuilder().bytes(m).patch32(at, v).get();
  };
  ExpectRefused({{"data area inside the header", 23, with(84, 91)},
                 {"records past the data area", 23, with(76, 8)},
                 {"fewer names than records", 23, with(76, 4)}});
}

TEST(ObjectPackage, RefusesWhatTheTablesCannotName) {
  const SampleTable rows = PackageSamples();
  const auto with = [&](size_t row, size_t at, uint32_t v) {
    return ArchiveBuilder().bytes(rows[row].bytes).patch32(at, v).get();
  };
  const uint32_t exports = ByteView(rows[1].bytes).u32le(24);
  ExpectRefused({{"name index outside", 36, with(0, 12, 8)},
                 {"class of a missing import", 36, with(0, 28, 2)},
                 {"export table past the end", 36, with(0, 24, 0xFFFF0000)},
                 {"sound header larger than its object", 36, with(1, exports + 20, 22)}});
}

}  // namespace
}  // namespace cairn::test
