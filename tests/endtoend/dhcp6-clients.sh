#!/usr/bin/env bash
# What happens to a DHCPv6 client, and no DHCPv4 at all: after each event, what the program
# shows is compared with what the kernel says.
#
# Usage: dhcp6-clients.sh PATH-OF-cimdhcp PATH-OF-tree-on-request CLIENT EVENTS
# CLIENT: dhcp6c, dhclient, dhcpcd, networkd or NetworkManager; EVENTS: life (leases of ten
# minutes) or end (of twenty seconds, which end)
set -euo pipefail

program=$1
tree_on_request=$2
kind=$3
events=$4
subject="$kind, DHCPv6"
here=$(dirname "$0")
source "$here/dhcp-laboratory.sh"
source "$here/dhcp-truth.sh"
need python3

in_server ip address add 2001:db8:99::1/64 dev zrs$$ nodad
start_server6() {
    start_server --enable-ra --dhcp-range=2001:db8:99::100,2001:db8:99::1ff,64,10m
}
# A manager has the link in its hands when it asks.
managed=no
# Whether its address stays when it is killed and the lease ends.
address_stays=no
# Whether a file or a bus tells of the lease.
tells_lease=yes

case $kind in
    dhcp6c)
        need dhcp6c
        processes=(dhcp6c)
        client_name=dhcp6c
        tells_lease=no
        address_stays=yes
        in_client mkdir -p /var/lib/dhcpv6
        write_in_client /run/dhcp6c.conf <<'FILE'
interface eth1 {
    send ia-na 0;
};
id-assoc na 0 {
};
FILE
        start_client() { background dhcp6c -f -c /run/dhcp6c.conf -p /run/dhcp6c.pid eth1; }
        stop_client() { signal_client TERM "$(in_client cat /run/dhcp6c.pid)"; }
        ;;
    dhclient)
        need dhclient
        processes=(dhclient)
        client_name=dhclient
        start_client() { background dhclient -6 -d -q -pf "$work/client.pid" eth1; }
        stop_client() {
            in_client dhclient -6 -r -q -pf "$work/client.pid" eth1 </dev/null >>"$work/client.log" 2>&1
        }
        ;;
    dhcpcd)
        need dhcpcd
        processes=(dhcpcd)
        client_name=dhcpcd
        # Without advertisements it would wait for them: it is told to ask at once.
        write_in_client /run/dhcpcd.conf <<'FILE'
noipv6rs
interface eth1
    ia_na 1
FILE
        dhcpcd_options=(-f /run/dhcpcd.conf --nohook resolv.conf --noipv4ll --nodelay --nodev -6)
        start_client() { in_client dhcpcd -b "${dhcpcd_options[@]}" eth1 </dev/null >>"$work/client.log" 2>&1; }
        stop_client() {
            in_client dhcpcd -f /run/dhcpcd.conf -6 -k eth1 </dev/null >>"$work/client.log" 2>&1
        }
        ;;
    networkd)
        networkd=/lib/systemd/systemd-networkd
        need $networkd
        processes=(systemd-network)
        client_name=systemd-networkd
        managed=yes
        in_client mkdir -p /run/systemd/netif/links /run/systemd/netif/leases /run/systemd/netif/lldp
        in_client chown -R systemd-network: /run/systemd/netif
        write_in_client /etc/systemd/network/10-eth1.network <<'FILE'
[Match]
Name=eth1
[Network]
DHCP=ipv6
[DHCPv6]
WithoutRA=solicit
FILE
        start_client() { background env container=laboratory $networkd; }
        stop_client() { kill_processes TERM systemd-network; }
        start_bus
        ;;
    NetworkManager)
        need NetworkManager
        need nmcli
        processes=(NetworkManager)
        client_name=NetworkManager
        managed=yes
        prepare_networkmanager "" method=disabled method=dhcp
        start_client() { activate_networkmanager; }
        stop_client() { in_client nmcli connection down office >>"$work/client.log" 2>&1; }
        start_bus
        ;;
    *)
        echo "no such client: $kind"
        exit 2
        ;;
esac

