// Chained-item files: no directory block; each item names or tags itself and
// says how long it is, and the next item starts right behind it.
//
// - "paq" archive (FormatId 8): from offset 4, items of a zero-terminated name,
//   a 32-bit size and the data.
// - "MNA" archive (28): from offset 16, items with a 24-byte head whose 24-bit
//   field at 4 is the length of the whole item; items are named after the
//   archive file and their index.
// - "1XFG" chunk file (40): from offset 4, chunks of a reversed four-character
//   tag, a 32-bit data length and the data; a "CTBL" chunk is followed by 4
//   bytes more. Every "IMGE" chunk, a 640-pixel-wide 16-bit picture, also gets
//   a TGA copy.
// - "ACTRHEAD" item file (45): from offset 0, items with a 32-byte head whose
//   values at 24 and 28 multiply to the length of the payload behind it; named
//   like the "MNA" items.
// - "VXBG" archive (27): the name-and-size lines of "paq" gathered into one
//   directory (its size at 4, its lines from 8); the data follows it without
//   gaps, in directory order.
//
// A walk ends when the next item would start at or beyond the end of the
// file. An item shorter than its own head is refused, so the walk always
// moves forward.

#include <algorithm>
#include <array>
#include <string>
#include <vector>

#include "media/conversion.h"
#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

// A zero-terminated name followed by a 32-bit size.
struct NameLine {
  std::string_view name;
  uint32_t size;
  uint32_t length;  // bytes the line takes
};

NameLine ReadNameLine(ByteView v, uint64_t at) {
  const std::string_view name = v.cstr(at, kMaxNameLength + 1);
  const uint32_t length = static_cast<uint32_t>(name.size()) + 5;
  return {name, v.u32le(at + length - 4), length};
}

// Adds the entries of the item whose head starts at `position` and answers the
// item's length, which leads to the next item.
using AddItemFn = uint64_t (*)(ReaderContext& c, ByteView head, uint32_t position, uint32_t index);

uint64_t AddNamedItem(ReaderContext& c, ByteView head, uint32_t position, uint32_t) {
  const NameLine line = ReadNameLine(head, 0);
  AddEntry(c, line.name, position + line.length, line.size, line.size);
  return uint64_t{line.length} + line.size;
}

uint64_t AddCountedItem(ReaderContext& c, ByteView head, uint32_t position, uint32_t index) {
  // 24 bits: the byte at 7 is not part of the length.
  const uint32_t length = head.u24le(4);
  AddEntry(c, NumberedName(c.archiveFileName, index), position, length, length);
  return length;
}

uint64_t AddTaggedChunk(ReaderContext& c, ByteView head, uint32_t position, uint32_t) {
  // The tag is stored back to front; like any name it ends at a zero byte.
  std::string tag;
  for (int i = 3; i >= 0 && head.u8(i) != 0; --i) tag += static_cast<char>(head.u8(i));
  const uint32_t length = head.u32le(4);
  AddEntry(c, tag, position + 8, length, length);
  if (tag == "IMGE") AddTgaEntry(c, tag, position + 8, length, 640, length / 1280, 2, 1);
  return 8 + uint64_t{length} + (tag == "CTBL" ? 4 : 0);
}

uint64_t AddSizedItem(ReaderContext& c, ByteView head, uint32_t position, uint32_t index) {
  const uint64_t length = 32 + uint64_t{head.u32le(24)} * head.u32le(28);
  if (length > UINT32_MAX) throw BadData("item larger than 4 GiB");
  const auto size = static_cast<uint32_t>(length);
  AddEntry(c, NumberedName(c.archiveFileName, index), position, size, size);
  return length;
}

struct ChainLayout {
  uint32_t start;   // where the first item begins
  uint32_t head;    // bytes every item head takes at least
  uint32_t window;  // bytes read at each item, fewer only at the end of the file
  AddItemFn add;
};

// Rows in the order of the registry's `row` column.
constexpr std::array<ChainLayout, 4> kChainLayouts = {{
    {4, 5, 256, AddNamedItem},     // 8 "paq": the name lies within 256 bytes of the item
    {16, 24, 24, AddCountedItem},  // 28 "MNA"
    {4, 8, 8, AddTaggedChunk},     // 40 "1XFG"
    {0, 32, 32, AddSizedItem},     // 45 "ACTRHEAD"
}};

}  // namespace

void ChainedItemReader(ReaderContext& c, unsigned row) {
  const ChainLayout& l = kChainLayouts.at(row);
  uint32_t index = 0;
  for (uint64_t position = l.start; position < c.fileSize; ++index) {
    const uint64_t available = std::min<uint64_t>(l.window, c.fileSize - position);
    if (available < l.head) throw BadData("item head past the end of the file");
    const std::vector<uint8_t> head = ReadBlock(c, position, available);
    const uint64_t length = l.add(c, head, static_cast<uint32_t>(position), index);
    if (length < l.head) throw BadData("item shorter than its head");  // or of no length
    position += length;
  }
}

void LineDirectoryReader(ReaderContext& c, unsigned) {
  const uint32_t size = c.header.u32le(4);
  const std::vector<uint8_t> block = ReadBlock(c, 8, size);
  const ByteView lines(block);
  // The data lies behind the directory, entry after entry.
  uint64_t offset = uint64_t{size} + 8;
  for (uint64_t at = 0; at < lines.size();) {
    const NameLine line = ReadNameLine(lines, at);
    if (offset > UINT32_MAX) throw BadData("entry beyond 4 GiB");
    AddEntry(c, line.name, static_cast<uint32_t>(offset), line.size, line.size);
    offset += line.size;
    at += line.length;
  }
}

}  // namespace cairn
