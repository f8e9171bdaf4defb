#!/usr/bin/env python3
"""Attacks on transactions, batches, host files and output, each of which once
broke a promise of ostracli or ostrahost.

  contention    commands that change two things at once, run by 8 processes
                together with a short lock timeout: every refused run changed
                nothing, so the host always holds the whole pair of values of
                one acknowledged run
  kills         ostrahost init, generate and import killed at random moments:
                the path holds a whole host or nothing, never half of one
  init race     two ostrahost init of one new path at once: exactly one wins,
                the other says the host exists
  copy          after changing commands, a copy of host.db alone holds them
  /dev/full     output that cannot be written is an error, not exit status 0;
                a batch whose output fails keeps nothing
  forged names  stored names cannot add lines or terminal escapes to output
  import limit  an endless or huge description is refused by its size, and no
                standard-library text reaches the user
  disk full     (root only) a batch on a nearly full tmpfs stops when its
                transaction is lost and keeps nothing
  growth        batch additions of port groups and DNS servers cost time in
                proportion to their number, not to its square

Usage: faults_test.py OSTRACLI OSTRAHOST [--seed N] [--rounds N] [--kills N]
"""
import argparse
import json
import os
import random
import shutil
import signal
import subprocess
import sys
import tempfile
import time

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
from changes import SKIPPED, report, require_sqlite, sqlite3  # noqa: E402


class Tools:
    def __init__(self, cli, host, tmp):
        self.cli, self.host, self.tmp = cli, host, tmp

    def fresh(self, name, profile="demo"):
        path = os.path.join(self.tmp, name)
        for suffix in ("", "-journal"):
            if os.path.exists(path + suffix):
                os.remove(path + suffix)
        subprocess.run([self.host, "init", path, "--profile", profile], check=True)
        return path

    def run(self, db, *args, stdin=None, env=None, stdout=subprocess.PIPE):
        full = dict(os.environ, **(env or {}))
        return subprocess.run([self.cli, "--host", db, *args], input=stdin, stdout=stdout,
                              stderr=subprocess.PIPE, env=full, timeout=120)

    def json(self, db, *args):
        result = self.run(db, "--formatter", "json", *args)
        assert result.returncode == 0, result.stderr
        return json.loads(result.stdout)


def sound(db):
    """Problems SQLite itself finds in the file, if any."""
    con = sqlite3.connect(db)
    try:
        check = [row[0] for row in con.execute("PRAGMA integrity_check")]
        return [] if check == ["ok"] else ["integrity_check of %s: %s" % (db, check[:5])]
    finally:
        con.close()


# --- contention ---------------------------------------------------------------

# (command, the two values of run i, how to read the pair back)
def interface_pair(tools, db):
    row = [x for x in tools.json(db, "network", "ip", "interface", "list") if x["Name"] == "tvk1"][0]
    return (row["Enabled"], row["MTU"])


def vswitch_pair(tools, db):
    row = [x for x in tools.json(db, "network", "vswitch", "standard", "list")
           if x["Name"] == "coreSwitch"][0]
    return (row["MTU"], row["CDP Status"])


CDP = ("down", "listen", "advertise", "both")
CONTENDED = [
    ("ip interface set",
     lambda i: (["network", "ip", "interface", "set", "-i", "tvk1", "--enabled",
                 "true" if i % 2 else "false", "--mtu", str(1280 + 2 * i)],
                (i % 2 == 1, 1280 + 2 * i)),
     interface_pair),
    ("vswitch standard set",
     lambda i: (["network", "vswitch", "standard", "set", "-v", "coreSwitch", "--mtu",
                 str(2000 + 8 * i), "--cdp-status", CDP[i % 4]], (2000 + 8 * i, CDP[i % 4])),
     vswitch_pair),
]


