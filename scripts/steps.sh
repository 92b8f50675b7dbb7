# shellcheck shell=bash
# For scripts that do one thing after the other; sourced, not run. Each step is a line
# with its time. What the tools print goes to a log.

begin_log() { # begin_log FILE: where the steps that follow write
    log=$1
    mkdir -p "${log%/*}"
    : >"$log"
    echo "Log: $log"
}

# How far ninja or ctest is, from the lines that they print.
progress() { # progress NAME
    local line
    while IFS= read -r line; do
        if [[ $line =~ ^\ *\[?([0-9]+)/([0-9]+)[]\ ] ]]; then
            printf '\r%s ... %3d %%' "$1" $((100 * BASH_REMATCH[1] / BASH_REMATCH[2]))
        fi
    done
    printf '\r%s ... ' "$1"
}

# step NAME COMMAND...: runs the command, and returns its status.
step() {
    local name=$1 start=$SECONDS status=0
    shift
    printf '%s ... ' "$name"
    echo "== $name: $*" >>"$log"
    if [[ -t 1 ]]; then
        "$@" 2>&1 | tee --append "$log" | progress "$name" || status=$?
    else
        "$@" >>"$log" 2>&1 || status=$?
    fi
    local end="done"
    ((status == 0)) || end=FAILED
    echo "$end ($((SECONDS - start)) s)"
    return "$status"
}

# needed NAME COMMAND...: the same; where it fails, shows why and ends the script.
needed() {
    local status=0
    step "$@" || status=$?
    if ((status != 0)); then
        # Of this step, from the first fault that ninja tells of, else what came last.
        tac "$log" | sed '/^== /q' | tac >"$log.step"
        sed -n '/^FAILED: /,$p' "$log.step" | grep . | head -n 60 || tail -n 40 "$log.step"
        rm "$log.step"
        echo "The whole log: $log"
        exit "$status"
    fi
}
