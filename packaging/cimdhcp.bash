# Completion of cimdhcp for bash: asks the program what may follow.

# The text of a word without its quotes, into the variable "plain".
_cimdhcp_unquote() {
    local word=$1 quote='' index letter
    plain=''
    for ((index = 0; index < ${#word}; ++index)); do
        letter=${word:index:1}
        if [[ -n $quote && $letter == "$quote" ]]; then
            quote=''
        elif [[ -z $quote && $letter == [\'\"] ]]; then
            quote=$letter
        elif [[ $quote != "'" && $letter == \\ ]]; then
            plain+=${word:++index:1}
        else
            plain+=$letter
        fi
    done
}

_cimdhcp() {
    local rest=$COMP_LINE raw=() words=() plain word index line quote=''
    COMPREPLY=()

    # Bash breaks words at "=" and ":", too; the program wants them whole.
    for ((index = 0; index <= COMP_CWORD; ++index)); do
        word=${COMP_WORDS[index]}
        if ((index == 0)) || [[ $rest == [[:blank:]]* ]]; then
            rest=${rest#"${rest%%[![:blank:]]*}"}
            raw+=("$word")
        else
            raw[-1]+=$word
        fi
        rest=${rest#"$word"}
    done
    for word in "${raw[@]:1}"; do
        _cimdhcp_unquote "$word"
        words+=("$plain")
    done

    # What bash puts a candidate in place of: the part behind the last break, or quote.
    local own=${COMP_WORDS[COMP_CWORD]}
    [[ $own == [\'\"]* ]] && quote=${own:0:1}
    [[ $own == [=:] ]] && own=''
    _cimdhcp_unquote "$own"
    own=$plain
    local before=${words[-1]%"$own"}

    while IFS= read -r line; do
        case $line in
            :nospace) compopt -o nospace ;;
            :file)
                compopt -o filenames
                mapfile -t COMPREPLY < <(compgen -f -- "$own")
                ;;
            :tree)
                compopt -o filenames
                mapfile -t COMPREPLY < <(compgen -o plusdirs -f -X '!*.json' -- "$own")
                ;;
            :directory)
                compopt -o filenames
                mapfile -t COMPREPLY < <(compgen -d -- "$own")
                ;;
            :host) mapfile -t COMPREPLY < <(compgen -A hostname -- "$own") ;;
            *)
                word=${line%%$'\t'*}
                word=${word#"$before"}
                if [[ $quote == '"' ]]; then
                    word=${word//\\/\\\\}
                    word=${word//\"/\\\"}
                elif [[ -z $quote && $word == *[!a-zA-Z0-9_./:=,%+@-]* ]]; then
                    word="'${word//\'/\'\\\'\'}'"
                fi
                COMPREPLY+=("$word")
                ;;
        esac
    done < <("${COMP_WORDS[0]/#\~/$HOME}" complete "${words[@]}" 2>/dev/null)
}
complete -F _cimdhcp cimdhcp