def contention(tools, rounds, rng):
    problems = []
    refused = acknowledged = 0
    for name, make, read in CONTENDED:
        db = tools.fresh("contention.db")
        for round_ in range(rounds):
            runs = [make(i + 8 * round_) for i in range(8)]
            rng.shuffle(runs)
            env = dict(os.environ, OSTRACLI_LOCK_TIMEOUT_MS=str(rng.choice((1, 10, 40))))
            procs = [subprocess.Popen([tools.cli, "--host", db, *args], stdout=subprocess.PIPE,
                                      stderr=subprocess.PIPE, env=env) for args, _ in runs]
            done = [(p.communicate(), p.returncode) for p in procs]
            ok = [pair for (args, pair), (_, status) in zip(runs, done) if status == 0]
            for (args, pair), ((_, err), status) in zip(runs, done):
                if status != 0 and b"is locked by another process" not in err:
                    problems.append("%s: refused for another reason: %r" % (name, err))
            refused += len(runs) - len(ok)
            acknowledged += len(ok)
            now = read(tools, db)
            if ok and now not in ok:
                problems.append("%s round %d: the host holds %s, which no acknowledged run set "
                                "(acknowledged: %s)" % (name, round_, now, ok))
        problems += sound(db)
    print("contention: %d runs of two-option commands, %d acknowledged, %d refused on the lock; "
          "every refusal changed nothing" % (refused + acknowledged, acknowledged, refused))
    return problems


# --- kills and races ------------------------------------------------------------

def host_is_whole_or_absent(tools, path, nics):
    """Problems with what a killed creation left at path."""
    if not os.path.exists(path):
        return []
    result = tools.run(path, "--formatter", "json", "network", "nic", "list")
    if result.returncode != 0:
        return ["a killed creation left an unusable file: %r" % result.stderr[:200]]
    if len(json.loads(result.stdout)) != nics:
        return ["a killed creation left a host with %d NICs" % len(json.loads(result.stdout))]
    return sound(path)


