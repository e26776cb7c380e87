"""Whole runs of the shipped programs on a virtual PC. The judges are its devices: tests look at what those saw, and at the
program's lines and exit code; never into the program."""
import json
import os
import subprocess
import sys
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
        # A graphical session writes all lock LEDs anew when a person types another lock key: here while Num is lit for
        # the test's sake.
        script = """
        (given typed; num=$(echo /sys/class/leds/*::numlock/brightness)
         until [ "$(cat $num)" = 1 ]; do sleep 0.02; done; echo 0 >$num; touch /out/rewritten) &
        """ + TEST + "-SectionID=Bench; echo rc=$?; touch /out/ended; busybox ip route; sleep 0.3"

        def type_while_num_blinks(name):
            if name == "NumLock":
                bench.give("typed")
                self.assertTrue(bench.wait_until(lambda: bench.made("rewritten")))

        with Bench("every-door", options, script) as bench:
            bench.operate(buttons, before_press=type_while_num_blinks)
            bench.finish()
            self.assertEqual(run_counts(bench.text()), [0], bench.text()[-2000:])
            self.assertEqual({name for name, _ in buttons}, set(bench.pressed))
            self.assertTrue(bench.changes("judge0") and bench.changes("judge1"), "one turn for each controller")
            for light in AT_REST:
                self.assert_phase(bench, light, PORT_PHASE_S)
            self.assert_at_rest(bench)
            for light in ("num", "caps", "scroll"):
                self.assert_phase(bench, light, LOCK_KEY_PHASE_S)
                self.assertEqual(bench.last(light, before=bench.made("ended") + 0.2), 0, light)  # power-off darkens all
            self.assertIsNotNone(bench.median_phase("camera"))
            self.assertEqual((bench.last("net"), bench.last("camera")), (1, 0))
            self.assertIn("10.77.0.0/16 via 10.9.8.1", bench.text())
            self.assertEqual(bench.contents(), ["unchanged", "unchanged"])
            self.assert_no_crash(bench)

    def test_device_memory_and_an_ide_disk_in_use(self):
        options = ["--machine", "pc", "--smbios", "type=2,product=E002-board", "--registers", "--trace",
                   "memory_region_ops_write=pc-testdev", "--disk", "ide", "--disk", "megasas", "--modules",
                   "ext4,crc32c_generic"]
        buttons = [("PowerGreen", ["iomem400.6"]), ("PowerRed", ["iomem404.6"]), ("NoLED", []),
                   ("ChargeWhite", ["iomem408.6"]), ("ChargeAmber", ["iomem40c.6"]),
                   ("HardDrive", ["judge0", "judge1"])]
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
                      if judge == "disk" and at > begin + 0.2 and "writes" in seen and seen["disk"] == "judge0"]
            self.assertLess(sum(writes), 40, "a disk in use is read, not written")  # the filesystem's own are few
            self.assertTrue(bench.changes("judge1"))
            self.assertEqual(bench.contents()[1], "unchanged")

    def test_the_codec(self):
        options = ["--smbios", "type=2,product=E003-board", "--device-log", "verb 0x715", "--disk", "virtio-scsi",
                   "--network", "e1000e", "--qemu",
                   "-device ich9-intel-hda,addr=1b,debug=3 -device hda-duplex,debug=3"]
        buttons = [("Speaker", ["pin0"]), ("Microphone", ["pin3"]), ("NoLED", []), ("HardDrive", ["judge0"]),
                   ("Network", ["net"])]
        with Bench("codec", options, TEST + "-SectionID=Codec; echo rc=$?") as bench:
            bench.operate(buttons)
            bench.finish()
            self.assertEqual(run_counts(bench.text()), [0], bench.text()[-1500:] + bench.text("stderr"))
            self.assertEqual({name for name, _ in buttons}, set(bench.pressed))
            self.assertEqual(bench.contents(), ["unchanged"])
            self.assertEqual(bench.last("net"), 1)

    def test_a_wrong_answer_a_wrong_file_a_signal_and_a_lost_display_leave_the_registers_as_they_were(self):
        # The first run answers wrong, the second answers right but its board file lights red for green, the third is
        # ended by a signal, the fourth loses its display.
        script = "cp mbdetect.ini right.ini; sed '/powerled.green.assert/s/0x01/0x02/' mbdetect.ini >wrong.ini\n"
        script += "".join(
            "cp %s.ini mbdetect.ini; %s %s-SectionID=Ports >/out/run%d; echo rc=$?\n" % (file, prefix, TEST, number)
            for number, (file, prefix) in enumerate([("right", ""), ("wrong", ""), ("right", "timeout -s TERM 9"),
                                                     ("right", "")]))
        with Bench("ends", E001, script) as bench:
            bench.operate(PORT_BUTTONS, wrong=0)
            bench.operate(PORT_BUTTONS)
            self.assertTrue(bench.open_dialog())
            self.assertTrue(bench.await_change("ioporte0.0", time.time()) or bench.changes())
            self.assertTrue(bench.wait_until(lambda: bench.made("run3")))
            self.assertTrue(bench.open_dialog())
            time.sleep(6)  # at least one LED in its turn
            bench.screen.kill()
            bench.finish()
            codes = run_counts(bench.text())
            self.assertEqual(len(codes), 4, bench.text() + bench.text("stderr"))
            self.assertTrue(all(codes), codes)
            self.assertRegex(bench.text("run0"), r"TestFailed 7710(17|20|19)")
            self.assertIn("TestFailed 771017", bench.text("run1"))
            self.assertIn("EndOfTest", bench.text("run2"))
            self.assertIn("TestFailed 990640", bench.text("run3"))
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
        (given take-%s; %s) &
        timeout -s KILL 60 panelglow-diags -subtest=CustomLEDTest -LEDTimeout=10 -Retries=0 -SectionID=%s; echo rc=$?
        """ % (section, remove, section) for section, _, remove in gone)
        with Bench("gone", options, script) as bench:
            for section, light, _ in gone:
                begin = time.time()
                self.assertTrue(bench.open_dialog(), section)
                self.assertTrue(bench.await_change(light, begin), section)
                bench.give("take-" + section)
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
        # First whole runs without the one or the other right. Then the kernel is locked down while a LED blinks: what
        # has begun goes on, and the next run is refused.
        script = """
        refused() {{
            name=$1; shift
            "$@" sh -c 'timeout -s TERM 3 panelglow-diags -subtest=LEDStatusIndicator; echo rc=$?
                {test}-SectionID=Power; echo rc=$?
                panelglow-diags -version=true; echo rc=$?' >/out/$name 2>/out/$name.told
        }}
        chmod -R a+rwX /tmp/bench
        user="setpriv --reuid 1000 --regid 1000 --clear-groups"
        refused nobody $user
        chgrp 1000 /dev/mem; chmod 440 /dev/mem
        refused read-only $user --inh-caps=+sys_rawio --ambient-caps=+sys_rawio
        mkdir /tmp/groups; mount -t cgroup -o devices none /tmp/groups; mkdir /tmp/groups/box
        echo 'c 1:1 w' >/tmp/groups/box/devices.deny
        refused box sh -c 'echo $$ >/tmp/groups/box/cgroup.procs; exec "$@"' box
        (given lock; echo integrity >/sys/kernel/security/lockdown; touch /out/locked) &
        touch /out/begun; {test}-SectionID=Power; echo rc=$?; touch /out/middle
        refused lockdown env""".format(test=TEST)
        with Bench("refused", E001 + ["--timeout", "200"], script) as bench:
            self.assertTrue(bench.open_dialog())
            begun = bench.made("begun")
            early = [light for at, light, _ in bench.changes() if at < begun]
            self.assertIn(early, ([], ["ioporte0.0"]))  # the bench's own
            self.assertTrue(bench.wait_until(lambda: len(bench.changes()) > len(early) + 2))
            bench.give("lock")
            bench.operate(PORT_BUTTONS)
            bench.finish()
            locked, ended = bench.made("locked"), bench.made("middle")
            self.assertEqual(run_counts(bench.text()), [0], bench.text()[-1500:] + bench.text("stderr"))
            self.assertEqual({light for at, light, _ in bench.changes() if locked < at < ended},
                             {"ioporte0.0", "ioporte0.1"})
            self.assert_at_rest(bench)
            self.assertEqual([change for change in bench.changes() if change[0] > ended], [])
            for name, sentence in (("nobody", "start it as root"), ("read-only", "the file's mode"),
                                   ("box", "a container's list of devices"), ("lockdown", "the kernel is locked down")):
                with self.subTest(name):
                    self.assertEqual(run_counts(bench.text(name))[1:], [1, 0], bench.text(name))
                    self.assertIn("TestFailed 020472", bench.text(name))
                    self.assertIn(sentence, bench.text(name + ".told"))
            self.assert_no_crash(bench)

    def test_several_at_once_and_one_killed_with_its_locks(self):
        # The second and the third wait for the first one's dialog, and go on when it is killed while its LED blinks.
        script = """
        {test}-SectionID=Power >/out/first & first=$!
        given more
        for name in second third; do ({test}-SectionID=Power >/out/$name; echo rc=$?) & done
        given kill; kill -KILL $first; wait $first; echo rc=$?; touch /out/killed
        wait; grep -c panelglow-mutex /proc/net/unix""".format(test=TEST)
        with Bench("several", E001 + ["--timeout", "200"], script) as bench:
            self.assertTrue(bench.open_dialog())
            self.assertTrue(bench.wait_until(lambda: bench.changes("ioporte0.0") or bench.changes("ioporte0.1")))
            bench.give("more")
            for name in ("second", "third"):
                self.assertTrue(bench.wait_until(lambda: bench.made(name) and "UpdatePercentage 5" in bench.text(name)))
            time.sleep(2)  # whoever does not wait has a window by now
            self.assertEqual(len(bench.screen.windows()), 1)
            self.assertTrue(bench.wait_until(lambda: any(bench.last(light) != AT_REST[light] for light in AT_REST)))
            bench.give("kill")
            self.assertTrue(bench.wait_until(lambda: bench.made("killed")))
            for number in (2, 3):
                bench.operate(PORT_BUTTONS, until=lambda: len(run_counts(bench.text())) == number)
            bench.finish()
            self.assertEqual(run_counts(bench.text()), [137, 0, 0], bench.text() + bench.text("stderr"))
            self.assertEqual(bench.text().split("\n")[-2], "0", "no lock is left")
            self.assert_at_rest(bench)
            self.assertTrue({"PowerGreen", "PowerRed"} <= set(bench.pressed))
            self.assert_no_crash(bench)


def main():
    """`--again`: what failed is run once more, and only what fails twice counts. For machines that other work shares: an
    emulated processor that has to wait is a slow operator."""
    arguments = [word for word in sys.argv if word != "--again"]
    first = unittest.main(argv=arguments, warnings="ignore", exit=False)
    failed = {getattr(test, "test_case", test) for test, _ in first.result.failures + first.result.errors}
    if not failed or len(arguments) == len(sys.argv):
        return 0 if first.result.wasSuccessful() else 1
    print("Once more:", ", ".join(sorted(test.id() for test in failed)), flush=True)
    names = ["Runs." + test.id().rpartition(".")[2] for test in failed]
    second = unittest.main(argv=[arguments[0], "-v", *sorted(names)], warnings="ignore", exit=False)
    return 0 if second.result.wasSuccessful() else 1


if __name__ == "__main__":
    sys.exit(main())
