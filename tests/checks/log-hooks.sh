#!/usr/bin/env bash
# What the library says goes to the host's log functions, and to standard error where there are none;
# they are found however host and library come together at run time: linked (log-host.cpp) or loaded.
#
# usage: log-hooks.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

build=$1
source=$2
cached() { sed -n "s/^$1:[A-Z]*=//p" "$build/CMakeCache.txt"; }
compiler=$(cached CMAKE_CXX_COMPILER)
flags=(-std=c++20 -fPIC -fvisibility=hidden -fno-gnu-unique -I"$source/include")
[[ $(cached CMAKE_CXX_COMPILER_ID) != Clang && $compiler != *clang* ]] || flags=("${flags[@]/-fno-gnu-unique/}")
[[ $(cached QX_SANITIZE) != ON ]] || flags+=(-fsanitize=address,undefined)
library=(-L"$build/lib" -lQXXMLMarshalling "-Wl,-rpath,$build/lib")
if [[ ! -e $build/lib/libQXXMLMarshalling.so ]]; then
    echo "the library is not built" >&2
    exit 77
fi

folder=$(mktemp -d)
trap 'rm -rf -- "$folder"' EXIT
cd -- "$folder"

# A plug-in that links the library and makes it warn.
cat >plugin.cpp <<'END'
#include <QXXMLMarshalling/model/Class.h>
struct One : qx::Object {};
struct Two : qx::Object {};
extern "C" QX_API void warn() {
    qx::Class::forget("Taken");
    qx::Class::define<One>("Taken");
    qx::Class::define<Two>("Taken");
}
END
cat >hooks.cpp <<'END'
#include <QXXMLMarshalling/host/Log.h>
#include <cstdio>
void QXLogWarning(std::string_view, std::span<const qx::Value>) { std::puts("host"); }
END
# usage: host OBJECT...: loads each, "+" for everybody, and calls warn() of the first that has it.
cat >host.cpp <<'END'
#include <dlfcn.h>
#include <cstdio>
int main(int count, char** names) {
    void (*warn)() = nullptr;
    void* last = nullptr;
    for (int i = 1; i < count; ++i) {
        const bool all = names[i][0] == '+';
        last = dlopen(names[i] + all, RTLD_NOW | (all ? RTLD_GLOBAL : RTLD_LOCAL));
        if (last == nullptr) { std::puts(dlerror()); return 1; }
        if (warn == nullptr) warn = reinterpret_cast<void (*)()>(dlsym(last, "warn"));
        if (warn != nullptr) { warn(); std::fflush(stdout); }
    }
    if (count > 2) { dlclose(last); warn(); }
}
END
compile() { "$compiler" "${flags[@]}" "$@"; }
compile -shared plugin.cpp -o plugin.so "${library[@]}"
compile -shared plugin.cpp hooks.cpp -o plugin-with-hooks.so "${library[@]}"
# Binds what it needs of the library when it is loaded; it needs nothing else of it.
compile -shared hooks.cpp -o hooks.so
compile host.cpp -o host -ldl
compile host.cpp hooks.cpp -o host-with-hooks -ldl -Wl,-rpath,"$build/lib"
compile -rdynamic host.cpp hooks.cpp -o host-exporting-hooks -ldl

# Standard error first, without the head of each line; then what the functions were told.
saidWith() {
    compile "$@" "$source/tests/checks/log-host.cpp" -o log-host "${library[@]}"
    ./log-host 2>errors >told || echo "ended with $?"
    sed -E 's/^[0-9-]+ [0-9:.]+ Client\[[0-9]+\] /line: /' errors told |
        sed -E 's#/tmp/qx-log-[A-Za-z0-9]+#FOLDER#; s/0x[0-9a-f]+/ADDRESS/; s/(Premature end).*/\1/; s/(The class name Taken is taken).*/\1/'
}
status=0
warnings='The class name Taken is taken
Unable to read the property list FOLDER/Client.plist: Premature end
Unable to read the property list FOLDER/Info.plist: Premature end'
attributes='Unbound attributes: (number [1])'
fields='Unbound fields: (note [1])'
record='Set for key: title existing: untold value: Emma
Set for key: pages existing: (null) value: 300
<QXGenericRecord:ADDRESS: _setValue:forKey: pages, (null)
Undo for key: pages existing: 300 value: (null)
<QXGenericRecord:ADDRESS: _setValue:forKey: title, untold
Undo for key: title existing: Emma value: untold
<QXGenericRecord:ADDRESS: _setValue:forKey: title, Emma
Redo for key: title existing: untold value: Emma
<QXGenericRecord:ADDRESS: _setValue:forKey: pages, 300
Redo for key: pages existing: (null) value: 300'
as() { printf '%s\n' "${@:2}" | sed "s/^/$1: /"; }
# A function that asks for the files hears of them first, from the last one on.
nested=$(tac <<<"$warnings")
lines=$(as line "$warnings" "$fields" "$attributes")
for hooks in "" "-DWITH_DEBUG" "-DWITH_WARNING" "-DWITH_DEBUG -DWITH_WARNING"; do
    case $hooks in
    "") expected=$lines ;;
    -DWITH_DEBUG) expected=$lines$'\n'$(as debug "$record") ;;
    -DWITH_WARNING) expected=$(as warning "$nested" "$attributes") ;;
    *)
        expected=$(as warning "$nested"; as debug "*** Warning: $fields"
            as warning "$attributes"; as debug "$record") ;;
    esac
    # shellcheck disable=SC2086 # the flags are words
    if ! diff <(printf '%s\n' "$expected") <(saidWith $hooks); then
        echo "a host with other words: ${hooks:-no functions}" >&2
        status=1
    fi
done
# expect "PLACE..." COMMAND...: where the warnings went, in order.
expect() {
    local expected=$1 actual
    shift
    actual=$(ASAN_OPTIONS=detect_leaks=0 "$@" 2>&1 | sed -E 's/^[0-9-]+ [0-9:.]+ .* The class.*/line/' | tr '\n' ' ')
    if [[ $actual != "$expected " ]]; then
        echo "$*: expected $expected, got $actual" >&2
        status=1
    fi
}
expect 'line' ./host ./plugin.so
expect 'host' ./host-exporting-hooks ./plugin.so
# Its functions are not exported, which the header warns of.
expect 'line' ./host-with-hooks ./plugin.so
expect 'host' ./host ./plugin-with-hooks.so
# Functions that come for everybody after the library. The loader keeps them while the library, which
# has found them, is there: closing them leaves no dangling pointer.
expect 'line host host' ./host ./plugin.so +./hooks.so
expect 'line line line' ./host ./plugin.so ./hooks.so
exit "$status"
