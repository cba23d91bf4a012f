#!/bin/sh
# Builds the fuzz targets (clang-14, libFuzzer, ASan + UBSan) in build-fuzz
# and runs each for SECONDS seconds (default 20): the three decoders, and
# `open`, a whole archive through recognition, a reader and extraction.
#
#   tools/fuzz-smoke.sh            a smoke run, 20 s per target
#   tools/fuzz-smoke.sh 60 rle     one target only
#
# `open` starts from the seeds in build-fuzz/seeds/open, made when that folder
# is missing: every sample archive (the native tests, built in
# build-fuzz-seeds, dump them) and a cut-down copy, under 64 KiB, of each real
# game archive installed (tools/fuzz-seeds.py). Delete the folder to make them
# again.
#
# A longer run, e.g. before a release: an hour per target, keeping the
# corpus in build-fuzz/corpus/<target> between runs, so that each run
# starts where the last one stopped:
#
#   tools/fuzz-smoke.sh 3600
#
# A crash, hang (10 s) or leak leaves its input as
# build-fuzz/crash-<target>-{crash,timeout,leak,oom}-*; replay it with
#   build-fuzz/fuzz/fuzz_<target> build-fuzz/crash-<target>-...
set -eu
cd "$(dirname "$0")/.."
seconds=${1:-20}
shift 2>/dev/null || true
decoders=${*:-jdlz rle opcode_lz open}

CC=clang-14 CXX=clang++-14 cmake -S . -B build-fuzz -DCMAKE_BUILD_TYPE=RelWithDebInfo \
  -DCAIRN_FUZZ=ON -DCAIRN_TESTS=OFF -DCAIRN_CLI=OFF >/dev/null
targets=""
for d in $decoders; do targets="$targets fuzz_$d"; done
# shellcheck disable=SC2086
cmake --build build-fuzz -j2 --target $targets

seeds=build-fuzz/seeds/open
case " $decoders " in *" open "*)
  if [ ! -d "$seeds" ]; then
    cmake -S . -B build-fuzz-seeds -DCMAKE_BUILD_TYPE=Debug -DCAIRN_CLI=OFF >/dev/null
    cmake --build build-fuzz-seeds -j2 --target cairn_tests
    dump=build-fuzz/seeds/dump
    rm -rf "$dump" && mkdir -p "$dump"
    CAIRN_DUMP_FIXTURES="$PWD/$dump" build-fuzz-seeds/tests/cairn_tests \
      --gtest_filter=Samples.DumpWhenAsked >/dev/null
    real=""
    for f in /usr/share/games/doom/freedoom1.wad /usr/share/games/doom/freedoom2.wad \
      /usr/share/games/doom/freedm.wad /usr/share/games/quake/quakespasm.pak; do
      if [ -f "$f" ]; then real="$real $f"; fi
    done
    # shellcheck disable=SC2086
    rm -rf "$seeds.new"
    python3 tools/fuzz-seeds.py "$dump" "$seeds.new" $real
    rm -rf "$dump"
    mv "$seeds.new" "$seeds"
  fi
esac

for d in $decoders; do
  corpus=build-fuzz/corpus/$d
  mkdir -p "$corpus"
  if [ "$d" = open ]; then
    dirs="$corpus $seeds" max_len=65536
  else
    dirs=$corpus max_len=16384
  fi
  echo "== $d: $seconds s"
  # shellcheck disable=SC2086
  build-fuzz/fuzz/fuzz_$d $dirs -max_total_time="$seconds" -max_len=$max_len -timeout=10 \
    -rss_limit_mb=1024 -artifact_prefix="build-fuzz/crash-$d-" -print_final_stats=1 \
    2>&1 | grep -E '^(#[0-9]+[[:space:]]+DONE|stat::(number_of_executed_units|average_exec_per_sec)|==[0-9]+==|SUMMARY)' || true
  if ls build-fuzz/crash-"$d"-* >/dev/null 2>&1; then
    echo "$d: crash found" >&2
    exit 1
  fi
done
