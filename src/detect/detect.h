// Recognition: the FormatId of a file from its first 104 bytes, its size, its
// path and, for a few formats, a companion file beside it.
//
// Two stages: the magics of the signature table, compared at offset 0 in row
// order (FormatIds 1 to 79; a "PACK" file whose header describes a readable
// directory is 70 rather than 7), then the ordered structural and extension
// rules (FormatIds 80 to 157). The first match decides.
#pragma once

#include <cstdint>
#include <span>
#include <string_view>

#include "core/session.h"
#include "util/bytes.h"
#include "util/platform.h"

namespace cairn {

// `header` holds the first 104 bytes of the open file `h`; `path` may be
// empty. Answers 1..157, or 0 when no signature or rule matches.
FormatId DetectFormat(ByteView header, std::string_view path, os::Handle h);

// One row of the signature table: row n stands for FormatId n.
struct Signature {
  FormatId id;
  std::string_view magic;  // compared whole, case included, at offset 0; row 70 has none
};
std::span<const Signature> SignatureTable();

// The magics alone: the FormatId of the first row whose magic begins
// `header`, or 0. A "PACK" file answers 7 here; DetectFormat then looks at
// its directory.
FormatId MatchSignature(ByteView header);

// The second stage alone, for a header that no magic matched: `size` is the
// file size the rules compare with, `h` the file some rules read from (reads
// from kNoFile simply fail). Answers 80..157 or 0.
FormatId DetectByRules(ByteView header, std::string_view path, os::Handle h, uint32_t size);

// The formats that recognition never answers, each with the reason: a rule
// earlier in the order takes every header they could have.
struct UnreachableFormat {
  FormatId id;
  std::string_view why;
};
std::span<const UnreachableFormat> UnreachableFormats();

}  // namespace cairn
