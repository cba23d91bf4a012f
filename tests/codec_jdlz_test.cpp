#include <gtest/gtest.h>

#include "codec_encoders.h"
#include "codec_support.h"
#include "codecs/codecs.h"

namespace cairn::test {
namespace {

Bytes Decode(const Bytes& coded, uint32_t size) {
  return JdlzDecode(ByteView(coded), size);
}

TEST(Jdlz, LiteralsAndBothMatchForms) {
  // F1 0x02: a literal 'a', then a match; F2 0x01: the short form, distance
  // 1, length 7 + 3.
  EXPECT_EQ(Decode({0x02, 0x01, 'a', 0x00, 0x07}, 11), Bytes(11, 'a'));

  // F1 0x30: four literals and two matches; F2 0x01: the first match is
  // short (distance 1, length 0x809 + 3), the second long: 0xE0 0xFF is
  // distance 2064, length 3, which reaches back to "ABC".
  Bytes want = Text("ABCz");
  CopyBack(want, 1, 2060);
  CopyBack(want, 2064, 3);
  EXPECT_EQ(Decode({0x30, 0x01, 'A', 'B', 'C', 'z', 0x80, 0x09, 0xE0, 0xFF}, 2067), want);

  // The longest forms: 0xFF 0xFF short is distance 16, length 4098; 0x1F
  // 0x00 long is distance 17, length 34.
  JdlzWriter w;
  want = Text("0123456789abcdefg");
  for (uint8_t b : want) w.literal(b);
  w.match(16, 4098);
  w.match(17, 34);
  CopyBack(want, 16, 4098);
  CopyBack(want, 17, 34);
  EXPECT_EQ(Slice(w.bytes(), w.bytes().size() - 4, 4), Bytes({0xFF, 0xFF, 0x1F, 0x00}));
  EXPECT_EQ(Decode(w.bytes(), static_cast<uint32_t>(want.size())), want);
}

TEST(Jdlz, OverlappingCopiesRepeatRecentBytes) {
  for (size_t distance = 1; distance <= 16; ++distance) {
    for (size_t length = 3; length <= 70; ++length) {
      JdlzWriter w;
      Bytes want = Text("ponmlkjihgfedcba");
      for (uint8_t b : want) w.literal(b);
      w.match(distance, length);
      CopyBack(want, distance, length);
      ASSERT_EQ(Decode(w.bytes(), static_cast<uint32_t>(want.size())), want)
          << "distance " << distance << ", length " << length;
    }
  }
}

TEST(Jdlz, FlagBytesFallingDueTogetherRefillF1First) {
  // Eight literals, then eight short matches (distance 8, length 3): after
  // the sixteenth token both registers are empty. The next byte refills F1
  // (0x01: a match), the one after it F2 (0x00: the long form), so token 17
  // is 0x05 0x03 read as distance 3 + 17, length 5 + 3.
  Bytes coded = {0x00, 0xFF, 'a', 'b', 'c', 'd', 'e', 'f', 'g', 'h', 0xFF};
  for (int k = 0; k < 8; ++k) coded.insert(coded.end(), {0x07, 0x00});
  coded.insert(coded.end(), {0x01, 0x00, 0x05, 0x03});
  Bytes want = Text("abcdefgh");
  for (int k = 0; k < 8; ++k) CopyBack(want, 8, 3);
  CopyBack(want, 20, 8);
  EXPECT_EQ(Decode(coded, 40), want);
}

TEST(Jdlz, LiteralsOnAFullOutputTakeNoByteButCountAgainstTheRest) {
  // The output holds one byte. Tokens 2 to 8 are literals that find it full:
  // they take no coded byte, so the F1 refill reads the byte right after
  // 'a' (0x00, eight more literals), and the two that follow use up the
  // rest. Had they taken bytes, F1 would be 0x01 and a match would overflow.
  EXPECT_EQ(Decode({0x00, 0xFF, 'a', 0x00, 0, 0, 0, 0, 0, 0, 0x01, 0x00, 0x00}, 1), Text("a"));
  // Plain trailing literals past a full output are dropped.
  EXPECT_EQ(Decode({0x00, 0x00, 'a', 'b', 'c', 'd'}, 2), Text("ab"));
}

TEST(Jdlz, EndConditions) {
  // Two flag bytes and no tokens.
  EXPECT_EQ(Decode({0x00, 0x00}, 0), Bytes());
  // Fewer bytes than the two flag bytes hold no tokens either.
  EXPECT_EQ(Decode({}, 0), Bytes());
  EXPECT_EQ(Decode({0x00}, 0), Bytes());
  // Eight tokens end the stream whether or not the F1 byte due after them
  // is there.
  EXPECT_EQ(Decode({0x00, 0x00, '1', '2', '3', '4', '5', '6', '7', '8'}, 8), Text("12345678"));
  EXPECT_EQ(Decode({0x00, 0x00, '1', '2', '3', '4', '5', '6', '7', '8', 0x00}, 8),
            Text("12345678"));
  // A stream that ends early leaves zeros, also right after a match that is
  // copied in whole blocks.
  EXPECT_EQ(Decode({0x00, 0x00, 'a', 'b'}, 5), Bytes({'a', 'b', 0, 0, 0}));
  JdlzWriter w;
  for (uint8_t b : Text("abcdefgh")) w.literal(b);
  w.match(8, 5);
  Bytes want = Text("abcdefghabcde");
  want.resize(16, 0);
  EXPECT_EQ(Decode(w.bytes(), 16), want);
}

TEST(Jdlz, RefusesInvalidData) {
  // A match before any output, short and long form.
  EXPECT_THROW(Decode({0x01, 0x01, 0x00, 0x00}, 3), BadData);
  EXPECT_THROW(Decode({0x02, 0x00, 'a', 0x00, 0x00}, 18), BadData);
  // A match one byte past the output.
  EXPECT_THROW(Decode({0x02, 0x01, 'a', 0x00, 0x07}, 10), BadData);
  // A match whose second byte is missing.
  EXPECT_THROW(Decode({0x02, 0x01, 'a', 0x00}, 4), BadData);
  // More output than the coded bytes could make: two token bytes make at
  // most 4098 bytes, and no bytes nothing.
  EXPECT_THROW(Decode({0x00, 0x00, 'a', 'b'}, 4099), BadData);
  EXPECT_THROW(Decode({0x00, 0x00}, 1), BadData);
  EXPECT_THROW(Decode({0x00}, 1), BadData);
  EXPECT_THROW(Decode({0x00, 0x00}, 0xFFFFFFFF), BadData);
}

TEST(Jdlz, RoundTripsGeneratedData) {
  for (const Bytes& data : {TextLike(160 * 1024), PictureLike(128 * 1024), RandomBytes(32 * 1024),
                            MixedData(96 * 1024, 9)}) {
    const Bytes coded = JdlzEncode(data);
    EXPECT_EQ(Decode(coded, static_cast<uint32_t>(data.size())), data);
  }
}

TEST(Jdlz, ExtractsEntriesThroughTheFrame) {
  const Bytes good = {0x02, 0x01, 'a', 0x00, 0x07};
  const Bytes bad = {0x01, 0x01, 0x00, 0x00};
  const Bytes archive = ArchiveBuilder().text("JDLZhead").bytes(good).bytes(bad).text("tail").get();
  auto o = SessionOver(50, archive,
                       {
                           {"a.bin", 8, 11, 5},
                           {"short.bin", 8, 14, 5},  // ends early: zeros follow
                           {"bad.bin", 13, 3, 4},
                           {"past.bin", 13, 3, 9},  // stored bytes run past the end
                       });
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->extract(0), Bytes(11, 'a'));
  Bytes want(11, 'a');
  want.resize(14, 0);
  EXPECT_EQ(o->extract(1), want);
  Bytes out;
  EXPECT_EQ(o->extract(2, out), kBadData);
  EXPECT_EQ(o->extract(3, out), kBadData);
}

}  // namespace
}  // namespace cairn::test
