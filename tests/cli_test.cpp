// The `cairn` command-line tool, run as a user runs it: the built binary on
// archives made here, its output, the files it writes and its exit status.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <map>
#include <regex>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "builder.h"
#include "detect_fixtures.h"
#include "formats/registry.h"
#include "samples.h"

extern char** environ;

namespace cairn::test {
namespace {

namespace fs = std::filesystem;

#ifdef CAIRN_CLI_PATH

struct ToolRun {
  int status = -1;  // the exit status; -1 when the tool died of a signal
  std::string out, err;
  std::vector<std::string> errLines() const {
    std::vector<std::string> lines;
    std::istringstream in(err);
    for (std::string line; std::getline(in, line);) lines.push_back(line);
    return lines;
  }
};

// Runs the tool with `args`, no input, in `cwd` when given.
ToolRun Cairn(const std::vector<std::string>& args, const std::string& cwd = "") {
  TempDir io;
  const std::string outPath = io.path("stdout"), errPath = io.path("stderr");
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 0, "/dev/null", O_RDONLY, 0);
  posix_spawn_file_actions_addopen(&actions, 1, outPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC,
                                   0644);
  posix_spawn_file_actions_addopen(&actions, 2, errPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC,
                                   0644);
  if (!cwd.empty()) posix_spawn_file_actions_addchdir_np(&actions, cwd.c_str());
  std::vector<std::string> all{CAIRN_CLI_PATH};
  all.insert(all.end(), args.begin(), args.end());
  std::vector<char*> argv;
  for (std::string& a : all) argv.push_back(a.data());
  argv.push_back(nullptr);
  ToolRun r;
  pid_t pid = 0;
  const int spawned = posix_spawn(&pid, CAIRN_CLI_PATH, &actions, nullptr, argv.data(), environ);
  posix_spawn_file_actions_destroy(&actions);
  EXPECT_EQ(spawned, 0) << "cannot start " << CAIRN_CLI_PATH;
  if (spawned != 0) return r;
  int wstatus = 0;
  waitpid(pid, &wstatus, 0);
  if (WIFEXITED(wstatus)) r.status = WEXITSTATUS(wstatus);
  const Bytes out = ReadFile(outPath), err = ReadFile(errPath);
  r.out.assign(out.begin(), out.end());
  r.err.assign(err.begin(), err.end());
  return r;
}

using Lumps = std::vector<std::pair<std::string, Bytes>>;

// A "PWAD" lump archive: the 12-byte header (magic, count, directory
// position), the lumps, padding up to the 104 bytes every archive has, then
// the directory of 16-byte records: offset, size, name[8].
Bytes Pwad(const Lumps& lumps) {
  ArchiveBuilder b;
  b.text("PWAD").u32(static_cast<uint32_t>(lumps.size())).u32(0);
  std::vector<uint32_t> offsets;
  for (const auto& [name, data] : lumps) {
    offsets.push_back(static_cast<uint32_t>(b.size()));
    b.bytes(data);
  }
  b.padTo(104).patch32(8, static_cast<uint32_t>(b.size()));
  for (size_t i = 0; i < lumps.size(); ++i)
    b.u32(offsets[i]).u32(static_cast<uint32_t>(lumps[i].second.size())).name(lumps[i].first, 8);
  return b.get();
}

// A "GLB2.0" archive: magic, count at 8, the directory from 16 in records of
// 28 bytes (offset, size, name[20]), then the data, at least 104 bytes in all.
Bytes Glb(const Lumps& files) {
  ArchiveBuilder b;
  b.text("GLB2.0").u8(0).u8(0).u32(static_cast<uint32_t>(files.size())).u32(0);
  uint32_t offset = static_cast<uint32_t>(16 + 28 * files.size());
  offset = std::max<uint32_t>(offset, 104);
  for (const auto& [name, data] : files) {
    b.u32(offset).u32(static_cast<uint32_t>(data.size())).name(name, 20);
    offset += static_cast<uint32_t>(data.size());
  }
  b.padTo(104);
  for (const auto& [name, data] : files) b.bytes(data);
  return b.padTo(104).get();
}

// The rows between the two rules of a listing: unpacked size, packed size and
// name; `total` receives the line after the second rule.
struct Row {
  uint64_t unpacked, packed;
  std::string name;
  bool operator==(const Row&) const = default;
};
std::ostream& operator<<(std::ostream& o, const Row& r) {
  return o << r.unpacked << " " << r.packed << " \"" << r.name << "\"";
}

std::vector<Row> ListedRows(const std::string& out, std::string* total = nullptr) {
  static const std::regex row(R"(^ *(\d+) +(\d+)  (.*)$)");
  std::vector<Row> rows;
  std::istringstream in(out);
  int rules = 0;
  for (std::string line; std::getline(in, line);) {
    if (line.rfind("--------", 0) == 0) {
      ++rules;
      continue;
    }
    std::smatch m;
    if (rules == 1 && std::regex_match(line, m, row))
      rows.push_back({std::stoull(m[1]), std::stoull(m[2]), m[3]});
    if (rules == 2 && total != nullptr) {
      *total = line;
      break;
    }
  }
  return rows;
}

// Every regular file below `root`, by '/'-joined relative path.
std::map<std::string, Bytes> FilesBelow(const fs::path& root) {
  std::map<std::string, Bytes> files;
  if (!fs::is_directory(root)) return files;
  for (const auto& e : fs::recursive_directory_iterator(root))
    if (e.is_regular_file() && !e.is_symlink())
      files[fs::relative(e.path(), root).generic_string()] = ReadFile(e.path().string());
  return files;
}

// A signature-recognised format whose reader is still missing, as a file of
// 104 bytes; empty when every format of the candidates can be read.
std::pair<FormatId, Bytes> UnreadableSample() {
  static const std::pair<FormatId, std::string_view> kCandidates[] = {
      {3, "FAR!byAZ"}, {12, "MageGold"}, {29, "HAK V1.0"}, {45, "ACTRHEAD"}, {59, "AWAD"}};
  for (const auto& [id, magic] : kCandidates)
    if (FindFormat(id)->reader == nullptr)
      return {id, ArchiveBuilder().text(magic).padTo(104).get()};
  return {0, {}};
}

const Bytes kPlainText = Text(
    "This is a plain text file and not an archive of any kind at all.\n"
    "It goes on for a second line so that it is longer than a header.\n");

TEST(Cli, ListShowsSizesNamesAndTotal) {
  TempDir dir;
  const Bytes big(1234567, 'x');
  const std::string path = dir.write("game.glb", Glb({{"readme.txt", Text("hello\n")},
                                                      {"docs/manual.txt", Text("a manual")},
                                                      {"empty", {}},
                                                      {"maps\\big.bin", big}}));
  std::string total;
  const ToolRun r = Cairn({"list", path});
  EXPECT_EQ(r.status, 0);
  EXPECT_EQ(r.err, "");
  EXPECT_EQ(r.out.rfind("Archive: " + path + " (format 15, glb2)\n", 0), 0u) << r.out;
  // Names as the archive holds them, '/' turned into '\'; sizes right-aligned.
  EXPECT_EQ(ListedRows(r.out, &total), (std::vector<Row>{{6, 6, "readme.txt"},
                                                         {8, 8, "docs\\manual.txt"},
                                                         {0, 0, "empty"},
                                                         {1234567, 1234567, "maps\\big.bin"}}));
  EXPECT_EQ(total, " 1234581   1234581  4 entries");
  EXPECT_NE(r.out.find("    Size    Packed  Name\n--------  --------  ----\n"), std::string::npos);

  // One entry: the singular; an empty archive: a total of nothing.
  const ToolRun one = Cairn({"list", dir.write("one.wad", Pwad({{"E1M1", Text("abc")}}))});
  ListedRows(one.out, &total);
  EXPECT_EQ(total, "       3         3  1 entry");
  const ToolRun none = Cairn({"list", dir.write("none.wad", Pwad({}))});
  EXPECT_EQ(none.status, 0);
  EXPECT_TRUE(ListedRows(none.out, &total).empty());
  EXPECT_EQ(total, "       0         0  0 entries");
}

TEST(Cli, ListNamesTheFileAndTheReasonOnOneLine) {
  TempDir dir;
  struct Case {
    std::string path, reason;
  };
  std::vector<Case> cases = {
      {dir.path("missing.pak"), "cannot open: no such file"},
      {dir.dir().string(), "cannot open: it is a folder"},
      {dir.write("notes.txt", kPlainText), "not a recognised archive"},
      {dir.write("short.wad", Slice(Pwad({{"A", Text("x")}}), 0, 103)), "too short or unreadable"},
  };
  // A directory that lies past the end of the file.
  Bytes broken = Pwad({{"A", Text("x")}});
  PutU32le(broken, 8, 5000);
  cases.push_back({dir.write("broken.wad", broken), "damaged or inconsistent directory"});
  const auto [unreadable, sample] = UnreadableSample();
  if (unreadable != 0)
    cases.push_back({dir.write("sample.bin", sample),
                     "recognised as format " + std::to_string(unreadable) + " (" +
                         FindFormat(unreadable)->shortName + "), which cannot be read yet"});
  for (const Case& c : cases) {
    SCOPED_TRACE(c.path);
    for (const auto& args : {std::vector<std::string>{"list", c.path},
                             std::vector<std::string>{"extract", c.path, "-o", dir.path("out")}}) {
      const ToolRun r = Cairn(args);
      EXPECT_EQ(r.status, 1);
      EXPECT_EQ(r.out, "");
      EXPECT_EQ(r.errLines(), std::vector<std::string>{"cairn: " + c.path + ": " + c.reason});
    }
  }
}

TEST(Cli, ExtractWritesEveryEntryIntoItsFolders) {
  TempDir dir;
  const Bytes big = Pattern(3000000);
  const std::string path = dir.write("game.glb", Glb({{"readme.txt", Text("hello\n")},
                                                      {"docs/manual.txt", Text("a manual")},
                                                      {"docs\\deep\\x.bin", Pattern(77)},
                                                      {"empty", {}},
                                                      {"big.bin", big}}));
  const ToolRun r = Cairn({"extract", path, "-o", dir.path("out/new")});
  EXPECT_EQ(r.status, 0) << r.err;
  EXPECT_EQ(r.err, "");
  EXPECT_EQ(FilesBelow(dir.path("out/new")),
            (std::map<std::string, Bytes>{{"readme.txt", Text("hello\n")},
                                          {"docs/manual.txt", Text("a manual")},
                                          {"docs/deep/x.bin", Pattern(77)},
                                          {"empty", {}},
                                          {"big.bin", big}}));
  EXPECT_NE(r.out.find("  extracted: docs/deep/x.bin\n"), std::string::npos) << r.out;
  EXPECT_NE(r.out.find("5 entries extracted to " + dir.path("out/new") + "\n"), std::string::npos);

  // Without -o the current folder takes the files; -q prints nothing.
  fs::create_directories(dir.path("here"));
  const ToolRun quiet = Cairn({"extract", "-q", path, "readme.txt"}, dir.path("here"));
  EXPECT_EQ(quiet.status, 0);
  EXPECT_EQ(quiet.out + quiet.err, "");
  EXPECT_EQ(ReadFile(dir.path("here/readme.txt")), Text("hello\n"));
}

TEST(Cli, ExtractSelectsByNameGlobAndFolder) {
  TempDir dir;
  const std::string path = dir.write("game.glb", Glb({{"README.TXT", Text("r")},
                                                      {"docs\\a.txt", Text("a")},
                                                      {"docs\\b.dat", Text("b")},
                                                      {"maps\\e1m1", Text("m1")},
                                                      {"maps\\e1m2", Text("m2")},
                                                      {"maps\\e2m1", Text("m3")}}));
  auto extracted = [&](const std::vector<std::string>& names, int status = 0) {
    static int serial = 0;
    const std::string out = dir.path("out" + std::to_string(serial++));
    std::vector<std::string> args{"extract", path, "-o", out};
    args.insert(args.end(), names.begin(), names.end());
    const ToolRun r = Cairn(args);
    EXPECT_EQ(r.status, status) << r.err;
    std::vector<std::string> got;
    for (const auto& [name, bytes] : FilesBelow(out)) got.push_back(name);
    return got;
  };
  using Names = std::vector<std::string>;
  EXPECT_EQ(extracted({"readme.txt"}), Names{"README.TXT"});              // letters without case
  EXPECT_EQ(extracted({"*.txt"}), (Names{"README.TXT", "docs/a.txt"}));   // '*' crosses folders
  EXPECT_EQ(extracted({"docs/*"}), (Names{"docs/a.txt", "docs/b.dat"}));  // '/' for '\'
  EXPECT_EQ(extracted({"docs\\b.dat"}), Names{"docs/b.dat"});
  EXPECT_EQ(extracted({"maps"}), (Names{"maps/e1m1", "maps/e1m2", "maps/e2m1"}));  // a folder
  EXPECT_EQ(extracted({"DOCS/"}), (Names{"docs/a.txt", "docs/b.dat"}));
  EXPECT_EQ(extracted({"maps/e?m1", "docs/b*"}), (Names{"docs/b.dat", "maps/e1m1", "maps/e2m1"}));
  EXPECT_EQ(extracted({"maps/e1m"}, 3), Names{});  // a name, not a prefix

  // A name that matches nothing is reported; the others are still written.
  const ToolRun r = Cairn({"extract", path, "-o", dir.path("partial"), "nothing*", "docs/a.txt"});
  EXPECT_EQ(r.status, 3);
  EXPECT_EQ(r.errLines(),
            std::vector<std::string>{"cairn: " + path + ": no entry matches \"nothing*\""});
  EXPECT_EQ(ReadFile(dir.path("partial/docs/a.txt")), Text("a"));
}

TEST(Cli, ExtractRefusesNamesThatLeaveTheFolderAndGoesOn) {
  TempDir dir;
  const std::string path = dir.write("evil.glb", Glb({{"first.txt", Text("1")},
                                                      {"..\\escape.txt", Text("e")},
                                                      {"/abs.txt", Text("a")},
                                                      {"C:\\drive.txt", Text("c")},
                                                      {"ok\\..\\..\\up.txt", Text("u")},
                                                      {"\\", Text("s")},
                                                      {".\\.\\", Text("d")},
                                                      {"a\\.\\\\b.txt", Text("b")},
                                                      {"a\\b.txt\\c", Text("x")},
                                                      {"last.txt", Text("2")}}));
  const std::string out = dir.path("deep/out");
  const ToolRun r = Cairn({"extract", path, "-o", out});
  EXPECT_EQ(r.status, 3);
  const std::string at = "cairn: " + path + ": ";
  EXPECT_EQ(r.errLines(),
            (std::vector<std::string>{
                at + "..\\escape.txt: refused: name climbs out with \"..\"",
                at + "\\abs.txt: refused: absolute name",
                at + "C:\\drive.txt: refused: name with a drive letter",
                at + "ok\\..\\..\\up.txt: refused: name climbs out with \"..\"",
                at + "\\: refused: absolute name",
                at + ".\\.\\: refused: empty name",
                at + "a\\b.txt\\c: cannot create: \"a/b.txt\" is a file, not a folder",
            }));
  // The good entries are all there, and nothing was written beside the folder.
  EXPECT_EQ(
      FilesBelow(dir.path("deep")),
      (std::map<std::string, Bytes>{
          {"out/first.txt", Text("1")}, {"out/a/b.txt", Text("b")}, {"out/last.txt", Text("2")}}));
  EXPECT_NE(r.out.find("3 of 10 entries extracted to " + out + ", 7 failed"), std::string::npos)
      << r.out;
}

TEST(Cli, ExtractNeverWritesThroughSymbolicLinks) {
  TempDir dir;
  const std::string path =
      dir.write("game.glb", Glb({{"linked\\inside.txt", Text("in")}, {"target.txt", Text("new")}}));
  const std::string out = dir.path("out");
  fs::create_directories(dir.path("elsewhere"));
  fs::create_directories(out);
  fs::create_directory_symlink(dir.path("elsewhere"), out + "/linked");
  const std::string outside = dir.write("outside.txt", Text("keep me"));
  fs::create_symlink(outside, out + "/target.txt");

  const ToolRun refused = Cairn({"extract", path, "-o", out});
  EXPECT_EQ(refused.status, 3);
  const std::string at = "cairn: " + path + ": ";
  EXPECT_EQ(refused.errLines(),
            (std::vector<std::string>{
                at + "linked\\inside.txt: refused: \"linked\" in the output folder is a symbolic "
                     "link",
                at + "target.txt: already exists (use --overwrite to replace it)"}));

  // Replacing puts a file where the link was; the file it pointed to stays.
  const ToolRun replaced = Cairn({"extract", path, "-o", out, "--overwrite"});
  EXPECT_EQ(replaced.status, 3);
  EXPECT_EQ(replaced.errLines().size(), 1u);
  EXPECT_TRUE(fs::is_empty(dir.path("elsewhere")));
  EXPECT_EQ(ReadFile(outside), Text("keep me"));
  EXPECT_FALSE(fs::is_symlink(out + "/target.txt"));
  EXPECT_EQ(ReadFile(out + "/target.txt"), Text("new"));
}

TEST(Cli, ExtractOverwritesOnlyWhenAsked) {
  TempDir dir;
  const std::string path =
      dir.write("game.wad", Pwad({{"ONE", Text("fresh one")}, {"TWO", Text("fresh two")}}));
  const std::string out = dir.path("out");
  fs::create_directories(out);
  dir.write("out/ONE", Text("old"));

  const ToolRun kept = Cairn({"extract", path, "-o", out});
  EXPECT_EQ(kept.status, 3);
  EXPECT_EQ(kept.errLines(), std::vector<std::string>{"cairn: " + path +
                                                      ": ONE: already exists (use --overwrite to "
                                                      "replace it)"});
  EXPECT_EQ(ReadFile(out + "/ONE"), Text("old"));
  EXPECT_EQ(ReadFile(out + "/TWO"), Text("fresh two"));

  const ToolRun replaced = Cairn({"extract", "--overwrite", path, "-o", out});
  EXPECT_EQ(replaced.status, 0) << replaced.err;
  EXPECT_EQ(FilesBelow(out),
            (std::map<std::string, Bytes>{{"ONE", Text("fresh one")}, {"TWO", Text("fresh two")}}));
}

TEST(Cli, DetectAnswersTheFormatOrUnknown) {
  TempDir dir;
  const std::string wad = dir.write("a.wad", Pwad({{"A", Text("x")}}));
  const std::string glb = dir.write("b.glb", Glb({{"a", Text("x")}}));
  const std::string text = dir.write("c.txt", kPlainText);
  const std::string shortWad = dir.write("d.wad", ArchiveBuilder().text("PWAD").padTo(103).get());
  const std::string missing = dir.path("missing.wad");
  const auto [unreadable, sample] = UnreadableSample();
  const std::string other = dir.write("e.bin", sample);

  const ToolRun r = Cairn({"detect", wad, missing, glb, text, shortWad, other});
  EXPECT_EQ(r.status, 1);  // for the missing file; the others are still answered
  EXPECT_EQ(r.errLines(),
            std::vector<std::string>{"cairn: " + missing + ": cannot open: no such file"});
  std::string expected =
      wad + ": 34 pwad\n" + glb + ": 15 glb2\n" + text + ": unknown\n" + shortWad + ": unknown\n";
  if (unreadable != 0)
    expected += other + ": " + std::to_string(unreadable) + " " +
                FindFormat(unreadable)->shortName + " (not readable yet)\n";
  else
    expected += other + ": unknown\n";
  EXPECT_EQ(r.out, expected);

  const ToolRun ok = Cairn({"detect", text});
  EXPECT_EQ(ok.status, 0);
}

// One file of every format that recognition can reach, each in a folder of
// its own with its companions: detect names its FormatId and short name.
TEST(Cli, DetectRecognisesEveryReachableFormat) {
  TempDir dir;
  std::vector<std::string> args = {"detect"};
  std::string expected;
  int n = 0;
  for (const DetectCase& c : DetectCases()) {
    const std::string folder = "case" + std::to_string(n++) + "/";
    for (const auto& [name, bytes] : c.companions) dir.write(folder + name, bytes);
    const std::string path = dir.write(folder + c.fileName, c.bytes);
    args.push_back(path);
    const FormatInfo* info = FindFormat(c.id);
    expected += path + ": " + std::to_string(c.id) + " " + info->shortName +
                (info->reader == nullptr ? " (not readable yet)" : "") + "\n";
  }
  EXPECT_EQ(n, 154);
  const ToolRun r = Cairn(args);
  EXPECT_EQ(r.status, 0);
  EXPECT_EQ(r.out, expected);
}

TEST(Cli, FormatsListsAllFormatsWithTheirReadability) {
  const ToolRun r = Cairn({"formats"});
  EXPECT_EQ(r.status, 0);
  EXPECT_EQ(r.err, "");
  std::istringstream in(r.out);
  std::string line;
  std::getline(in, line);
  EXPECT_EQ(line.rfind(" Id  Name", 0), 0u) << line;
  size_t readable = 0;
  for (const FormatInfo& f : AllFormats()) {
    ASSERT_TRUE(std::getline(in, line));
    const std::regex row(R"(^ *(\d+)  (\S+) +(yes|no) +  (.+)$)");
    std::smatch m;
    ASSERT_TRUE(std::regex_match(line, m, row)) << line;
    EXPECT_EQ(std::stoul(m[1]), f.id);
    EXPECT_EQ(m[2], f.shortName);
    EXPECT_EQ(m[3], f.reader != nullptr ? "yes" : "no") << f.id;
    EXPECT_EQ(m[4], f.description);
    readable += f.reader != nullptr;
  }
  ASSERT_TRUE(std::getline(in, line));
  EXPECT_EQ(line, "157 formats, " + std::to_string(readable) + " readable");
}

TEST(Cli, UsageErrorsAndHelp) {
  const ToolRun help = Cairn({"--help"});
  EXPECT_EQ(help.status, 0);
  EXPECT_NE(help.out.find("Exit status:"), std::string::npos);
  EXPECT_NE(help.out.find("130"), std::string::npos);
  for (const std::vector<std::string>& args : std::vector<std::vector<std::string>>{
           {}, {"list"}, {"frobnicate"}, {"extract", "--nope", "x"}, {"detect"}}) {
    const ToolRun r = Cairn(args);
    EXPECT_EQ(r.status, 2) << (args.empty() ? "" : args[0]);
  }
  const ToolRun r = Cairn({"list", "a", "b"});
  EXPECT_EQ(r.errLines().size(), 1u);
  EXPECT_EQ(r.err.rfind("cairn: ", 0), 0u) << r.err;
}

// Every registered fixture lists and extracts through the tool exactly as it
// does through the core.
TEST(Cli, ReplaysEveryFixture) {
  for (const Sample& f : AllSamples()) {
    if (!f.recognised) continue;
    SCOPED_TRACE(f.label);
    TempDir dir;
    for (const auto& [name, bytes] : f.companions) dir.write(name, bytes);
    const std::string path = dir.write(f.fileName, f.bytes);

    const ToolRun list = Cairn({"list", path});
    ASSERT_EQ(list.status, 0) << list.err;
    std::vector<std::string> names;
    for (const Row& row : ListedRows(list.out)) names.push_back(row.name);
    std::vector<std::string> expectedNames;
    for (const Listed& e : f.listing) expectedNames.push_back(e.name);
    EXPECT_EQ(names, expectedNames);

    // Entries of one name replace each other: the last one stays.
    std::map<std::string, Bytes> expected;
    for (size_t i = 0; i < f.data.size(); ++i) {
      std::string rel = f.listing[i].name;
      std::replace(rel.begin(), rel.end(), '\\', '/');
      expected[rel] = f.data[i];
    }
    const ToolRun extract = Cairn({"extract", "--overwrite", "-q", path, "-o", dir.path("out")});
    EXPECT_EQ(extract.status, 0) << extract.err;
    EXPECT_EQ(extract.out, "");
    EXPECT_EQ(FilesBelow(dir.path("out")), expected);
  }
}

#endif  // CAIRN_CLI_PATH

}  // namespace
}  // namespace cairn::test
