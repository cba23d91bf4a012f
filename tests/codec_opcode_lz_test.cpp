#include <gtest/gtest.h>

#include "codec_encoders.h"
#include "codec_support.h"
#include "codecs/codecs.h"

namespace cairn::test {
namespace {

Bytes Decode(const Bytes& coded, uint32_t size) {
  return OpcodeLzDecode(ByteView(coded), size);
}

// `data` (a multiple of 4 bytes long) as literal opcodes of up to 112.
void Literals(Bytes& coded, const Bytes& data) {
  for (size_t at = 0; at < data.size();) {
    const size_t n = std::min<size_t>(112, data.size() - at);
    coded.push_back(static_cast<uint8_t>(0xE0 + (n - 4) / 4));
    coded.insert(coded.end(), data.begin() + static_cast<std::ptrdiff_t>(at),
                 data.begin() + static_cast<std::ptrdiff_t>(at + n));
    at += n;
  }
}

TEST(OpcodeLz, SmallestOfEachClass) {
  EXPECT_EQ(Decode({0xFC}, 0), Bytes());
  EXPECT_EQ(Decode({0xFD, 'x'}, 1), Text("x"));
  EXPECT_EQ(Decode({0xE0, 'a', 'b', 'c', 'd', 0xFC}, 4), Text("abcd"));
  // One literal 'a', then distance 1, length 3.
  EXPECT_EQ(Decode({0x01, 0x00, 'a', 0xFC}, 4), Text("aaaa"));
  // 0x80: no literals, length 4, distance 1; 0xC0: length 5, distance 1.
  EXPECT_EQ(Decode({0x01, 0x00, 'm', 0x80, 0x00, 0x00, 0xC0, 0x00, 0x00, 0x00, 0xFC}, 13),
            Bytes(13, 'm'));
}

TEST(OpcodeLz, LargestOfEachClass) {
  // 131072 distinct bytes first, then every class with its most literals,
  // its longest copy and its farthest distance.
  const Bytes head = Pattern(131072, 5);
  Bytes coded;
  Literals(coded, head);
  Bytes want = head;
  // 0x7F 0xFF: 3 literals, length 10, distance 1024.
  coded.insert(coded.end(), {0x7F, 0xFF, 'a', 'b', 'c'});
  want.insert(want.end(), {'a', 'b', 'c'});
  CopyBack(want, 1024, 10);
  // 0xBF 0xFF 0xFF: 3 literals, length 67, distance 16384.
  coded.insert(coded.end(), {0xBF, 0xFF, 0xFF, 'd', 'e', 'f'});
  want.insert(want.end(), {'d', 'e', 'f'});
  CopyBack(want, 16384, 67);
  // 0xDF 0xFF 0xFF 0xFF: 3 literals, length 1028, distance 131072.
  coded.insert(coded.end(), {0xDF, 0xFF, 0xFF, 0xFF, 'g', 'h', 'i'});
  want.insert(want.end(), {'g', 'h', 'i'});
  CopyBack(want, 131072, 1028);
  // 0xFB: 112 literals; 0xFF: the end, with 3 literals.
  const Bytes tail = Pattern(115, 77);
  coded.push_back(0xFB);
  coded.insert(coded.end(), tail.begin(), tail.begin() + 112);
  coded.push_back(0xFF);
  coded.insert(coded.end(), tail.begin() + 112, tail.end());
  want.insert(want.end(), tail.begin(), tail.end());
  EXPECT_EQ(Decode(coded, static_cast<uint32_t>(want.size())), want);
}

TEST(OpcodeLz, CopyFieldsAreReadFromTheirBits) {
  // Each field alone: class 0 distance bits 0x60 (+512), class 1 length and
  // distance high bits, class 2 distance bit 0x10 (+65536) and length bits
  // 0x0C (+512); the literals after the opcode bytes come before the copy.
  const Bytes head = Pattern(70000, 9);
  Bytes coded;
  Literals(coded, head);
  Bytes want = head;
  coded.insert(coded.end(), {0x44, 0x10});  // no literals, length 1 + 3, distance 512 + 0x10 + 1
  CopyBack(want, 529, 4);
  coded.insert(coded.end(), {0x85, 0x41, 0x02, 'y'});  // 1 literal, length 9, distance 0x102 + 1
  want.push_back('y');
  CopyBack(want, 0x103, 9);
  // 1 literal, length 0x201 + 5, distance 65536 + 5 + 1.
  coded.insert(coded.end(), {0xD9, 0x00, 0x05, 0x01, 'z'});
  want.push_back('z');
  CopyBack(want, 65542, 518);
  coded.push_back(0xFC);
  EXPECT_EQ(Decode(coded, static_cast<uint32_t>(want.size())), want);
}

TEST(OpcodeLz, EndConditions) {
  // The last opcode ends at the last coded byte: no end opcode needed once
  // the output is full.
  EXPECT_EQ(Decode({0x01, 0x00, 'a'}, 4), Text("aaaa"));
  // Bytes after the end opcode are not read.
  EXPECT_EQ(Decode({0xFD, 'x', 0xC0, 0x12}, 1), Text("x"));
  // The end opcode's literals are skipped when the output is already full.
  EXPECT_EQ(Decode({0x01, 0x00, 'a', 0xFF, 'x', 'y', 'z'}, 4), Text("aaaa"));
  EXPECT_EQ(Decode({0x01, 0x00, 'a', 0xFE}, 4), Text("aaaa"));
  // Nothing coded decodes to nothing.
  EXPECT_EQ(Decode({}, 0), Bytes());
}

TEST(OpcodeLz, RefusesStreamsThatDisagreeWithTheSize) {
  // A copy past the size, though everything before it was right.
  EXPECT_THROW(Decode({0xE0, 'a', 'b', 'c', 'd', 0x00, 0x00}, 6), BadData);
  EXPECT_THROW(Decode({0x01, 0x00, 'a', 0xFC}, 3), BadData);
  // Literals past the size: of a copy opcode, a literal opcode, the end.
  EXPECT_THROW(Decode({0x03, 0x00, 'a', 'b', 'c'}, 2), BadData);
  EXPECT_THROW(Decode({0xE0, 'a', 'b', 'c', 'd'}, 3), BadData);
  EXPECT_THROW(Decode({0xE0, 'a', 'b', 'c', 'd', 0xFE, 'e', 'f'}, 5), BadData);
  // Fewer bytes than the size, with and without an end opcode.
  EXPECT_THROW(Decode({0xFD, 'x'}, 2), BadData);
  EXPECT_THROW(Decode({0x01, 0x00, 'a'}, 5), BadData);
  EXPECT_THROW(Decode({}, 1), BadData);
  // More output than the coded bytes could make: 257 per byte.
  EXPECT_THROW(Decode({0xFC}, 258), BadData);
  EXPECT_THROW(Decode({0xFC}, 0xFFFFFFFF), BadData);
}

TEST(OpcodeLz, RefusesInvalidData) {
  // Four literals, then a copy from 4 back is fine, from 5 back reaches
  // before the start of the output; in every class.
  const Bytes abcd = {0xE0, 'a', 'b', 'c', 'd'};
  const auto with = [&](std::initializer_list<uint8_t> tail) {
    Bytes b = abcd;
    b.insert(b.end(), tail);
    return b;
  };
  EXPECT_EQ(Decode(with({0x00, 0x03}), 7), Text("abcdabc"));
  EXPECT_THROW(Decode(with({0x00, 0x04}), 7), BadData);
  EXPECT_EQ(Decode(with({0x80, 0x00, 0x03}), 8), Text("abcdabcd"));
  EXPECT_THROW(Decode(with({0x80, 0x00, 0x04}), 8), BadData);
  EXPECT_EQ(Decode(with({0xC0, 0x00, 0x03, 0x00}), 9), Text("abcdabcda"));
  EXPECT_THROW(Decode(with({0xC0, 0x00, 0x04, 0x00}), 9), BadData);
  EXPECT_THROW(Decode({0x00, 0x00}, 3), BadData);
  // Opcode bytes past the coded bytes, in every class.
  EXPECT_THROW(Decode(with({0x00}), 7), BadData);
  EXPECT_THROW(Decode(with({0x80, 0x00}), 8), BadData);
  EXPECT_THROW(Decode(with({0xC0, 0x00, 0x03}), 9), BadData);
  // Literals past the coded bytes: of a literal opcode, a copy opcode, the
  // end.
  EXPECT_THROW(Decode({0xE0, 'a', 'b'}, 4), BadData);
  EXPECT_THROW(Decode({0x02, 0x00, 'a'}, 5), BadData);
  EXPECT_THROW(Decode({0xFE, 'a'}, 2), BadData);
}

TEST(OpcodeLz, RoundTripsGeneratedData) {
  for (const Bytes& data : {TextLike(160 * 1024), PictureLike(128 * 1024), RandomBytes(32 * 1024),
                            MixedData(160 * 1024, 5), Bytes()}) {
    EXPECT_EQ(Decode(OpcodeLzEncode(data), static_cast<uint32_t>(data.size())), data);
  }
}

TEST(OpcodeLz, ExtractsEntriesThroughTheFrame) {
  const Bytes archive = ArchiveBuilder().text("QFS\x10\xFB").bytes({0x01, 0x00, 'a', 0xFC}).get();
  auto o = SessionOver(125, archive,
                       {
                           {"a.bin", 5, 4, 4},
                           {"long.bin", 5, 5, 4},  // one byte short
                           {"past.bin", 5, 4, 5},  // stored bytes run past the end
                       });
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->extract(0), Text("aaaa"));
  Bytes out;
  EXPECT_EQ(o->extract(1, out), kBadData);
  EXPECT_EQ(o->extract(2, out), kBadData);
}

}  // namespace
}  // namespace cairn::test
