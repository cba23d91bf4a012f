// The quirks of the byte view and the name helpers that every reader leans
// on and that the sample archives do not reach.
#include <gtest/gtest.h>

#include "builder.h"
#include "util/bytes.h"
#include "util/file.h"
#include "util/names.h"

namespace cairn {
namespace {

using test::Bytes;

TEST(ByteView, ReadsBothByteOrdersAndRefusesEveryByteOutside) {
  const Bytes b = {0x01, 0x02, 0x03, 0x04, 0x05, 'A', 'B', 0};
  const ByteView v(b);
  EXPECT_EQ(v.u16be(0) + v.u24le(2), 0x0102 + 0x050403u);
  EXPECT_EQ(v.u32be(0), 0x01020304u);
  EXPECT_THROW(v.u32le(5), BadData);
  EXPECT_THROW(v.sub(7, 2), BadData);
  EXPECT_THROW(v.u32le(UINT64_MAX - 1), BadData);  // no wrap-around
  EXPECT_EQ(v.field(5, 3), "AB");
  EXPECT_THROW(v.cstr(5, 2), BadData);             // no terminator within the bound
  EXPECT_THROW(v.sub(0, 7).cstr(5, 10), BadData);  // none before the end
}

TEST(Names, TheRulesOfNamesAndNumbers) {
  EXPECT_EQ(FileNamePart("C:\\games\\data.pak"), "data.pak");
  EXPECT_EQ(FileNamePart("\\data.pak"), "\\data.pak");  // position 0 is not examined
  EXPECT_FALSE(FindExtension(".profile"));
  EXPECT_EQ(StripExtension("dir.x\\readme"), "");
  EXPECT_EQ(PathExtension("C:\\x.d\\data"), "");
  EXPECT_EQ(NumberedName("data.bin", 42), "data.bin.000042");
  EXPECT_EQ(NumberedName("x", 1234567), "x1234567");  // longer numbers take the dot
  EXPECT_EQ(NumberedName("x", 4000000000u), "x4000000000");
  size_t used = 0;
  EXPECT_EQ(DecodeSignedVarInt(ByteView(Bytes{0x45, 0x03}), 0, used), 197);
  EXPECT_EQ(DecodeSignedVarInt(ByteView(Bytes{0x85}), 0, used), -5);
  DecodeSignedVarInt(ByteView(Bytes{0x7F, 0xFF, 0xFF, 0xFF, 0x7F, 0x55}), 0, used);
  EXPECT_EQ(used, 5u);
  EXPECT_THROW(DecodeSignedVarInt(ByteView(Bytes{0x40}), 0, used), BadData);
}

TEST(FileHelpers, ReadsAreExactPositionsStopAtTwoGiBAndOnlyFilesOpen) {
  test::TempDir dir;
  File f(os::OpenShared(dir.write("f", test::Pattern(103)).c_str()));
  uint8_t buffer[104];
  EXPECT_FALSE(ReadAt(f.get(), buffer, 0, 104));
  EXPECT_TRUE(ReadAt(f.get(), buffer, 103, 0));
  EXPECT_FALSE(ReadAt(f.get(), buffer, 2147483648u, 0));
  EXPECT_FALSE(SeekTo(f.get(), 0xFFFFFFFFu));
  EXPECT_EQ(os::OpenShared(dir.dir().string().c_str()), os::kNoFile);
  EXPECT_EQ(os::OpenShared(dir.path("missing").c_str()), os::kNoFile);
}

}  // namespace
}  // namespace cairn
