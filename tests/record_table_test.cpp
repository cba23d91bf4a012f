// Fixed-record table directories: each layout row lists and extracts exactly,
// the derived sizes and offsets come out right, and directories that cannot
// lie inside the file are refused.
#include <gtest/gtest.h>

#include <string>

#include "builder.h"
#include "fixtures.h"
#include "readers/readers.h"
#include "table_checks.h"

namespace cairn::test {
namespace {

Fixture Wad(FormatId id, std::string_view magic, std::string_view fileName) {
  const Bytes map = Pattern(40, 3), things = Pattern(30, 9), palette = Pattern(50, 17);
  ArchiveBuilder b;
  b.text(magic).u32(4).u32(132).bytes(map).bytes(things).bytes(palette);
  b.u32(0).u32(0).name("S_START", 8);  // a marker lump without data
  b.u32(12).u32(40).name("E1M1", 8);
  b.u32(52).u32(30).name("THINGS", 8);
  b.u32(82).u32(50).name("PLAYPAL8", 8);  // fills its field
  return {std::string(magic),
          id,
          std::string(fileName),
          b.get(),
          {},
          {{"S_START", {}}, {"E1M1", map}, {"THINGS", things}, {"PLAYPAL8", palette}}};
}

CAIRN_FIXTURE(Iwad) {
  return Wad(6, "IWAD", "doom.wad");
}
CAIRN_FIXTURE(Pwad) {
  return Wad(34, "PWAD", "mymap.wad");
}

const std::vector<Listed> kWadListing = {{"S_START", 0, 0, 0, 0, 0},
                                         {"E1M1", 12, 40, 40, 0, 0},
                                         {"THINGS", 52, 30, 30, 0, 0},
                                         {"PLAYPAL8", 82, 50, 50, 0, 0}};

TEST(RecordTable, IwadAndPwadTakeCountAndDirectoryFromTheHeader) {
  ExpectListsAndExtracts(6, Iwad(), kWadListing);
  ExpectListsAndExtracts(34, Pwad(), kWadListing);
}

CAIRN_FIXTURE(Glb2) {
  const Bytes intro = Pattern(60, 5), level = Pattern(25, 8);
  ArchiveBuilder b;
  b.text("GLB2.0").u8(0).u8(0).u32(2).u32(0);
  b.u32(72).u32(60).name("intro.pcx", 20);
  b.u32(132).u32(25).name("level1.map", 20);
  b.bytes(intro).bytes(level);
  return {"GLB2.0", 15, "game.glb", b.get(), {}, {{"intro.pcx", intro}, {"level1.map", level}}};
}

TEST(RecordTable, Glb2RecordsHoldOffsetAndSizeBeforeTheName) {
  ExpectListsAndExtracts(15, Glb2(),
                         {{"intro.pcx", 72, 60, 60, 0, 0}, {"level1.map", 132, 25, 25, 0, 0}});
}

CAIRN_FIXTURE(Fastf) {
  const Bytes car = Pattern(33, 2), tracks = Pattern(20, 4);
  ArchiveBuilder b;
  b.text("FASTF101").fill(16).u32(2);
  b.name("CAR.SHP", 12).u32(76).u32(33).u32(0xEEEEEEEE);
  b.name("TRACKS01.DAT", 12).u32(109).u32(20).u32(0xEEEEEEEE);  // fills its field
  b.bytes(car).bytes(tracks);
  return {"FASTF101", 17, "race.ff", b.get(), {}, {{"CAR.SHP", car}, {"TRACKS01.DAT", tracks}}};
}

TEST(RecordTable, FastfSkipsTheLastFourBytesOfEachRecord) {
  ExpectListsAndExtracts(17, Fastf(),
                         {{"CAR.SHP", 76, 33, 33, 0, 0}, {"TRACKS01.DAT", 109, 20, 20, 0, 0}});
}

CAIRN_FIXTURE(Sbf0) {
  const Bytes menu = Pattern(10, 1), click = Pattern(20, 2), theme = Pattern(15, 3);
  ArchiveBuilder b;
  b.text("SBF0").fill(12).u32(24).u32(3);
  b.name("menu.wav", 16).u32(120).fill(12, 0xAB);
  b.name("click.wav", 16).u32(130).fill(12, 0xAB);
  b.name("theme.ogg", 16).u32(150).fill(12, 0xAB);
  b.bytes(menu).bytes(click).bytes(theme);
  return {"SBF0",  22, "sounds.sbf",
          b.get(), {}, {{"menu.wav", menu}, {"click.wav", click}, {"theme.ogg", theme}}};
}

TEST(RecordTable, Sbf0SizesRunToTheNextEntryAndTheLastToTheEnd) {
  ExpectListsAndExtracts(22, Sbf0(),
                         {{"menu.wav", 120, 10, 10, 0, 0},
                          {"click.wav", 130, 20, 20, 0, 0},
                          {"theme.ogg", 150, 15, 15, 0, 0}});
}

CAIRN_FIXTURE(Dorba) {
  const Bytes sky = Pattern(30, 6), font = Pattern(25, 7);
  ArchiveBuilder b;
  b.text("DorbaMistfel").u32(3);
  b.name("sky.tga", 12).u32(30);
  b.name("empty.txt", 12).u32(0);
  b.name("font.fnt", 12).u32(25);
  b.bytes(sky).bytes(font);
  return {"DorbaMistfel", 24, "group.grp",
          b.get(),        {}, {{"sky.tga", sky}, {"empty.txt", {}}, {"font.fnt", font}}};
}

TEST(RecordTable, DorbaDataFollowsTheDirectoryBackToBack) {
  ExpectListsAndExtracts(24, Dorba(),
                         {{"sky.tga", 64, 30, 30, 0, 0},
                          {"empty.txt", 94, 0, 0, 0, 0},
                          {"font.fnt", 94, 25, 25, 0, 0}});

  // Sizes 10, 0 and 5 behind a 48-byte directory.
  ArchiveBuilder b;
  b.text("DorbaMistfel").u32(3).name("a", 12).u32(10).name("b", 12).u32(0).name("c", 12).u32(5);
  auto o = OpenBytesAs(24, b.padTo(104).get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(
      o->listing(),
      (std::vector<Listed>{{"a", 64, 10, 10, 0, 0}, {"b", 74, 0, 0, 0, 0}, {"c", 74, 5, 5, 0, 0}}));
}

// Signature row 42: 32-byte records at 2048 whose offset fields are not
// offsets; the data lies on a grid after the directory.
Bytes Grid(uint8_t mode, const std::vector<std::pair<std::string, uint32_t>>& entries) {
  ArchiveBuilder b;
  b.u8(0xCE).u8(0x0A).u8(0x89).u8(0x51).u32(3).u32(static_cast<uint32_t>(entries.size()));
  b.padTo(2048);
  for (const auto& [name, size] : entries)
    b.name(name, 23).u8(mode).u8(0x11).u8(0x22).u8(0x33).u8(0x44).u32(size);
  return b.get();
}

CAIRN_FIXTURE(Grid2048) {
  const Bytes movie = Pattern(100, 9), credits = Pattern(50, 10);
  ArchiveBuilder b;
  b.bytes(Grid(0, {{"opening.smk", 100}, {"credits.txt", 50}}));
  b.padTo(4096).bytes(movie).padTo(6144).bytes(credits);
  return {"signature row 42",
          42,
          "movies.dat",
          b.get(),
          {},
          {{"opening.smk", movie}, {"credits.txt", credits}}};
}

TEST(RecordTable, Row42LaysTheDataOnTheGridTheFirstRecordChooses) {
  ExpectListsAndExtracts(
      42, Grid2048(), {{"opening.smk", 4096, 100, 100, 0, 0}, {"credits.txt", 6144, 50, 50, 0, 0}});

  const std::vector<std::pair<std::string, uint32_t>> three = {{"a", 100}, {"b", 3000}, {"c", 10}};
  auto coarse = OpenBytesAs(42, ArchiveBuilder().bytes(Grid(0, three)).padTo(10250).get());
  ASSERT_EQ(coarse->result, kOk);
  EXPECT_EQ(coarse->listing(), (std::vector<Listed>{{"a", 4096, 100, 100, 0, 0},
                                                    {"b", 6144, 3000, 3000, 0, 0},
                                                    {"c", 10240, 10, 10, 0, 0}}));
  auto fine = OpenBytesAs(42, ArchiveBuilder().bytes(Grid(1, three)).padTo(7242).get());
  ASSERT_EQ(fine->result, kOk);
  EXPECT_EQ(fine->listing(), (std::vector<Listed>{{"a", 4096, 100, 100, 0, 0},
                                                  {"b", 4224, 3000, 3000, 0, 0},
                                                  {"c", 7232, 10, 10, 0, 0}}));
}

TEST(RecordTable, AnEmptyDirectoryIsNotRead) {
  // The directory would begin at 2048, far past the end of this file.
  auto o = OpenBytesAs(42, Slice(Grid(0, {}), 0, 104));
  ASSERT_EQ(o->result, kOk);
  EXPECT_TRUE(o->listing().empty());
}

CAIRN_FIXTURE(Dotted) {
  const Bytes readme = Pattern(20, 11), a = Pattern(15, 12), music = Pattern(30, 13);
  ArchiveBuilder b;
  b.u32(3);
  b.name(std::string_view("README\0TXT", 10), 40).u32(148).u32(20);
  b.name(std::string_view("A\0\0TXT", 6), 40).u32(168).u32(15);
  b.name("MUSIC.MID", 40).u32(183).u32(30);
  b.bytes(readme).bytes(a).bytes(music);
  return {"dotted 40-byte names",
          85,
          "files.res",
          b.get(),
          {},
          {{"README.TXT", readme}, {"A..TXT", a}, {"MUSIC.MID", music}}};
}

TEST(RecordTable, ZeroBytesInsideA40ByteNameBecomeDots) {
  ExpectListsAndExtracts(85, Dotted(),
                         {{"README.TXT", 148, 20, 20, 0, 0},
                          {"A..TXT", 168, 15, 15, 0, 0},
                          {"MUSIC.MID", 183, 30, 30, 0, 0}});
}

CAIRN_FIXTURE(Unsized) {
  const Bytes title = Pattern(12, 14), font = Pattern(34, 15), intro = Pattern(20, 16);
  ArchiveBuilder b;
  b.u32(3).name("title.pcx", 40).u32(136).name("font.pcx", 40).u32(148);
  b.name("intro.txt", 40).u32(182);
  b.bytes(title).bytes(font).bytes(intro);
  return {"40-byte names without sizes",
          86,
          "screens.res",
          b.get(),
          {},
          {{"title.pcx", title}, {"font.pcx", font}, {"intro.txt", intro}}};
}

TEST(RecordTable, UnsizedRecordsRunToTheNextOffset) {
  ExpectListsAndExtracts(86, Unsized(),
                         {{"title.pcx", 136, 12, 12, 0, 0},
                          {"font.pcx", 148, 34, 34, 0, 0},
                          {"intro.txt", 182, 20, 20, 0, 0}});

  ArchiveBuilder b;
  b.u32(3).name("a", 40).u32(100).name("b", 40).u32(300).name("c", 40).u32(700).padTo(1000);
  auto o = OpenBytesAs(86, b.get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (std::vector<Listed>{{"a", 100, 200, 200, 0, 0},
                                               {"b", 300, 400, 400, 0, 0},
                                               {"c", 700, 300, 300, 0, 0}}));
}

const std::string kLongName = std::string(76, 'x') + ".dat";  // fills an 80-byte field

CAIRN_FIXTURE(Names80) {
  const Bytes wall = Pattern(20, 17), big = Pattern(10, 18);
  ArchiveBuilder b;
  b.u32(2).name("textures/wall.bmp", 80).u32(180).u32(20).name(kLongName, 80).u32(200).u32(10);
  b.bytes(wall).bytes(big);
  return {"80-byte names", 89, "level.res",
          b.get(),         {}, {{"textures\\wall.bmp", wall}, {kLongName, big}}};
}

TEST(RecordTable, EightyByteNamesAreListedWholeWithBackslashes) {
  ExpectListsAndExtracts(
      89, Names80(), {{"textures\\wall.bmp", 180, 20, 20, 0, 0}, {kLongName, 200, 10, 10, 0, 0}});
}

CAIRN_FIXTURE(Padded80) {
  const Bytes town = Pattern(16, 19), cave = Pattern(8, 20);
  ArchiveBuilder b;
  b.u32(2).name("maps/town.map", 80).u32(188).u32(16).u32(0xCCCCCCCC);
  b.name("maps/cave.map", 80).u32(204).u32(8).u32(0xCCCCCCCC);
  b.bytes(town).bytes(cave);
  return {"80-byte names in padded records",
          114,
          "world.rss",
          b.get(),
          {},
          {{"maps\\town.map", town}, {"maps\\cave.map", cave}}};
}

TEST(RecordTable, PaddedRecordsStepOverTheirPadding) {
  ExpectListsAndExtracts(
      114, Padded80(),
      {{"maps\\town.map", 188, 16, 16, 0, 0}, {"maps\\cave.map", 204, 8, 8, 0, 0}});
}

// Records of 14-byte names whose size comes first and whose offset is
// stored 2 short.
CAIRN_FIXTURE(Names14) {
  const Bytes grass = Pattern(10, 21), stone = Pattern(20, 22), mud = Pattern(5, 23),
              sand = Pattern(15, 24);
  ArchiveBuilder b;
  b.u16(4);
  b.name("GRASS.BMP", 14).u32(10).u32(88);
  b.name("STONE.BMP", 14).u32(20).u32(98);
  b.name("MUD.BMP", 14).u32(5).u32(118);
  b.name("SAND.BMP", 14).u32(15).u32(123);
  b.bytes(grass).bytes(stone).bytes(mud).bytes(sand);
  return {"14-byte names",
          105,
          "tiles.res",
          b.get(),
          {},
          {{"GRASS.BMP", grass}, {"STONE.BMP", stone}, {"MUD.BMP", mud}, {"SAND.BMP", sand}}};
}

TEST(RecordTable, FourteenByteNamesExchangeTheirFields) {
  ExpectListsAndExtracts(105, Names14(),
                         {{"GRASS.BMP", 90, 10, 10, 0, 0},
                          {"STONE.BMP", 100, 20, 20, 0, 0},
                          {"MUD.BMP", 120, 5, 5, 0, 0},
                          {"SAND.BMP", 125, 15, 15, 0, 0}});

  // The count is 16 bits wide: the next two bytes begin the first name.
  ArchiveBuilder b;
  b.u8(0x02).u8(0x00).u8(0xFF).u8(0xFF).text("AB").fill(10).u32(500).u32(1000);
  b.name("second", 14).u32(4).u32(1500);
  const Bytes first = Pattern(500, 25), second = Pattern(4, 26);
  b.padTo(1002).bytes(first).bytes(second);
  auto o = OpenBytesAs(105, b.get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (std::vector<Listed>{{"\xFF\xFF"
                                                "AB",
                                                1002, 500, 500, 0, 0},
                                               {"second", 1502, 4, 4, 0, 0}}));
  EXPECT_EQ(o->extract(0), first);
  EXPECT_EQ(o->extract(1), second);
}

TEST(RecordTable, DirectoriesThatCannotLieInsideTheFileAreRefused) {
  // The directory begins 8 bytes before the end but needs 16.
  ExpectRefused(6, ArchiveBuilder().text("IWAD").u32(1).u32(96).padTo(104).get());
  // The directory position lies past the end.
  ExpectRefused(34, ArchiveBuilder().text("PWAD").u32(1).u32(0x7FFFFFFF).padTo(104).get());
  // 0x10000001 records of 16 bytes: 16 bytes in 32-bit arithmetic, 4 GiB in truth.
  ExpectRefused(6, ArchiveBuilder().text("IWAD").u32(0x10000001).u32(12).padTo(104).get());
  // A directory at 2048 in a file of 104 bytes.
  ExpectRefused(42, Slice(Grid(0, {{"a", 1}}), 0, 104));
  // Data laid back to back would begin past 4 GiB.
  ExpectRefused(24, ArchiveBuilder()
                        .text("DorbaMistfel")
                        .u32(3)
                        .name("a", 12)
                        .u32(0xFFFFFFF0)
                        .name("b", 12)
                        .u32(0xFFFFFFF0)
                        .name("c", 12)
                        .u32(1)
                        .padTo(104)
                        .get());
}

TEST(RecordTable, ParsedDirectoriesMustHoldEveryRecord) {
  ArchiveSession s;
  ReaderContext c{s, os::kNoFile, ByteView(), 0, "", "", s.entries};
  const Bytes directory =
      ArchiveBuilder().name("one", 12).u32(100).u32(5).name("two", 12).u32(105).u32(7).get();
  EXPECT_THROW(ParseRecordDirectory(c, ByteView(directory), 3, {12, 4, 4, false}), BadData);
  EXPECT_TRUE(s.entries.empty());
  ParseRecordDirectory(c, ByteView(directory), 2, {12, 4, 4, false});
  ASSERT_EQ(s.entries.size(), 2u);
  EXPECT_EQ(s.entries[1].Name, "two");
  EXPECT_EQ(s.entries[1].Offset, 105u);
  EXPECT_EQ(s.entries[1].PackedSize, 7u);
}

}  // namespace
}  // namespace cairn::test
