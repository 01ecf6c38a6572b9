#!/bin/sh
# Takes the library in one of the ways that its users have, and checks what the consumer prints:
#
#   ways.sh install SOURCE WORK BUILD    installs it shared (from BUILD) and static, for find_package and pkg_config
#   ways.sh find_package SOURCE WORK
#   ways.sh pkg_config SOURCE WORK
#   ways.sh add_subdirectory SOURCE WORK
#   ways.sh FetchContent SOURCE WORK
#
# SOURCE is the library's source; WORK, a folder, is the same for all. Each way takes the library shared and static, and
# together they use g++ and clang++, C++17 and C++20.
set -eu
way=$1
source=$2
installed=$3/install
work=$3/$way
here=$(CDPATH='' cd "$(dirname "$0")" && pwd)
rm -rf "$work"
mkdir -p "$work"

fail() {
    echo "$*" >&2
    exit 1
}

# Shows a command's output only if the command fails.
quietly() {
    "$@" >"$work/log" 2>&1 || {
        cat "$work/log" >&2
        fail "failed: $*"
    }
}

configure() {
    quietly cmake -G Ninja "$@"
}

# check COMMAND...: runs the consumer and compares what it prints.
check() {
    sed 's/@TIME@/2009-02-13T23:31:30Z/g' "$here/expected.txt" >"$work/expected.txt"
    "$@" >"$work/printed.txt" 2>"$work/records.txt" || fail "ended with $?: $*"
    cmp "$work/expected.txt" "$work/printed.txt" || fail "printed something else: $*"
    [ -s "$work/records.txt" ] || fail "wrote no record: $*"
}

# The static library lies where distributions put libraries.
multiarch=lib/$(g++ -print-multiarch)

# Both libraries are installed in $work/first and then moved, so that their files must not name that folder.
install_both() {
    quietly cmake --install "$1" --prefix "$work/first"
    mv "$work/first" "$work/shared"
    configure -S "$source" -B "$work/build" -DCMAKE_CXX_COMPILER=g++ -DBUILD_SHARED_LIBS=OFF -DIC_BUILD_TESTS=OFF \
        -DIC_BUILD_TEST_KIT=OFF -DIC_BUILD_EXAMPLES=OFF -DIC_BUILD_TOOLS=OFF -DCMAKE_INSTALL_PREFIX="$work/nowhere" \
        -DCMAKE_INSTALL_LIBDIR="$multiarch"
    quietly cmake --build "$work/build"
    quietly cmake --install "$work/build" --prefix "$work/first"
    mv "$work/first" "$work/static"
    if grep -rIF -e "$work" -e "$source" -e "$1" "$work/shared" "$work/static"; then
        fail "installed files name a folder of this machine"
    fi
}

# find_package shared|static COMPILER STANDARD
find_package() {
    folder=$work/$1-$2-$3
    configure -S "$here" -B "$folder" -DCMAKE_PREFIX_PATH="$installed/$1" -DCMAKE_CXX_COMPILER="$2" \
        -DCMAKE_CXX_STANDARD="$3" -DCMAKE_CXX_EXTENSIONS=OFF
    quietly cmake --build "$folder"
    check "$folder/program"
    echo "find_package, $1, $2, C++$3"
}

# pkg_config PREFIX LIBRARY-FOLDER COMPILER STANDARD [--static]
pkg_config() {
    prefix=$1
    library=$2
    shift 2
    export PKG_CONFIG_PATH="$library/pkgconfig"
    [ "$(pkg-config --modversion IC)" = 1.1.0 ] || fail "pkg-config finds another IC"
    if pkg-config --exists 'IC >= 2'; then
        fail "the pkg-config module says that it is version 2"
    fi
    for variable in libdir="$library" includedir="$prefix/include"; do
        folder=$(pkg-config --variable="${variable%%=*}" IC | xargs)  # xargs removes the backslash before a blank
        [ "$(realpath "$folder")" = "$(realpath "${variable#*=}")" ] || fail "the module's ${variable%%=*} is $folder"
    done
    # pkg-config prints words of the shell.
    eval "quietly \"\$1\" -std=c++$2 -Wall -Wextra -Wpedantic -Werror \"\$here/main.cpp\" -o \"\$work/program\" \
        $(pkg-config --cflags --libs ${3+"$3"} IC) -ldl"
    check env LD_LIBRARY_PATH="$library" "$work/program"
    echo "pkg-config${3+ $3}, $library, $1, C++$2"
}

# subproject FOLDER shared|static COMPILER STANDARD [ARGUMENT...]: within a larger project, which takes FOLDER.
# The objects of the two libraries are the same, so both are linked in one build folder.
subproject() {
    folder=$1
    library=$2
    compiler=$3
    standard=$4
    shift 4
    shared=ON
    [ "$library" = shared ] || shared=OFF
    configure -S "$here/subproject" -B "$work/build" -DWAY="$way" -DIC_FOLDER="$folder" -DBUILD_SHARED_LIBS="$shared" \
        -DCMAKE_CXX_COMPILER="$compiler" -DCMAKE_CXX_STANDARD="$standard" "$@"
    quietly cmake --build "$work/build"
    check "$work/build/program"
    [ "$(ctest --test-dir "$work/build" --show-only | tail -n 1)" = 'Total Tests: 1' ] ||
        fail "the library adds tests"
    quietly cmake --install "$work/build" --prefix "$work/$library"
    [ "$(cd "$work/$library" && find . ! -type d)" = ./bin/program ] ||
        fail "$work/$library has more than the project's own program"
    linked=OFF
    ! readelf --dynamic "$work/build/program" | grep -q 'NEEDED.*libIC\.so\.1' || linked=ON
    [ "$linked" = "$shared" ] || fail "BUILD_SHARED_LIBS=$shared had no effect"
    echo "$way, $library, $compiler, C++$standard"
}

case $way in
install) install_both "$4" ;;
find_package)
    configure -S "$here/version" -B "$work/version" -DCMAKE_PREFIX_PATH="$installed/shared"
    echo "find_package refuses a wrong version"
    find_package shared g++ 17
    find_package shared clang++ 20
    find_package static clang++ 20
    find_package static g++ 20
    ;;
pkg_config)
    pkg_config "$installed/shared" "$installed/shared/lib" clang++ 17
    pkg_config "$installed/shared" "$installed/shared/lib" g++ 20
    pkg_config "$installed/static" "$installed/static/$multiarch" g++ 17
    # An absolute folder for the libraries is kept, wherever the rest is installed.
    configure -S "$source" -B "$installed/build" -DCMAKE_INSTALL_PREFIX="$work/absolute" \
        -DCMAKE_INSTALL_LIBDIR="$work/absolute-libraries"
    quietly cmake --install "$installed/build"
    pkg_config "$work/absolute" "$work/absolute-libraries" g++ 20 --static
    ;;
add_subdirectory)
    subproject "$source" shared g++ 20 -DCMAKE_BUILD_TYPE=RelWithDebInfo
    subproject "$source" static g++ 20
    # The project's debugger finds the library's sources by their full paths.
    ! grep -F -e -prefix-map "$work/build/build.ninja" || fail "the library changes the paths in debug information"
    ;;
FetchContent)
    # A release must hold at least these.
    mkdir "$work/source"
    for part in CMakeLists.txt cmake include platform src; do
        cp -R "$source/$part" "$work/source/$part"
    done
    subproject "$work/source" shared clang++ 17 -DSANITIZE=ON
    subproject "$work/source" static clang++ 17 -DSANITIZE=ON
    ;;
*) fail "no way '$way'" ;;
esac
