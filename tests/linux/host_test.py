#!/usr/bin/env python3
"""The Linux host against a throwaway namespace, checked with iproute2, ethtool and ss.

Usage: host_test.py OSTRACLI

Each test class builds a lab namespace of its own (veth pairs vmnicN/peerN, a
bridge, addresses, routes, neighbours, sockets, /etc/netns/NAME files) and
deletes it afterwards, even when a test fails. Values are compared with what
an independent reader of the same kernel state prints: `ip -json`,
`bridge -json`, `ethtool --json`, `ss`, never with ostracli's own output.
Without root every test is skipped with the reason.
"""
import json
import os
import shutil
import socket
import subprocess
import sys
import unittest

OSTRACLI = None


def run(argv, check=True, **kwargs):
    done = subprocess.run(argv, capture_output=True, text=True, **kwargs)
    if check and done.returncode != 0:
        raise AssertionError(f"{' '.join(argv)}: {done.returncode}: {done.stderr}")
    return done


def skip_reason():
    if os.geteuid() != 0:
        return "building a network namespace lab needs root"
    for tool in ("ip", "bridge", "ethtool", "ss"):
        if shutil.which(tool) is None:
            return f"the checks need {tool}"
    return None


class Lab(unittest.TestCase):
    """A namespace with vmnic0 (in br0) and vmnic1, addresses, routes, neighbours."""

    @classmethod
    def setUpClass(cls):
        reason = skip_reason()
        if reason:
            raise unittest.SkipTest(reason)
        cls.ns = f"lht{os.getpid()}-{cls.__name__[:6].lower()}"
        run(["ip", "netns", "add", cls.ns])
        try:
            for line in [
                "link add vmnic0 type veth peer name peer0",
                "link add vmnic1 type veth peer name peer1",
                "link add br0 type bridge",
                "link set vmnic0 master br0",
                "link set lo up", "link set vmnic0 up", "link set peer0 up", "link set br0 up",
                "address add 10.1.0.2/24 dev br0",
                "-6 address add 2001:db8::2/64 dev br0 nodad",
                "route add 198.51.100.0/24 via 10.1.0.1",
                "-6 route add 2001:db8:5::/48 via 2001:db8::1",
                "neigh add 10.1.0.9 lladdr 02:00:00:00:00:09 dev br0",
            ]:
                run(["ip", "-n", cls.ns] + line.split())
            os.makedirs(f"/etc/netns/{cls.ns}", exist_ok=True)
            with open(f"/etc/netns/{cls.ns}/resolv.conf", "w") as f:
                f.write("# kept\nnameserver 192.0.2.53\noptions ndots:2\nsearch lab.example\n")
            with open(f"/etc/netns/{cls.ns}/hosts", "w") as f:
                f.write("127.0.0.1 localhost\n# a comment\n192.0.2.7 web.lab web\n")
        except BaseException:
            cls.tearDownClass()
            raise

    @classmethod
    def tearDownClass(cls):
        run(["ip", "netns", "del", cls.ns], check=False)
        shutil.rmtree(f"/etc/netns/{cls.ns}", ignore_errors=True)

    def ostra(self, *words, status=0):
        done = run([OSTRACLI, "--host", f"netns:{self.ns}", "--formatter", "json", *words],
                   check=False)
        self.assertEqual(done.returncode, status, done.stderr)
        return json.loads(done.stdout) if status == 0 and done.stdout else done.stderr

    def ip(self, *words):
        return json.loads(run(["ip", "-n", self.ns, "-json", *words]).stdout or "[]")

    def in_ns(self, *argv):
        return run(["ip", "netns", "exec", self.ns, *argv])


