#!/usr/bin/env bash
# The shared library exports what the public headers mark with QX_API, and nothing else.
#
# usage: exports.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

library=$1/lib/libQXXMLMarshalling.so
if [[ ! -e $library ]]; then
    echo "the library is not built" >&2
    exit 77
fi
# The words between a mark and the end of what is declared: a class or a function is among them. What
# the address sanitizer adds is left out.
marked=$(find "$2/include" -name '*.h' -exec cat {} + | tr '\n' ' ' | grep -oE 'QX_API[^;{]*' | grep -oE '[A-Za-z_0-9]+' | sort -u)
exported=$(nm -DC --defined-only "$library" | cut -c20- | grep -vE '^(__odr_asan|__asan|__ubsan|__sanitizer|_ZTI.*ubsan)' |
    sed -E 's/^(vtable|VTT|typeinfo|typeinfo name|guard variable) for //; s/^(non-)?virtual thunk to //')
unmarked=$(sed -E 's/^(qx::)?(detail::)?([A-Za-z_0-9]+).*/\3 &/' <<<"$exported" |
    awk 'NR == FNR { marked[$1]; next } !($1 in marked)' <(echo "$marked") -)
if [[ -n $unmarked || $(wc -l <<<"$exported") -lt 100 ]]; then
    echo "exports.sh: these are exported, but not marked with QX_API:" >&2
    echo "$unmarked" >&2
    exit 1
fi
