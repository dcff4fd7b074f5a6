"""Modems that answer AT commands from a table, for ModemManager's test profiles."""
import socket
import threading

HOME, SEARCHING, ROAMING = 1, 2, 5


class Modem:
    """A modem with one port, the abstract Unix socket "abstract:NAME"; its answers may be changed while it is in use."""

    def __init__(self, name, imsi="310150123456789", mnc_digits=3, number="+15551234567", imei="356938035643809"):
        self.name = name
        self.radio_is_on = True
        self.pin = None
        self.connections = []
        self.answers = {
            "ATE0": "", "ATV1": "", "ATX4": "", "AT&C1": "", "AT": "", "ATZ": "", "ATH": "", "AT+CMEE=1": "",
            "AT+GCAP": "+GCAP: +CGSM,+DS,+ES", "AT+CGMI": "Example", "AT+CGMM": "Table", "AT+CGMR": "1.0",
            "AT+CGSN": imei, "AT+CIMI": imsi, "AT+CPIN?": "+CPIN: READY",
            "AT+CRSM=176,28589,0,0,4": f'+CRSM: 144,0,"000000{mnc_digits:02}"',
            "AT+CRSM=176,12258,0,0,10": '+CRSM: 144,0,"98101032547698103214"',
            "AT+CNUM": f'+CNUM: "","{number}",145',
            "AT+CSCS=?": '+CSCS: ("IRA","GSM","UCS2")', 'AT+CSCS="UCS2"': "", 'AT+CSCS="IRA"': "", "AT+CSCS?": '+CSCS: "IRA"',
            "AT+CNMI=?": "+CNMI: (0-2),(0-3),(0,2),(0-2),(0,1)", "AT+CMGF=?": "+CMGF: (0,1)", "AT+CMGF=0": "", "AT+CMGF=1": "",
            "AT+CPMS=?": '+CPMS: ("SM"),("SM"),("SM")', 'AT+CPMS="SM","SM","SM"': "+CPMS: 0,10,0,10,0,10",
            "AT+CFUN=1": "", "AT+CFUN=4": "", "AT+CFUN=0": "", "AT+CREG=2": "", "AT+CGREG=2": "", "AT+CREG=0": "", "AT+CGREG=0": "",
            "AT+COPS=0": "", "AT+COPS=3,2": "", "AT+COPS=3,0": "", "AT+COPS=3,2;+COPS?": '+COPS: 0,2,"310150",2',
            "AT+COPS=3,0;+COPS?": '+COPS: 0,0,"Home",2', "AT+COPS?": '+COPS: 0,2,"310150",2',
            "AT+WS46=?": "+WS46: (22)", "AT+CLCK=?": '+CLCK: ("SC")', 'AT+CLCK="SC",2': "+CLCK: 0", "AT+CSQ": "+CSQ: 20,99",
            "AT+CGDCONT=?": '+CGDCONT: (1-4),"IP",,,(0-1),(0-1)', "AT+CGDCONT?": '+CGDCONT: 1,"IP","internet","",0,0',
            "AT+CGACT?": "+CGACT: 1,0",
        }
        self.register(HOME)
        self.listener = socket.socket(socket.AF_UNIX)
        self.listener.bind(f"\0{self.port}")
        self.listener.listen()
        threading.Thread(target=self.accept, daemon=True).start()

    @property
    def port(self):
        return f"abstract:{self.name}"

    def register(self, state, operator="310150"):
        """Registers with a network, and says so if it is asked to."""
        where = f'{state},"0001","00000001",2' if state in (HOME, ROAMING) else str(state)
        for kind in ("CREG", "CGREG"):
            self.answers[f"AT+{kind}?"] = f"+{kind}: 2,{where}"
        for command in ("AT+COPS=3,2;+COPS?", "AT+COPS?"):
            self.answers[command] = f'+COPS: 0,2,"{operator}",2'
        self.say(f"+CREG: {where}")
        self.say(f"+CGREG: {where}")

    def require_pin(self, pin):
        self.pin = pin
        self.answers["AT+CPIN?"] = "+CPIN: SIM PIN"

    def remove_sim(self):
        self.answers["AT+CPIN?"] = None

    def say(self, text):
        for connection in list(self.connections):
            self.send(connection, f"\r\n{text}\r\n")

    def unplug(self):
        for each in (self.listener, *self.connections):
            try:
                each.shutdown(socket.SHUT_RDWR)
            except OSError:
                pass  # it was unplugged before, or the daemon has gone
        self.listener.close()

    @staticmethod
    def send(connection, text):
        try:
            connection.sendall(text.encode())
        except OSError:
            pass  # the daemon has gone

    def accept(self):
        while True:
            try:
                connection, _ = self.listener.accept()
            except OSError:
                return
            self.connections.append(connection)
            threading.Thread(target=self.serve, args=(connection,), daemon=True).start()

    def serve(self, connection):
        pending = b""
        while True:
            try:
                data = connection.recv(4096)
            except OSError:
                data = b""
            if not data:
                self.connections.remove(connection)
                connection.close()
                return
            *commands, pending = (pending + data).split(b"\r")
            for command in commands:
                self.send(connection, self.answer(command.decode(errors="replace").strip()))

    def answer(self, command):
        if not command:
            return ""
        if command == "AT+CPIN?" and self.answers[command] is None:
            return "\r\n+CME ERROR: 10\r\n"
        if self.pin and command == f'AT+CPIN="{self.pin}"':
            self.pin = None
            self.answers["AT+CPIN?"] = "+CPIN: READY"
            return "\r\nOK\r\n"
        if self.pin and command in ("AT+CIMI", "AT+CNUM") or command.startswith("AT+CRSM") and self.pin:
            return "\r\n+CME ERROR: 11\r\n"
        if command.startswith("AT+CFUN="):
            self.radio_is_on = command == "AT+CFUN=1"
        if command == "AT+CFUN?":
            return f"\r\n+CFUN: {1 if self.radio_is_on else 4}\r\n\r\nOK\r\n"
        if command.startswith(("AT+CGDCONT=", "AT+CGACT=")) and not command.endswith("?"):
            return "\r\nOK\r\n"
        if command.startswith("ATD*99"):
            return "\r\nCONNECT\r\n"
        text = self.answers.get(command)
        if text is None:
            return "\r\nERROR\r\n"
        return f"\r\n{text}\r\n\r\nOK\r\n" if text else "\r\nOK\r\n"
