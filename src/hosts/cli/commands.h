// The commands of the `cairn` tool. Each prints its result on standard
// output, one line per problem on standard error ("cairn: FILE: reason"), and
// answers the process exit status.
#pragma once

#include <string>
#include <vector>

namespace cairn::cli {

enum ExitStatus : int {
  kExitDone = 0,
  kExitFailed = 1,     // an archive or file could not be opened, read or recognised
  kExitUsage = 2,      // the command line was not understood
  kExitPartial = 3,    // some entries were not extracted or did not decode, or a pattern
                       // matched nothing
  kExitStopped = 130,  // interrupted; the entry being written was removed
};

struct ListOptions {
  std::string archive;
  bool json = false;  // one JSON document instead of the table
  bool lng = false;   // also each entry's offset, extra value and flag
};
int ListCommand(const ListOptions& options);

// What becomes of an entry whose output path an earlier entry of the same run
// has written: it takes a numbered name (THINGS_1, a_1.txt), is left out, or
// replaces the earlier one.
enum class Duplicates { Rename, Skip, Overwrite };

struct ExtractOptions {
  std::string archive;
  std::string outputDir = ".";
  std::vector<std::string> patterns;  // none: every entry
  bool overwrite = false;             // replace files that existed before the run
  Duplicates duplicates = Duplicates::Rename;
  bool quiet = false;
};
int ExtractCommand(const ExtractOptions& options);

struct TestOptions {
  std::vector<std::string> paths;
  bool recursive = false;  // walk folders, passing over files that are no archive
};
// Decodes every entry of each archive and throws the bytes away.
int TestCommand(const TestOptions& options);

int DetectCommand(const std::vector<std::string>& files);

int FormatsCommand();

}  // namespace cairn::cli
