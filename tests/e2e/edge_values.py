#!/usr/bin/env python3
"""The edges of every integer range of every command of the network namespace.

Beside bad_input.py, whose tables and machinery it shares: the commands,
their parameters and their ranges come from the live tree's JSON help, and
each command runs from the same base invocation on a fresh demo host.

An integer parameter's range is where its values are taken. It starts as the
range of its parameter spec, or unbounded without one, and is narrowed by
each check of the command or the host that refuses an edge and states its
own range in the message ("[MIN - MAX]", "(MIN - MAX)", "MIN to MAX",
"between MIN and MAX", "at most MAX"): the check's range is read from the
message, which the check builds from its own table (IntFit rows, the host's
limits), so no bound is restated here. The range found is the overlap of
them all, each side bound by the check that narrowed it. Then:

    low, high       the lowest and the highest value are taken (status 0);
                    where READBACK names a command that reads the value back,
                    it shows the value given
    low-1, high+1   the first value outside on each side is refused (status 1
                    or 2) by a message stating that side's bound, so a check
                    and its message agree

An unbounded side (no declared range, no check) is probed with +-2^62, which must
be refused: a parameter that takes any 64-bit value is listed in UNBOUNDED
with the reason. Numbers inside text values (a prefix length) are listed in
TEXT_RANGES. Edges the demo host cannot take as they are have their reason
in EDGE_SETUP, EDGE_ARGS, EDGE_REFUSED, UNSTATED or UNCHANGED_BY.

    edge_values.py OSTRACLI OSTRAHOST [--jobs N] [--verbose] [FILTER...]
"""
import argparse
import concurrent.futures
import json
import re
import shlex
import sys
import tempfile
import time

import bad_input
from bad_input import Tools, base_args, list_commands, without

FAR = 1 << 62
INT64_MIN, INT64_MAX = -(1 << 63), (1 << 63) - 1

# How a message states a range: (pattern, which bounds its groups are).
RANGE_TEXTS = (
    (re.compile(r"\[(-?\d+) - (-?\d+)\]"), "both"),
    (re.compile(r"\((?:[a-z ]+ )?(-?\d+) - (-?\d+)\)"), "both"),
    (re.compile(r"(?<![\w.])(-?\d+) to (-?\d+)(?![\w.])"), "both"),
    (re.compile(r"between (-?\d+) and (-?\d+)"), "both"),
    (re.compile(r"at most (-?\d+)"), "high"),
    (re.compile(r"at least (-?\d+)"), "low"),
)

# (command, parameter) -> (argv that reads the value back, the path to it in
# its JSON output): words select a field, "k=v" the element of a list whose
# field k is v ({value} stands for the value given), and a one-element list
# is entered by any field name; a third element maps values to the text shown
# for them. UNCHANGED_BY lists the values that leave the setting as it was.
READBACK = {
    ("network nic set", "message-level"):
        ("network nic get -n vmnic0", ["Current Message Level"]),
    ("network nic set", "phy-address"): ("network nic get -n vmnic0", ["PHY Address"]),
    ("network ip netstack set", "maxconn"):
        ("network ip netstack get -N driftway", ["Max Connections"]),
    ("network ip interface set", "mtu"): ("network ip interface list", ["Name=tvk1", "MTU"]),
    ("network ip interface add", "mtu"): ("network ip interface list", ["Name=tvk20", "MTU"]),
    ("network ip interface add", "num-rxqueue"):
        ("network ip interface list", ["Name=tvk20", "RXDispQueue Size"]),
    ("network vswitch standard add", "ports"):
        ("network vswitch standard list", ["Name=labSwitch", "Configured Ports"]),
    ("network vswitch standard set", "mtu"):
        ("network vswitch standard list", ["Name=coreSwitch", "MTU"]),
    ("network vswitch standard portgroup set", "vlan-id"):
        ("network vswitch standard portgroup list", ["Name=VM Traffic", "VLAN ID"]),
    ("network nic attachment add", "vlan-id"):
        ("network nic attachment list", ["Branch=vmnic2", "VLAN ID"]),
    ("network ens maxLcores set", "maxlcores"): ("network ens maxLcores get", []),
    ("network ens lcore add", "lcore-id"):
        ("network ens lcore list", ["Lcore ID={value}", "Lcore ID"]),
    ("network ens lcore affinity set", "affinity"): ("network ens lcore affinity get -l 1", []),
    ("network nic coalesce set", "sample-interval"):
        ("network nic coalesce get -n vmnic0", ["Sample interval seconds"]),
    ("network nic coalesce set", "rx-usecs"):
        ("network nic coalesce get -n vmnic0", ["RX microseconds"]),
    ("network nic coalesce set", "tx-max-frames"):
        ("network nic coalesce get -n vmnic0", ["TX Maximum frames"]),
    ("network nic coalesce set", "rx-max-frames"):
        ("network nic coalesce get -n vmnic0", ["RX maximum frames"]),
    ("network nic coalesce set", "tx-usecs"):
        ("network nic coalesce get -n vmnic0", ["TX microseconds"]),
    ("network nic queue count set", "num"):
        ("network nic queue count get", ["NIC=vmnic2", "Tx netqueue count"]),
    ("network ip ipsec sp add", "source-port"):
        ("network ip ipsec sp list", ["Name=sp-plain", "Source Port"]),
    ("network ip ipsec sp add", "destination-port"):
        ("network ip ipsec sp list", ["Name=sp-plain", "Destination Port"]),
    ("network nic ring current set", "rx"): ("network nic ring current get -n vmnic0", ["RX"]),
    ("network nic ring current set", "tx"): ("network nic ring current get -n vmnic0", ["TX"]),
}

