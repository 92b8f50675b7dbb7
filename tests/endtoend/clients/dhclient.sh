# ISC dhclient, started by hand.
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
