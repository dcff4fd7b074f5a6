#!/usr/bin/env bash
# Installs a build into a prefix that is on no default path, moves it, and there builds and runs the agent that the README shows.
# usage: agent_from_readme.sh BUILD_DIR README CXX
set -euo pipefail
build=$1 readme=$2 cxx=$3
. "$(dirname "$0")/agent.sh"

scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cmake --install "$build" --prefix "$scratch/made" >"$scratch/install.log"
mv "$scratch/made" "$scratch/moved"
if grep --recursive --fixed-strings --files-with-matches -e "$scratch/made" -e "$build" "$scratch/moved"; then
    echo "these know where they were built or installed"
    exit 1
fi
try_agent "$scratch/moved" "$readme" "$cxx" "$scratch"

read -ra flags <<<"$(pkg-config --cflags kiv_system)"
for header in DASystem DASimManager DADBusManager DAConnectionManager IDAConnectionStateListener; do
    echo "#include <$header.h>" | "$cxx" -std=c++17 -fsyntax-only -Wall -Wextra -Wpedantic -Werror -x c++ - "${flags[@]}"
done
for header in "$scratch"/moved/include/kiv_system/{tele,wifi,net_,run,sys,sto,pack,app_,vconf,dlog,[IT]*a*p*i}*.h; do
    [[ $(basename "$header") == IDA* ]] || cc -std=c11 -fsyntax-only -Wall -Wextra -Wpedantic -Werror "$header"
done
