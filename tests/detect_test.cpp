// Recognition of real files (rules read them and look beside them): each format's
// minimal file and the bytes it cannot do without, then near misses and order.
#include "detect/detect.h"

#include <gtest/gtest.h>

#include <map>
#include <numeric>

#include "detect_fixtures.h"
#include "util/file.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

// Recognises the case's file, written beside its companions, as the open frame does.
FormatId Detect(const DetectCase& c) {
  const TempDir dir;
  for (const auto& [name, bytes] : c.companions) dir.write(name, bytes);
  const std::string p = dir.write(c.fileName.empty() ? "a.res" : c.fileName, c.bytes);
  const File f(os::OpenShared(p.c_str()));
  Bytes header(kHeaderSize);
  EXPECT_TRUE(f && ReadAt(f.get(), header.data(), 0, kHeaderSize)) << p;
  return DetectFormat(ByteView(header), c.fileName.empty() ? "" : p, f.get());
}

// The bytes each rule looks at in its format's minimal file: changing any
// one of them loses the id. Every byte of a magic counts the same way.
// clang-format off
const std::map<FormatId, std::vector<size_t>> kCounted = {
    {80, {0, 3}}, {81, {0, 4, 8, 12}}, {82, {0, 4, 8}}, {83, {64, 68, 72, 96, 100}}, {85, {0, 44}},
    {86, {0, 44}}, {87, {2, 4, 8}}, {88, {0, 4, 22}}, {89, {0, 84}}, {90, {0, 114, 115, 119}},
    {92, {0, 4, 8, 12}}, {93, {4, 8, 12}}, {94, {0, 4, 6, 8}}, {95, {0, 4, 6, 8}},
    {96, {0, 5, 6, 10, 15, 16}}, {97, {0, 3, 12}}, {99, {0, 10, 55}}, {100, {6, 11, 55}},
    {101, {0}}, {102, {0, 3, 4, 8, 16}}, {103, {12, 16, 32, 36, 52, 56, 72}}, {104, {4, 5}},
    {105, {16, 20, 38, 42, 60, 64, 86}}, {106, {0, 2}}, {107, {0}}, {109, {0, 1}}, {110, {0, 4}},
    {111, {0, 3, 8}}, {112, {0, 3, 8}}, {113, {0, 3}}, {116, {0, 4, 7}}, {117, {0, 4}},
    {118, {0, 132}}, {119, {256, 271}}, {120, {4, 7}}, {122, {0, 4}}, {123, {36, 46}},
    {124, {36, 47}}, {125, {0, 1}}, {127, {8}}, {128, {1, 5, 9, 12}}, {129, {0}}, {131, {0, 1}},
    {133, {0, 3}}, {135, {0}}, {136, {8}}, {137, {0}}, {138, {8}}, {139, {0, 3, 5, 6}}, {141, {0}},
    {142, {0, 1}}, {145, {0, 23, 52, 62, 83}}, {146, {0}}, {147, {4, 5}}, {149, {4, 8}},
    {151, {0, 4, 8}}, {152, {0, 4, 8}}, {153, {0, 111, 116}}, {154, {32, 47}}, {155, {0, 3, 8, 15}},
    {156, {0, 4}}, {157, {84, 91}}};
// clang-format on

TEST(Detect, EachFormatAndTheBytesItNeeds) {
  FormatId next = 1;  // ascending, every id that recognition can answer
  for (const DetectCase& c : DetectCases()) {
    SCOPED_TRACE(std::to_string(c.id) + " " + c.fileName);
    EXPECT_EQ(c.id, next);
    next = c.id + 1;
    for (const UnreachableFormat& u : UnreachableFormats()) next += u.id == next;
    EXPECT_EQ(Detect(c), c.id);
    std::vector<size_t> counted(c.id < 80 ? SignatureTable()[c.id - 1].magic.size() : 0);
    std::iota(counted.begin(), counted.end(), 0);
    if (kCounted.count(c.id)) counted = kCounted.at(c.id);
    for (size_t at : counted) {
      DetectCase changed = c;
      changed.bytes[at] ^= 0x20;  // changes letter case too
      EXPECT_NE(Detect(changed), c.id) << "byte " << at;
    }
  }
  EXPECT_EQ(next, 158u);
}

