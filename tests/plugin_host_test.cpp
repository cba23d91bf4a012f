// Drives the built plug-in exactly as a file manager does: loaded with
// dlopen, asked for its capabilities and whether it handles a file, then
// OpenArchive, SetProcessDataProc, ReadHeader and ProcessFile alternately
// until the end, CloseArchive.
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <csignal>

#include <cstring>
#include <filesystem>
#include <functional>
#include <thread>

#include "builder.h"
#include "hosts/wcx/wcx.h"
#include "samples.h"

namespace cairn::test {
namespace {

// The plug-in's exports, looked up by name as a host does.
struct Plugin {
  void* lib = dlopen(CAIRN_PLUGIN_PATH, RTLD_NOW | RTLD_LOCAL);
  template <typename F>
  F find(const char* name) {
    void* f = lib != nullptr ? dlsym(lib, name) : nullptr;
    if (f == nullptr) throw std::runtime_error(lib != nullptr ? name : dlerror());
    return reinterpret_cast<F>(f);
  }
#define CAIRN_EXPORT(name) decltype(&::name) name = find<decltype(&::name)>(#name)
  CAIRN_EXPORT(OpenArchive);
  CAIRN_EXPORT(ReadHeader);
  CAIRN_EXPORT(ProcessFile);
  CAIRN_EXPORT(CloseArchive);
  CAIRN_EXPORT(SetChangeVolProc);
  CAIRN_EXPORT(SetProcessDataProc);
  CAIRN_EXPORT(CanYouHandleThisFile);
  CAIRN_EXPORT(GetPackerCaps);
  CAIRN_EXPORT(GetBackgroundFlags);
#undef CAIRN_EXPORT
};

const Plugin& Loaded() {
  static const Plugin p;
  return p;
}

// What the host's progress callback has been told; it answers 0 at report
// number g_stopAtReport.
std::vector<std::pair<std::string, int>> g_reports;
int g_stopAtReport = -1;
int Progress(char* name, int size) {
  g_reports.emplace_back(name, size);
  return static_cast<int>(g_reports.size()) == g_stopAtReport ? 0 : 1;
}
int ChangeVolume(char*, int) {
  return 1;
}

struct Walk {
  int openResult = 0, endCode = 0;
  std::vector<tHeaderData> listed;
  std::vector<int> results;
};

// One pass of the host's loop, extracting entry i to out-i when `extract`
// says so and skipping it otherwise.
Walk HostWalk(
    const std::string& archive, const TempDir& out,
    const std::function<bool(size_t)>& extract = [](size_t) { return true; }) {
  const Plugin& p = Loaded();
  Walk w;
  std::string arc = archive, folder = out.dir().string();
  tOpenArchiveData od{};
  od.ArcName = arc.data();
  od.OpenMode = 1;
  void* h = p.OpenArchive(&od);
  w.openResult = od.OpenResult;
  if (h == nullptr) return w;
  p.SetChangeVolProc(h, ChangeVolume);
  p.SetProcessDataProc(h, Progress);
  for (size_t i = 0; w.endCode == 0; ++i) {
    tHeaderData hd;
    std::memset(&hd, 0xAB, sizeof hd);
    w.endCode = p.ReadHeader(h, &hd);
    if (w.endCode != 0) break;
    // Nothing past FileAttr is written, nor the fields the host owns.
    const auto* raw = reinterpret_cast<const uint8_t*>(&hd);
    for (size_t k = offsetof(tHeaderData, FileAttr) + 4; k < sizeof hd; ++k)
      EXPECT_EQ(raw[k], 0xAB) << "byte " << k;
    EXPECT_EQ(hd.Flags & hd.Method & hd.FileCRC, static_cast<int>(0xABABABAB));
    w.listed.push_back(hd);
    std::string dest = out.path("out-" + std::to_string(i));
    w.results.push_back(extract(i) ? p.ProcessFile(h, PK_EXTRACT, folder.data(), dest.data())
                                   : p.ProcessFile(h, PK_SKIP, nullptr, nullptr));
  }
  EXPECT_EQ(p.CloseArchive(h), 0);
  return w;
}

int64_t MTime(const std::string& path) {
  struct stat st {};
  stat(path.c_str(), &st);
  return st.st_mtim.tv_sec;
}

TEST(PluginHost, AnswersCapabilitiesContentTestsAndOpenFailures) {
  const Plugin& p = Loaded();
  EXPECT_EQ(p.GetPackerCaps(), 68);
  TempDir dir;
  Bytes badDirectory = Glb({{"A", Pattern(10)}});
  PutU32le(badDirectory, 8, 0x7FFFFF00);
  const std::pair<std::string, int> cases[] = {
      {dir.path("missing.wad"), 15},
      {dir.dir().string(), 15},
      {dir.write("short.wad", Slice(Glb({}), 0, 103)), 18},
      {dir.write("junk.bin", Bytes(200, 0xEE)), 14},
      {dir.write("bad.wad", badDirectory), 12},
      {dir.write("maps.glb", Glb({{"A", Pattern(10)}})), 0}};
  for (auto [path, result] : cases) {
    EXPECT_EQ(HostWalk(path, dir).openResult, result) << path;
    EXPECT_EQ(p.CanYouHandleThisFile(path.data()), result == 0 || result == 12) << path;
  }
  EXPECT_EQ(p.CanYouHandleThisFile(nullptr), 0);
}

// Every sample archive, listed and extracted whole: '/' between folders,
// FileTime in Unix seconds, regular-file attributes, the archive's time on
// each output, and one final report of the entry's packed size.
TEST(PluginHost, ListsAndExtractsEverySampleAsAFileManagerDoes) {
  for (const Sample& s : AllSamples()) {
    if (!s.recognised) continue;
    SCOPED_TRACE(s.label);
    TempDir dir;
    const std::string path = WriteSample(s, dir.dir());
    g_reports.clear();
    const Walk w = HostWalk(path, dir);
    ASSERT_EQ(w.openResult, 0);
    EXPECT_EQ(w.endCode, 10);
    ASSERT_EQ(w.listed.size(), s.data.size());
    for (size_t i = 0; i < s.data.size(); ++i) {
      const std::string out = dir.path("out-" + std::to_string(i));
      std::string name = s.listing[i].name;
      std::replace(name.begin(), name.end(), '\\', '/');
      EXPECT_EQ(w.listed[i].FileName, name);
      EXPECT_EQ(w.results[i], 0) << name;
      EXPECT_EQ(w.listed[i].FileTime, MTime(path));
      EXPECT_EQ(w.listed[i].FileAttr, 0100644);
      EXPECT_EQ(ReadFile(out), s.data[i]) << name;
      EXPECT_EQ(MTime(out), MTime(path));
      // The wrapped IFF copies all but its first 16 bytes and reports that.
      const int copied = w.listed[i].PackSize - (s.id == 155 ? 16 : 0);
      EXPECT_NE(std::find(g_reports.begin(), g_reports.end(), std::pair{out, copied}),
                g_reports.end())
          << name;
    }
  }
}

TEST(PluginHost, ExtractingWhileWalkingMeetsEveryEntryOnceAndFailuresLeaveNothing) {
  TempDir dir;
  const Bytes a = Pattern(30, 1), b = Pattern(40, 2), c = Pattern(50, 3);
  // A fourth record whose data lies past the end of the file.
  Bytes four = Glb({{"A", a}, {"B", b}, {"C", c}, {"D", Pattern(10)}});
  PutU32le(four, 16 + 3 * 28, 9999);
  const std::string path = dir.write("four.glb", four);
  g_reports.clear();
  g_stopAtReport = 3;  // the first chunk of the second entry asks to stop
  const Walk all = HostWalk(path, dir);
  g_stopAtReport = -1;
  EXPECT_EQ(all.results, (std::vector<int>{0, 21, 0, 12}));
  EXPECT_EQ(g_reports.size(), 5u);  // one chunk and one final report each
  EXPECT_EQ(ReadFile(dir.path("out-0")), a);
  EXPECT_FALSE(Exists(dir.path("out-1")));
  EXPECT_EQ(ReadFile(dir.path("out-2")), c);
  EXPECT_FALSE(Exists(dir.path("out-3")));
  // Only the second selected: the walk still goes on to the end.
  TempDir other;
  const Walk one = HostWalk(path, other, [](size_t i) { return i == 1; });
  EXPECT_EQ(one.results, (std::vector<int>{0, 0, 0, 0}));
  EXPECT_EQ(ReadFile(other.path("out-1")), b);
  EXPECT_FALSE(Exists(other.path("out-0")) || Exists(other.path("out-2")));
}

TEST(PluginHost, TheCursorKeepsToTheHostsCalls) {
  const Plugin& p = Loaded();
  TempDir dir;
  std::string path = dir.write("two.glb", Glb({{"A", Pattern(3)}, {"B", Pattern(4)}}));
  std::string dest = dir.path("x");
  tOpenArchiveData od{};
  od.ArcName = path.data();
  void* h = p.OpenArchive(&od);
  ASSERT_NE(h, nullptr);
  p.SetProcessDataProc(h, Progress);
  // Nothing was listed yet: there is no entry to extract.
  EXPECT_EQ(p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data()), 12);
  EXPECT_FALSE(Exists(dest));
  tHeaderData hd{};
  EXPECT_EQ(p.ReadHeader(h, &hd), 0);
  EXPECT_EQ(p.ProcessFile(h, PK_TEST, nullptr, dest.data()), 0);
  EXPECT_FALSE(Exists(dest));
  EXPECT_EQ(p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data()), 0);
  EXPECT_EQ(p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data()), 0);  // the same entry again
  EXPECT_EQ(ReadFile(dest), Pattern(3));
  EXPECT_EQ(p.ReadHeader(h, &hd), 0);
  EXPECT_STREQ(hd.FileName, "B");
  EXPECT_EQ(p.ReadHeader(h, &hd), 10);
  EXPECT_EQ(p.ReadHeader(h, &hd), 10);
  // A second archive opened before the first is closed: both work, and the
  // callback set last serves the new one; a closed handle is good for nothing.
  std::string path2 = dir.write("one.glb", Glb({{"C", Pattern(5)}}));
  od.ArcName = path2.data();
  void* h2 = p.OpenArchive(&od);
  ASSERT_NE(h2, h);
  EXPECT_EQ(p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data()), 0);
  EXPECT_EQ(ReadFile(dest), Pattern(4));
  EXPECT_EQ(p.ReadHeader(h2, &hd), 0);
  EXPECT_STREQ(hd.FileName, "C");
  g_reports.clear();
  EXPECT_EQ(p.ProcessFile(h2, PK_EXTRACT, nullptr, dest.data()), 0);
  EXPECT_EQ(g_reports.size(), 2u);
  EXPECT_EQ(ReadFile(dest), Pattern(5));
  EXPECT_EQ(p.CloseArchive(h), 0);
  EXPECT_EQ(p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data()), 12);
  EXPECT_EQ(p.ReadHeader(h, &hd), 10);
  EXPECT_EQ(p.CloseArchive(h2), 0);
  EXPECT_EQ(p.GetBackgroundFlags(), 1);  // BACKGROUND_UNPACK
}

