#!/usr/bin/env bash
# What happens to a DHCPv4 client and its link, event after event: after each, what the
# program shows is compared with what the client and the kernel say.
#
# Usage: dhcp-events.sh PATH-OF-cimdhcp PATH-OF-tree-on-request CLIENT EVENTS
# CLIENT: one of the set-ups of dhcp-clients.sh, or NetworkManager-PROGRAM; EVENTS: life (leases of
# ten minutes) or end (of twenty seconds, which end).
set -euo pipefail

program=$1
tree_on_request=$2
kind=$3
events=$4
subject=$kind
here=$(dirname "$0")
source "$here/dhcp-laboratory.sh"
source "$here/dhcp-truth.sh"
source "$here/dhcp-clients.sh"

# A client has the functions start_client, which returns while it asks, stop_client, which
# gives the lease back, said_address and said_server; renew_client if it can be told to.
# Besides it tells
processes=()          # the names of its processes
client_name=          # how the program calls it
tells_server=yes      # whether anything tells the server
gives_up=no           # whether it soon takes an address of its own where no server is; then
                      # it has misses_cable, which tells whether it knows that the cable is out
source_of_none=0      # AddressSource where no server is, after some time
address_stays=no      # whether its address stays when it is killed and the lease ends
without_cable=true    # DHCPEnabled when the cable is out and the address gone
file_found=yes        # whether its lease file is found when it does not run
drops_address=yes     # whether it takes its address away when the cable is out
loses_name=no         # whether nothing ties it to its link then
asked_on_bus=()       # the names of its processes that respond on the system bus
follows_name=yes      # whether it goes on when its link gets another name
"set_up_${kind%-@(dhclient|dhcpcd)}"

leased() {
    local address
    address=$(kernel_address "$current")
    [[ $address == 198.51.100.* && $(said_address) == "$address" ]]
}
leases_elsewhere() { # leases_elsewhere ADDRESS: it has a lease of another address
    local address
    address=$(kernel_address "$current")
    [[ -n $address && $address != "$1" && $(said_address) == "$address" ]]
}
await_lease() {
    eventually leased || { explain; fail "$kind gets no lease $*"; }
}
# Takes the cable out and puts it in again, at which a client that has given up asks.
replug() {
    ip -n "$server" link set zrs$$ down
    eventually misses_cable || { explain; fail "$kind does not miss the cable"; }
    ip -n "$server" link set zrs$$ up
}
explain() {
    echo "--- the kernel:"; ip -n "$client" address show
    echo "--- the client: $(said_address) $(said_server)"; tail -30 "$work/client.log"
    cat "$work/dnsmasq.log" "$work/udhcpd.log" 2>/dev/null || true
}

# What is true with a lease of the address that the kernel has, from the server that is given.
bound() {
    local moment=$1 server=$2 address
    address=$(kernel_address "$current")
    if [[ $tells_server == yes ]]; then
        truth "$moment" enabled=true source=1 servers="$server" \
            lease4="$client_name @(5|8) $address @(-|$server)"
    else
        truth "$moment" enabled=true source=1 servers="@(none|$server)" \
            lease4="$client_name @(0|5|8) @(-|$address) @(-|$server)"
    fi
}
# What is true while a client asks: no address, so none that was obtained.
asking() {
    truth "$1" enabled=true source=0 servers=none lease4="$client_name [023467] - -"
}
# What is true without a client and without an address.
nothing() {
    truth "$1" enabled=false source=0 servers=none lease4=none
}
# An address that someone set by hand, and DHCP nowhere.
by_hand() {
    truth "$1" enabled=false source=3 servers=none lease4=none
}
set_by_hand() {
    ip -n "$client" address flush dev "$current" scope global
    ip -n "$client" address add "$1/24" dev "$current"
}

