#!/usr/bin/env bash
# Refuses an include that runs against the order of the layers under src/, an operating-system
# header or switch outside platform/, a path that exists on one machine only, and two types of one
# name, whose inline functions the linker would take for the same.
set -euo pipefail
status=0
report() { [[ -z $2 ]] || { printf '%s:\n%s\n' "$1" "$2"; status=1; }; }

report "include against the order of the layers" "$(grep -rnE '^#include "[a-z]+/.*\.h"' src | awk -F'[:/"]' '
    BEGIN {
        n = split("base codecs platform kernels image host convert serialize", order, " ")
        for (i = 1; i <= n; ++i) rank[order[i]] = i
        rank["files"] = rank["display"] = rank["timers"] = n + 1
        rank["exports"] = n + 2
    }
    {
        match($0, /#include "[a-z]+/)
        target = substr($0, RSTART + 10, RLENGTH - 10)
        if (target != $2 && rank[target] >= rank[$2]) print
    }')"

kSystemHeaders='windows|windef|winbase|wingdi|winuser|io|direct|process|unistd|fcntl|dlfcn|pthread|dirent|sched|poll|sys/[a-z]+'
report "operating-system header outside platform/" \
    "$(grep -rnE "^#include <($kSystemHeaders)\.h>" src --include='*.h' --include='*.cpp' |
        grep -v '^src/platform/' || true)"
report "operating-system switch outside platform/" \
    "$(grep -rnE '\b(_WIN32|_WIN64|__linux__|__unix__|__MINGW32__)\b' src include tools |
        grep -vE '^(src/platform/|include/zqvissvc/types\.h:)' || true)"
report "path of one machine" \
    "$(git grep --untracked -nIE '(^|[^A-Za-z0-9_.}/"]|(^|[^A-Za-z0-9_}])")/(work|root|tmp|home)/[A-Za-z]' -- \
        . ':!scripts/check_layers.sh' || true)"
kType='^(struct|class|enum class) [A-Z][A-Za-z0-9]*( final)?( : [^;{]*)? \{'
report "two types of one name" \
    "$({ grep -rhoE "$kType" src --include='*.h' --exclude-dir=platform
         grep -hoE "$kType" src/kernels/*.cpp; } |
        sed -E 's/^(struct|class|enum class) ([A-Za-z0-9]+).*/\2/' | sort | uniq -d)"
exit $status
