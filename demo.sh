#!/bin/bash
# Builds the library with the simulated device and shows what they do on a private message bus: the device, its SIMs, countries,
# notifications, push messages, and a network change that a watching agent receives. At the end it shows the machine itself. It
# stops everything that it starts.
set -euo pipefail
here=$(dirname "$(readlink -f "$0")")
cd "$here"

readonly build=$here/build/demo
readonly kivctl=$build/tools/kivctl/kivctl
work=
declare -A pids=()
bold= plain=
[[ -t 1 ]] && bold=$'\033[1m' plain=$'\033[0m'

stop_all()
{
    ((${#pids[@]})) && kill "${pids[@]}" 2>/dev/null
    wait
    [[ -n $work ]] && rm -rf "$work"
}
trap 'stop_all || true' EXIT
trap 'exit 130' INT
trap 'exit 143' TERM HUP

build()
{
    mkdir -p build
    exec 9>build/demo.lock # demonstrations at the same time build one after the other
    flock 9
    [[ -x $kivctl ]] || echo "Building; the first time it takes a minute or two."
    local log=build/demo.log
    if ! { cmake --preset demo && cmake --build --preset demo; } >"$log" 2>&1; then
        cat "$log" >&2
        return 1
    fi
    exec 9>&-
}

# Starts a program in the background. Its output goes to a file with that name.
start() # name command...
{
    local name=$1
    shift
    : >"$work/$name"
    "$@" >>"$work/$name" 2>&1 &
    pids[$name]=$!
}

# Waits until a program in the background has printed that text.
await() # name text
{
    local deadline=$((SECONDS + 20))
    until grep --quiet --fixed-strings -- "$2" "$work/$1"; do
        if ((SECONDS > deadline)) || ! kill -0 "${pids[$1]}" 2>/dev/null; then
            echo "$1 did not print \"$2\", but:" >&2
            cat "$work/$1" >&2
            return 1
        fi
        sleep 0.02
    done
}

title() # text
{
    printf '\n%s== %s%s\n' "$bold" "$1" "$plain"
}

prompt() # argument...
{
    local argument
    printf '$ kivctl'
    for argument in "$@"; do
        [[ $argument == *[[:space:]{]* ]] && argument="'$argument'"
        printf ' %s' "$argument"
    done
}

# Shows a command and its output. A failure is shown too, and the demonstration continues.
show() # argument...
{
    prompt "$@"
    echo
    kivctl "$@" || echo "(exit code $?)"
}

# The same for a command that shows progress on a terminal, here without its progress.
without_progress() # argument...
{
    prompt "$@"
    echo
    kivctl "$@" 2>&1 | cat
}

# Shows what a program in the background has printed since the last time.
printed_by() # name
{
    sed "s/^/  $1 | /" "$work/$1"
    : >"$work/$1"
}

kivctl()
{
    "$kivctl" "$@"
}

start_bus_and_services()
{
    export DBUS_SYSTEM_BUS_ADDRESS=unix:path=$work/socket KIV_SUBSCRIBERS=$work/subscribers.db
    unset KIV_PROFILE KIV_LOG
    start bus dbus-daemon --config-file="$here"/dbus/private-bus.conf --address="$DBUS_SYSTEM_BUS_ADDRESS" --nofork --print-address
    await bus "$DBUS_SYSTEM_BUS_ADDRESS"
    start board "$build/platform/services/kiv-board-daemon"
    start manager "$build/platform/services/kiv-service-manager"
    start subscriptions "$build/platform/services/kiv-subscription-service"
    await board ready
    await manager ready
    await subscriptions ready
}

start_client_services()
{
    start mail "$kivctl" subscribe --name org.example.Mail --key 7 --kind policy --kind status --kind auth --kind activated \
        --kind number_changed --push mail
    await mail ready
    start calls "$kivctl" subscribe --name org.example.Calls --key 8 --kind status --kind auth --push mail
    await calls ready

    title "Two client services have subscribed over the bus"
    show subscribers list
}

show_device()
{
    title "The device"
    show device
    show device id
}

show_sims()
{
    title "The SIMs of the device"
    show sim

    title "The SIMs of a device whose first SIM is locked"
    show sim --profile dual-first-locked

    title "Waiting for a SIM that starts slowly, and for one that needs its PIN"
    show sim wait --profile slow-sim
    show sim wait --profile pin-required --timeout 1
}

show_countries()
{
    title "Countries"
    show country 450
    show country +590
    show country KR
}

show_notifications()
{
    title "Notifications to the client services"
    without_progress notify auth-success
    without_progress notify auth-fail
    without_progress notify on --service 7
    without_progress notify off on --service 7 --service 8
    without_progress notify policy --service 7 --texts on chat 2 http://example.org
    without_progress notify activated
    without_progress notify deactivated
    without_progress notify number-changed --texts a b c d
    printed_by mail
    printed_by calls

    title "Notifications to the platform's service manager"
    without_progress notify auth-success --to manager
    without_progress notify auth-fail --to manager
    without_progress notify on --service 7 --to manager
    without_progress notify off --service 7 --to manager
    without_progress notify policy --service 7 --texts on chat 2 http://example.org --to manager
    without_progress notify activated --to manager
    without_progress notify deactivated --to manager
    printed_by manager
}

show_push()
{
    title "A push message"
    without_progress push mail --data '{"folder":"inbox"}' --message "You have mail" --time 1764000000
    printed_by mail
    printed_by calls
}

show_watch()
{
    title "Flight mode is switched on while an agent watches"
    show device set --profile ./phone runtime.flight-mode=false
    start watcher "$kivctl" watch --profile ./phone
    await watcher ready
    show network --profile ./phone
    show device set --profile ./phone runtime.flight-mode=true network.cellular=flight-mode
    await watcher flight_mode
    show network --profile ./phone
    printed_by watcher
}

# Shows the machine on which this runs, with its system bus and daemons, if it has any.
show_machine()
{
    title "This machine"
    unset DBUS_SYSTEM_BUS_ADDRESS
    show device --profile host
    show network --profile host
}

.ci/install-missing build
build
work=$(mktemp -d)
cd "$work"
start_bus_and_services
start_client_services
show_device
show_sims
show_countries
show_notifications
show_push
show_watch
show_machine
