#!/usr/bin/env bash
# A type that has no traits, of a member or of a value by key, is one error of the compiler, which names
# it: with the build's compiler.
#
# usage: traits-errors.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

source=$2
work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT
compiler=$(sed -n 's/^CMAKE_CXX_COMPILER:[A-Z]*=//p' "$1/CMakeCache.txt")

# refused TYPE USE: what uses Odd::member, which is of the type, does not compile, as said above.
refused() {
    cat >"$work/program.cpp" <<END
#include <QXXMLMarshalling/model/Class.h>
#include <chrono>
#include <map>
struct Odd { $1 member; };
void use(qx::Object& object) { $2; }
END
    if "$compiler" -std=c++20 -I "$source/include" -fsyntax-only "$work/program.cpp" 2>"$work/errors"; then
        echo "traits-errors.sh: $1 was taken by $2"
        exit 1
    fi
    if [[ $(grep -c 'error:' "$work/errors") != 1 ]] || ! grep -q 'no qx::ValueTraits' "$work/errors" ||
        ! grep -Eq 'ValueTraits<(std::(map|pair|chrono)|int *\*)' "$work/errors"; then
        echo "traits-errors.sh: the errors of $1 in $2 are too many, or do not name it:"
        cat "$work/errors"
        exit 1
    fi
}

for type in 'std::map<int, int>' 'int*' 'std::optional<std::map<int, int>>' \
    'std::vector<std::map<int, int>>' 'std::chrono::sys_seconds' 'std::pair<int, int>'; do
    refused "$type" 'qx::Class::define<Odd>("Odd").members<&Odd::member>()'
done
for use in 'object["key"] = Odd().member' 'object["key"].get<decltype(Odd::member)>()'; do
    refused 'std::map<int, int>' "$use"
done
