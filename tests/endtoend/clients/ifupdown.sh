# ifupdown, which starts dhclient.
source "$clients/dhclient.sh"
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
