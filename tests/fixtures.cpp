#include "fixtures.h"

#include <gtest/gtest.h>

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

}  // namespace cairn::test
