#!/bin/sh
# usage: service.sh BUILD-DIRECTORY UNIT-TEMPLATE
# The unit of the server: systemd has nothing against it, and the server serves the
# machine under as many of its restrictions as can be had without systemd: another
# user, no capabilities and none to gain, a file system that can only be read, with
# a /tmp of its own, and the limits of descriptors. What needs systemd or a seccomp
# filter (system calls, address families, executable memory) is not applied.
set -eu
build=$1
template=$2
directory=$(mktemp -d)
trap 'kill "$server" 2> /dev/null || true; rm -rf "$directory"' EXIT
server=

unit=$directory/cimdhcp.service
sed -e "s|@CMAKE_INSTALL_PREFIX@/@BINDIR@|$build/bin|" "$template" > "$unit"
# The manual page that units name is there where they are installed.
if command -v systemd-analyze > /dev/null; then
    systemd-analyze verify --man=no "$unit" 2> "$directory/complaints" || true
    # Of its neighbours, as they would be installed beside it.
    for further in cimdhcp-metrics.service cimdhcp-metrics.timer cimdhcp-exporter.service; do
        source=${template%/*}/$further
        test -e "$source" || source=$source.in
        sed -e "s|@CMAKE_INSTALL_PREFIX@/@BINDIR@|$build/bin|" "$source" > "$directory/$further"
        systemd-analyze verify --man=no "$directory/$further" 2>> "$directory/complaints" || true
    done
    # Other units of the machine are none of ours.
    if grep -F cimdhcp "$directory/complaints"; then
        exit 1
    fi
fi

if [ "$(id -u)" != 0 ] || ! unshare --mount true 2> /dev/null; then
    echo "the restrictions need root and a mount namespace"
    exit 77
fi
# Those that are applied have to be those of the unit.
for line in DynamicUser=yes CapabilityBoundingSet= NoNewPrivileges=yes UMask=0077 \
    LimitNOFILE=4096 ProtectSystem=strict PrivateTmp=yes; do
    grep -qx "$line" "$unit"
done
command=$(sed -n 's/^ExecStart=//p' "$unit")
schema=$(realpath "$build/share/dhcp-client-provider/schema")
chmod 755 "$directory"
mkfifo "$directory/output"
chmod 666 "$directory/output"
# The build tree may be in /tmp, which the server gets an empty one of.
cat > "$directory/start" << END
set -eu
mount --make-rprivate /
mkdir -p /run/cimdhcp-build
mount -t tmpfs none /run/cimdhcp-build
mkdir /run/cimdhcp-build/tree /run/cimdhcp-build/schema /run/cimdhcp-build/service
mount --bind "$build" /run/cimdhcp-build/tree
mount --bind "$schema" /run/cimdhcp-build/schema
mount --bind "$directory" /run/cimdhcp-build/service
mount -t tmpfs -o mode=1777,nosuid,nodev none /tmp
mkdir -p "$build" "$schema"
mount --bind /run/cimdhcp-build/tree "$build"
mount --bind /run/cimdhcp-build/schema "$schema"
mount -o remount,bind,ro /
mount -o remount,bind,ro "$build"
cd /
umask 0077
ZR_LOG_SINK=none exec prlimit --nofile=4096 setpriv --reuid=65534 --regid=65534 --clear-groups \\
    --inh-caps=-all --bounding-set=-all --no-new-privs \\
    $command --listen 127.0.0.1:0 > /run/cimdhcp-build/service/output 2>&1
END
unshare --mount sh "$directory/start" &
server=$!
read -r line < "$directory/output" || true
case $line in
    "Listening on http://"*) url=${line#Listening on } ;;
    *) echo "not served: $line" && exit 1 ;;
esac

grep -qx "NoNewPrivs:	1" "/proc/$server/status"
grep -qx "CapEff:	0000000000000000" "/proc/$server/status"
grep -qx "CapBnd:	0000000000000000" "/proc/$server/status"
grep -q "^Uid:	65534	65534" "/proc/$server/status"
grep -Eq "^[^ ]+ / [^ ]+ ro(,|$)" "/proc/$server/mounts"

wbemcli ein "${url%/cimom}/root/cimv2:CIM_ComputerSystem" > "$directory/systems"
grep -F ":QVXZR_ComputerSystem.CreationClassName=\"QVXZR_ComputerSystem\",Name=\"$(hostname)\"" \
    "$directory/systems"
# All interfaces of the machine have settings, whether they use DHCP or not.
wbemcli ein "${url%/cimom}/root/cimv2:QVXZR_DHCPSettingData" | sed 's|^[^/]*/||' \
    > "$directory/settings"
"$build/bin/cimdhcp" names QVXZR_DHCPSettingData > "$directory/expected"
test -s "$directory/expected"
diff "$directory/expected" "$directory/settings"
kill "$server"
wait "$server"
server=
