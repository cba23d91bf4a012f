// Directories whose records hold offsets and sizes while the names lie
// elsewhere.
//
// - "AFS" archive (FormatId 9): a count at 4, (offset, size) pairs from 8 and
//   one more pair locating the name block, which holds a 48-byte record per
//   entry with the name in its first 32 bytes. When that pair is (0, ...) it
//   sits in the 8 bytes before the first entry's data instead.
// - "archive  V2.2" archive (13): a count at 16, 12-byte records from 20
//   (name position, offset, size); the names are zero-terminated strings
//   between the records and the first entry's data.
// - "StOR" archive (14): the directory at the position given at 4 runs to the
//   end of the file: a count, 12-byte records with the offset at 4, then the
//   names one after another. Sizes are not stored: each entry runs to the next
//   one's offset, the last one up to the directory.
// - "HAK V1.0" archive (29): a count at 16 and the directory position at 24;
//   the directory holds 24-byte name records, then (offset, size) pairs. The
//   bytes from 168 up to the directory are listed as "_description_".
// - "DWFB" archive (31): a count at 72, the name block's position and size at
//   76 and 80, 40-byte records from 88 (name position and length, offset,
//   size).
//
// Every name must lie inside its block, end inside it and fit in 259
// characters.

#include <algorithm>
#include <array>
#include <vector>

#include "readers/readers.h"

