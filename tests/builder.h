// Small builders for test archives: bytes assembled in code, written to a
// temporary folder, opened and extracted through the core.
#pragma once

#include <algorithm>
#include <cstdint>
#include <filesystem>
#include <initializer_list>
#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "core/extract.h"
#include "core/session.h"
#include "formats/archive.h"

namespace cairn::test {

using Bytes = std::vector<uint8_t>;

class ArchiveBuilder {
 public:
  ArchiveBuilder& bytes(const Bytes& v) {
    b_.insert(b_.end(), v.begin(), v.end());
    return *this;
  }
  ArchiveBuilder& u8(uint8_t v) { return bytes({v}); }
  ArchiveBuilder& u16(uint16_t v) { return u8(v & 0xFF).u8(v >> 8); }
  ArchiveBuilder& u16be(uint16_t v) { return u8(v >> 8).u8(v & 0xFF); }
  ArchiveBuilder& u32(uint32_t v) { return u16(v & 0xFFFF).u16(v >> 16); }
  ArchiveBuilder& u32be(uint32_t v) { return u16be(v >> 16).u16be(v & 0xFFFF); }
  ArchiveBuilder& text(std::string_view s) { return bytes(Bytes(s.begin(), s.end())); }
  ArchiveBuilder& fill(size_t n, uint8_t v = 0) { return bytes(Bytes(n, v)); }
  // A fixed-width name field, zero-padded (cut when the text is longer).
  ArchiveBuilder& name(std::string_view s, size_t width) {
    return text(s.substr(0, width)).fill(width - std::min(width, s.size()));
  }
  // Zero bytes up to position `n`.
  ArchiveBuilder& padTo(size_t n) { return fill(n - std::min(n, size())); }
  // Overwrites a u32 written earlier (a placeholder for an offset).
  ArchiveBuilder& patch32(size_t at, uint32_t v) {
    for (int i = 0; i < 4; ++i) b_.at(at + i) = static_cast<uint8_t>(v >> (8 * i));
    return *this;
  }
  size_t size() const { return b_.size(); }
  const Bytes& get() const { return b_; }

 private:
  Bytes b_;
};

// Bytes with a recognisable pattern.
inline Bytes Pattern(size_t n, uint8_t seed = 1) {
  Bytes b(n);
  for (size_t i = 0; i < n; ++i) b[i] = static_cast<uint8_t>(seed + i * 7 + (i >> 8));
  return b;
}

inline Bytes Text(std::string_view s) {
  return Bytes(s.begin(), s.end());
}

inline Bytes Cat(std::initializer_list<Bytes> parts) {
  Bytes b;
  for (const Bytes& p : parts) b.insert(b.end(), p.begin(), p.end());
  return b;
}

// A complete zlib stream of `data`.
Bytes Compress(const Bytes& data, int level = -1);

inline Bytes Slice(const Bytes& b, size_t at, size_t n) {
  return Bytes(b.begin() + static_cast<std::ptrdiff_t>(at),
               b.begin() + static_cast<std::ptrdiff_t>(at + n));
}

// A "GLB2.0" archive: count at 8, records of offset, size and a 20-byte name
// from 16, then the data from 104 on at the latest, zeros up to 104 bytes.
Bytes Glb(const std::vector<std::pair<std::string, Bytes>>& files);

// A fresh folder under the system's temporary folder, removed afterwards.
class TempDir {
 public:
  TempDir();
  ~TempDir();
  TempDir(const TempDir&) = delete;
  TempDir& operator=(const TempDir&) = delete;
  std::string path(std::string_view name) const { return (dir_ / std::string(name)).string(); }
  std::string write(std::string_view name, const Bytes& b) const;
  const std::filesystem::path& dir() const { return dir_; }

 private:
  std::filesystem::path dir_;
};

// Writes `b` to `path`, making the folders on the way.
std::string WriteFile(const std::filesystem::path& path, const Bytes& b);
Bytes ReadFile(const std::string& path);
bool Exists(const std::string& path);

// What a listing shows of an entry.
struct Listed {
  std::string name;
  uint32_t offset, unpacked, packed, extra;
  uint8_t flag;
  bool operator==(const Listed&) const = default;
};
std::ostream& operator<<(std::ostream& o, const Listed& l);

// An archive opened through the core, as the CLI and the plug-in do.
struct Opened {
  TempDir dir;
  ArchiveSession session;
  int result = -1;
  std::vector<Listed> listing() const;
  // Extracts entry `index` and answers the result; `out` receives the bytes.
  int extract(size_t index, Bytes& out);
  Bytes extract(size_t index);  // expects success
};

// Writes `bytes` under `fileName` in a fresh folder and opens it as FormatId
// `format`, without recognition.
std::unique_ptr<Opened> OpenBytesAs(FormatId format, const Bytes& bytes,
                                    std::string_view fileName = "test.bin");

// A session over `bytes` with a table made by hand, as a reader would leave
// it: for tests of the frame and of the methods on their own.
std::unique_ptr<Opened> SessionOver(FormatId format, const Bytes& bytes,
                                    std::vector<ArchiveEntry> entries);

}  // namespace cairn::test
