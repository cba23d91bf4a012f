// Extraction methods that write a media file around the stored bytes, and the
// pure pieces they are built from: header builders and pixel transforms.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <utility>
#include <vector>

#include "core/extract.h"
#include "util/bytes.h"

namespace cairn {

// ---- Methods -------------------------------------------------------------

// TGA (truevision) pictures.
void TgaFromBuiltInPalette(ExtractionFrame& f);  // 4, 70
void TgaFromTailPalette(ExtractionFrame& f);     // 5
void TgaThenInflate(ExtractionFrame& f);         // 39, 120
void TgaStored16(ExtractionFrame& f);            // 40
void TgaStored(ExtractionFrame& f);              // 47, 71, 72, 134, 139, 141, 152
void TgaLeadingPalette(ExtractionFrame& f);      // 78
void TgaChunkPicture(ExtractionFrame& f);        // 92, 111
void TgaPixelObject(ExtractionFrame& f);         // 145
void TgaTrailingPalette(ExtractionFrame& f);     // 151
// The 8-bit and 16-bit image sequences: TGA or BMP by Flag.
void ImageSequencePicture(ExtractionFrame& f);  // 135-138
// Their 8-bit pictures with a palette of their own, as 16-bit TGA.
void TgaFromOwnPalette16(ExtractionFrame& f);

// BMP pictures.
void BmpFixedLayout(ExtractionFrame& f);      // 99, 100
void BmpWithColourTable(ExtractionFrame& f);  // 104
void Bmp565(ExtractionFrame& f);              // 140, 149

// Sounds and fixed starts.
void WavPcm16Short(ExtractionFrame& f);  // 41: 40-byte header
void WavPcm8(ExtractionFrame& f);        // 102
void WavPcm16(ExtractionFrame& f);       // 126
void JpegPrefix(ExtractionFrame& f);     // 131
// An IFF ILBM picture whose first 16 bytes are replaced by a FORM/BMHD start.
void IlbmPrefix(ExtractionFrame& f);  // 155

// DDS textures.
void DdsStored(ExtractionFrame& f);      // 79, 124, 157
void DdsMaybeCoded(ExtractionFrame& f);  // 123

// ---- Building blocks -----------------------------------------------------

inline constexpr size_t kTgaHeaderSize = 18;
inline constexpr size_t kTgaColourMapSize = 768;
inline constexpr size_t kBmpHeaderSize8 = 1078;  // headers and 256-colour palette
inline constexpr size_t kBmpHeaderSize16 = 66;   // headers and three bit masks
inline constexpr size_t kDdsHeaderSize = 128;

// An uncompressed true-colour TGA header. `size` is width | height << 16.
std::vector<uint8_t> TgaHeader(uint32_t size, uint8_t bitsPerPixel, uint8_t descriptor);

// The header of an uncompressed colour-mapped TGA (256 entries of 24 bits,
// top row first) followed by its colour map, built from `colours` red-green-
// blue triples (at most 256 are used; the rest of the map stays 0): 786 bytes.
std::vector<uint8_t> TgaColourMappedStart(uint32_t size, uint8_t bitsPerPixel, ByteView rgb,
                                          size_t colours);

// Each index turned into the first `outBytes` bytes of the palette entry it
// selects (entries `entryBytes` apart). Indices past the palette give zeros.
std::vector<uint8_t> ExpandIndices(ByteView indices, ByteView palette, unsigned entryBytes,
                                   unsigned outBytes);

// Red-green-blue triples as blue-green-red triples.
std::vector<uint8_t> BgrFromRgb(ByteView rgb);

// Exchanges bytes 0 and 2 of every 4-byte group (red and blue); a short tail
// is left alone.
void SwapRedBlue(std::span<uint8_t> pixels);

// The BMP headers: 54 bytes for 8 bits per pixel (the palette follows), 66
// for 16 bits (5-6-5 bit fields, the masks included).
std::vector<uint8_t> BmpHeader(uint32_t fileSize, uint32_t width, uint32_t height,
                               unsigned bitsPerPixel);

// 256 red-green-blue triples (an ".act" colour table) as BMP palette entries.
std::vector<uint8_t> BmpPaletteFromRgb(ByteView rgb);

// BMP rows are 4-byte aligned.
inline uint64_t BmpStride(uint64_t rowBytes) {
  return (rowBytes + 3) & ~uint64_t{3};
}

// `area` holds `rows` rows of `rowBytes` bytes, top row first and packed at its
// start; they are rearranged in place into BMP order: bottom row first, each
// row padded with zeros to BmpStride(rowBytes). `area` must be
// BmpStride(rowBytes) x rows bytes long.
void ArrangeBmpRows(std::span<uint8_t> area, size_t rowBytes, size_t rows);

// Width and height of a raw 8-bit picture by its stored size; none for a size
// that is not a known picture size.
std::optional<std::pair<uint32_t, uint32_t>> RawPictureSize(uint32_t packedSize);

// A RIFF/WAVE header for mono PCM. With `withDataSize` false the header stops
// before the data size (40 bytes) and the first stored bytes take its place.
std::vector<uint8_t> WavHeader(uint32_t dataSize, uint32_t rate, unsigned bitsPerSample,
                               bool withDataSize);

// The 10 bytes a JPEG/JFIF file begins with.
std::vector<uint8_t> JpegStart();

// The 128-byte DDS header for an entry of `format` with `flag` and `extra`;
// throws BadData for a Flag that names no pixel format.
std::vector<uint8_t> DdsHeader(FormatId format, uint8_t flag, uint32_t extra);

}  // namespace cairn
