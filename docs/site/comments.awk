# Plain comments of a header as Doxygen reads them: a comment above a declaration documents it, one behind a
# member too, and the one at the head of a header its file and the class of the file's name. What is
# indented in a comment is an example, shown as it stands.

function escaped(text) {
    gsub(/[\\@#&<>%"*`|$]/, "\\\\&", text)
    return text
}
# One line of a comment, without its slashes.
function say(prefix, text) {
    if (text ~ /^  /) {
        if (!example) print prefix "@code{.unparsed}"
        example = 1
        print prefix substr(text, 3)
        return
    }
    if (example && text ~ /^ *$/) { print prefix; return }
    endExample(prefix)
    print prefix escaped(text)
}
function endExample(prefix) {
    if (example) print prefix "@endcode"
    example = 0
}
function headLines(    i, count, list) {
    count = split(head, list, "\n")
    for (i = 1; i < count; ++i) say("", list[i])
    endExample("")
}

FNR == 1 {
    stem = FILENAME
    sub(/.*\//, "", stem); sub(/\.h$/, "", stem)
    atHead = 1
}
# The head of the file, up to its first include.
atHead && /^#pragma once/ { print; next }
atHead && /^\/\/ ?/ { sub(/^\/\/ ?/, ""); head = head $0 "\n"; print ""; next }
atHead && /^#include|^[a-z]/ {
    atHead = 0
    if (head) { printf "/*! @file\n"; headLines(); print "*/" }
}
!atHead && match($0, "^(class|struct) QX_API " stem "([ :;]|$)") && head {
    indent = ""
    print "/*!"; headLines(); print "*/"
    head = ""
}
/^ *\/\/( |$)/ {
    match($0, /^ */)
    prefix = substr($0, 1, RLENGTH) "/// "
    text = substr($0, RLENGTH + 1)
    sub(/^\/\/ ?/, "", text)
    say(prefix, text)
    lastPrefix = prefix
    next
}
{ endExample(lastPrefix) }
# Behind a member or an enumerator.
(/[;,A-Za-z0-9_)] +\/\/ / || /\).*\{.*\} +\/\/ /) && !/"[^"]*\/\/[^"]*"/ && !/^ *(namespace|#|\})/ {
    at = index($0, "// ")
    print substr($0, 1, at - 1) "///< " escaped(substr($0, at + 3))
    next
}
# Doxygen lists friends without a place for them: declarations are left out, functions are the class's.
/^ *friend [^{(]*;$/ || /^ *friend [^{]*make<.*;$/ { print ""; next }
/^ *friend / { sub(/friend /, "static ") }
{ print }
