// The WCX exports: the one process-wide session the host contract describes,
// walked by the host's cursor. ProcessFile works on the entry the last
// ReadHeader returned and never moves the cursor, so a host that extracts
// while it walks meets every entry exactly once.
#include "hosts/wcx/wcx.h"

#include <algorithm>
#include <cstring>
#include <exception>
#include <list>
#include <optional>
#include <string>
#include <utility>

#include "core/extract.h"
#include "core/session.h"
#include "formats/archive.h"

namespace {

using namespace cairn;

struct Plugin {
  ArchiveSession session;
  void* handle = nullptr;         // what the host holds for the open session
  size_t cursor = 0;              // the entry the next ReadHeader returns
  std::optional<size_t> current;  // the entry the last ReadHeader returned
  tProcessDataProc callback = nullptr;
  // Archives opened again before being closed: their handles stay good for
  // CloseArchive only.
  std::list<std::pair<void*, File>> abandoned;
  uintptr_t serial = 0;
};

Plugin& State() {
  static Plugin plugin;
  return plugin;
}

// Sets how the paths of one call are spelled, for the length of the call.
class PathSpelling {
 public:
  explicit PathSpelling(os::PathEncoding e) : old_(os::SetPathEncoding(e)) {}
  ~PathSpelling() { os::SetPathEncoding(old_); }
  PathSpelling(const PathSpelling&) = delete;
  PathSpelling& operator=(const PathSpelling&) = delete;

 private:
  os::PathEncoding old_;
};

void* Open(const std::string& path, int& openResult) {
  try {
    Plugin& p = State();
    if (p.handle != nullptr) {
      p.abandoned.emplace_back(p.handle, std::move(p.session.archive));
      p.handle = nullptr;
    }
    p.cursor = 0;
    p.current.reset();
    const int result = OpenArchiveSession(p.session, path);
    if (result != kOk) {
      openResult = result;
      return nullptr;
    }
#ifdef _WIN32
    // Windows hosts get the archive's own file handle.
    p.handle = reinterpret_cast<void*>(p.session.archive.get());
#else
    p.handle = reinterpret_cast<void*>(++p.serial);
#endif
    return p.handle;
  } catch (...) {
    openResult = kBadData;
    return nullptr;
  }
}

// The entry the next ReadHeader reports, or none at the end.
const ArchiveEntry* Next() {
  Plugin& p = State();
  if (p.handle == nullptr || p.cursor >= p.session.entries.size()) return nullptr;
  p.current = p.cursor;
  return &p.session.entries[p.cursor++];
}

int Process(void* handle, int operation, const char* destName) {
  if (operation == PK_SKIP || operation == PK_TEST) return kOk;
  try {
    Plugin& p = State();
    if (handle == nullptr || handle != p.handle || !p.current) return kBadData;
    if (destName == nullptr) return kCreateFailed;
    return ExtractEntry(p.session, *p.current, destName);
  } catch (...) {
    return kBadData;
  }
}

template <typename Char, size_t N>
void CopyName(Char (&to)[N], const std::basic_string<Char>& name) {
  std::fill(std::begin(to), std::end(to), Char{0});
  std::copy_n(name.begin(), std::min(name.size(), N - 1), to);
#ifndef _WIN32
  // Double Commander on Linux takes '/' between path parts.
  std::replace(std::begin(to), std::end(to), Char{'\\'}, Char{'/'});
#endif
}

int FileTimeForHost() {
#ifdef _WIN32
  return static_cast<int>(State().session.dosTime);
#else
  // Double Commander on Linux reads Unix seconds here.
  return static_cast<int>(os::UnixTime(State().session.times));
#endif
}

// The fields the host's header records share.
template <typename Header>
void FillCommon(Header& h) {
  h.FileTime = FileTimeForHost();
#ifndef _WIN32
  h.FileAttr = 0100644;  // a regular file, in Unix mode bits
#endif
}

}  // namespace

WCX_EXPORT void* WCX_API OpenArchive(tOpenArchiveData* ArchiveData) {
  if (ArchiveData == nullptr) return nullptr;
  PathSpelling spelling(os::PathEncoding::Ansi);
  return Open(ArchiveData->ArcName ? ArchiveData->ArcName : "", ArchiveData->OpenResult);
}

WCX_EXPORT int WCX_API ReadHeader(void* /*hArcData*/, tHeaderData* HeaderData) {
  if (HeaderData == nullptr) return kBadData;
  const ArchiveEntry* e = Next();
  if (e == nullptr) return kEndArchive;
  CopyName(HeaderData->FileName, e->Name);
  HeaderData->PackSize = static_cast<int>(e->PackedSize);
  HeaderData->UnpSize = static_cast<int>(e->UnpackedSize);
  FillCommon(*HeaderData);
  return kOk;
}

