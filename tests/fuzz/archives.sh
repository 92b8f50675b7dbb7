#!/usr/bin/env bash
# Each corpus belongs to a target, is as small as docs/fuzzing.md says and is what
# fuzz/corpus makes of its inputs. An archive that is damaged or missing is refused.
# Usage: archives.sh SOURCE_DIRECTORY
set -euo pipefail
cd "$1/fuzz"

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
failures=0
fail() {
    echo "$1"
    failures=$((failures + 1))
}

for archive in corpora/*; do
    name=$(basename "$archive" .tar.gz)
    [[ $archive == *.tar.gz && -f targets/${name}Fuzzer.cpp ]] || fail "$archive: of no target"
    ./corpus unpack "$archive" "$work/$name"
    # What people wrote has a name that says why, and comes on top.
    inputs=$(find "$work/$name" -mindepth 1 -regex '.*/[0-9a-f]+' | wc -l)
    bytes=$(find "$work/$name" -type f -regex '.*/[0-9a-f]+' -exec cat {} + | wc -c)
    ((inputs > 0 && inputs <= 250)) || fail "$archive: $inputs inputs"
    ((bytes <= 80000)) || fail "$archive: $bytes bytes"
    # What gzip makes of the same bytes differs with its version.
    touch "$work/$name"/*
    ./corpus pack "$work/$name" "$work/again.tar.gz"
    cmp <(gzip -dc "$archive") <(gzip -dc "$work/again.tar.gz") ||
        fail "$archive: packed again it is another one"
done

refused() { # WHY ARCHIVE
    if ./corpus unpack "$2" "$work/refused" 2>"$work/log"; then
        fail "$1 was unpacked"
    elif [[ -e $work/refused || ! -s $work/log ]]; then
        fail "$1: refused without a word, or unpacked in part"
    fi
}
whole=corpora/StringTokenize.tar.gz
size=$(stat -c %s "$whole")
head -c $((size - 9)) "$whole" >"$work/torn"
refused "an archive without its end" "$work/torn"
cp "$whole" "$work/changed"
printf '\377\377' | dd of="$work/changed" bs=1 seek=$((size / 2)) conv=notrunc status=none
refused "an archive with other bytes in it" "$work/changed"
refused "an archive that is not there" "$work/missing"
exit $((failures > 0))
