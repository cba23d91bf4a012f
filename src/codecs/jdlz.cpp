// The "JDLZ" decoder: LZ77 with two flag registers. F1 says, token by token,
// literal (0) or match (1); F2 says, match by match, which of the two match
// forms follows: short distance and long length (1) or long distance and
// short length (0). Each register holds eight flags under a marker bit; once
// only the marker is left, the next coded byte refills it, F1 before F2 when
// both run out at the same token. There is no end marker: decoding stops when
// the coded bytes are used up.
#include <algorithm>
#include <bit>
#include <cstring>

#include "codecs/codecs.h"
#include "codecs/lz_copy.h"

namespace cairn {
namespace {

constexpr uint64_t kLongestMatch = 4098;

}  // namespace

std::vector<uint8_t> JdlzDecode(ByteView coded, uint32_t unpackedSize) {
  // After the two flag bytes, no token yields more than a two-byte match of
  // 4098 bytes: the output buffer holds no more than that, and a stream that
  // fills it has used up its coded bytes.
  const uint64_t tokenBytes = coded.size() < 2 ? 0 : coded.size() - 2;
  const size_t end =
      std::min<uint64_t>(unpackedSize, tokenBytes / 2 * kLongestMatch + tokenBytes % 2);
  if (coded.size() < 2 && unpackedSize > 0) throw BadData("no flag bytes");
  std::vector<uint8_t> out(end + kCopySlack);
  uint8_t* const o0 = out.data();
  size_t o = 0;
  if (coded.size() >= 2) {
    size_t in = 2;
    // Counts down the coded bytes. A literal that arrives when the output is
    // already full takes no coded byte but still counts here, so `in` may lag
    // behind; `in + remaining` never exceeds the coded size.
    size_t remaining = coded.size() - 2;
    uint32_t f1 = coded.u8(0) | 0x100u;
    uint32_t f2 = coded.u8(1) | 0x100u;
    while (remaining > 0) {
      if ((f1 & 1) == 0) {
        // A run of literal tokens, up to the next match flag or the marker:
        // at most eight.
        const size_t tokens = std::min<size_t>(std::countr_zero(f1), remaining);
        const size_t copied = std::min(tokens, end - o);
        if (coded.has(in, 8))
          std::memcpy(o0 + o, coded.data() + in, 8);
        else if (copied > 0)
          std::memcpy(o0 + o, coded.sub(in, copied).data(), copied);
        o += copied;
        in += copied;
        remaining -= tokens;
        f1 >>= tokens;
      } else {
        if (remaining < 2) throw BadData("match past the coded bytes");
        const uint32_t b = coded.u16le(in);  // b0 in the low byte, b1 in the high
        const bool shortForm = f2 & 1;
        size_t distance, length;
        if (shortForm) {
          distance = (b & 0x0F) + 1;
          length = ((b & 0xF0) << 4 | b >> 8) + 3;
        } else {
          distance = ((b & 0xE0) << 3 | b >> 8) + 17;
          length = (b & 0x1F) + 3;
        }
        if (distance > o) throw BadData("match before the start of the output");
        if (length > end - o) throw BadData("match past the end of the output");
        if (shortForm)
          CopyMatch(o0 + o, distance, length);
        else
          CopyBlocks<16>(o0 + o, o0 + o - distance, length);  // never overlaps within a block
        o += length;
        in += 2;
        remaining -= 2;
        f2 >>= 1;
        f1 >>= 1;
      }
      // A register that runs empty as the coded bytes end is not refilled:
      // no token follows.
      if (f1 == 1) {
        if (remaining == 0) break;
        f1 = coded.u8(in++) | 0x100u;
        --remaining;
      }
      if (f2 == 1) {
        if (remaining == 0) break;
        f2 = coded.u8(in++) | 0x100u;
        --remaining;
      }
    }
  }
  // Bytes the stream did not produce are zero, whatever the block copies
  // left there.
  std::memset(o0 + o, 0, end - o);
  out.resize(end);
  return out;
}

}  // namespace cairn
