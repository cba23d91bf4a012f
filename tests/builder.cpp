#include "builder.h"

#include <gtest/gtest.h>
#include <zlib.h>

#include <atomic>
#include <fstream>
#include <iterator>
#include <ostream>
#include <random>

namespace cairn::test {

TempDir::TempDir() {
  static std::atomic<unsigned> counter{0};
  std::random_device rd;
  dir_ = std::filesystem::temp_directory_path() /
         ("cairn-test-" + std::to_string(rd()) + "-" + std::to_string(counter++));
  std::filesystem::create_directories(dir_);
}

TempDir::~TempDir() {
  std::error_code ec;
  std::filesystem::remove_all(dir_, ec);
}

std::string TempDir::write(std::string_view name, const Bytes& b) const {
  return WriteFile(dir_ / std::string(name), b);
}

std::string WriteFile(const std::filesystem::path& path, const Bytes& b) {
  std::filesystem::create_directories(path.parent_path());
  std::ofstream(path, std::ios::binary | std::ios::trunc)
      .write(reinterpret_cast<const char*>(b.data()), static_cast<std::streamsize>(b.size()));
  return path.string();
}

Bytes Compress(const Bytes& data, int level) {
  uLongf size = compressBound(static_cast<uLong>(data.size()));
  Bytes out(size);
  EXPECT_EQ(compress2(out.data(), &size, data.data(), static_cast<uLong>(data.size()), level),
            Z_OK);
  out.resize(size);
  return out;
}

Bytes Glb(const std::vector<std::pair<std::string, Bytes>>& files) {
  ArchiveBuilder b;
  b.text("GLB2.0").fill(2).u32(static_cast<uint32_t>(files.size())).u32(0);
  uint32_t offset = std::max<uint32_t>(static_cast<uint32_t>(16 + 28 * files.size()), 104);
  for (const auto& [name, data] : files) {
    b.u32(offset).u32(static_cast<uint32_t>(data.size())).name(name, 20);
    offset += static_cast<uint32_t>(data.size());
  }
  b.padTo(104);
  for (const auto& [name, data] : files) b.bytes(data);
  return b.padTo(104).get();
}

Bytes ReadFile(const std::string& path) {
  std::ifstream f(path, std::ios::binary);
  return Bytes(std::istreambuf_iterator<char>(f), std::istreambuf_iterator<char>());
}

bool Exists(const std::string& path) {
  return std::filesystem::exists(path);
}

std::ostream& operator<<(std::ostream& o, const Listed& l) {
  return o << "{\"" << l.name << "\", " << l.offset << ", " << l.unpacked << ", " << l.packed
           << ", " << l.extra << ", " << int(l.flag) << "}";
}

std::vector<Listed> Opened::listing() const {
  std::vector<Listed> v;
  for (const ArchiveEntry& e : session.entries)
    v.push_back({e.Name, e.Offset, e.UnpackedSize, e.PackedSize, e.Extra, e.Flag});
  return v;
}

int Opened::extract(size_t index, Bytes& out) {
  const std::string dest = dir.path("out-" + std::to_string(index));
  const int r = ExtractEntry(session, index, dest);
  out = r == kOk ? ReadFile(dest) : Bytes{};
  if (r != kOk) EXPECT_FALSE(Exists(dest)) << "output left behind after " << r;
  std::filesystem::remove(dest);
  return r;
}

Bytes Opened::extract(size_t index) {
  Bytes out;
  EXPECT_EQ(extract(index, out), kOk) << "entry " << index;
  return out;
}

std::unique_ptr<Opened> OpenBytesAs(FormatId format, const Bytes& bytes,
                                    std::string_view fileName) {
  auto o = std::make_unique<Opened>();
  const std::string p = o->dir.write(fileName, bytes);
  o->result = OpenArchiveAs(o->session, p, format);
  return o;
}

std::unique_ptr<Opened> SessionOver(FormatId format, const Bytes& bytes,
                                    std::vector<ArchiveEntry> entries) {
  auto o = std::make_unique<Opened>();
  const std::string p = o->dir.write("archive.bin", bytes);
  o->session.archive = File(os::OpenShared(p.c_str()));
  EXPECT_TRUE(o->session.archive);
  o->session.path = p;
  o->session.format = format;
  o->session.entries = std::move(entries);
  os::GetTimes(o->session.archive.get(), o->session.times);
  o->result = kOk;
  return o;
}

}  // namespace cairn::test
