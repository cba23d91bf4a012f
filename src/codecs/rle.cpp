// The run-length decoder. Each run opens with a control byte c whose low
// seven bits n are its length: with bit 7 set, n literal bytes follow; with
// bit 7 clear, one byte follows and repeats n times. A run of length 0 still
// takes its byte (0x00) or nothing more (0x80).
#include <algorithm>
#include <cstring>

#include "codecs/codecs.h"
#include "codecs/lz_copy.h"

namespace cairn {

std::vector<uint8_t> RleDecode(ByteView coded, uint32_t unpackedSize) {
  // The most two coded bytes can say is a run of 127: the output buffer holds
  // no more than that.
  const size_t end = std::min<uint64_t>(unpackedSize, uint64_t{coded.size() / 2} * 127);
  std::vector<uint8_t> out(end + kCopySlack);
  uint8_t* const o0 = out.data();
  size_t o = 0;
  for (size_t i = 0; i < coded.size();) {
    const uint8_t c = coded.u8(i++);
    const size_t n = c & 0x7F;
    if (n > end - o) throw BadData("run past the end of the output");
    if (c & 0x80) {
      if (coded.has(i, n + 16))
        CopyBlocks<16>(o0 + o, coded.data() + i, n);
      else if (n > 0)
        std::memcpy(o0 + o, coded.sub(i, n).data(), n);
      i += n;
    } else {
      // An empty repeat run at the very end has no byte to take; it needs
      // none.
      if (n > 0) {
        const uint8_t v = coded.u8(i);
        for (size_t k = 0; k < n; k += 16) std::memset(o0 + o + k, v, 16);
      }
      i += 1;
    }
    o += n;
  }
  // Bytes the runs do not reach are zero, whatever the block copies left
  // there.
  std::memset(o0 + o, 0, end - o);
  out.resize(end);
  return out;
}

}  // namespace cairn
