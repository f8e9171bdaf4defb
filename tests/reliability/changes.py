"""Changes to a host and their verification, shared by the reliability tests.

A change is the addition or removal of one item: a port group on a standard
switch, a DNS server, a hosts entry or an IPv4 route. Every item is named after
the worker that owns it and a serial number, so that concurrent workers never
touch each other's items and the final state can be checked item by item.

The expected state of an item is PRESENT (an acknowledged addition), ABSENT (an
acknowledged removal or a refused addition) or UNKNOWN (the process was killed
before it answered). Verification reads the host back through ostracli's JSON
listings, checks every item against its expected state and every attribute of
the items that are there (so that a half-applied item is caught), and checks the
store file itself with SQLite.
"""
import json
import os
import subprocess
import sys
import tempfile

try:
    import sqlite3
except ImportError:  # A Python built without it; see require_sqlite.
    sqlite3 = None

PRESENT, ABSENT, UNKNOWN = "present", "absent", "unknown"

# The message of a change refused because another process held the store
# longer than the busy timeout.
BUSY_TEXT = "is locked by another process; try again"

KINDS = ("portgroup", "dns", "hosts", "route")

# The exit status CTest takes for a skipped test (SKIP_RETURN_CODE).
SKIPPED = 77


def require_sqlite():
    """Exits as skipped when Python's sqlite3 module is missing."""
    if sqlite3 is None:
        print("SKIPPED: this Python has no sqlite3 module, which checks the store file")
        sys.exit(SKIPPED)


