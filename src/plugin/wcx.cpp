// The WCX exports: the one process-wide session the host contract describes,
// walked by the host's cursor. ProcessFile works on the entry the last
// ReadHeader returned and never moves the cursor, so a host that extracts
// while it walks meets every entry exactly once.
#include "plugin/wcx.h"

#include <cstring>
#include <exception>
#include <list>
#include <optional>
#include <string>
#include <utility>

#include "plugin/extract.h"
#include "plugin/session.h"

namespace {

using namespace cairn;

struct Plugin {
  ArchiveSession session;
  void* handle = nullptr;  // what the host holds for the open session
  size_t cursor = 0;       // the entry the next ReadHeader returns
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

void* NewHandle(Plugin& p) {
#ifdef _WIN32
  // Windows hosts get the archive's own file handle.
  return reinterpret_cast<void*>(p.session.archive.get());
#else
  return reinterpret_cast<void*>(++p.serial);
#endif
}

void CopyName(char (&to)[260], const std::string& name) {
  std::memset(to, 0, sizeof to);
  std::memcpy(to, name.data(), std::min(name.size(), sizeof to - 1));
#ifndef _WIN32
  // Double Commander on Linux takes '/' between path parts.
  for (char& c : to)
    if (c == '\\') c = '/';
#endif
}

}  // namespace

WCX_EXPORT void* WCX_API OpenArchive(tOpenArchiveData* ArchiveData) {
  if (ArchiveData == nullptr) return nullptr;
  try {
    Plugin& p = State();
    if (p.handle != nullptr) {
      p.abandoned.emplace_back(p.handle, std::move(p.session.archive));
      p.handle = nullptr;
    }
    p.cursor = 0;
    p.current.reset();
    const int result =
        OpenArchiveSession(p.session, ArchiveData->ArcName ? ArchiveData->ArcName : "");
    if (result != kOk) {
      ArchiveData->OpenResult = result;
      return nullptr;
    }
    p.handle = NewHandle(p);
    return p.handle;
  } catch (...) {
    ArchiveData->OpenResult = kBadData;
    return nullptr;
  }
}

WCX_EXPORT int WCX_API ReadHeader(void* /*hArcData*/, tHeaderData* HeaderData) {
  Plugin& p = State();
  if (p.handle == nullptr || p.cursor >= p.session.entries.size()) return kEndArchive;
  if (HeaderData == nullptr) return kBadData;
  const ArchiveEntry& e = p.session.entries[p.cursor];
  CopyName(HeaderData->FileName, e.Name);
  HeaderData->PackSize = static_cast<int>(e.PackedSize);
  HeaderData->UnpSize = static_cast<int>(e.UnpackedSize);
#ifdef _WIN32
  HeaderData->FileTime = static_cast<int>(p.session.dosTime);
#else
  // Double Commander on Linux reads Unix seconds and Unix mode bits here.
  HeaderData->FileTime = static_cast<int>(os::UnixTime(p.session.times));
  HeaderData->FileAttr = 0100644;
#endif
  p.current = p.cursor++;
  return kOk;
}

WCX_EXPORT int WCX_API ProcessFile(void* hArcData, int Operation, char* /*DestPath*/,
                                   char* DestName) {
  if (Operation == PK_SKIP || Operation == PK_TEST) return kOk;
  try {
    Plugin& p = State();
    if (hArcData == nullptr || hArcData != p.handle || !p.current) return kBadData;
    if (DestName == nullptr) return kCreateFailed;
    return ExtractEntry(p.session, *p.current, DestName);
  } catch (...) {
    return kBadData;
  }
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
  try {
    return RecogniseFile(FileName) != 0 ? 1 : 0;
  } catch (...) {
    return 0;
  }
}

WCX_EXPORT int WCX_API GetPackerCaps(void) { return PK_CAPS_MULTIPLE | PK_CAPS_BY_CONTENT; }
