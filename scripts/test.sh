#!/usr/bin/env bash
# ./dev test [--quick]: runs the suites and checks of every target and closes with one line.
set -uo pipefail
. scripts/common.sh
passed=0 failed=0 failures=() not_run=()

pass() { passed=$((passed + $1)); }
fail() { failed=$((failed + $1)); failures+=("$2"); }

# check TITLE COMMAND...: one check that passes or fails as a whole.
check() {
    local title=$1
    shift
    say "$title"
    if "$@"; then pass 1; else fail 1 "$title"; fi
}

# count_report PRESET TEST STATUS: adds one CTest test, by its cases where it reports them.
count_report() {
    local report=build/$1/reports/$2.xml tests bad
    if [[ ! -s $report ]]; then   # no GoogleTest program, or it died before its report
        if [[ $3 == run ]]; then pass 1; else fail 1 "$1: $2"; fi
        return
    fi
    tests=$(sed -nE '0,/<testsuites/s/.*<testsuites tests="([0-9]+)".*/\1/p' "$report")
    bad=$(sed -nE '0,/<testsuites/s/.*<testsuites .*failures="([0-9]+)".*/\1/p' "$report")
    pass $((tests - bad))
    [[ $bad -eq 0 ]] || fail "$bad" "$1: $2"
    # Nothing failed by the report, yet the program did (a leak found at exit, a time-out).
    [[ $3 == run || $bad -gt 0 ]] || fail 1 "$1: $2, at its end"
}

# suite PRESET: builds the preset and counts what its CTest run reports.
suite() {
    local preset=$1 before=$((passed + failed)) name status
    ./dev build "$preset" || { fail 1 "$preset: build"; return; }
    [[ $preset != win64 ]] || wine_setup
    say "testing $preset"
    mkdir -p "build/$preset/reports"
    rm -f "build/$preset"/reports/*.xml
    ctest --preset "$preset" -j "$JOBS" --output-junit reports/ctest.junit </dev/null
    while read -r name status; do
        count_report "$preset" "$name" "$status"
    done < <(sed -nE 's/.*<testcase name="([^"]+)".* status="([a-z]+)".*/\1 \2/p' \
        "build/$preset/reports/ctest.junit")
    [[ $((passed + failed)) -gt $before ]] || fail 1 "$preset: no test ran"
}

# A machine may be unable to run 32-bit Windows programs; then they are built all the same.
suite_win32() {
    local status=0
    win32_setup || status=$?
    if [[ $status -ne 77 ]]; then suite win32; return; fi
    check "32-bit Windows build" ./dev build win32
    not_run+=("the 32-bit Windows suite: $(tail -n 1 "$cache/win32.log")")
}

everything() {
    check "lint, the quick part" scripts/lint.sh --fast
    suite native
    check "exports of libZqVisSvc.so" scripts/check_exports.sh build/native/lib/libZqVisSvc.so
    suite asan
    suite tsan
    suite win64
    check "exports and imports of the 64-bit DLL" \
        scripts/check_exports.sh build/win64/bin/ZqVisSvc.dll
    suite_win32
    check "exports and imports of the 32-bit DLL" \
        scripts/check_exports.sh build/win32/bin/ZqVisSvc.dll
}

case ${1:-} in
    --quick) suite native ;;
    '') everything ;;
    *) die "usage: ./dev test [--quick]" ;;
esac

say "took $((SECONDS / 60)) min $((SECONDS % 60)) s"
for name in "${not_run[@]}"; do echo "not run: $name"; done
for name in "${failures[@]}"; do echo "failed: $name"; done
echo "zqvissvc: $passed passed, $failed failed"
[[ $failed -eq 0 ]]
