"""A virtual PC with the shipped program on it, and an operator before it who looks at what the devices saw and never at
the program."""
import os
import statistics
import subprocess
import sys
import tempfile
import time

sys.dont_write_bytecode = True
ROOT = os.path.dirname(os.path.dirname(os.path.dirname(os.path.realpath(__file__))))
sys.path.insert(0, os.path.join(ROOT, "tools"))

from qemu import machine, picture  # noqa: E402

OUT = os.path.join(ROOT, "build", "machine", "runs")
PROGRAMS = os.path.join(ROOT, "build", "release", "bin")

# The set-up of a bench, in the guest: a word for waiting, the installation with this machine's files, the adapter with
# its address, the power lamp green at port 0xE0 as the firmware of a real one would leave it, the camera's driver
# telling of its stream.
SET_UP = """
given() {{ while [ ! -e /out/$1 ]; do sleep 0.2; done; }}
mkdir /tmp/bench; cp -r {root}/installation/. {root}/machines/qemu/*.ini {root}/machines/qemu/*.xml /tmp/bench
cd /tmp/bench; export PATH={programs}:$PATH
for link in /sys/class/net/eth*; do
  [ -e "$link" ] && [ "$(cat $link/address)" != 52:54:00:00:60:00 ] || continue
  busybox ip link set ${{link##*/}} name bench-lan
  busybox ifconfig bench-lan 10.9.8.7 netmask 255.255.255.0
  busybox ip route add 10.77.0.0/16 via 10.9.8.1
done
printf '\\001' | dd of=/dev/port bs=1 seek=224 conv=notrunc 2>/dev/null
[ -e /sys/class/video4linux/video0 ] && echo 1 > /sys/class/video4linux/video0/dev_debug && busybox dmesg -n 8
"""

# Which light a judge's line is about, by the judge; and its new state.
LEDS_OF_KEYBOARD = ("num", "caps", "scroll")


def lights_of(judge, seen):
    if judge == "trace" and seen.get("device", "").startswith("pc-testdev"):
        place = "%s%x" % (seen["device"].split("-")[2], int(seen["address"], 16) & 0xFFF)
        return {"%s.%d" % (place, bit): int(seen["value"], 16) >> bit & 1 for bit in range(8)}
    if judge == "keyboard-leds":
        return {name: seen[name] for name in LEDS_OF_KEYBOARD}
    if judge == "disk" and "writes" in seen:
        return {seen["disk"]: int(seen["reads"] + seen["writes"] > 0)}
    if judge == "network":
        return {"net": int(seen["link"] == "answers")}
    if judge == "console" and "VIDIOC_STREAMO" in seen["text"]:
        return {"camera": int("VIDIOC_STREAMON" in seen["text"])}
    if judge == "device-log" and "verb 0x715, payload" in seen["text"]:
        pins = int(seen["text"].split()[-1], 16)
        return {"pin%d" % bit: pins >> bit & 1 for bit in range(8)}
    return {}


class Screen:
    """A display of the host's, ended with the object."""

    def __init__(self):
        read, write = os.pipe()
        self.memory = tempfile.TemporaryDirectory()
        self.server = subprocess.Popen(["Xvfb", "-displayfd", str(write), "-screen", "0", "1280x1024x24", "-nolisten",
                                        "tcp", "-fbdir", self.memory.name], pass_fds=[write],
                                       stderr=subprocess.DEVNULL)
        os.close(write)
        with os.fdopen(read) as number:
            self.name = ":" + number.readline().strip()

    def do(self, *words):
        return subprocess.run(["xdotool", *map(str, words)], capture_output=True, text=True, timeout=20,
                              env={**os.environ, "DISPLAY": self.name}).stdout

    def windows(self):
        """(width, height, x, y) of what is shown."""
        found = []
        for window in self.do("search", "--onlyvisible", "--name", ".").split():
            lines = self.do("getwindowgeometry", "--shell", window).split("\n")
            place = dict(line.split("=") for line in lines if "=" in line)
            if place:
                found.append(tuple(int(place[key]) for key in ("WIDTH", "HEIGHT", "X", "Y")))
        return found

    def save(self, path):
        picture.save(self.memory.name, path)

    def kill(self):
        self.server.kill()
        self.server.wait()
        self.memory.cleanup()


