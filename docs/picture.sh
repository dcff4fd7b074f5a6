#!/bin/bash
# Draws docs/demo.svg, the picture in the README, from what demo.sh prints on a terminal.
# usage: docs/picture.sh [--check]   --check compares the picture and changes nothing
set -euo pipefail
cd "$(dirname "$(readlink -f "$0")")/.."
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
picture=$work/demo.svg
mkfifo "$work/keyboard" # nobody types; at the end of its input, a terminal would print what ends it
script --quiet --return --command "stty cols 130 && ./demo.sh" /dev/null <>"$work/keyboard" | docs/picture.py >"$picture"
[[ ${1-} == --check ]] || { cp "$picture" docs/demo.svg; exit 0; }
cmp "$picture" docs/demo.svg || { echo "docs/demo.svg is not what demo.sh prints: run docs/picture.sh"; exit 1; }
