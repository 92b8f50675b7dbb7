#!/usr/bin/env bash
# Installs the platform's CMake package, and builds and runs a project that uses it.
# Usage: consumer.sh BUILD_DIRECTORY TREE
set -euo pipefail

directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT
cmake --install "$1" --component dev --prefix "$directory/prefix" >/dev/null
cmake -S "$(dirname "$0")/consumer" -B "$directory/build" -DCMAKE_PREFIX_PATH="$directory/prefix" \
    -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build "$directory/build" >/dev/null
ZR_INSTRUMENTATION_TREE=$2 "$directory/build/consumer" >"$directory/output"
diff - "$directory/output" <<'TEXT'
eth0
wlan0
eth1
85
TEXT
