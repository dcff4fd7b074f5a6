#!/usr/bin/python3
"""kivctl and an agent on the machine itself, with real daemons on a private bus and modems that answer from a table.

usage: machine.py KIVCTL HOST_AGENT [TEST...]
With KIV_TEST_LONG=1 in the environment the agent is asked for 60 seconds while the daemons come and go, else for 6.
"""
import json
import os
import random
import shutil
import signal
import subprocess
import sys
import tempfile
import time
import unittest

from at_modem import HOME, ROAMING, Modem

KIVCTL, AGENT = sys.argv[1:3]
HOLDER = "KIV_IN_NAMESPACE"
MM, NM = "org.freedesktop.ModemManager1", "org.freedesktop.NetworkManager"
BUS = """<busconfig><type>system</type><listen>unix:path={folder}/bus</listen><auth>EXTERNAL</auth>
<policy context="default"><allow user="*"/><allow own="*"/><allow send_type="method_call"/><allow send_destination="*"/>
<allow receive_type="*"/></policy></busconfig>"""
NM_CONF = """[main]
plugins=keyfile
dns=none
auth-polkit=root-only
[keyfile]
unmanaged-devices=interface-name:kiv1;interface-name:ppp0;interface-name:kiv2
"""
# Reports a connection that is there, as the plugin of a pppd does; kernels of build machines have no PPP.
PPPD = """#!/bin/bash
while (($#)); do [[ $1 == ipparam ]] && path=$2; shift; done
call() { gdbus call --system -d org.freedesktop.NetworkManager -o "$path" -m "org.freedesktop.NetworkManager.PPP.$1" "$2"; }
call SetIfindex "$(ip -o link show ppp0 | cut -d: -f1)"
call SetIp4Config "{'interface': <'ppp0'>, 'address': <uint32 67109056>, 'prefix': <uint32 32>}"
trap 'exit 0' TERM
while :; do sleep 0.1; done
"""


def until(condition, what, seconds=10.0):
    """Waits until the condition holds, and returns what it gave."""
    end = time.monotonic() + seconds
    while True:
        value = condition()
        if value:
            return value
        if time.monotonic() > end:
            raise AssertionError(f"not within {seconds} s: {what}, but {value!r}")
        time.sleep(0.02)


def run(*command, check=False, **options):
    return subprocess.run(command, stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True, check=check, timeout=60, **options)


class Agent:
    """A process that stays, and says what its device is."""

    def __init__(self):
        self.process = subprocess.Popen([AGENT], stdin=subprocess.PIPE, stdout=subprocess.PIPE, text=True,
                                        env={**os.environ, "KIV_PROFILE": "host"})

    def ask(self):
        self.process.stdin.write("\n")
        self.process.stdin.flush()
        return dict(field.split("=") for field in self.process.stdout.readline().split())

    def descriptors(self):
        return len(os.listdir(f"/proc/{self.process.pid}/fd"))

    def end(self):
        self.process.stdin.close()
        code = self.process.wait(10)
        self.process.stdout.close()
        return code


