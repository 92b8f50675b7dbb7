#!/usr/bin/env bash
# Each drawing of the pages is the one that Graphviz makes of its source.
# Usage: drawings.sh SOURCE_DIRECTORY; with UPDATE_EXPECTED=yes, draws them anew.
set -euo pipefail
cd "$1/docs"

# Places and sizes differ with fonts and versions of Graphviz; nodes and edges do not.
content() { grep -oP '<title>\K[^<]*|<text [^>]*>\K[^<]*' "$1" | LC_ALL=C sort; }

made=$(mktemp)
trap 'rm -f "$made"' EXIT
failures=0
for source in *.dot; do
    drawing=${source%.dot}.svg
    dot -Tsvg "$source" >"$made"
    if [[ ${UPDATE_EXPECTED:-no} == yes ]]; then
        cat "$made" >"$drawing"
    fi
    diff <(content "$drawing") <(content "$made") || {
        echo "$drawing is not that of $source"
        failures=$((failures + 1))
    }
    grep -q "($drawing)" ./*.md || {
        echo "no page shows $drawing"
        failures=$((failures + 1))
    }
done
exit $((failures > 0))
