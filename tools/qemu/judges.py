"""What the devices saw: lines of a time line, each by one judge. A judge is a device or a log of qemu's, never a part of
the program under test."""
import ctypes
import json
import mmap
import re
import select
import signal
import socket
import struct
import threading
import time


class Timeline:
    """Lines of what the judges saw. Times count from the begin of the command, so before it they are below 0. While
    the machine runs they stand in timeline.live with the time of day, for whoever plays the operator."""

    def __init__(self, path):
        self.lock, self.notes, self.path, self.zero = threading.Lock(), [], path, None
        self.live = open(path[:-len("jsonl")] + "live", "w")

    def add(self, judge, at=None, **seen):
        with self.lock:
            self.notes.append((at or time.time(), judge, seen))
            self.live.write(json.dumps({"time": self.notes[-1][0], "judge": judge, **seen}) + "\n")
            self.live.flush()

    def write(self):
        zero = self.zero or (self.notes[0][0] if self.notes else 0)
        with open(self.path, "w") as out:
            for at, judge, seen in sorted(self.notes, key=lambda n: n[0]):
                out.write(json.dumps({"t": round(at - zero, 4), "judge": judge, **seen}) + "\n")


def die_with_us():
    """In the child: qemu ends when this program does, however that ends (PR_SET_PDEATHSIG)."""
    ctypes.CDLL(None).prctl(1, signal.SIGKILL)


def connect(path, patience=10):
    end = time.time() + patience
    while True:
        s = socket.socket(socket.AF_UNIX)
        try:
            s.connect(path)
            return s
        except OSError:
            s.close()
            if time.time() > end:
                raise
            time.sleep(0.02)


class Monitor:
    """qemu's machine protocol (QMP): one JSON object a line."""

    def __init__(self, path, timeline):
        self.lock, self.timeline = threading.Lock(), timeline
        self.socket = connect(path)
        self.stream = self.socket.makefile("rw", encoding="utf-8")
        self.stream.readline()
        self("qmp_capabilities")

    def __call__(self, command, **arguments):
        with self.lock:
            self.stream.write(json.dumps({"execute": command, "arguments": arguments}) + "\n")
            self.stream.flush()
            while True:
                line = self.stream.readline()
                if not line:
                    raise EOFError
                answer = json.loads(line)
                if "event" in answer:
                    stamp = answer["timestamp"]
                    self.timeline.add("event", stamp["seconds"] + stamp["microseconds"] / 1e6, event=answer["event"],
                                      data=answer.get("data"))
                elif "return" in answer:
                    return answer["return"]
                else:
                    raise RuntimeError(answer["error"]["desc"])

    def close(self):
        self.stream.close()
        self.socket.close()

    def human(self, line):
        return self("human-monitor-command", **{"command-line": line})


def watch_console(pipe, timeline, path, over, pattern):
    """The kernel's own words; those that match `pattern` are a judge's."""
    wanted = re.compile(pattern) if pattern else None
    with open(path, "w") as out:
        for raw in iter(pipe.readline, b""):
            line = raw.decode("latin-1").rstrip("\r\n")
            out.write("%.3f %s\n" % (time.time(), line))
            out.flush()
            if line == "@start":
                timeline.zero = time.time()
            if line == "@end":
                over.set()
            if wanted and wanted.search(line):
                timeline.add("console", text=line)


def watch_port_log(path, port, timeline):
    stream = connect(path)
    while True:
        data = stream.recv(4096)
        if not data:
            return
        now = time.time()
        for byte in data:
            timeline.add("port-log", now, port=port, value=byte)


def watch_trace(path, filters, timeline, over):
    """Lines "PID@SECONDS.MICROSECONDS:EVENT TEXT" out of the pipe that qemu logs into."""
    compiled = {event: re.compile(pattern) for event, pattern in filters}
    with open(path, encoding="latin-1") as lines:
        for line in lines:
            found = re.match(r"\d+@(\d+\.\d+):(\w+) (.*)", line)
            # Only what happens during the command: booting alone makes tens of thousands of register writes.
            if not found or not timeline.zero or float(found[1]) < timeline.zero or over.is_set():
                continue
            if found[2] in compiled and compiled[found[2]].search(found[3]):
                register = re.match(r"cpu \d+ mr \S+ addr (\S+) value (\S+) size (\d+) name '(.*)'", found[3])
                if register:
                    timeline.add("trace", float(found[1]), event=found[2], device=register[4], address=register[1],
                                 value=register[2], size=int(register[3]))
                else:
                    timeline.add("trace", float(found[1]), event=found[2], text=found[3])


