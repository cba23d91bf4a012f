// Extraction methods that decode the stored bytes.
#pragma once

#include "core/extract.h"

namespace cairn {

// The entry is one zlib stream; its inflated bytes are the output.
void Inflate(ExtractionFrame& f);
// Stored as is when Flag is 0, otherwise a zlib stream.
void RawOrInflate(ExtractionFrame& f);
// Stored as is when Flag is 0, otherwise a zlib stream of at most 4 MiB.
void RawOrInflate4M(ExtractionFrame& f);
// A zlib stream; with a Flag, one that inflates to a length-prefixed picture
// of at most Extra bytes.
void InflateJpegContainer(ExtractionFrame& f);

// The entry is run-length coded; the output is exactly UnpackedSize bytes.
void RleMethod(ExtractionFrame& f);
// The entry is one "JDLZ" coded stream (flag bytes first).
void JdlzMethod(ExtractionFrame& f);
// The entry is a chain of blocks, each a u16 length L (data bytes + 1), three
// unread bytes and L - 1 data bytes; PackedSize is the sum of the L values.
void BlockJoin(ExtractionFrame& f);
// The entry is an opcode LZ stream that decodes to exactly UnpackedSize bytes.
void OpcodeLzMethod(ExtractionFrame& f);

}  // namespace cairn
