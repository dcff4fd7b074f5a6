"""Real daemons on a private bus, with modems that answer from a table, and an agent on the machine itself."""
import json
import os
import shutil
import signal
import subprocess
import sys
import tempfile
import time
import unittest

KIVCTL, AGENT = sys.argv[1:3]
HOLDER = "KIV_IN_NAMESPACE"
MM, NM = "org.freedesktop.ModemManager1", "org.freedesktop.NetworkManager"
BUS = """<busconfig><type>system</type><listen>unix:path={folder}/bus</listen><auth>EXTERNAL</auth>
<policy context="default"><allow user="*"/><allow own="*"/><allow send_type="method_call"/><allow send_destination="*"/>
<allow receive_type="*"/></policy><policy context="mandatory">{denied}</policy></busconfig>"""
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

    def __init__(self, test):
        self.process = subprocess.Popen([AGENT], stdin=subprocess.PIPE, stdout=subprocess.PIPE, text=True,
                                        env={**os.environ, "KIV_PROFILE": "host"})
        test.addCleanup(self.process.kill)

    def tell(self, line):
        """Returns the lines of the reply, as lists of their fields."""
        self.process.stdin.write(f"{line}\n")
        self.process.stdin.flush()
        lines = []
        while not lines or lines[-1] != "\n":
            lines.append(self.process.stdout.readline())
            if lines[-1] == "":
                raise AssertionError(f"the agent ended: {self.process.wait()}")
        return [text.rstrip("\n").split("\t") for text in lines[:-1]]

    def ask(self, member):
        return next(answer for query, answer in self.tell("ask") if bare(query) == member)

    def imsi(self):
        return self.ask("GetIMSIFromSim")

    def descriptors(self):
        return len(os.listdir(f"/proc/{self.process.pid}/fd"))

    def threads(self):
        return len(os.listdir(f"/proc/{self.process.pid}/task"))

    def memory(self):
        """Returns the KiB of memory that are its own."""
        with open(f"/proc/{self.process.pid}/status") as file:
            return next(int(line.split()[1]) for line in file if line.startswith("RssAnon:"))

    def end(self):
        self.process.stdin.close()
        code = self.process.wait(10)
        self.process.stdout.close()
        return code


def bare(query):
    """"GetIMEI" of "DASystem::GetIMEI(char**)"."""
    return query.split("(")[0].split("::")[-1]


class Daemons(unittest.TestCase):
    """A private bus, the daemons on it, and what kivctl prints there."""

    maxDiff = None

    def setUp(self):
        self.folder = tempfile.mkdtemp(prefix="kiv-machine-")
        self.processes = {}
        address = f"unix:path={self.folder}/bus"
        os.environ.update(DBUS_SYSTEM_BUS_ADDRESS=address, DBUS_SESSION_BUS_ADDRESS=address, LC_ALL="C", TZ="UTC",
                          KIV_SUBSCRIBERS=f"{self.folder}/subscribers.db")
        os.environ.pop("KIV_PROFILE", None)
        os.environ.setdefault("TSAN_OPTIONS", f"suppressions={os.path.dirname(__file__)}/../tsan.supp")
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

    def start_bus(self, denied=""):
        with open(f"{self.folder}/bus.conf", "w") as file:
            file.write(BUS.format(folder=self.folder, denied=denied))
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
        until(lambda: self.owns(NM), "NetworkManager is on the bus")

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


def main(case):
    enter_namespace()
    signal.signal(signal.SIGTERM, lambda *_: sys.exit(1))
    result = unittest.main(argv=[sys.argv[0], *(f"{case.__name__}.{name}" for name in sys.argv[3:])], exit=False, verbosity=2).result
    sys.exit(0 if result.wasSuccessful() and len(result.skipped) < result.testsRun else 77 if result.wasSuccessful() else 1)
