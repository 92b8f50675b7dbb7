#!/usr/bin/env bash
# Machines on which it is easy to be wrong: configuration that no one executes, clients and
# files that another user has forged, clients that are dead or serve another link, rights
# that lack, and clocks that were set.
#
# Usage: dhcp-machines.sh PATH-OF-cimdhcp PATH-OF-tree-on-request GROUP
# GROUP: intent, forged, static, odd, clock or rights
set -euo pipefail

program=$1
tree_on_request=$2
group=$3
subject=$group
here=$(dirname "$0")
source "$here/dhcp-laboratory.sh"
source "$here/dhcp-truth.sh"
in_client mkdir /run/laboratory

by_hand() {
    truth "$1" enabled=false source=3 servers=none lease4=none
}
set_by_hand() {
    ip -n "$client" address flush dev eth1 scope global
    ip -n "$client" address add "$1/24" dev eth1
}
has_address() {
    [[ -n $(kernel_address eth1) ]]
}
start_dhclient() { # start_dhclient OPTION...
    in_client dhclient -1 -q -pf /run/laboratory/dhclient.pid "$@" </dev/null >>"$work/client.log" 2>&1
}
stop_dhclient() {
    kill_processes KILL dhclient
    ip -n "$client" address flush dev eth1 scope global
    in_client rm -f /var/lib/dhcp/dhclient.leases
}
# impostor NAME ARGUMENT...: a process of that name and with these arguments that does nothing.
impostor() {
    local name=$1
    shift
    in_client cp /bin/bash "/run/laboratory/$name"
    background "${as[@]}" "/run/laboratory/$name" -c 'while :; do sleep 100; done' "$@"
    eventually is_running "$name"
}
as_nobody=(setpriv --reuid 65534 --regid 65534 --clear-groups)

# An address was set by hand; the file asks for DHCP, and no client runs.
not_executed() { # not_executed WHAT FILE <TEXT
    write_in_client "$2"
    in_client chmod 600 "$2"
    by_hand "$1"
    tells "$1" 'asks? for DHCP'
    in_client rm "$2"
}
intent() {
    local profile='[connection]
id=office
uuid=11111111-2222-4333-8444-555555555555
type=ethernet
interface-name=eth1
autoconnect=false
[ipv4]
method=auto'
    set_by_hand 198.51.100.30
    by_hand "an address set by hand"
    not_executed "interfaces, never brought up" /etc/network/interfaces <<<'iface eth1 inet dhcp'
    not_executed "ifcfg with ONBOOT=no" /etc/sysconfig/network-scripts/ifcfg-eth1 \
        <<<$'DEVICE=eth1\nBOOTPROTO=dhcp\nONBOOT=no'
    not_executed "netplan's file without networkd" /run/systemd/network/10-netplan-eth1.network \
        <<<$'[Match]\nName=eth1\n[Network]\nDHCP=ipv4'
    not_executed "a profile without NetworkManager" \
        /etc/NetworkManager/system-connections/office.nmconnection <<<"$profile"

    in_client mkdir -p /run/NetworkManager/conf.d /var/lib/NetworkManager
    start_bus
    write_in_client /run/NetworkManager/laboratory.conf <<<$'[main]\nplugins=keyfile\nno-auto-default=*
dns=none\nrc-manager=unmanaged\n[keyfile]\nunmanaged-devices=interface-name:eth1'
    write_in_client /etc/NetworkManager/system-connections/office.nmconnection <<<"$profile"
    in_client chmod 600 /etc/NetworkManager/system-connections/office.nmconnection
    background NetworkManager --no-daemon --config /run/NetworkManager/laboratory.conf \
        --config-dir /run/NetworkManager/conf.d
    eventually in_client nmcli general status || fail "no NetworkManager: $(<"$work/client.log")"
    by_hand "a profile, and NetworkManager told to leave the link alone"
    kill_processes TERM NetworkManager
    by_hand "a profile, and NetworkManager stopped"
}

