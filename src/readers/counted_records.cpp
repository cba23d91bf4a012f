// Further counted record directories: a count and a list of records, each
// format with a twist of its own. Entries are stored as they are, but for
// "ezd", whose entries are zlib streams.
//
// - "AWAD" (FormatId 59): a big-endian count at 4 and 28-byte records from 8:
//   name[16], then size and offset, both big-endian, and 4 spare bytes.
// - "MJZ0" (60): a count at 8 and 144-byte records from 16: name[128], a
//   state (1: deleted, not listed), offset, size, 4 spare bytes.
// - "MH3 V1.0 " (61): 64-byte records from 64 up to the header word at 48:
//   name[48], offset, size, 8 spare bytes; a record beginning "****" ends the
//   list.
// - "VER2" (62): a count at 4 and 32-byte records from 8: start sector,
//   sector count, name[24]; a sector is 2048 bytes.
// - "MQDB" (63): the header word at 24 locates a count and 16-byte records:
//   4 spare bytes, size, data position less 28, 4 spare bytes. Entries are
//   numbered, with an extension told by their first four bytes.
// - "ezd" (64): a count at 4 and records from 16 up to the header word at 8:
//   a zero-ended name, 5 spare bytes, offset, unpacked and packed size.
// - "MIX1" (67): the header word at 4 locates a count and 12-byte records (4
//   spare bytes, offset, size); 4 past the word at 8 lie the names, each a
//   length byte and as many bytes, the name ending at its first zero.
// - "THU3" (68): a count at 4 and records from 16 in the header word at 8
//   less 13 bytes: 4 spare bytes, offset, 16 spare bytes, name length and the
//   name. Each entry runs to the next one's offset.
// - "SDPA" (69): a count at 4 and 12-byte records from 8: offset, size, 4
//   spare bytes; entries are numbered sounds.
// - "LP1C" (74): a count at 8 and records from 12 up to the first entry's
//   data: a name length byte, the name, size, offset, 8 spare bytes.

#include <array>
#include <string>
#include <string_view>
#include <vector>

#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

using namespace std::string_view_literals;

// The 32-bit word stored in the archive at `position`.
uint32_t WordAt(const ReaderContext& c, uint64_t position) {
  return ByteView(ReadBlock(c, position, 4)).u32le(0);
}

// Reads `count` records of `size` bytes from `position` and hands each to `add`.
template <class Add>
void EachRecord(ReaderContext& c, uint64_t position, uint32_t count, uint32_t size, Add add) {
  const std::vector<uint8_t> block = ReadBlock(c, position, uint64_t{count} * size);
  c.entries.reserve(count);
  for (uint32_t i = 0; i < count; ++i) add(ByteView(block).sub(uint64_t{i} * size, size));
}

void ReadAwad(ReaderContext& c) {
  EachRecord(c, 8, c.header.u32be(4), 28, [&](ByteView r) {
    AddEntry(c, r.field(0, 16), r.u32be(20), r.u32be(16), r.u32be(16));
  });
}

void ReadMjz0(ReaderContext& c) {
  EachRecord(c, 16, c.header.u32le(8), 144, [&](ByteView r) {
    if (r.u32le(128) != 1) AddEntry(c, r.field(0, 128), r.u32le(132), r.u32le(136), r.u32le(136));
  });
}

void ReadMh3(ReaderContext& c) {
  const uint32_t end = c.header.u32le(48);
  if (end < 64) throw BadData("directory ends before it starts");
  const std::vector<uint8_t> block = ReadBlock(c, 64, end - 64);
  const ByteView region(block);
  uint32_t count = 0;
  while (region.has(uint64_t{count} * 64, 64) && !region.matches(uint64_t{count} * 64, "****"))
    ++count;
  ParseRecordDirectory(c, region, count, {48, 4, 12, false});
}

void ReadVer2(ReaderContext& c) {
  ReadRecordDirectory(c, 8, c.header.u32le(4), {24, 4, 4, true});
  for (ArchiveEntry& e : c.entries) {
    e.Offset = DerivedOffset(uint64_t{e.Offset} * 2048);
    e.UnpackedSize = e.PackedSize = DerivedOffset(uint64_t{e.PackedSize} * 2048);
  }
}

struct MagicExtension {
  std::string_view magic, extension;
};
constexpr std::array<MagicExtension, 3> kMqdbExtensions = {{
    {"\x89PNG"sv, ".png"sv},
    {"BIKi"sv, ".bik"sv},
    {"RIFF"sv, ".wav"sv},
}};

void ReadMqdb(ReaderContext& c) {
  const uint32_t table = c.header.u32le(24);
  ReadFieldDirectory(c, uint64_t{table} + 4, WordAt(c, table), {0, 0, 8, 4, 4, 16});
  for (size_t i = 0; i < c.entries.size(); ++i) {
    ArchiveEntry& e = c.entries[i];
    e.Offset = DerivedOffset(uint64_t{e.Offset} + 28);
    const std::vector<uint8_t> head = ReadBlock(c, e.Offset, 4);
    std::string_view extension;
    for (const MagicExtension& m : kMqdbExtensions)
      if (ByteView(head).matches(0, m.magic)) extension = m.extension;
    NumberEntry(c, i, extension);
  }
}

