#!/bin/bash
# Installs missing packages, builds the release, measures it, prints the table, and plots the cost per subscriber.
set -euo pipefail
cd "$(dirname "$(readlink -f "$0")")"

usage()
{
    cat <<'TEXT'
usage: ./bench.sh [--json FILE] [--only TEXT]
  Measure the cost of the library. Print one row per item: goal, result, range of the middle half of the rounds. This takes
  about four minutes.
  --json FILE  write the table to FILE (default: build/bench.json)
  --only TEXT  measure only the items whose text contains TEXT, without a plot
  Exit codes: 0 all goals met, 1 a goal missed, 2 failure
TEXT
}

json=$PWD/build/bench.json
only=
while (($#)); do
    case "$1" in
        --json) json=$(realpath -m "${2:?a file is needed}"); shift 2 ;;
        --only) only=${2:?a text is needed}; shift 2 ;;
        -h | --help) usage; exit 0 ;;
        *) usage >&2; exit 2 ;;
    esac
done

build()
{
    .ci/install-missing build test bench cross && cmake --preset release && cmake --build --preset release --target kiv_bench
}
build >&2 || exit 2

code=0
build/release/bench/kiv_bench --json "$json" ${only:+--only "$only"} || code=$?
((code < 2)) && [[ -z $only ]] || exit "$code"

jq --raw-output '.[] | select(.series) | [.series, .subscribers, .library_ns, .bare_ns] | @tsv' "$json" >build/bench.tsv
gnuplot -e 'data = "build/bench.tsv"; picture = "build/bench.svg"' bench/cost.gnuplot
# The same library for the other processors, as far as the mirror has what it needs.
sizes=(build/release)
for arch in armhf arm64; do
    .ci/sysroot $arch || continue
    cmake --preset $arch && cmake --build --preset $arch --target kiv_system || exit 2
    sizes+=(build/$arch)
done >&2
echo
bench/sizes.sh "${sizes[@]}" || code=1

printf '\n%s\n' "Table: $json" "Picture: $PWD/build/bench.svg"
exit "$code"
