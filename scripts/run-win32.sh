#!/usr/bin/env bash
# Runs a 32-bit Windows program on an x86-64 Debian 12 machine, also where the kernel cannot run
# 32-bit code at all.
#
#   run-win32.sh CACHE PROGRAM.EXE [ARGUMENT...]   in the current folder
#   run-win32.sh --prepare CACHE                   only make the cache
#
# CACHE is a folder of 1.3 GB, made on first use by scripts/win32/make_cache.sh; see there for what
# lies in it. Needs root. Exit status: the low 8 bits of the program's own; 124 when it ran longer
# than WIN32_TIMEOUT seconds (default 1800); 77, with the reason on standard error, where this
# machine cannot run such programs.
#
# How: a 32-bit Wine under a recent user-mode qemu, in namespaces of its own. The program sees the
# machine's files as they are; only /usr has the 32-bit files laid over it. A private binfmt_misc
# makes the namespace start 32-bit programs through qemu. The Wine server is the native 64-bit one
# of the same version, so that reading another process's memory works too. Each run has a
# throw-away copy of the Wine prefix: runs do not influence each other and may overlap.
set -euo pipefail
self=$(readlink -f "${BASH_SOURCE[0]}")
limit=${WIN32_TIMEOUT:-1800}
export LC_ALL=C.UTF-8

kWine=/usr/lib/wine/wine
kNamespace=(unshare --user --map-root-user --mount --pid --fork --mount-proc --kill-child
    --propagation private)

say() { echo "run-win32: $*" >&2; }
cannot() { say "cannot run here: $*"; exit 77; }
usage() { sed -n '2,/^set/s/^# \{0,1\}//p' "$self" >&2; exit 2; }

# ---- Inside the namespaces: everything started here ends with them.

# The magic of 32-bit x86 executables and shared objects; F opens qemu now, before /usr changes.
register_qemu() {
    local head='\x7fELF\x01\x01\x01\x00\x00\x00\x00\x00\x00\x00\x00\x00\x02\x00\x03\x00'
    local mask='\xff\xff\xff\xff\xff\xfe\xfe\x00\xff\xff\xff\xff\xff\xff\xff\xff\xfe\xff\xff\xff'
    mount -t binfmt_misc none /proc/sys/fs/binfmt_misc
    printf '%s\n' ":win32:M::$head:$mask:$1:OCF" >/proc/sys/fs/binfmt_misc/register
}

# inside CACHE RUN MODE COMMAND...: leaves the command's exit status in RUN/status. MODE "prefix"
# works on the cache's own Wine prefix, "run" on a copy that goes with RUN.
inside() {
    local cache=$1 run=$2 mode=$3 status=0
    shift 3
    mount -t overlay overlay -o "ro,lowerdir=$cache/sysroot/usr:/usr" /usr
    register_qemu "$cache/qemu-i386"
    export WINEPREFIX=$cache/prefix
    mkdir -p "$WINEPREFIX"
    if [[ $mode == run ]]; then
        mkdir "$run/upper" "$run/work" "$run/prefix"
        local layers="lowerdir=$cache/prefix,upperdir=$run/upper,workdir=$run/work"
        mount -t overlay overlay -o "$layers,userxattr" "$run/prefix"
        WINEPREFIX=$run/prefix
    fi
    export HOME=$cache/home FONTCONFIG_FILE=$cache/sysroot/etc/fonts/fonts.conf
    export WINEARCH=win32 WINELOADERNOEXEC=1 WINESERVER=$cache/wineserver64
    export WINEDLLOVERRIDES='winemenubuilder.exe,mscoree,mshtml='  # no prompts for add-ons
    export WINEDEBUG=${WINEDEBUG_WIN32:--all}
    export QEMU_SET_ENV=LD_PRELOAD=$cache/trap_number.so  # for emulated programs only
    unset LD_PRELOAD LD_LIBRARY_PATH WAYLAND_DISPLAY
    "$WINESERVER" -p
    timeout -k 5 "$limit" "$@" || status=$?
    if [[ $mode == prefix ]]; then  # writes the registry
        "$WINESERVER" -k
        timeout 60 "$WINESERVER" -w
    fi
    echo "$status" >"$run/status"
}

# ---- Outside

