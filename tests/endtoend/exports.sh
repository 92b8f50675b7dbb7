#!/usr/bin/env bash
# A provider library exports exactly the symbols named: some object managers open it
# with its symbols visible to everybody.
# Usage: exports.sh LIBRARY SYMBOL...
set -euo pipefail
library=$1
shift
actual=$(nm --dynamic --defined-only --format=posix "$library" | awk '{print $1}' | sort)
expected=$(printf '%s\n' "$@" | sort)
[[ $actual == "$expected" ]] || {
    echo "FAILED: $library exports:"
    echo "$actual"
    exit 1
}
