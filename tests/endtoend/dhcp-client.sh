#!/usr/bin/env bash
# A real DHCP server (dnsmasq) and a real client (ISC dhclient) on the two ends of a
# veth pair, each in a network namespace of its own, and the real program in the
# client's. What it shows is compared with what the kernel and the server say.
#
# Usage: dhcp-client.sh PATH-OF-cimdhcp
set -euo pipefail

program=$1
source "$(dirname "$0")/dhcp-laboratory.sh"
command -v dhclient >/dev/null || { echo "needs dhclient"; exit 1; }
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
compact_json() {
    cimdhcp --format json "$@" | tr -d ' \n'
}
expect 'EnabledState            = 2 (Enabled)' cimdhcp instances $endpoint
expect 'ClientState             = 8 (Bound)' cimdhcp instances $endpoint
expect '"ClientState":{"type":"uint16","value":8}' \
    compact_json instances $endpoint
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
