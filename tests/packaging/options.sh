#!/usr/bin/env bash
# Compares the options that the program's help tells with those of its manual page and those
# that it offers to shells: each knows all of them, and no other.
# Usage: options.sh PROGRAM MANUAL_PAGE
set -euo pipefail

program=$1
manual=$2
commands=(show watch rename graph tree check classes names instances describe get modify
    associators references serve "user add" profiles metrics exporter help)

# Long options, one per line.
options() { grep -oE -e '(^|[^a-zA-Z0-9-])--[a-z][a-z-]*[a-z]' | sed 's/^[^-]*//' | LC_ALL=C sort -u; }

failures=0
compare() { # WHAT EXPECTED FOUND
    if difference=$(diff <(echo "$2") <(echo "$3")); then
        echo "ok: $1"
    else
        echo "FAILED: $1"
        echo "$difference"
        failures=$((failures + 1))
    fi
}

# The options of the program as a whole; what the examples show is among them.
general=$("$program" --help | sed -n '/^Options:/,/^PATH names/p' | grep -E '^ +-' | options)
[[ $(wc -l <<<"$general") -ge 20 ]]
all=$general
for command in "${commands[@]}"; do
    # shellcheck disable=SC2086
    own=$("$program" $command --help | grep -E '^ +-' | options)
    all+=$'\n'$own
    # What the shell completes behind the command.
    # shellcheck disable=SC2086
    completed=$("$program" complete $command -- | cut -f 1 | options)
    compare "completion of $command" "$(printf '%s\n%s\n' "$general" "$own" | LC_ALL=C sort -u)" \
        "$completed"
done
# Roff writes a hyphen that is to be copied with a backslash.
page=$(sed 's/\\-/-/g' "$manual")
compare "manual page" "$(LC_ALL=C sort -u <<<"$all")" "$(options <<<"$page")"
for command in "${commands[@]}"; do
    grep -qE "^\.(B|BI|BR) \"?$command( |$)" <<<"$page" || {
        echo "FAILED: the manual page does not tell about $command"
        failures=$((failures + 1))
    }
done
exit $((failures > 0))
