// Files that are one stream behind a small header: the "PACK" compressed
// file, "Nemo Fi", "l33t", "AVIX" and "JDLZ".
#include <gtest/gtest.h>

#include <string>

#include "readers_sample.h"

namespace cairn::test {
namespace {

constexpr FormatId kPackRle = 7, kNemo = 35, kL33t = 37, kAvix = 47, kJdlz = 50;

// A zlib stream holding `data` in one stored block.
Bytes StoredZlib(const Bytes& data) {
  uint32_t a = 1, b = 0;
  for (uint8_t v : data) {
    a = (a + v) % 65521;
    b = (b + a) % 65521;
  }
  const auto n = static_cast<uint16_t>(data.size());
  ArchiveBuilder w;
  w.u8(0x78).u8(0x01).u8(0x01).u16(n).u16(static_cast<uint16_t>(~n));
  return w.bytes(data).u32be(b << 16 | a).get();
}

// A run-length stream of 90 bytes that decodes to "abczzzz": a literal run,
// a repeat run, then runs of length 0 that produce nothing.
ReaderSample PackRleSample() {
  ArchiveBuilder w;
  w.text("PACK").u16(0).u32(7).u32(0).u8(0x83).text("abc").u8(0x04).text("z").fill(84);
  return {"level.pak",
          w.get(),
          {{"level.unk", 14, 7, 90, 0, 0}},
          {Bytes{'a', 'b', 'c', 'z', 'z', 'z', 'z'}}};
}

// "Nemo Fi": two parts behind a 64-byte header.
Bytes NemoArchive(uint32_t compressed, const Bytes& part0, uint32_t unpacked0, const Bytes& part1,
                  uint32_t unpacked1) {
  ArchiveBuilder w;
  w.text("Nemo Fi").u8(0).padTo(24).u32(compressed);
  w.u32(static_cast<uint32_t>(part0.size())).u32(static_cast<uint32_t>(part1.size()));
  w.u32(unpacked1).padTo(60).u32(unpacked0).bytes(part0).bytes(part1);
  return w.get();
}

ReaderSample NemoStoredSample() {
  const Bytes a = Pattern(30, 30), b = Pattern(20, 31);
  return {"movie.nfi",
          NemoArchive(0, a, 30, b, 20),
          {{"movie.nfi0", 64, 30, 30, 0, 0}, {"movie.nfi1", 94, 20, 20, 0, 0}},
          {a, b}};
}

ReaderSample NemoCompressedSample() {
  const Bytes a = Pattern(30, 32), b = Pattern(20, 33);
  return {"movie.nfi",
          NemoArchive(7, StoredZlib(a), 30, StoredZlib(b), 20),
          {{"movie.nfi0", 64, 30, 41, 0, 1}, {"movie.nfi1", 64 + 41, 20, 31, 0, 1}},
          {a, b}};
}

ReaderSample L33tSample() {
  const Bytes data = Pattern(90, 34);
  return {"intro.dat",
          ArchiveBuilder().text("l33t").u32(90).bytes(StoredZlib(data)).get(),
          {{"intro", 8, 90, 101, 0, 0}},
          {data}};
}

// A 8 x 5 picture of 16-bit pixels: height 5 is the product of the words at
// 8 and 16, bits per pixel the byte at 12.
ReaderSample AvixSample() {
  const Bytes pixels = Pattern(80, 35);
  ArchiveBuilder w;
  w.text("AVIX").u32(8).u32(5).u8(16).fill(3, 0xAB).u32(1).padTo(24).bytes(pixels);
  ArchiveBuilder tga;
  tga.fill(2).u8(2).fill(9).u16(8).u16(5).u8(16).u8(0x20).bytes(pixels);
  return {"pic.avx", w.get(), {{"pic.tga", 24, 98, 80, 8 | 5 << 16, 16}}, {tga.get()}};
}

// A literal 'a', then a match of distance 1 and length 10: eleven 'a'.
ReaderSample JdlzSample() {
  ArchiveBuilder w;
  w.text("JDLZ").u8(2).fill(3).u32(11).u32(16 + 5);
  w.u8(0x02).u8(0x01).text("a").u8(0x00).u8(0x07);
  return {"tex.jdz", Padded(w), {{"tex", 16, 11, 5, 0, 0}}, {Bytes(11, 'a')}};
}

TEST(SingleStream, EachFormatListsAndExtractsExactly) {
  const std::pair<FormatId, ReaderSample> samples[] = {
      {kPackRle, PackRleSample()}, {kNemo, NemoStoredSample()}, {kNemo, NemoCompressedSample()},
      {kL33t, L33tSample()},       {kAvix, AvixSample()},       {kJdlz, JdlzSample()}};
  for (const auto& [format, sample] : samples) {
    SCOPED_TRACE(format);
    ExpectSample(format, sample);
  }
}

TEST(SingleStream, NamesWithoutExtensionKeepTheWholeFileName) {
  const struct {
    FormatId format;
    Bytes bytes;
    const char* fileName;
    const char* listed;
  } cases[] = {{kPackRle, PackRleSample().bytes, "LEVEL", "LEVEL.unk"},
               {kL33t, L33tSample().bytes, ".intro", ".intro"},
               {kAvix, AvixSample().bytes, "a.b.c", "a.b.tga"}};
  for (const auto& k : cases) {
    auto o = OpenBytesAs(k.format, k.bytes, k.fileName);
    ASSERT_EQ(o->result, kOk);
    EXPECT_EQ(o->listing().at(0).name, k.listed);
  }
}

TEST(SingleStream, EntriesPastTheEndAreListedButDoNotExtract) {
  // A stored size below the 16-byte header wraps around: still listed.
  auto jdlz = OpenBytesAs(
      kJdlz, Padded(ArchiveBuilder().text("JDLZ").u8(2).fill(3).u32(11).u32(10)), "t.jdz");
  ASSERT_EQ(jdlz->result, kOk);
  EXPECT_EQ(jdlz->listing(), (std::vector<Listed>{{"t", 16, 11, 0xFFFFFFFA, 0, 0}}));
  Bytes out;
  EXPECT_EQ(jdlz->extract(0, out), kBadData);

  // The second part claims 500 stored bytes; 10 follow.
  ArchiveBuilder w;
  w.text("Nemo Fi").u8(0).padTo(28).u32(40).u32(500).u32(500).padTo(60).u32(40);
  w.bytes(Pattern(40)).bytes(Pattern(10));
  auto nemo = OpenBytesAs(kNemo, w.get(), "m.nfi");
  ASSERT_EQ(nemo->result, kOk);
  EXPECT_EQ(nemo->listing(),
            (std::vector<Listed>{{"m.nfi0", 64, 40, 40, 0, 0}, {"m.nfi1", 104, 500, 500, 0, 0}}));
  EXPECT_EQ(nemo->extract(1, out), kBadData);
  EXPECT_EQ(nemo->extract(0), Pattern(40));
}

// clang-format off
CAIRN_FIXTURE(PackRleFixture) { return SampleFixture("PACK compressed", kPackRle, PackRleSample()); }
CAIRN_FIXTURE(NemoFixture) { return SampleFixture("Nemo Fi", kNemo, NemoStoredSample()); }
CAIRN_FIXTURE(L33tFixture) { return SampleFixture("l33t", kL33t, L33tSample()); }
CAIRN_FIXTURE(AvixFixture) { return SampleFixture("AVIX", kAvix, AvixSample()); }
CAIRN_FIXTURE(JdlzFixture) { return SampleFixture("JDLZ", kJdlz, JdlzSample()); }
// clang-format on

}  // namespace
}  // namespace cairn::test
