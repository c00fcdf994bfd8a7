# What the completion offers for a line that ends where the cursor is, as bash would ask it.
# shellcheck shell=bash disable=SC2206
PATH=$PWD:$PATH
. "$SOURCE/etc/bash-completion/quorlog"
compopt() { :; }
# Fills in what readline would, for a line that ends where the cursor is.
try() {
    COMP_LINE=$1 COMP_POINT=${#1}
    local line=${1//=/ = }
    COMP_WORDS=(${line//:/ : })
    [[ $1 == *' ' ]] && COMP_WORDS+=('')
    COMP_CWORD=$((${#COMP_WORDS[@]} - 1))
    _quorlog quorlog "${COMP_WORDS[COMP_CWORD]}" "${COMP_WORDS[COMP_CWORD - 1]}"
    printf '%s\n' "${COMPREPLY[@]}"
    for word in "${COMPREPLY[@]}"; do eval "set -- $word"; done
}
set -f
try "$1"
