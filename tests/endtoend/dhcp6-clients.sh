#!/usr/bin/env bash
# A DHCPv6 client that does not tell its server's address, and no DHCPv4 at all: the link
# shows DHCP while the client runs, and neither a server nor an IPv4 address.
#
# Usage: dhcp6-clients.sh PATH-OF-cimdhcp CLIENT
# CLIENT: dhcp6c, dhclient or dhcpcd
set -euo pipefail

program=$1
kind=$2
source "$(dirname "$0")/dhcp-laboratory.sh"
command -v "$kind" >/dev/null || { echo "needs $kind"; exit 1; }

in_server ip address add 2001:db8:99::1/64 dev zrs$$ nodad
start_server --enable-ra --dhcp-range=2001:db8:99::100,2001:db8:99::1ff,64,10m

case $kind in
    dhcp6c)
        in_client mkdir -p /var/lib/dhcpv6
        in_client tee /run/dhcp6c.conf >/dev/null <<'FILE'
interface eth1 {
    send ia-na 0;
};
id-assoc na 0 {
};
FILE
        start_client() {
            in_client dhcp6c -f -c /run/dhcp6c.conf -p /run/dhcp6c.pid eth1 </dev/null \
                >"$work/client.log" 2>&1 &
            disown  # its end is no news
        }
        stop_client() { signal_client TERM "$(in_client cat /run/dhcp6c.pid)"; }
        ;;
    dhclient)
        start_client() {
            in_client dhclient -6 -1 -q -pf "$work/client.pid" eth1 </dev/null \
                >"$work/client.log" 2>&1
        }
        stop_client() {
            in_client dhclient -6 -r -q -pf "$work/client.pid" eth1 </dev/null \
                >"$work/client.log" 2>&1
        }
        ;;
    dhcpcd)
        # Without advertisements it would wait for them: it is told to ask at once.
        in_client tee /run/dhcpcd.conf >/dev/null <<'FILE'
noipv6rs
interface eth1
    ia_na 1
FILE
        start_client() {
            in_client dhcpcd -f /run/dhcpcd.conf --nohook resolv.conf --noipv4ll --nodelay \
                --nodev -6 -w eth1 </dev/null >"$work/client.log" 2>&1
        }
        stop_client() {
            in_client dhcpcd -f /run/dhcpcd.conf -6 -k eth1 </dev/null >"$work/client.log" 2>&1
        }
        ;;
    *)
        echo "no such client: $kind"
        exit 2
        ;;
esac

leased6() {
    [[ -n $(ip -n "$client" -j -6 address show dev eth1 |
        jq -r '.[].addr_info[]? | select(.local // "" | startswith("2001:db8:99::1"))
               | select(.tentative | not) | .local') ]]
}
not_leased6() {
    ! leased6
}
explain() {
    echo "--- the program:"; cimdhcp tree --explain
    echo "--- the kernel:"; ip -n "$client" address show dev eth1
    echo "--- the client:"; tail -20 "$work/client.log"
    echo "--- the server:"; tail -20 "$work/dnsmasq.log"
}
# shows DHCPEnabled: what the tree has, now.
shows() {
    look || return 1
    [[ $(seen DHCPEnabled) == "$1" && $(seen DHCPServerAddresses) == '[]' &&
        $(seen AddressSource) == 0 && -z $(seen IPv4Address) ]]
}

# A link has no address for DHCPv6 to be asked from before its own is known to be unique.
link_local() {
    [[ -n $(ip -n "$client" -j -6 address show dev eth1 |
        jq -r '.[].addr_info[]? | select(.scope == "link" and (.tentative | not)) | .local') ]]
}
eventually link_local || { explain; fail "no address of the link"; }
eventually shows false || { explain; fail "DHCP without a client"; }

start_client || { explain; fail "$kind does not start"; }
eventually leased6 || { explain; fail "$kind gets no lease"; }
eventually shows true || { explain; fail "$kind: the program shows something else"; }
expect "$kind" cimdhcp tree --explain

stop_client || { explain; fail "$kind does not give the lease back"; }
eventually not_leased6 || { explain; fail "$kind keeps the address"; }
eventually shows false || { explain; fail "$kind: DHCP after its end"; }
echo "$kind: passed"
