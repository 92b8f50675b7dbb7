#!/usr/bin/env bash
# Makes the packages of a build twice, which has to give the same bytes, lets lintian read
# them, and installs, uses, upgrades and purges them in a root of their own: the machine's, with
# everything that is written going to a file system in memory, which ends with the test.
# Packages that the machine itself has installed, and what they keep, are taken out of that root
# first. The archive and an installation without packages are tried, too.
# Usage: packages.sh BUILD_DIRECTORY TREE
set -euo pipefail

build=$(realpath "$1")
tree=$(realpath "$2")
program=$(dirname "$0")/../../scripts/packages
directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT
exec 3>&1 >"$directory/output"

quietly() { # quietly COMMAND...: tells what it printed where it fails
    "$@" >"$directory/log" 2>&1 || {
        cat "$directory/log" >&3
        echo "FAILED: $*" >&3
        exit 1
    }
}
quietly "$program" --of "$build" "$directory/packages"
(umask 077 && TZ=Asia/Tokyo LC_ALL=C.UTF-8 quietly "$program" --of "$build" "$directory/again")
for file in "$directory"/packages/*; do
    quietly cmp "$file" "$directory/again/${file##*/}"
done
(cd "$directory/packages" && quietly sha256sum --check SHA256SUMS)
version=$(dpkg-deb --field "$directory"/packages/cimdhcp_*.deb Version)
packages=("$directory"/packages/*.deb)
# Not every build has symbols to take out.
quietly lintian --allow-root --fail-on error,warning \
    --suppress-tags initial-upload-closes-no-bugs,debug-file-with-no-debug-symbols "${packages[@]}"

echo "== packages"
for package in "${packages[@]}"; do
    dpkg-deb --show --showformat='${Package}: ${Description}\n' "$package" | sed -n 1p
    printf '  control: %s\n' "$(dpkg-deb --ctrl-tarfile "$package" | tar --list | sed -n 's#^\./\(..*\)#\1#p' |
        LC_ALL=C sort | paste -sd' ')"
    dpkg-deb --show --showformat='${Depends}, ${Recommends}, ${Suggests}\n' "$package" |
        (grep -oE '[a-z-]*(dhcp|libc6)[a-z-]* \([^)]*\)' || true) | sed -E "s/= $version\)/the same)/; s/(libc6 ).*/\1(a version)/; s/^/  /"
    # Where the plug-ins of this architecture are, and no linker looks.
    dpkg-deb --contents "$package" | sed -n "s#.* \./usr/lib/$(gcc -print-multiarch)/\(.*\.so\)\$#  library: \1#p"
done

echo "== without the program that finds dependencies, or with one that finds none"
mkdir "$directory/fake"
: >"$directory/fake/nothing"
printf '#!/bin/sh\necho shlibs:Depends=\n' >"$directory/fake/blind"
chmod 755 "$directory/fake/blind"
for fake in nothing blind; do
    status=0
    unshare --mount bash -c 'mount --bind "$1" /usr/bin/dpkg-shlibdeps && shift && exec "$@"' bash \
        "$directory/fake/$fake" "$program" --of "$build" "$directory/none" >"$directory/log" 2>&1 || status=$?
    printf 'status %s: %s\n' "$status" "$(grep -E '^packages: cimdhcp |^ *Packages need' "$directory/log" |
        sed 's/^ *//; s/needs [^,]*/needs a library/')"
done

echo "== the archive"
mkdir "$directory/unpacked"
tar --extract --directory "$directory/unpacked" --file "$directory"/packages/*.tar.gz
(
    cd "$directory"/unpacked/*
    find . -maxdepth 2 -mindepth 2 | LC_ALL=C sort
    bin/cimdhcp --tree "$tree" classes | wc -l
)

echo "== an installation without packages"
export DESTDIR=$directory/destination
quietly cmake --install "$build" --prefix /usr
cmp "$DESTDIR/etc/zr/platform.conf" "$(dirname "$program")/../packaging/platform.conf"
echo LOG_LEVEL=4000 >"$DESTDIR/etc/zr/platform.conf"
quietly cmake --install "$build" --prefix /usr
(cd "$DESTDIR/etc/zr" && head -v -n 1 platform.conf* | grep .)
quietly cmake -P "$build/uninstall.cmake"
(cd "$DESTDIR" && find . ! -type d -o -name '*dhcp*' -o -name cmpi)
unset DESTDIR

# The next version, with another setting.
mkdir "$directory/next"
for package in "${packages[@]}"; do
    [[ $package != *-dbgsym_* ]] || continue
    rm -rf "$directory/content"
    dpkg-deb --raw-extract "$package" "$directory/content"
    sed -i "s/^Version: .*/&.next/; s/(= $version)/(= $version.next)/g" "$directory/content/DEBIAN/control"
    [[ ! -e $directory/content/etc/zr ]] || echo '#NEXT=1' >>"$directory/content/etc/zr/platform.conf"
    quietly dpkg-deb --build --root-owner-group -Zgzip "$directory/content" "$directory/next"
