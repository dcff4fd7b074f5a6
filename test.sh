#!/bin/bash
# Installs missing packages, then builds and runs the tests with and without sanitizers. Ends with CTest's summary of the plain
# build.
set -euo pipefail
cd "$(dirname "$(readlink -f "$0")")"

usage()
{
    cat <<'TEXT'
usage: ./test.sh [--all | --arch armhf | --arch arm64]
  Build in build/, and run the tests three times: with AddressSanitizer and UBSan, with ThreadSanitizer, and in a plain build.
  --all   Also build with clang++; check the format of all sources; run clang-tidy on all sources except the tests; run each fuzz
          target for 30 seconds; use real modem and network daemons; check packages, a device's build, documents and country data;
          and test plain builds for both ARM processors, with their packages
  --arch  Only build for this processor, without sanitizers, and run the tests with qemu-user-static
TEXT
}

all= arch=
case "${1-}" in
    "") ;;
    --all) all=yes ;;
    --arch)
        arch=${2-}
        [[ $arch == armhf || $arch == arm64 ]] || { usage >&2; exit 2; } ;;
    -h | --help) usage; exit 0 ;;
    *) usage >&2; exit 2 ;;
esac

say()
{
    printf '\n== %s\n' "$*"
}

# Runs a command. Prints its output only if it fails.
quietly() # command...
{
    local log
    log=$(mktemp)
    if ! "$@" >"$log" 2>&1; then
        cat "$log"
        rm -f "$log"
        return 1
    fi
    rm -f "$log"
}

build() # preset
{
    say "$1: build"
    quietly cmake --preset "$1"
    quietly cmake --build --preset "$1"
}

# This compiler's ThreadSanitizer fails on kernels with much address randomisation, so this switches it off where allowed.
fixed_addresses=()
if setarch "$(uname -m)" --addr-no-randomize true 2>/dev/null; then
    fixed_addresses=(setarch "$(uname -m)" --addr-no-randomize)
fi

run_tests() # preset
{
    say "$1: tests"
    # Two tests per processor: half of the time a test waits for programs that it started.
    "${fixed_addresses[@]}" ctest --preset "$1" --parallel $((2 * $(nproc)))
}

# Builds for another processor and runs its tests, as far as the mirror has the libraries.
test_arch() # arch
{
    local arch=$1 code=0
    say "$arch: libraries"
    .ci/sysroot "$arch" || code=$?
    if [[ $code == 77 && $all ]]; then
        say "$arch: skipped"
        return
    fi
    ((code == 0)) || return "$code"
    build "$arch"
    [[ $all ]] && run_tests "check-$arch"
    run_tests "$arch"
}

sources()
{
    git ls-files --cached --others --exclude-standard -- '*.cpp' '*.h'
}

check_format()
{
    say "clang-format"
    sources | xargs clang-format --dry-run -Werror
}

check_tidy()
{
    say "clang-tidy"
    quietly run-clang-tidy -quiet -p build/clang -j "$(nproc)" "^$PWD/(lib|platform|tools|bench)/"
}

if [[ $arch ]]; then
    .ci/install-missing build test cross
    test_arch "$arch"
    exit
fi

if [[ $all ]]; then
    .ci/install-missing
    check_format
    build clang
    check_tidy
    run_tests clang
    say "fuzz targets"
    ./fuzz.sh 30
    test_arch armhf
    test_arch arm64
else
    .ci/install-missing build test
fi

for preset in asan tsan dev; do
    build "$preset"
    if [[ $all && $preset == dev ]]; then
        run_tests check
    elif [[ $all ]]; then
        run_tests "check-$preset"
    fi
    run_tests "$preset"
done
