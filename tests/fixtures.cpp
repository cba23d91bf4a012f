#include "fixtures.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

namespace cairn::test {

std::vector<FixtureMaker>& FixtureMakers() {
  static std::vector<FixtureMaker> makers;
  return makers;
}

std::vector<Fixture> AllFixtures() {
  std::vector<Fixture> all;
  for (FixtureMaker make : FixtureMakers()) all.push_back(make());
  return all;
}

// Every fixture is recognised as its format, lists exactly and extracts
// exactly through the core.
TEST(Fixtures, EachListsAndExtractsThroughRecognition) {
  for (const Fixture& f : AllFixtures()) {
    SCOPED_TRACE(f.label);
    auto o = std::make_unique<Opened>();
    for (const auto& [name, bytes] : f.companions) o->dir.write(name, bytes);
    const std::string path = o->dir.write(f.fileName, f.bytes);
    ASSERT_EQ(OpenArchiveSession(o->session, path), kOk);
    EXPECT_EQ(o->session.format, f.id);
    ASSERT_EQ(o->session.entries.size(), f.entries.size());
    for (size_t i = 0; i < f.entries.size(); ++i) {
      EXPECT_EQ(o->session.entries[i].Name, f.entries[i].name);
      EXPECT_EQ(o->extract(i), f.entries[i].bytes) << f.entries[i].name;
    }
  }
}

// Writes every fixture to the folder CAIRN_DUMP_FIXTURES names, for the
// hosts that run outside this test binary: folder NN holds the archive and
// its companions, and list.txt has a line "NN FILENAME" for each.
TEST(Fixtures, DumpWhenAsked) {
  const char* root = std::getenv("CAIRN_DUMP_FIXTURES");
  if (root == nullptr) GTEST_SKIP() << "CAIRN_DUMP_FIXTURES is not set";
  std::filesystem::create_directories(root);
  std::ofstream list(std::filesystem::path(root) / "list.txt");
  int n = 0;
  for (const Fixture& f : AllFixtures()) {
    const auto dir = std::filesystem::path(root) / std::to_string(n);
    std::filesystem::create_directories(dir);
    for (const auto& [name, bytes] : f.companions) {
      std::ofstream(dir / name, std::ios::binary)
          .write(reinterpret_cast<const char*>(bytes.data()),
                 static_cast<std::streamsize>(bytes.size()));
    }
    std::ofstream(dir / f.fileName, std::ios::binary)
        .write(reinterpret_cast<const char*>(f.bytes.data()),
               static_cast<std::streamsize>(f.bytes.size()));
    list << n << ' ' << f.fileName << '\n';
    ++n;
  }
}

}  // namespace cairn::test
