// One zlib stream of an entry inflated to the output, in bounded memory.
#pragma once

#include <cstdint>

#include "core/extract.h"

namespace cairn {

// Inflates the zlib stream of `packedSize` bytes at `offset` and writes the
// result at the output's position. A stream that would inflate to more than
// `capacity` bytes fails. With `lengthPrefixed` the inflated data begins with
// a u32 length n and only the n bytes after it (at most what follows) are
// written. Answers 0, -8 when the stored bytes cannot be read, or zlib's
// result (Z_BUF_ERROR, Z_DATA_ERROR, Z_MEM_ERROR).
int InflateMember(ExtractionFrame& f, uint32_t offset, uint32_t packedSize, uint32_t capacity,
                  bool lengthPrefixed);

}  // namespace cairn
