#!/usr/bin/env bash
# The README's program compiles as it stands there and does what the README says, under the README's
# mapping.
#
# usage: readme.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT
# block LANGUAGE: the README's first block in that language.
block() { awk -v fence="\`\`\`$1" '$0 == fence { on = 1; next } on && /^```/ { exit } on' "$2/README.md"; }
block xml "$2" >"$work/order-mapping.xml"
block cpp "$2" >"$work/program.cpp"
printf '<order number="7"><customer>Bea</customer><note/></order>' >"$work/order.xml"

compiler=$(sed -n 's/^CMAKE_CXX_COMPILER:[A-Z]*=//p' "$1/CMakeCache.txt")
flags=()
! grep -q '^QX_SANITIZE:BOOL=ON' "$1/CMakeCache.txt" || flags+=(-fsanitize=address,undefined)
! grep -q '^QX_WARNINGS_AS_ERRORS:BOOL=ON' "$1/CMakeCache.txt" || flags+=(-Werror)
"$compiler" -std=c++20 -Wall -Wextra "${flags[@]}" -I "$2/include" "$work/program.cpp" \
    -L "$1/lib" -lQXXMLMarshalling -Wl,-rpath,"$1/lib" -o "$work/program"
cd -- "$work"
./program
diff - order.xml <<'EOF'
<?xml version="1.0" encoding="UTF-8"?>
<order number="7">
    <customer>Ada</customer>
    <note></note>
</order>
EOF
printf '<invoice/>' >order.xml
if ./program 2>errors; then
    echo "readme.sh: the program took a document that its mapping does not know"
    exit 1
fi
diff - errors <<<'No definition to handle element: <invoice></invoice>'
