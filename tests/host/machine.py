#!/usr/bin/python3
"""kivctl and an agent on the machine itself, in every situation that a user may meet.

usage: machine.py KIVCTL HOST_AGENT [TEST...]
"""
import json
import os
import signal
import subprocess
import time

from at_modem import ROAMING, Modem
from daemons import HOLDER, KIVCTL, MM, NM, Agent, Daemons, main, run, until


class Machine(Daemons):
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
        agent = Agent(self)
        self.assertEqual("0 310150123456789", agent.imsi())
        self.unplug(modem)
        until(lambda: "no modem" in (run(KIVCTL, "--profile", "host", "sim").stderr), "no slot")
        until(lambda: agent.imsi() == "4 before", "a process that runs forgets the card", 1)
        self.assertEqual(0, agent.end())

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
        agent = Agent(self)
        until(lambda: agent.imsi() == "0 310150123456789", "the modem is there")
        descriptors = agent.descriptors()
        for number, kill in enumerate(("ModemManager", "bus", "ModemManager"), 1):
            self.kill(kill)
            until(lambda: agent.imsi() == "4 before", "nothing is remembered", 1)
            if kill == "bus":
                self.kill("ModemManager")
                self.start_bus()
            imsi = f"31015012345678{number}"
            modem.answers["AT+CIMI"] = imsi  # another card, whose path is that of the one before
            self.start_modem_manager()
            until(lambda: self.index_of(modem), "ModemManager knows it")
            until(lambda: agent.imsi() == f"0 {imsi}", "the card is the new one", 1)
        self.assertLessEqual(agent.descriptors(), descriptors)
        self.assertEqual(0, agent.end())

    def test_daemon_that_is_stuck_counts_as_absent_until_it_answers(self):
        self.start_modem_manager()
        self.plug(Modem("one"))
        self.await_slots(card=["ready"])
        if os.environ.get(HOLDER) == "yes":
            self.start_network_manager()
        for name, query, absent, present in (("ModemManager", "GetIMSIFromSim", "4 before", "0 310150123456789"),
                                             ("NetworkManager", "IsMobileData", "false", "true")):
            if name not in self.processes:
                continue
            self.processes[name].send_signal(signal.SIGSTOP)
            agent = Agent(self)
            begin = time.monotonic()
            self.assertEqual(absent, agent.ask(query))
            self.assertLess(time.monotonic() - begin, 10, "it does not wait for the daemon")
            self.processes[name].send_signal(signal.SIGCONT)
            until(lambda: agent.ask(query) == present, f"{name} answers")
            self.assertEqual(0, agent.end())

    def test_bus_that_denies_is_named_as_the_reason(self):
        self.kill("bus")
        self.start_bus("".join(f'<deny send_destination="{name}" send_type="method_call"/>' for name in (MM, NM)))
        self.start_modem_manager()
        if os.environ.get(HOLDER) == "yes":
            self.start_network_manager()
        else:
            self.start("NetworkManager", "/usr/bin/python3", "-m", "dbusmock", "--system", NM, "/org/freedesktop", NM)
            until(lambda: self.owns(NM), "the stand-in is on the bus")
        self.assertEqual("kivctl: not permitted\n", self.kivctl("sim", code=1))
        self.assertEqual({"not permitted"}, set(self.json("network", code=1)["notes"].values()))
        self.assertEqual({"ModemManager": "not permitted", "NetworkManager": "not permitted"},
                         {row["check"]: row["finding"] for row in self.json("doctor", code=1) if row["check"].endswith("Manager")})

    def test_card_that_may_not_be_read_is_ready_without_an_imsi(self):
        self.kill("bus")
        self.start_bus(f'<deny send_destination="{MM}" send_interface="org.freedesktop.DBus.Properties" send_member="GetAll"/>')
        self.start_modem_manager()
        self.plug(Modem("one"))
        self.await_slots(card=["ready"], imsi=[None], number=["+15551234567"])

    def test_answers_of_the_wrong_type_are_ignored(self):
        self.start("ModemManager", "/usr/bin/python3", "-m", "dbusmock", "--system", MM, "/org/freedesktop/ModemManager1", MM)
        until(lambda: self.owns(MM), "the stand-in is on the bus")
        slot = f"{{'/modem': {{'{MM}.Modem': {{'Sim': 'no path'}}}}}}"
        for kind, answer, expected in (("s", "'no name'", "kivctl: ModemManager does not run\n"), ("a{oa{sa{sv}}}", slot, "none\n")):
            self.call(MM, "/org/freedesktop/ModemManager1", "org.freedesktop.DBus.Mock.AddMethod", "org.freedesktop.DBus.ObjectManager",
                      "GetManagedObjects", "", kind, f"ret = {answer}")
            result = run(KIVCTL, "--profile", "host", "-t", "--fields", "service", "sim")
            self.assertEqual(expected, result.stdout + result.stderr)

    def test_network_manager_decides_about_radios_and_connections(self):
        self.start_network_manager()
        self.start_modem_manager()
        modem = self.plug(Modem("one"))
        until(lambda: f"{modem.port.replace(':', chr(92) + ':')}:gsm" in run("nmcli", "-t", "device").stdout, "it knows the modem")
        until(lambda: self.json("network")["cellular"] == "available", "registered")
        agent = Agent(self)
        self.assertEqual(("false", "true"), (agent.ask("IsFlightMode"), agent.ask("IsMobileData")))
        self.watch()
        run("nmcli", "radio", "wwan", "off", check=True)
        until(lambda: len(self.watched()) >= 3, "two changes")
        until(lambda: self.json("network")["cellular"] == "flight mode", "flight mode")
        run("nmcli", "radio", "wwan", "on", check=True)
        until(lambda: self.json("network")["cellular"] == "available", "registered again")
        self.assertEqual(["ready", "flight_mode value=yes", "packet_data value=no", "flight_mode value=no", "packet_data value=yes"],
                         self.watched())
        for answer, roaming in (("yes", "false"), ("no", "true")):
            run("nmcli", "connection", "delete", "mobile")
            run("nmcli", "connection", "add", "type", "gsm", "ifname", "*", "con-name", "mobile", "apn", "internet",
                "autoconnect", "no", "gsm.home-only", answer, check=True)
            until(lambda: agent.ask("IsDataRoamingEnabled") == roaming, f"home-only is {answer}")
        for answer, roaming in (("yes", "false"), ("no", "true")):
            run("nmcli", "connection", "modify", "mobile", "gsm.home-only", answer, "ipv6.method", "disabled", check=True)
            until(lambda: agent.ask("IsDataRoamingEnabled") == roaming, f"home-only was changed to {answer}")
        run("nmcli", "connection", "up", "mobile", check=True)
        until(lambda: agent.ask("GetCellularNetworkState") == "5", "a data connection")
        self.assertTrue(self.json("network", code=0)["connected"])
        run("nmcli", "connection", "down", "mobile", check=True)
        until(lambda: agent.ask("GetCellularNetworkState") == "4", "no data connection any more")
        self.kill("NetworkManager")
        until(lambda: agent.ask("IsMobileData") == "false", "NetworkManager is gone", 1)
        self.start_network_manager()
        until(lambda: agent.ask("IsMobileData") == "true", "NetworkManager is back", 1)
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


if __name__ == "__main__":
    main(Machine)
