// Drives the built plug-in exactly as a file manager does: loaded with
// dlopen, asked for its capabilities and whether it handles a file, then
// OpenArchive, SetProcessDataProc, ReadHeader and ProcessFile alternately
// until the end, CloseArchive.
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <cstring>
#include <string>
#include <vector>

#include "builder.h"
#include "hosts/wcx/wcx.h"
#include "samples.h"

namespace cairn {
namespace {

using test::Bytes;

struct Plugin {
  void* lib = nullptr;
  decltype(&::OpenArchive) OpenArchive = nullptr;
  decltype(&::ReadHeader) ReadHeader = nullptr;
  decltype(&::ProcessFile) ProcessFile = nullptr;
  decltype(&::CloseArchive) CloseArchive = nullptr;
  decltype(&::SetChangeVolProc) SetChangeVolProc = nullptr;
  decltype(&::SetProcessDataProc) SetProcessDataProc = nullptr;
  decltype(&::CanYouHandleThisFile) CanYouHandleThisFile = nullptr;
  decltype(&::GetPackerCaps) GetPackerCaps = nullptr;
};

template <typename F>
void Find(void* lib, const char* name, F& f) {
  f = reinterpret_cast<F>(dlsym(lib, name));
  ASSERT_NE(f, nullptr) << name;
}

const Plugin& Loaded() {
  static Plugin p = [] {
    Plugin q;
    q.lib = dlopen(CAIRN_PLUGIN_PATH, RTLD_NOW | RTLD_LOCAL);
    EXPECT_NE(q.lib, nullptr) << dlerror();
    if (q.lib == nullptr) return q;
    Find(q.lib, "OpenArchive", q.OpenArchive);
    Find(q.lib, "ReadHeader", q.ReadHeader);
    Find(q.lib, "ProcessFile", q.ProcessFile);
    Find(q.lib, "CloseArchive", q.CloseArchive);
    Find(q.lib, "SetChangeVolProc", q.SetChangeVolProc);
    Find(q.lib, "SetProcessDataProc", q.SetProcessDataProc);
    Find(q.lib, "CanYouHandleThisFile", q.CanYouHandleThisFile);
    Find(q.lib, "GetPackerCaps", q.GetPackerCaps);
    return q;
  }();
  return p;
}

// What the host's progress callback has been told.
std::vector<std::pair<std::string, int>> g_reports;
int g_stopAtReport = -1;

int Progress(char* name, int size) {
  g_reports.emplace_back(name, size);
  return static_cast<int>(g_reports.size()) == g_stopAtReport ? 0 : 1;
}

int ChangeVolume(char*, int) {
  return 1;
}

struct Listed {
  std::string name;
  int packed, unpacked, time, attr;
};

// One pass of the host's loop. `extract` says which entries to extract
// (by their position in the walk); the others are skipped.
struct Walk {
  int openResult = 0;
  std::vector<Listed> listed;
  std::vector<int> results;
  int endCode = 0;
};

Walk HostWalk(
    const std::string& archive, const test::TempDir& out,
    const std::function<bool(size_t)>& extract = [](size_t) { return true; }) {
  const Plugin& p = Loaded();
  Walk w;
  std::string arc = archive;
  tOpenArchiveData od{};
  od.ArcName = arc.data();
  od.OpenMode = 1;
  void* h = p.OpenArchive(&od);
  w.openResult = od.OpenResult;
  if (h == nullptr) return w;
  p.SetChangeVolProc(h, ChangeVolume);
  p.SetProcessDataProc(h, Progress);
  for (size_t i = 0; i < 10000; ++i) {
    tHeaderData hd;
    std::memset(&hd, 0xAB, sizeof hd);
    const int r = p.ReadHeader(h, &hd);
    if (r != 0) {
      w.endCode = r;
      break;
    }
    // Nothing past FileAttr is written, nor the fields the host owns.
    const auto* raw = reinterpret_cast<const uint8_t*>(&hd);
    for (size_t k = offsetof(tHeaderData, FileAttr) + 4; k < sizeof hd; ++k)
      EXPECT_EQ(raw[k], 0xAB) << "byte " << k;
    EXPECT_EQ(hd.Flags, static_cast<int>(0xABABABAB));
    EXPECT_EQ(hd.Method, static_cast<int>(0xABABABAB));
    EXPECT_EQ(hd.FileCRC, static_cast<int>(0xABABABAB));
    w.listed.push_back({hd.FileName, hd.PackSize, hd.UnpSize, hd.FileTime, hd.FileAttr});
    std::string dest = out.path("out-" + std::to_string(i));
    std::string destPath = out.dir().string();
    w.results.push_back(extract(i) ? p.ProcessFile(h, PK_EXTRACT, destPath.data(), dest.data())
                                   : p.ProcessFile(h, PK_SKIP, nullptr, nullptr));
  }
  EXPECT_EQ(p.CloseArchive(h), 0);
  return w;
}

std::string ForHost(std::string name) {
  for (char& c : name)
    if (c == '\\') c = '/';
  return name;
}

int64_t MTime(const std::string& path) {
  struct stat st {};
  stat(path.c_str(), &st);
  return st.st_mtim.tv_sec;
}

using test::Pwad;

TEST(PluginHost, AnswersItsCapabilitiesAndHandlesOnlyWhatItRecognises) {
  const Plugin& p = Loaded();
  ASSERT_NE(p.lib, nullptr);
  EXPECT_EQ(p.GetPackerCaps(), 68);
  test::TempDir dir;
  std::string missing = dir.path("missing.wad");
  std::string shortFile = dir.write("short.wad", Bytes(103, 0));
  std::string wad = dir.write("maps.wad", Pwad({{"A", test::Pattern(10)}}));
  std::string folder = dir.dir().string();
  EXPECT_EQ(p.CanYouHandleThisFile(missing.data()), 0);
  EXPECT_EQ(p.CanYouHandleThisFile(shortFile.data()), 0);
  EXPECT_EQ(p.CanYouHandleThisFile(folder.data()), 0);
  EXPECT_EQ(p.CanYouHandleThisFile(wad.data()), 1);
  EXPECT_EQ(p.CanYouHandleThisFile(nullptr), 0);
}

TEST(PluginHost, OpenFailuresCarryTheirResultCodes) {
  test::TempDir dir;
  EXPECT_EQ(HostWalk(dir.path("missing"), dir).openResult, 15);
  EXPECT_EQ(HostWalk(dir.dir().string(), dir).openResult, 15);
  Bytes shortWad = Pwad({});
  shortWad.resize(103);
  EXPECT_EQ(HostWalk(dir.write("short.wad", shortWad), dir).openResult, 18);
  EXPECT_EQ(HostWalk(dir.write("junk.bin", Bytes(200, 0xEE)), dir).openResult, 14);
  Bytes badDirectory = Pwad({{"A", test::Pattern(10)}});
  test::ArchiveBuilder b;
  b.bytes(badDirectory).patch32(8, 0x7FFFFF00);
  EXPECT_EQ(HostWalk(dir.write("bad.wad", b.get()), dir).openResult, 12);
}

// Every example archive of the test suite, listed and extracted whole.
TEST(PluginHost, ListsAndExtractsEveryFixtureAsAFileManagerDoes) {
  for (const test::Sample& f : test::AllSamples()) {
    if (!f.recognised) continue;
    SCOPED_TRACE(f.label);
    test::TempDir dir;
    for (const auto& [name, bytes] : f.companions) dir.write(name, bytes);
    const std::string path = dir.write(f.fileName, f.bytes);
    g_reports.clear();
    g_stopAtReport = -1;
    const Walk w = HostWalk(path, dir);
    ASSERT_EQ(w.openResult, 0);
    EXPECT_EQ(w.endCode, 10);
    ASSERT_EQ(w.listed.size(), f.data.size());
    for (size_t i = 0; i < f.data.size(); ++i) {
      const std::string out = dir.path("out-" + std::to_string(i));
      EXPECT_EQ(w.listed[i].name, ForHost(f.listing[i].name));
      EXPECT_EQ(w.results[i], 0) << f.listing[i].name;
      EXPECT_EQ(w.listed[i].time, MTime(path));
      EXPECT_EQ(w.listed[i].attr, 0100644);
      EXPECT_EQ(test::ReadFile(out), f.data[i]) << f.listing[i].name;
      EXPECT_EQ(MTime(out), MTime(path));
    }
    // Each extraction ends with one report of the entry's packed size; the
    // wrapped IFF copies all but its first 16 bytes and reports that.
    size_t finals = 0;
    for (size_t i = 0; i < w.listed.size(); ++i) {
      const std::string out = dir.path("out-" + std::to_string(i));
      const int copied = w.listed[i].packed - (f.id == 155 ? 16 : 0);
      for (const auto& [name, size] : g_reports)
        if (name == out && size == copied) {
          ++finals;
          break;
        }
    }
    EXPECT_EQ(finals, w.listed.size());
  }
}

TEST(PluginHost, ExtractingWhileWalkingMeetsEveryEntryOnce) {
  test::TempDir dir;
  const Bytes a = test::Pattern(30, 1), b = test::Pattern(40, 2), c = test::Pattern(50, 3);
  const std::string path = dir.write("three.wad", Pwad({{"A", a}, {"B", b}, {"C", c}}));
  g_reports.clear();
  g_stopAtReport = -1;
  const Walk all = HostWalk(path, dir);
  ASSERT_EQ(all.listed.size(), 3u);
  EXPECT_EQ(all.results, (std::vector<int>{0, 0, 0}));
  EXPECT_EQ(test::ReadFile(dir.path("out-0")), a);
  EXPECT_EQ(test::ReadFile(dir.path("out-1")), b);
  EXPECT_EQ(test::ReadFile(dir.path("out-2")), c);
  EXPECT_EQ(g_reports.size(), 6u);  // one chunk and one final report each

  // Only the second selected: the walk still goes on to the third.
  test::TempDir other;
  const Walk one = HostWalk(path, other, [](size_t i) { return i == 1; });
  ASSERT_EQ(one.listed.size(), 3u);
  EXPECT_EQ(test::ReadFile(other.path("out-1")), b);
  EXPECT_FALSE(test::Exists(other.path("out-0")));
  EXPECT_FALSE(test::Exists(other.path("out-2")));
}

TEST(PluginHost, AFailedOrStoppedExtractionLeavesNothingAndTheWalkGoesOn) {
  test::TempDir dir;
  // A third record whose data lies past the end of the file.
  test::ArchiveBuilder broken;
  broken.bytes(Pwad({{"A", test::Pattern(30)}, {"B", test::Pattern(20)}})).patch32(4, 3);
  broken.u32(9999).u32(10).name("BROKEN", 8);
  const std::string path = dir.write("broken.wad", broken.get());
  g_reports.clear();
  g_stopAtReport = 1;  // the first chunk of the first entry asks to stop
  const Walk w = HostWalk(path, dir);
  ASSERT_EQ(w.listed.size(), 3u);
  EXPECT_EQ(w.results, (std::vector<int>{21, 0, 12}));
  EXPECT_FALSE(test::Exists(dir.path("out-0")));
  EXPECT_TRUE(test::Exists(dir.path("out-1")));
  EXPECT_FALSE(test::Exists(dir.path("out-2")));
  g_stopAtReport = -1;
}

TEST(PluginHost, TheCursorKeepsToTheHostsCalls) {
  const Plugin& p = Loaded();
  test::TempDir dir;
  std::string path = dir.write("two.wad", Pwad({{"A", test::Pattern(3)}, {"B", test::Pattern(4)}}));
  std::string dest = dir.path("x");
  tOpenArchiveData od{};
  od.ArcName = path.data();
  void* h = p.OpenArchive(&od);
  ASSERT_NE(h, nullptr);
  p.SetProcessDataProc(h, Progress);
  // Nothing was listed yet: there is no entry to extract.
  EXPECT_EQ(p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data()), 12);
  EXPECT_FALSE(test::Exists(dest));
  tHeaderData hd{};
  EXPECT_EQ(p.ReadHeader(h, &hd), 0);
  EXPECT_EQ(p.ProcessFile(h, PK_TEST, nullptr, dest.data()), 0);
  EXPECT_FALSE(test::Exists(dest));
  EXPECT_EQ(p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data()), 0);
  EXPECT_EQ(p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data()), 0);  // the same entry again
  EXPECT_EQ(test::ReadFile(dest), test::Pattern(3));
  EXPECT_EQ(p.ReadHeader(h, &hd), 0);
  EXPECT_STREQ(hd.FileName, "B");
  EXPECT_EQ(p.ReadHeader(h, &hd), 10);
  EXPECT_EQ(p.ReadHeader(h, &hd), 10);

  // A second archive opened before the first is closed: the first handle is
  // good only for CloseArchive.
  std::string path2 = dir.write("one.wad", Pwad({{"C", test::Pattern(5)}}));
  od.ArcName = path2.data();
  void* h2 = p.OpenArchive(&od);
  ASSERT_NE(h2, nullptr);
  EXPECT_NE(h2, h);
  EXPECT_EQ(p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data()), 12);
  EXPECT_EQ(p.CloseArchive(h), 0);
  EXPECT_EQ(p.ReadHeader(h2, &hd), 0);
  EXPECT_STREQ(hd.FileName, "C");
  EXPECT_EQ(p.ProcessFile(h2, PK_EXTRACT, nullptr, dest.data()), 0);  // the callback stayed
  EXPECT_EQ(test::ReadFile(dest), test::Pattern(5));
  EXPECT_EQ(p.CloseArchive(h2), 0);
}

}  // namespace
}  // namespace cairn
