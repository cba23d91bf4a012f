#include <gtest/gtest.h>

#include "builder.h"
#include "util/bytes.h"
#include "util/file.h"
#include "util/names.h"

namespace cairn {
namespace {

using test::Bytes;

TEST(ByteView, ReadsLittleAndBigEndianAndRefusesEveryByteOutside) {
  const Bytes b = {0x01, 0x02, 0x03, 0x04, 0x05};
  const ByteView v(b);
  EXPECT_EQ(v.u16le(0), 0x0201);
  EXPECT_EQ(v.u16be(0), 0x0102);
  EXPECT_EQ(v.u24le(2), 0x050403u);
  EXPECT_EQ(v.u32le(1), 0x05040302u);
  EXPECT_EQ(v.u32be(0), 0x01020304u);
  EXPECT_THROW(v.u32le(2), BadData);
  EXPECT_THROW(v.u8(5), BadData);
  EXPECT_THROW(v.sub(4, 2), BadData);
  EXPECT_THROW(v.u32le(UINT64_MAX - 1), BadData);  // no wrap-around
  EXPECT_EQ(v.sub(5, 0).size(), 0u);
  EXPECT_FALSE(v.matches(3, "abc"));
}

TEST(ByteView, NameFieldsEndAtTheirFirstZeroOrTheirWidth) {
  const Bytes b = {'A', 'B', 0, 'C', 'D', 'E', 'F'};
  const ByteView v(b);
  EXPECT_EQ(v.field(0, 4), "AB");
  EXPECT_EQ(v.field(3, 4), "CDEF");
  EXPECT_THROW(v.field(4, 4), BadData);
  EXPECT_EQ(v.cstr(0, 10), "AB");
  EXPECT_THROW(v.cstr(3, 10), BadData);  // no terminator before the end
  EXPECT_THROW(v.cstr(0, 2), BadData);   // none within the bound
}

TEST(Names, FileNamePartTakesTheTextAfterTheLastSeparator) {
  EXPECT_EQ(FileNamePart("C:\\games\\data.pak"), "data.pak");
  EXPECT_EQ(FileNamePart("data.pak"), "data.pak");
  EXPECT_EQ(FileNamePart("\\data.pak"), "\\data.pak");  // position 0 is not examined
#ifndef _WIN32
  EXPECT_EQ(FileNamePart("/games/doom/maps.pak"), "maps.pak");
#endif
}

TEST(Names, ExtensionsAndTheirRemoval) {
  EXPECT_FALSE(FindExtension(".profile"));
  EXPECT_EQ(FindExtension("a.b.c"), 3u);
  EXPECT_EQ(FindExtension("end."), 3u);
  EXPECT_EQ(StripExtension("sound.bank.dat"), "sound.bank");
  EXPECT_EQ(StripExtension("dir.x\\readme"), "");
  EXPECT_EQ(StripExtension(".profile"), "");
  EXPECT_EQ(PathExtension("C:\\x\\data.IMG"), ".IMG");
  EXPECT_EQ(PathExtension("C:\\x.d\\data"), "");
  EXPECT_EQ(PathExtension("noext"), "");
  EXPECT_TRUE(EqualNoCase(".Img", ".iMG"));
  EXPECT_LT(CompareNamesNoCase("abc", "ABD"), 0);
  EXPECT_EQ(CompareNamesNoCase("MAP01", "map01"), 0);
}

TEST(Names, NumberedNamesPadToSixDigitsAndLongerNumbersTakeTheDot) {
  EXPECT_EQ(NumberedName("data.bin", 42), "data.bin.000042");
  EXPECT_EQ(NumberedName("x", 0), "x.000000");
  EXPECT_EQ(NumberedName("x", 7), "x.000007");
  EXPECT_EQ(NumberedName("x", 999999), "x.999999");
  EXPECT_EQ(NumberedName("x", 1234567), "x1234567");
  EXPECT_EQ(NumberedName("x", 4000000000u), "x4000000000");
}

TEST(Names, SignedVarIntsOfOneToFiveBytes) {
  size_t used = 0;
  const Bytes a = {0x45, 0x03};
  EXPECT_EQ(DecodeSignedVarInt(ByteView(a), 0, used), 197);
  EXPECT_EQ(used, 2u);
  const Bytes b = {0x85};
  EXPECT_EQ(DecodeSignedVarInt(ByteView(b), 0, used), -5);
  EXPECT_EQ(used, 1u);
  const Bytes c = {0x7F, 0xFF, 0xFF, 0xFF, 0x7F, 0x55};
  DecodeSignedVarInt(ByteView(c), 0, used);
  EXPECT_EQ(used, 5u);
  const Bytes cut = {0x40};  // announces a second byte that is not there
  EXPECT_THROW(DecodeSignedVarInt(ByteView(cut), 0, used), BadData);
}

TEST(FileHelpers, ReadsAreExactAndPositionsStopAtTwoGiB) {
  test::TempDir dir;
  const std::string p = dir.write("f", test::Pattern(103));
  File f(os::OpenShared(p.c_str()));
  ASSERT_TRUE(f);
  uint8_t buffer[104];
  EXPECT_FALSE(ReadAt(f.get(), buffer, 0, 104));
  EXPECT_TRUE(ReadAt(f.get(), buffer, 0, 103));
  EXPECT_TRUE(ReadAt(f.get(), buffer, 103, 0));
  EXPECT_FALSE(ReadAt(f.get(), buffer, 2147483648u, 0));
  EXPECT_FALSE(SeekTo(f.get(), 0xFFFFFFFFu));
  EXPECT_EQ(os::SizeLow(f.get()), 103u);
}

TEST(FileHelpers, OnlyRegularFilesOpen) {
  test::TempDir dir;
  EXPECT_EQ(os::OpenShared(dir.dir().string().c_str()), os::kNoFile);
  EXPECT_EQ(os::OpenShared(dir.path("missing").c_str()), os::kNoFile);
  EXPECT_EQ(os::OpenShared(""), os::kNoFile);
}

}  // namespace
}  // namespace cairn
