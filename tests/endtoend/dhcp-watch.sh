#!/usr/bin/env bash
# A real client gets a lease, gets another address, loses its link and gives the lease back, and
# then has one that it renews and that ends without a server, while "cimdhcp watch" runs on its
# machine: each of these is told once, in this order, and within 100 ms of the last of its signs,
# which are the kernel's message and what the client writes down; nine times that where other
# tests have the processors. What is late by itself waits for a look once a second, and is found
# out.
#
# It takes one and a half times the shortest lease that all clients accept, nearly all of it
# waiting.
#
# Usage: dhcp-watch.sh PATH-OF-cimdhcp CLIENT [SECONDS]
# CLIENT: one of the set-ups of dhcp-clients.sh; SECONDS: what an event may take instead, where
# the program is slow.
set -euo pipefail

program=$1
kind=$2
here=$(dirname "$0")
source "$here/dhcp-laboratory.sh"
source "$here/dhcp-clients.sh"

current=eth1
drops_address=yes
file_of_lease=
"set_up_$kind"
case $kind in
    dhclient) file_of_lease=$leases ;;
    udhcpc) file_of_lease=$state_file ;;
    dhcpcd) file_of_lease=/var/lib/dhcpcd/eth1.lease ;;
esac
limit=${3:-0.9}

in_client env TZ=UTC0 ip -o -ts monitor link address >"$work/kernel" 2>&1 &
disown  # its end is no news

# Each line with the moment at which it came.
watched=$work/watched
stamp() {
    local line
    while IFS= read -r line; do echo "$EPOCHREALTIME $line"; done >"$watched"
}
: >"$watched"
in_client env LC_ALL=C ZR_LOG_SINK=stderr ZR_DATA_DIR="$work/data" "$program" watch \
    > >(stamp) 2>"$work/told" &
watch=$!
eventually grep -q watching "$work/told" || fail "it does not watch: $(<"$work/told")"

explain() {
    echo "--- watched:"; cat "$watched" "$work/told"
    echo "--- the kernel:"; cat "$work/kernel"
    echo "--- the client:"; tail -30 "$work/client.log" || true
}
refuse() {
    explain
    fail "$@"
}

# begins EVENT: what is told and what the kernel says from here on are of this event.
begins() {
    moment=$1
    kernel_before=$(wc -l <"$work/kernel")
}
lines=0  # those of earlier events
has_come() { tail -n +$((lines + 1)) "$watched" | grep -Eq -- "$1"; }
# tells REGEX [PASSING]: a line matches, and those that came before it match the other one.
tells() {
    local wanted=$1 passing=${2:-} line
    eventually has_come "$wanted" || refuse "\"$wanted\" is not told"
    while IFS= read -r line; do
        lines=$((lines + 1))
        if [[ $line =~ $wanted ]]; then
            told_at=${line%% *}
            return
        fi
        [[ -n $passing && $line =~ $passing ]] || refuse "unexpected: $line"
    done < <(tail -n +$((lines + 1)) "$watched")
}
# The moments of an event's signs: of the first message of the kernel with the text since it
# began, of one that may be there or not, and of the client's last writing to its file.
signs=()
message_of() {
    tail -n +$((kernel_before + 1)) "$work/kernel" | grep -Em 1 -- "$1" | sed 's/^\[\([^]]*\)\].*/\1/'
}
kernel_may_say() {
    local time
    time=$(message_of "$1") || return 0
    signs+=("$(TZ=UTC0 date -d "$time" +%s.%6N)")
}
kernel_says() {
    eventually message_of "$1" || refuse "the kernel does not say \"$1\""
    kernel_may_say "$1"
}
client_writes() {
    signs+=("$(in_client stat -c %.Y "$file_of_lease")")
}
# in_time: it was told in time after the last of them. While other tests make or remove a
# thousand links, the kernel lets everyone wait who asks for links: that long an event may take
# besides.
in_time() {
    local delay wait
    read -r delay wait < <(printf '%s\n' "${signs[@]}" | sort -g |
        awk -v told="$told_at" 'NR == FNR { sign = $1; next }
            $2 > sign && $2 - $1 > wait { wait = $2 - $1 }
            END { printf "%.3f %.3f\n", told - sign, wait }' - "$work/waits")
    signs=()
    printf '%-20s %7s s\n' "$moment" "$delay"
    awk -v delay="$delay" -v limit="$limit" -v wait="$wait" \
        'BEGIN { exit !(delay < limit + wait) }' ||
        refuse "told $delay s after its sign, and the kernel lets wait for $wait s"
}
while :; do
    asked_at=$EPOCHREALTIME
    ip -n "$client" link show eth1 >/dev/null 2>&1 || break
    echo "$asked_at $EPOCHREALTIME"
    sleep 0.5
done >"$work/waits" &
disown  # it ends with the client's machine
server_listens() { [[ -n $(in_server ss -Huln 'sport = :67') ]]; }
# What passes by while a client asks for an address, or starts again.
asking='-> (asking|off)|(asking|off) -> '

# The server is in the client's file, which a busy machine may write some time after the address.
leased='198\.51\.100\.1[0-9]*'
start_server
begins "a lease"
start_client
tells "(-> bound $leased|bound $leased ->) from 198\.51\.100\.1\$" "$asking|-> bound $leased\$"
address=$(kernel_address)
kernel_says " inet $address/"
client_writes
in_time

stop_server
rm -f "$work/server.leases"
range=198.51.100.200,198.51.100.220
start_server
# A request to renew that finds none is not repeated soon.
eventually server_listens || refuse "no server: $(<"$work/dnsmasq.log")"
begins "another address"
if declare -F ask_anew >/dev/null; then ask_anew; else renew_client; fi
leased='198\.51\.100\.2[0-9]*'
tells "(-> (bound )?$leased|bound $leased ->) from 198\.51\.100\.1\$" \
    "$asking|-> (bound )?$leased\$"
former=$address
address=$(kernel_address)
[[ $address != "$former" ]] || refuse "it has the same address"
kernel_says " inet $address/"
client_writes
in_time

begins "link down"
ip -n "$client" link set eth1 down
tells "bound $address -> no link"
kernel_says 'eth1.* state DOWN'
in_time
begins "link up"
ip -n "$client" link set eth1 up
tells "-> bound $address" "no link -> |$asking"
kernel_says 'eth1.* state UP'
kernel_may_say " inet $address/"
in_time

begins "released"
stop_client
tells "bound $address -> "
kernel_says "Deleted.* inet $address/"
in_time

stop_server
start_short_server
begins "a short lease"
start_client
leased='198\.51\.100\.1[0-9]*'
tells "(-> bound $leased|bound $leased ->) from 198\.51\.100\.1\$" '-> '
address=$(kernel_address)
kernel_says " inet $address/"
client_writes
in_time
begins "renewed"
tells "bound $address, renewed until |(renewing|rebinding|expired) $address -> bound" \
    '-> (renewing|rebinding|expired)'
kernel_may_say " inet $address/"
client_writes
in_time
begins "expired"
stop_short_server
# By what was written down, in whole seconds, the lease may end some moments before its client
# takes the address away, and be unknown meanwhile.
tells '-> asking$' '-> (renewing|rebinding|expired|\?)|\? -> bound'
kernel_says "Deleted.* inet $address/"
in_time

kill_processes KILL "${processes[@]}"
kill -INT "$(pids_of cimdhcp)"
wait "$watch" || fail "it ends with status $?"
echo "ok"
