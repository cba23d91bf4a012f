// Directories shaped beyond a flat list.
//
// - "DATOS" archive (FormatId 21): a tree of lists of 44-byte records (name
//   of 32 bytes, kind, size, offset), the root list at offset 0. A folder
//   record points at the folder's own list; an end record closes a list.
//   Entries are named by their folder path.
// - Typed resource archive (25): a table of types (four-character tag and
//   entry count) at 64, then the 12-byte entry records (identifier, offset,
//   size) of every type in type order. Entries are named after the archive
//   file and their index within the type, with the type's tag as extension.
// - "GSCfmt" archive (26): a key byte at 9, a count at 10 and 81-byte records
//   from 14 (name of 64 bytes, inverted offset, size, enciphered mark). An
//   enciphered entry carries the key in its Flag; the raw copy XORs it away.

#include <algorithm>
#include <string>
#include <vector>

#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

constexpr uint32_t kFolderRecord = 44;
constexpr uint32_t kFolderKind = 0xCDCDCD01;
constexpr uint32_t kEndKind = 0xCDCDCDFF;
// Real trees are far shallower; the bound keeps the walk small whatever the
// folder records point at.
constexpr size_t kMaxFolderDepth = 64;

struct FolderWalk {
  ReaderContext& c;
  // Records of a sound tree never overlap, so no more than this many fit.
  uint64_t recordsLeft;
  std::vector<uint32_t> lists;  // positions of the lists being walked, root first
};

void WalkFolderList(FolderWalk& w, uint32_t list, const std::string& path) {
  if (std::find(w.lists.begin(), w.lists.end(), list) != w.lists.end())
    throw BadData("folder list leads back into itself");
  if (w.lists.size() == kMaxFolderDepth) throw BadData("folders nested too deep");
  w.lists.push_back(list);
  for (uint64_t at = list;; at += kFolderRecord) {
    if (w.recordsLeft-- == 0) throw BadData("more records than the file holds");
    const std::vector<uint8_t> bytes = ReadBlock(w.c, at, kFolderRecord);
    const ByteView record(bytes);
    const uint32_t kind = record.u32le(32);
    if (kind == kEndKind) break;
    std::string name = path;
    if (!name.empty()) name += '\\';
    name += record.field(0, 32);
    if (kind == kFolderKind) {
      if (name.size() > kMaxNameLength) throw BadData("folder path too long");
      WalkFolderList(w, record.u32le(40), name);
    } else {
      const uint32_t size = record.u32le(36);
      AddEntry(w.c, name, record.u32le(40), size, size);
    }
  }
  w.lists.pop_back();
}

}  // namespace

void FolderTreeReader(ReaderContext& c, unsigned) {
  FolderWalk w{c, c.fileSize / kFolderRecord, {}};
  WalkFolderList(w, 0, "");
}

void TypedTableReader(ReaderContext& c, unsigned) {
  const uint32_t typeCount = c.header.u32le(56);
  const std::vector<uint8_t> typeBlock = ReadBlock(c, 64, uint64_t{typeCount} * 12);
  const ByteView types(typeBlock);
  uint64_t count = 0;
  for (uint32_t t = 0; t < typeCount; ++t) {
    count += types.u32le(uint64_t{t} * 12 + 8);
    if (count > c.fileSize / 12) throw BadData("more entries than the file holds");
  }
  // The records are plain fixed records (a 4-byte name that is not used, the
  // offset, the size); the names come from the types.
  const size_t first = c.entries.size();
  ReadRecordDirectory(c, 64 + uint64_t{typeCount} * 12, static_cast<uint32_t>(count),
                      {4, 4, 4, false});
  size_t e = first;
  for (uint32_t t = 0; t < typeCount; ++t) {
    // The tag is stored back to front after one byte of padding: " pmb" is
    // ".bmp". Like any name, the extension ends at a zero byte.
    const ByteView tag = types.sub(uint64_t{t} * 12, 4);
    std::string extension = ".";
    for (int i = 3; i >= 1 && tag.u8(i) != 0; --i) extension += static_cast<char>(tag.u8(i));
    const uint32_t n = types.u32le(uint64_t{t} * 12 + 8);
    for (uint32_t i = 0; i < n; ++i, ++e) {
      std::string name = NumberedName(c.archiveFileName, i) + extension;
      if (name.size() > kMaxNameLength) throw BadData("name too long");
      c.entries[e].Name = std::move(name);
    }
  }
}

void KeyedRecordReader(ReaderContext& c, unsigned) {
  const uint8_t key = c.header.u8(9);
  const uint32_t count = c.header.u32le(10);
  const std::vector<uint8_t> block = ReadBlock(c, 14, uint64_t{count} * 81);
  const ByteView records(block);
  c.entries.reserve(count);
  for (uint32_t i = 0; i < count; ++i) {
    const ByteView r = records.sub(uint64_t{i} * 81, 81);
    const uint32_t size = r.u32le(72);
    AddEntry(c, r.field(4, 64), ~r.u32le(68), size, size, r.u8(80) != 0 ? key : 0);
  }
}

}  // namespace cairn
