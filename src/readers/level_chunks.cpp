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
//   file. Inflated it holds 1040-byte records: a zero-terminated name in 1024
//   bytes, the unpacked size, the stored size. The data lies back to back
//   from 276 in record order.
#include <zlib.h>

#include <algorithm>
#include <array>
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

std::vector<uint8_t> InflateDirectory(ByteView stream, uint64_t capacity) {
  // The output grows with what the stream gives, so a count that promises
  // more than the stream holds allocates nothing for it.
  constexpr size_t kStep = 65536;
  std::vector<uint8_t> out;
  z_stream z{};
  if (inflateInit(&z) != Z_OK) throw BadData("inflate failed to start");
  z.next_in = const_cast<Bytef*>(stream.data());
  z.avail_in = static_cast<uInt>(stream.size());
  Bytef none = 0;  // zlib wants somewhere to write even when there is no room
  int r = Z_OK;
  while (r == Z_OK) {
    const size_t done = out.size();
    const size_t room = static_cast<size_t>(std::min<uint64_t>(kStep, capacity - done));
    out.resize(done + room);
    z.next_out = room == 0 ? &none : out.data() + done;
    z.avail_out = static_cast<uInt>(room);
    r = inflate(&z, Z_NO_FLUSH);
    out.resize(done + room - z.avail_out);
    // A full output that the stream still wants to add to is too much.
    if (r == Z_OK && out.size() == capacity) r = Z_BUF_ERROR;
  }
  inflateEnd(&z);
  if (r != Z_STREAM_END) throw BadData("directory does not inflate");
  return out;
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
      // A copy whose name or size would not fit is left out.
      AddTgaEntry(c, name, offset, stored, 256, unpacked / a.bytesPerRow, a.bytesPerPixel, a.flag);
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
  const uint64_t size = uint64_t{count} * kSnokRecord;
  const std::vector<uint8_t> inflated = InflateDirectory(packed, size);
  // The records are all there or the directory is not.
  if (inflated.size() != size) throw BadData("directory shorter than its count");
  const ByteView records(inflated);
  uint64_t offset = kSnokData;
  for (uint32_t i = 0; i < count; ++i) {
    const ByteView r = records.sub(uint64_t{i} * kSnokRecord, kSnokRecord);
    const uint32_t stored = r.u32le(1028);
    AddEntry(c, r.field(0, 1024), DerivedOffset(offset), r.u32le(1024), stored);
    offset += stored;
  }
}

}  // namespace cairn
