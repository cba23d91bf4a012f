// The directory readers. Each fills the context's entries or throws BadData;
// `row` selects a layout for the readers that serve several formats.
#pragma once

#include <cstdint>
#include <functional>
#include <string_view>
#include <vector>

#include "core/session.h"

namespace cairn {

void RecordTableReader(ReaderContext& c, unsigned row);
void FieldTableReader(ReaderContext& c, unsigned row);
void SingleEntryReader(ReaderContext& c, unsigned row);

// An offset derived by adding up sizes: one that no longer fits in 32 bits
// cannot lie in the archive.
inline uint32_t DerivedOffset(uint64_t position) {
  if (position > UINT32_MAX) throw BadData("offset past 4 GiB");
  return static_cast<uint32_t>(position);
}

// How a fixed-size record holds its name, its data offset and its size. With
// `offsetFirst` a record is offset, size, name; otherwise name, offset, size.
// The record is as long as the three steps together.
struct RecordFields {
  uint32_t nameWidth;
  uint32_t firstStep;   // from the first numeric field to the size field
  uint32_t secondStep;  // from the size field to what follows it; 0: no size is stored
  bool offsetFirst;

  constexpr uint64_t recordSize() const { return uint64_t{nameWidth} + firstStep + secondStep; }
};

// Reads `count` records laid out as `fields` from `offset` and adds one entry
// per record, in order: the name field up to its first zero byte, the offset
// field, and the size field as both sizes (0 when none is stored). The whole
// directory must lie inside the archive. Answers the directory's bytes, for
// readers that look at more of each record.
std::vector<uint8_t> ReadRecordDirectory(ReaderContext& c, uint64_t offset, uint32_t count,
                                         const RecordFields& fields);
// The same over a directory already in memory (a companion file's, say).
void ParseRecordDirectory(ReaderContext& c, ByteView directory, uint32_t count,
                          const RecordFields& fields);

// Where each field sits in a fixed-size record, in any order. Where the two
// size positions coincide the entry's sizes are equal.
struct FieldPositions {
  uint32_t namePosition;
  uint32_t nameWidth;
  uint32_t offsetPosition;
  uint32_t unpackedPosition;
  uint32_t packedPosition;
  uint32_t recordSize;

