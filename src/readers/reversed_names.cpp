// Two directories that make sense only once reworked.
//
// - "MASSIVE PAKFILE V 4.0" archive (FormatId 23): K records (count at 76)
//   of size, order key and 8 unused bytes from offset 92, 2 bytes, then name
//   strings up to the data area (at 84). Each string is stored back to front,
//   ends in a zero byte and is followed by 2 bytes that are not part of it.
//   A string with a '.' names the next record; one without is a folder that
//   prefixes the names after it, until the next folder. The data lies back to
//   back from the data area in ascending order of the keys, and the listing
//   follows that order (records of equal keys keep theirs).
// - "PK" header list (76): from offset 64, records of a stored offset, 4
//   bytes, a stored size, 20 bytes, a zero-terminated name and a zero byte;
//   the next record starts 54 bytes after the name. The first record that
//   does not end that way (or that the end of the file cuts) is no record:
//   the data begins 20 bytes before it, and the stored offsets are moved so
//   that the first entry starts there. Each entry runs to the next one, the
//   last to the end of the file; the stored size, less a correction taken
//   from the inverted header word at 20, is the inflated size.

#include <algorithm>
#include <string>
#include <vector>

#include "readers/readers.h"

namespace cairn {

void MassivePakReader(ReaderContext& c, unsigned) {
  const uint32_t count = c.header.u32le(76);
  const uint32_t dataStart = c.header.u32le(84);
  if (dataStart < 92) throw BadData("data area inside the header");
  const std::vector<uint8_t> block = ReadBlock(c, 92, dataStart - 92);
  const ByteView directory(block);
  directory.need(0, uint64_t{count} * 16);  // the records; a count of 0 needs no names
  uint64_t at = uint64_t{count} * 16 + 2;
  std::string folder;
  for (uint32_t i = 0; i < count;) {
    const std::string_view stored = directory.cstr(at, kMaxNameLength + 1);
    at += stored.size() + 3;
    const std::string name(stored.rbegin(), stored.rend());
    if (name.find('.') == std::string::npos) {
      folder = name.empty() ? "" : name + '\\';
      continue;
    }
    const uint32_t size = directory.u32le(uint64_t{i} * 16);
    AddEntry(c, folder + name, directory.u32le(uint64_t{i} * 16 + 4), size, size);  // key for now
    ++i;
  }
  std::stable_sort(
      c.entries.begin(), c.entries.end(),
      [](const ArchiveEntry& a, const ArchiveEntry& b) { return a.Offset < b.Offset; });
  uint64_t offset = dataStart;
  for (ArchiveEntry& e : c.entries) {
    e.Offset = DerivedOffset(offset);
    offset += e.PackedSize;
  }
}

namespace {

// The name of the record window `w`, when the record ends as a record must:
// a name of at most 260 characters inside the window and a zero byte after
// its terminator.
bool ListRecordName(ByteView w, std::string_view& name) {
  for (size_t t = 0; t <= 260 && w.has(32 + t, 2); ++t) {
    if (w.u8(32 + t) != 0) continue;
    if (w.u8(33 + t) != 0) return false;
    name = w.field(32, t);
    return true;
  }
  return false;
}

}  // namespace

void HeaderListReader(ReaderContext& c, unsigned) {
  const uint32_t correction = ~c.header.u32le(20) - 64;
  uint64_t position = 64;
  while (position < c.fileSize) {
    const std::vector<uint8_t> record =
        ReadBlock(c, position, std::min<uint64_t>(294, c.fileSize - position));
    const ByteView w(record);
    std::string_view name;
    if (!ListRecordName(w, name)) break;
    AddEntry(c, name, w.u32le(0), w.u32le(8), 0);
    position += name.size() + 54;
  }
  if (c.entries.empty()) return;
  // Modulo 2^32, as the stored offsets are.
  const uint32_t shift = c.entries.front().Offset - static_cast<uint32_t>(position - 20);
  uint32_t end = c.fileSize;
  for (size_t i = c.entries.size(); i-- > 0;) {
    ArchiveEntry& e = c.entries[i];
    e.Offset -= shift;
    e.UnpackedSize -= correction;
    e.PackedSize = end - e.Offset;
    end = e.Offset;
  }
}

}  // namespace cairn
