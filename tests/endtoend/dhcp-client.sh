#!/usr/bin/env bash
# A real DHCP server (dnsmasq) and a real client (ISC dhclient) on the two ends of a
# veth pair, each in a network namespace of its own, and the real program in the
# client's. What it shows is compared with what the kernel and the server say.
#
# Usage: dhcp-client.sh PATH-OF-cimdhcp
set -euo pipefail

program=$1
for tool in ip dnsmasq dhclient; do
    command -v "$tool" >/dev/null || PATH=$PATH:/usr/sbin:/sbin
    command -v "$tool" >/dev/null || { echo "needs $tool"; exit 1; }
done
[[ $EUID == 0 ]] || { echo "needs root: makes network namespaces"; exit 1; }

server=zr-server-$$
client=zr-client-$$
work=$(mktemp -d)
dnsmasq_pid=

cleanup() {
    [[ -f $work/dhclient.pid ]] && kill "$(<"$work/dhclient.pid")" 2>/dev/null || true
    [[ -n $dnsmasq_pid ]] && kill "$dnsmasq_pid" 2>/dev/null || true
    ip netns delete "$client" 2>/dev/null || true
    ip netns delete "$server" 2>/dev/null || true
    rm -rf "$work"
}
trap cleanup EXIT

fail() {
    echo "FAILED: $*"
    exit 1
}

# expect TEXT COMMAND...: the command's output has the text.
expect() {
    local text=$1 output
    shift
    output=$("$@" 2>&1) || fail "$* answers status $?: $output"
    [[ $output == *"$text"* ]] || fail "$* lacks \"$text\": $output"
}

ip netns add "$server"
ip netns add "$client"
ip link add zrs$$ netns "$server" type veth peer name eth1 netns "$client"
ip -n "$server" address add 198.51.100.1/24 dev zrs$$
ip -n "$server" link set zrs$$ up
ip -n "$client" link set lo up
ip -n "$client" link set eth1 up

ip netns exec "$server" dnsmasq --keep-in-foreground --conf-file=/dev/null --port=0 \
    --interface=zrs$$ --bind-interfaces --dhcp-authoritative --no-ping --user=root \
    --dhcp-range=198.51.100.100,198.51.100.150,255.255.255.0,10m \
    --dhcp-leasefile="$work/server.leases" --pid-file="$work/dnsmasq.pid" >"$work/dnsmasq.log" 2>&1 &
dnsmasq_pid=$!

# The client sees a host of its own: its leases, resolver and configuration files
# are in the test's folder. The client's hook sets the address and nothing else.
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
mkdir "$work/data" "$work/leases"
in_client() {
    ip netns exec "$client" unshare --mount sh -c '
        mount --bind "$1" /var/lib/dhcp && shift && exec "$@"' sh "$work/leases" "$@"
}
cimdhcp() {
    in_client env ZR_LOG_SINK=stderr ZR_DATA_DIR="$work/data" "$program" "$@"
}

[[ -d /var/lib/dhcp ]] || mkdir -p /var/lib/dhcp
# Before there is a client, nothing uses DHCP (and a veth end without an address is no
# interface of the computer).
output=$(cimdhcp instances QVXZR_DHCPProtocolEndpoint)
[[ $output != *eth1* ]] || fail "an endpoint without a client: $output"

in_client dhclient -1 -q -pf "$work/dhclient.pid" -sf "$work/hook" \
    -lf /var/lib/dhcp/dhclient.eth1.leases eth1 >"$work/dhclient.log" 2>&1 ||
    fail "dhclient: $(<"$work/dhclient.log") $(<"$work/dnsmasq.log")"
address=$(ip -n "$client" -4 -o address show dev eth1 scope global | awk '{print $4}' | cut -d/ -f1)
[[ -n $address ]] || fail "the client has no address"

endpoint=QVXZR_DHCPProtocolEndpoint
expect 'EnabledState            = 2 (Enabled)' cimdhcp instances $endpoint
expect 'ClientState             = 8 (Bound)' cimdhcp instances $endpoint
expect '"ClientState":{"type":"uint16","value":8}' \
    sh -c "$(declare -f in_client cimdhcp); client=$client work=$work program=$program; cimdhcp --format json instances $endpoint | tr -d ' \n'"
expect "$address" cimdhcp show
expect 198.51.100.1 cimdhcp show

# The server's address is the access point's; the leased one is the setting's.
expect 'AccessInfo              = "198.51.100.1"' cimdhcp instances QVXZR_DHCPRemoteServiceAccessPoint
expect "RequestedIPv4Address = \"$address\"" cimdhcp get 'QVXZR_DHCPSettingData.InstanceID="Computer%eth1"'

# Renaming the configuration changes exactly one line of the interface's file.
printf 'DEVICE=eth1\nCONFIG_NAME=old\nONBOOT=yes\n' >"$work/data/ifcfg-eth1"
cimdhcp rename eth1 office >/dev/null || fail "rename answers status $?"
printf 'DEVICE=eth1\nCONFIG_NAME=office\nONBOOT=yes\n' | cmp - "$work/data/ifcfg-eth1" || fail "rename changed more than its line"
cimdhcp show
expect 'ConfigurationName    = "office"' cimdhcp get 'QVXZR_DHCPSettingData.InstanceID="Computer%eth1"'

# A released lease never shows.
in_client dhclient -r -q -pf "$work/dhclient.pid" -sf "$work/hook" \
    -lf /var/lib/dhcp/dhclient.eth1.leases eth1 >/dev/null 2>&1 || true
ip -n "$client" address flush dev eth1 scope global
output=$(cimdhcp instances QVXZR_DHCPRemoteServiceAccessPoint)
[[ -z ${output//[[:space:]]/} || $output != *198.51.100.1* ]] || fail "a released lease shows: $output"
output=$(cimdhcp instances $endpoint)
[[ $output != *eth1* ]] || fail "an endpoint without a client: $output"
echo "passed"
