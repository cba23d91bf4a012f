// Samples and refusals of the directories named by content or type, and of
// the readers whose entries come from their header.
#include <gtest/gtest.h>

#include <tuple>

#include "media/media.h"
#include "media/palettes.h"
#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

const Bytes kSheet = B().u32(~0u).u32(0).u32(32).fill(8).u32(2).fill(80).get();

B& Scrambled(B& b, std::string_view name, uint32_t i, uint32_t at, uint32_t size, uint32_t packed) {
  const auto n = uint32_t(name.size());
  b.u32(n);
  for (uint32_t k = 0; k < n; ++k) b.u8(uint8_t(name[k] ^ (n % 5 + 2 * (k + n) + i)));
  return b.u32(at).u32(size).u32(packed);
}

CAIRN_SAMPLES(ContentNameSamples) {
  B sheets = B().u32(0x20030507).u32(2).padTo(16).u32(48).u32(0).u32(8).u32(0).u32(56).u32(0);
  sheets.u32(104).u32(0).bytes(Pattern(8)).bytes(kSheet);
  const Bytes d = Pattern(41);
  B dir = B().u16(3).u16(3).u32(0).fill(2).name("TXT ", 4).name("README", 8).u32(74).u32(5);
  dir.fill(2).name("B?C", 4).name("DATA", 8).u32(79).u32(6).fill(6).name("NOTES", 8).u32(85);
  const Bytes snd = B().u32(0x06465345).u32(40).bytes(Pattern(40)).get(), tail = Pattern(64, 3);
  const Bytes bank = B().u32(0x2DA2DF95).u32(40).u32(48).u32(0).u32(88).u32(64).fill(16).get();
  Bytes pix;
  for (int r = 0; r < 64; ++r) pix = Cat({pix, Pattern(64)});  // every row alike
  const std::string name36 = "abcdefghijklmnopqrstuvwxyz0123456789";
  B raw = B().u32(2).text("FM").padTo(84).name(name36, 36).u32(164).name("pic.RAW", 36).u32(172);
  const Bytes x = Pattern(50), zx = Compress(x), zy = Compress(Text("hello"));
  const auto zxs = uint32_t(zx.size()), zys = uint32_t(zy.size());
  B scr = B().u8(1).u32(0).bytes(zx).bytes(zy);
  Scrambled(Scrambled(scr.patch32(1, uint32_t(scr.size())).u32(2), "a.b", 0, 5, 50, zxs),
            "dir/c.txt", 1, 5 + zxs, 5, zys);
  const Bytes sfx = Pattern(110, 5);
  B idx = B().text(std::string("GABA\x02\0\0\0", 8)).fill(4).name("boom", 16).u32(0).u32(40);
  idx.u32(22050).u32(6).fill(4).name("theme", 16).u32(40).u32(20).u32(7).u32(36).fill(4);
  B chunks = B().u32(0).u32(4).u32(0).u32(0x80134000).u32(0).u32(0x00030210).u32(20).fill(20, 1);
  chunks.u32(0x00030203).u32(24).u32(0x00030210).fill(20, 2).u32(0x12345678).u32(24).fill(24, 3);
  const Bytes& k = chunks.u32(0x00E34009).u32(16).fill(16, 4).get();
  B meg = B().u32(2).u32(2).u16(5).text("a.txt").u16(7).text("b/c.dat").fill(8).u32(4).u32(64);
  meg.u32(1).fill(8).u32(6).u32(70).u32(1).bytes(Pattern(40));
  return {
      Row({"sheet archive", 80, "art.bin", sheets.get()},
          {{"art.bin.000000", 48, Pattern(8)}, {"art.bin.000001.sht", 56, kSheet}}),
      Row({"embedded sheet", 84, "one.sht", kSheet}, {}),
      Row({"8.3 names", 88, "game.dat", dir.u32(30).bytes(d).get()},
          {{"README.TXT", 74, Slice(d, 0, 5)},
           {"DATA.B", 79, Slice(d, 5, 6)},
           {"NOTES", 85, Slice(d, 11, 30)}}),
      Entries({"offset-list sound bank", 102, "snd.bin", Cat({bank, snd, tail})},
              {{{"snd.bin.000000", 40, 48, 48, 0, 0}, snd},
               {{"_TO_WAV_\\snd.bin.000000.wav", 48, 84, 40, 0, 1},
                Cat({WavHeader(40, 11025, 8, true), Pattern(40)})},
               {{"snd.bin.000002", 88, 64, 64, 0, 0}, tail}}),
      Entries({"raw picture list", 104, "gfx.pod", raw.fill(8, 9).bytes(pix).get()},
              {{{name36.substr(0, 32), 164, 8, 8, 0, 0}, Bytes(8, 9)},
               {{"pic.RAW", 172, 4096, 4096, 0, 0}, pix},
               {{"_TO_BMP_\\pic.RAW.bmp", 172, 5174, 4096, 0, 1},
                Cat({BmpHeader(5174, 64, 64, 8),
                     Bytes(kBuiltInPalette4.begin(), kBuiltInPalette4.end()), pix})}}),
      Entries(
          {"scrambled names", 106, "data.pak", scr.get()},
          {{{"a.b", 5, 50, zxs, 0, 1}, x}, {{"dir\\c.txt", 5 + zxs, 5, zys, 0, 1}, Text("hello")}}),
      Entries({"indexed sound bank", 126, "sfx.bag", sfx, {}, {}, {{"sfx.idx", idx.get()}}},
              {{{"boom.wav", 0, 84, 40, 22050, 1},
                Cat({WavHeader(40, 22050, 16, true), Slice(sfx, 0, 40)})},
               {{"theme.mp3", 40, 20, 20, 7, 0}, Slice(sfx, 40, 20)}}),
      Row({"tagged chunk stream", 146, "s.bin", k}, {{"s.bin.000000.lzc", 32, Slice(k, 32, 16)},
                                                     {"s.bin.000001.lzc", 68, Slice(k, 68, 12)},
                                                     {"s.bin.000002.unk.bin", 80, Slice(k, 80, 32)},
                                                     {"s.bin.000003.o", 128, Slice(k, 128, 8)}}),
      Row({"name list", 156, "list.meg", meg.get()},
          {{"a.txt", 0, {}}, {"b\\c.dat", 70, Slice(Pattern(40), 6, 6)}}),
  };
}

