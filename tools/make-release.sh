#!/bin/bash
# Packs the two Windows plug-ins into a zip that Total Commander installs by
# itself (it reads pluginst.inf when the zip is opened).
#   make-release.sh WIN32_BUILD_DIR WIN64_BUILD_DIR OUTPUT.zip
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
stage=$(mktemp -d)
trap 'rm -rf "$stage"' EXIT
cp "$1/cairn.wcx" "$2/cairn.wcx64" "$stage/"
cp "$root/packaging/pluginst.inf" "$root/packaging/readme.txt" "$stage/"
# Windows tools read these two as text with CR LF line ends.
sed -i 's/$/\r/' "$stage/pluginst.inf" "$stage/readme.txt"
out=$(realpath -m "$3")
rm -f "$out"
(cd "$stage" && zip -q -X "$out" pluginst.inf readme.txt cairn.wcx cairn.wcx64)
echo "$out: $(stat -c %s "$out") bytes"
unzip -l "$out"