class Bench:
    """One virtual PC that runs one script. Buttons are pairs of a name and its lights, in the dialog's order; one without
    lights is for "nothing blinks"."""

    def __init__(self, name, options, script, display=True):
        self.screen = Screen() if display else None
        self.folder = os.path.join(OUT, name)
        arguments = ["--kernel", os.path.join(ROOT, "build", "machine", "kernel"), "--out", self.folder, *options]
        if display:
            arguments += ["--display", self.screen.name]
        text = SET_UP.format(root=ROOT, programs=PROGRAMS) + script
        self.machine = machine.VirtualMachine(machine.parser().parse_args(arguments), ["/bin/sh", "-c", text])
        self.pressed = []
        self.code = None

    def __enter__(self):
        self.machine.start()
        return self

    def __exit__(self, *_):
        self.machine.close()
        if self.screen:
            self.screen.kill()

    def finish(self):
        self.code = self.machine.wait()
        return self.code

    def text(self, name="stdout"):
        with open(os.path.join(self.folder, name), encoding="utf-8", errors="replace") as f:
            return f.read()

    def changes(self, light=None):
        """(time, light, state) of every change that a judge saw, in order; of one light when it is named."""
        state, found = {}, []
        for at, judge, seen in sorted(self.machine.timeline.notes, key=lambda note: note[0]):
            for name, value in lights_of(judge, seen).items():
                if state.get(name, value if judge != "trace" else 0) != value and light in (None, name):
                    found.append((at, name, value))
                state[name] = value
        return found

    def last(self, light, before=float("inf")):
        values = [value for at, judge, seen in self.machine.timeline.notes if at < before
                  for name, value in lights_of(judge, seen).items() if name == light]
        return values[-1] if values else None

    def contents(self):
        """Of each disk whether it was found as it was given."""
        return [seen["content"] for _, _, seen in self.machine.timeline.notes if "content" in seen]

    def median_phase(self, light):
        """Seconds that a light is on, as the middle one of all times that are shorter than two seconds."""
        changes = self.changes(light)
        phases = [b - a for (a, _, lit), (b, _, _) in zip(changes, changes[1:]) if lit and 0.01 < b - a < 2]
        return statistics.median(phases) if len(phases) >= 2 else None

    def operate(self, buttons, wrong=None, until=None, before_press=None, patience=150):
        """Presses the button of each light that blinks, until the dialog is gone or `until` holds. `wrong`: the
        number of the press that goes to the next button instead. `before_press` is called with the button's name."""
        dialog, quiet, gone_since = None, time.time(), None
        end = time.time() + patience
        while time.time() < end and self.machine.qemu.poll() is None and not (until and until()):
            shown = self.screen.windows()
            if not any(place[1] > 500 for place in shown):
                gone_since = gone_since or time.time()
                if dialog and not until and time.time() - gone_since > 2:
                    return
                if not dialog:
                    self._answer_prompt(shown)
                time.sleep(0.1)
                continue
            gone_since = None
            if not dialog:
                time.sleep(1)  # it is moved to the middle after it has come
                dialog = [place for place in self.screen.windows() if place[1] > 500][0]
                quiet = time.time()
            choice = self._blinking(buttons, quiet)
            if choice is not None:
                self.screen.save(os.path.join(self.folder, "press-%d.png" % len(self.pressed)))
                if wrong == len(self.pressed):
                    choice = (choice + 1) % len(buttons)
                if before_press:
                    before_press(buttons[choice][0])
                self._press(dialog, choice)
                self.pressed.append(buttons[choice][0])
                self.machine.timeline.add("operator", pressed=self.pressed[-1])
                time.sleep(1.5)
                quiet = time.time()
            time.sleep(0.05)

    def wait_until(self, condition, patience=60):
        """Whether it held within the time, as long as the machine ran."""
        end = time.time() + patience
        while not condition():
            if time.time() > end or self.machine.qemu.poll() is not None:
                return False
            time.sleep(0.1)
        return True

    def open_dialog(self):
        """Answers the prompt ahead of a test. True when the dialog is there."""

        def is_there():
            shown = self.screen.windows()
            if any(place[1] > 500 for place in shown):
                return True
            self._answer_prompt(shown)
            return False

        return self.wait_until(is_there)

    def await_no_window(self):
        self.wait_until(lambda: not self.screen.windows())

    def _answer_prompt(self, shown):
        """Confirms what is shown, once: a second key would fall into the dialog that comes after it."""
        if shown:
            self.screen.do("key", "Return")
            end = time.time() + 8
            while self.screen.windows() == shown and time.time() < end:
                time.sleep(0.1)

    def await_change(self, light, since):
        """True when a judge has seen this light change."""
        return self.wait_until(lambda: any(at > since for at, _, _ in self.changes(light)), patience=30)

    def made(self, name):
        """When the script made this file; None when it has not."""
        path = os.path.join(self.folder, name)
        return os.path.getmtime(path) if os.path.exists(path) else None

    def give(self, name):
        """Makes a file that the script waits for."""
        with open(os.path.join(self.folder, name), "w"):
            pass

    def _blinking(self, buttons, quiet):
        now = time.time()
        recent = [name for at, name, _ in self.changes() if at > max(quiet, now - 12)]  # a link may need three seconds
        for number, (_, lights) in enumerate(buttons):
            if any(recent.count(light) >= 5 for light in lights):
                return number
        if now - quiet > 6 and not recent:
            return next(number for number, (_, lights) in enumerate(buttons) if not lights)
        return None

    def _press(self, dialog, choice):
        self.screen.do("mousemove", dialog[2] + 126 + 201 * (choice % 3), dialog[3] + 168 + 46 * (choice // 3), "click",
                       1)
