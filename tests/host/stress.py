#!/usr/bin/python3
"""Six threads of an agent on the machine itself make all queries, while the daemons come and go and a listener is set and removed.

usage: stress.py KIVCTL HOST_AGENT
With KIV_TEST_LONG=1 in the environment this takes 60 seconds, else 6. The text KIV_TEST_SEED decides what happens when.
"""
import collections
import datetime
import json
import os
import random
import re
import sys
import time

from at_modem import HOME, ROAMING, Modem
from daemons import AGENT, Agent, Daemons, bare, main, run, until

with open(AGENT, "rb") as program:
    IS_SANITIZED = re.search(b"__[at]san_init", program.read()) is not None

DAEMONS = ("ModemManager", "NetworkManager")

# What depends on the daemons: the answers while all are at work and the modem has a certain card; and what may be answered besides
# while a daemon is missing, starts or reads the modem. "|" separates answers. Any other query always has the same answer.
# A query makes several calls, between which a modem may come or go. Then the default SIM is unknown (-1), or a card that is being
# read (2) already has service (4, 7).
ANSWERS = {
    "GetCpNameList": ("abstract:one", "null|"),
    "GetIMSIFromSim": ("0 {mcc}{mnc}{msin}|before {mcc}{mnc}{msin} 1", "4 before|before 0|4 null"),
    "GetMCCFromSim": ("0 {mcc}|before {mcc} 1", "4 before|before 0|4 null"),
    "GetMNCFromSim": ("0 {mnc}|before {mnc} 1", "4 before|before 0|4 null"),
    "GetSimInfo": ("true {mcc} {mnc} {msin}", "false before before before"),
    "GetPhoneNumberFromSim": ("0 {number}|before {number} 1", "4 before|before 0|-39841791 null|-39841791 before"),
    "GetPhoneNumber": ("true {number}", "false before"),
    "GetIMEI": ("0 {imei}", "0 000000000000000"),
    "GetSimState": ("true 2", "true 3|false"),
    "IsSimExist": ("true", "false"),
    "IsSimAvailable": ("true", "false"),
    "InitHandleList": ("true 1 true", "true 0 true|false 0 true"),
    "SuccessToInitTelephonyHandle": ("true 1", "false 0"),
    "IsAvaliableState": ("true 3", "false"),
    "IsAvaliableSendSMS": ("true 3 7", "false|true 3 4|true 2 4|true 2 7"),
    "CheckSmsEnabled": ("true 1", "true 0|false"),
    "GetMainSimSubscription": ("true 0", "false|true -1"),
    "GetCallPreferredSubscription": ("true 0", "false|true -1"),
    "GetDefaultDataSubscription": ("true 0", "false|true -1"),
    "GetRoamingStatus": ("true {roaming}", "false true"),
    "GetCellularNetworkState": ("{cellular}", "0"),
    "IsMobileData": ("true", "false"),
    "IsDataRoamingEnabled": ("true", "false"),
    "IsFlightMode": ("false", ""),
    "registration": ("done", ""),
    "packet data": ("", "0 new agreed|1 new agreed"),
    "flight mode": ("", ""),
}
# What may be answered besides while the radio is switched off and on.
SILENT = {"GetCellularNetworkState": "1", "IsFlightMode": "true", "flight mode": "0 new agreed|1 new agreed"}


def card(number):
    """Returns the values of a card and its modem. All differ from those of the card before."""
    mcc, mnc, roaming, cellular = (("310", "150", "false", 4), ("262", "01", "true", 2))[number % 2]
    msin = f"1{number:0{14 - len(mcc + mnc)}}"
    return {"mcc": mcc, "mnc": mnc, "msin": msin, "number": f"+1555{number:07}", "imei": f"3569380{number:08}", "roaming": roaming,
            "cellular": cellular}


def right(cards, is_changing=False, is_silent=False):
    """Returns the right answers by member, when the modem has one of these cards."""
    texts = {member: [always.format(**each) for each in cards] + [meanwhile] * is_changing + [SILENT.get(member, "")] * is_silent
             for member, (always, meanwhile) in ANSWERS.items()}
    return {member: set("|".join(those).split("|")) for member, those in texts.items()}


class Judge:
    """Compares what an agent answers in each phase with what is right then."""

    def __init__(self, agent, phase):
        self.agent, self.phases, self.begin = agent, [phase], time.time()
        self.always = {query: answer for query, answer in agent.tell("ask") if bare(query) not in {*ANSWERS, "GetCurrentTime"}}
        self.counts, self.wrong = collections.Counter(), []

    def enter(self, phase):
        self.phases.append(phase)
        self.take(len(self.phases) - 1)

    def take(self, line):
        """Tells the agent a line, and compares the answers that it prints."""
        for times, first, last, query, answer in self.agent.tell(line):
            member = bare(query)
            self.counts[member] += int(times)
            if query in self.always:
                is_right = answer == self.always[query]
            elif member == "GetCurrentTime":
                year, month, *others = (int(number) for number in answer.split()[1:7])
                clock = datetime.datetime(year + 1900, month + 1, *others, tzinfo=datetime.timezone.utc).timestamp()
                is_right = self.begin - 1 <= clock <= time.time()
            else:
                is_right = any(answer in phase.get(member, ()) for phase in self.phases[int(first):int(last) + 1])
            if not is_right:
                self.wrong.append((times, first, last, query, answer))


