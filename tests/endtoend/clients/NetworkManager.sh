# NetworkManager with the DHCP client that it brings.
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
