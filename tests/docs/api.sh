#!/usr/bin/env bash
# The pages of the installed headers are made without a warning, and every header, class and type has one.
# usage: api.sh SOURCE_DIR
set -euo pipefail
command -v doxygen >/dev/null || { echo "skipped: doxygen is not installed"; exit 77; }
cd "$1"
pages=$(mktemp -d)
trap 'rm -rf "$pages"' EXIT
doxygen - <<<"$(<docs/Doxyfile)
OUTPUT_DIRECTORY = $pages
GENERATE_XML = YES"

headers=(lib/DASystem/include/*.h lib/kiv_util/include/*.h platform/include/*.h)
types=$(sed --quiet --regexp-extended \
    -e 's/^ *(class|struct|enum( class)?) ([A-Z_]+ |__attribute__\(\(.*\)\) )?(\w+)( :.*)?$/\4/p' \
    -e 's/^typedef .*\b(\w+);$/\1/p' -e 's/^typedef .*\(\*(\w+)\).*/\1/p' -e 's/^} (\w+);$/\1/p' \
    "${headers[@]}" | sort --unique)
(($(wc --words <<<"$types") > 30)) || { echo "the types of the headers are not found: $types"; exit 1; }
failed=0
for type in $types "${headers[@]##*/}"; do
    grep --quiet --extended-regexp "<name>(\w+::)?$type</name>" "$pages/xml/index.xml" || { echo "no page describes $type"; failed=1; }
done
grep --quiet "GetAlpha3CountryCodeFromMcc" "$pages/api/index.html" || { echo "the main page does not show the facade"; failed=1; }
exit $failed