std::atomic<int> g_threadReports{0};
int CountReport(char*, int) {
  ++g_threadReports;
  return 1;
}

// One host thread extracts every entry of one archive over and over while
// another opens, lists and closes a second one: each handle has its own
// session.
TEST(PluginHost, TwoThreadsWorkOnTwoArchivesAtOnce) {
  const Plugin& p = Loaded();
  TempDir dir;
  const std::vector<std::pair<std::string, Bytes>> files = {
      {"A", Pattern(3000, 1)}, {"B", Pattern(70000, 2)}, {"C", Pattern(10, 3)}};
  const std::string one = dir.write("one.glb", Glb(files));
  const std::string two = dir.write("two.glb", Glb({{"X", Pattern(9)}, {"Y", Pattern(8)}}));
  const auto walk = [&](std::string path, bool extract) {
    tOpenArchiveData od{};
    od.ArcName = path.data();
    void* h = p.OpenArchive(&od);
    if (h == nullptr) return -1;
    p.SetProcessDataProc(h, CountReport);
    tHeaderData hd{};
    int n = 0, failures = 0;
    for (; p.ReadHeader(h, &hd) == 0; ++n) {
      std::string dest = dir.path("out-" + std::string(hd.FileName));
      if (extract && (p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data()) != 0 ||
                      ReadFile(dest) != files[static_cast<size_t>(n)].second))
        ++failures;
    }
    p.CloseArchive(h);
    return failures == 0 ? n : -1;
  };
  int extracted = 0, listed = 0;
  std::thread extractor([&] {
    for (int i = 0; i < 40; ++i) extracted += walk(one, true) == 3;
  });
  std::thread lister([&] {
    for (int i = 0; i < 400; ++i) listed += walk(two, false) == 2;
  });
  extractor.join();
  lister.join();
  EXPECT_EQ(extracted, 40);
  EXPECT_EQ(listed, 400);
  EXPECT_EQ(g_threadReports, 40 * 6);
}

