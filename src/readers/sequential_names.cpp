// Directories walked record by record, each record as long as its name makes
// it, or chains of items that each tell the way to the next. Everything is
// stored as it is, but for the 16-byte-header chain, whose items are zlib
// streams.
//
// - 23-byte-header file chain (FormatId 77): from 1344, a header of name[12],
//   7 spare bytes and the size, then the data and one spare byte, up to 23
//   bytes before the end of the file.
// - Zero-terminated-name directory (96): the directory's size at 0, then
//   records from 4: a zero-terminated name, the offset and the size.
// - Name table at file start (103): 20-byte records from 0, name[12], offset
//   and size; the first entry's offset is where the records end, and the
//   first record with an empty name ends the list.
// - Inline name directory (107): records from 0 of a zero-terminated name, 16
//   spare bytes and the size; a record with an empty name ends the list and
//   the data follows it back to back, 21 bytes after its start. Each record
//   is read in a window of 260 bytes, so at least 260 bytes of file follow
//   each record's start.
// - Unnamed 20-byte record list (113): records from 4 of 12 spare bytes,
//   offset and size; a size of 0 ends the list. Entries are numbered.
// - Unnamed 16-byte-header chain (117): a count at 12 and items from 20, each
//   a 16-byte header (packed size at 6, unaligned, unpacked size at 12) and
//   the zlib stream. Entries are numbered.
// - Space-terminated-name directory (119): the 256-byte description block at
//   0 is listed as "_description_"; 80-byte records from 296 hold the name up
//   to its first space (at most 79 bytes, reaching over the numbers), offset
//   at 64 and size at 68; 0x40000000 at 72 marks the last record.
// - Length-prefixed-name directory (144): the directory's size at 0, records
//   from 4 of 4 spare bytes, offset, size, 4 spare bytes, name length and
//   the name. Offsets count from the end of the directory.
// - Big-endian directory ("BIG4", 16, and "BIGF", 132): a big-endian count at
//   8 and the end of the directory at 12; records from 16 of a big-endian
//   offset and size and a zero-terminated name. Empty names are numbered.

#include <algorithm>
#include <array>
#include <string>
#include <vector>

#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

constexpr uint32_t kNameRoom = kMaxNameLength + 1;  // a name and its terminator

void AddNumbered(ReaderContext& c, uint32_t offset, uint32_t unpacked, uint32_t packed) {
  AddEntry(c, NumberedName(c.archiveFileName, static_cast<uint32_t>(c.entries.size())), offset,
           unpacked, packed);
}

void ReadFileChain(ReaderContext& c) {
  for (uint64_t at = 1344; at + 23 < c.fileSize;) {
    const std::vector<uint8_t> block = ReadBlock(c, at, 23);
    const ByteView h(block);
    const uint32_t size = h.u32le(19);
    AddEntry(c, h.field(0, 12), DerivedOffset(at + 23), size, size);
    at += 23 + uint64_t{size} + 1;
  }
}

// Every record must end inside the directory: nothing after it was read.
void ReadZeroNames(ReaderContext& c) {
  const std::vector<uint8_t> block = ReadBlock(c, 4, c.header.u32le(0));
  const ByteView d(block);
  for (uint64_t j = 0; j < d.size();) {
    const std::string_view name = d.cstr(j, kNameRoom);
    const uint64_t at = j + name.size() + 1;
    AddEntry(c, name, d.u32le(at), d.u32le(at + 4), d.u32le(at + 4));
    j = at + 8;
  }
}

void ReadNameTable(ReaderContext& c) {
  ReadRecordDirectory(c, 0, c.header.u32le(12) / 20, {12, 4, 4, false});
  const auto empty = std::find_if(c.entries.begin(), c.entries.end(),
                                  [](const ArchiveEntry& e) { return e.Name.empty(); });
  c.entries.erase(empty, c.entries.end());
}

