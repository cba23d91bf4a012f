// The TGA writers. Every file is an uncompressed TGA with an 18-byte header:
// true colour (type 2) built from the entry's Extra (width | height << 16) and
// a depth, or colour-mapped (type 1) with a 256-entry map of 24-bit colours.
// Pixels are either the stored bytes behind the header (RawCopy, inflation)
// or indices turned into colours through a palette; indices are converted in
// order, with no row reordering.
#include <algorithm>

#include "codecs/inflate.h"
#include "codecs/methods.h"
#include "core/stored.h"
#include "media/media.h"
#include "media/palettes.h"

namespace cairn {
namespace {

uint64_t PixelCount(uint32_t size) {
  return uint64_t{size & 0xFFFF} * (size >> 16);
}

ByteView View(const std::array<uint8_t, 1024>& palette) {
  return ByteView(palette.data(), palette.size());
}

// Reads `count` indices at `position` and writes the header and the pixels
// they select.
void WriteIndexed(ExtractionFrame& f, const std::vector<uint8_t>& header, uint64_t position,
                  uint64_t count, ByteView palette, unsigned entryBytes, unsigned outBytes) {
  const std::vector<uint8_t> indices = ReadStored(f, position, count);
  f.Write(header);
  f.Write(ExpandIndices(indices, palette, entryBytes, outBytes));
}

}  // namespace

std::vector<uint8_t> TgaHeader(uint32_t size, uint8_t bitsPerPixel, uint8_t descriptor) {
  std::vector<uint8_t> h(kTgaHeaderSize, 0);
  h[2] = 2;
  PutU32le(h, 12, size);
  h[16] = bitsPerPixel;
  h[17] = descriptor;
  return h;
}

std::vector<uint8_t> TgaColourMappedStart(uint32_t size, uint8_t bitsPerPixel, ByteView rgb,
                                          size_t colours) {
  std::vector<uint8_t> h(kTgaHeaderSize + kTgaColourMapSize, 0);
  h[1] = 1;
  h[2] = 1;
  PutU16le(h, 5, 256);
  h[7] = 24;
  PutU32le(h, 12, size);
  h[16] = bitsPerPixel;
  h[17] = 0x20;
  const std::vector<uint8_t> map = BgrFromRgb(rgb.sub(0, 3 * std::min<size_t>(colours, 256)));
  std::copy(map.begin(), map.end(), h.begin() + kTgaHeaderSize);
  return h;
}

std::vector<uint8_t> BgrFromRgb(ByteView rgb) {
  std::vector<uint8_t> out(rgb.data(), rgb.data() + rgb.size());
  for (size_t i = 0; i + 3 <= out.size(); i += 3) std::swap(out[i], out[i + 2]);
  return out;
}

std::vector<uint8_t> ExpandIndices(ByteView indices, ByteView palette, unsigned entryBytes,
                                   unsigned outBytes) {
  std::vector<uint8_t> out(indices.size() * outBytes, 0);
  const size_t entries = entryBytes == 0 ? 0 : palette.size() / entryBytes;
  const size_t take = std::min(outBytes, entryBytes);
  const uint8_t* p = indices.data();
  for (size_t i = 0; i < indices.size(); ++i) {
    if (p[i] >= entries) continue;  // a colour the palette does not hold: black
    const uint8_t* colour = palette.data() + size_t{p[i]} * entryBytes;
    std::copy(colour, colour + take, out.begin() + static_cast<std::ptrdiff_t>(i * outBytes));
  }
  return out;
}

void SwapRedBlue(std::span<uint8_t> pixels) {
  for (size_t i = 0; i + 4 <= pixels.size(); i += 4) std::swap(pixels[i], pixels[i + 2]);
}

void TgaFromBuiltInPalette(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  if (e.Flag == 0) return RawCopy(f);
  // "WAD2" pictures have an 8-byte head, "PACK" ones a 100-byte head.
  const bool wad2 = e.Flag == 1;
  const uint32_t start = wad2 ? 8 : 100;
  const uint64_t count = PixelCount(e.Extra);
  if (start + count > e.PackedSize) throw BadData("fewer indices than pixels");
  WriteIndexed(f, TgaHeader(e.Extra, 24, 0x21), uint64_t{e.Offset} + start, count,
               View(wad2 ? kBuiltInPalette2 : kBuiltInPalette1), 4, 3);
}

void TgaFromTailPalette(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  if (e.Flag == 0) return RawCopy(f);
  // The picture ends in a colour count, 256 red-green-blue colours and two
  // spare bytes; the indices start after a 40-byte or an 8-byte head.
  if (e.PackedSize < 770) throw BadData("no palette behind the picture");
  const uint32_t start = e.Flag == 1 ? 40 : 8;
  const uint64_t count = PixelCount(e.Extra);
  if (start + count > e.PackedSize) throw BadData("fewer indices than pixels");
  const std::vector<uint8_t> palette =
      BgrFromRgb(ReadStored(f, uint64_t{e.Offset} + e.PackedSize - 770, 768));
  WriteIndexed(f, TgaHeader(e.Extra, 24, 0x20), uint64_t{e.Offset} + start, count, palette, 3, 3);
}

void TgaThenInflate(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  if (e.Flag == 0) return RawCopy(f);
  if (e.Flag == 1) return Inflate(f);
  if (e.UnpackedSize < kTgaHeaderSize) throw BadData("no room for the picture");
  const uint8_t bits = f.session.format == 120 ? 24 : e.Flag == 4 ? 16 : 32;
  f.Write(TgaHeader(e.Extra, bits, 0x20));
  if (InflateMember(f, e.Offset, e.PackedSize, e.UnpackedSize - kTgaHeaderSize, false) != 0)
    throw BadData("inflate failed");
}

void TgaStored16(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  if (e.Flag == 0) return RawCopy(f);
  // Exactly the pixels the header describes: the chunk may hold a partial
  // row more, never less.
  const uint64_t bytes = PixelCount(e.Extra) * 2;
  if (bytes > e.PackedSize) throw BadData("fewer pixels than the picture needs");
  f.Write(TgaHeader(e.Extra, 16, 0x20));
  CopyStored(f, e.Offset, static_cast<uint32_t>(bytes));
}

void TgaStored(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  if (e.Flag == 0) return RawCopy(f);
  f.Write(TgaHeader(e.Extra, e.Flag, 0x20));
  CopyStored(f, e.Offset, e.PackedSize);
}

void TgaLeadingPalette(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  // The data: a u16 colour count c, c red-green-blue colours, the 4-byte
  // picture size, then the pixels.
  if (e.PackedSize < 2) throw BadData("no colour count");
  const uint16_t colours = ByteView(ReadStored(f, e.Offset, 2)).u16le(0);
  const uint32_t skip = 3u * colours + 6;
  if (skip > e.PackedSize) throw BadData("palette past the end of the picture");
  // A byte index reaches 256 colours; more are skipped, not mapped.
  const size_t used = std::min<size_t>(colours, 256);
  const std::vector<uint8_t> rgb = ReadStored(f, uint64_t{e.Offset} + 2, 3 * used);
  f.Write(TgaColourMappedStart(e.Extra, e.Flag, rgb, used));
  CopyStored(f, e.Offset + skip, e.PackedSize - skip);
}

void TgaChunkPicture(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  if (e.Flag == 0) return RawCopy(f);
  // The entry starts at its chunk's header; the pixels follow a fixed
  // 33-byte head, or a 41-byte head with the chunk's name inside.
  const bool named = f.session.format == 92;
  uint64_t head = 33;
  if (named) head = 41 + ByteView(ReadStored(f, e.Offset, 104)).cstr(36, 68).size();
  const uint32_t size = named ? e.Extra : e.Extra >> 16 | e.Extra << 16;
  const std::vector<uint8_t> header = TgaHeader(size, 32, named ? 0x21 : 0);
  const uint64_t count = PixelCount(e.Extra);
  const uint64_t at = uint64_t{e.Offset} + head;
  if (e.Flag == 1) {
    std::vector<uint8_t> pixels = ReadStored(f, at, count * 4);
    SwapRedBlue(pixels);
    f.Write(header);
    f.Write(pixels);
    return;
  }
  // Indices, a u32 colour count, then the colours, 4 bytes each.
  const uint32_t colours = ByteView(ReadStored(f, at + count, 4)).u32le(0);
  std::vector<uint8_t> palette =
      ReadStored(f, at + count + 4, 4 * std::min<uint32_t>(colours, 256));
  SwapRedBlue(palette);
  WriteIndexed(f, header, at, count, palette, 4, 4);
}

void TgaPixelObject(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  // The picture always starts at file position 125, whatever Offset says.
  constexpr uint32_t kPixels = 125;
  const uint64_t count = PixelCount(e.Extra);
  if (e.Flag == 1) {
    // 250 colours of 4 bytes lie 15 bytes behind the indices; indices past
    // them are black.
    const std::vector<uint8_t> palette = ReadStored(f, count + 140, 1000);
    WriteIndexed(f, TgaHeader(e.Extra, 32, 0x20), kPixels, count, palette, 4, 4);
    return;
  }
  const uint8_t bits = e.Flag == 2 ? 24 : 32;
  const std::vector<uint8_t> pixels = ReadStored(f, kPixels, count * (bits / 8));
  f.Write(TgaHeader(e.Extra, bits, 0x20));
  f.Write(pixels);
}

void TgaTrailingPalette(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  // A 12-byte head, the indices, then 256 red-green-blue colours.
  const std::vector<uint8_t> rgb = ReadStored(f, uint64_t{e.PackedSize} + 12, 768);
  f.Write(TgaColourMappedStart(e.Extra, 8, rgb, 256));
  CopyStored(f, e.Offset, e.PackedSize);
}

void TgaFromOwnPalette16(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  // Indices, 8 spare bytes, then 256 colours of 16 bits.
  if (e.PackedSize < 520) throw BadData("no palette behind the picture");
  const uint64_t count = PixelCount(e.Extra);
  if (count > e.PackedSize - 520) throw BadData("fewer indices than pixels");
  const std::vector<uint8_t> palette = ReadStored(f, uint64_t{e.Offset} + e.PackedSize - 512, 512);
  WriteIndexed(f, TgaHeader(e.Extra, 16, 0x20), e.Offset, count, palette, 2, 2);
}

}  // namespace cairn
