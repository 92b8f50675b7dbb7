#!/usr/bin/env bash
# The life of a lease with one of the DHCP clients of Debian: lease, loss of the cable,
# renewal, another server, a new name of the link, release, and removal of the link.
# After each step, what the program shows is compared with what the kernel and the
# client say.
#
# Usage: dhcp-clients.sh PATH-OF-cimdhcp CLIENT
# CLIENT: dhclient, dhcpcd, udhcpc, networkd, NetworkManager or NetworkManager-dhclient
set -euo pipefail

program=$1
kind=$2
source "$(dirname "$0")/dhcp-laboratory.sh"
need() {
    command -v "$1" >/dev/null || { echo "needs $1"; exit 1; }
}

# A link that stays an interface of the machine when it has no address, other than a
# veth end: those are the inner ends of containers' cables, too.
ip -n "$client" link set eth1 name cable
ip -n "$client" link add link cable name eth1 type macvlan mode bridge
ip -n "$client" link set eth1 up
start_server

# write_in_client FILE: makes a file on the client's machine of what is given to it.
write_in_client() {
    in_client sh -c 'mkdir -p "$(dirname "$1")" && cat >"$1"' sh "$1"
}

# Each client has: start_client, stop_client (with a release), renew_client (unless it
# can only wait until half of the time is over), and what it says itself: said_address and said_server, of the interface $1. A client that cannot follow a new
# name says what it said before.
case $kind in
    dhclient)
        need dhclient
        leases=/var/lib/dhcp/dhclient.leases
        start_client() {
            in_client dhclient -1 -q -pf "$work/client.pid" eth1 </dev/null >"$work/client.log" 2>&1
        }
        stop_client() {
            in_client dhclient -r -q -pf "$work/client.pid" "$1" </dev/null >"$work/client.log" 2>&1
        }
        said() {
            in_client sed -n "s/^  $1 \(.*\);\$/\1/p" $leases | tail -1
        }
        said_address() { said fixed-address; }
        said_server() { said 'option dhcp-server-identifier'; }
        # It would give the lease back under a name that the link no longer has.
        renew_client() {
            in_client dhclient -x -q -pf "$work/client.pid" eth1 </dev/null >"$work/client.log" 2>&1
            start_client
        }
        renamed_back=yes
        ;;
    dhcpcd)
        need dhcpcd
        start_client() {
            in_client dhcpcd --nohook resolv.conf --noipv6rs --noipv4ll --nodelay --nodev \
                -4 -w eth1 </dev/null >"$work/client.log" 2>&1
        }
        stop_client() {
            in_client dhcpcd -4 -k "$1" </dev/null >"$work/client.log" 2>&1
        }
        said() {
            in_client dhcpcd -4 -U eth1 2>/dev/null |
                 sed -n "s/^$1='\{0,1\}\([^']*\)'\{0,1\}\$/\1/p" | tail -1
        }
        said_address() { said ip_address; }
        said_server() { said dhcp_server_identifier; }
        renew_client() { in_client dhcpcd -4 -n eth1 </dev/null >"$work/client.log" 2>&1; }
        renamed_back=yes
        ;;
    udhcpc)
        need udhcpc
        # Debian's script sets the address; the lines before it are those that
        # docs/sources.md recommends, and what this test asks.
        cat >"$work/hook" <<'HOOK'
#!/bin/sh
case $1 in
    bound | renew) printf 'ip=%s\nserverid=%s\nlease=%s\n' "$ip" "$serverid" "$lease" \
        >"/run/udhcpc.$interface.state" ;;
    deconfig) rm -f "/run/udhcpc.$interface.state" ;;
