// Directories whose records carry each entry's name together with its offset
// and size. All entries are stored as they are.
//
// Counted arrays of equal records, each a fixed-width name field, an offset
// and a size (NamedRecordReader, one row per shape; the first two are the
// fixed-record reader given their layouts):
//   "MHX XS V1.0"  64-byte records from file offset 64; the header word at 48
//                  is the end of the directory region, 448 bytes past the
//                  end of the records: name[48], offset, size, 8 spare bytes.
//   "MageGold"     directory offset and byte size in the header at 40 and 44;
//                  64-byte records: name[56], offset, size.
//   "PFF2"/"PFF3"  count, record size and directory offset in the header at
//                  8, 12 and 16; records: 4 spare bytes, offset, size, 4
//                  spare bytes, then the name filling the rest of the record.
//
// Records of varying length, walked one after another:
//   "DIR"       the directory runs from 4104 past the header word at 8 up to
//               the header word at 4; records: offset, size, a zero-ended
//               name padded with zeros to a multiple of 4 (at least one
//               zero), 4 spare bytes.
//   "FAR!byAZ"  the directory runs from the header word at 12 to the end of
//               the file: a count, then records of size, 4 spare bytes,
//               offset, name length and the name.
//   "DFP1"      the directory runs from the header word at 4 up to the word
//               at 25; the header word at 8 counts its records: a zero-ended
//               name, then size and offset.
//   "CMPR"      the directory ends 4 bytes past the header word at 4; the
//               word stored there, plus 8, is where it starts; records: size,
//               offset less 8, name length and the name padded to 4.
//   "PVOL"      a block at the header word at 4: a tag, the length of a list
//               of zero-ended names, the names (padded to an even file
//               position), a tag, the length of a list of 17-byte records
//               (8 spare bytes, offset less 8, size, 1 spare byte). The n-th
//               name goes with the n-th record.
#include <array>
#include <cstdint>
#include <string_view>
#include <vector>

#include "readers/readers.h"

