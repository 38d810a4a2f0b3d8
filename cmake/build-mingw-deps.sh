#!/usr/bin/env bash
# Builds the third-party libraries for Windows, static, from Debian's source packages.
#
#   build-mingw-deps.sh ARCH PREFIX        ARCH: x86_64 or i686
#
# Every finished library leaves a stamp in PREFIX/.stamps, so a rerun builds only what is missing.
# Nothing outside PREFIX is written and root is not needed. JOBS=n limits the compile jobs.
# The caller keys PREFIX by a checksum of this file and of the toolchain file.
set -euo pipefail

die() { echo "build-mingw-deps: ERROR: $*" >&2; exit 1; }
say() { printf '[%s %4ds] %s\n' "$arch" "$SECONDS" "$*"; }

arch=${1:-} prefix=${2:-} jobs=${JOBS:-$(nproc)}
[[ $# -eq 2 && $arch =~ ^(x86_64|i686)$ ]] || die "usage: $0 x86_64|i686 PREFIX"
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
mkdir -p "$prefix/.stamps" || die "cannot write to $prefix"
prefix=$(cd "$prefix" && pwd)
work=$prefix/.work

for tool in cmake ninja nasm dpkg-source apt-get flock "$arch-w64-mingw32-g++-posix"; do
    command -v "$tool" >/dev/null || die "'$tool' is missing"
done
exec 9>"$prefix/.lock"
flock 9   # one build a prefix at a time; the second one waits, then finds the stamps

# Runs a command quietly; on failure shows the end of its log and stops.
run() { "$@" >>"$log" 2>&1 || { tail -n 40 "$log" >&2; die "$lib: failed: $* (log: $log)"; }; }

# A private apt set-up: the machine's own sources, with deb turned into deb-src.
apt_setup() {
    [[ ${APT_CONFIG:-} == "$work/apt/apt.conf" ]] && return
    say "reading the source package lists"
    rm -rf "$work/apt"
    mkdir -p "$work"/apt/{sources,lists/partial,cache/archives/partial}
    local f
    for f in /etc/apt/sources.list /etc/apt/sources.list.d/*.list; do
        [[ -r $f ]] && sed -nE 's/^deb(-src)?[[:space:]]/deb-src /p' "$f" | sort -u \
            >"$work/apt/sources/$(basename "$f" .list).list"
    done
    for f in /etc/apt/sources.list.d/*.sources; do
        [[ -r $f ]] && sed -E 's/^Types:.*/Types: deb-src/' "$f" \
            >"$work/apt/sources/$(basename "$f")"
    done
    cat >"$work/apt/apt.conf" <<CONF
Dir::Etc::sourcelist "/dev/null";
Dir::Etc::sourceparts "$work/apt/sources";
Dir::State::lists "$work/apt/lists";
Dir::Cache "$work/apt/cache";
Acquire::Languages "none";
Acquire::Retries "3";
APT::Sandbox::User "";
CONF
    export APT_CONFIG=$work/apt/apt.conf
    # A stale index of one suite is no reason to stop: a missing package fails below, by name.
    apt-get update --error-on=any >"$work/apt/log" 2>&1 ||
        say "note: apt-get update reported problems (see $work/apt/log)"
}

# Downloads the newest version of $lib that the mirror really has: it may list one whose
# files are gone. Sets $version.
download_source() {
    local v
    for v in $(apt-cache showsrc --only-source "$lib" 2>>"$log" |
               sed -n 's/^Version: //p' | sort -Vru); do
        if (cd "$work/$lib" && apt-get source -y --only-source --download-only "$lib=$v") \
               >>"$log" 2>&1; then
            version=$v
            return
        fi
        say "note: $lib $v cannot be downloaded, trying an older version"
    done
    tail -n 20 "$log" >&2
    die "no Debian source package '$lib' could be downloaded (logs: $log, $work/apt/log)"
}

# begin SOURCE-PACKAGE: false when already built; else fetches and unpacks it into $src.
begin() {
    lib=$1 src=$work/$1/src bld=$work/$1/build stamp=$prefix/.stamps/$1
    if [[ -e $stamp ]]; then
        say "$lib: already built"
        return 1
    fi
    apt_setup
    rm -rf "${work:?}/$lib"; mkdir -p "$work/$lib"
    log=$work/$lib.log; : >"$log"
    download_source
    # apt checked the files against the signed index; dpkg-source checks them against the .dsc.
    run dpkg-source --no-copy -x "$work/$lib/${lib}_${version#*:}.dsc" "$src"
    say "$lib $version: building"
}

# ":PATH" matters: untyped, libjpeg-turbo would take "lib" as relative to the current folder.
configure() {
    run cmake -S "$src" -B "$bld" -G Ninja -Wno-dev \
        -DCMAKE_TOOLCHAIN_FILE="$here/mingw-toolchain.cmake" \
        -DMINGW_ARCH="$arch" -DMINGW_DEPS="$prefix" \
        -DCMAKE_INSTALL_PREFIX="$prefix" -DCMAKE_INSTALL_LIBDIR:PATH=lib \
        -DCMAKE_BUILD_TYPE=Release \
        -DCMAKE_C_FLAGS_RELEASE="-O2 -DNDEBUG" -DCMAKE_CXX_FLAGS_RELEASE="-O2 -DNDEBUG" \
        -DCMAKE_POSITION_INDEPENDENT_CODE=ON -DBUILD_SHARED_LIBS=OFF -DBUILD_TESTING=OFF "$@"
}
build_and_install() {
    configure "$@"
    run cmake --build "$bld" -j "$jobs"
    run cmake --install "$bld"
}
# finish FILE...: the files (below PREFIX) that must be there now.
finish() {
    local f
    for f in "$@"; do
        [[ -e $prefix/$f ]] || die "$lib: $f was not installed (log: $log)"
    done
    run install -D -m644 "$src/debian/copyright" "$prefix/share/licenses/$lib"
    printf '%s %s\n' "$lib" "$version" >"$stamp"
    rm -rf "${work:?}/$lib"
    say "$lib $version: done"
}

if begin zlib; then
    # Only the static library: Debian's tarball lacks the files for the DLL.
    configure
    run cmake --build "$bld" -j "$jobs" --target zlibstatic
    run install -D -m644 "$bld/libzlibstatic.a" "$prefix/lib/libz.a"
    run install -D -m644 -t "$prefix/include" "$src/zlib.h" "$bld/zconf.h"
    finish lib/libz.a
fi
# Its fast code is for 64 bits; builds for 32 bits inflate with zlib.
if [[ $arch == x86_64 ]] && begin libisal; then
    run make -C "$src" -f Makefile.unx -j "$jobs" arch=mingw AS=nasm units="crc igzip" lib
    run install -D -m644 "$src/bin/isa-l.a" "$prefix/lib/libisal.a"
    run install -D -m644 -t "$prefix/include/isa-l" "$src"/include/{igzip_lib,types}.h
    finish lib/libisal.a include/isa-l/igzip_lib.h
fi
if begin libpng1.6; then
    # The pattern "^i?86" never matches i686 and would leave out the SSE2 row filters.
    run sed -i 's/"^i?86"/"^i.86"/' "$src/CMakeLists.txt"
    build_and_install -DPNG_SHARED=OFF -DPNG_TESTS=OFF -DPNG_EXECUTABLES=OFF
    finish lib/libpng.a include/png.h
fi
if begin highway; then
    build_and_install -DHWY_ENABLE_TESTS=OFF -DHWY_ENABLE_EXAMPLES=OFF
    finish lib/libhwy.a lib/cmake/hwy/hwy-config.cmake
fi
if begin googletest; then
    build_and_install
    finish lib/libgtest.a lib/libgmock.a lib/cmake/GTest/GTestConfig.cmake
fi
if begin fmtlib; then
    build_and_install -DFMT_TEST=OFF -DFMT_DOC=OFF
    finish lib/libfmt.a lib/cmake/fmt/fmt-config.cmake
fi
if begin cli11; then
    build_and_install -DCLI11_BUILD_DOCS=OFF -DCLI11_BUILD_EXAMPLES=OFF
    finish include/CLI/CLI.hpp
fi
if begin nlohmann-json3; then
    build_and_install -DJSON_BuildTests=OFF
    finish include/nlohmann/json.hpp
fi
if begin benchmark; then
    build_and_install -DBENCHMARK_ENABLE_TESTING=OFF -DBENCHMARK_ENABLE_WERROR=OFF \
        -DBENCHMARK_INSTALL_DOCS=OFF -DGIT_VERSION="${version%-*}"
    finish lib/libbenchmark.a lib/cmake/benchmark/benchmarkConfig.cmake
fi
if begin libjpeg-turbo; then
    build_and_install -DENABLE_SHARED=OFF -DREQUIRE_SIMD=ON -DWITH_TURBOJPEG=OFF
    finish lib/libjpeg.a include/jpeglib.h
fi
if begin tiff; then
    build_and_install -Djpeg=ON -Dzlib=ON -Dcxx=OFF -Dtiff-tools=OFF -Dtiff-tests=OFF \
        -Dtiff-contrib=OFF -Dtiff-docs=OFF -Dlzma=OFF -Dzstd=OFF -Dwebp=OFF -Djbig=OFF \
        -Dlerc=OFF -Dlibdeflate=OFF
    # libtiff drops a codec silently when its library is not found.
    run grep -E "^#define JPEG_SUPPORT" "$prefix/include/tiffconf.h"
    run grep -E "^#define ZIP_SUPPORT" "$prefix/include/tiffconf.h"
    finish lib/libtiff.a include/tiffio.h
fi
if begin openjpeg2; then
    build_and_install -DBUILD_CODEC=OFF
    # A user of the static library must define OPJ_STATIC on Windows; let the target say so.
    echo 'set_property(TARGET openjp2 APPEND PROPERTY INTERFACE_COMPILE_DEFINITIONS OPJ_STATIC)' \
        >>"$(echo "$prefix"/lib/openjpeg-*/OpenJPEGTargets.cmake)"
    finish lib/libopenjp2.a
fi
rm -rf "$work" "${prefix:?}"/{bin,share/doc,share/man}   # tools and manuals are of no use here
say "all libraries are in $prefix"