def kills(tools, count, rng):
    problems = []
    description = os.path.join(tools.tmp, "demo.json")
    with open(description, "wb") as out:
        subprocess.run([tools.host, "profile", "demo"], stdout=out, check=True)
    nics = len(json.load(open(description))["nics"])
    imported = tools.fresh("import.db", "empty")
    killed = 0
    for n in range(count):
        kind = ("init", "generate", "import")[n % 3]
        path = os.path.join(tools.tmp, "kill.db")
        if os.path.exists(path):
            os.remove(path)
        if kind == "init":
            args = [tools.host, "init", path]
        elif kind == "generate":
            args = [tools.host, "generate", path, "--routes", "20000", "--portgroups", "200",
                    "--vms", "10"]
        else:
            args = [tools.host, "import", description, "--host", imported]
        proc = subprocess.Popen(args, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        time.sleep(rng.uniform(0, 0.08))
        if proc.poll() is None:
            proc.send_signal(signal.SIGKILL)
            killed += 1
        proc.wait()
        if kind == "import":
            # The import replaces the host in one transaction: the old (empty)
            # host or the whole demo host.
            got = tools.json(imported, "network", "nic", "list")
            if len(got) not in (0, nics):
                problems.append("a killed import left %d NICs" % len(got))
        else:
            # A generated host is the demo host grown: the same NICs.
            problems += host_is_whole_or_absent(tools, path, nics)
    problems += sound(imported)
    print("kills: %d runs of init, generate and import, %d killed; every path held a whole "
          "host or none" % (count, killed))
    return problems


def init_race(tools, rounds):
    problems = []
    for n in range(rounds):
        path = os.path.join(tools.tmp, "race%d.db" % n)
        procs = [subprocess.Popen([tools.host, "init", path], stdout=subprocess.PIPE,
                                  stderr=subprocess.PIPE) for _ in range(2)]
        results = [(p.communicate()[1], p.returncode) for p in procs]
        winners = [r for r in results if r[1] == 0]
        losers = [r for r in results if r[1] != 0]
        if len(winners) != 1 or b"exists already" not in losers[0][0]:
            problems.append("init race %d: %s" % (n, results))
        problems += sound(path)
    print("init race: %d races of two inits; exactly one won each, the other said the host "
          "exists" % rounds)
    return problems


# --- files and output ---------------------------------------------------------

def copy_is_whole(tools):
    db = tools.fresh("copy.db")
    servers = ["10.77.0.%d" % i for i in (1, 2, 3)]
    for server in servers:
        tools.run(db, "network", "ip", "dns", "server", "add", "-s", server)
    copy = os.path.join(tools.tmp, "copy-of-host.db")
    shutil.copyfile(db, copy)
    listed = tools.run(copy, "network", "ip", "dns", "server", "list").stdout.decode()
    missing = [s for s in servers if s not in listed]
    print("copy: a copy of host.db alone after three additions holds %d of them" %
          (len(servers) - len(missing)))
    return ["the copy of host.db lacks %s" % missing] if missing else []


def full_output(tools):
    problems = []
    db = tools.fresh("full.db")
    with open("/dev/full", "wb") as full:
        for args in (["network", "nic", "list"], ["--batch", "-"]):
            result = subprocess.run([tools.cli, "--host", db, *args], stdout=full,
                                    stderr=subprocess.PIPE,
                                    input=b"network ip dns server add -s 10.66.0.1\n"
                                          b"network nic list\n")
            if result.returncode == 0 or b"cannot write the output" not in result.stderr:
                problems.append("ostracli %s > /dev/full: status %d, %r" %
                                (" ".join(args), result.returncode, result.stderr))
        result = subprocess.run([tools.host, "export", "--host", db], stdout=full,
                                stderr=subprocess.PIPE)
        if result.returncode == 0 or b"cannot write the output" not in result.stderr:
            problems.append("ostrahost export > /dev/full: status %d" % result.returncode)
    if "10.66.0.1" in tools.run(db, "network", "ip", "dns", "server", "list").stdout.decode():
        problems.append("a batch whose output failed kept its change")
    # A batch piped into a reader that goes away stops cleanly and keeps nothing.
    lines = b"".join(b"network ip dns server add -s 10.65.%d.%d\nnetwork nic list\n" %
                     (i // 250, i % 250 + 1) for i in range(2000))
    batch = os.path.join(tools.tmp, "pipe.txt")
    with open(batch, "wb") as out:
        out.write(lines)
    proc = subprocess.Popen([tools.cli, "--host", db, "--batch", batch], stdout=subprocess.PIPE,
                            stderr=subprocess.PIPE)
    proc.stdout.read(100)
    proc.stdout.close()
    err = proc.stderr.read()
    proc.wait()
    if proc.returncode <= 0 or b"no change of the batch was kept" not in err:
        problems.append("a batch piped into a closed reader: status %d, %r" %
                        (proc.returncode, err[-300:]))
    elif "10.65.0.1" in tools.run(db, "network", "ip", "dns", "server", "list").stdout.decode():
        problems.append("a batch piped into a closed reader kept its changes")
    print("/dev/full: single commands, batches and export fail with a message; a batch whose "
          "reader went away kept nothing")
    return problems


def forged_names(tools):
    problems = []
    db = tools.fresh("forged.db")
    name = "pg\n   Uplinks: vmnic9\x1b[2J"
    tools.run(db, "network", "vswitch", "standard", "portgroup", "add", "-v", "coreSwitch",
              "-p", name)
    for formatter in ("simple", "table"):
        out = tools.run(db, "--formatter", formatter, "network", "vswitch", "standard",
                        "portgroup", "list").stdout
        if b"\x1b" in out or b"\n   Uplinks: vmnic9" in out:
            problems.append("%s output carries the forged name raw" % formatter)
    out = tools.run(db, "--formatter", "keyvalue", "network", "vswitch", "standard",
                    "portgroup", "list").stdout.decode()
    if any(line.count("=") == 0 for line in out.splitlines()):
        problems.append("keyvalue output has a line without a value: forged line end")
    print("forged names: a port group named with a line break and an escape sequence shows "
          "escaped in simple, table and keyvalue")
    return problems


def import_limit(tools):
    problems = []
    db = tools.fresh("limit.db")
    for args, expect in ((["/dev/zero", "--max-size", "1M"], b"import limit"),
                         (["/dev/zero", "--max-size", "64K"], b"import limit"),
                         ([tools.tmp], b"Is a directory")):
        result = subprocess.run([tools.host, "import", *args, "--host", db],
                                capture_output=True, timeout=60)
        if result.returncode == 0 or expect not in result.stderr or \
                b"std::" in result.stderr or b"basic_filebuf" in result.stderr:
            problems.append("import %s: status %d, %r" % (args, result.returncode, result.stderr))
    result = subprocess.run([tools.host, "import", "-", "--host", db], capture_output=True,
                            input=b'{"nics": [{"name": "a", "name": "b", "mac": "00:50:56:00:00:01"}]}')
    if result.returncode == 0 or b'nics[0]: duplicate key "name"' not in result.stderr:
        problems.append("a duplicate key was not refused: %r" % result.stderr)
    print("import limit: /dev/zero, a directory and a duplicate key are refused with the "
          "tool's own words")
    return problems


# --- disk full and growth --------------------------------------------------------

def disk_full(tools):
    if os.geteuid() != 0 or shutil.which("mount") is None:
        print("disk full: SKIPPED (mounting a small tmpfs needs root)")
        return []
    mount = tempfile.mkdtemp(prefix="ostra-full-")
    if subprocess.run(["mount", "-t", "tmpfs", "-o", "size=4m", "tmpfs", mount]).returncode:
        print("disk full: SKIPPED (this machine refused to mount a tmpfs)")
        os.rmdir(mount)
        return []
    problems = []
    try:
        db = os.path.join(mount, "host.db")
        subprocess.run([tools.host, "init", db], check=True)
        # Leave about 1.9 MB free.
        stat = os.statvfs(mount)
        free = stat.f_bavail * stat.f_frsize
        with open(os.path.join(mount, "filler"), "wb") as filler:
            filler.write(b"\0" * max(0, free - 1900 * 1024))
        before = tools.json(db, "network", "vswitch", "standard", "portgroup", "list")
        # Long names, so that the batch needs more than the space left.
        lines = "".join("network vswitch standard portgroup add -v coreSwitch -p full-%05d-%s\n"
                        % (i, "x" * 100) for i in range(20000)).encode()
        result = tools.run(db, "--batch", "-", "--keep-going", stdin=lines,
                           stdout=subprocess.DEVNULL)
        after = tools.json(db, "network", "vswitch", "standard", "portgroup", "list")
        if result.returncode == 0:
            problems.append("the disk-full batch exited 0")
        if len(after) != len(before):
            problems.append("the disk-full batch kept %d port groups" % (len(after) - len(before)))
        if b"no change of the batch was kept" not in result.stderr:
            problems.append("the disk-full batch did not say that nothing was kept: %r" %
                            result.stderr[-300:])
        problems += sound(db)
        print("disk full: a 20,000-line batch on a nearly full 4 MB tmpfs: %s" %
              (result.stderr.decode().strip().splitlines() or ["(nothing on stderr)"])[-1])
    finally:
        subprocess.run(["umount", mount])
        os.rmdir(mount)
    return problems


def growth(tools):
    """Seconds per batch line at two sizes; a ratio near 1 is linear cost."""
    problems = []
    for name, line, small, large in (
            ("port group adds", "network vswitch standard portgroup add -v coreSwitch -p g%d",
             5000, 20000),
            ("DNS server adds", "network ip dns server add -s 10.%d.%d.%d", 1000, 4000)):
        per_line = []
        for count in (small, large):
            db = tools.fresh("growth.db")
            if "%d.%d.%d" in line:
                text = "".join(line % (100 + i // 65536, i // 256 % 256, i % 256) + "\n"
                               for i in range(count))
            else:
                text = "".join(line % i + "\n" for i in range(count))
            start = time.perf_counter()
            result = tools.run(db, "--batch", "-", stdin=text.encode(), stdout=subprocess.DEVNULL)
            per_line.append((time.perf_counter() - start) / count)
            if result.returncode != 0:
                problems.append("%s: the batch failed: %r" % (name, result.stderr[-200:]))
        ratio = per_line[1] / per_line[0]
        print("growth: %s: %.1f us per line at %d lines, %.1f us at %d (ratio %.2f)" %
              (name, per_line[0] * 1e6, small, per_line[1] * 1e6, large, ratio))
        # Quadratic cost would make the ratio about 4; allow noise on a busy machine.
        if ratio > 2.5:
            problems.append("%s cost grows with the table: ratio %.2f" % (name, ratio))
    return problems


def main():
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    parser.add_argument("ostracli")
    parser.add_argument("ostrahost")
    parser.add_argument("--seed", type=int, default=None)
    parser.add_argument("--rounds", type=int, default=12, help="contention rounds per command")
    parser.add_argument("--kills", type=int, default=60, help="killed creations")
    args = parser.parse_args()
    require_sqlite()
    seed = args.seed if args.seed is not None else random.randrange(1 << 31)
    print("seed %d (replay with --seed %d)" % (seed, seed))
    rng = random.Random(seed)
    tmp = tempfile.mkdtemp(prefix="ostra-faults-")
    tools = Tools(os.path.abspath(args.ostracli), os.path.abspath(args.ostrahost), tmp)
    try:
        problems = []
        problems += contention(tools, args.rounds, rng)
        problems += kills(tools, args.kills, rng)
        problems += init_race(tools, 20)
        problems += copy_is_whole(tools)
        problems += full_output(tools)
        problems += forged_names(tools)
        problems += import_limit(tools)
        problems += disk_full(tools)
        problems += growth(tools)
    finally:
        shutil.rmtree(tmp, ignore_errors=True)
    return report(problems)


if __name__ == "__main__":
    sys.exit(main())
