// The chained-item readers: "paq" (8), "VXBG" (27), "MNA" (28), "1XFG" (40)
// and "ACTRHEAD" (45).

#include <gtest/gtest.h>

#include "fixture_replay.h"
#include "formats/registry.h"

namespace cairn::test {
namespace {

using Listing = std::vector<Listed>;

// A "paq" item: zero-terminated name, 32-bit size, data.
ArchiveBuilder& PaqItem(ArchiveBuilder& b, std::string_view name, const Bytes& data) {
  return b.text(name).u8(0).u32(static_cast<uint32_t>(data.size())).bytes(data);
}

// An "MNA" item of `length` bytes: 24-byte head with the 24-bit length at 4
// and `high` in the byte after it.
Bytes MnaItem(uint32_t length, uint8_t seed, uint8_t high = 0) {
  ArchiveBuilder b;
  b.u32(0x11223344).u8(length & 0xFF).u8(length >> 8 & 0xFF).u8(length >> 16 & 0xFF).u8(high);
  b.fill(16, 0xAB).bytes(Pattern(length - 24, seed));
  return b.get();
}

// A "1XFG" chunk: the tag stored back to front, the data length, the data.
ArchiveBuilder& Chunk(ArchiveBuilder& b, std::string_view tag, const Bytes& data) {
  const std::string stored(tag.rbegin(), tag.rend());
  return b.text(stored).u32(static_cast<uint32_t>(data.size())).bytes(data);
}

// An "ACTRHEAD" item: 32-byte head with two factors of the payload length.
Bytes ActorItem(std::string_view tag, uint32_t a, uint32_t b, uint8_t seed) {
  ArchiveBuilder item;
  item.name(tag, 8).fill(16, 0xEE).u32(a).u32(b).bytes(Pattern(uint64_t{a} * b, seed));
  return item.get();
}

CAIRN_FIXTURE(PaqFixture) {
  const Bytes readme = Pattern(20, 3), sub = Pattern(300, 9), last = Pattern(9, 40);
  ArchiveBuilder b;
  b.text("paq").u8(0);
  PaqItem(b, "readme.txt", readme);
  PaqItem(b, "dir/sub.bin", sub);
  PaqItem(b, "last", last);  // 18 bytes: fewer than the 256 the name may take
  return {"paq archive", 8,  "sample.paq",
          b.get(),       {}, {{"readme.txt", readme}, {"dir\\sub.bin", sub}, {"last", last}}};
}

CAIRN_FIXTURE(LineDirectoryFixture) {
  const Bytes a = Pattern(5, 1), c = Pattern(100, 2), d = Pattern(7, 3);
  ArchiveBuilder b;
  b.text("VXBG").u32(38);
  b.text("a.txt").u8(0).u32(5).text("b/c.dat").u8(0).u32(100);
  b.text("empty").u8(0).u32(0).text("d").u8(0).u32(7);
  b.bytes(a).bytes(c).bytes(d);
  return {"VXBG archive", 27, "sample.vxb",
          b.get(),        {}, {{"a.txt", a}, {"b\\c.dat", c}, {"empty", {}}, {"d", d}}};
}

CAIRN_FIXTURE(CountedItemFixture) {
  const Bytes i0 = MnaItem(40, 1, 0xFF), i1 = MnaItem(30, 2), i2 = MnaItem(50, 3);
  ArchiveBuilder b;
  b.text("MNA").u8(0).fill(12, 0x55).bytes(i0).bytes(i1).bytes(i2);
  return {"MNA archive",
          28,
          "pack.mna",
          b.get(),
          {},
          {{"pack.mna.000000", i0}, {"pack.mna.000001", i1}, {"pack.mna.000002", i2}}};
}

// The TGA copy of a 640 x 1 picture: the chunk holds 18 bytes more than the
// pixels.
const Bytes kImage = Pattern(1298, 77);
Bytes ImageTga() {
  ArchiveBuilder tga;
  tga.u8(0).u8(0).u8(2).fill(9).u16(640).u16(1).u8(16).u8(0x20);
  tga.bytes(Slice(kImage, 0, 1280));
  return tga.get();
}

CAIRN_FIXTURE(ChunkFixture) {
  const Bytes table = Pattern(6, 5), text = Pattern(10, 6);
  ArchiveBuilder b;
  b.text("1XFG");
  Chunk(b, "CTBL", table).u32(0xDEADBEEF);  // 4 bytes not counted in the length
  Chunk(b, "IMGE", kImage);
  Chunk(b, "TEXT", text);
  return {"1XFG chunk file",
          40,
          "level.xfg",
          b.get(),
          {},
          {{"CTBL", table}, {"IMGE", kImage}, {"_TO_TGA_\\IMGE.tga", ImageTga()}, {"TEXT", text}}};
}

CAIRN_FIXTURE(SizedItemFixture) {
  const Bytes i0 = ActorItem("ACTRHEAD", 3, 4, 1), i1 = ActorItem("ITEM0001", 10, 7, 2),
              i2 = ActorItem("ITEM0002", 0, 5, 3);
  ArchiveBuilder b;
  b.bytes(i0).bytes(i1).bytes(i2);
  return {"ACTRHEAD item file",
          45,
          "actors.act",
          b.get(),
          {},
          {{"actors.act.000000", i0}, {"actors.act.000001", i1}, {"actors.act.000002", i2}}};
}

TEST(ChainedItems, PaqListsAndExtracts) {
  const Fixture f = PaqFixture();
  auto o = OpenBytesAs(8, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{"readme.txt", 19, 20, 20, 0, 0},
                                   {"dir\\sub.bin", 55, 300, 300, 0, 0},
                                   {"last", 364, 9, 9, 0, 0}}));
  ReplayFixture(f);
}

