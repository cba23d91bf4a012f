// Directories whose names depend on what the entries hold or on a type field
// of their records, some with converted copies beside the stored entries.
//
//   sheet archive (80)      count at 4, 16-byte records from 16 (offset at 0,
//       size at 8); an entry whose first 104 bytes are recognised as an image
//       list or a sheet is named with ".sht".
//   8.3 directory (88)      u16 count at 2, 22-byte records from 8: 2 spare
//       bytes, a 4-byte extension, an 8-byte base name, offset and size.
//   offset-list bank (102)  records of offset, size and 4 spare bytes from 4,
//       the list (u32 at 4) - 4 bytes long and ended by a zero offset; an
//       entry that opens with "ESF" 6 and its sound size gets a WAV copy.
//   raw picture list (104)  count at 0, 40-byte records from 84 (a 36-byte
//       name, then the offset), each entry running to the next; a ".raw"
//       entry of a known picture size gets a BMP copy.
//   indexed sound bank (126) records in the ".idx" file beside the archive,
//       36 bytes each from 12: a 16-byte name, offset, size, rate and type.
//   scrambled names (106)   the directory at the u32 at 1: a count, then
//       records of a name length, the name XORed with a running key, offset,
//       unpacked and packed size. Byte 0 is every entry's Flag.
//   tagged chunk stream (146) chunks of a tag, a length L and L bytes; the
//       tag picks a suffix and how much of the chunk is the entry.
//   name list (156)         a count at 0, length-prefixed names from 8, then
//       20-byte records (size at 8, offset at 12, entry index at 16).
#include <algorithm>
#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "detect/detect.h"
#include "media/conversion.h"
#include "media/media.h"
#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

uint32_t Fit32(uint64_t v) {
  if (v > UINT32_MAX) throw BadData("size past 4 GiB");
  return static_cast<uint32_t>(v);
}

struct ChunkKind {
  uint32_t tag;
  uint32_t second;  // the word at 8 the tag needs as well; 0: any
  std::string_view suffix;
  uint32_t skip;  // chunk bytes in front of the entry's data
};

// Every chunk runs L + 8 bytes from its tag; the entry is the chunk without
// its first `skip` bytes.
constexpr std::array<ChunkKind, 7> kChunkKinds = {{
    {0x80134000, 0, ".geo.bin", 0},
    {0xB3300000, 0, ".tpk.bin", 0},
    {0x00E34010, 0, ".o", 16},
    {0x00E34009, 0, ".o", 16},
    {0x00030210, 0, ".lzc", 12},
    {0x00030203, 0x00030210, ".lzc", 20},
    {0, 0, ".unk.bin", 0},  // any other tag
}};

const ChunkKind& KindOf(uint32_t tag, uint32_t second) {
  for (const ChunkKind& k : kChunkKinds)
    if (k.tag == tag && (k.second == 0 || k.second == second)) return k;
  return kChunkKinds.back();
}

}  // namespace

void SheetArchiveReader(ReaderContext& c, unsigned) {
  const uint32_t count = c.header.u32le(4);
  const std::vector<uint8_t> records = ReadBlock(c, 16, uint64_t{16} * count);
  const ByteView r(records);
  for (uint32_t i = 0; i < count; ++i) {
    const uint32_t offset = r.u32le(16 * uint64_t{i}), size = r.u32le(16 * uint64_t{i} + 8);
    // The embedded file is recognised by its own header and size, under the
    // archive's path.
    const std::vector<uint8_t> head = ReadBlock(c, offset, kHeaderSize);
    const FormatId id = DetectByRules(head, c.path, os::kNoFile, size);
    std::string name = NumberedName(c.archiveFileName, i);
    if (id >= 81 && id <= 84) name += ".sht";
    AddEntry(c, name, offset, size, size);
  }
}

void Dir83Reader(ReaderContext& c, unsigned) {
  const uint32_t count = c.header.u16le(2);
  const std::vector<uint8_t> records = ReadBlock(c, 8, uint64_t{22} * count);
  for (uint32_t i = 0; i < count; ++i) {
    const ByteView r = ByteView(records).sub(22 * uint64_t{i}, 22);
    // The extension ends at a zero byte, a space or a '?'.
    std::string_view ext = r.field(2, 4);
    ext = ext.substr(0, std::min(ext.find(' '), ext.find('?')));
    std::string name(r.field(6, 8));
    if (!ext.empty()) name.append(".").append(ext);
    AddEntry(c, name, r.u32le(14), r.u32le(18), r.u32le(18));
  }
}

void OffsetSoundReader(ReaderContext& c, unsigned) {
  const uint32_t listSize = c.header.u32le(4) - 4;
  const std::vector<uint8_t> list = ReadBlock(c, 4, listSize);
  // The list ends at the first zero offset, or where the list does.
  for (uint64_t at = 0; at + 12 <= list.size(); at += 12) {
    const uint32_t offset = ByteView(list).u32le(at), size = ByteView(list).u32le(at + 4);
    if (offset == 0) break;
    // Numbered by the entries listed so far, converted copies included.
    const std::string name = NumberedName(c.archiveFileName, Fit32(c.entries.size()));
    AddEntry(c, name, offset, size, size);
    // A sound is an 8-byte head ("ESF" 6 and the sample count) and samples.
    const std::vector<uint8_t> head = ReadBlock(c, offset, 8);
    if (size >= 8 && ByteView(head).u32le(0) == 0x06465345 && ByteView(head).u32le(4) == size - 8)
      AddConvertedEntry(c, kWavFolder, name, ".wav", offset + 8, uint64_t{size} + 36, size - 8, 0,
                        1);
  }
}

