#include "detect_fixtures.h"

#include "detect/detect.h"

namespace cairn::test {

Bytes Words(std::initializer_list<std::pair<size_t, uint32_t>> words, size_t size) {
  ArchiveBuilder b = ArchiveBuilder().text("AAAA").padTo(size);
  for (const auto& [at, v] : words) b.patch32(at, v);
  return b.get();
}

std::vector<DetectCase> DetectCases() {
  using B = ArchiveBuilder;
  const Bytes plain = Words({});
  auto image = [](uint32_t w, uint32_t v) {  // the palette images' fixed directory
    B b;
    for (uint32_t x :
         {0x16u, 0x049C | w, v, 1u, 4u, v, 1u, 0x15u, 0x0474 | w, v, 1u, 0x045C | w, v, 8u})
      b.u32(x);
    return Header(b);
  };
  std::vector<DetectCase> v;
  for (const Signature& s : SignatureTable())
    if (!s.magic.empty()) v.push_back({s.id, "a.res", Header(B().text(s.magic))});
  // A "PACK" directory of one record, "a" at 12, 4 bytes long.
  v.insert(v.begin() + 69,
           {70, "a.pak",
            Header(B().text("PACK").u32(16).u32(64).padTo(16).name("a", 56).u32(12).u32(4), 128)});
  const std::vector<DetectCase> rules = {
      {80, "a.res", Header(B().u32(0x20030507))},
      {81, "a.res", Header(B().u32(0xFFFFFFFF).u32(0).u32(0).u32(80))},
      {82, "a.res", Words({{0, 0xFFFFFFFF}, {8, 32}, {20, 1}})},
      {83, "a.res", Words({{0, 1}, {64, 0xFFFFFFFF}, {72, 32}, {96, 0xFFFFFFFF}})},
      {84, "a.res", Words({{0, 0xFFFFFFFF}, {8, 32}, {20, 2}})},
      {85, "a.res", Words({{0, 2}, {44, 2 * 48 + 4}})},
      {86, "a.res", Words({{0, 2}, {44, 2 * 44 + 4}})},
      {87, "a.res", Header(B().u16(1).u16(5).u32(7).u32(7))},
      {88, "a.res", Header(B().u16(3).u16(2).u32(0).padTo(22).u32(52))},
      {89, "a.res", Words({{0, 1}, {84, 92}})},
      {90, "a.res", Header(B().u32(120).padTo(114).u8(' '), 128)},
      {92, "a.res", Header(B().u32(16).u32(16 + 8192).u32(3).u32(4))},
      {93, "a.res", Header(B().u32(7).u32(64).u32(64).u32(16), 128)},
      {94, "a.res", Header(B().u32(24).u16(3).u16(1000).u32(20))},
      {95, "a.res", Header(B().u32(25).u16(3).u16(6000).u32(20))},
      {96, "a.res", Header(B().u32(100).u16('A').u32(104).u32(10).u16('B').u32(114), 124)},
      {97, "a.res", Header(B().text("BIGF").u32(0).u32(1).u32(2048))},
      {98, "a.img", plain, {{"a.dir", Pattern(16)}}},
      {99, "a.res", image(0x40000, 0x1003FFFF)},
      {100, "a.res", image(0x20000, 0x0C02FFFF)},
      {101, "a.adf", Header(B().u8(0xDD).text("AAA"))},
      {102, "a.res", Header(B().u32(0x2DA2DF95).u32(1).u32(2).u32(0).u32(3))},
      {103, "a.res", Words({{12, 1}, {16, 2}, {32, 3}, {36, 4}, {52, 7}, {56, 8}, {72, 15}})},
      {104, "a.res", Header(B().text("AAAAFM"))},
      {105, "a.res", Words({{16, 1}, {20, 2}, {38, 4}, {42, 3}, {60, 8}, {64, 7}, {86, 15}})},
      {106, "a.dat", Header(B().u8(0).u32(103))},
      {107, "a.pbo", Header(B().text(" AAA"))},
      {108, "a.rfd", plain, {{"a.rfh", Pattern(8)}}},
      {109, "a.jaz", Header(B().u8(1).u32(104 - 9))},
      {110, "a.res", Header(B().u32(2).u32(12))},
      {111, "a.res", Header(B().text("TGL").u8(0).u32(0).u32(104))},
      {112, "a.res", Header(B().text("KPS").u8(0).u32(0).u32(96))},
      {113, "a.res", Header(B().u32(0x80C381D7))},
      {114, "a.rss", plain},
      {115, "a.mult", plain},
      {116, "a.res", Header(B().u32(0x7B2B0A68).u32(0x7CE2FF0A))},
      {117, "a.res", Header(B().u32(0xDD72DD12).u32(3))},
      {118, "a.res", Header(B().u32(1).padTo(132).u32(140), 136)},
      {119, "a.res", Header(B().text("AAAA").padTo(256).text("PSVDSC_V2.00\r\n\r\n"))},
      {120, "a.res", Words({{4, 0xBDEC9C78}})},
      {121, "a.pak", plain, {{"a.dir", Pattern(8)}}},
      {122, "a.res", Header(B().u32(112).u32(2).padTo(103).u32(112), 112)},  // d0 = size, not 153
      {123, "a.res", Header(B().text("AAAA").padTo(36).text("CARTEXTURES"))},
      {124, "a.res", Header(B().text("AAAA").padTo(36).text("ROAD_SEGMENT"))},
      {125, "a.qfs", Header(B().u8(0x10).u8(0xFB).text("AA"))},
      {126, "a.bag", plain, {{"a.idx", B().text("GABA").u32(2).u32(0).get()}}},
      {127, "a.frame", plain},
      {128, "a.sequence", Header(B().u32(1))},
      {129, "a.sequence", Header(B().u8(1).text("AAA"))},
      {131, "a.syj", Header(B().u8(0).u8(1).text("AA"))},
      {132, "a.res", Header(B().text("BIGF").u32(0).u32(1))},
      {133, "a.res", Header(B().text("BIGF"))},
      {134, "a.555", plain},
      {135, "a.r8", Header(B().u8(1).text("AAA"))},
      {136, "a.r8", Header(B().text("AAAA").padTo(8).u8(1))},
      {137, "a.r16", Header(B().u8(1).text("AAA"))},
      {138, "a.r16", Header(B().text("AAAA").padTo(8).u8(1))},
      {139, "a.res", Header(B().text("TEX").u8(0).u16(1).u32(0x40000001).u32(4))},  // wraps
      {140, "a.565", Header(B().text("TEX").u8(0).u16(1).u32(0x40000001).u32(4))},
      {141, "a.anm", Header(B().u32(100).u32(1).u32(1))},
      {142, "a.wd", Header(B().u8(0x78).u8(0x9C).text("AA"))},
      {143, "a.big", plain, {{"a.fat", Pattern(8)}}},
      {144, "a.bf", plain},
      {145, "a.res",
       Header(B().text("NetImmerse File Format, ").padTo(52).text("NiPixelData").padTo(83).u8(24))},
      {146, "a.res", Header(B())},
      {147, "a.clz", Header(B().text("AAAA").u8(0x78).u8(0xDA))},
      {148, "a.wd", plain},
      {149, "a.rsb", Words({{4, 11}, {8, 6}})},  // 2 x 11 x 6 = 104 + 28
      {150, "a.pck", plain},
      {151, "a.res", Header(B().u32(100).u32(10).u32(10), 880)},  // behind a 780-byte palette
      {152, "a.res", Header(B().u32(108).u32(6).u32(6), 120)},
      {153, "a.res", Header(B().u32(120).padTo(111).u32(128), 128)},
      {154, "a.res",
       Words({{32, 0x99A1A220}, {36, 0x99A1A220}, {40, 0x99A1A220}, {44, 0x99A1A220}})},
      {155, "a.res", Header(B().text("XXXX").u32(0).text("XXXXXXXX"))},
      {156, "a.meg", Header(B().u32(7).u32(7))},
      {157, "a.res", Header(B().text("AAAA").padTo(84).text("FRONTEND"))},
  };
  v.insert(v.end(), rules.begin(), rules.end());
  return v;
}

}  // namespace cairn::test
