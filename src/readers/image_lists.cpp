// Image lists, tables kept at the end of the archive, directories kept in a
// companion file beside it, and a chain whose size words are scrambled.
// Everything is stored as it is, but for some entries of the ".rfh" and
// ".dir" indexes, which are zlib streams.
//
// - Image lists (FormatIds 81, 82, 83): images back to back, each a 16-byte
//   header (width u16 at 8, height u16 at 10, bits per pixel as a signed
//   byte at 12) and its pixels. An entry runs from its header for
//   width x height x bits / 8 + 128 bytes, the first one 32 bytes less. 81
//   finds a table at the header word at 16 that opens with 0xFFFFFFFF 0 and
//   counts the images at 20, the images following it from 32 on, 24-bit ones
//   sized as 32-bit; 82 counts at 20 with the images from 32; 83 counts at 84
//   with the images from 96. In 82 and 83 a count of 0 is one 32-bit image.
//   A list of one image is named after the archive, longer ones are numbered.
// - Name directory at the end (91): a count at 12; the word 4 per entry past
//   20 tells where the records start, and they run to the end of the file:
//   offset, size, 12 spare bytes and a zero-terminated name.
// - Offset table at the end (93): from 4 before the header word at 4 to the
//   end of the file, one offset per entry (one more than the count at 12);
//   the first slot is not an offset, the first entry is at 16. Each entry
//   runs to the next one's offset, the last to the header word at 4.
// - Trailing name table (116): a u16 count at 0, 12-byte slots from 2 (4
//   spare bytes, offset, size) and, at the very end of the file, one 15-byte
//   name per entry.
// - ".fat" index (143): records of 4 spare bytes, offset, size, 4 spare bytes,
//   name length and the name.
// - ".rfh" index (108): records of name length, 4 spare bytes, a method byte,
//   3 spare bytes, stored size plus 4, unpacked size, offset less 4, name.
// - ".dir" index (121): each name is spelt as (character, tag) byte pairs, the
//   pair tagged 8, 72, 136 or 200 holding its last character; offset and
//   stored size follow. In the archive, 4 bytes past the offset, the unpacked
//   size is kept with its three low bytes XORed with the top one; a zlib
//   stream follows it when the next two bytes are 78 DA. Entries are named
//   by their index, a dot and the spelt name.
// - Scrambled size chain (154): every size word is XORed with 0x3A91C4D7.
//   A count at 0 of 128-byte slots that are skipped, then records of a size
//   and the data up to the end of the file. Entries are numbered, with ".jpg"
//   or ".bik" for data that begins like a JPEG or a Bink video.

#include <algorithm>
#include <array>
#include <string>
#include <string_view>
#include <vector>

#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

using namespace std::string_view_literals;

struct ImageListLayout {
  bool locatedTable;  // the count and the images follow a table the word at 16 locates
  uint32_t countAt;   // in the table, or in the header
  uint32_t firstImage;
  bool emptyIsOne;  // a count of 0 is one 32-bit image
  bool widen24;     // a 24-bit image is stored with 32 bits per pixel
};

constexpr std::array<ImageListLayout, 3> kImageListLayouts = {{
    {true, 20, 32, false, true},   // 0: 81
    {false, 20, 32, true, false},  // 1: 82
    {false, 84, 96, true, false},  // 2: 83
}};

void NameEntries(ReaderContext& c) {
  if (c.entries.size() == 1)
    c.entries[0].Name.assign(c.archiveFileName);
  else
    for (size_t i = 0; i < c.entries.size(); ++i) NumberEntry(c, i);
}

// The whole of the file beside the archive whose name is the archive's with
// its extension replaced by `ext`.
std::vector<uint8_t> ReadCompanion(const ReaderContext& c, std::string_view ext) {
  const size_t dot = c.archiveFileName.rfind('.');
  if (dot == std::string_view::npos) throw BadData("no extension to replace");
  std::string path(c.path.substr(0, c.path.size() - c.archiveFileName.size() + dot));
  path += ext;
  const File index = OpenBeside(c, path);
  if (!index) throw BadData("no index file");
  std::vector<uint8_t> bytes(os::SizeLow(index.get()));
  if (!ReadAt(index.get(), bytes.data(), 0, static_cast<uint32_t>(bytes.size())))
    throw BadData("short index file");
  return bytes;
}

