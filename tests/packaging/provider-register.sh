#!/usr/bin/env bash
# Registers and takes out the providers below a directory of its own, for both kinds
# of object manager, and compares all that is written with what is expected, whole.
# The object managers themselves are not in Debian 12: where their programs would be
# called, programs of this test stand that write down their arguments.
# Usage: provider-register.sh PROGRAM EXPECTED
set -euo pipefail

program=$1
expected=$2
directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT

failures=0
check() { # NAME COMMAND...
    local name=$1
    shift
    if "$@" >"$directory/difference" 2>&1; then
        echo "ok: $name"
    else
        echo "FAILED: $name"
        cat "$directory/difference"
        failures=$((failures + 1))
    fi
}
content() { # every file below a directory with its name and text, MOF classes left out
    (cd "$1" && find . -type f | LC_ALL=C sort | while read -r file; do
        echo "== $file"
        case $file in *dhcp-client.mof) echo "(the classes)" ;; *) cat "$file" ;; esac
    done)
}
stamps() { find "$1" -printf '%P %i %T@\n' | LC_ALL=C sort; }

for type in sfcb pegasus; do
    stage=$directory/$type
    mkdir "$stage"
    check "$type: registers" env DESTDIR="$stage" "$program" -t "$type"
    content "$stage" >"$directory/content"
    if [[ ${UPDATE_EXPECTED:-no} == yes ]]; then
        cp "$directory/content" "$expected/$type"
    fi
    check "$type: writes what is expected" diff "$expected/$type" "$directory/content"
    find "$stage" -name 10-dhcp-client.mof -exec cmp {} "$(dirname "$program")/schema/10-dhcp-client.mof" \; >"$directory/classes"
    check "$type: stages the classes unchanged" test ! -s "$directory/classes"
    stamps "$stage" >"$directory/before"
    check "$type: registers again" env DESTDIR="$stage" "$program" -t "$type"
    stamps "$stage" >"$directory/after"
    check "$type: a second run changes nothing" diff "$directory/before" "$directory/after"
    check "$type: takes out" env DESTDIR="$stage" "$program" -t "$type" -d
    check "$type: taking out leaves nothing" test -z "$(find "$stage" -mindepth 1)"
    check "$type: taking out again" env DESTDIR="$stage" "$program" -t "$type" -d
done

# What the user names counts.
stage=$directory/named
mkdir "$stage"
cat >"$directory/one.registration" <<'TEXT'
# One class.
[TEST_Thing]
   provider: Things
   location: ThingsLibrary
   type: instance association
   namespace: root/a root/b
TEXT
echo "class TEST_Thing {};" >"$directory/things.mof"
echo "class TEST_Other {};" >"$directory/others.mof"
DESTDIR=$stage "$program" -t sfcb -r "$directory/one.registration" -m "$directory/things.mof" "$directory/others.mof"
cat >"$directory/wanted" <<'TEXT'
== ./var/lib/sfcb/stage/mofs/root/a/others.mof
class TEST_Other {};
== ./var/lib/sfcb/stage/mofs/root/a/things.mof
class TEST_Thing {};
== ./var/lib/sfcb/stage/mofs/root/b/others.mof
class TEST_Other {};
== ./var/lib/sfcb/stage/mofs/root/b/things.mof
class TEST_Thing {};
== ./var/lib/sfcb/stage/regs/Things.reg
[TEST_Thing]
   provider: Things
   location: ThingsLibrary
   type: instance association
   namespace: root/a root/b
TEXT
content "$stage" >"$directory/content"
check "serves the files and namespaces that are named" diff "$directory/wanted" "$directory/content"
DESTDIR=$stage "$program" -t sfcb -d -r "$directory/one.registration" -m "$directory/things.mof" "$directory/others.mof"
check "taking out what is named leaves nothing" test -z "$(find "$stage" -mindepth 1)"
DESTDIR=$stage "$program" -t sfcb -n root/c -r "$directory/one.registration" -m "$directory/things.mof"
cat >"$directory/wanted" <<'TEXT'
== ./var/lib/sfcb/stage/mofs/root/c/things.mof
class TEST_Thing {};
== ./var/lib/sfcb/stage/regs/Things.reg
[TEST_Thing]
   provider: Things
   location: ThingsLibrary
   type: instance association
   namespace: root/c
TEXT
content "$stage" >"$directory/content"
check "-n counts before the registration" diff "$directory/wanted" "$directory/content"

# What it says.
told() { # NAME ARGUMENTS... compares what is said below DESTDIR with standard input
    local name=$1
    shift
    (cd "$directory" && DESTDIR=stage "$program" "$@" 2>&1) >"$directory/said" || true
    check "$name" diff - "$directory/said"
}
things=(-r "$directory/one.registration" -m "$directory/things.mof" -n root/c)
told "says what it registers with -v" -v -t sfcb "${things[@]}" <<'TEXT'
written: stage/var/lib/sfcb/stage/regs/Things.reg
written: stage/var/lib/sfcb/stage/mofs/root/c/things.mof
not run below DESTDIR: sfcbrepos -f
TEXT
told "says with -v that a second run changes nothing" -v -t sfcb "${things[@]}" <<'TEXT'
unchanged: stage/var/lib/sfcb/stage/regs/Things.reg
unchanged: stage/var/lib/sfcb/stage/mofs/root/c/things.mof
TEXT
told "says what it takes out with -v" -v -d -t sfcb "${things[@]}" <<'TEXT'
removed: stage/var/lib/sfcb/stage/regs/Things.reg
removed: stage/var/lib/sfcb/stage/mofs/root/c/things.mof
not run below DESTDIR: sfcbrepos -f
TEXT
told "says nothing without -v" -t pegasus "${things[@]}" <<'TEXT'
TEXT
told "says what it takes out of OpenPegasus with -v" -v -d -t pegasus "${things[@]}" <<'TEXT'
removed: stage/var/lib/dhcp-client-provider/pegasus/Things.mof
not run below DESTDIR: cimprovider -d -m ThingsModule
not run below DESTDIR: cimprovider -r -m ThingsModule
removed: stage/var/lib/dhcp-client-provider/pegasus/root/c/things.mof
TEXT
check "leaves nothing" test -z "$(find "$directory/stage" -mindepth 1)"
for option in -h --help; do
    told "prints its options with $option" "$option" <<'TEXT'
