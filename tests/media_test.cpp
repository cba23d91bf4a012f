// The media writers, one row per variant: stored bytes and the entry a reader
// lists -> the exact file written, or a refusal; real decoders read the files.
#include <gtest/gtest.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <optional>

#include "builder.h"
#include "media/palettes.h"

namespace cairn::test {
namespace {

// Little-endian words of `width` bytes each.
Bytes Le(std::initializer_list<uint32_t> words, unsigned width = 4) {
  Bytes b;
  for (uint32_t w : words)
    for (unsigned i = 0; i < width; ++i) b.push_back(static_cast<uint8_t>(w >> (8 * i)));
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
  for (uint8_t i : indices) out = Cat({out, Slice(palette, i * size, size)});
  return out;
}
// Every triple followed by `fourth`: RGBA as decoders read it, or BMP palette entries.
Bytes Quads(const Bytes& rgb, uint8_t fourth = 255) {
  Bytes out;
  for (size_t i = 0; i + 3 <= rgb.size(); i += 3) out = Cat({out, Slice(rgb, i, 3), {fourth}});
  return out;
}

// True colour; with `rgb`, colour-mapped: 256 entries of 24 bits made of those colours.
Bytes Tga(uint32_t w, uint32_t h, uint8_t bits, uint8_t descriptor, Bytes rgb = {}) {
  const Bytes type = rgb.empty() ? Bytes{0, 0, 2, 0, 0, 0, 0, 0} : Bytes{0, 1, 1, 0, 0, 0, 1, 24};
  rgb.resize(rgb.empty() ? 0 : 768);
  return Cat({type, Bytes(4), Le({w, h}, 2), {bits, descriptor}, Swap02(rgb, 3)});
}
Bytes Bmp(uint32_t size, uint32_t w, uint32_t h, uint16_t bits) {
  const bool fields = bits == 16;  // 5-6-5 with its three masks
  return Cat({Text("BM"), Le({size, 0, fields ? 66u : 1078u, 40, w, h}), Le({1, bits}, 2),
              fields ? Le({3, 0, 0, 0, 0, 0, 0xF800, 0x07E0, 0x001F}) : Bytes(24)});
}
// Rows of `rowBytes` as BMP holds them: bottom row first, each padded to 4 bytes.
Bytes BmpRows(const Bytes& src, size_t rowBytes) {
  Bytes out;
  for (size_t r = src.size() / rowBytes; r-- > 0;)
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
  const Bytes wad2 = Cat({Bytes(8), {16}}), d13 = Pattern(13);
  const Bytes px = Pattern(64), z = Compress(px), tex = Pattern(32), bgra = Pattern(8, 30);
  const auto zs = static_cast<uint32_t>(z.size());
  const Bytes many = Cat({Le({300}, 2), Pattern(900), Le({0}), {7}});
  const Bytes chunk = Cat({Bytes(39), Text("tex"), Bytes(5), {1, 2, 3, 4, 5, 6, 7, 8}, Bytes(52)});
  const Bytes c111 = Cat({Bytes(33), {0, 1, 2, 1}, Le({2}), {10, 20, 30, 40, 50, 60, 70, 80}});
  const Bytes d111 = Cat({Bytes(33), {10, 20, 30, 255, 40, 50, 60, 255}});
  const Bytes obj = Cat({Bytes(125), {0, 249, 250, 255}, Bytes(15), Pattern(1000), Bytes(8)});
  const Bytes trail = Cat({Bytes(12), {1, 255, 1, 2, 3, 9, 8, 7}, Bytes(759), {4, 5, 6}});
  const Bytes own = Cat({{2, 0, 255, 1}, Bytes(8), Pattern(512, 3)});  // 256 colours of 16 bits
  const Bytes p16 = Le({0x7C00, 0x03E0, 0x001F, 0x7FFF}, 2);
  const Bytes pal = Pattern(1024, 3), big = Pattern(131072, 9);
  const Bytes fixed = Cat({Bytes(140), pal, Bytes(4), big});  // palette at 140, pixels at 1168
  const Bytes act = Pattern(768, 7), vga(act.rbegin(), act.rend()), pix = Pattern(4096, 5);
  const Bytes raw = Cat({pix, act, vga}), top = Bmp(5174, 64, 64, 8), rows = BmpRows(pix, 64);
  const auto in104 = [](std::string name, uint32_t packed, std::vector<ArchiveEntry> tables) {
    tables.insert(tables.begin(), {"_TO_BMP_\\" + name, 0, 5174, packed, 0, 1});
    return tables;
  };
  const std::vector<ArchiveEntry> acts = {{"GFX\\TITLE.ACT", 4096, 768, 768, 0, 0},
                                          {"ART\\VGA.ACT", 4864, 768, 768, 0, 0}};
  const Bytes seq = Cat({{2}, Le({3, 2}), Bytes(20), {0, 1, 2, 3, 0, 1}});  // image header, pixels
  const Bytes pal3(kBuiltInPalette3.begin(), kBuiltInPalette3.end());
  const Bytes dxt1 = Le({0xF800, 0x001F, 0, 0}, 2), rotated = {0, 1, 2, 1, 2, 0, 2, 0, 1};
  const Bytes c565 = Pick(rotated, Le({0xF800, 0x07E0, 0x001F}, 2), 2);
  // "JDLZ", 4 bytes, decoded size, block size, coded bytes: 16 x 0x11, 1024 x 0x22.
  const Bytes coded = Cat({Text("JDLZ"), Le({0, 1040, 24}), {10, 3, 0x11, 0, 12, 0x22, 48, 252}});
  const Bytes samples = Pattern(1000), snd = Cat({Bytes(8), samples}), ilbm = Pattern(0x1234);
  const Bytes gaba = Cat({Le({996}), Pattern(996)});  // the sound brings its data size

  return {
      Row("4 WAD2 via palette 2", 4, wad2, {{"w.tga", 0, 21, 9, 0x10001, 1}},
          Cat({Tga(1, 1, 24, 0x21), {7, 11, 15}}), {15, 11, 7, 255}),
      Row("39 Flag 4", 39, z, {{"", 0, 82, zs, 0x00040008, 4}}, Cat({Tga(8, 4, 16, 0x20), px})),
      Row("78 300 colours, 256 mapped", 78, many, {{"", 0, 787, 907, 0x00010001, 16}},
          Cat({Tga(1, 1, 16, 0x20, Slice(Pattern(900), 0, 768)), {7}})),
      Row("92 pixels at 41 + name length", 92, chunk, {{"", 3, 26, 104, 0x00010002, 1}},
          Cat({Tga(2, 1, 32, 0x21), {3, 2, 1, 4, 7, 6, 5, 8}})),
      Row("111 indexed, third colour black", 111, c111, {{"", 0, 34, 49, 0x00010004, 2}},
          Cat({Tga(1, 4, 32, 0), {30, 20, 10, 40, 70, 60, 50, 80, 0, 0, 0, 0, 70, 60, 50, 80}})),
      Row("111 direct, bottom row first", 111, d111, {{"c.tga", 0, 26, 41, 0x00010002, 1}},
          Cat({Tga(1, 2, 32, 0), Swap02(Slice(d111, 33, 8), 4)}), Quads({40, 50, 60, 10, 20, 30})),
      Row("145 indexed, past 250 colours black", 145, obj, {{"", 7, 34, 9, 0x00020002, 1}},
          Cat({Tga(2, 2, 32, 0x20), Pick({0, 249}, Pattern(1000), 4), Bytes(8)})),
      Row("151 trailing palette", 151, trail, {{"p.tga", 12, 788, 2, 0x00010002, 24}},
          Cat({Tga(2, 1, 8, 0x20, Slice(trail, 14, 768)), {1, 255}}), Quads({9, 8, 7, 4, 5, 6})),
      Row("137 own 16-bit palette", 137, own, {{"", 0, 26, 524, 0x00020002, 1}},
          Cat({Tga(2, 2, 16, 0x20), Pick({2, 0, 255, 1}, Slice(own, 12, 512), 2)})),
      Row("137 16-bit pixels", 137, p16, {{"s.tga", 0, 26, 8, 0x00020002, 3}},
          Cat({Tga(2, 2, 16, 0x20), p16}), Quads({255, 0, 0, 0, 255, 0, 0, 0, 255, 255, 255, 255})),

      Row("100 fixed layout", 100, fixed, {{"", 0, 132150, 132150, 0, 0}},
          Cat({Bmp(132150, 512, 256, 8), Swap02(pal, 4), BmpRows(big, 512)})),
      Row("104 companion, any case", 104, raw, in104("gfx\\title.raw.bmp", 4096, acts),
          Cat({top, Swap02(Quads(act, 0), 4), rows}), Quads(Pick(pix, act, 3))),
      Row("135 palette 3, odd width padded", 135, seq, {{"s.bmp", 29, 1086, 6, 0, 2}},
          Cat({Bmp(1086, 3, 2, 8), pal3, {3, 0, 1, 0, 0, 1, 2, 0}})),
      Row("149 flipped and padded", 149, c565, {{"c.bmp", 0, 90, 18, 0x00030003, 0}},
          Cat({Bmp(90, 3, 3, 16), BmpRows(c565, 6)}),
          Quads(Pick(rotated, {255, 0, 0, 0, 255, 0, 0, 0, 255}, 3))),

      Row("79 DXT1", 79, dxt1, {{"t.dds", 0, 136, 8, 0x00040004, '1'}},
          Cat({Dds(4, 4, 0, '1'), dxt1}), Quads(Pick(Bytes(16), {255, 0, 0}, 3))),
      Row("79 Flag 6: 24 bits", 79, tex, {{"", 0, 160, 32, 0x00020004, 6}},
          Cat({Dds(2, 4, 0, 24), tex})),
      Row("124 palette, signed height", 124, tex, {{"", 0, 160, 32, 0x8000FFFF, 0x31}},
          Cat({Dds(0xFFFF8000, 0xFFFF, 3, 'P'), tex})),
      Row("123 coded palette moves first", 123, coded, {{"", 0, 1168, 24, 0x00040004, 0x11}},
          Cat({Dds(4, 4, 1, 'P'), Bytes(1024, 0x22), Bytes(16, 0x11)})),
      Row("124 32 bits", 124, bgra, {{"u.dds", 0, 136, 8, 0x00010002, 2}},
          Cat({Dds(1, 2, 0, 32), bgra}), Swap02(bgra, 4)),

      Row("102 8 bits", 102, snd, {{"s.wav", 8, 1044, 1000, 0, 1}},
          Cat({Wav(1036, 11025, 8), Le({1000}), samples}), Cat({Text("1 1 11025 1000 "), samples})),
      Row("126 16 bits", 126, snd, {{"b.wav", 8, 1044, 1000, 32000, 1}},
          Cat({Wav(1036, 32000, 16), Le({1000}), samples}), Cat({Text("1 2 32000 500 "), samples})),
      Row("41 40-byte header", 41, gaba, {{"c.wav", 0, 1040, 1000, 44100, 1}},
          Cat({Wav(1032, 44100, 16), gaba}), Cat({Text("1 2 44100 498 "), Pattern(996)})),
      Row("131 JFIF start", 131, d13, {{"", 0, 23, 13, 0, 0}},
          Cat({{0xFF, 0xD8, 0xFF, 0xE0, 0, 16}, Text("JFIF"), d13})),
      Row("155 under 16 bytes", 155, ilbm, {{"", 0, 15, 15, 0, 0}}, kRefused),
  };
}

TEST(MediaWriters, EachWritesExactlyOrRefuses) {
  for (const Row& r : Rows()) {
    auto o = SessionOver(r.format, r.stored, r.entries);
    Bytes out;
    EXPECT_EQ(o->extract(0, out), r.written ? kOk : kBadData) << r.what;
    if (r.written) EXPECT_EQ(out, *r.written) << r.what;
    if (r.written) EXPECT_EQ(o->extract(0), out) << r.what << ": the entry is left as it was";
  }
}

// The expected files as real decoders read them. Pictures: ImageMagick's RGBA, top row first.
// Sounds: Python's wave module, channels, sample width, rate and frame count, then the samples.
TEST(MediaWriters, RealDecodersReadTheExpectedPixelsAndSamples) {
  if (std::system("command -v convert >/dev/null && command -v python3 >/dev/null") != 0)
    GTEST_SKIP() << "skipped: ImageMagick's convert or python3 is not installed";
  const std::string wave =
      "python3 -c \"import sys, wave\nw = wave.open(sys.argv[1])\nsys.stdout.buffer.write(b'%d %d "
      "%d %d ' % w.getparams()[:4] + w.readframes(w.getnframes()))\" '";
  TempDir dir;
  for (const Row& r : Rows()) {
    if (r.decoded.empty()) continue;
    const std::string& name = r.entries[0].Name;
    const std::string path = dir.write("out" + name.substr(name.rfind('.')), *r.written);
    const std::string command = name.ends_with(".wav")
                                    ? wave + path + "'"
                                    : "convert '" + path + "' -auto-orient -depth 8 rgba:-";
    std::system((command + " >'" + path + ".out' 2>/dev/null").c_str());
    EXPECT_EQ(ReadFile(path + ".out"), r.decoded) << r.what;
  }
}

// Each built-in palette is its data file's red-green-blue hex lines as blue-green-red-0.
TEST(MediaPalettes, AreTheDataFilesTheyComeFrom) {
  const auto data = std::filesystem::path(__FILE__).parent_path().parent_path() / "data";
  int n = 0;
  for (auto* p : {&kBuiltInPalette1, &kBuiltInPalette2, &kBuiltInPalette3, &kBuiltInPalette4}) {
    std::ifstream in(data / ("palette" + std::to_string(++n) + ".txt"));
    if (!in) GTEST_SKIP() << "skipped: the data files are not beside the sources";
    Bytes colours;
    for (std::string line; std::getline(in, line);) {
      unsigned r, g, b;
      if (std::sscanf(line.c_str(), "%x %x %x", &r, &g, &b) == 3)
        colours = Cat({colours, {uint8_t(b), uint8_t(g), uint8_t(r), 0}});
    }
    EXPECT_EQ(colours, Bytes(p->begin(), p->end())) << "palette " << n;
  }
}

}  // namespace
}  // namespace cairn::test
