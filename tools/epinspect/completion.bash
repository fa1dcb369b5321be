# bash completion for epinspect: subcommands, options, kinds and file names.
_epinspect() {
    local word=$2 previous=$3 command='' kind='' index
    local commands='dump entry map extent lun path'
    local common='--root --verbose --help'
    COMPREPLY=()
    for ((index = 1; index < COMP_CWORD; index++)); do
        if [[ ${COMP_WORDS[index - 1]} == --root ]]; then
            continue
        elif [[ -z $command && " $commands " == *" ${COMP_WORDS[index]} "* ]]; then
            command=${COMP_WORDS[index]}
        elif [[ $command == path && " tbl fri jnl dat map " == *" ${COMP_WORDS[index]} "* ]]; then
            kind=${kind:-${COMP_WORDS[index]}}
        fi
    done

    case $previous in
        --as) mapfile -t COMPREPLY < <(compgen -W 'tbl map dat fri jnl head' -- "$word") && return ;;
        --root)
            compopt -o filenames
            mapfile -t COMPREPLY < <(compgen -d -- "$word")
            return
            ;;
        --first | --count | --extent-size | --extent-address) return ;;
    esac

    local options=$common
    case $command in
        '') options="$commands $common --version" ;;
        dump) options+=' --as --json' ;;
        entry | lun) options+=' --json' ;;
        map) options+=' --first --count --chart --json' ;;
        extent) options+=' --extent-size --raw' ;;
        path)
            [[ -z $kind ]] && options="tbl fri jnl dat map $common"
            [[ $kind == dat ]] && options+=' --extent-size --extent-address'
            ;;
    esac
    if [[ $word == -* || -z $command || ($command == path && -z $kind) ]]; then
        mapfile -t COMPREPLY < <(compgen -W "$options" -- "$word")
    elif [[ $command != lun && $kind != map ]]; then
        compopt -o filenames
        mapfile -t COMPREPLY < <(compgen -f -- "$word")
    fi
}
complete -F _epinspect epinspect
