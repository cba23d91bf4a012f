// Files that wrap one payload behind a header of their own.
#include <gtest/gtest.h>
#include <zlib.h>

#include <string>
#include <vector>

#include "samples.h"
#include "util/bytes.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

// Two stored members; `sig` holds the signatures of both local headers, the
// central headers and the end record, 4 bytes each.
Bytes Zip(std::string_view sig, bool names = true, std::string_view comment = "") {
  B b, c;
  const std::string file[2] = {"readme.txt", "maps/map01.txt"};
  for (size_t i = 0; i < 2; ++i) {
    const Bytes data = Pattern(40 + i * 7, static_cast<uint8_t>(45 + i));
    const auto n = static_cast<uint32_t>(data.size());
    const auto crc = static_cast<uint32_t>(crc32(0, data.data(), n));
    const auto length = static_cast<uint16_t>(file[i].size());
    const std::string_view note = i == 0 ? comment : "";
    c.text(sig.substr(8, 4)).u16(20).u16(20).u16(2).u16(0).u16(0).u16(0x21).u32(crc).u32(n);
    c.u32(n).u16(length).u16(0).u16(static_cast<uint16_t>(note.size())).u16(0).u16(0).u32(0);
    c.u32(static_cast<uint32_t>(b.size())).text(names ? file[i] : std::string(length, 0));
    c.text(note);
    b.text(sig.substr(4 * i, 4)).u16(20).u16(2).u16(0).u16(0).u16(0x21).u32(crc).u32(n).u32(n);
    b.u16(length).u16(0).text(file[i]).bytes(data);
  }
  const auto central = static_cast<uint32_t>(b.size()), size = static_cast<uint32_t>(c.size());
  b.bytes(c.get()).text(sig.substr(12, 4)).u16(0).u16(0).u16(2).u16(2);
  return b.u32(size).u32(central).u16(0).get();
}
constexpr std::string_view kZip = "PK\3\4PK\3\4PK\1\2PK\5\6";
constexpr std::string_view kScrambled("F5CDF5CDF512\0\0\0\0", 16);
constexpr std::string_view kStripped("IPF1PK\3\4\0\0\0\0PK\5\6", 16);

uint32_t Size(const Bytes& b) {
  return static_cast<uint32_t>(b.size());
}

Bytes Nemo(uint32_t zlib, const Bytes& part0, uint32_t size0, const Bytes& part1, uint32_t size1) {
  B w;
  w.text("Nemo Fi").u8(0).padTo(24).u32(zlib).u32(Size(part0)).u32(Size(part1)).u32(size1);
  return w.padTo(60).u32(size0).bytes(part0).bytes(part1).get();
}

