# The DHCP clients of the laboratory: a function for each set-up, which tells how it is
# started, stopped and asked, and what it says itself. It sets what the events expect.

# ISC dhclient, started by hand.
set_up_dhclient() {
    need dhclient
    processes=(dhclient)
    client_name=dhclient
    drops_address=no
    leases=/var/lib/dhcp/dhclient.leases
    dhclient_options=(-q -pf "$work/client.pid")
    # Without these it would wait for ten seconds and longer before it asks again.
    write_in_client /etc/dhcp/dhclient.conf <<'FILE'
request subnet-mask, broadcast-address, routers;
initial-interval 1;
backoff-cutoff 2;
retry 2;
FILE

    start_client() { in_client dhclient -nw "${dhclient_options[@]}" eth1 </dev/null >>"$work/client.log" 2>&1; }
    stop_client() {
        in_client dhclient -r "${dhclient_options[@]}" "$current" </dev/null >>"$work/client.log" 2>&1
        eventually not_running dhclient
    }
    # It has no request to renew: it is told to end, and asks for its address again.
    renew_client() {
        in_client dhclient -x "${dhclient_options[@]}" "$current" </dev/null >>"$work/client.log" 2>&1
        eventually not_running dhclient
        start_client
    }
    said() {
        in_client sed -n "s/^  $1 \(.*\);\$/\1/p" "$leases" | tail -1
    }
    said_address() { said fixed-address; }
    said_server() { said 'option dhcp-server-identifier'; }
}

# ISC dhclient with a lease file where no one would look for it.
set_up_dhclient-lf() {
    set_up_dhclient
    file_found=no
    leases=/run/laboratory/eth1.db
    dhclient_options+=(-lf $leases)
    in_client mkdir /run/laboratory
}

# ifupdown, which starts dhclient.
set_up_ifupdown() {
    set_up_dhclient
    need ifup
    leases=/var/lib/dhcp/dhclient.eth1.leases
    write_in_client /etc/network/interfaces <<'FILE'
iface eth1 inet dhcp
FILE
    start_client() {
        # It waits for a lease.
        background ifup eth1
        eventually is_running dhclient
    }
    stop_client() { in_client ifdown eth1 </dev/null >>"$work/client.log" 2>&1; }
    unset -f renew_client
}

# dhcpcd for one link.
set_up_dhcpcd() {
    need dhcpcd
    processes=(dhcpcd)
    client_name=dhcpcd
    dhcpcd_options=(-b --nohook resolv.conf --noipv6rs --noipv4ll --nodelay --nodev -4)
    start_client() { in_client dhcpcd "${dhcpcd_options[@]}" eth1 </dev/null >>"$work/client.log" 2>&1; }
    stop_client() { in_client dhcpcd -4 -k "$current" </dev/null >>"$work/client.log" 2>&1; }
    # What asks the one that runs does not always end after that.
    ask_running() { in_client timeout --signal=KILL 3 dhcpcd "$@" </dev/null >>"$work/client.log" 2>&1 || (($? == 137)); }
    renew_client() { ask_running -4 -n "$current"; }
    # Its file is the message of the server; "dhcpcd -U" does not always end, either.
    said_address() {
        in_client od -An -tu1 -j16 -N4 "/var/lib/dhcpcd/$current.lease" 2>/dev/null |
            sed 's/^ *//; s/  */./g'
    }
    said_server() { :; }
}

# dhcpcd for all links.
set_up_dhcpcd-manager() {
    set_up_dhcpcd
    write_in_client /etc/dhcpcd.conf <<'FILE'
ipv4only
noipv4ll
nohook resolv.conf
FILE
    start_client() { in_client dhcpcd -b --nodelay --nodev </dev/null >>"$work/client.log" 2>&1; }
    # It takes a renewal for one link, but gives leases back at its end alone: "dhcpcd -k LINK"
    # finds no dhcpcd.
    stop_client() {
        in_client dhcpcd -k </dev/null >>"$work/client.log" 2>&1
        eventually not_running dhcpcd
    }
    kill_link() { ask_running -k "$current" || (($? == 1)); }
    renew_client() { ask_running -n "$current"; }
    # It does not take a second request to renew soon after the first.
    ask_anew() {
        ip -n "$server" link set zrs$$ down
        eventually no_address "$current"
        ip -n "$server" link set zrs$$ up
    }
}

# udhcpc with a script that writes what docs/sources.md recommends.
set_up_udhcpc() {
    need udhcpc
    processes=(udhcpc)
    client_name=udhcpc
    drops_address=no
    # It sets an address without a lifetime, whoever ends before its lease.
    address_stays=yes
    state_file=/run/udhcpc.eth1.state
    write_udhcpc_script() {
        write_in_client /run/udhcpc-script <<HOOK
#!/bin/sh
case \$1 in
    bound | renew)
        printf '%s\n' "ip=\$ip" "serverid=\$serverid" "lease=\$lease" "obtained=\$(date +%s)" \
            "options='\$(env | sed -n 's/^\([a-z0-9]*\)=.*/\1/p' | tr '\n' ' ')'" \
            >$state_file ;;
    deconfig) rm -f $state_file ;;
