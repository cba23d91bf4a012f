// Recognition: the signature rows, the ordered rules and their traps, run on
// real files so that the rules that read the file or look for a companion
// beside it do so.
#include "detect/detect.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <set>
#include <string>
#include <vector>

#include "builder.h"
#include "detect_fixtures.h"
#include "util/file.h"

namespace cairn::test {
namespace {

using Companions = std::vector<std::pair<std::string, Bytes>>;

// Recognises the file at `path` as the open frame does: its first 104 bytes,
// `given` as the path, its handle.
FormatId DetectPath(const std::string& path, std::string_view given) {
  const File f(os::OpenShared(path.c_str()));
  Bytes header(kHeaderSize);
  if (!f || !ReadAt(f.get(), header.data(), 0, kHeaderSize)) {
    ADD_FAILURE() << "cannot read the header of " << path;
    return 0;
  }
  return DetectFormat(ByteView(header), given, f.get());
}

// Writes `bytes` as `name` (with its companions) into a fresh folder and
// recognises it.
FormatId Detect(const Bytes& bytes, std::string_view name = "sample.res",
                const Companions& companions = {}) {
  const TempDir dir;
  for (const auto& [n, b] : companions) dir.write(n, b);
  const std::string p = dir.write(name, bytes);
  return DetectPath(p, p);
}

// The same file recognised with no path at all.
FormatId DetectWithoutPath(const Bytes& bytes) {
  const TempDir dir;
  return DetectPath(dir.write("sample.res", bytes), "");
}

Bytes Header(ArchiveBuilder b, size_t size = kHeaderSize) {
  return b.padTo(size).get();
}

// "AAAA" and zeros: nothing takes it unless the extension does.
Bytes Plain() {
  return Header(ArchiveBuilder().text("AAAA"));
}

TEST(DetectCases, EveryReachableFormatIsRecognised) {
  std::set<FormatId> seen;
  for (const DetectCase& c : DetectCases()) {
    SCOPED_TRACE(c.fileName + " as " + std::to_string(c.id));
    ASSERT_GE(c.bytes.size(), kHeaderSize);
    EXPECT_TRUE(seen.insert(c.id).second) << "twice";
    EXPECT_EQ(Detect(c.bytes, c.fileName, c.companions), c.id);
  }
  for (FormatId id = 1; id <= 157; ++id)
    EXPECT_EQ(seen.count(id), id == 70 || id == 91 || id == 130 ? 0u : 1u) << id;
}

// --- Signatures -------------------------------------------------------------

// Every byte of every magic takes part in the comparison, embedded and
// trailing zero bytes included, so a comparison that stops at the first zero
// byte or at the shorter text is caught.
TEST(DetectSignatures, EveryByteOfEveryMagicCounts) {
  ASSERT_EQ(SignatureTable().size(), 79u);
  for (const Signature& s : SignatureTable()) {
    SCOPED_TRACE(s.id);
    ASSERT_EQ(s.id, static_cast<FormatId>(&s - SignatureTable().data() + 1));
    Bytes h(s.magic.begin(), s.magic.end());
    h.resize(kHeaderSize);
    EXPECT_EQ(MatchSignature(h), s.id == 70 ? 7u : s.id);
    for (size_t i = 0; i < s.magic.size(); ++i) {
      Bytes changed = h;
      changed[i] ^= 0x01;
      EXPECT_NE(MatchSignature(changed), s.id) << "byte " << i;
    }
  }
}

TEST(DetectSignatures, RowOrderDecides) {
  // Row 7 "PACK" comes first and takes the "PACK" 00 00 of row 70.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("PACK").u16(0).u32(5))), 7u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("PACKXYZ"))), 7u);
  // "DIR" is all of row 2's magic.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("DIR"))), 2u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("DIRECTORY"))), 2u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("DIR").fill(101, 0xFF))), 2u);
  // A magic wins over extensions and companions.
  const Bytes wad3 = Header(ArchiveBuilder().text("WAD3").u32(0));
  EXPECT_EQ(Detect(wad3, "a.wd"), 5u);
  EXPECT_EQ(Detect(wad3, "a.rss"), 5u);
  EXPECT_EQ(Detect(wad3, "a.img", {{"a.dir", Pattern(8)}}), 5u);
}

TEST(DetectSignatures, MagicsAreCaseSensitive) {
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("pack"))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("wad3"))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("Dir"))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("magegold"))), 0u);
}

