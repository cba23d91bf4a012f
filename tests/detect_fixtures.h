// One minimal file for every FormatId that recognition can reach, with the
// name and companion files it needs, for the tests of recognition and of the
// hosts that report it.
#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "builder.h"

namespace cairn::test {

struct DetectCase {
  FormatId id;
  std::string fileName;
  Bytes bytes;                                            // at least 104 bytes
  std::vector<std::pair<std::string, Bytes>> companions;  // files beside it
};

// Every id from 1 to 157 except 70, 91 and 130, which no header reaches, in
// ascending order.
std::vector<DetectCase> DetectCases();

// Bytes written as hexadecimal pairs separated by spaces: "50 41 43 4B".
Bytes FromHex(std::string_view hex);

}  // namespace cairn::test