namespace cairn {
namespace {

// The 32-bit word stored in the archive at `position`.
uint32_t WordAt(const ReaderContext& c, uint64_t position) {
  return ByteView(ReadBlock(c, position, 4)).u32le(0);
}

// A directory stated by position and byte size must lie in the file as a
// whole, a trailing partial record included, although only whole records are
// listed.
void NeedDirectoryInFile(const ReaderContext& c, uint64_t position, uint64_t size) {
  if (position + size > c.fileSize) throw BadData("directory past the end");
}

}  // namespace

void NamedRecordReader(ReaderContext& c, unsigned row) {
  switch (row) {
    case 0: {  // "MHX XS V1.0": the directory region ends 448 bytes past the records
      const uint32_t size = c.header.u32le(48) - 448;
      NeedDirectoryInFile(c, 64, size);
      ReadRecordDirectory(c, 64, size / 64, {48, 4, 12, false});
      return;
    }
    case 1: {  // "MageGold"
      const uint32_t position = c.header.u32le(40), size = c.header.u32le(44);
      NeedDirectoryInFile(c, position, size);
      ReadRecordDirectory(c, position, size / 64, {56, 4, 4, false});
      return;
    }
    default: {  // "PFF2", "PFF3": the name fills the record after its four words
      const uint32_t count = c.header.u32le(8);
      const uint32_t stride = c.header.u32le(12);
      if (stride < 16) throw BadData("record too short for a name");
      const std::vector<uint8_t> block = ReadBlock(c, c.header.u32le(16), uint64_t{count} * stride);
      const ByteView dir(block);
      c.entries.reserve(count);
      for (uint64_t i = 0; i < count; ++i) {
        const ByteView record = dir.sub(i * stride, stride);
        const uint32_t size = record.u32le(8);
        AddEntry(c, record.field(16, stride - 16), record.u32le(4), size, size);
      }
    }
  }
}

void DirReader(ReaderContext& c, unsigned) {
  const uint32_t end = c.header.u32le(4);
  const uint32_t start = c.header.u32le(8) + 4104;
  // An end before the start wraps to a size no file holds.
  const std::vector<uint8_t> block = ReadBlock(c, start, static_cast<uint32_t>(end - start));
  const ByteView dir(block);
  // Records are at least 16 bytes long, so the walk ends within the block.
  for (uint64_t at = 0; at < dir.size();) {
    const uint32_t offset = dir.u32le(at);
    const uint32_t size = dir.u32le(at + 4);
    // The padded name field and the 4 bytes after it fit 260 bytes: the name
    // ends within 256.
    const std::string_view name = dir.cstr(at + 8, 256);
    const uint64_t field = (name.size() + 4) & ~uint64_t{3};
    AddEntry(c, name, offset, size, size);
    at += 8 + field + 4;
  }
}

void FarReader(ReaderContext& c, unsigned) {
  const uint32_t start = c.header.u32le(12);
  if (start > c.fileSize) throw BadData("directory past the end");
  const std::vector<uint8_t> block = ReadBlock(c, start, c.fileSize - start);
  const ByteView dir(block);
  const uint32_t count = dir.u32le(0);
  if (count > (dir.size() - 4) / 16) throw BadData("more records than the directory holds");
  c.entries.reserve(count);
  uint64_t at = 4;
  for (uint32_t i = 0; i < count; ++i) {
    const uint32_t size = dir.u32le(at);
    const uint32_t offset = dir.u32le(at + 8);
    const uint32_t length = dir.u32le(at + 12);
    if (length > kMaxNameLength) throw BadData("name too long");
    AddEntry(c, dir.field(at + 16, length), offset, size, size);
    at += 16 + uint64_t{length};
  }
}

void Dfp1Reader(ReaderContext& c, unsigned) {
  const uint32_t start = c.header.u32le(4);
  const uint32_t count = c.header.u32le(8);
  const uint32_t end = c.header.u32le(25);
  const std::vector<uint8_t> block = ReadBlock(c, start, static_cast<uint32_t>(end - start));
  const ByteView dir(block);
  // A record is at least a terminator and two words.
  if (count > dir.size() / 9) throw BadData("more records than the directory holds");
  c.entries.reserve(count);
  uint64_t at = 0;
  for (uint32_t i = 0; i < count; ++i) {
    const std::string_view name = dir.cstr(at, kMaxNameLength + 1);
    at += name.size() + 1;
    const uint32_t size = dir.u32le(at);
    AddEntry(c, name, dir.u32le(at + 4), size, size);
    at += 8;
  }
}

void CmprReader(ReaderContext& c, unsigned) {
  const uint32_t end = c.header.u32le(4) + 4;
  const uint32_t start = WordAt(c, end) + 8;
  const std::vector<uint8_t> block = ReadBlock(c, start, static_cast<uint32_t>(end - start));
  const ByteView dir(block);
  for (uint64_t at = 0; at < dir.size();) {
    const uint32_t size = dir.u32le(at);
    const uint32_t offset = dir.u32le(at + 4) + 8;
    const uint32_t length = dir.u32le(at + 8);
    if (length > kMaxNameLength) throw BadData("name too long");
    AddEntry(c, dir.field(at + 12, length), offset, size, size);
    at += 12 + ((uint64_t{length} + 3) & ~uint64_t{3});
  }
}

void PvolReader(ReaderContext& c, unsigned) {
  const uint64_t start = c.header.u32le(4);
  const uint32_t namesLength = WordAt(c, start + 4);
  // The record list begins on an even file position.
  const uint64_t padded = namesLength + uint64_t{(start + namesLength) & 1};
  const uint32_t recordsLength = WordAt(c, start + padded + 12);
  const std::vector<uint8_t> block = ReadBlock(c, start, padded + recordsLength + 16);
  const ByteView all(block);
  const ByteView names = all.sub(8, namesLength);
  const ByteView records = all.sub(padded + 16, recordsLength);
  const uint64_t count = recordsLength / 17;
  c.entries.reserve(static_cast<size_t>(count));
  uint64_t nameAt = 0;
  for (uint64_t i = 0; i < count; ++i) {
    // Each record takes the next name of the list; the list must not run out.
    const std::string_view name = names.cstr(nameAt, kMaxNameLength + 1);
    nameAt += name.size() + 1;
    const ByteView record = records.sub(i * 17, 17);
    const uint32_t size = record.u32le(12);
    AddEntry(c, name, record.u32le(8) + 8, size, size);
  }
}

}  // namespace cairn
