#!/usr/bin/env bash
# Sets cairn up on a Debian machine and runs its tests: installs what is
# missing, builds the Linux plug-in, tool and tests, cross-builds the two
# Windows plug-ins, and runs ctest (which also checks the Windows DLLs and
# runs the 64-bit one under Wine beside the Linux one).
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/.."

bash tools/install-packages.sh --all
for arch in i686 x86_64; do
  cmake -S . -B "build-$arch-w64-mingw32" -DCMAKE_TOOLCHAIN_FILE="cmake/mingw-$arch.cmake" \
    -DCMAKE_BUILD_TYPE=Release -DCAIRN_TESTS=OFF -DCAIRN_CLI=OFF
  cmake --build "build-$arch-w64-mingw32" -j2
done
cmake -S . -B build -DCAIRN_WIN32_DIR="$PWD/build-i686-w64-mingw32" \
  -DCAIRN_WIN64_DIR="$PWD/build-x86_64-w64-mingw32" && cmake --build build -j2 &&
  ctest --test-dir build --output-on-failure
bash tools/make-release.sh build-i686-w64-mingw32 build-x86_64-w64-mingw32 build/cairn-wcx.zip