class Machine(unittest.TestCase):
    maxDiff = None

    def setUp(self):
        self.folder = tempfile.mkdtemp(prefix="kiv-machine-")
        self.processes = {}
        address = f"unix:path={self.folder}/bus"
        os.environ.update(DBUS_SYSTEM_BUS_ADDRESS=address, DBUS_SESSION_BUS_ADDRESS=address, LC_ALL="C",
                          KIV_SUBSCRIBERS=f"{self.folder}/subscribers.db")
        os.environ.pop("KIV_PROFILE", None)
        with open(f"{self.folder}/bus.conf", "w") as file:
            file.write(BUS.format(folder=self.folder))
        self.modems = []
        self.start_bus()

    def tearDown(self):
        for name in list(self.processes):
            self.kill(name)
        for modem in self.modems:
            modem.unplug()
        shutil.rmtree(self.folder)

    # Daemons

    def start(self, name, *command):
        log = open(f"{self.folder}/{name}.log", "a")
        self.processes[name] = subprocess.Popen(command, stdout=log, stderr=log, stdin=subprocess.DEVNULL)
        log.close()

    def kill(self, name):
        process = self.processes.pop(name)
        process.kill()
        process.wait()

    def start_bus(self):
        self.start("bus", "dbus-daemon", f"--config-file={self.folder}/bus.conf", "--nofork", "--nosyslog")
        until(lambda: self.call("org.freedesktop.DBus", "/", "org.freedesktop.DBus.Peer.Ping") is not None, "the bus answers")

    def call(self, name, path, method, *arguments):
        result = run("gdbus", "call", "--system", "-d", name, "-o", path, "-m", method, *arguments)
        return result.stdout if result.returncode == 0 else None

    def owns(self, name):
        reply = self.call("org.freedesktop.DBus", "/", "org.freedesktop.DBus.NameHasOwner", name)
        return reply is not None and "true" in reply

    def start_modem_manager(self):
        if shutil.which("ModemManager", path=os.environ["PATH"] + ":/usr/sbin") is None:
            self.skipTest("modemmanager is not installed")
        self.start("ModemManager", "/usr/sbin/ModemManager", "--test-session", "--test-enable", "--no-auto-scan", "--test-no-udev",
                   "--test-no-suspend-resume", "--test-no-qrtr", "--debug")
        until(lambda: self.owns(MM), "ModemManager is on the bus")
        for modem in self.modems:
            self.set_profile(modem)

    def plug(self, modem):
        self.modems.append(modem)
        self.set_profile(modem)
        return modem

    def unplug(self, modem):
        modem.unplug()
        self.set_profile(modem, "@as []")

    def set_profile(self, modem, ports=None):
        self.call(MM, "/org/freedesktop/ModemManager1", f"{MM}.Test.SetProfile", modem.name, "generic", ports or f"['{modem.port}']")

    def enable(self, modem):
        index = until(lambda: self.index_of(modem), f"ModemManager knows {modem.name}")
        until(lambda: run("mmcli", "-m", index, "-e").returncode == 0, f"{modem.name} is enabled")

    def index_of(self, modem):
        for path in json.loads(run("mmcli", "-L", "-J").stdout or '{"modem-list": []}')["modem-list"]:
            properties = json.loads(run("mmcli", "-m", path, "-J").stdout or "{}").get("modem", {})
            if properties.get("generic", {}).get("primary-port") == modem.port:
                return path
        return None

    def start_network_manager(self):
        if os.environ.get(HOLDER) != "yes":
            self.skipTest("NetworkManager needs root and a network namespace of its own")
        folder = f"{self.folder}/NetworkManager"
        os.makedirs(folder, exist_ok=True)
        with open(f"{self.folder}/NetworkManager.conf", "w") as file:
            file.write(NM_CONF)
        self.start("NetworkManager", "/usr/sbin/NetworkManager", "--no-daemon", f"--config={self.folder}/NetworkManager.conf",
                   f"--config-dir={folder}", f"--intern-config={folder}/NetworkManager-intern.conf")
        until(lambda: run("nmcli", "-t", "-f", "STATE", "general").returncode == 0, "NetworkManager answers")

    # What is looked at

    def kivctl(self, *arguments, code=0):
        result = run(KIVCTL, "--profile", "host", *arguments)
        self.assertEqual(code, result.returncode, result.stdout + result.stderr)
        return result.stdout + result.stderr

    def json(self, *arguments, code=None):
        result = run(KIVCTL, "--profile", "host", "--json", *arguments)
        if code is not None:
            self.assertEqual(code, result.returncode, result.stdout + result.stderr)
        return json.loads(result.stdout) if result.stdout else None

    def slots(self):
        return self.json("sim", "--show-ids") or []

    def await_slots(self, **expected):
        """Waits until the fields of the slots are these, in the order of the slots."""
        count = len(next(iter(expected.values())))

        def agree():
            slots = self.slots()
            return len(slots) == count and all([slot[name] for slot in slots] == values for name, values in expected.items())
        try:
            until(agree, expected)
        except AssertionError:
            self.assertEqual(expected, {name: [slot[name] for slot in self.slots()] for name in expected})

    def watch(self):
        log = open(f"{self.folder}/watch.log", "w")
        self.processes["watch"] = subprocess.Popen([KIVCTL, "--profile", "host", "watch"], stdout=log)
        log.close()
        until(lambda: self.watched() == ["ready"], "watching")

    def watched(self):
        with open(f"{self.folder}/watch.log") as file:
            return file.read().splitlines()

    # Situations

    def test_without_daemons_files_answer_and_the_rest_has_a_reason(self):
        self.assertIn("ModemManager does not run", self.kivctl("sim", code=1))
        network = self.json("network", code=1)
        self.assertEqual(("out of service", "off", "off"), tuple(network[name] for name in ("cellular", "wifi", "bluetooth")))
        self.assertEqual({"ModemManager does not run", "NetworkManager does not run"}, set(network["notes"].values()))
        device = self.json("device", code=0)
        self.assertTrue(device["name"] and device["platform"] and device["storage_suffices"])
        self.assertEqual("not available on this machine", device["notes"]["font_size"])
        self.assertIn("only a device file can be changed", self.kivctl("device", "set", "runtime.flight-mode=true", code=2))
        self.assertIn("does not run", self.kivctl("doctor", code=1))

    def test_modem_is_a_slot_from_plugging_to_unplugging(self):
        self.start_modem_manager()
        self.assertIn("no modem", self.kivctl("sim", code=1))
        modem = self.plug(Modem("one"))
        self.await_slots(card=["ready"], mcc=["310"], mnc=["150"], imsi=["310150123456789"], number=["+15551234567"],
                         country=["United States of America"], cp_name=["abstract:one"])
        self.assertEqual("***********3809", self.json("device")["imei"])
        self.enable(modem)
        self.await_slots(service=["in service"], roaming=[False], sms=["ready"], default_for=[["network", "voice", "data"]])
        self.assertEqual("available", self.json("network")["cellular"])
        modem.register(ROAMING, "26201")
        self.await_slots(roaming=[True])
        self.assertEqual("roaming", self.json("network")["cellular"])
        self.unplug(modem)
        until(lambda: "no modem" in (run(KIVCTL, "--profile", "host", "sim").stderr), "no slot")

    def test_modems_have_cards_that_are_locked_or_missing(self):
        self.start_modem_manager()
        locked = Modem("two")
        locked.require_pin("1234")
        empty = Modem("ten")
        empty.remove_sim()
        for modem in (empty, Modem("one", imsi="262011234567890", mnc_digits=2), locked):
            self.plug(modem)
        self.await_slots(cp_name=["abstract:one", "abstract:ten", "abstract:two"], card=["ready", "no card", "PIN required"],
                         imsi=["262011234567890", None, None], default_for=[[], [], []])
        wait = subprocess.Popen([KIVCTL, "--profile", "host", "sim", "wait", "--slot", "2", "--timeout", "20"],
                                stdout=subprocess.PIPE, text=True)
        time.sleep(0.5)  # in which it asks
        sim = json.loads(run("mmcli", "-m", self.index_of(locked), "-J").stdout)["modem"]["generic"]["sim"]
        self.assertEqual(0, run("mmcli", "-i", sim, "--pin=1234").returncode)
        self.assertIn("2", wait.communicate(timeout=30)[0])
        self.assertEqual(0, wait.returncode)
        self.await_slots(card=["ready", "no card", "ready"], imsi=["262011234567890", None, "310150123456789"])

    def test_daemon_and_bus_that_come_back_are_read_anew(self):
        self.start_modem_manager()
        modem = self.plug(Modem("one"))
        agent = Agent()
        until(lambda: agent.ask()["imsi"] == "310150123456789,", "the modem is there")
        descriptors = agent.descriptors()
        for number, kill in enumerate(("ModemManager", "bus", "ModemManager"), 1):
            self.kill(kill)
            until(lambda: agent.ask()["imsi"] == "", "nothing is remembered", 1)
            if kill == "bus":
                self.kill("ModemManager")
                self.start_bus()
            imsi = f"31015012345678{number}"
            modem.answers["AT+CIMI"] = imsi  # another card, whose path is that of the one before
            self.start_modem_manager()
            until(lambda: self.index_of(modem), "ModemManager knows it")
            until(lambda: agent.ask()["imsi"] == f"{imsi},", "the card is the new one", 1)
        self.assertLessEqual(agent.descriptors(), descriptors)
        self.assertEqual(0, agent.end())

    def test_daemon_that_is_stuck_counts_as_absent_until_it_answers(self):
        self.start_modem_manager()
        self.plug(Modem("one"))
        self.await_slots(card=["ready"])
        self.processes["ModemManager"].send_signal(signal.SIGSTOP)
        agent = Agent()
        begin = time.monotonic()
        self.assertEqual("", agent.ask()["imsi"])
        self.assertLess(time.monotonic() - begin, 10, "it does not wait for the daemon")
        self.processes["ModemManager"].send_signal(signal.SIGCONT)
        until(lambda: agent.ask()["imsi"] == "310150123456789,", "it answers")
        self.assertEqual(0, agent.end())

    def test_network_manager_decides_about_radios_and_connections(self):
        self.start_network_manager()
        self.start_modem_manager()
        modem = self.plug(Modem("one"))
        until(lambda: f"{modem.port.replace(':', chr(92) + ':')}:gsm" in run("nmcli", "-t", "device").stdout, "it knows the modem")
        until(lambda: self.json("network")["cellular"] == "available", "registered")
        agent = Agent()
        self.assertEqual(("0", "1"), (agent.ask()["flight"], agent.ask()["mobile"]))
        self.watch()
        run("nmcli", "radio", "wwan", "off", check=True)
        until(lambda: len(self.watched()) >= 3, "two changes")
        until(lambda: self.json("network")["cellular"] == "flight mode", "flight mode")
        run("nmcli", "radio", "wwan", "on", check=True)
        until(lambda: self.json("network")["cellular"] == "available", "registered again")
        self.assertEqual(["ready", "flight_mode value=yes", "packet_data value=no", "flight_mode value=no", "packet_data value=yes"],
                         self.watched())
        for answer, roaming in (("yes", "0"), ("no", "1")):
            run("nmcli", "connection", "delete", "mobile")
            run("nmcli", "connection", "add", "type", "gsm", "ifname", "*", "con-name", "mobile", "apn", "internet",
                "autoconnect", "no", "gsm.home-only", answer, check=True)
            until(lambda: agent.ask()["roaming"] == roaming, f"home-only is {answer}")
        run("nmcli", "connection", "modify", "mobile", "gsm.home-only", "yes", "ipv6.method", "disabled", check=True)
        until(lambda: agent.ask()["roaming"] == "0", "home-only was changed")
        run("nmcli", "connection", "up", "mobile", check=True)
        until(lambda: agent.ask()["cellular"] == "5", "a data connection")
        self.assertTrue(self.json("network", code=0)["connected"])
        run("nmcli", "connection", "down", "mobile", check=True)
        until(lambda: agent.ask()["cellular"] == "4", "no data connection any more")
        self.kill("NetworkManager")
        until(lambda: agent.ask()["mobile"] == "0", "NetworkManager is gone", 1)
        self.start_network_manager()
        until(lambda: agent.ask()["mobile"] == "1", "NetworkManager is back", 1)
        self.assertEqual(0, agent.end())

    def test_wired_connection_is_noted_and_does_not_count(self):
        self.start_network_manager()
        run("nmcli", "connection", "add", "type", "ethernet", "ifname", "kiv0", "con-name", "wired", "ip4", "192.0.2.2/24", "gw4",
            "192.0.2.1", check=True)
        run("nmcli", "connection", "up", "wired", check=True)
        network = until(lambda: self.json("network") if "connected" in self.json("network").get("notes", {}) else None, "a note")
        self.assertEqual(False, network["connected"])
        self.assertIn("wired", network["notes"]["connected"])

    def test_changes_of_wifi_are_reported_once_and_in_order(self):
        self.start("NetworkManager", "/usr/bin/python3", "-m", "dbusmock", "--system", "--is-object-manager", NM, "/org/freedesktop", NM)
        until(lambda: self.owns(NM), "the stand-in is on the bus")
        root = "/org/freedesktop"

        def mock(path, method, *arguments):
            self.assertIsNotNone(self.call(NM, path, f"org.freedesktop.DBus.Mock.{method}", *arguments), method)

        def update(path, interface, **properties):
            texts = ", ".join(f"'{name}': <{value}>" for name, value in properties.items())
            mock(path, "UpdateProperties", interface, "{" + texts + "}")

        def add(path, interface, properties):
            mock(root, "AddObject", path, interface, properties, "@a(ssss) []")
            mock(root, "EmitSignal", "org.freedesktop.DBus.ObjectManager", "InterfacesAdded", "oa{sa{sv}}",
                 f"[<objectpath '{path}'>, <{{'{interface}': {properties}}}>]")
        self.watch()
        manager, device = f"{root}/NetworkManager", f"{root}/NetworkManager/Devices/1"
        switches = "{" + ", ".join(f"'{name}': <true>" for name in (
            "WirelessEnabled", "WirelessHardwareEnabled", "WwanEnabled", "WwanHardwareEnabled")) + "}"
        add(manager, NM, switches)
        add(device, f"{NM}.Device", "{'DeviceType': <uint32 2>, 'State': <uint32 30>}")
        for state in (40, 50, 50, 70, 90, 100):
            update(device, f"{NM}.Device", State=f"uint32 {state}")
        until(lambda: self.json("network")["wifi"] == "connected", "connected")
        self.assertTrue(self.json("network", "--wifi", code=0)["connected"])
        update(device, f"{NM}.Device", State="uint32 120")
        update(manager, NM, WirelessEnabled="false")
        until(lambda: len(self.watched()) >= 11, "all radios are off")
        self.assertEqual(
            ["ready", "wifi_device value='on'", "wifi_connected value=no", "wifi_connection value='associating'",
             "wifi_connection value='configuring'", "wifi_connection value='connected'", "wifi_connected value=yes",
             "wifi_connection value='failure'", "wifi_connected value=no", "wifi_device value='off'", "flight_mode value=yes"], self.watched())
        add(f"{root}/NetworkManager/Devices/2", f"{NM}.Device", "{'DeviceType': <uint32 5>, 'State': <uint32 100>}")
        until(lambda: self.json("network")["bluetooth"] == "connected", "Bluetooth carries a connection")

    def test_six_threads_get_right_answers_while_daemons_come_and_go(self):
        seconds = 60 if os.environ.get("KIV_TEST_LONG") == "1" else 6
        self.start_modem_manager()
        names = ["ModemManager"]
        if os.environ.get(HOLDER) == "yes":
            self.start_network_manager()
            names.append("NetworkManager")
        self.plug(Modem("one"))
        self.await_slots(imsi=["310150123456789"])
        stress = subprocess.Popen([AGENT, str(seconds), "310150123456789"], stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True,
                                  env={**os.environ, "KIV_PROFILE": "host"})
        chance = random.Random(7)
        while stress.poll() is None:
            time.sleep(chance.uniform(0.1, 2.5))
            name = chance.choice([*names, "bus"])
            self.kill(name)
            if name == "bus":
                for other in names:
                    self.kill(other)
                self.start_bus()
            for other in names:
                if other not in self.processes:
                    self.start_modem_manager() if other == "ModemManager" else self.start_network_manager()
        output, errors = stress.communicate()
        self.assertEqual((0, ""), (stress.returncode, errors), output)
        print(output, end="", file=sys.stderr)


