// The extraction methods over the in-memory decoders, and the block join.
// A decoded entry is built once in memory and written with one write; the
// stored bytes are released before that.
#include <algorithm>
#include <vector>

#include "codecs/codecs.h"
#include "codecs/methods.h"
#include "core/stored.h"

namespace cairn {
namespace {

using DecodeFn = std::vector<uint8_t> (*)(ByteView coded, uint32_t unpackedSize);

// The output is UnpackedSize bytes even where the coded bytes cannot produce
// that many: the rest is zeros, written a chunk at a time rather than from a
// buffer of the size the directory claims. Each chunk asks the host whether
// to go on (a report of no bytes: the figure stays PackedSize).
void DecodeEntry(ExtractionFrame& f, DecodeFn decode) {
  const std::vector<uint8_t> out =
      decode(ReadStored(f, f.entry.Offset, f.entry.PackedSize), f.entry.UnpackedSize);
  f.Write(out);
  const std::vector<uint8_t> zeros(std::min<size_t>(f.entry.UnpackedSize - out.size(), 1048576));
  for (size_t left = f.entry.UnpackedSize - out.size(); left > 0;) {
    const size_t n = std::min(left, zeros.size());
    f.Write(ByteView(zeros.data(), n));
    f.Report(0);
    left -= n;
  }
}

}  // namespace

void RleMethod(ExtractionFrame& f) {
  DecodeEntry(f, RleDecode);
}
void JdlzMethod(ExtractionFrame& f) {
  DecodeEntry(f, JdlzDecode);
}
void OpcodeLzMethod(ExtractionFrame& f) {
  DecodeEntry(f, OpcodeLzDecode);
}

void BlockJoin(ExtractionFrame& f) {
  // Every block counts at least 1 towards PackedSize, so the walk ends.
  std::vector<uint8_t> block(65535);
  uint64_t position = f.entry.Offset;
  for (uint64_t done = 0; done < f.entry.PackedSize;) {
    uint8_t head[4];
    if (position > UINT32_MAX || !ReadAt(f.archive, head, static_cast<uint32_t>(position), 4))
      throw BadData("block header past the archive");
    const uint16_t length = ByteView(head, sizeof head).u16le(0);
    if (length == 0) throw BadData("block of length 0");
    const uint32_t n = length - 1u;
    position += 5;
    if (position > UINT32_MAX ||
        !ReadAt(f.archive, block.data(), static_cast<uint32_t>(position), n))
      throw BadData("block data past the archive");
    f.Write(ByteView(block.data(), n));
    position += n;
    done += length;
  }
}

}  // namespace cairn
