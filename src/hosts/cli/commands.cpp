#include "hosts/cli/commands.h"

#include <fmt/core.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdint>
#include <cstdio>
#include <exception>
#include <filesystem>
#include <nlohmann/json.hpp>
#include <optional>
#include <random>
#include <set>
#include <string_view>
#include <system_error>

#include "core/extract.h"
#include "core/session.h"
#include "detect/detect.h"
#include "formats/archive.h"
#include "formats/registry.h"
#include "hosts/cli/names.h"
#include "media/conversion.h"

namespace cairn::cli {
namespace {

namespace fs = std::filesystem;

void Say(std::string_view file, std::string_view reason) {
  fmt::print(stderr, "cairn: {}: {}\n", Printable(file), reason);
}

void Say(std::string_view file, std::string_view entry, std::string_view reason) {
  fmt::print(stderr, "cairn: {}: {}: {}\n", Printable(file), Shown(entry), reason);
}

// What recognition answers for the file at `path`: nothing when the file
// cannot be opened; 0 when it is shorter than a header or nothing matches.
std::optional<FormatId> Recognise(const std::string& path) {
  File file(os::OpenShared(path.c_str()));
  if (!file) return std::nullopt;
  std::vector<uint8_t> header(kHeaderSize, 0);
  if (!ReadAt(file.get(), header.data(), 0, kHeaderSize)) return FormatId{0};
  try {
    const FormatId id = DetectFormat(ByteView(header), path, file.get());
    return FindFormat(id) != nullptr ? id : 0;
  } catch (const std::exception&) {
    return FormatId{0};
  }
}

std::string CannotOpen(const std::string& path) {
  std::error_code ec;
  const fs::file_status st = fs::status(path, ec);
  if (!fs::exists(st)) return "cannot open: no such file";
  if (fs::is_directory(st)) return "cannot open: it is a folder";
  if (!fs::is_regular_file(st)) return "cannot open: not a regular file";
  return "cannot open";
}

std::string OpenFailure(const std::string& path, int code) {
  switch (code) {
    case kBadData:
      return "damaged or inconsistent directory";
    case kUnknownFormat: {
      // Recognition may know the format even though its reader is missing.
      const std::optional<FormatId> id = Recognise(path);
      const FormatInfo* info = id ? FindFormat(*id) : nullptr;
      if (info != nullptr && info->reader == nullptr)
        return fmt::format("recognised as format {} ({}), which cannot be read yet", info->id,
                           info->shortName);
      return "not a recognised archive";
    }
    case kOpenFailed:
      return CannotOpen(path);
    case kReadFailed:
      return "too short or unreadable";
    default:
      return "cannot be read";
  }
}

std::string_view ExtractFailure(int code) {
  switch (code) {
    case kBadData:
      return "damaged entry data";
    case kCreateFailed:
      return "cannot create";
    case kAborted:
      return "stopped";
    default:
      return "cannot be extracted";
  }
}

bool OpenOrSay(ArchiveSession& s, const std::string& path) {
  const int result = OpenArchiveSession(s, path);
  if (result == kOk) return true;
  Say(path, OpenFailure(path, result));
  return false;
}

size_t Digits(uint64_t n) {
  return fmt::formatted_size("{}", n);
}

// Ctrl-C while extracting makes the progress callback ask the core to stop:
// the half-written entry is removed and the tool ends.
volatile std::sig_atomic_t gStopRequested = 0;

extern "C" void RequestStop(int) {
  gStopRequested = 1;
}

struct InterruptGuard {
  using Handler = void (*)(int);
  Handler previous;
  InterruptGuard() : previous(std::signal(SIGINT, RequestStop)) { gStopRequested = 0; }
  ~InterruptGuard() { std::signal(SIGINT, previous == SIG_ERR ? SIG_DFL : previous); }
  InterruptGuard(const InterruptGuard&) = delete;
  InterruptGuard& operator=(const InterruptGuard&) = delete;
};

// Makes the folders of `parts` below `root` and answers the path of the file
// itself. Nothing is created through a symbolic link below the root: an entry
// whose way down meets one is refused.
std::optional<fs::path> PrepareTarget(const ArchiveSession& s, const fs::path& root,
                                      const std::vector<std::string>& parts, bool overwrite,
                                      std::string& why) {
  fs::path at = root;
  std::string shown;
  for (size_t i = 0; i + 1 < parts.size(); ++i) {
    at /= parts[i];
    shown += parts[i];
    std::error_code ec;
    const fs::file_status st = fs::symlink_status(at, ec);
    if (fs::is_symlink(st)) {
      why =
          fmt::format("refused: \"{}\" in the output folder is a symbolic link", Printable(shown));
      return std::nullopt;
    }
    if (!fs::exists(st)) {
      fs::create_directory(at, ec);
      if (ec) {
        why = fmt::format("cannot create the folder \"{}\"", Printable(shown));
        return std::nullopt;
      }
    } else if (!fs::is_directory(st)) {
      why = fmt::format("cannot create: \"{}\" is a file, not a folder", Printable(shown));
      return std::nullopt;
    }
    shown += kShownSeparator;
  }
  fs::path target = at / parts.back();
  std::error_code ec;
  // Renaming the finished entry over the archive, or over a file it is read
  // with, would lose it, whatever --overwrite says.
  if (IsArchiveFile(s, target.string())) {
    why = "refused: that is the archive being read, or a file read with it";
    return std::nullopt;
  }
  const fs::file_status st = fs::symlink_status(target, ec);
  if (fs::exists(st) || fs::is_symlink(st)) {
    if (fs::is_directory(st)) {
      why = "cannot create: a folder of that name exists";
      return std::nullopt;
    }
    if (!overwrite) {
      why = "already exists (use --overwrite to replace it)";
      return std::nullopt;
    }
  }
  return target;
}

// Creates an empty file of a fresh name in `folder`. The exclusive create
// never opens an existing name, a symbolic link included.
std::optional<fs::path> CreateScratch(const fs::path& folder) {
  static const unsigned tag = std::random_device{}();
  static unsigned counter = 0;
  for (int attempt = 0; attempt < 100; ++attempt) {
    fs::path p = folder / fmt::format(".cairn-{:08x}-{}.part", tag, counter++);
    if (std::FILE* f = std::fopen(p.string().c_str(), "wbx")) {
      std::fclose(f);
      return p;
    }
    if (errno != EEXIST) break;
  }
  return std::nullopt;
}

// The paths written so far in one run, as the file system compares them.
class TakenPaths {
 public:
  bool has(const std::vector<std::string>& parts) const { return paths_.count(Key(parts)) > 0; }
  void add(const std::vector<std::string>& parts) { paths_.insert(Key(parts)); }