TEST(DetectSignatures, LongestMagicIsComparedWhole) {
  const Bytes tribe = FromHex(
      "43 6F 70 79 72 69 67 68 74 20 28 63 29 20 31 39 39 37 20 45 6E 73 65 6D 62 6C 65 20 53 74 "
      "75 64 69 6F 73 2E 1A 00 00 00 31 2E 30 30 74 72 69 62 65 00 00 00 00 00 00 00");
  ASSERT_EQ(tribe.size(), 56u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().bytes(tribe).text("rest"))), 25u);
  Bytes last = tribe;
  last[55] = ' ';
  EXPECT_NE(Detect(Header(ArchiveBuilder().bytes(last))), 25u);
  Bytes first = tribe;
  first[0] = 'c';
  EXPECT_NE(Detect(Header(ArchiveBuilder().bytes(first))), 25u);
}

// --- Rules on the header ----------------------------------------------------

TEST(DetectRules, FourZeroBytesTakeEverything) {
  // d0 = 0 with d44 = 4 would be a 40-byte-name directory, and ".rss" or a
  // companion would decide further down; the zero start comes first.
  const Bytes zeroStart = Header(ArchiveBuilder().u32(0).u32(3).padTo(44).u32(4));
  EXPECT_EQ(Detect(zeroStart), 146u);
  EXPECT_EQ(Detect(zeroStart, "a.rss"), 146u);
  EXPECT_EQ(Detect(zeroStart, "a.img", {{"a.dir", Pattern(8)}}), 146u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().fill(104, 0))), 146u);
  for (uint32_t d0 : {0x80134000u, 0xB3300000u, 0x00E34010u, 0x00E34009u, 0x00135200u})
    EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(d0))), 146u) << d0;
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0x00135201))), 0u);
}

TEST(DetectRules, BigfOrder) {
  auto bigf = [](uint32_t d8, uint32_t d12) {
    return Header(ArchiveBuilder().text("BIGF").u32(0).u32(d8).u32(d12));
  };
  EXPECT_EQ(Detect(bigf(5, 64)), 97u);  // before the test of d8
  EXPECT_EQ(Detect(bigf(0, 2048)), 97u);
  EXPECT_EQ(Detect(bigf(5, 63)), 132u);
  EXPECT_EQ(Detect(bigf(0, 1)), 133u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("BIGf").u32(0).u32(0).u32(64))), 0u);
}

TEST(DetectRules, PixelDataObjectDepths) {
  for (uint8_t depth : {8, 24, 32, 16}) {
    const Bytes h = Header(ArchiveBuilder()
                               .text("NetImmerse File Format, ")
                               .padTo(52)
                               .text("NiPixelData")
                               .padTo(83)
                               .u8(depth));
    EXPECT_EQ(Detect(h), depth == 16 ? 0u : 145u) << int(depth);
  }
}

TEST(DetectRules, DirectoryTemplates) {
  auto image = [](const char* variant, const char* width) {
    const std::string v(variant), w(width);
    return FromHex("16 00 00 00 9C 04 " + w + " FF FF " + v + " 01 00 00 00 04 00 00 00 FF FF " +
                   v + " 01 00 00 00 15 00 00 00 74 04 " + w + " FF FF " + v +
                   " 01 00 00 00 5C 04 " + w + " FF FF " + v + " 08 00 00 00");
  };
  for (const char* v : {"03 10", "02 0C", "01 04"})
    EXPECT_EQ(Detect(Header(ArchiveBuilder().bytes(image(v, "04 00")))), 99u) << v;
  EXPECT_EQ(Detect(Header(ArchiveBuilder().bytes(image("02 0C", "02 00")))), 100u);
  // The wide picture exists only in the middle variant.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().bytes(image("03 10", "02 00")))), 0u);
  Bytes cut = image("03 10", "04 00");
  cut[55] = 1;
  EXPECT_EQ(Detect(Header(ArchiveBuilder().bytes(cut))), 0u);
}

