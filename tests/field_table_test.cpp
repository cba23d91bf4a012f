// Field-offset table directories: each layout row lists and extracts exactly,
// offsets are rebased or derived as the format wants, and directories that
// cannot lie inside the file are refused.
#include <gtest/gtest.h>

#include <string>

#include "builder.h"
#include "fixtures.h"
#include "readers/readers.h"
#include "table_checks.h"

namespace cairn::test {
namespace {

const Bytes kIntro = Text("The castle gate opens at dawn. The castle gate closes at dusk.\n");
const Bytes kMap = Pattern(300, 27);

// Every entry of a "LOD" archive is a zlib stream.
CAIRN_FIXTURE(Lod) {
  const Bytes intro = Compress(kIntro), map = Compress(kMap);
  const auto introSize = static_cast<uint32_t>(intro.size());
  ArchiveBuilder b;
  b.text("LOD").u8(0).u32(0).u32(2).padTo(92);
  b.name("intro.txt", 16).u32(156).u32(static_cast<uint32_t>(kIntro.size()));
  b.u32(0xDEADBEEF).u32(introSize);
  b.name("map.dat", 16).u32(156 + introSize).u32(300).u32(0xDEADBEEF);
  b.u32(static_cast<uint32_t>(map.size()));
  b.bytes(intro).bytes(map);
  return {"LOD", 10, "h3bitmap.lod", b.get(), {}, {{"intro.txt", kIntro}, {"map.dat", kMap}}};
}

TEST(FieldTable, LodEntriesAreInflated) {
  const Fixture f = Lod();
  const auto intro = static_cast<uint32_t>(Compress(kIntro).size());
  const auto map = static_cast<uint32_t>(Compress(kMap).size());
  ExpectListsAndExtracts(10, f,
                         {{"intro.txt", 156, static_cast<uint32_t>(kIntro.size()), intro, 0, 0},
                          {"map.dat", 156 + intro, 300, map, 0, 0}});
}

TEST(FieldTable, LodEntriesThatDoNotInflateAsStatedFailToExtract) {
  Bytes damaged = Lod().bytes;
  damaged.at(160) ^= 0xFF;  // inside the first stream
  auto o = OpenBytesAs(10, damaged);
  ASSERT_EQ(o->result, kOk);
  Bytes out;
  EXPECT_EQ(o->extract(0, out), kBadData);
  EXPECT_EQ(o->extract(1), kMap);

  Bytes understated = Lod().bytes;
  PutU32le(understated, 92 + 32 + 20, 299);  // one byte fewer than the stream holds
  auto u = OpenBytesAs(10, understated);
  ASSERT_EQ(u->result, kOk);
  EXPECT_EQ(u->extract(1, out), kBadData);
}

CAIRN_FIXTURE(Csid) {
  const Bytes sprite = Pattern(20, 28), palette = Pattern(10, 29), icons = Pattern(15, 30);
  ArchiveBuilder b;
  b.text("CSid").u16(3);
  b.u8(0x99).name("SPRITE.SHP", 12).u32(20).u32(69);
  b.u8(0x99).name("PALETTE.PAL", 12).u32(10).u32(89);
  b.u8(0x99).name("ICONS.ICN", 12).u32(15).u32(99);
  b.bytes(sprite).bytes(palette).bytes(icons);
  return {"CSid",  11, "sprites.csd",
          b.get(), {}, {{"SPRITE.SHP", sprite}, {"PALETTE.PAL", palette}, {"ICONS.ICN", icons}}};
}

TEST(FieldTable, CsidNamesStartAfterOneByte) {
  ExpectListsAndExtracts(11, Csid(),
                         {{"SPRITE.SHP", 69, 20, 20, 0, 0},
                          {"PALETTE.PAL", 89, 10, 10, 0, 0},
                          {"ICONS.ICN", 99, 15, 15, 0, 0}});
}

Bytes Xcr(const std::string& firstName) {
  ArchiveBuilder b;
  b.text("xcr File 1.00").fill(3).u32(0).u32(2).u32(0);
  b.name(firstName, 256).fill(256, 0x55).u32(1092).u32(30).fill(12, 0x77);
  b.name("sfx/boom.wav", 256).fill(256, 0x55).u32(1122).u32(12).fill(12, 0x77);
  b.bytes(Pattern(30, 31)).bytes(Pattern(12, 32));
  return b.get();
}

CAIRN_FIXTURE(XcrFixture) {
  return {"xcr File 1.00",
          73,
          "data.xcr",
          Xcr("gfx/menu.pcx"),
          {},
          {{"gfx\\menu.pcx", Pattern(30, 31)}, {"sfx\\boom.wav", Pattern(12, 32)}}};
}

TEST(FieldTable, XcrHas256ByteNames) {
  ExpectListsAndExtracts(
      73, XcrFixture(),
      {{"gfx\\menu.pcx", 1092, 30, 30, 0, 0}, {"sfx\\boom.wav", 1122, 12, 12, 0, 0}});

  // A name that fills its whole field has no terminator and ends there.
  const std::string full(256, 'n');
  auto o = OpenBytesAs(73, Xcr(full));
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->session.entries.at(0).Name, full);
}

CAIRN_FIXTURE(Records27) {
  const Bytes longName = Pattern(10, 33), tree = Pattern(20, 34), rock = Pattern(13, 35);
  ArchiveBuilder b;
  b.u16(3);
  b.u16(5).u32(10).u32(10).name("LONGNAME0.DAT", 13).u32(83);  // fills its field
  b.u16(9).u32(20).u32(0x12345678).name("TREE.SPR", 13).u32(93);
  b.u16(9).u32(13).u32(0x12345678).name("ROCK.SPR", 13).u32(113);
  b.bytes(longName).bytes(tree).bytes(rock);
  return {
      "27-byte records", 87, "objects.res",
      b.get(),           {}, {{"LONGNAME0.DAT", longName}, {"TREE.SPR", tree}, {"ROCK.SPR", rock}}};
}

TEST(FieldTable, TwentySevenByteRecordsHaveASixteenBitCount) {
  ExpectListsAndExtracts(87, Records27(),
                         {{"LONGNAME0.DAT", 83, 10, 10, 0, 0},
                          {"TREE.SPR", 93, 20, 20, 0, 0},
                          {"ROCK.SPR", 113, 13, 13, 0, 0}});

  Bytes oneAfterCount = Records27().bytes;
  oneAfterCount.at(2) = 1;  // header bytes 03 00 01 00
  auto o = OpenBytesAs(87, oneAfterCount);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->session.entries.size(), 3u);
}

