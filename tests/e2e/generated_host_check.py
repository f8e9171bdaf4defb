#!/usr/bin/env python3
"""ostrahost generate makes a valid host that every listing command reads.

Generates a small host, checks that export then import gives the same host,
runs every read-only command that needs no option on it (JSON output) and
compares the row counts of the grown listings with the demo host's. Also
checks the refusals of generate (existing file, bad count, sizes beyond the
host's limits, which must leave no file behind).

    generated_host_check.py OSTRACLI OSTRAHOST
"""
import json
import os
import subprocess
import sys
import tempfile
import time

from command_tree import read_only_commands
SIZES = {"--routes": 25, "--portgroups": 9, "--vms": 5, "--ports-per-vm": 3,
         "--neighbours": 7, "--hosts-entries": 6}
# Listings that grow with the sizes, and by how many rows.
GROWN = {
    ("network", "ip", "route", "ipv4", "list"): 25,
    ("network", "vswitch", "standard", "portgroup", "list"): 9,
    ("network", "vm", "list"): 5,
    ("network", "ip", "neighbor", "list"): 7,
    ("network", "ip", "hosts", "list"): 6,
}


def main():
    cli, host_tool = sys.argv[1], sys.argv[2]
    failures = []
    passed = 0

    def expect(ok, what):
        nonlocal passed
        if ok:
            passed += 1
        else:
            failures.append(what)
            print("FAILED:", what)

    with tempfile.TemporaryDirectory() as tmp:
        demo = os.path.join(tmp, "demo.db")
        big = os.path.join(tmp, "big.db")
        subprocess.run([host_tool, "init", demo, "--profile", "demo"], check=True)
        sizes = [str(word) for pair in SIZES.items() for word in pair]
        done = subprocess.run([host_tool, "generate", big] + sizes, capture_output=True, text=True)
        expect(done.returncode == 0, f"generate: {done.stderr}")
        if done.returncode:
            return 1

        # Export then import gives the same host.
        first = subprocess.run([host_tool, "export", "--host", big], capture_output=True,
                               check=True).stdout
        copy = os.path.join(tmp, "copy.db")
        subprocess.run([host_tool, "import", "-", "--host", copy], input=first, check=True)
        again = subprocess.run([host_tool, "export", "--host", copy], capture_output=True,
                               check=True).stdout
        expect(first == again, "export, import, export changes the host")

        def run(db, args):
            return subprocess.run([cli, "--host", db] + args, capture_output=True)

        commands = read_only_commands(cli, extra=["--host", demo])
        for path in commands:
            small = run(demo, ["--formatter", "json"] + path)
            large = run(big, ["--formatter", "json"] + path)
            name = " ".join(path)
            expect(large.returncode == small.returncode,
                   f"{name}: exit status {large.returncode} on the generated host, "
                   f"{small.returncode} on the demo host: {large.stderr.decode()[:200]}")
            try:
                rows = json.loads(large.stdout) if large.stdout else None
            except ValueError as error:
                expect(False, f"{name}: not JSON: {error}")
                continue
            if tuple(path) in GROWN:
                before = json.loads(small.stdout)
                expect(len(rows) - len(before) == GROWN[tuple(path)],
                       f"{name}: {len(rows)} rows on the generated host, {len(before)} on demo")
        expect(len(commands) > 20, "the tree walk found the listing commands")

        # Refusals.
        done = subprocess.run([host_tool, "generate", big], capture_output=True, text=True)
        expect(done.returncode == 1 and "exists already" in done.stderr,
               f"generate over an existing file: {done.returncode} {done.stderr}")
        bad = os.path.join(tmp, "bad.db")
        for args, status, text in (
                (["--routes", "many"], 2, "takes a count"),
                (["--routes", "-5"], 2, "takes a count"),
                (["--vms", "3000", "--ports-per-vm", "4"], 1, "12000 VM ports do not fit"),
                (["--routes", "3000000"], 1, "routes must be from 0 to 2000000")):
            done = subprocess.run([host_tool, "generate", bad] + args, capture_output=True,
                                  text=True)
            expect(done.returncode == status and text in done.stderr,
                   f"generate {' '.join(args)}: {done.returncode} {done.stderr.strip()}")
            expect(not os.path.exists(bad), f"generate {' '.join(args)} left a file behind")
        done = subprocess.run([host_tool, "init", bad, "--routes", "5"], capture_output=True,
                              text=True)
        expect(done.returncode == 2, "sizes are options of generate only")

        # 100,000 routes build quickly (the bound only catches a lost
        # transaction or quadratic work; the figure is printed).
        start = time.monotonic()
        done = subprocess.run([host_tool, "generate", os.path.join(tmp, "100k.db"), "--routes",
                               "100000"], capture_output=True, text=True)
        elapsed = time.monotonic() - start
        expect(done.returncode == 0 and elapsed < 20,
               f"generate --routes 100000: status {done.returncode} in {elapsed:.1f} s")
        print(f"generate --routes 100000 (and the default sizes): {elapsed:.2f} s")

    print(f"{len(commands)} commands; {passed} passed, {len(failures)} failed")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
