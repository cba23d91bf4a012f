// The `cairn` command-line tool: lists, extracts and recognises game resource
// archives through the same core as the file-manager plug-in.
#include <fmt/core.h>

#include <CLI/CLI.hpp>
#include <exception>
#include <string>
#include <vector>

#include "hosts/cli/commands.h"

#ifndef CAIRN_VERSION
#define CAIRN_VERSION "unknown"
#endif

namespace {

constexpr const char* kExitStatusHelp =
    "Exit status:\n"
    "  0    done\n"
    "  1    an archive or file could not be opened, read or recognised (test: 3)\n"
    "  2    the command line was not understood\n"
    "  3    some entries were not extracted (refused, already present, damaged,\n"
    "       not creatable), or a NAME matched no entry; for test, an archive or\n"
    "       an entry failed\n"
    "  130  interrupted; the entry being written was removed\n"
    "Problems are reported one per line on standard error: \"cairn: FILE: reason\".";

}  // namespace

int main(int argc, char** argv) {
  using namespace cairn::cli;

  CLI::App app{"cairn lists, extracts and tests the resource archives of old games.", "cairn"};
  app.set_version_flag("--version", std::string("cairn ") + CAIRN_VERSION);
  app.require_subcommand(1);
  app.footer(kExitStatusHelp);

  ListOptions listing;
  CLI::App* list = app.add_subcommand("list", "Show the entries of an archive with their sizes");
  list->add_option("ARCHIVE", listing.archive, "The archive file")->required();
  list->add_flag("--json", listing.json, "Print one JSON document instead of the table");
  list->add_flag("-l,--long", listing.lng, "Also show each entry's offset, extra value and flag");

  ExtractOptions extract;
  CLI::App* extractCommand = app.add_subcommand(
      "extract", "Write the entries of an archive, or those matching NAME, into a folder");
  extractCommand->add_option("ARCHIVE", extract.archive, "The archive file")->required();
  extractCommand->add_option("NAME", extract.patterns,
                             "Entry names or patterns (* any run, ? one character, no case; "
                             "'/' or '\\' between folders; a folder selects what lies below it)");
  extractCommand->add_option("-o,--output", extract.outputDir,
                             "Folder to write into, made when missing (default: .)");
  extractCommand->add_flag("--overwrite", extract.overwrite,
                           "Replace files that existed before this run");
  std::string duplicates = "rename";
  extractCommand
      ->add_option("--duplicates", duplicates,
                   "An entry whose path an earlier entry took: rename (default; THINGS_1, "
                   "a_1.txt), skip, or overwrite the earlier one")
      ->check(CLI::IsMember({"rename", "skip", "overwrite"}));
  extractCommand->add_flag("-q,--quiet", extract.quiet, "Report problems only");

  TestOptions test;
  CLI::App* testCommand = app.add_subcommand(
      "test", "Decode every entry of each archive without writing it; one line per archive");
  testCommand->add_option("ARCHIVE", test.paths, "Archive files, or folders with -r")->required();
  testCommand->add_flag("-r,--recursive", test.recursive,
                        "Test the archives in folders and below, passing over other files");

  std::vector<std::string> detectFiles;
  CLI::App* detect = app.add_subcommand("detect", "Tell the format of each file, or \"unknown\"");
  detect->add_option("FILE", detectFiles, "Files to recognise")->required();

  CLI::App* formats = app.add_subcommand("formats", "List all known formats");

  if (argc <= 1) {
    fmt::print("{}", app.help());
    return kExitUsage;
  }
  try {
    app.parse(argc, argv);
  } catch (const CLI::ParseError& e) {
    if (e.get_exit_code() == 0) return app.exit(e);  // --help, --version
    fmt::print(stderr, "cairn: {} (see cairn --help)\n", e.what());
    return kExitUsage;
  }

  try {
    if (list->parsed()) return ListCommand(listing);
    if (extractCommand->parsed()) {
      extract.duplicates = duplicates == "skip"        ? Duplicates::Skip
                           : duplicates == "overwrite" ? Duplicates::Overwrite
                                                       : Duplicates::Rename;
      return ExtractCommand(extract);
    }
    if (testCommand->parsed()) return TestCommand(test);
    if (detect->parsed()) return DetectCommand(detectFiles);
    if (formats->parsed()) return FormatsCommand();
  } catch (const std::exception& e) {
    fmt::print(stderr, "cairn: {}\n", e.what());
    return kExitFailed;
  }
  return kExitUsage;
}
