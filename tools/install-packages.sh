#!/usr/bin/env bash
# Installs the Debian packages that cairn is built with, unless all of them
# are present already. Runs apt-get directly as root, through sudo otherwise.
#   install-packages.sh          the build: compiler, zlib, GoogleTest, CLI11, fmt, nlohmann-json
#   install-packages.sh --all    also what the whole test run needs: the real
#                                picture and sound decoders, the Windows
#                                cross-compilers and Wine, clang's fuzzer, gcovr,
#                                and the real game archives of freedoom, freedm
#                                and quakespasm when they can be installed
set -euo pipefail

packages=(cmake make g++ zlib1g-dev libgtest-dev libcli11-dev libfmt-dev nlohmann-json3-dev)
if [ "${1:-}" = "--all" ]; then
  packages+=(imagemagick sox python3 libbenchmark-dev
             g++-mingw-w64-i686 g++-mingw-w64-x86-64 libz-mingw-w64-dev wine64 zip
             clang-14 libfuzzer-14-dev libclang-rt-14-dev gcovr)
  # Game data for the test of real archives; the test skips what is missing.
  optional=(freedoom freedm quakespasm)
fi
installed() { dpkg-query -W -f='${Status}' "$1" 2>/dev/null | grep -q 'install ok installed'; }
missing=() optional_missing=()
for p in "${packages[@]}"; do installed "$p" || missing+=("$p"); done
for p in "${optional[@]:-}"; do [ -z "$p" ] || installed "$p" || optional_missing+=("$p"); done

if [ "${#missing[@]}" -eq 0 ] && [ "${#optional_missing[@]}" -eq 0 ]; then
  echo "All needed packages are installed."
  exit 0
fi

if [ "$(id -u)" -eq 0 ]; then
  as_root=()
else
  as_root=(sudo)
fi
echo "Installing: ${missing[*]} ${optional_missing[*]:-}"
"${as_root[@]}" env DEBIAN_FRONTEND=noninteractive apt-get update
if [ "${#missing[@]}" -gt 0 ]; then
  "${as_root[@]}" env DEBIAN_FRONTEND=noninteractive apt-get install -y "${missing[@]}"
fi
for p in "${optional_missing[@]:-}"; do
  [ -z "$p" ] || "${as_root[@]}" env DEBIAN_FRONTEND=noninteractive apt-get install -y "$p" ||
    echo "Could not install $p: the tests that need it are skipped."
done
