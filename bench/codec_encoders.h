// Simple greedy encoders for the three decoders, and generated data to feed
// them, for the benchmarks. They aim at valid streams of a reasonable ratio,
// not at the best one.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

namespace cairn::test {

using Bytes = std::vector<uint8_t>;

// --- Data ------------------------------------------------------------------

// A small, fixed pseudo-random sequence, the same on every platform.
struct Random {
  uint64_t state;
  explicit Random(uint64_t seed) : state(seed * 0x9E3779B97F4A7C15ull + 1) {}
  uint32_t next() {
    state ^= state << 13;
    state ^= state >> 7;
    state ^= state << 17;
    return static_cast<uint32_t>(state >> 16);
  }
  uint32_t below(uint32_t n) { return next() % n; }
};

// Words of a small vocabulary, the common ones far more often, in sentences
// and lines.
inline Bytes TextLike(size_t n, uint64_t seed = 1) {
  Random r(seed);
  std::vector<std::string> words;
  const char* syllables[] = {"ka", "to", "ren", "mi",  "sol", "de", "an",  "the", "ing", "or",
                             "qu", "el", "ba",  "str", "ix",  "on", "ver", "lo",  "pa",  "ne"};
  for (int i = 0; i < 400; ++i) {
    std::string w;
    for (uint32_t k = 1 + r.below(3); k > 0; --k) w += syllables[r.below(20)];
    words.push_back(w);
  }
  Bytes b;
  b.reserve(n);
  size_t line = 0;
  while (b.size() < n) {
    // Squaring a uniform pick favours the first words.
    const uint32_t u = r.below(400);
    std::string w = words[u * u / 400];
    if (r.below(12) == 0) w[0] = static_cast<char>(w[0] - 32);
    w += r.below(9) == 0 ? ", " : r.below(14) == 0 ? ". " : " ";
    line += w.size();
    if (line > 70) {
      w += '\n';
      line = 0;
    }
    b.insert(b.end(), w.begin(), w.end());
  }
  b.resize(n);
  return b;
}

// An 8-bit picture: flat areas, gradients and a little noise, in rows of 256.
inline Bytes PictureLike(size_t n, uint64_t seed = 2) {
  Random r(seed);
  Bytes b(n);
  const size_t width = 256;
  uint8_t flat = 0;
  for (size_t i = 0; i < n; ++i) {
    const size_t x = i % width, y = i / width;
    const size_t band = (y / 16 + x / 64) % 4;
    if (x % 64 == 0) flat = static_cast<uint8_t>(r.below(16) * 16);
    uint8_t v;
    switch (band) {
      case 0:
        v = flat;
        break;  // flat
      case 1:
        v = static_cast<uint8_t>(x + y);
        break;  // gradient
      case 2:
        v = static_cast<uint8_t>(flat + (r.below(8) == 0 ? 1 : 0));
        break;  // dithered
      default:
        v = static_cast<uint8_t>((x / 4 + y / 4) * 3 + r.below(3));
        break;  // noisy ramp
    }
    b[i] = v;
  }
  return b;
}

inline Bytes RandomBytes(size_t n, uint64_t seed = 3) {
  Random r(seed);
  Bytes b(n);
  for (auto& v : b) v = static_cast<uint8_t>(r.next());
  return b;
}

// Text, pictures and incompressible data in blocks of 64 KiB, mixed 2:2:1.
inline Bytes MixedData(size_t n, uint64_t seed = 4) {
  const size_t block = 65536;
  Bytes b;
  b.reserve(n);
  for (size_t k = 0; b.size() < n; ++k) {
    const size_t take = std::min(block, n - b.size());
    const Bytes part = k % 5 == 4  ? RandomBytes(take, seed + k)
                       : k % 5 < 2 ? TextLike(take, seed + k)
                                   : PictureLike(take, seed + k);
    b.insert(b.end(), part.begin(), part.end());
  }
  return b;
}

// --- Encoders ----------------------------------------------------------------

namespace detail {

inline uint32_t Hash3(const Bytes& d, size_t i, int bits) {
  const uint32_t v = d[i] | d[i + 1] << 8 | d[i + 2] << 16;
  return (v * 2654435761u) >> (32 - bits);
}

inline size_t MatchLength(const Bytes& d, size_t from, size_t at, size_t longest) {
  size_t n = 0;
  while (n < longest && at + n < d.size() && d[from + n] == d[at + n]) ++n;
  return n;
}

// Earlier positions with the same first three bytes, nearest first, through
// hash chains of a bounded depth.
class MatchFinder {
 public:
  explicit MatchFinder(const Bytes& d) : d_(d), head_(1 << 16, -1), prev_(d.size(), -1) {}
  void insert(size_t i) {
    if (i + 3 > d_.size()) return;
    int64_t& h = head_[Hash3(d_, i, 16)];
    prev_[i] = h;
    h = static_cast<int64_t>(i);
  }
  // The longest match at `i` within [nearest, farthest] back, of at most
  // `longest` bytes, that `usable(length, distance)` accepts: {length,
  // distance}, or length 0.
  template <class Usable>
  std::pair<size_t, size_t> longest(size_t i, size_t nearest, size_t farthest, size_t longest,
                                    Usable usable) const {
    std::pair<size_t, size_t> best{0, 0};
    if (i + 3 > d_.size()) return best;
    int64_t p = head_[Hash3(d_, i, 16)];
    for (int depth = 0; depth < 16 && p >= 0; ++depth, p = prev_[static_cast<size_t>(p)]) {
      const size_t distance = i - static_cast<size_t>(p);
      if (distance > farthest) break;
      if (distance < nearest) continue;
      const size_t n = MatchLength(d_, static_cast<size_t>(p), i, longest);
      if (n > best.first && usable(n, distance)) best = {n, distance};
    }
    return best;
  }

