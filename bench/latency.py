#!/usr/bin/env python3
"""Whole-process latency of ostracli commands against `ip -json link show`.

Each command and the peer run alternately, N times each, in the same run; the
report gives the median wall time of each and the ratio ostracli / peer.

    bench/latency.py [--build build] [--runs 200]
"""
import argparse
import os
import shutil
import statistics
import subprocess
import sys
import tempfile
import time


def timed(argv, env):
    start = time.perf_counter_ns()
    subprocess.run(argv, env=env, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL, check=False)
    return (time.perf_counter_ns() - start) / 1e6


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--build", default="build")
    parser.add_argument("--runs", type=int, default=200)
    args = parser.parse_args()
    ostracli = os.path.join(args.build, "bin", "ostracli")
    ostrahost = os.path.join(args.build, "bin", "ostrahost")
    ip = shutil.which("ip")
    if not ip:
        sys.exit("the peer `ip` (iproute2) is not installed")
    with tempfile.TemporaryDirectory() as tmp:
        db = os.path.join(tmp, "host.db")
        subprocess.run([ostrahost, "init", db, "--profile", "demo"], check=True)
        env = dict(os.environ, OSTRACLI_HOST=db)
        cases = {
            "network nic list": [ostracli, "network", "nic", "list"],
        }
        peer = [ip, "-json", "link", "show"]
        for argv in list(cases.values()) + [peer]:
            timed(argv, env)  # warm the page cache
        print(f"{'command':40} {'median ms':>10} {'peer ms':>9} {'ratio':>6}")
        for name, argv in cases.items():
            ours, theirs = [], []
            for _ in range(args.runs):
                ours.append(timed(argv, env))
                theirs.append(timed(peer, env))
            a, b = statistics.median(ours), statistics.median(theirs)
            print(f"{name:40} {a:10.2f} {b:9.2f} {a / b:6.2f}")


if __name__ == "__main__":
    main()
