#!/usr/bin/env bash
# Installs a build into a prefix outside the default paths, moves it, and builds and runs the README's agent with it.
# usage: agent_from_readme.sh BUILD_DIR README CXX...
set -euo pipefail
build=$1 readme=$2 cxx=("${@:3}")
. "$(dirname "$0")/agent.sh"

scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cmake --install "$build" --prefix "$scratch/made" >"$scratch/install.log"
mv "$scratch/made" "$scratch/moved"
if grep --recursive --fixed-strings --files-with-matches -e "$scratch/made" -e "$build" "$scratch/moved"; then
    echo "these know where they were built or installed"
    exit 1
fi
try_agent "$scratch/moved" "$readme" "$scratch" "${cxx[@]}"

read -ra flags <<<"$(pkg-config --cflags kiv_system)"
for header in DASystem DASimManager DADBusManager DAConnectionManager IDAConnectionStateListener; do
    echo "#include <$header.h>" | "${cxx[@]}" -std=c++17 -fsyntax-only -Wall -Wextra -Wpedantic -Werror -x c++ - "${flags[@]}"
done
for header in "$scratch"/moved/include/kiv_system/{tele,wifi,net_,run,sys,sto,pack,app_,vconf,dlog,[IT]*a*p*i}*.h; do
    [[ $(basename "$header") == IDA* ]] ||
        "${cxx[@]}" -x c -std=c11 -fsyntax-only -Wall -Wextra -Wpedantic -Werror "${flags[@]}" "$header"
done

# Where the C library uses 32 bits by default, the contract documents the setting for 64 bits.
narrow=$(echo '#include <sys/statvfs.h>
#if __SIZEOF_LONG__ == 4
narrow
#endif' | "${cxx[@]}" -x c -E - | grep --line-regexp narrow || true)
refusal=$("${cxx[@]}" -x c -std=c11 -fsyntax-only "$scratch/moved/include/kiv_system/storage.h" 2>&1 || true)
[[ $narrow && $refusal == *"compile with -D_FILE_OFFSET_BITS=64"* || ! $narrow && ! $refusal ]] ||
    { echo "storage.h without the flags of pkg-config: $refusal"; exit 1; }
