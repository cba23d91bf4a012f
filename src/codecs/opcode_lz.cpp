// The opcode LZ decoder. Each opcode's top bits say how many opcode bytes it
// has, how many literal bytes follow it, and how long and from how far back
// the copy after those literals is:
//   0x00-0x7F  2 bytes, 0-3 literals, copy 3-10 from up to 1024 back
//   0x80-0xBF  3 bytes, 0-3 literals, copy 4-67 from up to 16384 back
//   0xC0-0xDF  4 bytes, 0-3 literals, copy 5-1028 from up to 131072 back
//   0xE0-0xFB  1 byte, 4-112 literals, no copy
//   0xFC-0xFF  1 byte, 0-3 literals, end of the stream
// The stream also ends when its last opcode ends at the last coded byte. It
// must decode to exactly the size the directory gives.
#include <cstring>

#include "codecs/codecs.h"
#include "codecs/lz_copy.h"

namespace cairn {
namespace {

// A copy of 1028 from a four-byte opcode is the code's best ratio.
constexpr uint64_t kBestRatio = 257;

}  // namespace

std::vector<uint8_t> OpcodeLzDecode(ByteView coded, uint32_t unpackedSize) {
  if (unpackedSize > coded.size() * kBestRatio)
    throw BadData("more output than the coded bytes can hold");
  if (coded.empty()) return {};  // nothing to decode, and nothing expected

  const size_t end = unpackedSize;
  std::vector<uint8_t> out(end + kCopySlack);
  uint8_t* const o0 = out.data();
  size_t o = 0;
  size_t in = 0;
  const auto literalsTo = [&](size_t at, size_t n) {
    if (n > end - o) throw BadData("literals past the end of the output");
    if (coded.has(at, n + 16))
      CopyBlocks<16>(o0 + o, coded.data() + at, n);
    else if (n > 0)
      std::memcpy(o0 + o, coded.sub(at, n).data(), n);
    o += n;
  };
  for (;;) {
    const uint32_t b0 = coded.u8(in);
    if (b0 >= 0xFC) {
      // The end: its literals are taken only while the output has room.
      if (o < end) literalsTo(in + 1, b0 & 3);
      break;
    }
    size_t opcodeBytes, literals, length = 0, distance = 0;
    if (b0 < 0x80) {
      const uint32_t b1 = coded.u8(in + 1);
      opcodeBytes = 2;
      literals = b0 & 3;
      length = ((b0 & 0x1C) >> 2) + 3;
      distance = ((b0 & 0x60) << 3) + b1 + 1;
    } else if (b0 < 0xC0) {
      const uint32_t b1 = coded.u8(in + 1), b2 = coded.u8(in + 2);
      opcodeBytes = 3;
      literals = b1 >> 6;
      length = (b0 & 0x3F) + 4;
      distance = ((b1 & 0x3F) << 8) + b2 + 1;
    } else if (b0 < 0xE0) {
      const uint32_t b1 = coded.u8(in + 1), b2 = coded.u8(in + 2), b3 = coded.u8(in + 3);
      opcodeBytes = 4;
      literals = b0 & 3;
      length = (((b0 >> 2) & 3) << 8) + b3 + 5;
      distance = ((b0 & 0x10) << 12) + (b1 << 8) + b2 + 1;
    } else {
      opcodeBytes = 1;
      literals = ((b0 & 0x1F) << 2) + 4;
    }
    literalsTo(in + opcodeBytes, literals);
    in += opcodeBytes + literals;
    if (length > 0) {
      if (distance > o) throw BadData("copy before the start of the output");
      if (length > end - o) throw BadData("copy past the end of the output");
      CopyMatch(o0 + o, distance, length);
      o += length;
    }
    if (in >= coded.size()) break;
  }
  if (o != end) throw BadData("the stream ends short of its size");
  out.resize(end);
  return out;
}

}  // namespace cairn
