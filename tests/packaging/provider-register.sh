#!/usr/bin/env bash
# Registers and takes out the providers below a directory of its own, for both kinds
# of object manager, and compares all that is written with what is expected, whole.
# The object managers themselves are not in Debian 12: where their programs would be
# called, programs of this test stand that write down their arguments, and fail when a
# file tells them to. What the real ones do with the calls is not seen here.
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
        case $file in */1?-dhcp-*.mof) echo "(the classes)" ;; *) cat "$file" ;; esac
    done)
}
stamps() { find "$1" -printf '%P %i %T@\n' | LC_ALL=C sort; }

for type in sfcb pegasus; do
    stage=$directory/$type
    mkdir "$stage"
    check "$type: registers" env DESTDIR="$stage" "$program" -t "$type"
    content "$stage" >"$directory/content"
    awk -v wanted="=== $type" '/^=== / { inside = $0 == wanted; next } inside' "$expected" \
        >"$directory/expected"
    check "$type: writes what is expected" diff "$directory/expected" "$directory/content"
    find "$stage" -name '1?-dhcp-*.mof' | while read -r file; do
        cmp "$file" "$(dirname "$program")/schema/${file##*/}" || true
    done >"$directory/classes"
    check "$type: stages the classes unchanged" test ! -s "$directory/classes"
    stamps "$stage" >"$directory/before"
    check "$type: registers again" env DESTDIR="$stage" "$program" -t "$type"
    stamps "$stage" >"$directory/after"
    check "$type: a second run changes nothing" diff "$directory/before" "$directory/after"
    check "$type: takes out" env DESTDIR="$stage" "$program" -t "$type" -d
    check "$type: taking out leaves nothing" test -z "$(find "$stage" -mindepth 1)"
    check "$type: taking out again" env DESTDIR="$stage" "$program" -t "$type" -d
done

# As packages do when they are removed one by one.
own=$(dirname "$program")/schema
for type in sfcb pegasus; do
    stage=$directory/$type
    DESTDIR=$stage "$program" -t "$type" --exact
    for library in DHCPClientNeighbours DHCPClientProvider; do
        DESTDIR=$stage "$program" -t "$type" -d -r "$own/exact/$library.registration"
    done
    check "$type: the last form leaves nothing" test -z "$(find "$stage" -mindepth 1)"
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
== ./var/lib/sfcb/stage/regs/ThingsLibrary.reg
[TEST_Thing]
   provider: Things
   location: ThingsLibrary
   type: instance association
   namespace: root/a root/b
   group: ThingsLibrary
TEXT
content "$stage" >"$directory/content"
check "serves the files and namespaces that are named" diff "$directory/wanted" "$directory/content"
DESTDIR=$stage "$program" -t sfcb -d -r "$directory/one.registration" -m "$directory/things.mof" "$directory/others.mof"
check "taking out what is named leaves nothing" test -z "$(find "$stage" -mindepth 1)"
DESTDIR=$stage "$program" -t sfcb -n root/c -r "$directory/one.registration" -m "$directory/things.mof"
cat >"$directory/wanted" <<'TEXT'
== ./var/lib/sfcb/stage/mofs/root/c/things.mof
class TEST_Thing {};
== ./var/lib/sfcb/stage/regs/ThingsLibrary.reg
[TEST_Thing]
   provider: Things
   location: ThingsLibrary
   type: instance association
   namespace: root/c
   group: ThingsLibrary
TEXT
content "$stage" >"$directory/content"
check "-n counts before the registration" diff "$directory/wanted" "$directory/content"

# A namespace takes the place of the one of the DHCP clients, not of the one for discovery.
DESTDIR=$stage "$program" -t sfcb -n root/c -r "$directory/one.registration" -m "$directory/things.mof" -d
sed 's|root/b|root/interop|' "$directory/one.registration" >"$directory/two.registration"
DESTDIR=$stage "$program" -t sfcb -n root/c -r "$directory/two.registration" -m "$directory/things.mof"
check "-n leaves the interop namespace" grep -q 'namespace: root/c root/interop$' "$stage/var/lib/sfcb/stage/regs/ThingsLibrary.reg"
check "classes are in both namespaces" cmp "$stage/var/lib/sfcb/stage/mofs/root/"{c,interop}/things.mof
DESTDIR=$stage "$program" -t pegasus --interop root/PG_InterOp -r "$directory/two.registration" -m "$directory/things.mof"
check "the interop namespace is what OpenPegasus calls it" \
    grep -q 'Namespaces = {"root/a", "root/PG_InterOp"};' "$stage/var/lib/dhcp-client-provider/pegasus/ThingsLibrary.mof"

