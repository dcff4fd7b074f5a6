#!/usr/bin/env bash
# The picture of the layers has exactly one arrow for each folder that includes headers of another folder.
# usage: layers.sh SOURCE_DIR
set -euo pipefail
cd "$1"
readonly page=docs/architecture.md

# Nodes are written as node["folder<br>words"], arrows as node --> node.
mapfile -t folders < <(sed --quiet 's/^ *\w*\["\([^"<]*\).*"\]$/\1/p' $page)
((${#folders[@]})) || { echo "$page has no picture"; exit 1; }

drawn()
{
    sed --quiet 's/^ *\(\w*\)\["\([^"<]*\).*"\]$/\1 \2/p; s/^ *\(\w*\) --> \(\w*\)$/\1 --> \2/p' $page |
        awk '$2 == "-->" { print folder[$1], folder[$3]; next } { folder[$1] = $2 }'
}

# A folder with a header of that name includes its own.
included()
{
    for folder in "${folders[@]}"; do
        find "$folder" \( -name '*.h' -o -name '*.h.in' \) -printf "has $folder %f\n"
        grep --recursive --no-filename --only-matching --perl-regexp '^#include [<"]\K\w+\.h' "$folder" |
            sed "s|^|includes $folder |"
    done | awk '
        { sub(/\.in$/, "", $3) }
        $1 == "has" { has[$2, $3]; folders[$2]; next }
        !(($2, $3) in has) { wanted[$2 " " $3] }
        END {
            for (want in wanted) {
                split(want, of)
                for (folder in folders)
                    if ((folder, of[2]) in has)
                        print of[1], folder
            }
        }' | sort --unique
}

diff <(drawn | sort) <(included) || { echo "< drawn in $page, > included"; exit 1; }
