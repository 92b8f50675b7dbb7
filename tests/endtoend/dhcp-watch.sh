#!/usr/bin/env bash
# A real client gets a lease, renews it, loses its link and gives the lease back, while
# "cimdhcp watch" runs on its machine: each of these is one line, in this order.
#
# Usage: dhcp-watch.sh PATH-OF-cimdhcp
set -euo pipefail

program=$1
source "$(dirname "$0")/dhcp-laboratory.sh"
need dhclient
start_server

# The client's hook sets the address and nothing else.
cat >"$work/hook" <<'HOOK'
#!/bin/sh
case $reason in
    BOUND | RENEW | REBIND | REBOOT)
        ip address replace "$new_ip_address/24" dev "$interface" \
            valid_lft "$new_dhcp_lease_time" preferred_lft "$new_dhcp_lease_time" ;;
    RELEASE | EXPIRE | STOP) ip address flush dev "$interface" scope global ;;
    PREINIT) ip link set "$interface" up ;;
esac
HOOK
chmod 755 "$work/hook"
dhclient() {
    in_client dhclient -q -pf "$work/dhclient.pid" -sf "$work/hook" \
        -lf /var/lib/dhcp/dhclient.eth1.leases "$@" eth1 >>"$work/dhclient.log" 2>&1
}

watched=$work/watched
in_client env LC_ALL=C ZR_LOG_SINK=stderr ZR_DATA_DIR="$work/data" "$program" watch \
    >"$watched" 2>"$work/told" &
watch=$!
eventually grep -q watching "$work/told" || fail "it does not watch: $(<"$work/told")"

# next TEXT: a further line comes, and it ends with the text; lines before it, of what passes
# by, are none of another kind than those given.
lines=0
next() {
    local wanted=$1 passing=${2:-}
    eventually eval '[[ $(tail -n +$((lines + 1)) "$watched") == *"$wanted"* ]]' ||
        fail "\"$wanted\" is not among: $(<"$watched") $(<"$work/told") $(<"$work/dhclient.log")"
    local line
    while read -r line; do
        lines=$((lines + 1))
        [[ $line != *"$wanted"* ]] || return 0
        [[ -n $passing && $line == *"$passing"* ]] || fail "unexpected: $line"
    done < <(tail -n +$((lines + 1)) "$watched")
}

dhclient -1
address=$(kernel_address)
[[ -n $address ]] || fail "no address: $(<"$work/dhclient.log")"
next "-> bound $address" "asking"
eventually grep -q "from 198.51.100.1$" "$watched" || fail "no server: $(<"$watched")"
lines=$(wc -l <"$watched")

# The same lease again, a second later at least.
sleep 2
kill "$(pids_of dhclient)"
eventually not_running dhclient
dhclient -1
next "bound $address, renewed until "

ip -n "$client" link set eth1 down
next "bound $address -> no link"
ip -n "$client" link set eth1 up
next "no link -> bound $address"

dhclient -r
next "bound $address -> " "->"
sleep 1
[[ $(grep -c "renewed" "$watched") == 1 ]] || fail "renewed more than once: $(<"$watched")"

pid=$(pids_of cimdhcp)
kill -INT "$pid"
wait "$watch" || fail "it ends with status $?"
echo "ok"
