// Offset tables and directories kept beside the archive. All are stored as
// they are.
//
//   90   records from 0, each a data offset and a zero-terminated name; the
//        first offset D is also where the records end, 4 bytes after the
//        last name. Each entry runs to the next one's offset, the last to the
//        end of the file.
//   98   the directory is the companion ".dir" file: 32-byte records of
//        offset, size and a 24-byte name, offset and size counted in
//        2048-byte sectors.
//   110  a count and a table of offsets, each to a 40-byte head: size at 4,
//        a 16-byte name at 8; the data follows the head.
//   130  a count at 8 and 16-byte records from 24: offset at 4, size at 8;
//        entries are named after the archive and their index.
//   133  records from 80: a zero-terminated name, the size and an offset
//        counted from one byte after the last record. The record whose data
//        reaches the end of the file is the last.
//   148  a count, 24-byte records (offset at 0, size at 4, name position at
//        20), the size of the name block and the block itself.
//   153  records from 0 as in 90 within the first D bytes; each size is the
//        next record's offset less the entry's own, and the list ends at the
//        first record with an empty name.
#include <cstdint>
#include <string>
#include <vector>

#include "readers/readers.h"
#include "util/names.h"

namespace cairn {

void OffsetNameReader(ReaderContext& c, unsigned /*row*/) {
  const uint32_t records = c.header.u32le(0);
  if (records < 4) throw BadData("records end before they start");
  const std::vector<uint8_t> bytes = ReadBlock(c, 0, records - 4);
  const ByteView directory(bytes);
  for (uint64_t at = 0; at < directory.size();) {
    const std::string_view name = directory.cstr(at + 4, kMaxNameLength + 1);
    AddEntry(c, name, directory.u32le(at), 0, 0);
    at += name.size() + 5;
  }
  SizesToNextOffset(c);
}

void SectorDirectoryReader(ReaderContext& c, unsigned /*row*/) {
  constexpr uint64_t kSector = 2048;
  const File companion = OpenBeside(c, CompanionPath(c.path, ".dir"));
  if (!companion) throw BadData("no companion directory");
  const uint32_t size = os::SizeLow(companion.get());
  std::vector<uint8_t> bytes(size);
  if (!ReadAt(companion.get(), bytes.data(), 0, size)) throw BadData("short companion read");
  ParseRecordDirectory(c, ByteView(bytes), size / 32, {24, 4, 4, true});
  for (ArchiveEntry& e : c.entries) {
    e.Offset = DerivedOffset(e.Offset * kSector);
    e.UnpackedSize = e.PackedSize = DerivedOffset(e.PackedSize * kSector);
  }
}

void HeadTableReader(ReaderContext& c, unsigned /*row*/) {
  constexpr uint32_t kHead = 40;
  const uint32_t count = c.header.u32le(0);
  const std::vector<uint8_t> table = ReadBlock(c, 4, uint64_t{count} * 4);
  c.entries.reserve(count);
  for (uint32_t i = 0; i < count; ++i) {
    const uint32_t at = ByteView(table).u32le(uint64_t{i} * 4);
    const std::vector<uint8_t> head = ReadBlock(c, at, kHead);
    const uint32_t size = ByteView(head).u32le(4);
    AddEntry(c, ByteView(head).field(8, 16), at + kHead, size, size);
  }
}

void NumberedRecordReader(ReaderContext& c, unsigned /*row*/) {
  ReadFieldDirectory(c, 24, c.header.u32le(8), {0, 0, 4, 8, 8, 16});
  for (size_t i = 0; i < c.entries.size(); ++i) NumberEntry(c, i);
}

void TrailingDataReader(ReaderContext& c, unsigned /*row*/) {
  constexpr uint32_t kWindow = 260;
  uint64_t at = 80;
  for (bool last = false; !last;) {
    const std::vector<uint8_t> bytes = ReadBlock(c, at, kWindow);
    const ByteView record(bytes);
    const std::string_view name = record.cstr(0, kWindow);
    const uint32_t size = record.u32le(name.size() + 1);
    const uint32_t offset = record.u32le(name.size() + 5);
    AddEntry(c, name, offset, size, size);
    at += name.size() + 9;
    last = uint64_t{offset} + at + 1 + size >= c.fileSize;
  }
  for (ArchiveEntry& e : c.entries) e.Offset = DerivedOffset(e.Offset + at + 1);
}

void SeparateNameReader(ReaderContext& c, unsigned /*row*/) {
  const uint32_t count = c.header.u32le(0);
  const uint64_t records = uint64_t{count} * 24;
  const uint32_t nameBytes = ByteView(ReadBlock(c, records + 4, 4)).u32le(0);
  const std::vector<uint8_t> bytes = ReadBlock(c, 4, records + 4 + nameBytes);
  const ByteView directory(bytes), names = directory.from(records + 4);
  c.entries.reserve(count);
  for (uint64_t at = 0; at < records; at += 24) {
    const uint32_t size = directory.u32le(at + 4);
    AddEntry(c, names.cstr(directory.u32le(at + 20), kMaxNameLength + 1), directory.u32le(at), size,
             size);
  }
}

void EmptyNameEndReader(ReaderContext& c, unsigned /*row*/) {
  const std::vector<uint8_t> bytes = ReadBlock(c, 0, c.header.u32le(0));
  const ByteView directory(bytes);
  for (uint64_t at = 0; at < directory.size();) {
    const std::string_view name = directory.cstr(at + 4, kMaxNameLength + 1);
    if (name.empty()) break;
    const uint32_t offset = directory.u32le(at), end = directory.u32le(at + name.size() + 5);
    if (end < offset) throw BadData("offsets going back");
    AddEntry(c, name, offset, end - offset, end - offset);
    at += name.size() + 5;
  }
}

}  // namespace cairn
