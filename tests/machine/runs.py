"""Whole runs of the shipped programs on a virtual PC. The judges are its devices: tests look at what those saw, and at the
program's lines and exit code; never into the program."""
import json
import os
import subprocess
import tempfile
import time
import unittest

from bench import PROGRAMS, ROOT, Bench

E001 = ["--smbios", "type=2,product=E001-board", "--registers", "--trace", "memory_region_ops_write=pc-testdev"]
TEST = "panelglow-diags -subtest=CustomLEDTest -LEDTimeout=20 -Retries=0 "
PORT_BUTTONS = [("PowerGreen", ["ioporte0.0"]), ("PowerRed", ["ioporte0.1"]), ("NoLED", [])]
# What the port lamps are when nothing blinks: power green, red and drive dark.
AT_REST = {"ioporte0.0": 1, "ioporte0.1": 0, "ioporte2.3": 0}
# How long a light is on; the class of the port chip rests 30 ms behind each write.
PHASE_S, PORT_PHASE_S, LOCK_KEY_PHASE_S = 0.5, 0.53, 0.2
# An idle machine keeps within 3 ms of them; one whose two cores are shared needs more room.
TOLERANCE_S = 0.010


def run_counts(text):
    """Exit codes that a script printed as "rc=N"."""
    return [int(line[3:]) for line in text.split("\n") if line.startswith("rc=")]


