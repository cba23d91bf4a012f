// Files that wrap one payload behind a header of their own, listed under the
// archive's own name: the single-entry wrappers (ZIP archives with scrambled
// or stripped signatures, XOR, zlib, the IFF start put back) and the single
// streams ("PACK" run-length, "Nemo Fi", "l33t", "AVIX", "JDLZ"). The names
// keep all but the last extension, or the whole name when that is all
// extension.
#include <gtest/gtest.h>
#include <zlib.h>

#include <string>
#include <vector>

#include "samples.h"
#include "util/bytes.h"

namespace cairn::test {
namespace {

void Put(Bytes& b, size_t at, std::string_view s) {
  for (size_t i = 0; i < s.size(); ++i) b.at(at + i) = static_cast<uint8_t>(s[i]);
}

// A ZIP archive of two stored members whose headers carry general purpose
// flag 2, and where its headers lie.
struct Zip {
  Bytes bytes;
  size_t locals[2], centrals[2], end;
};

Zip BuildZip(std::string_view comment) {  // on the first central header
  Zip z{};
  ArchiveBuilder b, c;
  const std::string names[2] = {"readme.txt", "maps/map01.txt"};
  for (size_t i = 0; i < 2; ++i) {
    const Bytes data = Pattern(40 + i * 7, static_cast<uint8_t>(45 + i));
    const auto n = static_cast<uint32_t>(data.size()), length = uint32_t(names[i].size());
    const auto crc = static_cast<uint32_t>(crc32(0, data.data(), n));
    const std::string_view note = i == 0 ? comment : "";
    z.locals[i] = b.size();
    z.centrals[i] = c.size();
    b.text("PK\3\4").u16(20).u16(2).u16(0).u16(0).u16(0x21).u32(crc).u32(n).u32(n);
    b.u16(uint16_t(length)).u16(0).text(names[i]).bytes(data);
    c.text("PK\1\2").u16(20).u16(20).u16(2).u16(0).u16(0).u16(0x21).u32(crc).u32(n).u32(n);
    c.u16(uint16_t(length)).u16(0).u16(uint16_t(note.size())).u16(0).u16(0).u32(0);
    c.u32(uint32_t(z.locals[i])).text(names[i]).text(note);
  }
  const auto central = static_cast<uint32_t>(b.size());
  for (size_t& at : z.centrals) at += central;
  z.end = central + c.size();
  b.bytes(c.get()).text("PK\5\6").u16(0).u16(0).u16(2).u16(2);
  z.bytes = b.u32(uint32_t(c.size())).u32(central).u16(0).get();
  return z;
}

// Local headers marked "F5CD", central headers "F512", the end record's
// signature gone.
Bytes Scramble(const Zip& z) {
  Bytes b = z.bytes;
  for (size_t at : z.locals) Put(b, at, "F5CD");
  for (size_t at : z.centrals) Put(b, at, "F512");
  Put(b, z.end, std::string(4, '\0'));
  return b;
}

// The first signature reads "IPF1"; the central headers lost their
// signatures and names.
Bytes Strip(const Zip& z) {
  Bytes b = z.bytes;
  Put(b, 0, "IPF1");
  for (size_t at : z.centrals) Put(b, at, std::string(4, '\0'));
  for (size_t at : z.centrals) Put(b, at + 46, std::string(b.at(at + 28), '\0'));
  return b;
}

Sample One(std::string label, FormatId id, std::string fileName, Bytes bytes, Listed entry,
           Bytes data) {
  return {std::move(label), id, std::move(fileName), std::move(bytes), {entry}, {data}};
}

uint32_t Size(const Bytes& b) {
  return static_cast<uint32_t>(b.size());
}

// "Nemo Fi": two parts behind a 64-byte header; a word at 24 other than 0
// marks them as zlib streams.
Bytes Nemo(uint32_t zlib, const Bytes& part0, uint32_t size0, const Bytes& part1, uint32_t size1) {
  ArchiveBuilder w;
  w.text("Nemo Fi").u8(0).padTo(24).u32(zlib).u32(Size(part0)).u32(Size(part1)).u32(size1);
  return w.padTo(60).u32(size0).bytes(part0).bytes(part1).get();
}

// A literal 'a', then a match of distance 1 and length 10: eleven 'a'.
Bytes Jdlz() {
  ArchiveBuilder w;
  w.text("JDLZ").u8(2).fill(3).u32(11).u32(16 + 5).u8(2).u8(1).text("a").u8(0).u8(7);
  return w.padTo(kHeaderSize).get();
}

CAIRN_SAMPLES(WrappedPayloadSamples) {
  const Zip bonus = BuildZip("a comment"), extras = BuildZip("");
  ArchiveBuilder gzip, video, mp3, sound, iff, rle, avix, tga;
  gzip.u8(0x1F).u8(0x8B).u8(8).fill(6).u8(3).bytes(Pattern(100, 47));
  // The magic's last byte is the video's first.
  for (uint8_t v : Bytes{0x55, 0x42, 0x56, 0x9E, 0x01, 0xF1, 0x53, 0x4B, 0xFE, 0xD0,
                         0x42, 0x1E, 0x4B, 0x4D, 0xDD, 0x78, 0xF1, 0x41, 0x01, 0x78,
                         0x80, 0x08, 0x9E, 0x38, 0x1F, 0x13, 0xA8, 0xD3, 0x6C, 0xFC})
    video.u8(v);
  video.text("BIKi").bytes(Pattern(100, 48));
  mp3.u8(0xFF).u8(0xFB).u8(0x90).u8(0x64).bytes(Pattern(100, 49));
  sound.u8(1).u8(0).u8(0).u8(0x10).u8(2).u8(0x44).u8(0xAC).u8(0).fill(11).bytes(mp3.get());
  const Bytes save = Pattern(600, 50), level = Pattern(400, 51), tune = Pattern(200, 0xB6);
  const Bytes saveZ = Compress(save), levelZ = Compress(level, 9);
  Bytes xored = tune;
  for (uint8_t& v : xored) v ^= 0x6B;
  iff.text("FORM").u32be(104).text("ILBM").text("BMHD").u32be(20).u16be(16).u16be(4).fill(4);
  iff.u8(1).fill(11).text("BODY").u32be(64).bytes(Pattern(64, 52));
  Bytes wrapped = iff.get();
  Put(wrapped, 0, "XXXXXXXXXXXXXXXX");
  // A literal run, a repeat run, then runs of length 0 that give nothing.
  rle.text("PACK").u16(0).u32(7).u32(0).u8(0x83).text("abc").u8(0x04).text("z").fill(84);
  const Bytes nemo0 = Pattern(30, 30), nemo1 = Pattern(20, 31), l33t = Pattern(90, 34);
  const Bytes nemoZ0 = Compress(nemo0), nemoZ1 = Compress(nemo1), l33tZ = Compress(l33t);
  // Height 5 is the product of the words at 8 and 16; bits per pixel at 12.
  const Bytes pixels = Pattern(80, 35);
  avix.text("AVIX").u32(8).u32(5).u8(16).fill(3, 0xAB).u32(1).padTo(24).bytes(pixels);
  tga.fill(2).u8(2).fill(9).u16(8).u16(5).u8(16).u8(0x20).bytes(pixels);
  const uint32_t zipSize = Size(bonus.bytes), strippedSize = Size(extras.bytes);
  return {
      One("F5CD", 32, "BONUS", Scramble(bonus), {"BONUS.zip", 0, zipSize, zipSize, 0, 0},
          bonus.bytes),
      One("IPF1", 33, "extras.ipf", Strip(extras),
          {"extras.zip", 0, strippedSize, strippedSize, 0, 0}, extras.bytes),
      One("H4CAMPAIGN", 43, "campaign.h4c",
          ArchiveBuilder().text("H4CAMPAIGN").fill(5).bytes(gzip.get()).get(),
          {"campaign.gz", 15, 110, 110, 0, 0}, gzip.get()),
      One("signature row 51", 51, "movie.vid", video.get(), {"movie.bik", 30, 104, 104, 0, 0},
          Slice(video.get(), 30, 104)),
      One("signature row 55", 55, ".snd", sound.get(), {".snd.mp3", 19, 104, 104, 0, 0}, mp3.get()),
      One("CPAL savegame 3.3", 56, "save01.sav",
          ArchiveBuilder().text("CPAL savegame 3.3\n\n").u8(0).u32(600).bytes(saveZ).get(),
          {"save01", 24, 600, Size(saveZ), 0, 1}, save),
      One("XOR-scrambled sound", 101, "my.game.adf", xored, {"my.game.mp3", 0, 200, 200, 0, 0x6B},
          tune),
      One("size-prefixed zlib", 147, "level.clz", ArchiveBuilder().u32(400).bytes(levelZ).get(),
          {"level", 4, 400, Size(levelZ), 0, 1}, level),
      One("wrapped IFF", 155, "picture.iff", wrapped, {"picture.iff", 0, 112, 112, 0, 0},
          iff.get()),
      One("PACK run-length", 7, "LEVEL", rle.get(), {"LEVEL.unk", 14, 7, 90, 0, 0},
          Text("abczzzz")),
      {"Nemo Fi, stored",
       35,
       "movie.nfi",
       Nemo(0, nemo0, 30, nemo1, 20),
       {{"movie.nfi0", 64, 30, 30, 0, 0}, {"movie.nfi1", 94, 20, 20, 0, 0}},
       {nemo0, nemo1}},
      {"Nemo Fi, zlib",
       35,
       "movie.nfi",
       Nemo(7, nemoZ0, 30, nemoZ1, 20),
       {{"movie.nfi0", 64, 30, Size(nemoZ0), 0, 1},
        {"movie.nfi1", 64 + Size(nemoZ0), 20, Size(nemoZ1), 0, 1}},
       {nemo0, nemo1}},
      One("l33t", 37, "intro.dat", ArchiveBuilder().text("l33t").u32(90).bytes(l33tZ).get(),
          {"intro", 8, 90, Size(l33tZ), 0, 0}, l33t),
      One("AVIX", 47, "pic.v2.avx", avix.get(), {"pic.v2.tga", 24, 98, 80, 8 | 5 << 16, 16},
          tga.get()),
      One("JDLZ", 50, ".tex", Jdlz(), {".tex", 16, 11, 5, 0, 0}, Bytes(11, 'a')),
  };
}

TEST(WrappedPayloads, PayloadsThatDoNotHoldTogetherFailToExtract) {
  const Zip z = BuildZip("a comment");
  Bytes unknown = Scramble(z), overshoot = Scramble(z), stripped = Strip(BuildZip(""));
  Bytes nemo = Nemo(0, Pattern(40), 40, Pattern(10), 500), jdlz = Jdlz();
  Put(unknown, z.locals[1], "XXXX");
  PutU16le(overshoot, z.centrals[1] + 32, 4);  // a comment longer than it is
  PutU32le(stripped, stripped.size() - 6, Size(stripped) + 100);
  PutU32le(nemo, 32, 500);  // 500 bytes claimed, 10 there
  PutU32le(jdlz, 12, 10);   // the stored size wraps below the header: still listed
  const struct {
    const char* what;
    FormatId format;
    Bytes bytes;
    size_t entry;
  } cases[] = {{"a ZIP header of no kind", 32, unknown, 0},
               {"ZIP headers that step past the end record", 32, overshoot, 0},
               {"a central directory past the end", 33, stripped, 0},
               {"a part past the end", 35, nemo, 1},
               {"a stored size that wraps", 50, jdlz, 0}};
  for (const auto& k : cases) {
    SCOPED_TRACE(k.what);
    auto o = OpenBytesAs(k.format, k.bytes);
    ASSERT_EQ(o->result, kOk);
    Bytes out;
    EXPECT_EQ(o->extract(k.entry, out), kBadData);
  }
}

}  // namespace
}  // namespace cairn::test
