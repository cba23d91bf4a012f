// One minimal file for every FormatId that recognition can reach, with its name
// and companions, for the tests of recognition and of the hosts that report it.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "builder.h"

namespace cairn::test {

struct DetectCase {
  FormatId id;
  std::string fileName;                                   // empty: recognised without a path
  Bytes bytes;                                            // at least 104 bytes
  std::vector<std::pair<std::string, Bytes>> companions;  // files beside it
};

// Every id from 1 to 157 except 91 and 130, which no file reaches, in
// ascending order.
std::vector<DetectCase> DetectCases();

// The builder's bytes padded with zeros to `n`, a whole header by default.
inline Bytes Header(ArchiveBuilder b, size_t n = kHeaderSize) {
  return b.padTo(n).get();
}

// "AAAA" (a first word no rule takes) and zeros, with 32-bit words at offsets.
Bytes Words(std::initializer_list<std::pair<size_t, uint32_t>> words, size_t size = kHeaderSize);

}  // namespace cairn::test
