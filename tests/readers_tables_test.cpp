// Directories of fixed-size records, and texture archives that list a TGA
// copy after each picture lump.
#include <gtest/gtest.h>

#include <algorithm>
#include <string>

#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

struct At {
  std::string name;
  uint32_t offset, size;
};

using Record = void (*)(B& b, const std::string& name, const At& e);

// `head`, a record per entry, then data up to the end of the last entry.
Sample Table(std::string label, FormatId id, std::string fileName, B head,
             const std::vector<At>& entries, Record record) {
  Sample s{std::move(label), id, std::move(fileName), {}, {}, {}};
  uint32_t end = 0;
  for (const At& e : entries) {
    std::string name = e.name;
    std::replace(name.begin(), name.end(), '\\', '/');
    record(head, name, e);
    end = std::max(end, e.offset + e.size);
    s.listing.push_back({e.name, e.offset, e.size, e.size, 0, 0});
  }
  if (end > head.size()) head.bytes(Pattern(end - head.size(), static_cast<uint8_t>(id)));
  s.bytes = head.get();
  for (const At& e : entries) s.data.push_back(Slice(s.bytes, e.offset, e.size));
  return s;
}

const std::vector<At> kLumps = {
    {"S_START", 0, 0}, {"E1M1", 76, 40}, {"THINGS", 116, 30}, {"PLAYPAL8", 146, 50}};
void Lump(B& b, const std::string& name, const At& e) {
  b.u32(e.offset).u32(e.size).name(name, 8);
}

Bytes GreyTga(uint16_t width, uint16_t height, uint8_t descriptor, const Bytes& greys) {
  B w;
  w.fill(2).u8(2).fill(9).u16(width).u16(height).u8(24).u8(descriptor);
  for (uint8_t g : greys) w.fill(3, g);
  return w.get();
}

void WadRecord(B& w, uint32_t offset, uint32_t size, std::string_view name) {
  w.u32(offset).u32(size).u32(size).u32(0x44).name(name, 16);
}

// The built-in palettes begin with greys 00 0F 1F 2F 3F 4B 5B 6B 7B 8B 9B AB BB CB DB EB.
Sample Wad2() {
  const Bytes picture = B().u32(4).u32(2).bytes({0, 1, 2, 3, 15, 14, 13, 12}).get();
  B w;
  w.text("WAD2").u32(3).u32(36).bytes(picture).fill(8);
  WadRecord(w, 12, 16, "PICTURE");
  WadRecord(w, 28, 8, "0123456789abcdef");  // fills the field
  WadRecord(w, 128, 4, "tail");
  return Entries({"WAD2", 4, "gfx.wad", w.get()},
                 {{{"PICTURE", 12, 16, 16, 0, 0}, picture},
                  {{"_TO_TGA_\\PICTURE.tga", 12, 4 * 2 * 3 + 18, 16, 4 | 2 << 16, 1},
                   GreyTga(4, 2, 0x21, {0x00, 0x0F, 0x1F, 0x2F, 0xEB, 0xDB, 0xCB, 0xBB})},
                  {{"0123456789abcdef", 28, 8, 8, 0, 0}, Bytes(8)},
                  {{"_TO_TGA_\\0123456789abcdef.tga", 28, 18, 8, 0, 1}, GreyTga(0, 0, 0x21, {})},
                  {{"tail", 128, 4, 4, 0, 0}, Bytes(4)}});
}

// The mip texture's first words pass the plain-picture test as well.
Sample Wad3() {
  B tail = B().u16(256);
  for (int i = 255; i >= 0; --i) tail.fill(3, static_cast<uint8_t>(i));
  B mip, plain, w;
  mip.u32(1).u32(36).fill(8).u32(2).u32(2).u32(40).u32(44).fill(8).bytes({5, 6, 7, 200});
  mip.bytes(tail.get()).u16(0);                                        // 816 bytes
  plain.u32(2).u32(2).bytes({5, 6, 7, 200}).bytes(tail.get()).u16(0);  // 784 bytes
  w.text("WAD3").u32(2).u32(12 + 816 + 784).bytes(mip.get()).bytes(plain.get());
  WadRecord(w, 12, 816, "brick");
  WadRecord(w, 828, 784, "conchars");
  const Bytes tga = GreyTga(2, 2, 0x20, {250, 249, 248, 55});
  return Entries({"WAD3", 5, "halflife.wad", w.get()},
                 {{{"brick", 12, 816, 816, 0, 0}, mip.get()},
                  {{"_TO_TGA_\\brick.tga", 12, 2 * 2 * 3 + 18, 816, 2 | 2 << 16, 1}, tga},
                  {{"conchars", 828, 784, 784, 0, 0}, plain.get()},
                  {{"_TO_TGA_\\conchars.tga", 828, 2 * 2 * 3 + 18, 784, 2 | 2 << 16, 2}, tga}});
}

