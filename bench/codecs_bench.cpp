// Output throughput of the decoders on 16 MiB of generated data, each next to
// memcpy and zlib's inflate of the same bytes, measured in the same run.
// Data sets: a mix of text, pictures and incompressible blocks (2:2:1), and
// each kind alone.
#include <benchmark/benchmark.h>
#include <zlib.h>

#include <cstring>
#include <map>
#include <stdexcept>
#include <string>

#include "codec_encoders.h"
#include "codecs/codecs.h"

namespace {

using cairn::test::Bytes;

constexpr size_t kSize = 16u << 20;

struct DataSet {
  Bytes plain, jdlz, opcodeLz, rle, zlib;
};

const DataSet& Data(const std::string& kind) {
  static std::map<std::string, DataSet> sets;
  auto it = sets.find(kind);
  if (it != sets.end()) return it->second;
  DataSet d;
  d.plain = kind == "text"      ? cairn::test::TextLike(kSize)
            : kind == "picture" ? cairn::test::PictureLike(kSize)
            : kind == "random"  ? cairn::test::RandomBytes(kSize)
                                : cairn::test::MixedData(kSize);
  d.jdlz = cairn::test::JdlzEncode(d.plain);
  d.opcodeLz = cairn::test::OpcodeLzEncode(d.plain);
  d.rle = cairn::test::RleEncode(d.plain);
  uLongf n = compressBound(kSize);
  d.zlib.resize(n);
  if (compress(d.zlib.data(), &n, d.plain.data(), kSize) != Z_OK)
    throw std::runtime_error("compress failed");
  d.zlib.resize(n);
  return sets.emplace(kind, std::move(d)).first->second;
}

void Finish(benchmark::State& state, size_t coded) {
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kSize);
  state.counters["ratio"] = static_cast<double>(coded) / kSize;
}

void Memcpy(benchmark::State& state, const std::string& kind) {
  const DataSet& d = Data(kind);
  Bytes out(kSize);
  for (auto _ : state) {
    std::memcpy(out.data(), d.plain.data(), kSize);
    benchmark::DoNotOptimize(out.data());
    benchmark::ClobberMemory();
  }
  Finish(state, kSize);
}

using DecodeFn = std::vector<uint8_t> (*)(cairn::ByteView, uint32_t);

void Decode(benchmark::State& state, const std::string& kind, Bytes DataSet::*coded,
            DecodeFn decode) {
  const DataSet& d = Data(kind);
  if (decode(d.*coded, kSize) != d.plain) {
    state.SkipWithError("decoded bytes differ");
    return;
  }
  for (auto _ : state) {
    std::vector<uint8_t> out = decode(d.*coded, kSize);
    benchmark::DoNotOptimize(out.data());
  }
  Finish(state, (d.*coded).size());
}

void Inflate(benchmark::State& state, const std::string& kind) {
  const DataSet& d = Data(kind);
  for (auto _ : state) {
    // A fresh output each time, as the decoders above make.
    std::vector<uint8_t> out(kSize);
    uLongf n = kSize;
    if (uncompress(out.data(), &n, d.zlib.data(), d.zlib.size()) != Z_OK || n != kSize) {
      state.SkipWithError("inflate failed");
      return;
    }
    benchmark::DoNotOptimize(out.data());
  }
  Finish(state, d.zlib.size());
}

const bool registered = [] {
  for (const std::string kind : {"mixed", "text", "picture", "random"}) {
    benchmark::RegisterBenchmark(("memcpy/" + kind).c_str(), Memcpy, kind);
    benchmark::RegisterBenchmark(("inflate/" + kind).c_str(), Inflate, kind);
    benchmark::RegisterBenchmark(("jdlz/" + kind).c_str(), Decode, kind, &DataSet::jdlz,
                                 cairn::JdlzDecode);
    benchmark::RegisterBenchmark(("opcode_lz/" + kind).c_str(), Decode, kind, &DataSet::opcodeLz,
                                 cairn::OpcodeLzDecode);
    benchmark::RegisterBenchmark(("rle/" + kind).c_str(), Decode, kind, &DataSet::rle,
                                 cairn::RleDecode);
  }
  return true;
}();

}  // namespace

BENCHMARK_MAIN();
