// Every sample archive, and the real game archives when their packages are
// installed, with a few of their bytes changed, many times over: recognition,
// the readers and the methods must answer with a result code, never crash,
// hang or leave an output behind after a failure. Run it under the
// sanitizers (tools/sanitize.sh) to catch reads outside a buffer.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <random>

#include "samples.h"

namespace cairn::test {
namespace {

// CAIRN_MUTANTS sets how many mutants each sample gets (60 by default).
int MutantsPerSample() {
  const char* n = std::getenv("CAIRN_MUTANTS");
  return n != nullptr ? std::atoi(n) : 60;
}

struct Tally {
  size_t opened = 0, refused = 0, extracted = 0, failed = 0;
};

// Opens the sample changed at `changes` positions, anywhere in it or, with a
// `tail`, in its first 12 bytes and its last `tail`, and extracts its first 64
// entries.
void Mutant(Sample s, size_t changes, size_t tail, std::mt19937& random, Tally& t) {
  const size_t size = s.bytes.size();
  for (size_t k = 0; k < changes; ++k) {
    const size_t at = tail == 0       ? random() % size
                      : random() % 2 ? random() % 12
                                      : size - 1 - random() % tail;
    s.bytes[at] = random() & 0xFF;
  }
  auto o = std::make_unique<Opened>();
  const std::string path = WriteSample(s, o->dir.dir());
  const int r =
      s.recognised ? OpenArchiveSession(o->session, path) : OpenArchiveAs(o->session, path, s.id);
  ASSERT_TRUE(r == kOk || r == kBadData || r == kUnknownFormat) << r;
  ++(r == kOk ? t.opened : t.refused);
  for (size_t i = 0; r == kOk && i < o->session.entries.size() && i < 64; ++i) {
    // A damaged size may rightly ask a short stream for gigabytes of zeros.
    if (o->session.entries[i].UnpackedSize > (16u << 20)) continue;
    Bytes out;
    const int e = o->extract(i, out);  // checks that a failure leaves no file
    ASSERT_TRUE(e == kOk || e == kBadData) << e;
    ++(e == kOk ? t.extracted : t.failed);
  }
}

TEST(Mutation, DamagedArchivesAreAnsweredWithResultCodes) {
  std::mt19937 random(20261206);
  Tally t;
  for (const Sample& s : AllSamples()) {
    SCOPED_TRACE(s.label);
    // Under 1% of the bytes, at least one, each set to a random value.
    for (int m = 0; m < MutantsPerSample(); ++m)
      Mutant(s, 1 + random() % std::max<size_t>(1, s.bytes.size() / 100), 0, random, t);
  }
  // The real archives keep their directories at the end: the changes fall
  // in the header and in the last 64 KiB.
  for (const char* real :
       {"/usr/share/games/doom/freedoom2.wad", "/usr/share/games/doom/freedm.wad",
        "/usr/share/games/quake/quakespasm.pak"}) {
    if (!std::filesystem::exists(real)) continue;
    SCOPED_TRACE(real);
    const Sample s{real, 0, std::filesystem::path(real).filename(), ReadFile(real)};
    const size_t tail = std::min<size_t>(s.bytes.size(), 65536);
    for (int m = 0; m < std::max(1, MutantsPerSample() / 10); ++m)
      Mutant(s, 1 + random() % 8, tail, random, t);
  }
  std::printf("mutants opened %zu, refused %zu; entries extracted %zu, failed %zu\n", t.opened,
              t.refused, t.extracted, t.failed);
}

}  // namespace
}  // namespace cairn::test
