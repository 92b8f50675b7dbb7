# NetworkManager, which starts dhclient.
need dhclient
backend=dhclient
source "$clients/NetworkManager.sh"
