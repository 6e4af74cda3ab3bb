#!/usr/bin/env bash
# Classes are described in every way that C++ offers, and by a plug-in that is loaded and unloaded
# (registrations.cpp): with the build's compiler, and with GCC and Clang where they are there.
#
# usage: registrations.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

build=$1
source=$2
cached() { sed -n "s/^$1:[A-Z]*=//p" "$build/CMakeCache.txt"; }
own=$(cached CMAKE_CXX_COMPILER)
if [[ ! -e $build/lib/libQXXMLMarshalling.so ]]; then
    echo "the library is not built" >&2
    exit 77
fi

folder=$(mktemp -d)
trap 'rm -rf -- "$folder"' EXIT
cd -- "$folder"

family() { "$1" --version | grep -qi clang && echo clang++ || echo g++; }
# run COMPILER: a sanitizer's run-time is that of the compiler which built the library.
run() {
    local flags=(-std=c++20 -fPIC -fvisibility=hidden -Wall -Wextra -I"$source/include") preload=
    [[ $(family "$1") == clang++ ]] || flags+=(-fno-gnu-unique)
    if [[ $(cached QX_SANITIZE) == ON ]]; then
        if [[ $1 == "$own" ]]; then
            # A call through a pointer to a base's member is taken for one on another object.
            flags+=(-fsanitize=address,undefined -fno-sanitize=vptr)
        else
            preload=$("$own" -print-file-name=libasan.so)
            [[ -e $preload ]] || return 0
        fi
    fi
    local library=(-L"$build/lib" -lQXXMLMarshalling "-Wl,-rpath,$build/lib" -Wl,--allow-shlib-undefined)
    "$1" "${flags[@]}" -shared -DPLUG_IN "$source/tests/checks/registrations.cpp" -o plug-in.so "${library[@]}"
    "$1" "${flags[@]}" "$source/tests/checks/registrations.cpp" -o registrations "${library[@]}" -ldl
    LD_PRELOAD=$preload ASAN_OPTIONS=detect_leaks=0 ./registrations ./plug-in.so 2>log || {
        echo "with $1:" >&2
        cat log >&2
        return 1
    }
    # What is there twice is said, whatever was loaded in between.
    if [[ $(grep -cE 'The class (Again is described already, as One|name (One|Lamp) is taken)' log) != 4 ]]; then
        echo "with $1, the warnings are others:" >&2
        cat log >&2
        return 1
    fi
}
run "$own"
for other in g++ clang++; do
    if [[ $(family "$own") != "$other" ]] && command -v "$other" >/dev/null; then
        run "$other"
    fi
done