Sample Vtf(uint32_t flags, uint32_t size, uint8_t flag) {
  B v = B().text(std::string("VTF\0\x07\0\0\0", 8)).padTo(16).u32(0x40004).u32(flags);
  const Bytes& t = v.bytes(Pattern(80)).get();
  return Entries({"texture", 79, "wall.vtf", t},
                 {{{"wall.dds", 104 - size, size + 128, size, 0x40004, flag},
                   Cat({DdsHeader(79, flag, 0x40004), Slice(t, 104 - size, size)})}});
}

CAIRN_SAMPLES(HeaderPictureSamples) {
  const Bytes p = Pattern(15);
  B pck;
  using F = std::tuple<const char*, uint8_t, uint32_t, uint32_t>;
  for (auto [name, type, size, at] : {F{"maps", 1, 0, 48}, F{"a", 0, 5, 288}, F{"b", 0, 7, 293},
                                      F{"x", 255, 0, 0}, F{"top.txt", 0, 3, 300}})
    pck.name(name, 32).fill(4).u8(type).fill(3).u32(size).u32(at);
  const Bytes x = Pattern(64), zx = Compress(x), y = Pattern(40, 3);
  const auto zxs = uint32_t(zx.size());
  B dir = B().fill(8).u16(2).u8(4).text("maps").fill(20).u8(2).text("a").u8(0).u8(9);
  dir.u8(8).text("maps\\x.z").u8(1).u32(0).u32(zxs).u32(64).u8(5).text("y.txt").u8(0).u32(zxs);
  const Bytes zd = Compress(dir.u32(40).u32(40).get());
  const Bytes wd = Cat({zx, y, zd, B().u32(uint32_t(zd.size()) + 4).get()});
  const Bytes z = Compress(Pattern(100)), rgb = Pattern(6);
  const auto zs = uint32_t(z.size());
  B mult = B().u32(3).u32(2).bytes(Pattern(8)).padTo(16384).u32(0).u32(0).u32(73).u32(1).fill(64);
  mult.bytes(Pattern(5)).u32(68 + zs).u32(1).fill(64).bytes(z);
  B img = B().text("IMG\x1A").fill(4).text("logo").u8(0).u8(8).u8(0).u16(2);
  img.bytes(rgb).u32(0x10002).fill(82, 7);
  return {
      Row({"nested folders", 150, "data.pck", pck.fill(48).bytes(p).get()},
          {{"maps\\a", 288, Slice(p, 0, 5)},
           {"maps\\b", 293, Slice(p, 5, 7)},
           {"top.txt", 300, Slice(p, 12, 3)}}),
      Entries({"compressed trailing directory", 142, "game.wd", wd},
              {{{"maps\\x.z", 0, 64, zxs, 0, 1}, x}, {{"y.txt", zxs, 40, 40, 0, 0}, y}}),
      Entries({"palette and image bank", 115, "pics.mult", mult.get()},
              {{{"_palette_", 8, 8, 8, 0, 0}, Pattern(8)},
               {{"pics.mult.000000", 0, 0, 0, 0, 0}, {}},
               {{"pics.mult.000001", 16464, 5, 5, 0, 0}, Pattern(5)},
               {{"pics.mult.000002", 16541, 0, zs, 0, 1}, Pattern(100)}}),
      Entries({"named palette picture", 78, "pic.img", img.get()},
              {{{"logo.pic.tga", 15, 868, 94, 0x10002, 8},
                Cat({TgaColourMappedStart(0x10002, 8, rgb, 2), Bytes(82, 7)})}}),
      Vtf(0x2000, 16, '3'),
  };
}

TEST(ContentNames, RefusesWhatTheDirectoriesCannotHold) {
  const SampleTable rows = ContentNameSamples(), more = HeaderPictureSamples();
  const uint32_t names = ByteView(rows[5].bytes).u32le(1) + 4;
  ExpectRefused({
      {"scrambled name of 261 bytes", 106, With(rows[5], names, 261)},
      {"record of an entry past the count", 156, With(rows[8], 60, 2)},
      {"folder inside itself", 150, With(more[0], 44, 0)},
      {"texture larger than the file", 79, With(more[4], 16, 0x400040)},
  });
}

}  // namespace
}  // namespace cairn::test
