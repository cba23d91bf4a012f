// Recognition: the FormatId of a file from its first 104 bytes, its size, its
// path and, for a few formats, a companion file beside it.
#pragma once

#include <string_view>

#include "plugin/session.h"
#include "util/bytes.h"
#include "util/platform.h"

namespace cairn {

// `header` holds the first 104 bytes of the open file `h`; `path` may be
// empty. Answers 1..157, or 0 when no signature or rule matches.
FormatId DetectFormat(ByteView header, std::string_view path, os::Handle h);

}  // namespace cairn
