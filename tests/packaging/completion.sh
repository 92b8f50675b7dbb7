#!/usr/bin/env bash
# Completes command lines as bash would, with the real program behind.
# Usage: completion.sh COMPLETION PROGRAM TREE
set -euo pipefail

# shellcheck source=/dev/null
source "$1"
export ZR_INSTRUMENTATION_TREE=$3
program=$2

failures=0
completes() { # WANTED WORD...
    local wanted=$1
    shift
    COMP_WORDS=("$program" "$@")
    COMP_CWORD=$#
    COMPREPLY=()
    _cimdhcp
    if [[ ${COMPREPLY[*]} == "$wanted" ]]; then
        echo "ok: $*"
    else
        echo "FAILED: $* gives \"${COMPREPLY[*]}\", not \"$wanted\""
        failures=$((failures + 1))
    fi
}

completes 'show' sh
completes 'rename references' re
completes 'show serve' s
completes 'add' user a
completes '--users' user add --us
completes 'table' --format ta
completes '--format' --fo
completes '--connect --count --color' --co
completes 'always' --color al
completes 'state' show --sort st
completes 'PATH' instances QVXZR_DHCPCapabilities --sort ''
completes '' --connect localhost --timeout ''
completes 'show serve' --parallel 3 --hosts file s
completes 'QVXZR_DHCPSettingData' names QVXZR_DHCPS
completes 'QVXZR_DHCPProtocolEndpoint' --format json instances QVXZR_DHCPP
completes 'QVXZR_SAPSAPDependency' associators --assoc-class QVXZR_SAP
completes 'eth0 eth1' rename eth
completes '' rename eth0 of
completes 'eth0 eth1' watch wlan0 eth
completes '--parallel --provider-dir --poll' watch --p
completes '' watch --poll ''
completes 'version' profiles --sort v
completes '--create' rename --crea
completes '--sort --schema-dir --svg' graph --s
completes "$3" --tree "${3%.json}"
completes '--registration-dir --result-class --role --result-role' associators --r
exit $((failures > 0))
