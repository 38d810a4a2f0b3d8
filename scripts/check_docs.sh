#!/usr/bin/env bash
# Every name of the export list must be declared in a public header, with a comment directly above
# its declaration or above the block of declarations that it stands in.
set -euo pipefail
awk '
    FILENAME ~ /exports\.txt$/ {
        sub(/#.*/, "")
        if (NF == 3) wanted[$2] = 1
        next
    }
    FNR == 1 { documented = 0 }
    /^[ \t]*$/ { documented = 0 }
    /^[ \t]*(\/\*|\*|\/\/)/ { documented = 1; next }
    {
        line = $0
        gsub(/[^A-Za-z0-9_]+/, " ", line)
        count = split(line, words, " ")
        for (i = 1; i <= count; ++i) {
            if (words[i] in wanted && documented) found[words[i]] = 1
        }
    }
    END {
        for (name in wanted) if (!(name in found)) { print "not documented: " name; bad = 1 }
        exit bad
    }' src/exports/exports.txt include/zqvissvc/*.h
echo "every exported name is documented"
