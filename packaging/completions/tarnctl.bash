# Completion of tarnctl for bash.
_tarnctl() {
    local current=${COMP_WORDS[COMP_CWORD]} previous=${COMP_WORDS[COMP_CWORD-1]} verb="" index
    for ((index = 1; index < COMP_CWORD; index++)); do
        case ${COMP_WORDS[index]} in
            --socket) ((index++)) ;;
            -*) ;;
            *) verb=${COMP_WORDS[index]}; break ;;
        esac
    done
    COMPREPLY=()
    case $previous in
        --socket) compopt -o default; return ;;
        --rate | --from) return ;;
    esac
    local options files=no
    case $verb in
        "") options="--help --version --socket"
            [[ $current == -* ]] || options="play info send" ;;
        play) options="--rate --from --grant --help"; files=yes ;;
        info) options="--json --grant --help"; files=yes ;;
        send) options="--json --follow --help"
              [[ $current == -* ]] || options="grant wait $(tarnctl send --help 2>/dev/null |
                  grep -oE '^  [A-Za-z]+\.[A-Za-z]+')" ;;
    esac
    if [[ $files == yes && $current != -* ]]; then
        compopt -o default
    else
        mapfile -t COMPREPLY < <(compgen -W "$options" -- "$current")
    fi
}
complete -F _tarnctl tarnctl
