"""One run of the virtual machine: a command in the guest, the devices that it may touch, and the judges beside them."""
import argparse
import hashlib
import json
import os
import shlex
import shutil
import struct
import subprocess
import tempfile
import threading
import time

from . import boot, judges

TOOL = os.path.join(os.path.dirname(os.path.dirname(os.path.realpath(__file__))), "machine")
GUEST_OUT_OF_TIME, GUEST_DIED = 124, 125


def parser(**more):
    number = lambda text: int(text, 0)  # noqa: E731
    p = argparse.ArgumentParser(formatter_class=argparse.RawDescriptionHelpFormatter, **more)
    p.add_argument("--out", default="machine.out", help="folder for what comes back, made anew")
    p.add_argument("--timeout", type=float, default=120, help="seconds for boot and command together")
    p.add_argument("--kernel", help="folder with boot/ and lib/modules/; without it the package is downloaded once")
    p.add_argument("--machine", default="q35", help="q35 or pc")
    p.add_argument("--memory", default="1024", help="MiB")
    p.add_argument("--cpu", default="max")
    p.add_argument("--see", action="append", default=[], metavar="FOLDER", help="a folder of the host's below /tmp")
    p.add_argument("--modules", default="", help="further kernel modules, by commas; options behind colons")
    p.add_argument("--append", default="", help="further words of the kernel's command line")
    p.add_argument("--smbios", action="append", default=[], help="as type=2,product=E001-board; as often as wanted")
    p.add_argument("--qemu", action="append", default=[], metavar="ARGUMENTS", help="further arguments of qemu")
    p.add_argument("--port-log", type=number, action="append", default=[], metavar="PORT",
                   help="writes down every byte that this port is given; reading it gives 0xE9")
    p.add_argument("--registers", action="store_true",
                   help="four readable ports at 0xE0 and 64 KiB of device memory at 0xFF000000")
    p.add_argument("--watch-port", type=number, action="append", default=[], metavar="PORT",
                   help="what the port reads, each time it changes")
    p.add_argument("--trace", action="append", default=[], metavar="EVENT[=REGEX]", help="lines of qemu's own log")
    p.add_argument("--device-log", metavar="REGEX", help="lines that devices print by themselves")
    p.add_argument("--console", metavar="REGEX", help="lines of the kernel")
    p.add_argument("--shared-memory", action="store_true", help="1 MiB of memory behind a PCI device's BAR 2")
    p.add_argument("--disk", action="append", default=[], choices=sorted(boot.DISK_MODULES),
                   help="a disk of 16 MiB; its transfers are counted, its content compared at the end")
    p.add_argument("--network", choices=sorted(boot.NETWORK_MODULES),
                   help="an adapter; the host asks for 10.9.8.7, which the guest must give itself")
    p.add_argument("--keyboard-leds", action="store_true", help="the lock LEDs as a remote display is told of them")
    p.add_argument("--display", metavar=":N", help="a display of the host's that programs in the guest may use")
    return p


