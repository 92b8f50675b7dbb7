#!/usr/bin/env bash
# The test of the pages fails for a block that does not say what it is, for a command that
# fails and for output that differs, and for nothing else.
# Usage: run-page-test.sh BUILD_DIRECTORY SOURCE_DIRECTORY
set -euo pipefail

directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT
failures=0
expect() { # STATUS PATTERN: of the page on standard input
    cat >"$directory/page.md"
    local status=0
    "${0%/*}/run-page.sh" "$directory/page.md" "$build" "$source" >"$directory/output" 2>&1 || status=$?
    if ((status != $1)) || ! grep -qF -- "$2" "$directory/output"; then
        echo "expected status $1 with \"$2\", got status $status with"
        cat "$directory/output"
        failures=$((failures + 1))
    fi
}
build=$1 source=$2

expect 1 "is not fenced:     rm file" <<'PAGE'
A command:

    rm file
PAGE
expect 1 'does not say what it is: ```' <<'PAGE'
```
rm file
```
PAGE
expect 1 'does not say what it is: ```sh not run:' <<'PAGE'
```sh not run:
rm file
```
PAGE
expect 1 "for docs/fleet.md alone" <<'PAGE'
```console
$ rm file
```
PAGE
expect 1 "has no end" <<'PAGE'
```text
PAGE
expect 0 "0 commands and scripts are run, 2 blocks are not" <<'PAGE'
```sh not run: changes the firewall
rm file
```

- a list

  whose text goes on

```sh not run: changes the firewall
rm file
```

```json
{}
```
PAGE
expect 1 "FAILED: false" <<'PAGE'
```sh
$ echo first
first
$ false
```
PAGE
expect 1 "line 2: second" <<'PAGE'
```sh
$ printf 'first\nsecond\n'
first
```
PAGE
exit $((failures > 0))