void RawPictureListReader(ReaderContext& c, unsigned) {
  ReadRecordDirectory(c, 84, c.header.u32le(0), {36, 4, 0, false});
  SizesFromOffsets(c);
  std::vector<ArchiveEntry> listed;
  listed.swap(c.entries);
  for (const ArchiveEntry& e : listed) {
    const std::string name = e.Name.substr(0, 32);
    AddEntry(c, name, e.Offset, e.PackedSize, e.PackedSize);
    const auto dot = FindExtension(name);
    const auto size = RawPictureSize(e.PackedSize);
    if (!dot || !EqualNoCase(std::string_view(name).substr(*dot), ".raw") || !size) continue;
    const std::string copy = (std::string(kBmpFolder) + name + ".bmp").substr(0, 36);
    AddEntry(c, copy, e.Offset, Fit32(BmpStride(size->first) * size->second + kBmpHeaderSize8),
             e.PackedSize, 1);
  }
}

void IndexedSoundBankReader(ReaderContext& c, unsigned) {
  // Without its index the bank lists nothing.
  const File index = OpenBeside(c, CompanionPath(c.path, ".idx"));
  if (!index) return;
  const uint32_t size = os::SizeLow(index.get());
  if (size < 12) throw BadData("index shorter than its header");
  std::vector<uint8_t> records(size - 12);
  if (!ReadAt(index.get(), records.data(), 12, size - 12)) throw BadData("short index");
  for (uint64_t at = 0; at + 36 <= records.size(); at += 36) {
    const ByteView r = ByteView(records).sub(at, 36);
    std::string name(r.field(0, 16));
    const uint32_t type = r.u32le(28), stored = r.u32le(20);
    uint64_t unpacked = stored;
    uint8_t flag = 0;
    if (type == 36 || type == 37) name += ".mp3";
    if (type == 6) {
      // Written with a 44-byte WAV header in front.
      name += ".wav";
      unpacked += 44;
      flag = 1;
    }
    AddEntry(c, name, r.u32le(16), Fit32(unpacked), stored, flag, r.u32le(24));
  }
}

void ScrambledNameReader(ReaderContext& c, unsigned) {
  const uint8_t flag = c.header.u8(0);
  const uint32_t at = c.header.u32le(1);
  const uint32_t count = ByteView(ReadBlock(c, at, 4)).u32le(0);
  const std::vector<uint8_t> bytes =
      ReadBlock(c, uint64_t{at} + 4, c.fileSize - (uint64_t{at} + 4));
  const ByteView d(bytes);
  NeedRoomFor(count, d.size(), 16);
  uint64_t p = 0;
  for (uint32_t i = 0; i < count; ++i) {
    const uint32_t length = d.u32le(p);
    if (length > 260) throw BadData("name too long");
    const ByteView stored = d.sub(p + 4, length);
    std::string name(length, '\0');
    for (uint32_t k = 0; k < length; ++k)
      name[k] = static_cast<char>(stored.u8(k) ^ (length % 5 + 2 * (k + length) + i));
    name.resize(std::min(name.size(), name.find('\0')));
    p += 4 + uint64_t{length};
    AddEntry(c, name, d.u32le(p), d.u32le(p + 4), d.u32le(p + 8), flag);
    p += 12;
  }
}

void ChunkStreamReader(ReaderContext& c, unsigned) {
  for (uint64_t p = 0; p < c.fileSize;) {
    const std::vector<uint8_t> head = ReadBlock(c, p, 12);
    const uint32_t tag = ByteView(head).u32le(0), length = ByteView(head).u32le(4);
    if (length == 0) {
      p += 8;
      continue;
    }
    const uint64_t next = p + length + 8;
    if (tag != 0) {
      const ChunkKind& k = KindOf(tag, ByteView(head).u32le(8));
      if (uint64_t{length} + 8 < k.skip) throw BadData("chunk shorter than its head");
      const uint32_t size = Fit32(uint64_t{length} + 8 - k.skip);
      AddEntry(c, NumberedName(c.archiveFileName, Fit32(c.entries.size())).append(k.suffix),
               DerivedOffset(p + k.skip), size, size);
    }
    p = next;
  }
}

void NameListReader(ReaderContext& c, unsigned) {
  const uint32_t count = c.header.u32le(0);
  // Each entry has at least its 2-byte name length and its 20-byte record.
  NeedRoomFor(count, c.fileSize, 22);
  std::vector<uint8_t> window;
  uint64_t start = 0, q = 8;
  for (uint32_t k = 0; k < count; ++k) {
    // Names are read through a window of 64 KiB, which always holds a whole
    // name and its length.
    if (q < start || q + 262 > start + window.size()) {
      if (q > c.fileSize) throw BadData("name past the end");
      window = ReadBlock(c, q, std::min<uint64_t>(65536, c.fileSize - q));
      start = q;
    }
    const ByteView w(window);
    const uint32_t length = w.u16le(q - start);
    if (length > 260) throw BadData("name too long");
    const ByteView stored = w.sub(q - start + 2, length);
    const std::string_view name(reinterpret_cast<const char*>(stored.data()), length);
    AddEntry(c, name.substr(0, name.find('\0')), 0, 0, 0);
    q += 2 + uint64_t{length};
  }
  const std::vector<uint8_t> records = ReadBlock(c, q, uint64_t{20} * count);
  for (uint32_t j = 0; j < count; ++j) {
    const ByteView r = ByteView(records).sub(20 * uint64_t{j}, 20);
    const uint32_t k = r.u32le(16);
    if (k >= count) throw BadData("record names no entry");
    ArchiveEntry& e = c.entries[k];
    e.Offset = r.u32le(12);
    e.UnpackedSize = e.PackedSize = r.u32le(8);
  }
}

}  // namespace cairn
