#!/bin/bash
# Builds the fuzz targets and runs them, two at a time. Keeps inputs that reach new code for the next run. Keeps and names inputs
# that fail.
set -euo pipefail
cd "$(dirname "$(readlink -f "$0")")"
readonly build=build/fuzz

usage()
{
    cat <<'TEXT'
usage: ./fuzz.sh [SECONDS [TARGET...]]
  Run each TARGET for SECONDS (default: 30; all targets).
  To run a kept input again: build/fuzz/tests/fuzz/TARGET INPUT
TEXT
}

targets()
{
    basename --multiple tests/fuzz/corpus/*
}

build()
{
    .ci/install-missing
    echo "Building the targets."
    mkdir -p $build
    if ! { cmake --preset fuzz && cmake --build --preset fuzz; } >$build/build.log 2>&1; then
        cat $build/build.log >&2
        return 1
    fi
}

# Runs one target; its output goes to a log.
run() # target
{
    mkdir -p "$build/corpus/$1"
    TMPDIR=$work "$build/tests/fuzz/$1" -max_total_time="$seconds" -timeout=10 -rss_limit_mb=1500 -detect_leaks=0 \
        -print_final_stats=1 -artifact_prefix="$build/failed-$1-" "$build/corpus/$1" "tests/fuzz/corpus/$1" \
        >"$build/$1.log" 2>&1 || touch "$work/$1.failed"
}

said() # target text
{
    sed --quiet "s/^$2[: ]*//p" "$build/$1.log" | tail --lines=1
}

report()
{
    local target runs
    printf '\n%-10s %10s %8s %8s %12s\n' target runs runs/s corpus "records fed"
    for target in "$@"; do
        runs=$(said "$target" stat::number_of_executed_units)
        printf '%-10s %10s %8s %8s %12s\n' "$target" "${runs:--}" "$(said "$target" stat::average_exec_per_sec)" \
            "$(find "$build/corpus/$target" -type f | wc --lines)" "$(said "$target" fed)"
    done
}

failures()
{
    local target failed=0
    for target in "$@"; do
        [[ -e $work/$target.failed ]] || continue
        failed=1
        printf '\n%s failed: %s\n' "$target" "$(sed --quiet 's/.*Test unit written to //p' "$build/$target.log")"
        grep --max-count=1 --after-context=20 --extended-regexp 'not true|Failure|CRITICAL|WARNING|runtime error|ERROR:' \
            "$build/$target.log" || tail --lines=20 "$build/$target.log"
    done
    return $failed
}

case "${1-}" in
    -h | --help) usage; exit 0 ;;
    *[!0-9]*) usage >&2; exit 2 ;;
esac
seconds=${1:-30}
shift $(($# > 0))
(($#)) || mapfile -t all < <(targets)
(($#)) || set -- "${all[@]}"
for target in "$@"; do
    [[ -d tests/fuzz/corpus/$target ]] || { usage >&2; exit 2; }
done

build
work=$(mktemp --directory --tmpdir="$([[ -w /dev/shm ]] && echo /dev/shm || echo "${TMPDIR:-/tmp}")")
trap 'rm --recursive --force "$work"' EXIT
for target in "$@"; do
    (($(jobs -rp | wc --lines) < 2)) || wait -n
    echo "$target: $seconds s"
    run "$target" &
done
wait
report "$@"
failures "$@"
