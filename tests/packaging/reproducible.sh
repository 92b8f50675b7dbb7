#!/usr/bin/env bash
# Makes the packages of a source tree twice: of copies at two paths, with different times, masks
# and languages, and compares what comes out byte for byte. With that, the packages are looked
# through for the paths of the builds, and those of symbols for what debuggers need.
# It takes two whole builds: 20 minutes of two processors.
# Usage: reproducible.sh SOURCE_TREE [DIRECTORY]   DIRECTORY: where copies and packages stay
set -euo pipefail

source=$(realpath "$1")
if (($# > 1)); then
    directory=$(realpath "$2")
else
    directory=$(mktemp -d)
    trap 'rm -rf "$directory"' EXIT
fi
SOURCE_DATE_EPOCH=$(git -C "$source" log -1 --format=%ct)
export SOURCE_DATE_EPOCH

make() { # make COPY PACKAGES
    mkdir -p "$1"
    git -C "$source" ls-files -z | tar --create --directory "$source" --null --files-from=- --ignore-failed-read |
        tar --extract --directory "$1" --touch
    "$1/scripts/packages" "$2"
}
(umask 022 && TZ=Asia/Tokyo LC_ALL=C make "$directory/one" "$directory/first")
(umask 077 && TZ=America/Lima LC_ALL=C.UTF-8 make "$directory/another/of it" "$directory/second")

ls "$directory/first" >"$directory/names"
ls "$directory/second" | diff "$directory/names" -
failures=0
while read -r name; do
    cmp "$directory/first/$name" "$directory/second/$name" || failures=$((failures + 1))
done <"$directory/names"
cd "$directory/first"
sha256sum --check --quiet SHA256SUMS

# The symbols fit: each file of a package has its own, by the number that both have.
mkdir "$directory/root"
for package in *.deb; do
    dpkg-deb --extract "$package" "$directory/root"
done
if grep -rlF -e "$directory" "$directory/root"; then
    echo "FAILED: these files have the path of the build"
    failures=$((failures + 1))
fi
count=0
while IFS= read -r file; do
    id=$(readelf --notes "$file" | sed -n 's/.*Build ID: //p')
    symbols=$directory/root/usr/lib/debug/.build-id/${id:0:2}/${id:2}.debug
    readelf --sections --wide "$symbols" | grep -q ' \.debug_line ' || {
        echo "FAILED: no line numbers for $file"
        failures=$((failures + 1))
    }
    count=$((count + 1))
done < <(find "$directory/root/usr/bin" "$directory/root/usr/lib" -path '*/debug/*' -prune -o \
    -type f \( -name cimdhcp -o -name '*.so' \) -print)
if ((count != 4)); then
    echo "FAILED: $count programs and libraries, and not 4"
    failures=$((failures + 1))
fi
exit $((failures > 0))
