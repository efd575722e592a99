# Completion of tarnctl for fish.
set -l verbs play info send

function __tarnctl_commands
    printf '%s\n' grant wait
    tarnctl send --help 2>/dev/null | string match -rg '^  ([A-Za-z]+\.[A-Za-z]+)'
end

complete -c tarnctl -n "not __fish_seen_subcommand_from $verbs" -f
complete -c tarnctl -n "not __fish_seen_subcommand_from $verbs" -l help -d 'Show help'
complete -c tarnctl -n "not __fish_seen_subcommand_from $verbs" -l version -d 'Show the version'
complete -c tarnctl -n "not __fish_seen_subcommand_from $verbs" -l socket -rF -d 'Where the service listens'
complete -c tarnctl -n "not __fish_seen_subcommand_from $verbs" -a play -d 'Play files one after the other'
complete -c tarnctl -n "not __fish_seen_subcommand_from $verbs" -a info -d 'Show what the service reads from files'
complete -c tarnctl -n "not __fish_seen_subcommand_from $verbs" -a send -d 'Send commands, print answers and events'

complete -c tarnctl -n '__fish_seen_subcommand_from play' -l rate -x -d 'How fast'
complete -c tarnctl -n '__fish_seen_subcommand_from play' -l from -x -d 'Where to begin'
complete -c tarnctl -n '__fish_seen_subcommand_from play info' -l grant -d 'Hand the open files over'
complete -c tarnctl -n '__fish_seen_subcommand_from info send' -l json -d 'Print JSON'
complete -c tarnctl -n '__fish_seen_subcommand_from send' -l follow -d 'Go on printing events'
complete -c tarnctl -n '__fish_seen_subcommand_from send' -f -a '(__tarnctl_commands)'
