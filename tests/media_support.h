// A session over hand-made bytes holding the entries a reader would have
// listed: the writers and the methods are tested without any reader.
#pragma once

#include "builder.h"

namespace cairn::test {

struct MediaArchive {
  std::unique_ptr<Opened> opened;

  MediaArchive(FormatId format, const Bytes& bytes, std::vector<ArchiveEntry> entries = {})
      : opened(SessionOver(format, bytes, std::move(entries))) {}
  MediaArchive& add(std::string name, uint32_t offset, uint32_t unpacked, uint32_t packed,
                    uint32_t extra, uint8_t flag) {
    opened->session.entries.push_back({std::move(name), offset, unpacked, packed, extra, flag});
    return *this;
  }
  int extract(size_t index, Bytes& out) { return opened->extract(index, out); }
  Bytes extract(size_t index) { return opened->extract(index); }
};

}  // namespace cairn::test
