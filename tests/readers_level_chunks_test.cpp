// Samples and refusals of the chunk-chain and compressed-directory readers:
// the "TR4" level file (39) and the "SNOK_DATAFILE_KEEP_OUT!" archive (46).
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

Bytes Tga(uint16_t width, uint16_t height, uint8_t bits, const Bytes& pixels) {
  return ArchiveBuilder()
      .u8(0)
      .u8(0)
      .u8(2)
      .fill(9)
      .u16(width)
      .u16(height)
      .u8(bits)
      .u8(0x20)
      .bytes(pixels)
      .get();
}

// A "SNOK" archive of `count` with the data, then the directory inflated from `records`.
Bytes Snok(uint32_t count, const Bytes& data, const Bytes& records) {
  ArchiveBuilder w;
  w.text("SNOK_DATAFILE_KEEP_OUT!\x1A").padTo(264).u32(count).u32(0).u32(0).bytes(data);
  return w.patch32(272, uint32_t(w.size())).bytes(Compress(records)).get();
}

CAIRN_SAMPLES(LevelChunkSamples) {
  // Three compressed atlases (256 x 1, 256 x 1 and 256 x 2), a stored chunk
  // with its 4 extra bytes and a last chunk whose sizes differ.
  const Bytes p0 = Pattern(1024, 1), p1 = Pattern(512, 2), p2 = Pattern(2048, 3);
  const Bytes z0 = Compress(p0), z1 = Compress(p1), z2 = Compress(p2);
  const Bytes s3 = Pattern(5, 4), s4 = Pattern(60, 5);
  ArchiveBuilder tr4;
  tr4.text("TR4").fill(7).u32(1024).u32(z0.size()).bytes(z0).u32(512).u32(z1.size()).bytes(z1);
  tr4.u32(2048).u32(z2.size()).bytes(z2).u32(5).u32(5).bytes(s3).u32(0xEEEEEEEE);
  tr4.u32(0).u32(60).bytes(s4);
  const uint32_t o0 = 18, o1 = o0 + z0.size() + 8, o2 = o1 + z1.size() + 8, o3 = o2 + z2.size() + 8;
  Sample level = Row({"TR4", 39, "level.tr4", tr4.get()},
                     {{"level.tr4.000003", o3, s3}, {"level.tr4.000004", o3 + 17, s4}});
  const std::string n0 = "level.tr4.000000.TEX32", n1 = "level.tr4.000001.TEX16",
                    n2 = "level.tr4.000002.TEX32";
  const uint32_t one = 256 | 1 << 16, two = 256 | 2 << 16;
  level.listing.insert(level.listing.begin(),
                       {{"_TO_TGA_\\" + n0 + ".tga", o0, 1042, uint32_t(z0.size()), one, 3},
                        {n0, o0, 1024, uint32_t(z0.size()), 0, 1},
                        {"_TO_TGA_\\" + n1 + ".tga", o1, 530, uint32_t(z1.size()), one, 4},
                        {n1, o1, 512, uint32_t(z1.size()), 0, 1},
                        {"_TO_TGA_\\" + n2 + ".tga", o2, 2066, uint32_t(z2.size()), two, 2},
                        {n2, o2, 2048, uint32_t(z2.size()), 0, 1}});
  level.data.insert(level.data.begin(),
                    {Tga(256, 1, 32, p0), p0, Tga(256, 1, 16, p1), p1, Tga(256, 2, 32, p2), p2});
  // Entries are inflated whatever their sizes; the directory holds "/".
  const Bytes a = Pattern(300, 6), b = Text("hello"), za = Compress(a), zb = Compress(b);
  ArchiveBuilder dir;
  dir.name("maps/one.dat", 1024).u32(300).u32(za.size()).fill(8);
  dir.name("readme.txt", 1024).u32(5).u32(zb.size()).fill(8);
  Sample snok{"SNOK", 46, "game.dat", Snok(2, Join(za, zb), dir.get())};
  snok.listing = {{"maps\\one.dat", 276, 300, uint32_t(za.size()), 0, 0},
                  {"readme.txt", 276 + uint32_t(za.size()), 5, uint32_t(zb.size()), 0, 0}};
  snok.data = {a, b};
  // A count of 0 takes a directory that inflates to nothing.
  return {level, snok, {"SNOK of no entries", 46, "none.dat", Snok(0, Pattern(80), {})}};
}

// Chunk heads cut by the end of the file, and directories that do not hold
// exactly their count of records, are refused.
TEST(LevelChunks, RefusesCutChunksAndDirectoriesOfTheWrongSize) {
  const Bytes record = ArchiveBuilder().name("a", 1024).u32(1).u32(1).fill(8).get();
  ArchiveBuilder cut;
  cut.text("TR4").fill(7).u32(0).u32(80).fill(80).u32(3).u32(3);
  ExpectRefused({
      {"TR4 chunk head cut", 39, cut.get()},
      {"SNOK directory of more records", 46, Snok(1, Pattern(80), Join(record, record))},
      {"SNOK directory of fewer records", 46, Snok(3, Pattern(80), Join(record, record))},
      {"SNOK count of 0 with records", 46, Snok(0, Pattern(80), record)},
      {"SNOK name of 1024", 46, Snok(1, Pattern(80), ArchiveBuilder().fill(1040, 'n').get())},
  });
}

}  // namespace
}  // namespace cairn::test