# (command, parameter, value) -> why that value leaves the setting unchanged.
UNCHANGED_BY = {
    ("network nic ring current set", "rx", 0): "a ring size of 0 leaves the ring as it is",
    ("network nic ring current set", "tx", 0): "a ring size of 0 leaves the ring as it is",
}

# (command, parameter) -> why it takes any 64-bit value: an id that is looked
# up rather than range-checked.
UNBOUNDED = {
    ("network port stats get", "portid"): "a port id is looked up: an unknown one is not found",
    ("network port filter stats get", "portid"):
        "a port id is looked up: an unknown one is not found",
    ("network vm port list", "world-id"): "a world id is looked up: an unknown one is not found",
}

# (command, parameter, "low" or "high") -> why the first value outside that
# edge is refused by a message that does not state the range.
UNSTATED = {
    ("network nic set", "phy-address", "low"):
        "0 is \"Invalid PHY address value.\" (-1 leaves the address as it is)",
    ("network sriovnic vf stats", "vf-id", "low"): "\"vf id starts from 0\" says the edge",
}

# (command, parameter) -> (the refusal's text, why): an edge that passes the
# range check and is then refused for another reason the demo host cannot
# avoid (an object with that id does not exist).
EDGE_REFUSED = {
    ("network vswitch dvs corvex lacp timeout set", "lag-id"):
        ("has no LAG with ID", "the demo switch has LAG 1 only; no command makes a LAG"),
    ("network sriovnic vf stats", "vf-id"): ("has no VF with ID", "the demo NIC has VFs 0 to 3"),
    ("network nic eeprom change", "magic"):
        ("Wrong magic key", "only the NIC's own magic key is taken"),
    ("network nic eeprom dump", "offset"):
        ("cannot read", "the offset is then checked against the EEPROM's size"),
    ("network nic eeprom dump", "length"):
        ("cannot read", "the length is then checked against the EEPROM's size"),
    ("network nic eeprom change", "offset"):
        ("cannot write", "the offset is then checked against the EEPROM's size"),
    ("network nic ring current set", "rx-mini"):
        ("has no RX mini ring", "no demo NIC has an RX mini ring"),
    ("network nic ring current set", "rx-jumbo"):
        ("has no RX jumbo ring", "no demo NIC has an RX jumbo ring"),
    ("network nic coalesce low set", "pkt-rate"):
        ("must be below its high packet rate", "the low rate stays below the high one"),
}

