// Field-offset table directories: a count in the header (16 or 32 bits) and a
// counted array of equal-sized records in which the name, the data offset,
// the unpacked size and the packed size each sit at a fixed place of their
// own. Serves "LOD" (10), "CSid" (11), "xcr File 1.00" (73), the 27-byte
// records with a 16-bit count (87), the "BIGF" directory with offsets
// relative to a header value (97), the 136-byte records (118) and the
// size-prefixed 52-byte names whose data follows in directory order (122).
#include <array>
#include <cstdint>

#include "readers/readers.h"

namespace cairn {
namespace {

enum class AfterReading {
  Nothing,
  BackToBack,     // no offsets stored: the data follows the directory, each on a 4-byte grid
  AddHeaderBase,  // offsets count from the u32 at header position 8
};

struct FieldTableLayout {
  uint32_t countAt;
  bool shortCount;  // a 16-bit count
  uint32_t directory;
  FieldPositions fields;
  AfterReading after;
};

using enum AfterReading;

constexpr std::array<FieldTableLayout, 7> kFieldTableLayouts = {{
    {8, false, 92, {0, 16, 16, 20, 28, 32}, Nothing},        // 0: 10
    {0, true, 2, {10, 13, 23, 2, 2, 27}, Nothing},           // 1: 87
    {4, true, 6, {1, 12, 17, 13, 13, 21}, Nothing},          // 2: 11
    {0, false, 4, {0, 38, 128, 132, 132, 136}, Nothing},     // 3: 118
    {4, false, 8, {4, 52, 0, 0, 0, 56}, BackToBack},         // 4: 122
    {4, false, 36, {0, 16, 20, 16, 16, 24}, AddHeaderBase},  // 5: 97
    {20, false, 28, {0, 256, 512, 516, 516, 532}, Nothing},  // 6: 73
}};

constexpr bool FieldsFitTheirRecords() {
  for (const FieldTableLayout& r : kFieldTableLayouts)
    if (!r.fields.fitsRecord()) return false;
  return true;
}
static_assert(FieldsFitTheirRecords(), "every field lies inside its record");

}  // namespace

void ReadFieldDirectory(ReaderContext& c, uint64_t offset, uint32_t count,
                        const FieldPositions& fields) {
  if (count == 0) return;
  const uint64_t stride = fields.recordSize;
  const std::vector<uint8_t> directory = ReadBlock(c, offset, stride * count);
  c.entries.reserve(c.entries.size() + count);
  for (uint32_t i = 0; i < count; ++i) {
    const ByteView record = ByteView(directory).sub(stride * i, stride);
    AddEntry(c, record.field(fields.namePosition, fields.nameWidth),
             record.u32le(fields.offsetPosition), record.u32le(fields.unpackedPosition),
             record.u32le(fields.packedPosition));
  }
}

void FieldTableReader(ReaderContext& c, unsigned row) {
  const FieldTableLayout& r = kFieldTableLayouts.at(row);
  const uint32_t count = r.shortCount ? c.header.u16le(r.countAt) : c.header.u32le(r.countAt);
  const uint64_t directorySize = uint64_t{r.fields.recordSize} * count;
  ReadFieldDirectory(c, r.directory, count, r.fields);

  switch (r.after) {
    case Nothing:
      break;
    case BackToBack: {
      // The data follows the 8-byte header and the directory; each entry
      // starts on a multiple of 4 bytes after the one before.
      uint64_t position = directorySize + 8;
      for (ArchiveEntry& e : c.entries) {
        e.Offset = DerivedOffset(position);
        position += (uint64_t{e.PackedSize} + 3) / 4 * 4;
      }
      break;
    }
    case AddHeaderBase: {
      const uint32_t base = c.header.u32le(8);
      for (ArchiveEntry& e : c.entries) e.Offset = DerivedOffset(uint64_t{e.Offset} + base);
      break;
    }
  }
}

}  // namespace cairn
