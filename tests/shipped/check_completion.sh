#!/bin/bash
# check_completion.sh VX SCRIPT: the completion script inside bash, as a person would use it.
set -u
PATH=$(dirname "$1"):$PATH
source "$2" || exit 1
failed=0

# expect WANTED WORD...: what bash gets for a line whose last word is being completed.
expect() {
    local wanted=$1
    shift
    COMP_WORDS=("$@")
    COMP_CWORD=$((${#COMP_WORDS[@]} - 1))
    COMPREPLY=()
    _vx
    if [[ "${COMPREPLY[*]}" != "$wanted" ]]; then
        echo "$*: completed to '${COMPREPLY[*]}', expected '$wanted'"
        failed=1
    fi
}

expect measure vx mea
expect polarity vx measure pol
expect --platform vx run --plat
expect HiFi2 vx run --platform Hi
expect HiFi2 vx run --platform = Hi
expect "Float HiFi2 iSST AIC326x" vx run --platform =
expect "" vx nonsense
cd "$(mktemp -d)" && touch 'a sound.wav' && expect "a sound.wav" vx run 'a s'
complete -p vx >/dev/null || failed=1
rm -f 'a sound.wav' && rmdir "$PWD"
exit $failed
