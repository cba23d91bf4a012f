// The `cairn` command-line tool, run as a user runs it: the built binary on
// archives made here, its output, the files it writes and its exit status.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <filesystem>
#include <map>
#include <sstream>
#include <tuple>

#ifdef CAIRN_CLI_PATH
#include <nlohmann/json.hpp>
#endif

#include "builder.h"
#include "detect_fixtures.h"
#include "formats/registry.h"
#include "samples.h"

namespace cairn::test {
namespace {

namespace fs = std::filesystem;
using Strings = std::vector<std::string>;
using Files = std::map<std::string, Bytes>;

#ifdef CAIRN_CLI_PATH

Strings Lines(const std::string& text) {
  Strings lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

struct ToolRun {
  int status = -1;
  std::string out, err;
  Strings errLines() const { return Lines(err); }
};

std::string Quoted(const std::string& s) {
  std::string q = "'";
  for (char c : s) q += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return q + "'";
}

// Runs the tool with `args`, no input, in `cwd` when given, after the shell
// commands `before`.
ToolRun Cairn(const Strings& args, const std::string& cwd = "", const std::string& before = "") {
  TempDir io;
  std::string command =
      (cwd.empty() ? "" : "cd " + Quoted(cwd) + " && ") + before + CAIRN_CLI_PATH;
  for (const std::string& a : args) command += " " + Quoted(a);
  command += " </dev/null >" + io.path("1") + " 2>" + io.path("2");
  const int status = std::system(command.c_str());
  ToolRun r;
  if (WIFEXITED(status)) r.status = WEXITSTATUS(status);
  const Bytes out = ReadFile(io.path("1")), err = ReadFile(io.path("2"));
  r.out.assign(out.begin(), out.end());
  r.err.assign(err.begin(), err.end());
  return r;
}

// The lines between the two rules of a listing; `total` gets the line after.
Strings ListedRows(const std::string& out, std::string* total = nullptr) {
  const Strings lines = Lines(out);
  const auto rule = [](const std::string& line) { return line.rfind("--------", 0) == 0; };
  const auto first = std::find_if(lines.begin(), lines.end(), rule);
  const auto second = std::find_if(first + 1, lines.end(), rule);
  if (total != nullptr && second + 1 < lines.end()) *total = second[1];
  return Strings(first + 1, second);
}

Files FilesBelow(const fs::path& root) {
  Files files;
  if (fs::is_directory(root))
    for (const auto& e : fs::recursive_directory_iterator(root))
      if (e.is_regular_file() && !e.is_symlink())
        files[fs::relative(e.path(), root).generic_string()] = ReadFile(e.path().string());
  return files;
}

const Bytes kPlainText = Text(
    "This is a plain text file and not an archive of any kind at all.\n"
    "It goes on for a second line so that it is longer than a header.\n");

// The files of a small game, as written out; the archive stores the
// folder parts with either separator.
const Files kGame = {{"README.TXT", Text("hello\n")},
                     {"docs/a.txt", Text("a")},
                     {"docs/b.dat", Text("b")},
                     {"maps/e1m1", Text("m1")},
                     {"maps/e1m2", Text("m2")},
                     {"maps/e2m1", Text("m3")},
                     {"empty", {}},
                     {"big.bin", Pattern(3000000)}};
std::string WriteGame(const TempDir& dir) {
  std::vector<std::pair<std::string, Bytes>> files(kGame.begin(), kGame.end());
  files[2].first = "docs\\a.txt";  // docs/a.txt
  return dir.write("game.glb", Glb(files));
}

TEST(Cli, ListShowsSizesNamesAndTotal) {
  TempDir dir;
  const std::string path = WriteGame(dir);
  std::string total;
  const ToolRun r = Cairn({"list", path});
  EXPECT_EQ(r.status, 0);
  EXPECT_EQ(r.out.rfind("Archive: " + path + " (format 15, glb2)\n\n    Size    Packed  Name\n", 0),
            0u)
      << r.out;
  const Strings rows = ListedRows(r.out, &total);
  EXPECT_EQ(Strings(rows.begin(), rows.begin() + 3),
            (Strings{"       6         6  README.TXT", " 3000000   3000000  big.bin",
                     "       1         1  docs/a.txt"}));
  EXPECT_EQ(total, " 3000014   3000014  8 entries");
  ListedRows(Cairn({"list", dir.write("one.glb", Glb({{"E1M1", Text("abc")}}))}).out, &total);
  EXPECT_EQ(total, "       3         3  1 entry");
}

TEST(Cli, ListJsonAndLong) {
  TempDir dir;
  const std::string path = dir.write("j.glb", Glb({{"a.txt", Text("abc")}, {"d\\b", Text("xy")}}));
  const ToolRun r = Cairn({"list", "--json", "--long", path});
  EXPECT_EQ(r.status, 0);
  const nlohmann::json j = nlohmann::json::parse(r.out);
  EXPECT_EQ(j["archive"], path);
  EXPECT_EQ(j["format"], 15);
  EXPECT_EQ(j["format_name"], "glb2");
  EXPECT_EQ(j["entries"], nlohmann::json::parse(R"([
      {"name": "a.txt", "size": 3, "packed": 3, "converted": false,
       "offset": 104, "extra": 0, "flag": 0},
      {"name": "d/b", "size": 2, "packed": 2, "converted": false,
       "offset": 107, "extra": 0, "flag": 0}])"));
  EXPECT_EQ(j["total"], nlohmann::json::parse(R"({"entries": 2, "size": 5, "packed": 5})"));
  EXPECT_EQ(nlohmann::json::parse(Cairn({"list", "--json", path}).out)["entries"][1].size(), 4u);
  EXPECT_EQ(ListedRows(Cairn({"list", "--long", path}).out)[1],
            "       2         2     107  00000000     0  d/b");
  const ToolRun bad = Cairn({"list", "--json", dir.path("none.glb")});
  EXPECT_EQ(bad.status, 1);
  EXPECT_EQ(bad.out, "");
}

TEST(Cli, AnArchiveThatCannotBeReadIsOneLineWithTheReason) {
  TempDir dir;
  Bytes broken = Glb({{"A", Text("x")}});
  PutU32le(broken, 8, 5000);  // more records than the file holds
  const std::pair<std::string, std::string> cases[] = {
      {dir.path("missing.pak"), "cannot open: no such file"},
      {dir.dir().string(), "cannot open: it is a folder"},
      {dir.write("notes.txt", kPlainText), "not a recognised archive"},
      {dir.write("short.glb", Slice(broken, 0, 103)), "too short or unreadable"},
      {dir.write("broken.glb", broken), "damaged or inconsistent directory"}};
  for (const auto& [path, reason] : cases)
    for (const Strings& args : {Strings{"list", path}, Strings{"extract", path, "-o", "x"}}) {
      const ToolRun r = Cairn(args, dir.dir().string());
      EXPECT_EQ(r.status, 1);
      EXPECT_EQ(r.out, "");
      EXPECT_EQ(r.errLines(), Strings{"cairn: " + path + ": " + reason});
    }
  EXPECT_FALSE(Exists(dir.path("x")));
}

TEST(Cli, ExtractWritesEntriesIntoTheirFolders) {
  TempDir dir;
  const std::string path = WriteGame(dir), out = dir.path("out/new");
  const ToolRun r = Cairn({"extract", path, "-o", out});
  EXPECT_EQ(r.status, 0) << r.err;
  EXPECT_EQ(FilesBelow(out), kGame);
  EXPECT_NE(r.out.find("  extracted: docs/a.txt\n"), std::string::npos) << r.out;
  EXPECT_NE(r.out.find("8 entries extracted to " + out + "\n"), std::string::npos);
  // Without -o the current folder takes the files; -q prints nothing.
  fs::create_directories(dir.path("here"));
  const ToolRun quiet = Cairn({"extract", "-q", path, "readme.txt"}, dir.path("here"));
  EXPECT_EQ(quiet.out + quiet.err, "");
  EXPECT_EQ(FilesBelow(dir.path("here")), (Files{{"README.TXT", Text("hello\n")}}));
}

TEST(Cli, ExtractSelectsByNameGlobAndFolder) {
  TempDir dir;
  const std::string path = WriteGame(dir);
  const std::vector<std::pair<Strings, Strings>> cases = {
      {{"readme.txt"}, {"README.TXT"}},            // letters without case
      {{"*.txt"}, {"README.TXT", "docs/a.txt"}},   // '*' crosses folders
      {{"docs/*"}, {"docs/a.txt", "docs/b.dat"}},  // '/' for '\'
      {{"docs\\b.dat"}, {"docs/b.dat"}},
      {{"maps"}, {"maps/e1m1", "maps/e1m2", "maps/e2m1"}},  // a folder
      {{"DOCS/"}, {"docs/a.txt", "docs/b.dat"}},
      {{"maps/e?m1", "docs/b*"}, {"docs/b.dat", "maps/e1m1", "maps/e2m1"}},
      {{"maps/e1m"}, {}}};  // a name, not a prefix
  int n = 0;
  for (const auto& [names, expected] : cases) {
    const std::string out = dir.path("out" + std::to_string(n++));
    Strings args{"extract", path, "-o", out};
    args.insert(args.end(), names.begin(), names.end());
    EXPECT_EQ(Cairn(args).status, expected.empty() ? 3 : 0) << names[0];
    Strings got;
    for (const auto& [name, bytes] : FilesBelow(out)) got.push_back(name);
    EXPECT_EQ(got, expected) << names[0];
  }
  // A name that matches nothing is reported; the others are still written.
  const ToolRun r = Cairn({"extract", path, "-o", dir.path("partial"), "nothing*", "docs/a.txt"});
  EXPECT_EQ(r.status, 3);
  EXPECT_EQ(r.errLines(), Strings{"cairn: " + path + ": no entry matches \"nothing*\""});
  EXPECT_EQ(FilesBelow(dir.path("partial")), (Files{{"docs/a.txt", Text("a")}}));
}

TEST(Cli, ExtractNeverWritesOutsideTheFolderNorThroughLinks) {
  TempDir dir;
  const std::string path = dir.write("evil.glb", Glb({{"first.txt", Text("1")},
                                                      {"..\\escape.txt", Text("e")},
                                                      {"/abs.txt", Text("a")},
                                                      {"C:\\drive.txt", Text("c")},
                                                      {"ok\\..\\..\\up.txt", Text("u")},
                                                      {".\\.\\", Text("d")},
                                                      {"a\\.\\\\b.txt", Text("b")},
                                                      {"a\\b.txt\\c", Text("x")},
                                                      {"linked\\in.txt", Text("i")},
                                                      {"target.txt", Text("new")}}));
  const std::string out = dir.path("deep/out");
  fs::create_directories(out);
  fs::create_directories(dir.path("elsewhere"));
  fs::create_directory_symlink(dir.path("elsewhere"), out + "/linked");
  fs::create_symlink(dir.write("outside.txt", Text("keep me")), out + "/target.txt");
  const ToolRun r = Cairn({"extract", path, "-o", out});
  EXPECT_EQ(r.status, 3);
  const std::string at = "cairn: " + path + ": ";
  EXPECT_EQ(r.errLines(),
            (Strings{at + "../escape.txt: refused: name climbs out with \"..\"",
                     at + "/abs.txt: refused: absolute name",
                     at + "C:/drive.txt: refused: name with a drive letter",
                     at + "ok/../../up.txt: refused: name climbs out with \"..\"",
                     at + "././: refused: empty name",
                     at + "a/b.txt/c: cannot create: \"a/b.txt\" is a file, not a folder",
                     at + "linked/in.txt: refused: \"linked\" in the output folder is a "
                          "symbolic link",
                     at + "target.txt: already exists (use --overwrite to replace it)"}));
  EXPECT_NE(r.out.find("2 of 10 entries extracted to " + out + ", 8 failed"), std::string::npos)
      << r.out;
  // Replacing puts a file where the link was; the file it pointed to stays.
  EXPECT_EQ(Cairn({"extract", path, "-o", out, "--overwrite"}).status, 3);
  EXPECT_EQ(FilesBelow(dir.path("deep")), (Files{{"out/first.txt", Text("1")},
                                                 {"out/a/b.txt", Text("b")},
                                                 {"out/target.txt", Text("new")}}));
  EXPECT_TRUE(fs::is_empty(dir.path("elsewhere")));
  EXPECT_EQ(ReadFile(dir.path("outside.txt")), Text("keep me"));
}

// The first entry of a name keeps it; later ones are renamed, skipped or
// replace it. Letter case tells names apart.
TEST(Cli, ExtractKeepsRepeatedNamesApart) {
  TempDir dir;
  std::vector<std::pair<std::string, Bytes>> entries;
  for (std::string e : {"a.txt=1", "THINGS=t", "a.txt=2", "THINGS=u", "THINGS=v", "a.TXT=c"})
    entries.emplace_back(e.substr(0, e.find('=')), Text(e.substr(e.find('=') + 1)));
  const std::string path = dir.write("maps.glb", Glb(entries));
  const auto written = [&] {
    std::string s;
    for (const auto& [name, bytes] : FilesBelow(dir.path("OUT")))
      s += name + "=" + std::string(bytes.begin(), bytes.end()) + " ";
    return s;
  };
  const std::string renamed = "THINGS=t THINGS_1=u THINGS_2=v a.TXT=c a.txt=1 a_1.txt=2 ";
  const std::vector<std::tuple<std::string, std::string, std::string>> cases = {
      {"rename", renamed, "6 entries extracted to OUT, 3 renamed for a repeated name\n"},
      {"skip", "THINGS=t a.TXT=c a.txt=1 ", "3 of 6 entries extracted to OUT, 3 skipped"},
      {"overwrite", "THINGS=v a.TXT=c a.txt=2 ", "6 entries extracted to OUT, 3 replaced"}};
  for (const auto& [mode, files, summary] : cases) {
    const ToolRun r = Cairn({"extract", path, "-o", "OUT", "--duplicates=" + mode}, dir.path(""));
    EXPECT_EQ(r.status, 0) << r.err;
    EXPECT_EQ(written(), files);
    EXPECT_NE(r.out.find(summary), std::string::npos) << r.out;
    fs::remove_all(dir.path("OUT"));
  }
  // Renames are shown; files from before the run stay protected.
  EXPECT_NE(Cairn({"extract", path, "-o", "OUT"}, dir.path("")).out.find("a.txt as a_1.txt\n"),
            std::string::npos);
  EXPECT_EQ(Cairn({"extract", path, "-o", "OUT"}, dir.path("")).status, 3);
  EXPECT_EQ(written(), renamed);
}

// test decodes every entry and says which failed; -r passes over other files.
TEST(Cli, TestDecodesEveryEntryAndWalksFolders) {
  TempDir dir;
  const std::string good = WriteGame(dir), sub = dir.path("sub");
  Bytes bad = Glb({{"a.txt", Text("a")}, {"b\\c.txt", Text("c")}});
  PutU32le(bad, 48, 5000);  // b\c.txt runs past the end
  const std::string damaged = dir.write("sub/damaged.glb", bad), failed = damaged + ": 1 of 2 ";
  const std::string again = dir.write("sub/deeper/again.glb", Glb({{"x", Text("x")}}));
  dir.write("sub/deeper/notes.txt", kPlainText);
  const Strings bcTxt = {"cairn: " + damaged + ": b/c.txt: damaged entry data"};
  const std::vector<std::tuple<Strings, int, std::string, Strings>> cases = {
      {{good}, 0, good + ": 8 entries OK\n", {}},
      {{good, damaged}, 3, good + ": 8 entries OK\n" + failed + "entries failed\n", bcTxt},
      {{"-r", sub}, 3, failed + "entries failed\n" + again + ": 1 entry OK\n", bcTxt},
      {{sub},
       3,
       "",
       {"cairn: " + sub + ": it is a folder (use -r to test the archives below it)"}}};
  for (const auto& [args, status, out, err] : cases) {
    Strings command = {"test"};
    command.insert(command.end(), args.begin(), args.end());
    const ToolRun r = Cairn(command);
    EXPECT_EQ(r.status, status) << args.back();
    EXPECT_EQ(r.out, out);
    EXPECT_EQ(r.errLines(), err);
  }
}

TEST(Cli, ExtractNeverReplacesTheArchiveItself) {
  TempDir dir;
  const Bytes archive = Glb({{"self.glb", Text("entry")}});
  const std::string path = dir.write("self.glb", archive);
  for (const char* overwrite : {"-q", "--overwrite"}) {
    const ToolRun r = Cairn({"extract", overwrite, path, "-o", dir.dir().string()});
    EXPECT_EQ(r.status, 3);
    EXPECT_EQ(r.errLines(), (Strings{"cairn: " + path + ": self.glb: refused: that is the "
                                     "archive being read, or a file read with it"}));
    EXPECT_EQ(ReadFile(path), archive);
  }
}

// A file size limit stands in for a full disk: the tool names the system's
// reason and goes no further.
TEST(Cli, ExtractStopsAtTheFirstOutputThatCannotBeWritten) {
  TempDir dir;
  const std::string path =
      dir.write("g.glb", Glb({{"a", Text("a")}, {"big", Pattern(200000)}, {"c", Text("c")}}));
  const std::string out = dir.path("out");
  // A coverage build's counters cannot be written under the limit either: they
  // go to a folder of their own, so that they spoil no other run's.
  const ToolRun r = Cairn({"extract", "-q", path, "-o", out}, "",
                          "trap '' XFSZ; ulimit -f 64; GCOV_PREFIX=" + dir.path("gcov") + " ");
  EXPECT_EQ(r.status, 3);
  Strings said = r.errLines();  // the tool's lines, not the coverage runtime's
  std::erase_if(said, [](const std::string& line) { return line.rfind("cairn: ", 0) != 0; });
  EXPECT_EQ(said, (Strings{"cairn: " + path + ": big: cannot write: File too large",
                                   "cairn: " + path + ": stopped: 1 of 3 entries extracted to " +
                                       out}));
  EXPECT_EQ(FilesBelow(out), (Files{{"a", Text("a")}}));
}

// One file of every format that recognition can reach, each in a folder of
// its own with its companions, and files that are no archive.
TEST(Cli, DetectNamesEveryReachableFormatOrUnknown) {
  TempDir dir;
  Strings args = {"detect"};
  std::string expected;
  int n = 0;
  for (const DetectCase& c : DetectCases()) {
    const std::string folder = "case" + std::to_string(n++) + "/";
    for (const auto& [name, bytes] : c.companions) dir.write(folder + name, bytes);
    args.push_back(dir.write(folder + c.fileName, c.bytes));
    const FormatInfo* info = FindFormat(c.id);
    expected += args.back() + ": " + std::to_string(c.id) + " " + info->shortName +
                (info->reader == nullptr ? " (not readable yet)" : "") + "\n";
  }
  for (const std::string& unknown :
       {dir.write("c.txt", kPlainText),
        dir.write("d.wad", ArchiveBuilder().text("PWAD").padTo(103).get())}) {
    args.push_back(unknown);
    expected += unknown + ": unknown\n";
  }
  const ToolRun r = Cairn(args);
  EXPECT_EQ(r.status, 0);
  EXPECT_EQ(r.out, expected);
  // A missing file is reported, and the others are still answered.
  const ToolRun missing = Cairn({"detect", dir.path("missing"), args[1]});
  EXPECT_EQ(missing.status, 1);
  EXPECT_EQ(missing.errLines(),
            Strings{"cairn: " + dir.path("missing") + ": cannot open: no such file"});
  EXPECT_EQ(missing.out, expected.substr(0, expected.find('\n') + 1));
}

TEST(Cli, FormatsListsAllFormatsWithTheirReadability) {
  const ToolRun r = Cairn({"formats"});
  EXPECT_EQ(r.status, 0);
  size_t readable = 0;
  for (const FormatInfo& f : AllFormats()) readable += f.reader != nullptr;
  EXPECT_EQ(r.out.rfind(" Id  Name", 0), 0u);
  EXPECT_NE(r.out.find("\n 34  pwad "), std::string::npos);
  EXPECT_NE(r.out.find("\n157 formats, " + std::to_string(readable) + " readable\n"),
            std::string::npos);
  EXPECT_NE(r.out.find("\n91 is not reached by recognition: a header whose first word is 0 "),
            std::string::npos);
  EXPECT_EQ(std::count(r.out.begin(), r.out.end(), '\n'), 159 + 2);  // 91 and 130 noted
}

TEST(Cli, UsageErrorsAndHelp) {
  const ToolRun help = Cairn({"--help"});
  EXPECT_EQ(help.status, 0);
  EXPECT_NE(help.out.find("Exit status:"), std::string::npos);
  for (const Strings& args :
       {Strings{}, Strings{"list"}, Strings{"test"}, Strings{"frobnicate"},
        Strings{"extract", "--nope", "x"}, Strings{"extract", "x", "--duplicates=keep"}})
    EXPECT_EQ(Cairn(args).status, 2) << (args.empty() ? "" : args[0]);
  const ToolRun r = Cairn({"list", "a", "b"});
  EXPECT_EQ(r.status, 2);
  EXPECT_EQ(r.errLines().size(), 1u);
  EXPECT_EQ(r.err.rfind("cairn: ", 0), 0u) << r.err;
}

// Every sample lists and extracts through the tool as it does through the
// core, with '/' between folders; a repeated name gets a numbered copy.
TEST(Cli, ReplaysEverySample) {
  for (const Sample& s : AllSamples()) {
    if (!s.recognised) continue;
    SCOPED_TRACE(s.label);
    TempDir dir;
    const std::string path = WriteSample(s, dir.dir());
    Strings names, listed;
    Files expected;
    for (size_t i = 0; i < s.data.size(); ++i) {
      std::string rel = s.listing[i].name;
      std::replace(rel.begin(), rel.end(), '\\', '/');
      names.push_back(rel);
      const std::string base = rel;
      const size_t dot = base.rfind('.'), start = base.rfind('/') + 1;
      const size_t at = dot == std::string::npos || dot <= start ? base.size() : dot;
      for (int n = 1; expected.count(rel) > 0; ++n)
        rel = base.substr(0, at) + "_" + std::to_string(n) + base.substr(at);
      expected[rel] = s.data[i];
    }
    const ToolRun list = Cairn({"list", path});
    ASSERT_EQ(list.status, 0) << list.err;
    for (const std::string& row : ListedRows(list.out)) listed.push_back(row.substr(20));
    EXPECT_EQ(listed, names);
    const ToolRun extract = Cairn({"extract", "-q", path, "-o", dir.path("out")});
    EXPECT_EQ(extract.status, 0) << extract.err;
    EXPECT_EQ(FilesBelow(dir.path("out")), expected);
  }
}

#endif  // CAIRN_CLI_PATH

}  // namespace
}  // namespace cairn::test
