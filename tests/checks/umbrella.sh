#!/usr/bin/env bash
# The header over all others includes every public header; those in detail/ are no host's to include.
#
# usage: umbrella.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

cd -- "$2/include"
umbrella=QXXMLMarshalling/QXXMLMarshalling.h
diff <(find QXXMLMarshalling -name '*.h' ! -path "$umbrella" ! -path '*/detail/*' | LC_ALL=C sort) \
    <(sed -n 's/^#include <\(QXXMLMarshalling\/.*\)>$/\1/p' "$umbrella" | LC_ALL=C sort)
