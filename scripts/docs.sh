#!/usr/bin/env bash
# ./dev docs: the reference is the public headers; checks that it is complete.
set -euo pipefail
. scripts/common.sh
scripts/check_docs.sh
say "reference: include/zqvissvc/*.h"
for page in README.md docs/*.md; do
    [[ -e $page ]] && printf '%-28s %s\n' "$page" "$(sed -n 's/^# //p;T;q' "$page")"
done
