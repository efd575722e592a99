# Completion of tarnctl for fish: the tool itself knows what can follow.
function __tarnctl_offers
    set -l words (commandline -opc) (commandline -ct)
    for line in ($words[1] complete -- $words[2..] 2>/dev/null)
        if test $line = :files
            __fish_complete_path (commandline -ct)
        else
            echo $line
        end
    end
end

complete -c tarnctl -f -a '(__tarnctl_offers)'
