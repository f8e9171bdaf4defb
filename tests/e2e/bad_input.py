#!/usr/bin/env python3
"""Bad input to every parameter of every command of the network namespace.

The commands and their parameters come from the live tree (ostracli --reference
for the paths, the JSON help for each command's parameters, types and
constraints). Each command gets a base invocation with valid arguments: its
required parameters, plus the few optional ones its meaning needs (BASE), with
values that exist on the demo host (GOOD). Then each parameter in turn is given
as:

    missing     the option last, with no value
    type        text for an integer, "maybe" for a boolean, a value for a flag
    outside     just outside its range, enumeration or pattern; -1 for an
                integer without a constraint; a malformed address, network or
                key for the text parameters of OUTSIDE_TEXT
    overflow    2^63, one past the largest 64-bit integer
    empty       the empty string ("--flag=" for a flag)
    4k          4096 bytes, the longest value the command host passes on, for
                a text parameter without a constraint
    long        1 MiB of text (through "--batch -": a single argument string
                of that size exceeds the kernel's limit and execve fails with
                E2BIG)
    utf8        bytes that are not UTF-8

Every run must end in a refusal by the command host (status 2, a message
starting "Error: " and naming the option) or the command's own error (status
1, a message that is neither an internal error nor the store's), with a
short, valid UTF-8 message, nothing on stdout (but for PRINTS_ON_ERROR) and no
signal, within the time limit. The host must not change: its export is compared before and
after the bad runs of each command. Finally the base invocation itself must
succeed on that host, which shows that the refusals came from the bad
parameter. ACCEPTED lists the bad-looking values that a command is meant to
take, each with its reason; they run on a host of their own and must succeed.

    bad_input.py OSTRACLI OSTRAHOST [--jobs N] [--verbose] [FILTER...]

FILTER words select commands whose path contains one of them.
"""
import argparse
import concurrent.futures
import errno
import itertools
import json
import re
import os
import shutil
import subprocess
import sys
import tempfile
import time

TIMEOUT = 20
CASES = ("missing", "type", "outside", "overflow", "empty", "4k", "long", "utf8")
OUTCOMES = ("refused", "error", "accepted", "fault")
# Cases whose values the command host refuses before any command code runs,
# whatever the parameter.
HOST_CASES = ("missing", "type", "overflow", "long", "utf8")
MIB = 1 << 20
# The longest option value the command host passes on.
HOST_LIMIT = 4096
# The longest message expected; a message may quote a 4 KiB value twice.
MAX_MESSAGE = 2 * HOST_LIMIT + 1024

# Values that exist on the demo host, by parameter name.
GOOD = {
    "nic-name": "vmnic0",
    "vmnic": "vmnic0",
    "trunk": "vmnic1",
    "branch": "vmnic2",
    "uplink-name": "vmnic1",
    "vswitch-name": "coreSwitch",
    "portgroup-name": "VM Traffic",
    "interface-name": "tvk1",
    "netstack": "defaultTcpipStack",
    "ruleset-id": "shellAccess",
    "ip-address": "10.20.30.40",
    "dvs": "dvs-west",
    "krx": "dvs-west",
    "krx-name": "dvs-west",
    "lag-id": "1",
    "portid": "33554443",
    "world-id": "2100401",
    "lcore-id": "1",
    "vf-id": "1",
    "type": "system",
}

