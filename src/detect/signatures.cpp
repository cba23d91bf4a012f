// The first stage of recognition: magics at offset 0.
//
// Row n of the table stands for FormatId n and the rows are tried in order,
// so a magic that begins with an earlier row's magic is never reached: "PACK"
// (row 7) takes every header that the longer "PACK" 00 00 of row 70 would.
#include <array>
#include <cstddef>

#include "detect/detect.h"

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
    {6, "PACK\0\0"sv},
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
    if (r.magic.size() != r.length || r.length < 3 || r.length > kHeaderSize) return false;
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

}  // namespace

std::span<const Signature> SignatureTable() {
  return kSignatures;
}

FormatId MatchSignature(ByteView header) {
  for (const Signature& s : kSignatures)
    if (header.matches(0, s.magic)) return s.id;
  return 0;
}

FormatId DetectFormat(ByteView header, std::string_view path, os::Handle h) {
  const uint32_t size = os::SizeLow(h);
  if (const FormatId id = MatchSignature(header)) return id;
  return DetectByRules(header, path, h, size);
}

}  // namespace cairn
