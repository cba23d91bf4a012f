// Every example archive, with a few of its bytes changed, many times over:
// recognition, the readers and the methods must answer with a result code,
// never crash, hang or leave an output behind after a failure. Run it under
// the sanitizers (tools/sanitize.sh) to catch reads outside a buffer.
#include <gtest/gtest.h>

#include <cstdlib>
#include <random>

#include "samples.h"

namespace cairn::test {
namespace {

// CAIRN_MUTANTS sets how many mutants each fixture gets (60 by default).
int MutantsPerFixture() {
  const char* n = std::getenv("CAIRN_MUTANTS");
  return n != nullptr ? std::atoi(n) : 60;
}

TEST(Mutation, DamagedArchivesAreAnsweredWithResultCodes) {
  std::mt19937 random(20261206);
  size_t opened = 0, refused = 0, extracted = 0, failed = 0;
  for (const Sample& f : AllSamples()) {
    SCOPED_TRACE(f.label);
    for (int m = 0; m < MutantsPerFixture(); ++m) {
      Bytes bytes = f.bytes;
      // Under 1% of the bytes, at least one, each set to a random value.
      const size_t changes = 1 + random() % std::max<size_t>(1, bytes.size() / 100);
      for (size_t k = 0; k < changes; ++k) bytes[random() % bytes.size()] = random() & 0xFF;
      auto o = std::make_unique<Opened>();
      for (const auto& [name, companion] : f.companions) o->dir.write(name, companion);
      const std::string path = o->dir.write(f.fileName, bytes);
      const int r = f.recognised ? OpenArchiveSession(o->session, path)
                                 : OpenArchiveAs(o->session, path, f.id);
      ASSERT_TRUE(r == kOk || r == kBadData || r == kUnknownFormat) << r;
      if (r != kOk) {
        ++refused;
        continue;
      }
      ++opened;
      for (size_t i = 0; i < o->session.entries.size() && i < 64; ++i) {
        Bytes out;
        const int e = o->extract(i, out);  // checks that a failure leaves no file
        ASSERT_TRUE(e == kOk || e == kBadData) << e;
        ++(e == kOk ? extracted : failed);
      }
    }
  }
  std::printf("mutants opened %zu, refused %zu; entries extracted %zu, failed %zu\n", opened,
              refused, extracted, failed);
}

}  // namespace
}  // namespace cairn::test
