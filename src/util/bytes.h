// Bounds-checked views over bytes read from an archive. Every field of a file
// is read through a ByteView; an access outside the view throws BadData, which
// the open and extraction frames turn into their error exits.
#pragma once

#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <string_view>
#include <vector>

namespace cairn {

// The archive contradicts itself or ends early.
struct BadData : std::runtime_error {
  explicit BadData(const char* what = "bad data") : std::runtime_error(what) {}
};

class ByteView {
 public:
  ByteView() = default;
  ByteView(const uint8_t* data, size_t size) : data_(data), size_(size) {}
  ByteView(const std::vector<uint8_t>& v) : data_(v.data()), size_(v.size()) {}  // NOLINT

  const uint8_t* data() const { return data_; }
  size_t size() const { return size_; }
  bool empty() const { return size_ == 0; }

  // True when [at, at + len) lies inside the view.
  bool has(uint64_t at, uint64_t len) const { return at <= size_ && len <= size_ - at; }
  void need(uint64_t at, uint64_t len) const {
    if (!has(at, len)) throw BadData("read outside the data");
  }

  uint8_t u8(uint64_t at) const {
    need(at, 1);
    return data_[at];
  }
  uint16_t u16le(uint64_t at) const {
    need(at, 2);
    return static_cast<uint16_t>(data_[at] | data_[at + 1] << 8);
  }
  uint16_t u16be(uint64_t at) const {
    need(at, 2);
    return static_cast<uint16_t>(data_[at] << 8 | data_[at + 1]);
  }
  uint32_t u24le(uint64_t at) const {
    need(at, 3);
    return data_[at] | data_[at + 1] << 8 | static_cast<uint32_t>(data_[at + 2]) << 16;
  }
  uint32_t u32le(uint64_t at) const {
    need(at, 4);
    return data_[at] | data_[at + 1] << 8 | data_[at + 2] << 16 |
           static_cast<uint32_t>(data_[at + 3]) << 24;
  }
  uint32_t u32be(uint64_t at) const {
    need(at, 4);
    return static_cast<uint32_t>(data_[at]) << 24 | data_[at + 1] << 16 | data_[at + 2] << 8 |
           data_[at + 3];
  }

  ByteView sub(uint64_t at, uint64_t len) const {
    need(at, len);
    return ByteView(data_ + at, static_cast<size_t>(len));
  }
  ByteView from(uint64_t at) const {
    need(at, 0);
    return ByteView(data_ + at, size_ - static_cast<size_t>(at));
  }

  // A fixed-width name field: all `width` bytes must lie inside the view; the
  // name ends at its first zero byte or at the end of the field.
  std::string_view field(uint64_t at, uint64_t width) const {
    need(at, width);
    const char* p = reinterpret_cast<const char*>(data_ + at);
    size_t n = 0;
    while (n < width && p[n] != 0) ++n;
    return {p, n};
  }

  // A zero-terminated string that starts at `at`: its terminator must come
  // within `max` bytes and inside the view.
  std::string_view cstr(uint64_t at, uint64_t max) const {
    need(at, 0);
    const char* p = reinterpret_cast<const char*>(data_ + at);
    const size_t limit = size_ - static_cast<size_t>(at) < max ? size_ - static_cast<size_t>(at)
                                                               : static_cast<size_t>(max);
    for (size_t n = 0; n < limit; ++n)
      if (p[n] == 0) return {p, n};
    throw BadData("unterminated string");
  }

  // Whether the bytes at `at` equal `text` exactly; false when they would run
  // past the end.
  bool matches(uint64_t at, std::string_view text) const {
    if (!has(at, text.size())) return false;
    for (size_t i = 0; i < text.size(); ++i)
      if (data_[at + i] != static_cast<uint8_t>(text[i])) return false;
    return true;
  }

 private:
  const uint8_t* data_ = nullptr;
  size_t size_ = 0;
};

// Little-endian stores into an output buffer, checked like the reads.
inline void PutU16le(std::vector<uint8_t>& b, size_t at, uint16_t v) {
  ByteView(b).need(at, 2);
  b[at] = static_cast<uint8_t>(v);
  b[at + 1] = static_cast<uint8_t>(v >> 8);
}
inline void PutU32le(std::vector<uint8_t>& b, size_t at, uint32_t v) {
  ByteView(b).need(at, 4);
  for (int i = 0; i < 4; ++i) b[at + i] = static_cast<uint8_t>(v >> (8 * i));
}
inline void PutU32be(std::vector<uint8_t>& b, size_t at, uint32_t v) {
  ByteView(b).need(at, 4);
  for (int i = 0; i < 4; ++i) b[at + i] = static_cast<uint8_t>(v >> (24 - 8 * i));
}

}  // namespace cairn
