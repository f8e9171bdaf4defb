#!/usr/bin/env python3
"""Scale benchmarks of ostracli on large generated hosts, against iproute2.

Every figure is measured in one run, ours and the peer's alternately, and
reported as a ratio (ours / peer) next to its target:

  list      `ostracli --formatter json network ip route ipv4 list` on a host of
            10,000 routes against `ip -json route show` of 10,000 kernel routes
            in a network namespace made for the run (target <= 1.0)
  growth    the same listing at 1k, 10k and 100k routes: time per row beyond
            the demo host's listing (flat, and at most 0.5 µs a row)
  lookup    one port group's failover policy and one NIC by name, on the demo
            host and on the generated host (target: generated / demo <= 1.1)
  batch     10,000 route additions through `ostracli --batch FILE` against
            `ip -batch FILE` adding 10,000 routes in the namespace (target <= 1.0)
  mutate    `network ip dns server add`, then `remove`, each committed durably,
            against `ip -json link show` (target <= 2.0)
  memory    peak resident memory of `network nic list` on the demo host
            (target <= 6 MiB) and of the 10,000-route JSON listing (<= 12 MiB)
  huge      peak resident memory of the route listing, JSON and table, on a
            host of --huge-routes routes (default 2,000,000; < 64 MiB), and
            its time; not run unless named, as the host takes a while to make

The namespace parts need root and `ip` (iproute2); without them they are
skipped with a message. The namespace is deleted at the end, also on error or
interruption.

    bench/scale.py [--build build] [--runs 30] [--only list,batch,...]
    bench/scale.py --smoke     # tiny counts, one run each, no targets (CTest)
"""
import argparse
import os
import shutil
import signal
import statistics
import subprocess
import sys
import tempfile
import time
import json

MIB = 1024 * 1024


class Sample(float):
    """A wall time in ms that also carries the CPU time (user + system) in ms."""

    def __new__(cls, wall, cpu):
        value = super().__new__(cls, wall)
        value.cpu = cpu
        return value


def run_timed(argv, env=None, stdin=None):
    """Runs argv with its output discarded; returns (Sample, status)."""
    start = time.perf_counter_ns()
    proc = subprocess.Popen(argv, env=env, stdin=stdin, stdout=subprocess.DEVNULL,
                            stderr=subprocess.DEVNULL)
    _, status, usage = os.wait4(proc.pid, 0)
    elapsed = (time.perf_counter_ns() - start) / 1e6
    proc.returncode = os.waitstatus_to_exitcode(status)
    return Sample(elapsed, (usage.ru_utime + usage.ru_stime) * 1000), proc.returncode


