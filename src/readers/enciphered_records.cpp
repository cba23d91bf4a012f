// The "ISD0" record list (FormatId 75): records from offset 20, each the
// length of the whole record, 12 bytes, the data size, 4 bytes, a 16-bit name
// length, 6 bytes, the name and the data (a chain of blocks, see BlockJoin).
// Records and names are enciphered with an 8-byte repeating XOR key that the
// file does not store:
//
// - bytes 2 and 3 are the header's 16-bit value at 6;
// - bytes 4 to 7 are the header's value at 24 XOR kIsd0KeyConstant;
// - bytes 0 and 1 are the smallest k for which, with M = k | value at 6 << 16,
//   (value at 4 ^ M) * 28 == value at 12 ^ M; 65535 when none is.
//
// The entry count is the value at 4 XOR key bytes 0 to 3. A record shorter
// than its head and name is refused, so the walk always moves forward.

#include <algorithm>
#include <array>
#include <vector>

#include "readers/readers.h"

namespace cairn {
namespace {

using Isd0Key = std::array<uint8_t, 8>;

Isd0Key FindKey(ByteView header) {
  const uint32_t count = header.u32le(4), check = header.u32le(12);
  const uint32_t high = uint32_t{header.u16le(6)} << 16;
  uint32_t k = 0;
  while (k < 65535 && (count ^ (k | high)) * 28 != (check ^ (k | high))) ++k;
  const uint32_t low = k | high, rest = header.u32le(24) ^ kIsd0KeyConstant;
  Isd0Key key;
  for (int i = 0; i < 4; ++i) {
    key[i] = static_cast<uint8_t>(low >> 8 * i);
    key[4 + i] = static_cast<uint8_t>(rest >> 8 * i);
  }
  return key;
}

}  // namespace

void EncipheredRecordReader(ReaderContext& c, unsigned) {
  const Isd0Key key = FindKey(c.header);
  const uint32_t count =
      c.header.u32le(4) ^ (key[0] | key[1] << 8 | key[2] << 16 | uint32_t{key[3]} << 24);
  uint64_t position = 20;
  for (uint32_t i = 0; i < count; ++i) {
    // The head and the longest name a record may have, as far as the file goes.
    if (position > c.fileSize) throw BadData("record past the end");
    std::vector<uint8_t> record =
        ReadBlock(c, position, std::min<uint64_t>(32 + kMaxNameLength, c.fileSize - position));
    for (size_t j = 0; j < record.size(); ++j) record[j] ^= key[j % 8];
    const ByteView r(record);
    const uint16_t nameLength = r.u16le(24);
    if (nameLength > kMaxNameLength) throw BadData("name too long");
    const uint32_t length = r.u32le(0);
    if (length < 32u + nameLength) throw BadData("record shorter than its head");
    const uint32_t size = r.u32le(16);
    AddEntry(c, r.field(32, nameLength), DerivedOffset(position + 32 + nameLength), size, size);
    position += length;
  }
}

}  // namespace cairn
