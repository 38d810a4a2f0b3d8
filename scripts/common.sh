# shellcheck shell=bash
# Shared by ./dev and the scripts of its verbs: messages, packages, cache folder, builds.
# Sourced with the root of the checkout as the current folder.
export LC_ALL=C.UTF-8
JOBS=${JOBS:-$(nproc)}
cache=${ZQVISSVC_CACHE:-${XDG_CACHE_HOME:-$HOME/.cache}/zqvissvc}
mkdir -p "$cache"
cache=$(cd "$cache" && pwd)

say() { printf '\n== %s\n' "$*"; }
die() { printf 'dev: %s\n' "$*" >&2; exit 1; }

# ---- Debian packages

kLibraries=(zlib1g-dev libisal-dev libpng-dev libjpeg62-turbo-dev libtiff-dev libopenjp2-7-dev libhwy-dev libgtest-dev
    libgmock-dev libbenchmark-dev libcli11-dev libfmt-dev nlohmann-json3-dev)
kTools=(git cmake ninja-build ccache g++ binutils)
kCross=(nasm dpkg-dev g++-mingw-w64-x86-64-posix g++-mingw-w64-i686-posix)
kOtherCross=(gcc-mingw-w64-x86-64-win32 gcc-mingw-w64-i686-win32 clang)   # tests/contract

installed() { [[ $(dpkg-query -W -f='${db:Status-Status}' "$1" 2>/dev/null) == installed* ]]; }

as_root() {
    if [[ $EUID -eq 0 ]]; then "$@"; else sudo -n "$@"; fi
}

apt() { as_root env DEBIAN_FRONTEND=noninteractive apt-get -q -o DPkg::Lock::Timeout=600 "$@"; }

