# dhcpcd for one link.
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