Usage: provider-register.sh [-t pegasus|sfcb] [-n NAMESPACE] [-r FILE...] [-m FILE...] [-d] [-v]

Registers CMPI providers with an object manager, or takes them out again.

  -t TYPE       pegasus or sfcb; the one that is installed when not given
  -n NAMESPACE  the namespace to serve instead of the one in the registration
  -r FILE...    registration files; those of this package when not given
  -m FILE...    MOF files; those of this package when not given
  -d            take the providers out
  -v            say what is done
  -h            print this help

With the variable DESTDIR, everything happens below that directory, and no program
of the object manager is called. A second run with the same arguments changes nothing.
TEXT
done

# Without -t, it is the object manager whose programs are there.
found() { # PROGRAMS-OF-OBJECT-MANAGERS
    rm -rf "$directory/found"
    mkdir "$directory/found"
    local name
    for name in $1; do
        printf '#!/bin/sh\n' >"$directory/found/$name"
        chmod +x "$directory/found/$name"
    done
}
PATH=$directory/found:$PATH
found sfcbrepos
told "finds SFCB" -v "${things[@]}" <<'TEXT'
object manager: sfcb
written: stage/var/lib/sfcb/stage/regs/Things.reg
written: stage/var/lib/sfcb/stage/mofs/root/c/things.mof
not run below DESTDIR: sfcbrepos -f
TEXT
told "finds SFCB to take out, too" -d "${things[@]}" <<'TEXT'
TEXT
check "leaves nothing" test -z "$(find "$directory/stage" -mindepth 1)"
found ''
told "finds none" "${things[@]}" <<'TEXT'
provider-register.sh: no object manager is installed that this program knows; name one with -t
TEXT
found 'sfcbrepos cimmof'
told "finds two" "${things[@]}" <<'TEXT'
provider-register.sh: more than one object manager is installed; choose one with -t
TEXT
check "writes nothing then" test -z "$(find "$directory/stage" -mindepth 1)"
found ''

# The object manager is found by its programs, which are then called.
mkdir "$directory/bin"
for name in cimmof cimprovider; do
    printf '#!/bin/sh\necho "%s $*" >>"%s/called"\n' "$name" "$directory" >"$directory/bin/$name"
    chmod +x "$directory/bin/$name"
done
cat >"$directory/real" <<TEXT
cimmof -nroot/a /var/lib/dhcp-client-provider/pegasus/root/a/things.mof
cimmof -nroot/PG_InterOp /var/lib/dhcp-client-provider/pegasus/Things.mof
cimprovider -d -m ThingsModule
cimprovider -r -m ThingsModule
TEXT
# In a mount namespace of its own, since the real places are written to.
check "finds OpenPegasus and calls its programs" unshare --mount bash -euc '
    mount -t tmpfs none /var/lib
    export PATH=$1/bin:$PATH
    "$2" -n root/a -r "$1/one.registration" -m "$1/things.mof"
    "$2" -n root/a -r "$1/one.registration" -m "$1/things.mof"
    "$2" -d -n root/a -r "$1/one.registration" -m "$1/things.mof"
    diff "$1/real" "$1/called"' - "$directory" "$program"

refused() { # STATUS TEXT ARGUMENTS...
    local status=0 want=$1 text=$2
    shift 2
    DESTDIR=$directory/refused "$program" "$@" >"$directory/out" 2>&1 || status=$?
    check "refuses: $*" test "$status" = "$want"
    check "says: $text" grep -qF -- "$text" "$directory/out"
    check "writes nothing" test ! -e "$directory/refused"
}
refused 2 'there is no option -x' -x
refused 2 'there is no object manager "foo"' -t foo
refused 2 '-t needs a value' -t
refused 1 'none.mof: no such file' -t sfcb -m none.mof
printf '[TEST_Thing\n' >"$directory/wrong.registration"
refused 1 'wrong.registration:1: no entry of a section' -t sfcb -r "$directory/wrong.registration"
printf '[TEST_Thing]\nprovider: A\n' >"$directory/wrong.registration"
refused 1 'the section of TEST_Thing lacks an entry' -t sfcb -r "$directory/wrong.registration"
printf '[TEST_Thing]\nprovider: A"; rm\n' >"$directory/wrong.registration"
refused 1 'no value for provider' -t sfcb -r "$directory/wrong.registration"
printf '[TEST_Thing]\ntype: indication\n' >"$directory/wrong.registration"
refused 1 'unknown type indication' -t sfcb -r "$directory/wrong.registration"

exit $((failures > 0))
