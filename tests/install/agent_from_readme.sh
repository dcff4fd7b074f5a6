#!/usr/bin/env bash
# Installs a build into a prefix that is on no default path, moves it, and there builds and runs the agent that the README shows.
# usage: agent_from_readme.sh BUILD_DIR README CXX
set -euo pipefail
build=$1 readme=$2 cxx=$3

scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
cmake --install "$build" --prefix "$scratch/made" >"$scratch/install.log"
mv "$scratch/made" "$scratch/moved"

awk '/^```cpp$/ { inside = 1; next } /^```$/ { inside = 0 } inside' "$readme" >"$scratch/agent.cpp"
export PKG_CONFIG_PATH LD_LIBRARY_PATH
PKG_CONFIG_PATH=$(dirname "$(find "$scratch/moved" -name kiv_system.pc)")
LD_LIBRARY_PATH=$(dirname "$(find "$scratch/moved" -name libkiv_system.so)")
read -ra flags <<<"$(pkg-config --cflags --libs kiv_system)"
"$cxx" -std=c++17 -Wall -Wextra -Werror "$scratch/agent.cpp" "${flags[@]}" -o "$scratch/agent"

read -ra flags <<<"$(pkg-config --cflags kiv_system)"
for header in DASystem DASimManager DADBusManager DAConnectionManager IDAConnectionStateListener; do
    echo "#include <$header.h>" | "$cxx" -std=c++17 -fsyntax-only -Wall -Wextra -Wpedantic -Werror -x c++ - "${flags[@]}"
done
for header in "$scratch"/moved/include/kiv_system/{tele,wifi,net_,run,sys,sto,pack,app_,vconf,dlog,[IT]*a*p*i}*.h; do
    [[ $(basename "$header") == IDA* ]] || cc -std=c11 -fsyntax-only -Wall -Wextra -Wpedantic -Werror "$header"
done

export DBUS_SYSTEM_BUS_ADDRESS="unix:path=$scratch/no-bus" KIV_SUBSCRIBERS="$scratch/subscribers.db"
single=$(KIV_PROFILE=single "$scratch/agent")
none=$(KIV_PROFILE=no-telephony "$scratch/agent") && exit 1
printf '%s\n%s\n' "$single" "$none"
[[ $single == "SIM of "*", network "* && $none == "no SIM answers" ]]
