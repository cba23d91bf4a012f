#include "core/extract.h"

#include <algorithm>
#include <array>
#include <exception>
#include <vector>

namespace cairn {
namespace {

constexpr uint32_t kChunk = 1048576;

// The sound banks are enciphered byte by byte with this key, by file position
// modulo 16.
constexpr std::array<uint8_t, 16> kPositionKey = {0xEA, 0x3A, 0xC4, 0xA1, 0x9A, 0xA8, 0x14, 0xF3,
                                                  0x48, 0xB0, 0xD7, 0x23, 0x9D, 0xE8, 0xFF, 0xF1};

// A catalogue track of the station bank is three other entries joined; this
// table gives the first of them for each Flag from 2 up.
constexpr std::array<uint8_t, 160> kCompositePartTable = {
    61,  68,  75,  82,  89,  96,  103, 110, 117, 124, 131, 138, 145, 152, 159, 166, 173, 40,
    47,  54,  61,  68,  75,  82,  89,  96,  103, 110, 117, 124, 44,  51,  58,  65,  72,  78,
    85,  92,  95,  101, 108, 115, 122, 129, 136, 143, 150, 53,  60,  67,  74,  81,  88,  95,
    102, 109, 116, 123, 130, 136, 141, 150, 156, 51,  58,  65,  72,  79,  86,  93,  100, 107,
    114, 121, 128, 135, 142, 149, 56,  63,  70,  77,  84,  91,  98,  104, 111, 118, 125, 132,
    137, 140, 146, 153, 159, 164, 47,  54,  61,  68,  75,  82,  89,  96,  103, 110, 117, 124,
    51,  58,  65,  72,  79,  86,  92,  98,  104, 109, 116, 123, 130, 135, 142, 148, 47,  54,
    61,  68,  75,  82,  89,  96,  103, 110, 117, 124, 131, 138, 145, 36,  41,  46,  51,  56,
    61,  66,  71,  76,  81,  86,  91,  96,  101, 106, 111, 0,   0,   0,   0,   0};

enum class Transform { None, Xor, PositionKey };

Transform TransformOf(FormatId format, uint8_t flag) {
  switch (format) {
    case 26:
      return flag != 0 ? Transform::Xor : Transform::None;
    case 58:
    case 101:
      return Transform::Xor;
    case 65:
    case 66:
      return flag == 1 ? Transform::PositionKey : Transform::None;
    default:
      return Transform::None;
  }
}

// Copies `size` bytes from `offset`, each chunk transformed; `position` is the
// archive position of the first byte, which the position key follows.
void CopyChunks(ExtractionFrame& f, uint32_t offset, uint32_t size, Transform t, uint8_t key) {
  if (!SeekTo(f.archive, offset)) throw BadData("seek failed");
  std::vector<uint8_t> buffer(std::max<uint32_t>(512, std::min(size, kChunk) + 16));
  for (uint32_t done = 0; done < size;) {
    const uint32_t chunk = std::min(size - done, kChunk);
    if (!ReadExact(f.archive, buffer.data(), chunk)) throw BadData("archive ends early");
    if (t == Transform::Xor) {
      for (uint32_t i = 0; i < chunk; ++i) buffer[i] ^= key;
    } else if (t == Transform::PositionKey) {
      // The key words overlap, so the word-wise XOR of each aligned group of
      // four is the same as a byte-wise XOR by position.
      const uint32_t base = offset + done;
      for (uint32_t i = 0; i < chunk; ++i) buffer[i] ^= kPositionKey[(base + i) & 15];
    }
    f.Write(ByteView(buffer.data(), chunk));
    f.Report(chunk);
    done += chunk;
  }
}

void CopyComposite(ExtractionFrame& f) {
  const std::array<int, 3> parts = CompositeParts(f.entry.Flag);
  if (parts[0] < 0) throw BadData("no such track");
  for (int index : parts) {
    // A part is a plain item of the bank, never another track.
    if (index < 0 || static_cast<size_t>(index) >= f.session.entries.size() ||
        f.session.entries[static_cast<size_t>(index)].Flag != 1)
      throw BadData("track part outside the items");
    const ArchiveEntry& part = f.session.entries[static_cast<size_t>(index)];
    CopyChunks(f, part.Offset, part.PackedSize, Transform::PositionKey, 0);
  }
}

void ReadOutputAt(ExtractionFrame& f, uint8_t* buffer, uint32_t position, uint32_t count) {
  if (!ReadAt(f.output, buffer, position, count)) throw BadData("output ends early");
}

// The entry is a ZIP archive whose local and central header signatures were
// replaced by "F5CD" and "F512"; put "PK" back.
void RestoreScrambledZip(ExtractionFrame& f) {
  const uint64_t end = static_cast<uint32_t>(f.entry.PackedSize - 22);
  uint64_t position = 0;
  uint8_t h[46];
  while (position < end) {
    ReadOutputAt(f, h, static_cast<uint32_t>(position), sizeof h);
    const ByteView v(h, sizeof h);
    uint64_t next;
    if (v.matches(0, "F5CD")) {
      next = position + 30 + v.u32le(18) + v.u16le(26) + v.u16le(28);
      f.WriteAt(ByteView(reinterpret_cast<const uint8_t*>("PK\3\4"), 4),
                static_cast<uint32_t>(position));
    } else if (v.matches(0, "F512")) {
      // A central header ends after its name, extra field and comment.
      next = position + 46 + v.u16le(28) + v.u16le(30) + v.u16le(32);
      f.WriteAt(ByteView(reinterpret_cast<const uint8_t*>("PK\1\2"), 4),
                static_cast<uint32_t>(position));
    } else {
      throw BadData("unexpected ZIP signature");
    }
    position = next;
  }
  // The headers must chain up to the end record exactly; a walk that steps
  // past it would put the end signature in the wrong place.
  if (position != end) throw BadData("ZIP headers do not reach the end record");
  f.WriteAt(ByteView(reinterpret_cast<const uint8_t*>("PK\5\6"), 4),
            static_cast<uint32_t>(position));
}

// The entry is a ZIP archive that begins with "IPF1" and whose central
// directory lost its signatures and names; both are rebuilt from the local
// headers.
void RestoreStrippedZip(ExtractionFrame& f) {
  f.WriteAt(ByteView(reinterpret_cast<const uint8_t*>("PK\3\4"), 4), 0);
  // The entry count and the central directory's offset, 8 bytes apart in
  // the end record.
  uint8_t tail[12];
  if (!ReadAt(f.archive, tail, f.entry.PackedSize - 14, sizeof tail))
    throw BadData("no end record");
  const uint16_t count = ByteView(tail, sizeof tail).u16le(0);
  uint64_t central = ByteView(tail, sizeof tail).u32le(8);
  uint64_t local = 18;
  for (uint32_t i = 0; i < count; ++i) {
    uint8_t fixed[12];
    if (local > UINT32_MAX || !ReadAt(f.archive, fixed, static_cast<uint32_t>(local), 12))
      throw BadData("local header past the end");
    const ByteView v(fixed, sizeof fixed);
    const uint16_t nameLength = v.u16le(8);
    if (nameLength > 260) throw BadData("ZIP name too long");
    uint8_t name[260];
    if (!ReadExact(f.archive, name, nameLength)) throw BadData("ZIP name past the end");
    // The rebuilt headers belong inside the entry, not behind it.
    if (central + 46 + nameLength > f.entry.PackedSize)
      throw BadData("central directory past the end");
    f.WriteAt(ByteView(reinterpret_cast<const uint8_t*>("PK\1\2"), 4),
              static_cast<uint32_t>(central));
    central += 46;
    f.WriteAt(ByteView(name, nameLength), static_cast<uint32_t>(central));
    central += nameLength;
    local += 30 + uint64_t{v.u32le(0)} + nameLength + v.u16le(10);
  }
}

}  // namespace

const uint32_t kPositionKeyTable[16] = {
#define CAIRN_KEY_WORD(k)                                       \
  (kPositionKey[(k) % 16] | kPositionKey[((k) + 1) % 16] << 8 | \
   kPositionKey[((k) + 2) % 16] << 16 | static_cast<uint32_t>(kPositionKey[((k) + 3) % 16]) << 24)
    CAIRN_KEY_WORD(0),  CAIRN_KEY_WORD(1),  CAIRN_KEY_WORD(2),  CAIRN_KEY_WORD(3),
    CAIRN_KEY_WORD(4),  CAIRN_KEY_WORD(5),  CAIRN_KEY_WORD(6),  CAIRN_KEY_WORD(7),
    CAIRN_KEY_WORD(8),  CAIRN_KEY_WORD(9),  CAIRN_KEY_WORD(10), CAIRN_KEY_WORD(11),
    CAIRN_KEY_WORD(12), CAIRN_KEY_WORD(13), CAIRN_KEY_WORD(14), CAIRN_KEY_WORD(15),
#undef CAIRN_KEY_WORD
};

std::array<int, 3> CompositeParts(uint8_t flag) {
  if (flag < 2 || flag - 2u >= kCompositePartTable.size()) return {-1, -1, -1};
  const int first = kCompositePartTable[flag - 2];
  const int second = first + (flag == 62 ? 1 : -1);
  const int third = second + (flag == 39 || flag == 92 || flag == 140 ? 2 : 4);
  return {first, second, third};
}

bool IsArchiveFile(const ArchiveSession& s, const std::string& path) {
  os::FileId id;
  if (!os::IdentifyPath(path.c_str(), id)) return false;
  return std::find(s.sources.begin(), s.sources.end(), id) != s.sources.end();
}

void ExtractionFrame::Report(uint32_t bytes) const {
  if (session.progress && session.progress(destName, bytes) == 0) throw Aborted{};
}

void ExtractionFrame::Write(ByteView bytes) const {
  if (bytes.size() > UINT32_MAX) throw BadData("output too large");
  if (!WriteExact(output, bytes.data(), static_cast<uint32_t>(bytes.size())))
    throw WriteFailed{os::LastError()};
}

void ExtractionFrame::WriteAt(ByteView bytes, uint32_t position) const {
  if (!SeekTo(output, position)) throw BadData("output position out of reach");
  Write(bytes);
}

void CopyStored(ExtractionFrame& f, uint32_t offset, uint32_t size) {
  CopyChunks(f, offset, size, TransformOf(f.session.format, f.entry.Flag), f.entry.Flag);
}

void RawCopy(ExtractionFrame& f) {
  if (f.session.format == 65 && f.entry.Flag >= 2)
    CopyComposite(f);
  else
    CopyStored(f, f.entry.Offset, f.entry.PackedSize);
  if (f.session.format == 32) RestoreScrambledZip(f);
  if (f.session.format == 33) RestoreStrippedZip(f);
}

}  // namespace cairn