Sample Pack() {
  const Bytes first = B().u32(3).u32(2).bytes({1, 2, 3, 4, 5, 6}).get();
  B second, w;
  second.name("second", 32).u32(2).u32(4).u32(100).u32(108).padTo(100);
  second.bytes({9, 8, 7, 6, 5, 4, 3, 2});  // 108 bytes
  const std::string full(56, 'p');
  w.text("PACK").u32(134).u32(2 * 64 + 40).bytes(first).bytes(second.get());
  w.name("gfx/first.lmp", 56).u32(12).u32(14).name(full, 56).u32(26).u32(108).fill(40, 0x13);
  Sample s = Entries({"PACK directory", 70, "pak0.pak", w.get()},
                     {{{"gfx\\first.lmp", 12, 14, 14, 0, 0}, first},
                      {{"_TO_TGA_\\gfx\\first.lmp.tga", 12, 3 * 2 * 3 + 18, 14, 3 | 2 << 16, 1},
                       GreyTga(3, 2, 0x21, {0x0F, 0x1F, 0x2F, 0x3F, 0x4B, 0x5B})},
                      {{full, 26, 108, 108, 0, 0}, second.get()},
                      {{"_TO_TGA_\\" + full + ".tga", 26, 2 * 4 * 3 + 18, 108, 2 | 4 << 16, 2},
                       GreyTga(2, 4, 0x21, {0x8B, 0x7B, 0x6B, 0x5B, 0x4B, 0x3F, 0x2F, 0x1F})}});
  s.recognised = false;
  return s;
}

const std::string kName38 = std::string(34, 'y') + ".txt", kName80 = std::string(76, 'x') + ".dat";
const std::string kName256 = "sfx\\" + std::string(248, 'z') + ".wav";

