// The directory readers. Each fills the context's entries or throws BadData;
// `row` selects a layout for the readers that serve several formats.
#pragma once

#include "plugin/session.h"

namespace cairn {

void RecordTableReader(ReaderContext& c, unsigned row);
void FieldTableReader(ReaderContext& c, unsigned row);
void SingleEntryReader(ReaderContext& c, unsigned row);

// Directories whose records carry the names (inline_names.cpp).
// Counted arrays of equal records: row 0 "MHX XS V1.0", 1 "MageGold",
// 2 "PFF2"/"PFF3".
void NamedRecordReader(ReaderContext& c, unsigned row);
void DirReader(ReaderContext& c, unsigned row);   // "DIR"
void FarReader(ReaderContext& c, unsigned row);   // "FAR!byAZ"
void Dfp1Reader(ReaderContext& c, unsigned row);  // "DFP1"
void CmprReader(ReaderContext& c, unsigned row);  // "CMPR"
void PvolReader(ReaderContext& c, unsigned row);  // "PVOL"

// Lump archives with TGA copies of their pictures (textures.cpp): row 0
// "WAD2", 1 "WAD3", 2 the "PACK" directory archive.
void TextureArchiveReader(ReaderContext& c, unsigned row);

// Files that are one stream behind a small header (single_stream.cpp): row 0
// "PACK" compressed file, 1 "Nemo Fi", 2 "l33t", 3 "AVIX", 4 "JDLZ".
void SingleStreamReader(ReaderContext& c, unsigned row);

}  // namespace cairn
