#include "formats/archive.h"

#include <exception>
#include <new>

#include "detect/detect.h"
#include "formats/registry.h"
#include "util/names.h"

namespace cairn {

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
    os::FileId id;
    if (!os::IdentifyFile(o.file.get(), id)) throw BadData("no file identity");
    s.sources.push_back(id);
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

int ExtractEntry(ArchiveSession& s, size_t index, const std::string& destName,
                 int* writeError) {
  if (index >= s.entries.size() || !s.archive) return kBadData;
  if (IsArchiveFile(s, destName)) return kCreateFailed;
  File output(os::CreateAlways(destName.c_str()));
  if (!output) return kCreateFailed;
  // A copy: a method may read other entries, but never changes the table.
  const ArchiveEntry entry = s.entries[index];
  ExtractionFrame f{s, entry, s.archive.get(), output.get(), destName};
  int result = kOk;
  try {
    const FormatInfo* info = FindFormat(s.format);
    const MethodFn method = info != nullptr ? info->method : RawCopy;
    method(f);
    f.Report(f.reportedSize);
    os::SetTimes(output.get(), s.times);
  } catch (const Aborted&) {
    result = kAborted;
  } catch (const WriteFailed& w) {
    if (writeError != nullptr) *writeError = w.error;
    result = kWriteFailed;
  } catch (const std::exception&) {
    result = kBadData;
  }
  output.Close();
  if (result != kOk) os::Delete(destName.c_str());
  return result;
}

}  // namespace cairn
