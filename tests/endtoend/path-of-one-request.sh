#!/usr/bin/env bash
# What one EnumerateInstances request does in the provider, as its log tells
# it, line for line. Times, line numbers, addresses and the host's name are what
# differs from run to run; they are replaced by T, N, ADDRESS and HOST.
#
# Usage: path-of-one-request.sh PATH-OF-cimdhcp EXPECTED
set -euo pipefail

program=$1
expected=$2
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

cat >"$work/tree.json" <<'TREE'
{ "nodes": [ { "type": "ComputerSystem", "description": "Computer",
  "properties": { "Name": "${HOSTNAME}" }, "children": [
    { "type": "Network", "description": "Network", "children": [
      { "type": "NetworkInterface", "description": "Ethernet interface",
        "properties": { "Name": "eth0", "NameMaxLength": 15, "DHCPEnabled": true,
                        "AddressSource": 1, "InterfaceState": 1 } } ] } ] } ] }
TREE
ZR_LOG_SINK=file:$work/log ZR_LOG_LEVEL=3000 \
    "$program" --exact --tree "$work/tree.json" instances QVXZR_DHCPProtocolEndpoint >/dev/null

"$(dirname "$0")/without-accidents.sh" "$work" <"$work/log" >"$work/actual"
if [[ ${UPDATE_EXPECTED:-} == yes ]]; then
    cp "$work/actual" "$expected"
fi
diff -u "$expected" "$work/actual"
