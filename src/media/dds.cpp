// The DDS writers: a 128-byte DirectDraw Surface header in front of stored
// texture data. The header comes from one of three templates (8-bit palette
// indices, 32-bit RGBA, DXT block compression) chosen by the entry's Flag:
// "VTF" textures (79) carry the DXT digit or the pixel size themselves, the
// texture bundles (123, 124, 157) a compact code in the low four bits and the
// mipmap count in the high four. Bundle 123 may keep a texture "JDLZ"-coded;
// a coded palette texture ends with its palette, which DDS wants first.
#include <algorithm>
#include <array>

#include "codecs/codecs.h"
#include "core/stored.h"
#include "media/media.h"

namespace cairn {
namespace {

struct DdsTemplate {
  uint32_t formatFlags;
  uint32_t bitCount;
  std::array<uint32_t, 4> masks;  // red, green, blue, alpha
  uint32_t caps2;                 // also caps3, caps4 and the reserved word
};

constexpr DdsTemplate kPaletteTemplate = {0x20, 8, {0, 0, 0, 0}, 0};
constexpr DdsTemplate kRgbaTemplate = {
    0x41, 32, {0x00FF0000, 0x0000FF00, 0x000000FF, 0xFF000000}, 0x3B000000};
constexpr DdsTemplate kDxtTemplate = {0x04, 0, {0, 0, 0, 0}, 0};

// One coded byte yields at most 2049 decoded bytes (a two-byte match copies
// at most 4098).
constexpr uint64_t kJdlzMaxExpansion = 2049;

std::vector<uint8_t> FromTemplate(const DdsTemplate& t, uint32_t extra) {
  std::vector<uint8_t> h(kDdsHeaderSize, 0);
  h[0] = 'D';
  h[1] = 'D';
  h[2] = 'S';
  h[3] = ' ';
  PutU32le(h, 4, 124);
  PutU32le(h, 8, 0x000A1007);
  // The height is a signed 16-bit number.
  PutU32le(h, 12, static_cast<uint32_t>(static_cast<int32_t>(static_cast<int16_t>(extra >> 16))));
  PutU32le(h, 16, extra & 0xFFFF);
  PutU32le(h, 76, 32);
  PutU32le(h, 80, t.formatFlags);
  PutU32le(h, 88, t.bitCount);
  for (size_t i = 0; i < 4; ++i) PutU32le(h, 92 + 4 * i, t.masks[i]);
  PutU32le(h, 108, 0x00401008);
  for (size_t i = 0; i < 4; ++i) PutU32le(h, 112 + 4 * i, t.caps2);
  return h;
}

void SetDxt(std::vector<uint8_t>& h, uint8_t digit) {
  h[84] = 'D';
  h[85] = 'X';
  h[86] = 'T';
  h[87] = digit;
}

}  // namespace

std::vector<uint8_t> DdsHeader(FormatId format, uint8_t flag, uint32_t extra) {
  if (format == 79) {
    if (flag == '1' || flag == '3') {
      std::vector<uint8_t> h = FromTemplate(kDxtTemplate, extra);
      SetDxt(h, flag);
      return h;
    }
    if (flag == 6 || flag == 8) {
      std::vector<uint8_t> h = FromTemplate(kRgbaTemplate, extra);
      h[88] = static_cast<uint8_t>((flag >> 1) * 8);
      return h;
    }
    throw BadData("no pixel format for this texture");
  }
  std::vector<uint8_t> h;
  switch (flag & 0x0F) {
    case 1:
      h = FromTemplate(kPaletteTemplate, extra);
      break;
    case 2:
      h = FromTemplate(kRgbaTemplate, extra);
      break;
    case 3:
    case 4:
    case 5:
      h = FromTemplate(kDxtTemplate, extra);
      SetDxt(h, "135"[(flag & 0x0F) - 3]);
      break;
    default:
      throw BadData("no pixel format for this texture");
  }
  h[28] = static_cast<uint8_t>(flag >> 4);  // mipmap count
  return h;
}

void DdsStored(ExtractionFrame& f) {
  f.Write(DdsHeader(f.session.format, f.entry.Flag, f.entry.Extra));
  CopyStored(f, f.entry.Offset, f.entry.PackedSize);
}

void DdsMaybeCoded(ExtractionFrame& f) {
  const ArchiveEntry& e = f.entry;
  const std::vector<uint8_t> header = DdsHeader(f.session.format, e.Flag, e.Extra);
  // A coded texture: "JDLZ", 4 bytes, the decoded size, the block size
  // (these 16 bytes included), then the coded bytes.
  std::vector<uint8_t> head;
  if (e.PackedSize >= 16) head = ReadStored(f, e.Offset, 16);
  if (!ByteView(head).matches(0, "JDLZ")) {
    f.Write(header);
    return CopyStored(f, e.Offset, e.PackedSize);
  }
  const uint32_t decodedSize = ByteView(head).u32le(8);
  const uint32_t blockSize = ByteView(head).u32le(12);
  if (blockSize < 16) throw BadData("coded block shorter than its header");
  if (decodedSize > (blockSize - 16) * kJdlzMaxExpansion)
    throw BadData("decoded size beyond what the coded bytes can give");
  const std::vector<uint8_t> coded = ReadStored(f, uint64_t{e.Offset} + 16, blockSize - 16);
  std::vector<uint8_t> texture = JdlzDecode(coded, decodedSize);
  texture.resize(decodedSize);  // what the coded bytes cannot reach is zero
  if ((e.Flag & 0x0F) == 1) {
    if (texture.size() < 1024) throw BadData("no palette behind the pixels");
    std::rotate(texture.begin(), texture.end() - 1024, texture.end());
  }
  f.Write(header);
  f.Write(texture);
}

}  // namespace cairn
