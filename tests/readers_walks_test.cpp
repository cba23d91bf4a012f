// Samples and refusals of the chunk, section and tree walks: "TR4", "SNOK",
// "PALETTEFILES ", "TEX", "_ARCHIVE", "RezMgr" and the item-stream tree.
#include <gtest/gtest.h>

#include <array>

#include "media/media.h"
#include "samples.h"

namespace cairn::test {
namespace {

ArchiveBuilder& Z(ArchiveBuilder& w, std::initializer_list<std::string_view> texts) {
  for (std::string_view t : texts) w.text(t).u8(0);
  return w;
}

Bytes Snok(uint32_t count, const Bytes& data, const Bytes& records) {
  ArchiveBuilder w;
  w.text("SNOK_DATAFILE_KEEP_OUT!\x1A").padTo(264).u32(count).u32(0).u32(0).bytes(data);
  return w.patch32(272, uint32_t(w.size())).bytes(Compress(records)).get();
}

CAIRN_SAMPLES(SectionSamples) {
  Sample tr4{"TR4", 39, "level.tr4"};
  ArchiveBuilder w;
  w.text("TR4").fill(7);
  const uint32_t sizes[] = {1024, 512, 2048};
  const uint8_t flags[] = {3, 4, 2}, bits[] = {32, 16, 32};
  for (uint32_t i = 0; i < 3; ++i) {
    const Bytes p = Pattern(sizes[i], uint8_t(i)), z = Compress(p);
    const uint32_t at = w.size() + 8, zs = z.size(), n = sizes[i], e = 256 | (i / 2 + 1) << 16;
    const std::string name = "level.tr4.00000" + std::to_string(i) + (i == 1 ? ".TEX16" : ".TEX32");
    tr4.listing.push_back({"_TO_TGA_\\" + name + ".tga", at, n + 18, zs, e, flags[i]});
    tr4.listing.push_back({name, at, n, zs, 0, 1});
    tr4.data.insert(tr4.data.end(), {Cat({TgaHeader(e, bits[i], 0x20), p}), p});
    w.u32(n).u32(zs).bytes(z);
  }
  const uint32_t o = w.size() + 8;
  tr4.bytes = w.u32(5).u32(5).bytes(Pattern(5)).u32(~0u).u32(0).u32(60).bytes(Pattern(60)).get();
  tr4 = Row(tr4, {{"level.tr4.000003", o, Pattern(5)}, {"level.tr4.000004", o + 17, Pattern(60)}});
  const Bytes a = Pattern(300, 6), za = Compress(a), zb = Compress(Text("hi"));
  const uint32_t zas = uint32_t(za.size()), zbs = uint32_t(zb.size());
  ArchiveBuilder dir;
  dir.name("maps/one.dat", 1024).u32(300).u32(zas).fill(8).name("readme.txt", 1024).u32(2).u32(zbs);
  Sample snok{"SNOK", 46, "game.dat", Snok(2, Cat({za, zb}), dir.fill(8).get())};
  snok.listing = {{"maps\\one.dat", 276, 300, zas, 0, 0}, {"readme.txt", 276 + zas, 2, zbs, 0, 0}};
  snok.data = {a, Text("hi")};
  const Bytes b = Pattern(8, 1), c = Pattern(4, 2), d = Pattern(60, 3);
  ArchiveBuilder pal;
  Z(Z(Z(pal, {"PALETTEFILES 2", "sky.pal"}).u32(8).bytes(b), {"sea.pal"}).u32(4).bytes(c),
    {"EMPTY 0", "SOUNDS 2", "boom.wav", "hiss.wav", "TEXTURES  1", "wall/brick"});
  Z(pal.u32(60).bytes(d), {"MATERIALS_X 1", "stone"});
  const Bytes p = Pattern(24, 4), q = Pattern(8, 5), r = Pattern(16, 6);
  ArchiveBuilder tex1, tex2;
  tex1.text("TEX").u8(0).u32(1).u32(0x80u << 24).u32(3).fill(8).u32(0x08000000).fill(12);
  tex1.u32(0x080026).u32(0).u32(2).u32(3).fill(4).bytes(p).fill(8 + 5464);
  tex1.u32(0x0A0000).u32(0).u32(1).u32(2).fill(12).bytes(q).fill(8);
  tex2.text("TEX").u8(0).u32(2).u32(0).u32(0).u32(4).u32(1).bytes(r).fill(80);
  const auto tga = [](uint32_t e, const Bytes& px) { return Cat({TgaHeader(e, 32, 0x20), px}); };
  Sample list = Row({"TEX counted", 71, "wall.tex", tex1.get()}, {{"wall.tex.000000.tga", 32, {}}});
  list.listing.push_back({"wall.tex.000001.tga", 60, 42, 24, 2 | 3 << 16, 0x20});
  list.listing.push_back({"wall.tex.000002.tga", 5584, 26, 8, 1 | 2 << 16, 0x20});
  list.data.insert(list.data.end(), {tga(2 | 3 << 16, p), tga(1 | 2 << 16, q)});
  Sample one{"TEX single", 72, "one.tex", tex2.get()};
  one.listing = {{"one.tex.000000.tga", 24, 34, 16, 4 | 1 << 16, 0x20}};
  one.data = {tga(4 | 1 << 16, r)};
  const Sample sections =
      Row({"PALETTEFILES", 49, "game.pal", pal.get()}, {{"PALETTEFILES\\sky.pal", 27, b},
                                                        {"PALETTEFILES\\sea.pal", 47, c},
                                                        {"SOUNDS\\boom.wav", 77, {}},
                                                        {"SOUNDS\\hiss.wav", 86, {}},
                                                        {"TEXTURES\\wall\\brick", 113, d},
                                                        {"MATERIALS_X\\stone", 193, {}}});
  return {tr4, snok, sections, list, one};
}

// "_ARCHIVE" of folder records (name, child folders [a, b), files [g, h)) over
// two files: "a.bin" (10 bytes) and "b.z" (200 bytes compressed to `zs`).
Bytes Tables(const std::vector<std::array<uint16_t, 5>>& folders, const Bytes& data, uint32_t zs) {
  ArchiveBuilder w;
  const uint32_t files = 204 + 12 * uint32_t(folders.size()), names = files + 40;
  w.text("_ARCHIVE").padTo(176).u32(names + 26).fill(6).u32(24).u16(uint16_t(folders.size()));
  w.u32(files - 180).u16(2).u32(names - 180).fill(2);
  for (const auto& f : folders) w.u32(f[0]).u16(f[1]).u16(f[2]).u16(f[3]).u16(f[4]);
  w.u32(16).fill(4).u32(0).u32(10).u32(10).u32(22).fill(4).u32(10).u32(zs).u32(200);
  return w.text(std::string("data\0maps\0empty\0a.bin\0b.z\0", 26)).bytes(data).get();
}

ArchiveBuilder& Item(ArchiveBuilder& w, std::string_view name, bool folder, uint32_t children,
                     uint32_t at = 0, uint32_t size = 0) {
  w.u8(folder ? 1 : 7).u32(0).u32(uint32_t(name.size())).text(name).u32(children);
  return folder ? w : w.u32(at ^ 0x6D2E91C4).u32(size ^ 0x47B20E5A).u32(0);
}

const std::string kMudge = "MUDGE4.008/27/2000Copyright by Witan Entertainment B.V.";

CAIRN_SAMPLES(NestedTreeSamples) {
  // "data" holds "maps" and "empty", whose empty folder range hides its files;
  // the last folder is never a child.
  const Bytes a = Pattern(10, 1), z = Compress(Pattern(200, 2));
  const uint32_t zs = uint32_t(z.size());
  Sample tables{"_ARCHIVE", 53, "game.arc",
                Tables({{0, 1, 3, 0, 0}, {5, 9, 0, 0, 2}, {10, 2, 2, 1, 2}, {}}, Cat({a, z}), zs)};
  tables.listing = {{"data\\maps\\a.bin", 318, 10, 10, 0, 0},
                    {"data\\maps\\b.z", 328, 200, zs, 0, 1}};
  tables.data = {a, Pattern(200, 2)};
  const Bytes b = Pattern(12, 4), c = Pattern(7, 5), d = Pattern(5, 6);
  ArchiveBuilder rez;
  rez.text("\r\nRezMgr").padTo(131).u32(163).u32(91).bytes(b).bytes(c).bytes(d);
  rez.u32(0).u32(139).u32(12).fill(8).text("TXT").fill(5).text("readme").fill(2);
  rez.u32(1).u32(254).u32(34).fill(4).text("maps").u8(0);
  rez.u32(0).u32(158).u32(5).fill(11).text("Q").fill(4).text("note").fill(2);
  const Bytes r = rez.u32(0).u32(151).u32(7).fill(8).text("GMI").fill(5).text("e1m1").fill(2).get();
  Bytes masked = Cat({a, b, c});
  for (uint8_t& v : masked) v ^= 0xD3;
  ArchiveBuilder mudge;
  mudge.text(kMudge).u8(0).padTo(60).u32(93).bytes(masked);
  Item(Item(Item(mudge, "", true, 3), "top.txt", false, 0, 64, 10), "sub", true, 2);
  Item(Item(Item(mudge, "in.bin", false, 0, 74, 12), "", true, 1), "deep.dat", false, 0, 86, 7);
  Sample items =
      Row({"item tree", 58, "game.mdg", Item(mudge, "last", false, 0, 60, 0).get()},
          {{"top.txt", 64, a}, {"sub\\in.bin", 74, b}, {"sub\\deep.dat", 86, c}, {"last", 60, {}}});
  for (Listed& l : items.listing) l.flag = 0xD3;
  return {tables,
          Row({"RezMgr", 54, "game.rez", r}, {{"_description_", 0, Slice(r, 0, 127)},
                                              {"readme.TXT", 139, b},
                                              {"maps\\e1m1.IMG", 151, c},
                                              {"noteQ", 158, d}}),
          items};
}

TEST(Walks, RefusesWhatTheWalksCannotHold) {
  const Bytes record = ArchiveBuilder().name("a", 1024).u32(1).u32(1).fill(8).get();
  const SampleTable rows = SectionSamples();
  ArchiveBuilder deep;
  deep.text(kMudge).u8(0).padTo(60).u32(64);
  for (int k = 0; k < 64; ++k) Item(deep, "", true, 1);
  ExpectRefused({
      {"SNOK directory of more records", 46, Snok(1, Pattern(80), Cat({record, record}))},
      {"TEX header past the end", 71, With(rows[3], 12, 4)},
      {"TEX too wide", 72, With(rows[4], 16, 1 << 16)},
      {"_ARCHIVE folder inside itself", 53, Tables({{0, 0, 1, 0, 0}, {}}, Pattern(30), 10)},
      {"RezMgr block leading back to the root", 54, With(NestedTreeSamples()[1], 203, 163)},
      {"tree folders 64 deep", 58, Item(deep, "f", false, 0).get()},
  });
}

}  // namespace
}  // namespace cairn::test
