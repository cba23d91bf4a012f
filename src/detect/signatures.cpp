// The first stage of recognition: magics at offset 0.
//
// Row n of the table stands for FormatId n and the rows are tried in order,
// so a magic that begins with an earlier row's magic is never reached. Row 70
// has no magic of its own: "PACK" directory archives begin like the "PACK"
// compressed files of row 7 and are told apart by the directory their header
// describes (PackDirectory).
#include <algorithm>
#include <array>
#include <cstddef>

#include "detect/detect.h"
#include "util/file.h"

namespace cairn {
namespace {

using namespace std::string_view_literals;

struct SignatureRow {
  size_t length;  // kept beside each magic so that a mistyped escape cannot go unnoticed
  std::string_view magic;
};

constexpr std::array<SignatureRow, 79> kSignatureRows = {{
    {12, "MHX XS V1.0\0"sv},
    {3, "DIR"sv},
    {8, "FAR!byAZ"sv},
    {4, "WAD2"sv},
    {4, "WAD3"sv},
    {4, "IWAD"sv},
    {4, "PACK"sv},
    {4, "paq\0"sv},
    {4, "AFS\0"sv},
    {4, "LOD\0"sv},
    {4, "CSid"sv},
    {8, "MageGold"sv},
    {14, "archive  V2.2\0"sv},
    {4, "StOR"sv},
    {7, "GLB2.0\0"sv},
    {4, "BIG4"sv},
    {8, "FASTF101"sv},
    {4, "DFP1"sv},
    {8, "\x14\0\0\0PFF2"sv},
    {8, "\x14\0\0\0PFF3"sv},
    {5, "DATOS"sv},
    {4, "SBF0"sv},
    {32, "\x04\0\0\0MASSIVE PAKFILE V 4.0\r\n\0\0\0\0\0"sv},
    {12, "DorbaMistfel"sv},
    {56,
     "Copyright (c) 1997 Ensemble Studios.\x1A\0\0\0"
     "1.00tribe\0\0\0\0\0\0\0"sv},
    {6, "GSCfmt"sv},
    {4, "VXBG"sv},
    {4, "MNA\0"sv},
    {8, "HAK V1.0"sv},
    {4, "CMPR"sv},
    {8, "DWFB\x02\0\0\0"sv},
    {8, "F5CD\x14\0\x02\0"sv},
    {8, "IPF1\x14\0\x02\0"sv},
    {4, "PWAD"sv},
    {8, "Nemo Fi\0"sv},
    {4, "\xC1\x83\x2A\x9E"sv},
    {4, "l33t"sv},
    {4, "PVOL"sv},
    {4, "TR4\0"sv},
    {4, "1XFG"sv},
    {8, "GABA\x04\0\0\0"sv},
    {8, "\xCE\x0A\x89\x51\x03\0\0\0"sv},
    {10, "H4CAMPAIGN"sv},
    {4, "H4R\x05"sv},
    {8, "ACTRHEAD"sv},
    {24, "SNOK_DATAFILE_KEEP_OUT!\x1A"sv},
    {4, "AVIX"sv},
    {8, "\x72\x10\xEA\xF4\0\0\0\0"sv},
    {13, "PALETTEFILES "sv},
    {5, "JDLZ\x02"sv},
    {31,
     "\x55\x42\x56\x9E\x01\xF1\x53\x4B\xFE\xD0\x42\x1E\x4B\x4D\xDD\x78"
     "\xF1\x41\x01\x78\x80\x08\x9E\x38\x1F\x13\xA8\xD3\x6C\xFC\x42"sv},
    {4, "BIG\0"sv},
    {8, "_ARCHIVE"sv},
    {8, "\r\nRezMgr"sv},
    {8, "\x01\x00\x00\x10\x02\x44\xAC\x00"sv},
    {20, "CPAL savegame 3.3\n\n\0"sv},
    {41, "Centauri Production Resource File 3.00\n\n\0"sv},
    {56, "MUDGE4.008/27/2000Copyright by Witan Entertainment B.V.\0"sv},
    {4, "AWAD"sv},
    {4, "MJZ0"sv},
    {9, "MH3 V1.0 "sv},
    {4, "VER2"sv},
    {8, "MQDB\0\0\0\0"sv},
    {4, "ezd\xFF"sv},
    {8, "\x15\xC5\x3B\x5E\x9A\xA8\x14\xF3"sv},
    {8, "\x72\x7D\xC4\xA1\x9E\xA8\x14\xF3"sv},
    {4, "MIX1"sv},
    {4, "THU3"sv},
    {4, "SDPA"sv},
    {0, {}},  // "PACK" directory archive, see PackDirectory
    {8, "TEX\0\x01\0\0\0"sv},
    {8, "TEX\0\x02\0\0\0"sv},
    {16, "xcr File 1.00\0\0\0"sv},
    {8, "LP1C\0\0\0\0"sv},
    {4, "ISD0"sv},
    {4, "PK\x04\0"sv},
    {8, "LGR12M\0\0"sv},
    {4, "IMG\x1A"sv},
    {8, "VTF\0\x07\0\0\0"sv},
}};

constexpr bool LengthsAgree() {
  for (const SignatureRow& r : kSignatureRows)
    if (r.magic.size() != r.length || (r.length != 0 && (r.length < 3 || r.length > kHeaderSize)))
      return false;
  return true;
}
static_assert(LengthsAgree(), "a magic differs from its stated length");

constexpr std::array<Signature, 79> MakeTable() {
  std::array<Signature, 79> t{};
  for (size_t i = 0; i < t.size(); ++i)
    t[i] = {static_cast<FormatId>(i + 1), kSignatureRows[i].magic};
  return t;
}
constexpr std::array<Signature, 79> kSignatures = MakeTable();

// A "PACK" file holds a directory of 64-byte records (name[56], offset,
// size) rather than one compressed stream when its header describes one that
// can be read: the offset at 4 lies behind the 12-byte header, the byte size
// at 8 is a whole number of records, the directory lies inside the file, and
// its first records (one read of at most two) hold a printable name that ends
// inside its field and an entry that lies inside the file.
bool PackDirectory(ByteView header, os::Handle h, uint32_t size) {
  constexpr uint32_t kRecord = 64, kNameWidth = 56;
  if (!header.has(0, 12)) return false;
  const uint32_t at = header.u32le(4), length = header.u32le(8);
  if (at < 12 || length == 0 || length % kRecord != 0 || uint64_t{at} + length > size) return false;
  std::array<uint8_t, 2 * kRecord> first{};
  const uint32_t n = std::min<uint32_t>(length, first.size());
  if (!ReadAt(h, first.data(), at, n)) return false;
  for (uint32_t r = 0; r < n; r += kRecord) {
    const ByteView record(first.data() + r, kRecord);
    const std::string_view name = record.field(0, kNameWidth);
    const bool printable = std::all_of(name.begin(), name.end(), [](char c) {
      return static_cast<uint8_t>(c) >= 0x20 && static_cast<uint8_t>(c) <= 0x7E;
    });
    if (name.empty() || name.size() == kNameWidth || !printable ||
        uint64_t{record.u32le(kNameWidth)} + record.u32le(kNameWidth + 4) > size)
      return false;
  }
  return true;
}

}  // namespace

std::span<const Signature> SignatureTable() {
  return kSignatures;
}

FormatId MatchSignature(ByteView header) {
  for (const Signature& s : kSignatures)
    if (!s.magic.empty() && header.matches(0, s.magic)) return s.id;
  return 0;
}

FormatId DetectFormat(ByteView header, std::string_view path, os::Handle h) {
  const uint32_t size = os::SizeLow(h);
  const FormatId id = MatchSignature(header);
  if (id == 7 && PackDirectory(header, h, size)) return 70;
  if (id != 0) return id;
  return DetectByRules(header, path, h, size);
}

}  // namespace cairn
