#!/usr/bin/env bash
# Fails when a source includes a header from a layer above its own, or from
# another folder of its own layer that it has no business with. Layers, from
# the bottom: util; core; detect, readers, codecs, media; formats; hosts/*.
set -euo pipefail
src="${1:-$(dirname "$0")/../src}"
rank() {
  case "$1" in
    util) echo 0 ;; core) echo 1 ;; detect | readers | codecs | media) echo 2 ;;
    formats) echo 3 ;; hosts/*) echo 4 ;; *) echo 9 ;;
  esac
}
# The uses across one layer: pictures decode through the codecs, readers add
# converted copies of pictures and sounds, and one reader recognises entries.
allowed=" media>codecs readers>media readers>detect "
folder() { case "$1" in hosts/*) echo "$1" | cut -d/ -f1-2 ;; *) echo "${1%%/*}" ;; esac; }
bad=0
while IFS= read -r file; do
  from=$(folder "${file#"$src"/}")
  while IFS= read -r target; do
    to=$(folder "$target")
    [ "$to" = "$from" ] && continue
    if [ "$(rank "$to")" -lt "$(rank "$from")" ] || [[ "$allowed" == *" $from>$to "* ]]; then continue; fi
    echo "${file#"$src"/} includes $target (layer $to is not below $from)"
    bad=1
  done < <(sed -n 's/^[[:space:]]*#[[:space:]]*include[[:space:]]*"\([^"]*\/[^"]*\)".*/\1/p' "$file")
done < <(find "$src" -type f \( -name '*.cpp' -o -name '*.h' -o -name '*.inc' \) | sort)
[ "$bad" -eq 0 ] && echo "every include goes down the layers"
exit "$bad"
