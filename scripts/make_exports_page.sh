#!/usr/bin/env bash
# Prints the reference page of the exports, docs/exports.md, made from the one list of them and from
# the public headers, in which each name is described.
set -euo pipefail

cat <<'PAGE'
# Exported names

Made by `scripts/make_exports_page.sh` from `src/exports/exports.txt`; do not edit. Ordinals never change. On Windows
functions and variables are exported by name and ordinal, core functions by ordinal alone; elsewhere all are exported by
name. Each is described in the header named beside it, in `include/zqvissvc/`.

| ordinal | name | kind | header |
|---|---|---|---|
PAGE
sed 's/#.*//' src/exports/exports.txt | awk 'NF == 3' | sort -n | while read -r ordinal name kind; do
    header=$(grep -lE "ZQ_CALL $name\(|ZQ_CALL\* $name\)|extern ZQ_DATA [A-Za-z]+ $name;" include/zqvissvc/*.h | head -n 1)
    [[ -n $header ]] || { echo "no header declares $name" >&2; exit 1; }
    echo "| $ordinal | \`$name\` | $kind | \`${header##*/}\` |"
done
