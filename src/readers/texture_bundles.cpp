// Game textures listed as DDS files, and one packed texture.
//
// The sectioned bundles keep their tables in a chain of sections: each opens
// with its byte size S (counted from the size field) and the next one begins
// S + 8 bytes after it.
//   three-section bundle (123)  the chain starts at 168 + the u32 at 160:
//       placement records (20 bytes from 8: data offset, size), texture
//       records (124 bytes from 16) and format records (32 bytes from 24).
//       As many textures as whole placement records fit the first section.
//   bundles with a leading block (124, 157)  the block is as long as the u32
//       at 12; the chain starts at 168 + the block + the u32 at 160 of the
//       block: texture records, format records, and a third section whose
//       end + 260 is the origin of the data offsets. As many textures as
//       whole texture records fit the first section.
// A texture record: name[24], data offset at 36, stored size at 44, the
// picture's geometry at 56 (kept as Extra), the mipmap count at 66. A format
// record opens with the pixel-format code. Record i of each table describes
// texture i.
//
// The packed texture (120): the u32 at 0 is the inflated size of the zlib
// stream that runs from 4 to the end, a 512 x 256 picture of 24 bits.
#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "media/conversion.h"
#include "media/media.h"
#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

struct BundleLayout {
  bool placements;      // offsets and sizes in a section of their own
  bool paletteInFront;  // a palette texture's 1024-byte palette lies before its offset
};

constexpr std::array<BundleLayout, 3> kBundleLayouts = {{
    {true, false},   // 0: 123
    {false, true},   // 1: 124
    {false, false},  // 2: 157
}};

// The pixel-format codes and the method bits they give the entry's Flag.
struct PixelFormat {
  uint32_t code;
  uint8_t bits;
};
constexpr uint32_t Tag(const char (&t)[5]) {
  return uint32_t(uint8_t(t[0])) | uint32_t(uint8_t(t[1])) << 8 | uint32_t(uint8_t(t[2])) << 16 |
         uint32_t(uint8_t(t[3])) << 24;
}
constexpr uint32_t kPaletteCode = 41;
constexpr std::array<PixelFormat, 5> kPixelFormats = {
    {{Tag("DXT1"), 3}, {Tag("DXT3"), 4}, {Tag("DXT5"), 5}, {21, 2}, {kPaletteCode, 1}}};

constexpr uint32_t kPaletteBytes = 1024;
constexpr uint32_t kPaletteExtra = 1088;  // listed beside a palette texture's size

uint8_t FormatBits(uint32_t code) {
  for (const PixelFormat& p : kPixelFormats)
    if (p.code == code) return p.bits;
  return 0;
}

uint32_t WordAt(const ReaderContext& c, uint64_t at) {
  return ByteView(ReadBlock(c, at, 4)).u32le(0);
}

uint32_t Fit32(uint64_t v) {
  if (v > UINT32_MAX) throw BadData("texture past 4 GiB");
  return static_cast<uint32_t>(v);
}

}  // namespace

void TextureBundleReader(ReaderContext& c, unsigned row) {
  const BundleLayout& l = kBundleLayouts.at(row);
  const uint64_t lead = l.placements ? 0 : WordAt(c, 12);
  std::array<uint64_t, 3> at{};
  std::array<uint32_t, 3> size{};
  at[0] = lead + WordAt(c, lead + 160) + 168;
  for (size_t i = 0; i < 3; ++i) {
    if (i > 0) at[i] = at[i - 1] + size[i - 1] + 8;
    size[i] = WordAt(c, at[i]);
  }
  const uint64_t base = at[2] + size[2] + 260;
  // The third section of the bundles with a leading block is not needed.
  std::array<std::vector<uint8_t>, 3> sections;
  for (size_t i = 0; i < (l.placements ? 3 : 2); ++i) sections[i] = ReadBlock(c, at[i], size[i]);
  const ByteView placements(sections[0]);
  const ByteView textures(sections[l.placements ? 1 : 0]);
  const ByteView formats(sections[l.placements ? 2 : 1]);
  const uint32_t count = l.placements ? size[0] / 20 : size[0] / 124;
  // Each record must lie inside its own section, as far as it is read.
  c.entries.reserve(count);
  for (uint32_t i = 0; i < count; ++i) {
    const ByteView t = textures.sub(16 + 124ull * i, 67);
    const uint32_t code = formats.u32le(24 + 32ull * i);
    const uint32_t stored = t.u32le(44);
    uint64_t offset = base + t.u32le(36), packed = stored;
    if (l.placements) {
      offset = placements.u32le(8 + 20ull * i);
      packed = placements.u32le(12 + 20ull * i);
    }
    uint64_t unpacked = uint64_t{stored} + kDdsHeaderSize;
    if (code == kPaletteCode) {
      unpacked += kPaletteExtra;
      if (l.paletteInFront) {
        if (offset < kPaletteBytes) throw BadData("palette before the start of the file");
        offset -= kPaletteBytes;
        packed += kPaletteBytes;
      }
    }
    // Only the low four bits of the mipmap count fit beside the method bits.
    const auto flag = static_cast<uint8_t>(t.u8(66) << 4 | FormatBits(code));
    AddEntry(c, NumberedName(t.field(0, 24), i) + ".dds", Fit32(offset), Fit32(unpacked),
             Fit32(packed), flag, t.u32le(56));
  }
}

void PackedTextureReader(ReaderContext& c, unsigned) {
  std::string_view base = StripExtension(c.archiveFileName);
  if (base.empty()) base = c.archiveFileName;
  const std::string name = std::string(base) + ".TEX24";
  const uint32_t packed = c.fileSize - 4;  // every archive holds its 104-byte header
  AddTgaEntry(c, name, 4, packed, 512, 256, 3, 2);
  AddEntry(c, name, 4, c.header.u32le(0), packed, 1);
}

}  // namespace cairn
