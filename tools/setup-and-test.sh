#!/usr/bin/env bash
# Sets cairn up on a Debian machine and runs its tests: installs what is
# missing, builds everything and runs ctest.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/.."

bash tools/install-packages.sh
cmake -S . -B build && cmake --build build -j2 && ctest --test-dir build --output-on-failure