CAIRN_SAMPLES(TableSamples) {
  const B grid = B().u32(0x51890ACE).u32(3).u32(3).padTo(2048);
  const Bytes intro = Text("The castle gate opens at dawn. The castle gate closes at dusk.\n");
  const Bytes map = Pattern(300, 27), introZ = Compress(intro), mapZ = Compress(map);
  const auto introSize = static_cast<uint32_t>(introZ.size());
  const auto mapSize = static_cast<uint32_t>(mapZ.size());
  B lod;
  lod.text("LOD").u8(0).u32(0).u32(2).padTo(92).name("intro.txt", 16).u32(156).u32(63);
  lod.u32(0xDEADBEEF).u32(introSize).name("map.dat", 16).u32(156 + introSize).u32(300);
  lod.u32(0xDEADBEEF).u32(mapSize).bytes(introZ).bytes(mapZ);
  return {
      Table("IWAD", 6, "doom.wad", B().text("IWAD").u32(4).u32(12), kLumps, Lump),
      Table("PWAD", 34, "mymap.wad", B().text("PWAD").u32(4).u32(12), kLumps, Lump),
      Table("GLB2.0", 15, "game.glb", B().text("GLB2.0").u16(0).u32(2).u32(0),
            {{"intro.pcx", 72, 60}, {"level1.map", 132, 25}},
            [](B& b, auto& n, auto& e) { b.u32(e.offset).u32(e.size).name(n, 20); }),
      Table("FASTF101", 17, "race.ff", B().text("FASTF101").fill(16).u32(2),
            {{"CAR.SHP", 76, 33}, {"TRACKS01.DAT", 109, 20}},  // fills its field
            [](B& b, auto& n, auto& e) { b.name(n, 12).u32(e.offset).u32(e.size).u32(~0u); }),
      Table("SBF0, sizes run to the next entry", 22, "sounds.sbf",
            B().text("SBF0").fill(12).u32(24).u32(3),  // the directory's offset, the count
            {{"menu.wav", 120, 10}, {"click.wav", 130, 20}, {"theme.ogg", 150, 15}},
            [](B& b, auto& n, auto& e) { b.name(n, 16).u32(e.offset).fill(12, 0xAB); }),
      Table("DorbaMistfel, data back to back", 24, "group.grp", B().text("DorbaMistfel").u32(3),
            {{"sky.tga", 64, 30}, {"empty.txt", 94, 0}, {"font.fnt", 94, 25}},
            [](B& b, auto& n, auto& e) { b.name(n, 12).u32(e.size); }),
      Table("signature row 42, 2048-byte grid", 42, "movies.dat", grid,
            {{"a.smk", 4096, 100}, {"b.dat", 6144, 3000}, {"c.txt", 10240, 10}},
            [](B& b, auto& n, auto& e) { b.name(n, 23).u8(0).u32(0x44332211).u32(e.size); }),
      Table("zero bytes in a 40-byte name stand for dots", 85, "files.res", B().u32(3),
            {{"README.TXT", 148, 20}, {"A..TXT", 168, 15}, {"MUSIC.MID", 183, 30}},
            [](B& b, auto& n, auto& e) {
              std::string dotless = n;
              std::replace(dotless.begin(), dotless.end(), '.', '\0');
              b.name(dotless, 40).u32(e.offset).u32(e.size);
            }),
      Table("40-byte names without sizes", 86, "screens.res", B().u32(3),
            {{"title.pcx", 136, 12}, {"font.pcx", 148, 34}, {"intro.txt", 182, 20}},
            [](B& b, auto& n, auto& e) { b.name(n, 40).u32(e.offset); }),
      Table("80-byte names", 89, "level.res", B().u32(2),
            {{"textures\\wall.bmp", 180, 20}, {kName80, 200, 10}},
            [](B& b, auto& n, auto& e) { b.name(n, 80).u32(e.offset).u32(e.size); }),
      Table("80-byte names in padded records", 114, "world.rss", B().u32(2),
            {{"maps\\town.map", 188, 16}, {"maps\\cave.map", 204, 8}},
            [](B& b, auto& n, auto& e) { b.name(n, 80).u32(e.offset).u32(e.size).u32(~0u); }),
      Table("14-byte names", 105, "tiles.res", B().u16(4),
            {{"GRASS.BMP", 90, 10}, {"STONE.BMP", 100, 20}, {"MUD", 120, 5}, {"SAND", 125, 15}},
            [](B& b, auto& n, auto& e) { b.name(n, 14).u32(e.size).u32(e.offset - 2); }),
      Entries({"LOD, zlib entries", 10, "h3bitmap.lod", lod.get()},
              {{{"intro.txt", 156, 63, introSize, 0, 0}, intro},
               {{"map.dat", 156 + introSize, 300, mapSize, 0, 0}, map}}),
      Table("CSid", 11, "sprites.csd", B().text("CSid").u16(3),
            {{"SPRITE.SHP", 69, 20}, {"PALETTE.PAL", 89, 10}, {"ICONS.ICN", 99, 15}},
            [](B& b, auto& n, auto& e) { b.u8(0x99).name(n, 12).u32(e.size).u32(e.offset); }),
      Table("xcr File 1.00", 73, "data.xcr", B().text("xcr File 1.00").fill(3).u32(0).u32(2).u32(0),
            {{"gfx\\menu.pcx", 1092, 30}, {kName256, 1122, 12}},  // fills its field
            [](B& b, auto& n, auto& e) {
              b.name(n, 256).fill(256, 0x55).u32(e.offset).u32(e.size).fill(12, 0x77);
            }),
      Table("27-byte records", 87, "objects.res", B().u16(3),
            {{"LONGNAME0.DAT", 83, 10}, {"TREE.SPR", 93, 20}, {"ROCK.SPR", 113, 13}},
            [](B& b, auto& n, auto& e) {
              b.u16(5).u32(e.size).u32(e.size).name(n, 13).u32(e.offset);
            }),
      Table("BIGF", 97, "sounds.big", B().text("BIGF").u32(2).u32(84).u32(64).fill(20),
            {{"snd\\hit.wav", 84, 50}, {"snd\\miss.wav", 134, 30}},
            [](B& b, auto& n, auto& e) { b.name(n, 16).u32(e.size).u32(e.offset - 84); }),
      Table("136-byte records", 118, "stage.res", B().u32(2),
            {{"first.txt", 276, 9}, {kName38, 285, 17}},
            [](B& b, auto& n, auto& e) { b.name(n, 38).fill(90).u32(e.offset).u32(e.size); }),
      Table("size-prefixed 52-byte names", 122, "pack.res", B().u32(193).u32(3),
            {{"a.txt", 176, 5}, {"bb.txt", 184, 8}, {"c", 192, 1}},
            [](B& b, auto& n, auto& e) { b.u32(e.size).name(n, 52); }),
      Wad2(),
      Wad3(),
      Pack(),
  };
}

TEST(TableReaders, DirectoriesThatCannotLieInsideTheFileAreRefused) {
  B bigf;
  bigf.text("BIGF").u32(1).u32(0xFFFFFFF0).u32(64).fill(20).name("a", 16).u32(1).u32(0x20);
  ExpectRefused({
      {"16 * 0x10000001 wraps", 34, B().text("PWAD").u32(0x10000001).u32(12).padTo(104).get()},
      {"offsets rebased past 4 GiB", 97, bigf.padTo(104).get()},
  });
}

}  // namespace
}  // namespace cairn::test