# (command, parameter) -> command lines run first on the host of each edge
# run, where the demo host cannot take an edge value.
EDGE_SETUP = {
    ("network ip interface add", "mtu"): ["network vswitch standard set -v coreSwitch -m 9000"],
    ("network ip interface set", "mtu"): ["network vswitch standard set -v coreSwitch -m 9000"],
    ("network ens maxLcores set", "maxlcores"):
        ["network ens lcore switch remove -l 0", "network ens lcore remove -l 0",
         "network ens lcore remove -l 1"],
    ("network ens lcore add", "lcore-id"):
        ["network ens lcore switch remove -l 0", "network ens lcore remove -l 0"],
}
for _path in ("remove", "switch get", "switch add", "switch remove", "affinity get",
              "affinity set"):
    EDGE_SETUP[("network ens lcore " + _path, "lcore-id")] = ["network ens lcore add -l 15"]

# (command, parameter) -> (template, probes): a number inside a text value
# ({} in the template) whose range the command or the host checks; each probe
# is a number outside it that is refused by a message stating the range.
TEXT_RANGES = {
    ("network ip interface ipv6 address add", "ipv6"): ("2001:db8:30::21/{}", [0]),
}
UNSTATED[("network ip interface ipv6 address add", "ipv6", "high")] = \
    "a prefix above 128 does not parse as an IPv6 network: \"Invalid format for IPv6 address\""

# (command, parameter) -> options added to each edge run.
EDGE_ARGS = {
    ("network ip ipsec sp add", "source-port"): ["--upper-layer-protocol", "tcp"],
    ("network ip ipsec sp add", "destination-port"): ["--upper-layer-protocol", "tcp"],
}
for _level in ("low", "high"):
    for _name, _field in (("pkt-rate", "Packet rate"), ("rx-usecs", "RX delay time"),
                          ("rx-max-frames", "RX delay packets"), ("tx-usecs", "TX delay time"),
                          ("tx-max-frames", "TX delay packets")):
        READBACK[(f"network nic coalesce {_level} set", _name)] = (
            f"network nic coalesce {_level} get -n vmnic0", [_field])
# Offload switches read back as on and off.
for _family, _field in (("cso", "RX Checksum Offload"), ("tso", "Value"), ("sg", "Value")):
    READBACK[(f"network nic {_family} set", "enable")] = (
        f"network nic {_family} get -n vmnic0", [_field], {0: "off", 1: "on"})

# Shaping rates are read only while shaping is enabled, which needs all three;
# the peak rate is the largest there is, since the average must not exceed it.
SHAPING = ("avg-bandwidth", "peak-bandwidth", "burst-size")
SHAPING_FIELDS = ("Average Bandwidth", "Peak Bandwidth", "Burst Size")
for _path, _get in (("network vswitch standard policy shaping",
                     "network vswitch standard policy shaping get -v coreSwitch"),
                    ("network vswitch standard portgroup policy shaping",
                     "network vswitch standard portgroup policy shaping get -p 'VM Traffic'")):
    for _name, _field in zip(SHAPING, SHAPING_FIELDS):
        EDGE_ARGS[(_path + " set", _name)] = ["--enabled", "true"] + [
            word for other in SHAPING if other != _name
            for word in ("--" + other, "9223372036854775" if other == "peak-bandwidth" else "1")]
        READBACK[(_path + " set", _name)] = (_get, [_field])


def parse_args():
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    parser.add_argument("ostracli")
    parser.add_argument("ostrahost")
    parser.add_argument("--jobs", type=int, default=3)
    parser.add_argument("--verbose", action="store_true", help="print every run")
    parser.add_argument("filters", nargs="*")
    return parser.parse_intermixed_args()


def stated_range(message):
    """The (min, max) a message states, or None."""
    for pattern in RANGE_TEXTS:
        found = pattern.search(message)
        if found:
            return int(found.group(1)), int(found.group(2))
    return None


