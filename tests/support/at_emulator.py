#!/usr/bin/env python3
"""A modem that speaks AT commands and has no radio: it answers what a modem daemon asks on its way to
a registered modem, and says so by itself when its signal or its registration changes.

    at_emulator.py --abstract NAME [--control PATH] [--log PATH] [SETTING...]
    at_emulator.py --tcp PORT      [--control PATH] [--log PATH] [SETTING...]
    at_emulator.py --tell PATH SETTING...

Listens on the abstract Unix socket NAME or on 127.0.0.1:PORT (0: any), prints "ready NAME" or
"ready PORT" once it does, and serves any number of peers until it is killed. --control is the path of
a Unix socket over which --tell changes settings of the running one: it returns when they hold. --log
notes every command and what it was answered with. A setting is NAME=VALUE:

    csq=20                    0 to 31, 99 unknown; +CSQ, +CIND and +CIEV follow it
    cesq=99,99,255,255,20,40  the whole answer of +CESQ
    registration=1            0 idle, 1 home, 2 searching, 3 denied, 5 roaming
    technology=7              0 gsm, 2 umts, 7 lte
    network=00101             MCC and MNC of the network there is
    operator=Test Net         its name
    area=03DB                 LAC and TAC, hexadecimal
    cell=000027DB             cell id, hexadecimal
    sim=ready                 ready, pin, or none
    smsc=+15550001            the service centre's number; empty: the question fails
"""

import re
import selectors
import socket
import sys

SETTINGS = {
    "csq": "20",
    "cesq": "99,99,255,255,20,40",
    "registration": "1",
    "technology": "7",
    "network": "00101",
    "operator": "Test Net",
    "area": "03DB",
    "cell": "000027DB",
    "sim": "ready",
    "smsc": "+15550001",
}
IMEI = "490154203237518"
IMSI = "001010123456789"
ICCID = "8949000000000000017"
PROVIDER = "Home Net"
SIM_COMMANDS = ("+CIMI", "+CRSM", "+CNUM", "+CSCA", "+CPMS", "+CLCK")


def swapped(digits):
    """Digits as a SIM stores them: two a byte, the lower one first."""
    digits += "F" * (len(digits) % 2)
    return "".join(digits[i + 1] + digits[i] for i in range(0, len(digits), 2))


def padded(text, size):
    return text.encode().hex().upper().ljust(2 * size, "F")


# Elementary files of the SIM by their number: contents in hexadecimal.
SIM_FILES = {
    12258: swapped(ICCID).ljust(20, "F"),
    28589: "00000002",  # two digits of network code
    28486: "00" + padded(PROVIDER, 16),
}


