# Two machines in a laboratory, for tests to source: a DHCP server (dnsmasq) and a
# client on the two ends of a veth pair, each in a network namespace of its own. The
# client also has file systems of its own wherever DHCP clients read and write, and
# processes of its own, so that nothing of the machine that runs the test is touched or
# read: clients of other tests, too, would be seen there, and could not be told from ours
# by all users.
#
# The test has set `program` to the path of cimdhcp. It gets
#   $work           a directory that goes with the test
#   in_client ...   runs a command on the client's machine, in_server ... on the server's
#   signal_client SIGNAL NUMBER     sends a signal to a process of the client's machine
#   cimdhcp ...     runs the program on the client's machine
#   start_server    starts the server, with further options of dnsmasq; start_short_server
#                   starts one that leases for twenty seconds
#   fail, expect, eventually, look, seen, value, kernel_address and others    see below
# The server is 198.51.100.1 and gives addresses from 198.51.100.100 on; the client's
# link is eth1.

for tool in ip jq dnsmasq nsenter unshare ethtool; do
    command -v "$tool" >/dev/null || PATH=$PATH:/usr/sbin:/sbin
    command -v "$tool" >/dev/null || { echo "needs $tool"; exit 1; }
done
[[ $EUID == 0 ]] || { echo "needs root: makes network namespaces"; exit 1; }

server=zr-server-$$
client=zr-client-$$
work=$(mktemp -d)
holder=

cleanup() {
    local status=$?
    # Where a command of the test failed that was not expected to.
    ((status == 0)) || [[ -e $work/failed ]] || fail_after_all "status $status ${moment:+after \"$moment\"}"
    # Whatever the two machines still run, by its number: it is all the test's own.
    local pid
    for pid in $(ip netns pids "$client" 2>/dev/null) $(ip netns pids "$server" 2>/dev/null); do
        kill -9 "$pid" 2>/dev/null || true
    done
    ip netns delete "$client" 2>/dev/null || true
    ip netns delete "$server" 2>/dev/null || true
    rm -rf "$work"
}
trap cleanup EXIT
trap 'exit 1' INT TERM HUP

# fail TEXT...: ends the test. What was false before stands in the last lines, once more: of
# a long output these are what is looked at.
fail() {
    fail_after_all "$@"
    exit 1
}
fail_after_all() {
    : >"$work/failed"
    [[ ! -e $work/falsehoods ]] || cat "$work/falsehoods"
    echo "FAILED: $*"
}
moment=  # the last one that was looked at

# expect TEXT COMMAND...: the command's output has the text.
expect() {
    local text=$1 output
    shift
    output=$("$@" 2>&1) || fail "$* answers status $?: $output"
    [[ $output == *"$text"* ]] || fail "$* lacks \"$text\": $output"
}

# eventually COMMAND...: the command succeeds within half a minute, which a busy machine
# may need.
eventually() {
    local attempt
    for ((attempt = 0; attempt < 300; ++attempt)); do
        "$@" >/dev/null 2>&1 && return 0
        sleep 0.1
    done
    return 1
}

ip netns add "$server"
ip netns add "$client"
ip link add zrs$$ netns "$server" type veth peer name eth1 netns "$client"
ip -n "$server" address add 198.51.100.1/24 dev zrs$$
# Clients that read packets as they come look at checksums that a veth pair leaves out.
ip netns exec "$server" ethtool -K zrs$$ tx off >/dev/null
ip -n "$server" link set zrs$$ up
ip -n "$client" link set lo up
ip -n "$client" link set eth1 up

