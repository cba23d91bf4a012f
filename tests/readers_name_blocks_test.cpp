// The readers of directories with a separate name block: "AFS" (9),
// "archive  V2.2" (13), "StOR" (14), "HAK V1.0" (29) and "DWFB" (31).

#include <gtest/gtest.h>

#include "fixture_replay.h"

namespace cairn::test {
namespace {

using Listing = std::vector<Listed>;

const std::string kName32 = "abcdefghijklmnopqrstuvwxyz012345";

// An "AFS" name record: the name in 32 bytes, 16 bytes of other data.
ArchiveBuilder& AfsName(ArchiveBuilder& b, std::string_view name) {
  return b.name(name, 32).fill(16, 0x77);
}

CAIRN_FIXTURE(AfsFixture) {
  const Bytes e0 = Pattern(10, 1), e1 = Pattern(20, 2), e2 = Pattern(30, 3);
  ArchiveBuilder b;
  b.text("AFS").u8(0).u32(3);
  b.u32(64).u32(10).u32(74).u32(20).u32(94).u32(30).u32(124).u32(144).padTo(64);
  b.bytes(e0).bytes(e1).bytes(e2);
  AfsName(b, "first.adx");
  AfsName(b, "second.adx");
  AfsName(b, kName32);
  return {"AFS archive", 9,  "voice.afs",
          b.get(),       {}, {{"first.adx", e0}, {"second.adx", e1}, {kName32, e2}}};
}

CAIRN_FIXTURE(Archive22Fixture) {
  const Bytes alpha = Pattern(6, 1), beta = Pattern(40, 2);
  ArchiveBuilder b;
  b.text("archive  V2.2").u8(0).fill(2).u32(2);
  b.u32(44).u32(65).u32(6).u32(54).u32(71).u32(40);
  b.text("alpha.txt").u8(0).text("beta/b.dat").u8(0);
  b.bytes(alpha).bytes(beta);
  return {"archive V2.2", 13, "data.arc",
          b.get(),        {}, {{"alpha.txt", alpha}, {"beta\\b.dat", beta}}};
}

// A "StOR" directory record: 4 bytes, the offset, 4 bytes.
ArchiveBuilder& StorRecord(ArchiveBuilder& b, uint32_t offset) {
  return b.u32(0xAAAA).u32(offset).u32(0xBBBB);
}

CAIRN_FIXTURE(StorFixture) {
  const Bytes one = Pattern(20, 1), three = Pattern(40, 3);
  ArchiveBuilder b;
  b.text("StOR").u32(68).bytes(one).bytes(three).u32(3);
  StorRecord(b, 8);
  StorRecord(b, 28);
  StorRecord(b, 28);
  b.text("one").u8(0).text("two").u8(0).text("three").u8(0);
  return {"StOR archive", 14, "data.stor",
          b.get(),        {}, {{"one", one}, {"two", {}}, {"three", three}}};
}

// A "HAK V1.0" header: record count at 16, directory position at 24, the
// description from 168.
ArchiveBuilder HakHeader(uint32_t count, uint32_t directory, const Bytes& description) {
  ArchiveBuilder b;
  b.text("HAK V1.0").padTo(16).u32(count).u32(0).u32(directory).padTo(168).bytes(description);
  return b;
}

CAIRN_FIXTURE(HakFixture) {
  const Bytes description = Pattern(12, 9), map = Pattern(5, 1), other = Pattern(9, 2);
  ArchiveBuilder b = HakHeader(2, 180, description);
  b.name("map01.lvl", 16).fill(8, 0x33).name("sixteen_chars_ab", 16).fill(8, 0x33);
  b.u32(244).u32(5).u32(249).u32(9).bytes(map).bytes(other);
  return {"HAK V1.0 archive",
          29,
          "module.hak",
          b.get(),
          {},
          {{"_description_", description}, {"map01.lvl", map}, {"sixteen_chars_ab", other}}};
}

// A "DWFB" header: record count at 72, name block position and size at 76
// and 80, records from 88.
ArchiveBuilder DwfbHeader(uint32_t count, uint32_t names, uint32_t namesSize) {
  ArchiveBuilder b;
  b.text("DWFB").u32(2).padTo(72).u32(count).u32(names).u32(namesSize).padTo(88);
  return b;
}
ArchiveBuilder& DwfbRecord(ArchiveBuilder& b, uint32_t name, uint32_t length, uint32_t offset,
                           uint32_t size) {
  return b.u32(0x99).u32(name).u32(length).u32(offset).u32(size).fill(20, 0x44);
}

CAIRN_FIXTURE(DwfbFixture) {
  const Bytes kick = Pattern(12, 1), snare = Pattern(7, 2);
  ArchiveBuilder b = DwfbHeader(2, 168, 24);
  DwfbRecord(b, 168, 14, 192, 12);
  DwfbRecord(b, 182, 10, 204, 7);
  b.text("bank/kick.wav").u8(0).text("snare.wav").u8(0).bytes(kick).bytes(snare);
  return {"DWFB archive", 31, "drums.dwfb",
          b.get(),        {}, {{"bank\\kick.wav", kick}, {"snare.wav", snare}}};
}

TEST(NameBlocks, AfsListsAndExtracts) {
  const Fixture f = AfsFixture();
  auto o = OpenBytesAs(9, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{"first.adx", 64, 10, 10, 0, 0},
                                   {"second.adx", 74, 20, 20, 0, 0},
                                   {kName32, 94, 30, 30, 0, 0}}));
  ReplayFixture(f);
}

