# bash completion for vx: the program itself says what may follow, so the names of this machine's endpoints are among it.
_vx() {
    local word=${COMP_WORDS[COMP_CWORD]} words=("${COMP_WORDS[@]:1:COMP_CWORD}") candidate
    # The shell cuts --option=value into three words; vx wants one.
    if [[ $COMP_CWORD -ge 2 && $word == = ]]; then
        words=("${COMP_WORDS[@]:1:COMP_CWORD-2}" "${COMP_WORDS[COMP_CWORD - 1]}=")
        word=
    elif [[ $COMP_CWORD -ge 3 && ${COMP_WORDS[COMP_CWORD - 1]} == = ]]; then
        words=("${COMP_WORDS[@]:1:COMP_CWORD-3}" "${COMP_WORDS[COMP_CWORD - 2]}=$word")
    fi
    COMPREPLY=()
    while IFS= read -r candidate; do
        candidate=${candidate%$'\r'}
        if [[ $candidate == :files ]]; then
            compopt -o filenames 2>/dev/null
            while IFS= read -r candidate; do COMPREPLY+=("$candidate"); done < <(compgen -f -- "$word")
        else
            COMPREPLY+=("$(printf %q "$candidate")")
        fi
    done < <("${COMP_WORDS[0]}" complete -- "${words[@]}" 2>/dev/null)
}
complete -F _vx vx