CAIRN_SAMPLES(WrappedPayloadSamples) {
  const Bytes bonus = Zip(kZip, true, "a comment"), extras = Zip(kZip);
  B video, mp3, sound, iff, rle, avix, tga, jdlz;
  const Bytes gz = Cat({{0x1F, 0x8B, 8}, Bytes(6), {3}, Pattern(100, 47)});
  video.text("\x55\x42\x56\x9E\x01\xF1\x53\x4B\xFE\xD0\x42\x1E\x4B\x4D\xDD\x78\xF1\x41\x01\x78");
  video.text("\x80\x08\x9E\x38\x1F\x13\xA8\xD3\x6C\xFC").text("BIKi").bytes(Pattern(100, 48));
  mp3.u8(0xFF).u8(0xFB).u8(0x90).u8(0x64).bytes(Pattern(100, 49));
  sound.u8(1).u8(0).u8(0).u8(0x10).u8(2).u8(0x44).u8(0xAC).u8(0).fill(11).bytes(mp3.get());
  const Bytes save = Pattern(600, 50), level = Pattern(400, 51), tune = Pattern(200, 0xB6);
  const Bytes saveZ = Compress(save), levelZ = Compress(level, 9);
  Bytes xored = tune;
  for (uint8_t& v : xored) v ^= 0x6B;
  iff.text("FORM").u32be(104).text("ILBM").text("BMHD").u32be(20).u16be(16).u16be(4).fill(4);
  iff.u8(1).fill(11).text("BODY").u32be(64).bytes(Pattern(64, 52));
  rle.text("PACK").u16(0).u32(7).u32(0).u8(0x83).text("abc").u8(0x04).text("z").fill(84);
  const Bytes nemo0 = Pattern(30, 30), nemo1 = Pattern(20, 31), l33t = Pattern(90, 34);
  const Bytes nemoZ0 = Compress(nemo0), nemoZ1 = Compress(nemo1), l33tZ = Compress(l33t);
  const Bytes pixels = Pattern(80, 35);
  avix.text("AVIX").u32(8).u32(5).u8(16).fill(3, 0xAB).u32(1).padTo(24).bytes(pixels);
  tga.fill(2).u8(2).fill(9).u16(8).u16(5).u8(16).u8(0x20).bytes(pixels);
  jdlz.text("JDLZ").u8(2).fill(3).u32(11).u32(16 + 5).u8(2).u8(1).text("a").u8(0).u8(7);
  return {
      Row({"F5CD", 32, "BONUS", Zip(kScrambled, true, "a comment")}, {{"BONUS.zip", 0, bonus}}),
      Row({"IPF1", 33, "extras.ipf", Zip(kStripped, false)}, {{"extras.zip", 0, extras}}),
      Row({"H4CAMPAIGN", 43, "campaign.h4c", Cat({Text("H4CAMPAIGN"), Bytes(5), gz})},
          {{"campaign.gz", 15, gz}}),
      Row({"signature row 51", 51, "movie.vid", video.get()},
          {{"movie.bik", 30, Slice(video.get(), 30, 104)}}),
      Row({"signature row 55", 55, ".snd", sound.get()}, {{".snd.mp3", 19, mp3.get()}}),
      Entries({"CPAL savegame 3.3", 56, "save01.sav",
               B().text("CPAL savegame 3.3\n\n").u8(0).u32(600).bytes(saveZ).get()},
              {{{"save01", 24, 600, Size(saveZ), 0, 1}, save}}),
      Entries({"XOR-scrambled sound", 101, "my.game.adf", xored},
              {{{"my.game.mp3", 0, 200, 200, 0, 0x6B}, tune}}),
      Entries({"size-prefixed zlib", 147, "level.clz", B().u32(400).bytes(levelZ).get()},
              {{{"level", 4, 400, Size(levelZ), 0, 1}, level}}),
      Row({"wrapped IFF", 155, "picture.iff", Cat({Bytes(16, 'X'), Slice(iff.get(), 16, 96)})},
          {{"picture.iff", 0, iff.get()}}),
      Entries({"PACK run-length", 7, "LEVEL", rle.get()},
              {{{"LEVEL.unk", 14, 7, 90, 0, 0}, Text("abczzzz")}}),
      Entries({"Nemo Fi, zlib", 35, "movie.nfi", Nemo(7, nemoZ0, 30, nemoZ1, 20)},
              {{{"movie.nfi0", 64, 30, Size(nemoZ0), 0, 1}, nemo0},
               {{"movie.nfi1", 64 + Size(nemoZ0), 20, Size(nemoZ1), 0, 1}, nemo1}}),
      Entries({"l33t", 37, "intro.dat", B().text("l33t").u32(90).bytes(l33tZ).get()},
              {{{"intro", 8, 90, Size(l33tZ), 0, 0}, l33t}}),
      Entries({"AVIX", 47, "pic.v2.avx", avix.get()},
              {{{"pic.v2.tga", 24, 98, 80, 8 | 5 << 16, 16}, tga.get()}}),
      Entries({"JDLZ", 50, ".tex", jdlz.padTo(kHeaderSize).get()},
              {{{".tex", 16, 11, 5, 0, 0}, Bytes(11, 'a')}}),
  };
}

TEST(WrappedPayloads, ZipArchivesWhoseHeadersDoNotHoldTogetherFailToExtract) {
  Bytes stripped = Zip(kStripped, false);
  PutU32le(stripped, stripped.size() - 6, Size(stripped) + 100);  // the central directory
  for (const RefusedCase& k :
       std::vector<RefusedCase>{{"a central directory past the end", 33, stripped}}) {
    SCOPED_TRACE(k.what);
    auto o = OpenBytesAs(k.format, k.bytes);
    ASSERT_EQ(o->result, kOk);
    Bytes out;
    EXPECT_EQ(o->extract(0, out), kBadData);
  }
}

}  // namespace
}  // namespace cairn::test
