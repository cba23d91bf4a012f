// The four built-in 256-colour palettes, 4 bytes per colour (blue, green,
// red, 0), indexed by the pixel byte. Palette 1 draws the pictures of "PACK"
// directory archives, palette 2 those of "WAD2" archives, palette 3 the 8-bit
// image sequences, palette 4 raw pictures whose colour table is missing. The
// tables come from data/palette1.txt ... data/palette4.txt.
#pragma once

#include <array>
#include <cstdint>

namespace cairn {

#include "media/palettes_data.inc"

}  // namespace cairn