TEST(NameBlocks, AfsFindsTheNameBlockBeforeTheFirstEntry) {
  ArchiveBuilder b;
  b.text("AFS").u8(0).u32(1).u32(72).u32(16).u32(0).u32(0).padTo(64);
  b.u32(88).u32(48).bytes(Pattern(16));
  AfsName(b, "only.bin");
  auto o = OpenBytesAs(9, b.get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{"only.bin", 72, 16, 16, 0, 0}}));
  EXPECT_EQ(o->extract(0), Pattern(16));
}

TEST(NameBlocks, AfsWithoutEntriesListsNothing) {
  auto o = OpenBytesAs(9, ArchiveBuilder().text("AFS").u8(0).u32(0).fill(100, 0xFF).get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_TRUE(o->listing().empty());
}

TEST(NameBlocks, AfsRefusesNamesOutsideTheFile) {
  const auto afs = [](uint32_t names, uint32_t namesSize, uint32_t first) {
    ArchiveBuilder b;
    b.text("AFS").u8(0).u32(2).u32(first).u32(4).u32(68).u32(4).u32(names).u32(namesSize);
    b.padTo(64).fill(8);
    AfsName(b, "a");
    AfsName(b, "b");
    return b.get();
  };
  ExpectRefused(9, afs(100, 96, 64));  // runs past the end of the file
  ExpectRefused(9, afs(72, 40, 64));   // too small for the second name
  ExpectRefused(9, afs(0, 0, 4));      // no room before the first entry
}

TEST(NameBlocks, Archive22ListsAndExtracts) {
  const Fixture f = Archive22Fixture();
  auto o = OpenBytesAs(13, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(),
            (Listing{{"alpha.txt", 65, 6, 6, 0, 0}, {"beta\\b.dat", 71, 40, 40, 0, 0}}));
  ReplayFixture(f);
}

TEST(NameBlocks, Archive22WithLittleDataAfterTheNames) {
  // The directory is read up to the first entry's data, even when fewer than
  // 20 bytes follow it.
  const std::string name(80, 'q');
  ArchiveBuilder b;
  b.text("archive  V2.2").u8(0).fill(2).u32(1).u32(32).u32(113).u32(4).text(name).u8(0);
  b.bytes(Pattern(4));
  auto o = OpenBytesAs(13, b.get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{name, 113, 4, 4, 0, 0}}));
  EXPECT_EQ(o->extract(0), Pattern(4));
}

TEST(NameBlocks, Archive22RefusesNamesOutsideTheDirectory) {
  const auto archive = [](uint32_t count, uint32_t name) {
    ArchiveBuilder b;
    b.text("archive  V2.2").u8(0).fill(2).u32(count).u32(name).u32(90).u32(4);
    b.text("name").u8(0).padTo(90).fill(20, 'A');
    return b.get();
  };
  ExpectRefused(13, archive(1, 10));   // before the directory
  ExpectRefused(13, archive(1, 200));  // beyond the first entry's data
  ExpectRefused(13, archive(1, 90));   // runs to the end without a terminator
  ExpectRefused(13, archive(8, 32));   // more records than the directory holds
}