// Everything from `position` to the end of the file.
std::vector<uint8_t> ReadToEnd(const ReaderContext& c, uint64_t position) {
  if (position > c.fileSize) throw BadData("table past the end");
  return ReadBlock(c, position, c.fileSize - position);
}

// A name of `length` bytes at `at`, up to its first zero byte.
std::string_view StatedName(ByteView bytes, uint64_t at, uint32_t length) {
  if (length > kMaxNameLength) throw BadData("name too long");
  return bytes.field(at, length);
}

void ReadFatIndex(ReaderContext& c, ByteView index) {
  for (uint64_t j = 0; j < index.size();) {
    const uint32_t length = index.u32le(j + 16);
    AddEntry(c, StatedName(index, j + 20, length), index.u32le(j + 4), index.u32le(j + 8),
             index.u32le(j + 8));
    j += 20 + uint64_t{length};
  }
}

void ReadRfhIndex(ReaderContext& c, ByteView index) {
  for (uint64_t j = 0; j < index.size();) {
    const uint32_t length = index.u32le(j);
    // The stored size counts the 4 bytes in front of the data.
    const uint32_t stored = index.u32le(j + 12);
    if (stored < 4) throw BadData("stored size too small");
    AddEntry(c, StatedName(index, j + 24, length), DerivedOffset(uint64_t{index.u32le(j + 20)} + 4),
             index.u32le(j + 16), stored - 4, index.u8(j + 8));
    j += 24 + uint64_t{length};
  }
}

bool EndsName(uint8_t tag) {
  return (tag & 0x3F) == 8;  // 8, 72, 136 or 200
}

void ReadDirIndex(ReaderContext& c, ByteView index) {
  for (uint64_t p = 0; p + 1 < index.size();) {
    std::string name = std::to_string(c.entries.size());
    if (name.size() < 6) name.insert(0, 6 - name.size(), '0');
    name += '.';
    for (bool last = false; !last; p += 2) {
      if (name.size() >= kMaxNameLength) throw BadData("name too long");
      name += static_cast<char>(index.u8(p));
      last = EndsName(index.u8(p + 1));
    }
    name.resize(std::min(name.find('\0'), name.size()));  // a zero character ends the name
    const uint32_t at = index.u32le(p), stored = index.u32le(p + 4);
    p += 8;
    const std::vector<uint8_t> head = ReadBlock(c, uint64_t{at} + 4, 6);
    const ByteView h(head);
    const uint8_t key = h.u8(3);
    const uint32_t unpacked = (h.u8(0) ^ key) | (h.u8(1) ^ key) << 8 | (h.u8(2) ^ key) << 16;
    if (h.matches(4, "\x78\xDA"sv)) {
      if (stored < 8) throw BadData("stored size too small");
      AddEntry(c, name, DerivedOffset(uint64_t{at} + 8), unpacked, stored - 8, 1);
    } else {
      AddEntry(c, name, at, stored, stored);
    }
  }
}

struct CompanionIndex {
  std::string_view extension;
  void (*walk)(ReaderContext&, ByteView);
};

constexpr std::array<CompanionIndex, 3> kCompanionIndexes = {{
    {".fat"sv, ReadFatIndex},  // 0: 143
    {".rfh"sv, ReadRfhIndex},  // 1: 108
    {".dir"sv, ReadDirIndex},  // 2: 121
}};

}  // namespace

