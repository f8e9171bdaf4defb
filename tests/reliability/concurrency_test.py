#!/usr/bin/env python3
"""Concurrent ostracli processes on one host lose no change.

Eight workers each run 200 ostracli commands, one process at a time, all at
once against the same host: additions of port groups, DNS servers, hosts
entries and IPv4 routes, and removals of what the worker added before. Each
worker owns its names and addresses, so every change is valid and must be
acknowledged with exit status 0, unless it waited longer than the busy timeout:
such a refusal must say so on standard error with a non-zero exit status,
must change nothing, and may happen to a few percent of the changes at most.

Afterwards every acknowledged change is on the host (read back through
ostracli's listings and ostrahost export), nothing else changed, and the store
passes SQLite's integrity and foreign key checks.

    concurrency_test.py OSTRACLI OSTRAHOST [--workers N] [--changes N] [--seed N]
"""
import argparse
import os
import random
import sys
import threading
import time

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
import changes  # noqa: E402

# Most busy refusals a run may have, as a share of all changes.
MAX_BUSY_SHARE = 0.03


def worker(host, number, count, rng, items, log):
    """Runs \\p count changes of worker \\p number; appends its items to \\p items
    and one (seconds, outcome, item, text) record per change to \\p log."""
    serials = {kind: 0 for kind in changes.KINDS}
    present = []
    for _ in range(count):
        if present and rng.random() < 0.25:
            item = present.pop(rng.randrange(len(present)))
            adding = False
        else:
            kind = rng.choice(changes.KINDS)
            item = changes.Item(kind, number, serials[kind])
            serials[kind] += 1
            items.append(item)
            adding = True
        start = time.monotonic()
        result = host.run(item.add_args() if adding else item.remove_args())
        took = time.monotonic() - start
        what = ("add " if adding else "remove ") + repr(item)
        if result.returncode == 0:
            if result.stdout.strip() != "true" or result.stderr:
                log.append((took, "odd", what, result.stdout + result.stderr))
            item.state = changes.PRESENT if adding else changes.ABSENT
            if adding:
                present.append(item)
            log.append((took, "ok", what, ""))
        elif changes.BUSY_TEXT in result.stderr and result.returncode == 1:
            # Refused because of the busy timeout: the item keeps its state.
            if not adding:
                present.append(item)
            log.append((took, "busy", what, result.stderr.strip()))
        else:
            log.append((took, "refused", what,
                        "exit %d: %s" % (result.returncode, result.stderr.strip() or "(no message)")))
            if not adding:
                present.append(item)


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("ostracli")
    parser.add_argument("ostrahost")
    parser.add_argument("--workers", type=int, default=8)
    parser.add_argument("--changes", type=int, default=200)
    parser.add_argument("--seed", type=int, default=None)
    args = parser.parse_args()
    changes.require_sqlite()
    seed = args.seed if args.seed is not None else random.SystemRandom().randrange(1 << 31)
    print("seed %d (replay with --seed %d)" % (seed, seed))

    host = changes.Host(args.ostracli, args.ostrahost)
    try:
        baseline = host.snapshot()
        items, log = [], []
        threads = [
            threading.Thread(target=worker,
                             args=(host, n, args.changes, random.Random(seed * 1000 + n), items,
                                   log))
            for n in range(args.workers)
        ]
        start = time.monotonic()
        for thread in threads:
            thread.start()
        for thread in threads:
            thread.join()
        elapsed = time.monotonic() - start

        total = args.workers * args.changes
        counts = {}
        for _, outcome, _, _ in log:
            counts[outcome] = counts.get(outcome, 0) + 1
        times = sorted(took for took, outcome, _, _ in log if outcome != "odd")
        print("%d changes by %d processes at once in %.1f s: %d acknowledged, %d refused as busy, "
              "%d refused otherwise" % (total, args.workers, elapsed, counts.get("ok", 0),
                                        counts.get("busy", 0), counts.get("refused", 0)))
        print("per change: median %.1f ms, 99th percentile %.1f ms, longest %.1f ms" %
              (1000 * times[len(times) // 2], 1000 * times[int(len(times) * 0.99)],
               1000 * times[-1]))

        problems = []
        for took, outcome, what, text in log:
            if outcome == "busy":
                print("busy after %.1f s: %s: %s" % (took, what, text))
            elif outcome in ("refused", "odd"):
                problems.append("%s: %s %s" % (what, outcome, text))
        if counts.get("busy", 0) > MAX_BUSY_SHARE * total:
            problems.append("%d of %d changes were refused as busy (more than %d%%)" %
                            (counts["busy"], total, MAX_BUSY_SHARE * 100))
        problems += changes.verify(host, items, baseline)
        exported = host.export()
        names = {g["name"] for s in exported.get("vswitches", []) for g in s.get("portgroups", [])}
        for item in items:
            if item.kind == "portgroup" and (item.state == changes.PRESENT) != (item.key in names):
                problems.append("ostrahost export disagrees about %r" % item)
        problems += changes.check_store(host.db)
    finally:
        host.close()

    return changes.report(problems)


if __name__ == "__main__":
    sys.exit(main())
