# systemd-networkd where there is no bus: its files are all that tells.
start_bus() { :; }
source "$clients/networkd.sh"
unset -f renew_client ask_anew
asked_on_bus=()
