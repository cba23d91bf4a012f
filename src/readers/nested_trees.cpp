// Directories that are trees of folders. Entries are named by their folder
// path, the folder names joined with '\' (a folder with an empty name adds
// nothing), and listed depth first in the order the tree gives them.
//
// - "_ARCHIVE" archive (FormatId 53): the block at 176 gives the size X of
//   the directory area, the first X bytes of the file, and the places in it
//   of the folder table (12-byte records: name, first and end child folder,
//   first and end file), the file table (20-byte records: name, 4 unused
//   bytes, offset from the end of the area, stored size, unpacked size) and
//   the name block, each as its position minus 180. A folder whose child
//   range lies inside the table holds folders; any other holds the files of
//   its file range. Entries whose sizes differ are compressed (Flag 1).
// - "RezMgr" archive (54): the root folder block's position and size at 131
//   and 135. A block is a run of records: a kind (0 file, else folder), a
//   position and a size, 4 unused bytes, then a folder's zero-terminated name,
//   or a file's type, 4 unused bytes, its name and one more byte. A file's
//   name ends in its type, read back to front. The first 127 bytes are listed
//   as "_description_".
// - Item-stream tree archive (58): the tree at the position given at 60 runs
//   to the end of the file, one depth-first stream of items from the root: a
//   kind (1 folder), 4 unused bytes, a name length and the name; a folder
//   then holds its child count, a file its masked offset and size and 4
//   unused bytes. Every file carries the byte its data is masked with.
#include <algorithm>
#include <string>
#include <string_view>
#include <vector>

#include "readers/readers.h"

