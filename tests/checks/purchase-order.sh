#!/usr/bin/env bash
# The example prints what it always printed, the documents that it wrote included.
#
# usage: purchase-order.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

example=$2/examples/purchase-order
if [[ ! -x $1/bin/example_purchase_order ]]; then
    echo "the example is not built"
    exit 77
fi
diff --unified --label expected --label printed \
    "$example/expected-output.txt" <("$example/demo" "$1" 2>&1)
