#!/usr/bin/env bash
# Checks that the built files are hardened and stay loaded.
# usage: hardening.sh READELF SYSTEM_LIBRARY UTIL_LIBRARY PLATFORM_LIBRARY
# The first one calls a function that _FORTIFY_SOURCE checks.
set -euo pipefail
readelf=$1
shift

must() # what file pattern text
{
    grep --quiet --extended-regexp -e "$3" <<<"$4" || { echo "$2: $1 is missing"; exit 1; }
}

for file in "$@"; do
    segments=$("$readelf" --wide --program-headers "$file")
    dynamic=$("$readelf" --wide --dynamic "$file")
    symbols=$("$readelf" --wide --dyn-syms "$file")
    must "a stack that cannot be executed" "$file" 'GNU_STACK .* RW +0x' "$segments"
    must "a read-only relocation segment" "$file" GNU_RELRO "$segments"
    must "binding of all symbols at loading" "$file" 'BIND_NOW|\(FLAGS_1\).*NOW' "$dynamic"
    must "the stack protector" "$file" ' UND +__stack_chk_fail' "$symbols"
done
# A library that an agent closes has to stay loaded, because it has callbacks and threads that are still to run.
for file in "$1" "$3"; do
    must "the flag that keeps it loaded" "$file" 'FLAGS_1\).*NODELETE' "$("$readelf" --wide --dynamic "$file")"
done
must "a function of _FORTIFY_SOURCE" "$1" ' UND +__[a-z]+_chk@' "$("$readelf" --wide --dyn-syms "$1")"
