// Files whose directories carry no names of their own: block streams, offset
// tables and tagged chunk files. Entries are named after the archive and
// their index (level1.frame.000000, ...), the chunk files adding the chunk's
// tag read backwards.
//
// - Block streams (FormatIds 127 ".frame", 128 and 129 ".sequence"): blocks
//   back to back from 8, 12 or 0 up to 8 bytes before the end of the file.
//   A block of type 1 is a zlib stream: pad bytes, packed and unpacked size,
//   the data; it takes one pad byte when it is the first block of a ".frame"
//   file, or when a ".sequence" block follows another of type 1. A block of
//   any other type is a length L and L - 4 stored bytes.
// - Numbered offset tables (94, 95): a 16-bit slot count at 4 and the slots
//   from 8, each the offset of a record. Zero and repeated offsets are not
//   records; each record runs to the next offset, the last to the end of the
//   file, and its payload follows a 4-byte record header, or 5 bytes when the
//   header's bit 29 is set.
// - Tagged chunk files (111 "TGL", 112 "KPS"): a chunk count at 12 and the
//   chunks from 16, each opened by a 16-byte header: tag, total size in the
//   low 28 bits of the word at 4, width and height at 12 and 14.
// - Tagged chunks through an offset table (92): the table starts 64 bytes past
//   the header word at 0 and lists the chunks' offsets up to its first zero
//   (the first value, or the one at 16 when the first is zero, always
//   counts). Each chunk opens with a 104-byte header: size at 0, tag at 4,
//   height and width at 16 and 18, a zero-terminated name at 36.
//
// Chunks tagged "ABGR" (32-bit pixels) and "NLAP" (indices and a palette)
// are offered as TGA copies as well, except in the "KPS" files, whose entries
// extract only as they are stored.

#include <algorithm>
#include <array>
#include <string>
#include <vector>

#include "media/conversion.h"
#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

struct BlockStreamLayout {
  uint32_t start;      // the first block
  bool padFirstBlock;  // the pad byte: on the first block, or behind a block of type 1
};
constexpr std::array<BlockStreamLayout, 3> kBlockStreams = {{{8, true}, {12, false}, {0, false}}};

// The tag as its bytes read backwards, up to a zero byte.
std::string ReversedTag(ByteView tag) {
  std::string text;
  for (int i = 3; i >= 0 && tag.u8(i) != 0; --i) text += static_cast<char>(tag.u8(i));
  return text;
}

// The TGA copy of a chunk that holds a picture.
void AddChunkPicture(ReaderContext& c, ByteView tag, const std::string& name, uint32_t offset,
                     uint32_t width, uint32_t height) {
  uint8_t flag = 0;
  if (tag.matches(0, "ABGR")) flag = 1;
  if (tag.matches(0, "NLAP")) flag = 2;
  if (flag != 0) AddTgaEntry(c, name, offset, 0, width, height, 4, flag);
}

}  // namespace

void BlockStreamReader(ReaderContext& c, unsigned row) {
  const BlockStreamLayout& layout = kBlockStreams.at(row);
  const uint64_t end = c.fileSize - uint64_t{8};
  uint64_t at = layout.start;
  bool afterPacked = false;
  while (at < end) {
    const std::vector<uint8_t> head = ReadBlock(c, at, 10);
    const ByteView b(head);
    const std::string name = NumberedName(c.archiveFileName, uint32_t(c.entries.size()));
    const bool packed = b.u8(0) == 1;
    if (packed) {
      const uint32_t pad = layout.padFirstBlock ? at == layout.start : afterPacked;
      const uint32_t size = b.u32le(1 + pad);
      AddEntry(c, name, DerivedOffset(at + 9 + pad), b.u32le(5 + pad), size, 1);
      at += 9 + pad + uint64_t{size};
    } else {
      // The length counts its own four bytes.
      const uint32_t length = b.u32le(1);
      if (length < 4) throw BadData("block shorter than its length");
      AddEntry(c, name, DerivedOffset(at + 5), length - 4, length - 4);
      at += 1 + uint64_t{length};
    }
    afterPacked = packed;
  }
}

void NumberedOffsetTableReader(ReaderContext& c, unsigned) {
  const uint32_t count = c.header.u16le(4);
  const std::vector<uint8_t> table = ReadBlock(c, 8, 4 * uint64_t{count});
  std::vector<uint32_t> offsets(count);
  for (uint32_t i = 0; i < count; ++i) offsets[i] = ByteView(table).u32le(4 * uint64_t{i});
  std::sort(offsets.begin(), offsets.end());
  uint32_t last = 0;
  for (const uint32_t offset : offsets) {
    if (offset == last) continue;
    AddEntry(c, NumberedName(c.archiveFileName, uint32_t(c.entries.size())), offset, 0, 0);
    last = offset;
  }
  SizesToNextOffset(c);
  for (ArchiveEntry& e : c.entries) {
    if (e.PackedSize < 5) continue;
    const std::vector<uint8_t> header = ReadBlock(c, e.Offset, 4);
    const uint32_t skip = ByteView(header).u32le(0) & 0x20000000 ? 5 : 4;
    e.Offset += skip;
    e.UnpackedSize = e.PackedSize -= skip;
  }
}

void TaggedChunkReader(ReaderContext& c, unsigned row) {
  const bool pictures = row == 0;
  const uint32_t count = c.header.u32le(12);
  uint64_t at = 16;
  for (uint32_t i = 0; i < count; ++i) {
    const std::vector<uint8_t> head = ReadBlock(c, at, 16);
    const ByteView h(head);
    // A chunk shorter than its header would leave the walk where it is.
    const uint32_t size = h.u32le(4) & 0x0FFFFFFF;
    if (size < 16) throw BadData("chunk shorter than its header");
    const std::string name = NumberedName(c.archiveFileName, i) + "." + ReversedTag(h.sub(0, 4));
    const uint32_t offset = DerivedOffset(at);
    AddEntry(c, name, offset, size, size);
    if (pictures) AddChunkPicture(c, h.sub(0, 4), name, offset, h.u16le(12), h.u16le(14));
    at += size;
  }
}

void ChunkOffsetTableReader(ReaderContext& c, unsigned) {
  const uint64_t start = uint64_t{c.header.u32le(0)} + 64;
  if (start > c.fileSize) throw BadData("table past the end");
  // Beyond the end of the file the table reads as zeros.
  std::vector<uint8_t> table = ReadBlock(c, start, c.fileSize - start);
  table.resize(table.size() + 260);
  const ByteView t(table);
  const uint64_t first = t.u32le(0) == 0 ? 16 : 0;
  uint64_t count = 1;
  while (t.u32le(4 * (first + count)) != 0) ++count;
  for (uint64_t i = 0; i < count; ++i) {
    const uint32_t offset = t.u32le(4 * (first + i));
    const std::vector<uint8_t> head = ReadBlock(c, offset, 104);
    const ByteView h(head);
    const std::string name = std::string(h.cstr(36, 68)) + "." + ReversedTag(h.sub(4, 4));
    AddEntry(c, name, offset, h.u32le(0), h.u32le(0));
    AddChunkPicture(c, h.sub(4, 4), name, offset, h.u16le(18), h.u16le(16));
  }
}

}  // namespace cairn
