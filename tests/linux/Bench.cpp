//===- Bench.cpp - Listing costs of the kernel library against ip and ss --===//
//
// Builds a namespace with a dozen links, 10,000 routes and 5,000 sockets,
// and times, whole-process and in one run, a small program that lists them
// through the library against `ip -json link show`, `ip -json route show`
// and `ss -tuna` on the same namespace. Also times the library's calls alone
// and, for routes, libnl's route cache, the alternative to the library's
// single-pass dump. Needs root.
//
//   linuxnet_bench [--routes N] [--sockets N] [--runs N]
//
//===----------------------------------------------------------------------===//
#include "LinuxNet/Error.h"
#include "LinuxNet/Ethtool.h"
#include "LinuxNet/Links.h"
#include "LinuxNet/Namespace.h"
#include "LinuxNet/Routes.h"
#include "LinuxNet/Sockets.h"

#include <netlink/cache.h>
#include <netlink/netlink.h>
#include <netlink/route/route.h>

#include <algorithm>
#include <arpa/inet.h>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <functional>
#include <netinet/in.h>
#include <sched.h>
#include <spawn.h>
#include <string>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>
#include <vector>

extern char** environ;

using namespace LinuxNet;

namespace {

using Clock = std::chrono::steady_clock;

double Median(std::vector<double> v) {
  std::sort(v.begin(), v.end());
  return v[v.size() / 2];
}

/// Wall time in ms of running \p argv with its output to /dev/null.
double RunOnce(const std::vector<std::string>& argv) {
  std::vector<char*> args;
  for (const std::string& a : argv)
    args.push_back(const_cast<char*>(a.c_str()));
  args.push_back(nullptr);
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
  posix_spawn_file_actions_addopen(&actions, 2, "/dev/null", O_WRONLY, 0);
  const auto start = Clock::now();
  pid_t pid = 0;
  if (posix_spawnp(&pid, args[0], &actions, nullptr, args.data(), environ) != 0) {
    fprintf(stderr, "cannot run %s\n", args[0]);
    exit(1);
  }
  int status = 0;
  waitpid(pid, &status, 0);
  const double ms = std::chrono::duration<double, std::milli>(Clock::now() - start).count();
  posix_spawn_file_actions_destroy(&actions);
  return ms;
}

/// Median wall times of two commands run alternately, so that a busy
/// machine slows both alike; the first run of each warms the caches.
std::pair<double, double> TimeSideBySide(const std::vector<std::string>& ours,
                                         const std::vector<std::string>& peer, int runs) {
  std::vector<double> a, b;
  RunOnce(ours);
  RunOnce(peer);
  for (int i = 0; i < runs; ++i) {
    a.push_back(RunOnce(ours));
    b.push_back(RunOnce(peer));
  }
  return {Median(a), Median(b)};
}

/// Median time in µs of \p body.
double TimeCall(int runs, const std::function<void()>& body) {
  std::vector<double> times;
  body();
  for (int i = 0; i < runs; ++i) {
    const auto start = Clock::now();
    body();
    times.push_back(std::chrono::duration<double, std::micro>(Clock::now() - start).count());
  }
  return Median(times);
}

int Sh(const std::string& command) {
  return system(command.c_str());
}

/// The child: lists one kind of object and prints it, as a command would.
int Child(const std::string& what, const std::string& name) {
  Namespace ns = Namespace::Open(name);
  if (what == "links" || what == "nics") {
    const auto links = ListLinks(ns);
    std::vector<LinkModes> modes;
    if (what == "nics")
      modes = DumpLinkModes(ns);
    for (const Link& l : links) {
      std::string driver;
      uint32_t speed = 0;
      if (what == "nics") {
        try {
          driver = GetDriverInfo(ns, l.name).driver;
        } catch (const Error&) {
        }
        for (const LinkModes& m : modes)
          if (m.ifindex == l.index)
            speed = m.speed;
      }
      printf("%d %s %s %u %s %s %lu %lu %s %u\n", l.index, l.name.c_str(), l.kind.c_str(), l.mtu,
             FormatHwAddress(l.address).c_str(), OperStateName(l.operState),
             static_cast<unsigned long>(l.stats.rxBytes),
             static_cast<unsigned long>(l.stats.txBytes), driver.c_str(), speed);
    }
  } else if (what == "routes") {
    for (const Route& r : ListRoutes(ns, Family::Ipv4))
      printf("%s %s %s %s %u\n", r.destination.ToString().c_str(), r.gateway.ToString().c_str(),
             r.device.c_str(), RouteProtocolName(r.protocol).c_str(), r.metric);
  } else if (what == "sockets") {
    for (const Socket& s : ListSockets(ns))
      printf("%s %s %u %u %s:%u %s:%u\n", s.protocol == IPPROTO_TCP ? "tcp" : "udp",
             SocketStateName(s.protocol, s.state).c_str(), s.recvQueue, s.sendQueue,
             s.local.ToString().c_str(), s.localPort, s.remote.ToString().c_str(), s.remotePort);
  }
  return 0;
}

/// Connected TCP pairs over the namespace's loopback, kept open.
std::vector<int> MakeSockets(const std::string& name, int count) {
  std::vector<int> fds;
  std::thread maker([&] {
    const int nsFd = open(("/run/netns/" + name).c_str(), O_RDONLY);
    if (nsFd < 0 || setns(nsFd, CLONE_NEWNET) != 0) {
      perror("setns");
      exit(1);
    }
    close(nsFd);
    const int listener = socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in a{};
    a.sin_family = AF_INET;
    a.sin_port = htons(9000);
    a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    if (bind(listener, reinterpret_cast<sockaddr*>(&a), sizeof a) != 0 || listen(listener, 4096)) {
      perror("listen");
      exit(1);
    }
    fds.push_back(listener);
    for (int i = 0; i + 1 < count; i += 2) {
      const int c = socket(AF_INET, SOCK_STREAM, 0);
      if (connect(c, reinterpret_cast<sockaddr*>(&a), sizeof a) != 0) {
        perror("connect");
        exit(1);
      }
      fds.push_back(c);
      fds.push_back(accept(listener, nullptr, nullptr));
    }
  });
  maker.join();
  return fds;
}

/// libnl's route cache of the namespace: the alternative to a raw dump.
double TimeRouteCache(const std::string& name, int runs) {
  nl_sock* sk = nl_socket_alloc();
  std::thread connector([&] {
    const int nsFd = open(("/run/netns/" + name).c_str(), O_RDONLY);
    setns(nsFd, CLONE_NEWNET);
    close(nsFd);
    nl_connect(sk, NETLINK_ROUTE);
  });
  connector.join();
  const double t = TimeCall(runs, [&] {
    nl_cache* cache = nullptr;
    if (rtnl_route_alloc_cache(sk, AF_INET, 0, &cache) == 0)
      nl_cache_free(cache);
  });
  nl_socket_free(sk);
  return t;
}

} // namespace

