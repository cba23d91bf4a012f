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
  EXPECT_EQ(Decode({0x83, 'a', 'b', 'c', 0x04, 'z'}, 7), Str("abczzzz"));
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
  EXPECT_EQ(Decode({0x00, 'x', 0x82, 'p', 'q'}, 2), Str("pq"));
  // 0x80 takes nothing more: 0x02 is the next control byte.
  EXPECT_EQ(Decode({0x80, 0x02, 'k'}, 2), Str("kk"));
  // At the very end, 0x00 has no byte to take and needs none.
  EXPECT_EQ(Decode({0x81, 'a', 0x00}, 1), Str("a"));
  EXPECT_EQ(Decode({0x81, 'a', 0x80}, 1), Str("a"));
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

}  // namespace
}  // namespace cairn::test
