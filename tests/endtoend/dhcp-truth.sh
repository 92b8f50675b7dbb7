# What is true at a moment, compared with what the program shows then, for tests to source
# after dhcp-laboratory.sh. Asked are, each time,
#   - the program, started for the one question, and a process that has run since the first,
#   - their instances of the classes: of the program, and of its server over HTTP.
#
# The test has set `program` and `tree_on_request` to the paths of the two programs, and
# `subject` to what its lines begin with. It gets
#   truth MOMENT FACT=PATTERN...    compares; a pattern is one of the shell's. Facts are
#       link      yes or no: whether the interface is there
#       enabled   DHCPEnabled: true, false or unknown
#       source    AddressSource: a number, or none
#       servers   the servers with commas between them, or none
#       lease4    of each lease or asking client of IPv4, "CLIENT STATE ADDRESS SERVER",
#                 with "-" for what is not known and commas between them; or none
#       lease6    likewise of IPv6
#     InterfaceState, IPv4Address and the end of a lease that the kernel knows, too, are
#     compared with the kernel each time, a server never stands where there is no
#     endpoint, and no source where there is no address.
#   truth_now MOMENT FACT=PATTERN...  the same, of a program started for the one question alone:
#       one that stays may know more
#   tells MOMENT REGEX              a line of "cimdhcp show" on standard error has it
#   finish                          tells how many were false; the status is 1 if any was
# A moment that is false does not end the test.

truths=0
falsehoods=0
current=eth1
asked=  # how many seconds ago the staying processes were started
shopt -s extglob

command -v jq >/dev/null || { echo "needs jq"; exit 1; }

start_staying() {
    coproc staying { in_client env ZR_LOG_SINK=none ZR_DATA_DIR="$work/data" "$tree_on_request" 2>&1; }
    disown
    in_client env ZR_LOG_SINK=none ZR_DATA_DIR="$work/data" "$program" serve --listen 127.0.0.1:5988 \
        >"$work/serve.log" 2>&1 &
    disown
    eventually in_client bash -c ': >/dev/tcp/127.0.0.1/5988' || fail "no server: $(<"$work/serve.log")"
    asked=$SECONDS
}

# staying_tree: what the process that stays tells now.
staying_tree() {
    local line
    echo >&"${staying[1]}"
    while IFS= read -r -t 10 line <&"${staying[0]}"; do
        printf '%s\n' "$line"
        [[ $line != '}' ]] || return 0
    done
    return 1
}