class Modem:
    """The state of one modem and its answers; knows nothing of sockets."""

    def __init__(self, settings):
        self.settings = dict(SETTINGS)
        self.unsolicited = {"+CREG": 0, "+CGREG": 0, "+CEREG": 0, "+CMER": 0}
        self.operator_format = 0
        self.power = 1
        self.change(settings)

    def change(self, settings):
        """Takes settings; returns the lines that a modem sends by itself because of them."""
        before = dict(self.settings)
        for setting in settings:
            name, separator, value = setting.partition("=")
            if not separator or name not in SETTINGS:
                raise ValueError(f"no such setting: {setting}")
            self.settings[name] = value
        changed = {name for name in SETTINGS if before[name] != self.settings[name]}
        lines = []
        if "csq" in changed and self.unsolicited["+CMER"]:
            lines.append(f"+CIEV: 1,{self._bars()}")
        if changed & {"registration", "technology", "area", "cell"}:
            for command in ("+CREG", "+CGREG", "+CEREG"):
                if self.unsolicited[command]:
                    lines.append(f"{command}: {self._registration(command)}")
        return lines

    def answer(self, command):
        """Lines without the final result, or None for ERROR; a text that begins with +CM is its own
        final result."""
        if command.startswith(SIM_COMMANDS) and self.settings["sim"] != "ready":
            return "+CME ERROR: " + ("10" if self.settings["sim"] == "none" else "11")
        for pattern, respond in ANSWERS:
            found = pattern.fullmatch(command)
            if found:
                return respond(self, *found.groups()) if callable(respond) else respond
        return None

    def _bars(self):
        csq = int(self.settings["csq"])
        return 0 if csq > 31 else min(5, (csq + 5) // 6)

    def _registration(self, command):
        state, technology = self.settings["registration"], self.settings["technology"]
        # Only the registration that fits the technology is there.
        if (command == "+CEREG") != (technology == "7") and command != "+CREG":
            state = "0"
        if self.unsolicited[command] < 2 or state not in "15":
            return state
        return f'{state},"{self.settings["area"]}","{self.settings["cell"]}",{technology}'

    def registration(self, command):
        return [f"{command}: {self.unsolicited[command]},{self._registration(command)}"]

    def set_unsolicited(self, command, value):
        self.unsolicited[command] = int(value)
        return []

    def set_events(self, values):
        self.unsolicited["+CMER"] = int(values.split(",")[3]) if values.count(",") >= 3 else 0
        return []

    def indicators(self):
        registered = int(self.settings["registration"] in "15")
        roaming = int(self.settings["registration"] == "5")
        return [f"+CIND: {self._bars()},{registered},{roaming}"]

    def pin(self):
        return {"ready": ["+CPIN: READY"], "pin": ["+CPIN: SIM PIN"]}.get(self.settings["sim"], "+CME ERROR: 10")

    def set_operator(self, mode, operator_format):
        if mode == "3" and operator_format:
            self.operator_format = int(operator_format)
        return []

    def operator(self):
        if self.settings["registration"] not in "15":
            return ["+COPS: 0"]
        name = self.settings["network"] if self.operator_format == 2 else self.settings["operator"]
        return [f'+COPS: 0,{self.operator_format},"{name}",{self.settings["technology"]}']

    def operators(self):
        settings = self.settings
        return [f'+COPS: (2,"{settings["operator"]}","{settings["operator"]}","{settings["network"]}",'
                f'{settings["technology"]}),,(0,1,2,3,4),(0,1,2)']

    def read_sim(self, action, number, length):
        content = SIM_FILES.get(int(number))
        if content is None:
            return ['+CRSM: 106,130,""']  # no such file
        size = len(content) // 2
        if action == "192":
            header = f"0000{size:04X}{int(number):04X}040000FFFF0102000000"
            return [f'+CRSM: 144,0,"{header}"']
        return [f'+CRSM: 144,0,"{content[:2 * int(length or size)]}"']

    def service_centre(self):
        return [f'+CSCA: "{self.settings["smsc"]}",145'] if self.settings["smsc"] else None

    def set_power(self, value):
        self.power = int(value)
        return []


def rows(*table):
    return [(re.compile(pattern), respond) for pattern, respond in table]


ANSWERS = rows(
    # What is there.
    (r"", []),
    (r"[EVQZ&].*", []),
    (r"I\d?", ["Example Radios", "Pocket Modem", "Revision: 1.2.3"]),
    (r"\+GCAP", ["+GCAP: +CGSM,+CLTE2"]),
    (r"\+CGMI", ["Example Radios"]),
    (r"\+CGMM", ["Pocket Modem"]),
    (r"\+CGMR", ["1.2.3"]),
    (r"\+CGSN", [IMEI]),
    (r"\+CFUN=\?", ["+CFUN: (0,1,4),(0,1)"]),
    (r"\+CFUN\?", lambda modem: [f"+CFUN: {modem.power}"]),
    (r"\+CFUN=(\d)(?:,\d)?", Modem.set_power),
    (r"\+CMEE=\d", []),
    (r"\+CSCS=\?", ['+CSCS: ("IRA","UCS2","GSM")']),
    (r"\+CSCS\?", ['+CSCS: "IRA"']),
    (r"\+CSCS=.*", []),
    (r"\+WS46=\?", ["+WS46: (12,22,25,28,29)"]),
    (r"\+WS46\?", ["+WS46: 25"]),
    (r"\+WS46=\d+", []),
    # The card.
    (r"\+CPIN\?", Modem.pin),
    (r"\+CIMI", [IMSI]),
    (r"\+CRSM=(176|192),(\d+)(?:,\d+,\d+,(\d+))?", Modem.read_sim),
    (r"\+CLCK=\?", ['+CLCK: ("SC","PN","PU","PP","PC")']),
    (r'\+CLCK="\w+",2.*', ["+CLCK: 0"]),
    (r"\+CNUM", ['+CNUM: ,"+15550100",145']),
    (r"\+CSCA\?", Modem.service_centre),
    (r"\+CSCA=.*", []),
    # The network.
    (r"\+CSQ", lambda modem: [f"+CSQ: {modem.settings['csq']},99"]),
    (r"\+CSQ=\?", ["+CSQ: (0-31,99),(0-7,99)"]),
    (r"\+CESQ", lambda modem: [f"+CESQ: {modem.settings['cesq']}"]),
    (r"\+CESQ=\?", ["+CESQ: (0-63,99),(0-7,99),(0-96,255),(0-49,255),(0-34,255),(0-97,255)"]),
    (r"\+CIND=\?", ['+CIND: ("signal",(0-5)),("service",(0,1)),("roam",(0,1))']),
    (r"\+CIND\?", Modem.indicators),
    (r"\+CMER=\?", ["+CMER: (0-3),(0),(0),(0-1),(0)"]),
    (r"\+CMER=(.*)", Modem.set_events),
    (r"(\+CE?G?REG)=\?", lambda modem, command: [f"{command}: (0-2)"]),
    (r"(\+CE?G?REG)\?", Modem.registration),
    (r"(\+CE?G?REG)=(\d)", Modem.set_unsolicited),
    (r"\+COPS=\?", Modem.operators),
    (r"\+COPS\?", Modem.operator),
    (r"\+COPS=(\d)(?:,(\d).*)?", Modem.set_operator),
    (r"\+CGATT\?", lambda modem: [f"+CGATT: {int(modem.settings['registration'] in '15')}"]),
    (r"\+CGATT=\d", []),
    # Data and messages.
    (r"\+CGDCONT=\?", ['+CGDCONT: (1-4),"IP",,,(0,1),(0,1)', '+CGDCONT: (1-4),"IPV6",,,(0,1),(0,1)']),
    (r"\+CGDCONT\?", ['+CGDCONT: 1,"IP","internet","",0,0']),
    (r"\+CGDCONT=.*", []),
    (r"\+CGACT\?", ["+CGACT: 1,0"]),
    (r"\+CGACT=.*", []),
    (r"\+CGEREP=\?", ["+CGEREP: (0-2),(0,1)"]),
    (r"\+CGEREP=.*", []),
    (r"\+CPMS=\?", ['+CPMS: ("ME","SM"),("ME","SM"),("ME","SM")']),
    (r"\+CPMS\?", ['+CPMS: "ME",0,23,"ME",0,23,"ME",0,23']),
    (r"\+CPMS=.*", ["+CPMS: 0,23,0,23,0,23"]),
    (r"\+CMGF=\?", ["+CMGF: (0,1)"]),
    (r"\+CMGF=\d", []),
    (r"\+CMGL=.*", []),
    (r"\+CSMS=\?", ["+CSMS: (0,1)"]),
    (r"\+CSMS=\d", ["+CSMS: 1,1,1"]),
    (r"\+CSMS\?", ["+CSMS: 0,1,1,1"]),
    (r"\+CNMI=\?", ["+CNMI: (0-2),(0-3),(0-3),(0-2),(0-1)"]),
    (r"\+CNMI=.*", []),
    (r"\+CLIP=\d|\+CLIR=\d|\+CRC=\d|\+CCWA=\d|\+COLP=\d|\+CUSD=\d|\+CSSN=.*|\+CSGT=\d", []),
    (r"\+CLCC", []),
)


class Server:
    def __init__(self, modem, log):
        self.modem = modem
        self.log = log
        self.selector = selectors.DefaultSelector()
        self.peers = {}  # socket -> bytes without an end of line yet

    def listen(self, listener, serve):
        listener.listen(8)
        self.selector.register(listener, selectors.EVENT_READ, lambda: self._accept(listener, serve))

    def run(self):
        while True:
            for key, _ in self.selector.select():
                key.data()

    def _accept(self, listener, serve):
        peer, _ = listener.accept()
        if serve == self.tell:  # a teller asks once and leaves
            with peer:
                self.tell(peer)
            return
        self.peers[peer] = b""
        self.selector.register(peer, selectors.EVENT_READ, lambda: serve(peer))

    def talk(self, peer):
        try:
            data = peer.recv(4096)
        except OSError:
            data = b""
        if not data:
            self._drop(peer)
            return
        *commands, self.peers[peer] = re.split(rb"[\r\n\x1a]", self.peers[peer] + data)
        for command in commands:
            text = command.decode(errors="replace").strip()
            if text[:2].upper() == "AT":
                self._reply(peer, text)

    def tell(self, peer):
        settings = peer.makefile().readline().rstrip("\n").split("\t")
        try:
            lines = self.modem.change(settings)
        except ValueError as error:
            peer.sendall(f"{error}\n".encode())
            return
        for line in lines:
            self._note("(by itself)", [line])
            for other in list(self.peers):
                self._send(other, f"\r\n{line}\r\n")
        peer.sendall(b"done\n")

    def _reply(self, peer, text):
        answer = self.modem.answer(text[2:])
        if answer is None:
            answer, final = [], "ERROR"
        elif isinstance(answer, str):
            answer, final = [], answer
        else:
            final = "OK"
        self._note(text, answer + [final])
        self._send(peer, "".join(f"\r\n{line}\r\n" for line in answer + [final]))

    def _send(self, peer, text):
        try:
            peer.sendall(text.encode())
        except OSError:
            self._drop(peer)

    def _drop(self, peer):
        if self.peers.pop(peer, None) is not None:
            self.selector.unregister(peer)
            peer.close()

    def _note(self, command, lines):
        if self.log:
            print(command, "->", *lines, file=self.log, flush=True)


def tell(path, settings):
    with socket.socket(socket.AF_UNIX) as teller:
        teller.connect(path)
        teller.sendall(("\t".join(settings) + "\n").encode())
        answer = teller.makefile().read().strip()
    if answer != "done":
        sys.exit(answer)


def main(words):
    options = {}
    while len(words) >= 2 and words[0] in ("--abstract", "--tcp", "--control", "--log", "--tell"):
        options[words[0]] = words[1]
        words = words[2:]
    if "--tell" in options:
        tell(options["--tell"], words)
        return
    if ("--abstract" in options) == ("--tcp" in options):
        sys.exit(__doc__)
    server = Server(Modem(words), open(options["--log"], "a") if "--log" in options else None)
    if "--abstract" in options:
        listener = socket.socket(socket.AF_UNIX)
        where = options["--abstract"]
        listener.bind("\0" + where)
    else:
        listener = socket.create_server(("127.0.0.1", int(options["--tcp"])))
        where = listener.getsockname()[1]
    server.listen(listener, server.talk)
    if "--control" in options:
        control = socket.socket(socket.AF_UNIX)
        control.bind(options["--control"])
        server.listen(control, server.tell)
    print("ready", where, flush=True)
    server.run()


if __name__ == "__main__":
    main(sys.argv[1:])