leased_address6() {
    ip -n "$client" -j -6 address show dev eth1 |
        jq -r '[.[].addr_info[]? | select(.local // "" | startswith("2001:db8:99::1"))
               | select(.tentative | not) | .local] | .[0] // empty'
}
leased6() {
    [[ -n $(leased_address6) ]]
}
not_leased6() {
    ! leased6
}
explain() {
    echo "--- the kernel:"; ip -n "$client" address show dev eth1
    echo "--- the client:"; tail -20 "$work/client.log"
    echo "--- the server:"; tail -20 "$work"/{dnsmasq,short-server}.log 2>/dev/null || true
}
# A link has no address for DHCPv6 to be asked from before its own is known to be unique.
link_local() {
    [[ -n $(ip -n "$client" -j -6 address show dev eth1 |
        jq -r '.[].addr_info[]? | select(.scope == "link" and (.tentative | not)) | .local') ]]
}
nothing6() {
    truth "$1" enabled=false source=0 servers=none lease4=none lease6=none
}
bound6() {
    if [[ $tells_lease == yes ]]; then
        truth "$1" enabled=true source=1 servers='@(none|fe80:*)' lease4=none \
            lease6="$client_name @(5|8) $(leased_address6) @(-|fe80:*)"
    else
        truth "$1" enabled=true source='@(0|1)' servers=none lease4=none \
            lease6="$client_name @(0|5|8) @(-|$(leased_address6)) -"
    fi
}

life() {
    eventually link_local || { explain; fail "no address of the link"; }
    nothing6 "before it runs"
    start_client || { explain; fail "$kind does not start"; }
    eventually is_running "${processes[@]}"
    # Managers are told to ask without a router, too.
    truth "no server" enabled=true source=0 servers=none lease4=none lease6="$client_name [023467] - -"

    start_server6
    eventually leased6 || { explain; fail "$kind gets no lease"; }
    bound6 "a lease"
    if [[ $managed == yes ]]; then
        # Its files do not tell what DHCPv6 gave.
        suspend_processes "${processes[@]}"
        truth_now "a lease, and it does not respond" enabled='@(true|unknown)' source='@(1|none)'
        tells "a lease, and it does not respond" 'cannot be asked'
        resume_processes "${processes[@]}"
        bound6 "a lease, and it responds again"
    fi

    ip -n "$client" -6 address flush dev eth1 scope global
    sleep 0.3
    leased6 || truth "the address flushed" enabled=true source=0 servers=none lease4=none

    stop_client || { explain; fail "$kind does not give the lease back"; }
    eventually not_leased6 || { explain; fail "$kind keeps the address"; }
    nothing6 "released"

    start_client || { explain; fail "$kind does not start again"; }
    eventually leased6 || { explain; fail "$kind gets no lease again"; }
    bound6 "a lease again"
    kill_processes KILL "${processes[@]}"
    truth "killed while the lease runs" link=yes lease4=none
    # As the kernel does when the lease ends.
    ip -n "$client" -6 address delete "$(leased_address6)/128" dev eth1 2>/dev/null ||
        ip -n "$client" -6 address flush dev eth1 scope global
    nothing6 "killed, and no address"
}

# Leases that soon end, and no server that renews them.
start_short_server6() {
    in_server python3 "$here/dhcp6-short-server.py" zrs$$ 2001:db8:99::155 20 \
        >"$work/short-server.log" 2>&1 &
    disown  # its end is no news
    eventually short_server6_runs || { cat "$work/short-server.log"; fail "no server"; }
}
short_server6_runs() {
    [[ -n $(in_server ss -6 -H -l -u -n 'sport = :547') ]]
}
stop_short_server6() {
    local pid
    for pid in $(ip netns pids "$server"); do
        [[ $(<"/proc/$pid/comm") != python* ]] || kill "$pid"
    done
}
end() {
    eventually link_local || { explain; fail "no address of the link"; }
    start_short_server6
    start_client || { explain; fail "$kind does not start"; }
    eventually leased6 || { explain; fail "$kind gets no lease"; }
    bound6 "a lease of twenty seconds"
    stop_short_server6
    eventually not_leased6 || { explain; fail "$kind keeps the address"; }
    truth "no server until the end of the lease" enabled=true source=0 servers=none lease4=none \
        lease6="$client_name [023467] - -"

    start_short_server6
    eventually leased6 || { explain; fail "$kind gets no lease after the end of another"; }
    bound6 "a lease after the end of another"
    kill_processes KILL "${processes[@]}"
    stop_short_server6
    if [[ $address_stays == yes ]]; then
        truth "killed, and its address stays" enabled=false source=0 servers=none lease6=none
        return 0
    fi
    # The kernel ends the address.
    eventually not_leased6 || { explain; fail "the address of $kind has no end"; }
    nothing6 "killed, and the lease has ended"
}

case $events in
    life | end) "$events" ;;
    *)
        echo "no such events: $events"
        exit 2
        ;;
esac
finish
