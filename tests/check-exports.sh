#!/bin/sh
# Compares the dynamic symbols a plug-in defines with the WCX export list.
set -eu
expected="CanYouHandleThisFile CloseArchive GetBackgroundFlags GetPackerCaps OpenArchive ProcessFile ReadHeader SetChangeVolProc SetProcessDataProc"
actual=$(nm -D --defined-only "$1" | awk '$2 ~ /^[TDBRVW]$/ {print $3}' | sort | tr '\n' ' ' | sed 's/ $//')
if [ "$actual" != "$expected" ]; then
  echo "exports differ:"; echo "  expected: $expected"; echo "  actual:   $actual"; exit 1
fi
echo "exports: $actual"
