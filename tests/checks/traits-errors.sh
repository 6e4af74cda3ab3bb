#!/usr/bin/env bash
# A member of a type that has no traits is one error of the compiler, which names the type: with the
# build's compiler.
#
# usage: traits-errors.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT
compiler=$(sed -n 's/^CMAKE_CXX_COMPILER:[A-Z]*=//p' "$1/CMakeCache.txt")
for type in 'std::map<int, int>' 'int*' 'std::optional<std::map<int, int>>' \
    'std::vector<std::map<int, int>>' 'std::chrono::sys_seconds' 'std::pair<int, int>'; do
    cat >"$work/program.cpp" <<END
#include <QXXMLMarshalling/model/Class.h>
#include <chrono>
#include <map>
struct Odd { $type member; };
int main() { qx::Class::define<Odd>("Odd").members<&Odd::member>(); }
END
    if "$compiler" -std=c++20 -I "$2/include" -fsyntax-only "$work/program.cpp" 2>"$work/errors"; then
        echo "traits-errors.sh: $type was taken"
        exit 1
    fi
    if [[ $(grep -c 'error:' "$work/errors") != 1 ]] || ! grep -q 'no qx::ValueTraits' "$work/errors" ||
        ! grep -Eq 'ValueTraits<(std::(map|pair|chrono)|int *\*)' "$work/errors"; then
        echo "traits-errors.sh: the errors of $type are too many, or do not name it:"
        cat "$work/errors"
        exit 1
    fi
done
