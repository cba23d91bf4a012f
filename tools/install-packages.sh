#!/usr/bin/env bash
# Installs the Debian packages that cairn is built with, unless all of them
# are present already. Runs apt-get directly as root, through sudo otherwise.
#   install-packages.sh          the build: compiler, zlib, GoogleTest, CLI11, fmt
#   install-packages.sh --all    also what the whole test run needs: the real
#                                picture and sound decoders, the Windows
#                                cross-compilers and Wine, clang's fuzzer
set -euo pipefail

packages=(cmake make g++ zlib1g-dev libgtest-dev libcli11-dev libfmt-dev)
if [ "${1:-}" = "--all" ]; then
  packages+=(imagemagick sox python3 libbenchmark-dev
             g++-mingw-w64-i686 g++-mingw-w64-x86-64 libz-mingw-w64-dev wine64 zip
             clang-14 libfuzzer-14-dev libclang-rt-14-dev)
fi
missing=()
for p in "${packages[@]}"; do
  if ! dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q 'install ok installed'; then
    missing+=("$p")
  fi
done

if [ "${#missing[@]}" -eq 0 ]; then
  echo "All needed packages are installed."
  exit 0
fi

if [ "$(id -u)" -eq 0 ]; then
  as_root=()
else
  as_root=(sudo)
fi
echo "Installing: ${missing[*]}"
"${as_root[@]}" env DEBIAN_FRONTEND=noninteractive apt-get update
"${as_root[@]}" env DEBIAN_FRONTEND=noninteractive apt-get install -y "${missing[@]}"
