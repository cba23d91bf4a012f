// The decoders: pure functions over bytes, no I/O. Each throws BadData on
// data it cannot decode and never reads or writes outside its buffers.
#pragma once

#include <cstdint>
#include <vector>

#include "util/bytes.h"

namespace cairn {

// A "JDLZ" coded stream (the two flag bytes first, no tagged header) decoded
// to exactly `unpackedSize` bytes.
std::vector<uint8_t> JdlzDecode(ByteView coded, uint32_t unpackedSize);

}  // namespace cairn