# Per command: the parameters of its base invocation, where the required ones
# alone are not a meaningful command or their generic values do not fit.
BASE = {
    "network ip neighbor remove": {"version": "4", "neighbor-addr": "10.20.0.254"},
    "network ip dns server add": {"server": "10.20.0.54"},
    "network ip dns server remove": {"server": "10.20.0.53"},
    "network ip dns search add": {"domain": "corp.example"},
    "network ip dns search remove": {"domain": "example"},
    "network ip route ipv4 add": {"network": "172.31.0.0/16", "gateway": "10.20.0.254"},
    "network ip route ipv4 remove": {"network": "192.168.100.0/24", "gateway": "10.20.0.254"},
    "network ip route ipv6 add": {"network": "2001:db8:aa::/48", "gateway": "2001:db8:20::fe"},
    "network ip route ipv6 remove": {"network": "2001:db8:99::/48",
                                     "gateway": "2001:db8:20::fe"},
    "network ip ipsec sa add": {
        "sa-name": "sa-web", "sa-source": "2001:db8:20::5", "sa-destination": "2001:db8:20::50",
        "sa-spi": "1f4", "encryption-algorithm": "3des-cbc",
        "encryption-key": "0123456789abcdef01234567", "integrity-algorithm": "hmac-sha1",
        "integrity-key": "0123456789abcdef0123"},
    "network ip ipsec sa remove": {"sa-name": "sa-store"},
    "network ip ipsec sp add": {"sp-name": "sp-plain", "sp-source": "any", "sp-destination": "any",
                                "source-port": "0", "destination-port": "0", "action": "ipsec",
                                "sa-name": "sa-store"},
    "network ip ipsec sp remove": {"sp-name": "sp-store"},
    "network ip interface add": {"portgroup-name": "VM Traffic", "interface-name": "tvk20"},
    "network ip interface remove": {"interface-name": "tvk1"},
    "network ip interface set": {"enabled": "true"},
    "network ip interface ipv4 set": {"type": "static", "ipv4": "10.30.0.22",
                                      "netmask": "255.255.255.0"},
    "network ip interface ipv6 address add": {"ipv6": "2001:db8:30::21/64"},
    "network ip interface ipv6 address remove": {"interface-name": "tvk0",
                                                 "ipv6": "2001:db8:20::21/64"},
    "network ip interface tag add": {"interface-name": "tvk0", "tagname": "TimeSync"},
    "network ip interface tag remove": {"interface-name": "tvk0", "tagname": "HostConsole"},
    "network ip netstack add": {"netstack": "twinRun"},
    "network ip netstack remove": {"netstack": "AmbrelProvisioning"},
    "network ip netstack set": {"netstack": "driftway"},
    "network ip hosts add": {"ip": "10.20.0.42", "hostname": "store02.lab.example"},
    "network ip hosts remove": {"ip": "10.20.0.40", "hostname": "store01.lab.example"},
    "network nic set": {"message-level": "3"},
    "network nic ring current set": {"rx": "1024", "tx": "1024"},
    "network nic eeprom change": {"vmnic": "vmnic5", "magic": "1261646896", "offset": "16",
                                  "value": "3735928559"},
    "network nic queue loadbalancer plugin set": {"enable": "true", "module": "nqcore",
                                                  "plugin": "default"},
    "network nic queue count set": {"vmnic": "vmnic2", "num": "4", "tx": "true"},
    "network nic cso set": {"enable": "0"},
    "network nic tso set": {"enable": "0"},
    "network nic sg set": {"enable": "1"},
    "network nic attachment add": {"vlan-id": "20"},
    "network nic attachment remove": {"trunk": "vmnic1", "branch": "vmnic2"},
    "network vswitch standard add": {"vswitch-name": "labSwitch"},
    "network vswitch standard remove": {"vswitch-name": "labSwitch"},
    "network vswitch standard uplink remove": {"uplink-name": "vmnic1"},
    "network vswitch standard portgroup add": {"portgroup-name": "Backup"},
    "network vswitch standard portgroup remove": {"portgroup-name": "Storage B",
                                                  "vswitch-name": "storageSwitch"},
    "network vswitch standard portgroup set": {"vlan-id": "10"},
    "network vswitch dvs corvex lacp timeout set": {"timeout": "true"},
    "network firewall set": {"enabled": "true"},
    "network firewall ruleset set": {"enabled": "true"},
    "network firewall ruleset allowedip add": {"ip-address": "10.20.30.40"},
    "network firewall ruleset allowedip remove": {"ip-address": "192.168.40.7"},
    "network ens maxLcores set": {"maxlcores": "3"},
    "network ens lcore add": {"lcore-id": "2"},
    "network ens lcore switch add": {"switch": "coreSwitch"},
    "network ens lcore switch remove": {"lcore-id": "0"},
    "network ens lcore affinity set": {"affinity": "1"},
}

