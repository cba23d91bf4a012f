// Bare pictures, image sequences, texture bundles and the packed texture.
#include <gtest/gtest.h>

#include "media/media.h"
#include "media/palettes.h"
#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

const std::string kName24 = "abcdefghijklmnopqrstuvwx";
const Bytes kPalette3(kBuiltInPalette3.begin(), kBuiltInPalette3.end());

Sample Named(FormatId id, uint32_t w, uint32_t v, uint32_t height, const std::string& name) {
  const uint32_t size = 512 * height + 1078;
  B b;
  for (uint32_t x : {22u, 0x49C | w, v, 1u, 4u, v, 1u, 21u, 0x474 | w, v, 1u, 0x45C | w, v, 8u})
    b.u32(x);
  const Bytes pixels(512 * height, 0x5A),
      bmp = Cat({BmpHeader(size, 512, height, 8), Bytes(1024), pixels});
  b.padTo(60).name(name, 24).padTo(1168).bytes(pixels);
  return Entries({"named palette image", id, "sky.pic", b.get()},
                 {{{name + ".bmp", 0, size, size, 0, 0}, bmp}});
}

Sample Sequence(FormatId id, const std::string& file, uint32_t lead) {
  auto Head = [](uint8_t type, uint32_t w, uint32_t h, uint32_t palette, uint8_t bits) {
    return std::move(B().u8(type).u32(w).u32(h).fill(12).u32(palette).u8(bits).fill(3));
  };
  const Bytes own = Cat({{0, 1, 2, 255}, Bytes(8), Pattern(512, 5)}), odd = Pattern(3),
              deep = Pattern(18);
  B b = B().fill(lead, 7).bytes(Head(1, 2, 2, 1, 8).bytes(own).fill(8).get());
  b.bytes(Head(2, 3, 1, 0, 8).bytes(odd).get()).bytes(Head(2, 3, 3, 0, 16).bytes(deep).get());
  const Bytes& a = b.get();
  const Bytes t0 = Cat({TgaHeader(0x20002, 16, 0x20), Slice(own, 12, 6), Slice(own, 522, 2)});
  const Bytes b1 = Cat({BmpHeader(1082, 3, 1, 8), kPalette3, odd, {0}});
  const std::string n = file + ".00000", tga = "_TO_TGA_\\" + n;
  return Entries({"image sequence", id, file, a},
                 {{{n + "0", lead, 553, 553, 0, 0}, Slice(a, lead, 553)},
                  {{tga + "0.tga", lead + 29, 26, 524, 0x20002, 1}, t0},
                  {{n + "1", lead + 561, 32, 32, 0, 0}, Slice(a, lead + 561, 32)},
                  {{"_TO_BMP_\\" + n + "1.bmp", lead + 590, 1082, 3, 0, 2}, b1},
                  {{n + "2", lead + 593, 47, 47, 0, 0}, Slice(a, lead + 593, 47)},
                  {{tga + "2.tga", lead + 622, 36, 18, 0x30003, 3},
                   Cat({TgaHeader(0x30003, 16, 0x20), deep})}});
}

B& Tables(B& b) {
  b.u32(140).fill(12).name(kName24, 24).fill(12).u32(1024).fill(4).u32(16).fill(8).u32(0x20004);
  return b.fill(6).u8(1).fill(65).u32(56).fill(20).u32(41).fill(36);
}

Sample Bundle(FormatId id, const Bytes& a, uint32_t at, uint32_t packed) {
  const Bytes dds = Cat({DdsHeader(id, 0x11, 0x20004), Slice(a, at, packed)});
  return Entries({"texture bundle", id, "ui.bun", a},
                 {{{kName24 + ".000000.dds", at, 1232, packed, 0x20004, 0x11}, dds}});
}

Bytes Leading(size_t labelAt, std::string_view label) {
  B b = B().text("BNDL").padTo(12).u32(104).padTo(labelAt).text(label).padTo(272);
  return Tables(b).u32(4).padTo(748).bytes(Pattern(1040)).get();
}

CAIRN_SAMPLES(PictureSamples) {
  const Bytes indices = Pattern(8, 2), rgb = Pattern(768, 5), rgb24 = Pattern(96, 8);
  const Bytes logo = Cat({B().u32(8).u32(4).u32(2).get(), indices, rgb});
  const Bytes photo = Cat({B().u32(96).u32(8).u32(4).get(), rgb24}), texture = Pattern(1000);
  B three = B().text("BND3").padTo(36).text("CARTEXTURES").padTo(168).u32(39).u32(0).u32(432);
  Tables(three.u32(12).fill(31)).padTo(432).bytes(Pattern(12));
  const uint32_t wide = 512 | 256 << 16;
  const Bytes tex = Cat({B().u32(1000).get(), Compress(texture)});
  Sample packed = Entries({"packed texture", 120, "car.tex", tex},
                          {{{"_TO_TGA_\\car.TEX24.tga", 4, 393234, 296, wide, 2},
                            Cat({TgaHeader(wide, 24, 0x20), texture})},
                           {{"car.TEX24", 4, 1000, 296, 0, 1}, texture}});
  packed.recognised = false;
  return {
      Named(99, 0x40000, 0x1003FFFF, 512, "sky"),
      Named(100, 0x20000, 0x0C02FFFF, 256, kName24),
      Entries({"headerless 8-bit picture", 151, "logo.raw", logo},
              {{{"logo.tga", 12, 794, 8, 0x20004, 24},
                Cat({TgaColourMappedStart(0x20004, 8, rgb, 256), indices})}}),
      Entries(
          {"headerless 24-bit picture", 152, "photo.raw", photo},
          {{{"photo.tga", 12, 114, 96, 0x40008, 24}, Cat({TgaHeader(0x40008, 24, 0x20), rgb24})}}),
      Sequence(135, "anim.r8", 0),
      Sequence(137, "anim.r16", 0),
      Sequence(136, "anim.r8", 8),
      Sequence(138, "anim.r16", 8),
      Bundle(123, three.get(), 432, 12),
      Bundle(124, Leading(36, "ROAD_SEGMENT"), 748, 1040),
      Bundle(157, Leading(84, "FRONTEND"), 1772, 16),
      packed,
  };
}

TEST(PictureReaders, RefuseWhatCannotHoldTogether) {
  ExpectRefused({
      {"sequence picture past 4 GiB", 135, With(Sequence(135, "a.r8", 0), 1, 0x80000000)},
      {"headerless picture past 4 GiB", 151, B().u32(0).u32(65536).u32(65536).padTo(104).get()},
  });
}

}  // namespace
}  // namespace cairn::test
