#include "util/names.h"

#include <algorithm>

namespace cairn {
namespace {

bool IsSeparator(char c) {
  return kPathSeparators.find(c) != std::string_view::npos;
}

char Lower(char c) {
  return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

}  // namespace

std::string_view FileNamePart(std::string_view path) {
  for (size_t i = path.size(); i-- > 1;)
    if (IsSeparator(path[i])) return path.substr(i + 1);
  return path;
}

std::optional<size_t> FindExtension(std::string_view name) {
  const size_t dot = name.rfind('.');
  if (dot == std::string_view::npos || dot == 0) return std::nullopt;
  return dot;
}

std::string_view PathExtension(std::string_view path) {
  const auto dot = FindExtension(path);
  if (!dot) return {};
  const std::string_view ext = path.substr(*dot);
  if (std::any_of(ext.begin(), ext.end(), IsSeparator)) return {};
  return ext;
}

std::string_view StripExtension(std::string_view name) {
  for (size_t i = name.size(); i-- > 0;) {
    if (name[i] == '.') return name.substr(0, i);
    if (name[i] == '\\') break;
  }
  return {};
}

std::string CompanionPath(std::string_view path, std::string_view ext) {
  const size_t dot = path.rfind('.');
  const size_t cut = path.find_last_of(kPathSeparators);
  if (dot == std::string_view::npos || (cut != std::string_view::npos && dot < cut)) return {};
  std::string p(path.substr(0, dot));
  p += ext;
  return p;
}

void ToBackslashes(std::string& name) {
  std::replace(name.begin(), name.end(), '/', '\\');
}

std::string NumberedName(std::string_view prefix, uint32_t number) {
  std::string digits = std::to_string(number);
  if (number == 0) digits.clear();
  std::string name(prefix);
  if (digits.size() <= 6) {
    name += '.';
    name.append(6 - digits.size(), '0');
  }
  return name + digits;
}

int CompareNamesNoCase(std::string_view a, std::string_view b) {
  const size_t n = std::min(a.size(), b.size());
  for (size_t i = 0; i < n; ++i) {
    const int d = static_cast<unsigned char>(Lower(a[i])) - static_cast<unsigned char>(Lower(b[i]));
    if (d != 0) return d;
  }
  return a.size() < b.size() ? -1 : a.size() > b.size() ? 1 : 0;
}

bool EqualNoCase(std::string_view a, std::string_view b) {
  return a.size() == b.size() && CompareNamesNoCase(a, b) == 0;
}

int32_t DecodeSignedVarInt(ByteView bytes, size_t at, size_t& used) {
  const uint8_t first = bytes.u8(at);
  uint32_t value = first & 0x3F;
  used = 1;
  bool more = (first & 0x40) != 0;
  for (int shift = 6; more && used < 5; shift += 7) {
    const uint8_t b = bytes.u8(at + used);
    value |= static_cast<uint32_t>(b & 0x7F) << shift;
    ++used;
    more = (b & 0x80) != 0;
  }
  const int32_t magnitude = static_cast<int32_t>(value);
  return (first & 0x80) ? static_cast<int32_t>(0u - value) : magnitude;
}

}  // namespace cairn
