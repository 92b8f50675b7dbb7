#!/usr/bin/env bash
# Makes the Debian packages, lets lintian read them, and installs, uses and purges them
# in a root of their own: the machine's, with everything that is written going to a
# file system in memory, which ends with the test. Packages that the machine itself has
# installed, and what they keep, are taken out of that root first.
# Usage: packages.sh BUILD_DIRECTORY TREE
set -euo pipefail

build=$1
tree=$2
directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT

(cd "$build" && cpack --config CPackConfig.cmake -B "$directory/packages") >"$directory/cpack.log" 2>&1 || {
    cat "$directory/cpack.log"
    exit 1
}
packages=("$directory"/packages/*.deb)
echo "== packages"
for package in "${packages[@]}"; do
    dpkg-deb --show --showformat='${Package}: ${Description}\n' "$package" | sed -n 1p
done
lintian --allow-root --fail-on error --suppress-tags initial-upload-closes-no-bugs "${packages[@]}"

cp "$tree" "$directory/tree.json"
# What is in the way on a machine where the packages are installed.
cat >"$directory/clear" <<'TEXT'
set -euo pipefail
dpkg --purge cimdhcp cmpi-dhcp-client cmpi-dhcp-client-neighbours cmpi-dhcp-client-provider \
    dhcp-client-provider-schema
rm -rf /etc/zr /var/lib/dhcp-client-provider
TEXT
cat >"$directory/inside" <<'TEXT'
set -euo pipefail
cd /packages
echo "== install"
dpkg --install *.deb >/dev/null
test -x /usr/bin/cimdhcp
command -v cimdhcp
grep -x 'ExecStart=/usr/bin/cimdhcp serve --read-only' /usr/lib/systemd/system/cimdhcp.service
grep -E '^ExecStart=/usr/bin/cimdhcp (metrics|exporter) ' \
    /usr/lib/systemd/system/cimdhcp-{metrics,exporter}.service >/dev/null
# They are off until a person turns them on.
test -e /usr/lib/systemd/system/cimdhcp-metrics.timer
[[ -z $(find /etc/systemd/system -name 'cimdhcp*') ]]
test -s /usr/share/cimdhcp/monitoring/dashboard.json
grep -Fx 'ExecReload=/bin/kill -HUP $MAINPID' /usr/lib/systemd/system/cimdhcp.service >/dev/null
for page in man1/cimdhcp.1 man5/zr-platform.conf.5 man8/provider-register.sh.8; do
    test -s /usr/share/man/$page.gz
done
echo "== use"
stat --format='%U %a' /var/lib/dhcp-client-provider
printf 'DEVICE=eth0\nCONFIG_NAME=old\n' >/var/lib/dhcp-client-provider/ifcfg-eth0
cimdhcp --tree /tree.json show
cimdhcp --tree /tree.json rename eth0 new
grep -x CONFIG_NAME=new /var/lib/dhcp-client-provider/ifcfg-eth0
cimdhcp --tree /tree.json classes | tail -n +2 | wc -l
cimdhcp --exact --tree /tree.json classes | tail -n +2 | wc -l
DESTDIR=/stage /usr/share/dhcp-client-provider/provider-register.sh -t sfcb -v | grep -c written
DESTDIR=/stage /usr/share/dhcp-client-provider/provider-register.sh -t sfcb -d
echo "== a setting that was changed survives a new installation"
echo LOG_LEVEL=4000 >/etc/zr/platform.conf
dpkg --install --force-confdef dhcp-client-provider-schema_*.deb >/dev/null
cat /etc/zr/platform.conf
echo "== a library that is removed is taken out of the object manager"
# In the place of one that was built from source; dpkg's PATH may be without it.
mkdir -p /usr/local/bin /usr/local/var/lib/sfcb/stage
printf '#!/bin/sh\necho "sfcbrepos $*"\n' >/usr/local/bin/sfcbrepos
chmod +x /usr/local/bin/sfcbrepos
registered() { (cd /usr/local/var/lib/sfcb/stage && find . -type f | LC_ALL=C sort); }
/usr/share/dhcp-client-provider/provider-register.sh --exact
registered
# The other packages' registration stays.
PATH=/usr/sbin:/usr/bin:/sbin:/bin dpkg --remove cmpi-dhcp-client-neighbours | grep sfcbrepos
registered
/usr/share/dhcp-client-provider/provider-register.sh
registered
PATH=/usr/sbin:/usr/bin:/sbin:/bin dpkg --remove cimdhcp cmpi-dhcp-client | grep sfcbrepos
registered
rm -r /usr/local/bin/sfcbrepos /usr/local/var/lib/sfcb
rmdir -p --ignore-fail-on-non-empty /usr/local/var/lib
echo "== purge"
dpkg --purge cimdhcp cmpi-dhcp-client cmpi-dhcp-client-neighbours cmpi-dhcp-client-provider \
    dhcp-client-provider-schema >/dev/null
TEXT

# dpkg's own records, and what ldconfig and the package's triggers refresh, stay.
cat >"$directory/outside" <<'TEXT'
set -euo pipefail
directory=$1
mount -t tmpfs none "$directory/memory"
mkdir "$directory"/memory/{upper,work,root}
mount -t overlay none -o "lowerdir=/,upperdir=$directory/memory/upper,workdir=$directory/memory/work" \
    "$directory/memory/root"
mkdir "$directory/memory/root/packages"
cp "$directory"/packages/*.deb "$directory/memory/root/packages"
cp "$directory/clear" "$directory/inside" "$directory/tree.json" "$directory/memory/root/"
mount -t proc none "$directory/memory/root/proc"
mount --bind /dev "$directory/memory/root/dev"
# All that was written, and the directories of the packages.
written() {
    (cd "$directory/memory/upper" &&
        find . -mindepth 1 \( ! -type d -o -name '*dhcp-client*' -o -name zr \) | LC_ALL=C sort)
}
chroot "$directory/memory/root" /bin/bash /clear >"$directory/cleared" 2>&1 || {
    cat "$directory/cleared"
    exit 1
}
written >"$directory/before"
chroot "$directory/memory/root" /bin/bash /inside
echo "== left behind"
written | LC_ALL=C comm -13 "$directory/before" - |
    grep -Ev '^\./(var/(lib/dpkg|log|cache)/|etc/ld.so.cache|usr/share/info/dir)' || true
TEXT
mkdir "$directory/memory"
unshare --mount bash "$directory/outside" "$directory" >"$directory/output" 2>"$directory/errors" || {
    cat "$directory/output" "$directory/errors"
    exit 1
}
cat >"$directory/expected" <<'TEXT'
== install
/usr/bin/cimdhcp
ExecStart=/usr/bin/cimdhcp serve --read-only
== use
root 755
INTERFACE  DHCP  STATE  CLIENT          ADDRESS        EXPIRES     SERVERS                 CONFIGURATION NAME
eth0       on    bound  dhclient        192.0.2.17     2100-01-01  192.0.2.1, 2001:db8::1  old
wlan0      on    bound  NetworkManager  198.51.100.23  never       198.51.100.1            -
eth1       off   off    -               203.0.113.4    -           -                       -
eth0: the configuration name is now "new", was "old" (/var/lib/dhcp-client-provider/ifcfg-eth0).
CONFIG_NAME=new
21
15
5
== a setting that was changed survives a new installation
LOG_LEVEL=4000
== a library that is removed is taken out of the object manager
sfcbrepos -f
./mofs/root/cimv2/10-dhcp-client.mof
./mofs/root/cimv2/11-dhcp-extensions.mof
./mofs/root/cimv2/12-dhcp-profile.mof
./mofs/root/interop/12-dhcp-profile.mof
./regs/DHCPClientNeighbours.reg
./regs/DHCPClientProvider.reg
sfcbrepos -f
./mofs/root/cimv2/10-dhcp-client.mof
./mofs/root/cimv2/11-dhcp-extensions.mof
./mofs/root/cimv2/12-dhcp-profile.mof
./mofs/root/interop/12-dhcp-profile.mof
./regs/DHCPClientProvider.reg
sfcbrepos -f
./mofs/root/cimv2/10-dhcp-client.mof
./mofs/root/cimv2/11-dhcp-extensions.mof
./mofs/root/cimv2/12-dhcp-profile.mof
./mofs/root/interop/12-dhcp-profile.mof
./regs/DHCPClient.reg
sfcbrepos -f
== purge
== left behind
TEXT
diff "$directory/expected" "$directory/output"