namespace cairn {
namespace {

// Real trees are far shallower; the bound keeps the walks small whatever the
// folder records point at.
constexpr size_t kMaxTreeDepth = 64;

// The folder path of a folder named `name` inside `path`.
std::string FolderPath(std::string path, std::string_view name) {
  if (name.empty()) return path;
  path.append(name).push_back('\\');
  if (path.size() > kMaxNameLength) throw BadData("folder path too long");
  return path;
}

constexpr uint32_t kTableBase = 180;
constexpr uint32_t kFolderRecord = 12;
constexpr uint32_t kFileRecord = 20;

struct FolderTables {
  ReaderContext& c;
  uint32_t areaSize;
  ByteView folders, files, names;
  uint32_t folderCount, fileCount;
  // A tree reaches each folder and each file once.
  std::vector<bool> folderSeen, fileSeen;
};

std::string_view TableName(const FolderTables& t, ByteView record) {
  return t.names.cstr(record.u32le(0), kMaxNameLength + 1);
}

void WalkTableFolder(FolderTables& t, uint32_t folder, const std::string& parent, size_t depth) {
  if (depth == kMaxTreeDepth) throw BadData("folders nested too deep");
  if (t.folderSeen[folder]) throw BadData("folder reached twice");
  t.folderSeen[folder] = true;
  const ByteView f = t.folders.sub(uint64_t{folder} * kFolderRecord, kFolderRecord);
  const std::string path = FolderPath(parent, TableName(t, f));
  const uint32_t first = f.u16le(4), end = f.u16le(6);
  if (first < t.folderCount && end < t.folderCount) {
    for (uint32_t child = first; child < end; ++child) WalkTableFolder(t, child, path, depth + 1);
    return;
  }
  const uint32_t firstFile = f.u16le(8), endFile = f.u16le(10);
  for (uint32_t i = firstFile; i < endFile; ++i) {
    if (i >= t.fileCount) throw BadData("file outside its table");
    if (t.fileSeen[i]) throw BadData("file listed twice");
    t.fileSeen[i] = true;
    const ByteView r = t.files.sub(uint64_t{i} * kFileRecord, kFileRecord);
    const uint32_t packed = r.u32le(12), unpacked = r.u32le(16);
    AddEntry(t.c, path + std::string(TableName(t, r)),
             DerivedOffset(uint64_t{t.areaSize} + r.u32le(8)), unpacked, packed,
             unpacked != packed ? 1 : 0);
  }
}

constexpr uint32_t kRezRoot = 131;
constexpr uint32_t kRezDescription = 127;
constexpr uint32_t kRezSmallestRecord = 17;

struct RezWalk {
  ReaderContext& c;
  uint64_t recordsLeft;          // no more records than the file can hold
  std::vector<uint32_t> blocks;  // positions of the blocks being walked, root first
};

// The type of a file appended to its name: its four bytes back to front, the
// first of them a '.' when the second is not zero, up to the first zero.
void AppendType(std::string& name, ByteView type) {
  char suffix[4];
  for (int i = 0; i < 4; ++i) suffix[i] = static_cast<char>(type.u8(3 - i));
  if (suffix[1] != 0) suffix[0] = '.';
  for (char ch : suffix) {
    if (ch == 0) break;
    name.push_back(ch);
  }
}

void WalkRezBlock(RezWalk& w, uint32_t position, uint32_t size, const std::string& path) {
  if (std::find(w.blocks.begin(), w.blocks.end(), position) != w.blocks.end())
    throw BadData("folder block leads back into itself");
  if (w.blocks.size() == kMaxTreeDepth) throw BadData("folders nested too deep");
  w.blocks.push_back(position);
  const std::vector<uint8_t> bytes = ReadBlock(w.c, position, size);
  const ByteView block(bytes);
  for (uint64_t at = 0; at < size;) {
    if (w.recordsLeft-- == 0) throw BadData("more records than the file holds");
    const bool folder = block.u32le(at) != 0;
    const std::string_view name = block.cstr(at + (folder ? 16 : 28), kMaxNameLength + 1);
    if (folder) {
      WalkRezBlock(w, block.u32le(at + 4), block.u32le(at + 8), FolderPath(path, name));
      at += 17 + name.size();
      continue;
    }
    std::string full = path + std::string(name);
    AppendType(full, block.sub(at + 20, 4));
    const uint32_t length = block.u32le(at + 8);
    AddEntry(w.c, full, block.u32le(at + 4), length, length);
    at += 30 + name.size();
  }
  w.blocks.pop_back();
}

constexpr uint32_t kItemTreeAt = 60;
constexpr uint32_t kOffsetMask = 0x6D2E91C4;
constexpr uint32_t kSizeMask = 0x47B20E5A;
constexpr uint8_t kDataKey = 0xD3;

// Walks `count` items from `at` and answers where the stream goes on. Every
// item takes at least 13 bytes of the tree, so no count runs past its end.
uint64_t WalkItems(ReaderContext& c, ByteView tree, uint64_t at, uint32_t count,
                   const std::string& path, size_t depth) {
  if (depth == kMaxTreeDepth) throw BadData("folders nested too deep");
  for (; count > 0; --count) {
    const bool folder = tree.u8(at) == 1;
    const uint32_t length = tree.u32le(at + 5);
    if (length > kMaxNameLength) throw BadData("name too long");
    const std::string_view name = tree.field(at + 9, length);
    const uint64_t after = at + 9 + length;
    if (folder) {
      at = WalkItems(c, tree, after + 4, tree.u32le(after), FolderPath(path, name), depth + 1);
      continue;
    }
    const uint32_t size = tree.u32le(after + 8) ^ kSizeMask;
    AddEntry(c, path + std::string(name), tree.u32le(after + 4) ^ kOffsetMask, size, size,
             kDataKey);
    at = after + 16;
  }
  return at;
}

}  // namespace

void FolderTableReader(ReaderContext& c, unsigned) {
  const std::vector<uint8_t> blockBytes = ReadBlock(c, 176, 26);
  const ByteView block(blockBytes);
  const uint32_t areaSize = block.u32le(0);
  const std::vector<uint8_t> areaBytes = ReadBlock(c, 0, areaSize);
  const ByteView area(areaBytes);
  const uint32_t folderCount = block.u16le(14), fileCount = block.u16le(20);
  const auto table = [&](uint64_t at, uint64_t length) {
    return area.sub(at + kTableBase, length);
  };
  FolderTables t{c,
                 areaSize,
                 table(block.u32le(10), uint64_t{folderCount} * kFolderRecord),
                 table(block.u32le(16), uint64_t{fileCount} * kFileRecord),
                 area.from(uint64_t{block.u32le(22)} + kTableBase),
                 folderCount,
                 fileCount,
                 std::vector<bool>(folderCount),
                 std::vector<bool>(fileCount)};
  // An archive without folders holds nothing.
  if (folderCount > 0) WalkTableFolder(t, 0, "", 0);
}

void RezMgrReader(ReaderContext& c, unsigned) {
  const std::vector<uint8_t> rootBytes = ReadBlock(c, kRezRoot, 8);
  const ByteView root(rootBytes);
  AddEntry(c, "_description_", 0, kRezDescription, kRezDescription);
  RezWalk w{c, c.fileSize / kRezSmallestRecord, {}};
  WalkRezBlock(w, root.u32le(0), root.u32le(4), "");
}

void ItemTreeReader(ReaderContext& c, unsigned) {
  const uint32_t at = c.header.u32le(kItemTreeAt);
  if (at > c.fileSize) throw BadData("tree past the end");
  const std::vector<uint8_t> tree = ReadBlock(c, at, c.fileSize - at);
  WalkItems(c, tree, 0, 1, "", 0);
}

}  // namespace cairn
