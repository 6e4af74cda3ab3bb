#!/usr/bin/env bash
# The editor prints what it always printed: every change, and the document that it saved.
#
# usage: editor.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

example=$2/examples/editor
if [[ ! -x $1/bin/example_editor ]]; then
    echo "the example is not built"
    exit 77
fi
diff --unified --label expected --label printed \
    "$example/expected-output.txt" <("$example/demo" "$1" 2>&1)
