// The WCX exports. Every open archive has a session of its own, found by the
// handle the host holds; file managers call from worker threads, so each
// archive's calls run under its own lock and the table's lock is held only
// to find one. ProcessFile works on the entry the last ReadHeader returned
// and never moves the cursor, so a host that extracts while it walks meets
// every entry exactly once.
#include "hosts/wcx/wcx.h"

#include <algorithm>
#include <cstring>
#include <exception>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <utility>

#include "core/extract.h"
#include "core/session.h"
#include "formats/archive.h"

namespace {

using namespace cairn;

struct OpenArchiveState {
  std::mutex lock;  // held for the whole of each call on this archive
  ArchiveSession session;
  size_t cursor = 0;              // the entry the next ReadHeader returns
  std::optional<size_t> current;  // the entry the last ReadHeader returned
  tProcessDataProc callback = nullptr;
};
using Archive = std::shared_ptr<OpenArchiveState>;

struct Plugin {
  std::mutex lock;
  std::map<void*, Archive> open;
  // The callback set last: an archive opened next starts with it.
  tProcessDataProc callback = nullptr;
  uintptr_t serial = 0;
};

Plugin& State() {
  static Plugin plugin;
  return plugin;
}

// The archive `handle` stands for, kept alive for the caller even if
// another thread closes it meanwhile; none for an unknown or closed handle.
Archive Find(void* handle) {
  Plugin& p = State();
  const std::lock_guard<std::mutex> guard(p.lock);
  const auto it = p.open.find(handle);
  return it != p.open.end() ? it->second : nullptr;
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
    auto a = std::make_shared<OpenArchiveState>();
    {
      const std::lock_guard<std::mutex> guard(p.lock);
      a->callback = p.callback;
    }
    const int result = OpenArchiveSession(a->session, path);
    if (result != kOk) {
      openResult = result;
      return nullptr;
    }
    // Runs inside ProcessFile, under the archive's lock.
    a->session.progress = [state = a.get()](const std::string& name, uint32_t bytes) {
      if (state->callback == nullptr) return 1;
      std::string copy = name;  // the host's signature takes a non-const name
      return state->callback(copy.data(), static_cast<int>(bytes));
    };
    const std::lock_guard<std::mutex> guard(p.lock);
#ifdef _WIN32
    // Windows hosts get the archive's own file handle.
    void* handle = reinterpret_cast<void*>(a->session.archive.get());
#else
    void* handle = reinterpret_cast<void*>(++p.serial);
#endif
    p.open[handle] = std::move(a);
    return handle;
  } catch (...) {
    openResult = kBadData;
    return nullptr;
  }
}

// The entry the next ReadHeader reports, or none at the end. Called under
// the archive's lock.
const ArchiveEntry* Next(OpenArchiveState& a) {
  if (a.cursor >= a.session.entries.size()) return nullptr;
  a.current = a.cursor;
  return &a.session.entries[a.cursor++];
}

// Runs `fill(archive, entry)` on the next entry of the archive `handle`
// stands for: 0, 10 at the end (or for a handle that is not open), 12 when
// `header` is missing.
template <typename Header, typename Fill>
int ReadNext(void* handle, Header* header, Fill fill) {
  if (header == nullptr) return kBadData;
  try {
    const Archive a = Find(handle);
    if (a == nullptr) return kEndArchive;
    const std::lock_guard<std::mutex> guard(a->lock);
    const ArchiveEntry* e = Next(*a);
    if (e == nullptr) return kEndArchive;
    return fill(*a, *e);
  } catch (...) {
    return kBadData;
  }
}

