// One row per FormatId: its short name, what it is, its directory reader and
// its extraction method.
#pragma once

#include <span>

#include "core/extract.h"
#include "core/session.h"

namespace cairn {

inline constexpr FormatId kFormatCount = 157;

struct FormatInfo {
  FormatId id;
  const char* shortName;
  const char* description;
  ReaderFn reader;  // null until the format can be read
  unsigned row;     // the layout row a shared reader takes
  MethodFn method;
};

// The row of `id`, or null outside 1..157.
const FormatInfo* FindFormat(FormatId id);
std::span<const FormatInfo> AllFormats();

}  // namespace cairn
