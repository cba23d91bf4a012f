// Samples and refusals of the readers that walk a file section by section:
// "PALETTEFILES " (49) and the "TEX" texture lists (71, 72).
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

Bytes Tga32(uint16_t width, uint16_t height, const Bytes& pixels) {
  return ArchiveBuilder()
      .u8(0)
      .u8(0)
      .u8(2)
      .fill(9)
      .u16(width)
      .u16(height)
      .u8(32)
      .u8(0x20)
      .bytes(pixels)
      .get();
}

ArchiveBuilder& Z(ArchiveBuilder& w, std::string_view s) {
  return w.text(s).u8(0);
}

CAIRN_SAMPLES(SectionSamples) {
  const Bytes a = Pattern(8, 1), b = Pattern(4, 2), c = Pattern(60, 3);
  // An empty section, name-only items, blanks before a count, and a last
  // header closer to the end than a header's window.
  ArchiveBuilder pal;
  Z(pal, "PALETTEFILES 2");
  Z(pal, "sky.pal").u32(8).bytes(a);
  Z(pal, "sea.pal").u32(4).bytes(b);
  Z(Z(Z(Z(pal, "EMPTY 0"), "SOUNDS 2"), "boom.wav"), "hiss.wav");
  Z(Z(pal, "TEXTURES  1"), "wall/brick").u32(60).bytes(c);
  Z(Z(pal, "MATERIALS_X 1"), "stone");
  // An empty texture, one followed by 5464 bytes and one with a 12-byte
  // header extension.
  const Bytes p = Pattern(24, 4), q = Pattern(8, 5), r = Pattern(16, 6);
  ArchiveBuilder tex1;
  tex1.text("TEX").u8(0).u32(1).u32(0x80u << 24).u32(3).fill(8).u32(0x08000000).fill(12);
  tex1.u32(0x080026).u32(0).u32(2).u32(3).fill(4).bytes(p).fill(8 + 5464);
  tex1.u32(0x0A0000).u32(0).u32(1).u32(2).fill(12).bytes(q).fill(8);
  ArchiveBuilder tex2;
  tex2.text("TEX").u8(0).u32(2).u32(0).u32(0).u32(4).u32(1).bytes(r).fill(80);
  Sample list = Row({"TEX counted", 71, "wall.tex", tex1.get()}, {{"wall.tex.000000.tga", 32, {}}});
  list.listing.push_back({"wall.tex.000001.tga", 60, 42, 24, 2 | 3 << 16, 0x20});
  list.listing.push_back({"wall.tex.000002.tga", 5584, 26, 8, 1 | 2 << 16, 0x20});
  list.data.push_back(Tga32(2, 3, p));
  list.data.push_back(Tga32(1, 2, q));
  Sample one{"TEX single", 72, "one.tex", tex2.get()};
  one.listing = {{"one.tex.000000.tga", 24, 34, 16, 4 | 1 << 16, 0x20}};
  one.data = {Tga32(4, 1, r)};
  return {
      Row({"PALETTEFILES", 49, "game.pal", pal.get()}, {{"PALETTEFILES\\sky.pal", 27, a},
                                                        {"PALETTEFILES\\sea.pal", 47, b},
                                                        {"SOUNDS\\boom.wav", 77, {}},
                                                        {"SOUNDS\\hiss.wav", 86, {}},
                                                        {"TEXTURES\\wall\\brick", 113, c},
                                                        {"MATERIALS_X\\stone", 193, {}}}),
      list,
      one,
  };
}

// Headers without a count or a terminator, items and textures beyond the
// end, names of 260 and textures too large for a TGA are refused.
TEST(Sections, RefusesHeadersAndItemsBeyondTheirBounds) {
  const SampleTable rows = SectionSamples();
  const auto with = [&](size_t row, size_t at, uint32_t v) {
    return ArchiveBuilder().bytes(rows[row].bytes).patch32(at, v).get();
  };
  ArchiveBuilder longName, noSpace, noZero;
  Z(Z(longName, "PALETTEFILES 1"), std::string(260, 'n'));
  Z(noSpace, "PALETTEFILES").fill(100);
  noZero.text("PALETTEFILES 1").fill(100, '1');
  Bytes moreItems = rows[0].bytes;
  moreItems[185] = '9';  // "MATERIALS_X 9"
  ExpectRefused({
      {"PALETTEFILES header without a space", 49, noSpace.get()},
      {"PALETTEFILES header without its zero", 49, noZero.get()},
      {"PALETTEFILES more items than the file", 49, moreItems},
      {"PALETTEFILES name of 260", 49, longName.get()},
      {"TEX header past the end", 71, with(1, 12, 4)},
      {"TEX width beyond 16 bits", 72, with(2, 16, 0x10000)},
  });
}

}  // namespace
}  // namespace cairn::test
