#!/usr/bin/env bash
# The two figures that keep the tests in proportion: non-blank lines of
# tests/ against src/ (the generated palette data not counted), and line
# coverage of src/ over the whole test run, from a coverage build in
# build-cov (gcovr).
#   tools/test-figures.sh            both figures
#   tools/test-figures.sh --ratio    only the line ratio, without building
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/.."
lines() {
  find "$1" -type f \( -name '*.cpp' -o -name '*.h' -o -name '*.sh' -o -name '*.py' -o -name '*.txt' \) \
    -print0 | xargs -0 cat | grep -cv '^\s*$'
}
src=$(lines src) tests=$(lines tests)
echo "tests/ $tests non-blank lines, src/ $src: ratio $(awk "BEGIN {printf \"%.2f\", $tests / $src}")"
[ "${1:-}" = "--ratio" ] && exit 0
cmake -S . -B build-cov -DCMAKE_BUILD_TYPE=Debug -DCMAKE_CXX_FLAGS="--coverage -O0" \
  -DCMAKE_EXE_LINKER_FLAGS=--coverage -DCMAKE_SHARED_LINKER_FLAGS=--coverage >/dev/null
cmake --build build-cov -j2 >/dev/null
find build-cov -name '*.gcda' -delete
ctest --test-dir build-cov -j2 >/dev/null || true
gcovr -r . --filter src/ build-cov | grep TOTAL
