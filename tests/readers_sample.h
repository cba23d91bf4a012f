// An archive built in a reader test together with what its listing and its
// extraction must give; it is checked by the test and registered as a
// fixture.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

#include "builder.h"
#include "fixtures.h"

namespace cairn::test {

struct Sample {
  std::string fileName = "test.bin";
  Bytes bytes;
  std::vector<Listed> listing;
  std::vector<Bytes> data;  // what extracting each entry writes
  // Entries whose extraction method (TGA, run-length, "JDLZ") comes with
  // another change; only the tests named "...Pending..." extract them.
  std::vector<size_t> pending;

  bool isPending(size_t i) const {
    return std::find(pending.begin(), pending.end(), i) != pending.end();
  }
};

// Opens the sample as `format`, checks the listing exactly and extracts
// every entry (or only the pending ones), comparing the bytes exactly.
inline void ExpectSample(FormatId format, const Sample& s, bool pendingOnly = false) {
  auto o = OpenBytesAs(format, s.bytes, s.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), s.listing);
  ASSERT_EQ(s.data.size(), s.listing.size());
  ASSERT_EQ(o->session.entries.size(), s.data.size());
  for (size_t i = 0; i < s.data.size(); ++i)
    if (s.isPending(i) == pendingOnly) EXPECT_EQ(o->extract(i), s.data[i]) << s.listing[i].name;
}

// The same archive as a fixture, replayed through recognition.
inline Fixture SampleFixture(std::string label, FormatId format, const Sample& s) {
  Fixture f;
  f.label = std::move(label);
  f.id = format;
  f.fileName = s.fileName;
  f.bytes = s.bytes;
  for (size_t i = 0; i < s.listing.size(); ++i) f.entries.push_back({s.listing[i].name, s.data[i]});
  return f;
}

// An archive that opens as `format` with exactly `listing`.
struct ListingCase {
  const char* what;
  FormatId format;
  Bytes bytes;
  std::vector<Listed> listing;
};

inline void ExpectListings(const std::vector<ListingCase>& cases) {
  for (const ListingCase& k : cases) {
    SCOPED_TRACE(k.what);
    auto o = OpenBytesAs(k.format, k.bytes);
    EXPECT_EQ(o->result, kOk);
    EXPECT_EQ(o->listing(), k.listing);
  }
}

// An archive that opening as `format` refuses: the error exit, nothing
// listed.
struct RefusedCase {
  const char* what;
  FormatId format;
  Bytes bytes;
};

inline void ExpectRefused(const std::vector<RefusedCase>& cases) {
  for (const RefusedCase& k : cases) {
    SCOPED_TRACE(k.what);
    auto o = OpenBytesAs(k.format, k.bytes);
    EXPECT_EQ(o->result, kBadData);
    EXPECT_TRUE(o->session.entries.empty());
  }
}

// `bytes` made at least `size` long with zeros.
inline Bytes Padded(ArchiveBuilder w, size_t size = kHeaderSize) {
  return w.padTo(size).get();
}

}  // namespace cairn::test