class NicTest(Lab):
    def test_nics_are_the_vmnic_veth_ends_as_ip_shows_them(self):
        nics = {n["Name"]: n for n in self.ostra("network", "nic", "list")}
        self.assertEqual(sorted(nics), ["vmnic0", "vmnic1"])
        for link in self.ip("link", "show"):
            if link["ifname"] in nics:
                nic = nics[link["ifname"]]
                self.assertEqual(nic["MAC Address"], link["address"])
                self.assertEqual(nic["MTU"], link["mtu"])
                self.assertEqual(nic["Admin Status"], "Up" if "UP" in link["flags"] else "Down")
                self.assertEqual(nic["Link Status"], "Up" if link["operstate"] == "UP" else "Down")

    def test_an_address_never_makes_a_link_a_nic(self):
        run(["ip", "-n", self.ns, "address", "add", "10.9.0.1/24", "dev", "peer1"])
        run(["ip", "-n", self.ns, "address", "add", "10.9.1.1/24", "dev", "vmnic1"])
        names = [n["Name"] for n in self.ostra("network", "nic", "list")]
        self.assertEqual(names, ["vmnic0", "vmnic1"])

    def test_up_down_and_mtu_reach_the_kernel(self):
        self.ostra("network", "nic", "up", "-n", "vmnic1")
        self.assertIn("UP", self.ip("link", "show", "vmnic1")[0]["flags"])
        self.ostra("network", "nic", "down", "-n", "vmnic1")
        self.assertNotIn("UP", self.ip("link", "show", "vmnic1")[0]["flags"])
        run(["ip", "-n", self.ns, "link", "set", "vmnic1", "mtu", "1400"])
        nic = [n for n in self.ostra("network", "nic", "list") if n["Name"] == "vmnic1"][0]
        self.assertEqual(nic["MTU"], 1400)

    def test_driver_offloads_and_queues_match_ethtool(self):
        info = self.ostra("network", "nic", "get", "-n", "vmnic0")
        driver = self.in_ns("ethtool", "-i", "vmnic0").stdout
        self.assertIn(f"driver: {info['Driver Info']['Driver']}\n", driver)
        self.ostra("network", "nic", "tso", "set", "-n", "vmnic0", "-e", "0")
        features = json.loads(self.in_ns("ethtool", "--json", "-k", "vmnic0").stdout)[0]
        self.assertFalse(features["tx-tcp-segmentation"]["active"])
        tso = {r["NIC"]: r["Value"] for r in self.ostra("network", "nic", "tso", "get")}
        self.assertEqual(tso["vmnic0"], "off")
        self.ostra("network", "nic", "queue", "count", "set", "-n", "vmnic0", "-r", "true",
                   "-t", "true", "-q", "2")
        channels = self.in_ns("ethtool", "-l", "vmnic0").stdout.split("Current hardware settings:")[1]
        self.assertRegex(channels, r"RX:\s+2\n")
        self.assertRegex(channels, r"TX:\s+2\n")

    def test_stats_are_the_kernels_counters(self):
        stats = self.ostra("network", "nic", "stats", "get", "-n", "vmnic0")[0]
        link = self.ip("-s", "-s", "link", "show", "vmnic0")[0]["stats64"]
        self.assertGreaterEqual(stats["Packets sent"], 0)
        self.assertLessEqual(stats["Packets sent"], link["tx"]["packets"])
        self.assertEqual(stats["Receive CRC errors"], link["rx"]["crc_errors"])
        self.assertEqual(stats["Broadcast packets sent"], -1)  # Not counted by veth.

    def test_what_veth_lacks_is_the_drivers_refusal(self):
        for words, what in [(("ring", "current", "get"), "ring parameters"),
                            (("eeprom", "dump"), "EEPROM access"),
                            (("selftest", "run"), "self tests")]:
            err = self.ostra("network", "nic", *words, "-n", "vmnic1", status=1)
            self.assertEqual(err, f"vmnic1: the driver veth does not support {what}\n")
        self.assertEqual(self.ostra("network", "nic", "get", "-n", "peer0", status=1),
                         "There is no pnic with name peer0\n")


