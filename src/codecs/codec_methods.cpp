// The extraction methods over the in-memory decoders, and the block join.
// A decoded entry is built once in memory and written with one write; the
// stored bytes are released before that.
#include <vector>

#include "codecs/codecs.h"
#include "codecs/methods.h"
#include "core/stored.h"

namespace cairn {
namespace {

using DecodeFn = std::vector<uint8_t> (*)(ByteView coded, uint32_t unpackedSize);

void DecodeEntry(ExtractionFrame& f, DecodeFn decode) {
  std::vector<uint8_t> out =
      decode(ReadStored(f, f.entry.Offset, f.entry.PackedSize), f.entry.UnpackedSize);
  f.Write(out);
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