TEST(ChainedItems, PaqItemPastTheEndIsListedButNotExtracted) {
  ArchiveBuilder b;
  b.text("paq").u8(0);
  PaqItem(b, "a", Pattern(100));
  b.text("big").u8(0).u32(1000).fill(10);
  auto o = OpenBytesAs(8, b.get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{"a", 10, 100, 100, 0, 0}, {"big", 118, 1000, 1000, 0, 0}}));
  Bytes out;
  EXPECT_EQ(o->extract(1, out), kBadData);
}

TEST(ChainedItems, PaqRefusesBrokenItems) {
  ArchiveBuilder b;
  b.text("paq").u8(0);
  PaqItem(b, "a", Pattern(100));
  ArchiveBuilder stray = b;
  ExpectRefused(8, stray.fill(3).get());  // too short for a name and a size
  ExpectRefused(8, b.text("unterminated").get());
}

TEST(ChainedItems, LineDirectoryListsAndExtracts) {
  const Fixture f = LineDirectoryFixture();
  auto o = OpenBytesAs(27, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{"a.txt", 46, 5, 5, 0, 0},
                                   {"b\\c.dat", 51, 100, 100, 0, 0},
                                   {"empty", 151, 0, 0, 0, 0},
                                   {"d", 151, 7, 7, 0, 0}}));
  ReplayFixture(f);
}

TEST(ChainedItems, LineDirectoryNameLengths) {
  for (size_t length : {259u, 260u}) {
    ArchiveBuilder b;
    b.text("VXBG").u32(static_cast<uint32_t>(length) + 5).text(std::string(length, 'n')).u8(0);
    b.u32(4).fill(4);
    auto o = OpenBytesAs(27, b.get());
    if (length == 259) {
      ASSERT_EQ(o->result, kOk);
      EXPECT_EQ(o->listing(), (Listing{{std::string(259, 'n'), 272, 4, 4, 0, 0}}));
    } else {
      EXPECT_EQ(o->result, kBadData);
    }
  }
}

TEST(ChainedItems, LineDirectoryRefusesBrokenDirectories) {
  // The directory runs past the end of the file.
  ExpectRefused(27, ArchiveBuilder().text("VXBG").u32(200).fill(100).get());
  // The last line's size crosses the end of the directory.
  ExpectRefused(27, ArchiveBuilder().text("VXBG").u32(6).text("abc").u8(0).u32(1).fill(100).get());
  // The entries would lie beyond 4 GiB.
  ExpectRefused(27, ArchiveBuilder()
                        .text("VXBG")
                        .u32(12)
                        .text("a")
                        .u8(0)
                        .u32(0xFFFFFFF0)
                        .text("b")
                        .u8(0)
                        .u32(1)
                        .fill(100)
                        .get());
}

