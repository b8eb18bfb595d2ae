# bash completion for fxscan

_fxscan() {
    local current=${COMP_WORDS[COMP_CWORD]} previous=${COMP_WORDS[COMP_CWORD - 1]}
    COMPREPLY=()
    case $previous in
        --format)
            mapfile -t COMPREPLY < <(compgen -W 'table json csv' -- "$current")
            return
            ;;
        --timeout | --retry) return ;;
    esac
    if [[ $previous != --data-folder && $current == -* ]]; then
        mapfile -t COMPREPLY < <(compgen -W '--data-folder --format --help --in-process --list --quiet --retry
            --retry-failed --show-window --strict --timeout --version' -- "$current")
    else
        mapfile -t COMPREPLY < <(compgen -d -- "$current")
        compopt -o filenames
    fi
}

complete -F _fxscan fxscan
