#!/bin/bash
# Installs into an empty folder, moves the tree, and builds a program against it
# through pkg-config, as C and as C++, and through find_package; the libraries are
# shared or static, as the build made them.
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
libDir=$(dirname "$(find "$work/moved" -name 'libquillon.*' | head -n 1)")
isShared=$([ -e "$libDir/libquillon.so" ] && echo yes || true)

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
# What shared libraries are built of is nobody else's affair: neither pkg-config nor
# CMake may look for it.
[ -z "$isShared" ] || export PKG_CONFIG_LIBDIR=$PKG_CONFIG_PATH
read -ra flags <<<"$(pkg-config --cflags --libs $([ -n "$isShared" ] || echo --static) 'quillon >= 1.0')"
"${cc[@]}" -std=c99 -x c -Wall -Werror "$here/consumer/client.c" -o "$work/inC" "${flags[@]}"
"${cxx[@]}" -std=c++17 -x c++ -Wall -Werror "$here/consumer/client.c" -o "$work/inCpp" "${flags[@]}"
"${cxx[@]}" -std=c++17 "$here/consumer/face.cpp" -o "$work/face" "${flags[@]}"
export LD_LIBRARY_PATH=$libDir
for program in "$work"/{inC,inCpp,face}; do
    "${emulator[@]}" "$program"
done

echo "A function of the host's that has the name of one of libhearth's"
clash() { # CALLS [FLAG...]
    "${cc[@]}" "$here/consumer/clash.c" -o "$work/clash" "${@:2}" "${flags[@]}"
    local calls=0
    "${emulator[@]}" "$work/clash" 2>/dev/null || calls=$?
    [ "$calls" = "$1" ] || { echo "clash ${*:2}: $calls calls instead of $1"; exit 1; }
}
clash 0 -DLINKAGE=static -Wno-unused-function
[ -z "$isShared" ] || clash 0 -fvisibility=hidden
clash 1
[ -z "$isShared" ] || nm -D --defined-only "$work/clash" | grep -qw Log
unset LD_LIBRARY_PATH

echo "find_package"
configure=(-DCMAKE_C_COMPILER="${cc[0]}" -DCMAKE_PREFIX_PATH="$work/moved"
    ${toolchain:+-DCMAKE_TOOLCHAIN_FILE="$toolchain"}
    ${isShared:+-DCMAKE_DISABLE_FIND_PACKAGE_PNG=ON -DCMAKE_DISABLE_FIND_PACKAGE_PkgConfig=ON})
cmake -S "$here/consumer" -B "$work/build" -G "$generator" "${configure[@]}" >"$work/log" ||
    { cat "$work/log"; exit 1; }
cmake --build "$work/build" >"$work/log" || { cat "$work/log"; exit 1; }
"${emulator[@]}" "$work/build/client"