esac
exec /etc/udhcpc/default.script "$@"
HOOK
        chmod 755 "$work/hook"
        start_client() {
            in_client udhcpc -i eth1 -f -p "$work/client.pid" -s "$work/hook" </dev/null \
                >"$work/client.log" 2>&1 &
            eventually test -n "$(sleep 0.3; cat "$work/client.pid")"
        }
        stop_client() {
            signal_client USR2 "$(<"$work/client.pid")"
            eventually no_address "$1"
            signal_client TERM "$(<"$work/client.pid")"
        }
        said() {
            in_client sed -n "s/^$1=//p" /run/udhcpc.eth1.state
        }
        said_address() { said ip; }
        said_server() { said serverid; }
        renew_client() { signal_client USR1 "$(<"$work/client.pid")"; }
        renamed_back=yes
        ;;
    networkd)
        networkd=/lib/systemd/systemd-networkd
        [[ -x $networkd ]] || { echo "needs $networkd"; exit 1; }
        need dbus-daemon
        need networkctl
        start_client() {
            in_client mkdir -p /run/systemd/netif/links /run/systemd/netif/leases /run/systemd/netif/lldp
            in_client chown -R systemd-network: /run/systemd/netif
            write_in_client /run/systemd/network/05-cable.network <<'FILE'
[Match]
Name=cable
[Network]
LinkLocalAddressing=no
MACVLAN=eth1
ConfigureWithoutCarrier=yes
FILE
            write_in_client /run/systemd/network/10-eth1.network <<'FILE'
[Match]
Name=eth1 lan0
[Network]
DHCP=ipv4
LinkLocalAddressing=no
FILE
            # Renewal is asked for over a bus. It stays when networkd is started again.
            if ! in_client test -S /run/dbus/system_bus_socket; then
                in_client mkdir -p /run/dbus
                in_client dbus-daemon --system --nofork --nopidfile </dev/null >"$work/bus.log" 2>&1 &
                eventually in_client test -S /run/dbus/system_bus_socket
            fi
            in_client env container=laboratory $networkd </dev/null >"$work/client.log" 2>&1 &
        }
        renew_client() { in_client networkctl renew eth1 </dev/null >>"$work/client.log" 2>&1; }
        stop_client() {
            local pid
            for pid in $(ip netns pids "$client"); do
                [[ $(<"/proc/$pid/comm") != systemd-network ]] || kill "$pid"
            done
        }
        lease_file() {
            echo "/run/systemd/netif/leases/$(ip -n "$client" -j link show dev "$current" | jq '.[0].ifindex')"
        }
        said() {
            in_client sed -n "s/^$1=//p" "$(lease_file)"
        }
        said_address() { said ADDRESS; }
        said_server() { said SERVER_ADDRESS; }
        renamed_back=no
        ;;
    NetworkManager | NetworkManager-dhclient)
        backend=internal
        [[ $kind == NetworkManager ]] || backend=dhclient
        need NetworkManager
        need dbus-daemon
        start_client() {
            in_client mkdir -p /run/dbus /run/NetworkManager/conf.d /var/lib/NetworkManager
            write_in_client /run/NetworkManager/laboratory.conf <<FILE
[main]
dhcp=$backend
plugins=keyfile
no-auto-default=*
dns=none
rc-manager=unmanaged
[keyfile]
unmanaged-devices=interface-name:cable
FILE
            write_in_client /run/NetworkManager/system-connections/office.nmconnection <<'FILE'
[connection]
id=office
uuid=11111111-2222-4333-8444-555555555555
type=macvlan
interface-name=eth1
[macvlan]
mode=2
parent=cable
[ipv4]
method=auto
[ipv6]
method=disabled
FILE
            # It takes no profile that others may read.
            in_client chmod 600 /run/NetworkManager/system-connections/office.nmconnection
            in_client dbus-daemon --system --nofork --nopidfile </dev/null >"$work/bus.log" 2>&1 &
            eventually in_client test -S /run/dbus/system_bus_socket
            in_client NetworkManager --no-daemon --config /run/NetworkManager/laboratory.conf \
                --config-dir /run/NetworkManager/conf.d </dev/null >"$work/client.log" 2>&1 &
            eventually in_client nmcli connection up office
        }
        stop_client() {
            in_client nmcli connection down office
        }
        renew_client() { restart_client; }
        restart_client() { in_client nmcli connection up office >"$work/client.log" 2>&1; }
        said() {
            in_client nmcli -t -f DHCP4 device show "$current" | sed -n "s/^DHCP4.OPTION\[[0-9]*\]:$1 = //p"
        }
        said_address() { said ip_address; }
        said_server() { said dhcp_server_identifier; }
        renamed_back=yes
        ;;
    *)
        echo "no such client: $kind"
        exit 2
        ;;
esac

no_address() {
    [[ -z $(kernel_address "$1") ]]
}
current=eth1