# What it says.
told() { # NAME ARGUMENTS... compares what is said below DESTDIR with standard input
    local name=$1
    shift
    (cd "$directory" && DESTDIR=stage "$program" "$@" 2>&1) >"$directory/said" || true
    check "$name" diff - "$directory/said"
}
things=(-r "$directory/one.registration" -m "$directory/things.mof" -n root/c)
told "says what it registers with -v" -v -t sfcb "${things[@]}" <<'TEXT'
written: stage/var/lib/sfcb/stage/regs/ThingsLibrary.reg
written: stage/var/lib/sfcb/stage/mofs/root/c/things.mof
not run below DESTDIR: sfcbrepos -f
TEXT
told "says with -v that a second run changes nothing" -v -t sfcb "${things[@]}" <<'TEXT'
unchanged: stage/var/lib/sfcb/stage/regs/ThingsLibrary.reg
unchanged: stage/var/lib/sfcb/stage/mofs/root/c/things.mof
TEXT
told "says what it takes out with -v" -v -d -t sfcb "${things[@]}" <<'TEXT'
removed: stage/var/lib/sfcb/stage/regs/ThingsLibrary.reg
removed: stage/var/lib/sfcb/stage/mofs/root/c/things.mof
not run below DESTDIR: sfcbrepos -f
TEXT
told "says nothing without -v" -t pegasus "${things[@]}" <<'TEXT'
TEXT
told "says what it takes out of OpenPegasus with -v" -v -d -t pegasus "${things[@]}" <<'TEXT'
not run below DESTDIR: cimprovider -d -m ThingsLibraryModule
not run below DESTDIR: cimprovider -r -m ThingsLibraryModule
removed: stage/var/lib/dhcp-client-provider/pegasus/ThingsLibrary.mof
removed: stage/var/lib/dhcp-client-provider/pegasus/root/c/things.mof
TEXT
check "leaves nothing" test -z "$(find "$directory/stage" -mindepth 1)"
for option in -h --help; do
    told "prints its options with $option" "$option" <<'TEXT'
Usage: provider-register.sh [-t TYPE] [--exact] [-n NAMESPACE] [-r FILE...] [-m FILE...]
       [--sfcb-root DIR] [--interop NAMESPACE] [-d | --refresh] [-v]

Registers CMPI providers with an object manager, or takes them out again.

  -t TYPE       pegasus or sfcb; "installed": each that is installed, if there is any;
                the one that is installed when not given
  --exact       the library DHCPClientProvider and its neighbours, in place of DHCPClient
                with its gateway
  -n NAMESPACE  the namespace to serve instead of the one in the registration; the
                interop namespace stays
  -r FILE...    registration files; those of this package when not given
  -m FILE...    MOF files; those of this package when not given
  --sfcb-root DIR
                the directory of SFCB with "stage" in it; found beside sfcbrepos when
                not given
  --interop NAMESPACE
                the interop namespace of OpenPegasus; asked for when not given
  -d            take the providers out
  --refresh     bring up to date what is registered for the same namespaces, and register
                nothing else
  -v            say what is done
  -h            print this help

With the variable DESTDIR, everything happens below that directory, and no program
of the object manager is called. A second run with the same arguments changes nothing,
and does again what failed. The exit status is 0 when all is done.
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
written: stage/var/lib/sfcb/stage/regs/ThingsLibrary.reg
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

