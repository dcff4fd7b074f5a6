#!/bin/bash
# Prints the size of the stripped library, with a column per processor, and compares it with the goals.
# usage: bench/sizes.sh BUILD_DIR...   each with a library of the build type Release
# Exit codes: 0 all goals met, 1 a goal missed
set -euo pipefail
declare -A goals=([amd64]=130 [armhf]=110)

cached() # build variable
{
    sed --quiet "s/^$2:[A-Z]*=//p" "$1/CMakeCache.txt"
}

kib() # bytes
{
    awk -v bytes="$1" 'BEGIN { printf "%.1f KiB", bytes / 1024 }'
}

stripped=$(mktemp)
trap 'rm --force "$stripped"' EXIT
names= files= contents= wanted= code=0
for build in "$@"; do
    toolchain=$(cached "$build" CMAKE_TOOLCHAIN_FILE)
    arch=$([[ $toolchain ]] && basename "$toolchain" .cmake || dpkg --print-architecture)
    "$(cached "$build" CMAKE_STRIP)" -o "$stripped" "$build/lib/DASystem/libkiv_system.so"
    file=$(stat --format=%s "$stripped")
    # The size of the sections, without the padding between them.
    content=0
    while read -r _ type _ _ size _; do
        [[ $type == NOBITS ]] || ((content += 16#$size))
    done < <("$(cached "$build" CMAKE_READELF)" --wide --sections "$stripped" | sed --quiet 's/^ *\[ *[1-9][0-9]*\] *//p')
    goal=${goals[$arch]-}
    names+=$(printf '%14s' "$arch")
    files+=$(printf '%14s' "$(kib "$file")")
    contents+=$(printf '%14s' "$(kib "$content")")
    wanted+=$(printf '%14s' "${goal:+<= $goal KiB}")
    [[ ! $goal ]] || ((file <= goal * 1024)) || { code=1; echo "MISSED: the library of $arch has $(kib "$file")"; }
done
printf '%-28s%s\n' "libkiv_system.so, stripped" "$names" "size of the file" "$files" "without padding to pages" "$contents" goal "$wanted"
exit $code
