// The WAV writers: a RIFF/WAVE header for mono PCM in front of the stored
// samples, which follow by RawCopy.
#include "media/media.h"

namespace cairn {
namespace {

void WriteWav(ExtractionFrame& f, uint32_t rate, unsigned bits, bool withDataSize) {
  const ArchiveEntry& e = f.entry;
  if (e.Flag == 0) return RawCopy(f);
  f.Write(WavHeader(e.PackedSize, rate, bits, withDataSize));
  CopyStored(f, e.Offset, e.PackedSize);
}

}  // namespace

std::vector<uint8_t> WavHeader(uint32_t dataSize, uint32_t rate, unsigned bitsPerSample,
                               bool withDataSize) {
  const uint32_t headerSize = withDataSize ? 44 : 40;
  // The RIFF size counts everything after its own field.
  if (dataSize > UINT32_MAX - (headerSize - 8)) throw BadData("sound too long for a WAV file");
  const uint16_t blockAlign = static_cast<uint16_t>(bitsPerSample / 8);
  std::vector<uint8_t> h(headerSize, 0);
  const auto text = [&](size_t at, const char* s) {
    for (size_t i = 0; s[i] != 0; ++i) h[at + i] = static_cast<uint8_t>(s[i]);
  };
  text(0, "RIFF");
  PutU32le(h, 4, dataSize + headerSize - 8);
  text(8, "WAVEfmt ");
  PutU32le(h, 16, 16);
  PutU16le(h, 20, 1);  // PCM
  PutU16le(h, 22, 1);  // mono
  PutU32le(h, 24, rate);
  PutU32le(h, 28, rate * blockAlign);
  PutU16le(h, 32, blockAlign);
  PutU16le(h, 34, static_cast<uint16_t>(bitsPerSample));
  text(36, "data");
  if (withDataSize) PutU32le(h, 40, dataSize);
  return h;
}

// The short header leaves out the data size: the stored sound begins with
// its own.
void WavPcm16Short(ExtractionFrame& f) {
  WriteWav(f, f.entry.Extra, 16, false);
}
void WavPcm8(ExtractionFrame& f) {
  WriteWav(f, 11025, 8, true);
}
void WavPcm16(ExtractionFrame& f) {
  WriteWav(f, f.entry.Extra, 16, true);
}

}  // namespace cairn
