# udhcpc as it is: no file tells what it knows. The test's own is none that would be read.
source "$clients/udhcpc.sh"
state_file=/run/laboratory.state
write_udhcpc_script
tells_server=no
loses_name=yes
