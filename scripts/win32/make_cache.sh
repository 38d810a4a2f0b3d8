# shellcheck shell=bash disable=SC2034,SC2154
# Makes the cache of run-win32.sh, which sources this and brings say, cannot, launch and the names
# that they share. In the cache:
#   sysroot/        the 32-bit Wine of Debian and all it needs, unpacked; the machine's own package
#                   database is not touched
#   qemu-i386       user-mode qemu of version 9 or later; Debian 12's own, 7.2, cannot run Wine
#   wineserver64    the 64-bit Wine server of the same version
#   trap_number.so  preloaded library, see trap_number.c
#   prefix/, home/  the Wine prefix that every run starts from, and its home folder
#   complete        there once all of it has worked

here=$(dirname "${BASH_SOURCE[0]}")

# private_apt STATE ARCHITECTURE SOURCES PROGRAM ARGUMENT...: apt with lists, downloads and an
# (empty) package database of its own. SOURCES is a folder, or "system" for the machine's sources.
private_apt() {
    local state=$1 architecture=$2 sources=$3 program=$4
    shift 4
    local options=(-o "APT::Architecture=$architecture" -o "APT::Architectures::=$architecture"
        -o "Dir::State::lists=$state/lists" -o "Dir::State::status=$state/status"
        -o "Dir::Cache::archives=$state/archives" -o Dir::Cache::pkgcache= -o Dir::Cache::srcpkgcache=
        -o Acquire::Languages=none -o Acquire::Retries=3 -o APT::Sandbox::User=root
        -o APT::Update::Error-Mode=any -o Debug::NoLocking=1)
    mkdir -p "$state/lists/partial" "$state/archives/partial"
    : >"$state/status"
    [[ $sources == system ]] ||
        options+=(-o Dir::Etc::sourcelist=/dev/null -o "Dir::Etc::sourceparts=$sources")
    timeout 900 "$program" "${options[@]}" "$@" >>"$log" 2>&1
}

# sources_for SUITE FOLDER: the machine's own sources of Debian's main archive with another suite:
# same servers and keys, no security suite, no other vendor. False when there are none.
sources_for() {
    local suite=$1 folder=$2 file
    mkdir -p "$folder"
    for file in /etc/apt/sources.list.d/*.sources; do
        [[ -f $file ]] || continue
        awk -v suite="$suite" -f "$here/sources_stanzas.awk" "$file" \
            >"$folder/$(basename "$file" .sources)-$suite.sources"
    done
    for file in /etc/apt/sources.list /etc/apt/sources.list.d/*.list; do
        [[ -f $file ]] || continue
        awk -v suite="$suite" -f "$here/sources_lines.awk" "$file" \
            >"$folder/$(basename "$file" .list)-$suite.list"
    done
    find "$folder" -type f -size -2c -delete
    [[ -n $(ls "$folder") ]]
}

unpack() {
    dpkg-deb --fsys-tarfile "$1" |
        tar -x --keep-directory-symlink --no-same-owner -C "$2" "${@:3}" 2>>"$log"
}

# fetch_wine_from SOURCES: into $tmp/i386 and $tmp/amd64.
fetch_wine_from() {
    local version
    rm -rf "$tmp"/{i386,amd64}
    mkdir -p "$tmp"/{i386,amd64}
    private_apt "$tmp/i386" i386 "$1" apt-get update || return 1
    private_apt "$tmp/i386" i386 "$1" apt-get -y --download-only --no-install-recommends install \
        wine32 libwine fontconfig-config fonts-dejavu-core || return 1
    version=$(dpkg-deb -f "$tmp"/i386/archives/wine32_*.deb Version)
    private_apt "$tmp/amd64" amd64 "$1" apt-get update || return 1
    (cd "$tmp/amd64" && private_apt "$tmp/amd64" amd64 "$1" apt-get download "wine64=$version")
}

# An index of a third party may be broken, or offer nothing for i386; then the main suite must do.
fetch_wine() {
    say "fetching 32-bit Wine"
    fetch_wine_from system && return
    sources_for bookworm "$tmp/main" && fetch_wine_from "$tmp/main" && return
    cannot "apt could not fetch 32-bit Wine (see $log)"
}

fetch_qemu() {
    local suite version
    say "fetching qemu"
    for suite in bookworm-backports trixie; do
        rm -rf "$tmp/qemu"
        mkdir -p "$tmp/qemu"
        sources_for "$suite" "$tmp/$suite" || continue
        private_apt "$tmp/qemu" amd64 "$tmp/$suite" apt-get update || continue
        (cd "$tmp/qemu" &&
            private_apt "$tmp/qemu" amd64 "$tmp/$suite" apt-get download qemu-user) || continue
        unpack "$tmp"/qemu/qemu-user_*.deb "$tmp/qemu" ./usr/bin/qemu-i386 || continue
        version=$("$tmp/qemu/usr/bin/qemu-i386" --version | sed -n '1s/.*version \([0-9]*\)\..*/\1/p')
        [[ ${version:-0} -ge 9 ]] || continue
        mv "$tmp/qemu/usr/bin/qemu-i386" "$cache/qemu-i386"
        return
    done
    cannot "apt offers no qemu-user of version 9 or later (see $log)"
}

