#!/usr/bin/env bash
# The worked example of docs/repositories.md: its documents are laid out as they stand there, and what
# a program resolves is what the page says.
#
# usage: repositories-example.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

program=$1/bin/program_resolve_mapping
page=$2/docs/repositories.md
if [[ ! -x $program ]]; then
    echo "program_resolve_mapping is not built" >&2
    exit 77
fi
root=$(mktemp -d)
trap 'rm -rf -- "$root"' EXIT
root=$(cd -- "$root" && pwd -P)

# block LANGUAGE NAME: the text of the fenced block that begins with both.
block() {
    awk -v head="\`\`\`$1 $2" '$0 == "```" { on = 0 } on { print } $0 == head { on = 1 }' "$page"
}
mapfile -t files < <(sed -n 's/^```xml //p' "$page")
((${#files[@]} == 7)) || { echo "the page shows ${#files[@]} files" >&2; exit 1; }
for file in "${files[@]}"; do
    mkdir -p -- "$root/$(dirname -- "$file")"
    block xml "$file" >"$root/$file"
done
mkdir -p -- "$root/usr/bin"
cp -- "$program" "$root/usr/bin/Client"

mapfile -t names < <(block text resolved | sed -n 's/ -> .*//p')
actual=$(env -u XDG_DATA_HOME -u XDG_CONFIG_HOME HOME="$root/home" "$root/usr/bin/Client" "${names[@]}" |
    sed "s|$root/home|~|; s|$root||")
diff <(block text resolved) <(echo "$actual")