class Runs(unittest.TestCase):
    def assert_phase(self, bench, light, expected, tolerance=TOLERANCE_S):
        phase = bench.median_phase(light)
        self.assertIsNotNone(phase, light + " was not seen to blink")
        self.assertLessEqual(abs(phase - expected), tolerance, "%s: %.4f s" % (light, phase))

    def assert_at_rest(self, bench):
        for light, state in AT_REST.items():
            self.assertEqual(bench.last(light) or 0, state, light)

    def assert_no_crash(self, bench):
        self.assertNotRegex(bench.text("console"), r"segfault|trap invalid opcode|general protection")

    def test_every_door(self):
        options = E001 + ["--timeout", "200", "--keyboard-leds", "--network", "virtio-net-pci", "--disk", "ahci",
                          "--disk", "nvme", "--modules", "evdev,vivid:n_devs=1:node_types=1", "--console",
                          "VIDIOC_STREAMO"]
        buttons = [("NumLock", ["num"]), ("CapsLock", ["caps"]), ("ScrollLock", ["scroll"]), *PORT_BUTTONS,
                   ("DriveRed", ["ioporte2.3"]), ("HardDrive", ["judge0", "judge1"]), ("Network", ["net"]),
                   ("Webcam", ["camera"])]
        script = TEST + "-SectionID=Bench; echo rc=$?; busybox ip route"
        with Bench("every-door", options, script) as bench:
            bench.operate(buttons)
            bench.finish()
            self.assertEqual(run_counts(bench.text()), [0], bench.text()[-2000:])
            self.assertEqual({name for name, _ in buttons}, set(bench.pressed))
            self.assertEqual(bench.pressed.count("HardDrive"), 2)  # one for each controller
            for light in AT_REST:
                self.assert_phase(bench, light, PORT_PHASE_S)
            self.assert_at_rest(bench)
            for light in ("num", "caps", "scroll"):
                self.assert_phase(bench, light, LOCK_KEY_PHASE_S)
                self.assertEqual(bench.last(light), 0)
            self.assertIsNotNone(bench.median_phase("camera"))
            self.assertEqual((bench.last("net"), bench.last("camera")), (1, 0))
            self.assertIn("10.77.0.0/16 via 10.9.8.1", bench.text())
            contents = [seen["content"] for _, judge, seen in bench.machine.timeline.notes if "content" in seen]
            self.assertEqual(contents, ["unchanged", "unchanged"])
            self.assert_no_crash(bench)

    def test_device_memory_and_an_ide_disk_in_use(self):
        options = ["--machine", "pc", "--smbios", "type=2,product=E002-board", "--registers", "--trace",
                   "memory_region_ops_write=pc-testdev", "--disk", "ide", "--modules", "ext4,crc32c_generic"]
        buttons = [("PowerGreen", ["iomem400.6"]), ("PowerRed", ["iomem404.6"]), ("NoLED", []),
                   ("ChargeWhite", ["iomem408.6"]), ("ChargeAmber", ["iomem40c.6"]), ("HardDrive", ["judge0"])]
        script = "mkfs.ext4 -q -F /dev/sda && mkdir /tmp/used && mount /dev/sda /tmp/used\n" + TEST
        with Bench("memory", options, script + "-SectionID=Memory; echo rc=$?; umount /tmp/used") as bench:
            bench.operate(buttons)
            bench.finish()
            self.assertEqual(run_counts(bench.text()), [0], bench.text()[-2000:] + bench.text("stderr"))
            # As chip.ini says of this chip: after a test the power LED is white, the others are dark.
            for light, after in (("iomem400.6", 1), ("iomem404.6", 0), ("iomem408.6", 0), ("iomem40c.6", 0)):
                self.assert_phase(bench, light, PHASE_S)
                self.assertEqual(bench.last(light), after, light)
            self.assertIn("/dev/sda is in use (mounted at /tmp/used)", bench.text("stderr"))
            begin = min(at for at, light, _ in bench.changes() if light == "judge0")
            writes = [seen["writes"] for at, judge, seen in bench.machine.timeline.notes
                      if judge == "disk" and at > begin + 0.2 and "writes" in seen]
            self.assertLess(sum(writes), 40, "a disk in use is read, not written")  # the filesystem's own are few

    def test_the_codec(self):
        options = ["--smbios", "type=2,product=E003-board", "--device-log", "verb 0x715", "--qemu",
                   "-device ich9-intel-hda,addr=1b,debug=3 -device hda-duplex,debug=3"]
        with Bench("codec", options, TEST + "-SectionID=Codec; echo rc=$?") as bench:
            bench.operate([("Speaker", ["pin0"]), ("Microphone", ["pin3"]), ("NoLED", [])])
            bench.finish()
            self.assertEqual(run_counts(bench.text()), [0], bench.text()[-1500:] + bench.text("stderr"))
            self.assertTrue(bench.changes())

    def test_a_wrong_answer_a_signal_and_a_lost_display_leave_the_registers_as_they_were(self):
        # The first run answers wrong, the second is ended by a signal, the third loses its display.
        script = "".join(
            "%s %s-SectionID=Ports >/out/run%d; echo rc=$?\n" % (prefix, TEST, number)
            for number, prefix in enumerate(["", "timeout -s TERM 9", ""]))
        with Bench("ends", E001, script) as bench:
            bench.operate(PORT_BUTTONS, wrong=0)
            self.assertTrue(bench.open_dialog())
            self.assertTrue(bench.await_change("ioporte0.0", time.time()) or bench.changes())
            while os.path.exists(os.path.join(bench.folder, "run2")) is False and bench.machine.qemu.poll() is None:
                time.sleep(0.2)
            self.assertTrue(bench.open_dialog())
            time.sleep(6)  # at least one LED in its turn
            bench.screen.kill()
            bench.finish()
            codes = run_counts(bench.text())
            self.assertEqual(len(codes), 3, bench.text() + bench.text("stderr"))
            self.assertTrue(all(codes), codes)
            self.assertRegex(bench.text("run0"), r"TestFailed 7710(17|20|19)")
            self.assertIn("EndOfTest", bench.text("run1"))
            self.assertIn("TestFailed 990640", bench.text("run2"))
            self.assert_at_rest(bench)
            self.assertGreater(len(bench.changes()), 6)
            self.assert_no_crash(bench)

    def test_what_is_gone_in_the_middle(self):
        # A disk, an adapter and a camera go while their LED blinks; nobody presses anything.
        options = E001 + ["--network", "virtio-net-pci", "--disk", "virtio-scsi", "--modules",
                          "evdev,vivid:n_devs=1:node_types=1", "--console", "VIDIOC_STREAMO"]
        adapter = "$(readlink -f /sys/class/net/bench-lan/device)"
        gone = [("Drive", "judge0", "echo 1 > /sys/block/sda/device/delete"),
                ("Adapter", "net", "echo $(basename {0}) > {0}/driver/unbind".format(adapter)),
                ("Camera", "camera", "echo vivid.0 > /sys/bus/platform/drivers/vivid/unbind")]
        script = "".join("""
        (while [ ! -e /out/take-%s ]; do sleep 0.2; done; %s) &
        timeout -s KILL 60 panelglow-diags -subtest=CustomLEDTest -LEDTimeout=10 -Retries=0 -SectionID=%s; echo rc=$?
        """ % (section, remove, section) for section, _, remove in gone)
        with Bench("gone", options, script) as bench:
            for section, light, _ in gone:
                begin = time.time()
                self.assertTrue(bench.open_dialog(), section)
                self.assertTrue(bench.await_change(light, begin), section)
                with open(os.path.join(bench.folder, "take-" + section), "w"):
                    pass
                bench.await_no_window()
            bench.finish()
            self.assertEqual(run_counts(bench.text()), [1, 1, 1], bench.text()[-1500:] + bench.text("stderr"))
            self.assertEqual(bench.text().count("ReportFailure 770118"), 3, bench.text())  # ended by their time alone
            self.assertIn("The adapter bench-lan cannot be switched", bench.text("stderr"))
            self.assert_at_rest(bench)
            self.assert_no_crash(bench)

    def test_the_integrators_program(self):
        script = """
        panelglow-board report --json > /out/report.json; echo rc=$?
        panelglow-board detect > /out/detect; echo rc=$?
        panelglow-board blink power-green --seconds 4; echo rc=$?
        panelglow-board blink power-green --seconds 2 --trace /tmp/blink.trace; echo rc=$?; cp /tmp/blink.trace /out
        panelglow-board blink power-red --seconds 3 & panelglow-board blink power-red --seconds 3; echo rc=$?; wait
        timeout --preserve-status -s TERM 4 panelglow-diags -subtest=LEDStatusIndicator -BlinkSpeed=500; echo rc=$?"""
        with Bench("integrator", E001 + ["--disk", "ahci"], script, display=False) as bench:
            bench.finish()
            self.assertEqual(run_counts(bench.text()), [0] * 6, bench.text() + bench.text("stderr"))
            self.assert_phase(bench, "ioporte0.0", PORT_PHASE_S)
            self.assert_at_rest(bench)
            report = json.loads(bench.text("report.json"))
            self.assertIn("E001", json.dumps(report))
            with tempfile.TemporaryDirectory() as folder:
                subprocess.run("cp -r %s/installation/. %s/machines/qemu/*.ini %s" % (ROOT, ROOT, folder), shell=True,
                               check=True)
                replay = subprocess.run([os.path.join(PROGRAMS, "panelglow-board"), "replay",
                                         os.path.join(bench.folder, "blink.trace"), "blink", "power-green",
                                         "--seconds", "2"], cwd=folder, capture_output=True, text=True, timeout=60)
            self.assertEqual(replay.returncode, 0, replay.stdout + replay.stderr)

    def test_what_the_kernel_refuses(self):
        script = """
        panelglow-diags -subtest=LEDStatusIndicator -BlinkTime=1; echo rc=$?
        {test}-SectionID=Ports; echo rc=$?
        panelglow-diags -version=true; echo rc=$?""".format(test=TEST)
        cases = [("lockdown", ["--append", "lockdown=integrity"], "", "the kernel is locked down"),
                 ("nobody", [], "chmod -R a+rwX /tmp/bench; exec setpriv --reuid 1000 --regid 1000 --clear-groups "
                  "/bin/sh -c '", "start it as root")]
        for name, options, prefix, sentence in cases:
            with self.subTest(name), Bench(name, E001 + options, prefix + script + ("'" if prefix else ""),
                                           display=False) as bench:
                bench.finish()
                codes = run_counts(bench.text())
                self.assertEqual(codes[1:], [1, 0], bench.text() + bench.text("stderr"))
                self.assertIn("TestFailed 020472", bench.text())
                self.assertIn(sentence, bench.text("stderr"))
                self.assertEqual(bench.changes("ioporte0.1"), [])
                self.assertLessEqual(len(bench.changes("ioporte0.0")), 1)  # the bench's own


if __name__ == "__main__":
    unittest.main(warnings="ignore")
