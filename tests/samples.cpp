#include "samples.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

namespace cairn::test {
namespace {

void ExpectListsAndExtracts(const Sample& s, Opened& o) {
  EXPECT_EQ(o.listing(), s.listing);
  ASSERT_EQ(s.data.size(), s.listing.size()) << "the row itself";
  ASSERT_EQ(o.session.entries.size(), s.data.size());
  for (size_t i = 0; i < s.data.size(); ++i)
    EXPECT_EQ(o.extract(i), s.data[i]) << s.listing[i].name;
}

}  // namespace

std::vector<SampleMaker>& SampleMakers() {
  static std::vector<SampleMaker> makers;
  return makers;
}

SampleTable AllSamples() {
  SampleTable all;
  for (SampleMaker make : SampleMakers())
    for (Sample& s : make()) all.push_back(std::move(s));
  return all;
}

std::string WriteSample(const Sample& s, const std::filesystem::path& dir) {
  for (const auto& [name, bytes] : s.companions) WriteFile(dir / name, bytes);
  return WriteFile(dir / s.fileName, s.bytes);
}

Sample Row(Sample s, const std::vector<std::tuple<std::string, uint32_t, Bytes>>& entries) {
  for (const auto& [name, offset, data] : entries) {
    s.listing.push_back({name, offset, uint32_t(data.size()), uint32_t(data.size()), 0, 0});
    s.data.push_back(data);
  }
  return s;
}

Sample Entries(Sample s, const std::vector<std::pair<Listed, Bytes>>& entries) {
  for (const auto& [listed, data] : entries) {
    s.listing.push_back(listed);
    s.data.push_back(data);
  }
  return s;
}

Bytes With(const Sample& s, size_t at, uint32_t v) {
  return ArchiveBuilder().bytes(s.bytes).patch32(at, v).get();
}

void ExpectLists(FormatId format, const Bytes& bytes, const std::vector<Listed>& listing) {
  auto o = OpenBytesAs(format, bytes);
  EXPECT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), listing);
}

void ExpectRefused(FormatId format, const Bytes& bytes, std::string_view fileName) {
  auto o = OpenBytesAs(format, bytes, fileName);
  EXPECT_EQ(o->result, kBadData);
  EXPECT_TRUE(o->session.entries.empty());
  EXPECT_FALSE(o->session.archive);
}

void ExpectRefused(const std::vector<RefusedCase>& cases) {
  for (const RefusedCase& k : cases) {
    SCOPED_TRACE(k.what);
    ExpectRefused(k.format, k.bytes);
  }
}

// Every row opens as its format, through recognition where recognition
// reaches it and through its reader alone, lists exactly and extracts every
// entry exactly.
TEST(Samples, EachListsAndExtractsExactly) {
  for (const Sample& s : AllSamples()) {
    SCOPED_TRACE(s.label);
    auto direct = std::make_unique<Opened>();
    const std::string path = WriteSample(s, direct->dir.dir());
    ASSERT_EQ(OpenArchiveAs(direct->session, path, s.id), kOk);
    ExpectListsAndExtracts(s, *direct);
    if (!s.recognised) continue;
    auto o = std::make_unique<Opened>();
    ASSERT_EQ(OpenArchiveSession(o->session, path), kOk);
    EXPECT_EQ(o->session.format, s.id);
    ExpectListsAndExtracts(s, *o);
  }
}

// Writes every sample that recognition reaches to the folder
// CAIRN_DUMP_FIXTURES names, for the hosts that run outside this test binary:
// folder N holds the archive and its companions, and list.txt has a line
// "N FILENAME" for each.
TEST(Samples, DumpWhenAsked) {
  const char* root = std::getenv("CAIRN_DUMP_FIXTURES");
  if (root == nullptr) GTEST_SKIP() << "CAIRN_DUMP_FIXTURES is not set";
  std::string list;
  int n = 0;
  for (const Sample& s : AllSamples())
    if (s.recognised) {
      WriteSample(s, std::filesystem::path(root) / std::to_string(n));
      list += std::to_string(n++) + ' ' + s.fileName + '\n';
    }
  WriteFile(std::filesystem::path(root) / "list.txt", Text(list));
}

}  // namespace cairn::test
