# Completion of the command `coresystem` in bash.

# The words of one completion: options that every command takes, and the command's own.
_coresystem_words()
{
    local global='--device --verbose --help'
    case $1 in
    '') echo "info get network serial sim package storage watch country log doctor --version $global" ;;
    info | sim) echo "--reveal --json $global" ;;
    country | doctor | network | serial | package | watch) echo "--json $global" ;;
    storage) echo "--at-least --json $global" ;;
    get) echo "$("$2" get --list 2>/dev/null) --list --json $global" ;;
    log) echo "decipher $global" ;;
    decipher) echo "--key $global" ;;
    esac
}

_coresystem()
{
    local current=${COMP_WORDS[COMP_CWORD]} command='' i
    COMPREPLY=()
    case ${COMP_WORDS[COMP_CWORD - 1]} in
    --device | --key)
        compopt -o filenames 2>/dev/null
        mapfile -t COMPREPLY < <(compgen -f -- "$current")
        return
        ;;
    esac
    for ((i = 1; i < COMP_CWORD; i++)); do
        case ${COMP_WORDS[i]} in
        --device | --key | --at-least) ((i++)) ;;
        -*) ;;
        info | get | network | serial | sim | package | storage | watch | country | log | doctor)
            [[ -z $command ]] && command=${COMP_WORDS[i]}
            ;;
        decipher) [[ $command == log ]] && command=decipher ;;
        esac
    done
    mapfile -t COMPREPLY < <(compgen -W "$(_coresystem_words "$command" "${COMP_WORDS[0]}")" -- "$current")
}

complete -F _coresystem coresystem
