// The second stage of recognition: for files that carry no magic, ordered
// rules over header values, the file size, the extension, a few bytes further
// into the file and companion files beside it. The first rule that holds
// decides, so the order is part of the rules: four zero bytes at the start
// are taken before anything else can look at such a header, "BIGF" with 64
// or 2048 at 12 is claimed before the word at 8 is looked at, and ".wd" files
// that begin like a zlib stream are claimed before every other ".wd" file.
//
// Header values are little-endian: d(n) 32 bits, w(n) 16 bits, b(n) one byte
// at offset n. Arithmetic is unsigned 32-bit and wraps (one product is
// exempt, see OffsetTableAfterCount). Extensions compare without regard to
// case; a path without an extension fails every extension test.
#include <array>
#include <cstdint>
#include <initializer_list>
#include <span>
#include <string>

#include "detect/detect.h"
#include "util/file.h"
#include "util/names.h"

namespace cairn {
namespace {

using namespace std::string_view_literals;

// Everything a rule may look at. A header value outside the bytes given
// throws BadData, which makes the rule that asked for it fail.
struct Facts {
  ByteView header;
  std::string_view path;
  std::string_view ext;  // dot included; empty when the path has none
  os::Handle file;
  uint32_t size;

  uint32_t d(uint32_t at) const { return header.u32le(at); }
  uint32_t w(uint32_t at) const { return header.u16le(at); }
  uint32_t b(uint32_t at) const { return header.u8(at); }
  bool text(uint32_t at, std::string_view t) const { return header.matches(at, t); }
  bool extIs(std::string_view e) const { return !ext.empty() && EqualNoCase(ext, e); }
};

bool AnyOf(uint32_t v, std::initializer_list<uint32_t> values) {
  for (uint32_t x : values)
    if (v == x) return true;
  return false;
}

bool AnyTextAt(const Facts& f, uint32_t at, std::span<const std::string_view> texts) {
  for (std::string_view t : texts)
    if (f.text(at, t)) return true;
  return false;
}

bool ExtIn(const Facts& f, std::span<const std::string_view> exts) {
  for (std::string_view e : exts)
    if (f.extIs(e)) return true;
  return false;
}

// ---------------------------------------------------------------------------
// Constant data of the rules.

// Volume labels written at offset 4 of the pod archives of one family of
// racing games; each compares over its own length.
constexpr std::array kVolumeLabels = {
    "GameX POD - Hellbender Trial Version  JRS8"sv,
    "User Interface Trial Version"sv,
    "Startup Fury3 Trial Version"sv,
    "Startup Final Trial Version"sv,
    "Sierra Logging Add-on Track"sv,
    "Fury3 Trial Version Egypt2"sv,
    "MTM2 Trial Version Trucks"sv,
    "Snowy Canyon Add-on Track"sv,
    "Crazier 8 Add-on track"sv,
    "Startup Trial Version"sv,
    "Disk Version 1.1 Gold"sv,
    "Trucks Trial Version"sv,
    "Cockpits are cool..."sv,
    "Vroooooooom  (Trial)"sv,
    "Music Trial Version"sv,
    "Game Trial Version"sv,
    "TV 1.2 Shareware"sv,
    "Startup 1.1 Gold"sv,
    "UI Trial Version"sv,
    "CDROM 1.1 Gold"sv,
    "Startup MTM2"sv,
    "FM"sv,
};

// The fixed 56-byte directories that open the named palette images: three
// variants of the 512 x 512 picture, one of the 512 x 256 picture.
constexpr std::array kSquareImageTemplates = {
    "\x16\x00\x00\x00\x9C\x04\x04\x00\xFF\xFF\x03\x10\x01\x00\x00\x00\x04\x00\x00\x00\xFF\xFF\x03"
    "\x10\x01\x00\x00\x00\x15\x00\x00\x00\x74\x04\x04\x00\xFF\xFF\x03\x10\x01\x00\x00\x00\x5C\x04"
    "\x04\x00\xFF\xFF\x03\x10\x08\x00\x00\x00"sv,
    "\x16\x00\x00\x00\x9C\x04\x04\x00\xFF\xFF\x02\x0C\x01\x00\x00\x00\x04\x00\x00\x00\xFF\xFF\x02"
    "\x0C\x01\x00\x00\x00\x15\x00\x00\x00\x74\x04\x04\x00\xFF\xFF\x02\x0C\x01\x00\x00\x00\x5C\x04"
    "\x04\x00\xFF\xFF\x02\x0C\x08\x00\x00\x00"sv,
    "\x16\x00\x00\x00\x9C\x04\x04\x00\xFF\xFF\x01\x04\x01\x00\x00\x00\x04\x00\x00\x00\xFF\xFF\x01"
    "\x04\x01\x00\x00\x00\x15\x00\x00\x00\x74\x04\x04\x00\xFF\xFF\x01\x04\x01\x00\x00\x00\x5C\x04"
    "\x04\x00\xFF\xFF\x01\x04\x08\x00\x00\x00"sv,
};
constexpr std::array kWideImageTemplates = {
    "\x16\x00\x00\x00\x9C\x04\x02\x00\xFF\xFF\x02\x0C\x01\x00\x00\x00\x04\x00\x00\x00\xFF\xFF\x02"
    "\x0C\x01\x00\x00\x00\x15\x00\x00\x00\x74\x04\x02\x00\xFF\xFF\x02\x0C\x01\x00\x00\x00\x5C\x04"
    "\x02\x00\xFF\xFF\x02\x0C\x08\x00\x00\x00"sv,
};

constexpr bool TemplatesAreWhole() {
  for (std::string_view t : kSquareImageTemplates)
    if (t.size() != 56) return false;
  return kWideImageTemplates[0].size() == 56;
}
static_assert(TemplatesAreWhole(), "a directory template is not 56 bytes long");

// Section names of the texture bundles: the three-section bundles name their
// first section at 36, the bundles with separate palettes too, and the
// bundles with a leading block name it at 84.
constexpr std::array kThreeSectionNames = {"CARTEXTURES"sv, "TRACKSELECT"sv, "MAGAZINES"sv,
                                           "DYNAMIC"sv,     "VINYL"sv,       "HUD"sv};
constexpr std::array kPaletteBundleNames = {"GLOBALMESSAGE"sv, "ROAD_SEGMENT"sv, "GLOBAL"sv,
                                            "INGAME"sv, "TRACK"sv};
constexpr std::array kLeadingBlockNames = {"GLOBALMESSAGE"sv, "PLATFORMCRIB"sv, "FRONTEND"sv,
                                           "PARTICLE"sv,      "DRIVER"sv,       "GLOBAL"sv,
                                           "INGAME"sv,        "Region"sv};

// Extensions under which the width-only 16-bit pictures are found.
constexpr std::array kWidthOnlyPictureExts = {".anm"sv, ".bin"sv, ".img"sv, ".msk"sv};

// ---------------------------------------------------------------------------
// Reads from the file and companion files.

// `count` bytes of the archive at `position` (computed, so possibly before
// the start of the file); false for such a position and for a short read.
bool ReadFromFile(const Facts& f, int64_t position, uint8_t* out, uint32_t count) {
  if (position < 0 || position > int64_t{UINT32_MAX}) return false;
  return ReadAt(f.file, out, static_cast<uint32_t>(position), count);
}

bool FileU32(const Facts& f, int64_t position, uint32_t& value) {
  std::array<uint8_t, 4> v{};
  if (!ReadFromFile(f, position, v.data(), v.size())) return false;
  value = ByteView(v.data(), v.size()).u32le(0);
  return true;
}

// The archive has extension `archiveExt` and a companion with `companionExt`
// beside it that opens (and, when `firstBytes` is given, begins with them).
// The companion is closed again before the next rule.
bool HasCompanion(const Facts& f, std::string_view companionExt, std::string_view archiveExt,
                  std::string_view firstBytes = {}) {
  if (f.size == 0 || !f.extIs(archiveExt)) return false;
  const std::string p = CompanionPath(f.path, companionExt);
  std::array<uint8_t, 16> head{};
  if (p.empty() || firstBytes.size() > head.size()) return false;
  const File companion(os::OpenShared(p.c_str()));
  if (!companion) return false;
  const auto n = static_cast<uint32_t>(firstBytes.size());
  return n == 0 || (ReadAt(companion.get(), head.data(), 0, n) &&
                    ByteView(head.data(), n).matches(0, firstBytes));
}

// ---------------------------------------------------------------------------
// Rules that need more than one line.

// An offset-and-name directory ending in an empty name: the directory at d0
// is preceded by a zero word and, five bytes before that, the file size.
bool EmptyNameDirectory(const Facts& f) {
  const uint32_t at = f.d(0);
  uint32_t zero = 0, size = 0;
  return at < f.size && FileU32(f, int64_t{at} - 4, zero) && zero == 0 &&
         FileU32(f, int64_t{at} - 9, size) && size == f.size;
}

// A chained directory: a name at 4, then the first entry's offset (d0 + 4)
// and size, then the second name and the second entry's offset, which is
// where the first entry ends. Both names must end inside the header.
bool ChainedDirectory(const Facts& f) {
  const auto p = static_cast<uint32_t>(f.header.cstr(4, kHeaderSize).size());
  const auto q = static_cast<uint32_t>(f.header.cstr(p + 13, kHeaderSize).size());
  return f.d(p + 5) == f.d(0) + 4 && f.d(p + 5) + f.d(p + 9) == f.d(p + q + 14);
}

// The description block of the space-terminated-name directories at 256.
bool DescribedDirectory(const Facts& f) {
  std::array<uint8_t, 16> v{};
  return ReadFromFile(f, 256, v.data(), v.size()) &&
         ByteView(v.data(), v.size()).matches(0, "PSVDSC_V2.00\r\n\r\n"sv);
}

// The six bytes just before the position that d0 names are a byte of at
// least 0x20 and five zeros.
bool TableEndBeforeData(const Facts& f) {
  std::array<uint8_t, 6> v{};
  if (!ReadFromFile(f, int64_t{f.d(0)} - 6, v.data(), v.size())) return false;
  const ByteView t(v.data(), v.size());
  return t.u8(0) >= 0x20 && t.matches(1, "\0\0\0\0\0"sv);
}

// d0 records of 136 bytes from 4; the word at 132 points right behind them.
bool RecordsOf136(const Facts& f) {
  uint32_t v = 0;
  return FileU32(f, 132, v) && 136 * f.d(0) == v - 4;
}

// A 16-bit picture with a 22-byte "TEX" header: width at 6 and height at 10,
// and the pixels fit the file.
bool TexPicture(const Facts& f) {
  return 2 * f.d(6) * f.d(10) <= f.size - 22 && f.text(0, "TEX\0\x01\0"sv);
}

// A count at 0 and an offset table from 4 whose first offset points right
// behind the table. The table must fit a 32-bit file, so the product does not
// wrap: a count of 0xFFFFFFFF with a first offset of 0 is the image lists'
// marker, not a table.
bool OffsetTableAfterCount(const Facts& f) {
  return uint64_t{4} * f.d(0) + 4 == f.d(4);
}

bool ThousandsAt6(const Facts& f) {
  return AnyOf(f.w(6), {1000, 2000, 3000, 4000, 5000, 6000});
}

// ---------------------------------------------------------------------------
// The rule chain, in the order the rules are tried.

struct Rule {
  FormatId id;
  bool (*holds)(const Facts&);
};

constexpr Rule kRules[] = {
    {145,
     [](const Facts& f) {
       return f.text(0, "NetImmerse File Format, "sv) && f.text(52, "NiPixelData"sv) &&
              AnyOf(f.b(83), {8, 24, 32});
     }},
    {97,
     [](const Facts& f) {
       return f.text(0, "BIGF"sv) && AnyOf(f.d(12), {2048, 64});
     }},
    {132, [](const Facts& f) { return f.text(0, "BIGF"sv) && f.d(8) != 0; }},
    {133, [](const Facts& f) { return f.text(0, "BIGF"sv); }},
    {99, [](const Facts& f) { return AnyTextAt(f, 0, kSquareImageTemplates); }},
    {100, [](const Facts& f) { return AnyTextAt(f, 0, kWideImageTemplates); }},
    {117, [](const Facts& f) { return f.d(0) == 0xDD72DD12 && f.d(4) == 3; }},
    {104, [](const Facts& f) { return AnyTextAt(f, 4, kVolumeLabels); }},
    {123, [](const Facts& f) { return AnyTextAt(f, 36, kThreeSectionNames); }},
    {124, [](const Facts& f) { return AnyTextAt(f, 36, kPaletteBundleNames); }},
    {157, [](const Facts& f) { return AnyTextAt(f, 84, kLeadingBlockNames); }},
    // Tagged chunk streams; this takes every header that starts with zero.
    {146,
     [](const Facts& f) {
       return AnyOf(f.d(0), {0, 0x80134000, 0xB3300000, 0x00E34010, 0x00E34009, 0x00135200});
     }},
    // The 22-byte-header pictures: ".565" ones are offered as BMP, the others as TGA.
    {140, [](const Facts& f) { return TexPicture(f) && f.extIs(".565"); }},
    {139, TexPicture},
    {111, [](const Facts& f) { return f.text(0, "TGL\0"sv) && f.d(8) == f.size; }},
    {112, [](const Facts& f) { return f.text(0, "KPS\0"sv) && f.d(8) + 8 == f.size; }},
    {113, [](const Facts& f) { return f.d(0) == 0x80C381D7; }},
    {80, [](const Facts& f) { return f.d(0) == 0x20030507; }},
    {116, [](const Facts& f) { return f.d(0) == 0x7B2B0A68 && f.d(4) == 0x7CE2FF0A; }},
    // A zlib stream at 4.
    {120, [](const Facts& f) { return f.d(4) == 0xBDEC9C78; }},
    {154,
     [](const Facts& f) {
       return f.text(32, "\x20\xA2\xA1\x99\x20\xA2\xA1\x99\x20\xA2\xA1\x99\x20\xA2\xA1\x99"sv) &&
              !f.extIs(".psc");
     }},
    {155, [](const Facts& f) { return f.text(0, "XXXX"sv) && f.text(8, "XXXXXXXX"sv); }},
    {153, EmptyNameDirectory},
    {151, [](const Facts& f) { return f.d(0) == f.d(4) * f.d(8) && f.d(0) == f.size - 780; }},
    {152, [](const Facts& f) { return f.d(0) == 3 * f.d(4) * f.d(8) && f.d(0) == f.size - 12; }},
    {85, [](const Facts& f) { return f.d(44) == 48 * f.d(0) + 4; }},
    {86, [](const Facts& f) { return f.d(44) == 44 * f.d(0) + 4; }},
    {87, [](const Facts& f) { return f.w(2) == 5 && f.d(4) != 0 && f.d(4) == f.d(8); }},
    {88, [](const Facts& f) { return f.w(0) == 3 && f.d(4) == 0 && 22 * f.w(2) == f.d(22) - 8; }},
    {89, [](const Facts& f) { return 88 * f.d(0) == f.d(84) - 4; }},
    {92, [](const Facts& f) { return f.d(4) - f.d(0) == 8192 && f.d(8) == 3 && f.d(12) == 4; }},
    {93, [](const Facts& f) { return f.d(4) == f.d(8) && 4 * f.d(12) == f.size - f.d(8); }},
    {94,
     [](const Facts& f) { return f.d(0) == 24 && 4 * f.w(4) == f.d(8) - 8 && ThousandsAt6(f); }},
    {95,
     [](const Facts& f) { return f.d(0) == 25 && 4 * f.w(4) == f.d(8) - 8 && ThousandsAt6(f); }},
    {96, ChainedDirectory},
    {98, [](const Facts& f) { return HasCompanion(f, ".dir"sv, ".img"sv); }},
    {108, [](const Facts& f) { return HasCompanion(f, ".rfh"sv, ".rfd"sv); }},
    {121, [](const Facts& f) { return HasCompanion(f, ".dir"sv, ".pak"sv); }},
    {143, [](const Facts& f) { return HasCompanion(f, ".fat"sv, ".big"sv); }},
    {126, [](const Facts& f) { return HasCompanion(f, ".idx"sv, ".bag"sv, "GABA\x02\0\0\0"sv); }},
    {119, DescribedDirectory},
    {90, TableEndBeforeData},
    {102, [](const Facts& f) { return f.d(4) + f.d(8) == f.d(16) && f.d(0) == 0x2DA2DF95; }},
    {103,
     [](const Facts& f) {
       return f.d(12) + f.d(16) == f.d(32) && f.d(36) + f.d(32) == f.d(52) &&
              f.d(56) + f.d(52) == f.d(72) && f.d(32) != 0 && f.d(52) != 0 && f.d(72) != 0;
     }},
    {105,
     [](const Facts& f) {
       return f.d(16) + f.d(20) == f.d(42) && f.d(38) + f.d(42) == f.d(64) &&
              f.d(60) + f.d(64) == f.d(86) && f.w(0) != 0 && f.d(42) != 0 && f.d(64) != 0 &&
              f.d(86) != 0;
     }},
    {101, [](const Facts& f) { return f.extIs(".adf"sv) && f.b(0) == 0xDD; }},
    {118, RecordsOf136},
    {109, [](const Facts& f) { return f.b(0) == 1 && f.d(1) + 9 == f.size && f.extIs(".jaz"sv); }},
    {106,
     [](const Facts& f) {
       return f.b(0) <= 1 && f.d(1) < f.size && (f.extIs(".pak"sv) || f.extIs(".dat"sv));
     }},
    {107, [](const Facts& f) { return f.extIs(".pbo"sv) && f.b(0) >= 0x20; }},
    {142, [](const Facts& f) { return f.extIs(".wd"sv) && f.text(0, "\x78\x9C"sv); }},
    {149, [](const Facts& f) { return 2 * f.d(4) * f.d(8) <= f.size + 28 && f.extIs(".rsb"sv); }},
    {127, [](const Facts& f) { return f.b(8) <= 1 && f.extIs(".frame"sv); }},
    {128,
     [](const Facts& f) {
       return f.b(12) <= 1 && f.d(0) < 256 && f.d(4) < 256 && f.d(8) < 256 &&
              f.extIs(".sequence"sv);
     }},
    {129, [](const Facts& f) { return f.b(0) <= 1 && f.extIs(".sequence"sv); }},
    {156, [](const Facts& f) { return f.d(0) == f.d(4) && f.d(4) != 0 && f.extIs(".meg"sv); }},
    {114, [](const Facts& f) { return f.extIs(".rss"sv); }},
    {115, [](const Facts& f) { return f.extIs(".mult"sv); }},
    {125,
     [](const Facts& f) {
       return f.extIs(".qfs"sv) && AnyOf(f.b(0), {0x10, 0x11}) && f.b(1) == 0xFB;
     }},
    {131, [](const Facts& f) { return f.extIs(".syj"sv) && f.text(0, "\0\x01"sv); }},
    {110, OffsetTableAfterCount},
    {122, [](const Facts& f) { return f.d(0) == f.size && 56 * f.d(4) <= f.size; }},
    {134, [](const Facts& f) { return f.extIs(".555"sv) && f.d(0) != 0; }},
    {135, [](const Facts& f) { return f.extIs(".r8"sv) && f.b(0) == 1; }},
    {136, [](const Facts& f) { return f.extIs(".r8"sv) && f.b(8) == 1; }},
    {137, [](const Facts& f) { return f.extIs(".r16"sv) && f.b(0) == 1; }},
    {138, [](const Facts& f) { return f.extIs(".r16"sv) && f.b(8) == 1; }},
    {144, [](const Facts& f) { return f.extIs(".bf"sv); }},
    {148, [](const Facts& f) { return f.extIs(".wd"sv); }},
    {150, [](const Facts& f) { return f.extIs(".pck"sv); }},
    {141,
     [](const Facts& f) {
       return ExtIn(f, kWidthOnlyPictureExts) && f.d(4) != 0 && f.d(8) != 0 && f.d(0) == 100;
     }},
    {147, [](const Facts& f) { return f.extIs(".clz"sv) && f.text(4, "\x78\xDA"sv); }},
    // The image lists open with 0xFFFFFFFF 0.
    {81,
     [](const Facts& f) {
       return f.d(0) == 0xFFFFFFFF && f.d(4) == 0 && f.d(8) == 0 && f.d(12) == 80;
     }},
    {84,
     [](const Facts& f) {
       return f.d(0) == 0xFFFFFFFF && f.d(4) == 0 && f.d(8) == 32 && f.d(20) > 1;
     }},
    {82, [](const Facts& f) { return f.d(0) == 0xFFFFFFFF && f.d(4) == 0 && f.d(8) == 32; }},
    {83,
     [](const Facts& f) {
       return f.d(64) == 0xFFFFFFFF && f.d(68) == 0 && f.d(72) == 32 && f.d(96) == 0xFFFFFFFF &&
              f.d(100) == 0;
     }},
};

// The tests of 91 and 130 look only at headers whose first word is 0, so
// they are left out of the chain.
constexpr std::string_view kFirstWordZero =
    "a header whose first word is 0 is always taken as a tagged chunk stream (146)";
constexpr std::array<UnreachableFormat, 2> kUnreachable = {{
    {91, kFirstWordZero},
    {130, kFirstWordZero},
}};

}  // namespace

std::span<const UnreachableFormat> UnreachableFormats() {
  return kUnreachable;
}

FormatId DetectByRules(ByteView header, std::string_view path, os::Handle h, uint32_t size) {
  const Facts f{header, path, PathExtension(path), h, size};
  for (const Rule& r : kRules) {
    try {
      if (r.holds(f)) return r.id;
    } catch (const BadData&) {
      // A value outside the header: this rule cannot hold.
    }
  }
  return 0;
}

}  // namespace cairn
