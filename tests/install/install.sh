#!/bin/bash
# Installs into an empty folder, moves the tree, and builds a program against it
# through pkg-config, as C and as C++, and through find_package.
# Usage: install.sh BUILD_DIR CC CXX CMAKE_GENERATOR TOOLCHAIN_FILE SYSROOT [EMULATOR...]
# where TOOLCHAIN_FILE and SYSROOT are empty but in a cross build.
set -euo pipefail
here=$(cd "$(dirname "$0")" && pwd)
buildDir=$1 generator=$4 toolchain=$5
cc=("$2" ${6:+--sysroot="$6"}) cxx=("$3" ${6:+--sysroot="$6"}) emulator=("${@:7}")
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

cmake --install "$buildDir" --prefix "$work/first" >"$work/log"
mv "$work/first" "$work/moved"
libDir=$(dirname "$(find "$work/moved" -name libquillon.so)")

strict=(-fsyntax-only -Wall -Wextra -Wpedantic -Werror -I"$work/moved/include/quillon-1")
everyStandard() { # FILE, by itself
    for standard in c99 c11 c17 c2x; do
        "${cc[@]}" -std=$standard "${strict[@]}" -x c -include "$1" - <<<"int unused;"
    done
    for standard in c++11 c++14 c++17 c++20 c++2b; do
        "${cxx[@]}" -std=$standard "${strict[@]}" -x c++ -include "$1" - <<<"int unused;"
    done
}

echo "Each header compiles by itself, in every standard of C and C++"
for header in "$work"/moved/include/quillon-1/{quillon,hearth}/*.h; do
    everyStandard "$header"
done

echo "The C++ face compiles in a strict program, with every compiler that there is"
face=(-fsyntax-only -Wall -Wextra -Wpedantic -Wconversion -Wsign-conversion -Wshadow
    -Wold-style-cast -Werror -I"$work/moved/include/quillon-1")
for standard in c++17 c++20 c++2b; do
    "${cxx[@]}" -std=$standard "${face[@]}" "$here/consumer/face.cpp"
    for compiler in g++ clang++; do
        [ -z "$(command -v $compiler)" ] || $compiler -std=$standard "${face[@]}" "$here/consumer/face.cpp"
    done
done
for header in "$work"/moved/include/quillon-1/quillon/face/*.hpp; do
    "${cxx[@]}" -std=c++17 "${face[@]}" -x c++ -include "$header" - <<<"int unused;"
done

echo "The preprocessor can compare versions"
everyStandard "$here/consumer/version.h"

echo "pkg-config"
export PKG_CONFIG_PATH=$libDir/pkgconfig
# No other .pc file may be needed.
read -ra flags <<<"$(PKG_CONFIG_LIBDIR=$PKG_CONFIG_PATH pkg-config --cflags --libs 'quillon >= 1.0')"
"${cc[@]}" -std=c99 -x c -Wall -Werror "$here/consumer/client.c" -o "$work/inC" "${flags[@]}"
"${cxx[@]}" -std=c++17 -x c++ -Wall -Werror "$here/consumer/client.c" -o "$work/inCpp" "${flags[@]}"
"${cxx[@]}" -std=c++17 "$here/consumer/face.cpp" -o "$work/face" "${flags[@]}"
for program in "$work"/{inC,inCpp,face}; do
    LD_LIBRARY_PATH=$libDir "${emulator[@]}" "$program"
done

echo "find_package"
# Nobody who uses libquillon may be made to look for what it is built of.
cmake -S "$here/consumer" -B "$work/build" -G "$generator" \
    -DCMAKE_C_COMPILER="${cc[0]}" ${toolchain:+-DCMAKE_TOOLCHAIN_FILE="$toolchain"} -DCMAKE_PREFIX_PATH="$work/moved" -DCMAKE_DISABLE_FIND_PACKAGE_PNG=ON \
    -DCMAKE_DISABLE_FIND_PACKAGE_PkgConfig=ON >"$work/log" ||
    { cat "$work/log"; exit 1; }
cmake --build "$work/build" >"$work/log" || { cat "$work/log"; exit 1; }
"${emulator[@]}" "$work/build/client"