class PeakMemory:
    """Peak resident memory of a program, without the memory of this script.

    The ru_maxrss that wait4 reports for a child includes the resident size of
    the process it was forked from (Python's, some 14 MiB), which exec keeps as
    a floor. The program's own peak is its VmHWM just before it exits: the
    child is traced (ptrace through ctypes) and stopped at its exit, where
    /proc/PID/status still shows it. Where tracing is not permitted, the
    wait4 figure is used and marked as an upper bound.
    """

    PTRACE_TRACEME, PTRACE_CONT, PTRACE_SETOPTIONS = 0, 7, 0x4200
    PTRACE_O_TRACEEXIT, PTRACE_EVENT_EXIT = 0x40, 6

    def __init__(self):
        import ctypes
        import ctypes.util
        self.libc = ctypes.CDLL(ctypes.util.find_library("c") or "libc.so.6", use_errno=True)
        self.libc.ptrace.argtypes = [ctypes.c_long, ctypes.c_long, ctypes.c_void_p,
                                     ctypes.c_void_p]
        self.libc.ptrace.restype = ctypes.c_long

    def _traceme(self):
        # Refused tracing leaves the child untraced: measure() then falls back.
        self.libc.ptrace(self.PTRACE_TRACEME, 0, None, None)

    def measure(self, argv):
        """Returns (peak bytes, exact): exact is False for the wait4 fallback."""
        proc = subprocess.Popen(argv, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL,
                                preexec_fn=self._traceme)
        peak = None
        while True:
            _, status, usage = os.wait4(proc.pid, 0)
            if os.WIFEXITED(status) or os.WIFSIGNALED(status):
                proc.returncode = os.waitstatus_to_exitcode(status)
                break
            signal_number = os.WSTOPSIG(status)
            event = status >> 16
            if event == self.PTRACE_EVENT_EXIT:
                with open(f"/proc/{proc.pid}/status") as f:
                    for line in f:
                        if line.startswith("VmHWM:"):
                            peak = int(line.split()[1]) * 1024
                self.libc.ptrace(self.PTRACE_CONT, proc.pid, None, None)
            elif signal_number == signal.SIGTRAP and peak is None and event == 0:
                # The stop after exec: trace the exit from here on.
                self.libc.ptrace(self.PTRACE_SETOPTIONS, proc.pid, None,
                                 self.PTRACE_O_TRACEEXIT)
                self.libc.ptrace(self.PTRACE_CONT, proc.pid, None, None)
            else:
                self.libc.ptrace(self.PTRACE_CONT, proc.pid, None, signal_number)
        if proc.returncode != 0 or peak is None:
            # Untraced (tracing refused), or failed while traced (a sanitizer
            # build's leak check cannot stop a traced process): measure by
            # wait4 alone.
            proc = subprocess.Popen(argv, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
            _, status, usage = os.wait4(proc.pid, 0)
            if status != 0:
                sys.exit(f"failed ({os.waitstatus_to_exitcode(status)}): {' '.join(argv)}")
            return usage.ru_maxrss * 1024, False
        return peak, True


def check(argv, env=None, what=None):
    """Runs argv and fails the benchmark when it fails; returns its standard output."""
    done = subprocess.run(argv, env=env, capture_output=True, text=True, check=False)
    if done.returncode != 0:
        sys.exit(f"failed ({done.returncode}): {what or ' '.join(argv)}\n{done.stderr}")
    return done.stdout


def median(samples):
    """The median wall time, carrying the median CPU time."""
    return Sample(statistics.median(samples), statistics.median(s.cpu for s in samples))


def median_pair(ours, peer, runs, prepare=None):
    """Alternates ours and peer `runs` times; returns their median Samples."""
    a, b = [], []
    for _ in range(runs):
        if prepare:
            prepare()
        a.append(ours())
        b.append(peer())
    return median(a), median(b)


class Report:
    def __init__(self):
        self.rows = []
        self.missed = 0

    def add(self, what, ours, peer, ratio, target, met, cpu="-"):
        self.rows.append((what, ours, peer, ratio, target, met))
        if met is False:
            self.missed += 1
        mark = "" if met is None else ("met" if met else "MISSED")
        print(f"{what:48} {ours:>11} {peer:>11} {ratio:>7} {cpu:>7} {target:>8} {mark}",
              flush=True)

    def timing(self, what, a, b, target, limit, smoke):
        """Adds a ratio of wall times (and of CPU times) against its limit."""
        ratio = a / b
        cpu = a.cpu / b.cpu if b.cpu > 0 else float("inf")
        self.add(what, f"{a:.2f} ms", f"{b:.2f} ms", f"{ratio:.2f}", target,
                 None if smoke or limit is None else ratio <= limit, f"{cpu:.2f}")

    @staticmethod
    def header():
        print(f"{'what':48} {'ours':>11} {'peer':>11} {'ratio':>7} {'cpu':>7} {'target':>8}",
              flush=True)
        print(f"{'':48} {'(median wall time; ratio of wall times, cpu: of CPU times)':>49}",
              flush=True)


class Namespace:
    """A network namespace with one interface for the routes, deleted by close().

    The interface is a dummy one; where the kernel lacks dummy interfaces (some
    containers), one end of a veth pair inside the namespace, else loopback.
    """

    def __init__(self, ip):
        self.ip = ip
        self.name = f"ostra-scale-{os.getpid()}"
        self.made = False
        self.dev = "lo"

    def open(self):
        done = subprocess.run([self.ip, "netns", "add", self.name], capture_output=True,
                              text=True, check=False)
        if done.returncode != 0:
            return done.stderr.strip() or "ip netns add failed"
        self.made = True
        for kind in (["dummy"], ["veth", "peer", "name", "bench1"]):
            made = subprocess.run(self.cmd("link", "add", "bench0", "type", *kind),
                                  capture_output=True, check=False)
            if made.returncode == 0:
                self.dev = "bench0"
                break
        for args in (["link", "set", "lo", "up"],
                     ["addr", "add", "10.99.0.2/16", "dev", self.dev],
                     ["link", "set", self.dev, "up"]):
            check(self.cmd(*args))
        return None

    def close(self):
        if self.made:
            subprocess.run([self.ip, "netns", "delete", self.name], check=False,
                           stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
            self.made = False

    def cmd(self, *args):
        return [self.ip, "-n", self.name] + list(args)


def route_lines(count, first_octet, via, dev):
    """`ip -batch` lines adding `count` /24 (or longer) routes."""
    lines = []
    step = 256 if count <= 16384 else 16
    for i in range(count):
        value = (first_octet << 24) + i * step
        network = f"{value >> 24}.{(value >> 16) & 255}.{(value >> 8) & 255}.{value & 255}"
        prefix = 24 if step == 256 else 28
        lines.append(f"route add {network}/{prefix} via {via} dev {dev}\n")
    return "".join(lines)


def batch_lines(count):
    """ostracli batch lines adding `count` routes in 10.192.0.0/10 through tvk0's router."""
    lines = []
    for i in range(count):
        value = (10 << 24) + (192 << 16) + i * 256
        lines.append(f"network ip route ipv4 add -n {value >> 24}.{(value >> 16) & 255}."
                     f"{(value >> 8) & 255}.0/24 -g 10.20.0.254\n")
    return "".join(lines)


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--build", default="build")
    parser.add_argument("--runs", type=int, default=30)
    parser.add_argument("--only", default="list,growth,lookup,batch,mutate,memory",
                        help="parts to run, of list,growth,lookup,batch,mutate,memory,huge")
    parser.add_argument("--huge-routes", type=int, default=2000000)
    parser.add_argument("--smoke", action="store_true",
                        help="tiny counts and one run each: checks that every part works")
    args = parser.parse_args()
    parts = set(args.only.split(","))
    if args.smoke:
        parts.add("huge")
    ostracli = os.path.abspath(os.path.join(args.build, "bin", "ostracli"))
    ostrahost = os.path.abspath(os.path.join(args.build, "bin", "ostrahost"))
    for tool in (ostracli, ostrahost):
        if not os.access(tool, os.X_OK):
            sys.exit(f"{tool} is not built")
    runs = 1 if args.smoke else args.runs
    size = 20 if args.smoke else 10000
    growth_sizes = [10, 20, 40] if args.smoke else [1000, 10000, 100000]
    batch_runs = 1 if args.smoke else max(3, runs // 6)
    ip = shutil.which("ip")

    namespace = Namespace(ip) if ip else None

    def interrupted(signum, frame):
        raise SystemExit(f"interrupted by signal {signum}")

    signal.signal(signal.SIGTERM, interrupted)
    signal.signal(signal.SIGHUP, interrupted)
    tmp = tempfile.mkdtemp(prefix="ostra-scale-")
    try:
        return run(args, parts, ostracli, ostrahost, runs, size, growth_sizes, batch_runs,
                   namespace, tmp)
    finally:
        if namespace:
            namespace.close()
        shutil.rmtree(tmp, ignore_errors=True)


def run(args, parts, ostracli, ostrahost, runs, size, growth_sizes, batch_runs, namespace, tmp):
    smoke = args.smoke
    report = Report()

    def host(name, *sizes):
        path = os.path.join(tmp, name + ".db")
        if not os.path.exists(path):
            if sizes:
                check([ostrahost, "generate", path] + list(sizes))
            else:
                check([ostrahost, "init", path, "--profile", "demo"])
        return path

    def cli(path, *words):
        return [ostracli, "--host", path] + list(words)

    def timed(argv):
        sample, status = run_timed(argv)
        if status != 0:
            sys.exit(f"failed ({status}): {' '.join(argv)}")
        return sample

    demo = host("demo")
    big = host("big", "--routes", str(size), *(["--portgroups", "40", "--vms", "10"]
                                               if smoke else []))
    listing = ["--formatter", "json", "network", "ip", "route", "ipv4", "list"]
    rows = json.loads(check(cli(big, *listing)))
    if len(rows) < size:
        sys.exit(f"the generated host lists {len(rows)} routes, expected at least {size}")

    problem = None
    if namespace is None:
        problem = "`ip` (iproute2) is not installed"
    elif os.geteuid() != 0:
        problem = "not running as root"
    else:
        problem = namespace.open()
    if problem:
        print(f"namespace benchmarks skipped: {problem}", flush=True)
        namespace = None
    else:
        print(f"namespace {namespace.name}: kernel routes on {namespace.dev}", flush=True)

    Report.header()
    if "list" in parts and namespace:
        routes = os.path.join(tmp, "routes.batch")
        with open(routes, "w") as f:
            f.write(route_lines(size, 172, "10.99.0.1", namespace.dev))
        check(namespace.cmd("-batch", routes))
        kernel = json.loads(check(namespace.cmd("-json", "route", "show")))
        if len(kernel) < size:
            sys.exit(f"the namespace lists {len(kernel)} routes, expected {size}")
        ours_argv = cli(big, *listing)
        peer_argv = namespace.cmd("-json", "route", "show")
        a, b = median_pair(lambda: timed(ours_argv), lambda: timed(peer_argv), runs)
        report.timing(f"route list, JSON, {size} routes", a, b, "<= 1.0", 1.0, smoke)

    if "growth" in parts:
        base = median([timed(cli(demo, *listing)) for _ in range(runs)])
        demo_rows = len(json.loads(check(cli(demo, *listing))))
        for n in growth_sizes:
            path = host(f"routes{n}", "--routes", str(n), "--portgroups", "0", "--vms", "0")
            t = median([timed(cli(path, *listing)) for _ in range(runs)])
            per_row = (t - base) * 1000 / n
            per_row_cpu = (t.cpu - base.cpu) * 1000 / n
            report.add(f"route list, JSON, {n + demo_rows} rows", f"{t:.2f} ms",
                       f"{base:.2f} ms", f"{per_row:.3f}", "<= 0.5",
                       None if smoke or n < 10000 else per_row <= 0.5, f"{per_row_cpu:.3f}")
        print(f"{'':48} (peer: the demo host's listing; ratio and cpu: µs per added row)")

    if "lookup" in parts:
        lookups = [
            ("port group failover policy", ["network", "vswitch", "standard", "portgroup",
                                            "policy", "failover", "get", "-p", "VM Traffic"]),
            ("NIC by name", ["network", "nic", "get", "-n", "vmnic0"]),
        ]
        for what, words in lookups:
            check(cli(big, *words))
            a, b = median_pair(lambda: timed(cli(big, *words)), lambda: timed(cli(demo, *words)),
                               runs)
            report.timing(f"{what}: generated / demo host", a, b, "<= 1.1", 1.1, smoke)

    if "batch" in parts and namespace:
        count = size
        ours_file = os.path.join(tmp, "add.ostra")
        with open(ours_file, "w") as f:
            f.write(batch_lines(count))
        peer_file = os.path.join(tmp, "add.ip")
        with open(peer_file, "w") as f:
            f.write(route_lines(count, 11, "10.99.0.1", namespace.dev))
        fresh = os.path.join(tmp, "batch.db")

        def prepare():
            for suffix in ("", "-wal", "-shm"):
                if os.path.exists(fresh + suffix):
                    os.remove(fresh + suffix)
            check([ostrahost, "init", fresh, "--profile", "demo"])
            subprocess.run(namespace.cmd("route", "flush", "root", "11.0.0.0/8"), check=False)

        a, b = median_pair(lambda: timed(cli(fresh, "--batch", ours_file)),
                           lambda: timed(namespace.cmd("-batch", peer_file)), batch_runs,
                           prepare)
        added = json.loads(check(cli(fresh, *listing)))
        if len(added) < count:
            sys.exit(f"the batch left {len(added)} routes, expected at least {count}")
        report.timing(f"batch of {count} route additions", a, b, "<= 1.0", 1.0, smoke)

    ip = shutil.which("ip")
    if "mutate" in parts and ip:
        path = host("mutate")
        peer_argv = [ip, "-json", "link", "show"]
        adds, removes, peers = [], [], []
        for _ in range(runs):
            adds.append(timed(cli(path, "network", "ip", "dns", "server", "add", "-s",
                                  "10.20.9.9")))
            peers.append(timed(peer_argv))
            removes.append(timed(cli(path, "network", "ip", "dns", "server", "remove", "-s",
                                     "10.20.9.9")))
            peers.append(timed(peer_argv))
        b = median(peers)
        for verb, values in (("add", adds), ("remove", removes)):
            report.timing(f"dns server {verb} (durable)", median(values), b, "<= 2.0", 2.0,
                          smoke)

    if "memory" in parts:
        meter = PeakMemory()
        for what, argv, limit in (
                ("peak RSS: nic list, demo host", cli(demo, "network", "nic", "list"), 6),
                (f"peak RSS: route list, JSON, {size} routes", cli(big, *listing), 12)):
            peaks = [meter.measure(argv) for _ in range(min(runs, 5))]
            peak = max(value for value, _ in peaks)
            exact = all(exact for _, exact in peaks)
            report.add(what, f"{peak / MIB:.1f} MiB" + ("" if exact else " (bound)"), "-", "-",
                       f"<= {limit} MiB", None if smoke else peak <= limit * MIB)

    if "huge" in parts:
        count = 200 if smoke else args.huge_routes
        start = time.perf_counter()
        path = host(f"huge{count}", "--routes", str(count), "--portgroups", "0", "--vms", "0")
        print(f"{'':48} (made a host of {count} routes in "
              f"{time.perf_counter() - start:.1f} s)", flush=True)
        meter = PeakMemory()
        for name, formatter in (("JSON", ["--formatter", "json"]), ("table", [])):
            argv = cli(path, *formatter, "network", "ip", "route", "ipv4", "list")
            start = time.perf_counter()
            peak, exact = meter.measure(argv)
            seconds = time.perf_counter() - start
            report.add(f"peak RSS: route list, {name}, {count} routes",
                       f"{peak / MIB:.1f} MiB" + ("" if exact else " (bound)"),
                       f"{seconds:.2f} s", "-", "< 64 MiB", None if smoke else peak < 64 * MIB)

    if smoke:
        print(f"smoke run done: {len(report.rows)} figures")
        return 0
    return 1 if report.missed else 0


if __name__ == "__main__":
    sys.exit(main())
