#!/usr/bin/env bash
# Checks the example policy on a bus that denies by default: it allows only the library's calls, and a client service must add a
# rule.
# usage: policy.sh KIVCTL KIV_AGENT_CONF
set -euo pipefail
kivctl=$1 policy=$2
scratch=$(mktemp -d)
pids=()
trap '((${#pids[@]})) && kill "${pids[@]}" 2>/dev/null; wait; rm -rf "$scratch"' EXIT
export DBUS_SYSTEM_BUS_ADDRESS=unix:path=$scratch/bus KIV_SUBSCRIBERS=$scratch/subscribers.db
unset KIV_PROFILE KIV_LOG

. "$(dirname "$(readlink -f "$0")")/../support/programs.sh"

# The agent, the services and their client run as one user here, so the policy allows the services as little as possible.
sed "s/user=\"kiv-agent\"/user=\"$(id --user)\"/" "$policy" >"$scratch/agent.conf"
cat >"$scratch/bus.conf" <<CONF
<busconfig>
  <type>system</type>
  <listen>$DBUS_SYSTEM_BUS_ADDRESS</listen>
  <auth>EXTERNAL</auth>
  <policy context="default">
    <allow user="*"/>
    <deny own="*"/>
    <deny send_type="method_call"/>
    <allow send_type="signal"/>
    <allow send_requested_reply="true" send_type="method_return"/>
    <allow send_requested_reply="true" send_type="error"/>
    <allow receive_type="*"/>
  </policy>
  <policy user="$(id --user)">
    <allow own="org.tizen.system.deviced"/>
    <allow own="org.tizen.servicemanager.service"/>
    <allow own_prefix="org.example"/>
    <allow send_destination="org.freedesktop.DBus" send_interface="org.freedesktop.DBus" send_member="RequestName"/>
    <allow send_destination="org.freedesktop.DBus" send_interface="org.freedesktop.DBus" send_member="ReleaseName"/>
    <allow send_destination="org.example.Mail" send_interface="org.kiv.ClientService"/>
    <allow send_destination="org.example.Mail" send_interface="org.freedesktop.DBus.Properties" send_member="GetAll"/>
  </policy>
  <include>$scratch/agent.conf</include>
</busconfig>
CONF
start bus unix: dbus-daemon --config-file="$scratch/bus.conf" --nofork --nosyslog --print-address
start services ready "$kivctl" services
subscribe() # name kind...
{
    start "$1" ready "$kivctl" subscribe --name "org.example.$1" "${@:2}"
}
subscribe Mail --key 7 --kind policy --kind status --kind auth --kind activated --kind number_changed --push mail

"$kivctl" device id >/dev/null || fail "the device unique ID is denied"
while read -r event options; do
    read -ra words <<<"$event $options"
    [[ $event == number-changed ]] || "$kivctl" notify "${words[@]}" --to manager >/dev/null ||
        fail "the manager was not notified: $event"
    [[ $("$kivctl" notify "${words[@]}") == "sent subscribers=1 delivered=1" ]] || fail "the subscriber was not notified: $event"
done <<EVENTS
auth-success
on              --service 7
policy          --service 7 --texts a b c d
activated
number-changed  --texts a b c d
EVENTS
[[ $("$kivctl" push mail --data a --message b) == "sent subscribers=1 delivered=1" ]] || fail "not pushed"
! grep Rejected "$scratch/bus.log" || fail "the library makes calls that the policy denies"

# Without a rule for it, a client service is neither notified nor started. The others are.
subscribe Other --kind auth
"$kivctl" subscribers add auth all org.example.Gone /org/example org.example.Gone >/dev/null
[[ $("$kivctl" notify auth-success 2>&1) == *"subscribers=3 delivered=1"* ]] || fail "not exactly one of three was notified"
[[ $(wc --lines <"$scratch/Other.log") == 1 ]] || fail "the wrong subscriber was notified"
! grep "Rejected.*StartServiceByName" "$scratch/bus.log" || fail "a subscriber cannot be started"

call() # destination path member
{
    dbus-send --system --print-reply --reply-timeout=5000 --dest="$1" "$2" "$3" 2>&1
}
readonly board=/Org/Tizen/System/DeviceD/Board manager=/org/tizen/servicemanager
call org.tizen.system.deviced $board org.tizen.system.deviced.Board.GetSerial >/dev/null || fail "even GetSerial is denied"
while read -r destination path member; do
    [[ $(call "$destination" "$path" "$member") == *AccessDenied* ]] || fail "allowed: $destination $path $member"
done <<CALLS
org.tizen.system.deviced         $board          org.tizen.system.deviced.Board.SetSerial
org.tizen.system.deviced         /               org.tizen.system.deviced.Board.GetSerial
org.tizen.system.deviced         $board          org.freedesktop.DBus.Peer.Ping
org.tizen.servicemanager.service $manager        org.tizen.servicemanager.number_change
org.tizen.servicemanager.service $manager/other  org.tizen.servicemanager.auth
org.freedesktop.DBus             /               org.freedesktop.DBus.ListNames
org.example.Other                /               org.kiv.ClientService.auth
CALLS

[[ $("$kivctl" doctor) == *"which forbids this user to ask whether it answers"* ]] || fail "the doctor does not see the manager"
change() # pattern replacement: of the policy
{
    sed --in-place "s|$1|$2|" "$scratch/bus.conf"
    kill -HUP "${pids[0]}"
}

# If the bus denies even the query for the owner of a name, no service can be called.
deny='<deny send_interface="org.freedesktop.DBus" send_member="GetNameOwner"/>'
change '</busconfig>' "<policy context=\"mandatory\">$deny</policy>&"
deadline=$((SECONDS + 20)) code=0
while ((code != 5)); do
    ((SECONDS < deadline)) || fail "exit code $code, not 5"
    "$kivctl" notify auth-success --to manager >/dev/null 2>"$scratch/last.log" && code=0 || code=$?
done

# "Start it" is no advice where the bus gives this user no name.
kill "${pids[1]}"
wait "${pids[1]}" || true
change '<allow own="org.tizen.system.deviced"/>' ''
deadline=$((SECONDS + 20))
until [[ $("$kivctl" doctor) == *"deviced is not on the bus, and the bus forbids this user to own it"* ]]; do
    ((SECONDS < deadline)) || fail "the doctor does not see what the bus forbids"
done