TEST(DetectRules, VolumeLabelsAtFour) {
  // The longest, one with two spaces inside, one with lower case, the shortest.
  for (const char* label : {"GameX POD - Hellbender Trial Version  JRS8", "Vroooooooom  (Trial)",
                            "Crazier 8 Add-on track", "Cockpits are cool...", "FM"}) {
    // The label is followed by whatever the volume holds: no terminator.
    EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").text(label).text("xyz"))), 104u) << label;
    EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAAA").text(label))), 0u) << label;
  }
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").text("fm"))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").text("Crazier 8 Add-on Track"))), 0u);
}

TEST(DetectRules, SectionNames) {
  for (const char* name : {"CARTEXTURES", "TRACKSELECT", "MAGAZINES", "DYNAMIC", "VINYL", "HUD"})
    EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").padTo(36).text(name))), 123u) << name;
  // "TRACK" begins "TRACKSELECT", which the three-section bundles claim first.
  for (const char* name : {"GLOBALMESSAGE", "ROAD_SEGMENT", "GLOBAL", "INGAME", "TRACK"})
    EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").padTo(36).text(name))), 124u) << name;
  for (const char* name : {"GLOBALMESSAGE", "PLATFORMCRIB", "FRONTEND", "PARTICLE", "DRIVER",
                           "GLOBAL", "INGAME", "Region"})
    EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").padTo(84).text(name))), 157u) << name;
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").padTo(84).text("REGION"))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").padTo(35).text("HUD"))), 0u);
}

TEST(DetectRules, TexPictureSizeTestComesFirst) {
  // 2 x width x height against the size less the 22-byte header.
  auto tex = [](uint32_t w, uint32_t h) {
    return Header(ArchiveBuilder().text("TEX").u8(0).u16(1).u32(w).u32(h), 122);
  };
  EXPECT_EQ(Detect(tex(10, 5)), 139u);  // 100 = 122 - 22
  EXPECT_EQ(Detect(tex(10, 5), "pic.565"), 140u);
  EXPECT_EQ(Detect(tex(10, 5), "pic.TEX"), 139u);
  EXPECT_EQ(Detect(tex(10, 6)), 0u);
  EXPECT_EQ(Detect(tex(10, 6), "pic.565"), 0u);
  // A product that wraps to a small number passes.
  EXPECT_EQ(Detect(tex(0x80000001, 0x80000000)), 139u);
  // 00 00 at 6 is the texture list of the signature table.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("TEX").u8(0).u16(1).u16(0).u16(5))), 71u);
}

TEST(DetectRules, FileSizeRelations) {
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("TGL").u8(0).u32(0).u32(110), 110)), 111u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("TGL").u8(0).u32(0).u32(110), 111)), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("KPS").u8(0).u32(0).u32(102), 110)), 112u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("KPS").u8(0).u32(0).u32(110), 110)), 0u);
  // Headerless pictures, with the size - 780 that wraps for small files.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0u - 676).u32(1).u32(0u - 676))), 151u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(108).u32(6).u32(6), 121)), 0u);
  // A size-prefixed directory: d0 is the size and 56 x d4 fits in it.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(112).u32(2), 112)), 122u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(112).u32(3), 112)), 0u);
}

TEST(DetectRules, ArithmeticWraps) {
  // d4 - d0 = 8192 across the top of the range.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0xFFFFF000).u32(0x1000).u32(3).u32(4))), 92u);
  // 48 x 0x40000000 is 0.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0x40000000).padTo(44).u32(4))), 85u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(3).padTo(44).u32(3 * 44 + 4))), 86u);
}

