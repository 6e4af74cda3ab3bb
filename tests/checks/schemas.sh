#!/usr/bin/env bash
# The schemas of mapping documents say what docs/mapping-format.md says, and agree with the library and with
# each other about every mapping of the tree: files, and blocks of the pages. What they alone refuse is what
# qxxml check finds; what the library alone refuses takes more than one element to see.
#
# usage: schemas.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

tool=$1/bin/qxxml
source=$2
"$source/scripts/schema" --check
if [[ ! -x $tool ]] || ! command -v xmllint >/dev/null; then
    echo "qxxml is not built, or xmllint (libxml2-utils) is not installed" >&2
    exit 77
fi
work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT
cd -- "$source"

# Blocks are named after page and line; what is no whole document gets its root. Those of the checks' tests have
# words that the library passes over.
find docs tests -name '*.md' -not -path 'tests/check/*' -exec awk -v folder="$work" '
    /^```$/ { if (name) { if (!whole) print "</mapping>" > name; close(name) } name = ""; next }
    name && first { whole = /^(<\?xml|<mapping)/; if (!whole) print "<mapping>" > name; first = 0 }
    name { print > name }
    /^```xml .*mapping/ {
        page = FILENAME; gsub(/\//, ":", page); name = folder "/" page ":" FNR ".xml"; first = 1
    }' {} \;
for file in $(grep -rlE '<mapping' --include='*.xml' examples fuzz/seeds/mapping tests); do
    cp -- "$file" "$work/${file//\//:}"
done
cd -- "$work"
files=(*.xml)
((${#files[@]} > 150)) || { echo "only ${#files[@]} mappings were found" >&2 && exit 1; }

# refused OPTION SCHEMA: the files that are refused.
refused() { { xmllint --noout "$@" "${files[@]}" 2>&1 || true; } | sed -n 's/^\(.*\.xml\) fails to validate$/\1/p' | LC_ALL=C sort; }
refused --relaxng "$source/share/schema/mapping.rng" >by-rng
refused --schema "$source/share/schema/mapping.xsd" >by-xsd
printf '%s\n' "${files[@]}" | ASAN_OPTIONS=detect_leaks=0 xargs -P "$(nproc)" -I {} sh -c \
    '"$1" describe "$2" >/dev/null 2>"$2.said" || printf "%s\n" "$2"' - "$tool" {} | LC_ALL=C sort >by-library
status=0
wrong() {
    echo "schemas.sh: $*" >&2
    status=1
}
diff by-rng by-xsd || wrong "the schemas disagree"
for file in $(LC_ALL=C comm -23 by-rng by-library); do
    # Where the library passes over something, a check of the mapping finds it.
    [[ -n $("$tool" check "$file" 2>&1) ]] || wrong "the schemas refuse what the library takes: $file"
done
for file in $(LC_ALL=C comm -13 by-rng by-library); do
    grep -qE 'error -205: (Class|Element) redefined' "$file.said" ||
        wrong "the schemas take what the library refuses: $file: $(<"$file.said")"
done

# What the library passes over without a word, and who writes a mapping wants to hear of.
files=()
while IFS= read -r faulty; do
    files+=("faulty-${#files[@]}.xml")
    echo "<mapping>$faulty</mapping>" >"${files[-1]}"
done <<'END'
<clas name="A"/>
<class name="A" extend="B"/>
<class name="A"><field name="f" requird="true"/></class>
<class name="A"><field name="f" collection="list"/></class>
<class name="A"><field name="f"><bind-xml node="atribute"/></field></class>
<class name="A"><field name="f"><bind-xml><map-to xml="a"/></bind-xml></field></class>
<class name="A">text</class>
END
for kind in relaxng:rng schema:xsd; do
    [[ $(refused "--${kind%:*}" "$source/share/schema/mapping.${kind#*:}") == $(printf '%s\n' "${files[@]}") ]] ||
        wrong "${kind#*:} does not refuse each of the faulty mappings"
done
exit "$status"
