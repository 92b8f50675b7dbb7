# Completion of cimdhcp for bash.

_cimdhcp() {
    local word=${COMP_WORDS[COMP_CWORD]} before=${COMP_WORDS[COMP_CWORD - 1]}
    local options='--tree --data-dir --namespace --format --connect --hosts --parallel --timeout
        --credentials --cacert --insecure --no-header --sort --count --time --color --schema-dir
        --registration-dir --provider-dir --cim-schema --exact --version --help'
    local commands='show watch rename graph tree check classes names instances get modify
        associators references serve user profiles metrics exporter'
    # What the program is asked for completions with: the same servers, if there are any.
    local asked=("${COMP_WORDS[0]}")
    local command='' position=0 index
    COMPREPLY=()

    # The command, and how many words stand behind it already.
    for ((index = 1; index < COMP_CWORD; ++index)); do
        case ${COMP_WORDS[index]} in
            --connect | --credentials | --cacert)
                asked+=("${COMP_WORDS[index]}" "${COMP_WORDS[index + 1]}")
                ((++index))
                ;;
            --tree | --data-dir | --namespace | --format | --hosts | --parallel | --timeout | --sort | --color | --*-dir | --*-class | --role | --result-role | --listen | --tls-* | --users | --config | --output | --max-* | --workers | --io-threads | --*-timeout | --poll | --subscriptions | --listener-cacert | --delivery-retries | --retry-interval | --give-up-after)
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
    # A server that is slow must not make the shell wait.
    if [[ ${asked[*]} == *--connect* ]]; then
        asked+=(--timeout 2)
    fi

    case $before in
        --format)
            mapfile -t COMPREPLY < <(compgen -W 'table mof json' -- "$word")
            return
            ;;
        --color)
            mapfile -t COMPREPLY < <(compgen -W 'auto always never' -- "$word")
            return
            ;;
        --tls-cert | --tls-key | --users | --config | --output | --hosts | --credentials | --cacert)
            mapfile -t COMPREPLY < <(compgen -f -- "$word")
            return
            ;;
        --connect)
            mapfile -t COMPREPLY < <(compgen -A hostname -- "$word")
            return
            ;;
        --sort)
            case $command in
                show) mapfile -t COMPREPLY < <(compgen -W 'system interface dhcp state address
                    servers configuration-name' -- "$word") ;;
                profiles) mapfile -t COMPREPLY < <(compgen -W 'organization profile version
                    instances' -- "$word") ;;
                classes) mapfile -t COMPREPLY < <(compgen -W 'class superclass kind provider' \
                    -- "$word") ;;
                *) mapfile -t COMPREPLY < <(compgen -W 'PATH' -- "$word") ;;
            esac
            return
            ;;
        --tree)
            mapfile -t COMPREPLY < <(compgen -o plusdirs -f -X '!*.json' -- "$word")
            return
            ;;
        --cim-schema)
            mapfile -t COMPREPLY < <(compgen -o plusdirs -f -X '!*.mof' -- "$word")
            return
            ;;
        --data-dir | --schema-dir | --registration-dir | --provider-dir | --subscriptions)
            mapfile -t COMPREPLY < <(compgen -d -- "$word")
            return
            ;;
        --assoc-class | --result-class)
            command=names position=0
            ;;
        --namespace | --role | --result-role | --parallel | --timeout | --listen | --max-* | --workers | --io-threads | --*-timeout | --poll | --delivery-retries | --retry-interval | --give-up-after)
            return
            ;;
    esac

    if [[ $word == -* ]]; then
        case $command in
            watch) options+=' --poll --listen' ;;
            rename) options+=' --create --force' ;;
            graph) options+=' --svg' ;;
            tree) options+=' --explain' ;;
            serve) options+=' --listen --tls-cert --tls-key --users --read-only --metrics --max-header-line
                --max-headers --max-body --max-depth --max-connections --max-connections-each
                --max-connection-rate --max-checks-each --max-refusals-each --max-memory --max-waiting
                --max-stuck --max-result --max-enumerations --max-enumerations-each --workers
                --io-threads --head-timeout --request-timeout --answer-timeout --enumeration-timeout
                --max-enumeration-timeout --subscriptions --listener-cacert
                --max-filters --max-listeners --max-subscriptions --max-queue --delivery-retries
                --retry-interval --listener-timeout --give-up-after' ;;
            user) options+=' --users --modify' ;;
            metrics) options+=' --output' ;;
            exporter) options+=' --config --listen --tls-cert --tls-key --users --check' ;;
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
                "$("${asked[@]}" classes 2>/dev/null | awk 'NR > 1 { print $1 }')" -- "$word")
            ;;
        rename:0 | watch:*)
            mapfile -t COMPREPLY < <(compgen -W \
                "$("${asked[@]}" names QVXZR_DHCPSettingData 2>/dev/null |
                    sed -n 's/.*InstanceID="[^%]*%\(.*\)"$/\1/p')" -- "$word")
            ;;
    esac
}
complete -F _cimdhcp cimdhcp
