// Samples and refusals of the image lists, trailing tables and companion indexes.
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

Bytes Image(uint16_t w, uint16_t h, uint8_t bits, size_t size, uint8_t seed) {
  return Cat(
      {B().u32(0xFFFFFFFF).u32(0).u16(w).u16(h).u8(bits).fill(3).get(), Pattern(size - 16, seed)});
}

CAIRN_SAMPLES(ImageListSamples) {
  const Bytes a = Pattern(5, 1), b = Pattern(70, 2), c = Pattern(12, 3),
              p = Image(2, 2, 24, 112, 4);
  const Bytes q = Image(4, 2, 8, 136, 5), s = Image(4, 2, 8, 128, 6), x = Image(16, 16, 8, 352, 7);
  const Bytes y = Image(16, 16, 8, 384, 8);
  B list81, list82, list83, end91, end93, trail, names, fat, fatIndex, rfd, rfh, pak, dir, psc;
  list81.u32(0xFFFFFFFF).u32(0).u32(0).u32(80).u32(80).padTo(80).u32(0xFFFFFFFF).padTo(100).u32(2);
  list81.padTo(112).bytes(p).bytes(q);
  list82.u32(0xFFFFFFFF).u32(0).u32(32).padTo(32).bytes(s);
  list83.text("LIST").padTo(64).u32(0xFFFFFFFF).u32(0).u32(32).padTo(84).u32(2).padTo(96);
  list83.bytes(x).bytes(y);
  end91.padTo(12).u32(2).padTo(24).u32(8).u32(107).bytes(a).bytes(b).u32(32).u32(5);
  end91.fill(12).text("a.txt").u8(0).u32(37).u32(70).fill(12).text("x/b.dat").u8(0);
  end93.text("ENDT").u32(104).u32(104).u32(1).bytes(Pattern(84, 3)).u32(7).u32(60);
  constexpr uint32_t kCount = 0x0A68, kData = 2 + 12 * kCount;
  const Bytes data = Pattern(kCount, 4);
  std::vector<std::tuple<std::string, uint32_t, Bytes>> named;
  trail.u16(kCount);
  for (uint32_t i = 0; i < kCount; ++i) {
    trail.u32(i == 0 ? 0xFF0A7B2B : 0).u32(kData + i).u32(1);
    named.emplace_back(i == 0 ? "fifteen_letters" : "n" + std::to_string(i), kData + i,
                       Slice(data, i, 1));
    names.name(std::get<0>(named.back()), 15);
  }
  trail.bytes(data).bytes(names.get());
  fat.bytes(a).bytes(b).bytes(c).padTo(104);
  fatIndex.u32(9).u32(0).u32(5).u32(0).u32(5).text("a.txt");
  fatIndex.u32(9).u32(5).u32(70).u32(0).u32(7).text("x/b.dat");
  const Bytes bz = Compress(b), dz = Compress(b, 9);
  const auto bzSize = uint32_t(bz.size()), dzSize = uint32_t(dz.size());
  rfd.u32(5).bytes(a).u32(70).bytes(bz).padTo(104);
  rfh.u32(5).u32(0).u32(0).u32(9).u32(5).u32(0).text("a.txt");
  rfh.u32(7).u32(0).u32(1).u32(bzSize + 4).u32(70).u32(9).text("x/b.dat");
  pak.bytes(c).u32(0).u32(0x5A5A5A1C).bytes(dz).padTo(104);
  dir.text("a\x01.\x40t\x81x\xFFt\xC8").u32(0).u32(12).text("b\x08").u32(12).u32(dzSize + 8);
  constexpr uint32_t kKey = 0x3A91C4D7;
  psc.u32(1 ^ kKey).padTo(32);
  for (int i = 0; i < 4; ++i) psc.u32(0x99A1A220);
  const Bytes jpg = Cat({Text("\xFF\xD8\xFF\xE0"), a}), bik = Cat({Text("BIKi"), b});
  psc.padTo(132).u32(9 ^ kKey).bytes(jpg).u32(74 ^ kKey).bytes(bik).u32(12 ^ kKey).bytes(c);
  return {
      Row({"image list behind a table", 81, "a.spr", list81.get()},
          {{"a.spr.000000", 112, p}, {"a.spr.000001", 224, q}}),
      Row({"image list of one image", 82, "one.spr", list82.get()}, {{"one.spr", 32, s}}),
      Row({"image list after 96 bytes", 83, "b.spr", list83.get()},
          {{"b.spr.000000", 96, x}, {"b.spr.000001", 448, y}}),
      Row({"name directory at the end", 91, "e.dat", end91.get(), {}, {}, {}, false},
          {{"a.txt", 32, a}, {"x\\b.dat", 37, b}}),
      Row({"offset table at the end", 93, "t.bin", end93.get()},
          {{"t.bin.000000", 16, Slice(end93.get(), 16, 44)},
           {"t.bin.000001", 60, Slice(end93.get(), 60, 44)}}),
      Row({"trailing name table", 116, "t.dat", trail.get()}, named),
      Row({"fat index", 143, "d.big", fat.get(), {}, {}, {{"d.fat", fatIndex.get()}}},
          {{"a.txt", 0, a}, {"x\\b.dat", 5, b}}),
      Entries({"rfh index", 108, "d.rfd", rfd.get(), {}, {}, {{"d.rfh", rfh.get()}}},
              {{{"a.txt", 4, 5, 5, 0, 0}, a}, {{"x\\b.dat", 13, 70, bzSize, 0, 1}, b}}),
      Entries({"dir index", 121, "d.pak", pak.get(), {}, {}, {{"d.dir", dir.get()}}},
              {{{"000000.a.txt", 0, 12, 12, 0, 0}, c}, {{"000001.b", 20, 70, dzSize, 0, 1}, b}}),
      Row({"scrambled size chain", 154, "intro.vid", psc.get()},
          {{"intro.vid.000000.jpg", 136, jpg},
           {"intro.vid.000001.bik", 149, bik},
           {"intro.vid.000002", 227, c}}),
  };
}

TEST(ImageLists, RefusesBrokenListsAndTables) {
  const SampleTable rows = ImageListSamples();
  ExpectRefused({
      {"91 directory past the end", 91, With(rows[3], 28, 0xFFFFFFF0)},
  });
}

}  // namespace
}  // namespace cairn::test
