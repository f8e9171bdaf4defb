#!/usr/bin/env python3
"""ostracli processes killed at random moments leave a sound host.

Runs 500 changing ostracli commands one after another (additions and removals
of port groups, DNS servers, hosts entries and IPv4 routes, and now and then a
--batch of three additions) and kills most of them with SIGKILL after a random
delay between 0 and about the time such a command takes. A run that ends by
itself must succeed: every change is valid, and a killed process must not leave
the store locked for the next one. Afterwards:

- every change acknowledged with exit status 0 is there, every acknowledged
  removal is gone, and a change whose process was killed is either wholly there
  (a port group with its policy row, a route with all its columns, a hosts entry
  with its aliases and comment; the three additions of a batch together) or
  not at all;
- the store passes SQLite's integrity and foreign key checks, and ostracli
  still reads it and changes it.

The seed is printed; --seed replays a run.

    crash_test.py OSTRACLI OSTRAHOST [--runs N] [--seed N]
"""
import argparse
import collections
import os
import random
import signal
import subprocess
import sys
import time

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
import changes  # noqa: E402

# Share of runs that get a kill (some of them finish before it lands).
KILL_SHARE = 0.6
# Runs at the start that are never killed; they measure a command's duration.
CALIBRATION_RUNS = 10
# The typical duration is the median of this many recent runs that had no kill
# planned, so that it follows the load of the machine.
DURATION_WINDOW = 15
# The worker number of this test's items (see changes.Item).
WORKER = 9
# A stale lock would make the next run wait this long and then fail.
BUSY_TIMEOUT_MS = 2000


def start(host, args, batch_file=None):
    if batch_file is not None:
        args = ["--batch", batch_file]
    return subprocess.Popen([host.ostracli] + args, stdout=subprocess.PIPE,
                            stderr=subprocess.PIPE, text=True, env=host.env)


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("ostracli")
    parser.add_argument("ostrahost")
    parser.add_argument("--runs", type=int, default=500)
    parser.add_argument("--seed", type=int, default=None)
    args = parser.parse_args()
    changes.require_sqlite()
    seed = args.seed if args.seed is not None else random.SystemRandom().randrange(1 << 31)
    print("seed %d (replay with --seed %d)" % (seed, seed))
    rng = random.Random(seed)

    host = changes.Host(args.ostracli, args.ostrahost, busy_timeout_ms=BUSY_TIMEOUT_MS)
    problems = []
    try:
        baseline = host.snapshot()
        batch_file = os.path.join(host.tmp.name, "batch.txt")
        serials = {kind: 0 for kind in changes.KINDS}
        items, present, batches = [], [], []
        durations = collections.deque(maxlen=DURATION_WINDOW)
        killed = finished = after_kill = 0
        after_kill_longest = 0.0
        previous_killed = False

        def new_item():
            kind = rng.choice(changes.KINDS)
            item = changes.Item(kind, WORKER, serials[kind])
            serials[kind] += 1
            items.append(item)
            return item

        began = time.monotonic()
        for run in range(args.runs):
            # Choose the change.
            roll = rng.random()
            batch = None
            if present and roll < 0.25:
                targets = [present.pop(rng.randrange(len(present)))]
                adding = False
                proc_args = targets[0].remove_args()
            elif roll < 0.35:
                targets = [new_item() for _ in range(3)]
                adding = True
                with open(batch_file, "w") as out:
                    for item in targets:
                        out.write(" ".join("'%s'" % word for word in item.add_args()) + "\n")
                batch = batch_file
                proc_args = []
            else:
                targets = [new_item()]
                adding = True
                proc_args = targets[0].add_args()
            what = "%s %s" % ("add" if adding else "remove", targets)

            # Run it, and perhaps kill it.
            kill = run >= CALIBRATION_RUNS and rng.random() < KILL_SHARE
            if kill:
                typical = sorted(durations)[len(durations) // 2]
                delay = rng.uniform(0, typical)
            started = time.monotonic()
            proc = start(host, proc_args, batch)
            if kill:
                time.sleep(delay)
                proc.send_signal(signal.SIGKILL)
            out, err = proc.communicate()
            took = time.monotonic() - started
            if not kill:
                durations.append(took)
            if run == CALIBRATION_RUNS - 1:
                typical = sorted(durations)[len(durations) // 2]
                print("a change takes about %.1f ms at first; kills land from 0 to about that "
                      "long after the start" % (1000 * typical))

            if proc.returncode == -signal.SIGKILL:
                killed += 1
                previous_killed = True
                for item in targets:
                    item.state = changes.UNKNOWN
                if batch:
                    batches.append(targets)
                continue
            finished += 1
            if previous_killed:
                after_kill += 1
                after_kill_longest = max(after_kill_longest, took)
            previous_killed = False
            if proc.returncode != 0:
                problems.append("run %d (%s) failed with exit status %d: %s" %
                                (run, what, proc.returncode, err.strip() or "(no message)"))
                if not adding:
                    present.extend(targets)
                continue
            if out.split() != ["true"] * len(targets) or err:
                problems.append("run %d (%s) printed %r %r" % (run, what, out, err))
            for item in targets:
                item.state = changes.PRESENT if adding else changes.ABSENT
                if adding:
                    present.append(item)
        elapsed = time.monotonic() - began

        print("%d runs in %.1f s: %d killed, %d finished (%d of them right after a kill)" %
              (args.runs, elapsed, killed, finished, after_kill))
        # Every run that finished had to succeed; those right after a kill
        # show that the killed process left no lock behind.
        print("the longest run right after a kill took %.1f ms; a lock left behind would have "
              "failed it after the busy timeout of %d ms" % (1000 * after_kill_longest,
                                                             BUSY_TIMEOUT_MS))
        if killed < args.runs // 4 or after_kill == 0:
            problems.append("only %d runs were killed, %d ran right after a kill" %
                            (killed, after_kill))

        # The host as ostracli sees it.
        problems += changes.verify(host, items, baseline)
        snap = host.snapshot()
        for group in batches:
            there = [item.key in snap[item.kind] for item in group]
            if any(there) and not all(there):
                problems.append("a killed batch is half applied: %s" %
                                [(item, flag) for item, flag in zip(group, there)])
        unknown = [item for item in items if item.state == changes.UNKNOWN]
        landed = sum(1 for item in unknown if item.key in snap[item.kind])
        print("%d changes of killed runs: %d applied whole, %d not at all" %
              (len(unknown), landed, len(unknown) - landed))
        host.export()

        # SQLite's view of the file.
        problems += changes.check_store(host.db)

        # A further change and a read after all that.
        probe = changes.Item("hosts", WORKER, 10000)
        for words in (probe.add_args(), ["network", "ip", "hosts", "list"], probe.remove_args()):
            result = host.run(words)
            if result.returncode != 0:
                problems.append("after the kills, %s failed: %s" %
                                (" ".join(words), result.stderr.strip()))
    finally:
        host.close()

    return changes.report(problems)


if __name__ == "__main__":
    sys.exit(main())
