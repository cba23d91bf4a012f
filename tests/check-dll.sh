#!/bin/bash
# Reads a Windows plug-in's export and import tables: it must export the WCX
# functions under their plain names and import only Windows system DLLs.
#   check-dll.sh OBJDUMP DLL
set -euo pipefail
objdump=$1; dll=$2
expected="CanYouHandleThisFile CanYouHandleThisFileW CloseArchive GetBackgroundFlags GetPackerCaps OpenArchive OpenArchiveW ProcessFile ProcessFileW ReadHeader ReadHeaderEx ReadHeaderExW SetChangeVolProc SetProcessDataProc"
exports=$("$objdump" -p "$dll" | sed -n '/\[Ordinal\/Name Pointer\] Table/,/^$/p' | awk '/\[/ && NR>1 {print $NF}' | sort | tr '\n' ' ' | sed 's/ $//')
[ "$exports" = "$expected" ] || { echo "exports differ: $exports"; exit 1; }
imports=$("$objdump" -p "$dll" | awk '/DLL Name:/ {print tolower($3)}' | sort -u | tr '\n' ' ' | sed 's/ $//')
for d in $imports; do
  case "$d" in
    kernel32.dll|msvcrt.dll|ucrtbase.dll|api-ms-win-crt-*.dll) ;;
    *) echo "imports $d"; exit 1 ;;
  esac
done
echo "$(basename "$dll"): $(stat -c %s "$dll") bytes; exports: $exports; imports: $imports"
