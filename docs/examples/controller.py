#!/usr/bin/env python3
"""A small controller: starts one subtest, shows its progress, stops it when it takes too long, and gives the verdict.

    controller.py [--limit SECONDS] PROGRAM -name=value ...

Run it in the folder of the installation. Exit code: that of the program, 2 for a wrong call, 3 for a run without an end.
"""
import os
import subprocess
import sys
import threading

STOP_FILE = "kill.ctl"  # in the current folder; its presence asks the run to end


def ask_to_stop():
    open(STOP_FILE, "w").close()


def follow(program, limit_s):
    """Reads lines until the program closes its output; returns what the verdict is made of."""
    seen = {"ended": False, "failed": None, "reported": None}
    watch = threading.Timer(limit_s, ask_to_stop)
    watch.start()
    try:
        for line in program.stdout:
            tag, _, rest = line.rstrip("\r\n").partition(" ")
            if tag == "UpdatePercentage":
                print(f"{rest} %", flush=True)
            elif tag == "TestFailed":
                seen["failed"] = rest
            elif tag == "ReportFailure":
                seen["reported"] = rest
            elif tag == "EndOfTest":
                seen["ended"] = True
    finally:
        watch.cancel()
    return seen


def main(arguments):
    limit_s = 600.0
    if len(arguments) > 1 and arguments[0] == "--limit":
        limit_s, arguments = float(arguments[1]), arguments[2:]
    if not arguments:
        print(__doc__, file=sys.stderr)
        return 2
    if os.path.exists(STOP_FILE):
        os.remove(STOP_FILE)  # of an earlier run: the program never removes it
    with subprocess.Popen(arguments, stdout=subprocess.PIPE, encoding="utf-8", errors="replace") as program:
        seen = follow(program, limit_s)
    if os.path.exists(STOP_FILE):
        os.remove(STOP_FILE)
    if not seen["ended"] or program.returncode not in (0, 1):
        print(f"no verdict: the program ended early with {program.returncode}")
        return 3
    # TestFailed says more than ReportFailure, so it counts where both were printed.
    code = (seen["failed"] or seen["reported"] or "no code").split()[0]
    print("passed" if program.returncode == 0 else f"failed: {code}")
    return program.returncode


if __name__ == "__main__":
    sys.exit(main(sys.argv[1:]))
