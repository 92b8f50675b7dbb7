#!/usr/bin/env bash
# The lines of a log without what differs from run to run: times, line numbers,
# addresses, the host's name and the directory of the run become T, N, ADDRESS, HOST
# and WORK.
# Usage: without-accidents.sh DIRECTORY <LOG
set -euo pipefail
# The directory goes first: its random name may look like an address.
sed -E -e "s|$1|WORK|g" -e 's/^[0-9-]+T[0-9:.]+Z /T /' \
    -e 's/^(T [0-9]+ [^ ]+ [^ ]+):[0-9]+ /\1:N /' \
    -e 's/Line: [0-9]+\]/Line: N]/; s/at line [0-9]+ in/at line N in/' \
    -e 's/0x[0-9a-f]+/ADDRESS/g; s/=0( |$)/=ADDRESS\1/g' \
    -e "s/$(uname -n)/HOST/g"
