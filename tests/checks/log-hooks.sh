#!/usr/bin/env bash
# A host's log functions are found however host and library come together at run time. Hosts that link
# the library are the programs log_*.cpp; here are those that load it.
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

status=0
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