Bytes Bigf(uint32_t base, uint32_t secondOffset, size_t fileSize) {
  ArchiveBuilder b;
  b.text("BIGF").u32(2).u32(base).u32(64).fill(20);
  b.name("snd/hit.wav", 16).u32(50).u32(0);
  b.name("snd/miss.wav", 16).u32(30).u32(secondOffset);
  b.padTo(base).bytes(Pattern(50, 36)).padTo(base + secondOffset).bytes(Pattern(30, 37));
  return b.padTo(fileSize).get();
}

CAIRN_FIXTURE(BigfFixture) {
  return {"BIGF",       97,
          "sounds.big", Bigf(84, 50, 164),
          {},           {{"snd\\hit.wav", Pattern(50, 36)}, {"snd\\miss.wav", Pattern(30, 37)}}};
}

TEST(FieldTable, BigfOffsetsCountFromTheHeaderValue) {
  ExpectListsAndExtracts(
      97, BigfFixture(),
      {{"snd\\hit.wav", 84, 50, 50, 0, 0}, {"snd\\miss.wav", 134, 30, 30, 0, 0}});

  auto o = OpenBytesAs(97, Bigf(1000, 50, 1080));
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->session.entries.at(0).Offset, 1000u);
  EXPECT_EQ(o->session.entries.at(1).Offset, 1050u);
  EXPECT_EQ(o->extract(1), Pattern(30, 37));
}

const std::string kName38 = std::string(34, 'y') + ".txt";

CAIRN_FIXTURE(Records136) {
  const Bytes first = Pattern(9, 38), second = Pattern(17, 39);
  ArchiveBuilder b;
  b.u32(2);
  b.name("first.txt", 38).fill(90, 0xCC).u32(276).u32(9);
  b.name(kName38, 38).fill(90, 0xCC).u32(285).u32(17);  // fills its field
  b.bytes(first).bytes(second);
  return {
      "136-byte records", 118, "stage.res", b.get(), {}, {{"first.txt", first}, {kName38, second}}};
}

TEST(FieldTable, OneHundredThirtySixByteRecordsKeepTheirFieldsAtTheEnd) {
  ExpectListsAndExtracts(118, Records136(),
                         {{"first.txt", 276, 9, 9, 0, 0}, {kName38, 285, 17, 17, 0, 0}});
}

CAIRN_FIXTURE(SizePrefixed) {
  ArchiveBuilder b;
  b.u32(193).u32(3);
  b.u32(5).name("a.txt", 52).u32(8).name("bb.txt", 52).u32(1).name("c", 52);
  b.bytes(Pattern(5, 40)).fill(3, 0xEE).bytes(Pattern(8, 41)).bytes(Pattern(1, 42));
  return {"size-prefixed 52-byte names",
          122,
          "pack.res",
          b.get(),
          {},
          {{"a.txt", Pattern(5, 40)}, {"bb.txt", Pattern(8, 41)}, {"c", Pattern(1, 42)}}};
}

TEST(FieldTable, SizePrefixedDataLiesOnAFourByteGridAfterTheDirectory) {
  ExpectListsAndExtracts(
      122, SizePrefixed(),
      {{"a.txt", 176, 5, 5, 0, 0}, {"bb.txt", 184, 8, 8, 0, 0}, {"c", 192, 1, 1, 0, 0}});
}

TEST(FieldTable, DirectoriesThatCannotLieInsideTheFileAreRefused) {
  Bytes lod = Lod().bytes;
  PutU32le(lod, 8, 100);  // 100 records of 32 bytes from 92
  ExpectRefused(10, lod);
  ExpectRefused(118, ArchiveBuilder().u32(0x7FFFFFFF).padTo(400).get());
  Bytes records = Records27().bytes;
  PutU16le(records, 0, 0xFFFF);
  ExpectRefused(87, records);
  Bytes csid = Csid().bytes;
  PutU16le(csid, 4, 6);  // six records of 21 bytes from 6 need 132 bytes
  ExpectRefused(11, csid);
  // Offsets that pass 4 GiB once rebased or laid out cannot be in the file.
  Bytes rebased = Bigf(84, 0x20, 164);
  PutU32le(rebased, 8, 0xFFFFFFF0);
  ExpectRefused(97, rebased);
  ExpectRefused(122, ArchiveBuilder()
                         .u32(0)
                         .u32(2)
                         .u32(0xFFFFFFF0)
                         .name("a", 52)
                         .u32(0xFFFFFFF0)
                         .name("b", 52)
                         .get());
}

}  // namespace
}  // namespace cairn::test
