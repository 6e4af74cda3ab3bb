#!/usr/bin/env bash
# The structs that `qxxml infer --classes` prints compile, and a document that is read into them comes
# back as it does from records: with the build's compiler.
#
# usage: inferred.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

build=$1
source=$2
cached() { sed -n "s/^$1:[A-Z]*=//p" "$build/CMakeCache.txt"; }
if [[ ! -e $build/lib/libQXXMLMarshalling.so || ! -x $build/bin/qxxml ]]; then
    echo "the library or the tool is not built" >&2
    exit 77
fi

folder=$(mktemp -d)
trap 'rm -rf -- "$folder"' EXIT
cd -- "$folder"
flags=(-std=c++20 -Wall -Wextra -Werror "-I$source/include" -I.)
[[ $(cached QX_SANITIZE) != ON ]] || flags+=(-fsanitize=address,undefined)

# same ROOT DOCUMENT
same() {
    "$build/bin/qxxml" infer "$2" >mapping.xml
    "$build/bin/qxxml" infer --classes "$2" >inferred.h
    "$(cached CMAKE_CXX_COMPILER)" "${flags[@]}" "-DROOT=$1" '-DINFERRED="inferred.h"' \
        "$source/tests/checks/inferred.cpp" -o inferred \
        -L"$build/lib" -lQXXMLMarshalling "-Wl,-rpath,$build/lib"
    ./inferred mapping.xml "$2" written.xml 2>/dev/null
    diff <("$build/bin/qxxml" roundtrip --pretty mapping.xml "$2" 2>/dev/null) \
        <("$build/bin/qxxml" roundtrip --pretty mapping.xml written.xml 2>/dev/null)
}

# Keywords, classes in each other, numbers, lists of all kinds, letters beyond ASCII, words that C++ has
# taken, and what no member has.
cat >document.xml <<'END'
<Node xmlns:a="urn:a" xml:lang="en" a:id="1" id="2" ID="3">
    <Node id="7"><class>x</class><a:b><c-d.e q="1">-5</c-d.e></a:b><int>7</int><int/></Node>
    <class/><String v="1"/><a:b/><namespace on="true">1.5</namespace><NULL x="0"/>
    <flags><f>true</f><f>false</f></flags><nums><n>1</n><n>0</n></nums>
    <opt k="0"/><opt k="1" b="false"/><opt e=""/>
    <turns><größe Ünit="1"/><mark/><größe Ünit="2"><turns><mark/><größe Ünit="0"/><mark/></turns></größe></turns>
    <turns><mark/></turns>
    <text>with <b>elements</b></text>
</Node>
END
same Node document.xml
same Gpx "$source/examples/gpx/walk.gpx"
# More classes in turns than are put into a variant.
awk 'BEGIN { print "<r>"; for (i = 0; i < 65; ++i) print "<p" i " v=\"1\"/>"; print "<p0 v=\"2\"/></r>" }' >many.xml
same R many.xml
