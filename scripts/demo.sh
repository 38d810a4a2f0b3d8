#!/usr/bin/env bash
# ./dev demo: carries a real photograph through the library: PNG to AIPD and back, and compares
# the pixels.
set -euo pipefail
. scripts/common.sh

kPhotoPackage=python3-skimage   # ships freely licensed photographs as PNG
kPhoto=usr/lib/python3/dist-packages/skimage/data/coffee.png

# download_package NAME: leaves the package file in the current folder.
download_package() {
    as_root apt-get -q download "$1" && return
    apt update || echo "note: some package indexes could not be refreshed"
    as_root apt-get -q download "$1"
}

# Prints the path of the photograph: from the installed package, or unpacked into the cache.
photo() {
    [[ -e /$kPhoto ]] && { echo "/$kPhoto"; return; }
    local folder=$cache/photo
    if [[ ! -e $folder/$kPhoto ]]; then
        mkdir -p "$folder"
        (cd "$folder" && download_package "$kPhotoPackage") >&2
        dpkg-deb --fsys-tarfile "$folder/$kPhotoPackage"_*.deb | tar -x -C "$folder" "./$kPhoto"
        rm -f "$folder"/*.deb
    fi
    echo "$folder/$kPhoto"
}

run() { echo "\$ $*"; "$@"; }

build_preset native zqvis
picture=$(photo)
zqvis=build/native/bin/zqvis
out=build/demo
mkdir -p "$out"

say "what the photograph is"
run "$zqvis" info "$picture"
say "to AIPD, and back to PNG"
run "$zqvis" convert "$picture" -o "$out/photo.aipd"
run "$zqvis" info "$out/photo.aipd"
run "$zqvis" convert "$out/photo.aipd" -o "$out/roundtrip.png"
say "comparing the pixels before and after"
run "$zqvis" dump "$picture" -o "$out/before.raw"
run "$zqvis" dump "$out/roundtrip.png" -o "$out/after.raw"
cmp "$out/before.raw" "$out/after.raw" || die "the pixels changed on the way"
echo "identical: $(stat -c %s "$out/before.raw") bytes"
say "done: the result is $out/roundtrip.png"
