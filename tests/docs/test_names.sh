#!/usr/bin/env bash
# A test's name is a sentence of at most 60 letters.
# usage: test_names.sh SOURCE_DIR
set -euo pipefail

names=$(grep --recursive --no-filename --null-data --only-matching --perl-regexp 'TEST(_F|_P)?\(\w+,\s*\K\w+' \
    --include='*.cpp' "$1/tests" | tr '\0' '\n')
awk 'length > 60 { print "longer than 60 letters: " $0; bad = 1 } END { exit bad }' <<<"$names"
