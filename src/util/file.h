// Positioned and exact file transfers over the platform layer, and an owning
// file handle. Each helper answers true only when the whole request was done.
#pragma once

#include <cstdint>
#include <utility>

#include "util/platform.h"

namespace cairn {

bool SeekTo(os::Handle h, uint32_t position);
bool ReadExact(os::Handle h, void* buffer, uint32_t count);
bool WriteExact(os::Handle h, const void* buffer, uint32_t count);
bool ReadAt(os::Handle h, void* buffer, uint32_t position, uint32_t count);
bool WriteAt(os::Handle h, const void* buffer, uint32_t position, uint32_t count);

// Owns one open file and closes it when it goes.
class File {
 public:
  File() = default;
  explicit File(os::Handle h) : h_(h) {}
  File(File&& o) noexcept : h_(std::exchange(o.h_, os::kNoFile)) {}
  File& operator=(File&& o) noexcept {
    if (this != &o) {
      Close();
      h_ = std::exchange(o.h_, os::kNoFile);
    }
    return *this;
  }
  File(const File&) = delete;
  File& operator=(const File&) = delete;
  ~File() { Close(); }

  os::Handle get() const { return h_; }
  explicit operator bool() const { return h_ != os::kNoFile; }
  void Close() {
    if (h_ != os::kNoFile) os::Close(std::exchange(h_, os::kNoFile));
  }

 private:
  os::Handle h_ = os::kNoFile;
};

}  // namespace cairn
