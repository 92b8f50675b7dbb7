#!/usr/bin/env bash
# Makes RPM packages twice, which have to be equal byte for byte, and those of a next release, and
# lets rpmlint read them. Installs them in a root of their own, uses, upgrades and removes them:
# the root is the machine's, with everything that is written going to a file system in memory, which
# ends with the test. What rpm needs from outside is given by a package that says that it has it.
# Usage: rpm.sh BUILD_DIRECTORY TREE   with what that build has made
#        rpm.sh --whole DIRECTORY TREE  builds everything with rpmbuild from an archive of the sources
#                                       first, in DIRECTORY/rpmbuild, which takes minutes, and goes on
#                                       with that build; so without arguments, in build/everywhere
set -euo pipefail

source=$(cd "$(dirname "$0")/../.." && pwd)
spec=$source/packaging/rpm/dhcp-client-provider.spec
for tool in rpmbuild rpmlint; do
    command -v $tool >/dev/null || {
        echo "$tool is not installed: no RPM packages are tried"
        exit 77
    }
done
(($# > 0)) || set -- --whole "$source/build/everywhere/rpm" "$source/docs/sample-machine.json"
whole=
if [[ $1 == --whole ]]; then
    whole=$(mkdir -p "$2" && cd "$2" && pwd)/rpmbuild
    shift
fi
build=$(realpath "$1")
tree=$(realpath "$2")
directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT

# What rpm cannot ask Debian's database.
load=()
if [[ -z $(rpm --eval '%{?_unitdir}') ]]; then
    load=(--load "$source/packaging/rpm/debian.macros")
fi
version=$(rpmspec "${load[@]}" -q --srpm --qf '%{VERSION}' "$spec")
project=$(sed -nE 's/^project\(.* VERSION ([0-9.]+).*/\1/p' "$source/CMakeLists.txt")
if [[ $version != "$project" ]]; then
    echo "The RPM packages have version $version, and CMakeLists.txt $project."
    exit 1
fi

tar -C "$source" --create --gzip --file "$directory/dhcp-client-provider-$version.tar.gz" \
    --sort=name --owner=0 --group=0 --numeric-owner --exclude-vcs --exclude=./build \
    --transform="s,^\.,dhcp-client-provider-$version," .
within=()
make_packages() { # SPEC TOP ARGUMENT...
    mkdir -p "$2"
    "${within[@]}" rpmbuild "${load[@]}" --nodeps --define "_topdir $2" --define "_sourcedir $directory" \
        --define "_tmppath $directory" "${@:3}" "$1" >"$2/log" 2>&1 || {
        tail -n 60 "$2/log"
        exit 1
    }
}
cp "${spec%.spec}.rpmlintrc" "$directory/filters"
# Without packages for debug information, rpm takes out that alone.
printf 'addFilter("%s")\n' static-library-without-debuginfo unstripped-binary-or-object >>"$directory/filters"
lint() { # FILE...
    rpmlint --strict --rpmlintrc "$directory/filters" "$@" >"$directory/lint" 2>&1 || {
        cat "$directory/lint"
        exit 1
    }
}

if [[ -n $whole ]]; then
    rm -rf "$whole"
    make_packages "$spec" "$whole" -ba --noclean --define "debug_package %{nil}"
    lint "$whole"/SRPMS/*.rpm "$whole"/RPMS/*/*.rpm
    echo "== made from the sources"
    (cd "$whole/RPMS" && find . -name '*.rpm' -printf '%f %k kB\n' | LC_ALL=C sort)
    build=$(find "$whole/BUILD" -maxdepth 3 -name CMakeCache.txt -printf '%h\n')
fi

# Stripped by rpmbuild's own steps, and compressed quickly.
libraries=$(sed -n 's/^CMAKE_INSTALL_LIBDIR:.*=//p' "$build/CMakeCache.txt")
packages() { # SPEC TOP
    make_packages "$1" "$2" -bb --define "built $build" --define "_lib $libraries" \
        --define "_libdir %{_prefix}/%{_lib}" --define "debug_package %{nil}" \
        --define "_binary_payload w1.gzdio"
}
packages "$spec" "$directory/first"
(umask 077 && TZ=Asia/Tokyo LC_ALL=C packages "$spec" "$directory/second")
for package in "$directory"/first/RPMS/*/*.rpm; do
    cmp "$package" "${package/first/second}"
done
lint "$spec" "$directory"/first/RPMS/*/*.rpm
if [[ -n $whole ]]; then
    # What the quick way packages is what the whole one does.
    for package in "$directory"/first/RPMS/*/*.rpm; do
        same=$whole${package#"$directory/first"}
        diff <(rpm -qlp "$package") <(rpm -qlp "$same" | grep -v '/\.build-id')
    done
fi


# The next release has another default in its settings, seen at its place by its build alone.
sed 's/^Release:.*/Release: 2/' "$spec" >"$directory/next.spec"
sed 's/^#LOG_LEVEL=.*/#LOG_LEVEL=5000/' "$source/packaging/platform.conf" >"$directory/platform.conf"
# shellcheck disable=SC2016 # the inner shell expands it
within=(unshare --mount bash -c 'mount --bind "$0" "$1" && exec "${@:2}"'
    "$directory/platform.conf" "$source/packaging/platform.conf")
packages "$directory/next.spec" "$directory/next"

# All that the packages need from outside is given by one that says that it has it.
names() { LC_ALL=C sort -u; }
rpm -qp --requires "$directory"/first/RPMS/*/*.rpm | grep -v '^rpmlib(' | names >"$directory/required"
rpm -qp --provides "$directory"/first/RPMS/*/*.rpm | names >"$directory/provided"
LC_ALL=C comm -23 "$directory/required" "$directory/provided" >"$directory/outside-needs"
{
    printf '%s: %s\n' Name machine Version 1 Release 1 Summary 'What is there' License none \
        BuildArch noarch
    grep -vE '^(cmpi-|cimdhcp|dhcp-client-provider)' "$directory/outside-needs" | sed 's/^/Provides: /'
    printf '%s\n' %description %files
} >"$directory/machine.spec"
within=()
make_packages "$directory/machine.spec" "$directory/machine" -bb
mkdir "$directory/packages"
for part in first next machine; do
    mkdir "$directory/packages/$part"
    cp "$directory/$part"/RPMS/*/*.rpm "$directory/packages/$part"
done

# What is in the way on a machine where Debian's packages are installed.
cat >"$directory/clear" <<'TEXT'
set -euo pipefail
dpkg --purge cimdhcp cmpi-dhcp-client cmpi-dhcp-client-neighbours cmpi-dhcp-client-provider \
    dhcp-client-provider-schema
rm -rf /etc/zr /var/lib/dhcp-client-provider
TEXT
cat >"$directory/inside" <<'TEXT'
set -euo pipefail
export HOME=/root PATH=/usr/sbin:/usr/bin:/sbin:/bin
cd /packages
# Debian's rpm wants to be asked twice.
install() { rpm --force-debian "$@"; }
install -i machine/*.rpm
# In place of those that are not here: an object manager that was built from source, and what
# systemd is told.
mkdir -p /usr/local/bin /usr/local/var/lib/sfcb/stage
printf '#!/bin/sh\necho "sfcbrepos $*" >>/told\n' >/usr/local/bin/sfcbrepos
printf '#!/bin/sh\necho "$*" >>/told\n' >/usr/lib/systemd/systemd-update-helper
chmod +x /usr/local/bin/sfcbrepos /usr/lib/systemd/systemd-update-helper
# Another package's.
mkdir -p /usr/share/fish/vendor_completions.d
: >/usr/share/fish/vendor_completions.d/other
registered() {
    (cd /usr/local/var/lib/sfcb/stage && find . -type f | LC_ALL=C sort)
    cat /told
    rm /told
}
echo "== install"
install -i first/*.rpm
registered
for page in man1/cimdhcp.1 man5/zr-platform.conf.5 man8/provider-register.sh.8; do
    test -s /usr/share/man/$page.gz
done
rpm -q --whatprovides cmpi-dhcp-client-extensions --qf '%{NAME}\n'
[[ -z $(find /etc/systemd/system -name 'cimdhcp*') ]]
rpm -V $(rpm -qa)
echo "== use"
printf 'DEVICE=eth0\nCONFIG_NAME=old\n' >/var/lib/dhcp-client-provider/ifcfg-eth0
cimdhcp --tree /tree.json show
cimdhcp --tree /tree.json rename eth0 new
cimdhcp --tree /tree.json classes | tail -n +2 | wc -l
cimdhcp --exact --tree /tree.json classes | tail -n +2 | wc -l
DESTDIR=/stage /usr/share/dhcp-client-provider/provider-register.sh -t sfcb -v | grep -c written
DESTDIR=/stage /usr/share/dhcp-client-provider/provider-register.sh -t sfcb -d
echo "== a package that others need stays"
! install -e cmpi-dhcp-client 2>&1 | head -n 1
! install -e dhcp-client-provider-schema 2>&1 | head -n 1
echo "== upgrade: what was changed and chosen stays"
echo LOG_LEVEL=4000 >/etc/zr/platform.conf
/usr/share/dhcp-client-provider/provider-register.sh --exact
rm /told
sed -i 's/provider: .*/provider: Old/' /usr/local/var/lib/sfcb/stage/regs/DHCPClientProvider.reg
install -U next/*.rpm
rpm -qa --qf '%{NAME}-%{VERSION}-%{RELEASE}\n' | LC_ALL=C sort
cat /etc/zr/platform.conf
grep LOG_LEVEL /etc/zr/platform.conf.rpmnew
rm /etc/zr/platform.conf.rpmnew
! grep Old /usr/local/var/lib/sfcb/stage/regs/DHCPClientProvider.reg
registered
echo "== remove: what the administrator has made stays"
install -e $(rpm -qa | grep -v ^machine)
registered
find /etc/zr /var/lib/dhcp-client-provider -type f
rm /etc/zr/platform.conf.rpmsave /var/lib/dhcp-client-provider/ifcfg-eth0
echo "== in the other order, the exact form is registered, and nothing stays at all"
install -i next/dhcp-client-provider-schema-*.rpm next/cmpi-dhcp-client-{provider,neighbours}-*.rpm
install -i next/cmpi-dhcp-client-[0-9]*.rpm
registered
install -e $(rpm -qa | grep -v ^machine)
registered
rm -r /usr/local/bin/sfcbrepos /usr/local/var/lib/sfcb /usr/lib/systemd/systemd-update-helper \
    /usr/share/fish/vendor_completions.d/other
rmdir -p --ignore-fail-on-non-empty /usr/local/var/lib
TEXT

# rpm's own records stay.
cat >"$directory/outside" <<'TEXT'
set -euo pipefail
directory=$1
mount -t tmpfs none "$directory/memory"
mkdir "$directory"/memory/{upper,work,root}
mount -t overlay none -o "lowerdir=/,upperdir=$directory/memory/upper,workdir=$directory/memory/work" \
    "$directory/memory/root"
cp -r "$directory/packages" "$directory/memory/root/packages"
cp "$directory/clear" "$directory/inside" "$directory/memory/root/"
cp "$2" "$directory/memory/root/tree.json"
mount -t proc none "$directory/memory/root/proc"
mount --bind /dev "$directory/memory/root/dev"
# All that was written, and the directories of the packages.
written() {
    (cd "$directory/memory/upper" && find . -mindepth 1 \
        \( ! -type d -o -name '*dhcp*' -o -name zr -o -name cmpi -o -name ZrPlatform \) | LC_ALL=C sort)
}
chroot "$directory/memory/root" /bin/bash /clear >"$directory/cleared" 2>&1 || {
    cat "$directory/cleared"
    exit 1
}
written >"$directory/before"
chroot "$directory/memory/root" /bin/bash /inside
echo "== left behind"
written | LC_ALL=C comm -13 "$directory/before" - | grep -v '^\./root/\.rpmdb/' || true
TEXT
mkdir "$directory/memory"
{
    # What each compiler links with is left out; libcurl is there in several makes.
    echo "== needs"
    sed -E 's/[ (].*//; s/^libcurl.*/libcurl/' "$directory/outside-needs" | grep -vE '^(rtld|ld-linux.*|lib(c|m|gcc_s|stdc\+\+)\.so\..*)$' | names
} >"$directory/output"
unshare --mount bash "$directory/outside" "$directory" "$tree" >>"$directory/output" 2>"$directory/errors" || {
    cat "$directory/output" "$directory/errors"
    exit 1
}
cat >"$directory/expected" <<'TEXT'
== needs
/bin/sh
coreutils
diffutils
gawk
libcrypt.so.1
libcurl
libexpat.so.1
libgnutls.so.30
libmicrohttpd.so.12
libmnl.so.0
libz.so.1
pkgconfig
sed
== install
./mofs/root/cimv2/10-dhcp-client.mof
./mofs/root/cimv2/11-dhcp-extensions.mof
./mofs/root/cimv2/12-dhcp-profile.mof
./mofs/root/interop/12-dhcp-profile.mof
./regs/DHCPClient.reg
sfcbrepos -f
install-system-units cimdhcp.service cimdhcp-exporter.service cimdhcp-metrics.service cimdhcp-metrics.timer
cmpi-dhcp-client
== use
INTERFACE  DHCP  STATE  CLIENT          ADDRESS        EXPIRES     SERVERS                 CONFIGURATION NAME
eth0       on    bound  dhclient        192.0.2.17     2100-01-01  192.0.2.1, 2001:db8::1  old
wlan0      on    bound  NetworkManager  198.51.100.23  never       198.51.100.1            -
eth1       off   off    -               203.0.113.4    -           -                       -
eth0: the configuration name is now "new", was "old" (/var/lib/dhcp-client-provider/ifcfg-eth0).
21
15
5
== a package that others need stays
error: Failed dependencies:
error: Failed dependencies:
== upgrade: what was changed and chosen stays
cimdhcp-0.1.0-2
cmpi-dhcp-client-0.1.0-2
cmpi-dhcp-client-neighbours-0.1.0-2
cmpi-dhcp-client-provider-0.1.0-2
dhcp-client-provider-devel-0.1.0-2
dhcp-client-provider-schema-0.1.0-2
machine-1-1
LOG_LEVEL=4000
#LOG_LEVEL=5000
./mofs/root/cimv2/10-dhcp-client.mof
./mofs/root/cimv2/11-dhcp-extensions.mof
./mofs/root/cimv2/12-dhcp-profile.mof
./mofs/root/interop/12-dhcp-profile.mof
./regs/DHCPClientNeighbours.reg
./regs/DHCPClientProvider.reg
sfcbrepos -f
mark-restart-system-units cimdhcp.service cimdhcp-exporter.service
== remove: what the administrator has made stays
sfcbrepos -f
sfcbrepos -f
remove-system-units cimdhcp.service cimdhcp-exporter.service cimdhcp-metrics.service cimdhcp-metrics.timer
/etc/zr/platform.conf.rpmsave
/var/lib/dhcp-client-provider/ifcfg-eth0
== in the other order, the exact form is registered, and nothing stays at all
./mofs/root/cimv2/10-dhcp-client.mof
./mofs/root/cimv2/11-dhcp-extensions.mof
./mofs/root/cimv2/12-dhcp-profile.mof
./regs/DHCPClientNeighbours.reg
./regs/DHCPClientProvider.reg
sfcbrepos -f
sfcbrepos -f
sfcbrepos -f
sfcbrepos -f
== left behind
TEXT
diff "$directory/expected" "$directory/output"
