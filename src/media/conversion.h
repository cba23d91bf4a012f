// The conversion folders: converted copies of pictures and sounds listed
// beside the stored entries as "_TO_TGA_\", "_TO_BMP_\", "_TO_WAV_\" and
// "_TO_JPG_\" + name + extension.
#pragma once

#include <cstdint>
#include <string_view>

#include "core/session.h"

namespace cairn {

inline constexpr std::string_view kTgaFolder = "_TO_TGA_\\";
inline constexpr std::string_view kBmpFolder = "_TO_BMP_\\";
inline constexpr std::string_view kWavFolder = "_TO_WAV_\\";
inline constexpr std::string_view kJpgFolder = "_TO_JPG_\\";

// Adds folder + name + extension. A composed name too long for the table, or
// an unpacked size beyond 4 GiB, leaves the copy out (the stored entry stays
// listed): answers whether it was added.
bool AddConvertedEntry(ReaderContext& c, std::string_view folder, std::string_view name,
                       std::string_view extension, uint32_t offset, uint64_t unpacked,
                       uint32_t packed, uint32_t extra, uint8_t flag);

// A TGA copy of a width x height picture: its size is the pixels at
// `bytesPerPixel` plus the 18-byte header; Extra holds width | height << 16.
bool AddTgaEntry(ReaderContext& c, std::string_view name, uint32_t offset, uint32_t packedSize,
                 uint32_t width, uint32_t height, uint8_t bytesPerPixel, uint8_t flag);

}  // namespace cairn
