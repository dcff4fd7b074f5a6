#!/usr/bin/env bash
# Builds the client service of the documentation, in one of its languages, and checks that it prints what the page shows.
# usage: client_service.sh BUILD_DIR SOURCE_DIR cpp|python [CXX...]
set -euo pipefail
build=$1 sources=$2 language=$3 cxx=("${@:4}")
page=$sources/docs/client-service.md
. "$sources/tests/install/emulate.sh"
if [[ $language == python ]] && ! /usr/bin/python3 -c 'from gi.repository import Gio' 2>/dev/null; then
    echo "skipped: python3-gi or gir1.2-glib-2.0 is not installed"
    exit 77
fi

scratch=$(mktemp -d)
pids=()
trap '((${#pids[@]})) && kill "${pids[@]}" 2>/dev/null; wait; rm -rf "$scratch"' EXIT
cd "$scratch"

block() # language number
{
    awk -v fence="\`\`\`$1" -v number="$2" '/^```$/ { inside = 0 } inside; $0 == fence { inside = ++count == number }' "$page"
}

fail() # text
{
    echo "$1" >&2
    head -50 ./*.log >&2
    exit 1
}

await() # text-of-a-failure condition...
{
    local deadline=$((SECONDS + 20))
    until "${@:2}"; do
        ((SECONDS < deadline)) && kill -0 "${pids[-1]}" 2>/dev/null || fail "$1"
        sleep 0.02
    done
}

start() # name text-that-it-prints command...
{
    : >"$1.log"
    "${@:3}" >>"$1.log" 2>&1 &
    pids+=($!)
    await "not ready: ${*:3}" grep --quiet "$2" "$1.log"
}

cmake --install "$build" --prefix "$scratch/prefix" >install.log
emulate "$scratch"/prefix/bin/*
export PKG_CONFIG_PATH LD_LIBRARY_PATH PATH=$scratch/prefix/bin:$PATH
PKG_CONFIG_PATH=$(dirname "$(find "$scratch/prefix" -name kiv_system.pc)")
LD_LIBRARY_PATH=$(dirname "$(find "$scratch/prefix" -name libkiv_system.so)")
if [[ $language == cpp ]]; then
    block cpp 1 >mail.cpp
    command=$(block sh 1)
    command=${command//\/usr\/share/$scratch/prefix/share}
    command=${command/g++/${cxx[*]} -Wall -Wextra -Werror}
    eval "${command/gcc/${cxx[*]} -x c}"
    emulate mail
    service=(./mail)
else
    block python 1 >mail.py
    service=(/usr/bin/python3 mail.py)
fi

unset KIV_PROFILE KIV_LOG
ln -s "$sources/dbus"
HOME=$scratch eval "$(block sh 2)" >bus.pid 2>bus.log
pids+=("$(<bus.pid)")
read -ra subscriptions <<<"$(block sh 3)"
start subscriptions ready "${subscriptions[@]::3}"
start service ready "${service[@]}"

# Repeats what the page shows: the service's output follows its start.
block console 1 | awk '/^\$ / { file = /^\$ \.\/mail/ ? "heard" : "told"; if (file == "heard") next } { print >file ".expected" }'
while read -r prompt command; do
    [[ $prompt == '$' ]] || continue
    echo "$prompt $command"
    eval "$command" 2>&1 </dev/null || true
done <told.expected >told
diff told.expected told || fail "the page shows another output of kivctl"
await "the page shows another output of the service" cmp --silent heard.expected service.log
