// The media writers, one row per variant: stored bytes and the entry a reader
// lists -> the exact file written, or a refusal; real decoders read the files.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <optional>
#include <sstream>

#include "media/palettes.h"
#include "media_support.h"

namespace cairn::test {
namespace {

// Little-endian words of `width` bytes each.
Bytes Le(std::initializer_list<uint32_t> words, unsigned width = 4) {
  Bytes b;
  for (uint32_t w : words)
    for (unsigned i = 0; i < width; ++i) b.push_back(static_cast<uint8_t>(w >> (8 * i)));
  return b;
}
Bytes Cat(std::initializer_list<Bytes> parts) {
  Bytes b;
  for (const Bytes& p : parts) b.insert(b.end(), p.begin(), p.end());
  return b;
}
// Bytes 0 and 2 of every `step` bytes exchanged: red-green-blue to blue-green-red.
Bytes Swap02(Bytes b, size_t step) {
  for (size_t i = 0; i + step <= b.size(); i += step) std::swap(b[i], b[i + 2]);
  return b;
}
// The `size`-byte palette entries that `indices` select.
Bytes Pick(const Bytes& indices, const Bytes& palette, size_t size) {
  Bytes out;
  for (uint8_t i : indices) out = Join(out, Slice(palette, i * size, size));
  return out;
}
// Every triple followed by `fourth`: RGBA as a decoder reads it, or (0, red
// and blue exchanged) a BMP palette.
Bytes Quads(const Bytes& rgb, uint8_t fourth = 255) {
  Bytes out;
  for (size_t i = 0; i + 3 <= rgb.size(); i += 3) out = Join(out, Join(Slice(rgb, i, 3), {fourth}));
  return out;
}
Bytes Palette(const std::array<uint8_t, 1024>& p) {
  return Bytes(p.begin(), p.end());
}

Bytes Tga(uint32_t w, uint32_t h, uint8_t bits, uint8_t descriptor) {
  return Cat({{0, 0, 2}, Bytes(9), Le({w, h}, 2), {bits, descriptor}});
}
// Colour-mapped, 256 entries of 24 bits made of the `rgb` colours.
Bytes Mapped(uint32_t w, uint32_t h, uint8_t bits, Bytes rgb) {
  rgb.resize(768);
  return Cat({{0, 1, 1, 0, 0, 0, 1, 24, 0, 0, 0, 0}, Le({w, h}, 2), {bits, 0x20}, Swap02(rgb, 3)});
}
Bytes Bmp(uint32_t size, uint32_t w, uint32_t h, uint16_t bits) {
  const bool fields = bits == 16;  // 5-6-5 with its three masks
  return Cat({Text("BM"), Le({size, 0, fields ? 66u : 1078u, 40, w, h}), Le({1, bits}, 2),
              fields ? Le({3, 0, 0, 0, 0, 0, 0xF800, 0x07E0, 0x001F}) : Bytes(24)});
}
// Rows stored top row first, as BMP holds them: bottom row first, each padded to 4 bytes.
Bytes BmpRows(const Bytes& src, size_t rowBytes, size_t rows) {
  Bytes out;
  for (size_t r = rows; r-- > 0;)
    out = Cat({out, Slice(src, r * rowBytes, rowBytes), Bytes((4 - rowBytes % 4) % 4)});
  return out;
}
// `kind`: 'P' palette indices, '1', '3' or '5' DXT, else RGBA of `kind` bits.
Bytes Dds(uint32_t h, uint32_t w, uint32_t mipmaps, uint8_t kind) {
  Bytes format = Le({0x41, 0, kind, 0x00FF0000, 0x0000FF00, 0x000000FF, 0xFF000000});
  if (kind == 'P') format = Le({0x20, 0, 8, 0, 0, 0, 0});
  if (kind >= '1' && kind <= '5') format = Cat({Le({4}), Text("DXT"), {kind}, Bytes(20)});
  const uint32_t c = format[0] == 0x41 ? 0x3B000000 : 0;  // caps2 to reserved, RGBA only
  return Cat({Text("DDS "), Le({124, 0x000A1007, h, w, 0, 0, mipmaps}), Bytes(44), Le({32}), format,
              Le({0x00401008, c, c, c, c})});
}
// Mono PCM up to the "data" tag.
Bytes Wav(uint32_t riff, uint32_t rate, uint16_t bits) {
  return Cat({Text("RIFF"), Le({riff}), Text("WAVEfmt "), Le({16, 0x00010001}),
              Le({rate, rate * bits / 8}), Le({bits / 8u, bits}, 2), Text("data")});
}

struct Row {
  const char* what;
  FormatId format;
  Bytes stored;                       // the archive file
  std::vector<ArchiveEntry> entries;  // the first is written; names matter to 104 and decoders
  std::optional<Bytes> written;       // none: refused
  Bytes decoded = {};                 // RGBA, or wave fields and samples; empty: not decoded
};
constexpr std::nullopt_t kRefused = std::nullopt;

std::vector<Row> Rows() {
  const Bytes wad2 = Cat({Le({2, 2}), {0, 15, 255, 16}}), pack = Cat({Bytes(100), {1, 14, 255, 0}});
  const Bytes rgb = Pattern(768, 4);  // "WAD3": head, indices, 5 bytes, count, colours, 2 bytes
  const auto wad3 = [&](size_t head) {
    return Cat({Bytes(head), {3, 200, 0, 255}, Bytes(5), Le({256}, 2), rgb, {0, 0}});
  };
  const Bytes px = Pattern(64), z = Compress(px), d13 = Pattern(13), tex = Pattern(40);
  const auto zs = static_cast<uint32_t>(z.size());
  // 78: u16 colour count, the colours, the picture size, the pixels.
  const Bytes lead = Cat({Bytes(5), Le({2}, 2), {10, 20, 30, 40, 50, 60}, Le({0}), {1, 0, 1}});
  const Bytes chunk = Cat({Bytes(39), Text("tex"), Bytes(5), {1, 2, 3, 4, 5, 6, 7, 8}, Bytes(52)});
  const Bytes c111 = Cat({Bytes(33), {0, 1, 2, 1}, Le({2}), {10, 20, 30, 40, 50, 60, 70, 80}});
  const Bytes d111 = Cat({Bytes(33), {10, 20, 30, 255, 40, 50, 60, 255}});
  const Bytes obj = Cat({Bytes(125), {0, 249, 250, 255}, Bytes(15), Pattern(1000), Bytes(8)});
  const Bytes trail = Cat({Bytes(12), {0, 1, 0, 255, 1, 2, 3, 9, 8, 7}, Bytes(759), {4, 5, 6}});
  const Bytes many = Cat({Le({300}, 2), Pattern(900), Le({0}), {7}});
  const Bytes own = Cat({{2, 0, 255, 1}, Bytes(8), Pattern(512, 3)});  // 256 colours of 16 bits
  const Bytes p16 = Le({0x7C00, 0x03E0, 0x001F, 0x7FFF}, 2);
  const Bytes fixed = Cat({Bytes(140), Pattern(1024, 3), Bytes(4), Pattern(512 * 256, 9)});
  const Bytes act = Pattern(768, 7), vga(act.rbegin(), act.rend()), pix = Pattern(4096, 5);
  const Bytes raw = Cat({pix, act, vga}), top = Bmp(5174, 64, 64, 8), rows = BmpRows(pix, 64, 64);
  const auto in104 = [](std::string name, uint32_t packed, std::vector<ArchiveEntry> tables) {
    tables.insert(tables.begin(), {"_TO_BMP_\\" + name, 0, 5174, packed, 0, 1});
    return tables;
  };
  const std::vector<ArchiveEntry> acts = {{"GFX\\TITLE.ACT", 4096, 768, 768, 0, 0},
                                          {"ART\\VGA.ACT", 4864, 768, 768, 0, 0}};
  const Bytes seq = Cat({{2}, Le({3, 2}), Bytes(20), {0, 1, 2, 3, 0, 1}});  // image header, pixels
  const Bytes s565 = Cat({Bytes(22), Le({1, 2, 3, 4, 5, 6}, 2)});
  const Bytes c565 = Le({0xF800, 0x07E0, 0x001F, 0xFFFF, 0, 0xF800}, 2);
  const Bytes dxt1 = Le({0xF800, 0x001F, 0, 0}, 2), bgra = {30, 20, 10, 255, 60, 50, 40, 128};
  const auto dds = [&](const char* what, FormatId f, uint32_t extra, uint8_t flag,
                       std::optional<Bytes> header) {
    return Row(what, f, tex, {{"", 4, 160, 32, extra, flag}},
               header ? Cat({*header, Slice(tex, 4, 32)}) : header);
  };
  // "JDLZ", 4 bytes, decoded size, block size, coded bytes: 16 x 0x11, 1024 x 0x22.
  const Bytes coded = Cat({Text("JDLZ"), Le({0, 1040, 24}), {10, 3, 0x11, 0, 12, 0x22, 48, 252}});
  const auto jdlz = [](uint32_t decoded, uint32_t block) {
    return Cat({Text("JDLZ"), Le({0, decoded, block}), Bytes(8)});
  };
  const Bytes samples = Pattern(1000), snd = Cat({Bytes(8), samples}), ilbm = Pattern(0x1234);
  const Bytes gaba = Cat({Le({996}), Pattern(996)});  // the sound brings its data size

  return {
      Row("4 WAD2 via palette 2", 4, wad2, {{"w.tga", 0, 30, 12, 0x00020002, 1}},
          Cat({Tga(2, 2, 24, 0x21), {0, 0, 0, 0xEB, 0xEB, 0xEB, 0x53, 0x5B, 0x9F, 7, 0x0B, 0x0F}}),
          {0, 0, 0, 255, 0xEB, 0xEB, 0xEB, 255, 0x9F, 0x5B, 0x53, 255, 0x0F, 0x0B, 7, 255}),
      Row("70 PACK via palette 1", 70, pack, {{"", 0, 30, 104, 0x00020002, 2}},
          Cat({Tga(2, 2, 24, 0x21), {15, 15, 15, 0xDB, 0xDB, 0xDB, 0x53, 0x5B, 0x9F, 0, 0, 0}})),
      Row("70 short index data", 70, pack, {{"", 0, 30, 103, 0x00020002, 2}}, kRefused),
      Row("5 40-byte head", 5, wad3(40), {{"", 0, 30, 821, 0x00010004, 1}},
          Cat({Tga(4, 1, 24, 0x20), Swap02(Pick({3, 200, 0, 255}, rgb, 3), 3)})),
      Row("5 8-byte head", 5, wad3(8), {{"", 0, 24, 789, 0x00010002, 2}},
          Cat({Tga(2, 1, 24, 0x20), Swap02(Pick({3, 200}, rgb, 3), 3)})),
      Row("5 no palette", 5, wad3(40), {{"", 0, 30, 769, 0x00010004, 1}}, kRefused),
      Row("39 32 bits", 39, z, {{"", 0, 82, zs, 0x00040004, 2}}, Cat({Tga(4, 4, 32, 0x20), px})),
      Row("39 Flag 4", 39, z, {{"", 0, 82, zs, 0x00040008, 4}}, Cat({Tga(8, 4, 16, 0x20), px})),
      Row("120 24 bits", 120, z, {{"", 0, 82, zs, 0x00010010, 2}}, Cat({Tga(16, 1, 24, 0x20), px})),
      Row("39 inflates past the picture", 39, z, {{"", 0, 81, zs, 0x00040004, 3}}, kRefused),
      Row("40 1XFG: width*height*2", 40, d13, {{"", 0, 26, 13, 0x00020002, 1}},
          Cat({Tga(2, 2, 16, 0x20), Slice(d13, 0, 8)})),
      Row("40 short", 40, d13, {{"", 0, 26, 7, 0x00020002, 1}}, kRefused),
      Row("47 stored", 47, d13, {{"", 1, 30, 12, 0x00010004, 24}},
          Cat({Tga(4, 1, 24, 0x20), Slice(d13, 1, 12)})),
      Row("78 leading palette", 78, lead, {{"", 5, 789, 15, 0x00010003, 8}},
          Cat({Mapped(3, 1, 8, {10, 20, 30, 40, 50, 60}), {1, 0, 1}})),
      Row("78 palette past the entry", 78, lead, {{"", 5, 789, 11, 0x00010003, 8}}, kRefused),
      Row("78 300 colours, 256 mapped", 78, many, {{"", 0, 787, 907, 0x00010001, 16}},
          Cat({Mapped(1, 1, 16, Slice(Pattern(900), 0, 768)), {7}})),
      Row("92 pixels at 41 + name length", 92, chunk, {{"", 3, 26, 104, 0x00010002, 1}},
          Cat({Tga(2, 1, 32, 0x21), {3, 2, 1, 4, 7, 6, 5, 8}})),
      Row("92 name unterminated", 92, Bytes(104, 1), {{"", 0, 26, 104, 0x00010002, 1}}, kRefused),
      Row("111 indexed, third colour black", 111, c111, {{"", 0, 34, 49, 0x00010004, 2}},
          Cat({Tga(1, 4, 32, 0), {30, 20, 10, 40, 70, 60, 50, 80, 0, 0, 0, 0, 70, 60, 50, 80}})),
      Row("111 direct, bottom row first", 111, d111, {{"c.tga", 0, 26, 41, 0x00010002, 1}},
          Cat({Tga(1, 2, 32, 0), Swap02(Slice(d111, 33, 8), 4)}), Quads({40, 50, 60, 10, 20, 30})),
      Row("111 past the archive", 111, c111, {{"", 0, 18, 49, 0xFFFFFFFF, 1}}, kRefused),
      Row("145 indexed, past 250 colours black", 145, obj, {{"", 7, 34, 9, 0x00020002, 1}},
          Cat({Tga(2, 2, 32, 0x20), Pick({0, 249}, Pattern(1000), 4), Bytes(8)})),
      Row("145 24 bits", 145, obj, {{"", 7, 30, 9, 0x00020002, 2}},
          Cat({Tga(2, 2, 24, 0x20), Slice(obj, 125, 12)})),
      Row("145 32 bits", 145, obj, {{"", 7, 34, 9, 0x00020002, 3}},
          Cat({Tga(2, 2, 32, 0x20), Slice(obj, 125, 16)})),
      Row("145 past the file", 145, obj, {{"", 7, 34, 9, 0x04000400, 3}}, kRefused),
      Row("151 trailing palette", 151, trail, {{"p.tga", 12, 790, 4, 0x00020002, 24}},
          Cat({Mapped(2, 2, 8, Slice(trail, 16, 768)), {0, 1, 0, 255}}),
          Quads(Pick({0, 1, 0, 255}, Slice(trail, 16, 768), 3))),
      Row("151 cut short", 151, Slice(trail, 0, 783), {{"", 12, 790, 4, 0x00020002, 24}}, kRefused),
      Row("137 stored", 137, own, {{"", 0, 524, 524, 0, 0}}, own),
      Row("137 own 16-bit palette", 137, own, {{"", 0, 26, 524, 0x00020002, 1}},
          Cat({Tga(2, 2, 16, 0x20), Pick({2, 0, 255, 1}, Slice(own, 12, 512), 2)})),
      Row("137 fewer indices", 137, own, {{"", 0, 30, 524, 0x00020003, 1}}, kRefused),
      Row("137 Flag 4: nothing", 137, own, {{"", 0, 26, 524, 0x00020002, 4}}, Bytes{}),
      Row("137 16-bit pixels", 137, p16, {{"s.tga", 0, 26, 8, 0x00020002, 3}},
          Cat({Tga(2, 2, 16, 0x20), p16}), Quads({255, 0, 0, 0, 255, 0, 0, 0, 255, 255, 255, 255})),

      Row("100 fixed layout", 100, fixed, {{"", 0, 132150, 132150, 0, 0}},
          Cat({Bmp(132150, 512, 256, 8), Swap02(Pattern(1024, 3), 4),
               BmpRows(Pattern(131072, 9), 512, 256)})),
      Row("99 too short", 99, fixed, {{"", 0, 263222, 263222, 0, 0}}, kRefused),
      Row("104 companion, any case", 104, raw, in104("gfx\\title.raw.bmp", 4096, acts),
          Cat({top, Swap02(Quads(act, 0), 4), rows}), Quads(Pick(pix, act, 3))),
      Row("104 art\\vga.act", 104, raw, in104("x.raw.bmp", 4096, acts),
          Cat({top, Swap02(Quads(vga, 0), 4), rows})),
      Row("104 palette 4", 104, raw, in104("p.raw.bmp", 4096, {{"p.act", 4096, 700, 700, 0, 0}}),
          Cat({top, Palette(kBuiltInPalette4), rows})),
      Row("104 unknown picture size", 104, raw, in104("p.raw.bmp", 4095, {}), kRefused),
      Row("135 palette 3, odd width padded", 135, seq, {{"s.bmp", 29, 1086, 6, 0, 2}},
          Cat({Bmp(1086, 3, 2, 8), Palette(kBuiltInPalette3), {3, 0, 1, 0, 0, 1, 2, 0}}),
          Quads({0, 0, 0, 0x58, 0x28, 0x28, 0xF0, 0xA0, 0xA8, 0x40, 8, 0x18, 0, 0, 0, 0x58, 0x28,
                 0x28})),
      Row("135 no image header", 135, seq, {{"", 28, 1086, 6, 0, 2}}, kRefused),
      Row("135 fewer pixels", 135, seq, {{"", 29, 1086, 5, 0, 2}}, kRefused),
      Row("140 flipped, middle row stays", 140, s565, {{"", 22, 78, 12, 0x00030002, 0}},
          Cat({Bmp(78, 2, 3, 16), Le({5, 6, 3, 4, 1, 2}, 2)})),
      Row("140 past the archive", 140, s565, {{"", 24, 78, 12, 0x00030002, 0}}, kRefused),
      Row("149 rows padded", 149, c565, {{"c.bmp", 0, 82, 12, 0x00020003, 0}},
          Cat({Bmp(82, 3, 2, 16), Le({0xFFFF, 0, 0xF800, 0, 0xF800, 0x07E0, 0x001F, 0}, 2)}),
          Quads({255, 0, 0, 0, 255, 0, 0, 0, 255, 255, 255, 255, 0, 0, 0, 255, 0, 0})),

      Row("79 DXT1", 79, dxt1, {{"t.dds", 0, 136, 8, 0x00040004, '1'}},
          Cat({Dds(4, 4, 0, '1'), dxt1}), Quads(Pick(Bytes(16), {255, 0, 0}, 3))),
      dds("79 Flag 6: 24 bits", 79, 0x00020004, 6, Dds(2, 4, 0, 24)),
      dds("79 no template", 79, 0x00020004, 7, kRefused),
      dds("124 RGBA", 124, 0x01000200, 0x12, Dds(256, 512, 1, 32)),
      dds("123 not coded", 123, 0x00100010, 0x25, Dds(16, 16, 2, '5')),
      dds("157 DXT1", 157, 0x00100010, 0xF3, Dds(16, 16, 15, '1')),
      dds("157 DXT3", 157, 0x00100010, 0x04, Dds(16, 16, 0, '3')),
      dds("124 palette, signed height", 124, 0x8000FFFF, 0x31, Dds(0xFFFF8000, 0xFFFF, 3, 'P')),
      dds("123 no template", 123, 0x00100010, 0x10, kRefused),
      Row("123 coded palette moves first", 123, coded, {{"", 0, 1168, 24, 0x00040004, 0x11}},
          Cat({Dds(4, 4, 1, 'P'), Bytes(1024, 0x22), Bytes(16, 0x11)})),
      Row("123 coded RGBA", 123, coded, {{"", 0, 1168, 24, 0x00040004, 0x02}},
          Cat({Dds(4, 4, 0, 32), Bytes(16, 0x11), Bytes(1024, 0x22)})),
      Row("123 coded palette under 1024 bytes", 123, Cat({Text("JDLZ"), Le({0, 1, 19}), {0, 0, 1}}),
          {{"", 0, 129, 19, 0x00010001, 0x01}}, kRefused),
      Row("123 over 2049 per byte", 123, jdlz(8 * 2049 + 1, 24), {{"", 0, 200, 24, 0, 2}},
          kRefused),
      Row("123 block under its header", 123, jdlz(4, 15), {{"", 0, 200, 24, 0, 2}}, kRefused),
      Row("123 block past the archive", 123, jdlz(4, 100), {{"", 0, 200, 24, 0, 2}}, kRefused),
      Row("123 too short for the tag", 123, jdlz(0, 0), {{"", 0, 136, 8, 0x00010001, 2}},
          Cat({Dds(1, 1, 0, 32), Slice(jdlz(0, 0), 0, 8)})),
      Row("124 32 bits", 124, bgra, {{"u.dds", 0, 136, 8, 0x00010002, 2}},
          Cat({Dds(1, 2, 0, 32), bgra}), {10, 20, 30, 255, 40, 50, 60, 128}),

      Row("102 8 bits", 102, snd, {{"s.wav", 8, 1044, 1000, 0, 1}},
          Cat({Wav(1036, 11025, 8), Le({1000}), samples}), Cat({Text("1 1 11025 1000 "), samples})),
      Row("126 16 bits", 126, snd, {{"b.wav", 8, 1044, 1000, 32000, 1}},
          Cat({Wav(1036, 32000, 16), Le({1000}), samples}), Cat({Text("1 2 32000 500 "), samples})),
      Row("41 40-byte header", 41, gaba, {{"c.wav", 0, 1040, 1000, 44100, 1}},
          Cat({Wav(1032, 44100, 16), gaba}), Cat({Text("1 2 44100 498 "), Pattern(996)})),
      Row("102 past the archive", 102, snd, {{"", 8, 1045, 1001, 0, 1}}, kRefused),
      Row("131 JFIF start", 131, d13, {{"", 0, 23, 13, 0, 0}},
          Cat({{0xFF, 0xD8, 0xFF, 0xE0, 0, 16}, Text("JFIF"), d13})),
      Row("155 FORM start", 155, ilbm, {{"", 0, 0x1234, 0x1234, 0, 0}},
          Cat({Text("FORM"), {0, 0, 0x12, 0x2C}, Text("ILBMBMHD"), Slice(ilbm, 16, 0x1234 - 16)})),
      Row("155 under 16 bytes", 155, ilbm, {{"", 0, 15, 15, 0, 0}}, kRefused),
      Row("155 past the archive", 155, ilbm, {{"", 0xFFFFFFF8, 32, 32, 0, 0}}, kRefused),
  };
}

TEST(MediaWriters, EachWritesExactlyOrRefuses) {
  for (const Row& r : Rows()) {
    MediaArchive a(r.format, r.stored, r.entries);
    Bytes out;
    EXPECT_EQ(a.extract(0, out), r.written ? kOk : kBadData) << r.what;
    if (r.written) EXPECT_EQ(out, *r.written) << r.what;
    if (r.written) EXPECT_EQ(a.extract(0), out) << r.what << ": the entry is left as it was";
  }
}

// Pictures: ImageMagick's RGBA, top row first. Sounds: Python's wave module,
// channels, sample width, rate and frame count, then the samples.
TEST(MediaWriters, RealDecodersReadTheExpectedPixelsAndSamples) {
  if (std::system("command -v convert >/dev/null && command -v python3 >/dev/null") != 0)
    GTEST_SKIP() << "skipped: ImageMagick's convert or python3 is not installed";
  const std::string wave =
      "python3 -c \"import sys, wave\nw = wave.open(sys.argv[1])\nsys.stdout.buffer.write(b'%d %d "
      "%d %d ' % w.getparams()[:4] + w.readframes(w.getnframes()))\" '";
  for (const Row& r : Rows()) {
    if (r.decoded.empty()) continue;
    MediaArchive a(r.format, r.stored, r.entries);
    const std::string& name = r.entries[0].Name;
    const std::string path = a.opened->dir.path("out" + name.substr(name.rfind('.')));
    ASSERT_EQ(ExtractEntry(a.opened->session, 0, path), kOk) << r.what;
    const std::string command = name.ends_with(".wav")
                                    ? wave + path + "'"
                                    : "convert '" + path + "' -auto-orient -depth 8 rgba:-";
    std::system((command + " >'" + path + ".out' 2>/dev/null").c_str());
    EXPECT_EQ(ReadFile(path + ".out"), r.decoded) << r.what;
  }
}

TEST(MediaPalettes, FixedEntriesAndTheDataFilesTheyComeFrom) {
  const std::array<uint8_t, 1024>* p[] = {&kBuiltInPalette1, &kBuiltInPalette2, &kBuiltInPalette3,
                                          &kBuiltInPalette4};
  const auto entry = [&](int n, size_t i) { return Slice(Palette(*p[n - 1]), 4 * i, 4); };
  const uint8_t greys[] = {0, 15, 31, 47, 63, 75, 91, 107, 123, 139, 155, 171, 187, 203, 219, 235};
  // Palettes 1 and 2 share their 16 greys and entry 255, and differ in the 239 others.
  for (size_t i = 0; i < 256; ++i) {
    EXPECT_EQ(entry(1, i) == entry(2, i), i < 16 || i == 255) << i;
    if (i < 16) EXPECT_EQ(entry(1, i), Bytes({greys[i], greys[i], greys[i], 0}));
  }
  EXPECT_EQ(entry(1, 255), Bytes({0x53, 0x5B, 0x9F, 0}));

  const auto data = std::filesystem::path(__FILE__).parent_path().parent_path() / "data";
  for (int n = 1; n <= 4; ++n) {
    std::ifstream in(data / ("palette" + std::to_string(n) + ".txt"));
    if (!in) GTEST_SKIP() << "skipped: the data files are not beside the sources";
    Bytes colours;  // red, green and blue in hex, a colour a line
    for (std::string line; std::getline(in, line);) {
      std::istringstream fields(line);
      unsigned r, g, b;
      if (line[0] != '#' && fields >> std::hex >> r >> g >> b)
        colours = Join(colours, {uint8_t(b), uint8_t(g), uint8_t(r), 0});
    }
    EXPECT_EQ(colours, Palette(*p[n - 1])) << "palette " << n;
  }
}

}  // namespace
}  // namespace cairn::test
