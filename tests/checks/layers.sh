#!/usr/bin/env bash
# The folders of src/ are layers: nothing includes a folder above its own, only the platform sees
# libxml2, ICU and the operating system, and programs see public headers alone.
#
# usage: layers.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

# What each folder may include beside itself.
declare -A below=(
    [platform/object]=''
    [platform/xml]='platform/object'
    [platform/system]='platform/object'
    [mapping]='platform/object platform/xml platform/system'
    [repository]='platform/object platform/xml platform/system'
    [record]='platform/object platform/xml platform/system'
    [resolved]='platform/object platform/xml platform/system mapping repository'
    [marshaller]='platform/object platform/xml platform/system mapping repository resolved record'
)
# Public headers that no .cpp file, or more than one, names as its own. The one over all others stands above the layers.
declare -A header_only=(
    [QXXMLMarshalling]='everything'
    [QXXMLDataRepository]='repository'
    [QXXMLMutableDataRepository]='repository'
    [QXXMLNodeType]='mapping'
    [QXGenericRecord]='record'
    [QXXMLMarshaller]='marshaller'
    [platform/Export]='platform/object'
    [platform/Ref]='platform/object'
    [platform/WeakRef]='platform/object'
)
# Single headers of another room: documents are files, what is wrong with them is told in the user's
# language, and property lists are documents.
declare -A lent=(
    ['platform/xml includes "files/Files.h"']=1
    ['platform/xml includes "model/Errors.h"']=1
    ['platform/xml includes "host/Localization.h"']=1
    ['platform/system includes <QXXMLMarshalling/xml/XMLDocument.h>']=1
)

libxml='^libxml/'
icu='^unicode/'
os='^(sys|arpa|net|netinet|linux|bits)/|^(unistd|dlfcn|fcntl|dirent|pwd|grp|poll|link|pthread|sched|ftw|glob|spawn|termios|syslog|signal|langinfo|strings)\.h$|^(filesystem|fstream)$'

