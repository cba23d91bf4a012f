// Single-entry wrapper files: one payload behind a short header of the game's
// own, listed as one entry named after the archive with the payload's usual
// extension. Serves the scrambled-ZIP wrappers "F5CD" and "IPF1" (32, 33),
// "H4CAMPAIGN" (43), the video and sound wrappers of signature rows 51 and 55,
// "CPAL savegame 3.3" (56), the XOR-scrambled sound file (101), the
// size-prefixed compressed file (147) and the wrapped IFF file (155).
#include <array>
#include <cstdint>
#include <string>
#include <string_view>

#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

struct SingleEntryLayout {
  std::string_view extension;  // appended to the archive's name without its extension
  uint32_t dataOffset;
  uint8_t flag;
  bool unpackedInHeader;  // the unpacked size is the u32 at header position `unpackedAt`;
  uint32_t unpackedAt;    // otherwise it is the packed size
};

constexpr std::array<SingleEntryLayout, 9> kSingleEntryLayouts = {{
    {".mp3", 0, 0x6B, false, 0},  // 0: 101, every byte XORed with the Flag
    {".zip", 0, 0, false, 0},     // 1: 32
    {".zip", 0, 0, false, 0},     // 2: 33
    {".gz", 15, 0, false, 0},     // 3: 43
    {".bik", 30, 0, false, 0},    // 4: 51
    {".mp3", 19, 0, false, 0},    // 5: 55
    {"", 24, 1, true, 20},        // 6: 56, a zlib stream
    {"", 4, 1, true, 0},          // 7: 147, a zlib stream
    {".iff", 0, 0, false, 0},     // 8: 155
}};

}  // namespace

void SingleEntryReader(ReaderContext& c, unsigned row) {
  const SingleEntryLayout& r = kSingleEntryLayouts.at(row);
  if (c.fileSize < r.dataOffset) throw BadData("file ends inside its header");
  // A file name without an extension is kept whole.
  std::string_view base = StripExtension(c.archiveFileName);
  if (base.empty()) base = c.archiveFileName;
  const uint32_t packed = c.fileSize - r.dataOffset;
  const uint32_t unpacked = r.unpackedInHeader ? c.header.u32le(r.unpackedAt) : packed;
  AddEntry(c, std::string(base) + std::string(r.extension), r.dataOffset, unpacked, packed, r.flag);
}

}  // namespace cairn
