#!/usr/bin/env bash
# Doxygen makes the pages of the headers without a warning, so everything public is documented.
# usage: api.sh SOURCE_DIR
set -euo pipefail
command -v doxygen >/dev/null || { echo "skipped: doxygen is not installed"; exit 77; }
cd "$1"
pages=$(mktemp -d)
trap 'rm -rf "$pages"' EXIT
doxygen - <<<"$(<docs/Doxyfile)
OUTPUT_DIRECTORY = $pages"
