// Block streams (127 to 129), numbered offset tables (94, 95), tagged chunks (92, 111, 112).
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

Sample Stream(std::string file, FormatId id, B b, std::vector<std::tuple<int, int, Bytes>> blocks) {
  std::vector<std::pair<Listed, Bytes>> entries;
  for (const auto& [type, pad, d] : blocks) {
    const Bytes z = type == 1 ? Compress(d) : d;
    const auto n = uint32_t(d.size()), zn = uint32_t(z.size());
    b.u8(type).fill(pad).u32(type == 1 ? zn : n + 4).bytes(type == 1 ? B().u32(n).get() : Bytes());
    const std::string name = file + ".00000" + char('0' + entries.size());
    entries.push_back({{name, uint32_t(b.size()), n, zn, 0, uint8_t(type == 1)}, d});
    b.bytes(z);
  }
  return Entries({file, id, file, b.fill(8).get()}, entries);
}

// Chunks (offset, size, name, flag) of the row; a flag adds the TGA copy of
// the 2 x 1 picture, written `w` wide with descriptor `d` (`w` 0: no copies).
using Chunk = std::tuple<uint32_t, uint32_t, std::string, int>;
Sample Chunks(Sample s, const std::vector<Chunk>& chunks, uint16_t w, uint8_t d = 0x21) {
  for (const auto& [at, size, name, flag] : chunks) {
    s = Row(s, {{name, at, Slice(s.bytes, at, size)}});
    if (flag == 0 || w == 0) continue;
    const Bytes p =
        flag == 1 ? Bytes{3, 2, 1, 4, 7, 6, 5, 8} : Bytes{70, 60, 50, 80, 30, 20, 10, 40};
    const Listed tga = {"_TO_TGA_\\" + name + ".tga", at, 26, 0, 2 | 1 << 16, uint8_t(flag)};
    s = Entries(s, {{tga, B().u16(0).u8(2).fill(9).u16(w).u16(3 - w).u8(32).u8(d).bytes(p).get()}});
  }
  return s;
}

CAIRN_SAMPLES(BlockStreamSamples) {
  const Bytes a = Pattern(90, 1), b = Pattern(40, 2), c = Pattern(60, 3);
  B t;
  t.u32(24).u16(5).u16(3000).u32(28).u32(0).u32(107).u32(70).u32(28).u32(1 << 29).fill(38, 8);
  t.u32(7).fill(36, 9);
  Sample t24 = Row({"offset table", 94, "t.dat", t.get()}, {{"t.dat.000000", 33, Bytes(37, 8)},
                                                            {"t.dat.000001", 74, Bytes(33, 9)},
                                                            {"t.dat.000002", 107, Bytes(3, 9)}});
  Sample t25 = t24;
  t25.id = 95, t25.label = "offset table 25", t25.bytes = With(t24, 0, 25);
  const Bytes pixels = {1, 2, 3, 4, 5, 6, 7, 8};
  const Bytes indexed = B().u16(1).u32(2).bytes({10, 20, 30, 40, 50, 60, 70, 80}).get();
  B k;
  k.text("TGL").u32(0).u8(0).u32(124).u32(3).text("ABGR").u32(41).fill(4).u32(2 | 1 << 16);
  k.fill(17).bytes(pixels).text("NLAP").u32(0x30000000 | 47).fill(4).u32(2 | 1 << 16).fill(17);
  const Bytes tgl = k.bytes(indexed).text("DAEH").u32(20).fill(12, 5).get();
  const Bytes kps = B().text("KPS").u32(0).u8(0).u32(116).bytes(Slice(tgl, 12, 112)).get();
  B n;
  n.u32(40).u32(8232).u32(3).u32(4).padTo(168).u32(180).u32(284).u32(0).u32(104).text("ABGR");
  n.fill(8).u32(1 | 2 << 16).fill(16).text("hero").fill(5).bytes(pixels).padTo(284).u32(104);
  n.text("NLAP").fill(8).u32(1 | 2 << 16).fill(16).text("pal").fill(5).bytes(indexed).padTo(388);
  const std::vector<Chunk> tagged = {{16, 41, "pics.000000.RGBA", 1},
                                     {57, 47, "pics.000001.PALN", 2},
                                     {104, 20, "pics.000002.HEAD", 0}};
  return {
      Stream("level1.frame", 127, B().fill(8, 0xAA), {{1, 1, a}, {1, 0, b}, {0, 0, c}}),
      Stream("intro.sequence", 128, B().u32(1).u32(2).u32(3), {{1, 0, a}, {1, 1, b}, {7, 0, c}}),
      Stream("outro.sequence", 129, B(), {{0, 0, {}}, {2, 0, c}, {1, 0, a}, {1, 1, b}}),
      t24,
      t25,
      Chunks({"TGL chunks", 111, "pics", tgl}, tagged, 1, 0),
      Chunks({"KPS chunks", 112, "pics", kps}, tagged, 0),
      Chunks({"chunks through a table", 92, "art.bin", n.get()},
             {{180, 104, "hero.RGBA", 1}, {284, 104, "pal.PALN", 2}}, 2),
  };
}

TEST(BlockStreams, RefusesWalksThatCannotMove) {
  const SampleTable rows = BlockStreamSamples();
  ExpectRefused({
      {"chunk shorter than its header", 111, With(rows[5], 20, 0x10000000)},
  });
}

}  // namespace
}  // namespace cairn::test
