#!/usr/bin/env bash
# The differences on the page about formats are those that the demos of the examples print.
#
# usage: formats.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

page=$2/docs/formats.md
examples=$(sed -n 's/^```diff //p' "$page")
[[ -n $examples ]]
for example in $examples; do
    if [[ ! -x $1/bin/example_$example ]]; then
        echo "the example $example is not built"
        exit 77
    fi
    shown=$(awk -v fence="\`\`\`diff $example" '$0 == fence { on = 1; next } /^```/ { on = 0 } on' "$page")
    printed=$("$2/examples/$example/demo" "$1" 2>&1)
    if [[ $printed != *"$shown"* ]]; then
        echo "formats.sh: the page shows of $example what its demo does not print:"
        diff <(printf '%s\n' "$shown") <(printf '%s\n' "$printed")
    fi
done
