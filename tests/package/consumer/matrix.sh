#!/bin/sh
# Builds and runs the consumer in every way in which a user takes the library: the installed package through CMake and
# pkg-config, and its source through add_subdirectory and FetchContent; each of them shared and static, and with every
# compiler and language level in one of the twelve.
#
#   matrix.sh SOURCE BUILD WORK: the library's source, a build of it as shared libraries, a folder that is emptied
set -eu
source=$1
build=$2
work=$3
here=$(cd "$(dirname "$0")" && pwd)
rm -rf "$work"
mkdir -p "$work"

fail() {
    echo "$*" >&2
    exit 1
}

# Runs a command quietly; where it fails, shows what it wrote.
quietly() {
    "$@" >"$work/log" 2>&1 || {
        cat "$work/log" >&2
        fail "failed: $*"
    }
}

# Runs the consumer and compares what it prints.
sed 's/@TIME@/2009-02-13T23:31:30Z/' "$here/expected.txt" >"$work/expected.txt"
check() {
    "$@" >"$work/printed.txt" 2>"$work/records.txt" || fail "ended with $?: $*"
    cmp "$work/expected.txt" "$work/printed.txt" || fail "printed something else: $*"
    [ -s "$work/records.txt" ] || fail "wrote no record: $*"
}

# expect_files PREFIX: installed there is what standard input lists, and nothing else.
expect_files() {
    (cd "$1" && find . ! -type d) | sort >"$work/installed.txt"
    sort | diff - "$work/installed.txt" || fail "what is installed in $1 is not what should be"
}

configure() {
    quietly cmake -G Ninja "$@"
}

# The installed libraries. Both were moved afterwards, so that nothing in them may name the place where they were.
quietly cmake --install "$build" --prefix "$work/first"
mv "$work/first" "$work/shared"
static_build=$work/static-build
multiarch=lib/$(g++ -print-multiarch)  # as distributions have it
configure -S "$source" -B "$static_build" -DCMAKE_CXX_COMPILER=g++ -DBUILD_SHARED_LIBS=OFF -DIC_BUILD_TESTS=OFF \
    -DIC_BUILD_EXAMPLES=OFF -DIC_BUILD_TOOLS=OFF -DCMAKE_INSTALL_PREFIX="$work/nowhere" -DCMAKE_INSTALL_LIBDIR="$multiarch"
quietly cmake --build "$static_build"
quietly cmake --install "$static_build" --prefix "$work/first"
mv "$work/first" "$work/static"
if grep -rIF -e "$work" -e "$source" -e "$build" "$work/shared" "$work/static"; then
    fail "installed files name a folder of this machine"
fi

configure -S "$here/version" -B "$work/version" -DCMAKE_PREFIX_PATH="$work/shared"
echo "a wrong version is refused"

# package shared|static COMPILER STANDARD: find_package.
package() {
    folder=$work/find_package-$1-$2-$3
    configure -S "$here" -B "$folder" -DCMAKE_PREFIX_PATH="$work/$1" -DCMAKE_CXX_COMPILER="$2" -DCMAKE_CXX_STANDARD="$3" \
        -DCMAKE_CXX_EXTENSIONS=OFF
    quietly cmake --build "$folder"
    check "$folder/program"
    echo "find_package, $1, $2, C++$3"
}

# module PREFIX LIBRARY-FOLDER COMPILER STANDARD [--static]: pkg-config, and nothing else.
module() {
    prefix=$1
    library=$2
    shift 2
    export PKG_CONFIG_PATH="$library/pkgconfig"
    [ "$(pkg-config --modversion IC)" = 1.0.0 ] || fail "pkg-config finds another IC"
    if pkg-config --exists 'IC >= 2'; then
        fail "the pkg-config module says that it is version 2"
    fi
    for variable in libdir="$library" includedir="$prefix/include"; do
        folder=$(pkg-config --variable="${variable%%=*}" IC)
        [ "$(realpath "$folder")" = "$(realpath "${variable#*=}")" ] || fail "the module's ${variable%%=*} is $folder"
    done
    program=$work/pkg-config-program
    # shellcheck disable=SC2046  # what pkg-config prints is a list of words
    quietly "$1" -std="c++$2" -Wall -Wextra -Wpedantic -Werror "$here/main.cpp" -o "$program" \
        $(pkg-config --cflags --libs ${3+"$3"} IC) -ldl
    check env LD_LIBRARY_PATH="$library" "$program"
    echo "pkg-config${3+ $3}, ${library#"$work"/}, $1, C++$2"
}

# subproject add_subdirectory|FetchContent FOLDER ON|OFF COMPILER STANDARD [ARGUMENT...]: within a larger project.
# Shared and static are compiled alike, so the two share a build and only link anew.
subproject() {
    way="$1, BUILD_SHARED_LIBS=$3, $4, C++$5"
    folder=$work/$1-$4-$5
    prefix=$folder-$3
    shared=$3
    configure -S "$here/subproject" -B "$folder" -DWAY="$1" -DIC_FOLDER="$2" -DBUILD_SHARED_LIBS="$3" \
        -DCMAKE_CXX_COMPILER="$4" -DCMAKE_CXX_STANDARD="$5" "${6--DSANITIZE=OFF}"
    quietly cmake --build "$folder"
    check "$folder/program"
    [ "$(ctest --test-dir "$folder" --show-only | tail -n 1)" = 'Total Tests: 1' ] || fail "$folder has other tests"
    quietly cmake --install "$folder" --prefix "$prefix"
    echo ./bin/program | expect_files "$prefix"
    linked=OFF
    ! readelf --dynamic "$folder/program" | grep -q 'NEEDED.*libIC\.so\.1' || linked=ON
    [ "$linked" = "$shared" ] || fail "$folder: BUILD_SHARED_LIBS=$shared is not heeded"
    echo "$way"
}

package shared g++ 17
package shared clang++ 20
package static clang++ 20
package static g++ 20

module "$work/shared" "$work/shared/lib" clang++ 17
module "$work/shared" "$work/shared/lib" g++ 20
module "$work/static" "$work/static/$multiarch" g++ 17
# An absolute folder for the libraries is a promise that they lie there.
configure -S "$source" -B "$static_build" -DCMAKE_INSTALL_PREFIX="$work/absolute" \
    -DCMAKE_INSTALL_LIBDIR="$work/absolute-libraries"
quietly cmake --install "$static_build"
module "$work/absolute" "$work/absolute-libraries" g++ 20 --static

subproject add_subdirectory "$source" ON g++ 20
subproject add_subdirectory "$source" OFF g++ 20

# What the library is built of, and so what a release must hold at least.
mkdir "$work/source"
for part in CMakeLists.txt cmake include platform src; do
    cp -R "$source/$part" "$work/source/$part"
done
subproject FetchContent "$work/source" ON clang++ 17 -DSANITIZE=ON
subproject FetchContent "$work/source" OFF clang++ 17 -DSANITIZE=ON
