# Completion of the command `coresystem` in fish: the command itself knows its words.
function __coresystem_complete
    set -l words (commandline -opc)
    for line in ($words[1] __complete $words[2..-1] (commandline -ct) 2>/dev/null)
        if test "$line" = :files
            set -l typed (string match -r '^(--[a-z-]*=)?(.*)$' -- (commandline -ct))
            for path in (__fish_complete_path $typed[-1])
                echo $typed[2]$path
            end
        else if test "$line" = :commands
            __fish_complete_command
        else
            echo $line
        end
    end
end

complete -c coresystem -f -a '(__coresystem_complete)'