 private:
  const Bytes& d_;
  std::vector<int64_t> head_, prev_;
};

}  // namespace detail

// Writes "JDLZ" tokens, reserving each flag byte where the decoder will look
// for it: F1 after every eighth token, F2 after every eighth match, F1 first
// when both fall due after the same token.
class JdlzWriter {
 public:
  void literal(uint8_t b) {
    out_.push_back(b);
    next(false);
  }
  // Distances up to 16 take the short-distance form (lengths 3 to 4098), the
  // others the long-distance form (distances 17 to 2064, lengths 3 to 34).
  void match(size_t distance, size_t length) {
    const size_t l = length - 3;
    if (distance <= 16) {
      out_.push_back(static_cast<uint8_t>((distance - 1) | (l >> 8) << 4));
      out_.push_back(static_cast<uint8_t>(l));
      out_[f2At_] |= static_cast<uint8_t>(1 << f2Used_);
    } else {
      const size_t d = distance - 17;
      out_.push_back(static_cast<uint8_t>((d >> 8) << 5 | l));
      out_.push_back(static_cast<uint8_t>(d));
    }
    out_[f1At_] |= static_cast<uint8_t>(1 << f1Used_);
    next(true);
  }
  const Bytes& bytes() const { return out_; }

 private:
  void next(bool match) {
    if (match) ++f2Used_;
    if (++f1Used_ == 8) f1At_ = out_.size(), f1Used_ = 0, out_.push_back(0);
    if (f2Used_ == 8) f2At_ = out_.size(), f2Used_ = 0, out_.push_back(0);
  }
  Bytes out_ = {0, 0};
  size_t f1At_ = 0, f2At_ = 1;
  int f1Used_ = 0, f2Used_ = 0;
};

// "JDLZ": the longest of the sixteen short distances and of the matches
// found farther back.
inline Bytes JdlzEncode(const Bytes& d) {
  JdlzWriter w;
  detail::MatchFinder finder(d);
  for (size_t i = 0; i < d.size();) {
    size_t best = 0, bestDistance = 0;
    for (size_t dist = 1; dist <= 16 && dist <= i; ++dist) {
      const size_t len = detail::MatchLength(d, i - dist, i, 4098);
      if (len > best) best = len, bestDistance = dist;
    }
    const auto far = finder.longest(i, 17, 2064, 34, [](size_t, size_t) { return true; });
    if (far.first > best) best = far.first, bestDistance = far.second;
    if (best >= 3) {
      w.match(bestDistance, best);
      for (size_t k = 0; k < best; ++k) finder.insert(i + k);
      i += best;
    } else {
      w.literal(d[i]);
      finder.insert(i++);
    }
  }
  return w.bytes();
}

// Run-length: repeats of three or more become repeat runs.
inline Bytes RleEncode(const Bytes& d) {
  Bytes out;
  size_t literalsAt = 0, literals = 0;
  const auto flush = [&] {
    if (literals == 0) return;
    out.insert(out.begin() + static_cast<std::ptrdiff_t>(literalsAt),
               static_cast<uint8_t>(0x80 | literals));
    literals = 0;
  };
  for (size_t i = 0; i < d.size();) {
    size_t run = 1;
    while (run < 127 && i + run < d.size() && d[i + run] == d[i]) ++run;
    if (run >= 3) {
      flush();
      out.push_back(static_cast<uint8_t>(run));
      out.push_back(d[i]);
      i += run;
    } else {
      if (literals == 0) literalsAt = out.size();
      out.push_back(d[i++]);
      if (++literals == 127) flush();
    }
  }
  flush();
  return out;
}

// Opcode LZ: the smallest opcode class that carries each copy; literals go
// with the copy (up to three) or in literal opcodes of 4 to 112.
inline Bytes OpcodeLzEncode(const Bytes& d) {
  Bytes out;
  detail::MatchFinder finder(d);
  size_t pending = 0;  // literals not yet written, ending at the current position
  const auto literalRuns = [&](size_t at) {
    while (pending > 3) {
      const size_t k = std::min<size_t>(112, pending & ~size_t{3});
      out.push_back(static_cast<uint8_t>(0xE0 + (k - 4) / 4));
      out.insert(out.end(), d.begin() + static_cast<std::ptrdiff_t>(at - pending),
                 d.begin() + static_cast<std::ptrdiff_t>(at - pending + k));
      pending -= k;
    }
  };
  // Three-byte copies reach 1024 back, four-byte ones 16384, longer ones
  // 131072.
  const auto usable = [](size_t n, size_t distance) {
    return n >= 5 || (n == 4 && distance <= 16384) || distance <= 1024;
  };
  for (size_t i = 0; i < d.size();) {
    const auto [len, dist] = finder.longest(i, 1, 131072, 1028, usable);
    const bool small = len >= 3 && len <= 10 && dist <= 1024;
    const bool medium = len >= 4 && len <= 67 && dist <= 16384;
    const bool large = len >= 5;
    if (!small && !medium && !large) {
      finder.insert(i);
      ++i, ++pending;
      continue;
    }
    literalRuns(i);
    const size_t lit = pending;
    const size_t dd = dist - 1;
    if (small) {
      out.push_back(static_cast<uint8_t>((dd >> 8) << 5 | (len - 3) << 2 | lit));
      out.push_back(static_cast<uint8_t>(dd));
    } else if (medium) {
      out.push_back(static_cast<uint8_t>(0x80 | (len - 4)));
      out.push_back(static_cast<uint8_t>(lit << 6 | dd >> 8));
      out.push_back(static_cast<uint8_t>(dd));
    } else {
      out.push_back(static_cast<uint8_t>(0xC0 | (dd >> 16) << 4 | ((len - 5) >> 8) << 2 | lit));
      out.push_back(static_cast<uint8_t>(dd >> 8));
      out.push_back(static_cast<uint8_t>(dd));
      out.push_back(static_cast<uint8_t>(len - 5));
    }
    out.insert(out.end(), d.begin() + static_cast<std::ptrdiff_t>(i - lit),
               d.begin() + static_cast<std::ptrdiff_t>(i));
    pending = 0;
    for (size_t k = 0; k < len; ++k) finder.insert(i + k);
    i += len;
  }
  literalRuns(d.size());
  out.push_back(static_cast<uint8_t>(0xFC | pending));
  out.insert(out.end(), d.end() - static_cast<std::ptrdiff_t>(pending), d.end());
  return out;
}

}  // namespace cairn::test