int main(int argc, char** argv) {
  if (argc == 4 && std::string(argv[1]) == "--child")
    return Child(argv[2], argv[3]);
  int routes = 10000, sockets = 5000, runs = 20;
  for (int i = 1; i + 1 < argc; i += 2) {
    const std::string option = argv[i];
    const int value = atoi(argv[i + 1]);
    if (option == "--routes")
      routes = value;
    else if (option == "--sockets")
      sockets = value;
    else if (option == "--runs")
      runs = std::max(1, value);
  }
  if (geteuid() != 0) {
    printf("skipped: the benchmark builds a network namespace and needs root\n");
    return 0;
  }
  rlimit files{65536, 65536};
  setrlimit(RLIMIT_NOFILE, &files);
  const std::string name = "lnbench" + std::to_string(getpid());
  const std::string self = "/proc/self/exe";
  char exe[4096] = {};
  if (readlink(self.c_str(), exe, sizeof exe - 1) < 0)
    return 1;
  CreateNamespace(name);
  struct Cleanup {
    std::string name;
    ~Cleanup() { Sh("ip netns del " + name); }
  } cleanup{name};

  std::string batch = "link set lo up\nlink add br0 type bridge\nlink set br0 up\n"
                      "addr add 10.1.0.2/16 dev br0\n";
  for (int i = 0; i < 6; ++i)
    batch += "link add vmnic" + std::to_string(i) + " type veth peer name peer" +
             std::to_string(i) + "\nlink set vmnic" + std::to_string(i) + " master br0\n";
  for (int i = 0; i < routes; ++i)
    batch += "route add 172." + std::to_string(16 + i / 65536) + "." +
             std::to_string(i / 256 % 256) + "." + std::to_string(i % 256) + "/32 via 10.1.0.1\n";
  FILE* ip = popen(("ip -n " + name + " -batch -").c_str(), "w");
  fputs(batch.c_str(), ip);
  if (pclose(ip) != 0)
    return 1;
  const std::vector<int> held = MakeSockets(name, sockets);

  Namespace ns = Namespace::Open(name);
  printf("namespace %s: %zu links, %zu routes, %zu sockets; median of %d runs\n\n", name.c_str(),
         ListLinks(ns).size(), ListRoutes(ns, Family::Ipv4).size(), ListSockets(ns).size(), runs);
  struct Row {
    const char* what;
    std::vector<std::string> ours, peer;
    const char* peerName;
    double target;
  };
  const Row rows[] = {
      {"links",
       {exe, "--child", "links", name},
       {"ip", "-n", name, "-json", "link", "show"},
       "ip -json link show",
       1.5},
      {"links + ethtool (nic list)",
       {exe, "--child", "nics", name},
       {"ip", "-n", name, "-json", "link", "show"},
       "ip -json link show",
       1.5},
      {"routes",
       {exe, "--child", "routes", name},
       {"ip", "-n", name, "-json", "route", "show"},
       "ip -json route show",
       1.2},
      {"sockets", {exe, "--child", "sockets", name}, {"ss", "-N", name, "-tuna"}, "ss -tuna", 1.5},
  };
  printf("| whole process | ours (ms) | peer | peer (ms) | ratio | target |\n");
  printf("|---|---|---|---|---|---|\n");
  for (const Row& row : rows) {
    const auto [ours, peer] = TimeSideBySide(row.ours, row.peer, runs);
    printf("| %s | %.2f | `%s` | %.2f | %.2f | %.1f |\n", row.what, ours, row.peerName, peer,
           ours / peer, row.target);
  }
  printf("\n| library call | median (µs) |\n|---|---|\n");
  printf("| ListLinks | %.0f |\n", TimeCall(runs, [&] { ListLinks(ns); }));
  printf("| DumpLinkModes | %.0f |\n", TimeCall(runs, [&] { DumpLinkModes(ns); }));
  printf("| ListRoutes (IPv4) | %.0f |\n", TimeCall(runs, [&] { ListRoutes(ns, Family::Ipv4); }));
  printf("| libnl route cache (IPv4), for comparison | %.0f |\n", TimeRouteCache(name, runs));
  printf("| ListSockets | %.0f |\n", TimeCall(runs, [&] { ListSockets(ns); }));
  for (int fd : held)
    close(fd);
  return 0;
}
