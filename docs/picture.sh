#!/bin/bash
# Draws docs/demo.svg, the picture in the README, from what demo.sh prints on a terminal.
# usage: docs/picture.sh [--check]   --check compares the picture and changes nothing
set -euo pipefail
cd "$(dirname "$(readlink -f "$0")")/.."
picture=$(mktemp)
trap 'rm -f "$picture"' EXIT
script --quiet --return --command "stty cols 130 && ./demo.sh" /dev/null </dev/null | docs/picture.py >"$picture"
[[ ${1-} == --check ]] || { cp "$picture" docs/demo.svg; exit 0; }
cmp "$picture" docs/demo.svg || { echo "docs/demo.svg is not what demo.sh prints: run docs/picture.sh"; exit 1; }