done

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
quietly() { "$@" >/log 2>&1 || { cat /log && exit 1; }; }
links() { find /etc/systemd/system -name 'cimdhcp*' | LC_ALL=C sort; }
echo "== install"
quietly dpkg --install ./*.deb
test -x /usr/bin/cimdhcp
command -v cimdhcp
grep -x 'ExecStart=/usr/bin/cimdhcp serve --read-only' /usr/lib/systemd/system/cimdhcp.service
grep -E '^ExecStart=/usr/bin/cimdhcp (metrics|exporter) ' \
    /usr/lib/systemd/system/cimdhcp-{metrics,exporter}.service >/dev/null
# They are off until a person turns them on.
test -e /usr/lib/systemd/system/cimdhcp-metrics.timer
[[ -z $(links) ]]
test -s /usr/share/cimdhcp/monitoring/dashboard.json
grep -Fx 'ExecReload=/bin/kill -HUP $MAINPID' /usr/lib/systemd/system/cimdhcp.service >/dev/null
for page in man1/cimdhcp.1 man1/cimdhcp-serve.1 man1/cimdhcp-exporter.1 man1/cimdhcp-metrics.1 \
    man5/zr-platform.conf.5 man5/platform.conf.5 man8/provider-register.sh.8 \
    man8/provider-register.8; do
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
echo "== an upgrade while services run"
quietly systemctl enable cimdhcp.service cimdhcp-metrics.timer
links
# Where systemd runs it would be asked.
mkdir -p /run/systemd/system
mv /usr/bin/deb-systemd-invoke /usr/bin/systemctl /
printf '#!/bin/sh\necho "${0##*/} $*" >>/calls\n' | tee /usr/bin/deb-systemd-invoke >/usr/bin/systemctl
chmod 755 /usr/bin/deb-systemd-invoke /usr/bin/systemctl
echo LOG_LEVEL=4000 >/etc/zr/platform.conf
quietly dpkg --install --force-confdef /next/*.deb
cat /calls
links
echo "a setting that was changed:"
cat /etc/zr/platform.conf
tail -n 1 /etc/zr/platform.conf.dpkg-dist
echo "== a library that is removed is taken out of the object manager"
# In the place of one that was built from source; dpkg's PATH may be without it.
mkdir -p /usr/local/bin /usr/local/var/lib/sfcb/stage
printf '#!/bin/sh\necho "sfcbrepos $*"\n' >/usr/local/bin/sfcbrepos
chmod +x /usr/local/bin/sfcbrepos
registered() { (cd /usr/local/var/lib/sfcb/stage && find . -type f | LC_ALL=C sort); }
/usr/share/dhcp-client-provider/provider-register.sh --exact
registered
# The other packages' registration stays, and what it needs.
export PATH=/usr/sbin:/usr/bin:/sbin:/bin
quietly dpkg --remove cmpi-dhcp-client{,-neighbours,-provider}-dbgsym cimdhcp-dbgsym
dpkg --remove cmpi-dhcp-client-neighbours | grep sfcbrepos
registered
dpkg --remove cmpi-dhcp-client-provider | grep sfcbrepos
registered
/usr/share/dhcp-client-provider/provider-register.sh
registered
rm -f /calls
mkdir -p /var/lib/prometheus/node-exporter /var/lib/private/cimdhcp
echo 'dhcp_client_up 1' >/var/lib/prometheus/node-exporter/dhcp-client.prom
ln -s private/cimdhcp /var/lib/cimdhcp
echo '{}' >/var/lib/private/cimdhcp/subscriptions
dpkg --remove cimdhcp cmpi-dhcp-client | grep sfcbrepos
registered
rm -r /usr/local/bin/sfcbrepos /usr/local/var/lib/sfcb
rmdir -p --ignore-fail-on-non-empty /usr/local/var/lib
echo "== removed services, and enabled again"
cat /calls
test ! -e /var/lib/prometheus/node-exporter/dhcp-client.prom
test -e /var/lib/cimdhcp/subscriptions
quietly dpkg --install /next/cimdhcp_*.deb /next/cmpi-dhcp-client_*.deb
links
echo "== purge"
quietly dpkg --purge cimdhcp cmpi-dhcp-client cmpi-dhcp-client-neighbours \
    cmpi-dhcp-client-provider dhcp-client-provider-schema
mv /deb-systemd-invoke /systemctl /usr/bin/
rm -r /run/systemd /calls /log
TEXT

# dpkg's own records, and what ldconfig and the package's triggers refresh, stay.
cat >"$directory/outside" <<'TEXT'
set -euo pipefail
directory=$1
mount -t tmpfs none "$directory/memory"
mkdir "$directory"/memory/{upper,work,root}
mount -t overlay none -o "lowerdir=/,upperdir=$directory/memory/upper,workdir=$directory/memory/work" \
    "$directory/memory/root"
mkdir "$directory"/memory/root/{packages,next}
cp "$directory"/packages/*.deb "$directory/memory/root/packages"
cp "$directory"/next/*.deb "$directory/memory/root/next"
cp "$directory/clear" "$directory/inside" "$directory/tree.json" "$directory/memory/root/"
mount -t proc none "$directory/memory/root/proc"
mount --bind /dev "$directory/memory/root/dev"
# All that was written, and the directories of the packages.
written() {
    (cd "$directory/memory/upper" &&
        find . -mindepth 1 \( ! -type d -o -name '*dhcp-client*' -o -name '*cimdhcp*' -o -name zr \) |
        LC_ALL=C sort)
}
chroot "$directory/memory/root" /bin/bash /clear >"$directory/cleared" 2>&1 || {
    cat "$directory/cleared"
    exit 1
}
written >"$directory/before"
chroot "$directory/memory/root" /bin/bash /inside
echo "== left behind"
# Two programs of the machine were put away, and are back.
written | LC_ALL=C comm -13 "$directory/before" - |
    grep -Ev '^\./(run/systemd|var/(lib/dpkg|log|cache)/|etc/ld.so.cache|usr/share/info/dir|usr/bin/(systemctl|deb-systemd-invoke)$)' ||
    true
TEXT
mkdir "$directory/memory"
unshare --mount bash "$directory/outside" "$directory" 2>"$directory/errors" || {
    cat "$directory/output" "$directory/errors" >&3
    exit 1
}
diff - "$directory/output" >&3 <<'TEXT'
== packages
cimdhcp-dbgsym: debug symbols for cimdhcp
  control: control md5sums
  cimdhcp (the same)
cimdhcp: show and change how network interfaces use DHCP
  control: control md5sums postinst postrm prerm
  cmpi-dhcp-client (the same)
  libc6 (a version)
  cmpi-dhcp-client-provider (the same)
cmpi-dhcp-client-dbgsym: debug symbols for cmpi-dhcp-client
  control: control md5sums
  cmpi-dhcp-client (the same)
cmpi-dhcp-client-neighbours-dbgsym: debug symbols for cmpi-dhcp-client-neighbours
  control: control md5sums
  cmpi-dhcp-client-neighbours (the same)
cmpi-dhcp-client-neighbours: CIM provider for what the DHCP clients are associated with
  control: control md5sums prerm
  dhcp-client-provider-schema (the same)
  libc6 (a version)
  library: cmpi/libDHCPClientNeighbours.so
cmpi-dhcp-client-provider-dbgsym: debug symbols for cmpi-dhcp-client-provider
  control: control md5sums
  cmpi-dhcp-client-provider (the same)
cmpi-dhcp-client-provider: CIM provider for the DHCP clients of the machine, by itself
  control: control md5sums prerm
  dhcp-client-provider-schema (the same)
  libc6 (a version)
  cmpi-dhcp-client-neighbours (the same)
  library: cmpi/libDHCPClientProvider.so
cmpi-dhcp-client: CIM providers for the DHCP clients of the machine
  control: control md5sums prerm
  dhcp-client-provider-schema (the same)
  libc6 (a version)
  library: cmpi/libDHCPClient.so
dhcp-client-provider-schema: classes and settings of the CIM providers for DHCP clients
  control: conffiles control md5sums postrm
== without the program that finds dependencies, or with one that finds none
status 1: Packages need the program "dpkg-shlibdeps": scripts/packages installs it
status 1: packages: cimdhcp needs a library, and does not say so: its package is not known
== the archive
./bin/cimdhcp
./lib/systemd
./lib/x86_64-linux-gnu
./share/bash-completion
./share/cimdhcp
./share/dhcp-client-provider
./share/doc
./share/fish
./share/man
./share/zsh
22
== an installation without packages
==> platform.conf <==
LOG_LEVEL=4000
==> platform.conf.new <==
# Settings of the DHCP client provider; zr-platform.conf(5) tells about each. The
./etc/zr/platform.conf
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
== an upgrade while services run
/etc/systemd/system/multi-user.target.wants/cimdhcp.service
/etc/systemd/system/timers.target.wants/cimdhcp-metrics.timer
systemctl --system daemon-reload
deb-systemd-invoke try-restart cimdhcp.service cimdhcp-exporter.service cimdhcp-metrics.timer
/etc/systemd/system/multi-user.target.wants/cimdhcp.service
/etc/systemd/system/timers.target.wants/cimdhcp-metrics.timer
a setting that was changed:
LOG_LEVEL=4000
#NEXT=1
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
sfcbrepos -f
./mofs/root/cimv2/10-dhcp-client.mof
./mofs/root/cimv2/11-dhcp-extensions.mof
./mofs/root/cimv2/12-dhcp-profile.mof
./mofs/root/interop/12-dhcp-profile.mof
./regs/DHCPClient.reg
sfcbrepos -f
== removed services, and enabled again
deb-systemd-invoke stop cimdhcp.service cimdhcp-exporter.service cimdhcp-metrics.timer cimdhcp-metrics.service
systemctl --system daemon-reload
/etc/systemd/system/multi-user.target.wants/cimdhcp.service
/etc/systemd/system/timers.target.wants/cimdhcp-metrics.timer
== purge
== left behind
TEXT