def watch_device_log(pipe, pattern, timeline, path):
    wanted = re.compile(pattern) if pattern else None
    with open(path, "w") as out:
        for raw in iter(pipe.readline, b""):
            line = raw.decode("latin-1").rstrip("\n")
            out.write(line + "\n")
            out.flush()
            if wanted and wanted.search(line):
                timeline.add("device-log", text=line)


def watch_memory(path, timeline, over):
    with open(path, "r+b") as file:
        memory = mmap.mmap(file.fileno(), 0)
    before = memory[:]
    while not over.wait(0.005):
        now = memory[:]
        if now != before:
            at = time.time()
            for offset in range(0, len(now), 4096):
                if now[offset:offset + 4096] != before[offset:offset + 4096]:
                    for i in range(offset, offset + 4096):
                        if now[i] != before[i]:
                            timeline.add("memory", at, offset=i, value=now[i])
            before = now


def watch_ports(monitor, ports, timeline, over):
    last = {}
    while not over.wait(0.02):
        for port in ports:
            try:
                value = int(monitor.human("i /1xb 0x%x" % port).split("=")[1], 0)
            except (EOFError, OSError, ValueError):
                return
            if last.get(port) != value:
                timeline.add("port", port=port, value=value)
                last[port] = value


def watch_disks(monitor, timeline, over):
    last = {}
    while not over.wait(0.1):
        try:
            answer = monitor("query-blockstats")
        except (EOFError, OSError):
            return
        at = time.time()
        for drive in answer:
            s = drive["stats"]
            now = (s["rd_operations"], s["wr_operations"])
            if drive.get("device", "").startswith("judge"):
                was = last.get(drive["device"], now)
                timeline.add("disk", at, disk=drive["device"], reads=now[0] - was[0], writes=now[1] - was[1])
                last[drive["device"]] = now


def watch_network(ours, theirs, timeline, over):
    """Asks for the guest's address every 50 ms; an answer is a link that carries."""
    s = socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM)
    s.bind(ours)
    mac, guest = bytes.fromhex("020000000001"), bytes([10, 9, 8, 7])
    ask = (b"\xff" * 6 + mac + b"\x08\x06" + struct.pack("!HHBBH", 1, 0x800, 6, 4, 1) + mac + bytes([10, 9, 8, 1])
           + b"\0" * 6 + guest).ljust(60, b"\0")
    up, heard, asked = False, 0.0, 0.0
    while not over.is_set():
        if time.time() - asked >= 0.05:
            asked = time.time()
            try:
                s.sendto(ask, theirs)
            except OSError:
                pass
        if select.select([s], [], [], 0.02)[0]:
            frame = s.recv(65536)
            if frame[12:14] == b"\x08\x06" and frame[20:22] == b"\0\x02" and frame[28:32] == guest:
                heard = time.time()
                if not up:
                    up = True
                    timeline.add("network", link="answers")
        if up and time.time() - heard > 0.15:
            up = False
            timeline.add("network", heard, link="silent")


def watch_keyboard_leds(path, timeline):
    """A remote-display client that wants nothing but the LEDs (pseudo-encoding -261): bit 0 Scroll, 1 Num, 2 Caps."""
    s = connect(path).makefile("rwb")
    s.read(12), s.write(b"RFB 003.008\n"), s.flush()
    s.read(s.read(1)[0]), s.write(b"\x01"), s.flush(), s.read(4)
    s.write(b"\x01"), s.flush()
    width, height = struct.unpack("!HH", s.read(4))
    s.read(16), s.read(struct.unpack("!I", s.read(4))[0])
    s.write(struct.pack("!BxHii", 2, 2, 0, -261)), s.flush()
    s.write(struct.pack("!BBHHHH", 3, 1, 0, 0, 1, 1)), s.flush()
    while True:
        kind = s.read(1)
        if not kind:
            return
        if kind == b"\0":
            for _ in range(struct.unpack("!xH", s.read(3))[0]):
                x, y, w, h, encoding = struct.unpack("!HHHHi", s.read(12))
                if encoding == -261:
                    leds = s.read(1)[0]
                    timeline.add("keyboard-leds", scroll=leds & 1, num=leds >> 1 & 1, caps=leds >> 2 & 1)
                elif encoding == 0:
                    s.read(w * h * 4)
            s.write(struct.pack("!BBHHHH", 3, 1, 0, 0, 1, 1)), s.flush()
        elif kind == b"\x03":
            s.read(3), s.read(struct.unpack("!I", s.read(4))[0])
        elif kind == b"\x01":
            s.read(5)