// Near misses: each header meets every condition of its rule but one, so a
// rule that forgets a condition takes it.
TEST(DetectRules, EveryConditionCounts) {
  // The second word of the two-word magics.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0xDD72DD12).u32(4))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0x7B2B0A68).u32(0x7CE2FF0B))), 0u);
  // "TEX" 00 01 00 needs its sixth byte.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("TEX").u8(0).u16(0x0101).u32(10).u32(5), 122)), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("XXXX").u32(0).text("XXXXXXXY"))), 0u);
  // The headerless pictures need width x height (x 3) to be d0.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(100).u32(10).u32(11), 880)), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(108).u32(6).u32(7), 120)), 0u);
  // 27-byte records: d4 must not be 0; 8.3 names: d4 must be 0.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u16(1).u16(5).u32(0).u32(0))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u16(3).u16(2).u32(1).padTo(22).u32(52))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(16).u32(16 + 8192).u32(3).u32(5))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0x2DA2DF95).u32(1).u32(2).u32(0).u32(4))), 0u);
  // 14-byte names: a zero count at 0, then a broken third sum.
  auto sums = [](uint16_t w0, uint32_t d86) {
    return Header(ArchiveBuilder()
                      .u16(w0)
                      .text("AA")
                      .padTo(16)
                      .u32(1)
                      .u32(2)
                      .padTo(38)
                      .u32(4)
                      .u32(3)
                      .padTo(60)
                      .u32(8)
                      .u32(7)
                      .padTo(86)
                      .u32(d86));
  };
  EXPECT_EQ(Detect(sums(1, 15)), 105u);
  EXPECT_EQ(Detect(sums(0, 15)), 0u);
  EXPECT_EQ(Detect(sums(1, 16)), 0u);
  // Image lists: each of the fixed words.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0xFFFFFFFF).u32(1).u32(0).u32(80))), 0u);
  auto list96 = [](uint32_t d64, uint32_t d68, uint32_t d72, uint32_t d96, uint32_t d100) {
    return Header(
        ArchiveBuilder().u32(1).padTo(64).u32(d64).u32(d68).u32(d72).padTo(96).u32(d96).u32(d100));
  };
  EXPECT_EQ(Detect(list96(0xFFFFFFFF, 0, 32, 0xFFFFFFFF, 0)), 83u);
  EXPECT_EQ(Detect(list96(0xFFFFFFFE, 0, 32, 0xFFFFFFFF, 0)), 0u);
  EXPECT_EQ(Detect(list96(0xFFFFFFFF, 1, 32, 0xFFFFFFFF, 0)), 0u);
  EXPECT_EQ(Detect(list96(0xFFFFFFFF, 0, 33, 0xFFFFFFFF, 0)), 0u);
  EXPECT_EQ(Detect(list96(0xFFFFFFFF, 0, 32, 0xFFFFFFFE, 0)), 0u);
  EXPECT_EQ(Detect(list96(0xFFFFFFFF, 0, 32, 0xFFFFFFFF, 1)), 0u);
}

// A count at 0 whose offset table would end beyond any 32-bit file is not an
// offset table: 0xFFFFFFFF 0 is the image lists' start, and 4 x 0xFFFFFFFF + 4
// only wraps to 0.
TEST(DetectRules, ImageListsAreNotOffsetTables) {
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0xFFFFFFFF).u32(0).u32(0).u32(80))), 81u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0xFFFFFFFF).u32(0).u32(32).padTo(20).u32(1))), 82u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0xFFFFFFFF).u32(0).u32(32).padTo(20).u32(9))), 84u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(0x40000000).u32(4))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(5).u32(24))), 110u);
}

TEST(DetectRules, CountedTablesWithThousands) {
  for (uint16_t w6 : {1000, 2000, 3000, 4000, 5000, 6000}) {
    EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(24).u16(2).u16(w6).u32(16))), 94u) << w6;
    EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(25).u16(2).u16(w6).u32(16))), 95u) << w6;
  }
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(24).u16(2).u16(1500).u32(16))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(24).u16(2).u16(7000).u32(16))), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(24).u16(2).u16(1000).u32(17))), 0u);
}