# Root is told nothing that another user made up.
forged() {
    local as=("${as_nobody[@]}") evil='lease {
  interface "eth1";
  fixed-address 198.51.100.30;
  option dhcp-lease-time 86400;
  option dhcp-message-type 5;
  option dhcp-server-identifier 203.0.113.66;
  renew 5 2090/11/20 23:13:32;
  rebind 5 2090/11/20 23:18:26;
  expire 5 2090/11/20 23:19:41;
}'
    set_by_hand 198.51.100.30
    impostor udhcpc -i eth1
    by_hand "udhcpc of another user"
    tells "udhcpc of another user" udhcpc
    kill_processes KILL udhcpc

    write_in_client /run/laboratory/evil.leases <<<"$evil"
    in_client chown 65534 /run/laboratory/evil.leases
    impostor dhclient -lf /run/laboratory/evil.leases eth1
    by_hand "dhclient of another user"
    tells "dhclient of another user" dhclient
    kill_processes KILL dhclient

    # The address ends when a lease of ten minutes would, as if a client had set it.
    ip -n "$client" address change 198.51.100.30/24 dev eth1 valid_lft 600 preferred_lft 600
    write_in_client /var/lib/dhcp/dhclient.eth1.leases <<<"$evil"
    in_client chown 65534 /var/lib/dhcp/dhclient.eth1.leases
    truth "a lease file of another user" servers=none
    tells "a lease file of another user" /var/lib/dhcp/dhclient.eth1.leases
    in_client rm /var/lib/dhcp/dhclient.eth1.leases
    write_in_client /run/udhcpc.eth1.state <<<$'ip=198.51.100.30\nserverid=203.0.113.66\nlease=86400'
    in_client chown 65534 /run/udhcpc.eth1.state
    truth "a state file of another user" servers=none
    tells "a state file of another user" /run/udhcpc.eth1.state
    in_client rm /run/udhcpc.eth1.state
    ip -n "$client" address flush dev eth1 scope global

    start_server
    in_client mkdir -m 777 /run/laboratory/shared
    start_dhclient -lf /run/laboratory/shared/leases eth1 || fail "dhclient: $(<"$work/client.log")"
    truth "a lease in a directory that all may write" enabled=true source=1 servers=none
    tells "a lease in a directory that all may write" /run/laboratory/shared
    stop_dhclient
}

# Addresses that dhcpcd did not obtain, although it runs.
static() {
    set_by_hand 198.51.100.30
    write_in_client /etc/dhcpcd.conf <<<$'ipv4only\nnoipv4ll\nnohook resolv.conf\ndenyinterfaces eth1'
    in_client dhcpcd -b --nodev </dev/null >>"$work/client.log" 2>&1
    eventually is_running dhcpcd || fail "no dhcpcd: $(<"$work/client.log")"
    by_hand "a link that dhcpcd is denied"
    kill_processes KILL dhcpcd
    in_client rm -rf /run/dhcpcd

    ip -n "$client" address flush dev eth1 scope global
    write_in_client /etc/dhcpcd.conf <<<$'ipv4only\nnoipv4ll\nnohook resolv.conf\nnodelay
noarp\ninterface eth1\nstatic ip_address=198.51.100.40/24'
    in_client dhcpcd -b --nodev </dev/null >>"$work/client.log" 2>&1
    eventually has_address || fail "dhcpcd sets no address: $(<"$work/client.log")"
    by_hand "an address in dhcpcd's configuration"
    kill_processes KILL dhcpcd
    in_client rm -rf /run/dhcpcd

    ip -n "$client" address flush dev eth1 scope global
    write_in_client /etc/dhcpcd.conf <<<$'ipv4only\nnoipv4ll\nnohook resolv.conf\nnoarp'
    in_client dhcpcd -b --nodev -S ip_address=198.51.100.41/24 eth1 </dev/null >>"$work/client.log" 2>&1
    eventually has_address || fail "dhcpcd sets no address: $(<"$work/client.log")"
    by_hand "an address on dhcpcd's command line"
}

odd() {
    local as=()
    set_by_hand 198.51.100.30
    in_client cp /bin/true /run/laboratory/dhclient
    background python3 -c 'import os, time
if os.fork() == 0:
    os.execv("/run/laboratory/dhclient", ["dhclient", "eth1"])
time.sleep(1000)'
    # A dead process has no network namespace by which it could be found.
    eventually in_client sh -c 'grep -qs "^State:.Z" /proc/[0-9]*/status' || fail "no zombie"
    by_hand "a dhclient that is dead, and whose parent does not care"
    kill_processes KILL python3

    ip -n "$client" address flush dev eth1 scope global
    in_client sysctl -qw net.ipv6.conf.all.disable_ipv6=1
    truth "no IPv6, and no address" enabled=false source=0 servers=none lease4=none
    start_server
    in_client sh -c 'cd /run/laboratory && : >my.leases && exec dhclient -1 -q -lf my.leases eth1' </dev/null \
        >>"$work/client.log" 2>&1
    truth "no IPv6, and a lease in a file with a relative name" enabled=true source=1 \
        servers=198.51.100.1 lease4="dhclient 8 $(kernel_address) @(-|198.51.100.1)"
    stop_dhclient

    start_dhclient eth1
    in_client sh -c 'printf "lease {\n  interface \"eth1\";\n  fixed-address 300.1.1.1;\n" \
        >/var/lib/dhcp/dhclient.damaged.leases'
    truth "a damaged file beside a good one" enabled=true source=1 servers=198.51.100.1 \
        lease4="dhclient 8 $(kernel_address) @(-|198.51.100.1)"
    tells "a damaged file" /var/lib/dhcp/dhclient.damaged.leases
    in_client rm /var/lib/dhcp/dhclient.damaged.leases
    stop_dhclient

    # What the kernel's own program for starting from a network leaves.
    in_client /usr/lib/klibc/bin/ipconfig -t 20 -c dhcp -d eth1 </dev/null >>"$work/client.log" 2>&1 ||
        fail "ipconfig: $(<"$work/client.log")"
    truth "the lease with which the system started" enabled=true source=1 \
        servers='@(none|198.51.100.1)'
    ip -n "$client" address flush dev eth1 scope global
    truth "that lease without its address" enabled=false source=0 servers=none
    in_client rm -f /run/net-eth1.conf

    ip -n "$client" link add br0 type bridge
    ip -n "$client" link set br0 up
    ip -n "$client" link set eth1 master br0
    impostor udhcpc -i eth1
    # The bridge owns the address; that a client runs there all the same is told.
    truth "a client on the port of a bridge" enabled=false source=0 servers=none
    tells "a client on the port of a bridge" "runs on a port of br0"
}

