#!/usr/bin/env bash
# ./dev bench: builds the native release and runs the benchmarks.
set -euo pipefail
. scripts/common.sh
need libopencv-imgproc-dev
build_preset native zqvis_bench
say "benchmarks"
exec build/native/bin/zqvis_bench "$@"