# One process holds the client's file systems and processes, and is the parent of those
# that lose theirs: it has to see their ends, which their clients wait for. /sys is read-only there, as in a
# container: programs then do not wait for a device manager that is not there.
mkdir -p "$work/data" "$work/etc"
ip netns exec "$client" unshare --mount --pid --fork --kill-child --mount-proc bash -c '
    mount --make-rprivate / &&
    mount -t tmpfs -o mode=755 tmpfs /run && mount -t tmpfs -o mode=755 tmpfs /var/lib &&
    mkdir /var/lib/dhcp /var/lib/dhcpcd &&
    mount -t tmpfs -o mode=755 tmpfs "$1/etc" && cp -a /etc/. "$1/etc" && mount --bind "$1/etc" /etc &&
    rm -rf /etc/network/interfaces* /etc/netplan /etc/sysconfig /etc/systemd/network/* \
        /etc/NetworkManager/system-connections/* /etc/NetworkManager/conf.d/* &&
    : >/etc/network/interfaces &&
    mount -o remount,bind,ro /sys && : >"$1/ready" &&
    while :; do sleep 3600 & wait; done' bash "$work" \
    >"$work/holder.log" 2>&1 &
holder=$!
disown  # its end is no news
eventually test -e "$work/ready" || fail "no file systems: $(<"$work/holder.log")"

in_client() {
    nsenter --target="$holder" --net --mount --pid="/proc/$holder/ns/pid_for_children" -- "$@"
}
# signal_client SIGNAL NUMBER: of a process on the client's machine, by its number there.
signal_client() {
    in_client sh -c 'kill -s "$1" "$2"' sh "$1" "$2"
}
in_server() {
    ip netns exec "$server" "$@"
}
cimdhcp() {
    in_client env ZR_LOG_SINK=stderr ZR_DATA_DIR="$work/data" "$program" "$@"
}

# What the server gives addresses from; a test may change it.
range=198.51.100.100,198.51.100.150
start_server() {
    in_server dnsmasq --keep-in-foreground --conf-file=/dev/null --port=0 \
        --interface=zrs$$ --bind-interfaces --dhcp-authoritative --no-ping --log-dhcp --log-facility=- --user=root \
        --dhcp-range=$range,255.255.255.0,10m \
        --dhcp-leasefile="$work/server.leases" --pid-file="$work/dnsmasq.pid" \
        "$@" >"$work/dnsmasq.log" 2>&1 &
    disown  # its end is no news
}

# Another server takes the place of the first: 198.51.100.2, with the same addresses to give.
change_server() {
    stop_server
    ip -n "$server" address delete 198.51.100.1/24 dev zrs$$
    ip -n "$server" address add 198.51.100.2/24 dev zrs$$
    start_server "$@"
}
# When the server's only lease ends, in seconds since the epoch.
lease_end() {
    cut -d ' ' -f 1 "$work/server.leases"
}

# look: reads the machine once. seen PROPERTY [INTERFACE]: what was seen then, as compact
# JSON; nothing when the interface or the property is not there.
look() {
    cimdhcp tree >"$work/tree.json"
}
seen() {
    jq -c --arg name "${2:-eth1}" --arg property "$1" \
        '[.. | objects | select(.type? == "NetworkInterface" and .properties.Name == $name)
          | .properties | select(has($property)) | .[$property]]
         | if length == 0 then empty else .[0] end' "$work/tree.json"
}
# value PROPERTY [INTERFACE]: both at once.
value() {
    look && seen "$@"
}

# kernel_address [INTERFACE]: the IPv4 address that the kernel has, without its length.
kernel_address() {
    ip -n "$client" -4 -oneline address show dev "${1:-eth1}" scope global |
        sed -nE '1s#.* inet ([0-9.]+)[ /].*#\1#p'
}

# write_in_client FILE: makes a file on the client's machine of what is given to it.
write_in_client() {
    in_client sh -c 'mkdir -p "$(dirname "$1")" && cat >"$1"' sh "$1"
}
# prepare_networkmanager MAIN IPV4 IPV6: its settings and its one profile, of eth1; each
# argument is the text of such a section, or a part of it.
prepare_networkmanager() {
    in_client mkdir -p /run/NetworkManager/conf.d /var/lib/NetworkManager
    write_in_client /run/NetworkManager/laboratory.conf <<FILE
[main]
plugins=keyfile
no-auto-default=*
dns=none
rc-manager=unmanaged
$1
FILE
    write_in_client /etc/NetworkManager/system-connections/office.nmconnection <<FILE
[connection]
id=office
uuid=11111111-2222-4333-8444-555555555555
type=ethernet
interface-name=eth1
[ipv4]
$2
[ipv6]
$3
FILE
    # It takes no profile that others may read.
    in_client chmod 600 /etc/NetworkManager/system-connections/office.nmconnection
}
# activate_networkmanager: starts it where it does not run, and its profile.
activate_networkmanager() {
    if ! is_running NetworkManager; then
        background NetworkManager --no-daemon --config /run/NetworkManager/laboratory.conf \
            --config-dir /run/NetworkManager/conf.d
        eventually in_client nmcli general status
    fi
    eventually in_client nmcli --wait 0 connection up office
}
# background COMMAND...: runs a command on the client's machine, and does not wait for it.
background() {
    in_client "$@" </dev/null >>"$work/client.log" 2>&1 &
    disown  # its end is no news
}
# pids_of NAME...: of the client's processes, those of these names, by their numbers here.
pids_of() {
    local pid name
    for pid in $(ip netns pids "$client"); do
        for name in "$@"; do
            [[ $(cat "/proc/$pid/comm" 2>/dev/null) != "$name" ]] || echo "$pid"
        done
    done
}
is_running() {
    [[ -n $(pids_of "$@") ]]
}
not_running() {
    ! is_running "$@"
}
# The programs that clients start for what they were told: one may live on and set an
# address that its client got.
hooks=(dhclient-script dhcpcd-run-hook nm-dhcp-helper udhcpc-script default.script)
# kill_processes SIGNAL NAME...: them, their hooks, and what they start meanwhile; waits until
# none has been there for some moments.
kill_processes() {
    local signal=$1 attempt pid pids none=0
    local -A told=()
    shift
    for ((attempt = 0; attempt < 300; ++attempt)); do
        pids=$(pids_of "$@" "${hooks[@]}")
        if [[ -z $pids ]]; then
            ((++none < 3)) || return 0
        else
            none=0
        fi
        for pid in $pids; do
            # Once: a second signal may cut an orderly end short.
            [[ -n ${told[$pid]:-} ]] || kill -s "$signal" "$pid" 2>/dev/null || true
            told[$pid]=yes
        done
        sleep 0.1
    done
    echo "still there: $*"
    return 1
}
# suspend_processes NAME..., resume_processes NAME...: what is suspended runs and responds to
# nothing.
suspend_processes() {
    # shellcheck disable=SC2046 # numbers
    kill -s STOP $(pids_of "$@")
}
resume_processes() {
    # shellcheck disable=SC2046 # numbers
    kill -s CONT $(pids_of "$@")
}
no_address() {
    [[ -z $(kernel_address "$1") ]]
}

# The server that leases for 20 seconds, the least that all clients accept.
start_short_server() {
    cat >"$work/udhcpd.conf" <<FILE
start 198.51.100.100
end 198.51.100.150
interface zrs$$
min_lease 10
lease_file $work/udhcpd.leases
pidfile $work/udhcpd.pid
option subnet 255.255.255.0
option router 198.51.100.1
option lease 20
FILE
    : >"$work/udhcpd.leases"
    in_server udhcpd -f "$work/udhcpd.conf" >"$work/udhcpd.log" 2>&1 &
    disown
}
stop_short_server() {
    kill "$(<"$work/udhcpd.pid")"
    eventually test ! -e "$work/udhcpd.pid"
}
stop_server() {
    kill "$(<"$work/dnsmasq.pid")"
    eventually test ! -e "$work/dnsmasq.pid"
}

need() {
    command -v "$1" >/dev/null || { echo "needs $1"; exit 1; }
}
start_bus() {
    in_client mkdir -p /run/dbus
    background dbus-daemon --system --nofork --nopidfile
    eventually in_client test -S /run/dbus/system_bus_socket || fail "no bus: $(<"$work/client.log")"
}