void ImageListReader(ReaderContext& c, unsigned row) {
  const ImageListLayout& r = kImageListLayouts.at(row);
  uint64_t base = 0;
  std::vector<uint8_t> located;
  ByteView table = c.header;
  if (r.locatedTable) {
    base = c.header.u32le(16);
    located = ReadBlock(c, base, 32);
    table = ByteView(located);
    if (table.u32le(0) != 0xFFFFFFFF || table.u32le(4) != 0) throw BadData("no image table");
  }
  uint32_t count = table.u32le(r.countAt);
  const bool single = r.emptyIsOne && count == 0;
  if (single) count = 1;
  // Each image header must be read from the file, so the walk is bounded by
  // the file whatever the count says.
  uint64_t at = base + r.firstImage;
  for (uint32_t i = 0; i < count; ++i) {
    const std::vector<uint8_t> header = ReadBlock(c, at, 16);
    const ByteView h(header);
    // The depth is a signed byte; a negative one would step back to an
    // earlier image or crawl through the file.
    const auto depth = static_cast<int8_t>(h.u8(12));
    if (!single && depth < 0) throw BadData("image of negative depth");
    uint64_t bits = single ? 32 : static_cast<uint64_t>(depth);
    if (r.widen24 && bits == 24) bits = 32;
    const uint32_t length =
        DerivedOffset(uint64_t{h.u16le(8)} * h.u16le(10) * bits / 8 + (i == 0 ? 96 : 128));
    AddEntry(c, {}, DerivedOffset(at), length, length);
    at += length;
  }
  NameEntries(c);
}

void EndDirectoryReader(ReaderContext& c, unsigned) {
  const uint32_t count = c.header.u32le(12);
  // With many entries that word lies past the header, so it is read from the file.
  const uint32_t start = ByteView(ReadBlock(c, 20 + uint64_t{4} * count, 4)).u32le(0);
  const std::vector<uint8_t> block = ReadToEnd(c, start);
  const ByteView d(block);
  NeedRoomFor(count, d.size(), 21);
  c.entries.reserve(count);
  uint64_t at = 0;
  for (uint32_t i = 0; i < count; ++i) {
    const std::string_view name = d.cstr(at + 20, kMaxNameLength + 1);
    AddEntry(c, name, d.u32le(at), d.u32le(at + 4), d.u32le(at + 4));
    at += 20 + name.size() + 1;
  }
}

void EndOffsetTableReader(ReaderContext& c, unsigned) {
  const uint32_t end = c.header.u32le(4);
  if (end < 4) throw BadData("table before the start of the file");
  const uint64_t count = uint64_t{c.header.u32le(12)} + 1;
  const std::vector<uint8_t> block = ReadToEnd(c, end - 4);
  const ByteView slots(block);
  NeedRoomFor(count, slots.size(), 4);
  c.entries.reserve(static_cast<size_t>(count));
  for (size_t i = 0; i < count; ++i) {
    AddEntry(c, {}, i == 0 ? 16 : slots.u32le(4 * uint64_t{i}), 0, 0);
    NumberEntry(c, i);
  }
  SizesToNextOffset(c, end);
}

void TrailingNameTableReader(ReaderContext& c, unsigned) {
  const uint32_t count = c.header.u16le(0);
  const uint64_t names = 15ull * count;
  ReadRecordDirectory(c, 2, count, {4, 4, 4, false});  // the spare word stands in for the name
  if (names > c.fileSize) throw BadData("name table before the start of the file");
  const std::vector<uint8_t> block = ReadBlock(c, c.fileSize - names, names);
  for (uint32_t i = 0; i < count; ++i) c.entries[i].Name = ByteView(block).field(15ull * i, 15);
}

void CompanionIndexReader(ReaderContext& c, unsigned row) {
  const CompanionIndex& r = kCompanionIndexes.at(row);
  const std::vector<uint8_t> index = ReadCompanion(c, r.extension);
  r.walk(c, ByteView(index));
}

void ScrambledSizeChainReader(ReaderContext& c, unsigned) {
  constexpr uint32_t kKey = 0x3A91C4D7;
  for (uint64_t p = 128 * uint64_t{c.header.u32le(0) ^ kKey} + 4; p < c.fileSize;) {
    const uint32_t size = ByteView(ReadBlock(c, p, 4)).u32le(0) ^ kKey;
    // Data shorter than four bytes cannot begin with either tag.
    std::string_view extension;
    if (size >= 4 && p + 8 <= c.fileSize) {
      const uint32_t tag = ByteView(ReadBlock(c, p + 4, 4)).u32le(0);
      if (tag == 0xE0FFD8FF) extension = ".jpg";
      if (tag == 0x694B4942) extension = ".bik";
    }
    AddEntry(c, {}, DerivedOffset(p + 4), size, size);
    NumberEntry(c, c.entries.size() - 1, extension);
    p += 4 + uint64_t{size};
  }
}

}  // namespace cairn
