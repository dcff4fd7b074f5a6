#!/usr/bin/env bash
# Runs the subscription service with several users, which only root can do. On a bus that denies by default, with the installed
# policies, a client service of another user subscribes and receives all notifications. A third user cannot interfere.
# usage: users.sh BUILD_DIR SOURCE_DIR
set -euo pipefail
build=$1 sources=$2
. "$sources/tests/install/emulate.sh"
readonly agent=daemon client=mail stranger=games
((EUID == 0)) || { echo "skipped: only root can be several users"; exit 77; }
command -v setpriv >/dev/null || { echo "skipped: util-linux is not installed"; exit 77; }

scratch=$(mktemp -d)
pids=()
trap '((${#pids[@]})) && kill "${pids[@]}" 2>/dev/null; wait; rm -rf "$scratch"' EXIT
chmod 755 "$scratch"
mkdir "$scratch"/{store,services}
chown $agent "$scratch/store"
export DBUS_SYSTEM_BUS_ADDRESS=unix:path=$scratch/bus KIV_SUBSCRIBERS=$scratch/store/subscribers.db
unset KIV_PROFILE KIV_LOG
cmake --install "$build" --prefix "$scratch/prefix" >"$scratch/installed"
emulate "$scratch"/prefix/bin/*
readonly share=$scratch/prefix/share kivctl=$scratch/prefix/bin/kivctl

. "$(dirname "$(readlink -f "$0")")/../support/programs.sh"

# For subshells, whose process it takes.
be() # user command...
{
    exec setpriv --reuid="$1" --regid="$1" --clear-groups "${@:2}"
}

call() # user method argument...
{
    be "$1" dbus-send --system --print-reply=literal --reply-timeout=20000 --dest=org.kiv.Subscriptions /org/kiv/Subscriptions \
        "org.kiv.Subscriptions1.$2" "${@:3}" 2>&1
}

expect() # text command...
{
    local answer
    answer=$("${@:2}" 2>&1) || true
    [[ $answer == *"$1"* ]] || fail "not \"$1\", but \"$answer\": ${*:2}"
}

# A standard bus starts a service as a user with a helper; this bus starts it itself.
run_as() # user
{
    echo "$(command -v setpriv) --reuid=$1 --regid=$1 --clear-groups"
}
sed "s|^Exec=.*/|Exec=$(run_as $agent) $scratch/prefix/bin/|" \
    "$share/dbus-1/system-services/org.kiv.Subscriptions.service" >"$scratch/services/org.kiv.Subscriptions.service"
readonly examples=$share/doc/libkiv-client-dev/examples
sed "s|^Exec=.*|Exec=$(run_as $client) $kivctl subscribe --name org.example.Mail --push other|" \
    "$examples/org.example.Mail.service" >"$scratch/services/org.example.Mail.service"
for policy in "$sources/dbus/kiv-agent.conf" "$share/dbus-1/system.d/org.kiv.Subscriptions.conf" \
    "$examples/org.example.Mail.conf"; do
    sed "s/user=\"kiv-agent\"/user=\"$agent\"/; s|/org/example/Mail|/org/kiv/ClientService|" "$policy" \
        >"$scratch/$(basename "$policy")"
done
cat >"$scratch/bus.conf" <<CONF
<busconfig>
  <type>system</type>
  <listen>$DBUS_SYSTEM_BUS_ADDRESS</listen>
  <auth>EXTERNAL</auth>
  <servicedir>$scratch/services</servicedir>
  <policy context="default">
    <allow user="*"/>
    <deny own="*"/>
    <deny send_type="method_call"/>
    <allow send_destination="org.freedesktop.DBus" send_interface="org.freedesktop.DBus"/>
    <allow send_type="signal"/>
    <allow send_requested_reply="true" send_type="method_return"/>
    <allow send_requested_reply="true" send_type="error"/>
    <allow receive_type="*"/>
  </policy>
  <include>$scratch/kiv-agent.conf</include>
  <include>$scratch/org.kiv.Subscriptions.conf</include>
  <include>$scratch/org.example.Mail.conf</include>
</busconfig>
CONF
start bus unix: dbus-daemon --config-file="$scratch/bus.conf" --nofork --nosyslog --print-address
expect "org.kiv.Subscriptions can be started by the bus" be $agent "$kivctl" doctor
start mail ready be $client "$kivctl" subscribe --name org.example.Mail --key 7 --kind policy --kind status --kind auth \
    --kind activated --kind number_changed --push mail
[[ $(stat --format=%U "$KIV_SUBSCRIBERS") == "$agent" ]] || fail "the store is not the agent's"

while read -r -a words; do
    expect "sent subscribers=1 delivered=1" be $agent "$kivctl" "${words[@]}"
done <<EVENTS
notify auth-success
notify on --service 7
notify policy --service 7 --texts a b c d
notify activated
notify number-changed --texts a b c d
push mail --data a --message b
EVENTS
(($(wc --lines <"$scratch/mail.log") == 7)) || fail "not everything is received"
! grep "Rejected.*org.example.Mail" "$scratch/bus.log" || fail "the policies deny a call of the agent"

before=$(call $agent List)
[[ $before == *org.example.Mail* && $(call root List) == "$before" ]] || fail "not listed: $before"
readonly record=(string:auth string:all string:org.example.Mail objpath:/org/kiv/ClientService string:org.kiv.ClientService)
expect AccessDenied call $stranger Subscribe "${record[@]}"
expect AccessDenied call $stranger Unsubscribe "${record[@]}"
expect AccessDenied call root Subscribe "${record[@]}"
[[ $(call $stranger List) != *org.example* ]] || fail "a stranger sees the subscriptions of others"
expect "not allowed to own" be $stranger "$kivctl" subscribe --name org.kiv.Subscriptions --push mail
expect AccessDenied be $client dbus-send --system --print-reply --dest=org.kiv.Subscriptions / org.freedesktop.DBus.Peer.Ping
[[ $(call $agent List) == "$before" ]] || fail "somebody else changed the subscriptions"

kill "${pids[1]}"
wait "${pids[1]}" || fail "the client service does not end"
[[ $(be $agent "$kivctl" subscribers list 2>/dev/null) == "" ]] || fail "the subscriptions are still there"

# The bus starts a client service that has the example's .service file.
(be $agent "$kivctl" subscribers add auth all org.example.Mail /org/kiv/ClientService org.kiv.ClientService)
expect "each one is on the bus, or the bus can start it" be $agent "$kivctl" doctor
expect "sent subscribers=1 delivered=1" be $agent "$kivctl" notify auth-success
