// Helpers of the codec tests: expected output built step by step.
#pragma once

#include "builder.h"

namespace cairn::test {

// Appends `length` bytes copied one at a time from `distance` back.
inline void CopyBack(Bytes& b, size_t distance, size_t length) {
  for (size_t k = 0; k < length; ++k) b.push_back(b[b.size() - distance]);
}

}  // namespace cairn::test