class VirtualMachine:
    """Started with the object's start(), over when wait() returns; close() leaves nothing behind but the folder --out.
    `timeline.notes` may be read meanwhile, `monitor` takes qemu's commands."""

    def __init__(self, options, command):
        self.options, self.command = options, command
        self.out = os.path.realpath(options.out)
        shutil.rmtree(self.out, ignore_errors=True)
        os.makedirs(self.out)
        self.timeline = judges.Timeline(self.out + "/timeline.jsonl")
        self.work = tempfile.mkdtemp(prefix="panelglow-machine.")
        self.qemu, self.monitor = None, None
        self.over = threading.Event()
        self.threads, self.content = [], {}
        self.begin = time.time()

    def __enter__(self):
        return self

    def __exit__(self, *_):
        self.close()

    def close(self):
        if self.qemu and self.qemu.poll() is None:
            self.qemu.kill()
            self.qemu.wait()
        self.over.set()
        if self.qemu:
            self.qemu.stdout.close()
            self.qemu.stderr.close()
        if self.monitor:
            self.monitor.close()
        self.timeline.live.close()
        shutil.rmtree(self.work, ignore_errors=True)

    # ---- before

    def _write_command(self):
        with open(self.out + "/command", "w") as f:
            if self.options.display:
                f.write("export DISPLAY=10.0.2.100%s\n" % self.options.display)
            f.write("exec " + " ".join(map(shlex.quote, self.command)) + "\n")

    def _write_first_files(self, tree):
        a = self.options
        wanted = list(boot.BASE_MODULES)
        for kind in a.disk:
            wanted += boot.DISK_MODULES[kind]
        wanted += boot.NETWORK_MODULES.get(a.network, []) + (["virtio_net"] if a.display else [])
        options = {}
        for text in a.modules.split(","):
            name, _, option = text.partition(":")
            if name:
                wanted.append(name)
                options[name.replace("-", "_")] = option.replace(":", " ")
        with open(self.work + "/initrd", "wb") as f:
            f.write(boot.first_files(shutil.which("busybox"), boot.module_order(tree, wanted), options, a.see))

    def _disk_arguments(self):
        args = []
        is_pc = self.options.machine.startswith("pc") and not self.options.machine.startswith("pc-q35")
        for number, kind in enumerate(self.options.disk):
            name = "judge%d" % number
            block = lambda i: hashlib.sha256(b"%d %d" % (number, i)).digest() * 16  # noqa: B023,E731
            self.content[name] = b"".join(block(i) for i in range(boot.DISK_SIZE // 512))
            with open("%s/%s" % (self.work, name), "wb") as f:
                f.write(self.content[name])
            args += ["-drive", "if=none,id=%s,format=raw,cache=none,file=%s/%s" % (name, self.work, name)]
            on_bus = "bus=c%d.0,drive=%s" % (number, name)
            args += {
                "ide": ["-device", "ide-hd,drive=" + name] if is_pc else
                       ["-device", "piix3-ide,id=c%d" % number, "-device", "ide-hd," + on_bus],
                "ahci": ["-device", "ahci,id=c%d" % number, "-device", "ide-hd,id=d%d,%s" % (number, on_bus)],
                "nvme": ["-device", "nvme,id=c%d,serial=n%d,drive=%s" % (number, number, name)],
                "virtio-scsi": ["-device", "virtio-scsi-pci,id=c%d" % number, "-device",
                                "scsi-hd,id=d%d,%s" % (number, on_bus)],
                "megasas": ["-device", "megasas,id=c%d" % number, "-device", "scsi-hd," + on_bus],
            }[kind]
        return args

    def _arguments(self, image, release):
        a, work = self.options, self.work
        args = ["qemu-system-x86_64", "-nodefaults", "-no-user-config", "-no-reboot", "-accel", "tcg", "-M", a.machine,
                "-cpu", a.cpu, "-m", a.memory, "-display", "none", "-msg", "timestamp=on", "-serial", "stdio",
                "-kernel", boot.unpacked_kernel(image, release), "-initrd", work + "/initrd",
                "-append", "console=ttyS0 quiet panic=-1 mitigations=off random.trust_cpu=on " + a.append,
                "-qmp", "unix:%s/qmp,server=on,wait=off" % work,
                "-fsdev", "local,id=host,path=/,security_model=none,readonly=on,multidevs=remap",
                "-device", "virtio-9p-pci,fsdev=host,mount_tag=host",
                "-fsdev", "local,id=out,path=%s,security_model=none" % self.out,
                "-device", "virtio-9p-pci,fsdev=out,mount_tag=out"]
        for text in a.smbios:
            args += ["-smbios", text]
        for port in a.port_log:
            args += ["-chardev", "socket,id=port%x,path=%s/port%x,server=on,wait=off" % (port, work, port),
                     "-device", "isa-debugcon,iobase=0x%x,chardev=port%x" % (port, port)]
        if a.registers:
            args += ["-device", "pc-testdev"]
        if a.shared_memory:
            with open(work + "/memory", "wb") as f:
                f.truncate(1 << 20)
            args += ["-object", "memory-backend-file,id=judge-memory,share=on,size=1M,mem-path=%s/memory" % work,
                     "-device", "ivshmem-plain,memdev=judge-memory"]
        args += self._disk_arguments()
        if a.network:
            args += ["-netdev", "dgram,id=net,local.type=unix,local.path=%s/net-guest,remote.type=unix,"
                     "remote.path=%s/net-host" % (work, work), "-device",
                     a.network + ",id=adapter,netdev=net,romfile="]
        if a.display:
            number = int(a.display.lstrip(":"))
            args += ["-netdev", "user,id=display,restrict=on,guestfwd=tcp:10.0.2.100:%d-cmd:%s --relay "
                     "/tmp/.X11-unix/X%d" % (6000 + number, TOOL, number),
                     "-device", "virtio-net-pci,netdev=display,mac=52:54:00:00:60:00,romfile="]
        if a.keyboard_leds:
            args += ["-device", "VGA", "-vnc", "unix:%s/vnc" % work]
        for event, _ in self._filters():
            args += ["-trace", "enable=" + event]
        if self._filters():
            args += ["-D", work + "/log"]
        for more in a.qemu:
            args += shlex.split(more)
        return args

    def _filters(self):
        pairs = [(text + "=").split("=", 1) for text in self.options.trace]
        return [(event, pattern.rstrip("=")) for event, pattern in pairs]

    # ---- the run

    def _judge(self, function, *arguments):
        def body():
            try:
                function(*arguments)
            except (OSError, EOFError, IndexError, struct.error, ValueError) as e:
                if not self.over.is_set():
                    self.timeline.add("failure", of=function.__name__, why=repr(e))

        self.threads.append(threading.Thread(target=body, daemon=True))
        self.threads[-1].start()

    def start(self):
        """Boots. Returns when the command has begun, or when it will not any more."""
        a, work, timeline, over = self.options, self.work, self.timeline, self.over
        self._write_command()
        image, tree, release = boot.find_kernel(a.kernel)
        self._write_first_files(tree)
        os.mkfifo(work + "/log")
        args = self._arguments(image, release)
        with open(self.out + "/qemu-command", "w") as f:
            f.write(" ".join(map(shlex.quote, args)) + "\n")
        if self._filters():
            self._judge(judges.watch_trace, work + "/log", self._filters(), timeline, over)
        if a.network:
            self._judge(judges.watch_network, work + "/net-host", work + "/net-guest", timeline, over)
        self.qemu = subprocess.Popen(args, stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.PIPE,
                                     preexec_fn=judges.die_with_us)
        self._judge(judges.watch_device_log, self.qemu.stderr, a.device_log, timeline, self.out + "/qemu-stderr")
        self._judge(judges.watch_console, self.qemu.stdout, timeline, self.out + "/console", over, a.console)
        for port in a.port_log:
            self._judge(judges.watch_port_log, "%s/port%x" % (work, port), port, timeline)
        try:
            self.monitor = judges.Monitor(work + "/qmp", timeline)
            while self.qemu.poll() is None and not timeline.zero and time.time() < self.begin + a.timeout:
                time.sleep(0.01)
            with open(self.out + "/pci.json", "w") as f:
                json.dump(self.monitor("query-pci"), f, indent=1)  # now that the firmware has numbered the buses
            if a.watch_port:
                self._judge(judges.watch_ports, self.monitor, a.watch_port, timeline, over)
            if a.disk:
                self._judge(judges.watch_disks, self.monitor, timeline, over)
        except (OSError, EOFError):
            pass  # qemu refused an argument; its exit and the file qemu-stderr tell
        if a.shared_memory:
            self._judge(judges.watch_memory, work + "/memory", timeline, over)
        if a.keyboard_leds:
            self._judge(judges.watch_keyboard_leds, work + "/vnc", timeline)

    def wait(self):
        """The command's exit code, or one of the two above."""
        is_late = False
        try:
            self.qemu.wait(max(1, self.begin + self.options.timeout - time.time()))
        except subprocess.TimeoutExpired:
            is_late = True
            self.qemu.kill()
            self.qemu.wait()
        self.over.set()
        for t in self.threads:
            t.join(2)
        for name, data in self.content.items():
            with open("%s/%s" % (self.work, name), "rb") as f:
                self.timeline.add("disk", disk=name, content="unchanged" if f.read() == data else "changed")
        self.timeline.write()
        if is_late:
            return GUEST_OUT_OF_TIME
        try:
            with open(self.out + "/rc") as f:
                return int(f.read())
        except (OSError, ValueError):
            return GUEST_DIED
