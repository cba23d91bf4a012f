#!/bin/sh
# Builds the decoder fuzz targets (clang-14, libFuzzer, ASan + UBSan) in
# build-fuzz and runs each for SECONDS seconds (default 20).
#
#   tools/fuzz-smoke.sh            a smoke run, 20 s per decoder
#   tools/fuzz-smoke.sh 60 rle     one decoder only
#
# A longer run, e.g. before a release: an hour per decoder, keeping the
# corpus in build-fuzz/corpus/<decoder> between runs, so that each run
# starts where the last one stopped:
#
#   tools/fuzz-smoke.sh 3600
#
# A crash leaves its input as build-fuzz/crash-<decoder>-*; replay it with
#   build-fuzz/fuzz/fuzz_<decoder> build-fuzz/crash-<decoder>-...
set -eu
cd "$(dirname "$0")/.."
seconds=${1:-20}
shift 2>/dev/null || true
decoders=${*:-jdlz rle opcode_lz}

CC=clang-14 CXX=clang++-14 cmake -S . -B build-fuzz -DCMAKE_BUILD_TYPE=RelWithDebInfo \
  -DCAIRN_FUZZ=ON -DCAIRN_TESTS=OFF -DCAIRN_CLI=OFF >/dev/null
targets=""
for d in $decoders; do targets="$targets fuzz_$d"; done
# shellcheck disable=SC2086
cmake --build build-fuzz -j2 --target $targets

for d in $decoders; do
  corpus=build-fuzz/corpus/$d
  mkdir -p "$corpus"
  echo "== $d: $seconds s"
  build-fuzz/fuzz/fuzz_$d "$corpus" -max_total_time="$seconds" -max_len=16384 \
    -rss_limit_mb=1024 -artifact_prefix="build-fuzz/crash-$d-" -print_final_stats=1 \
    2>&1 | grep -E '^(#[0-9]+ +DONE|stat::number_of_executed_units|==[0-9]+==|SUMMARY)' || true
  if ls build-fuzz/crash-"$d"-* >/dev/null 2>&1; then
    echo "$d: crash found" >&2
    exit 1
  fi
done
