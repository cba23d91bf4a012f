// Samples and refusals of the typed and path-carrying directories, FormatIds 41 to 57.
#include <gtest/gtest.h>

#include "samples.h"

namespace cairn::test {
namespace {

using B = ArchiveBuilder;

CAIRN_SAMPLES(TypedPathSamples) {
  const Bytes a = Pattern(5, 1), b = Pattern(70, 2), c = Pattern(10, 3);
  B gaba, wav, h4r, lines, big, res;
  gaba.text("GABA").u32(4).u32(3).u32(0).name("music", 32).u32(208).u32(5).u32(44100).u32(0x24);
  gaba.fill(16).name("shot", 32).u32(213).u32(70).u32(22050).u32(6).fill(16);
  gaba.name("voice.raw", 32).u32(283).u32(10).u32(8000).u32(9).fill(16).bytes(a).bytes(b).bytes(c);
  wav.text("RIFF").u32(102).text("WAVEfmt ").u32(16).u32(0x10001).u32(22050).u32(44100).u16(2);
  wav.u16(16).text("data").bytes(b);
  h4r.text("H4R\x05").u32(8).u32(3).u32(125).u32(5).fill(8).u16(9).text("intro.smk").u16(0);
  h4r.u16(1).u16(0).u32(130).u32(10).fill(8).u16(8).text("kick.wav").u16(7).text("C:\\snd\\");
  h4r.u16(0).u16(3).u16(0).u32(140).u32(70).fill(8).u16(5).text("a.map").u16(7);
  h4r.text(".\\maps\\").u16(1).u16(0).padTo(125).bytes(a).bytes(c).bytes(b).padTo(346);
  lines.u32(0xF4EA1072).u32(0).u32(91).u32(2).bytes(a).bytes(b).text("..cfg\n").u32(16).u32(5);
  lines.text("C:/x.txt\n").u32(21).u32(70);
  big.text("BIG").u32(0).padTo(8).u32(3).padTo(68).u32(92).u32(0).u32(97).u32(0).u32(97).u32(0);
  big.bytes(a).bytes(b);
  const Bytes az = Compress(a), bz = Compress(b);
  const auto azSize = uint32_t(az.size()), bzSize = uint32_t(bz.size());
  res.text("Centauri Production Resource File 3.00\n\n").u8(0).u32(2).u32(49 + azSize + bzSize);
  res.bytes(az).bytes(bz).text("pic.bmp").u8(0).fill(12).u32(49).u32(5).u32(azSize).u32(0);
  res.text("snd/x.wav").u8(0).fill(12).u32(49 + azSize).u32(70).u32(bzSize).u32(0);
  return {
      Entries({"GABA", 41, "sfx.gab", gaba.get()},
              {{{"music.mp3", 208, 5, 5, 44100, 0}, a},
               {{"shot.wav", 213, 110, 70, 22050, 1}, wav.get()},
               {{"voice.raw", 283, 10, 10, 8000, 0}, c}}),
      Row({"H4R", 44, "maps.h4r", h4r.get()},
          {{"intro.smk", 125, a}, {"C_\\snd\\kick.wav.gz", 130, c}, {"maps\\a.map", 140, b}}),
      Row({"newline directory", 48, "game.dat", lines.get()},
          {{"__cfg", 16, a}, {"C_\\x.txt", 21, b}}),
      Row({"BIG", 52, "data.big", big.get()},
          {{"data.big.000000", 92, a}, {"data.big.000001", 97, {}}, {"data.big.000002", 97, b}}),
      Entries({"signature row 57", 57, "game.res", res.get()},
              {{{"pic.bmp", 49, 5, azSize, 0, 1}, a},
               {{"snd\\x.wav", 49 + azSize, 70, bzSize, 0, 1}, b}}),
  };
}

TEST(TypedPaths, RefusesBrokenDirectories) {
  const SampleTable rows = TypedPathSamples();
  ExpectRefused({
      {"newline name of 260", 48, Cat({Slice(rows[2].bytes, 0, 91), Bytes(260, 'n'), Text("\n")})},
  });
}

}  // namespace
}  // namespace cairn::test
