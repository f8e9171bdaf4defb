#!/usr/bin/env python3
"""Hosts of the previous store layout migrate on first open, whole or not at all.

layout2/hosts.tar.gz holds hosts written by the release before layout 3 (its
`ostrahost init` of the demo and empty profiles, a small `ostrahost generate`,
and an `ostrahost import` of every host description of tests/e2e/cases), each
with that release's `ostrahost export` of it. layout2/schema.sql is that
release's schema, the source the large hosts below are built from.

- Every release-written host opens in the current layout, passes SQLite's
  integrity and foreign key checks, and exports byte for byte what the old
  release exported.
- A large old-layout host (the demo's rows plus many routes, neighbours,
  hosts entries and port groups, built from schema.sql) migrates with every
  row, and its routes list as before.
- Migrations of that large host killed with SIGKILL at random moments leave a
  file that opens in the old or the new layout with every row; the next open
  completes the migration.

The seed is printed; --seed replays a run.

    migration_test.py OSTRACLI OSTRAHOST [--kills N] [--routes N] [--seed N]
"""
import argparse
import json
import os
import random
import shutil
import signal
import subprocess
import sys
import tarfile
import tempfile
import time

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
from changes import report, require_sqlite, sqlite3  # noqa: E402

HERE = os.path.dirname(os.path.abspath(__file__))
APPLICATION_ID = 0x4F535452


def layout(db):
    con = sqlite3.connect(db)
    try:
        return con.execute("PRAGMA user_version").fetchone()[0]
    finally:
        con.close()


def sound(db):
    """Problems SQLite finds in the file."""
    con = sqlite3.connect(db)
    try:
        problems = []
        check = [row[0] for row in con.execute("PRAGMA integrity_check")]
        if check != ["ok"]:
            problems.append("integrity_check of %s: %s" % (db, check[:5]))
        orphans = con.execute("PRAGMA foreign_key_check").fetchall()
        if orphans:
            problems.append("foreign_key_check of %s: %s" % (db, orphans[:5]))
        if con.execute("PRAGMA journal_mode").fetchone()[0] != "delete":
            problems.append("%s left the rollback journal" % db)
        return problems
    finally:
        con.close()


def run(argv, **kwargs):
    return subprocess.run(argv, stdout=subprocess.PIPE, stderr=subprocess.PIPE, timeout=600,
                          **kwargs)


def check_release_hosts(tools, tmp):
    """Release-written hosts export as the release exported them."""
    problems = []
    with tarfile.open(os.path.join(HERE, "layout2", "hosts.tar.gz")) as archive:
        archive.extractall(tmp)
    names = sorted(n[:-3] for n in os.listdir(tmp) if n.endswith(".db"))
    if len(names) < 20:
        problems.append("only %d release-written hosts were found" % len(names))
    for name in names:
        db = os.path.join(tmp, name + ".db")
        if layout(db) != 2:
            problems.append("%s is not a layout 2 host" % name)
            continue
        first = run([tools.ostrahost, "export", "--host", db])
        if first.returncode != 0:
            problems.append("export of %s failed: %s" % (name, first.stderr.decode()))
            continue
        with open(os.path.join(tmp, name + ".json"), "rb") as old:
            if first.stdout != old.read():
                problems.append("%s exports differently after its migration" % name)
        if layout(db) != 3:
            problems.append("%s was not migrated" % name)
        problems += sound(db)
        again = run([tools.ostrahost, "export", "--host", db])
        if again.stdout != first.stdout:
            problems.append("%s exports differently when opened again" % name)
    return problems