# folder_of_source PATH: the layer of a path below src/, in `folder`.
folder_of_source() {
    folder=${1%/*}
    while [[ -n $folder && -z ${below[$folder]+known} ]]; do
        [[ $folder == */* ]] || { folder=; break; }
        folder=${folder%/*}
    done
}

# folder_of_header NAME: the layer of <QXXMLMarshalling/NAME.h>, in `folder`: that of the .cpp file of
# the same name, else of the lowest whose first include it is, else as tabled above.
declare -A own_folder
folder_of_header() {
    folder=${own_folder[$1]:-${header_only[$1]:-}}
    if [[ -z $folder && $1 == platform/* ]]; then
        # Templates and plain structs; those of the node tree are named for it.
        [[ $1 == platform/XML* ]] && folder=platform/xml || folder=platform/object
    fi
}

learn_headers() {
    own_folder=()
    local path name first folder layer
    for path in "${sources[@]}"; do
        [[ $path == src/*.cpp ]] || continue
        folder_of_source "${path#src/}"
        name=${path##*/}
        name=${name%.cpp}
        for name in "$name" "platform/$name"; do
            [[ -f include/QXXMLMarshalling/$name.h ]] || continue
            [[ $name == platform/* && $folder != platform/* ]] || own_folder[$name]=$folder
        done
    done
    for layer in platform/object platform/xml platform/system mapping repository record resolved marshaller; do
        for path in "${sources[@]}"; do
            [[ $path == src/"$layer"/*.cpp ]] || continue
            first=${first_include[$path]:-}
            [[ $first == '<QXXMLMarshalling/'*'.h>' ]] || continue
            name=${first#<QXXMLMarshalling/}
            name=${name%.h>}
            [[ -n ${own_folder[$name]:-} || -n ${header_only[$name]:-} ]] || own_folder[$name]=$layer
        done
    done
}

# violations DIR: prints one line for each include that breaks a rule. Changes the current folder.
violations() {
    cd -- "$1"
    declare -a sources=() lines=()
    declare -A first_include=()
    local roots=() root path number line target here folder
    for root in include src tools examples bench fuzz; do
        [[ -d $root ]] && roots+=("$root")
    done
    mapfile -t sources < <(find "${roots[@]}" -name '*.cpp' -o -name '*.h' | LC_ALL=C sort)
    mapfile -t lines < <(grep -HnoE '^[[:space:]]*#[[:space:]]*include[[:space:]]*[<"][^>"]+[>"]' \
        "${sources[@]}" | sed -E 's/:[[:space:]]*#[[:space:]]*include[[:space:]]*/:/')
    for line in "${lines[@]}"; do
        IFS=: read -r path number target <<<"$line"
        [[ -n ${first_include[$path]:-} ]] || first_include[$path]=$target
    done
    learn_headers

    for line in "${lines[@]}"; do
        IFS=: read -r path number target <<<"$line"
        case $path in
        src/*)
            folder_of_source "${path#src/}"
            ;;
        include/QXXMLMarshalling/*)
            folder=${path#include/QXXMLMarshalling/}
            folder_of_header "${folder%.h}"
            ;;
        *)
            folder=program
            ;;
        esac
        here=$folder
        check_include
    done
}

# One include: `target` in line `number` of `path`, which belongs to the folder `here`.
check_include() {
    local name=${target:1:-1} where="$path:$number"
    if [[ -z $here ]]; then
        echo "$where: belongs to no folder: enter it in layers.sh"
    elif [[ $target == \"* ]]; then
        if [[ $path == include/* ]]; then
            echo "$where: a public header includes $target"
        elif [[ $here == program ]]; then
            [[ ! -f src/$name ]] || echo "$where: a program includes the private header $target"
        elif [[ ! -f src/$name ]]; then
            echo "$where: $target is not named from src/"
        else
            folder_of_source "$name"
            may_include
        fi
    elif [[ $name == QXXMLMarshalling/* ]]; then
        [[ $here != program && $here != everything ]] || return 0
        name=${name#QXXMLMarshalling/}
        folder_of_header "${name%.h}"
        may_include
    elif [[ $name =~ $libxml ]]; then
        [[ $path == src/platform/xml/* || $path == bench/* ]] || echo "$where: libxml2 outside platform/xml"
    elif [[ $name =~ $icu ]]; then
        [[ $path == src/platform/object/* ]] || echo "$where: ICU outside platform/object"
    elif [[ $name =~ $os && $here != program ]]; then
        [[ $path == src/platform/* || $path == include/QXXMLMarshalling/platform/* ]] ||
            echo "$where: the operating system ($target) outside platform"
    fi
}

may_include() {
    [[ $folder == "$here" || " ${below[$here]} " == *" $folder "* || -n ${lent["$here includes $target"]:-} ]] ||
        echo "$where: $here includes $target of ${folder:-no folder}"
}

# The check has to be able to fail: a small tree with one fault of each kind.
self_test() {
    local tree=$1 expected actual
    mkdir -p "$tree"/{src/platform/{object,xml},src/{mapping,record,marshaller},include/QXXMLMarshalling/platform,tools/t}
    put() { printf '%s\n' "${@:2}" >"$tree/$1"; }
    put include/QXXMLMarshalling/base/Export.h '#pragma once'
    put include/QXXMLMarshalling/model/Value.h '#include <QXXMLMarshalling/QXRecord.h>'
    put include/QXXMLMarshalling/QXRecord.h '#include <QXXMLMarshalling/model/Value.h>' '#include "record/Table.h"'
    put include/QXXMLMarshalling/QXMapping.h '#include <QXXMLMarshalling/base/Export.h>' '#include <sys/stat.h>'
    put include/QXXMLMarshalling/QXNowhere.h '#include <string>'
    put src/model/Value.cpp '#include <QXXMLMarshalling/model/Value.h>' '#include <unistd.h>' '#  include <libxml/tree.h>'
    put src/platform/object/Key.h '#pragma once'
    put src/platform/xml/Node.cpp '#include "platform/object/Key.h"' '#include <libxml/tree.h>' '#include <unicode/uchar.h>'
    put src/mapping/read.cpp '#include <QXXMLMarshalling/QXMapping.h>' '#include "record/Table.h"' '#include "Key.h"'
    put src/record/QXRecord.cpp '#include <QXXMLMarshalling/QXRecord.h>' '#include <QXXMLMarshalling/QXMapping.h>' '#include <fstream>'
    put src/record/Table.h '#pragma once'
    put src/marshaller/way.cpp '#include "record/Table.h"' '#include <QXXMLMarshalling/QXMapping.h>'
    put tools/t/main.cpp '#include <QXXMLMarshalling/QXRecord.h>' '#include "record/Table.h"' '#include <fstream>'
    expected='include/QXXMLMarshalling/QXMapping.h:2: the operating system (<sys/stat.h>) outside platform
include/QXXMLMarshalling/QXNowhere.h:1: belongs to no folder: enter it in layers.sh
include/QXXMLMarshalling/QXRecord.h:2: a public header includes "record/Table.h"
include/QXXMLMarshalling/model/Value.h:1: platform/object includes <QXXMLMarshalling/QXRecord.h> of record
src/mapping/read.cpp:2: mapping includes "record/Table.h" of record
src/mapping/read.cpp:3: "Key.h" is not named from src/
src/model/Value.cpp:3: libxml2 outside platform/xml
src/platform/xml/Node.cpp:3: ICU outside platform/object
src/record/QXRecord.cpp:2: record includes <QXXMLMarshalling/QXMapping.h> of mapping
src/record/QXRecord.cpp:3: the operating system (<fstream>) outside platform
tools/t/main.cpp:2: a program includes the private header "record/Table.h"'
    actual=$(violations "$tree")
    if [[ $actual != "$expected" ]]; then
        echo "layers.sh does not find what it has to find:" >&2
        diff <(echo "$expected") <(echo "$actual") >&2 || true
        return 1
    fi
}

scratch=$(mktemp -d)
trap 'rm -rf -- "$scratch"' EXIT
self_test "$scratch"

found=$(violations "$2")
if [[ -n $found ]]; then
    echo "$found"
    exit 1
fi
