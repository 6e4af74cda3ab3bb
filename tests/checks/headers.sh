#!/usr/bin/env bash
# Every public header compiles alone, whichever a host includes first. Those that a .cpp file includes
# first are proved by the build; the others are compiled here.
#
# usage: headers.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

cd -- "$2/include"
compiler=$(sed -n 's/^CMAKE_CXX_COMPILER:[A-Z]*=//p' "$1/CMakeCache.txt")
strict=()
! grep -q '^QX_WARNINGS_AS_ERRORS:BOOL=ON' "$1/CMakeCache.txt" || strict=(-Werror)

declare -A first
while IFS= read -r source; do
    target=$(grep -m1 -oE '^#include <QXXMLMarshalling/[^>]+>' "$source" || true)
    line=$(grep -m1 '^#include' "$source" || true)
    if [[ -n $target && $target == "$line" ]]; then
        target=${target#*<}
        first[${target%>}]=1
    fi
done < <(find ../src -name '*.cpp')

status=0
while IFS= read -r header; do
    if [[ -z ${first[$header]:-} ]] &&
        ! "$compiler" -std=c++20 -Wall -Wextra "${strict[@]}" -fsyntax-only -I. -x c++ - <<<"#include <$header>"; then
        echo "$header does not compile alone" >&2
        status=1
    fi
done < <(find QXXMLMarshalling -name '*.h' | LC_ALL=C sort)
exit "$status"
