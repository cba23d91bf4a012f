// Files that hold one picture or one compressed stream, listed as one entry
// named after the archive (without its extension, unless said otherwise) so
// that extraction writes a picture file or the decoded stream. F is the file
// size; W and H are the picture's width and height.
//
//   131  a JPEG file without its first 10 bytes: the archive's name less its
//        last four characters + ".jpg", the whole file, 10 bytes more.
//   134  16-bit pixels, no header; W and H follow from F for a few sizes.
//   139  "TEX" 00 01 00, W at 6, H at 10, 16-bit pixels from 22: a TGA file.
//   140  the same as a 5-6-5 BMP file.
//   141  u32 100, W at 4, 16-bit pixels from 12; H is what F holds.
//   145  a pixel-data object: W at 107, H at 111, pixels from 125 of 8, 24
//        or 32 bits (the byte at 83); listed as the whole name + ".tga".
//   149  W at 4, H at 8, 16-bit pixels from 28: the whole name + ".bmp".
//   125  a coded stream from 5 (byte 0 is 16) or 8 (byte 0 is 17), its
//        decoded size big-endian in bytes 2 to 4.
//   109  a zlib stream from 9, its size at 1 and its inflated size at 5, and
//        a JPEG copy: the inflated data begins with the JPEG's length.
#include <zlib.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "media/conversion.h"
#include "media/media.h"
#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

std::string BaseName(const ReaderContext& c) {
  const std::string_view base = StripExtension(c.archiveFileName);
  return std::string(base.empty() ? c.archiveFileName : base);
}

uint32_t Fit32(uint64_t size) {
  if (size > UINT32_MAX) throw BadData("size past 4 GiB");
  return static_cast<uint32_t>(size);
}

// Width and height as one word; a picture file holds 16-bit sides only.
uint32_t SizeWord(uint64_t width, uint64_t height) {
  if (width > 0xFFFF || height > 0xFFFF) throw BadData("picture side beyond 16 bits");
  return static_cast<uint32_t>(width | height << 16);
}

// A 5-6-5 BMP file: its rows are padded to 4 bytes.
uint32_t Bmp565Size(uint32_t width, uint32_t height) {
  return Fit32(kBmpHeaderSize16 + BmpStride(2ull * width) * height);
}

void JpegStream(ReaderContext& c) {
  const std::string_view name = c.archiveFileName;
  AddEntry(c, std::string(name.substr(0, name.size() - std::min<size_t>(4, name.size()))) + ".jpg",
           0, Fit32(uint64_t{c.fileSize} + 10), c.fileSize);
}

void Headerless555(ReaderContext& c) {
  // By file size: 640 x 480, 100 x 4201, 100 x 4901, 1024 x 768, 640 x 2400.
  constexpr std::array<std::pair<uint32_t, uint32_t>, 5> kSizes = {{{614400, 0x01E00280},
                                                                    {840200, 0x10690064},
                                                                    {980200, 0x13250064},
                                                                    {1572864, 0x03000400},
                                                                    {3072000, 0x09600280}}};
  uint32_t word = 0;
  for (const auto& [size, w] : kSizes)
    if (size == c.fileSize) word = w;
  AddEntry(c, BaseName(c) + ".tga", 0, Fit32(uint64_t{c.fileSize} + 18), c.fileSize, 16, word);
}

void TexPicture(ReaderContext& c, bool bmp) {
  const uint32_t width = c.header.u32le(6), height = c.header.u32le(10);
  const uint32_t word = SizeWord(width, height);
  const uint32_t unpacked = bmp ? Bmp565Size(width, height) : Fit32(2ull * width * height + 18);
  AddEntry(c, BaseName(c) + (bmp ? ".bmp" : ".tga"), 22, unpacked, c.fileSize - 22, bmp ? 0 : 16,
           word);
}

void WidthOnlyPicture(ReaderContext& c) {
  const uint32_t width = c.header.u32le(4);
  if (width == 0) throw BadData("picture of width 0");
  const uint32_t word = SizeWord(width, c.fileSize / (2ull * width));
  AddEntry(c, BaseName(c) + ".tga", 12, Fit32(uint64_t{c.fileSize} + 6), c.fileSize - 12, 16, word);
}

void PixelObject(ReaderContext& c) {
  // Bits per pixel at 83: 32 and 24 are stored as they are, 8 are indices
  // into a palette of 32-bit colours.
  const uint8_t bits = c.header.u8(83);
  if (bits != 8 && bits != 24 && bits != 32) throw BadData("no such pixel depth");
  const uint8_t bytes = bits == 24 ? 3 : 4, flag = bits == 32 ? 3 : bits == 24 ? 2 : 1;
  // The sides lie just past the first 104 bytes.
  const std::vector<uint8_t> sides = ReadBlock(c, 107, 8);
  const uint32_t width = ByteView(sides).u32le(0), height = ByteView(sides).u32le(4);
  const uint32_t word = SizeWord(width, height);
  AddEntry(c, std::string(c.archiveFileName) + ".tga", 0,
           Fit32(uint64_t{width} * height * bytes + kTgaHeaderSize), c.fileSize, flag, word);
}

void RsbPicture(ReaderContext& c) {
  const uint32_t width = c.header.u32le(4), height = c.header.u32le(8);
  const uint32_t word = SizeWord(width, height);
  AddEntry(c, std::string(c.archiveFileName) + ".bmp", 28, Bmp565Size(width, height),
           Fit32(2ull * width * height), 0, word);
}

void QfsStream(ReaderContext& c) {
  const uint8_t kind = c.header.u8(0);
  if (kind != 16 && kind != 17) throw BadData("no such stream header");
  const uint32_t offset = kind == 16 ? 5 : 8;
  AddEntry(c, BaseName(c) + ".fsh", offset, c.header.u32be(1) & 0xFFFFFF, c.fileSize - offset);
}

void JpegContainer(ReaderContext& c) {
  // The JPEG's length is the first word the stream inflates to: inflating
  // the rest of the header into 4 bytes must fill them and want more.
  const ByteView head = c.header.sub(9, kHeaderSize - 9);
  std::array<uint8_t, 4> length{};
  uLongf got = length.size();
  if (uncompress(length.data(), &got, head.data(), head.size()) != Z_BUF_ERROR)
    throw BadData("no JPEG length at the start of the stream");
  const std::string base = BaseName(c);
  const uint32_t packed = c.header.u32le(1), inflated = c.header.u32le(5);
  AddEntry(c, base, 9, inflated, packed);
  AddConvertedEntry(c, kJpgFolder, base, ".jpg", 9, ByteView(length.data(), 4).u32le(0), packed,
                    inflated, 1);
}

using PictureFn = void (*)(ReaderContext&);
constexpr std::array<PictureFn, 9> kSinglePictureReaders = {
    JpegStream,
    Headerless555,
    [](ReaderContext& c) { TexPicture(c, false); },
    [](ReaderContext& c) { TexPicture(c, true); },
    WidthOnlyPicture,
    PixelObject,
    RsbPicture,
    QfsStream,
    JpegContainer,
};

}  // namespace

void SinglePictureReader(ReaderContext& c, unsigned row) {
  kSinglePictureReaders.at(row)(c);
}

}  // namespace cairn
