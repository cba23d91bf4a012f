#include "plugin/session.h"

#include <exception>
#include <new>

#include "detect/detect.h"
#include "plugin/registry.h"
#include "util/names.h"

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

void SizesFromOffsets(ReaderContext& c, uint32_t end) {
  if (end == 0) end = c.fileSize;
  for (size_t i = c.entries.size(); i-- > 0;) {
    ArchiveEntry& e = c.entries[i];
    e.UnpackedSize = e.PackedSize = end - e.Offset;
    end = e.Offset;
  }
}

void AssignSequentialOffsets(ReaderContext& c, uint32_t start) {
  for (ArchiveEntry& e : c.entries) {
    e.Offset = start;
    start += e.PackedSize;
  }
}

namespace {

struct Opened {
  File file;
  std::vector<uint8_t> header;
  FormatId format = 0;
  int result = kOk;
};

// The steps shared by opening and by the content test: open, read the
// header, recognise (unless `forced` names the format). A format without a
// reader is not recognised.
Opened OpenAndRecognise(const std::string& path, FormatId forced = 0) {
  Opened o;
  o.file = File(os::OpenShared(path.c_str()));
  if (!o.file) {
    o.result = kOpenFailed;
    return o;
  }
  o.header.assign(kHeaderSize, 0);
  if (!ReadAt(o.file.get(), o.header.data(), 0, kHeaderSize)) {
    o.result = kReadFailed;
    return o;
  }
  const FormatId id = forced != 0 ? forced : DetectFormat(ByteView(o.header), path, o.file.get());
  const FormatInfo* info = FindFormat(id);
  if (info == nullptr || info->reader == nullptr) {
    o.result = kUnknownFormat;
    return o;
  }
  o.format = id;
  return o;
}

}  // namespace

FormatId RecogniseFile(const std::string& path) {
  try {
    return OpenAndRecognise(path).format;
  } catch (const std::exception&) {
    return 0;
  }
}

void CloseArchiveSession(ArchiveSession& s) {
  s.entries.clear();
  s.entries.shrink_to_fit();
  s.archive.Close();
  s.format = 0;
  s.readerFlag = 0;
}

int OpenArchiveSession(ArchiveSession& s, const std::string& path) {
  return OpenArchiveAs(s, path, 0);
}

int OpenArchiveAs(ArchiveSession& s, const std::string& path, FormatId format) {
  CloseArchiveSession(s);
  try {
    Opened o = OpenAndRecognise(path, format);
    if (o.result != kOk) return o.result;
    const FormatInfo& info = *FindFormat(o.format);
    const uint32_t size = os::SizeLow(o.file.get());
    s.path = path;
    ReaderContext c{s,      o.file.get(),         ByteView(o.header), size,
                    s.path, FileNamePart(s.path), s.entries};
    info.reader(c, info.row);
    for (ArchiveEntry& e : s.entries) ToBackslashes(e.Name);
    if (!os::GetTimes(o.file.get(), s.times)) throw BadData("no file times");
    s.dosTime = os::DosTime(s.times);
    s.format = o.format;
    s.archive = std::move(o.file);
    return kOk;
  } catch (const std::exception&) {
    // BadData from a reader, bad_alloc, length_error: all the error exit.
  }
  CloseArchiveSession(s);
  return kBadData;
}

}  // namespace cairn
