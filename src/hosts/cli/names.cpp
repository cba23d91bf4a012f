#include "hosts/cli/names.h"

#include <algorithm>
#include <cstddef>

namespace cairn::cli {
namespace {

bool IsSeparator(char c) {
  return c == '\\' || c == '/';
}

char Fold(char c) {
  if (c == '/') return '\\';
  return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

bool IsAsciiLetter(char c) {
  return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
}

}  // namespace

RelativeName SplitEntryName(std::string_view name) {
  RelativeName r;
  if (!name.empty() && IsSeparator(name[0])) {
    r.refusal = "absolute name";
    return r;
  }
  if (name.size() >= 2 && IsAsciiLetter(name[0]) && name[1] == ':') {
    r.refusal = "name with a drive letter";
    return r;
  }
  size_t start = 0;
  while (start <= name.size()) {
    size_t end = start;
    while (end < name.size() && !IsSeparator(name[end])) ++end;
    const std::string_view part = name.substr(start, end - start);
    if (part == "..") {
      r.parts.clear();
      r.refusal = "name climbs out with \"..\"";
      return r;
    }
    if (!part.empty() && part != ".") r.parts.emplace_back(part);
    start = end + 1;
  }
  if (r.parts.empty()) r.refusal = "empty name";
  return r;
}

bool MatchesGlob(std::string_view pattern, std::string_view name) {
  // The usual walk with one remembered star: on a mismatch the last '*' takes
  // one more character. Every step advances through the name or ends.
  size_t p = 0, n = 0;
  size_t starP = std::string_view::npos, starN = 0;
  while (n < name.size()) {
    if (p < pattern.size() && pattern[p] == '*') {
      starP = p++;
      starN = n;
    } else if (p < pattern.size() && (pattern[p] == '?' || Fold(pattern[p]) == Fold(name[n]))) {
      ++p;
      ++n;
    } else if (starP != std::string_view::npos) {
      p = starP + 1;
      n = ++starN;
    } else {
      return false;
    }
  }
  while (p < pattern.size() && pattern[p] == '*') ++p;
  return p == pattern.size();
}

bool MatchesEntry(std::string_view pattern, std::string_view name) {
  // "docs/" names the folder docs.
  while (pattern.size() > 1 && IsSeparator(pattern.back())) pattern.remove_suffix(1);
  if (MatchesGlob(pattern, name)) return true;
  for (size_t i = 0; i < name.size(); ++i)
    if (name[i] == '\\' && MatchesGlob(pattern, name.substr(0, i))) return true;
  return false;
}

std::string Printable(std::string_view name) {
  std::string s(name);
  for (char& c : s)
    if (static_cast<unsigned char>(c) < 0x20 || c == 0x7F) c = '?';
  return s;
}

std::string Shown(std::string_view entryName) {
  std::string s = Printable(entryName);
  std::replace(s.begin(), s.end(), '\\', kShownSeparator);
  return s;
}

}  // namespace cairn::cli
