#!/usr/bin/env bash
# Every test that the page of promises names exists in this build.
# Usage: promises.sh BUILD-DIRECTORY PAGE
set -euo pipefail
build=$1 page=$2

# To ctest, a program may be one test.
tests=$({
    ctest --test-dir "$build" --show-only | sed -n 's/^ *Test *#[0-9]*: //p'
    find "$build/tests" -name '*_test' ! -name corpus_test -type f -perm -u+x -exec {} --gtest_list_tests \; |
        awk '/^[^ ].*\.$/ { suite = $1 } /^[^ ].*\.  #/ { suite = $1 } /^  / { print suite $1 }'
} | grep -oE '[A-Z][A-Za-z0-9]*(\.[A-Za-z][A-Za-z0-9-]*)+' | sort -u)
# Names of tests are words with a point between them; names of files have a slash or a
# lower-case end.
named=$(grep -oE '`[A-Z][A-Za-z0-9]*(\.[A-Z][A-Za-z0-9]*(\.[A-Za-z-]+)?)`' "$page" | tr -d '`' | sort -u)
if (($(wc -l <<<"$named") < 20)); then
    echo "only $(wc -l <<<"$named") tests are named in $page" >&2
    exit 1
fi
missing=$(comm -23 <(echo "$named") <(echo "$tests"))
if [[ -n $missing ]]; then
    echo "no such test: $missing" >&2
    exit 1
fi