# need PACKAGE...: installs what is missing; with nothing missing the network is not touched.
need() {
    local package missing=() attempt
    for package in "$@"; do
        installed "$package" || missing+=("$package")
    done
    [[ ${#missing[@]} -eq 0 ]] && return
    say "installing ${missing[*]}"
    for attempt in 1 2 3; do
        # One stale index (a foreign architecture, a third party) fails the update as a whole,
        # although all the others were refreshed; whether it matters shows in the install.
        apt update </dev/null || echo "note: some package indexes could not be refreshed"
        apt install -y --no-install-recommends "${missing[@]}" </dev/null && return
        sleep $((attempt * 5))
    done
    die "could not install: ${missing[*]}"
}

# ---- Cross-built libraries and Wine

# Prints the prefix of the libraries for x86_64 or i686; a change of the recipe moves it.
mingw_prefix() {
    local key
    key=$(cat cmake/build-mingw-deps.sh cmake/mingw-toolchain.cmake | sha256sum | cut -c1-12)
    echo "$cache/mingw-$1-$key"
}

mingw_deps() {
    local prefix
    prefix=$(mingw_prefix "$1")
    [[ -e $prefix/.complete ]] && return
    need "${kTools[@]}" "${kCross[@]}"
    say "building the third-party libraries for Windows ($1), once"
    JOBS=$JOBS cmake/build-mingw-deps.sh "$1" "$prefix"
    touch "$prefix/.complete"
}

# Makes Wine and its prefixes ready and exports what a run under it needs: one prefix without a
# display, and a copy of it for windows that are looked at (scripts/with-display.sh).
wine_setup() {
    need wine64 xvfb x11-xkb-utils fonts-liberation
    local version
    version=$(dpkg-query -W -f='${Version}' wine64 | tr -c 'A-Za-z0-9.\n' -)
    export ZQVISSVC_WINE64=/usr/lib/wine/wine64 WINEDEBUG=-all WINEARCH=win64
    export WINEPREFIX=$cache/wine-headless-$version WINESERVER=/usr/lib/wine/wineserver64
    export ZQVISSVC_WINE_DISPLAY_PREFIX=$cache/wine-display-$version
    export WINEDLLOVERRIDES='mscoree=d;mshtml=d;winemenubuilder.exe=d'
    unset DISPLAY
    [[ -e $WINEPREFIX/.complete && -e $ZQVISSVC_WINE_DISPLAY_PREFIX/.complete ]] && return
    say "preparing Wine, once"
    rm -rf "$WINEPREFIX" "$ZQVISSVC_WINE_DISPLAY_PREFIX"
    "$ZQVISSVC_WINE64" wineboot.exe --init </dev/null >/dev/null 2>&1 || die "Wine does not start"
    "$WINESERVER" -w
    cp -a "$WINEPREFIX" "$ZQVISSVC_WINE_DISPLAY_PREFIX"
    # Windows that nobody sees, so that message boxes work without a display.
    "$ZQVISSVC_WINE64" reg.exe add 'HKCU\Software\Wine\Drivers' /v Graphics /d null /f \
        </dev/null >/dev/null 2>&1 || die "Wine has no registry"
    "$WINESERVER" -w
    touch "$WINEPREFIX/.complete" "$ZQVISSVC_WINE_DISPLAY_PREFIX/.complete"
}

# Exports how 32-bit Windows programs are run; makes nothing yet.
win32_runner() {
    local key
    key=$(cat scripts/run-win32.sh scripts/win32/* | sha256sum | cut -c1-12)
    export ZQVISSVC_RUN_WIN32="$PWD/scripts/run-win32.sh;$cache/win32-$key"
}

# Makes ready what runs them. Status 77 where this machine cannot, with the reason in the last line
# of $cache/win32.log.
win32_setup() {
    win32_runner
    [[ -e ${ZQVISSVC_RUN_WIN32#*;}/complete ]] && return
    (need xvfb x11-xkb-utils gcc) || true
    say "preparing the 32-bit Wine, once"
    scripts/run-win32.sh --prepare "${ZQVISSVC_RUN_WIN32#*;}" 2>&1 | tee "$cache/win32.log"
    return "${PIPESTATUS[0]}"
}

# ---- Builds

# Unchanged sources are not compiled again, not even in a fresh clone elsewhere.
compiler_cache() {
    export CCACHE_DIR=$cache/ccache CCACHE_BASEDIR=$PWD CCACHE_NOHASHDIR=1 CCACHE_MAXSIZE=3G
    export CMAKE_C_COMPILER_LAUNCHER=ccache CMAKE_CXX_COMPILER_LAUNCHER=ccache
}

# prepare_preset PRESET: everything that configuring that preset needs.
prepare_preset() {
    case $1 in
        native | asan | tsan) need "${kTools[@]}" "${kLibraries[@]}" ;;
        fuzz) need "${kTools[@]}" "${kLibraries[@]}" clang libclang-rt-14-dev ;;
        win64)
            mingw_deps x86_64
            wine_setup
            ZQVISSVC_DEPS_WIN64=$(mingw_prefix x86_64)
            export ZQVISSVC_DEPS_WIN64
            need "${kTools[@]}" "${kCross[@]}" "${kOtherCross[@]}"
            ;;
        win32)
            mingw_deps i686
            ZQVISSVC_DEPS_WIN32=$(mingw_prefix i686)
            export ZQVISSVC_DEPS_WIN32
            win32_runner
            need "${kTools[@]}" "${kCross[@]}" "${kOtherCross[@]}"
            ;;
        *) die "unknown preset '$1' (native, asan, tsan, win64, win32)" ;;
    esac
    compiler_cache
}

# build_preset PRESET [TARGET...]
build_preset() {
    local preset=$1
    shift
    prepare_preset "$preset"
    say "building $preset"
    mkdir -p build
    local log=build/configure-$preset.log
    cmake --preset "$preset" >"$log" 2>&1 || { cat "$log"; return 1; }
    cmake --build --preset "$preset" -j "$JOBS" ${1:+--target "$@"}
}

# Prints the version, which stands in the build system alone.
project_version() { sed -nE 's/^project\(ZqVisSvc VERSION ([0-9.]+).*/\1/p' CMakeLists.txt; }
