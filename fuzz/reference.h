// Plain decoders written token by token, byte by byte, with the same rules
// for refusing data as the real ones: the fuzz targets check that the real
// decoders, with their block copies and literal runs, agree with these on
// every input. Empty optional: the data is refused.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

namespace cairn::fuzz {

using Bytes = std::vector<uint8_t>;

inline std::optional<Bytes> ReferenceJdlz(const uint8_t* c, size_t n, uint32_t size) {
  const uint64_t tokenBytes = n < 2 ? 0 : n - 2;
  if (n < 2 && size > 0) return std::nullopt;
  size = static_cast<uint32_t>(std::min<uint64_t>(size, tokenBytes / 2 * 4098 + tokenBytes % 2));
  Bytes out(size, 0);
  if (n < 2) return out;
  uint32_t f1 = c[0] | 0x100u, f2 = c[1] | 0x100u;
  size_t in = 2, o = 0;
  int64_t remaining = static_cast<int64_t>(n) - 2;
  while (remaining > 0) {
    if ((f1 & 1) == 0) {
      if (o < size) out[o++] = c[in++];
      remaining -= 1;
    } else {
      if (in + 1 >= n) return std::nullopt;
      const uint32_t b0 = c[in], b1 = c[in + 1];
      size_t distance, length;
      if (f2 & 1) {
        distance = (b0 & 0x0F) + 1;
        length = ((b0 & 0xF0) << 4 | b1) + 3;
      } else {
        distance = ((b0 & 0xE0) << 3 | b1) + 17;
        length = (b0 & 0x1F) + 3;
      }
      if (distance > o || o + length > size) return std::nullopt;
      for (size_t k = 0; k < length; ++k) out[o + k] = out[o + k - distance];
      o += length;
      in += 2;
      remaining -= 2;
      f2 >>= 1;
    }
    f1 >>= 1;
    if (f1 == 1) {
      if (remaining <= 0) break;
      f1 = c[in++] | 0x100u;
      remaining -= 1;
    }
    if (f2 == 1) {
      if (remaining <= 0) break;
      f2 = c[in++] | 0x100u;
      remaining -= 1;
    }
  }
  return out;
}

inline std::optional<Bytes> ReferenceRle(const uint8_t* c, size_t n, uint32_t size) {
  size = static_cast<uint32_t>(std::min<uint64_t>(size, n / 2 * uint64_t{127}));
  Bytes out(size, 0);
  size_t i = 0, o = 0;
  while (i < n) {
    const uint8_t control = c[i++];
    const size_t count = control & 0x7F;
    if (o + count > size) return std::nullopt;
    if (control & 0x80) {
      if (i + count > n) return std::nullopt;
      for (size_t k = 0; k < count; ++k) out[o + k] = c[i + k];
      i += count;
    } else {
      if (count > 0 && i >= n) return std::nullopt;
      for (size_t k = 0; k < count; ++k) out[o + k] = c[i];
      i += 1;
    }
    o += count;
  }
  return out;
}

inline std::optional<Bytes> ReferenceOpcodeLz(const uint8_t* c, size_t n, uint32_t size) {
  if (size > n * uint64_t{257}) return std::nullopt;
  if (n == 0) return Bytes();
  Bytes out(size, 0);
  size_t in = 0, o = 0;
  const auto at = [&](size_t k) -> std::optional<uint32_t> {
    if (k >= n) return std::nullopt;
    return c[k];
  };
  for (;;) {
    const uint32_t b0 = c[in];
    size_t opcodeBytes = 1, literals, length = 0, distance = 0;
    if (b0 >= 0xFC) {
      literals = b0 & 3;
      if (o < size) {
        if (o + literals > size || in + 1 + literals > n) return std::nullopt;
        for (size_t k = 0; k < literals; ++k) out[o++] = c[in + 1 + k];
      }
      break;
    }
    uint32_t b[4] = {b0, 0, 0, 0};
    opcodeBytes = b0 < 0x80 ? 2 : b0 < 0xC0 ? 3 : b0 < 0xE0 ? 4 : 1;
    for (size_t k = 1; k < opcodeBytes; ++k) {
      const auto v = at(in + k);
      if (!v) return std::nullopt;
      b[k] = *v;
    }
    if (b0 < 0x80) {
      literals = b0 & 3;
      length = ((b0 & 0x1C) >> 2) + 3;
      distance = ((b0 & 0x60) << 3) + b[1] + 1;
    } else if (b0 < 0xC0) {
      literals = b[1] >> 6;
      length = (b0 & 0x3F) + 4;
      distance = ((b[1] & 0x3F) << 8) + b[2] + 1;
    } else if (b0 < 0xE0) {
      literals = b0 & 3;
      length = (((b0 >> 2) & 3) << 8) + b[3] + 5;
      distance = ((b0 & 0x10) << 12) + (b[1] << 8) + b[2] + 1;
    } else {
      literals = ((b0 & 0x1F) << 2) + 4;
    }
    if (o + literals > size || in + opcodeBytes + literals > n) return std::nullopt;
    for (size_t k = 0; k < literals; ++k) out[o++] = c[in + opcodeBytes + k];
    in += opcodeBytes + literals;
    if (length > 0) {
      if (distance > o || o + length > size) return std::nullopt;
      for (size_t k = 0; k < length; ++k, ++o) out[o] = out[o - distance];
    }
    if (in >= n) break;
  }
  if (o != size) return std::nullopt;
  return out;
}

}  // namespace cairn::fuzz
