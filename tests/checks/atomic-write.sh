#!/usr/bin/env bash
# A program that saves a document, new or with an edit, is killed at each system call of the save, and
# each of them fails once: what is found afterwards is the old document or the new one, whole. Where
# even the directories are missing, a save that was killed while it made them is made up for by the
# next, which removes whatever a killed one left.
#
# usage: atomic-write.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

program=$1/bin/program_save_document
# The leak check of the sanitizers cannot run under a tracer.
export ASAN_OPTIONS=detect_leaks=0
folder=$(mktemp -d)
trap 'rm -rf -- "$folder"' EXIT
if [[ ! -x $program ]]; then
    echo "program_save_document is not built" >&2
    exit 77
fi
if ! strace -o /dev/null true 2>/dev/null; then
    echo "system calls cannot be traced here" >&2
    exit 77
fi

area=$folder/data/Client
old='<order>the old one</order>'
# prepare [STATE]: lays out the old document, or with STATE "nothing" not even a directory.
prepare() {
    rm -rf -- "$folder/data"
    [[ ${1:-} != nothing ]] || return 0
    mkdir -p -- "$area"
    printf '%s' "$old" >"$area/a.xml"
}
fail() {
    echo "$*" >&2
    exit 1
}

how=new
save() { "$program" "$folder/data" "$how"; }

# One undisturbed run from a state gives the new document and, in `calls`, those of the save: "name
# ordinal arguments", the ordinal counting the calls of that name from the start of the program, as
# strace does. Calls for memory are left out: the sanitizers make another number of them each time.
trace() {
    prepare "$1"
    strace -o "$folder/trace" -- "$program" "$folder/data" "$how"
    cp -- "$area/a.xml" "$folder/new.xml"
    mapfile -t calls < <(awk '
        match($0, /^[a-z0-9_]+\(/) {
            name = substr($0, 1, RLENGTH - 1)
            ++count[name]
            if (name == "getppid") ++marks
            else if (marks == 1 && name !~ /^(mmap|munmap|mprotect|madvise|brk)$/) print name, count[name], substr($0, RLENGTH)
        }' "$folder/trace")
    ((${#calls[@]} >= 8)) || fail "the save has only these calls: ${calls[*]}"
}

# What stands in the area, in `state`: nothing, old, new or a description of what is wrong.
look() {
    if [[ ! -e $area/a.xml ]]; then
        state=nothing
    elif cmp -s -- "$area/a.xml" "$folder/new.xml"; then
        state=new
    elif [[ $(<"$area/a.xml") == "$old" ]]; then
        state=old
    else
        state="a broken document of $(stat -c %s -- "$area/a.xml") bytes"
    fi
}

for way in new:nothing update:old file:old new:old; do
    how=${way%:*} start=${way#*:}
    trace "$start"
    [[ $start == old || ${calls[*]} == *mkdir* ]] || fail "no directory was made: ${calls[*]}"
    killed=0
    declare -A seen=()
    for call in "${calls[@]}"; do
        read -r name ordinal _ <<<"$call"
        prepare "$start"
        status=0
        { strace -o /dev/null -e "trace=$name" -e "inject=$name:signal=KILL:when=$ordinal" \
            -- "$program" "$folder/data" "$how" >/dev/null; } 2>/dev/null || status=$?
        look
        [[ $state == "$start" || $state == new ]] || fail "killed at $name ($ordinal): $state"
        seen[$state]=1
        ((status != 137)) || killed=$((killed + 1))
        save || fail "nothing is written after $call"
        [[ $(ls -A -- "$area") == a.xml ]] || fail "killed at $call: $(ls -A -- "$area" | tr '\n' ' ')"
    done
    ((killed == ${#calls[@]})) || fail "killed only $killed of ${#calls[@]} times"
    [[ -n ${seen[$start]:-} && -n ${seen[new]:-} ]] || fail "every time: ${!seen[*]}"
    [[ $start == old ]] || continue
    for call in "${calls[@]}"; do
        read -r name ordinal arguments <<<"$call"
        # The sanitizers have pipes of their own.
        [[ $name != pipe* && $name != close && ! ($name == write && $arguments != *'<'*) ]] || continue
        prepare
        expected=new
        strace -o /dev/null -e "trace=$name" -e "inject=$name:error=EIO:when=$ordinal" \
            -- "$program" "$folder/data" "$how" >/dev/null || expected=old
        look
        [[ $state == "$expected" ]] || fail "$how, EIO of $call: $state instead of $expected"
        [[ $(ls -A -- "$area") == a.xml ]] || fail "EIO of $call leaves $(ls -A -- "$area" | tr '\n' ' ')"
    done
done

# inject CALL ERROR: lets the first call within the save fail that begins with CALL, a pattern. What
# the program says in `said`.
inject() {
    local call name ordinal found=
    for call in "${calls[@]}"; do
        # shellcheck disable=SC2053
        [[ -n $found || $call != $1* ]] || found=$call
    done
    [[ -n $found ]] || fail "the save has no call of $1"
    read -r name ordinal _ <<<"$found"
    prepare
    said=$(strace -o /dev/null -e "trace=$name" -e "inject=$name:error=$2:when=$ordinal" \
        -- "$program" "$folder/data" "$how") || true
    look
}
while IFS='|' read -r name error expected; do
    inject "$name" "$error"
    [[ $state == old ]] || fail "$error of $name: $state"
    [[ $said == "NSCocoaErrorDomain $expected" ]] || fail "$error of $name: $said"
    [[ $(ls -A -- "$area") == a.xml ]] || fail "$error of $name leaves $(ls -A -- "$area" | tr '\n' ' ')"
done <<END
open*O_CREAT|EROFS|642: The disk is read-only: $area/a.xml (Read-only file system)
open*O_CREAT|EACCES|513: Permission to write is missing: $area/a.xml (Permission denied)
write|ENOSPC|640: The disk is too full to write: $area/a.xml (No space left on device)
fsync|EIO|512: The file cannot be written: $area/a.xml (Input/output error)
rename|EDQUOT|640: The disk is too full to write: $area/a.xml (Disk quota exceeded)
END
# Where the old rights can't be told, the new document is the owner's alone.
inject '*stat*a.xml' EIO
[[ $state == new && $(stat -c %a -- "$area/a.xml") == 600 ]] || fail "no rights known: $state"
# An interrupted call is made again.
inject write EINTR
[[ $state == new ]] || fail "an interrupted write: $state"
