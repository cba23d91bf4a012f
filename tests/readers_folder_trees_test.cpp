// Folder trees, typed tables and keyed records.
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

constexpr uint32_t kFolder = 0xCDCDCD01, kEnd = 0xCDCDCDFF;

ArchiveBuilder& Record(ArchiveBuilder& w, std::string_view name, uint32_t kind, uint32_t size,
                       uint32_t at) {
  return w.name(name, 32).u32(kind).u32(size).u32(at);
}

// `levels` folders each leading to the next; the last holds the file "f".
Bytes NestedFolders(uint32_t levels) {
  ArchiveBuilder w;
  for (uint32_t k = 1; k <= levels; ++k) Record(Record(w, "d", kFolder, 0, 88 * k), "", kEnd, 0, 0);
  Record(Record(w, "f", 0, 4, 88 * levels + 88), "", kEnd, 0, 0);
  return w.fill(4, 0x42).get();
}

CAIRN_SAMPLES(FolderTreeSamples) {
  const Bytes a = Pattern(5, 1), b = Pattern(7, 2), c = Pattern(12, 3), d = Pattern(20, 4);
  ArchiveBuilder datos;
  Record(Record(datos, "DATOS.TXT", 0, 5, 440), "MAPS", kFolder, 0, 176);
  Record(Record(datos, "EMPTY", kFolder, 0, 396), "", kEnd, 0, 0);
  Record(Record(datos, "LEVEL1", kFolder, 0, 308), "readme", 0x12345678, 7, 445);
  Record(Record(Record(datos, "", kEnd, 0, 0), "map.dat", 0, 12, 452), "", kEnd, 0, 0);
  Record(datos, "", kEnd, 0, 0).bytes(a).bytes(b).bytes(c);
  ArchiveBuilder drs;
  drs.text("Copyright (c) 1997 Ensemble Studios.\x1A").fill(3).text("1.00tribe").fill(7);
  drs.u32(3).padTo(64).text(" pmb").u32(0).u32(2).text(" vaw").u32(0).u32(0);
  drs.text(std::string(" x\0a", 4)).u32(0).u32(1).u32(1).u32(136).u32(5).u32(2).u32(141).u32(7);
  drs.u32(3).u32(148).u32(12).bytes(a).bytes(b).bytes(c);
  Bytes stored = d;
  for (uint8_t& v : stored) v ^= 0x5A;
  const std::string full(64, 'L');
  ArchiveBuilder gsc;
  gsc.text("GSCfmt").fill(3).u8(0x5A).u32(3);
  gsc.u32(1).name("intro.txt", 64).u32(~257u).u32(12).u32(0).u8(0);
  gsc.u32(1).name("data/secret.bin", 64).u32(~269u).u32(20).u32(0).u8(0x80);
  gsc.u32(1).name(full, 64).u32(~0u).u32(16).u32(0).u8(0).bytes(c).bytes(stored);
  Sample keyed = Row(
      {"GSCfmt", 26, "game.gsc", gsc.get()},
      {{"intro.txt", 257, c}, {"data\\secret.bin", 269, d}, {full, 0, Slice(gsc.get(), 0, 16)}});
  keyed.listing[1].flag = 0x5A;
  return {
      Row({"DATOS", 21, "game.dat", datos.get()},
          {{"DATOS.TXT", 440, a}, {"MAPS\\LEVEL1\\map.dat", 452, c}, {"MAPS\\readme", 445, b}}),
      Row({"typed", 25, "t.drs", drs.get()},
          {{"t.drs.000000.bmp", 136, a}, {"t.drs.000001.bmp", 141, b}, {"t.drs.000000.a", 148, c}}),
      keyed,
  };
}

TEST(FolderTrees, RefusesLoopsAndCountsBeyondTheFile) {
  const SampleTable rows = FolderTreeSamples();
  std::string path = "d";
  for (int k = 1; k < 63; ++k) path += "\\d";
  ExpectLists(21, NestedFolders(63), {{path + "\\f", 88 * 64, 4, 4, 0, 0}});
  ExpectRefused({
      {"DATOS folder whose list starts with itself", 21, With(rows[0], 44 + 40, 44)},
      {"DATOS 64 levels", 21, NestedFolders(64)},
  });
}

}  // namespace
}  // namespace cairn::test