int Process(void* handle, int operation, const char* destName) {
  if (operation == PK_SKIP || operation == PK_TEST) return kOk;
  try {
    const Archive a = handle != nullptr ? Find(handle) : nullptr;
    if (a == nullptr) return kBadData;
    const std::lock_guard<std::mutex> guard(a->lock);
    if (!a->current) return kBadData;
    if (destName == nullptr) return kCreateFailed;
    return ExtractEntry(a->session, *a->current, destName);
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

int FileTimeForHost(const ArchiveSession& s) {
#ifdef _WIN32
  return static_cast<int>(s.dosTime);
#else
  // Double Commander on Linux reads Unix seconds here.
  return static_cast<int>(os::UnixTime(s.times));
#endif
}

// The fields the host's header records share.
template <typename Header>
void FillCommon(Header& h, const ArchiveSession& s) {
  h.FileTime = FileTimeForHost(s);
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

WCX_EXPORT int WCX_API ReadHeader(void* hArcData, tHeaderData* HeaderData) {
  return ReadNext(hArcData, HeaderData, [&](const OpenArchiveState& a, const ArchiveEntry& e) {
    CopyName(HeaderData->FileName, e.Name);
    HeaderData->PackSize = static_cast<int>(e.PackedSize);
    HeaderData->UnpSize = static_cast<int>(e.UnpackedSize);
    FillCommon(*HeaderData, a.session);
    return kOk;
  });
}

WCX_EXPORT int WCX_API ProcessFile(void* hArcData, int Operation, char* /*DestPath*/,
                                   char* DestName) {
  PathSpelling spelling(os::PathEncoding::Ansi);
  return Process(hArcData, Operation, DestName);
}

WCX_EXPORT int WCX_API CloseArchive(void* hArcData) {
  try {
    Archive a;
    {
      Plugin& p = State();
      const std::lock_guard<std::mutex> guard(p.lock);
      const auto it = p.open.find(hArcData);
      if (it == p.open.end()) return kOk;
      a = std::move(it->second);
      p.open.erase(it);
    }
    // A call still running on this archive in another thread ends first.
    const std::lock_guard<std::mutex> guard(a->lock);
    CloseArchiveSession(a->session);
  } catch (...) {
  }
  return kOk;
}

WCX_EXPORT void WCX_API SetChangeVolProc(void*, tChangeVolProc) {}

WCX_EXPORT void WCX_API SetProcessDataProc(void* hArcData, tProcessDataProc pProcessDataProc) {
  try {
    Archive a;
    {
      Plugin& p = State();
      const std::lock_guard<std::mutex> guard(p.lock);
      p.callback = pProcessDataProc;
      const auto it = p.open.find(hArcData);
      if (it != p.open.end()) a = it->second;
    }
    if (a == nullptr) return;
    const std::lock_guard<std::mutex> guard(a->lock);
    a->callback = pProcessDataProc;
  } catch (...) {
  }
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

// Each archive has its own session: hosts may extract in the background.
WCX_EXPORT int WCX_API GetBackgroundFlags(void) {
  return BACKGROUND_UNPACK;
}

#ifdef _WIN32
// The wide and 64-bit-size entry points that today's Windows hosts prefer.
// They work on the same open archives as the ANSI ones; paths travel as
// UTF-8.

namespace {

template <typename Header>
int FillEx(Header& h, const OpenArchiveState& a, const ArchiveEntry& e) {
  h.PackSize = e.PackedSize;
  h.PackSizeHigh = 0;
  h.UnpSize = e.UnpackedSize;
  h.UnpSizeHigh = 0;
  FillCommon(h, a.session);
  return kOk;
}

}  // namespace

WCX_EXPORT void* WCX_API OpenArchiveW(tOpenArchiveDataW* ArchiveData) {
  if (ArchiveData == nullptr) return nullptr;
  PathSpelling spelling(os::PathEncoding::Utf8);
  return Open(os::Utf8FromWide(ArchiveData->ArcName), ArchiveData->OpenResult);
}

WCX_EXPORT int WCX_API ReadHeaderEx(void* hArcData, tHeaderDataEx* HeaderData) {
  return ReadNext(hArcData, HeaderData, [&](const OpenArchiveState& a, const ArchiveEntry& e) {
    CopyName(HeaderData->FileName, e.Name);
    return FillEx(*HeaderData, a, e);
  });
}

WCX_EXPORT int WCX_API ReadHeaderExW(void* hArcData, tHeaderDataExW* HeaderData) {
  return ReadNext(hArcData, HeaderData, [&](const OpenArchiveState& a, const ArchiveEntry& e) {
    // Names inside archives are in the system's code page.
    CopyName(HeaderData->FileName, os::WideFromAnsi(e.Name));
    return FillEx(*HeaderData, a, e);
  });
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
