# connman, which tells what it does on its bus alone.
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