TEST(DetectRules, ChainedNamesMustEndInsideTheHeader) {
  // The first name runs to the end of the header: no terminator, no match.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(100).fill(100, 'n'), 200)), 0u);
  // The second name starts inside and runs out.
  EXPECT_EQ(
      Detect(Header(ArchiveBuilder().u32(100).text("A").u8(0).u32(104).u32(10).fill(90, 'n'), 200)),
      0u);
  // Both names inside, but the second entry's offset runs past the header.
  auto chain = [](size_t second) {
    return Header(ArchiveBuilder()
                      .u32(100)
                      .fill(80, 'n')
                      .u8(0)
                      .u32(104)
                      .u32(10)
                      .fill(second, 'm')
                      .u8(0)
                      .u32(114));
  };
  EXPECT_EQ(Detect(chain(4)), 96u);
  EXPECT_EQ(Detect(chain(7)), 0u);  // its last byte is the file's 105th
}

// --- Rules that read the file -----------------------------------------------

TEST(DetectRules, ReadsFromTheFile) {
  // A directory at d0 after a zero word and, five bytes before it, the size.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(13).u32(110), 110)), 153u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(13).u32(111), 110)), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(8).u32(0), 110)), 0u);  // d0 - 9 before the start
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(13).u32(110).u8(0).u8(1), 110)), 0u);  // not zero
  // The description block at 256, which a shorter file cannot hold.
  const Bytes described =
      Header(ArchiveBuilder().text("AAAA").padTo(256).text("PSVDSC_V2.00\r\n\r\n"));
  EXPECT_EQ(Detect(described), 119u);
  EXPECT_EQ(Detect(Slice(described, 0, 271)), 0u);
  Bytes lastByte = described;
  lastByte[271] = ' ';
  EXPECT_EQ(Detect(lastByte), 0u);
  // A printable byte and five zeros just before d0.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(106).padTo(100).u8(' '), 107)), 90u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(106).padTo(100).u8(0x1F), 107)), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(106).padTo(100).u8(' ').u8(1), 107)), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(5), 107)), 0u);  // d0 - 6 before the start
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(300).padTo(294).u8('x'), 299)), 0u);  // short
  // 136-byte records counted at 0, the first data offset read at 132.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(2).padTo(132).u32(276), 136)), 118u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(2).padTo(132).u16(276), 134)), 0u);
}

TEST(DetectRules, NoFileAndShortHeaders) {
  // The second stage alone, as nested recognition runs it: no file to read,
  // and header values outside the bytes given fail their rules quietly.
  const Bytes described = Header(ArchiveBuilder().u32(13).u32(110), 110);
  EXPECT_EQ(DetectByRules(described, "", os::kNoFile, 110), 0u);
  EXPECT_EQ(DetectByRules(described, "", os::kNoFile, 0), 0u);
  const Bytes shortHeader = {'A', 'A', 'A', 'A', 1, 2};
  EXPECT_EQ(DetectByRules(shortHeader, "x.rss", os::kNoFile, 6), 114u);
  EXPECT_EQ(DetectByRules(shortHeader, "x.res", os::kNoFile, 6), 0u);
  EXPECT_EQ(DetectByRules(ByteView(), "x.r8", os::kNoFile, 0), 0u);
  EXPECT_EQ(DetectByRules(Header(ArchiveBuilder().u32(0xDD72DD12).u32(3)), "", os::kNoFile, 0),
            117u);
}

// --- Extensions and companions ----------------------------------------------