# Commands whose base invocation needs the host prepared first (one command
# line each, run before the host is exported).
SETUP = {
    "network vswitch standard uplink add": [
        ["network", "vswitch", "standard", "uplink", "remove", "-v", "coreSwitch", "-u",
         "vmnic1"]],
    "network vswitch standard remove": [
        ["network", "vswitch", "standard", "add", "-v", "labSwitch"]],
    "network nic attachment remove": [
        ["network", "nic", "attachment", "add", "-t", "vmnic1", "-b", "vmnic2", "-v", "20"]],
    "network firewall ruleset client remove": [
        ["network", "firewall", "ruleset", "client", "add", "-r", "shellAccess"]],
}

# Values just outside a pattern, by pattern.
OUTSIDE_PATTERN = {
    "tvk([0-9]|[1-9][0-9]|1[0-9][0-9]|2[0-4][0-9]|25[0-5])": "tvk256",
    "[pumbagsd]+": "pumbagsdx",
}

# Values just outside the form of a text parameter that has no constraint the
# command host checks (addresses, networks, keys), by name; OUTSIDE_TEXT_AT
# overrides by command where one name takes different forms.
OUTSIDE_TEXT = {
    "server": "10.20.0.256",
    "neighbor-addr": "10.20.0.256",
    "ip": "10.20.0.256",
    "ipv4": "10.30.0.256",
    "netmask": "255.0.255.0",
    "gateway": "10.20.0.256",
    "network": "172.31.0.0/33",
    "ip-address": "10.20.30.40/33",
    "mac-address": "0c:42:a1:5e:10:8g",
    "ipv6": "2001:db8:30::21/129",
    "sa-source": "2001:db8:20::5::1",
    "sa-destination": "2001:db8:20::5::1",
    "sp-source": "2001:db8:20::/129",
    "sp-destination": "2001:db8:20::/129",
    "sa-spi": "1g4",
    "encryption-key": "0123456789abcdef0123456",
    "integrity-key": "0123456789abcdef012",
    "domain": "corp..example",
    "hostname": "store 02",
    "alias": "store 02",
    "tagname": "NoSuchTag",
    "active-uplinks": "vmnic0,vmnic9",
    "standby-uplinks": "vmnic0,vmnic9",
}
OUTSIDE_TEXT_AT = {
    ("network ip route ipv6 add", "network"): "2001:db8:aa::/129",
    ("network ip route ipv6 remove", "network"): "2001:db8:99::/129",
    ("network ip route ipv6 add", "gateway"): "2001:db8:20::fe::1",
    ("network ip route ipv6 remove", "gateway"): "2001:db8:20::fe::1",
    ("network ip interface ipv6 set", "gateway"): "2001:db8:30::1::1",
    ("network ip netstack add", "netstack"): "twin/run",
}

