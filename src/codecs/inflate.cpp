// The inflate method. The stream is inflated piece by piece, so an entry
// never has to be held in memory whole: the input is read and the output
// written in windows of 64 KiB, and the capacity is counted as the bytes go
// by.
#include "codecs/inflate.h"

#include <zlib.h>

#include <algorithm>
#include <vector>

#include "codecs/methods.h"

namespace cairn {
namespace {

constexpr uint32_t kWindow = 65536;

struct Stream {
  z_stream z{};
  bool open = false;
  ~Stream() {
    if (open) inflateEnd(&z);
  }
};

}  // namespace

int InflateMember(ExtractionFrame& f, uint32_t offset, uint32_t packedSize, uint32_t capacity,
                  bool lengthPrefixed) {
  if (!SeekTo(f.archive, offset)) return -8;
  std::vector<uint8_t> in(std::min(packedSize, kWindow) + 1);
  std::vector<uint8_t> out(kWindow);
  Stream s;
  if (inflateInit(&s.z) != Z_OK) return Z_MEM_ERROR;
  s.open = true;

  uint64_t produced = 0;  // inflated bytes so far
  uint32_t remaining = packedSize;
  uint8_t prefix[4];
  uint64_t wanted = UINT64_MAX;  // bytes still to write after the prefix
  int r = Z_OK;
  while (r != Z_STREAM_END) {
    if (s.z.avail_in == 0) {
      if (remaining == 0) return Z_BUF_ERROR;  // the stream stops short
      const uint32_t n = std::min<uint32_t>(remaining, kWindow);
      if (!ReadExact(f.archive, in.data(), n)) return -8;
      remaining -= n;
      s.z.next_in = in.data();
      s.z.avail_in = n;
    }
    s.z.next_out = out.data();
    s.z.avail_out = kWindow;
    r = inflate(&s.z, Z_NO_FLUSH);
    if (r == Z_NEED_DICT) return Z_DATA_ERROR;
    if (r != Z_OK && r != Z_STREAM_END && r != Z_BUF_ERROR) return r;
    const uint32_t got = kWindow - s.z.avail_out;
    if (produced + got > capacity) return Z_BUF_ERROR;
    uint32_t skip = 0;
    if (lengthPrefixed) {
      // The first four inflated bytes are the length of what follows.
      for (; skip < got && produced + skip < 4; ++skip) prefix[produced + skip] = out[skip];
      if (produced < 4 && produced + got >= 4) wanted = ByteView(prefix, 4).u32le(0);
    }
    produced += got;
    const uint64_t n = std::min<uint64_t>(got - skip, wanted);
    if (n > 0) f.Write(ByteView(out.data() + skip, static_cast<size_t>(n)));
    if (lengthPrefixed) wanted -= std::min(wanted, n);
    if (r == Z_BUF_ERROR && got == 0 && s.z.avail_in != 0) return Z_DATA_ERROR;
  }
  return Z_OK;
}

namespace {

void InflateOrFail(ExtractionFrame& f, uint32_t capacity, bool lengthPrefixed) {
  if (InflateMember(f, f.entry.Offset, f.entry.PackedSize, capacity, lengthPrefixed) != 0)
    throw BadData("inflate failed");
}

}  // namespace

void Inflate(ExtractionFrame& f) {
  InflateOrFail(f, f.entry.UnpackedSize, false);
}

void RawOrInflate(ExtractionFrame& f) {
  if (f.entry.Flag == 0)
    RawCopy(f);
  else
    Inflate(f);
}

void RawOrInflate4M(ExtractionFrame& f) {
  if (f.entry.Flag == 0)
    RawCopy(f);
  else
    InflateOrFail(f, 4194304, false);
}

void InflateJpegContainer(ExtractionFrame& f) {
  if (f.entry.Flag == 0)
    Inflate(f);
  else
    InflateOrFail(f, f.entry.Extra, true);
}

}  // namespace cairn
