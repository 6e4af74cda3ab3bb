#!/usr/bin/env bash
# The manual page and the completions of qxxml tell every command and option that its help tells; bash
# completes them, and the other shells and man take theirs where they are installed.
#
# usage: tool-pages.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

tool=$1/bin/qxxml
pages=$1/pages
if [[ ! -x $tool ]]; then
    echo "qxxml is not built" >&2
    exit 77
fi
status=0
wrong() {
    echo "tool-pages.sh: $*" >&2
    status=1
}

mapfile -t commands < <("$tool" --help | sed -n '/^Subcommands:/,$ s/^  \([a-z]*\) .*/\1/p')
((${#commands[@]} >= 7)) || wrong "the help lists only ${commands[*]}"

# complete WORD...: what bash offers for the last word.
complete_words() {
    bash -c 'compopt() { :; }; source "$1"; shift; COMP_WORDS=("$@"); COMP_CWORD=$(($# - 1)); _qxxml
        printf "%s\n" "${COMPREPLY[@]}"' - "$pages/qxxml" "$@" | LC_ALL=C sort
}
for command in '' "${commands[@]}"; do
    section=$(sed 's/\\-/-/g' "$pages/qxxml.1" | sed -n "/^\.S[HS] ${command:-OPTIONS}\$/,/^\.S[HS] [A-Za-z]/p")
    # shellcheck disable=SC2086 # the tool itself has no word
    mapfile -t options < <("$tool" $command --help | grep -oE '^  (-.,)?--[a-z-]+' | grep -oE -- '--[a-z-]+')
    for option in "${options[@]}"; do
        [[ $section == *"$option"* ]] || wrong "the manual page does not tell: $command $option"
        [[ -z $command ]] || grep -q "from $command' .*-l ${option#--} " "$pages/qxxml.fish" ||
            wrong "fish does not complete: $command $option"
        grep -q -e "$option\[" <(sed -n "/ $command) _arg/,/;;/p" "$pages/_qxxml") || [[ -z $command ]] ||
            wrong "zsh does not complete: $command $option"
    done
    # shellcheck disable=SC2086
    diff <(printf '%s\n' "${options[@]}" | LC_ALL=C sort) <(complete_words qxxml $command -- | grep '^--') ||
        wrong "bash completes other options of: qxxml $command"
done
diff <(printf '%s\n' "${commands[@]}" | LC_ALL=C sort) <(complete_words qxxml '') || wrong "bash lists other commands"
[[ $(complete_words qxxml completion z) == zsh ]] || wrong "bash does not complete what a command takes"
mkdir -p "$pages/folder/inside"
[[ $(cd "$pages/folder" && complete_words qxxml read --search-path i) == inside ]] || wrong "bash completes no folder"
rmdir "$pages/folder/inside" "$pages/folder"

! command -v zsh >/dev/null || zsh -n "$pages/_qxxml" || wrong "zsh does not take its script"
! command -v fish >/dev/null || fish -n "$pages/qxxml.fish" || wrong "fish does not take its script"
if command -v groff >/dev/null; then
    warnings=$(LC_ALL=C.UTF-8 groff -man -Tutf8 -ww -z "$pages/qxxml.1" 2>&1)
    [[ -z $warnings ]] || wrong "groff warns: $warnings"
fi
exit "$status"