# (command, parameter, case) -> why the command takes that value and succeeds.
ACCEPTED = {
    ("network ip neighbor list", "interface-name", "empty"): "an empty name means all interfaces",
    ("network ip neighbor remove", "interface-name", "empty"):
        "an empty name means all interfaces",
    ("network ip interface ipv4 get", "interface-name", "empty"): "empty reads as absent: all",
    ("network ip interface ipv4 address list", "interface-name", "empty"):
        "empty reads as absent: all interfaces",
    ("network ip interface ipv6 get", "interface-name", "empty"): "empty reads as absent: all",
    ("network ip interface remove", "netstack", "empty"): "removal by name ignores the netstack",
    ("network ip interface remove", "netstack", "4k"): "removal by name ignores the netstack",
    ("network ip interface list", "netstack", "4k"): "an unknown netstack lists nothing",
    ("network ip interface ipv4 get", "netstack", "4k"): "an unknown netstack lists nothing",
    ("network ip interface ipv4 address list", "netstack", "4k"):
        "an unknown netstack lists nothing",
    ("network ip interface ipv6 get", "netstack", "4k"): "an unknown netstack lists nothing",
    ("network ip hosts add", "comment", "4k"): "a comment is free text of any length",
    ("network nic set", "virtual-address", "4k"): "the virtual address is free text for the driver",
    ("network ip ipsec sp add", "sa-name", "empty"): "no SA name lets the host choose the SA",
    ("network ip netstack set", "name", "empty"): "an empty name leaves the name untouched",
    ("network ip hosts add", "comment", "empty"): "an entry may have no comment",
    ("network nic set", "phy-address", "outside"): "-1 leaves the PHY address as it is",
    ("network nic set", "virtual-address", "empty"):
        "the demo NIC has no virtual address: no change",
    ("network vswitch standard policy failover set", "active-uplinks", "empty"):
        "an empty list leaves no active uplink",
    ("network vswitch standard policy failover set", "standby-uplinks", "empty"):
        "an empty list leaves no standby uplink",
    ("network vswitch standard portgroup policy failover set", "active-uplinks", "empty"):
        "an empty list leaves no active uplink",
    ("network vswitch standard portgroup policy failover set", "standby-uplinks", "empty"):
        "an empty list leaves no standby uplink",
    ("network vswitch dvs corvex list", "krx-name", "empty"): "empty reads as absent: all",
    ("network vswitch dvs corvex lacp timeout set", "nic-name", "empty"):
        "an empty NIC name means every NIC of the LAG",
}
# Commands that report a bad value and still set their result, which the
# command host prints with status 1.
PRINTS_ON_ERROR = {
    "network vswitch standard policy failover set":
        "an unknown uplink is reported, the policy left as it was, and the result is true",
    "network vswitch standard portgroup policy failover set":
        "an unknown uplink is reported, the policy left as it was, and the result is true",
}

# An empty netstack means the default instance for every IP command but
# interface add, which looks the key up as given.
for _path in ("network ip neighbor list", "network ip neighbor remove",
              "network ip connection list", "network ip dns server list",
              "network ip dns server add", "network ip dns server remove",
              "network ip dns search add", "network ip dns search remove",
              "network ip dns search list", "network ip route ipv4 add",
              "network ip route ipv4 remove", "network ip route ipv4 list",
              "network ip route ipv6 add", "network ip route ipv6 remove",
              "network ip route ipv6 list", "network ip interface list",
              "network ip interface ipv4 get", "network ip interface ipv4 address list",
              "network ip interface ipv6 get"):
    ACCEPTED[(_path, "netstack", "empty")] = "an empty netstack means the default instance"


def parse_args():
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    parser.add_argument("ostracli")
    parser.add_argument("ostrahost")
    parser.add_argument("--jobs", type=int, default=min(4, (os.cpu_count() or 2) + 1))
    parser.add_argument("--host-cases-once", action="store_true",
                        help="run the cases that only the command host's parsing sees "
                             f"({', '.join(HOST_CASES)}) for one parameter of each kind, "
                             "not for every parameter (for slow sanitizer builds)")
    parser.add_argument("--verbose", action="store_true",
                        help="print every run's status and message")
    parser.add_argument("filters", nargs="*")
    return parser.parse_intermixed_args()


class Tools:
    """The two executables and the pristine demo host."""

    def __init__(self, cli, host_tool, tmp):
        self.cli = cli
        self.host_tool = host_tool
        self.tmp = tmp
        self.demo = os.path.join(tmp, "demo.db")
        subprocess.run([host_tool, "init", self.demo, "--profile", "demo"], check=True,
                       stdout=subprocess.DEVNULL)
        self.ids = itertools.count()
        self.demo_export = self.export(self.demo)

    def fresh_host(self, tag):
        """A copy of the demo host: the file and its write-ahead log, which holds
        changes not yet folded into the file."""
        path = os.path.join(self.tmp, f"{tag}-{next(self.ids)}.db")
        shutil.copyfile(self.demo, path)
        if os.path.exists(self.demo + "-wal"):
            shutil.copyfile(self.demo + "-wal", path + "-wal")
        return path

    def export(self, db):
        done = subprocess.run([self.host_tool, "export", "--host", db], capture_output=True,
                              timeout=TIMEOUT)
        if done.returncode:
            raise RuntimeError(f"ostrahost export failed: {done.stderr.decode(errors='replace')}")
        return done.stdout

    def run(self, db, args, stdin=None):
        """Runs ostracli on db; returns (status, stdout, stderr), status None on a timeout."""
        try:
            done = subprocess.run([self.cli, "--host", db] + args, capture_output=True,
                                  input=stdin, stdin=None if stdin is not None else
                                  subprocess.DEVNULL, timeout=TIMEOUT)
        except subprocess.TimeoutExpired as expired:
            return None, expired.stdout or b"", expired.stderr or b""
        return done.returncode, done.stdout, done.stderr