class Item:
    """One item a worker adds and may later remove."""

    def __init__(self, kind, worker, serial):
        self.kind = kind
        self.worker = worker
        self.serial = serial
        self.state = ABSENT
        w, n = worker, serial
        if kind == "portgroup":
            self.switch = "coreSwitch" if n % 2 == 0 else "storageSwitch"
            self.key = "rel%d-pg%d" % (w, n)
        elif kind == "dns":
            self.key = "10.%d.%d.%d" % (100 + w, n // 200, n % 200 + 1)
        elif kind == "hosts":
            self.ip = "10.%d.%d.%d" % (120 + w, n // 200, n % 200 + 1)
            self.hostname = "w%d-h%d.reliab.test" % (w, n)
            self.aliases = ["a%dx%d" % (w, n), "b%dx%d" % (w, n)]
            self.comment = "worker %d entry %d" % (w, n)
            self.key = (self.ip, self.hostname)
        elif kind == "route":
            # /28 networks, so that the netmask column is not a common default.
            self.network = "172.%d.%d.%d" % (16 + w, n // 16, (n % 16) * 16)
            # Gateways on both connected subnets of the demo host, so that the
            # interface column varies with the gateway.
            if n % 2 == 0:
                self.gateway, self.interface = "10.20.0.%d" % (10 + w), "tvk0"
            else:
                self.gateway, self.interface = "10.83.189.%d" % (10 + w), "tvk2"
            self.key = self.network
        else:
            raise ValueError(kind)

    def __repr__(self):
        return "%s %s" % (self.kind, self.key)

    def add_args(self):
        if self.kind == "portgroup":
            return ["network", "vswitch", "standard", "portgroup", "add",
                    "--portgroup-name", self.key, "--vswitch-name", self.switch]
        if self.kind == "dns":
            return ["network", "ip", "dns", "server", "add", "--server", self.key]
        if self.kind == "hosts":
            return ["network", "ip", "hosts", "add", "--ip", self.ip, "--hostname", self.hostname,
                    "--alias", self.aliases[0], "--alias", self.aliases[1],
                    "--comment", self.comment]
        return ["network", "ip", "route", "ipv4", "add", "--network", self.network + "/28",
                "--gateway", self.gateway]

    def remove_args(self):
        if self.kind == "portgroup":
            return ["network", "vswitch", "standard", "portgroup", "remove",
                    "--portgroup-name", self.key, "--vswitch-name", self.switch]
        if self.kind == "dns":
            return ["network", "ip", "dns", "server", "remove", "--server", self.key]
        if self.kind == "hosts":
            return ["network", "ip", "hosts", "remove", "--ip", self.ip,
                    "--hostname", self.hostname]
        return ["network", "ip", "route", "ipv4", "remove", "--network", self.network + "/28",
                "--gateway", self.gateway]

    def expected_row(self):
        """The item as its listing shows it."""
        if self.kind == "portgroup":
            return {"Name": self.key, "Virtual Switch": self.switch, "Active Clients": 0,
                    "VLAN ID": 0}
        if self.kind == "dns":
            return self.key
        if self.kind == "hosts":
            return {"IP address": self.ip, "HostName": self.hostname, "Aliases": self.aliases,
                    "Comment": self.comment}
        return {"Network": self.network, "Netmask": "255.255.255.240", "Gateway": self.gateway,
                "Interface": self.interface, "Source": "user"}


def row_key(kind, row):
    """The key of a listed row, comparable with Item.key."""
    if kind == "portgroup":
        return row["Name"]
    if kind == "dns":
        return row
    if kind == "hosts":
        return (row["IP address"], row["HostName"])
    return row["Network"]


class Host:
    """A scratch host made from the demo profile, and the tools that work on it."""

    def __init__(self, ostracli, ostrahost, busy_timeout_ms=None):
        self.tmp = tempfile.TemporaryDirectory(prefix="ostra-reliability-")
        self.db = os.path.join(self.tmp.name, "host.db")
        self.ostracli = ostracli
        self.ostrahost = ostrahost
        self.env = dict(os.environ, OSTRACLI_HOST=self.db)
        if busy_timeout_ms is not None:
            self.env["OSTRACLI_BUSY_TIMEOUT_MS"] = str(busy_timeout_ms)
        subprocess.run([ostrahost, "init", self.db, "--profile", "demo"], check=True,
                       env=self.env)

    def close(self):
        self.tmp.cleanup()

    def run(self, args, **kw):
        return subprocess.run([self.ostracli] + args, capture_output=True, text=True,
                              env=self.env, **kw)

    def listing(self, args):
        result = self.run(["--formatter", "json"] + args)
        if result.returncode != 0:
            raise AssertionError("%s failed (%d): %s" %
                                 (" ".join(args), result.returncode, result.stderr.strip()))
        return json.loads(result.stdout)

    def snapshot(self):
        """Every listed row of the four kinds, keyed by kind and then by item key."""
        rows = {
            "portgroup": self.listing(["network", "vswitch", "standard", "portgroup", "list"]),
            "dns": self.listing(["network", "ip", "dns", "server", "list"])["DNS Servers"],
            "hosts": self.listing(["network", "ip", "hosts", "list"]),
            "route": [r for r in self.listing(["network", "ip", "route", "ipv4", "list"])
                      if r["Source"] != "connected"],
        }
        snap = {}
        for kind, listed in rows.items():
            snap[kind] = {}
            for row in listed:
                key = row_key(kind, row)
                if key in snap[kind]:
                    raise AssertionError("%s %s is listed twice" % (kind, key))
                snap[kind][key] = row
        return snap

    def export(self):
        result = subprocess.run([self.ostrahost, "export"], capture_output=True, text=True,
                                env=self.env)
        if result.returncode != 0:
            raise AssertionError("ostrahost export failed: " + result.stderr.strip())
        return json.loads(result.stdout)


def verify(host, items, baseline):
    """Checks the host against the expected state of \\p items; returns a list of
    problems (empty when all is well). \\p baseline is a snapshot taken before
    the first change: rows that are none of the items must be unchanged."""
    problems = []
    snap = host.snapshot()
    ours = {kind: {} for kind in KINDS}
    for item in items:
        ours[item.kind][item.key] = item
    for kind in KINDS:
        for key, row in snap[kind].items():
            item = ours[kind].get(key)
            if item is None:
                if baseline[kind].get(key) != row:
                    problems.append("%s %s appeared or changed: %s" % (kind, key, row))
                continue
            if item.state == ABSENT:
                problems.append("%r is there although its addition was refused or its "
                                "removal acknowledged: %s" % (item, row))
            elif row != item.expected_row():
                problems.append("%r is half there: listed %s, expected %s" %
                                (item, row, item.expected_row()))
        for key, row in baseline[kind].items():
            if key not in snap[kind]:
                problems.append("%s %s of the demo host is gone" % (kind, key))
        for key, item in ours[kind].items():
            if item.state == PRESENT and key not in snap[kind]:
                problems.append("%r was acknowledged but is lost" % item)
        # A worker adds its items one after another, each at the end of its
        # list (of its switch, for port groups): they are listed in that order.
        listed = {}
        for key in snap[kind]:
            item = ours[kind].get(key)
            if item is not None:
                group = (item.worker, getattr(item, "switch", None))
                listed.setdefault(group, []).append(item.serial)
        for (worker, _), serials in listed.items():
            if serials != sorted(serials):
                problems.append("the %s items of worker %d are listed out of order: %s" %
                                (kind, worker, serials))
    return problems


def false_null_report(db, line):
    """True when \\p line is integrity_check's "NULL value in T.C" and column C of
    table T holds no NULL. SQLite 3.40.1 (Debian 12) reports such NULLs for a
    NOT NULL column that comes before a primary key column of a WITHOUT ROWID
    table (ipsvc_dns_server.ord, ipsvc_dns_search.ord) even when every row has a
    value, on a freshly made host too."""
    prefix = "NULL value in "
    if not line.startswith(prefix) or line.count(".") != 1:
        return False
    table, column = line[len(prefix):].split(".")
    try:
        nulls = db.execute('SELECT count(*) FROM "%s" WHERE "%s" IS NULL' %
                           (table, column)).fetchone()[0]
    except sqlite3.Error:
        return False
    return nulls == 0


def check_store(path):
    """SQLite's own checks of the store file, and the rows that belong together;
    returns a list of problems."""
    problems = []
    db = sqlite3.connect(path)
    try:
        result = [row[0] for row in db.execute("PRAGMA integrity_check")]
        result = [line for line in result if not false_null_report(db, line)]
        if result != ["ok"] and result:
            problems.append("integrity_check: " + "; ".join(result[:10]))
        orphans = db.execute("PRAGMA foreign_key_check").fetchall()
        if orphans:
            problems.append("foreign_key_check: %d rows, first %s" % (len(orphans), orphans[:5]))
        # A port group and its policy row are made and removed together.
        lonely = db.execute(
            "SELECT g.name FROM portgroup g LEFT JOIN portgroup_policy p "
            "ON p.portgroup_id = g.id WHERE p.portgroup_id IS NULL").fetchall()
        if lonely:
            problems.append("port groups without their policy row: %s" % lonely[:10])
        mode = db.execute("PRAGMA journal_mode").fetchone()[0]
        if mode != "delete":
            problems.append("journal mode is %s, not delete" % mode)
    finally:
        db.close()
    return problems


def report(problems):
    """Prints each problem and the one-line summary; returns the exit status."""
    for problem in problems:
        print("FAIL: " + problem)
    print("%d passed, %d failed" % (0 if problems else 1, 1 if problems else 0))
    return 1 if problems else 0
