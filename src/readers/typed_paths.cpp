// Directories whose records carry more than a name, an offset and a size.
//
// - "GABA" sound archive (FormatId 41): a count at 8 and 64-byte records from
//   16: name[32], offset, size, a format parameter (the sample rate, kept in
//   Extra) and a type code that gives the extension; PCM sounds get a WAV
//   header in front when extracted.
// - "H4R" archive (44): the header word at 4 locates a count and the records:
//   offset, size, 8 spare bytes, the file name and the folder path, each
//   behind a 16-bit length, then a 16-bit value U, a storage code (3: gzip)
//   and 2 more bytes when U is 0. The path keeps its own trailing '\'; a
//   leading drive keeps its letter but not its colon.
// - Newline directory (48): a count at 12 and records from the header word at
//   8 to the end of the file: a name ended by a newline, offset, size.
// - "BIG" archive (52): a count at 8 and (offset, spare word) pairs from 68;
//   entries are numbered, each running to the next one's offset.
// - Resource file of signature row 57: a count at 41 and records from the
//   word at 45 to the end of the file: a zero-ended name, 12 spare bytes,
//   offset, unpacked and packed size, 4 spare bytes. Every entry is a zlib
//   stream.

#include <algorithm>
#include <array>
#include <string>
#include <string_view>
#include <vector>

#include "readers/readers.h"

namespace cairn {
namespace {

struct SoundType {
  uint32_t code;
  std::string_view extension;
  uint32_t header;  // bytes the extraction writes in front of the data
  uint8_t flag;
};
// Types 0x24 and 0x25 are MP3, type 6 is 16-bit PCM.
constexpr std::array<SoundType, 3> kGabaTypes = {{
    {0x24, ".mp3", 0, 0},
    {0x25, ".mp3", 0, 0},
    {6, ".wav", 40, 1},
}};

void ReadGaba(ReaderContext& c) {
  const uint32_t count = c.header.u32le(8);
  const std::vector<uint8_t> block = ReadRecordDirectory(c, 16, count, {32, 4, 28, false});
  for (uint32_t i = 0; i < count; ++i) {
    const ByteView r = ByteView(block).sub(uint64_t{i} * 64, 64);
    ArchiveEntry& e = c.entries[i];
    e.Extra = r.u32le(40);
    for (const SoundType& t : kGabaTypes) {
      if (r.u32le(44) != t.code) continue;
      e.Name += t.extension;
      e.UnpackedSize = DerivedOffset(uint64_t{e.UnpackedSize} + t.header);
      e.Flag = t.flag;
    }
  }
}

// The bytes of `v` as text.
std::string Text(ByteView v) {
  return {reinterpret_cast<const char*>(v.data()), v.size()};
}

void ReadH4r(ReaderContext& c) {
  const uint32_t table = c.header.u32le(4);
  const uint32_t count = ByteView(ReadBlock(c, table, 4)).u32le(0);
  uint64_t at = uint64_t{table} + 4;
  NeedRoomFor(count, c.fileSize - at, 24);
  c.entries.reserve(count);
  for (uint32_t i = 0; i < count; ++i) {
    // Each record is read as a window of 260 bytes, which must lie in the file.
    const std::vector<uint8_t> window = ReadBlock(c, at, 260);
    const ByteView r(window);
    const uint16_t fileLength = r.u16le(16);
    const uint16_t pathLength = r.u16le(18 + fileLength);
    std::string path = Text(r.sub(20 + fileLength, pathLength));
    std::string name = Text(r.sub(18, fileLength));
    const uint64_t tail = 20 + uint64_t{fileLength} + pathLength;
    if (!path.empty()) {
      if (path.size() > 1 && path[1] == '\\') path.erase(0, 1);
      // Names inside an archive are relative: a path that now begins with
      // '\' (".\" does) loses it.
      name = path.substr(std::min(path.size(), path.find_first_not_of('\\'))) + name;
      if (name.size() > 1 && name[1] == ':') name[1] = '_';
    }
    name.resize(std::min(name.size(), name.find('\0')));
    if (r.u16le(tail + 2) == 3) name += ".gz";
    const uint32_t size = r.u32le(4);
    AddEntry(c, name, r.u32le(0), size, size);
    at += tail + 4 + (r.u16le(tail) == 0 ? 2 : 0);
  }
}

// The name that starts at `at` and ends at a newline within 260 bytes.
std::string_view NewlineName(ByteView v, uint64_t at) {
  for (size_t n = 0; n <= kMaxNameLength && v.has(at, n + 1); ++n)
    if (v.u8(at + n) == '\n') return {reinterpret_cast<const char*>(v.data() + at), n};
  throw BadData("name without its newline");
}

void ReadNewlineDirectory(ReaderContext& c) {
  const uint32_t count = c.header.u32le(12), start = c.header.u32le(8);
  if (start > c.fileSize) throw BadData("directory past the end");
  const std::vector<uint8_t> block = ReadBlock(c, start, c.fileSize - start);
  const ByteView dir(block);
  NeedRoomFor(count, dir.size(), 9);
  c.entries.reserve(count);
  uint64_t at = 0;
  for (uint32_t i = 0; i < count; ++i) {
    const std::string_view line = NewlineName(dir, at);
    std::string name(line.substr(0, line.find('\0')));
    if (name.size() > 1 && (name[1] == ':' || name[1] == '.')) name[1] = '_';
    if (!name.empty() && name[0] == '.') name[0] = '_';
    at += line.size() + 1;
    const uint32_t size = dir.u32le(at + 4);
    AddEntry(c, name, dir.u32le(at), size, size);
    at += 8;
  }
}

void ReadBig(ReaderContext& c) {
  // The spare word is read as a size, then replaced.
  ReadRecordDirectory(c, 68, c.header.u32le(8), {0, 4, 4, true});
  for (size_t i = 0; i < c.entries.size(); ++i) NumberEntry(c, i);
  SizesToNextOffset(c);
}

void ReadResourceFile(ReaderContext& c) {
  const uint32_t start = c.header.u32le(45);
  if (start > c.fileSize) throw BadData("directory past the end");
  ReadNamedSizeRecords(c, ReadBlock(c, start, c.fileSize - start), c.header.u32le(41), 12, 4, 1);
}

// Rows in the order of the registry's `row` column.
constexpr std::array<void (*)(ReaderContext&), 5> kTypedPathReaders = {
    ReadGaba, ReadH4r, ReadNewlineDirectory, ReadBig, ReadResourceFile,
};

}  // namespace

void TypedPathReader(ReaderContext& c, unsigned row) {
  kTypedPathReaders.at(row)(c);
}

}  // namespace cairn
