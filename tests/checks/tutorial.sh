#!/usr/bin/env bash
# The tutorial is followed from its first to its last line, in an empty folder, with the library installed: its
# files are laid out as they stand there, and its commands say what it says.
#
# usage: tutorial.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

build=$1
page=$2/docs/tutorial.md
if [[ ! -e $build/lib/libQXXMLMarshalling.so || ! -x $build/bin/qxxml ]]; then
    echo "the library or the tool is not built" >&2
    exit 77
fi
cached() { sed -n "s/^$1:[A-Z]*=//p" "$build/CMakeCache.txt"; }
work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT
cmake --install "$build" --prefix "$work/installed" >/dev/null
export PATH=$work/installed/bin:$PATH CMAKE_PREFIX_PATH=$work/installed CXX
CXX=$(cached CMAKE_CXX_COMPILER)
[[ $(cached QX_SANITIZE) != ON ]] || export CXXFLAGS="-fsanitize=address,undefined"
export ASAN_OPTIONS=detect_leaks=0 LC_ALL=C.UTF-8

mkdir -- "$work/folder"
cd -- "$work/folder"
steps=0
# step HEADING: does what a block says that is in the file ../block.
step() {
    case $1 in
    console)
        local command
        command=$(head -n 1 ../block)
        # Lines of the library's log have the time in them, and are not shown.
        diff <(tail -n +2 ../block) <(eval "${command#\$ }" 2>&1 | sed -E '/^[0-9-]+ [0-9:.]+ garden\[/d') || {
            echo "tutorial.sh: this says something else: $command" >&2
            exit 1
        }
        steps=$((steps + 1)) ;;
    *' '*) cp -- ../block "${1#* }" ;;
    esac
}
heading=
while IFS= read -r line; do
    if [[ $line == '```' && -n $heading ]]; then
        step "$heading"
        heading=
    elif [[ $line == '```'* ]]; then
        heading=${line#'```'}
        : >../block
    elif [[ -n $heading ]]; then
        printf '%s\n' "$line" >>../block
    fi
done <"$page"
((steps >= 8)) || { echo "tutorial.sh: only $steps commands were run" >&2 && exit 1; }