const Bytes kPlain = Words({});
const Bytes kP154 = Words({{32, 0x99A1A220}, {36, 0x99A1A220}, {40, 0x99A1A220}, {44, 0x99A1A220}});

// 256 bytes: "PACK", a directory of `length` bytes at `at`, its records naming
// 4-byte entries at `entry`.
Bytes Pack(uint32_t at, uint32_t length, std::vector<std::string> names, uint32_t entry = 12) {
  B b = B().text("PACK").u32(at).u32(length).padTo(at);
  for (const std::string& name : names) b.name(name, 56).u32(entry).u32(4);
  return Header(b, 256);
}

const DetectCase kRows[] = {
    // "PACK" is a directory archive when its header describes a readable directory.
    {70, "a.res", Pack(192, 64, {" a~"}, 252)},  // both end where the file ends
    {70, "a.res", Pack(16, 128, {"a", "b"})},
    {7, "a.res", Pack(16, 128, {"a", "b\x1F"})},  // the second record counts too
    {7, "a.res", Pack(8, 64, {"a"})},
    {7, "a.res", Pack(16, 0, {"a"})},
    {7, "a.res", Pack(16, 100, {"a", "b"})},
    {7, "a.res", Pack(192, 128, {"a"})},  // the file is too short for it
    {7, "a.res", Header(B().text("PACK").u32(0xFFFFFFC0).u32(64))},
    {7, "a.res", Pack(16, 64, {""})},
    {7, "a.res", Pack(16, 64, {std::string(56, 'n')})},
    {7, "a.res", Pack(16, 64, {"a\x7F"})},
    {7, "a.res", Pack(16, 64, {"a"}, 253)},
    {7, "a.res", Pack(16, 64, {"a"}, 0xFFFFFFFE)},
    {7, "a.res", Header(B().text("PACK").u16(0).u32(5))},  // "PACK" 00 00 alone is no directory
    // The first signature or rule that holds decides, extensions and companions last.
    {5, "a.img", Header(B().text("WAD3")), {{"a.dir", Pattern(8)}}},
    {146, "a.img", Words({{0, 0}, {4, 3}, {44, 4}}), {{"a.dir", Pattern(8)}}},
    {97, "a.res", Header(B().text("BIGF").u32(0).u32(5).u32(64))},
    {124, "a.res", Header(B().text("AAAA").padTo(36).text("TRACK"))},  // not "TRACKSELECT"
    {71, "a.res", Header(B().text("TEX").u8(0).u16(1).u32(0).u32(5))},
    {135, "a.r8", Header(B().u8(1).text("AAA").padTo(8).u8(1))},
    // Limits are inclusive; arithmetic wraps, but for the offset table after a count.
    {139, "a.res", Header(B().text("TEX").u8(0).u16(1).u32(10).u32(5), 122)},  // 100 = 122 - 22
    {151, "a.res", Header(B().u32(0u - 676).u32(1).u32(0u - 676))},
    {0, "a.res", Words({{0, 0x40000000}, {4, 4}})},
    {0, "a.res", Header(B().u16(1).u16(5).u32(0).u32(0))},   // 87 needs d4 not 0
    {0, "a.res", Header(B().u32(100).fill(100, 'n'), 200)},  // a name past the header
    // Paths: extensions ignore case, only the last part has one, none is not ".psc".
    {0, "a.PSC", kP154},
    {154, "", kP154},
    {0, "a.rss/data", kPlain},
    // A companion is a file beside the archive, however empty; a folder is not.
    {98, "a.IMG", kPlain, {{"a.dir", {}}}},
    {141, "a.img", Header(B().u32(100).u32(3).u32(4))},
    {98, "d.x/a.b.img", kPlain, {{"d.x/a.b.dir", Pattern(4)}}},
    {0, "a.big", kPlain, {{"a.fat/x", Pattern(4)}}},
    {0, "a.bag", kPlain, {{"a.idx", B().text("GABA").u32(3).get()}}},
};

TEST(Detect, NearMissesAndOrder) {
  for (const DetectCase& c : kRows) EXPECT_EQ(Detect(c), c.id) << "row " << &c - kRows;
}

}  // namespace
}  // namespace cairn::test
