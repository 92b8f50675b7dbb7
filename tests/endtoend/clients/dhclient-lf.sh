# ISC dhclient with a lease file where no one would look for it.
source "$clients/dhclient.sh"
file_found=no
leases=/run/laboratory/eth1.db
dhclient_options+=(-lf $leases)
in_client mkdir /run/laboratory
