// An archive built in a reader test together with what its listing and its
// extraction must give; it is checked by the test and registered as a
// fixture.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "builder.h"
#include "fixture_replay.h"
#include "fixtures.h"

namespace cairn::test {

struct ReaderSample {
  std::string fileName = "test.bin";
  Bytes bytes;
  std::vector<Listed> listing;
  std::vector<Bytes> data;  // what extracting each entry writes
};

// Opens the sample as `format`, checks the listing exactly and extracts
// every entry, comparing the bytes exactly.
inline void ExpectSample(FormatId format, const ReaderSample& s) {
  auto o = OpenBytesAs(format, s.bytes, s.fileName);
  ASSERT_EQ(o->result, kOk);
  EXPECT_EQ(o->listing(), s.listing);
  ASSERT_EQ(s.data.size(), s.listing.size());
  ASSERT_EQ(o->session.entries.size(), s.data.size());
  for (size_t i = 0; i < s.data.size(); ++i)
    EXPECT_EQ(o->extract(i), s.data[i]) << s.listing[i].name;
}

// The same archive as a fixture, replayed through recognition.
inline Fixture SampleFixture(std::string label, FormatId format, const ReaderSample& s) {
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

// `bytes` made at least `size` long with zeros.
inline Bytes Padded(ArchiveBuilder w, size_t size = kHeaderSize) {
  return w.padTo(size).get();
}

}  // namespace cairn::test