// Opens `archive`, lists its first entry and extracts it to `dest`.
int ExtractFirst(std::string archive, std::string dest) {
  const Plugin& p = Loaded();
  tOpenArchiveData od{};
  od.ArcName = archive.data();
  void* h = p.OpenArchive(&od);
  if (h == nullptr) return -od.OpenResult;
  tHeaderData hd{};
  const int result =
      p.ReadHeader(h, &hd) != 0 ? -1 : p.ProcessFile(h, PK_EXTRACT, nullptr, dest.data());
  p.CloseArchive(h);
  return result;
}

// The archive and its companions are never a destination, by any name.
TEST(PluginHost, NeverExtractsOntoTheArchiveOrAFileReadBesideIt) {
  TempDir dir;
  const Bytes two = Glb({{"A", Pattern(3)}, {"B", Pattern(4)}});
  const std::string path = dir.write("two.glb", two);
  std::filesystem::create_symlink(path, dir.path("link.glb"));
  std::filesystem::create_hard_link(path, dir.path("hard.glb"));
  for (const std::string& dest : {path, dir.path("./two.glb"), dir.path("link.glb"),
                                  dir.path("hard.glb"), dir.path("sub/../two.glb")}) {
    std::filesystem::create_directories(dir.path("sub"));
    EXPECT_EQ(ExtractFirst(path, dest), 16) << dest;
    EXPECT_EQ(ReadFile(path), two) << dest;
  }
  EXPECT_EQ(ExtractFirst(path, dir.path("copy")), 0);
  for (const Sample& s : AllSamples()) {
    if (!s.recognised || s.companions.empty() || s.data.empty()) continue;
    TempDir d;
    const std::string archive = WriteSample(s, d.dir());
    for (const auto& [name, bytes] : s.companions) {
      EXPECT_EQ(ExtractFirst(archive, d.path(name)), 16) << s.label;
      EXPECT_EQ(ReadFile(d.path(name)), bytes) << s.label;
    }
  }
}

// A write the system refuses (here a file size limit, as a full disk would)
// is 19, not damaged data, and leaves no output.
TEST(PluginHost, AnOutputThatCannotBeWrittenIsAWriteFailure) {
  TempDir dir;
  const std::string path = dir.write("big.glb", Glb({{"A", Pattern(100000)}}));
  const std::string dest = dir.path("out");
  const pid_t child = fork();
  if (child == 0) {
    signal(SIGXFSZ, SIG_IGN);
    const rlimit limit{4096, 4096};
    setrlimit(RLIMIT_FSIZE, &limit);
    _exit(ExtractFirst(path, dest));
  }
  int status = 0;
  ASSERT_EQ(waitpid(child, &status, 0), child);
  EXPECT_TRUE(WIFEXITED(status));
  EXPECT_EQ(WEXITSTATUS(status), 19);
  EXPECT_FALSE(Exists(dest));
}

}  // namespace
}  // namespace cairn::test
