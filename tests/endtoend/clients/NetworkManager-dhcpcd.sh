# NetworkManager, which starts dhcpcd.
need dhcpcd
backend=dhcpcd
source "$clients/NetworkManager.sh"
