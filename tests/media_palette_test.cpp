// The built-in palettes: the entries every picture relies on, and the
// generated tables against the data files they come from.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>

#include "media/palettes.h"
#include "media_support.h"

namespace cairn::test {
namespace {

using Palette = std::array<uint8_t, 1024>;

Bytes Entry(const Palette& p, size_t i) {
  return Slice(Bytes(p.begin(), p.end()), 4 * i, 4);
}

// A data file's colours as blue, green, red, 0 entries.
std::optional<Bytes> LoadDataFile(const std::filesystem::path& path) {
  std::ifstream in(path);
  if (!in) return std::nullopt;
  Bytes out;
  std::string line;
  while (std::getline(in, line)) {
    if (line.empty() || line[0] == '#') continue;
    std::istringstream fields(line);
    unsigned r, g, b;
    fields >> std::hex >> r >> g >> b;
    out.insert(out.end(),
               {static_cast<uint8_t>(b), static_cast<uint8_t>(g), static_cast<uint8_t>(r), 0});
  }
  return out;
}

const std::filesystem::path kDataDir =
    std::filesystem::path(__FILE__).parent_path().parent_path() / "data";

TEST(Palette, Palettes1And2ShareTheirGreysAndLastEntryAndNothingElse) {
  const uint8_t greys[16] = {0x00, 0x0F, 0x1F, 0x2F, 0x3F, 0x4B, 0x5B, 0x6B,
                             0x7B, 0x8B, 0x9B, 0xAB, 0xBB, 0xCB, 0xDB, 0xEB};
  for (const Palette* p : {&kBuiltInPalette1, &kBuiltInPalette2}) {
    for (size_t i = 0; i < 16; ++i)
      EXPECT_EQ(Entry(*p, i), (Bytes{greys[i], greys[i], greys[i], 0}));
    EXPECT_EQ(Entry(*p, 255), (Bytes{0x53, 0x5B, 0x9F, 0}));
    for (size_t i = 0; i < 256; ++i) EXPECT_EQ((*p)[4 * i + 3], 0) << i;
  }
  int differing = 0;
  for (size_t i = 0; i < 256; ++i)
    differing += Entry(kBuiltInPalette1, i) != Entry(kBuiltInPalette2, i);
  EXPECT_EQ(differing, 239);
}

TEST(Palette, Palettes3And4BeginAsFixed) {
  EXPECT_EQ(Slice(Bytes(kBuiltInPalette3.begin(), kBuiltInPalette3.end()), 0, 16),
            (Bytes{0, 0, 0, 0, 0x28, 0x28, 0x58, 0, 0xA8, 0xA0, 0xF0, 0, 0x18, 0x08, 0x40, 0}));
  EXPECT_EQ(Slice(Bytes(kBuiltInPalette4.begin(), kBuiltInPalette4.end()), 0, 16),
            (Bytes{0, 0, 0, 0, 7, 7, 7, 0, 0x0E, 0x0E, 0x0E, 0, 0x16, 0x16, 0x16, 0}));
  EXPECT_EQ(Entry(kBuiltInPalette4, 255), (Bytes{0, 0, 0, 0}));
}

TEST(Palette, GeneratedTablesMatchTheirDataFiles) {
  const Palette* tables[4] = {&kBuiltInPalette1, &kBuiltInPalette2, &kBuiltInPalette3,
                              &kBuiltInPalette4};
  for (int n = 1; n <= 4; ++n) {
    const auto data = LoadDataFile(kDataDir / ("palette" + std::to_string(n) + ".txt"));
    if (!data) GTEST_SKIP() << "skipped: the data files are not beside the sources";
    EXPECT_EQ(*data, Bytes(tables[n - 1]->begin(), tables[n - 1]->end())) << "palette " << n;
  }
}

}  // namespace
}  // namespace cairn::test