def list_commands(tools, filters, jobs):
    reference = subprocess.run([tools.cli, "--reference"], capture_output=True, check=True,
                               text=True).stdout
    paths = [line[4:] for line in reference.splitlines() if line.startswith("### ")]
    paths = [p for p in paths if not filters or any(f in p for f in filters)]

    def help_of(path):
        done = subprocess.run([tools.cli, "--formatter", "json"] + path.split() + ["--help"],
                              capture_output=True, check=True)
        return json.loads(done.stdout)

    with concurrent.futures.ThreadPoolExecutor(jobs) as pool:
        return list(pool.map(help_of, paths))


def good_value(path, parameter):
    name = parameter["name"]
    if name in BASE.get(path, {}):
        return BASE[path][name]
    if name in GOOD:
        return GOOD[name]
    constraint = parameter.get("constraint")
    if constraint and constraint["type"] in (2, 3):
        return constraint["values"][0]["value"]
    if constraint and constraint["type"] == 1:
        return str(constraint["min"])
    return {"long": "1", "bool": "true"}.get(parameter["type"])


def option_args(parameter, value):
    if parameter["type"] == "flag":
        return ["--" + parameter["name"]]
    return ["--" + parameter["name"], value]


def base_args(command):
    """The base invocation: required parameters and BASE's, in help order."""
    path = command["path"]
    wanted = BASE.get(path, {})
    args = path.split()
    for parameter in command["parameters"]:
        if parameter["required"] or parameter["name"] in wanted:
            value = good_value(path, parameter)
            if value is None:
                raise KeyError(f"{path}: no good value for --{parameter['name']}")
            args += option_args(parameter, value)
    return args


def without(args, parameter):
    """args without the option of parameter (and its value)."""
    out = []
    skip = False
    for arg in args:
        if skip:
            skip = False
            continue
        if arg == "--" + parameter["name"]:
            skip = parameter["type"] != "flag"
            continue
        out.append(arg)
    return out


def bad_values(command, parameter):
    """(case, value) pairs for parameter; value None means "option last, no value"."""
    kind = parameter["type"]
    constraint = parameter.get("constraint")
    good = good_value(command["path"], parameter) or "x"
    if kind == "flag":
        return [("type", "=maybe"), ("empty", "=")]
    values = [("missing", None)]
    if kind == "long":
        values.append(("type", "twelve"))
    elif kind == "bool":
        values.append(("type", "maybe"))
    if constraint is None and kind == "long":
        values += [("outside", "-1"), ("overflow", str(1 << 63))]
    elif constraint and constraint["type"] == 1:
        values += [("outside", str(constraint["min"] - 1)), ("outside", str(constraint["max"] + 1))]
    elif constraint and constraint["type"] == 2:
        numbers = [int(v["value"]) for v in constraint["values"]]
        values.append(("outside", str(max(numbers) + 1)))
    elif constraint and constraint["type"] == 3:
        values.append(("outside", constraint["values"][-1]["value"] + "x"))
    elif kind in ("string", "string list") and constraint is None:
        outside = OUTSIDE_TEXT_AT.get((command["path"], parameter["name"]),
                                      OUTSIDE_TEXT.get(parameter["name"]))
        if outside is not None:
            values.append(("outside", outside))
    elif constraint and constraint["type"] == 4:
        if constraint["pattern"] not in OUTSIDE_PATTERN:
            raise KeyError(f"{command['path']} --{parameter['name']}: no value outside "
                           f"the pattern {constraint['pattern']}")
        values.append(("outside", OUTSIDE_PATTERN[constraint["pattern"]]))
    values.append(("empty", ""))
    if kind in ("string", "string list") and constraint is None:
        values.append(("4k", "x" * HOST_LIMIT))
    values.append(("long", "x" * MIB))
    values.append(("utf8", good.encode() + b"\xff\xfe"))
    return values


