#include "detect/detect.h"

namespace cairn {

FormatId DetectFormat(ByteView, std::string_view, os::Handle) { return 0; }

}  // namespace cairn
