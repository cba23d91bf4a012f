// Fixed-record table directories: a count in the header and a counted array
// of equal-sized records at a known place, each a fixed-width name, a data
// offset and a size (in that order, or offset and size before the name).
// Serves the "IWAD"/"PWAD" lump archives (6, 34), "GLB2.0" (15), "FASTF101"
// (17), "SBF0" (22), "DorbaMistfel" (24), the directory of signature row 42,
// and the name directories 85, 86, 89, 105 and 114. Some of them store no
// sizes or no offsets; those are derived after reading.
#include <array>
#include <cstdint>
#include <string>

#include "readers/readers.h"

namespace cairn {
namespace {

// What a layout does with the entries once the records are read.
enum class AfterReading {
  Nothing,
  SizesToNext,     // no sizes stored: each entry runs to the next one
  BackToBack,      // no offsets stored: the data follows the directory back to back
  DottedNames,     // zero bytes inside a name stand for dots
  ExchangeFields,  // the size is stored first and the offset is 2 short
  AlignedOffsets,  // offsets derived on a 2048- or 64-byte grid
};

struct RecordTableLayout {
  uint32_t countAt;        // header position of the entry count
  bool shortCount;         // only the low 16 bits of the u32 there count
  uint32_t directory;      // file offset of the first record...
  bool directoryInHeader;  // ...or the header position of a u32 that holds it
  uint32_t recordSize;
  RecordFields fields;
  AfterReading after;
};

using enum AfterReading;

constexpr std::array<RecordTableLayout, 11> kRecordTableLayouts = {{
    {8, false, 16, false, 28, {20, 4, 4, true}, Nothing},            // 0: 15
    {24, false, 28, false, 24, {12, 4, 8, false}, Nothing},          // 1: 17
    {0, false, 4, false, 88, {80, 4, 4, false}, Nothing},            // 2: 89
    {0, false, 4, false, 92, {80, 4, 8, false}, Nothing},            // 3: 114
    {0, false, 4, false, 48, {40, 4, 4, false}, DottedNames},        // 4: 85
    {0, false, 4, false, 44, {40, 4, 0, false}, SizesToNext},        // 5: 86
    {4, false, 8, true, 16, {8, 4, 4, true}, Nothing},               // 6: 6, 34
    {20, false, 16, true, 32, {16, 16, 0, false}, SizesToNext},      // 7: 22
    {12, false, 16, false, 16, {12, 0, 4, false}, BackToBack},       // 8: 24
    {0, true, 2, false, 22, {14, 4, 4, false}, ExchangeFields},      // 9: 105
    {8, false, 2048, false, 32, {23, 5, 4, false}, AlignedOffsets},  // 10: 42
}};

constexpr bool RecordSizesAgree() {
  for (const RecordTableLayout& r : kRecordTableLayouts)
    if (r.fields.recordSize() != r.recordSize) return false;
  return true;
}
static_assert(RecordSizesAgree(), "a record is its name and its two steps");

uint64_t RoundUp(uint64_t v, uint64_t unit) {
  return (v + unit - 1) / unit * unit;
}

// The name is stored as base name, zero bytes and extension; each zero byte
// between them stands for a dot. Zero bytes after the extension stay
// terminators, and the first byte is never changed.
std::string DottedName(ByteView field) {
  std::string bytes(reinterpret_cast<const char*>(field.data()), field.size());
  bool seen = false;
  for (size_t i = bytes.size(); i-- > 1;) {
    if (bytes[i] != 0)
      seen = true;
    else if (seen)
      bytes[i] = '.';
  }
  return bytes.substr(0, bytes.find('\0'));
}

}  // namespace

void ParseRecordDirectory(ReaderContext& c, ByteView directory, uint32_t count,
                          const RecordFields& fields) {
  const uint64_t stride = fields.recordSize();
  directory.need(0, stride * count);
  const uint32_t offsetAt = fields.offsetFirst ? 0 : fields.nameWidth;
  const uint32_t sizeAt = offsetAt + fields.firstStep;
  const uint32_t nameAt = fields.offsetFirst ? fields.firstStep + fields.secondStep : 0;
  c.entries.reserve(c.entries.size() + count);
  for (uint32_t i = 0; i < count; ++i) {
    const ByteView record = directory.sub(stride * i, stride);
    const uint32_t size = fields.secondStep != 0 ? record.u32le(sizeAt) : 0;
    AddEntry(c, record.field(nameAt, fields.nameWidth), record.u32le(offsetAt), size, size);
  }
}

std::vector<uint8_t> ReadRecordDirectory(ReaderContext& c, uint64_t offset, uint32_t count,
                                         const RecordFields& fields) {
  if (count == 0) return {};
  std::vector<uint8_t> directory = ReadBlock(c, offset, fields.recordSize() * count);
  ParseRecordDirectory(c, ByteView(directory), count, fields);
  return directory;
}

void RecordTableReader(ReaderContext& c, unsigned row) {
  const RecordTableLayout& r = kRecordTableLayouts.at(row);
  uint32_t count = c.header.u32le(r.countAt);
  if (r.shortCount) count &= 0xFFFF;
  const uint32_t directory = r.directoryInHeader ? c.header.u32le(r.directory) : r.directory;
  const uint64_t directorySize = uint64_t{r.recordSize} * count;
  const std::vector<uint8_t> records = ReadRecordDirectory(c, directory, count, r.fields);

  switch (r.after) {
    case Nothing:
      break;
    case SizesToNext:
      SizesFromOffsets(c, 0);
      break;
    case BackToBack: {
      // The data follows the 16-byte header and the directory.
      uint64_t position = directorySize + 16;
      for (ArchiveEntry& e : c.entries) {
        e.Offset = DerivedOffset(position);
        position += e.PackedSize;
      }
      break;
    }
    case DottedNames:
      for (uint32_t i = 0; i < count; ++i)
        c.entries[i].Name =
            DottedName(ByteView(records).sub(uint64_t{r.recordSize} * i, r.fields.nameWidth));
      break;
    case ExchangeFields:
      for (ArchiveEntry& e : c.entries) {
        const uint32_t size = e.Offset;
        e.Offset = DerivedOffset(uint64_t{e.PackedSize} + 2);
        e.UnpackedSize = e.PackedSize = size;
      }
      break;
    case AlignedOffsets: {
      // The stored offset fields are not offsets: the low byte of the first
      // one picks the grid the data lies on. The first entry starts on the
      // first 2048-byte boundary after the directory.
      if (count == 0) break;
      const uint64_t unit = ByteView(records).u8(r.fields.nameWidth) != 0 ? 64 : 2048;
      uint64_t position = RoundUp(directorySize, 2048) + 2048;
      for (ArchiveEntry& e : c.entries) {
        e.Offset = DerivedOffset(position);
        position += RoundUp(e.PackedSize, unit);
      }
      break;
    }
  }
}

}  // namespace cairn
