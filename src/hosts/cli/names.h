// Entry names as the command-line tool sees them: the relative output path an
// entry name stands for (or why it has none), the patterns that select
// entries, and names made safe to print.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace cairn::cli {

// An entry name cut into the folder parts and file name of a path below the
// output folder. `parts` is empty and `refusal` says why when the name could
// reach outside that folder.
struct RelativeName {
  std::vector<std::string> parts;
  std::string refusal;
};

// Splits at '\' (and '/'); empty and "." parts drop out. A name that starts
// with a separator or a drive letter, holds a ".." part or has nothing left is
// refused.
RelativeName SplitEntryName(std::string_view name);

// '*' stands for any run of characters, separators included, '?' for one
// character; letters match without regard to case, and '/' in the pattern
// matches '\' in the name.
bool MatchesGlob(std::string_view pattern, std::string_view name);

// True when the pattern matches the whole name or one of the folders it lies
// in, so that naming a folder selects everything below it.
bool MatchesEntry(std::string_view pattern, std::string_view name);

// The name with control characters shown as '?', so that a name read from an
// archive cannot drive the terminal.
std::string Printable(std::string_view name);

// What the tool prints between folders: '\' on Windows, '/' elsewhere.
#ifdef _WIN32
inline constexpr char kShownSeparator = '\\';
#else
inline constexpr char kShownSeparator = '/';
#endif

// An entry name as the tool prints it: Printable, with its '\' separators
// shown as kShownSeparator.
std::string Shown(std::string_view entryName);

}  // namespace cairn::cli
