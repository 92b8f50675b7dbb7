# dhcpcd for all links.
source "$clients/dhcpcd.sh"
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
