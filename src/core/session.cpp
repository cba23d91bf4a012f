#include "core/session.h"

namespace cairn {

ArchiveEntry& AddEntry(ReaderContext& c, std::string_view name, uint32_t offset, uint32_t unpacked,
                       uint32_t packed, uint8_t flag, uint32_t extra) {
  if (name.size() > kMaxNameLength) throw BadData("name too long");
  ArchiveEntry& e = c.entries.emplace_back();
  e.Name.assign(name);
  e.Offset = offset;
  e.UnpackedSize = unpacked;
  e.PackedSize = packed;
  e.Extra = extra;
  e.Flag = flag;
  return e;
}

std::vector<uint8_t> ReadBlock(const ReaderContext& c, uint64_t position, uint64_t length) {
  if (position > c.fileSize || length > c.fileSize - position) throw BadData("block past the end");
  std::vector<uint8_t> block(static_cast<size_t>(length));
  if (!ReadAt(c.archive, block.data(), static_cast<uint32_t>(position),
              static_cast<uint32_t>(length)))
    throw BadData("short read");
  return block;
}

File OpenBeside(const ReaderContext& c, const std::string& path) {
  File f(path.empty() ? os::kNoFile : os::OpenShared(path.c_str()));
  os::FileId id;
  if (f && os::IdentifyFile(f.get(), id)) c.session.sources.push_back(id);
  return f;
}

void SizesFromOffsets(ReaderContext& c, uint32_t end) {
  if (end == 0) end = c.fileSize;
  for (size_t i = c.entries.size(); i-- > 0;) {
    ArchiveEntry& e = c.entries[i];
    e.UnpackedSize = e.PackedSize = end - e.Offset;
    end = e.Offset;
  }
}

void CloseArchiveSession(ArchiveSession& s) {
  s.entries.clear();
  s.entries.shrink_to_fit();
  s.archive.Close();
  s.sources.clear();
  s.format = 0;
  s.readerFlag = 0;
}

}  // namespace cairn
