#!/usr/bin/env bash
# check_exports.sh LIBRARY: compares the export table of a built library with the export list; a
# DLL may besides import system DLLs only and must carry the version of the project.
set -euo pipefail
library=$1
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

kSystemDlls='^(advapi32|comctl32|comdlg32|gdi32|kernel32|msvcrt|ole32|shell32|user32|winmm)\.dll$'

list() { sed 's/#.*//' src/exports/exports.txt | awk 'NF == 3'; }

dll_exports() {
    # Ordinals and names stand in two tables, both relative to the ordinal base.
    objdump -p "$library" | awk '
        /^Ordinal Base/ { base = $3 }
        /\+base\[/ { match($0, /\+base\[ *[0-9]+/); present[substr($0, RSTART + 6, RLENGTH - 6) + 0] }
        /^\[Ordinal\/Name Pointer\] Table/ { names = 1; next }
        names && /^\t\[/ { match($0, /[0-9]+/); name[substr($0, RSTART, RLENGTH) + base] = $NF; next }
        /^$/ { names = 0 }
        END { for (o in present) print o, (o in name) ? name[o] : "-" }'
}

check_dll() {
    list | awk '{ print $1, $3 == "core" ? "-" : $2 }' | sort >"$work/expected"
    dll_exports | sort >"$work/actual"
    local imports
    imports=$(objdump -p "$library" | sed -n 's/^\tDLL Name: //p' | grep -viE "$kSystemDlls" || true)
    [[ -z $imports ]] || { echo "$library imports more than system DLLs: $imports"; return 1; }
    local version
    version=$(sed -nE 's/^project\(ZqVisSvc VERSION ([0-9.]+).*/\1/p' CMakeLists.txt)
    grep -qF "$version" <(strings -e l "$library") || { echo "$library has no version"; return 1; }
}

check_so() {
    list | awk '{ print $2 }' | sort >"$work/expected"
    nm -D --defined-only "$library" | awk '{ print $3 }' | sort >"$work/actual"
}

case $library in
    *.dll) check_dll ;;
    *) check_so ;;
esac
[[ -s $work/expected ]] || { echo "the export list is empty"; exit 1; }
diff -u "$work/expected" "$work/actual" || { echo "$library: export table differs from the list"; exit 1; }
echo "$library: $(wc -l <"$work/expected") exports as listed"