void ReadInlineNames(ReaderContext& c) {
  uint64_t p = 0;
  for (;;) {
    // The window is 260 bytes; a long name's size field lies beyond it, in
    // the 20 bytes that follow when the file holds them.
    if (p > c.fileSize || c.fileSize - p < 260) throw BadData("record window past the end");
    const std::vector<uint8_t> block = ReadBlock(c, p, std::min<uint64_t>(280, c.fileSize - p));
    const ByteView r(block);
    const std::string_view name = r.cstr(0, kNameRoom);
    if (name.empty()) break;
    const uint32_t size = r.u32le(name.size() + 17);
    AddEntry(c, name, 0, size, size);
    p += name.size() + 21;
  }
  uint64_t at = p + 21;
  for (ArchiveEntry& e : c.entries) {
    e.Offset = DerivedOffset(at);
    at += e.PackedSize;
  }
}

void ReadUnnamedRecords(ReaderContext& c) {
  for (uint64_t at = 4;; at += 20) {
    const std::vector<uint8_t> block = ReadBlock(c, at, 20);
    const ByteView r(block);
    const uint32_t size = r.u32le(16);
    if (size == 0) break;
    AddNumbered(c, r.u32le(12), size, size);
  }
}

void ReadHeaderChain(ReaderContext& c) {
  const uint32_t count = c.header.u32le(12);
  NeedRoomFor(count, c.fileSize - 20, 16);
  c.entries.reserve(count);
  uint64_t at = 20;
  for (uint32_t i = 0; i < count; ++i) {
    const std::vector<uint8_t> block = ReadBlock(c, at, 16);
    const ByteView h(block);
    const uint32_t packed = h.u32le(6);
    AddNumbered(c, DerivedOffset(at + 16), h.u32le(12), packed);
    at += 16 + uint64_t{packed};
  }
}

void ReadSpaceNames(ReaderContext& c) {
  AddEntry(c, "_description_", 0, 256, 256);
  for (uint64_t at = 296;; at += 80) {
    const std::vector<uint8_t> block = ReadBlock(c, at, 80);
    const ByteView r(block);
    // A zero byte ends the name too: it cannot hold one.
    const std::string_view field = r.field(0, 79);
    const std::string_view name = field.substr(0, field.find(' '));
    AddEntry(c, name, r.u32le(64), r.u32le(68), r.u32le(68));
    if (r.u32le(72) == 0x40000000) break;
  }
}

void ReadCountedNames(ReaderContext& c) {
  const uint32_t size = c.header.u32le(0);
  const std::vector<uint8_t> block = ReadBlock(c, 4, size);
  const ByteView d(block);
  for (uint64_t j = 0; j < d.size();) {
    const uint32_t length = d.u32le(j + 16);
    if (length > kMaxNameLength) throw BadData("name too long");
    const uint32_t bytes = d.u32le(j + 8);
    AddEntry(c, d.field(j + 20, length), DerivedOffset(uint64_t{size} + 4 + d.u32le(j + 4)), bytes,
             bytes);
    j += 20 + uint64_t{length};
  }
}

void ReadBigEndian(ReaderContext& c) {
  const uint32_t count = c.header.u32be(8), end = c.header.u32be(12);
  if (end < 16) throw BadData("directory ends before it starts");
  const std::vector<uint8_t> block = ReadBlock(c, 16, end - 16);
  const ByteView d(block);
  NeedRoomFor(count, d.size(), 9);
  c.entries.reserve(count);
  uint64_t at = 0;
  for (uint32_t i = 0; i < count; ++i) {
    const uint32_t offset = d.u32be(at), size = d.u32be(at + 4);
    const std::string_view name = d.cstr(at + 8, kNameRoom);
    if (name.empty())
      AddNumbered(c, offset, size, size);
    else
      AddEntry(c, name, offset, size, size);
    at += 9 + name.size();
  }
}

// Rows in the order of the registry's `row` column.
constexpr std::array<void (*)(ReaderContext&), 9> kSequentialNameReaders = {
    ReadFileChain,   ReadZeroNames,  ReadNameTable,    ReadInlineNames, ReadUnnamedRecords,
    ReadHeaderChain, ReadSpaceNames, ReadCountedNames, ReadBigEndian,
};

}  // namespace

void SequentialNameReader(ReaderContext& c, unsigned row) {
  kSequentialNameReaders.at(row)(c);
}

}  // namespace cairn
