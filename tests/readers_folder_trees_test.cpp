// The folder-tree, typed-table and keyed-record readers: "DATOS" (21), the
// typed resource archive (25) and "GSCfmt" (26).

#include <gtest/gtest.h>

#include "fixture_replay.h"

namespace cairn::test {
namespace {

using Listing = std::vector<Listed>;

constexpr uint32_t kFolder = 0xCDCDCD01;
constexpr uint32_t kEnd = 0xCDCDCDFF;

// A "DATOS" record: name of 32 bytes, kind, size, offset (or list position).
ArchiveBuilder& Record(ArchiveBuilder& b, std::string_view name, uint32_t kind, uint32_t size,
                       uint32_t offset) {
  return b.name(name, 32).u32(kind).u32(size).u32(offset);
}
ArchiveBuilder& EndRecord(ArchiveBuilder& b) {
  return Record(b, "", kEnd, 0, 0);
}

CAIRN_FIXTURE(FolderTreeFixture) {
  const Bytes text = Pattern(5, 1), readme = Pattern(7, 2), map = Pattern(12, 3);
  ArchiveBuilder b;
  Record(b, "DATOS.TXT", 0, 5, 440);  // the root list, at 0
  Record(b, "MAPS", kFolder, 0, 176);
  Record(b, "EMPTY", kFolder, 0, 396);
  EndRecord(b);
  Record(b, "LEVEL1", kFolder, 0, 308);  // MAPS, at 176
  Record(b, "readme", 0x12345678, 7, 445);
  EndRecord(b);
  Record(b, "map.dat", 0, 12, 452);  // MAPS\LEVEL1, at 308
  EndRecord(b);
  EndRecord(b);  // EMPTY, at 396
  b.bytes(text).bytes(readme).bytes(map);
  return {"DATOS folder archive",
          21,
          "game.dat",
          b.get(),
          {},
          {{"DATOS.TXT", text}, {"MAPS\\LEVEL1\\map.dat", map}, {"MAPS\\readme", readme}}};
}

// `levels` folders, each in a list of its own, named `folder`, around a list
// with the file "f".
Bytes NestedFolders(unsigned levels, std::string_view folder) {
  ArchiveBuilder b;
  for (unsigned k = 0; k < levels; ++k) {
    Record(b, k == 0 ? "DATOS" : folder, kFolder, 0, 88 * (k + 1));
    EndRecord(b);
  }
  Record(b, "f", 0, 4, 88 * (levels + 1));
  EndRecord(b);
  return b.fill(4, 0x42).get();
}

const std::string kSignature = std::string("Copyright (c) 1997 Ensemble Studios.\x1A", 37) +
                               std::string(3, '\0') + "1.00tribe" + std::string(7, '\0');

// A typed resource archive with the types given as (stored tag, count) and
// records (identifier, offset, size) from a list of sizes.
struct TypedArchive {
  std::vector<std::pair<std::string, uint32_t>> types;
  std::vector<uint32_t> sizes;
  Bytes build() const {
    ArchiveBuilder b;
    b.text(kSignature).u32(static_cast<uint32_t>(types.size())).padTo(64);
    for (const auto& [tag, count] : types) b.text(tag).u32(0x1234).u32(count);
    uint32_t offset = static_cast<uint32_t>(b.size() + 12 * sizes.size());
    for (size_t i = 0; i < sizes.size(); ++i) {
      b.u32(static_cast<uint32_t>(100 + i)).u32(offset).u32(sizes[i]);
      offset += sizes[i];
    }
    for (size_t i = 0; i < sizes.size(); ++i) b.bytes(Pattern(sizes[i], static_cast<uint8_t>(i)));
    return b.get();
  }
};

CAIRN_FIXTURE(TypedTableFixture) {
  const TypedArchive a{{{" pmb", 2}, {" vaw", 0}, {" nib", 3}}, {10, 20, 5, 0, 8}};
  std::vector<ExpectedEntry> entries;
  const char* names[] = {"ages.drs.000000.bmp", "ages.drs.000001.bmp", "ages.drs.000000.bin",
                         "ages.drs.000001.bin", "ages.drs.000002.bin"};
  for (size_t i = 0; i < 5; ++i)
    entries.push_back({names[i], Pattern(a.sizes[i], static_cast<uint8_t>(i))});
  return {"typed resource archive", 25, "ages.drs", a.build(), {}, entries};
}

// A "GSCfmt" record: 4 bytes, name of 64, inverted offset, size, 4 bytes,
// enciphered mark.
ArchiveBuilder& KeyedRecord(ArchiveBuilder& b, std::string_view name, uint32_t offset,
                            uint32_t size, uint8_t enciphered) {
  return b.u32(0xFEEDFACE).name(name, 64).u32(~offset).u32(size).u32(0).u8(enciphered);
}

const std::string kLongName(64, 'L');

CAIRN_FIXTURE(KeyedRecordFixture) {
  const Bytes intro = Pattern(12, 1), secret = Pattern(20, 2);
  Bytes stored = secret;
  for (uint8_t& v : stored) v ^= 0x5A;
  ArchiveBuilder b;
  b.text("GSCfmt").fill(3).u8(0x5A).u32(3);
  KeyedRecord(b, "intro.txt", 257, 12, 0);
  KeyedRecord(b, "data/secret.bin", 269, 20, 0x80);
  KeyedRecord(b, kLongName, 0, 16, 0);  // stored as 0xFFFFFFFF
  b.bytes(intro).bytes(stored);
  const Bytes bytes = b.get();
  return {"GSCfmt archive",
          26,
          "game.gsc",
          bytes,
          {},
          {{"intro.txt", intro}, {"data\\secret.bin", secret}, {kLongName, Slice(bytes, 0, 16)}}};
}

TEST(FolderTrees, DatosListsAndExtracts) {
  const Fixture f = FolderTreeFixture();
  auto o = OpenBytesAs(21, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  // Depth first, in the order met; the empty folder adds nothing.
  EXPECT_EQ(o->listing(), (Listing{{"DATOS.TXT", 440, 5, 5, 0, 0},
                                   {"MAPS\\LEVEL1\\map.dat", 452, 12, 12, 0, 0},
                                   {"MAPS\\readme", 445, 7, 7, 0, 0}}));
  ReplayFixture(f);
}

TEST(FolderTrees, DatosNestingIsBounded) {
  auto deep = OpenBytesAs(21, NestedFolders(63, "d"));
  ASSERT_EQ(deep->result, kOk);
  std::string path = "DATOS";
  for (int k = 1; k < 63; ++k) path += "\\d";
  EXPECT_EQ(deep->listing(), (Listing{{path + "\\f", 88 * 64, 4, 4, 0, 0}}));
  ExpectRefused(21, NestedFolders(64, "d"));
  // "DATOS" and eight folders of 32 characters make a path of 269.
  ExpectRefused(21, NestedFolders(9, std::string(32, 'x')));
}

TEST(FolderTrees, DatosRefusesLoopsAndOpenLists) {
  // A folder whose list is the root list.
  ArchiveBuilder loop;
  Record(loop, "DATOS.TXT", 0, 4, 0);
  Record(loop, "A", kFolder, 0, 132);
  EndRecord(loop);
  Record(loop, "B", kFolder, 0, 0);
  EndRecord(loop);
  ExpectRefused(21, loop.get());

  // A folder whose list starts with the folder itself.
  ArchiveBuilder self;
  Record(self, "DATOS.TXT", 0, 4, 0);
  Record(self, "A", kFolder, 0, 44);
  EndRecord(self);
  ExpectRefused(21, self.get());

  // Lists shared by two folders at every level multiply beyond what the file
  // could hold.
  ArchiveBuilder shared;
  for (uint32_t k = 0; k < 20; ++k) {
    Record(shared, "a", kFolder, 0, 132 * (k + 1));
    Record(shared, "b", kFolder, 0, 132 * (k + 1));
    EndRecord(shared);
  }
  Record(shared, "f", 0, 0, 0);
  EndRecord(shared);
  ExpectRefused(21, shared.get());

  // A list without an end record runs into the end of the file.
  ArchiveBuilder open;
  Record(open, "DATOS.TXT", 0, 4, 0);
  Record(open, "more", 0, 4, 0);
  Record(open, "most", 0, 4, 0);
  ExpectRefused(21, open.fill(10).get());
}

TEST(FolderTrees, TypedTablesListAndExtract) {
  const Fixture f = TypedTableFixture();
  auto o = OpenBytesAs(25, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  // Numbering starts again for every type; a type without entries adds none.
  EXPECT_EQ(o->listing(), (Listing{{"ages.drs.000000.bmp", 160, 10, 10, 0, 0},
                                   {"ages.drs.000001.bmp", 170, 20, 20, 0, 0},
                                   {"ages.drs.000000.bin", 190, 5, 5, 0, 0},
                                   {"ages.drs.000001.bin", 195, 0, 0, 0, 0},
                                   {"ages.drs.000002.bin", 195, 8, 8, 0, 0}}));
  ReplayFixture(f);
}

TEST(FolderTrees, TypedTableExtensionEndsAtAZeroByte) {
  const TypedArchive a{{{std::string(" x\0a", 4), 1}}, {40}};
  auto o = OpenBytesAs(25, a.build(), "t.drs");
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{"t.drs.000000.a", 88, 40, 40, 0, 0}}));
}

TEST(FolderTrees, TypedTablesRefuseCountsBeyondTheFile) {
  TypedArchive manyTypes{{{" pmb", 1}}, {40}};
  Bytes bytes = manyTypes.build();
  PutU32le(bytes, 56, 0x10000000);
  ExpectRefused(25, bytes);
  ExpectRefused(25, TypedArchive{{{" pmb", 1000}}, {40}}.build());
  ExpectRefused(25, TypedArchive{{{" pmb", 0xFFFFFFFF}, {" nib", 0xFFFFFFFF}}, {40}}.build());
}

TEST(FolderTrees, KeyedRecordsListAndExtract) {
  const Fixture f = KeyedRecordFixture();
  auto o = OpenBytesAs(26, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  // The key goes only to the entry marked enciphered; an inverted offset of
  // 0xFFFFFFFF is 0.
  EXPECT_EQ(o->listing(), (Listing{{"intro.txt", 257, 12, 12, 0, 0},
                                   {"data\\secret.bin", 269, 20, 20, 0, 0x5A},
                                   {kLongName, 0, 16, 16, 0, 0}}));
  ReplayFixture(f);
}

TEST(FolderTrees, KeyedRecordsRefuseACountBeyondTheFile) {
  ArchiveBuilder b;
  b.text("GSCfmt").fill(3).u8(1).u32(2);
  KeyedRecord(b, "only", 0, 0, 0);
  ExpectRefused(26, b.fill(20).get());
}

}  // namespace
}  // namespace cairn::test
