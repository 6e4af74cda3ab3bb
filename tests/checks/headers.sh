#!/usr/bin/env bash
# Every installed header compiles alone, with the build's compiler; and a program may have names of its own
# beside all of them, with GCC and Clang: both have the same standard library, so a header that lacks an include
# lacks it with either. Where one of them is missing, the check says so and ends as skipped once the other has
# compiled everything; with QX_REQUIRE_COMPILERS=ON in the environment it fails.
#
# usage: headers.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT
cmake --install "$1" --prefix "$work" --component headers >/dev/null
cd -- "$work/include"

warnings=(-Wall -Wextra -Wconversion -Wshadow -pedantic)
! grep -q '^QX_WARNINGS_AS_ERRORS:BOOL=ON' "$1/CMakeCache.txt" || warnings+=(-Werror)
compilers=("$(sed -n 's/^CMAKE_CXX_COMPILER:[A-Z]*=//p' "$1/CMakeCache.txt")")
family() { "$1" --version | grep -qi clang && echo clang++ || echo g++; }
missing=
for other in g++ clang++; do
    [[ $(family "${compilers[0]}") != "$other" ]] || continue
    if command -v "$other" >/dev/null; then
        compilers+=("$other")
    else
        missing=$other
    fi
done

# Each program that must compile: one for each header, and those that headers can break together.
mkdir alone together
while IFS= read -r header; do
    echo "#include <$header>" >"alone/${header//\//:}.cpp"
done < <(find QXXMLMarshalling -name '*.h')
cat >together/own-names.cpp <<'END'
#include <QXXMLMarshalling/QXXMLMarshalling.h>
namespace Marshalling {}
namespace Unmarshalling {}
namespace MappingPlan {}
namespace ClassPlan {}
namespace FieldPlan {}
namespace ObjectAccess {}
namespace detail {}
END
cp "$2/tests/model/MemberNameTest.cpp" together/

# compiles COMPILER PROGRAM: says so when it does not.
compiles() {
    "$1" -std=c++20 "${@:3}" -I. -fsyntax-only "$2" || { echo "$1: $2 does not compile" && false; }
}
export -f compiles
status=0
for compiler in "${compilers[@]}"; do
    folders=(together)
    [[ $compiler != "${compilers[0]}" ]] || folders+=(alone)
    find "${folders[@]}" -name '*.cpp' -print0 | xargs -0 -P "$(nproc)" -I {} \
        bash -c 'compiles "$@"' - "$compiler" {} "${warnings[@]}" >&2 || status=1
done
if [[ $status == 0 && -n $missing ]]; then
    echo "SKIPPED: $missing is not installed, only ${compilers[*]} compiled the headers" >&2
    [[ ${QX_REQUIRE_COMPILERS:-} != ON ]] || exit 1
    exit 77
fi
exit "$status"