TEST(ChainedItems, CountedItemsListAndExtract) {
  const Fixture f = CountedItemFixture();
  auto o = OpenBytesAs(28, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  // The first item's length byte at 7 is 0xFF and does not count.
  EXPECT_EQ(o->listing(), (Listing{{"pack.mna.000000", 16, 40, 40, 0, 0},
                                   {"pack.mna.000001", 56, 30, 30, 0, 0},
                                   {"pack.mna.000002", 86, 50, 50, 0, 0}}));
  ReplayFixture(f);
}

TEST(ChainedItems, CountedItemsRefuseBrokenItems) {
  const Bytes start = ArchiveBuilder().text("MNA").u8(0).fill(12).bytes(MnaItem(100, 1)).get();
  // An item of no length would never end the walk; one shorter than its head
  // contradicts itself.
  for (uint32_t length : {0u, 23u}) {
    ArchiveBuilder b;
    b.bytes(start).u32(0).u32(length).fill(40);
    ExpectRefused(28, b.get());
  }
  // The last item's head is cut off by the end of the file.
  ExpectRefused(28, ArchiveBuilder().bytes(start).fill(20).get());
}

TEST(ChainedItems, ChunksListAndExtract) {
  const Fixture f = ChunkFixture();
  auto o = OpenBytesAs(40, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  // Only the "CTBL" chunk is followed by 4 extra bytes.
  EXPECT_EQ(o->listing(), (Listing{{"CTBL", 12, 6, 6, 0, 0},
                                   {"IMGE", 30, 1298, 1298, 0, 0},
                                   {"_TO_TGA_\\IMGE.tga", 30, 1298, 1298, 640 | 1 << 16, 1},
                                   {"TEXT", 1336, 10, 10, 0, 0}}));
  ReplayFixture(f);
}

TEST(ChainedItems, ChunkImageShorterThanOneRowGetsAnEmptyCopy) {
  ArchiveBuilder b;
  b.text("1XFG");
  Chunk(b, "IMGE", Pattern(1000));
  auto o = OpenBytesAs(40, b.get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{"IMGE", 12, 1000, 1000, 0, 0},
                                   {"_TO_TGA_\\IMGE.tga", 12, 18, 1000, 640, 1}}));
}

TEST(ChainedItems, ChunksRefuseACutHead) {
  ArchiveBuilder b;
  b.text("1XFG");
  Chunk(b, "DATA", Pattern(100)).text("ABCD");
  ExpectRefused(40, b.get());
}

TEST(ChainedItems, ChunkImageCopyExtractsAsTga) {
  const Fixture f = ChunkFixture();
  auto o = OpenBytesAs(40, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->extract(2), ImageTga());
}

TEST(ChainedItems, SizedItemsListAndExtract) {
  const Fixture f = SizedItemFixture();
  auto o = OpenBytesAs(45, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{"actors.act.000000", 0, 44, 44, 0, 0},
                                   {"actors.act.000001", 44, 102, 102, 0, 0},
                                   {"actors.act.000002", 146, 32, 32, 0, 0}}));
  ReplayFixture(f);
}

TEST(ChainedItems, SizedItemsRefuseBrokenItems) {
  const Bytes first = ActorItem("ACTRHEAD", 9, 9, 1);
  // The item length does not fit 32 bits (it would wrap to a step of 0).
  ArchiveBuilder huge;
  huge.bytes(first).name("ITEM", 8).fill(16).u32(0x10).u32(0x0FFFFFFE).fill(40);
  ExpectRefused(45, huge.get());
  // The last item's head is cut off by the end of the file.
  ExpectRefused(45, ArchiveBuilder().bytes(first).bytes(first).fill(31).get());
}

}  // namespace
}  // namespace cairn::test