def enter_namespace():
    """As root: goes on in namespaces where a NetworkManager harms nobody."""
    if os.geteuid() != 0 or os.environ.get(HOLDER) or not os.path.exists("/usr/sbin/NetworkManager"):
        return
    set_up = """
        set -e
        mount --make-rprivate /
        mount -t sysfs -o ro sysfs /sys
        for folder in /etc/NetworkManager /var/lib/NetworkManager /run/NetworkManager /usr/local/sbin; do
            mkdir -p $folder
            mount -t tmpfs tmpfs $folder
        done
        ip link set lo up
        ip link add kiv0 type veth peer name kiv1
        ip link add ppp0 type veth peer name kiv2
        ip link set kiv1 up
        ip link set kiv2 up
        printf %s "$PPPD" >/usr/local/sbin/pppd
        chmod +x /usr/local/sbin/pppd"""
    os.environ["PPPD"] = PPPD
    if run("unshare", "-n", "-m", "bash", "-c", set_up).returncode == 0:
        os.environ[HOLDER] = "yes"
        os.execvp("unshare", ["unshare", "-n", "-m", "bash", "-c", set_up + '\nexec "$@"', "bash", sys.executable, *sys.argv])


if __name__ == "__main__":
    enter_namespace()
    signal.signal(signal.SIGTERM, lambda *_: sys.exit(1))
    result = unittest.main(argv=[sys.argv[0], *(f"Machine.{name}" for name in sys.argv[3:])], exit=False, verbosity=2).result
    sys.exit(0 if result.wasSuccessful() and len(result.skipped) < result.testsRun else 77 if result.wasSuccessful() else 1)
