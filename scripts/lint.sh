#!/usr/bin/env bash
# ./dev lint [--fast]: format, layers, scripts; then clang-tidy over all sources, unless --fast.
set -euo pipefail
. scripts/common.sh
status=0

sources() { git ls-files -co --exclude-standard -- '*.cpp' '*.cc' '*.c' '*.h' | sort -u; }

check() {
    local title=$1
    shift
    if "$@"; then echo "ok: $title"; else echo "FAILED: $title"; status=1; fi
}

format() { sources | xargs -r clang-format --dry-run -Werror; }
exports_page() { diff -u docs/exports.md <(scripts/make_exports_page.sh); }
scripts_clean() { shellcheck -x -S warning dev .ci/run scripts/*.sh scripts/win32/*.sh cmake/*.sh; }
# A source that this target does not compile has no entry in the compile database.
tidy() {
    sources | grep -E '\.(cpp|cc)$' | while read -r file; do
        grep -qF "/$file\"" build/native/compile_commands.json && echo "$file"
    done | xargs -r -P "$JOBS" -n 1 clang-tidy -p build/native --quiet 2>&1 |
        grep -vE '^[0-9]+ warnings? generated|^$' | tee build/tidy.log
    ! grep -qE '(warning|error):' build/tidy.log
}

need git clang-format shellcheck
say "lint"
check "format" format
check "layers" scripts/check_layers.sh
check "documentation of the exports" scripts/check_docs.sh
check "reference page of the exports" exports_page
check "shell scripts" scripts_clean
if [[ ${1:-} != --fast ]]; then
    need clang-tidy
    prepare_preset native
    cmake --preset native >/dev/null
    check "clang-tidy" tidy
fi
exit $status
