# Completion of tarnctl for bash: the tool itself knows what can follow.
_tarnctl() {
    local line
    COMPREPLY=()
    while IFS= read -r line; do
        case $line in
            :files) compopt -o default ;;
            *) COMPREPLY+=("${line%%$'\t'*}") ;;
        esac
    done < <("${COMP_WORDS[0]}" complete -- "${COMP_WORDS[@]:1:COMP_CWORD}" 2>/dev/null)
}
complete -F _tarnctl tarnctl