# What this machine must offer; without it not even the cache is made.
preflight() {
    local id code
    [[ $EUID -eq 0 ]] || cannot "needs root"
    [[ $(uname -m) == x86_64 ]] || cannot "not an x86-64 machine"
    [[ -L /lib ]] || cannot "/lib is not merged into /usr"
    # shellcheck disable=SC1091
    id=$(. /etc/os-release && echo "${ID:-}") code=$(. /etc/os-release && echo "${VERSION_CODENAME:-}")
    [[ $id/$code == debian/bookworm ]] || cannot "made for Debian 12, this is ${id:-unknown} $code"
    command -v Xvfb xkbcomp gcc >/dev/null || cannot "needs xvfb, x11-xkb-utils and gcc"
    timeout 20 "${kNamespace[@]}" true 2>/dev/null || cannot "no user namespaces"
    timeout 20 "${kNamespace[@]}" mount -t binfmt_misc none /proc/sys/fs/binfmt_misc 2>/dev/null ||
        cannot "no private binfmt_misc (comes with kernel 6.7)"
    mkdir -p "$cache/empty"
    timeout 20 "${kNamespace[@]}" mount -t overlay overlay -o "ro,lowerdir=$cache/empty:/usr" \
        /usr 2>/dev/null || cannot "no overlay file system in a user namespace"
}

run='' display_pid='' namespace_pid=''

start_display() {
    local i
    Xvfb -displayfd 9 -screen 0 1280x1024x24 -nolisten tcp -noreset -extension GLX \
        9>>"$run/display" >"$run/xvfb.log" 2>&1 </dev/null &
    display_pid=$!
    for ((i = 0; i < 600; ++i)); do
        display=$(head -n 1 "$run/display")
        [[ -z $display ]] || return 0
        kill -0 "$display_pid" 2>/dev/null || break
        sleep 0.1
    done
    cat "$run/xvfb.log" >&2
    cannot "Xvfb does not start"
}

stop_display() {
    local i
    [[ -n $display_pid ]] || return 0
    for ((i = 0; i < 20; ++i)); do
        kill "$display_pid" 2>/dev/null || break
        sleep 0.1
    done
    kill -KILL "$display_pid" 2>/dev/null || true
    wait "$display_pid" 2>/dev/null || true
    display_pid=
}

# launch MODE COMMAND...: a display, the namespaces, and the command in them; its exit status is
# left in `status`, empty when it could not be started.
launch() {
    local mode=$1 out err display=
    shift
    run=$(mktemp -d "$cache/run.XXXXXX")
    : >"$run/display"
    start_display
    # Output goes through pipes: on a terminal Wine would add control sequences.
    mkfifo "$run/out" "$run/err"
    cat <"$run/out" &
    out=$!
    cat <"$run/err" >&2 &
    err=$!
    DISPLAY=:$display WIN32_TIMEOUT=$limit "${kNamespace[@]}" "$self" --inside \
        "$cache" "$run" "$mode" "$@" </dev/null >"$run/out" 2>"$run/err" &
    namespace_pid=$!
    wait "$namespace_pid" || true
    wait "$out" "$err" || true
    namespace_pid=
    status=$(cat "$run/status" 2>/dev/null || true)
    stop_display
    rm -rf "$run"
    run=
}

clean_up() {
    # unshare ignores TERM; its namespace dies with it.
    if [[ -n $namespace_pid ]]; then
        kill -KILL "$namespace_pid" 2>/dev/null || true
        wait "$namespace_pid" 2>/dev/null || true
    fi
    stop_display
    [[ -z $run ]] || rm -rf "$run" 2>/dev/null || true
}

# One at a time makes the cache; only one that has run something counts as complete.
prepare() {
    [[ -e $cache/complete ]] && return
    preflight
    exec 8>"$cache/lock"
    flock 8
    if [[ ! -e $cache/complete ]]; then
        # shellcheck source=scripts/win32/make_cache.sh
        . "$(dirname "$self")/win32/make_cache.sh"
        make_cache
    fi
    exec 8>&-
}

case ${1:-} in
    --inside) shift; inside "$@"; exit ;;
    --prepare) [[ $# -eq 2 ]] || usage ;;
    '' | -*) usage ;;
    *) [[ $# -ge 2 ]] || usage ;;
esac
trap clean_up EXIT
trap 'exit 130' INT
trap 'exit 143' TERM
only_prepare=
[[ $1 != --prepare ]] || { only_prepare=1; shift; }
mkdir -p "$1"
cache=$(readlink -f "$1")
shift
case $cache in *[:,\\\ ]*) cannot "the cache's path holds one of : , \\ or a space" ;; esac
prepare
[[ -z $only_prepare ]] || exit 0
[[ -f $1 ]] || { say "no such program: $1"; exit 2; }
program=$(readlink -f "$1")
shift
launch run "$kWine" "Z:${program//\//\\}" "$@"
[[ -n $status ]] || { preflight; cannot "the namespaces or the emulator did not start"; }
exit "$status"
