#!/usr/bin/env bash
# Documents that name other files, in every way that XML and what stands around it know, are read
# with system calls watched: none of those files is opened or looked for, and no socket is made.
#
# usage: no-external-files.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

program=$1/bin/qxxml
# The leak check of the sanitizers cannot run under a tracer.
export ASAN_OPTIONS=detect_leaks=0
if [[ ! -x $program ]]; then
    echo "qxxml is not built" >&2
    exit 77
fi
if ! strace -o /dev/null true 2>/dev/null; then
    echo "system calls cannot be traced here" >&2
    exit 77
fi
folder=$(mktemp -d)
trap 'rm -rf -- "$folder"' EXIT
cd -- "$folder"

# Each of these is named by some document, as a path or a URL.
printf 'secret text' >"$folder/bait.txt"
printf '<!ENTITY e "secret text"><!ELEMENT a ANY>' >"$folder/bait.dtd"
printf '<b>secret text</b>' >"$folder/bait.xml"
file=file://$folder

# document NAME TEXT
document() { printf '%s' "$2" >"$folder/doc-$1.xml"; }
document subset "<!DOCTYPE a SYSTEM '$folder/bait.dtd'><a>ok</a>"
document subset-used "<!DOCTYPE a SYSTEM 'bait.dtd'><a>&e;</a>"
document public "<!DOCTYPE a PUBLIC '-//Bait//EN' '$file/bait.dtd'><a>ok</a>"
document standalone "<?xml version='1.0' standalone='no'?><!DOCTYPE a SYSTEM 'bait.dtd'><a>ok</a>"
document network "<!DOCTYPE a SYSTEM 'http://127.0.0.1:9/bait.dtd'><a>ok</a>"
document ftp "<!DOCTYPE a [<!ENTITY e SYSTEM 'ftp://127.0.0.1:9/bait.txt'>]><a>&e;</a>"
document general "<!DOCTYPE a [<!ENTITY e SYSTEM 'bait.txt'>]><a>&e;</a>"
document general-path "<!DOCTYPE a [<!ENTITY e SYSTEM '$folder/bait.txt'>]><a>&e;</a>"
document general-url "<!DOCTYPE a [<!ENTITY e PUBLIC 'p' '$file/bait.xml'>]><a>&e;</a>"
document general-nested "<!DOCTYPE a [<!ENTITY e SYSTEM 'bait.xml'><!ENTITY f '<c>&e;</c>'>]><a>&f;</a>"
document general-attribute "<!DOCTYPE a [<!ENTITY e SYSTEM 'bait.txt'>]><a b='&e;'/>"
document general-default \
    "<!DOCTYPE a [<!ENTITY e SYSTEM 'bait.txt'><!ATTLIST a b CDATA '&e;'>]><a/>"
document parameter "<!DOCTYPE a [<!ENTITY % p SYSTEM 'bait.dtd'> %p;]><a>&e;</a>"
document parameter-url "<!DOCTYPE a [<!ENTITY % p PUBLIC 'p' '$file/bait.dtd'> %p;]><a>ok</a>"
document parameter-nested \
    "<!DOCTYPE a [<!ENTITY % p \"<!ENTITY &#37; q SYSTEM 'bait.dtd'>\"> %p; %q;]><a>ok</a>"
document unparsed \
    "<!DOCTYPE a [<!NOTATION n SYSTEM 'bait.txt'><!ENTITY e SYSTEM 'bait.txt' NDATA n>]><a>ok</a>"
document include \
    "<a xmlns:xi='http://www.w3.org/2001/XInclude'>ok<xi:include href='bait.xml'/></a>"
document stylesheet "<?xml-stylesheet href='bait.xml' type='text/xsl'?><a>ok</a>"
document catalog "<?oasis-xml-catalog catalog='$folder/bait.xml'?><!DOCTYPE a SYSTEM 'b.dtd'><a>ok</a>"
document schema "<a xmlns:xsi='http://www.w3.org/2001/XMLSchema-instance' \
xsi:schemaLocation='urn:x $file/bait.xml' xsi:noNamespaceSchemaLocation='bait.xml'>ok</a>"
document base "<a xml:base='$file/'><b href='bait.xml'>ok</b></a>"

# Brings all text of a document through.
mapping='<mapping><class name="A"><map-to xml="a"/><field name="b"><bind-xml node="text"/></field></class></mapping>'
printf '%s' "$mapping" >"$folder/mapping.xml"
"$program" roundtrip mapping.xml doc-include.xml 2>/dev/null | grep -q 'ok<' ||
    { echo "what is read is not shown" >&2; exit 1; }

# The watch itself must work: a program that does open the bait is seen.
strace -f -e trace=file,network -o "$folder/trace" cat bait.txt >/dev/null
grep -q 'bait\.txt' "$folder/trace" || { echo "the watch sees nothing" >&2; exit 1; }

for document in "$folder"/doc-*.xml; do
    strace -f -e trace=file,network -o "$folder/trace" -- \
        "$program" roundtrip mapping.xml "$document" >"$folder/said" 2>&1 || [[ $? == 1 ]]
    name=${document##*/}
    if ! grep -qF "$name" "$folder/trace"; then
        echo "$name was not read at all" >&2
        exit 1
    fi
    if grep -E 'bait|b\.dtd|socket\(|connect\(' "$folder/trace" | grep -vF 'execve(' >&2; then
        echo "$name made the parser look at another file, or at the network" >&2
        exit 1
    fi
    if grep -q 'secret' "$folder/said"; then
        echo "$name brought in another file: $(<"$folder/said")" >&2
        exit 1
    fi
done