class Probe:
    """Runs one command with one integer parameter set, each run on a fresh
    demo host prepared as SETUP and EDGE_SETUP say."""

    def __init__(self, tools, command, parameter):
        self.tools = tools
        self.path = command["path"]
        self.name = parameter["name"]
        self.key = (self.path, self.name)
        self.rest = without(base_args(command), parameter) + EDGE_ARGS.get(self.key, [])
        self.setup = bad_input.SETUP.get(self.path, []) + \
            [line.split() for line in EDGE_SETUP.get(self.key, [])]
        self.template = TEXT_RANGES.get(self.key, ("{}", []))[0]
        self.log = []

    def run(self, value):
        """(status, message, host) of the command with the parameter at value."""
        db = self.tools.fresh_host("edge")
        for line in self.setup:
            status, _, err = self.tools.run(db, line)
            if status != 0:
                raise RuntimeError(f"setup {' '.join(line)} failed: {err.decode()[:200]}")
        status, _, err = self.tools.run(db, self.rest + ["--" + self.name,
                                                         self.template.format(value)])
        message = err.decode(errors="replace").strip()
        self.log.append(f"{value}: {status} {message[:160]}".replace("\n", " | "))
        return status, message, db

    def read_back(self, db, value):
        """The value as the command of READBACK shows it, as text."""
        argv, fields = READBACK[self.key][:2]
        status, out, err = self.tools.run(db, ["--formatter", "json"] + shlex.split(argv))
        if status != 0:
            raise RuntimeError(f"{argv} failed: {err.decode()[:200]}")
        shown = json.loads(out)
        for word in fields:
            word = word.replace("{value}", str(value))
            if "=" in word:
                key, wanted = word.split("=", 1)
                shown = next(row for row in shown if str(row.get(key)) == wanted)
            else:
                if isinstance(shown, list) and len(shown) == 1:
                    shown = shown[0]
                shown = shown[word]
        return str(shown)


def stated_range(message):
    """(low, high) that a message states, either None where it states only
    the other, or None."""
    for pattern, bounds in RANGE_TEXTS:
        found = pattern.search(message)
        if not found:
            continue
        if bounds == "both":
            return int(found.group(1)), int(found.group(2))
        number = int(found.group(1))
        return (number, None) if bounds == "low" else (None, number)
    return None


def edge_passes(key, status, message):
    """Whether an edge run got past every range check."""
    if status == 0:
        return True
    refused = EDGE_REFUSED.get(key)
    return refused is not None and status == 1 and refused[0] in message


def find_range(probe, constraint):
    """(low, high, stated, found, faults): the range of the parameter after
    every check that refuses an edge with a stated range has narrowed it;
    stated[side] is the bound that the message refusing the first value
    beyond that side must state (None: no message states it), found lists the
    ranges met."""
    where = f"{probe.path} --{probe.name}"
    if probe.key in TEXT_RANGES:
        low, high = -FAR, FAR
        for value in TEXT_RANGES[probe.key][1]:
            status, message, _ = probe.run(value)
            inner = stated_range(message)
            if status == 0 or inner is None or None in inner:
                return low, high, {}, [], [f"{where}: {value} is not refused by a message "
                                           f"stating a range ({status}): {message}"]
            low, high = max(low, inner[0]), min(high, inner[1])
        stated = {"low": low, "high": high}
        found = [f"text [{low} - {high}]"]
    elif constraint:
        low, high = constraint["min"], constraint["max"]
        stated = {"low": low, "high": high}  # the command host's own message
        found = [f"declared [{low} - {high}]"]
    else:
        low, high = -FAR, FAR
        stated = {"low": None, "high": None}
        found = []
    bounded = {"low": bool(found), "high": bool(found)}
    for _ in range(8):
        narrowed = False
        for side, value in (("low", low), ("high", high)):
            status, message, _ = probe.run(value)
            if edge_passes(probe.key, status, message):
                continue
            inner = stated_range(message)
            new_low = low if inner is None or inner[0] is None else max(low, inner[0])
            new_high = high if inner is None or inner[1] is None else min(high, inner[1])
            if (new_low, new_high) == (low, high):
                bounded[side] = True  # refused by a check that narrows nothing it states
                continue
            if new_low > new_high:
                return low, high, stated, found, [
                    f"{where}: {value} refused with a range that leaves nothing of "
                    f"[{low} - {high}]: {message}"]
            found.append(f"check [{inner[0]} - {inner[1]}]")
            if new_low != low:
                stated["low"], bounded["low"] = new_low, True
            if new_high != high:
                stated["high"], bounded["high"] = new_high, True
            low, high = new_low, new_high
            narrowed = True
            break
        if not narrowed:
            break
    faults = [f"{where}: {low if side == 'low' else high} is taken; a parameter without a "
              "range must refuse it or be listed in UNBOUNDED"
              for side in ("low", "high") if not bounded[side]]
    return low, high, stated, found, faults


