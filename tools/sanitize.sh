#!/usr/bin/env bash
# Builds cairn with AddressSanitizer and UBSan and runs the tests, with the
# mutation test at CAIRN_MUTANTS mutants per example archive (default 1000).
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/.."
cmake -S . -B build-asan -DCAIRN_SANITIZE=ON -DCMAKE_BUILD_TYPE=Debug
cmake --build build-asan -j2
CAIRN_MUTANTS=${CAIRN_MUTANTS:-1000} ctest --test-dir build-asan -j2 --output-on-failure -E Windows
