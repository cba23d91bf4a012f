// Directories that need more than a table walk.
//
// - "TR4" level file (FormatId 39): from offset 10 to the end of the file a
//   chain of chunks, each an unpacked size A, a stored size B and B bytes of
//   data; a chunk stored as is (A = B, not 0) is followed by 4 more bytes.
//   Chunks are named after the archive file and their index. The first three
//   are compressed texture atlases 256 pixels wide ("TEX32", "TEX16",
//   "TEX32"), each listed after its TGA copy.
// - "SNOK_DATAFILE_KEEP_OUT!" archive (46): the entry count at 264, and at
//   272 the position of the directory, one zlib stream to the end of the
//   file. Inflated it holds exactly that many 1040-byte records: a name
//   zero-terminated in 1024 bytes, the unpacked size, the stored size. The
//   data lies back to back from 276 in record order.
#include <zlib.h>

#include <algorithm>
#include <array>
#include <functional>
#include <string>
#include <vector>

#include "media/conversion.h"
#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

constexpr uint32_t kFirstChunk = 10;

struct Atlas {
  const char* extension;
  uint32_t bytesPerRow;  // the height is the unpacked size over this
  uint8_t bytesPerPixel;
  uint8_t flag;  // the picture layout handed to the converter
};

constexpr std::array<Atlas, 3> kAtlases = {{
    {".TEX32", 1024, 4, 3},
    {".TEX16", 512, 2, 4},
    {".TEX32", 1024, 4, 2},
}};

constexpr uint32_t kSnokRecord = 1040;
constexpr uint32_t kSnokData = 276;

}  // namespace

void InflatePieces(ByteView stream, uint64_t capacity, size_t piece,
                   const std::function<void(ByteView)>& take) {
  // Only one piece is held at a time, so a count that promises more than the
  // stream gives allocates nothing for it.
  struct Stream {
    z_stream z{};
    Stream() {
      if (inflateInit(&z) != Z_OK) throw BadData("inflate failed to start");
    }
    ~Stream() { inflateEnd(&z); }
  } s;
  s.z.next_in = const_cast<Bytef*>(stream.data());
  s.z.avail_in = static_cast<uInt>(stream.size());
  std::vector<uint8_t> buffer(std::max<size_t>(piece, 1));
  uint64_t total = 0;
  size_t filled = 0;
  int r = Z_OK;
  while (r == Z_OK) {
    const size_t room =
        static_cast<size_t>(std::min<uint64_t>(buffer.size() - filled, capacity - total));
    s.z.next_out = buffer.data() + filled;
    s.z.avail_out = static_cast<uInt>(room);
    r = inflate(&s.z, Z_NO_FLUSH);
    filled += room - s.z.avail_out;
    total += room - s.z.avail_out;
    // A full output that the stream still wants to add to is too much.
    if (r == Z_OK && total == capacity) r = Z_BUF_ERROR;
    if (filled == buffer.size()) {
      take(ByteView(buffer));
      filled = 0;
    }
  }
  if (r != Z_STREAM_END) throw BadData("directory does not inflate");
  if (filled > 0) take(ByteView(buffer.data(), filled));
}

void Tr4Reader(ReaderContext& c, unsigned) {
  uint64_t at = kFirstChunk;
  for (uint32_t i = 0; at < c.fileSize; ++i) {
    const std::vector<uint8_t> head = ReadBlock(c, at, 12);
    const uint32_t unpacked = ByteView(head).u32le(0);
    const uint32_t stored = ByteView(head).u32le(4);
    const uint32_t offset = DerivedOffset(at + 8);
    std::string name = NumberedName(c.archiveFileName, i);
    if (i < kAtlases.size()) {
      const Atlas& a = kAtlases[i];
      name += a.extension;
      if (!AddTgaEntry(c, name, offset, stored, 256, unpacked / a.bytesPerRow, a.bytesPerPixel,
                       a.flag))
        throw BadData("atlas copy that cannot be listed");
      AddEntry(c, name, offset, unpacked, stored, 1);
    } else {
      AddEntry(c, name, offset, stored, stored);
    }
    at += 8 + uint64_t{stored} + (unpacked == stored && unpacked != 0 ? 4 : 0);
  }
}

void SnokReader(ReaderContext& c, unsigned) {
  const std::vector<uint8_t> head = ReadBlock(c, 264, 12);
  const uint32_t count = ByteView(head).u32le(0);
  const uint32_t at = ByteView(head).u32le(8);
  if (at > c.fileSize) throw BadData("directory past the end");
  const std::vector<uint8_t> packed = ReadBlock(c, at, c.fileSize - at);
  // The records are all there or the directory is not.
  uint32_t seen = 0;
  uint64_t offset = kSnokData;
  InflatePieces(packed, uint64_t{count} * kSnokRecord, kSnokRecord, [&](ByteView r) {
    if (r.size() < kSnokRecord) throw BadData("record cut short");
    const uint32_t stored = r.u32le(1028);
    AddEntry(c, r.field(0, 1024), DerivedOffset(offset), r.u32le(1024), stored);
    offset += stored;
    ++seen;
  });
  if (seen != count) throw BadData("directory shorter than its count");
}

}  // namespace cairn
