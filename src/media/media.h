// Extraction methods that write a media file around the stored bytes.
#pragma once

#include "plugin/extract.h"

namespace cairn {

// An IFF ILBM picture whose first 16 bytes are replaced by a FORM/BMHD start.
void IlbmPrefix(ExtractionFrame& f);

}  // namespace cairn