life() {
    local first second
    nothing "before it runs"

    start_client || { explain; fail "$kind does not start"; }
    eventually is_running "${processes[@]}"
    asking "no server"
    if ((${#asked_on_bus[@]} != 0)); then
        suspend_processes "${asked_on_bus[@]}"
        truth_now "no server, and it does not respond" enabled='@(true|unknown)' \
            source="$source_of_none" servers=none
        tells "no server, and it does not respond" 'cannot be asked'
        resume_processes "${asked_on_bus[@]}"
        truth "no server, and it responds again" enabled=true source="$source_of_none" servers=none
    fi

    start_server
    [[ $gives_up == no ]] || replug
    await_lease
    first=$(kernel_address)
    bound "a lease" 198.51.100.1
    if ((${#asked_on_bus[@]} != 0)); then
        suspend_processes "${asked_on_bus[@]}"
        truth_now "a lease, and it does not respond" enabled=true source=1
        resume_processes "${asked_on_bus[@]}"
        bound "a lease, and it responds again" 198.51.100.1
    fi
    if declare -F kill_link >/dev/null; then
        kill_link || { explain; fail "$kind does not understand"; }
        await_lease "after it was told to leave the link"
        bound "told to leave the link" 198.51.100.1
    fi

    ip -n "$server" link set zrs$$ down
    if [[ $drops_address == no ]]; then
        bound "the cable out" 198.51.100.1
    else
        eventually no_address "$current" || { explain; fail "$kind keeps its address without a cable"; }
        truth "the cable out" enabled="$without_cable" source=0 servers=none
    fi
    ip -n "$server" link set zrs$$ up
    await_lease "with the cable in again"
    bound "the cable in again" 198.51.100.1

    if declare -F renew_client >/dev/null; then
        sleep 1  # ends are told in seconds
        before=$(lease_end)
        renew_client || { explain; fail "$kind does not renew its lease"; }
        eventually renewed || { explain; fail "$kind has not renewed its lease"; }
        bound "renewed" 198.51.100.1

        stop_server
        rm -f "$work/server.leases"
        range=198.51.100.200,198.51.100.220
        start_server
        if declare -F ask_anew >/dev/null; then ask_anew; else renew_client; fi ||
            { explain; fail "$kind does not ask anew"; }
        if eventually leases_elsewhere "$first"; then
            bound "another address" 198.51.100.1
        else
            explain
            fail "$kind takes no other address than $first"
        fi
    fi

    stop_client || { explain; fail "$kind does not give the lease back"; }
    eventually no_address "$current" || { explain; fail "$kind keeps its address"; }
    nothing "released"

    change_server
    start_client || { explain; fail "$kind does not start again"; }
    await_lease "from another server"
    second=$(kernel_address)
    bound "another server" 198.51.100.2

    if [[ $follows_name == yes ]]; then
        ip -n "$client" link set eth1 name lan0
        current=lan0
        if [[ $loses_name == no ]]; then
            bound "under another name" 198.51.100.2
        else
            truth "under another name" enabled=unknown source=0
        fi
        current=eth1
        truth "its former name" link=no
        ip -n "$client" link set lan0 name eth1
        await_lease "under its name again"
        bound "under its name again" 198.51.100.2
    fi

    ip -n "$client" address flush dev "$current" scope global
    # Some clients see that, and have the address again at some time.
    truth "the address flushed" enabled=true source='@(0|1)' servers='@(none|198.51.100.2)'

    kill_processes KILL "${processes[@]}"
    set_by_hand 198.51.100.30
    by_hand "killed, and an address set by hand"
    if [[ $address_stays == no ]]; then
        set_by_hand "$second"
        by_hand "killed, and its last address set by hand"
    fi
    ip -n "$client" address flush dev "$current" scope global
    nothing "killed, and no address"

    ip -n "$client" link delete "$current"
    truth "the link removed" link=no
}
unleased() { [[ $(kernel_address "$current") != 198.51.100.* ]]; }
renewed() { [[ $(lease_end) -gt $before ]] && leased; }

end() {
    local ended
    start_short_server
    start_client || { explain; fail "$kind does not start"; }
    await_lease
    bound "a lease of twenty seconds" 198.51.100.1

    stop_short_server
    eventually unleased || { explain; fail "$kind keeps its address without a server"; }
    if [[ $gives_up == no ]]; then
        asking "no server until the end of the lease"
    else
        truth "no server until the end of the lease" enabled=true source='@(0|4)' servers=none
    fi

    start_short_server
    [[ $gives_up == no ]] || replug
    await_lease "after the end of another"
    bound "a lease after the end of another" 198.51.100.1
    ended=$((SECONDS + 20))
    kill_processes KILL "${processes[@]}"
    # Who has seen the file of a manager that does not run cannot tell whose the server was.
    local facts=(enabled=true source=1)
    [[ $address_stays == no ]] || facts=(link=yes)
    [[ $file_found == yes ]] || facts=(enabled=unknown source=0)
    truth "killed while the lease runs" "${facts[@]}"
    while ((SECONDS <= ended)); do
        sleep 0.2
    done
    if no_address "$current"; then
        nothing "killed, and the lease has ended"
    else
        truth "killed, and the lease has ended" enabled=false servers=none lease4=none
    fi
}

case $events in
    life | end) "$events" ;;
    *)
        echo "no such events: $events"
        exit 2
        ;;
esac
finish
