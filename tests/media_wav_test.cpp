// The WAV writers and the fixed starts: header fields, what follows them, and
// Python's wave module reading the sounds back.
#include <gtest/gtest.h>

#include "media/media.h"
#include "media_support.h"

namespace cairn::test {
namespace {

Bytes Fmt(uint32_t riff, uint32_t rate, uint32_t perSecond, uint16_t align, uint16_t bits) {
  return ArchiveBuilder()
      .text("RIFF")
      .u32(riff)
      .text("WAVEfmt ")
      .u32(16)
      .u16(1)
      .u16(1)
      .u32(rate)
      .u32(perSecond)
      .u16(align)
      .u16(bits)
      .text("data")
      .get();
}

TEST(WavBuild, HeadersOfBothLengths) {
  EXPECT_EQ(WavHeader(1000, 11025, 8, true),
            Join(Fmt(1036, 11025, 11025, 1, 8), ArchiveBuilder().u32(1000).get()));
  EXPECT_EQ(WavHeader(1000, 22050, 16, true),
            Join(Fmt(1036, 22050, 44100, 2, 16), ArchiveBuilder().u32(1000).get()));
  EXPECT_EQ(WavHeader(1000, 22050, 16, false), Fmt(1032, 22050, 44100, 2, 16));
  // A RIFF size that would wrap is refused.
  EXPECT_NO_THROW(WavHeader(UINT32_MAX - 36, 1, 8, true));
  EXPECT_THROW(WavHeader(UINT32_MAX - 35, 1, 8, true), BadData);
  EXPECT_NO_THROW(WavHeader(UINT32_MAX - 32, 1, 16, false));
  EXPECT_THROW(WavHeader(UINT32_MAX - 31, 1, 16, false), BadData);
}

TEST(WavMethods, SoundsGetTheirHeaderAndTheStoredSamples) {
  const Bytes samples = Pattern(1000);
  const Bytes file = Join(Bytes(8, 0xEE), samples);

  MediaArchive esf(102, file);
  esf.add("s.000000", 0, 1008, 1008, 0, 0).add("_TO_WAV_\\s.000000.wav", 8, 1044, 1000, 0, 1);
  EXPECT_EQ(esf.extract(0), file);
  const Bytes wav8 = esf.extract(1);
  ASSERT_EQ(wav8.size(), 1044u);
  EXPECT_EQ(wav8, Join(WavHeader(1000, 11025, 8, true), samples));
  EXPECT_EQ(ByteView(wav8).u32le(4), 1036u);

  MediaArchive bag(126, file);
  bag.add("a.wav", 8, 1044, 1000, 32000, 1).add("b", 8, 1000, 1000, 32000, 0);
  EXPECT_EQ(bag.extract(0), Join(WavHeader(1000, 32000, 16, true), samples));
  EXPECT_EQ(bag.extract(1), samples);

  // The short header: the stored sound's first four bytes stand where the
  // data size belongs, and the RIFF size is the file's length less 8.
  MediaArchive gaba(41, file);
  gaba.add("c.wav", 8, 1040, 1000, 44100, 1).add("d", 8, 1000, 1000, 44100, 0);
  const Bytes wav40 = gaba.extract(0);
  ASSERT_EQ(wav40.size(), 1040u);
  EXPECT_EQ(wav40, Join(Fmt(1032, 44100, 88200, 2, 16), samples));
  EXPECT_EQ(gaba.extract(1), samples);

  // Samples past the end of the archive.
  MediaArchive cut(102, file);
  cut.add("x.wav", 8, 1045, 1001, 0, 1);
  Bytes out;
  EXPECT_EQ(cut.extract(0, out), kBadData);
}

TEST(PrefixMethods, JpegAndIlbmStarts) {
  EXPECT_EQ(JpegStart(), (Bytes{0xFF, 0xD8, 0xFF, 0xE0, 0x00, 0x10, 'J', 'F', 'I', 'F'}));
  const Bytes data = Pattern(0x1234);
  MediaArchive jpg(131, data);
  jpg.add("photo01.jpg", 0, 0x1234 + 10, 0x1234, 0, 0);
  EXPECT_EQ(jpg.extract(0), Join(JpegStart(), data));

  // The picture's own first 16 bytes give way to the FORM start; only the
  // bytes behind them are reported, in the copy and in the final total.
  MediaArchive iff(155, data);
  std::vector<uint32_t> reports;
  iff.opened->session.progress = [&](const std::string&, uint32_t n) {
    reports.push_back(n);
    return 1;
  };
  iff.add("p.iff", 0, 0x1234, 0x1234, 0, 0)
      .add("tiny", 0, 15, 15, 0, 0)
      .add("far", 0xFFFFFFF8u, 0x20, 0x20, 0, 0);
  const Bytes ilbm = iff.extract(0);
  EXPECT_EQ(Slice(ilbm, 0, 16),
            (ArchiveBuilder().text("FORM").u8(0).u8(0).u8(0x12).u8(0x2C).text("ILBMBMHD").get()));
  EXPECT_EQ(Slice(ilbm, 16, 0x1234 - 16), Slice(data, 16, 0x1234 - 16));
  EXPECT_EQ(reports, (std::vector<uint32_t>{0x1224, 0x1224}));
  EXPECT_EQ(iff.extract(0), ilbm);
  Bytes out;
  EXPECT_EQ(iff.extract(1, out), kBadData);
  // Data past the end of the archive is refused, not read from its start.
  EXPECT_EQ(iff.extract(2, out), kBadData);
}

// ---- A real decoder reads what was written --------------------------------

// Channels, sample width, rate, frame count and the samples of each file, as
// Python's wave module reads them (one interpreter for all: it starts slowly).
std::optional<Bytes> ReadWaves(const std::vector<std::string>& paths) {
  std::string command =
      "python3 -c \"import sys, wave\n"
      "for p in sys.argv[1:]:\n"
      " w = wave.open(p)\n"
      " sys.stdout.buffer.write(b'%d %d %d %d ' % (w.getnchannels(), w.getsampwidth(), "
      "w.getframerate(), w.getnframes()) + w.readframes(w.getnframes()))\"";
  for (const std::string& p : paths) command += " '" + p + "'";
  return Capture(command + " 2>/dev/null");
}

TEST(WavDecoded, PythonReadsTheFieldsAndSamples) {
  CAIRN_NEED_TOOL("python3");
  const Bytes samples = Pattern(600);
  // For the short header the stored sound starts with its own data size.
  const Bytes gabaSound = Join(ArchiveBuilder().u32(596).get(), Slice(samples, 4, 596));
  MediaArchive a(102, samples);
  a.add("a.wav", 0, 644, 600, 0, 1);
  const std::string p8 = a.dir.path("a.wav");
  ASSERT_EQ(a.extractTo(0, p8), kOk);

  MediaArchive b(126, samples);
  b.add("b.wav", 0, 644, 600, 22050, 1);
  const std::string p16 = b.dir.path("b.wav");
  ASSERT_EQ(b.extractTo(0, p16), kOk);

  MediaArchive c(41, gabaSound);
  c.add("c.wav", 0, 640, 600, 8000, 1);
  const std::string p40 = c.dir.path("c.wav");
  ASSERT_EQ(c.extractTo(0, p40), kOk);
  Bytes expected = Join(Text("1 1 11025 600 "), samples);
  expected = Join(Join(expected, Text("1 2 22050 300 ")), samples);
  expected = Join(Join(expected, Text("1 2 8000 298 ")), Slice(samples, 4, 596));
  EXPECT_EQ(ReadWaves({p8, p16, p40}), expected);
}

TEST(WavDecoded, SoxAgreesOnTheFields) {
  CAIRN_NEED_TOOL("soxi");
  MediaArchive b(126, Pattern(800));
  b.add("b.wav", 0, 844, 800, 16000, 1);
  const std::string p = b.dir.path("b.wav");
  ASSERT_EQ(b.extractTo(0, p), kOk);
  EXPECT_EQ(Capture("for o in r c b s; do soxi -$o '" + p + "'; done"),
            Text("16000\n1\n16\n400\n"));
}

}  // namespace
}  // namespace cairn::test