# facts_of FILE: those of the current interface, as lines FACT=VALUE.
facts_of() {
    jq -r --arg name "$current" '
        def or_none: if length == 0 then "none" else . end;
        def lease: .properties | [.Client, .ClientState, .Address, .ServerAddress]
            | map(if . == null or . == "" then "-" else tostring end) | join(" ");
        def leases($family): [.children[]? | select(.type == "DHCPLease" and .properties.Family == $family)
            | lease] | sort | join(",") | or_none;
        def ends($family): [.children[]? | select(.type == "DHCPLease" and .properties.Family == $family)
            | .properties.LeaseExpires // empty] | (min // "none");
        [.. | objects | select(.type? == "NetworkInterface" and .properties.Name == $name)]
        | if length == 0 then "link=no" else .[0] |
            "link=yes",
            "enabled=" + (.properties.DHCPEnabled | if . == null then "unknown" else tostring end),
            "source=\(.properties.AddressSource // "none")",
            "state=\(.properties.InterfaceState // "none")",
            "address=\(.properties.IPv4Address // "none")",
            "servers=" + ([.properties.DHCPServerAddresses[]?] | join(",") | or_none),
            "lease4=" + leases("IPv4"),
            "lease6=" + leases("IPv6"),
            "end4=\(ends("IPv4"))"
          end' "$1"
}

# read_kernel: what the kernel tells of the current interface now. `kernel` gets it as
# FACT=PATTERN, and `kernel_end` when its IPv4 address will go, in seconds since the epoch;
# nothing if it will not.
read_kernel() {
    mapfile -t kernel < <(ip -n "$client" -j address show dev "$current" 2>/dev/null |
        jq -rs --argjson now "$(date +%s)" '[.[][]? | select(.ifname?)][0] // {}
            | [.addr_info[]? | select(.family == "inet" and .scope == "global")] as $addresses
            | "address=" + ($addresses[0].local // "none"),
              "state=" + (if .operstate == "UP" or .operstate == "UNKNOWN" then "1" else "0" end),
              ([$addresses[] | select(.dynamic) | .valid_life_time][0] // empty | . + $now)')
    kernel_end=${kernel[2]:-}
    kernel=("${kernel[@]:0:2}")
}

# false_in FILE FACT=PATTERN...: tells each fact of the tree in the file that is not so; nothing
# if all are. FILE.facts then has those that are shown.
false_in() {
    local file=$1 fact pattern value
    shift
    facts_of "$file" >"$file.facts"
    local -A seen=()
    while IFS='=' read -r fact value; do
        seen[$fact]=$value
    done <"$file.facts"
    if [[ ${seen[link]:-no} == no && " $*" != *" link=no"* ]]; then
        echo "the interface is not there; true is $*"
        return 0
    fi
    for fact in "$@"; do
        pattern=${fact#*=}
        fact=${fact%%=*}
        # shellcheck disable=SC2053 # patterns are meant
        [[ ${seen[$fact]:-absent} == $pattern ]] ||
            echo "$fact: true is $pattern, shown ${seen[$fact]:-absent}"
    done
    [[ ${seen[link]:-no} == yes ]] || return 0
    [[ ${seen[enabled]} == true || ${seen[servers]} == none ]] ||
        echo "servers: ${seen[servers]} although DHCP is ${seen[enabled]}"
    [[ ${seen[address]} != none || ${seen[source]} == @(0|none) || ${seen[lease6]} != none ]] ||
        echo "source: ${seen[source]} of no address"
    if [[ -n $kernel_end && ${seen[end4]} != none && ${seen[lease4]} != *,* && ${seen[lease4]} != *' - -' ]]; then
        ((seen[end4] - kernel_end <= 3 && kernel_end - seen[end4] <= 3)) ||
            echo "LeaseExpires: the kernel says $kernel_end, shown ${seen[end4]}"
    fi
}

# classes_of OPTION...: what the classes show of the current interface, as FACT=VALUE.
classes_of() {
    local class
    for class in DHCPProtocolEndpoint DHCPRemoteServiceAccessPoint DHCPSettingData; do
        cimdhcp "$@" --format json instances "QVXZR_$class" >"$work/$class" 2>>"$work/classes.log" || true
    done
    jq -rn --arg name "$current" --slurpfile endpoints "$work/DHCPProtocolEndpoint" \
        --slurpfile servers "$work/DHCPRemoteServiceAccessPoint" \
        --slurpfile settings "$work/DHCPSettingData" '
        def named($names): .[].instances[]?.properties
            | select((.Name // .ElementName).value as $each | $names | index([$each]));
        def shown: [.[] | values | tostring] | join(" ");
        "endpoint=" + ([$endpoints | named([$name]) | .EnabledState.value, .ClientState.value] | shown),
        "servers=" + ([$servers | named([$name + "_IPv4", $name + "_IPv6"]) | .AccessInfo.value | values]
            | join(",")),
        "setting=" + ([$settings | named([$name]) | .RequestedIPv4Address.value] | shown)'
}
# false_classes FILE OPTION...: as false_in, of the classes against FILE.facts.
false_classes() {
    local file=$1 fact value expected
    shift
    local -A seen=() classes=()
    while IFS='=' read -r fact value; do
        seen[$fact]=$value
    done <"$file.facts"
    [[ ${seen[link]:-no} == yes ]] || return 0
    while IFS='=' read -r fact value; do
        classes[$fact]=$value
    done < <(classes_of "$@")
    expected=
    # Enabled and bound; else disabled and unknown.
    [[ ${seen[enabled]} != true ]] || case ${seen[source]}${seen[state]} in
        11) expected='2 8' ;;
        *) expected='3 0' ;;
    esac
    value=${classes[endpoint]-no response}
    [[ $value == "$expected" ]] || echo "endpoint: true is '$expected', shown '$value'"
    value=${classes[servers]-no response}
    [[ ${value:-none} == "${seen[servers]}" ]] || echo "access points: true is ${seen[servers]}, shown $value"
    value=${classes[setting]-no response}
    [[ ${value:-none} == "${seen[address]}" || ${seen[enabled]} != true ]] ||
        echo "setting data: true is ${seen[address]}, shown ${value:-none}"
}

# compare FACT=PATTERN...: what is false now goes to $work/false; the status is 1 if anything is.
compare() {
    local -a facts=("$@")
    read_kernel
    : >"$work/classes.log"
    [[ " $*" == *" link=no"* ]] || facts+=("${kernel[@]}")
    {
        cimdhcp tree >"$work/fresh.json" 2>"$work/fresh.log" || echo "started now: no tree"
        staying_tree >"$work/staying.json" || echo "stays: no tree"
        false_in "$work/fresh.json" "${facts[@]}" | sed 's/^/started now: /'
        false_in "$work/staying.json" "${facts[@]}" | sed 's/^/stays: /'
    } >"$work/false"
    [[ ! -s $work/false ]] || return 1
    {
        false_classes "$work/fresh.json" | sed 's/^/started now: /'
        false_classes "$work/fresh.json" --connect http://127.0.0.1:5988 | sed 's/^/serves: /'
    } >"$work/false"
    [[ ! -s $work/false ]]
}

compare_now() {
    read_kernel
    {
        cimdhcp tree >"$work/fresh.json" 2>"$work/fresh.log" || echo "no tree"
        false_in "$work/fresh.json" "$@" "${kernel[@]}"
    } >"$work/false"
    [[ ! -s $work/false ]]
}

# A client changes the kernel, its files and its own mind one after the other: some seconds
# are left for the last of them.
truth() {
    [[ -n $asked ]] || start_staying
    await_truth compare "$@"
}
truth_now() {
    await_truth compare_now "$@"
}
# await_truth COMPARISON MOMENT FACT=PATTERN...: a slow machine, on which one comparison takes
# seconds, makes as many as a fast one. Those in which a manager had no time to respond do not
# count, for a minute.
await_truth() {
    local comparison=$1 deadline=$((SECONDS + ${TRUTH_PATIENCE:-5})) attempts=0
    local last=$((SECONDS + 60))
    moment=$2
    shift 2
    ((++truths))
    until "$comparison" "$@"; do
        if ((SECONDS > last)) || ! is_unheard; then
            ((++attempts))
        fi
        if ((SECONDS > deadline && attempts >= 8)); then
            is_false
            return 0
        fi
        sleep 0.2
    done
    echo "right: $subject, $moment ($SECONDS s)"
}
# Whether a process told in the last comparison that it could not ask a manager, or, if it
# stays, that it does not know what such a one would tell.
is_unheard() {
    grep -qs 'cannot be asked' "$work/fresh.log" "$work/classes.log" ||
        grep -q '^stays: .*, shown unknown$' "$work/false"
}
# tell_false TEXT: tells now, and at the end once more.
tell_false() {
    ((++falsehoods))
    echo "FALSE: $subject, $1" | tee -a "$work/falsehoods"
}
# tell_falsehoods: each line of $work/false, of the present moment.
tell_falsehoods() {
    ((++falsehoods))
    sed "s/^/FALSE: $subject, $moment: /" "$work/false" | tee -a "$work/falsehoods"
}
is_false() {
    tell_falsehoods
    {
        echo "--- $subject, $moment: the kernel:"; ip -n "$client" address show
        echo "--- the program:"; cimdhcp tree --explain
        echo "--- what it told:"; cat "$work/fresh.log"
        echo "--- the client:"; tail -20 "$work/client.log" || true
    } >>"$work/explained" 2>&1
}

tells() {
    local regex=$2 told
    moment=$1
    ((++truths))
    told=$(cimdhcp show 2>&1 >/dev/null) || true
    if grep -Eq "$regex" <<<"$told"; then
        echo "right: $subject, $moment, is told"
    else
        tell_false "$moment: not told is /$regex/; told is: ${told:-nothing}"
    fi
}

finish() {
    if ((falsehoods != 0)); then
        [[ ! -e $work/explained ]] || cat "$work/explained"
        fail "$subject: $falsehoods of $truths moments"
    fi
    ((truths != 0)) || fail "$subject: nothing was compared"
    echo "$subject: $truths moments passed"
}
