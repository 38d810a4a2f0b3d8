#!/usr/bin/env bash
# ./dev bench [native|win64|win32] [ARGUMENT...]: builds the release of that target and runs its
# benchmarks, natively beside OpenCV; the 32-bit ones under the emulator, where only ratios between
# emulated code mean something.
set -euo pipefail
. scripts/common.sh
target=native
case ${1:-} in native | win64 | win32) target=$1; shift ;; esac
[[ $target != native ]] || need libopencv-imgcodecs-dev libopencv-imgproc-dev
build_preset "$target" zqvis_bench zqvis_codec_bench
[[ $target != win32 ]] || win32_setup
say "benchmarks ($target)"
cd "build/$target/bin"
for program in zqvis_bench zqvis_codec_bench; do
    case $target in
        native) "./$program" "$@" ;;
        win64) "$ZQVISSVC_WINE64" "./$program.exe" "$@" ;;
        win32) "${ZQVISSVC_RUN_WIN32%%;*}" "${ZQVISSVC_RUN_WIN32#*;}" "$program.exe" "$@" ;;
    esac
done
