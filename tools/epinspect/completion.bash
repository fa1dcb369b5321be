# bash completion for epinspect: subcommands, options, kinds and file names, also those below --root.

# Offers the files ("-f") or folders ("-d") that $2 may become, as they lie below the folder $3.
_epinspect_files() {
    local path
    while IFS= read -r path; do
        [[ -d $path ]] && path+=/
        COMPREPLY+=("${path#"$3"}")
    done < <(compgen "$1" -- "$3$2")
}

_epinspect() {
    local word before command='' kind='' root='' files='' piece replaced pieces=() typed=() index
    local commands='list dump check usage collect map entry diff find locate owner read extent lun path help' kinds='tbl fri jnl map dat'
    local common='--root --verbose --help'
    COMPREPLY=()
    # The words as the shell will see them: bash breaks them at "=" and "@".
    # shellcheck disable=SC2162  # backslashes quote here
    read -a pieces <<<"${COMP_LINE:0:COMP_POINT}"
    [[ ${COMP_LINE:COMP_POINT-1:1} == ' ' ]] && pieces+=('')
    for piece in "${pieces[@]}"; do
        if [[ $piece == --*=* ]]; then
            typed+=("${piece%%=*}" "${piece#*=}")
        else
            typed+=("$piece")
        fi
    done
    word=${typed[-1]} before=${typed[-2]}
    for ((index = 1; index < ${#typed[@]} - 1; index++)); do
        case ${typed[index]} in
            --root) root=${typed[++index]} ;;
            --as | --first | --count | --luns | --extent | --pool | --offset | --length | --output) ((++index)) ;;
            --extent-size | --extent-address | --address-bits | --count-from) ((++index)) ;;
            -*) ;;
            *)
                if [[ -z $command ]]; then
                    command=${typed[index]}
                elif [[ $command == path ]]; then
                    kind=${kind:-${typed[index]}}
                fi
                ;;
        esac
    done

    local options=$common
    case $command in
        '') options="$commands $common --version" ;;
        help) options=$commands ;;
        list) options+=' --luns --json' ;;
        dump) options+=' --as --json' ;;
        check) options+=' --each --luns --extent-size --json' ;;
        usage) options+=' --luns --extent-size --address-bits --chart --json' ;;
        collect) options+=' --luns' ;;
        entry | lun) options+=' --json' ;;
        diff) options+=' --headers --entries --json' ;;
        find) options+=' --extent --pool --luns --json' ;;
        locate) options+=' --extent-size --address-bits --count-from --json' ;;
        owner) options+=' --extent-size --address-bits --count-from --luns --json' ;;
        read) options+=' --offset --length --output --json --extent-size --address-bits --count-from' ;;
        map) options+=' --first --count --chart --json' ;;
        extent) options+=' --extent-size --raw' ;;
        path)
            [[ -z $kind ]] && options="$kinds $common"
            [[ $kind == dat ]] && options+=' --extent-size --extent-address'
            ;;
    esac
    case $before in
        --as) options='tbl map dat fri jnl head' ;;
        --root) files=-d ;;
        --output) files=-f root='' ;;
        --address-bits) options='48 52' ;;
        --count-from) options='file volume' ;;
        --first | --count | --luns | --extent | --pool | --offset | --length | --extent-size | --extent-address) return ;;
        *) [[ $word == -* || -z $command || $command$kind =~ ^(help|list|lun|path|pathmap)$ ]] || files=-f ;;
    esac
    if [[ -z $files ]]; then
        mapfile -t COMPREPLY < <(compgen -W "$options" -- "$word")
        [[ $word != -* && ($command == lun || $kind == map) ]] && COMPREPLY=()
    else
        if [[ $files == -f && -n $root ]]; then
            root=${root/#\~/$HOME} root=${root%/}
            [[ $word == /* ]] || root+=/
            _epinspect_files -f "$word" "$root"
        fi
        [[ ${#COMPREPLY[@]} != 0 ]] || _epinspect_files "$files" "$word" ''
        [[ ${#COMPREPLY[@]} == 1 && ${COMPREPLY[0]} != */ ]] || compopt -o nospace
    fi
    # bash replaces no more than $2, the end of the word.
    # shellcheck disable=SC2162
    read replaced <<<"$2"
    for index in "${!COMPREPLY[@]}"; do
        printf -v "COMPREPLY[index]" %q "${COMPREPLY[index]#"${word%"$replaced"}"}"
    done
}
complete -F _epinspect epinspect
