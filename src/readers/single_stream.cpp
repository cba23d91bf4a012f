// Files that are one compressed or wrapped stream behind a small header,
// listed as one entry ("Nemo Fi": two) named after the archive file, so that
// the host can take out the decoded content. Header words are little-endian;
// F is the file size.
//
//   "PACK"     14-byte header, unpacked size at 6, run-length stream to the
//              end of the file; listed as the base name + ".unk".
//   "Nemo Fi"  64-byte header, then part 0 (stored size at 28, unpacked size
//              at 60) and part 1 right after it (stored size at 32, unpacked
//              size at 36); a nonzero word at 24 marks both as zlib streams.
//              Listed as the full file name + "0" and + "1".
//   "l33t"     unpacked size at 4, zlib stream from 8 to the end of the
//              file; listed as the base name.
//   "AVIX"     24-byte header and the pixels to the end of the file, offered
//              directly as a TGA picture: width at 4, height the product of
//              the words at 8 and 16, bits per pixel the byte at 12.
//   "JDLZ"     unpacked size at 8, stored size with the header at 12, the
//              coded stream from 16; listed as the base name.
//
// The base name is the archive's file name without its extension, or the
// whole file name when that leaves nothing.
#include <array>
#include <cstdint>
#include <string>

#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

constexpr int kNone = -1;

// A value taken from the header: the word at `at` (none: 0), plus the file
// size when asked, plus a constant; 32-bit arithmetic, so values wrap.
struct HeaderValue {
  int at;
  bool plusFileSize;
  int32_t add;
};

enum class StreamName { Base, Full };

struct StreamPart {
  StreamName name;
  const char* suffix;
  HeaderValue offset, unpacked, packed;
};

enum class StreamMark {
  None,
  CompressedIfNonZero24,  // Flag 1 when the word at 24 is not 0
  PictureHeader,          // Flag the byte at 12; Extra the picture size
};

struct StreamLayout {
  std::array<StreamPart, 2> parts;
  unsigned partCount;
  StreamMark mark;
};

constexpr HeaderValue Const(int32_t v) {
  return {kNone, false, v};
}
constexpr HeaderValue Word(int at, int32_t add = 0) {
  return {at, false, add};
}
constexpr HeaderValue FileSize(int32_t add) {
  return {kNone, true, add};
}

constexpr std::array<StreamLayout, 5> kStreamLayouts = {{
    // "PACK" compressed file
    {{{{StreamName::Base, ".unk", Const(14), Word(6), FileSize(-14)}}}, 1, StreamMark::None},
    // "Nemo Fi" two-part file
    {{{{StreamName::Full, "0", Const(64), Word(60), Word(28)},
       {StreamName::Full, "1", Word(28, 64), Word(36), Word(32)}}},
     2,
     StreamMark::CompressedIfNonZero24},
    // "l33t" compressed file
    {{{{StreamName::Base, "", Const(8), Word(4), FileSize(-8)}}}, 1, StreamMark::None},
    // "AVIX" picture file
    {{{{StreamName::Base, ".tga", Const(24), FileSize(-6), FileSize(-24)}}},
     1,
     StreamMark::PictureHeader},
    // "JDLZ" compressed file
    {{{{StreamName::Base, "", Const(16), Word(8), Word(12, -16)}}}, 1, StreamMark::None},
}};

uint32_t Evaluate(const ReaderContext& c, HeaderValue v) {
  uint32_t value = v.at == kNone ? 0 : c.header.u32le(static_cast<uint64_t>(v.at));
  if (v.plusFileSize) value += c.fileSize;
  return value + static_cast<uint32_t>(v.add);
}

}  // namespace

void SingleStreamReader(ReaderContext& c, unsigned row) {
  const StreamLayout& l = kStreamLayouts.at(row);
  std::string_view base = StripExtension(c.archiveFileName);
  if (base.empty()) base = c.archiveFileName;
  uint8_t flag = 0;
  uint32_t extra = 0;
  if (l.mark == StreamMark::CompressedIfNonZero24) {
    flag = c.header.u32le(24) != 0 ? 1 : 0;
  } else if (l.mark == StreamMark::PictureHeader) {
    flag = c.header.u8(12);
    extra = c.header.u32le(4) + c.header.u32le(8) * c.header.u32le(16) * 65536;
  }
  for (unsigned i = 0; i < l.partCount; ++i) {
    const StreamPart& p = l.parts[i];
    std::string name(p.name == StreamName::Base ? base : c.archiveFileName);
    name += p.suffix;
    AddEntry(c, name, Evaluate(c, p.offset), Evaluate(c, p.unpacked), Evaluate(c, p.packed), flag,
             extra);
  }
}

}  // namespace cairn