TEST(DetectRules, ExtensionOrder) {
  const Bytes zlib = Header(ArchiveBuilder().u8(0x78).u8(0x9C).text("AA"));
  EXPECT_EQ(Detect(zlib, "a.wd"), 142u);
  EXPECT_EQ(Detect(zlib, "a.WD"), 142u);
  EXPECT_EQ(Detect(Plain(), "a.wd"), 148u);
  const Bytes both = Header(ArchiveBuilder().u8(1).text("AAA").padTo(8).u8(1));
  EXPECT_EQ(Detect(both, "a.r8"), 135u);
  EXPECT_EQ(Detect(both, "a.r16"), 137u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").padTo(8).u8(1)), "a.R16"), 138u);
  EXPECT_EQ(Detect(Plain(), "a.r8"), 0u);
  // ".psc" files with the scrambled pattern fall through to the later rules.
  const Bytes pattern = Header(ArchiveBuilder().text("AAAA").padTo(32).bytes(
      FromHex("20 A2 A1 99 20 A2 A1 99 20 A2 A1 99 20 A2 A1 99")));
  EXPECT_EQ(Detect(pattern, "a.psc"), 0u);
  EXPECT_EQ(Detect(pattern, "a.PSC"), 0u);
  EXPECT_EQ(Detect(pattern, "a.pscx"), 154u);
  EXPECT_EQ(DetectWithoutPath(pattern), 154u);
  // Sequences: the 12-byte header needs three small words.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(1).u32(255).u32(2)), "a.sequence"), 128u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(1).u32(256).u32(2)), "a.sequence"), 129u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(1).u32(255).u32(2).u8(2)), "a.sequence"), 129u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(2).u32(256)), "a.sequence"), 0u);
}

TEST(DetectRules, ExtensionWithHeaderTests) {
  // The 32-bit value at offset 1, unaligned.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(1).u32(110 - 9), 110), "a.jaz"), 109u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(1).u32(110 - 8), 110), "a.jaz"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(0).u32(110 - 9), 110), "a.jaz"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(1).u32(109), 110), "a.pak"), 106u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(0).u32(110), 110), "a.dat"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(2).u32(5)), "a.dat"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(0x11).u8(0xFB).text("AA")), "a.qfs"), 125u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(0x12).u8(0xFB).text("AA")), "a.qfs"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(0x10).u8(0xFA).text("AA")), "a.qfs"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(0).u8(2).text("AA")), "a.syj"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(0x78).u8(0x9D).text("AA")), "a.wd"), 148u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").padTo(8).u8(2)), "a.frame"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(0x1F).text("AAA")), "a.pbo"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u8(0xDC).text("AAA")), "a.adf"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(7).u32(8)), "a.meg"), 0u);
  EXPECT_EQ(Detect(Plain(), "a.555"), 134u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").text("\x78\xDB")), "a.clz"), 0u);
  // A 16-bit picture whose pixels do not fit the file.
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").u32(11).u32(6)), "a.rsb"), 149u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").u32(12).u32(6)), "a.rsb"), 0u);
  EXPECT_EQ(Detect(Header(ArchiveBuilder().text("AAAA").u32(67).u32(1), 105), "a.rsb"), 0u);
  for (const char* name : {"a.anm", "a.BIN", "a.img", "a.msk"})
    EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(100).u32(3).u32(4)), name), 141u) << name;
  EXPECT_EQ(Detect(Header(ArchiveBuilder().u32(100).u32(3).u32(0)), "a.anm"), 0u);
}

TEST(DetectRules, PathsWithoutExtension) {
  EXPECT_EQ(Detect(Plain(), "rss"), 0u);
  EXPECT_EQ(Detect(Plain(), "a.rss/data"), 0u);  // nor does a dot in a folder name
  EXPECT_EQ(Detect(Plain(), "a.rss/b.rss"), 114u);
  EXPECT_EQ(DetectWithoutPath(Plain()), 0u);
  {
    const TempDir dir;  // a leading dot starts no extension
    EXPECT_EQ(DetectPath(dir.write("x", Plain()), ".rss"), 0u);
  }
  // Rules that do not look at the extension work without a path.
  EXPECT_EQ(DetectWithoutPath(Header(ArchiveBuilder().u32(0xDD72DD12).u32(3))), 117u);
  EXPECT_EQ(DetectWithoutPath(Header(ArchiveBuilder().u32(13).u32(110), 110)), 153u);
}

