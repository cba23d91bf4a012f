// Writers that put a fixed start in front of the stored bytes.
#include "media/media.h"

namespace cairn {

std::vector<uint8_t> JpegStart() {
  // Start of image, then an APP0 segment of 16 bytes that begins "JFIF".
  return {0xFF, 0xD8, 0xFF, 0xE0, 0x00, 0x10, 'J', 'F', 'I', 'F'};
}

void JpegPrefix(ExtractionFrame& f) {
  // The stored picture lacks its first 10 bytes.
  f.Write(JpegStart());
  CopyStored(f, f.entry.Offset, f.entry.PackedSize);
}

void IlbmPrefix(ExtractionFrame& f) {
  // The stored file's own first 16 bytes give way to a FORM header that
  // carries the right length; only the bytes behind them count as copied.
  if (f.entry.PackedSize < 16) throw BadData("too short for an IFF picture");
  // The copy starts 16 bytes in; an offset that cannot move that far lies
  // past any archive, and must not wrap round to its start.
  if (f.entry.Offset > UINT32_MAX - 16) throw BadData("picture past the end of the archive");
  std::vector<uint8_t> start = {'F', 'O', 'R', 'M', 0,   0,   0,   0,
                                'I', 'L', 'B', 'M', 'B', 'M', 'H', 'D'};
  PutU32be(start, 4, f.entry.PackedSize - 8);
  f.WriteAt(ByteView(start), 0);
  f.reportedSize = f.entry.PackedSize - 16;
  CopyStored(f, f.entry.Offset + 16, f.entry.PackedSize - 16);
}

}  // namespace cairn
