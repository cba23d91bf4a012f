// Readers of items chained one after another.
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

CAIRN_SAMPLES(ChainedItemSamples) {
  const Bytes a = Pattern(20, 3), b = Pattern(300, 9), c = Pattern(9, 40), pic = Pattern(1298, 7);
  // The last item is shorter than the 256 bytes its name may take.
  ArchiveBuilder paq;
  paq.text("paq").u8(0).text("readme.txt").u8(0).u32(20).bytes(a);
  paq.text("dir/sub.bin").u8(0).u32(300).bytes(b).text("last").u8(0).u32(9).bytes(c);
  ArchiveBuilder vxbg;
  vxbg.text("VXBG").u32(38).text("a.txt").u8(0).u32(20).text("b/c.dat").u8(0).u32(300);
  vxbg.text("empty").u8(0).u32(0).text("d").u8(0).u32(9).bytes(a).bytes(b).bytes(c);
  ArchiveBuilder mna;
  mna.text("MNA").fill(13).u32(1).u32(40 | 0xFF << 24).fill(16).bytes(Pattern(16, 1));
  mna.u32(2).u32(30).fill(16).bytes(Pattern(6, 2)).u32(3).u32(50).fill(16).bytes(Pattern(26, 3));
  const Bytes m = mna.get();
  ArchiveBuilder xfg;
  xfg.text("1XFG").text("LBTC").u32(9).bytes(c).u32(0xDEADBEEF).text("EGMI").u32(1298).bytes(pic);
  xfg.text("TXET").u32(20).bytes(a);
  ArchiveBuilder tga;  // of one row: the chunk holds 18 bytes more than its pixels
  tga.u8(0).u8(0).u8(2).fill(9).u16(640).u16(1).u8(16).u8(0x20).bytes(Slice(pic, 0, 1280));
  Sample chunks = Row({"1XFG", 40, "level.xfg", xfg.get()}, {{"CTBL", 12, c},
                                                             {"IMGE", 33, pic},
                                                             {"_TO_TGA_\\IMGE.tga", 33, tga.get()},
                                                             {"TEXT", 1339, a}});
  chunks.listing[2].extra = 640 | 1 << 16;
  chunks.listing[2].flag = 1;
  ArchiveBuilder actors;
  actors.name("ACTRHEAD", 8).fill(16, 0xEE).u32(3).u32(4).bytes(Pattern(12, 1));
  actors.name("ITEM0001", 8).fill(16, 0xEE).u32(10).u32(7).bytes(Pattern(70, 2));
  const Bytes act = actors.name("ITEM0002", 8).fill(16, 0xEE).u32(0).u32(5).get();
  return {
      Row({"paq", 8, "sample.paq", paq.get()},
          {{"readme.txt", 19, a}, {"dir\\sub.bin", 55, b}, {"last", 364, c}}),
      Row({"VXBG", 27, "sample.vxb", vxbg.get()},
          {{"a.txt", 46, a}, {"b\\c.dat", 66, b}, {"empty", 366, {}}, {"d", 366, c}}),
      Row({"MNA", 28, "pack.mna", m}, {{"pack.mna.000000", 16, Slice(m, 16, 40)},
                                       {"pack.mna.000001", 56, Slice(m, 56, 30)},
                                       {"pack.mna.000002", 86, Slice(m, 86, 50)}}),
      chunks,
      Row({"ACTRHEAD", 45, "actors.act", act}, {{"actors.act.000000", 0, Slice(act, 0, 44)},
                                                {"actors.act.000001", 44, Slice(act, 44, 102)},
                                                {"actors.act.000002", 146, Slice(act, 146, 32)}}),
  };
}

TEST(ChainedItems, RefusesBrokenItems) {
  const SampleTable rows = ChainedItemSamples();
  const auto vxbg = [](uint32_t n) {
    ArchiveBuilder w;
    return w.text("VXBG").u32(n + 5).text(std::string(n, 'n')).u8(0).u32(4).fill(4).get();
  };
  ExpectLists(27, vxbg(259), {{std::string(259, 'n'), 272, 4, 4, 0, 0}});
  ExpectRefused({
      {"VXBG name of 260", 27, vxbg(260)},
      {"VXBG entries beyond 4 GiB", 27, With(rows[1], 14, 0xFFFFFFF0)},
  });
}

}  // namespace
}  // namespace cairn::test