def check_parameter(tools, command, parameter):
    """(faults, ranges found, log) of one integer parameter, or of the number
    inside a text parameter of TEXT_RANGES."""
    probe = Probe(tools, command, parameter)
    constraint = parameter.get("constraint") if probe.key not in TEXT_RANGES else None
    if constraint and constraint["type"] != 1:
        return [], [], []  # an enumeration: bad_input.py tries a value outside it
    if probe.key in UNBOUNDED:
        return [], [], []
    where = f"{probe.path} --{probe.name}"
    low, high, stated, found, faults = find_range(probe, constraint)
    if faults:
        return faults, found, probe.log
    # The edges are taken and read back.
    for value in sorted({low, high}):
        status, message, db = probe.run(value)
        if not edge_passes(probe.key, status, message):
            faults.append(f"{where}: {value}, an edge of [{low} - {high}], is refused "
                          f"({status}): {message}")
        elif status == 0 and probe.key in READBACK and \
                (probe.path, probe.name, value) not in UNCHANGED_BY:
            try:
                shown = probe.read_back(db, value)
            except (RuntimeError, LookupError, StopIteration, TypeError, ValueError) as error:
                shown = f"nothing ({error!r})"
            wanted = READBACK[probe.key][2].get(value) if len(READBACK[probe.key]) > 2 else None
            if shown != (wanted or str(value)):
                faults.append(f"{where}: {value} was taken but reads back as {shown}")
    # The first values outside are refused by a message stating the bound.
    for side, value in (("low", low - 1), ("high", high + 1)):
        if value < INT64_MIN or value > INT64_MAX:
            continue  # outside 64 bits: bad_input.py's overflow case
        status, message, _ = probe.run(value)
        if status not in (1, 2) or edge_passes(probe.key, status, message):
            faults.append(f"{where}: {value}, just outside [{low} - {high}], is not refused "
                          f"by a range check ({status}): {message}")
            continue
        if (probe.path, probe.name, side) in UNSTATED:
            continue
        inner = stated_range(message)
        bound = None if inner is None else inner[0] if side == "low" else inner[1]
        if stated[side] is None or bound != stated[side]:
            faults.append(f"{where}: {value} is refused by a message that does not state "
                          f"the {side} bound {low if side == 'low' else high}: {message}")
    return faults, found, probe.log


def main():
    options = parse_args()
    started = time.monotonic()
    with tempfile.TemporaryDirectory() as tmp:
        tools = Tools(options.ostracli, options.ostrahost, tmp)
        commands = list_commands(tools, options.filters, options.jobs)
        jobs = [(c, p) for c in commands for p in c["parameters"]
                if p["type"] == "long" or (c["path"], p["name"]) in TEXT_RANGES]
        with concurrent.futures.ThreadPoolExecutor(options.jobs) as pool:
            results = list(pool.map(lambda job: check_parameter(tools, *job), jobs))
    faults = []
    if not options.filters:
        # An entry for a parameter that no longer exists would silently stop
        # checking anything.
        known = {(c["path"], p["name"]) for c in commands for p in c["parameters"]}
        for table in (READBACK, UNBOUNDED, EDGE_REFUSED, EDGE_SETUP, EDGE_ARGS, TEXT_RANGES,
                      UNSTATED, UNCHANGED_BY):
            faults += [f"{' '.join(map(str, key))}: a table entry for no parameter of the tree"
                       for key in table if tuple(key[:2]) not in known]
    checked = 0
    for (command, parameter), (found, ranges, log) in zip(jobs, results):
        faults += found
        if ranges:
            checked += 1
        if options.verbose:
            print(f"{command['path']} --{parameter['name']}: {', '.join(ranges) or 'no range'}")
            print("  " + "\n  ".join(log))
    for fault in faults:
        print("FAULT " + fault)
    print(f"{len(jobs)} integer parameters and numbers in text, {checked} with a range; "
          f"{len(faults)} faults; {time.monotonic() - started:.1f} s")
    failed = len({fault.split(":")[0] for fault in faults})
    print(f"edge values: {len(jobs) - failed} passed, {failed} failed")
    return 1 if faults or not jobs else 0


if __name__ == "__main__":
    try:
        sys.exit(main())
    except (OSError, RuntimeError, ValueError) as error:
        print(f"edge_values.py: {error}", file=sys.stderr)
        sys.exit(1)
