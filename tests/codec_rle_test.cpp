#include <gtest/gtest.h>

#include "codec_encoders.h"
#include "codec_support.h"
#include "codecs/codecs.h"

namespace cairn::test {
namespace {

Bytes Decode(const Bytes& coded, uint32_t size) {
  return RleDecode(ByteView(coded), size);
}

TEST(Rle, LiteralAndRepeatRuns) {
  EXPECT_EQ(Decode({0x83, 'a', 'b', 'c', 0x04, 'z'}, 7), Text("abczzzz"));
  // The longest runs of each kind.
  Bytes coded = {0x7F, 'q', 0xFF};
  const Bytes literals = Pattern(127);
  coded.insert(coded.end(), literals.begin(), literals.end());
  Bytes want(127, 'q');
  want.insert(want.end(), literals.begin(), literals.end());
  EXPECT_EQ(Decode(coded, 254), want);
}

TEST(Rle, RunsOfLengthZero) {
  // 0x00 still takes the byte after it: 'x' is not read as a control byte.
  EXPECT_EQ(Decode({0x00, 'x', 0x82, 'p', 'q'}, 2), Text("pq"));
  // 0x80 takes nothing more: 0x02 is the next control byte.
  EXPECT_EQ(Decode({0x80, 0x02, 'k'}, 2), Text("kk"));
  // At the very end, 0x00 has no byte to take and needs none.
  EXPECT_EQ(Decode({0x81, 'a', 0x00}, 1), Text("a"));
  EXPECT_EQ(Decode({0x81, 'a', 0x80}, 1), Text("a"));
}

TEST(Rle, EndConditions) {
  EXPECT_EQ(Decode({}, 0), Bytes());
  // Runs that end short of the size leave zeros, also where runs are
  // written in whole blocks and empty runs follow.
  EXPECT_EQ(Decode({0x02, 'x'}, 5), Bytes({'x', 'x', 0, 0, 0}));
  Bytes coded = {0x81, 'a'};
  for (int k = 0; k < 9; ++k) coded.insert(coded.end(), {0x00, 'x'});
  EXPECT_EQ(Decode(coded, 4), Bytes({'a', 0, 0, 0}));
}

TEST(Rle, RefusesInvalidData) {
  // A repeat run and a literal run one byte past the output.
  EXPECT_THROW(Decode({0x05, 'a'}, 4), BadData);
  EXPECT_THROW(Decode({0x83, 'a', 'b', 'c'}, 2), BadData);
  // A literal run past the coded bytes; a repeat run without its byte.
  EXPECT_THROW(Decode({0x85, 'a', 'b'}, 5), BadData);
  EXPECT_THROW(Decode({0x81, 'a', 0x03}, 4), BadData);
  // More output than the coded bytes could make: 127 per two bytes.
  EXPECT_THROW(Decode({0x7F, 'q'}, 128), BadData);
  EXPECT_THROW(Decode({0x7F, 'q', 0x7F}, 255), BadData);
  EXPECT_THROW(Decode({}, 1), BadData);
}

TEST(Rle, RoundTripsGeneratedData) {
  for (const Bytes& data : {TextLike(128 * 1024), PictureLike(160 * 1024), RandomBytes(32 * 1024),
                            MixedData(96 * 1024, 7)}) {
    EXPECT_EQ(Decode(RleEncode(data), static_cast<uint32_t>(data.size())), data);
  }
}

TEST(Rle, ExtractsEntriesThroughTheFrame) {
  const Bytes archive = ArchiveBuilder()
                            .text("PACK")
                            .bytes({0x83, 'a', 'b', 'c', 0x04, 'z'})
                            .bytes({0x05, 'a'})
                            .get();
  auto o = SessionOver(7, archive,
                       {
                           {"a.bin", 4, 7, 6, 0, 1},  // the Flag does not matter
                           {"long.bin", 4, 9, 6},     // zeros after the runs
                           {"over.bin", 10, 4, 2},    // a run past the size
                           {"past.bin", 10, 5, 3},    // stored bytes run past the end
                       });
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->extract(0), Text("abczzzz"));
  EXPECT_EQ(o->extract(1), Bytes({'a', 'b', 'c', 'z', 'z', 'z', 'z', 0, 0}));
  Bytes out;
  EXPECT_EQ(o->extract(2, out), kBadData);
  EXPECT_EQ(o->extract(3, out), kBadData);
}

// A block: its length L (data bytes + 1), three bytes nobody reads, the data.
ArchiveBuilder& Block(ArchiveBuilder& b, std::string_view data) {
  return b.u16(static_cast<uint16_t>(data.size() + 1)).u8(0xA1).u8(0xB2).u8(0xC3).text(data);
}

TEST(BlockJoin, JoinsBlocksUntilTheirLengthsReachPackedSize) {
  ArchiveBuilder b;
  b.text("ISD0");
  Block(b, "");       // 4: L = 1
  Block(b, "abc");    // 9: L = 4
  Block(b, "de");     // 17: L = 3
  Block(b, "fghi");   // 24: L = 5
  Block(b, "never");  // 33: past every entry's PackedSize
  auto o = SessionOver(75, b.get(),
                       {
                           {"one.bin", 4, 0, 1},    // L = 1: nothing written
                           {"two.bin", 9, 5, 7},    // 4 + 3: "abc" + "de"
                           {"empty.bin", 9, 0, 0},  // no block read at all
                           {"over.bin", 9, 5, 5},   // the block that passes 5 is whole
                           {"chain.bin", 4, 9, 13, 0, 3},
                       });
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->extract(0), Bytes());
  EXPECT_EQ(o->extract(1), Text("abcde"));
  EXPECT_EQ(o->extract(2), Bytes());
  EXPECT_EQ(o->extract(3), Text("abcde"));
  EXPECT_EQ(o->extract(4), Text("abcdefghi"));
}

TEST(BlockJoin, FailsOnBadChains) {
  ArchiveBuilder b;
  b.text("ISD0");
  Block(b, "abc");                         // 4
  b.u16(0).u8(0).u8(0).u8(0);              // 12: L = 0
  b.u16(40).u8(0).u8(0).u8(0).text("xy");  // 17: claims 39 data bytes; 9 follow
  Block(b, "ok");                          // 24: ends the archive
  auto o = SessionOver(75, b.get(),
                       {
                           {"zero.bin", 4, 3, 5},
                           {"short.bin", 17, 39, 40},
                           {"noheader.bin", 24, 2, 6},  // wants a block after the end
                       });
  ASSERT_EQ(o->result, kOk);
  Bytes out;
  EXPECT_EQ(o->extract(0, out), kBadData);
  EXPECT_EQ(o->extract(1, out), kBadData);
  EXPECT_EQ(o->extract(2, out), kBadData);
}

}  // namespace
}  // namespace cairn::test
