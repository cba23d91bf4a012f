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

Bytes Pwad(const std::vector<std::pair<std::string, Bytes>>& lumps) {
  ArchiveBuilder b;
  b.text("PWAD").u32(static_cast<uint32_t>(lumps.size())).u32(0);
  std::vector<uint32_t> at;
  for (const auto& [name, data] : lumps) {
    at.push_back(static_cast<uint32_t>(b.size()));
    b.bytes(data);
  }
  b.padTo(104).patch32(8, static_cast<uint32_t>(b.size()));
  for (size_t i = 0; i < lumps.size(); ++i)
    b.u32(at[i]).u32(static_cast<uint32_t>(lumps[i].second.size())).name(lumps[i].first, 8);
  return b.get();
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