class IpTest(Lab):
    def test_interfaces_are_links_that_are_no_bridge_ports(self):
        names = {i["Name"] for i in self.ostra("network", "ip", "interface", "list")}
        ports = {l["ifname"] for l in self.ip("link", "show") if "master" in l}
        links = {l["ifname"] for l in self.ip("link", "show")}
        self.assertEqual(names, links - ports)

    def test_addresses_as_ip_address_shows_them(self):
        rows = {r["Name"]: r for r in self.ostra("network", "ip", "interface", "ipv4", "get")}
        self.assertEqual(rows["br0"]["IPv4 Address"], "10.1.0.2")
        self.assertEqual(rows["br0"]["IPv4 Netmask"], "255.255.255.0")
        self.ostra("network", "ip", "interface", "ipv4", "set", "-i", "peer1", "-t", "static",
                   "-I", "10.2.0.1", "-N", "255.255.0.0")
        addr = self.ip("-4", "address", "show", "peer1")[0]["addr_info"]
        self.assertEqual([(a["local"], a["prefixlen"]) for a in addr], [("10.2.0.1", 16)])
        self.ostra("network", "ip", "interface", "ipv6", "address", "add", "-i", "peer1",
                   "-I", "2001:db8:7::1/64")
        addr = self.ip("-6", "address", "show", "peer1", "scope", "global")[0]["addr_info"]
        self.assertIn(("2001:db8:7::1", 64), [(a["local"], a["prefixlen"]) for a in addr])

    def test_routes_as_ip_route_shows_them(self):
        self.ostra("network", "ip", "route", "ipv4", "add", "-n", "203.0.113.0/24", "-g", "10.1.0.1")
        ours = {(r["Network"], r["Gateway"]) for r in
                self.ostra("network", "ip", "route", "ipv4", "list")}
        theirs = {(r["dst"].split("/")[0], r.get("gateway", "0.0.0.0"))
                  for r in self.ip("-4", "route", "show")}
        self.assertEqual(ours, theirs)
        self.ostra("network", "ip", "route", "ipv4", "remove", "-n", "203.0.113.0/24", "-g",
                   "10.1.0.1")
        self.assertNotIn("203.0.113.0/24", [r["dst"] for r in self.ip("-4", "route", "show")])
        err = self.ostra("network", "ip", "route", "ipv4", "remove", "-n", "203.0.113.0/24",
                         "-g", "10.1.0.1", status=1)
        self.assertIn("203.0.113.0/24", err)

    def test_neighbours_as_ip_neigh_shows_them(self):
        ours = {(n["Neighbor"], n["Mac Address"]) for n in
                self.ostra("network", "ip", "neighbor", "list", "-v", "4")}
        theirs = {(n["dst"], n.get("lladdr", "")) for n in self.ip("-4", "neigh", "show")}
        self.assertEqual(ours, theirs)

    def test_connections_as_ss_shows_them(self):
        # A listener and a connected pair inside the lab.
        server = subprocess.Popen(["ip", "netns", "exec", self.ns, sys.executable, "-c",
                                   "import socket,time\n"
                                   "s=socket.socket();s.bind(('127.0.0.1',7001));s.listen()\n"
                                   "c=socket.create_connection(('127.0.0.1',7001));a=s.accept()\n"
                                   "print('up',flush=True);time.sleep(30)"],
                                  stdout=subprocess.PIPE, text=True)
        try:
            self.assertEqual(server.stdout.readline().strip(), "up")
            ours = {(c["Local Address"], c["Foreign Address"]) for c in
                    self.ostra("network", "ip", "connection", "list", "-t", "tcp")}
            lines = self.in_ns("ss", "-tan").stdout.splitlines()[1:]
            theirs = {(l.split()[3], l.split()[4].replace("*", "0")) for l in lines}
            theirs = {(a, "0.0.0.0:0" if b == "0.0.0.0:0" else b) for a, b in theirs}
            self.assertEqual(ours, theirs)
        finally:
            server.kill()
            server.wait()
            server.stdout.close()

    def test_dns_and_hosts_keep_the_lines_they_do_not_manage(self):
        self.ostra("network", "ip", "dns", "server", "add", "-s", "192.0.2.54")
        self.ostra("network", "ip", "dns", "search", "add", "-d", "corp.example")
        with open(f"/etc/netns/{self.ns}/resolv.conf") as f:
            self.assertEqual(f.read(), "# kept\nnameserver 192.0.2.53\nnameserver 192.0.2.54\n"
                                       "options ndots:2\nsearch lab.example corp.example\n")
        # What a program in the namespace resolves with.
        self.assertIn("192.0.2.54", self.in_ns("cat", "/etc/resolv.conf").stdout)
        self.ostra("network", "ip", "hosts", "add", "-I", "192.0.2.8", "-H", "db.lab")
        self.ostra("network", "ip", "hosts", "remove", "-I", "192.0.2.7", "-H", "web.lab")
        self.assertEqual(self.in_ns("getent", "hosts", "db.lab").stdout.split()[0], "192.0.2.8")
        with open(f"/etc/netns/{self.ns}/hosts") as f:
            self.assertEqual(f.read(), "127.0.0.1 localhost\n# a comment\n192.0.2.8\tdb.lab\n")

    def test_netstack_settings_are_the_namespaces_sysctls(self):
        self.ostra("network", "ip", "netstack", "set", "-N", "defaultTcpipStack", "-c", "reno",
                   "--ecn", "echo-only")
        out = self.in_ns("sysctl", "-n", "net.ipv4.tcp_congestion_control",
                         "net.ipv4.tcp_ecn").stdout.split()
        self.assertEqual(out, ["reno", "2"])
        available = self.in_ns("sysctl", "-n",
                               "net.ipv4.tcp_available_congestion_control").stdout.split()
        help_text = run([OSTRACLI, "--host", f"netns:{self.ns}", "network", "ip", "netstack",
                         "set", "--help"]).stdout
        for name in available:
            self.assertIn(name, help_text)

    def test_ipsec_policies_as_ip_xfrm_shows_them(self):
        self.ostra("network", "ip", "ipsec", "sp", "add", "-n", "p1", "-s", "2001:db8:1::/64",
                   "-d", "2001:db8:2::/64", "-p", "0", "-P", "443", "-u", "tcp", "-w", "out",
                   "-A", "discard")
        policies = run(["ip", "-n", self.ns, "xfrm", "policy"]).stdout
        self.assertIn("src 2001:db8:1::/64 dst 2001:db8:2::/64 proto tcp dport 443", policies)
        self.assertIn("action block", policies)
        # An SA needs the kernel's ESP support: added where it has it, refused
        # with the kernel's reason where it has not.
        done = run([OSTRACLI, "--host", f"netns:{self.ns}", "network", "ip", "ipsec", "sa", "add",
                    "-n", "s1", "-s", "2001:db8::1", "-d", "2001:db8::2", "-p", "0x100",
                    "-e", "aes128-cbc", "-k", "0x" + "11" * 16, "-i", "hmac-sha1",
                    "-K", "0x" + "22" * 20], check=False)
        states = run(["ip", "-n", self.ns, "xfrm", "state"]).stdout
        if done.returncode == 0:
            self.assertIn("spi 0x00000100", states)
        else:
            print(f"skip: adding an SA: {done.stderr.strip()}", file=sys.stderr)
            self.assertEqual(states, "")
            self.assertEqual(len(done.stderr.strip().splitlines()), 1)


