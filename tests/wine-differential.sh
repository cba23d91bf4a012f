#!/bin/bash
# Runs every example archive of the test suite through the Linux plug-in and
# through the Windows DLL under Wine, each loaded by the same small host, and
# requires the same listings, the same DOS FileTime and the same extracted
# bytes. Then the Windows-only cases: a path outside the ANSI code page, a
# missing archive, a folder given as the archive, an output that cannot be
# created.
#   wine-differential.sh LINUX_BUILD_DIR WINDOWS_BUILD_DIR
set -euo pipefail
linux=$(realpath "$1")
windows=$(realpath "$2")
wine=$(command -v wine64 || echo /usr/lib/wine/wine64)
export WINEDEBUG=-all WINEPREFIX=${WINEPREFIX:-$HOME/.cache/cairn-wine}
mkdir -p "$(dirname "$WINEPREFIX")"
# A server of an earlier run that is still shutting down drops new clients:
# wait for it to end first.
wineserver=$(command -v wineserver || echo /usr/lib/wine/wineserver64)
"$wineserver" -w 2>/dev/null || true
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

fail() { echo "FAIL: $*"; exit 1; }
winpath() { echo "Z:$1" | sed 's|/|\\|g'; }

CAIRN_DUMP_FIXTURES="$work/fx" "$linux/tests/cairn_tests" --gtest_filter=Samples.DumpWhenAsked >/dev/null \
  || fail "could not write the fixtures"
archives=(); winarchives=()
while read -r n name; do
  archives+=("$work/fx/$n/$name")
  winarchives+=("$(winpath "$work/fx/$n/$name")")
done < "$work/fx/list.txt"
echo "fixtures: ${#archives[@]}"
[ ${#archives[@]} -gt 0 ] || fail "no fixtures"

"$linux/wcx_host" "$linux/cairn.wcx" "$work/linux" "${archives[@]}" > "$work/linux.txt"
"$wine" "$windows/wcx_host.exe" "$windows/cairn.wcx64" "$(winpath "$work/wide")" "${winarchives[@]}" \
  | tr -d '\r' > "$work/wide.txt"
"$wine" "$windows/wcx_host.exe" --ansi "$windows/cairn.wcx64" "$(winpath "$work/ansi")" "${winarchives[@]}" \
  | tr -d '\r' > "$work/ansi.txt"
diff -u "$work/linux.txt" "$work/wide.txt" || fail "listings differ (Linux, Windows wide)"
diff -u "$work/linux.txt" "$work/ansi.txt" || fail "listings differ (Linux, Windows ANSI)"
diff -r "$work/linux" "$work/wide" || fail "extracted bytes differ (Linux, Windows wide)"
diff -r "$work/linux" "$work/ansi" || fail "extracted bytes differ (Linux, Windows ANSI)"
entries=$(grep -c '^entry ' "$work/linux.txt" || true)
failed=$(grep '^result ' "$work/linux.txt" | grep -vc '^result 0 ' || true)
[ "$failed" -eq 0 ] || fail "$failed extractions failed"
echo "same listings and bytes: ${#archives[@]} archives, $entries entries, wide and ANSI"

# A path outside the ANSI code page opens and extracts through the wide entry points.
unicode="$work/ünïcödé-архив-档案"
mkdir -p "$unicode"
cp -p "${archives[0]}" "$unicode/"
base=$(basename "${archives[0]}")
"$wine" "$windows/wcx_host.exe" "$windows/cairn.wcx64" "$(winpath "$work/uni")" \
  "$(winpath "$unicode/$base")" | tr -d '\r' > "$work/uni.txt"
awk '/^archive 1 /{exit} {print}' "$work/linux.txt" > "$work/first.txt"
diff -u "$work/first.txt" "$work/uni.txt" || fail "the path outside the code page reads differently"
diff -r "$work/linux/0" "$work/uni/0" || fail "the path outside the code page extracts differently"
echo "path outside the ANSI code page: same listing and bytes"

# A missing archive and a folder cannot be opened (15); an output that cannot
# be created is 16 and the walk goes on with the next entry.
"$wine" "$windows/wcx_host.exe" --unwritable "$windows/cairn.wcx64" "$(winpath "$work/bad")" \
  "$(winpath "$work/missing.wad")" "$(winpath "$work")" "${winarchives[0]}" | tr -d '\r' > "$work/bad.txt"
grep -q '^archive 0 open 15$' "$work/bad.txt" || fail "a missing archive is not 15"
grep -q '^archive 1 open 15$' "$work/bad.txt" || fail "a folder is not 15"
[ "$(grep '^result ' "$work/bad.txt" | head -1 | cut -d' ' -f2)" = 16 ] || fail "an uncreatable output is not 16"
[ "$(grep -c '^entry ' "$work/bad.txt")" = "$(awk '/^archive 1 /{exit} /^entry /{n++} END{print n+0}' "$work/linux.txt")" ] \
  || fail "the walk did not go on after 16"
echo "missing archive 15, folder 15, uncreatable output 16 with the walk going on"
echo "1 passed, 0 failed"
