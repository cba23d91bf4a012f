// Checks shared by the tests of the table-driven readers: an archive opened
// as one format lists exactly and extracts every entry exactly.
#pragma once

#include <gtest/gtest.h>

#include <string_view>
#include <vector>

#include "builder.h"
#include "fixture_replay.h"
#include "fixtures.h"

namespace cairn::test {

inline void ExpectListsAndExtracts(FormatId id, const Fixture& f,
                                   const std::vector<Listed>& listing) {
  auto o = OpenBytesAs(id, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->session.format, id);
  ASSERT_EQ(o->listing(), listing);
  ASSERT_EQ(f.entries.size(), listing.size());
  for (size_t i = 0; i < f.entries.size(); ++i) {
    EXPECT_EQ(listing[i].name, f.entries[i].name);
    EXPECT_EQ(o->extract(i), f.entries[i].bytes) << f.entries[i].name;
  }
}

}  // namespace cairn::test
