# udhcpc with a script that writes what docs/sources.md recommends.
need udhcpc
processes=(udhcpc)
client_name=udhcpc
drops_address=no
# It sets an address without a lifetime, whoever ends before its lease.
address_stays=yes
state_file=/run/udhcpc.eth1.state
write_udhcpc_script() {
    write_in_client /run/udhcpc-script <<HOOK
#!/bin/sh
case \$1 in
    bound | renew)
        printf '%s\n' "ip=\$ip" "serverid=\$serverid" "lease=\$lease" "obtained=\$(date +%s)" \
            "options='\$(env | sed -n 's/^\([a-z0-9]*\)=.*/\1/p' | tr '\n' ' ')'" \
            >$state_file ;;
    deconfig) rm -f $state_file ;;
esac
exec /etc/udhcpc/default.script "\$@"
HOOK
    in_client chmod 755 /run/udhcpc-script
}
write_udhcpc_script
start_client() {
    background udhcpc -i eth1 -f -T 1 -A 1 -p "$work/client.pid" -s /run/udhcpc-script
    eventually is_running udhcpc
}
stop_client() {
    signal_client USR2 "$(<"$work/client.pid")"
    eventually no_address "$current"
    kill_processes TERM udhcpc
}
renew_client() { signal_client USR1 "$(<"$work/client.pid")"; }
said() {
    in_client sed -n "s/^$1=//p" $state_file 2>/dev/null
}
said_address() { said ip; }
said_server() { said serverid; }