def build_large_host(tmp, demo, routes):
    """A layout 2 host: the demo's rows plus routes, neighbours, hosts entries
    and port groups, as the old release stored them (addresses as text)."""
    db = os.path.join(tmp, "large.db")
    con = sqlite3.connect(db)
    with open(os.path.join(HERE, "layout2", "schema.sql")) as schema:
        con.executescript(schema.read())
    con.execute("PRAGMA application_id=%d" % APPLICATION_ID)
    con.execute("PRAGMA user_version=2")
    con.execute("ATTACH ? AS demo", (demo,))
    tables = [row[0] for row in con.execute(
        "SELECT name FROM demo.sqlite_schema WHERE type = 'table' AND name NOT LIKE 'sqlite_%'")]
    con.execute("PRAGMA foreign_keys=OFF")
    with con:
        for table in tables:
            con.execute("INSERT INTO main.%s SELECT * FROM demo.%s" % (table, table))
        dotted = ("((n >> 24) & 255) || '.' || ((n >> 16) & 255) || '.' || ((n >> 8) & 255) "
                  "|| '.' || (n & 255)")
        con.execute(
            "WITH RECURSIVE i(k) AS (SELECT 0 UNION ALL SELECT k + 1 FROM i WHERE k + 1 < ?), "
            "a(k, n) AS (SELECT k, 0x0A800000 + k * 64 FROM i) "
            "INSERT INTO ipsvc_route(netstack, family, system, network, prefix, gateway, "
            "interface, source) SELECT 'defaultTcpipStack', 4, 0, " + dotted + ", 26, "
            "'10.20.0.' || (251 + k % 4), 'tvk0', 'user' FROM a", (routes,))
        con.execute(
            "WITH RECURSIVE i(k) AS (SELECT 0 UNION ALL SELECT k + 1 FROM i WHERE k + 1 < ?), "
            "a(k, n) AS (SELECT k, 0x0A200001 + k FROM i) "
            "INSERT INTO ipsvc_neighbor(family, interface, address, mac, expiry, type, state) "
            "SELECT 4, 'tvk0', " + dotted + ", printf('00:1c:74:%02x:%02x:%02x', "
            "(k >> 16) & 255, (k >> 8) & 255, k & 255), k % 1200, 1, 0 FROM a", (routes // 4,))
        con.execute(
            "WITH RECURSIVE i(k) AS (SELECT 0 UNION ALL SELECT k + 1 FROM i WHERE k + 1 < ?), "
            "a(k, n) AS (SELECT k, 0xAC100001 + k FROM i) "
            "INSERT INTO ipsvc_hosts(address, hostname, aliases, comment, system) "
            "SELECT " + dotted + ", printf('node%06d.lab.example', k), printf('node%06d', k), "
            "'', 0 FROM a", (routes // 4,))
        switch = con.execute("SELECT id FROM portset WHERE kind = 'standard' ORDER BY ord "
                             "LIMIT 1").fetchone()[0]
        con.execute(
            "WITH RECURSIVE i(k) AS (SELECT 0 UNION ALL SELECT k + 1 FROM i WHERE k + 1 < ?) "
            "INSERT INTO portgroup(name, portset_id, vlan_id, system, ord) "
            "SELECT printf('PG-%05d', k), ?, 100 + k % 3900, 0, 1000 + k FROM i",
            (routes // 20, switch))
        con.execute("INSERT INTO portgroup_policy(portgroup_id) SELECT id FROM portgroup "
                    "WHERE id NOT IN (SELECT portgroup_id FROM portgroup_policy)")
    con.execute("DETACH demo")
    con.close()
    return db


COUNTED = {
    # table of layout 2: the same rows in layout 3
    "ipsvc_route": "ipsvc_route",
    "ipsvc_neighbor": "ipsvc_neighbor",
    "ipsvc_hosts": "ipsvc_hosts",
    "portgroup": "portgroup",
    "portgroup_policy": "portgroup_policy",
    "port": "port",
    "tvknic": "tvknic",
    "pnic": "pnic",
    "fw_ruleset": "fw_ruleset",
}


def counts(db):
    con = sqlite3.connect(db)
    try:
        return {table: con.execute("SELECT count(*) FROM %s" % table).fetchone()[0]
                for table in COUNTED}
    finally:
        con.close()


def netmask(prefix):
    value = (0xFFFFFFFF << (32 - prefix)) & 0xFFFFFFFF
    return ".".join(str((value >> shift) & 255) for shift in (24, 16, 8, 0))


def route_listing(tools, db):
    listed = run([tools.ostracli, "--host", db, "--formatter", "json", "network", "ip", "route",
                  "ipv4", "list"])
    if listed.returncode != 0:
        raise RuntimeError(listed.stderr.decode())
    return json.loads(listed.stdout)


def check_large_host(tools, tmp, demo, routes):
    """Returns the problems, the old-layout file and the time one migration takes."""
    old = build_large_host(tmp, demo, routes)
    before = counts(old)
    db = os.path.join(tmp, "large-migrated.db")
    shutil.copy(old, db)
    start = time.monotonic()
    listing = route_listing(tools, db)
    took = time.monotonic() - start
    problems = []
    if layout(db) != 3:
        problems.append("the large host was not migrated")
    if counts(db) != before:
        problems.append("rows changed in the migration: %s, then %s" % (before, counts(db)))
    problems += sound(db)
    con = sqlite3.connect(old)
    stored = con.execute("SELECT network, prefix, gateway FROM ipsvc_route WHERE netstack = "
                         "'defaultTcpipStack' AND family = 4 AND system = 0 ORDER BY id").fetchall()
    con.close()
    listed = [(r["Network"], r["Netmask"], r["Gateway"]) for r in listing
              if r["Source"] != "connected"]
    expected = [("default" if prefix == 0 else network, netmask(prefix), gateway)
                for network, prefix, gateway in stored]
    if listed != expected:
        problems.append("the routes list differently after the migration: %d listed, %d stored"
                        % (len(listed), len(expected)))
    return problems, old, before, took


def check_kills(tools, tmp, old, before, took, kills, rng):
    """SIGKILL at random moments of a migration: old or new layout, every row."""
    problems = []
    outcomes = {2: 0, 3: 0}
    for n in range(kills):
        db = os.path.join(tmp, "kill%d.db" % n)
        shutil.copy(old, db)
        process = subprocess.Popen([tools.ostracli, "--host", db, "network", "nic", "list"],
                                   stdout=subprocess.DEVNULL, stderr=subprocess.PIPE)
        time.sleep(rng.uniform(0, took * 1.1))
        process.send_signal(signal.SIGKILL)
        process.wait()
        version = layout(db)  # opening rolls a hot journal back
        if version not in outcomes:
            problems.append("kill %d left layout %s" % (n, version))
            continue
        outcomes[version] += 1
        problems += sound(db)
        if counts(db) != before:
            problems.append("kill %d (layout %d) lost rows: %s, then %s" %
                            (n, version, before, counts(db)))
        again = run([tools.ostracli, "--host", db, "network", "nic", "list"])
        if again.returncode != 0 or layout(db) != 3 or counts(db) != before:
            problems.append("kill %d: the next open did not complete the migration: %s" %
                            (n, again.stderr.decode()))
        os.unlink(db)
    print("kills that left the old layout: %d, the new one: %d" % (outcomes[2], outcomes[3]))
    return problems


class Tools:
    def __init__(self, ostracli, ostrahost):
        self.ostracli = ostracli
        self.ostrahost = ostrahost


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("ostracli")
    parser.add_argument("ostrahost")
    parser.add_argument("--kills", type=int, default=10)
    parser.add_argument("--routes", type=int, default=200000)
    parser.add_argument("--seed", type=int, default=None)
    args = parser.parse_args()
    require_sqlite()
    seed = args.seed if args.seed is not None else random.randrange(1 << 30)
    print("seed %d" % seed)
    rng = random.Random(seed)
    tools = Tools(os.path.abspath(args.ostracli), os.path.abspath(args.ostrahost))
    with tempfile.TemporaryDirectory() as tmp:
        release = os.path.join(tmp, "release")
        os.mkdir(release)
        problems = check_release_hosts(tools, release)
        demo = os.path.join(tmp, "demo-layout2.db")
        with tarfile.open(os.path.join(HERE, "layout2", "hosts.tar.gz")) as archive:
            with archive.extractfile("demo.db") as source, open(demo, "wb") as target:
                shutil.copyfileobj(source, target)
        large, old, before, took = check_large_host(tools, tmp, demo, args.routes)
        problems += large
        print("migration of a host of %d routes: %.2f s" % (args.routes, took))
        problems += check_kills(tools, tmp, old, before, took, args.kills, rng)
    return report(problems)


if __name__ == "__main__":
    sys.exit(main())
