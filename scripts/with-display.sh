#!/usr/bin/env bash
# Runs a Windows program by the emulator's command line on a display of its own, that nobody sees:
#
#   with-display.sh EMULATOR... PROGRAM.EXE [ARGUMENT...]
#
# The 32-bit emulator brings a display itself; the 64-bit Wine needs one, and a prefix that is told
# to use it. wine_setup in common.sh exports that prefix.
set -euo pipefail
[[ $1 != *run-win32.sh ]] || exec "$@"

# Of the server that is stopped at the end, too: the other prefix may be in use.
export WINEPREFIX=$ZQVISSVC_WINE_DISPLAY_PREFIX
display_pid=
folder=$(mktemp -d)
clean_up() {
    "$WINESERVER" -k 2>/dev/null || true
    [[ -z $display_pid ]] || kill "$display_pid" 2>/dev/null || true
    rm -rf "$folder"
}
trap clean_up EXIT

Xvfb -displayfd 9 -screen 0 1280x1024x24 -nolisten tcp -noreset -extension GLX \
    9>"$folder/display" >"$folder/log" 2>&1 </dev/null &
display_pid=$!
for ((i = 0; i < 600; ++i)); do
    [[ ! -s $folder/display ]] || break
    sleep 0.1
done
[[ -s $folder/display ]] || { cat "$folder/log" >&2; exit 1; }
DISPLAY=:$(cat "$folder/display") "$@"
