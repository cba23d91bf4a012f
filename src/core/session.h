// The state of one open archive: its entry table, its time stamps and the
// host's progress callback; and what a directory reader is given to fill it.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "util/bytes.h"
#include "util/file.h"
#include "util/platform.h"

namespace cairn {

using FormatId = uint32_t;

// Result codes of the host interface.
enum ResultCode : int {
  kOk = 0,
  kEndArchive = 10,
  kBadData = 12,
  kUnknownFormat = 14,
  kOpenFailed = 15,
  kCreateFailed = 16,
  kReadFailed = 18,
  kWriteFailed = 19,
  kAborted = 21,
};

inline constexpr uint32_t kHeaderSize = 104;
inline constexpr size_t kMaxNameLength = 259;

struct ArchiveEntry {
  std::string Name;  // '\' between path parts, at most 259 characters
  uint32_t Offset = 0;
  uint32_t UnpackedSize = 0;
  uint32_t PackedSize = 0;
  uint32_t Extra = 0;  // pictures: width | height << 16; 16-bit sounds: the rate
  uint8_t Flag = 0;    // per-format method selector or key byte
};

// Called with the output's name and the bytes done since the last call; 0
// asks to stop.
using ProgressFn = std::function<int(const std::string& name, uint32_t bytes)>;

struct ArchiveSession {
  FormatId format = 0;
  File archive;
  std::string path;
  std::vector<ArchiveEntry> entries;
  os::FileTimes times;
  uint32_t dosTime = 0;
  ProgressFn progress;
  // The archive and every file its reader opened beside it: extraction never
  // writes onto one of them.
  std::vector<os::FileId> sources;
  uint8_t readerFlag = 0;  // one byte of state for the readers that need it
};

// What a directory reader works with. Readers fill `entries` (AddEntry) and
// throw BadData when the directory does not hold together.
struct ReaderContext {
  ArchiveSession& session;
  os::Handle archive;
  ByteView header;  // the first 104 bytes
  uint32_t fileSize;
  std::string_view path;
  std::string_view archiveFileName;
  std::vector<ArchiveEntry>& entries;
};

using ReaderFn = void (*)(ReaderContext&, unsigned row);

// Appends an entry; a name of 260 characters or more is refused with BadData.
ArchiveEntry& AddEntry(ReaderContext& c, std::string_view name, uint32_t offset, uint32_t unpacked,
                       uint32_t packed, uint8_t flag = 0, uint32_t extra = 0);

// Reads `length` bytes at `position`; refuses with BadData a block that does
// not lie inside the archive, before anything is allocated.
std::vector<uint8_t> ReadBlock(const ReaderContext& c, uint64_t position, uint64_t length);

// Opens a companion file beside the archive for reading and counts it among
// the session's sources; an empty File when it cannot be opened.
File OpenBeside(const ReaderContext& c, const std::string& path);

// Sizes each entry as the distance to the next entry's offset, the last one
// up to `end` (the file size when 0). Offsets must not go backwards.
void SizesFromOffsets(ReaderContext& c, uint32_t end = 0);

// Ends the session: releases the table and closes the archive.
void CloseArchiveSession(ArchiveSession& s);

}  // namespace cairn
