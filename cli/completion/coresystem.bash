# Completion of the command `coresystem` in bash: the command itself knows its words.
_coresystem()
{
    local current=${COMP_WORDS[COMP_CWORD]} word meaning
    COMPREPLY=()
    while IFS=$'\t' read -r word meaning; do
        if [[ $word == :files ]]; then
            compopt -o filenames 2>/dev/null
            mapfile -t -O ${#COMPREPLY[@]} COMPREPLY < <(compgen -f -- "$current")
        else
            [[ $word == *= ]] && compopt -o nospace 2>/dev/null
            COMPREPLY+=("$word")
        fi
    done < <("${COMP_WORDS[0]}" __complete "${COMP_WORDS[@]:1:COMP_CWORD}" 2>/dev/null)
}

complete -F _coresystem coresystem