class SwitchTest(Lab):
    def test_bridges_and_uplinks_as_bridge_shows_them(self):
        self.ostra("network", "vswitch", "standard", "add", "-v", "br1")
        self.ostra("network", "vswitch", "standard", "uplink", "add", "-v", "br1", "-u", "vmnic1")
        self.ostra("network", "vswitch", "standard", "set", "-v", "br1", "-m", "9000")
        ports = {l["ifname"]: l["master"] for l in
                 json.loads(run(["bridge", "-n", self.ns, "-json", "link", "show"]).stdout)}
        self.assertEqual(ports, {"vmnic0": "br0", "vmnic1": "br1"})
        self.assertEqual(self.ip("link", "show", "br1")[0]["mtu"], 9000)
        switches = {s["Name"]: s for s in self.ostra("network", "vswitch", "standard", "list")}
        self.assertEqual(switches["br1"]["Uplinks"], ["vmnic1"])
        self.assertEqual(switches["br0"]["Uplinks"], ["vmnic0"])
        self.ostra("network", "vswitch", "standard", "remove", "-v", "br1")
        self.assertEqual(run(["ip", "-n", self.ns, "link", "show", "br1"], check=False).returncode, 1)

    def test_port_groups_are_kept_beside_the_namespace(self):
        self.ostra("network", "vswitch", "standard", "portgroup", "add", "-p", "pg one", "-v", "br0")
        self.ostra("network", "vswitch", "standard", "portgroup", "set", "-p", "pg one", "-v", "42")
        groups = self.ostra("network", "vswitch", "standard", "portgroup", "list")
        self.assertEqual([(g["Name"], g["Virtual Switch"], g["VLAN ID"]) for g in groups],
                         [("pg one", "br0", 42)])
        with open(f"/etc/netns/{self.ns}/ostracli-state") as f:
            self.assertIn("portgroup\tbr0\tpg one\t42\n", f.read())


class HostChoiceTest(unittest.TestCase):
    def test_a_missing_namespace_is_one_line(self):
        done = run([OSTRACLI, "--host", "netns:no-such-lab-ns", "network", "nic", "list"],
                   check=False)
        self.assertEqual((done.returncode, done.stdout),  (1, ""))
        self.assertEqual(done.stderr, "ostracli: the network namespace no-such-lab-ns does not "
                                      "exist\n")

    def test_without_cap_net_admin_reads_work_and_changes_are_refused(self):
        reason = skip_reason() or (shutil.which("setpriv") is None and "setpriv is missing")
        if reason:
            self.skipTest(reason)
        ns = f"lht{os.getpid()}-priv"
        run(["ip", "netns", "add", ns])
        try:
            run(["ip", "-n", ns, "link", "add", "vmnic0", "type", "veth", "peer", "name", "peer0"])
            drop = ["ip", "netns", "exec", ns, "setpriv", "--reuid=65534", "--regid=65534",
                    "--clear-groups", "--inh-caps=-all", "--bounding-set=-all", OSTRACLI,
                    "--host", "linux"]
            listing = run(drop + ["network", "nic", "list"], check=False)
            self.assertEqual(listing.returncode, 0, listing.stderr)
            self.assertIn("vmnic0", listing.stdout)
            change = run(drop + ["network", "nic", "up", "-n", "vmnic0"], check=False)
            self.assertEqual(change.returncode, 1)
            self.assertEqual(change.stderr,
                             "permission denied: changing vmnic0 needs CAP_NET_ADMIN\n")
        finally:
            run(["ip", "netns", "del", ns], check=False)


if __name__ == "__main__":
    OSTRACLI = os.path.abspath(sys.argv.pop(1))
    socket.setdefaulttimeout(10)
    unittest.main(verbosity=2)
