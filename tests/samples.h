// The table of sample archives: one row per archive, built in code, with the
// exact listing it must give and the exact bytes of every entry. One test
// walks the table through recognition and through each reader; the same rows
// are replayed through the plug-in as a file manager loads it, the
// command-line tool, Wine and the mutation test.
#pragma once

#include <string>
#include <string_view>
#include <tuple>
#include <utility>
#include <vector>

#include "builder.h"

namespace cairn::test {

struct Sample {
  std::string label;
  FormatId id = 0;
  std::string fileName = "test.bin";  // recognition may look at the extension
  Bytes bytes;
  std::vector<Listed> listing;                                 // the whole listing, in order
  std::vector<Bytes> data;                                     // what extracting each entry writes
  std::vector<std::pair<std::string, Bytes>> companions = {};  // files beside it
  bool recognised = true;  // false where recognition cannot reach the format
};

using SampleTable = std::vector<Sample>;
using SampleMaker = SampleTable (*)();
std::vector<SampleMaker>& SampleMakers();

// Every registered sample, in registration order.
SampleTable AllSamples();

// Writes the archive and its companions into `dir`; answers the archive's path.
std::string WriteSample(const Sample& s, const std::filesystem::path& dir);

// The row `s` with entries that are all stored as they are, each given as
// (listed name, offset, bytes).
Sample Row(Sample s, const std::vector<std::tuple<std::string, uint32_t, Bytes>>& entries);

// The row `s` with entries given as listed, each with the bytes extracting it writes.
Sample Entries(Sample s, const std::vector<std::pair<Listed, Bytes>>& entries);

// The bytes of row `s` with the u32 at `at` set to `v`: a row broken in one word.
Bytes With(const Sample& s, size_t at, uint32_t v);

// An archive that opens as `format` with exactly `listing`, such as one at a bound.
void ExpectLists(FormatId format, const Bytes& bytes, const std::vector<Listed>& listing);

// An archive that opening as `format` must refuse: OpenResult 12, no table
// and no open file left.
void ExpectRefused(FormatId format, const Bytes& bytes, std::string_view fileName = "test.bin");

// Refusals grouped in a table, each traced by what it shows.
struct RefusedCase {
  const char* what;
  FormatId format;
  Bytes bytes;
};
void ExpectRefused(const std::vector<RefusedCase>& cases);

struct SampleRegistrar {
  explicit SampleRegistrar(SampleMaker make) { SampleMakers().push_back(make); }
};

}  // namespace cairn::test

// Defines a function that returns rows of the sample table and registers it:
//   CAIRN_SAMPLES(NameBlockSamples) { return {{"AFS archive", 9, ...}, ...}; }
#define CAIRN_SAMPLES(name)                                           \
  static ::cairn::test::SampleTable name();                           \
  static const ::cairn::test::SampleRegistrar name##Registrar(&name); \
  static ::cairn::test::SampleTable name()
