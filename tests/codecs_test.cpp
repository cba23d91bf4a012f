// The decoders on hand-assembled streams, the copies over every overlap, and
// the extraction methods that decode stored bytes over one hand-made archive.
#include "codecs/codecs.h"

#include <gtest/gtest.h>

#include <optional>
#include <tuple>

#include "../fuzz/reference.h"
#include "builder.h"

namespace cairn::test {
namespace {

using Decoded = std::optional<Bytes>;  // none: the data is refused
const Decoded kRefused;

using Stream = std::tuple<Bytes, uint32_t, Decoded>;  // coded, UnpackedSize, decoded

// The decoder and the plain one of the fuzz targets both give `want`.
template <auto Decode, auto Reference>
void ExpectStreams(const std::vector<Stream>& streams) {
  for (const auto& [coded, size, want] : streams) {
    SCOPED_TRACE(testing::PrintToString(coded) + ", size " + std::to_string(size));
    if (want)
      EXPECT_EQ(Decode(ByteView(coded), size), *want);
    else
      EXPECT_THROW(Decode(ByteView(coded), size), BadData);
    EXPECT_EQ(Reference(coded.data(), coded.size(), size), want);
  }
}

// `b`, then `length` bytes copied one at a time from `distance` back.
Bytes Back(Bytes b, size_t distance, size_t length) {
  for (size_t k = 0; k < length; ++k) b.push_back(b[b.size() - distance]);
  return b;
}

TEST(Jdlz, StreamsDecodeExactlyOrAreRefused) {
  const Bytes lits = Text("0123456789abcdef");
  ExpectStreams<JdlzDecode, fuzz::ReferenceJdlz>({
      // Short 0x80 0x09: distance 1, length 2060; long 0xE0 0xFF: distance 2064, length 3.
      {Bytes{0x30, 0x01, 'A', 'B', 'C', 'z', 0x80, 0x09, 0xE0, 0xFF}, 2067,
       Cat({Text("ABC"), Bytes(2061, 'z'), Text("ABC")})},
      // 16 literals, then the longest forms: short 0xFF 0xFF (16, 4098), long 0x1F 0 (17, 34).
      {Cat({{0, 1}, Slice(lits, 0, 8), {0}, Slice(lits, 8, 8), {3, 0xFF, 0xFF, 0x1F, 0}}), 4148,
       Back(Back(lits, 16, 4098), 17, 34)},
      // Eight matches (1, 3) empty both registers: F1 is refilled first (a
      // match), then F2 (long form 0x05 0x0F: distance 32, length 8).
      {Cat({{0x00, 0xFF}, Text("abcdefgh"), {0xFF}, Bytes(16, 0), {0x01, 0x00, 0x05, 0x0F}}), 40,
       Cat({Text("abcdefgh"), Bytes(24, 'h'), Text("abcdefgh")})},
      // Literals on a full output take no byte but count: F1 refills from
      // the 0x00 after 'a', not the 0x01 a byte per literal would reach.
      {{0x00, 0xFF, 'a', 0x00, 0, 0, 0, 0, 0, 0, 0x01, 0x00, 0x00}, 1, Text("a")},
      // The coded bytes end the stream, also where F2's next byte falls due.
      {{0xFE, 0xFF, 'a', 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0x01, 0, 0}, 25, Bytes(25, 'a')},
      // Bytes a short stream does not produce are zero, also after a block copy.
      {Cat({{0x00, 0x01}, Slice(lits, 0, 8), {0x01, 0x07, 0x02}}), 16,
       Cat({Slice(lits, 0, 8), Slice(lits, 0, 5), Bytes(3, 0)})},
      // A lone flag byte makes nothing.
      {{0x00}, 1, kRefused},
      // A match before the start (long form, distance 17); after a literal, a
      // short match of distance 1, length 7 + 3 past the output.
      {{0x02, 0x00, 'a', 0x00, 0x00}, 18, kRefused},
      {{0x02, 0x01, 'a', 0x00, 0x07}, 10, kRefused},
  });
}

TEST(Rle, StreamsDecodeExactlyOrAreRefused) {
  ExpectStreams<RleDecode, fuzz::ReferenceRle>({
      // 0x80 + n: n literals follow; n alone: the next byte n times.
      {Cat({{0x7F, 'q', 0xFF}, Pattern(127)}), 254, Cat({Bytes(127, 'q'), Pattern(127)})},
      // Runs of length 0: 0x00 takes its byte, 0x80 nothing.
      {{0x00, 'x', 0x82, 'p', 'q'}, 2, Text("pq")},
      {{0x80, 0x02, 'k'}, 2, Text("kk")},
      // Bytes the runs do not reach are zero, also after a block copy.
      {Cat({{0x81, 'a'}, Bytes(18, 0x80)}), 4, Bytes({'a', 0, 0, 0})},
      // A run past the output or past the coded bytes; a repeat without its
      // byte; more than 127 bytes per two coded bytes, 127 being the most.
      {{0x05, 'a'}, 4, kRefused},
      {{0x85, 'a', 'b'}, 5, kRefused},
      {{0x81, 'a', 0x03}, 4, kRefused},
      {{0x7F, 'q', 0x80}, 128, Bytes(127, 'q')},
  });
}

TEST(OpcodeLz, StreamsDecodeExactlyOrAreRefused) {
  // 131152 bytes in literal opcodes of 112, the most, over halves that differ (a wrong
  // distance finds other bytes); each copy class at its most; then single fields:
  // class 0 bits 0x60, class 1 high bits, class 2 bits 0x10, 0x0C.
  const Bytes head = Cat({Pattern(65576, 5), Pattern(65576, 9)});
  ArchiveBuilder coded;
  for (size_t at = 0; at < head.size(); at += 112) coded.u8(0xFB).bytes(Slice(head, at, 112));
  coded.bytes({0x7F, 0xFF, 'a', 'b', 'c'}).bytes({0xBF, 0xFF, 0xFF, 'd', 'e', 'f'});
  coded.bytes({0xDF, 0xFF, 0xFF, 0xFF, 'g', 'h', 'i'}).bytes({0x44, 0x10});
  coded.bytes({0x85, 0x41, 0x02, 'y'}).bytes({0xD9, 0x00, 0x05, 0x01, 'z', 0xFF, 'x', 'y', 'z'});
  const std::tuple<const char*, int, int> copies[] = {
      {"abc", 1024, 10}, {"def", 16384, 67}, {"ghi", 131072, 1028}, {"", 529, 4},
      {"y", 0x103, 9},   {"z", 65542, 518},  {"xyz", 1, 0}};
  Bytes most = head;
  for (const auto& [text, d, n] : copies) most = Back(Cat({most, Text(text)}), d, n);
  const Bytes abcd = {0xE0, 'a', 'b', 'c', 'd'};
  ExpectStreams<OpcodeLzDecode, fuzz::ReferenceOpcodeLz>({
      {coded.get(), static_cast<uint32_t>(most.size()), most},
      // The shortest copy of each class: 3, 4, 5.
      {{0x01, 0x00, 'm', 0x80, 0x00, 0x00, 0xC0, 0x00, 0x00, 0x00, 0xFC}, 13, Bytes(13, 'm')},
      // The stream also ends at its last coded byte; once the output is
      // full, nothing more is read.
      {{0x01, 0x00, 'a'}, 4, Text("aaaa")},
      {{0xFD, 'x', 0xC0, 0x12}, 1, Text("x")},
      {{}, 0, Bytes()},
      // A copy past the size; a stream short of it; more than 257 bytes per coded
      // byte; a copy from before the start; an opcode past the coded bytes.
      {Cat({abcd, {0x00, 0x00}}), 6, kRefused},
      {{0x01, 0x00, 'a'}, 5, kRefused},
      {{0xFC}, 258, kRefused},
      {Cat({abcd, {0x00, 0x04}}), 7, kRefused},
      {Cat({abcd, {0xC0, 0x00, 0x03}}), 9, kRefused},
  });
}

// 40 literals and a copy, over every overlap: each path of the copy both LZ codes share.
TEST(OpcodeLz, CopiesRepeatTheBytesJustWritten) {
  const Bytes head = Pattern(40);
  for (uint8_t d = 1; d <= 40; ++d)
    for (uint8_t n = 4; n <= 67; ++n) {
      const Bytes coded = Cat({{0xE9}, head, {uint8_t(0x7C + n), 0, uint8_t(d - 1)}});
      EXPECT_EQ(OpcodeLzDecode(ByteView(coded), 40 + n), Back(head, d, n)) << +n << " from " << +d;
    }
}

TEST(Methods, EachEntryExtractsExactlyOrIsBadData) {
  const Bytes many = Pattern(150000, 4), zStored = Compress(many, 0), zData = Compress(Pattern(9));
  const Bytes picture = Pattern(200000, 3), prefixed = Cat({{0xE8, 3, 0, 0}, picture});
  const Bytes zFewer = Compress(prefixed);
  const Bytes zFits = Compress(Bytes(4194304, 7)), zOver = Compress(Bytes(4194305, 7));
  // A block: its length L (data bytes + 1), three bytes nobody reads, the data.
  ArchiveBuilder chain;
  const auto block = [&](std::string_view d) { chain.u16(d.size() + 1).fill(3, 0xEE).text(d); };
  for (std::string_view d : {"abc", "de", "fghi"}) block(d);  // at 0, 8, 15
  chain.u16(0).fill(3).u16(40).fill(3).text("xy");  // 24: L = 0; 29: 39 data bytes claimed
  ArchiveBuilder archive;
  const auto n = [](const Bytes& b) { return static_cast<uint32_t>(b.size()); };
  const auto put = [&](const Bytes& b) { return n(archive.bytes(b).get()) - n(b); };
  const uint32_t olz = put({0x01, 0x00, 'a', 0xFC}), z = put(zData), stored = put(zStored);
  const uint32_t flags = put({0x00, 0x00}), runs = put({0x81, 'r'});
  const uint32_t fewer = put(zFewer), fits = put(zFits), over = put(zOver), c = put(chain.get());
  const std::tuple<const char*, FormatId, ArchiveEntry, Decoded> rows[] = {
      {"opcode LZ", 125, {"", olz, 4, 4}, Text("aaaa")},
      // Short streams still give UnpackedSize bytes, zeros beyond what they make.
      {"JDLZ of its flag bytes alone", 50, {"", flags, 3000000, 2}, Bytes(3000000, 0)},
      {"run-length, one run", 7, {"", runs, 70000, 2}, Cat({Text("r"), Bytes(69999, 0)})},
      {"the block passing PackedSize is whole", 75, {"", c, 5, 5, 0, 3}, Text("abcde")},
      {"block of length 0", 75, {"", c + 15, 4, 6}, kRefused},
      {"block data past the archive", 75, {"", c + 29, 39, 40}, kRefused},
      // Inflate gives the stream's own length, up to its capacity.
      {"inflate over capacity", 10, {"", z, 8, n(zData)}, kRefused},
      {"inflate under capacity, over input windows", 10, {"", stored, 200000, n(zStored)}, many},
      {"inflate, checksum cut", 10, {"", z, 9, n(zData) - 1}, kRefused},
      // The JPEG container: with a Flag, the 1000 bytes its u32 prefix counts, of at most Extra.
      {"container without a Flag", 109, {"", fewer, 200004, n(zFewer)}, prefixed},
      {"container prefix", 109, {"", fewer, 1000, n(zFewer), 200004, 1}, Slice(picture, 0, 1000)},
      {"container over Extra", 109, {"", fewer, 1000, n(zFewer), 200003, 1}, kRefused},
      // Palette banks: raw without a Flag, else at most 4 MiB inflated.
      {"bank raw", 115, {"", fits, n(zFits), n(zFits)}, zFits},
      {"bank of 4 MiB", 115, {"", fits, 16, n(zFits), 0, 1}, Bytes(4194304, 7)},
      {"bank over 4 MiB", 115, {"", over, 16, n(zOver), 0, 1}, kRefused},
  };
  for (const auto& [what, format, entry, want] : rows) {
    Bytes out;
    EXPECT_EQ(SessionOver(format, archive.get(), {entry})->extract(0, out), want ? kOk : kBadData)
        << what;
    if (want) EXPECT_EQ(out, *want) << what;
  }
}

}  // namespace
}  // namespace cairn::test
