# NetworkManager with the DHCP client that it brings.
need NetworkManager
need nmcli
: "${backend:=internal}"
processes=(NetworkManager dhclient dhcpcd nm-dhcp-helper)
client_name='@(NetworkManager|dhclient|dhcpcd)'
follows_name=no
# Without a cable no profile is active, after some seconds.
without_cable='@(true|false)'
in_client mkdir -p /run/NetworkManager/conf.d /var/lib/NetworkManager
write_in_client /run/NetworkManager/laboratory.conf <<FILE
[main]
dhcp=$backend
plugins=keyfile
no-auto-default=*
dns=none
rc-manager=unmanaged
FILE
write_in_client /etc/NetworkManager/system-connections/office.nmconnection <<'FILE'
[connection]
id=office
uuid=11111111-2222-4333-8444-555555555555
type=ethernet
interface-name=eth1
[ipv4]
method=auto
dhcp-timeout=2147483647
[ipv6]
method=disabled
FILE
# It takes no profile that others may read.
in_client chmod 600 /etc/NetworkManager/system-connections/office.nmconnection
start_bus
start_client() {
    if ! is_running NetworkManager; then
        background NetworkManager --no-daemon --config /run/NetworkManager/laboratory.conf \
            --config-dir /run/NetworkManager/conf.d
        eventually in_client nmcli general status
    fi
    eventually in_client nmcli --wait 0 connection up office
}
stop_client() { in_client nmcli connection down office >>"$work/client.log" 2>&1; }
renew_client() { in_client nmcli connection up office >>"$work/client.log" 2>&1; }
said() {
    in_client nmcli -t -f DHCP4 device show "$current" | sed -n "s/^DHCP4.OPTION\[[0-9]*\]:$1 = //p"
}
said_address() { said ip_address; }
said_server() { said dhcp_server_identifier; }
