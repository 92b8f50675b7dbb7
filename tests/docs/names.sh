#!/usr/bin/env bash
# Every file that a page names, and every link to a page and its part, is there, and README.md has
# a link to each page. Of the pages that say how the tree is changed, every name of the code is
# there, too. And every folder is told of in docs/architecture.md.
# Usage: names.sh SOURCE_DIRECTORY
set -euo pipefail
cd "$1"

failures=0
missing() { # PAGE NAME
    echo "$1: there is no $2"
    failures=$((failures + 1))
}
mapfile -t tree < <(find . \( -name .git -o -path ./build \) -prune -o -type f -printf '%P\n')
declare -A names=() tops=()
for file in "${tree[@]}"; do
    names[${file##*/}]=1
    tops[${file%%/*}]=1
done
headings() { # of a page, as links name them
    sed -nE 's/^#+ //p' "$1" | tr '[:upper:]' '[:lower:]' | sed -E 's/[^a-z0-9 _-]//g; s/ /-/g'
}
in_tree() { # a path of the tree, with wildcards; words such as TARGET stand for any
    local path
    path=$(sed -E 's/TARGET|NAME|WHY/*/g' <<<"$1")
    compgen -G "$path" >/dev/null || compgen -G "$path.in" >/dev/null
}

pages=(*.md docs/*.md)
for page in "${pages[@]}"; do
    while read -r link; do
        [[ $link == *://* ]] && continue
        target=${page%"${page##*/}"}${link%%#*}
        [[ $link != '#'* ]] || target=$page
        if [[ ! -e $target ]] || { [[ $link == *'#'* ]] && ! headings "$target" | grep -qxF "${link#*#}"; }; then
            missing "$page" "$link"
        fi
    done < <(grep -oP '\]\(\K[^)]+' "$page" || true)
    while read -r name; do
        if [[ $name == */* ]]; then
            # Other directories than those of the tree are those of a machine.
            [[ -n ${tops[${name%%/*}]:-} && -d ${name%%/*} ]] || continue
            [[ $name == build/* ]] || in_tree "${name%/}" || missing "$page" "$name"
        elif [[ $name =~ \.(cpp|h|mof|registration|md|sh|cmake|dot|svg)$ ]]; then
            [[ -n ${names[$name]:-} || -n ${names[$name.in]:-} ]] || missing "$page" "$name"
        fi
    done < <(grep -oP '`\K[A-Za-z0-9_][A-Za-z0-9_.*/-]*(?=`)' "$page" || true)
done

# A reader of README.md finds each page.
for page in docs/*.md; do
    grep -qF "($page)" README.md || missing README.md "link to $page"
done

# Names of the code: functions, types, members, CMake's variables.
for page in docs/extending.md; do
    while read -r name; do
        [[ $name == */* || $name == *.* ]] && continue
        grep -rqwF --exclude-dir=docs --exclude-dir=build --exclude-dir=.git -- "${name##*::}" . ||
            missing "$page" "$name"
    done < <(grep -oP '`\K[A-Za-z_][A-Za-z0-9_:]*(?=(\(\))?`)' "$page")
done

for folder in */ platform/*/ wbem/*/; do
    [[ $folder == build/ || $folder == platform/ || $folder == wbem/ ]] || grep -qF "\`$folder\`" docs/architecture.md ||
        missing docs/architecture.md "$folder"
done
for folder in platform/linux/*/ provider/*/ cimom/*/ wbem/server/*/ cimdhcp/*/ fuzz/*/; do
    name=$(basename "$folder")/
    # The headers that other rooms include are in include/ everywhere.
    [[ $name == include/ ]] || grep -qF "\`$name\`" docs/architecture.md ||
        missing docs/architecture.md "$folder"
done
for folder in tests/*/; do
    folder=${folder#tests/}
    # The folder of a room's tests has the room's name.
    [[ -d $folder && $folder != fuzz/ && $folder != docs/ ]] ||
        grep -qF "\`$folder\`" docs/architecture.md || missing docs/architecture.md "tests/$folder"
done
exit $((failures > 0))