# What the program shows of the current link is what the kernel and the client say.
agrees() {
    local address operstate state=0 expected='[]'
    address=$(kernel_address "$current")
    look || return 1
    operstate=$(ip -n "$client" -j link show dev "$current" | jq -r '.[0].operstate')
    [[ $operstate == UP ]] && state=1
    [[ $(seen InterfaceState "$current") == "$state" ]] || return 1
    if [[ -z $address ]]; then
        [[ -z $(seen IPv4Address "$current") ]] || return 1
    else
        [[ $(seen IPv4Address "$current") == "\"$address\"" ]] || return 1
        [[ $(seen AddressSource "$current") == 1 ]] || return 1
        [[ $(seen DHCPEnabled "$current") == true ]] || return 1
        [[ $(said_address) == "$address" ]] && expected="[\"$(said_server)\"]"
    fi
    [[ $(seen DHCPServerAddresses "$current") == "$expected" ]] || return 1
    served "$address" "$expected"
}
# served ADDRESS SERVERS: the endpoint, the access points and the setting data say so, too.
served() {
    local on
    on=$(seen DHCPEnabled "$current")
    [[ $(instances QVXZR_DHCPProtocolEndpoint Name "$current") == "$([[ $on != true ]] || echo "\"$current\"")" ]] ||
        return 1
    [[ $(instances QVXZR_DHCPRemoteServiceAccessPoint AccessInfo "${current}_IPv4") == \
        "$(jq -r '.[] | tojson' <<<"$2")" ]] || return 1
    [[ $(instances QVXZR_DHCPSettingData RequestedIPv4Address "$current") == "${1:+"\"$1\""}" ]]
}
# instances CLASS PROPERTY NAME: the property of those that are named, one per line.
instances() {
    cimdhcp --format json instances "$1" 2>/dev/null |
        jq -c --arg property "$2" --arg name "$3" '.instances[].properties
            | select((.Name // .ElementName).value == $name) | .[$property].value | values'
}
explain() {
    echo "--- the program:"; cimdhcp tree
    echo "--- the kernel:"; ip -n "$client" address show dev "$current"
    echo "--- the client: $(said_address) $(said_server)"; tail -20 "$work/client.log"
}
step() {
    eventually agrees || { explain; fail "$kind, $1: the program shows something else"; }
    echo "$kind, $1: $(seen IPv4Address "$current") from $(seen DHCPServerAddresses "$current")"
}
leased() {
    [[ -n $(kernel_address "$current") && $(said_address) == "$(kernel_address "$current")" ]]
}

[[ $(value DHCPEnabled) == false ]] || fail "DHCP without a client"
step "before it runs"

start_client || { tail -20 "$work/client.log"; fail "$kind does not start"; }
eventually leased || { explain; fail "$kind gets no lease"; }
step "with a lease"
expect 198.51.100.1 cimdhcp show

# Whoever may not read a source is told so in one line, and sees what is left.
as_nobody() {
    in_client setpriv --reuid 65534 --regid 65534 --clear-groups env ZR_LOG_SINK=none \
        ZR_DATA_DIR="$work/data" "$program" "$@"
}
if [[ $kind == dhcpcd ]] && as_nobody --version >/dev/null 2>&1; then
    as_nobody show >"$work/shown" 2>"$work/told" || fail "show as nobody answers status $?"
    [[ $(wc -l <"$work/told") == 1 ]] || fail "not one line: $(<"$work/told")"
    grep -q "cannot read /var/lib/dhcpcd/eth1.lease: Permission denied" "$work/told" ||
        fail "not told: $(<"$work/told")"
    grep -Eq "^eth1 +on .*$(kernel_address)" "$work/shown" || fail "not shown: $(<"$work/shown")"
fi

ip -n "$client" link set cable down
step "with the cable out"
[[ $(value InterfaceState) == 0 ]] || fail "active without a cable"
ip -n "$client" link set cable up
eventually leased || { explain; fail "$kind gets no lease again"; }
step "with the cable in again"

if declare -F renew_client >/dev/null; then
    before=$(lease_end)
    sleep 1  # ends are told in seconds
    renew_client || { explain; fail "$kind does not renew its lease"; }
    renewed() { [[ $(lease_end) -gt $before ]] && leased; }
    eventually renewed || { explain; fail "$kind has not renewed its lease"; }
    step "renewed"
fi

stop_client eth1 || fail "$kind does not give the first lease back"
eventually no_address eth1 || { explain; fail "$kind keeps the first address"; }
change_server
if declare -F restart_client >/dev/null; then restart_client; else start_client; fi ||
    { explain; fail "$kind does not start again"; }
eventually leased || { explain; fail "$kind gets no lease from another server"; }
step "with another server"
[[ $(value DHCPServerAddresses) == '["198.51.100.2"]' ]] || fail "the former server shows"

ip -n "$client" link set eth1 name lan0
current=lan0
step "under another name"
[[ -z $(value Name eth1) ]] || fail "the former name shows"
if [[ $renamed_back == yes ]]; then
    [[ $(value DHCPServerAddresses lan0) == '["198.51.100.2"]' ]] || fail "the lease got lost"
    ip -n "$client" link set lan0 name eth1
    current=eth1
fi

eventually leased || { explain; fail "$kind has no lease to give back"; }
stop_client "$current" || fail "$kind does not give the lease back"
eventually no_address "$current" || { explain; fail "$kind keeps the address"; }
step "after its release"
eventually test "$(value AddressSource "$current")" != 3 || fail "no address is a static one"

ip -n "$client" link delete "$current"
[[ -z $(value Name "$current") ]] || fail "the link is gone and shows"
expect 'nodes' cimdhcp tree
echo "$kind: passed"
