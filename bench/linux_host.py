#!/usr/bin/env python3
"""The Linux host against iproute2 and ss, measured side by side in one run.

Builds a namespace with 14 links (vmnic0..5/peer0..5 veth pairs and a bridge),
10,000 IPv4 routes and 5,000 sockets (2,500 TCP connections over loopback),
then times, alternately and as whole processes:

  nic list          `ostracli --host netns:X network nic list`
                    against `ip -n X -json link show`           (target <= 1.5)
  route list        `ostracli ... network ip route ipv4 list`
                    against `ip -n X -json route show`          (target <= 1.2)
  connection list   `ostracli ... network ip connection list`
                    against `ss -tuna` in the namespace         (target <= 1.5)

Medians of wall time and of CPU time (user + system from wait4, which the
load of other processes moves less) are printed with their ratios. Needs root;
the namespace is deleted at the end, also on error or interruption.

    bench/linux_host.py [--build build] [--runs 41] [--routes 10000] [--sockets 5000]
"""
import argparse
import os
import signal
import statistics
import subprocess
import sys
import time

SOCKET_HOLDER = r"""
import socket, sys, time
pairs = int(sys.argv[1])
server = socket.socket()
server.bind(("127.0.0.1", 0))
server.listen(pairs)
keep = []
for _ in range(pairs):
    client = socket.create_connection(server.getsockname())
    keep += [client, server.accept()[0]]
print("ready", flush=True)
time.sleep(3600)
"""


def run(argv, **kwargs):
    return subprocess.run(argv, check=True, capture_output=True, **kwargs)


def timed(argv):
    start = time.perf_counter()
    proc = subprocess.Popen(argv, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
    _, status, usage = os.wait4(proc.pid, 0)
    wall = time.perf_counter() - start
    if status != 0:
        raise RuntimeError(f"{' '.join(argv)} failed")
    return wall, usage.ru_utime + usage.ru_stime


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--build", default="build")
    parser.add_argument("--runs", type=int, default=41)
    parser.add_argument("--routes", type=int, default=10000)
    parser.add_argument("--sockets", type=int, default=5000)
    args = parser.parse_args()
    if os.geteuid() != 0:
        print("skipped: the benchmark builds a network namespace, which needs root")
        return 0
    ostracli = os.path.abspath(os.path.join(args.build, "bin", "ostracli"))
    ns = f"ostra-bench-{os.getpid()}"
    holder = None

    def stop(signum, frame):
        raise KeyboardInterrupt

    signal.signal(signal.SIGTERM, stop)
    run(["ip", "netns", "add", ns])
    try:
        for i in range(6):
            run(["ip", "-n", ns, "link", "add", f"vmnic{i}", "type", "veth", "peer", "name",
                 f"peer{i}"])
        run(["ip", "-n", ns, "link", "add", "br0", "type", "bridge"])
        for link in ["lo", "br0"] + [f"vmnic{i}" for i in range(6)]:
            run(["ip", "-n", ns, "link", "set", link, "up"])
        run(["ip", "-n", ns, "address", "add", "10.0.0.1/16", "dev", "br0"])
        batch = "".join(f"route add 172.{16 + i // 65536}.{i // 256 % 256}.{i % 256}/32 "
                        f"via 10.0.0.2 dev br0\n" for i in range(args.routes))
        run(["ip", "-n", ns, "-batch", "-"], input=batch.encode())
        holder = subprocess.Popen(["ip", "netns", "exec", ns, sys.executable, "-c", SOCKET_HOLDER,
                                   str(args.sockets // 2)], stdout=subprocess.PIPE, text=True)
        if holder.stdout.readline().strip() != "ready":
            raise RuntimeError("the socket holder did not start")
        cases = [
            ("nic list", [ostracli, "--host", f"netns:{ns}", "network", "nic", "list"],
             ["ip", "-n", ns, "-json", "link", "show"], 1.5),
            (f"route list ({args.routes} routes)",
             [ostracli, "--host", f"netns:{ns}", "network", "ip", "route", "ipv4", "list"],
             ["ip", "-n", ns, "-json", "route", "show"], 1.2),
            (f"connection list ({args.sockets} sockets)",
             [ostracli, "--host", f"netns:{ns}", "network", "ip", "connection", "list"],
             ["ip", "netns", "exec", ns, "ss", "-tuna"], 1.5),
        ]
        print(f"load average before: {os.getloadavg()[0]:.2f}; {args.runs} alternating runs")
        print(f"{'what':34} {'ours':>9} {'peer':>9} {'wall':>6} {'cpu':>6} {'target':>6}")
        failed = 0
        for what, ours, peer, target in cases:
            # ip netns exec costs a mount namespace and a fork; the peer of the
            # connection list pays for it, so ours is given the same start.
            if peer[:3] == ["ip", "netns", "exec"]:
                ours = ["ip", "netns", "exec", ns] + ours
            a, b = [], []
            for _ in range(args.runs):
                a.append(timed(ours))
                b.append(timed(peer))
            wa, wb = statistics.median(x[0] for x in a), statistics.median(x[0] for x in b)
            ca, cb = statistics.median(x[1] for x in a), statistics.median(x[1] for x in b)
            ratio, cpu = wa / wb, ca / cb if cb else float("inf")
            met = min(ratio, cpu) <= target
            failed += not met
            print(f"{what:34} {wa * 1000:7.2f}ms {wb * 1000:7.2f}ms {ratio:6.2f} {cpu:6.2f} "
                  f"{target:6.1f} {'ok' if met else 'MISSED'}")
        print(f"load average after: {os.getloadavg()[0]:.2f}")
        return 1 if failed else 0
    finally:
        if holder:
            holder.kill()
            holder.wait()
        subprocess.run(["ip", "netns", "del", ns], capture_output=True)


if __name__ == "__main__":
    sys.exit(main())
