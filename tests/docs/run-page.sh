#!/usr/bin/env bash
# Runs the commands that a page shows, and compares their output where it shows one.
# They run as root in a root of their own: the machine's with the tree installed in
# /usr, everything that is written going to memory, without a network, on a host that
# is called "example", in a directory that has the pages in docs/.
#
# What is run are the blocks fenced as "sh". A line "$ COMMAND" is a command, with
# further lines behind a backslash; what follows up to the next is its output, in which
# a line "..." stands for any lines. A command without output shown may print what it
# likes and has to succeed. A block without "$" is a script that has to succeed.
#
# Every other block says what it is, where the reader does not see it: commands that cannot
# be run here are fenced as "sh not run: REASON", and "console" is run by another test; texts
# have the name of their language. How many blocks are not run, and why, is printed.
#
# Usage: run-page.sh PAGE BUILD_DIRECTORY SOURCE_DIRECTORY
set -euo pipefail

page=$1
build=$2
source=$3
directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT

# Each command is a file N.command, and N.expected if output is shown.
number=0
faults=0
inside=no
before=
unrun=()
begin() {
    number=$((number + 1))
    printf '%s\n' "$1" >"$directory/$number.command"
}
fault() { # WHAT
    echo "$page: $1"
    faults=$((faults + 1))
}
fence() { # the words behind ```
    inside=other
    case $1 in
        sh) inside=first ;;
        "sh not run: "?*) unrun+=("${1#sh not run: }") ;;
        console) [[ $page == */fleet.md ]] || fault "console blocks are run for docs/fleet.md alone" ;;
        text | cmake | cpp | ini | json | sql | yaml) ;;
        *) fault "this block does not say what it is: \`\`\`$1" ;;
    esac
}
while IFS= read -r line; do
    case $inside in
        no)
            if [[ $line == '```'* ]]; then
                fence "${line#'```'}"
            elif [[ $line == '    '* && -z $before ]]; then
                fault "this block is not fenced: $line"
            fi
            ;;
        *)
            if [[ $line == '```' ]]; then
                inside=no
            elif [[ $inside == other ]]; then
                :
            elif [[ $inside == continued ]]; then
                printf '%s\n' "$line" >>"$directory/$number.command"
                [[ $line == *\\ ]] || inside=output
            elif [[ $line == '$ '* && $inside != script ]]; then
                begin "${line#'$ '}"
                if [[ $line == *\\ ]]; then inside=continued; else inside=output; fi
            elif [[ $inside == first ]]; then
                begin "$line"
                inside=script
            elif [[ $inside == script ]]; then
                printf '%s\n' "$line" >>"$directory/$number.command"
            else
                printf '%s\n' "$line" >>"$directory/$number.expected"
            fi
            ;;
    esac
    before=$line
done <"$page"
[[ $inside == no ]] || fault "a block has no end"
echo "$page: $number commands and scripts are run, ${#unrun[@]} blocks are not"
((${#unrun[@]} == 0)) || printf '  not run: %s\n' "${unrun[@]}" | sort | uniq -c
((faults == 0)) || exit 1
((number > 0)) || exit 0

# Compares a file of output with the expected one.
cat >"$directory/agrees.awk" <<'TEXT'
NR == FNR { expected[++count] = $0; next }
{
    if (at < count && expected[at + 1] == "...") { any = 1; ++at }
    same = at < count && expected[at + 1] == $0
    if (any && !same) next
    any = 0
    if (!same) { print "line " FNR ": " $0; failed = 1; exit }
    ++at
}
END {
    if (failed) exit 1
    if (at < count && expected[at + 1] == "...") ++at
    if (at != count) { print "missing: " expected[at + 1]; exit 1 }
}
TEXT

cat >"$directory/inside" <<'TEXT'
export HOME=/root MACHINES=3 PATH=/usr/sbin:/usr/bin:/sbin:/bin
cd /dhcp-client-provider
failures=0
for ((number = 1; number <= $1; ++number)); do
    command=$(</run/page/$number.command)
    expected=/run/page/$number.expected
    # In this very shell: a page may set variables and start servers.
    eval "$command" >/run/page/output 2>&1 </dev/null
    status=$?
    problem=
    if [[ -e $expected ]]; then
        problem=$(awk -f /run/page/agrees.awk "$expected" /run/page/output) || problem=${problem:-differs}
    elif ((status != 0)); then
        problem="exit status $status"
    fi
    if [[ -z $problem ]]; then
        echo "ok: $command"
    else
        echo "FAILED: $command"
        echo "  $problem"
        sed 's/^/  | /' /run/page/output
        failures=$((failures + 1))
    fi
done
exit $((failures > 0))
TEXT

cat >"$directory/outside" <<'TEXT'
set -euo pipefail
directory=$1 build=$2 source=$3 number=$4
mount -t tmpfs none "$directory/memory"
mkdir "$directory"/memory/{upper,work,root}
root=$directory/memory/root
mount -t overlay none -o "lowerdir=/,upperdir=$directory/memory/upper,workdir=$directory/memory/work" "$root"
mount -t proc none "$root/proc"
mount --bind /dev "$root/dev"
# What an installation on the machine itself may have left.
rm -rf "$root/etc/zr" "$root/var/lib/dhcp-client-provider" "$root/var/lib/sfcb"
mount -t tmpfs none "$root/run"
mount -t tmpfs none "$root/tmp"
mkdir -p "$root/run/page" "$root/dhcp-client-provider"
for component in gateway provider neighbours schema cimdhcp; do
    DESTDIR=$root cmake --install "$build" --component "$component" --prefix /usr >/dev/null
done
cp "$directory"/*.* "$directory/inside" "$root/run/page"
cp -r "$source"/{docs,fuzz} "$root/dhcp-client-provider"
# What scripts/run leaves, where it leaves it.
mkdir -p "$root/dhcp-client-provider/build/run/bin"
ln -s /usr/bin/cimdhcp "$root/dhcp-client-provider/build/run/bin/cimdhcp"
hostname example
ip link set lo up
exec chroot "$root" /bin/bash /run/page/inside "$number"
TEXT
mkdir "$directory/memory"
unshare --mount --net --uts --pid --fork --kill-child \
    bash "$directory/outside" "$directory" "$build" "$source" "$number"