namespace cairn {
namespace {

// Where the names are found.
enum class NameKind {
  Fixed,       // the i-th name is a fixed-width field, one per name record
  Pointer,     // a record field gives the file position of a zero-terminated name
  Counted,     // a record field gives the name's position, another its length
  Sequential,  // zero-terminated names one after another, in entry order
};

// The records and the names as read from the archive.
struct NameBlockDirectory {
  uint32_t count = 0;
  std::vector<uint8_t> recordBlock, nameBlock;
  ByteView records;      // count records
  ByteView names;        // the name block
  uint64_t namesAt = 0;  // file position of the name block's first byte
  uint32_t end = 0;      // where the last entry ends, for directories without sizes
};

// Reads the header and locates the records and the names; adds the entries
// that the records do not describe.
using OpenFn = void (*)(ReaderContext& c, NameBlockDirectory& d);

void OpenAfs(ReaderContext& c, NameBlockDirectory& d) {
  d.count = c.header.u32le(4);
  if (d.count == 0) return;
  d.recordBlock = ReadBlock(c, 8, uint64_t{d.count} * 8 + 8);
  const ByteView pairs(d.recordBlock);
  d.records = pairs.sub(0, uint64_t{d.count} * 8);
  ByteView locator = pairs.sub(uint64_t{d.count} * 8, 8);
  std::vector<uint8_t> fallback;
  if (locator.u32le(0) == 0) {
    const uint32_t first = pairs.u32le(0);
    if (first < 8) throw BadData("no room for the name block's position");
    fallback = ReadBlock(c, first - 8, 8);
    locator = fallback;
  }
  d.namesAt = locator.u32le(0);
  d.nameBlock =
      ReadBlock(c, d.namesAt, std::min<uint64_t>(locator.u32le(4), uint64_t{d.count} * 48));
  d.names = d.nameBlock;
}

void OpenArchive22(ReaderContext& c, NameBlockDirectory& d) {
  d.count = c.header.u32le(16);
  if (d.count == 0) return;
  // The records and the names lie before the first entry's data (at most as
  // far as the file goes).
  const uint32_t firstData = c.header.u32le(24);
  d.recordBlock = ReadBlock(c, 20, std::min<uint64_t>(firstData, c.fileSize - 20));
  const ByteView block(d.recordBlock);
  d.records = block.sub(0, uint64_t{d.count} * 12);
  d.names = block;
  d.namesAt = 20;
}

void OpenStor(ReaderContext& c, NameBlockDirectory& d) {
  const uint32_t at = c.header.u32le(4);
  if (at < 8) throw BadData("directory inside the header");
  d.recordBlock = ReadBlock(c, at, uint64_t{c.fileSize} - at);
  const ByteView directory(d.recordBlock);
  d.count = directory.u32le(0);
  d.records = directory.sub(4, uint64_t{d.count} * 12);
  d.names = directory.from(4 + uint64_t{d.count} * 12);
  d.end = at;
}

void OpenHak(ReaderContext& c, NameBlockDirectory& d) {
  const uint32_t at = c.header.u32le(24);
  if (at < 168) throw BadData("directory inside the header");
  AddEntry(c, "_description_", 168, at - 168, at - 168);
  d.count = c.header.u32le(16);
  d.recordBlock = ReadBlock(c, at, uint64_t{d.count} * 32);
  const ByteView directory(d.recordBlock);
  d.names = directory.sub(0, uint64_t{d.count} * 24);
  d.records = directory.sub(uint64_t{d.count} * 24, uint64_t{d.count} * 8);
}

void OpenDwfb(ReaderContext& c, NameBlockDirectory& d) {
  d.count = c.header.u32le(72);
  d.namesAt = c.header.u32le(76);
  d.recordBlock = ReadBlock(c, 88, uint64_t{d.count} * 40);
  d.records = d.recordBlock;
  d.nameBlock = ReadBlock(c, d.namesAt, c.header.u32le(80));
  d.names = d.nameBlock;
}

constexpr uint32_t kNoSize = UINT32_MAX;

struct NameBlockLayout {
  OpenFn open;
  uint32_t recordSize;
  uint32_t offsetAt;
  uint32_t sizeAt;  // kNoSize: sizes follow from the offsets
  NameKind names;
  uint32_t nameStride;  // Fixed: bytes from one name record to the next
  uint32_t nameWidth;   // Fixed: bytes of the name field
  uint32_t positionAt;  // Pointer, Counted: record field with the name's file position
  uint32_t lengthAt;    // Counted: record field with the name's length, terminator included
};

// Rows in the order of the registry's `row` column.
constexpr std::array<NameBlockLayout, 5> kNameBlockLayouts = {{
    // open, record size, offset at, size at, names, stride, width, position at, length at
    {OpenAfs, 8, 0, 4, NameKind::Fixed, 48, 32, 0, 0},             // 9 "AFS"
    {OpenArchive22, 12, 4, 8, NameKind::Pointer, 0, 0, 0, 0},      // 13 "archive  V2.2"
    {OpenStor, 12, 4, kNoSize, NameKind::Sequential, 0, 0, 0, 0},  // 14 "StOR"
    {OpenHak, 8, 0, 4, NameKind::Fixed, 24, 16, 0, 0},             // 29 "HAK V1.0"
    {OpenDwfb, 40, 12, 16, NameKind::Counted, 0, 0, 4, 8},         // 31 "DWFB"
}};

// The block offset of a name stored at file position `position`.
uint64_t InBlock(const NameBlockDirectory& d, uint32_t position) {
  if (position < d.namesAt) throw BadData("name outside its block");
  return position - d.namesAt;
}

}  // namespace

void NameBlockReader(ReaderContext& c, unsigned row) {
  const NameBlockLayout& l = kNameBlockLayouts.at(row);
  NameBlockDirectory d;
  l.open(c, d);
  c.entries.reserve(c.entries.size() + d.count);
  uint64_t next = 0;  // the next of the sequential names
  for (uint32_t i = 0; i < d.count; ++i) {
    const ByteView r = d.records.sub(uint64_t{i} * l.recordSize, l.recordSize);
    std::string_view name;
    switch (l.names) {
      case NameKind::Fixed:
        name = d.names.field(uint64_t{i} * l.nameStride, l.nameWidth);
        break;
      case NameKind::Pointer:
        name = d.names.cstr(InBlock(d, r.u32le(l.positionAt)), kMaxNameLength + 1);
        break;
      case NameKind::Counted: {
        // The length counts the terminator.
        const uint32_t length = r.u32le(l.lengthAt);
        if (length == 0 || length - 1 > kMaxNameLength) throw BadData("name length out of range");
        name = d.names.field(InBlock(d, r.u32le(l.positionAt)), length - 1);
        break;
      }
      case NameKind::Sequential:
        name = d.names.cstr(next, kMaxNameLength + 1);
        next += name.size() + 1;
        break;
    }
    const uint32_t size = l.sizeAt == kNoSize ? 0 : r.u32le(l.sizeAt);
    AddEntry(c, name, r.u32le(l.offsetAt), size, size);
  }
  if (l.sizeAt == kNoSize) {
    // Each entry runs up to the next one, so the offsets must not go back.
    uint32_t end = d.end;
    for (size_t i = c.entries.size(); i-- > 0;) {
      if (c.entries[i].Offset > end) throw BadData("entries out of order");
      end = c.entries[i].Offset;
    }
    SizesFromOffsets(c, d.end);
  }
}

}  // namespace cairn