class Stress(Daemons):
    def insert(self, modem, values):
        """Puts a card into the modem, while no ModemManager sees it."""
        modem.answers.update({"AT+CIMI": values["mcc"] + values["mnc"] + values["msin"], "AT+CGSN": values["imei"],
                              "AT+CNUM": f'+CNUM: "","{values["number"]}",145',
                              "AT+CRSM=176,28589,0,0,4": f'+CRSM: 144,0,"000000{len(values["mnc"]):02}"'})
        modem.register(ROAMING if values["roaming"] == "true" else HOME, values["mcc"] + values["mnc"])

    def await_work(self, modem):
        """Waits until both daemons report a modem that is registered."""
        def is_at_work():
            path = self.index_of(modem)
            report = json.loads((path and run("mmcli", "-m", path, "-J").stdout) or "{}").get("modem", {}).get("generic", {})
            devices = run("nmcli", "-t", "-f", "TYPE,STATE", "device").stdout
            seen[:] = [f"{name}={report.get(name)}" for name in ("state", "state-failed-reason", "power-state")] + devices.split()
            if report.get("state") == "disabled":  # as NetworkManager leaves it when a radio is on, or itself killed, too early
                run("nmcli", "radio", "wwan", "on")
                run("mmcli", "-m", path, "-e")
            return (report.get("state") == "registered" and report["access-technologies"] == ["umts"]
                    and "gsm:disconnected" in devices)
        seen = []
        until(is_at_work, seen, 30)

    def disturb(self, what, modem, cards, chance):
        """Switches the radio off and on, or kills and restarts a daemon, or the bus and all daemons. If ModemManager is among them,
        the modem then has the first of the cards, which is removed."""
        if what == "radio":
            for switch in ("off", "on"):
                until(lambda: run("nmcli", "radio", "wwan", switch).returncode == 0, f"the radio is {switch}")
                time.sleep(chance.uniform(0, 1))
            return
        starts = {"ModemManager": self.start_modem_manager, "NetworkManager": self.start_network_manager}
        names = DAEMONS if what == "bus" else (what,)
        for name in dict.fromkeys((what, *names)):
            self.kill(name)
        if what == "bus":
            self.start_bus()
        if "ModemManager" in names:
            self.insert(modem, cards.pop(0))
        for name in chance.sample(names, len(names)):
            time.sleep(chance.uniform(0, 1))
            starts[name]()
        time.sleep(chance.uniform(0, 1))

    def test_all_answers_are_right_while_daemons_come_and_go(self):
        seconds = 60 if os.environ.get("KIV_TEST_LONG") == "1" else 6
        seed = os.environ.get("KIV_TEST_SEED", "7")
        chance = random.Random(seed)
        modem, cards, memory = Modem("one"), [card(0)], []
        self.insert(modem, cards[0])
        self.start_network_manager()
        self.start_modem_manager()
        until(lambda: run("nmcli", "general").returncode == 0, "NetworkManager answers")
        run("nmcli", "connection", "delete", "mobile")
        run("nmcli", "connection", "add", "type", "gsm", "ifname", "*", "con-name", "mobile", "apn", "internet",
            "autoconnect", "no", "gsm.home-only", "no", check=True)
        self.plug(modem)
        self.await_work(modem)
        agent = Agent(self)
        judge = Judge(agent, right(cards))
        resources = agent.descriptors(), agent.threads()
        end = time.monotonic() + seconds
        agent.tell("start")
        while time.monotonic() < end:
            time.sleep(chance.uniform(0.2, 1))
            disturbances = chance.sample((*DAEMONS, "bus", "radio"), chance.randint(1, 3) if memory else 4)
            is_silent = "radio" in disturbances
            fresh = [card(len(cards) + i) for i in range(sum(what in ("ModemManager", "bus") for what in disturbances))]
            judge.enter(right([cards[-1], *fresh], True, is_silent))
            cards += fresh
            for what in disturbances:
                self.disturb(what, modem, fresh, chance)
            # One second after a daemon has the new value, an older one is wrong.
            until(lambda: self.index_of(modem), "ModemManager has the modem")
            time.sleep(1)
            judge.enter(right(cards[-1:], True, is_silent))
            self.await_work(modem)
            time.sleep(1)
            judge.enter(right(cards[-1:]))
            memory.append(agent.memory())
        judge.take("stop")
        counts = judge.counts
        story = (f"seed={seed} cards={len(cards)} asked={sum(counts.values())} wrong={sum(int(each[0]) for each in judge.wrong)} "
                 f"registrations={counts['registration']} changes={counts['packet data'] + counts['flight mode']} "
                 f"KiB={memory + [agent.memory()]} descriptors,threads={resources}")
        print(story, file=sys.stderr)
        self.assertEqual([], judge.wrong, story)
        self.assertLessEqual({*ANSWERS} - {"flight mode"}, counts.keys(), story)
        until(lambda: (agent.descriptors(), agent.threads()) == resources, f"descriptors and threads as before: {story}", 30)
        if not IS_SANITIZED:  # a sanitizer keeps what was freed
            self.assertLess(agent.memory(), memory[len(memory) // 2] + 1024, story)
        self.assertEqual(0, agent.end(), story)


if __name__ == "__main__":
    main(Stress)
