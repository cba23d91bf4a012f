// libFuzzer entry for the whole way from a file to its entries: recognition,
// the directory readers and the extraction methods. Each input is the bytes of
// one archive, written to one fixed file in a folder made at start-up. It is
// opened through recognition, and again as the FormatId its first byte picks
// (1 + data[0] % 157), so that the formats recognition cannot reach are read
// too; each time the first 16 entries are extracted to one fixed output file.
// Anything but the documented result codes aborts, as does a session left
// holding something after a refused open, an output left after a failed
// extraction, or any other file appearing in the folder; the sanitizers watch
// for the rest, leaks included.
#include <fcntl.h>
#include <unistd.h>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <system_error>

#include "formats/archive.h"
#include "formats/registry.h"

namespace {

namespace fs = std::filesystem;

// The input and output paths in a folder of their own, removed at exit.
struct Folder {
  fs::path dir;
  std::string input, output;
  Folder() {
    std::string name = (fs::temp_directory_path() / "cairn-fuzz-XXXXXX").string();
    if (mkdtemp(name.data()) == nullptr) std::abort();
    dir = name;
    input = (dir / "input.bin").string();
    output = (dir / "output.bin").string();
  }
  ~Folder() {
    std::error_code ignored;
    fs::remove_all(dir, ignored);
  }
};

const Folder& TheFolder() {
  static const Folder folder;
  return folder;
}

// A damaged size may rightly ask a short stream for gigabytes of zeros; an
// input must stay cheap.
constexpr uint32_t kMaxUnpacked = 4u << 20;
constexpr size_t kMaxEntries = 16;

void Check(bool ok, const char* what) {
  if (!ok) {
    std::fprintf(stderr, "open_fuzz: %s\n", what);
    std::abort();
  }
}

// Only the input may be left in the folder between steps.
void CheckOnlyInputLeft(const Folder& f) {
  size_t files = 0;
  for (const auto& e : fs::directory_iterator(f.dir)) {
    Check(e.path() == f.input, "a file other than the input was written");
    ++files;
  }
  Check(files == 1, "the input is gone");
}

void OpenAndExtract(const Folder& f, cairn::FormatId format) {
  cairn::ArchiveSession s;
  const int r = format == 0 ? cairn::OpenArchiveSession(s, f.input)
                            : cairn::OpenArchiveAs(s, f.input, format);
  Check(r == cairn::kOk || r == cairn::kBadData || r == cairn::kUnknownFormat ||
            r == cairn::kOpenFailed || r == cairn::kReadFailed,
        "an open result outside 0, 12, 14, 15, 18");
  if (r != cairn::kOk) {
    Check(s.entries.empty() && !s.archive, "a refused open left a table or a file");
    CheckOnlyInputLeft(f);
    return;
  }
  for (size_t i = 0; i < s.entries.size() && i < kMaxEntries; ++i) {
    if (s.entries[i].UnpackedSize > kMaxUnpacked) continue;
    const int e = cairn::ExtractEntry(s, i, f.output);
    Check(e == cairn::kOk || e == cairn::kBadData, "an extraction result outside 0, 12");
    std::error_code ec;
    const bool left = fs::exists(f.output, ec);
    Check(e != cairn::kOk || left, "a finished extraction left no output");
    Check(e == cairn::kOk || !left, "a failed extraction left its output");
    if (left) fs::remove(f.output, ec);
    CheckOnlyInputLeft(f);
  }
  cairn::CloseArchiveSession(s);
  Check(s.entries.empty() && !s.archive, "closing left a table or a file");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  const Folder& f = TheFolder();
  // Rewritten in place and cut to size: truncating a file to nothing makes
  // some file systems flush it to disk, which costs more than the input.
  const int fd = open(f.input.c_str(), O_WRONLY | O_CREAT, 0600);
  Check(fd >= 0, "cannot write the input");
  Check(pwrite(fd, data, size, 0) == ssize_t(size) && ftruncate(fd, off_t(size)) == 0,
        "cannot write the input");
  close(fd);
  OpenAndExtract(f, 0);
  if (size > 0) OpenAndExtract(f, 1 + data[0] % cairn::kFormatCount);
  return 0;
}
