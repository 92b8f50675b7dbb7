# Completion of cimdhcp for bash.

_cimdhcp() {
    local word=${COMP_WORDS[COMP_CWORD]} before=${COMP_WORDS[COMP_CWORD - 1]}
    local options='--tree --data-dir --namespace --format --schema-dir --registration-dir
        --provider-dir --version --help'
    local commands='show rename graph tree check classes names instances get modify associators
        references serve user'
    local command='' position=0 index
    COMPREPLY=()

    # The command, and how many words stand behind it already.
    for ((index = 1; index < COMP_CWORD; ++index)); do
        case ${COMP_WORDS[index]} in
            --tree | --data-dir | --namespace | --format | --*-dir | --*-class | --role | --result-role | --listen | --tls-* | --users)
                ((++index))
                ;;
            -*) ;;
            *)
                if [[ -z $command ]]; then
                    command=${COMP_WORDS[index]}
                else
                    ((++position))
                fi
                ;;
        esac
    done

    case $before in
        --format)
            mapfile -t COMPREPLY < <(compgen -W 'table mof json' -- "$word")
            return
            ;;
        --tls-cert | --tls-key | --users)
            mapfile -t COMPREPLY < <(compgen -f -- "$word")
            return
            ;;
        --tree)
            mapfile -t COMPREPLY < <(compgen -o plusdirs -f -X '!*.json' -- "$word")
            return
            ;;
        --data-dir | --schema-dir | --registration-dir | --provider-dir)
            mapfile -t COMPREPLY < <(compgen -d -- "$word")
            return
            ;;
        --assoc-class | --result-class)
            command=names position=0
            ;;
        --namespace | --role | --result-role) return ;;
    esac

    if [[ $word == -* ]]; then
        case $command in
            rename) options+=' --create' ;;
            graph) options+=' --svg' ;;
            tree) options+=' --explain' ;;
            serve) options+=' --listen --tls-cert --tls-key --users --read-only' ;;
            user) options+=' --users --modify' ;;
            associators) options+=' --names --assoc-class --result-class --role --result-role' ;;
            references) options+=' --names --result-class --role' ;;
        esac
        mapfile -t COMPREPLY < <(compgen -W "$options" -- "$word")
        return
    fi
    case $command:$position in
        :*) mapfile -t COMPREPLY < <(compgen -W "$commands" -- "$word") ;;
        user:0) mapfile -t COMPREPLY < <(compgen -W add -- "$word") ;;
        names:0 | instances:0)
            mapfile -t COMPREPLY < <(compgen -W \
                "$("${COMP_WORDS[0]}" classes 2>/dev/null | awk 'NR > 1 { print $1 }')" -- "$word")
            ;;
        rename:0)
            mapfile -t COMPREPLY < <(compgen -W \
                "$("${COMP_WORDS[0]}" names QVXZR_DHCPSettingData 2>/dev/null |
                    sed -n 's/.*InstanceID="[^%]*%\(.*\)"$/\1/p')" -- "$word")
            ;;
    esac
}
complete -F _cimdhcp cimdhcp
