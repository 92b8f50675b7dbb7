#!/usr/bin/env bash
# Makes the packages of a build twice, which has to give the same bytes, lets lintian read
# them, and installs, uses, upgrades and purges them in a root of their own: the machine's, with
# everything that is written going to a file system in memory, which ends with the test.
# Packages that the machine itself has installed, and what they keep, are taken out of that root
# first. The archive and an installation without packages are tried, too.
# Usage: packages.sh BUILD_DIRECTORY TREE
set -euo pipefail

build=$1
tree=$2
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
quietly lintian --allow-root --fail-on error,warning \
    --suppress-tags initial-upload-closes-no-bugs "${packages[@]}"

echo "== packages"
for package in "${packages[@]}"; do
    dpkg-deb --show --showformat='${Package}: ${Description}\n' "$package" | sed -n 1p
    printf '  control: %s\n' "$(dpkg-deb --ctrl-tarfile "$package" | tar --list | sed -n 's#^\./\(..*\)#\1#p' |
        LC_ALL=C sort | paste -sd' ')"
    dpkg-deb --show --showformat='${Depends}, ${Recommends}, ${Suggests}\n' "$package" |
        grep -oE '[a-z-]*(dhcp|libc6)[a-z-]* \([^)]*\)' | sed -E "s/= $version\)/the same)/; s/(libc6 ).*/\1(a version)/; s/^/  /"
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
    printf 'status %s: %s\n' "$status" "$(grep -E '^packages: cmpi-dhcp-client |^ *Packages need' "$directory/log" |
        sed 's/^ *//')"
done

echo "== the archive"
mkdir "$directory/unpacked"
tar --extract --directory "$directory/unpacked" --file "$directory"/packages/*.tar.gz
(
    cd "$directory"/unpacked/*
    find . -maxdepth 2 -mindepth 2 | LC_ALL=C sort
    bin/cimdhcp --tree "$tree" names QVXZR_DHCPCapabilities | wc -l
)

echo "== an installation without packages"
export DESTDIR=$directory/destination
quietly cmake --install "$build" --prefix /usr
cmp "$DESTDIR/etc/zr/platform.conf" "$(dirname "$program")/../packaging/platform.conf"
echo LOG_LEVEL=4000 >"$DESTDIR/etc/zr/platform.conf"
quietly cmake --install "$build" --prefix /usr
(cd "$DESTDIR/etc/zr" && head -v -n 1 platform.conf* | grep .)
quietly cmake -P "$build/uninstall.cmake"
find "$DESTDIR" ! -type d
find "$DESTDIR" \( -name '*dhcp*' -o -name cmpi \)
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
# One alone would not be of the same build as the others.
if dpkg --install /next/dhcp-client-provider-schema_*.deb >/log 2>&1; then exit 1; fi
grep -o 'depends on dhcp-client-provider-schema (= .*)' /log | LC_ALL=C sort -u | sed 's/(= .*)/(= ...)/'
quietly dpkg --install cimdhcp_*.deb cmpi-*.deb dhcp-*.deb
rm -f /calls
echo LOG_LEVEL=4000 >/etc/zr/platform.conf
quietly dpkg --install --force-confdef --force-depends /next/*.deb
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
quietly dpkg --remove cmpi-dhcp-client-{neighbours,provider,}-dbgsym cimdhcp-dbgsym
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
    grep -Ev '^\./(var/(lib/dpkg|log|cache)/|etc/ld.so.cache|usr/share/info/dir|usr/bin/(systemctl|deb-systemd-invoke)$)' ||
    true
TEXT
mkdir "$directory/memory"
unshare --mount bash "$directory/outside" "$directory" 2>"$directory/errors" || {
    cat "$directory/output" "$directory/errors" >&3
    exit 1
}
diff "$(dirname "$0")/expected/packages" "$directory/output" >&3