# The programs of the object managers are called. They write down how, and those that are
# named in the file "failing" fail. "modules" has the modules that OpenPegasus knows.
tools=$directory/prefix/bin
mkdir -p "$tools"
cat >"$directory/tool" <<'TEXT'
#!/bin/bash
# The state is beside bin.
cd "${0%/*}/.." || exit 99
name=${0##*/}
echo "$name $*" >>called
! grep -qx "$name $*" failing || exit 1
! grep -qx "$name" failing || exit 1
case "$name $*" in
    "cimcli gc -n "*) [[ $3 == "$(cat interop)" ]] ;;
    "cimprovider -l") true ;;
    "cimprovider -l -m "*) grep -qx "$3" modules ;;
    "cimprovider -r -m "*)
        grep -vx "$3" modules >rest
        mv rest modules
        ;;
    "cimmof -n$(cat interop) "*)
        # Instances cannot be made twice.
        added=$(sed -n '/PG_ProviderModule/,/Name/s/.*Name = "\(.*\)";/\1/p' "${@: -1}")
        ! grep -qx "$added" modules || exit 1
        echo "$added" >>modules
        ;;
    "sfcbrepos "*)
        cd var/lib/sfcb/registration
        rm -rf repository.previous
        mv repository repository.previous
        ! grep -qx broken ../../../../failing || exit 1
        mkdir repository
        cat ../stage/regs/*.reg >repository/all 2>/dev/null || true
        ;;
esac
TEXT
chmod +x "$directory/tool"
state=$directory/prefix
settle() { # PROGRAMS: which there are, in a state as after the installation of the object manager
    rm -rf "$state"
    mkdir -p "$tools" "$state"/var/lib/sfcb/{stage,registration/repository}
    echo first >"$state/var/lib/sfcb/registration/repository/all"
    echo root/interop >"$state/interop"
    : >"$state/failing"
    : >"$state/modules"
    : >"$state/called"
    for name in $1; do
        cp "$directory/tool" "$tools/$name"
    done
}
export -f settle
called() { # NAME: compares what has been called since with standard input
    sed "s|$directory|DIR|g" "$state/called" >"$directory/seen"
    : >"$state/called"
    check "$1" diff - "$directory/seen"
}
ends() { # STATUS ARGUMENTS...: runs it with the tools
    local want=$1 status=0
    shift
    PATH=$tools:$PATH "$program" "$@" >"$directory/out" 2>&1 || status=$?
    check "ends with $want: $*" test "$status" = "$want"
}
says() { check "says: $1" grep -qF -- "$1" "$directory/out"; }

thing=(-r "$directory/one.registration" -m "$directory/things.mof" -n root/a)
settle sfcbrepos
ends 0 -v "${thing[@]}"
called "calls SFCB's tool, whose directory is found beside it" <<'TEXT'
sfcbrepos -f
TEXT
check "writes where SFCB reads" test -f "$state/var/lib/sfcb/stage/regs/ThingsLibrary.reg"
check "leaves no mark when all is done" test ! -e "$state/var/lib/sfcb/stage/dhcp-client-provider.pending"
ends 0 "${thing[@]}"
called "a second run calls no program" <<'TEXT'
TEXT
echo 'class TEST_Thing { string more; };' >"$directory/things.mof"
echo sfcbrepos >"$state/failing"
ends 1 "${thing[@]}"
says 'sfcbrepos has failed: sfcbrepos -f'
ends 1 "${thing[@]}"
: >"$state/failing"
ends 0 "${thing[@]}"
called "what failed is done again, until it succeeds" <<'TEXT'
sfcbrepos -f
sfcbrepos -f
sfcbrepos -f
TEXT
ends 0 "${thing[@]}"
called "and not after that" <<'TEXT'
TEXT
echo broken >"$state/failing"
ends 1 -d "${thing[@]}"
says 'the repository is again what it was; the next run tries once more'
check "puts the repository back" grep -q TEST_Thing "$state/var/lib/sfcb/registration/repository/all"
: >"$state/failing"
ends 0 -d "${thing[@]}"
check "takes the provider out of the repository then" test ! -s "$state/var/lib/sfcb/registration/repository/all"
check "leaves nothing but SFCB's own directories" test "$(cd "$state/var/lib/sfcb/stage" && find . -mindepth 1 | sort | xargs)" == "./mofs ./regs"

settle sfcbrepos
ends 0 --refresh "${thing[@]}"
check "refreshing registers nothing" test -z "$(find "$state/var/lib/sfcb/stage" -type f)"
ends 0 "${thing[@]}"
: >"$state/called"
ends 0 --refresh "${thing[@]}"
called "refreshing does nothing where nothing has changed" <<'TEXT'
TEXT
sed -i 's/provider: .*/provider: NewThings/' "$directory/one.registration"
ends 0 --refresh "${thing[@]}"
called "refreshing makes what has changed known" <<'TEXT'
sfcbrepos -f
TEXT
check "the registration is the new one" grep -qx '   provider: NewThings' "$state/var/lib/sfcb/stage/regs/ThingsLibrary.reg"
sed -i 's/provider: .*/provider: Things/' "$directory/one.registration"
settle sfcbrepos
ends 0 --exact
sed -i 's/provider: .*/provider: Old/' "$state/var/lib/sfcb/stage/regs/DHCPClientProvider.reg"
ends 0 --refresh
check "refreshing leaves the form that is registered" test "$(cd "$state/var/lib/sfcb/stage/regs" && echo *)" == \
    "DHCPClientNeighbours.reg DHCPClientProvider.reg"
check "and makes it new" bash -c "! grep -q Old '$state/var/lib/sfcb/stage/regs/DHCPClientProvider.reg'"
ends 0 --exact -n root/other
: >"$state/called"
ends 0 --refresh
called "refreshing leaves the namespace that was chosen" <<'TEXT'
TEXT
ends 2 --refresh --exact
ends 2 --refresh -d

