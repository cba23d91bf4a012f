// The inflate method: capacities by format and Flag, the length prefix of
// the compressed JPEG container, and streams that must fail.
#include <gtest/gtest.h>

#include "media_support.h"
#include "table_checks.h"

namespace cairn::test {
namespace {

TEST(InflateMethod, AStreamShorterThanItsCapacityGivesItsOwnLength) {
  const Bytes data = Pattern(300);
  const Bytes z = Compress(data);
  const auto packed = static_cast<uint32_t>(z.size());
  MediaArchive a(10, z);
  a.add("short", 0, 1000, packed, 0, 0)
      .add("exact", 0, 300, packed, 0, 0)
      .add("over", 0, 299, packed, 0, 0)
      .add("empty", 0, 300, 0, 0, 0)
      .add("cut", 0, 300, packed - 1, 0, 0);
  EXPECT_EQ(a.extract(0), data);
  EXPECT_EQ(a.extract(1), data);
  Bytes out;
  EXPECT_EQ(a.extract(2, out), kBadData);  // one byte more than the capacity
  EXPECT_EQ(a.extract(3, out), kBadData);  // no stream at all
  EXPECT_EQ(a.extract(4, out), kBadData);  // the checksum is cut off
}

TEST(InflateMethod, TheJpegContainerWritesWhatItsPrefixCounts) {
  // The inflated data: a u32 length, then the picture (and possibly more).
  const Bytes picture = Pattern(200000, 3);
  const auto prefixed = [&](uint32_t n) {
    return Compress(ArchiveBuilder().u32(n).bytes(picture).get());
  };
  const Bytes fewer = prefixed(1000), more = prefixed(300000);
  const auto a0 = static_cast<uint32_t>(fewer.size()), a1 = static_cast<uint32_t>(more.size());
  MediaArchive a(109, Join(fewer, more));
  a.add("plain", 0, 200004, a0, 0, 0)
      .add("_TO_JPG_\\fewer.jpg", 0, 1000, a0, 200004, 1)
      .add("_TO_JPG_\\more.jpg", a0, 300000, a1, 200004, 1)
      .add("_TO_JPG_\\small.jpg", 0, 1000, a0, 200003, 1);
  EXPECT_EQ(a.extract(0), ArchiveBuilder().u32(1000).bytes(picture).get());
  EXPECT_EQ(a.extract(1), Slice(picture, 0, 1000));
  EXPECT_EQ(a.extract(2), picture);  // no more than the stream holds
  Bytes out;
  EXPECT_EQ(a.extract(3, out), kBadData);  // the capacity comes from Extra
}

TEST(InflateMethod, PaletteBanksInflateToAtMostFourMebibytes) {
  const Bytes fits = Compress(Bytes(4194304, 7)), over = Compress(Bytes(4194305, 7));
  const auto f = static_cast<uint32_t>(fits.size()), o = static_cast<uint32_t>(over.size());
  MediaArchive a(115, Join(fits, over));
  a.add("raw", 0, f, f, 0, 0).add("fits", 0, 16, f, 0, 1).add("over", f, 16, o, 0, 1);
  EXPECT_EQ(a.extract(0), fits);
  EXPECT_EQ(a.extract(1), Bytes(4194304, 7));
  Bytes out;
  EXPECT_EQ(a.extract(2, out), kBadData);
}

}  // namespace
}  // namespace cairn::test
