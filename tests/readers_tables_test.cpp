// Directories of fixed-size records: the record tables (a name, an offset and
// a size, or fewer fields and the rest derived) and the field tables (each
// field at a place of its own).
#include <gtest/gtest.h>

#include <string>

#include "samples.h"

namespace cairn::test {
namespace {

struct At {
  std::string name;
  uint32_t offset, size;
};

// A row whose entries are stored as they are: each lists its offset and its
// size twice and extracts to the archive's bytes there.
Sample Stored(std::string label, FormatId id, std::string fileName, const ArchiveBuilder& b,
              const std::vector<At>& entries) {
  Sample s{std::move(label), id, std::move(fileName), b.get(), {}, {}};
  for (const At& e : entries) {
    EXPECT_LE(e.offset + e.size, s.bytes.size()) << "the row itself: " << e.name;
    s.listing.push_back({e.name, e.offset, e.size, e.size, 0, 0});
    s.data.push_back(Slice(s.bytes, e.offset, e.size));
  }
  return s;
}

// The lump directory behind the data: offset, size, name[8].
ArchiveBuilder Wad(std::string_view magic) {
  ArchiveBuilder b;
  b.text(magic).u32(4).u32(132).bytes(Pattern(120, 3));
  b.u32(0).u32(0).name("S_START", 8);  // a marker lump without data
  b.u32(12).u32(40).name("E1M1", 8).u32(52).u32(30).name("THINGS", 8);
  return b.u32(82).u32(50).name("PLAYPAL8", 8);  // fills its field
}
const std::vector<At> kWadLumps = {
    {"S_START", 0, 0}, {"E1M1", 12, 40}, {"THINGS", 52, 30}, {"PLAYPAL8", 82, 50}};

// Signature row 42: 32-byte records at 2048 whose offset fields are not
// offsets; the data lies from 4096 on a grid of 2048 bytes, or of 64 when
// the byte after the first name is not 0.
ArchiveBuilder Grid(uint8_t grid, size_t fileSize) {
  ArchiveBuilder b;
  b.u32(0x51890ACE).u32(3).u32(3).padTo(2048);
  b.name("opening.smk", 23).u8(grid).u32(0x44332211).u32(100);
  b.name("level.dat", 23).u8(grid).u32(0x44332211).u32(3000);
  b.name("credits.txt", 23).u8(grid).u32(0x44332211).u32(10);
  return b.padTo(4096).bytes(Pattern(fileSize - 4096, 9));
}

const std::string kName38 = std::string(34, 'y') + ".txt", kName80 = std::string(76, 'x') + ".dat";
const std::string kName256 = "sfx/" + std::string(248, 'z') + ".wav";

CAIRN_SAMPLES(TableSamples) {
  ArchiveBuilder glb, ff, sbf, dorba, dotted, unsized, names80, padded80, names14;
  glb.text("GLB2.0").u16(0).u32(2).u32(0).u32(72).u32(60).name("intro.pcx", 20);
  glb.u32(132).u32(25).name("level1.map", 20).bytes(Pattern(85, 5));
  ff.text("FASTF101").fill(16).u32(2).name("CAR.SHP", 12).u32(76).u32(33).u32(0xEEEEEEEE);
  ff.name("TRACKS01.DAT", 12).u32(109).u32(20).u32(0xEEEEEEEE).bytes(Pattern(53, 2));
  sbf.text("SBF0").fill(12).u32(24).u32(3);  // the directory's offset, the count
  for (auto [name, offset] : {std::pair{"menu.wav", 120}, {"click.wav", 130}, {"theme.ogg", 150}})
    sbf.name(name, 16).u32(offset).fill(12, 0xAB);
  sbf.bytes(Pattern(45));
  dorba.text("DorbaMistfel").u32(3).name("sky.tga", 12).u32(30).name("empty.txt", 12).u32(0);
  dorba.name("font.fnt", 12).u32(25).bytes(Pattern(55, 6));
  dotted.u32(3).name(std::string_view("README\0TXT", 10), 40).u32(148).u32(20);
  dotted.name(std::string_view("A\0\0TXT", 6), 40).u32(168).u32(15).name("MUSIC.MID", 40);
  dotted.u32(183).u32(30).bytes(Pattern(65, 11));
  unsized.u32(3).name("title.pcx", 40).u32(136).name("font.pcx", 40).u32(148);
  unsized.name("intro.txt", 40).u32(182).bytes(Pattern(66, 14));
  names80.u32(2).name("textures/wall.bmp", 80).u32(180).u32(20).name(kName80, 80);
  names80.u32(200).u32(10).bytes(Pattern(30, 17));
  padded80.u32(2).name("maps/town.map", 80).u32(188).u32(16).u32(0xCCCCCCCC);
  padded80.name("maps/cave.map", 80).u32(204).u32(8).u32(0xCCCCCCCC).bytes(Pattern(24, 19));
  // The size comes first and the offset is stored 2 short; the count is 16
  // bits wide, the first name's bytes follow it.
  names14.u16(4).name("GRASS.BMP", 14).u32(10).u32(88).name("STONE.BMP", 14).u32(20).u32(98);
  names14.name("MUD.BMP", 14).u32(5).u32(118).name("SAND.BMP", 14).u32(15).u32(123);
  names14.bytes(Pattern(50, 21));

  // Field tables. "LOD" entries are zlib streams.
  const Bytes intro = Text("The castle gate opens at dawn. The castle gate closes at dusk.\n");
  const Bytes map = Pattern(300, 27), introZ = Compress(intro), mapZ = Compress(map);
  const auto introSize = static_cast<uint32_t>(introZ.size()),
             mapSize = static_cast<uint32_t>(mapZ.size());
  ArchiveBuilder lod, csid, xcr, records27, bigf, records136, sizes;
  lod.text("LOD").u8(0).u32(0).u32(2).padTo(92).name("intro.txt", 16).u32(156).u32(63);
  lod.u32(0xDEADBEEF).u32(introSize).name("map.dat", 16).u32(156 + introSize).u32(300);
  lod.u32(0xDEADBEEF).u32(mapSize).bytes(introZ).bytes(mapZ);
  csid.text("CSid").u16(3).u8(0x99).name("SPRITE.SHP", 12).u32(20).u32(69);
  csid.u8(0x99).name("PALETTE.PAL", 12).u32(10).u32(89);
  csid.u8(0x99).name("ICONS.ICN", 12).u32(15).u32(99).bytes(Pattern(45, 28));
  xcr.text("xcr File 1.00").fill(3).u32(0).u32(2).u32(0);
  xcr.name("gfx/menu.pcx", 256).fill(256, 0x55).u32(1092).u32(30).fill(12, 0x77);
  xcr.name(kName256, 256).fill(256, 0x55).u32(1122).u32(12).fill(12, 0x77);  // fills its field
  xcr.bytes(Pattern(42, 31));
  // A 16-bit count: the first record's bytes follow it.
  records27.u16(3).u16(5).u32(10).u32(10).name("LONGNAME0.DAT", 13).u32(83);
  records27.u16(9).u32(20).u32(0x12345678).name("TREE.SPR", 13).u32(93);
  records27.u16(9).u32(13).u32(0x12345678).name("ROCK.SPR", 13).u32(113).bytes(Pattern(43, 33));
  // Offsets count from the header word at 8.
  bigf.text("BIGF").u32(2).u32(84).u32(64).fill(20).name("snd/hit.wav", 16).u32(50).u32(0);
  bigf.name("snd/miss.wav", 16).u32(30).u32(50).bytes(Pattern(80, 36));
  records136.u32(2).name("first.txt", 38).fill(90, 0xCC).u32(276).u32(9);
  records136.name(kName38, 38).fill(90, 0xCC).u32(285).u32(17).bytes(Pattern(26, 38));
  // Sizes only: the data follows the directory, each entry on a 4-byte grid.
  sizes.u32(193).u32(3).u32(5).name("a.txt", 52).u32(8).name("bb.txt", 52).u32(1).name("c", 52);
  sizes.bytes(Pattern(17, 40));

  return {
      Stored("IWAD", 6, "doom.wad", Wad("IWAD"), kWadLumps),
      Stored("PWAD", 34, "mymap.wad", Wad("PWAD"), kWadLumps),
      Stored("GLB2.0", 15, "game.glb", glb, {{"intro.pcx", 72, 60}, {"level1.map", 132, 25}}),
      Stored("FASTF101", 17, "race.ff", ff, {{"CAR.SHP", 76, 33}, {"TRACKS01.DAT", 109, 20}}),
      Stored("SBF0, sizes run to the next entry", 22, "sounds.sbf", sbf,
             {{"menu.wav", 120, 10}, {"click.wav", 130, 20}, {"theme.ogg", 150, 15}}),
      Stored("DorbaMistfel, data back to back", 24, "group.grp", dorba,
             {{"sky.tga", 64, 30}, {"empty.txt", 94, 0}, {"font.fnt", 94, 25}}),
      Stored("signature row 42, 2048-byte grid", 42, "movies.dat", Grid(0, 10250),
             {{"opening.smk", 4096, 100}, {"level.dat", 6144, 3000}, {"credits.txt", 10240, 10}}),
      Stored("signature row 42, 64-byte grid", 42, "movies.dat", Grid(1, 7242),
             {{"opening.smk", 4096, 100}, {"level.dat", 4224, 3000}, {"credits.txt", 7232, 10}}),
      Stored("zero bytes in a 40-byte name stand for dots", 85, "files.res", dotted,
             {{"README.TXT", 148, 20}, {"A..TXT", 168, 15}, {"MUSIC.MID", 183, 30}}),
      Stored("40-byte names without sizes", 86, "screens.res", unsized,
             {{"title.pcx", 136, 12}, {"font.pcx", 148, 34}, {"intro.txt", 182, 20}}),
      Stored("80-byte names", 89, "level.res", names80,
             {{"textures\\wall.bmp", 180, 20}, {kName80, 200, 10}}),
      Stored("80-byte names in padded records", 114, "world.rss", padded80,
             {{"maps\\town.map", 188, 16}, {"maps\\cave.map", 204, 8}}),
      Stored("14-byte names", 105, "tiles.res", names14,
             {{"GRASS.BMP", 90, 10},
              {"STONE.BMP", 100, 20},
              {"MUD.BMP", 120, 5},
              {"SAND.BMP", 125, 15}}),
      {"LOD, zlib entries",
       10,
       "h3bitmap.lod",
       lod.get(),
       {{"intro.txt", 156, 63, introSize, 0, 0}, {"map.dat", 156 + introSize, 300, mapSize, 0, 0}},
       {intro, map}},
      Stored("CSid", 11, "sprites.csd", csid,
             {{"SPRITE.SHP", 69, 20}, {"PALETTE.PAL", 89, 10}, {"ICONS.ICN", 99, 15}}),
      Stored("xcr File 1.00", 73, "data.xcr", xcr,
             {{"gfx\\menu.pcx", 1092, 30}, {"sfx\\" + kName256.substr(4), 1122, 12}}),
      Stored("27-byte records", 87, "objects.res", records27,
             {{"LONGNAME0.DAT", 83, 10}, {"TREE.SPR", 93, 20}, {"ROCK.SPR", 113, 13}}),
      Stored("BIGF", 97, "sounds.big", bigf,
             {{"snd\\hit.wav", 84, 50}, {"snd\\miss.wav", 134, 30}}),
      Stored("136-byte records", 118, "stage.res", records136,
             {{"first.txt", 276, 9}, {kName38, 285, 17}}),
      Stored("size-prefixed 52-byte names", 122, "pack.res", sizes,
             {{"a.txt", 176, 5}, {"bb.txt", 184, 8}, {"c", 192, 1}}),
  };
}

TEST(TableReaders, AnEmptyGridDirectoryIsNotRead) {
  // The directory would begin at 2048, far past the end of this file.
  auto o = OpenBytesAs(42, ArchiveBuilder().u32(0x51890ACE).u32(3).u32(0).padTo(104).get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_TRUE(o->listing().empty());
}

TEST(TableReaders, DirectoriesThatCannotLieInsideTheFileAreRefused) {
  ArchiveBuilder dorba, bigf, sizes;
  dorba.text("DorbaMistfel").u32(2).name("a", 12).u32(0xFFFFFFF0).name("b", 12).u32(1);
  bigf.text("BIGF").u32(1).u32(0xFFFFFFF0).u32(64).fill(20).name("a", 16).u32(1).u32(0x20);
  sizes.u32(0).u32(2).u32(0xFFFFFFF0).name("a", 52).u32(1).name("b", 52);
  ExpectRefused({
      {"16 directory bytes from 8 before the end", 6,
       ArchiveBuilder().text("IWAD").u32(1).u32(96).padTo(104).get()},
      {"0x10000001 records of 16 bytes: 16 bytes in 32 bits", 34,
       ArchiveBuilder().text("PWAD").u32(0x10000001).u32(12).padTo(104).get()},
      {"a directory at 2048 in 104 bytes", 42,
       ArchiveBuilder().u32(0x51890ACE).u32(3).u32(1).padTo(104).get()},
      {"data back to back past 4 GiB", 24, dorba.padTo(104).get()},
      {"six records of 21 bytes from 6 in 104", 11,
       ArchiveBuilder().text("CSid").u16(6).padTo(104).get()},
      {"offsets rebased past 4 GiB", 97, bigf.padTo(104).get()},
      {"sizes laid out past 4 GiB", 122, sizes.get()},
  });
}

}  // namespace
}  // namespace cairn::test
