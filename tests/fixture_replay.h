// Checks a registered fixture through its reader alone, without recognition:
// the listing holds exactly the fixture's names and every entry extracts to
// exactly the fixture's bytes.
#pragma once

#include <gtest/gtest.h>

#include "fixtures.h"
#include "samples.h"

namespace cairn::test {

inline void ReplayFixture(const Fixture& f) {
  SCOPED_TRACE(f.label);
  auto o = OpenBytesAs(f.id, f.bytes, f.fileName);
  ASSERT_EQ(o->result, kOk);
  ASSERT_EQ(o->session.entries.size(), f.entries.size());
  for (size_t i = 0; i < f.entries.size(); ++i) {
    const std::string& name = f.entries[i].name;
    EXPECT_EQ(o->session.entries[i].Name, name);
    EXPECT_EQ(o->extract(i), f.entries[i].bytes) << name;
  }
}

}  // namespace cairn::test
