#!/usr/bin/env bash
# Every line that the two providers write on any road, once, for requests of every kind
# on a machine with one interface of each sort and a service processor.
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
    # A request that fails writes lines, too.
    ZR_LOG_SINK=file:$work/log ZR_LOG_LEVEL=0 ZR_TRACE_SINK=file:$work/log ZR_TRACE_LEVEL=0 \
        "$program" --tree "$work/tree.json" --data-dir "$work/data" "$@" >"$work/answer" 2>&1 || true
}

mapfile -t classes < <("$program" --tree "$work/tree.json" --format json classes |
    jq -r '.. | objects | .class? // .name? // empty' | grep '^QVXZR_' | sort -u)
((${#classes[@]} > 10))
for class in "${classes[@]}"; do
    ask names "$class"
    mapfile -t paths < <(grep "^.*$class\\." "$work/answer" || true)
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

"$(dirname "$0")/without-accidents.sh" "$work" <"$work/log" | LC_ALL=C sort -u >"$work/actual"
if [[ ${UPDATE_EXPECTED:-} == yes ]]; then
    cp "$work/actual" "$expected"
fi
diff -u "$expected" "$work/actual"
