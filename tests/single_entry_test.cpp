// Single-entry wrapper files: one entry named after the archive, and the
// extraction methods of the wrappers (ZIP header repairs, XOR, inflate, the
// IFF start) give back the payload exactly.
#include <gtest/gtest.h>
#include <zlib.h>

#include <string>
#include <vector>

#include "builder.h"
#include "fixtures.h"
#include "readers/readers.h"
#include "table_checks.h"

namespace cairn::test {
namespace {

void Put(Bytes& b, size_t at, std::string_view s) {
  for (size_t i = 0; i < s.size(); ++i) b.at(at + i) = static_cast<uint8_t>(s[i]);
}

struct ZipMember {
  std::string name;
  Bytes data;
  std::string comment;  // of its central header
};

// A real ZIP archive of stored members whose headers carry general purpose
// flag 2, and where its headers lie.
struct Zip {
  Bytes bytes;
  std::vector<size_t> locals, centrals;
  std::vector<std::pair<size_t, size_t>> centralNames;  // position, length
  size_t end = 0;                                       // of the end record
};

Zip BuildZip(const std::vector<ZipMember>& members) {
  Zip z;
  ArchiveBuilder b;
  std::vector<uint32_t> crcs;
  for (const ZipMember& m : members) {
    const auto size = static_cast<uint32_t>(m.data.size());
    crcs.push_back(static_cast<uint32_t>(crc32(0, m.data.data(), size)));
    z.locals.push_back(b.size());
    b.text("PK\3\4").u16(20).u16(2).u16(0).u16(0).u16(0x21).u32(crcs.back()).u32(size).u32(size);
    b.u16(static_cast<uint16_t>(m.name.size())).u16(0).text(m.name).bytes(m.data);
  }
  const size_t central = b.size();
  for (size_t i = 0; i < members.size(); ++i) {
    const ZipMember& m = members[i];
    const auto size = static_cast<uint32_t>(m.data.size());
    z.centrals.push_back(b.size());
    b.text("PK\1\2").u16(20).u16(20).u16(2).u16(0).u16(0).u16(0x21).u32(crcs[i]).u32(size);
    b.u32(size).u16(static_cast<uint16_t>(m.name.size())).u16(0);
    b.u16(static_cast<uint16_t>(m.comment.size())).u16(0).u16(0).u32(0);
    b.u32(static_cast<uint32_t>(z.locals[i]));
    z.centralNames.emplace_back(b.size(), m.name.size());
    b.text(m.name).text(m.comment);
  }
  z.end = b.size();
  const auto count = static_cast<uint16_t>(members.size());
  b.text("PK\5\6").u16(0).u16(0).u16(count).u16(count);
  b.u32(static_cast<uint32_t>(z.end - central)).u32(static_cast<uint32_t>(central)).u16(0);
  z.bytes = b.get();
  return z;
}

// Local headers marked "F5CD", central headers "F512"; the end record's
// signature is gone.
Bytes Scramble(const Zip& z) {
  Bytes b = z.bytes;
  for (size_t at : z.locals) Put(b, at, "F5CD");
  for (size_t at : z.centrals) Put(b, at, "F512");
  Put(b, z.end, std::string_view("\0\0\0\0", 4));
  return b;
}

// The first signature reads "IPF1"; the central headers lost their
// signatures and names.
Bytes Strip(const Zip& z) {
  Bytes b = z.bytes;
  Put(b, 0, "IPF1");
  for (size_t at : z.centrals) Put(b, at, std::string_view("\0\0\0\0", 4));
  for (auto [at, n] : z.centralNames) Put(b, at, std::string(n, '\0'));
  return b;
}

const std::vector<ZipMember> kMembers = {
    {"readme.txt", Text("Unpack the bonus levels into the maps folder.\n"), "a comment"},
    {"data.bin", Pattern(40, 45), ""},
};

CAIRN_FIXTURE(ScrambledZip) {
  const Zip z = BuildZip(kMembers);
  return {"F5CD", 32, "bonus.pak", Scramble(z), {}, {{"bonus.zip", z.bytes}}};
}

TEST(SingleEntry, ScrambledZipGetsItsSignaturesBack) {
  const Fixture f = ScrambledZip();
  const auto n = static_cast<uint32_t>(f.bytes.size());
  ExpectListsAndExtracts(32, f, {{"bonus.zip", 0, n, n, 0, 0}});
}

TEST(SingleEntry, ScrambledZipWhoseHeadersDoNotChainFailsToExtract) {
  const Zip z = BuildZip(kMembers);
  Bytes unknown = Scramble(z);
  Put(unknown, z.locals[1], "XXXX");
  auto o = OpenBytesAs(32, unknown, "bonus.pak");
  ASSERT_EQ(o->result, kOk);
  Bytes out;
  EXPECT_EQ(o->extract(0, out), kBadData);

  // A central header that claims a longer comment than it has steps past the
  // end record.
  Bytes overshoot = Scramble(z);
  PutU16le(overshoot, z.centrals[1] + 32, 4);
  auto p = OpenBytesAs(32, overshoot, "bonus.pak");
  ASSERT_EQ(p->result, kOk);
  EXPECT_EQ(p->extract(0, out), kBadData);
}

const std::vector<ZipMember> kPlainMembers = {
    {"campaign/map01.txt", Text("Hold the bridge until the reinforcements arrive.\n"), ""},
    {"campaign/map02.txt", Pattern(33, 46), ""},
};

CAIRN_FIXTURE(StrippedZip) {
  const Zip z = BuildZip(kPlainMembers);
  return {"IPF1", 33, "extras.ipf", Strip(z), {}, {{"extras.zip", z.bytes}}};
}

TEST(SingleEntry, StrippedZipGetsItsCentralDirectoryBack) {
  const Fixture f = StrippedZip();
  const auto n = static_cast<uint32_t>(f.bytes.size());
  ExpectListsAndExtracts(33, f, {{"extras.zip", 0, n, n, 0, 0}});
}

TEST(SingleEntry, StrippedZipWithItsCentralDirectoryPastTheEndFailsToExtract) {
  const Zip z = BuildZip(kPlainMembers);
  Bytes b = Strip(z);
  PutU32le(b, z.end + 16, static_cast<uint32_t>(b.size() + 100));
  auto o = OpenBytesAs(33, b, "extras.ipf");
  ASSERT_EQ(o->result, kOk);
  Bytes out;
  EXPECT_EQ(o->extract(0, out), kBadData);
}

const Bytes kGzip =
    ArchiveBuilder().u8(0x1F).u8(0x8B).u8(8).fill(6).u8(3).bytes(Pattern(100, 47)).get();

CAIRN_FIXTURE(Campaign) {
  return {"H4CAMPAIGN",
          43,
          "campaign.h4c",
          ArchiveBuilder().text("H4CAMPAIGN").fill(5).bytes(kGzip).get(),
          {},
          {{"campaign.gz", kGzip}}};
}

const Bytes kVideoMagic = {0x55, 0x42, 0x56, 0x9E, 0x01, 0xF1, 0x53, 0x4B, 0xFE, 0xD0, 0x42,
                           0x1E, 0x4B, 0x4D, 0xDD, 0x78, 0xF1, 0x41, 0x01, 0x78, 0x80, 0x08,
                           0x9E, 0x38, 0x1F, 0x13, 0xA8, 0xD3, 0x6C, 0xFC, 0x42};

CAIRN_FIXTURE(Video) {
  // The magic's last byte is the first byte of the video.
  const Bytes file = ArchiveBuilder().bytes(kVideoMagic).text("IKi").bytes(Pattern(100, 48)).get();
  return {"signature row 51", 51, "movie.vid", file, {}, {{"movie.bik", Slice(file, 30, 104)}}};
}

const Bytes kMp3 =
    ArchiveBuilder().u8(0xFF).u8(0xFB).u8(0x90).u8(0x64).bytes(Pattern(100, 49)).get();

CAIRN_FIXTURE(Sound) {
  ArchiveBuilder b;
  b.u8(1).u8(0).u8(0).u8(0x10).u8(2).u8(0x44).u8(0xAC).u8(0).fill(11).bytes(kMp3);
  return {"signature row 55", 55, "voice.snd", b.get(), {}, {{"voice.mp3", kMp3}}};
}

TEST(SingleEntry, HeadersBeforeThePayloadAreSkipped) {
  ExpectListsAndExtracts(43, Campaign(), {{"campaign.gz", 15, 110, 110, 0, 0}});
  ExpectListsAndExtracts(51, Video(), {{"movie.bik", 30, 104, 104, 0, 0}});
  ExpectListsAndExtracts(55, Sound(), {{"voice.mp3", 19, 104, 104, 0, 0}});
}

const Bytes kSave = Pattern(600, 50);

CAIRN_FIXTURE(Savegame) {
  ArchiveBuilder b;
  b.text("CPAL savegame 3.3\n\n").u8(0).u32(600).bytes(Compress(kSave));
  return {"CPAL savegame 3.3", 56, "save01.sav", b.get(), {}, {{"save01", kSave}}};
}

TEST(SingleEntry, SavegameIsInflatedToTheSizeInItsHeader) {
  const Fixture f = Savegame();
  const auto packed = static_cast<uint32_t>(f.bytes.size() - 24);
  ExpectListsAndExtracts(56, f, {{"save01", 24, 600, packed, 0, 1}});
}

const Bytes kTune = Pattern(200, 0xB6);

Bytes Scrambled(const Bytes& plain) {
  Bytes b = plain;
  for (uint8_t& v : b) v ^= 0x6B;
  return b;
}

CAIRN_FIXTURE(XorSound) {
  return {"XOR-scrambled sound", 101, "intro.adf", Scrambled(kTune), {}, {{"intro.mp3", kTune}}};
}

TEST(SingleEntry, XorSoundIsUnscrambledWithItsKey) {
  ASSERT_EQ(XorSound().bytes.at(0), 0xDD);
  ExpectListsAndExtracts(101, XorSound(), {{"intro.mp3", 0, 200, 200, 0, 0x6B}});
}

const Bytes kLevel = Pattern(400, 51);

CAIRN_FIXTURE(Clz) {
  return {"size-prefixed zlib",
          147,
          "level.clz",
          ArchiveBuilder().u32(400).bytes(Compress(kLevel, 9)).get(),
          {},
          {{"level", kLevel}}};
}

TEST(SingleEntry, SizePrefixedStreamIsInflated) {
  const Fixture f = Clz();
  ASSERT_EQ(f.bytes.at(4), 0x78);
  ASSERT_EQ(f.bytes.at(5), 0xDA);
  const auto packed = static_cast<uint32_t>(f.bytes.size() - 4);
  ExpectListsAndExtracts(147, f, {{"level", 4, 400, packed, 0, 1}});

  Bytes damaged = f.bytes;
  damaged.at(20) ^= 0x55;
  auto o = OpenBytesAs(147, damaged, "level.clz");
  ASSERT_EQ(o->result, kOk);
  Bytes out;
  EXPECT_EQ(o->extract(0, out), kBadData);
}

Bytes Iff() {
  ArchiveBuilder b;
  b.text("FORM").u32be(104).text("ILBM").text("BMHD").u32be(20);
  b.u16be(16).u16be(4).fill(4).u8(1).fill(11);
  b.text("BODY").u32be(64).bytes(Pattern(64, 52));
  return b.get();
}

CAIRN_FIXTURE(WrappedIff) {
  Bytes stored = Iff();
  Put(stored, 0, "XXXXXXXXXXXXXXXX");
  return {"wrapped IFF", 155, "picture.iff", stored, {}, {{"picture.iff", Iff()}}};
}

TEST(SingleEntry, WrappedIffGetsItsFormHeaderBack) {
  ExpectListsAndExtracts(155, WrappedIff(), {{"picture.iff", 0, 112, 112, 0, 0}});

  // The FORM size is big-endian: the file's size less 8.
  const Bytes stored =
      ArchiveBuilder().text("XXXX").fill(4).text("XXXXXXXX").bytes(Pattern(0x1234 - 16, 53)).get();
  auto o = OpenBytesAs(155, stored, "big.iff");
  ASSERT_EQ(o->result, kOk);
  const Bytes out = o->extract(0);
  ASSERT_EQ(out.size(), 0x1234u);
  EXPECT_EQ(Slice(out, 0, 16),
            ArchiveBuilder().text("FORM").u8(0).u8(0).u8(0x12).u8(0x2C).text("ILBMBMHD").get());
  EXPECT_EQ(Slice(out, 16, 0x1234 - 16), Pattern(0x1234 - 16, 53));
  EXPECT_EQ(o->extract(0), out);  // the entry is not changed by extracting it
}

TEST(SingleEntry, TheEntryIsNamedAfterTheArchive) {
  const auto nameOf = [](FormatId id, const Bytes& bytes, std::string_view fileName) {
    auto o = OpenBytesAs(id, bytes, fileName);
    EXPECT_EQ(o->result, kOk);
    return o->session.entries.empty() ? std::string() : o->session.entries[0].Name;
  };
  EXPECT_EQ(nameOf(101, XorSound().bytes, "my.game.adf"), "my.game.mp3");
  // A file name without an extension is kept whole.
  EXPECT_EQ(nameOf(101, XorSound().bytes, "INTRO"), "INTRO.mp3");
  EXPECT_EQ(nameOf(101, XorSound().bytes, ".adf"), ".adf.mp3");
  EXPECT_EQ(nameOf(147, Clz().bytes, "level"), "level");
  EXPECT_EQ(nameOf(32, ScrambledZip().bytes, "BONUS"), "BONUS.zip");
}

}  // namespace
}  // namespace cairn::test
