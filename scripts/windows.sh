#!/usr/bin/env bash
# ./dev windows: builds both DLLs, checks what they export and import, and packages each with its
# import library, .def file, headers, the tool, the viewer and the licences of the parts inside it.
set -euo pipefail
. scripts/common.sh
version=$(project_version)

# package BITS ARCH
package() {
    local name=ZqVisSvc-$version-win$1 stage=$PWD/build/win$1/stage
    build_preset "win$1" ZqVisSvc zqvis zqview
    scripts/check_exports.sh "build/win$1/bin/ZqVisSvc.dll"
    rm -rf "$stage" "dist/$name.zip"
    mkdir -p dist "$stage/$name"
    cmake --install "build/win$1" --prefix "$stage/$name" --strip >/dev/null
    mkdir -p "$stage/$name/licenses"
    local part parts=(zlib libpng1.6 libjpeg-turbo tiff openjpeg2 highway cli11 fmtlib nlohmann-json3)
    [[ $1 == 32 ]] || parts+=(libisal)
    for part in "${parts[@]}"; do
        cp "$(mingw_prefix "$2")/share/licenses/$part" "$stage/$name/licenses/"
    done
    (cd "$stage" && cmake -E tar cf "$OLDPWD/dist/$name.zip" --format=zip "$name")
    echo "dist/$name.zip"
}

package 32 i686
package 64 x86_64
