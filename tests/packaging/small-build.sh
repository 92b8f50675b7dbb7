#!/usr/bin/env bash
# Builds the libraries for machines with little memory, with everything that is read and
# without most of it, and looks at what they take: of both, a file without symbols, and what
# is in memory after the first request. The aims are 0.8 MB and 1 MB. A misspelt name of what
# is to be left out ends the configuration, and what is left out is not in the library.
#
# It compiles everything twice and needs some minutes, so that no other test runs it.
# Usage: small-build.sh BUILD_DIRECTORY SOURCE_DIRECTORY
# BUILD_DIRECTORY: has first_request, of whatever build.
set -euo pipefail

build=$1
source=$2
directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT
failures=0
wrong() {
    echo "wrong: $1" >&2
    failures=$((failures + 1))
}

# Everything that can be left out but for udhcpc, which is what such a machine mostly has.
left_out=$(sed -n '/sources{/,/}/p' "$source/platform/zrcommon/include/zrcommon/BuiltSources.h" |
    grep -o '"[^"]*"' | tr -d '"' | grep -vx udhcpc | paste -sd ';')

configure() { # DIRECTORY OPTION...
    cmake -S "$source" -B "$directory/$1" -G Ninja -DCMAKE_BUILD_TYPE=Release -DBUILD_TESTING=OFF \
        -DZR_COMPILED_TOGETHER=ON -DZR_SMALL=ON "${@:2}" >"$directory/log" 2>&1
}
measure() { # DIRECTORY LIBRARY REGISTRATION MOST_BYTES
    local file=$directory/$1/lib/cmpi/lib$2.so
    strip -o "$directory/stripped/lib$2.so" "$file"
    local size
    size=$(stat -c %s "$directory/stripped/lib$2.so")
    echo "$1: lib$2.so has $size bytes without symbols"
    ((size <= $4)) || wrong "the aim is $4 bytes"
    ZR_CONFIG=/dev/null ZR_LOG_SINK=none "$build/bin/first_request" "$directory/stripped" \
        "lib$2.so" "$source/schema/$3.registration" 1000 || wrong "memory"
}
mkdir "$directory/stripped"

if configure misspelt "-DZR_WITHOUT=wicked;dhclint"; then
    wrong "a misspelt name is taken"
elif ! grep -q 'there is no "dhclint"' "$directory/log"; then
    wrong "the misspelt name is not told: $(<"$directory/log")"
fi
for variant in all few; do
    if [[ $variant == all ]]; then configure all; else configure few "-DZR_WITHOUT=$left_out"; fi
    cmake --build "$directory/$variant" --target DHCPClient DHCPClientProvider >"$directory/log" ||
        { cat "$directory/log"; exit 1; }
    measure "$variant" DHCPClientProvider exact/DHCPClientProvider 800000
    measure "$variant" DHCPClient DHCPClient 800000
done
for words in org.freedesktop.NetworkManager net.connman; do
    if grep -qaF "$words" "$directory/few/lib/cmpi/libDHCPClient.so"; then
        wrong "$words is in the library without it"
    fi
done
grep -qaF org.freedesktop.NetworkManager "$directory/all/lib/cmpi/libDHCPClient.so" ||
    wrong "NetworkManager is not in the library with it"
exit $((failures > 0))
