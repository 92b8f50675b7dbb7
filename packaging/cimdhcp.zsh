#compdef cimdhcp
# Completion of cimdhcp for zsh: asks the program what may follow.

_cimdhcp() {
    local -a asked candidates shown
    local line word meaning
    local -a suffix
    asked=("${(@Q)words[2,CURRENT-1]}" "${(Q)PREFIX}")
    for line in "${(@f)$("${(Q)words[1]}" complete "${asked[@]}" 2>/dev/null)}"; do
        case $line in
            '') ;;
            :nospace) suffix=(-S '') ;;
            :file)
                compset -P '--*='
                _files
                return
                ;;
            :tree)
                compset -P '--*='
                _files -g '*.json'
                return
                ;;
            :directory)
                compset -P '--*='
                _files -/
                return
                ;;
            :host)
                compset -P '--*='
                _hosts
                return
                ;;
            *)
                word=${line%%$'\t'*}
                meaning=${line#"$word"}
                candidates+=("$word")
                shown+=("$word${meaning:+  -- ${meaning#$'\t'}}")
                ;;
        esac
    done
    compadd "${suffix[@]}" -d shown -a candidates
}

_cimdhcp "$@"
