#!/usr/bin/env bash
# ./dev fuzz [SECONDS]: runs every fuzz target for that long. New inputs that reach new code stay
# in the cache folder; a finding is left in build/fuzz/findings and fails the run.
set -euo pipefail
. scripts/common.sh
seconds=${1:-60}
[[ $seconds =~ ^[1-9][0-9]*$ ]] || die "usage: ./dev fuzz [SECONDS]"

build_preset fuzz
export ASAN_OPTIONS=allocator_may_return_null=1 UBSAN_OPTIONS=print_stacktrace=1
findings=build/fuzz/findings
mkdir -p "$findings"
failed=()
for program in build/fuzz/bin/fuzz_*; do
    name=${program##*/fuzz_}
    say "fuzzing $name for $seconds s"
    mkdir -p "$cache/corpus/$name"
    "$program" -max_total_time="$seconds" -timeout=20 -rss_limit_mb=3000 -print_final_stats=1 \
        -artifact_prefix="$findings/$name-" "$cache/corpus/$name" "fuzz/corpus/$name" \
        2>"build/fuzz/$name.log" || failed+=("$name")
    tail -n 12 "build/fuzz/$name.log"
done
[[ ${#failed[@]} -eq 0 ]] || die "findings in: ${failed[*]} (see $findings and build/fuzz/*.log)"
say "no finding"