lay_out() {
    local part package
    say "unpacking"
    mkdir -p "$cache/home" "$cache"/sysroot/usr/{bin,sbin,lib}
    for part in bin sbin lib; do ln -s "usr/$part" "$cache/sysroot/$part"; done
    for package in "$tmp"/i386/archives/*.deb; do
        unpack "$package" "$cache/sysroot" || cannot "could not unpack $package"
    done
    unpack "$tmp"/amd64/wine64_*.deb "$tmp/amd64" ./usr/lib/wine/wineserver64 ||
        cannot "no wineserver64 in wine64"
    mv "$tmp/amd64/usr/lib/wine/wineserver64" "$cache/wineserver64"
    # As the package's install script would do: marks the compression DLL as Wine's own.
    local zlib=$cache/sysroot/usr/i686-w64-mingw32/lib/zlib1.dll
    { head -c 64 "$zlib"; printf 'Wine builtin DLL'; head -c 16 /dev/zero; tail -c +97 "$zlib"; } \
        >"$cache/sysroot/usr/lib/i386-linux-gnu/wine/i386-windows/zlib1.dll"
}

# Without headers and libraries an ordinary 64-bit gcc can make 32-bit code.
build_preload() {
    gcc -m32 -O2 -fPIC -shared -nostdlib -ffreestanding -fno-stack-protector -fcf-protection=none \
        -o "$cache/trap_number.so" "$here/trap_number.c" >>"$log" 2>&1 ||
        cannot "gcc could not build the preloaded library (see $log)"
}

make_prefix() {
    local limit=400
    say "making the Wine prefix"
    # shellcheck disable=SC2016
    launch prefix sh -ec '"$1" wineboot --init; exec "$1" regedit /S "$2"' \
        sh "$kWine" "$here/prefix.reg" >>"$log" 2>&1
    [[ -s $cache/prefix/system.reg && $status == 0 ]] ||
        cannot "Wine could not make its prefix (result ${status:-none}, see $log)"
    launch run "$kWine" cmd /c 'exit 7' >>"$log" 2>&1
    [[ $status == 7 ]] || cannot "Wine does not work under qemu (result ${status:-none}, see $log)"
}

make_cache() {
    local begin=$SECONDS log=$cache/make.log tmp=$cache/tmp
    : >"$log"
    rm -rf "$tmp" "${cache:?}"/{sysroot,prefix,home,qemu-i386,wineserver64,trap_number.so}
    mkdir -p "$tmp"
    fetch_wine
    fetch_qemu
    lay_out
    build_preload
    make_prefix
    rm -rf "$tmp"
    touch "$cache/complete"
    say "cache ready after $((SECONDS - begin)) s"
}
