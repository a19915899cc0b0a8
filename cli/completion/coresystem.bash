# Completion of the command `coresystem` in bash: the command itself knows its words.
_coresystem()
{
    # bash takes "--device=x" and "a.b=x" for three words.
    local words=() i typed=${COMP_WORDS[COMP_CWORD]} word meaning
    for ((i = 1; i <= COMP_CWORD; i++)); do
        if ((i > 1)) && [[ ${COMP_WORDS[i]} == = || ${COMP_WORDS[i-1]} == = ]]; then
            words[-1]+=${COMP_WORDS[i]}
        else
            words+=("${COMP_WORDS[i]}")
        fi
    done
    [[ $typed == = ]] && typed=
    local kept=${words[-1]%"$typed"} # stands on the line already
    COMPREPLY=()
    while IFS=$'\t' read -r word meaning; do
        if [[ $word == :files ]]; then
            compopt -o filenames 2>/dev/null
            mapfile -t -O ${#COMPREPLY[@]} COMPREPLY < <(compgen -f -- "$typed")
        elif [[ $word == :commands ]]; then
            mapfile -t -O ${#COMPREPLY[@]} COMPREPLY < <(compgen -c -- "$typed")
        else
            [[ $word == *= ]] && compopt -o nospace 2>/dev/null
            COMPREPLY+=("${word#"$kept"}")
        fi
    done < <("${COMP_WORDS[0]}" __complete "${words[@]}" 2>/dev/null)
}

complete -F _coresystem coresystem
