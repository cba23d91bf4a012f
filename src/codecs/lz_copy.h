// The copies shared by the LZ decoders. The decoders keep a few spare bytes
// past the end of their output buffer, so that short copies can move whole
// 8- or 16-byte blocks and run over their end; whatever lands past the
// decoded length is overwritten or cleared afterwards.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace cairn {

// Spare bytes an output buffer keeps past the decoded size.
inline constexpr size_t kCopySlack = 32;

// Copies `n` bytes in blocks of `Block`; reads and writes up to Block - 1
// bytes past `n`.
template <size_t Block>
inline void CopyBlocks(uint8_t* dst, const uint8_t* src, size_t n) {
  for (size_t k = 0; k < n; k += Block) std::memcpy(dst + k, src + k, Block);
}

// Copies `length` bytes that start `distance` bytes before `dst` to `dst`, in
// the order a byte-by-byte copy would: where source and destination overlap,
// the bytes just written are repeated. The caller has checked that the source
// lies in the output written so far and that the destination, plus
// kCopySlack bytes, lies in the output buffer.
inline void CopyMatch(uint8_t* dst, size_t distance, size_t length) {
  const uint8_t* src = dst - distance;
  if (distance >= 16) {
    // Each block reads only bytes written before it.
    CopyBlocks<16>(dst, src, length);
  } else if (distance >= 8) {
    CopyBlocks<8>(dst, src, length);
  } else if (distance == 1) {
    std::memset(dst, *src, length);
  } else {
    // The copy repeats a pattern of `distance` bytes. Every pass copies whole
    // patterns from `src`, so it reads only bytes already in place and the
    // next pass can take twice as much.
    for (size_t done = 0; done < length;) {
      const size_t n = std::min(length - done, distance + done);
      std::memcpy(dst + done, src, n);
      done += n;
    }
  }
}

}  // namespace cairn