TEST(NameBlocks, StorListsAndExtracts) {
  const Fixture f = StorFixture();
  auto o = OpenBytesAs(14, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  // The last entry ends where the directory begins, not at the end of the file.
  EXPECT_EQ(
      o->listing(),
      (Listing{{"one", 8, 20, 20, 0, 0}, {"two", 28, 0, 0, 0, 0}, {"three", 28, 40, 40, 0, 0}}));
  ReplayFixture(f);
}

TEST(NameBlocks, StorRefusesBrokenDirectories) {
  const auto stor = [](uint32_t directory, uint32_t count, uint32_t first, uint32_t second) {
    ArchiveBuilder b;
    b.text("StOR").u32(directory).bytes(Pattern(92)).u32(count);
    StorRecord(b, first);
    StorRecord(b, second);
    return b.text("a").u8(0).text("b").u8(0).get();
  };
  ASSERT_EQ(OpenBytesAs(14, stor(100, 2, 8, 50))->result, kOk);
  ExpectRefused(14, stor(100, 2, 50, 8));   // offsets going back
  ExpectRefused(14, stor(100, 2, 8, 101));  // an entry beyond the directory
  ExpectRefused(14, stor(200, 2, 8, 50));   // directory beyond the file
  ExpectRefused(14, stor(4, 2, 8, 50));     // directory inside the header
  ExpectRefused(14, stor(100, 3, 8, 50));   // more records than the directory holds
  Bytes unterminated = stor(100, 2, 8, 50);
  unterminated.back() = 'c';
  ExpectRefused(14, unterminated);
}

TEST(NameBlocks, HakListsAndExtracts) {
  const Fixture f = HakFixture();
  auto o = OpenBytesAs(29, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{"_description_", 168, 12, 12, 0, 0},
                                   {"map01.lvl", 244, 5, 5, 0, 0},
                                   {"sixteen_chars_ab", 249, 9, 9, 0, 0}}));
  ReplayFixture(f);
}

TEST(NameBlocks, HakWithoutRecordsListsTheDescription) {
  auto o = OpenBytesAs(29, HakHeader(0, 200, Pattern(32)).get());
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), (Listing{{"_description_", 168, 32, 32, 0, 0}}));
  EXPECT_EQ(o->extract(0), Pattern(32));
}

TEST(NameBlocks, HakRefusesDirectoriesOutsideTheFile) {
  ExpectRefused(29, HakHeader(0, 100, Pattern(32)).get());  // inside the header
  ExpectRefused(29, HakHeader(2, 200, Pattern(64)).get());  // 64 bytes at 200 in 232
}

TEST(NameBlocks, DwfbListsAndExtracts) {
  const Fixture f = DwfbFixture();
  auto o = OpenBytesAs(31, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(),
            (Listing{{"bank\\kick.wav", 192, 12, 12, 0, 0}, {"snare.wav", 204, 7, 7, 0, 0}}));
  ReplayFixture(f);
}

TEST(NameBlocks, DwfbNameLengths) {
  const auto dwfb = [](uint32_t length, uint32_t position = 128) {
    ArchiveBuilder b = DwfbHeader(1, 128, 300);
    DwfbRecord(b, position, length, 0, 8);
    return b.text(std::string(280, 'n')).u8(0).fill(19).get();
  };
  auto o = OpenBytesAs(31, dwfb(260));
  ASSERT_EQ(o->result, kOk);  // 259 characters and the terminator
  EXPECT_EQ(o->listing(), (Listing{{std::string(259, 'n'), 0, 8, 8, 0, 0}}));
  ExpectRefused(31, dwfb(261));
  ExpectRefused(31, dwfb(0));
  ExpectRefused(31, dwfb(10, 100));  // before the name block
  ExpectRefused(31, dwfb(50, 400));  // past its end
}

TEST(NameBlocks, DwfbRefusesBlocksOutsideTheFile) {
  ArchiveBuilder records = DwfbHeader(3, 88, 0);
  ExpectRefused(31, records.fill(40).get());  // three records of 40 bytes need 120
  ArchiveBuilder names = DwfbHeader(0, 100, 50);
  ExpectRefused(31, names.fill(40).get());
}

}  // namespace
}  // namespace cairn::test
