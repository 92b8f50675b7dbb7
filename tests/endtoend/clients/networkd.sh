# systemd-networkd and a system bus at which it can be asked.
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
