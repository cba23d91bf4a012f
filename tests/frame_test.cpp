// The extraction frame and the raw copy: chunking, progress reports, the
// three endings, and the composite track joined from enciphered entries.
#include <gtest/gtest.h>

#include "builder.h"
#include "core/extract.h"

namespace cairn {
namespace {

using test::Bytes;
using test::Pattern;
using test::SessionOver;

ArchiveEntry Entry(uint32_t offset, uint32_t size, uint8_t flag = 0) {
  return ArchiveEntry{"e", offset, size, size, 0, flag};
}

// Records every progress report; answers 0 at report number `stopAt`.
struct Reports {
  std::vector<uint32_t> sizes;
  size_t stopAt = SIZE_MAX;
  void attach(ArchiveSession& s) {
    s.progress = [this](const std::string&, uint32_t n) {
      sizes.push_back(n);
      return sizes.size() == stopAt ? 0 : 1;
    };
  }
};

// Each case: the stored bytes, one entry, the stop the callback asks for;
// the result, the bytes written and the reports made.
TEST(RawCopy, CopiesInChunksReportsEachAndEndsInOneOfThreeWays) {
  const Bytes big = Pattern(3000100);
  struct Case {
    const char* what;
    Bytes stored;
    ArchiveEntry entry;
    size_t stopAt;
    int result;
    Bytes written;
    std::vector<uint32_t> reports;
  };
  const Case cases[] = {
      {"empty", Pattern(200), Entry(50, 0), SIZE_MAX, kOk, {}, {0}},
      {"three chunks",
       big,
       Entry(100, 3000000),
       SIZE_MAX,
       kOk,
       test::Slice(big, 100, 3000000),
       {1048576, 1048576, 902848, 3000000}},
      {"past the end", Pattern(200), Entry(150, 51), SIZE_MAX, kBadData, {}, {}},
      {"stop during", big, Entry(0, 3000000), 2, kAborted, {}, {1048576, 1048576}},
      {"stop at the end", big, Entry(0, 10), 2, kAborted, {}, {10, 10}},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    auto o = SessionOver(15, c.stored, {c.entry});
    Reports r;
    r.stopAt = c.stopAt;
    r.attach(o->session);
    Bytes out;
    EXPECT_EQ(o->extract(0, out), c.result);
    EXPECT_EQ(out, c.written);
    EXPECT_EQ(r.sizes, c.reports);
  }
  // No callback set: nothing stops the copy. An output that cannot be created.
  auto o = SessionOver(15, big, {Entry(10, 20)});
  EXPECT_EQ(o->extract(0), test::Slice(big, 10, 20));
  EXPECT_EQ(ExtractEntry(o->session, 0, o->dir.path("no/such/folder/x")), kCreateFailed);
}

// Enciphers as the sound banks store their data: each little-endian word at
// archive position p XOR key word p mod 16.
Bytes Encipher(Bytes b, uint32_t position) {
  for (size_t i = 0; i + 4 <= b.size(); i += 4) {
    const uint32_t key = kPositionKeyTable[(position + i) % 16];
    for (int k = 0; k < 4; ++k) b[i + k] ^= static_cast<uint8_t>(key >> (8 * k));
  }
  return b;
}

// A station catalogue whose entries 0..179 each hold their own index in four
// enciphered bytes.
std::unique_ptr<test::Opened> Catalogue(std::vector<ArchiveEntry> extra) {
  test::ArchiveBuilder a;
  std::vector<ArchiveEntry> entries;
  for (uint32_t i = 0; i < 180; ++i) {
    const uint32_t at = static_cast<uint32_t>(a.size());
    a.bytes(Encipher({static_cast<uint8_t>(i), 0, 0, 0}, at));
    entries.push_back(Entry(at, 4, 1));
  }
  for (auto& e : extra) entries.push_back(e);
  return SessionOver(65, a.get(), entries);
}

TEST(CompositeTrack, JoinsThreeEntriesChosenByTheFlag) {
  auto o = Catalogue(
      {Entry(0, 0, 2), Entry(0, 0, 62), Entry(0, 0, 39), Entry(0, 0, 92), Entry(0, 0, 161)});
  EXPECT_EQ(o->extract(180), (Bytes{61, 0, 0, 0, 60, 0, 0, 0, 64, 0, 0, 0}));     // T, T-1, T+3
  EXPECT_EQ(o->extract(181), (Bytes{141, 0, 0, 0, 142, 0, 0, 0, 146, 0, 0, 0}));  // T, T+1, T+5
  EXPECT_EQ(o->extract(182), (Bytes{92, 0, 0, 0, 91, 0, 0, 0, 93, 0, 0, 0}));     // T, T-1, T+1
  EXPECT_EQ(o->extract(183), (Bytes{137, 0, 0, 0, 136, 0, 0, 0, 138, 0, 0, 0}));
  Bytes out;
  EXPECT_EQ(o->extract(184, out), kBadData);  // table value 0: part -1 is outside
}

}  // namespace
}  // namespace cairn