def batch_line(args):
    """One line of a batch file holding args (quoted with single quotes)."""
    return " ".join("'" + a + "'" for a in args).encode() + b"\n"


def argv_refuses_mib(tools, db):
    """Whether a 1 MiB argument string makes execve fail with E2BIG."""
    try:
        subprocess.run([tools.cli, "--host", db, "network", "nic", "get", "-n", "x" * MIB],
                       capture_output=True, timeout=TIMEOUT)
    except OSError as error:
        return error.errno == errno.E2BIG
    return False


def check_run(path, parameter, status, out, err, batch):
    """The fault of one bad run, or None."""
    if status is None:
        return "timed out"
    if status < 0:
        return f"killed by signal {-status}"
    if status == 0:
        return "exit status 0"
    if status not in (1, 2):
        return f"exit status {status}"
    if out and not (status == 1 and path in PRINTS_ON_ERROR):
        return "printed on stdout: " + out[:120].decode(errors="replace")
    try:
        text = err.decode()
    except UnicodeDecodeError:
        return "message is not UTF-8: " + repr(err[:120])
    if batch:
        # A batch names the line of each message and ends with its summary.
        text = "\n".join(re.sub(r"^ostracli: -:\d+: ", "", line) for line in text.splitlines()
                         if not re.match(r"ostracli: -: \d+ lines? applied", line))
    if not text.strip():
        return "no message"
    if len(text) > MAX_MESSAGE:
        return f"message of {len(text)} bytes"
    if "Sanitizer" in text or "runtime error:" in text:
        return "sanitizer report: " + text.strip()[:400]
    if any(word in text for word in ("Internal error", "Traceback", "SQL", "sqlite")):
        # An escaped exception or the store's own words, not the command's.
        return "message: " + text.strip()[:200]
    if status == 2:
        name = parameter["name"]
        if not text.startswith("Error: ") or ("--" + name) not in text:
            return "refusal that does not name --" + name + ": " + text.strip()[:200]
    return None


def one_of_each_kind(commands):
    """(command, parameter) pairs: the first parameter of each type and constraint kind."""
    chosen = {}
    for command in commands:
        for parameter in command["parameters"]:
            kind = (parameter["type"], (parameter.get("constraint") or {}).get("type"))
            chosen.setdefault(kind, (command["path"], parameter["name"]))
    return set(chosen.values())


