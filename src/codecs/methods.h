// Extraction methods that decode the stored bytes.
#pragma once

#include "plugin/extract.h"

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

}  // namespace cairn