esac
exec /etc/udhcpc/default.script "\$@"
HOOK
        in_client chmod 755 /run/udhcpc-script
    }
    write_udhcpc_script
    start_client() {
        background udhcpc -i eth1 -f -T 1 -A 1 -p "$work/client.pid" -s /run/udhcpc-script
        eventually is_running udhcpc
    }
    stop_client() {
        signal_client USR2 "$(<"$work/client.pid")"
        eventually no_address "$current"
        kill_processes TERM udhcpc
    }
    renew_client() { signal_client USR1 "$(<"$work/client.pid")"; }
    said() {
        in_client sed -n "s/^$1=//p" $state_file 2>/dev/null
    }
    said_address() { said ip; }
    said_server() { said serverid; }
}

# udhcpc as it is: no file tells what it knows. The test's own is none that would be read.
set_up_udhcpc-silent() {
    set_up_udhcpc
    state_file=/run/laboratory.state
    write_udhcpc_script
    tells_server=no
    loses_name=yes
}

# systemd-networkd and a system bus at which it can be asked.
set_up_networkd() {
    networkd=/lib/systemd/systemd-networkd
    need $networkd
    need networkctl
    processes=(systemd-network)
    client_name=systemd-networkd
    follows_name=no
    asked_on_bus=(systemd-network)
    in_client mkdir -p /run/systemd/netif/links /run/systemd/netif/leases /run/systemd/netif/lldp
    in_client chown -R systemd-network: /run/systemd/netif
    write_in_client /etc/systemd/network/10-eth1.network <<'FILE'
[Match]
Name=eth1 lan0
[Network]
DHCP=ipv4
LinkLocalAddressing=no
IPv6AcceptRA=no
FILE
    start_bus
    start_client() { background env container=laboratory $networkd; }
    stop_client() { kill_processes TERM systemd-network; }
    renew_client() { in_client networkctl renew "$current" </dev/null >>"$work/client.log" 2>&1; }
    lease_file() {
        echo "/run/systemd/netif/leases/$(ip -n "$client" -j link show dev "$current" | jq '.[0].ifindex')"
    }
    said() {
        in_client sed -n "s/^$1=//p" "$(lease_file)" 2>/dev/null
    }
    said_address() { said ADDRESS; }
    said_server() { said SERVER_ADDRESS; }
    # A server refuses a renewal where it does not listen.
    ask_anew() { in_client networkctl reconfigure "$current" </dev/null >>"$work/client.log" 2>&1; }
}

# systemd-networkd where there is no bus: its files are all that tells.
set_up_networkd-no-bus() {
    start_bus() { :; }
    set_up_networkd
    unset -f renew_client ask_anew
    asked_on_bus=()
}

# NetworkManager with the DHCP client that it brings.
set_up_NetworkManager() {
    need NetworkManager
    need nmcli
    # The program behind it is named after it, if it is not its own.
    backend=${kind#NetworkManager}
    backend=${backend#-}
    [[ -z $backend ]] || need "$backend"
    processes=(NetworkManager dhclient dhcpcd nm-dhcp-helper)
    client_name='@(NetworkManager|dhclient|dhcpcd)'
    follows_name=no
    asked_on_bus=(NetworkManager)
    # Without a cable no profile is active, after some seconds.
    without_cable='@(true|false)'
    prepare_networkmanager "dhcp=${backend:-internal}" $'method=auto\ndhcp-timeout=2147483647' method=disabled
    start_bus
    start_client() { activate_networkmanager; }
    stop_client() { in_client nmcli connection down office >>"$work/client.log" 2>&1; }
    renew_client() { in_client nmcli connection up office >>"$work/client.log" 2>&1; }
    said() {
        in_client nmcli -t -f DHCP4 device show "$current" | sed -n "s/^DHCP4.OPTION\[[0-9]*\]:$1 = //p"
    }
    said_address() { said ip_address; }
    said_server() { said dhcp_server_identifier; }
}

# connman, which tells what it does on its bus alone.
set_up_connman() {
    need connmand
    need connmanctl
    processes=(connmand)
    client_name=connman
    address_stays=yes
    tells_server=no
    follows_name=no
    asked_on_bus=(connmand)
    # Without a server it soon takes an address of its own, and asks again after minutes.
    gives_up=yes
    source_of_none='@(0|4)'
    in_client mkdir -p /var/lib/connman
    start_bus
    start_client() {
        is_running connmand || background connmand -n -i eth1
    }
    misses_cable() { [[ -z $(service) ]]; }
    service() { in_client connmanctl services | sed -n 's/.* \(ethernet_[0-9a-f]*_cable\)$/\1/p'; }
    stop_client() { kill_processes TERM connmand; }
    said_address() {
        in_client connmanctl services "$(service)" | sed -n 's/^ *IPv4 = .*Method=dhcp.* Address=\([0-9.]*\).*/\1/p'
    }
    said_server() { :; }
}
