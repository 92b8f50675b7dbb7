#!/usr/bin/env bash
# The lines that the two providers write, in their order, for requests of every kind on
# a machine with one interface of each sort and a service processor. A line is left out
# where the same two lines followed each other before: each step from one line to the
# next is told once, at the first request that takes it.
#
# Usage: trace-lines.sh PATH-OF-cimdhcp EXPECTED
#        UPDATE_EXPECTED=yes trace-lines.sh ...   takes today's lines as the right ones
set -euo pipefail

program=$1
expected=$2
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

cat >"$work/tree.json" <<'TREE'
{ "nodes": [
  { "type": "ComputerSystem", "description": "Computer",
    "properties": { "Name": "${HOSTNAME}", "NameMaxLength": 64 }, "children": [
    { "type": "Network", "description": "Network", "children": [
      { "type": "NetworkInterface", "description": "Ethernet interface",
        "properties": { "Name": "eth0", "NameMaxLength": 15, "DHCPEnabled": true,
                        "AddressSource": 1, "InterfaceState": 1, "IPv4Address": "192.0.2.10",
                        "DHCPServerAddresses": ["192.0.2.1", "192.0.2.2"] } },
      { "type": "NetworkInterface", "description": "Ethernet interface",
        "properties": { "Name": "eth1", "NameMaxLength": 15, "DHCPEnabled": false,
                        "AddressSource": 3, "InterfaceState": 1, "IPv4Address": "192.0.2.11",
                        "DHCPServerAddresses": [] } },
      { "type": "NetworkInterface", "description": "Ethernet interface",
        "properties": { "Name": "eth2", "DHCPEnabled": true, "AddressSource": 1,
                        "DHCPServerAddresses": [] } } ] } ] },
  { "type": "ComputerSystem", "description": "BMC",
    "properties": { "Name": "BMC:-1" }, "children": [
    { "type": "Network", "description": "Network", "children": [
      { "type": "NetworkInterface", "description": "LAN channel",
        "properties": { "Name": "bmc-lan1", "DHCPEnabled": true, "AddressSource": 1,
                        "IPv4Address": "192.0.2.20", "DHCPServerAddresses": [] } } ] } ] } ] }
TREE
mkdir "$work/data"
printf 'CONFIG_NAME=office\n' >"$work/data/ifcfg-eth0"

ask() {
    printf '== %s\n' "$*" | tee -a "$work/log" >>"$work/trace"
    # A request that fails writes lines, too.
    ZR_LOG_SINK=file:$work/log ZR_LOG_LEVEL=0 ZR_TRACE_SINK=file:$work/trace ZR_TRACE_LEVEL=0 \
        "$program" --exact --tree "$work/tree.json" --data-dir "$work/data" "$@" >"$work/response" 2>&1 || true
}

# Standard input without the steps that were told before.
first_steps() {
    awk '/^== / { request = $0; previous = ""; next }
         !told[previous, $0]++ { if (request != "") print request; request = ""; print }
         { previous = $0 }'
}

mapfile -t classes < <("$program" --tree "$work/tree.json" --format json classes |
    jq -r '.. | objects | .class? // .name? // empty' | grep '^QVXZR_' | sort -u)
((${#classes[@]} > 10))
for class in "${classes[@]}"; do
    ask names "$class"
    mapfile -t paths < <(grep "^.*$class\\." "$work/response" || true)
    ask instances "$class"
    for path in "${paths[@]}"; do
        ask get "$path"
        ask associators "$path"
        ask associators --names "$path"
        ask references "$path"
        ask references --names "$path"
    done
    ask get "$class.InstanceID=\"nobody\""
    ask modify "$class.InstanceID=\"Computer%eth0\"" ConfigurationName=home
    ask modify "$class.InstanceID=\"Computer%eth2\"" ConfigurationName=home
    ask associators "$class.InstanceID=\"nobody\""
    ask references "$class.Name=\"nobody\""
done

here=$(dirname "$0")
"$here/without-accidents.sh" "$work" <"$work/log" >"$work/logged"
"$here/without-accidents.sh" "$work" <"$work/trace" >"$work/traced"
diff -u "$work/logged" "$work/traced"
first_steps <"$work/logged" >"$work/actual"
if [[ ${UPDATE_EXPECTED:-} == yes ]]; then
    cp "$work/actual" "$expected"
fi
diff -u "$expected" "$work/actual"
