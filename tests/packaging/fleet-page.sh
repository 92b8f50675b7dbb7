#!/usr/bin/env bash
# Carries out what a page shows: each command of its console blocks prints what stands
# below it, and "cat FILE" shows the file that the others use. The hosts of the page are
# real servers on this machine, with TLS, users and, behind one of them, no server.
# Usage: fleet-page.sh PROGRAM PAGE TREE
set -euo pipefail

program=$1
page=$2
tree=$3
directory=$(mktemp -d)
pids=()
# shellcheck disable=SC2317  # called by the trap
cleanup() {
    for pid in "${pids[@]}"; do
        kill "$pid" 2>/dev/null || true
        wait "$pid" 2>/dev/null || true
    done
    rm -rf "$directory"
}
trap cleanup EXIT
cd "$directory"
mkdir bin data
ln -s "$program" bin/cimdhcp
PATH=$directory/bin:$PATH
export ZR_LOG_SINK=none ZR_CONFIG=$directory/platform.conf NO_COLOR=1
touch platform.conf
printf 'DEVICE=eth0\nCONFIG_NAME=office\n' >data/ifcfg-eth0

openssl req -x509 -newkey ec -pkeyopt ec_paramgen_curve:prime256v1 -nodes -days 2 -subj /CN=test \
    -addext subjectAltName=IP:127.0.0.1 -keyout key.pem -out ca.pem 2>/dev/null
jq '.nodes[0].children[0].children |= .[0:1]' "$tree" >beta.json

substitutions=()
start() { # NAME TREE PASSWORD
    echo "$3" | cimdhcp user add --users "users-$1" --modify ada >/dev/null
    cimdhcp --tree "$2" --data-dir "$directory/data" serve --listen 127.0.0.1:0 --tls-cert ca.pem \
        --tls-key key.pem --users "users-$1" >"$1.log" 2>&1 &
    pids+=($!)
    local port=
    until port=$(sed -n 's#^Listening on https://127.0.0.1:\([0-9]*\)/cimom$#\1#p' "$1.log") &&
        [[ -n $port ]]; do
        kill -0 "$!" || {
            cat "$1.log"
            exit 1
        }
        sleep 0.05
    done
    substitutions+=("$1.example" "127.0.0.1:$port")
}
start alpha "$tree" "correct horse"
start beta beta.json secret
# Of the ports of the protocol suite, no server listens on this one here.
substitutions+=(gamma.example 127.0.0.1:1)

toReal() {
    local text index
    text=$(cat)
    for ((index = 0; index < ${#substitutions[@]}; index += 2)); do
        text=${text//${substitutions[index]}/${substitutions[index + 1]}}
    done
    printf '%s\n' "$text"
}
toPage() {
    local text index
    text=$(cat)
    for ((index = 0; index < ${#substitutions[@]}; index += 2)); do
        text=${text//${substitutions[index + 1]}/${substitutions[index]}}
    done
    printf '%s\n' "$text"
}

# The blocks as lines "$ COMMAND" and what stands below each.
console=$(awk '/^```console$/ { inside = 1; next } /^```$/ { inside = 0 } inside' "$page")
mapfile -t lines <<<"$console"
commands=()
outputs=()
for line in "${lines[@]}"; do
    if [[ $line == '$ '* ]]; then
        commands+=("${line#'$ '}")
        outputs+=("")
    else
        outputs[-1]+=$line$'\n'
    fi
done
[[ ${#commands[@]} -ge 7 ]]

# The files first: a page may show them late.
for index in "${!commands[@]}"; do
    if [[ ${commands[index]} == 'cat '* ]]; then
        file=${commands[index]#cat }
        toReal <<<"${outputs[index]}" >"$file"
        chmod 600 "$file"
    fi
done
failures=0
status=0
for index in "${!commands[@]}"; do
    command=${commands[index]}
    case $command in
        'cat '*) continue ;;
        'echo $?') found=$status ;;
        *)
            real=$(toReal <<<"$command")
            status=0
            bash -c "$real" >found 2>&1 || status=$?
            found=$(toPage <found)
            ;;
    esac
    # Which server responds first is not the page's to say.
    if diff <(sort <<<"${outputs[index]%$'\n'}") <(sort <<<"$found") >difference; then
        echo "ok: $command"
    else
        echo "FAILED: $command"
        cat difference
        failures=$((failures + 1))
    fi
done
exit $((failures > 0))
