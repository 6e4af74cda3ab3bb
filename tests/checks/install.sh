#!/usr/bin/env bash
# A project from outside the tree uses the library in each way that it can be had: installed and found by
# CMake or pkg-config, shared and static, and taken in by FetchContent, which changes and installs nothing.
# With the build's compiler; the static library with Clang, too, where that is installed.
#
# usage: install.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

build=$1
source=$2
cached() { sed -n "s/^$1:[A-Z]*=//p" "$build/CMakeCache.txt"; }
if [[ ! -e $build/lib/libQXXMLMarshalling.so || ! -x $build/bin/qxxml ]]; then
    echo "the library or the tool is not built" >&2
    exit 77
fi
work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT
compiler=$(cached CMAKE_CXX_COMPILER)
launcher=$(cached QX_CCACHE)
export CCACHE_BASEDIR= # it would change the paths that must not be found
[[ -x $launcher ]] || launcher=
flags=-O0
[[ $(cached QX_SANITIZE) != ON ]] || flags+=" -fsanitize=address,undefined"
fail() {
    echo "install.sh: $*" >&2
    exit 1
}
quietly() { "$@" >"$work/log" 2>&1 || { cat "$work/log" >&2 && fail "$*"; }; }

cp -r -- "$source/tests/checks/consumer" "$work/consumer"
mkdir -- "$work/run"
cat >"$work/run/mapping.xml" <<'END'
<mapping><class name="Order"><map-to xml="order"/><field name="number"><bind-xml name="number" node="attribute"/></field></class></mapping>
END
echo '<order number="7"/>' >"$work/run/order.xml"
echo '<invoice/>' >"$work/run/invoice.xml"
version=$(sed -n 's/^#define QXXMLMARSHALLING_VERSION_[A-Z]* //p' \
    "$source/include/QXXMLMarshalling/base/Version.h" | paste -sd.)

# runs FOLDER: the programs there do what they should, in the user's language.
runs() {
    (cd -- "$work/run" && LC_ALL=de_DE.UTF-8 ASAN_OPTIONS=detect_leaks=0 "$1/reader" && LC_ALL=de_DE.UTF-8 "$1/opener") \
        >"$work/said" || fail "the programs in $1 fail"
    diff "$work/said" - <<END || fail "the programs in $1 say something else"
$version
7
Keine Definition für das Element: <invoice></invoice>
Die Datei gibt es nicht: missing.xml
END
}
# configures NAME COMPILER FLAGS OPTION...: builds the project in a folder of that name, and runs it.
configures() {
    quietly cmake -S "$work/consumer" -B "$work/$1" -G Ninja "-DCMAKE_CXX_COMPILER=$2" "-DCMAKE_CXX_FLAGS=$3" \
        "-DCMAKE_CXX_COMPILER_LAUNCHER=$launcher" "${@:4}"
    quietly cmake --build "$work/$1"
    runs "$work/$1"
}
# pkg NAME PREFIX COMPILER FLAGS: the same with what pkg-config says.
pkg() {
    mkdir -- "$work/$1"
    local name said
    said=$(PKG_CONFIG_PATH=$(dirname -- "$(find "$2" -name QXXMLMarshalling.pc)") pkg-config --cflags --libs QXXMLMarshalling)
    for name in reader opener; do
        # shellcheck disable=SC2086 # they are words
        quietly "$3" -std=c++20 $4 "$work/consumer/$name.cpp" -o "$work/$1/$name" $said "-Wl,-rpath,$2/lib"
    done
    runs "$work/$1"
}
# names_no_folder PREFIX: no file below it, libraries and programs aside, names the machine that built it.
names_no_folder() {
    ! grep -rlF -e "$source" -e "$build" -e "$work" "$@" || fail "these name folders of this machine"
}

quietly cmake --install "$build" --prefix "$work/shared-prefix"
configures shared "$compiler" "$flags" "-DCMAKE_PREFIX_PATH=$work/shared-prefix"
names_no_folder "$work/shared-prefix" --exclude='*.so*' --exclude-dir=bin
! command -v pkg-config >/dev/null || pkg shared-pkg "$work/shared-prefix" "$compiler" "$flags"
soname=$(readelf -d "$work/shared-prefix"/lib*/libQXXMLMarshalling.so | sed -n 's/.*soname: \[\(.*\)\]/\1/p')
[[ $soname == "libQXXMLMarshalling.so.${version%.*}" ]] || fail "the library is called $soname"
for file in bin/qxxml share/man/man1/qxxml.1.gz share/doc/QXXMLMarshalling/LICENSE share/QXXMLMarshalling/Info.plist; do
    [[ -e $work/shared-prefix/$file ]] || fail "$file is not installed"
done

# Taken in, the library is built anew: static, since the project does not say otherwise.
configures static "$compiler" "-O0 -g1" "-DFETCHCONTENT_SOURCE_DIR_QXXMLMARSHALLING=$source"
quietly cmake --install "$work/static" --prefix "$work/nothing"
[[ $(cd "$work/nothing" && find . -type f) == ./bin/reader ]] || fail "a project that takes the library in installs it"
quietly cmake "$work/static" -DQX_INSTALL=ON
quietly cmake --build "$work/static"
quietly cmake --install "$work/static" --prefix "$work/static-prefix"
names_no_folder "$work/static-prefix" --exclude-dir=bin
for other in "$compiler" clang++; do
    command -v "$other" >/dev/null || continue
    configures "installed-$(basename -- "$other")" "$other" -O0 "-DCMAKE_PREFIX_PATH=$work/static-prefix"
done
! command -v pkg-config >/dev/null || pkg static-pkg "$work/static-prefix" "$compiler" -O0

# Texts that lie beside the program come before those in the library.
mkdir -p -- "$work/share/QXXMLMarshalling/de.lproj"
echo '"No definition to handle element: %@" = "Was ist %@";' >"$work/share/QXXMLMarshalling/de.lproj/Localizable.strings"
said=$(cd -- "$work/run" && LC_ALL=de_DE.UTF-8 "$work/static/reader")
[[ $said == *"Was ist <invoice></invoice>" ]] || fail "a file of texts is not read: $said"
