// Support for the media writer tests: a session whose entries are set by
// hand (the writers do not depend on any directory reader), and the real
// decoders (ImageMagick, Python's wave module) that check the written files.
#pragma once

#include <gtest/gtest.h>

#include <array>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>

#include "builder.h"
#include "core/extract.h"
#include "core/session.h"
#include "util/file.h"

namespace cairn::test {

// An archive of one FormatId whose entries the test lists itself.
struct MediaArchive {
  std::unique_ptr<Opened> opened;
  TempDir& dir;

  MediaArchive(FormatId format, const Bytes& bytes)
      : opened(SessionOver(format, bytes, {})), dir(opened->dir) {}

  MediaArchive& add(std::string name, uint32_t offset, uint32_t unpacked, uint32_t packed,
                    uint32_t extra, uint8_t flag) {
    opened->session.entries.push_back({std::move(name), offset, unpacked, packed, extra, flag});
    return *this;
  }

  // Extracts entry `index` to a file that stays until the archive goes;
  // answers the result code.
  int extractTo(size_t index, const std::string& path) {
    return ExtractEntry(opened->session, index, path);
  }
  int extract(size_t index, Bytes& out) { return opened->extract(index, out); }
  Bytes extract(size_t index) { return opened->extract(index); }
};

inline bool HaveTool(const char* name) {
  return std::system(("command -v " + std::string(name) + " >/dev/null 2>&1").c_str()) == 0;
}

// The standard output of a shell command; none when it fails.
inline std::optional<Bytes> Capture(const std::string& command) {
  FILE* p = popen(command.c_str(), "r");
  if (p == nullptr) return std::nullopt;
  Bytes out;
  std::array<uint8_t, 4096> buffer;
  size_t n;
  while ((n = fread(buffer.data(), 1, buffer.size(), p)) > 0)
    out.insert(out.end(), buffer.begin(), buffer.begin() + static_cast<std::ptrdiff_t>(n));
  if (pclose(p) != 0) return std::nullopt;
  return out;
}

// The picture in `path` decoded by ImageMagick to 8-bit RGBA, top row first.
inline std::optional<Bytes> DecodeRgba(const std::string& path, const char* format = "") {
  return Capture(std::string("convert ") + format + "'" + path +
                 "' -auto-orient -depth 8 rgba:- 2>/dev/null");
}

#define CAIRN_NEED_TOOL(tool)                                                                 \
  do {                                                                                        \
    if (!::cairn::test::HaveTool(tool)) GTEST_SKIP() << "skipped: " tool " is not installed"; \
  } while (0)

}  // namespace cairn::test
