#!/usr/bin/env bash
# Lets install-dependencies install packages of this test in a root of their own: the
# machine's, with everything that is written going to memory. There one package that
# the tests need is missing, and one of this test stands in its place in the only
# archive, with services.
# Usage: dependencies.sh PROGRAM
set -euo pipefail

program=$1
if ((EUID != 0)) || ! unshare --mount true 2>/dev/null; then
    echo "a root of its own needs root and a mount namespace"
    exit 77
fi
directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT
mkdir -p "$directory"/{memory,archive,policy,unit,script,postinst}

package() { # package NAME FIELD TREE
    mkdir -p "$3/DEBIAN"
    printf '%s\n' "Package: $1" "Version: 99" "Architecture: all" "Maintainer: Test <test@example.invalid>" \
        "Description: test" ${2:+"$2"} >"$3/DEBIAN/control"
    dpkg-deb --build --root-owner-group "$3" "$directory/archive/$1.deb" >/dev/null
}
added=$directory/added
mkdir -p "$added"/{DEBIAN,etc/init.d,lib/systemd/system}
printf '[Service]\nExecStart=/bin/true\n[Install]\nWantedBy=multi-user.target\n' \
    >"$added/lib/systemd/system/zr-added.service"
cat >"$added/etc/init.d/zr-added-script" <<'TEXT'
#!/bin/sh
### BEGIN INIT INFO
# Provides: zr-added-script
# Required-Start:
# Required-Stop:
# Default-Start: 2 3 4 5
# Default-Stop: 0 1 6
### END INIT INFO
TEXT
echo /etc/init.d/zr-added-script >"$added/DEBIAN/conffiles"
# What a package with services does when it is installed.
cat >"$added/DEBIAN/postinst" <<'TEXT'
#!/bin/sh
deb-systemd-helper enable zr-added.service
update-rc.d zr-added-script defaults
for service in zr-added zr-added.service zr-added-script zr-before zr-forbidden.service; do
    status=0
    /usr/sbin/policy-rc.d "$service" start || status=$?
    echo "$service $status" >>/asked
done
ls /etc/systemd/system/multi-user.target.wants/zr-* /etc/rc2.d/*zr-* >>/asked
TEXT
chmod 755 "$added/DEBIAN/postinst" "$added/etc/init.d/zr-added-script"
package sblim-wbemcli "" "$added"
package udhcpc "Conflicts: zr-installed" "$directory/conflicting"
(cd "$directory/archive" && dpkg-scanpackages --multiversion . 2>/dev/null >Packages)
# Installed before, and not of the archive.
mkdir -p "$directory/installed/lib/systemd/system"
printf '[Service]\nExecStart=/bin/true\n[Install]\nWantedBy=multi-user.target\n' \
    >"$directory/installed/lib/systemd/system/zr-before.service"
cp "$directory/installed/lib/systemd/system/zr-before.service" \
    "$directory/installed/lib/systemd/system/zr-forbidden.service"
package zr-installed "" "$directory/installed"

cat >"$directory/inside" <<'TEXT'
set -euo pipefail
forget() { # forget PACKAGE: as if it were not installed
    awk -v RS= -v ORS='\n\n' -v package="Package: $1\n" 'index($0, package) != 1' /var/lib/dpkg/status >/status
    cp /status /var/lib/dpkg/status
    rm -f /var/lib/dpkg/info/"$1".*
}
list() { ls "$@" 2>/dev/null || true; }
rm -rf /etc/apt/sources.list /etc/apt/sources.list.d/* /etc/apt/preferences.d/* /var/lib/apt/lists/*
echo 'deb [trusted=yes] file:/archive ./' >/etc/apt/sources.list
printf '#!/bin/sh\ncase $1 in zr-forbidden*) exit 101 ;; esac\n' >/usr/sbin/policy-rc.d
chmod 755 /usr/sbin/policy-rc.d
dpkg --install /archive/zr-installed.deb >/dev/null
systemctl --quiet enable zr-before.service
cp /usr/sbin/policy-rc.d /policy

echo "== nothing is missing, with either library"
sed -i 's/^Package: libcurl4-[a-z]*-dev$/Package: libcurl4-openssl-dev/' /var/lib/dpkg/status
/install-dependencies build test

echo "== services stay off"
forget sblim-wbemcli
/install-dependencies build test
echo "asked while it was installed:"
cat /asked
echo "enabled:"
list /etc/systemd/system/multi-user.target.wants/zr-*
list /etc/rc?.d/S*zr-*
cmp /policy /usr/sbin/policy-rc.d
list /usr/sbin/policy-rc.d?*

echo "== what is installed stays"
forget udhcpc
status=0
/install-dependencies build test 2>&1 || status=$?
echo "status $status"
dpkg-query --show --showformat='${db:Status-Status}\n' zr-installed
cmp /policy /usr/sbin/policy-rc.d
TEXT
cat >"$directory/outside" <<'TEXT'
set -euo pipefail
memory=$1/memory
mount -t tmpfs none "$memory"
mkdir "$memory"/{upper,work,root}
mount -t overlay none -o "lowerdir=/,upperdir=$memory/upper,workdir=$memory/work" "$memory/root"
cp -r "$1/archive" "$1/inside" "$memory/root"
cp "$2" "$memory/root/install-dependencies"
mount -t proc none "$memory/root/proc"
mount --bind /dev "$memory/root/dev"
mount -t tmpfs none "$memory/root/tmp"
chmod 1777 "$memory/root/tmp"
chmod -R a+rX "$memory/root/archive"
exec chroot "$memory/root" /bin/bash /inside
TEXT
unshare --mount bash "$directory/outside" "$directory" "$program" >"$directory/output" 2>"$directory/errors" || {
    cat "$directory/output" "$directory/errors"
    exit 1
}
diff - "$directory/output" <<'TEXT'
== nothing is missing, with either library
== services stay off
Installing Debian packages: sblim-wbemcli
asked while it was installed:
zr-added 101
zr-added.service 101
zr-added-script 101
zr-before 0
zr-forbidden.service 101
/etc/rc2.d/S01zr-added-script
/etc/systemd/system/multi-user.target.wants/zr-added.service
/etc/systemd/system/multi-user.target.wants/zr-before.service
enabled:
/etc/systemd/system/multi-user.target.wants/zr-before.service
== what is installed stays
Installing Debian packages: udhcpc
They cannot stand beside these installed packages, which are not removed for them:
zr-installed
Remove those yourself, or use another machine.
status 1
installed
TEXT