settle sfcbrepos
mkdir "$directory/elsewhere" "$directory/elsewhere/stage"
ends 0 --sfcb-root "$directory/elsewhere" "${thing[@]}"
called "SFCB's directory can be named" <<'TEXT'
sfcbrepos -f -s DIR/elsewhere/stage -r DIR/elsewhere/registration
TEXT
check "writes there" test -f "$directory/elsewhere/stage/regs/ThingsLibrary.reg"
ends 1 --sfcb-root "$directory/none" "${thing[@]}"
says "$directory/none/stage is not a directory"
check "writes nothing then" test ! -e "$directory/none"
if [[ ! -e /var/lib/sfcb && ! -e /usr/local/var/lib/sfcb ]]; then
    settle sfcbrepos
    rm -rf "$state/var/lib/sfcb/stage"
    ends 1 "${thing[@]}"
    says 'the directory of SFCB is not among'
fi

# In a mount namespace of its own, since OpenPegasus' state of this program is in /var/lib.
cat >"$directory/inside" <<'TEXT'
set -euo pipefail
mount -t tmpfs none /var/lib
source "$1/functions"
thing=(-r "$directory/one.registration" -m "$directory/things.mof" -n root/a)
kept=/var/lib/dhcp-client-provider/pegasus
settle "cimmof cimprovider cimcli"

ends 0 "${thing[@]}"
called "finds the interop namespace and loads classes and registration" <<'END'
cimcli gc -n root/PG_InterOp PG_ProviderModule
cimcli gc -n root/interop PG_ProviderModule
cimmof -uc -aEV -nroot/a /var/lib/dhcp-client-provider/pegasus/root/a/things.mof.new
cimprovider -l -m ThingsLibraryModule
cimprovider -l
cimmof -nroot/interop /var/lib/dhcp-client-provider/pegasus/ThingsLibrary.mof.new
END
ends 0 "${thing[@]}"
called "a second run loads nothing" <<'END'
cimcli gc -n root/PG_InterOp PG_ProviderModule
cimcli gc -n root/interop PG_ProviderModule
END
sed -i 's/Version = .*/Version = "0.0.1";/' "$kept/ThingsLibrary.mof"
echo old >"$kept/root/a/things.mof"
ends 0 --interop root/interop "${thing[@]}"
called "what has changed since is updated, a registration by removing it first" <<'END'
cimmof -uc -aEV -nroot/a /var/lib/dhcp-client-provider/pegasus/root/a/things.mof.new
cimprovider -l -m ThingsLibraryModule
cimprovider -d -m ThingsLibraryModule
cimprovider -r -m ThingsLibraryModule
cimmof -nroot/interop /var/lib/dhcp-client-provider/pegasus/ThingsLibrary.mof.new
END
check "keeps what was loaded" grep -q TEST_Thing "$kept/root/a/things.mof"

ends 0 --interop root/interop --refresh "${thing[@]}"
called "refreshing loads nothing where nothing has changed" <<'END'
END
mv "$kept/ThingsLibrary.mof" "$kept/kept"
ends 0 --interop root/interop --refresh "${thing[@]}"
check "refreshing registers nothing" test ! -e "$kept/ThingsLibrary.mof"
mv "$kept/kept" "$kept/ThingsLibrary.mof"

echo cimprovider >"$state/failing"
ends 1 -d "${thing[@]}"
says 'cimprovider has failed: cimprovider -l'
check "does not believe that a server is without the module that cannot be asked" \
    test -f "$kept/ThingsLibrary.mof"
echo "cimprovider -r -m ThingsLibraryModule" >"$state/failing"
ends 1 -d "${thing[@]}"
check "goes on to the end" test ! -e "$kept/root"
check "keeps what is still registered" test -f "$kept/ThingsLibrary.mof"
: >"$state/failing"
: >"$state/called"
ends 0 -d "${thing[@]}"
called "takes out at the next run what it could not" <<'END'
cimprovider -l -m ThingsLibraryModule
cimprovider -d -m ThingsLibraryModule
cimprovider -r -m ThingsLibraryModule
END
check "leaves nothing" test -z "$(find /var/lib/dhcp-client-provider -type f)"

echo cimmof >"$state/failing"
: >"$state/called"
ends 1 --interop root/interop "${thing[@]}"
says "cimmof has failed: cimmof -uc -aEV -nroot/a $kept/root/a/things.mof.new"
check "keeps nothing of what was not loaded" test -z "$(find /var/lib/dhcp-client-provider -type f)"
: >"$state/failing"
ends 0 --interop root/interop "${thing[@]}"
check "loads at the next run what it could not" test -f "$kept/ThingsLibrary.mof"
echo elsewhere >"$state/interop"
ends 1 "${thing[@]}"
says 'finds no interop namespace'