 private:
  static std::string Key(const std::vector<std::string>& parts) {
    std::string key;
    for (const std::string& part : parts) key += part + '/';
#ifdef _WIN32
    for (char& c : key)
      if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
#endif
    return key;
  }
  std::set<std::string> paths_;
};

// "THINGS" -> "THINGS_2", "a.txt" -> "a_2.txt"; a leading dot starts no
// extension.
std::string Numbered(const std::string& name, unsigned n) {
  const size_t dot = name.rfind('.');
  const size_t at = dot == std::string::npos || dot == 0 ? name.size() : dot;
  return fmt::format("{}_{}{}", name.substr(0, at), n, name.substr(at));
}

// Failed: this entry only. Full: the output cannot be written to, and the
// entries after it would fail the same way.
enum class Outcome { Done, Renamed, Replaced, Skipped, Failed, Full, Stopped };

// Writes entry `index` below `root`. The entry goes to a scratch file beside
// its place first and is renamed over it only when complete, so that a
// failed extraction leaves an existing file as it was.
Outcome ExtractOne(ArchiveSession& s, size_t index, const fs::path& root, const ExtractOptions& o,
                   TakenPaths& taken, std::string& shown) {
  const std::string name = s.entries[index].Name;
  RelativeName rel = SplitEntryName(name);
  if (rel.parts.empty()) {
    Say(o.archive, name, "refused: " + rel.refusal);
    return Outcome::Failed;
  }
  const bool repeated = taken.has(rel.parts);
  if (repeated && o.duplicates == Duplicates::Skip) return Outcome::Skipped;
  if (repeated && o.duplicates == Duplicates::Rename) {
    const std::string last = rel.parts.back();
    for (unsigned n = 1; taken.has(rel.parts); ++n) rel.parts.back() = Numbered(last, n);
  }
  const bool replace = o.overwrite || (repeated && o.duplicates == Duplicates::Overwrite);
  std::string why;
  const std::optional<fs::path> target = PrepareTarget(s, root, rel.parts, replace, why);
  if (!target) {
    Say(o.archive, name, why);
    return Outcome::Failed;
  }
  const std::optional<fs::path> scratch = CreateScratch(target->parent_path());
  if (!scratch) {
    Say(o.archive, name, "cannot create");
    return Outcome::Failed;
  }
  int writeError = 0;
  const int result = ExtractEntry(s, index, scratch->string(), &writeError);
  std::error_code ec;
  if (result == kOk) {
    fs::rename(*scratch, *target, ec);
    if (!ec) {
      taken.add(rel.parts);
      shown.clear();
      for (const std::string& part : rel.parts)
        shown += (shown.empty() ? "" : std::string(1, kShownSeparator)) + part;
      if (!repeated) return Outcome::Done;
      return o.duplicates == Duplicates::Rename ? Outcome::Renamed : Outcome::Replaced;
    }
  }
  fs::remove(*scratch, ec);
  if (result == kWriteFailed) {
    Say(o.archive, name, "cannot write: " + os::ErrorText(writeError));
    return Outcome::Full;
  }
  Say(o.archive, name, result == kOk ? "cannot create" : ExtractFailure(result));
  return result == kAborted ? Outcome::Stopped : Outcome::Failed;
}

}  // namespace

namespace {

// True for a converted copy listed in one of the "_TO_*_" folders.
bool IsConverted(std::string_view name) {
  for (std::string_view folder : {kTgaFolder, kBmpFolder, kWavFolder, kJpgFolder})
    if (name.substr(0, folder.size()) == folder) return true;
  return false;
}

void PrintJson(const ArchiveSession& s, const std::string& archive, bool lng) {
  const FormatInfo* info = FindFormat(s.format);
  nlohmann::ordered_json entries = nlohmann::ordered_json::array();
  uint64_t unpacked = 0, packed = 0;
  for (const ArchiveEntry& e : s.entries) {
    nlohmann::ordered_json j = {{"name", Shown(e.Name)},
                                {"size", e.UnpackedSize},
                                {"packed", e.PackedSize},
                                {"converted", IsConverted(e.Name)}};
    if (lng) {
      j["offset"] = e.Offset;
      j["extra"] = e.Extra;
      j["flag"] = e.Flag;
    }
    entries.push_back(std::move(j));
    unpacked += e.UnpackedSize;
    packed += e.PackedSize;
  }
  const nlohmann::ordered_json doc = {
      {"archive", archive},
      {"format", s.format},
      {"format_name", info != nullptr ? info->shortName : "?"},
      {"entries", std::move(entries)},
      {"total", {{"entries", s.entries.size()}, {"size", unpacked}, {"packed", packed}}}};
  // Bytes that are not UTF-8 become U+FFFD rather than failing the listing.
  fmt::print("{}\n", doc.dump(2, ' ', false, nlohmann::json::error_handler_t::replace));
}

}  // namespace

int ListCommand(const ListOptions& o) {
  ArchiveSession s;
  if (!OpenOrSay(s, o.archive)) return kExitFailed;
  if (o.json) {
    PrintJson(s, o.archive, o.lng);
    return kExitDone;
  }
  uint64_t unpacked = 0, packed = 0;
  uint32_t lastOffset = 0;
  for (const ArchiveEntry& e : s.entries) {
    unpacked += e.UnpackedSize;
    packed += e.PackedSize;
    lastOffset = std::max(lastOffset, e.Offset);
  }
  const FormatInfo* info = FindFormat(s.format);
  fmt::print("Archive: {} (format {}, {})\n\n", Printable(o.archive), s.format,
             info != nullptr ? info->shortName : "?");
  const size_t w = std::max<size_t>({8, Digits(unpacked), Digits(packed)});
  const size_t wo = std::max<size_t>(6, Digits(lastOffset));
  // --long: Offset, Extra (hex) and Flag between the sizes and the name.
  const std::string longRule = o.lng ? fmt::format("{0:-<{1}}  --------  ----  ", "", wo) : "";
  const std::string rule = fmt::format("{0:-<{1}}  {0:-<{1}}  {2}----\n", "", w, longRule);
  const std::string longHead =
      o.lng ? fmt::format("{:>{}}  {:>8}  {:>4}  ", "Offset", wo, "Extra", "Flag") : "";
  fmt::print("{:>{}}  {:>{}}  {}Name\n{}", "Size", w, "Packed", w, longHead, rule);
  for (const ArchiveEntry& e : s.entries) {
    const std::string longCells =
        o.lng ? fmt::format("{:>{}}  {:08x}  {:>4}  ", e.Offset, wo, e.Extra, e.Flag) : "";
    fmt::print("{:>{}}  {:>{}}  {}{}\n", e.UnpackedSize, w, e.PackedSize, w, longCells,
               Shown(e.Name));
  }
  const size_t n = s.entries.size();
  fmt::print("{}{:>{}}  {:>{}}  {} {}\n", rule, unpacked, w, packed, w, n,
             n == 1 ? "entry" : "entries");
  return kExitDone;
}

int ExtractCommand(const ExtractOptions& o) {
  ArchiveSession s;
  if (!OpenOrSay(s, o.archive)) return kExitFailed;

  std::vector<size_t> chosen;
  std::vector<bool> used(o.patterns.size(), false);
  for (size_t i = 0; i < s.entries.size(); ++i) {
    bool take = o.patterns.empty();
    for (size_t p = 0; p < o.patterns.size(); ++p) {
      if (MatchesEntry(o.patterns[p], s.entries[i].Name)) {
        take = true;
        used[p] = true;
      }
    }
    if (take) chosen.push_back(i);
  }
  bool unmatched = false;
  for (size_t p = 0; p < o.patterns.size(); ++p) {
    if (!used[p]) {
      Say(o.archive, fmt::format("no entry matches \"{}\"", Printable(o.patterns[p])));
      unmatched = true;
    }
  }

  const fs::path root(o.outputDir);
  std::error_code ec;
  fs::create_directories(root, ec);
  if (!fs::is_directory(root, ec)) {
    Say(o.outputDir, "cannot create the output folder");
    return kExitFailed;
  }

  InterruptGuard guard;
  s.progress = [](const std::string&, uint32_t) { return gStopRequested ? 0 : 1; };
  TakenPaths taken;
  size_t done = 0, failed = 0, renamed = 0, replaced = 0, skipped = 0;
  for (size_t index : chosen) {
    if (gStopRequested) {
      Say(o.archive, "stopped");
      return kExitStopped;
    }
    std::string shown;
    switch (ExtractOne(s, index, root, o, taken, shown)) {
      case Outcome::Replaced:
        ++replaced;
        [[fallthrough]];
      case Outcome::Done:
        ++done;
        if (!o.quiet) fmt::print("  extracted: {}\n", Printable(shown));
        break;
      case Outcome::Renamed:
        ++done;
        ++renamed;
        if (!o.quiet)
          fmt::print("  extracted: {} as {}\n", Shown(s.entries[index].Name), Printable(shown));
        break;
      case Outcome::Skipped:
        ++skipped;
        if (!o.quiet) fmt::print("  skipped: {} (a repeated name)\n", Shown(s.entries[index].Name));
        break;
      case Outcome::Failed:
        ++failed;
        break;
      case Outcome::Full:
        Say(o.archive, fmt::format("stopped: {} of {} entries extracted to {}", done,
                                   chosen.size(), Printable(o.outputDir)));
        return kExitPartial;
      case Outcome::Stopped:
        return kExitStopped;
    }
  }
  if (!o.quiet) {
    std::string summary = failed == 0 && skipped == 0
                              ? fmt::format("{} {} extracted to {}", done,
                                            done == 1 ? "entry" : "entries", Printable(o.outputDir))
                              : fmt::format("{} of {} entries extracted to {}", done, chosen.size(),
                                            Printable(o.outputDir));
    if (failed > 0) summary += fmt::format(", {} failed", failed);
    if (renamed > 0) summary += fmt::format(", {} renamed for a repeated name", renamed);
    if (replaced > 0) summary += fmt::format(", {} replaced an entry of the same name", replaced);
    if (skipped > 0) summary += fmt::format(", {} skipped for a repeated name", skipped);
    fmt::print("{}\n", summary);
  }
  return failed > 0 || unmatched ? kExitPartial : kExitDone;
}

namespace {

enum class Tested { Good, Failed, Skipped, Stopped };

// Decodes each entry of `path` into a scratch file in `scratchDir`, removed at
// once. While walking a folder, a file that is no archive is passed over.
Tested TestArchive(const std::string& path, bool walking, const fs::path& scratchDir) {
  if (walking) {
    const std::optional<FormatId> id = Recognise(path);
    if (!id || *id == 0 || FindFormat(*id)->reader == nullptr) return Tested::Skipped;
  }
  ArchiveSession s;
  if (!OpenOrSay(s, path)) return Tested::Failed;
  s.progress = [](const std::string&, uint32_t) { return gStopRequested ? 0 : 1; };
  size_t failed = 0;
  for (size_t i = 0; i < s.entries.size(); ++i) {
    const std::optional<fs::path> scratch = CreateScratch(scratchDir);
    if (!scratch) {
      Say(path, fmt::format("cannot create a scratch file in {}", scratchDir.string()));
      return Tested::Failed;
    }
    const int result = gStopRequested ? kAborted : ExtractEntry(s, i, scratch->string());
    std::error_code ec;
    fs::remove(*scratch, ec);
    if (result == kAborted) {
      Say(path, "stopped");
      return Tested::Stopped;
    }
    if (result != kOk) {
      Say(path, s.entries[i].Name, ExtractFailure(result));
      ++failed;
    }
  }
  const size_t n = s.entries.size();
  if (failed == 0)
    fmt::print("{}: {} {} OK\n", Printable(path), n, n == 1 ? "entry" : "entries");
  else
    fmt::print("{}: {} of {} entries failed\n", Printable(path), failed, n);
  return failed == 0 ? Tested::Good : Tested::Failed;
}

}  // namespace

int TestCommand(const TestOptions& o) {
  std::error_code ec;
  const fs::path scratchDir = fs::temp_directory_path(ec);
  if (ec) {
    fmt::print(stderr, "cairn: no folder for scratch files\n");
    return kExitFailed;
  }
  InterruptGuard guard;
  bool failed = false;
  for (const std::string& path : o.paths) {
    std::vector<std::string> files;
    bool walking = false;
    if (fs::is_directory(path, ec)) {
      if (!o.recursive) {
        Say(path, "it is a folder (use -r to test the archives below it)");
        failed = true;
        continue;
      }
      walking = true;
      for (auto it = fs::recursive_directory_iterator(
               path, fs::directory_options::skip_permission_denied, ec);
           !ec && it != fs::recursive_directory_iterator(); it.increment(ec))
        if (it->is_regular_file(ec)) files.push_back(it->path().string());
      if (ec) {
        Say(path, "cannot read the folder");
        failed = true;
      }
      std::sort(files.begin(), files.end());
    } else {
      files.push_back(path);
    }
    for (const std::string& file : files) {
      switch (TestArchive(file, walking, scratchDir)) {
        case Tested::Failed:
          failed = true;
          break;
        case Tested::Stopped:
          return kExitStopped;
        default:
          break;
      }
    }
  }
  return failed ? kExitPartial : kExitDone;
}

int DetectCommand(const std::vector<std::string>& files) {
  int status = kExitDone;
  for (const std::string& path : files) {
    const std::optional<FormatId> id = Recognise(path);
    if (!id) {
      Say(path, CannotOpen(path));
      status = kExitFailed;
      continue;
    }
    const FormatInfo* info = FindFormat(*id);
    if (info == nullptr)
      fmt::print("{}: unknown\n", Printable(path));
    else
      fmt::print("{}: {} {}{}\n", Printable(path), info->id, info->shortName,
                 info->reader == nullptr ? " (not readable yet)" : "");
  }
  return status;
}

int FormatsCommand() {
  size_t w = 4;
  size_t readable = 0;
  for (const FormatInfo& f : AllFormats()) {
    w = std::max(w, std::string_view(f.shortName).size());
    if (f.reader != nullptr) ++readable;
  }
  fmt::print("{:>3}  {:<{}}  {:<8}  {}\n", "Id", "Name", w, "Readable", "Description");
  for (const FormatInfo& f : AllFormats())
    fmt::print("{:>3}  {:<{}}  {:<8}  {}\n", f.id, f.shortName, w, f.reader ? "yes" : "no",
               f.description);
  fmt::print("{} formats, {} readable\n", AllFormats().size(), readable);
  for (const UnreachableFormat& u : UnreachableFormats())
    fmt::print("{} is not reached by recognition: {}\n", u.id, u.why);
  return kExitDone;
}

}  // namespace cairn::cli