void ReadEzd(ReaderContext& c) {
  const uint32_t end = c.header.u32le(8);
  if (end < 16) throw BadData("directory ends before it starts");
  ReadNamedSizeRecords(c, ReadBlock(c, 16, end - 16), c.header.u32le(4), 5, 0, 0);
}

void ReadMix1(ReaderContext& c) {
  const uint32_t table = c.header.u32le(4), names = c.header.u32le(8);
  const uint32_t count = WordAt(c, table);
  // The records and the names are read in one block up to the end of the
  // file, so the names cannot come before the records.
  if (names < table) throw BadData("names before the records");
  const std::vector<uint8_t> block = ReadBlock(c, uint64_t{table} + 4, c.fileSize - table - 4);
  const ByteView rest(block);
  ParseRecordDirectory(c, rest, count, {4, 4, 4, false});
  uint64_t at = names - table;
  for (ArchiveEntry& e : c.entries) {
    const uint8_t length = rest.u8(at);
    e.Name = rest.field(at + 1, length);
    at += 1 + uint64_t{length};
  }
}

void ReadThu3(ReaderContext& c) {
  const uint32_t count = c.header.u32le(4), size = c.header.u32le(8);
  if (size < 13) throw BadData("directory of negative size");
  const std::vector<uint8_t> block = ReadBlock(c, 16, size - 13);
  const ByteView dir(block);
  NeedRoomFor(count, dir.size(), 28);
  c.entries.reserve(count);
  uint64_t at = 0;
  for (uint32_t i = 0; i < count; ++i) {
    const uint32_t length = dir.u32le(at + 24);
    if (length > kMaxNameLength) throw BadData("name too long");
    AddEntry(c, dir.field(at + 28, length), dir.u32le(at + 4), 0, 0);
    at += 28 + uint64_t{length};
  }
  SizesToNextOffset(c);
}

void ReadSdpa(ReaderContext& c) {
  ReadRecordDirectory(c, 8, c.header.u32le(4), {0, 4, 8, true});
  for (size_t i = 0; i < c.entries.size(); ++i) NumberEntry(c, i, ".wav");
}

void ReadLp1c(ReaderContext& c) {
  const uint32_t count = c.header.u32le(8);
  if (count == 0) return;
  // The directory ends where the first entry's data begins, which the first
  // record's offset field tells. A length byte of 128 or more is negative.
  const uint8_t first = c.header.u8(12);
  if (first > 127) throw BadData("negative name length");
  const uint32_t end = WordAt(c, 17 + uint64_t{first});
  if (end < 12) throw BadData("data before the directory");
  const std::vector<uint8_t> block = ReadBlock(c, 12, end - 12);
  const ByteView dir(block);
  // The last record's 8 spare bytes may lie beyond the directory.
  NeedRoomFor(count, dir.size() + 8, 17);
  c.entries.reserve(count);
  uint64_t at = 0;
  for (uint32_t i = 0; i < count; ++i) {
    const uint8_t length = dir.u8(at);
    if (length > 127) throw BadData("negative name length");
    const uint32_t size = dir.u32le(at + 1 + length);
    AddEntry(c, dir.field(at + 1, length), dir.u32le(at + 5 + length), size, size);
    at += 17 + uint64_t{length};
  }
}

// Rows in the order of the registry's `row` column.
constexpr std::array<void (*)(ReaderContext&), 10> kCountedRecordReaders = {
    ReadAwad, ReadMjz0, ReadMh3,  ReadVer2, ReadMqdb,
    ReadEzd,  ReadMix1, ReadThu3, ReadSdpa, ReadLp1c,
};

}  // namespace

void CountedRecordReader(ReaderContext& c, unsigned row) {
  kCountedRecordReaders.at(row)(c);
}

void NumberEntry(ReaderContext& c, size_t i, std::string_view extension) {
  std::string name = NumberedName(c.archiveFileName, static_cast<uint32_t>(i));
  name += extension;
  if (name.size() > kMaxNameLength) throw BadData("name too long");
  c.entries.at(i).Name = std::move(name);
}

void SizesToNextOffset(ReaderContext& c, uint32_t end) {
  if (end == 0) end = c.fileSize;
  for (uint32_t last = end, i = static_cast<uint32_t>(c.entries.size()); i-- > 0;) {
    if (c.entries[i].Offset > last) throw BadData("entries out of order");
    last = c.entries[i].Offset;
  }
  SizesFromOffsets(c, end);
}

void ReadNamedSizeRecords(ReaderContext& c, ByteView directory, uint32_t count, uint32_t gap,
                          uint32_t tail, uint8_t flag) {
  NeedRoomFor(count, directory.size(), uint64_t{gap} + 13);
  c.entries.reserve(count);
  uint64_t at = 0;
  for (uint32_t i = 0; i < count; ++i) {
    const std::string_view name = directory.cstr(at, kMaxNameLength + 1);
    at += name.size() + 1 + gap;
    AddEntry(c, name, directory.u32le(at), directory.u32le(at + 4), directory.u32le(at + 8), flag);
    at += 12 + uint64_t{tail};
  }
}

}  // namespace cairn
