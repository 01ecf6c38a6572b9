#!/bin/sh
# Builds a copy of the tree in another folder, and fails unless the two builds install the same files, byte for byte: no
# path of a build is left behind. Also compares ic-inventory if it is built.
#
#   reproducible.sh SOURCE BUILD WORK CMAKE-ARGUMENT...    the arguments that configure a build like BUILD
set -eu
source=$1
build=$2
work=$3
shift 3
rm -rf "$work"
other="$work/a folder with a longer name"
mkdir -p "$other/source"

# A launcher such as ccache could take the objects of the first build.
unset CMAKE_CXX_COMPILER_LAUNCHER
export CCACHE_DISABLE=1

# quietly COMMAND...: shows the command's output only if it fails.
quietly() {
    "$@" >"$work/log" 2>&1 || {
        cat "$work/log" >&2
        echo "failed: $*" >&2
        exit 1
    }
}

# install BUILD FOLDER: with the same prefix, because GDB finds the installed script by it.
install() {
    quietly env DESTDIR="$work/$2" cmake --install "$1" --prefix /usr
    [ -z "$program" ] || cp "$1/$program" "$work/$2"
}

tools=OFF
program=tools/inventory/inventory
if [ -x "$build/$program" ]; then
    tools=ON
else
    program=
fi
for part in CMakeLists.txt cmake include platform src testkit tools; do
    cp -R "$source/$part" "$other/source/$part"
done
quietly cmake "$@" -S "$other/source" -B "$other/build" -DIC_BUILD_TESTS=OFF -DIC_BUILD_EXAMPLES=OFF \
    -DIC_BUILD_TOOLS=$tools
quietly cmake --build "$other/build"
install "$build" here
install "$other/build" there
[ -f "$work/here/usr/include/IC/Number.h" ] || { echo "no header is installed" >&2; exit 1; }
diff -r "$work/here" "$work/there" || { echo "two builds install different files" >&2; exit 1; }
