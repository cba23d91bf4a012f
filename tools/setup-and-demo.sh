#!/usr/bin/env bash
# Sets cairn up on a Debian machine and shows it at work: installs what is
# missing, builds the tool and the plug-in, then lists and extracts the small
# example archive examples/demo.wad.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/.."

bash tools/install-packages.sh
cmake -S . -B build && cmake --build build -j2 --target cairn_cli cairn_wcx

run() {
  echo
  echo "\$ $*"
  "$@"
}
run build/cairn list examples/demo.wad
run build/cairn extract examples/demo.wad -o build/demo --overwrite
for f in build/demo/*; do
  echo
  echo "--- $f"
  cat "$f"
done
