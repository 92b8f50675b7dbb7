#!/usr/bin/env bash
# systemd-networkd with leases of both protocols, and a system bus at which it can be
# asked: of all clients it alone tells the address of a DHCPv6 server.
#
# Usage: dhcp6-networkd.sh PATH-OF-cimdhcp
set -euo pipefail

program=$1
source "$(dirname "$0")/dhcp-laboratory.sh"
networkd=/lib/systemd/systemd-networkd
for tool in dbus-daemon $networkd; do
    command -v "$tool" >/dev/null || { echo "needs $tool"; exit 1; }
done

in_server ip address add 2001:db8:99::1/64 dev zrs$$ nodad
start_server --enable-ra --dhcp-range=2001:db8:99::100,2001:db8:99::1ff,64,10m
link_local=$(ip -n "$server" -j -6 address show dev zrs$$ |
    jq -r '[.[].addr_info[] | select(.scope == "link") | .local][0]')

in_client mkdir -p /run/dbus /run/systemd/network /run/systemd/netif/links \
    /run/systemd/netif/leases /run/systemd/netif/lldp
in_client chown -R systemd-network: /run/systemd/netif
in_client tee /run/systemd/network/10-eth1.network >/dev/null <<'FILE'
[Match]
Name=eth1
[Network]
DHCP=yes
FILE
in_client dbus-daemon --system --nofork --nopidfile </dev/null >"$work/bus.log" 2>&1 &
eventually in_client test -S /run/dbus/system_bus_socket || fail "no bus: $(<"$work/bus.log")"
in_client env container=laboratory $networkd </dev/null >"$work/client.log" 2>&1 &

both() {
    [[ $(value DHCPServerAddresses) == "[\"198.51.100.1\",\"$link_local\"]" ]]
}
explain() {
    echo "--- the program:"; cimdhcp tree --explain
    echo "--- the kernel:"; ip -n "$client" address show dev eth1
    echo "--- networkd:"; in_client networkctl --no-pager status eth1; tail -20 "$work/client.log"
}
eventually both || { explain; fail "not both servers, 198.51.100.1 and $link_local"; }
[[ $(seen DHCPEnabled) == true && $(seen AddressSource) == 1 ]] || { explain; fail "no DHCP"; }
# On a busy machine, networkd may once have no time to respond.
shows_server() {
    [[ $(cimdhcp show 2>&1) == *"$link_local"* ]]
}
eventually shows_server || { explain; fail "cimdhcp show lacks $link_local"; }
expect 'systemd-networkd /run/systemd/netif/leases/' cimdhcp tree --explain

# Without the bus, the state files are what is left.
bus=$(for pid in $(ip netns pids "$client"); do
    [[ $(<"/proc/$pid/comm") != dbus-daemon ]] || echo "$pid"
done)
kill "$bus"
only_files() {
    [[ $(value DHCPServerAddresses) == '["198.51.100.1"]' ]]
}
eventually only_files || { explain; fail "without the bus it is not the state files that count"; }
echo "passed"
