# Completion of the command `coresystem` in fish: the command itself knows its words.
function __coresystem_complete
    set -l words (commandline -opc)
    for line in ($words[1] __complete $words[2..-1] (commandline -ct) 2>/dev/null)
        if test "$line" = :files
            __fish_complete_path (commandline -ct)
        else
            echo $line
        end
    end
end

complete -c coresystem -f -a '(__coresystem_complete)'
