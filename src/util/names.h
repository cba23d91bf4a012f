// Name helpers shared by recognition, the readers and the frames.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "util/bytes.h"

namespace cairn {

// Characters that separate the parts of a path handed to us by the host:
// '\' everywhere, '/' as well where the platform uses it.
#ifdef _WIN32
inline constexpr std::string_view kPathSeparators = "\\";
#else
inline constexpr std::string_view kPathSeparators = "\\/";
#endif

// The part of a path after its last separator (a separator at position 0 does
// not count); the whole path when there is none.
std::string_view FileNamePart(std::string_view path);

// Position of the last '.' of the name; none when there is no dot or the only
// candidate is the first character.
std::optional<size_t> FindExtension(std::string_view name);

// The extension of an archive path, dot included, compared without case by
// the recognition rules; empty when the path has none. A dot inside a folder
// name gives no extension.
std::string_view PathExtension(std::string_view path);

// The name without its extension: everything before the last '.' of the
// last path part ('\' separates parts). Empty when the last part has no dot.
std::string_view StripExtension(std::string_view name);

// The path with the extension of its last part replaced by `ext` (a
// companion file beside an archive); empty when the last part has no '.'.
std::string CompanionPath(std::string_view path, std::string_view ext);

// Replaces every '/' by '\'.
void ToBackslashes(std::string& name);

// prefix + "." + the number as six digits; seven or more digits take the
// place of the dot.
std::string NumberedName(std::string_view prefix, uint32_t number);

// Case-insensitive comparison of ASCII names: negative, 0 or positive.
int CompareNamesNoCase(std::string_view a, std::string_view b);
bool EqualNoCase(std::string_view a, std::string_view b);

// A sign-and-magnitude integer of 1 to 5 bytes at `at`; `used` receives its
// length.
int32_t DecodeSignedVarInt(ByteView bytes, size_t at, size_t& used);

}  // namespace cairn
