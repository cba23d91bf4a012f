#include "detect_fixtures.h"

#include <cstdint>
#include <stdexcept>

namespace cairn::test {
namespace {

// 104 header bytes that no rule takes: "AAAA" (a first word that is neither
// zero nor a count, offset or size that fits the file) and zeros.
ArchiveBuilder Plain() {
  return ArchiveBuilder().text("AAAA");
}

DetectCase Case(FormatId id, std::string fileName, ArchiveBuilder b, size_t size = 104) {
  return {id, std::move(fileName), b.padTo(size).get(), {}};
}

DetectCase WithCompanion(DetectCase c, std::string name, Bytes bytes) {
  c.companions.emplace_back(std::move(name), std::move(bytes));
  return c;
}

// The magics, row by row; row 70 is hidden behind row 7.
struct MagicRow {
  FormatId id;
  const char* hex;
};
constexpr MagicRow kMagics[] = {
    {1, "4D 48 58 20 58 53 20 56 31 2E 30 00"},
    {2, "44 49 52"},
    {3, "46 41 52 21 62 79 41 5A"},
    {4, "57 41 44 32"},
    {5, "57 41 44 33"},
    {6, "49 57 41 44"},
    {7, "50 41 43 4B"},
    {8, "70 61 71 00"},
    {9, "41 46 53 00"},
    {10, "4C 4F 44 00"},
    {11, "43 53 69 64"},
    {12, "4D 61 67 65 47 6F 6C 64"},
    {13, "61 72 63 68 69 76 65 20 20 56 32 2E 32 00"},
    {14, "53 74 4F 52"},
    {15, "47 4C 42 32 2E 30 00"},
    {16, "42 49 47 34"},
    {17, "46 41 53 54 46 31 30 31"},
    {18, "44 46 50 31"},
    {19, "14 00 00 00 50 46 46 32"},
    {20, "14 00 00 00 50 46 46 33"},
    {21, "44 41 54 4F 53"},
    {22, "53 42 46 30"},
    {23,
     "04 00 00 00 4D 41 53 53 49 56 45 20 50 41 4B 46 49 4C 45 20 56 20 34 2E 30 0D 0A 00 00 00 00 "
     "00"},
    {24, "44 6F 72 62 61 4D 69 73 74 66 65 6C"},
    {25,
     "43 6F 70 79 72 69 67 68 74 20 28 63 29 20 31 39 39 37 20 45 6E 73 65 6D 62 6C 65 20 53 74 75 "
     "64 69 6F 73 2E 1A 00 00 00 31 2E 30 30 74 72 69 62 65 00 00 00 00 00 00 00"},
    {26, "47 53 43 66 6D 74"},
    {27, "56 58 42 47"},
    {28, "4D 4E 41 00"},
    {29, "48 41 4B 20 56 31 2E 30"},
    {30, "43 4D 50 52"},
    {31, "44 57 46 42 02 00 00 00"},
    {32, "46 35 43 44 14 00 02 00"},
    {33, "49 50 46 31 14 00 02 00"},
    {34, "50 57 41 44"},
    {35, "4E 65 6D 6F 20 46 69 00"},
    {36, "C1 83 2A 9E"},
    {37, "6C 33 33 74"},
    {38, "50 56 4F 4C"},
    {39, "54 52 34 00"},
    {40, "31 58 46 47"},
    {41, "47 41 42 41 04 00 00 00"},
    {42, "CE 0A 89 51 03 00 00 00"},
    {43, "48 34 43 41 4D 50 41 49 47 4E"},
    {44, "48 34 52 05"},
    {45, "41 43 54 52 48 45 41 44"},
    {46, "53 4E 4F 4B 5F 44 41 54 41 46 49 4C 45 5F 4B 45 45 50 5F 4F 55 54 21 1A"},
    {47, "41 56 49 58"},
    {48, "72 10 EA F4 00 00 00 00"},
    {49, "50 41 4C 45 54 54 45 46 49 4C 45 53 20"},
    {50, "4A 44 4C 5A 02"},
    {51,
     "55 42 56 9E 01 F1 53 4B FE D0 42 1E 4B 4D DD 78 F1 41 01 78 80 08 9E 38 1F 13 A8 D3 6C FC "
     "42"},
    {52, "42 49 47 00"},
    {53, "5F 41 52 43 48 49 56 45"},
    {54, "0D 0A 52 65 7A 4D 67 72"},
    {55, "01 00 00 10 02 44 AC 00"},
    {56, "43 50 41 4C 20 73 61 76 65 67 61 6D 65 20 33 2E 33 0A 0A 00"},
    {57,
     "43 65 6E 74 61 75 72 69 20 50 72 6F 64 75 63 74 69 6F 6E 20 52 65 73 6F 75 72 63 65 20 46 69 "
     "6C 65 20 33 2E 30 30 0A 0A 00"},
    {58,
     "4D 55 44 47 45 34 2E 30 30 38 2F 32 37 2F 32 30 30 30 43 6F 70 79 72 69 67 68 74 20 62 79 20 "
     "57 69 74 61 6E 20 45 6E 74 65 72 74 61 69 6E 6D 65 6E 74 20 42 2E 56 2E 00"},
    {59, "41 57 41 44"},
    {60, "4D 4A 5A 30"},
    {61, "4D 48 33 20 56 31 2E 30 20"},
    {62, "56 45 52 32"},
    {63, "4D 51 44 42 00 00 00 00"},
    {64, "65 7A 64 FF"},
    {65, "15 C5 3B 5E 9A A8 14 F3"},
    {66, "72 7D C4 A1 9E A8 14 F3"},
    {67, "4D 49 58 31"},
    {68, "54 48 55 33"},
    {69, "53 44 50 41"},
    {71, "54 45 58 00 01 00 00 00"},
    {72, "54 45 58 00 02 00 00 00"},
    {73, "78 63 72 20 46 69 6C 65 20 31 2E 30 30 00 00 00"},
    {74, "4C 50 31 43 00 00 00 00"},
    {75, "49 53 44 30"},
    {76, "50 4B 04 00"},
    {77, "4C 47 52 31 32 4D 00 00"},
    {78, "49 4D 47 1A"},
    {79, "56 54 46 00 07 00 00 00"},
};

// The fixed 56-byte directories of the named palette images.
constexpr const char* kSquareTemplate =
    "16 00 00 00 9C 04 04 00 FF FF 03 10 01 00 00 00 04 00 00 00 FF FF 03 10 01 00 00 00 "
    "15 00 00 00 74 04 04 00 FF FF 03 10 01 00 00 00 5C 04 04 00 FF FF 03 10 08 00 00 00";
constexpr const char* kWideTemplate =
    "16 00 00 00 9C 04 02 00 FF FF 02 0C 01 00 00 00 04 00 00 00 FF FF 02 0C 01 00 00 00 "
    "15 00 00 00 74 04 02 00 FF FF 02 0C 01 00 00 00 5C 04 02 00 FF FF 02 0C 08 00 00 00";

}  // namespace

Bytes FromHex(std::string_view hex) {
  Bytes b;
  for (size_t i = 0; i < hex.size();) {
    if (hex[i] == ' ') {
      ++i;
      continue;
    }
    if (i + 1 >= hex.size()) throw std::invalid_argument("odd hex digit");
    b.push_back(static_cast<uint8_t>(std::stoul(std::string(hex.substr(i, 2)), nullptr, 16)));
    i += 2;
  }
  return b;
}

std::vector<DetectCase> DetectCases() {
  std::vector<DetectCase> v;
  for (const MagicRow& m : kMagics)
    v.push_back(Case(m.id, "sample.res", ArchiveBuilder().bytes(FromHex(m.hex))));

  // Sheet archive: its first word.
  v.push_back(Case(80, "sample.res", ArchiveBuilder().u32(0x20030507)));
  // Image lists: 0xFFFFFFFF 0, then the header word that tells them apart.
  v.push_back(Case(81, "sample.res", ArchiveBuilder().u32(0xFFFFFFFF).u32(0).u32(0).u32(80)));
  v.push_back(Case(82, "sample.res", ArchiveBuilder().u32(0xFFFFFFFF).u32(0).u32(32)));
  v.push_back(Case(83, "sample.res",
                   ArchiveBuilder()
                       .u32(1)
                       .padTo(64)
                       .u32(0xFFFFFFFF)
                       .u32(0)
                       .u32(32)
                       .padTo(96)
                       .u32(0xFFFFFFFF)
                       .u32(0)));
  v.push_back(
      Case(84, "sample.res", ArchiveBuilder().u32(0xFFFFFFFF).u32(0).u32(32).padTo(20).u32(2)));
  // 40-byte-name directories: count at 0, the first data offset at 44.
  v.push_back(Case(85, "sample.res", ArchiveBuilder().u32(2).padTo(44).u32(2 * 48 + 4)));
  v.push_back(Case(86, "sample.res", ArchiveBuilder().u32(2).padTo(44).u32(2 * 44 + 4)));
  // 27-byte records after a 16-bit count of 1: 5 at 2, the same word at 4 and 8.
  v.push_back(Case(87, "sample.res", ArchiveBuilder().u16(1).u16(5).u32(7).u32(7)));
  // 8.3 names: 3, a count of 2 and the first data offset behind two records.
  v.push_back(Case(88, "sample.res", ArchiveBuilder().u16(3).u16(2).u32(0).padTo(22).u32(52)));
  // 80-byte names: one record, the first data offset at 84.
  v.push_back(Case(89, "sample.res", ArchiveBuilder().u32(1).padTo(84).u32(92)));
  // Derived sizes: the table ends in "A" and five zeros just before 120.
  v.push_back(Case(90, "sample.res", ArchiveBuilder().u32(120).padTo(114).u8('A'), 128));
  // Tagged chunks with an offset table.
  v.push_back(Case(92, "sample.res", ArchiveBuilder().u32(16).u32(16 + 8192).u32(3).u32(4)));
  // Offset table at the end: 16 slots from 64 to the end of a 128-byte file.
  v.push_back(Case(93, "sample.res", ArchiveBuilder().u32(7).u32(64).u32(64).u32(16), 128));
  // Numbered offset tables: 3 slots and a multiple of 1000.
  v.push_back(Case(94, "sample.res", ArchiveBuilder().u32(24).u16(3).u16(1000).u32(20)));
  v.push_back(Case(95, "sample.res", ArchiveBuilder().u32(25).u16(3).u16(6000).u32(20)));
  // Chained names in a 100-byte directory: "A" at 104 for 10 bytes, then "B" at 114.
  v.push_back(Case(
      96, "sample.res",
      ArchiveBuilder().u32(100).text("A").u8(0).u32(104).u32(10).text("B").u8(0).u32(114), 124));
  v.push_back(Case(97, "sample.res", ArchiveBuilder().text("BIGF").u32(0).u32(1).u32(64)));
  v.push_back(WithCompanion(Case(98, "sample.img", Plain()), "sample.dir", Pattern(16)));
  v.push_back(Case(99, "sample.res", ArchiveBuilder().bytes(FromHex(kSquareTemplate))));
  v.push_back(Case(100, "sample.res", ArchiveBuilder().bytes(FromHex(kWideTemplate))));
  v.push_back(Case(101, "sample.adf", ArchiveBuilder().u8(0xDD).text("AAA")));
  v.push_back(
      Case(102, "sample.res", ArchiveBuilder().u32(0x2DA2DF95).u32(1).u32(2).u32(0).u32(3)));
  // Name table: three running sums of lengths.
  v.push_back(Case(
      103, "sample.res",
      Plain().padTo(12).u32(1).u32(2).padTo(32).u32(3).u32(4).padTo(52).u32(7).u32(8).padTo(72).u32(
          15)));
  v.push_back(Case(104, "sample.res", Plain().text("FM")));
  v.push_back(Case(
      105, "sample.res",
      Plain().padTo(16).u32(1).u32(2).padTo(38).u32(4).u32(3).padTo(60).u32(8).u32(7).padTo(86).u32(
          15)));
  v.push_back(Case(106, "sample.dat", ArchiveBuilder().u8(0).u32(50)));
  v.push_back(Case(107, "sample.pbo", Plain()));
  v.push_back(WithCompanion(Case(108, "sample.rfd", Plain()), "sample.rfh", Pattern(8)));
  v.push_back(Case(109, "sample.jaz", ArchiveBuilder().u8(1).u32(104 - 9)));
  v.push_back(Case(110, "sample.res", ArchiveBuilder().u32(2).u32(12)));
  v.push_back(Case(111, "sample.res", ArchiveBuilder().text("TGL").u8(0).u32(0).u32(104)));
  v.push_back(Case(112, "sample.res", ArchiveBuilder().text("KPS").u8(0).u32(0).u32(96)));
  v.push_back(Case(113, "sample.res", ArchiveBuilder().u32(0x80C381D7)));
  v.push_back(Case(114, "sample.rss", Plain()));
  v.push_back(Case(115, "sample.mult", Plain()));
  v.push_back(Case(116, "sample.res", ArchiveBuilder().u32(0x7B2B0A68).u32(0x7CE2FF0A)));
  v.push_back(Case(117, "sample.res", ArchiveBuilder().u32(0xDD72DD12).u32(3)));
  // 136-byte records: one of them, its data offset at 132 pointing behind it.
  v.push_back(Case(118, "sample.res", ArchiveBuilder().u32(1).padTo(132).u32(140), 136));
  v.push_back(Case(119, "sample.res", Plain().padTo(256).text("PSVDSC_V2.00\r\n\r\n")));
  v.push_back(Case(120, "sample.res", Plain().u8(0x78).u8(0x9C).u8(0xEC).u8(0xBD)));
  v.push_back(WithCompanion(Case(121, "sample.pak", Plain()), "sample.dir", Pattern(8)));
  v.push_back(Case(122, "sample.res", ArchiveBuilder().u32(104).u32(1)));
  v.push_back(Case(123, "sample.res", Plain().padTo(36).text("CARTEXTURES")));
  v.push_back(Case(124, "sample.res", Plain().padTo(36).text("ROAD_SEGMENT")));
  v.push_back(Case(125, "sample.qfs", ArchiveBuilder().u8(0x10).u8(0xFB).text("AA")));
  v.push_back(WithCompanion(Case(126, "sample.bag", Plain()), "sample.idx",
                            ArchiveBuilder().text("GABA").u32(2).u32(0).get()));
  v.push_back(Case(127, "sample.frame", Plain()));
  v.push_back(Case(128, "sample.sequence", ArchiveBuilder().u32(1)));
  v.push_back(Case(129, "sample.sequence", ArchiveBuilder().u8(1).text("AAA")));
  v.push_back(Case(131, "sample.syj", ArchiveBuilder().u8(0).u8(1).text("AA")));
  v.push_back(Case(132, "sample.res", ArchiveBuilder().text("BIGF").u32(0).u32(1)));
  v.push_back(Case(133, "sample.res", ArchiveBuilder().text("BIGF").u32(0).u32(0)));
  v.push_back(Case(134, "sample.555", Plain()));
  v.push_back(Case(135, "sample.r8", ArchiveBuilder().u8(1).text("AAA")));
  v.push_back(Case(136, "sample.r8", Plain().padTo(8).u8(1)));
  v.push_back(Case(137, "sample.r16", ArchiveBuilder().u8(1).text("AAA")));
  v.push_back(Case(138, "sample.r16", Plain().padTo(8).u8(1)));
  // 22-byte-header pictures, 4 x 4 pixels of 16 bits.
  v.push_back(Case(139, "sample.res", ArchiveBuilder().text("TEX").u8(0).u16(1).u32(4).u32(4)));
  v.push_back(Case(140, "sample.565", ArchiveBuilder().text("TEX").u8(0).u16(1).u32(4).u32(4)));
  v.push_back(Case(141, "sample.anm", ArchiveBuilder().u32(100).u32(1).u32(1)));
  v.push_back(Case(142, "sample.wd", ArchiveBuilder().u8(0x78).u8(0x9C).text("AA")));
  v.push_back(WithCompanion(Case(143, "sample.big", Plain()), "sample.fat", Pattern(8)));
  v.push_back(Case(144, "sample.bf", Plain()));
  v.push_back(Case(145, "sample.res",
                   ArchiveBuilder()
                       .text("NetImmerse File Format, ")
                       .padTo(52)
                       .text("NiPixelData")
                       .padTo(83)
                       .u8(24)));
  v.push_back(Case(146, "sample.res", ArchiveBuilder()));
  v.push_back(Case(147, "sample.clz", Plain().u8(0x78).u8(0xDA)));
  v.push_back(Case(148, "sample.wd", Plain()));
  v.push_back(Case(149, "sample.rsb", Plain()));
  v.push_back(Case(150, "sample.pck", Plain()));
  // Headerless pictures: 10 x 10 at 8 bits behind a 780-byte palette block,
  // 6 x 6 at 24 bits behind 12 bytes.
  v.push_back(Case(151, "sample.res", ArchiveBuilder().u32(100).u32(10).u32(10), 880));
  v.push_back(Case(152, "sample.res", ArchiveBuilder().u32(108).u32(6).u32(6), 120));
  // Directory at 120: a zero word before it, the file size five bytes earlier.
  v.push_back(Case(153, "sample.res", ArchiveBuilder().u32(120).padTo(111).u32(128), 128));
  v.push_back(
      Case(154, "sample.res",
           Plain().padTo(32).bytes(FromHex("20 A2 A1 99 20 A2 A1 99 20 A2 A1 99 20 A2 A1 99"))));
  v.push_back(Case(155, "sample.res", ArchiveBuilder().text("XXXX").u32(0).text("XXXXXXXX")));
  v.push_back(Case(156, "sample.meg", ArchiveBuilder().u32(7).u32(7)));
  v.push_back(Case(157, "sample.res", Plain().padTo(84).text("FRONTEND")));
  return v;
}

}  // namespace cairn::test
