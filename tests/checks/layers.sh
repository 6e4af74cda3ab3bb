#!/usr/bin/env bash
# The folders of src/ are layers (cmake/layers.txt): none includes or befriends what stands above it, only
# some see libxml2, ICU and the operating system, and programs see public headers alone.
#
# usage: layers.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

libxml='^libxml/'
icu='^unicode/'
os='^(sys|arpa|net|netinet|linux|bits)/|^(unistd|dlfcn|fcntl|dirent|pwd|grp|poll|link|pthread|sched|ftw|glob|spawn|termios|syslog|signal|langinfo|strings)\.h$|^(filesystem|fstream)$'

# read_layers: `below[folder]`, all that a folder may use, and `listed[header]`, the folder of a header
# that the table names.
declare -A below listed
read_layers() {
    below=() listed=()
    local folder uses headers used header
    while IFS=: read -r folder uses headers; do
        folder=${folder// /}
        below[$folder]=" $folder"
        for used in $uses; do
            below[$folder]+=${below[$used]% }
        done
        below[$folder]+=" "
        for header in $headers; do
            listed[$header]=$folder
        done
    done < <(grep -v '^#' cmake/layers.txt)
}

# room_of PATH: the folder of the table that a file belongs to, in `room`; "program" for what stands on
# the library, "umbrella" for the header over all others, empty for a file without a place.
declare -A source_room
room_of() {
    local name=${1#include/QXXMLMarshalling/}
    case $1 in
    src/*) room=${1#src/} && room=${room%%/*} ;;
    fuzz/*/*) room=${1#fuzz/} && room=${room%%/*} ;; # sees inside that folder, like its tests
    include/QXXMLMarshalling/QXXMLMarshalling.h) room=umbrella ;;
    include/QXXMLMarshalling/detail/* | include/QXXMLMarshalling/*.h)
        room=${name%%/*}
        if [[ $room == "$name" || $room == detail ]]; then
            name=${name%.h}
            room=${listed[$name]:-${source_room[${name##*/}]:-}}
        fi
        ;;
    *) room=program ;;
    esac
    [[ $room == program || $room == umbrella ]] || [[ -n $room && -n ${below[$room]:-} ]] || room=
}