TEST(DetectRules, CompanionFiles) {
  EXPECT_EQ(Detect(Plain(), "data.IMG", {{"data.dir", Pattern(4)}}), 98u);
  EXPECT_EQ(Detect(Plain(), "data.img"), 0u);
  // Without its companion a ".img" file goes on to the width-only pictures.
  const Bytes picture = Header(ArchiveBuilder().u32(100).u32(3).u32(4));
  EXPECT_EQ(Detect(picture, "data.img", {{"data.dir", {}}}), 98u);  // empty, yet there
  EXPECT_EQ(Detect(picture, "data.img"), 141u);
  EXPECT_EQ(Detect(picture, "data.img", {{"data.dir.x", Pattern(4)}}), 141u);
  // The companion replaces the extension of the last path part only.
  EXPECT_EQ(Detect(Plain(), "d.x/data.img", {{"d.x/data.dir", Pattern(4)}}), 98u);
  EXPECT_EQ(Detect(Plain(), "d.x/data.img", {{"d.dir", Pattern(4)}}), 0u);
  EXPECT_EQ(Detect(Plain(), "a.b.img", {{"a.b.dir", Pattern(4)}}), 98u);
  EXPECT_EQ(Detect(Plain(), "a.b.img", {{"a.dir", Pattern(4)}}), 0u);
  // The same companion extension serves two archive extensions.
  EXPECT_EQ(Detect(Plain(), "data.pak", {{"data.dir", Pattern(4)}}), 121u);
  EXPECT_EQ(Detect(Plain(), "data.rfd", {{"data.rfh", Pattern(4)}}), 108u);
  EXPECT_EQ(Detect(Plain(), "data.rfh", {{"data.rfd", Pattern(4)}}), 0u);
  EXPECT_EQ(Detect(Plain(), "data.big", {{"data.fat", Pattern(4)}}), 143u);
  // An archive of no bytes has no companion.
  {
    const TempDir dir;
    const Bytes h = Header(ArchiveBuilder().text("AAAA").padTo(12).u32(1));
    const std::string img = dir.write("data.img", h);
    dir.write("data.dir", Pattern(4));
    EXPECT_EQ(DetectByRules(h, img, os::kNoFile, 1), 98u);
    EXPECT_EQ(DetectByRules(h, img, os::kNoFile, 0), 0u);
  }
  // A folder is not a companion.
  EXPECT_EQ(Detect(Plain(), "data.big", {{"data.fat/x", Pattern(4)}}), 0u);
}

TEST(DetectRules, SoundBankIndexMustBeginWithItsTag) {
  const Bytes gaba = ArchiveBuilder().text("GABA").u32(2).get();
  EXPECT_EQ(Detect(Plain(), "s.bag", {{"s.idx", gaba}}), 126u);
  EXPECT_EQ(Detect(Plain(), "s.bag", {{"s.idx", ArchiveBuilder().text("GABA").u32(3).get()}}), 0u);
  EXPECT_EQ(Detect(Plain(), "s.bag", {{"s.idx", Slice(gaba, 0, 7)}}), 0u);
  EXPECT_EQ(Detect(Plain(), "s.bag"), 0u);
}

// Probing companions leaves no file open, whether the rule held or not.
TEST(DetectRules, CompanionsAreClosed) {
  const std::filesystem::path fds = "/proc/self/fd";
  if (!std::filesystem::exists(fds)) GTEST_SKIP() << "no descriptor list";
  auto open = [&] {
    return std::distance(std::filesystem::directory_iterator(fds),
                         std::filesystem::directory_iterator());
  };
  const TempDir dir;
  dir.write("a.dir", Pattern(4));
  dir.write("a.idx", Pattern(8));
  const std::string img = dir.write("a.img", Plain());
  const std::string bag = dir.write("a.bag", Plain());
  const auto before = open();
  EXPECT_EQ(DetectPath(img, img), 98u);
  EXPECT_EQ(DetectPath(bag, bag), 0u);
  EXPECT_EQ(open(), before);
}

}  // namespace
}  // namespace cairn::test