  constexpr bool fitsRecord() const {
    return uint64_t{namePosition} + nameWidth <= recordSize &&
           offsetPosition + 4ull <= recordSize && unpackedPosition + 4ull <= recordSize &&
           packedPosition + 4ull <= recordSize;
  }
};

// Reads `count` records of `fields.recordSize` bytes from `offset` and adds
// one entry per record, in order. The whole directory must lie inside the
// archive, and every field inside its record.
void ReadFieldDirectory(ReaderContext& c, uint64_t offset, uint32_t count,
                        const FieldPositions& fields);

// Chained items and the line directory (chained_items.cpp).
void ChainedItemReader(ReaderContext& c, unsigned row);
void LineDirectoryReader(ReaderContext& c, unsigned row);

// Folder tree, typed tables and keyed records (folder_trees.cpp).
void FolderTreeReader(ReaderContext& c, unsigned row);
void TypedTableReader(ReaderContext& c, unsigned row);
void KeyedRecordReader(ReaderContext& c, unsigned row);

// Directories with a separate name block (name_blocks.cpp).
void NameBlockReader(ReaderContext& c, unsigned row);

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

// Further counted record directories (counted_records.cpp): row 0 "AWAD",
// 1 "MJZ0", 2 "MH3 V1.0 ", 3 "VER2", 4 "MQDB", 5 "ezd", 6 "MIX1", 7 "THU3",
// 8 "SDPA", 9 "LP1C".
void CountedRecordReader(ReaderContext& c, unsigned row);
// Directories with type codes and stored paths (typed_paths.cpp): row 0
// "GABA", 1 "H4R", 2 the newline directory, 3 "BIG", 4 the resource file of
// signature row 57.
void TypedPathReader(ReaderContext& c, unsigned row);

// Refuses `count` records of at least `minimum` bytes each that `bytes`
// cannot hold, before anything is reserved for them.
inline void NeedRoomFor(uint64_t count, uint64_t bytes, uint64_t minimum) {
  if (count > bytes / minimum) throw BadData("more records than the directory holds");
}
// Names entry `i` after the archive file and its index, then `extension`.
void NumberEntry(ReaderContext& c, size_t i, std::string_view extension = {});
// SizesFromOffsets for a directory whose offsets must not go back nor lie
// past `end` (the end of the file when 0); one that does is refused.
void SizesToNextOffset(ReaderContext& c, uint32_t end = 0);
// Adds `count` records from the start of `directory`: a zero-terminated
// name, `gap` spare bytes, offset, unpacked and packed size, `tail` spare
// bytes.
void ReadNamedSizeRecords(ReaderContext& c, ByteView directory, uint32_t count, uint32_t gap,
                          uint32_t tail, uint8_t flag);

// Chunk chains and compressed directories (level_chunks.cpp): the "TR4"
// level file and the "SNOK_DATAFILE_KEEP_OUT!" archive.
void Tr4Reader(ReaderContext& c, unsigned row);
void SnokReader(ReaderContext& c, unsigned row);
// Inflates a complete zlib stream held in memory and hands its bytes to
// `take` `piece` at a time (the last piece may be shorter). A stream that is
// broken or would inflate to more than `capacity` bytes is refused with
// BadData.
void InflatePieces(ByteView stream, uint64_t capacity, size_t piece,
                   const std::function<void(ByteView)>& take);

// Files walked section by section (sections.cpp): "PALETTEFILES " and the
// "TEX" texture lists.
void PaletteFilesReader(ReaderContext& c, unsigned row);
void TextureListReader(ReaderContext& c, unsigned row);

// Folder trees (nested_trees.cpp): "_ARCHIVE", "RezMgr" and the item-stream
// tree archive.
void FolderTableReader(ReaderContext& c, unsigned row);
void RezMgrReader(ReaderContext& c, unsigned row);
void ItemTreeReader(ReaderContext& c, unsigned row);
// The object package with name, export and import tables (object_package.cpp).
void ObjectPackageReader(ReaderContext& c, unsigned row);

// Directories reworked after reading (reversed_names.cpp).
void MassivePakReader(ReaderContext& c, unsigned row);  // "MASSIVE PAKFILE V 4.0"
void HeaderListReader(ReaderContext& c, unsigned row);  // "PK" header list

// The "ISD0" record list (enciphered_records.cpp). Its key takes in a 32-bit
// constant that is not known; this stand-in takes its place until it is.
inline constexpr uint32_t kIsd0KeyConstant = 0x5EED15D0;
void EncipheredRecordReader(ReaderContext& c, unsigned row);

// Sequential name directories and item chains (sequential_names.cpp): row 0
// the 23-byte-header chain (77), 1 zero-terminated names (96), 2 the name
// table (103), 3 inline names (107), 4 20-byte records (113), 5 the 16-byte
// header chain (117), 6 space-terminated names (119), 7 length-prefixed names
// (144), 8 the big-endian directory (16, 132).
void SequentialNameReader(ReaderContext& c, unsigned row);

// Block streams, offset tables and tagged chunk files (block_streams.cpp):
// block streams row 0 ".frame", 1 ".sequence" with a 12-byte header, 2
// ".sequence" without; tagged chunks row 0 "TGL", 1 "KPS".
void BlockStreamReader(ReaderContext& c, unsigned row);
void NumberedOffsetTableReader(ReaderContext& c, unsigned row);
void TaggedChunkReader(ReaderContext& c, unsigned row);
void ChunkOffsetTableReader(ReaderContext& c, unsigned row);

// Bare pictures (raw_pictures.cpp): the named palette images (row 0 512 x
// 512, 1 512 x 256), the headerless images (row 0 8-bit with a palette, 1
// 24-bit) and the image sequences (row 0 pictures at the next non-zero byte,
// 1 on an 8-byte grid).
void NamedImageReader(ReaderContext& c, unsigned row);
void HeaderlessImageReader(ReaderContext& c, unsigned row);
void ImageSequenceReader(ReaderContext& c, unsigned row);
// Textures (texture_bundles.cpp): the sectioned bundles (row 0 with three
// sections, 1 with a leading block and palettes in front, 2 with a leading
// block) and the packed 512 x 256 texture.
void TextureBundleReader(ReaderContext& c, unsigned row);
void PackedTextureReader(ReaderContext& c, unsigned row);

// Names chosen by content or type (content_names.cpp): the sheet archive
// (80), 8.3 names (88), the offset-list sound bank (102), the raw picture
// list (104), scrambled names (106), the sound bank with an ".idx" index
// (126), the tagged chunk stream (146) and the name list (156).
void SheetArchiveReader(ReaderContext& c, unsigned row);
void Dir83Reader(ReaderContext& c, unsigned row);
void OffsetSoundReader(ReaderContext& c, unsigned row);
void RawPictureListReader(ReaderContext& c, unsigned row);
void ScrambledNameReader(ReaderContext& c, unsigned row);
void IndexedSoundBankReader(ReaderContext& c, unsigned row);
void ChunkStreamReader(ReaderContext& c, unsigned row);
void NameListReader(ReaderContext& c, unsigned row);
// Nested folders, compressed directories and header-driven pictures
// (header_pictures.cpp): 150, 142, 115, 78, 79 and 84.
void NestedFolderReader(ReaderContext& c, unsigned row);
void CompressedDirectoryReader(ReaderContext& c, unsigned row);
void ImageBankReader(ReaderContext& c, unsigned row);
void NamedPalettePictureReader(ReaderContext& c, unsigned row);
void MipTextureReader(ReaderContext& c, unsigned row);
void EmbeddedSheetReader(ReaderContext& c, unsigned row);

// Offset tables and directories beside the archive (companion_files.cpp):
// 90, 98 (the ".dir" companion), 110, 130, 133, 148 and 153.
void OffsetNameReader(ReaderContext& c, unsigned row);
void SectorDirectoryReader(ReaderContext& c, unsigned row);
void HeadTableReader(ReaderContext& c, unsigned row);
void NumberedRecordReader(ReaderContext& c, unsigned row);
void TrailingDataReader(ReaderContext& c, unsigned row);
void SeparateNameReader(ReaderContext& c, unsigned row);
void EmptyNameEndReader(ReaderContext& c, unsigned row);
// One picture or stream a file (single_pictures.cpp): row 0 131, 1 134, 2
// 139, 3 140, 4 141, 5 145, 6 149, 7 125, 8 109.
void SinglePictureReader(ReaderContext& c, unsigned row);

// Enciphered sound banks (sound_banks.cpp): row 0 the station banks (65), 1
// the banks with a second length (66).
void SoundBankReader(ReaderContext& c, unsigned row);

// Image lists, trailing tables and companion indexes (image_lists.cpp): image
// lists row 0 behind a located table (81), 1 after 32 bytes (82), 2 after 96
// (83); companion indexes row 0 ".fat" (143), 1 ".rfh" (108), 2 ".dir" (121).
void ImageListReader(ReaderContext& c, unsigned row);
void EndDirectoryReader(ReaderContext& c, unsigned row);       // 91
void EndOffsetTableReader(ReaderContext& c, unsigned row);     // 93
void TrailingNameTableReader(ReaderContext& c, unsigned row);  // 116
void CompanionIndexReader(ReaderContext& c, unsigned row);
void ScrambledSizeChainReader(ReaderContext& c, unsigned row);  // 154

}  // namespace cairn