# complaints DIR: a line for each include or friend that breaks a rule. Changes the current folder.
complaints() {
    cd -- "$1"
    read_layers
    local roots=() root path number target name kind room here
    for root in include src tools examples bench fuzz; do
        [[ ! -d $root ]] || roots+=("$root")
    done
    source_room=()
    while read -r path; do
        name=${path##*/}
        room_of "$path"
        source_room[${name%.cpp}]=$room
    done < <(find src -name '*.cpp')

    while IFS=: read -r path number target; do
        room_of "$path"
        here=$room
        check_include
    done < <(grep -HnorE '^[[:space:]]*#[[:space:]]*include[[:space:]]*[<"][^>"]+[>"]' "${roots[@]}" \
        --include='*.h' --include='*.cpp' | sed -E 's/:[[:space:]]*#[[:space:]]*include[[:space:]]*/:/' | LC_ALL=C sort)

    # Each friend by its statement, which may stand on several lines; operators are defined in place.
    while IFS=$'\t' read -r path number name; do
        check_friend
    done < <(find include src -name '*.h' -print0 -o -name '*.cpp' -print0 | LC_ALL=C sort -z | xargs -0r awk '
        /^[[:space:]]*friend([[:space:]]|$)/ {
            line = FNR
            statement = $0
            while (statement !~ /[;{]/ && (getline following) > 0) statement = statement " " following
            if (statement ~ /operator/) next
            sub(/[(;{].*/, "", statement) # leaves the name at the end
            while (sub(/[[:space:]]*<[^<>]*>[[:space:]]*$/, "", statement)) {}
            sub(/.*[^A-Za-z0-9_]/, "", statement)
            printf "%s\t%d\t%s\n", FILENAME, line, statement
        }')
}

# One include: `target` in line `number` of `path`, which belongs to `here`.
check_include() {
    local name=${target:1:-1} where="$path:$number"
    if [[ -z $here ]]; then
        echo "$where: belongs to no folder: enter it in cmake/layers.txt"
    elif [[ $target == \"* ]]; then
        if [[ $path == include/* ]]; then
            echo "$where: a public header includes $target"
        elif [[ $here == program ]]; then
            [[ ! -f src/$name ]] || echo "$where: a program includes the private header $target"
        elif [[ ! -f src/$name ]]; then
            echo "$where: $target is not named from src/"
        else
            room_of "src/$name"
            may_use "$target"
        fi
    elif [[ $name == QXXMLMarshalling/* ]]; then
        room_of "include/$name"
        [[ $here == program || $here == umbrella ]] || may_use "$target"
    elif [[ $name =~ $libxml ]]; then
        [[ $path == src/xml/* || $path == bench/* ]] || echo "$where: libxml2 outside xml"
    elif [[ $name =~ $icu ]]; then
        [[ $path == src/base/* ]] || echo "$where: ICU outside base"
    elif [[ $name =~ $os && $here != program ]]; then
        [[ " base files host " == *" $here "* ]] || echo "$where: the operating system ($target) in $here"
    fi
}

# definitions_of NAME: the files that define a class, an enumeration or a function of that name.
definitions_of() {
    local type='(class|struct|union|enum)( [A-Za-z_]+)* ' function='[A-Za-z_][A-Za-z0-9_:<>,&* ]*[ &*]'
    local rest='([^;{]*\{|[^;]*$)' qualified="([A-Za-z0-9_]+::)*$1"
    grep -rE "^[[:space:]]*(($type)$qualified([^A-Za-z0-9_;]$rest|$)|$function$qualified\($rest)" include src \
        --include='*.h' --include='*.cpp' | grep -vE '^[^:]*:[[:space:]]*friend [^{]*$' | cut -d: -f1 | sort -u
}

# One friend: `name` in line `number` of `path`. A name that several folders define may be any of them.
check_friend() {
    local where="$path:$number" here definition
    room_of "$path"
    here=$room
    for definition in $(definitions_of "$name"); do
        room_of "$definition"
        [[ ${below[$here]:-} != *" $room "* ]] || return 0
    done
    if [[ -n ${definition:-} ]]; then
        echo "$where: $here befriends $name of $room"
    else
        echo "$where: $here befriends $name, which nobody defines"
    fi
}

may_use() {
    [[ ${below[$here]} == *" $room "* ]] || echo "$where: $here includes $1 of ${room:-no folder}"
}

# The check has to be able to fail: a small tree with one fault of each kind.
self_test() {
    local tree=$1 expected actual
    mkdir -p "$tree"/{cmake,src/{base,xml,mapping,record,marshaller},include/QXXMLMarshalling/{base,detail},tools/t,fuzz/xml}
    put() { printf '%s\n' "${@:2}" >"$tree/$1"; }
    put cmake/layers.txt '# folders' 'base : : detail/Count' 'xml : base :' 'mapping : xml :' 'record : base :' \
        'marshaller : mapping record :'
    put include/QXXMLMarshalling/detail/Count.h '#pragma once' '#include <sys/stat.h>'
    put include/QXXMLMarshalling/detail/Lost.h '#include <string>'
    put include/QXXMLMarshalling/base/Value.h '#include <QXXMLMarshalling/QXRecord.h>' '    friend class qx::Way;' \
        '    friend Deep;' '    friend qx::Ref<Value>' '    qx::make<Value>(int&&);' '    friend void qx::walk(Value&);' \
        '    friend bool operator==(Value, Value) = default;' 'class Way;' 'void walk(Value& value);'
    put include/QXXMLMarshalling/QXRecord.h '#include <QXXMLMarshalling/base/Value.h>' '#include "record/Table.h"'
    put include/QXXMLMarshalling/QXMapping.h '#include <QXXMLMarshalling/detail/Count.h>' '#include <sys/stat.h>'
    put src/base/Value.cpp '#include <unistd.h>' '#  include <libxml/tree.h>' 'Ref<T> make(Args&&... arguments) {'
    put src/xml/Node.cpp '#include <QXXMLMarshalling/base/Value.h>' '#include <libxml/tree.h>' '#include <unicode/uchar.h>'
    put src/mapping/QXMapping.cpp '#include <QXXMLMarshalling/QXMapping.h>' '#include "record/Table.h"' '#include "Key.h"'
    put src/record/QXRecord.cpp '#include <QXXMLMarshalling/QXMapping.h>' '#include <fstream>'
    put src/record/Table.h 'class Table {' '    friend class Table;' '    friend class Unknown;'
    put src/marshaller/way.cpp '#include "record/Table.h"' 'class Way {' '    struct Deep final : Base { int a; };' \
        'void walk(Value& value) {' '#include <QXXMLMarshalling/QXMapping.h>'
    put fuzz/xml/node.cpp '#include "xml/Node.cpp"' '#include "record/Table.h"'
    put tools/t/main.cpp '#include <QXXMLMarshalling/QXRecord.h>' '#include "record/Table.h"' '#include <fstream>'
    expected='fuzz/xml/node.cpp:2: xml includes "record/Table.h" of record
include/QXXMLMarshalling/QXMapping.h:2: the operating system (<sys/stat.h>) in mapping
include/QXXMLMarshalling/QXRecord.h:2: a public header includes "record/Table.h"
include/QXXMLMarshalling/base/Value.h:1: base includes <QXXMLMarshalling/QXRecord.h> of record
include/QXXMLMarshalling/base/Value.h:2: base befriends Way of marshaller
include/QXXMLMarshalling/base/Value.h:3: base befriends Deep of marshaller
include/QXXMLMarshalling/base/Value.h:6: base befriends walk of marshaller
include/QXXMLMarshalling/detail/Lost.h:1: belongs to no folder: enter it in cmake/layers.txt
src/base/Value.cpp:2: libxml2 outside xml
src/mapping/QXMapping.cpp:2: mapping includes "record/Table.h" of record
src/mapping/QXMapping.cpp:3: "Key.h" is not named from src/
src/record/QXRecord.cpp:1: record includes <QXXMLMarshalling/QXMapping.h> of mapping
src/record/QXRecord.cpp:2: the operating system (<fstream>) in record
src/record/Table.h:3: record befriends Unknown, which nobody defines
src/xml/Node.cpp:3: ICU outside base
tools/t/main.cpp:2: a program includes the private header "record/Table.h"'
    actual=$(complaints "$tree" | LC_ALL=C sort)
    if [[ $actual != "$expected" ]]; then
        echo "layers.sh does not find what it has to find:" >&2
        diff <(echo "$expected") <(echo "$actual") >&2 || true
        return 1
    fi
}

scratch=$(mktemp -d)
trap 'rm -rf -- "$scratch"' EXIT
self_test "$scratch"

found=$(complaints "$2")
if [[ -n $found ]]; then
    echo "$found"
    exit 1
fi