WCX_EXPORT int WCX_API ProcessFile(void* hArcData, int Operation, char* /*DestPath*/,
                                   char* DestName) {
  PathSpelling spelling(os::PathEncoding::Ansi);
  return Process(hArcData, Operation, DestName);
}

WCX_EXPORT int WCX_API CloseArchive(void* hArcData) {
  try {
    Plugin& p = State();
    if (hArcData != nullptr && hArcData == p.handle) {
      CloseArchiveSession(p.session);
      p.handle = nullptr;
      p.cursor = 0;
      p.current.reset();
    } else {
      p.abandoned.remove_if([&](const auto& a) { return a.first == hArcData; });
    }
  } catch (...) {
  }
  return kOk;
}

WCX_EXPORT void WCX_API SetChangeVolProc(void*, tChangeVolProc) {}

WCX_EXPORT void WCX_API SetProcessDataProc(void*, tProcessDataProc pProcessDataProc) {
  Plugin& p = State();
  p.callback = pProcessDataProc;
  p.session.progress = [](const std::string& name, uint32_t bytes) {
    tProcessDataProc callback = State().callback;
    if (callback == nullptr) return 1;
    std::string copy = name;  // the host's signature takes a non-const name
    return callback(copy.data(), static_cast<int>(bytes));
  };
}

WCX_EXPORT int WCX_API CanYouHandleThisFile(char* FileName) {
  if (FileName == nullptr) return 0;
  PathSpelling spelling(os::PathEncoding::Ansi);
  try {
    return RecogniseFile(FileName) != 0 ? 1 : 0;
  } catch (...) {
    return 0;
  }
}

WCX_EXPORT int WCX_API GetPackerCaps(void) {
  return PK_CAPS_MULTIPLE | PK_CAPS_BY_CONTENT;
}

#ifdef _WIN32
// The wide and 64-bit-size entry points that today's Windows hosts prefer.
// They share the one session with the ANSI ones; paths travel as UTF-8.

namespace {

template <typename Header>
int FillEx(Header& h, const ArchiveEntry& e) {
  h.PackSize = e.PackedSize;
  h.PackSizeHigh = 0;
  h.UnpSize = e.UnpackedSize;
  h.UnpSizeHigh = 0;
  FillCommon(h);
  return kOk;
}

}  // namespace

WCX_EXPORT void* WCX_API OpenArchiveW(tOpenArchiveDataW* ArchiveData) {
  if (ArchiveData == nullptr) return nullptr;
  PathSpelling spelling(os::PathEncoding::Utf8);
  return Open(os::Utf8FromWide(ArchiveData->ArcName), ArchiveData->OpenResult);
}

WCX_EXPORT int WCX_API ReadHeaderEx(void* /*hArcData*/, tHeaderDataEx* HeaderData) {
  if (HeaderData == nullptr) return kBadData;
  const ArchiveEntry* e = Next();
  if (e == nullptr) return kEndArchive;
  CopyName(HeaderData->FileName, e->Name);
  return FillEx(*HeaderData, *e);
}

WCX_EXPORT int WCX_API ReadHeaderExW(void* /*hArcData*/, tHeaderDataExW* HeaderData) {
  if (HeaderData == nullptr) return kBadData;
  const ArchiveEntry* e = Next();
  if (e == nullptr) return kEndArchive;
  // Names inside archives are in the system's code page.
  CopyName(HeaderData->FileName, os::WideFromAnsi(e->Name));
  return FillEx(*HeaderData, *e);
}

WCX_EXPORT int WCX_API ProcessFileW(void* hArcData, int Operation, wchar_t* /*DestPath*/,
                                    wchar_t* DestName) {
  PathSpelling spelling(os::PathEncoding::Utf8);
  if (DestName == nullptr) return Process(hArcData, Operation, nullptr);
  return Process(hArcData, Operation, os::Utf8FromWide(DestName).c_str());
}

WCX_EXPORT int WCX_API CanYouHandleThisFileW(wchar_t* FileName) {
  if (FileName == nullptr) return 0;
  PathSpelling spelling(os::PathEncoding::Utf8);
  try {
    return RecogniseFile(os::Utf8FromWide(FileName)) != 0 ? 1 : 0;
  } catch (...) {
    return 0;
  }
}
#endif