# Not every OpenPegasus has the classes of profiles.
settle "cimmof cimprovider cimcli"
echo "cimcli gc -n root/interop CIM_RegisteredProfile" >"$state/failing"
ends 0
says 'root/interop has no CIM_RegisteredProfile'
check "does without the profile there" test ! -e "$kept/root/interop"
check "and loads everything else" test -f "$kept/DHCPClient.mof"
: >"$state/failing"
ends 0
check "loads the profile once there are its classes" test -f "$kept/root/interop/12-dhcp-profile.mof"
ends 0 -d

# The two forms of this package take each other's place.
settle "cimmof cimprovider cimcli"
ends 0
check "registers one module for one library" diff <(echo DHCPClientModule) "$state/modules"
ends 0 --exact
check "--exact takes its place" \
    diff <(printf 'DHCPClientNeighboursModule\nDHCPClientProviderModule\n') "$state/modules"
ends 0
check "and the other way round" diff <(echo DHCPClientModule) "$state/modules"
ends 0 --exact -d
check "-d takes out what is registered, whichever it is" test ! -s "$state/modules"

# As the packages do before they are removed, where /usr/local is not in PATH.
mount -t tmpfs none /usr/local
mkdir /usr/local/sbin
settle ""
cp "$directory/tool" /usr/local/sbin/cimmof
cp "$directory/tool" /usr/local/sbin/cimprovider
cp "$directory/tool" /usr/local/sbin/cimcli
cp "$state"/{failing,modules,called,interop} /usr/local/
PATH=/usr/bin:/bin "$program" -t installed
check "finds what is below /usr/local" grep -q '^cimmof' /usr/local/called
PATH=/usr/bin:/bin "$program" -t installed -d -r "${program%/*}/schema/DHCPClient.registration"
check "takes it out again" test ! -s /usr/local/modules
rm /usr/local/sbin/*
check "is content where no object manager is" env PATH=/usr/bin:/bin "$program" -t installed -d
exit $((failures > 0))
TEXT
{
    declare -f check settle called ends says
    declare -p program directory tools state
    echo failures=0
} >"$directory/functions"
unshare --mount bash "$directory/inside" "$directory" || failures=$((failures + 1))

# One form of this package's providers at a time, with the classes as long as one needs them.
stage=$directory/forms
mkdir "$stage"
DESTDIR=$stage "$program" -t sfcb
DESTDIR=$stage "$program" -t sfcb --exact
(cd "$stage/var/lib/sfcb/stage/regs" && ls) >"$directory/seen"
check "--exact takes the place of the gateway" diff - "$directory/seen" <<'TEXT'
DHCPClientNeighbours.reg
DHCPClientProvider.reg
TEXT
DESTDIR=$stage "$program" -t sfcb -d -r "${program%/*}/schema/exact/DHCPClientNeighbours.registration"
(cd "$stage/var/lib/sfcb/stage" && find . -type f | LC_ALL=C sort) >"$directory/seen"
check "the classes stay with a provider that stays" diff - "$directory/seen" <<'TEXT'
./mofs/root/cimv2/10-dhcp-client.mof
./mofs/root/cimv2/11-dhcp-extensions.mof
./mofs/root/cimv2/12-dhcp-profile.mof
./mofs/root/interop/12-dhcp-profile.mof
./regs/DHCPClientProvider.reg
TEXT
DESTDIR=$stage "$program" -t sfcb -d
check "-d takes all out" test -z "$(find "$stage" -mindepth 1)"

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
refused 2 '--sfcb-root needs a value' --sfcb-root
refused 2 '--exact chooses' -t sfcb --exact -r "$directory/one.registration"
refused 1 'none.mof: no such file' -t sfcb -m none.mof
printf '[TEST_Thing\n' >"$directory/wrong.registration"
refused 1 'wrong.registration:1: no entry of a section' -t sfcb -r "$directory/wrong.registration"
printf '[TEST_Thing]\nprovider: A\n' >"$directory/wrong.registration"
refused 1 'the section of TEST_Thing lacks an entry' -t sfcb -r "$directory/wrong.registration"
printf '[TEST_Thing]\nprovider: A"; rm\n' >"$directory/wrong.registration"
refused 1 'no value for provider' -t sfcb -r "$directory/wrong.registration"
printf '[TEST_Thing]\ntype: method\n' >"$directory/wrong.registration"
refused 1 'unknown type method' -t sfcb -r "$directory/wrong.registration"

exit $((failures > 0))
