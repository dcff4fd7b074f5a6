#!/usr/bin/env bash
# The facade's page names every member, the README the number of tests, and its picture is what the demonstration prints. Whatever a
# page links to is there.
# usage: readme.sh SOURCE_DIR BUILD_DIR
set -euo pipefail
cd "$1"
build=$2

failed=0
while read -r member; do
    grep --quiet --fixed-strings "\`$member\`" docs/facade.md || { echo "docs/facade.md does not name $member"; failed=1; }
done < <(sed --quiet 's/^DASystem::\([A-Z]\w*\)(.*/\1/p' lib/DASystem/exported_symbols.txt | sort --unique |
    grep --invert-match --line-regexp -e DASystem -e GetInstance)

tests=$(ctest --test-dir "$build" --show-only --label-exclude '^check$' | sed --quiet 's/^Total Tests: //p')
grep --quiet "tests failed out of $tests\$" README.md || { echo "README.md shows another number of tests than $tests"; failed=1; }

while IFS=: read -r page link; do
    [[ -e $(dirname "$page")/$link ]] || { echo "$page links to $link, which is not there"; failed=1; }
done < <(grep --only-matching --with-filename --perl-regexp '\]\(\K(?!https?:)[\w.][^)#]*' ./*.md docs/*.md bench/*.md)

if /usr/bin/python3 -c 'import rich' 2>/dev/null; then
    docs/picture.sh --check || failed=1
else
    echo "the picture is not compared: python3-rich is not installed"
fi
exit $failed