clock() {
    local offset
    start_server
    start_dhclient eth1 || fail "dhclient: $(<"$work/client.log")"
    for offset in -3y -1d +1d +3y; do
        at_clock "$offset" "a clock set by $offset" enabled=true source=1 servers='@(none|198.51.100.1)'
    done
    stop_dhclient
    # The lease of a dead client whose address has no end is over when its time is.
    ip -n "$client" address add 198.51.100.30/24 dev eth1
    write_in_client /run/udhcpc.eth1.state <<<$'ip=198.51.100.30\nserverid=198.51.100.1\nlease=600'
    at_clock +3600 "a lease that ended an hour ago" enabled=false servers=none lease4=none
}
# at_clock OFFSET MOMENT FACT=PATTERN...: what the program tells with such a clock. Times
# of files stay what they are.
at_clock() {
    local offset=$1
    moment=$2
    shift 2
    ((++truths))
    in_client env ZR_LOG_SINK=none NO_FAKE_STAT=1 faketime -f "$offset" "$program" tree >"$work/fresh.json"
    read_kernel
    # When the kernel will remove the address is known by the true clock alone.
    kernel_end=
    false_in "$work/fresh.json" "${kernel[0]}" "$@" >"$work/false"
    judge
}
judge() {
    if [[ -s $work/false ]]; then
        tell_falsehoods
    else
        echo "right: $subject, $moment"
    fi
}

# What a user without rights cannot know is told to be unknown, and why.
seen_by_nobody() { # seen_by_nobody MOMENT FACT=PATTERN...
    moment=$1
    shift
    ((++truths))
    in_client "${as_nobody[@]}" env ZR_LOG_SINK=none ZR_DATA_DIR="$work/data" \
        "$work/program/bin/cimdhcp" tree >"$work/fresh.json" 2>>"$work/client.log" || true
    read_kernel
    false_in "$work/fresh.json" "$@" "${kernel[0]}" >"$work/false"
    judge
    if [[ " $* " == *" enabled=unknown "* ]]; then
        ((++truths))
        in_client "${as_nobody[@]}" env ZR_LOG_SINK=none ZR_DATA_DIR="$work/data" \
            "$work/program/bin/cimdhcp" show >"$work/shown" 2>"$work/told" || true
        if [[ -s $work/told ]]; then
            echo "right: $subject, $moment, is told"
        else
            tell_false "$moment: nothing is told"
        fi
    fi
}
rights() {
    # Where the build is, others may not look.
    chmod 755 "$work"
    mkdir "$work/program"
    cp -r "$(dirname "$program")/../bin" "$(dirname "$program")/../lib" "$(dirname "$program")/../share" \
        "$work/program"
    start_server
    start_dhclient eth1 || fail "dhclient: $(<"$work/client.log")"
    seen_by_nobody "dhclient, whose files all may read" enabled=true source=1 servers=198.51.100.1
    stop_dhclient

    background udhcpc -i eth1 -f -s /etc/udhcpc/default.script
    eventually has_address || fail "udhcpc: $(<"$work/client.log")"
    truth "udhcpc, as root" enabled=true source=1
    seen_by_nobody "udhcpc, whose network cannot be seen" 'enabled=@(true|unknown)' \
        'source=@(0|1|none)' servers=none
    in_client mount -o remount,hidepid=2 /proc
    seen_by_nobody "udhcpc, hidden" enabled=unknown 'source=@(0|none)' servers=none
    kill_processes KILL udhcpc
    set_by_hand 198.51.100.30
    seen_by_nobody "no client, hidden" enabled=unknown 'source=@(0|3|none)' servers=none
}

case $group in
    intent | forged | static | odd | clock | rights) "$group" ;;
    *)
        echo "no such group: $group"
        exit 2
        ;;
esac
finish