def run_command(tools, command, mib_through_batch, host_cases_for):
    """All bad runs of one command; returns (counts, faults, messages)."""
    path = command["path"]
    try:
        base = base_args(command)
        for parameter in command["parameters"]:
            bad_values(command, parameter)
    except KeyError as missing:
        # A command or pattern the tables do not know yet.
        return {}, [str(missing.args[0])], []
    db = tools.fresh_host("cmd")
    # counts[case][outcome], outcome one of OUTCOMES.
    counts = {}

    def count(case, outcome):
        counts.setdefault(case, dict.fromkeys(OUTCOMES, 0))[outcome] += 1

    faults = []
    messages = []
    for setup in SETUP.get(path, []):
        status, _, err = tools.run(db, setup)
        if status != 0:
            faults.append(f"{path}: setup {' '.join(setup)} failed: {err.decode()[:200]}")
    # A fresh copy is the demo host, whose export is known.
    before = tools.export(db) if path in SETUP else tools.demo_export
    accepted_runs = []
    for parameter in command["parameters"]:
        rest = without(base, parameter)
        for case, value in bad_values(command, parameter):
            key = (path, parameter["name"], case)
            if case in HOST_CASES and host_cases_for is not None and \
                    key[:2] not in host_cases_for:
                continue
            if parameter["type"] == "flag":
                args = rest + ["--" + parameter["name"] + value]
            elif value is None:
                args = rest + ["--" + parameter["name"]]
            else:
                args = rest + ["--" + parameter["name"], value]
            if key in ACCEPTED:
                accepted_runs.append((key, args))
                continue
            batch = case == "long" and mib_through_batch
            if batch:
                status, out, err = tools.run(db, ["--batch", "-"], stdin=batch_line(args))
            else:
                status, out, err = tools.run(db, args)
            fault = check_run(path, parameter, status, out, err, batch)
            shown = f"{path} --{parameter['name']} [{case}]"
            messages.append(f"{shown}: {status} {err.decode(errors='replace').strip()[:160]}")
            if fault:
                faults.append(f"{shown}: {fault}")
            count(case, "fault" if fault else "refused" if status == 2 else "error")
    after = tools.export(db)
    if after != before:
        faults.append(f"{path}: the host changed during the bad runs")
    status, _, err = tools.run(db, base)
    if status != 0:
        faults.append(f"{path}: the base invocation {' '.join(base[len(path.split()):])} "
                      f"failed ({status}): {err.decode(errors='replace').strip()[:200]}")
    for key, args in accepted_runs:
        own = tools.fresh_host("accepted")
        status, _, err = tools.run(own, args)
        if status != 0:
            faults.append(f"{' '.join(key)}: expected to be accepted ({ACCEPTED[key]}) but "
                          f"exit status {status}: {err.decode(errors='replace').strip()[:160]}")
        count(key[2], "accepted" if status == 0 else "fault")
    return counts, faults, messages


def main():
    options = parse_args()
    started = time.monotonic()
    with tempfile.TemporaryDirectory() as tmp:
        tools = Tools(options.ostracli, options.ostrahost, tmp)
        commands = list_commands(tools, options.filters, options.jobs)
        mib_through_batch = argv_refuses_mib(tools, tools.fresh_host("probe"))
        print("1 MiB values: " + ("through --batch - (one argument string of 1 MiB: execve "
                                  "fails with E2BIG)" if mib_through_batch else "as arguments"))
        with concurrent.futures.ThreadPoolExecutor(options.jobs) as pool:
            host_cases_for = one_of_each_kind(commands) if options.host_cases_once else None
            results = list(pool.map(lambda c: run_command(tools, c, mib_through_batch,
                                                          host_cases_for),
                                    commands))
    totals = {}
    faults = []
    for counts, command_faults, messages in results:
        for case, outcomes in counts.items():
            for outcome, number in outcomes.items():
                totals.setdefault(case, dict.fromkeys(OUTCOMES, 0))[outcome] += number
        faults += command_faults
        if options.verbose:
            print("\n".join(messages))
    for fault in faults:
        print("FAULT " + fault)
    parameters = sum(len(c["parameters"]) for c in commands)
    print(f"\n{len(commands)} commands, {parameters} parameters")
    print(f"{'case':<10}{'runs':>6}" + "".join(f"{o:>10}" for o in OUTCOMES))
    for case in list(CASES) + ["total"]:
        row = totals.get(case) if case != "total" else {
            o: sum(t[o] for t in totals.values()) for o in OUTCOMES}
        if row:
            print(f"{case:<10}{sum(row.values()):>6}" + "".join(f"{row[o]:>10}" for o in OUTCOMES))
    print("refused: status 2 from the command host; error: status 1 with the command's own "
          "message; accepted: taken as documented (ACCEPTED)")
    print(f"{len(faults)} faults; {time.monotonic() - started:.1f} s")
    return 1 if faults or not commands else 0


if __name__ == "__main__":
    try:
        sys.exit(main())
    except (OSError, subprocess.SubprocessError, ValueError) as error:
        print(f"bad_input.py: {error}", file=sys.stderr)
        sys.exit(1)
