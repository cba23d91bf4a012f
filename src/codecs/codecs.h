// The decoders: pure functions over bytes, no I/O. Each throws BadData on
// data it cannot decode and never reads or writes outside its buffers. An
// output size that the coded bytes could not produce even at the code's best
// ratio is refused before the output is allocated.
#pragma once

#include <cstdint>
#include <vector>

#include "util/bytes.h"

namespace cairn {

// A "JDLZ" coded stream (the two flag bytes first, no tagged header) decoded
// to `unpackedSize` bytes, or to as many as the coded bytes can produce when
// that is fewer: the bytes beyond, which no stream of this length reaches,
// are the caller's to write as zeros. Bytes the stream ends without
// producing are zero.
std::vector<uint8_t> JdlzDecode(ByteView coded, uint32_t unpackedSize);

// A run-length code (control byte: bit 7 set, that many literal bytes follow;
// clear, the next byte repeats that many times) decoded to `unpackedSize`
// bytes, or to as many as the coded bytes can produce, like JdlzDecode. Bytes
// the runs do not reach are zero.
std::vector<uint8_t> RleDecode(ByteView coded, uint32_t unpackedSize);

// An opcode LZ stream (each opcode gives literals, then a copy) decoded to
// exactly `unpackedSize` bytes; a stream that decodes to any other length is
// refused.
std::vector<uint8_t> OpcodeLzDecode(ByteView coded, uint32_t unpackedSize);

}  // namespace cairn
