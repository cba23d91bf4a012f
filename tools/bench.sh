#!/bin/sh
# Builds the benchmarks in Release (build-bench) and runs them. Arguments go
# to the benchmark binary, e.g.
#   tools/bench.sh --benchmark_filter=mixed
#   tools/bench.sh --benchmark_repetitions=5 --benchmark_report_aggregates_only=true
set -eu
cd "$(dirname "$0")/.."
cmake -S . -B build-bench -DCMAKE_BUILD_TYPE=Release \
  -DCAIRN_BENCH=ON -DCAIRN_TESTS=OFF -DCAIRN_CLI=OFF >/dev/null
cmake --build build-bench -j2 --target cairn_bench
exec build-bench/bench/cairn_bench "$@"
