// Files walked from their start rather than through a directory.
//
// - "PALETTEFILES " archive (FormatId 49): sections one after another, each
//   a text header (a section name, a space, a decimal item count and a zero
//   byte) and its items, each a zero-terminated name. In the sections whose
//   name begins with "MATERIALS", "COLORS" or "SOUNDS" an item is the name
//   alone, listed with size 0; elsewhere the name is followed by a size and
//   that many bytes of data. Entries are named section\item.
// - "TEX" texture lists (71, 72): with the byte at 11 0x80 a count at 12 and
//   texture records from 24, otherwise one record at 8. A record is a
//   16-byte header (kind, width at 8, height at 12), then the 32-bit pixels:
//   kind 0x08000000 is an empty texture of 16 bytes; the byte at 2 sizes an
//   extension of the header, and a first byte of 0x26 puts 5464 more bytes
//   after the pixels and the 8 that always follow them. Every texture is
//   offered as a TGA picture named after the archive file and its index.
#include <algorithm>
#include <array>
#include <string>
#include <string_view>
#include <vector>

#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

// A section header ends within this many bytes (fewer at the end of the file).
constexpr uint32_t kSectionHeaderWindow = 100;
constexpr std::array<std::string_view, 3> kNameOnlySections = {"MATERIALS", "COLORS", "SOUNDS"};

// Up to `length` bytes at `at`, fewer near the end of the file.
std::vector<uint8_t> ReadWindow(const ReaderContext& c, uint64_t at, uint64_t length) {
  return ReadBlock(c, at, std::min<uint64_t>(length, c.fileSize - at));
}

// The decimal count after the blanks at the start of `text`, read up to the
// first character that is not a digit; a negative count is no items.
uint64_t SectionCount(std::string_view text) {
  size_t i = text.find_first_not_of(" \t\n\v\f\r");
  if (i == std::string_view::npos) return 0;
  if (text[i] == '-') return 0;
  if (text[i] == '+') ++i;
  uint64_t n = 0;
  for (; i < text.size() && text[i] >= '0' && text[i] <= '9'; ++i)
    n = std::min<uint64_t>(n * 10 + (text[i] - '0'), UINT32_MAX);
  return n;
}

constexpr uint32_t kTexHeader = 16;
constexpr uint32_t kEmptyTexture = 0x08000000;
constexpr uint32_t kTrailerBytes = 5464;

}  // namespace

void PaletteFilesReader(ReaderContext& c, unsigned) {
  uint64_t at = 0;
  while (at < c.fileSize) {
    const std::vector<uint8_t> window = ReadWindow(c, at, kSectionHeaderWindow);
    const std::string_view header = ByteView(window).cstr(0, window.size());
    const size_t space = header.find(' ');
    if (space == std::string_view::npos) throw BadData("section header without a count");
    const std::string section(header.substr(0, space));
    uint64_t count = SectionCount(header.substr(space + 1));
    at += header.size() + 1;
    bool nameOnly = false;
    for (std::string_view prefix : kNameOnlySections) nameOnly |= section.starts_with(prefix);
    for (; count > 0; --count) {
      if (at >= c.fileSize) throw BadData("items past the end");
      const std::vector<uint8_t> item = ReadWindow(c, at, kMaxNameLength + 1);
      const std::string_view name = ByteView(item).cstr(0, kMaxNameLength + 1);
      at += name.size() + 1;
      const std::string full = section + '\\' + std::string(name);
      if (nameOnly) {
        AddEntry(c, full, DerivedOffset(at), 0, 0);
        continue;
      }
      const uint32_t size = ByteView(ReadBlock(c, at, 4)).u32le(0);
      AddEntry(c, full, DerivedOffset(at + 4), size, size);
      at += 4 + uint64_t{size};
    }
  }
}

void TextureListReader(ReaderContext& c, unsigned) {
  const bool counted = c.header.u8(11) == 0x80;
  const uint32_t count = counted ? c.header.u32le(12) : 1;
  uint64_t at = counted ? 24 : 8;
  // Each record needs its header in the file, so the count cannot run away.
  for (uint32_t i = 0; i < count; ++i) {
    const std::vector<uint8_t> bytes = ReadBlock(c, at, kTexHeader);
    const ByteView head(bytes);
    const std::string name = NumberedName(c.archiveFileName, i) + ".tga";
    if (head.u32le(0) == kEmptyTexture) {
      AddEntry(c, name, DerivedOffset(at + 8), 0, 0);
      at += kTexHeader;
      continue;
    }
    const uint32_t extension = head.u8(2) == 8 ? 4 : (head.u8(2) + 2u) & ~3u;
    const uint32_t width = head.u32le(8), height = head.u32le(12);
    // A TGA header holds 16-bit sides, and the file 32-bit sizes.
    const uint64_t pixels = uint64_t{width} * height * 4;
    if (width > 0xFFFF || height > 0xFFFF || pixels + 18 > UINT32_MAX)
      throw BadData("texture too large");
    const uint32_t offset = DerivedOffset(at + kTexHeader + extension);
    const uint32_t size = static_cast<uint32_t>(pixels);
    AddEntry(c, name, offset, size + 18, size, 0x20, width | height << 16);
    at = uint64_t{offset} + size + 8 + (head.u8(0) == 0x26 ? kTrailerBytes : 0);
  }
}

}  // namespace cairn
