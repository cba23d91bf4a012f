// libFuzzer entry for one decoder, chosen at build time: CAIRN_FUZZ_DECODER
// names the decoder, CAIRN_FUZZ_REFERENCE its plain counterpart. The first
// four bytes are the output size (little-endian, kept under 256 KiB), the rest
// is the coded stream. The decoder must stay inside its buffers (the
// sanitizers watch), and refuse exactly what the plain decoder refuses or
// produce exactly its bytes.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <optional>

#include "codecs/codecs.h"
#include "reference.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  if (size < 4) return 0;
  const cairn::ByteView input(data, size);
  const uint32_t unpackedSize = input.u32le(0) & 0x3FFFF;
  const cairn::ByteView coded = input.from(4);
  std::optional<std::vector<uint8_t>> out;
  try {
    out = CAIRN_FUZZ_DECODER(coded, unpackedSize);
  } catch (const cairn::BadData&) {
  }
  const auto expected = CAIRN_FUZZ_REFERENCE(coded.data(), coded.size(), unpackedSize);
  if (out != expected) std::abort();
  return 0;
}
