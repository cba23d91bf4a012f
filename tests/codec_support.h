// Helpers of the codec tests: expected output built step by step, and an
// extraction method run through the frame without a directory reader.
#pragma once

#include <memory>
#include <string_view>
#include <utility>
#include <vector>

#include "builder.h"

namespace cairn::test {

inline Bytes Str(std::string_view s) {
  return Bytes(s.begin(), s.end());
}

// Appends `length` bytes copied one at a time from `distance` back.
inline void CopyBack(Bytes& b, size_t distance, size_t length) {
  for (size_t k = 0; k < length; ++k) b.push_back(b[b.size() - distance]);
}

// The archive opened as FormatId `format`, its entries set by hand.
inline std::unique_ptr<Opened> OpenWithEntries(FormatId format, const Bytes& archive,
                                               std::vector<ArchiveEntry> entries) {
  auto o = std::make_unique<Opened>();
  const std::string p = o->dir.write("archive.bin", archive);
  o->session.archive = File(os::OpenShared(p.c_str()));
  o->session.format = format;
  o->session.entries = std::move(entries);
  o->result = o->session.archive ? kOk : kOpenFailed;
  return o;
}

}  // namespace cairn::test
