//===- SocketsTest.cpp - Listing sockets against ss -----------------------===//
#include "Lab.h"

#include "LinuxNet/Error.h"
#include "LinuxNet/Sockets.h"

#include <algorithm>
#include <arpa/inet.h>
#include <netinet/in.h>
#include <sstream>
#include <sys/socket.h>
#include <unistd.h>

using namespace LinuxNet;
using namespace LinuxNetTest;

namespace {

class SocketsTest : public LabTest {
protected:
  void TearDown() override {
    for (int fd : fds_)
      close(fd);
    LabTest::TearDown();
  }
  int Make(int domain, int type) {
    const int fd = ns_->OpenSocket(domain, type, 0);
    fds_.push_back(fd);
    return fd;
  }
  static sockaddr_in V4(const char* address, uint16_t port) {
    sockaddr_in a{};
    a.sin_family = AF_INET;
    a.sin_port = htons(port);
    inet_pton(AF_INET, address, &a.sin_addr);
    return a;
  }
  static sockaddr_in6 V6(const char* address, uint16_t port) {
    sockaddr_in6 a{};
    a.sin6_family = AF_INET6;
    a.sin6_port = htons(port);
    inet_pton(AF_INET6, address, &a.sin6_addr);
    return a;
  }
  std::vector<int> fds_; ///< Sockets to close.
};

/// "addr:port" as ss prints it, with wildcards as "*".
std::string Endpoint(const IpAddress& a, uint16_t port) {
  const bool any = std::all_of(a.bytes.begin(), a.bytes.end(), [](uint8_t b) { return b == 0; });
  const std::string host = any                        ? "*"
                           : a.family == Family::Ipv6 ? "[" + a.ToString() + "]"
                                                      : a.ToString();
  return host + ":" + (port ? std::to_string(port) : "*");
}

std::string NormaliseSs(std::string endpoint) {
  const auto colon = endpoint.rfind(':');
  std::string host = endpoint.substr(0, colon);
  if (host == "0.0.0.0" || host == "[::]")
    host = "*";
  return host + endpoint.substr(colon);
}

TEST_F(SocketsTest, ListMatchesSsTuna) {
  int on = 1;
  const int listener = Make(AF_INET, SOCK_STREAM);
  auto l4 = V4("127.0.0.1", 5000);
  ASSERT_EQ(bind(listener, reinterpret_cast<sockaddr*>(&l4), sizeof l4), 0);
  ASSERT_EQ(listen(listener, 16), 0);
  const int listener6 = Make(AF_INET6, SOCK_STREAM);
  setsockopt(listener6, IPPROTO_IPV6, IPV6_V6ONLY, &on, sizeof on);
  auto l6 = V6("::1", 5001);
  ASSERT_EQ(bind(listener6, reinterpret_cast<sockaddr*>(&l6), sizeof l6), 0);
  ASSERT_EQ(listen(listener6, 16), 0);
  const int client = Make(AF_INET, SOCK_STREAM);
  ASSERT_EQ(connect(client, reinterpret_cast<sockaddr*>(&l4), sizeof l4), 0);
  ASSERT_EQ(send(client, "hello", 5, 0), 5);
  const int server = accept(listener, nullptr, nullptr);
  ASSERT_GE(server, 0);
  fds_.push_back(server);
  const int udp = Make(AF_INET, SOCK_DGRAM);
  auto u4 = V4("0.0.0.0", 5353);
  ASSERT_EQ(bind(udp, reinterpret_cast<sockaddr*>(&u4), sizeof u4), 0);
  const int udp6 = Make(AF_INET6, SOCK_DGRAM);
  auto u6 = V6("::1", 9);
  ASSERT_EQ(connect(udp6, reinterpret_cast<sockaddr*>(&u6), sizeof u6), 0);
  usleep(20000); // the five bytes reach the server's queue

  std::vector<std::string> oracle;
  std::istringstream lines(Exec("ss -tunaH").out);
  for (std::string line; std::getline(lines, line);) {
    std::istringstream words(line);
    std::string netid, state, rq, sq, local, peer;
    if (words >> netid >> state >> rq >> sq >> local >> peer)
      oracle.push_back(netid + " " + state + " " + rq + " " + sq + " " + NormaliseSs(local) + " " +
                       NormaliseSs(peer));
  }
  std::vector<std::string> ours;
  for (const Socket& s : ListSockets(*ns_))
    ours.push_back(std::string(s.protocol == IPPROTO_TCP ? "tcp" : "udp") + " " +
                   SocketStateName(s.protocol, s.state) + " " + std::to_string(s.recvQueue) + " " +
                   std::to_string(s.sendQueue) + " " + Endpoint(s.local, s.localPort) + " " +
                   Endpoint(s.remote, s.remotePort));
  std::sort(oracle.begin(), oracle.end());
  std::sort(ours.begin(), ours.end());
  EXPECT_EQ(ours, oracle);
  EXPECT_EQ(ours.size(), 6u);
  sockaddr_in mine{};
  socklen_t length = sizeof mine;
  ASSERT_EQ(getsockname(client, reinterpret_cast<sockaddr*>(&mine), &length), 0);
  const std::string accepted =
      "tcp ESTAB 5 0 127.0.0.1:5000 127.0.0.1:" + std::to_string(ntohs(mine.sin_port));
  EXPECT_NE(std::find(ours.begin(), ours.end(), accepted), ours.end());
}

TEST_F(SocketsTest, QueriesSelectProtocolsAndFamiliesAndCarryCongestionControl) {
  const int listener6 = Make(AF_INET6, SOCK_STREAM);
  auto l6 = V6("::", 7000);
  ASSERT_EQ(bind(listener6, reinterpret_cast<sockaddr*>(&l6), sizeof l6), 0);
  ASSERT_EQ(listen(listener6, 4), 0);
  const int udp = Make(AF_INET, SOCK_DGRAM);
  auto u4 = V4("127.0.0.1", 7001);
  ASSERT_EQ(bind(udp, reinterpret_cast<sockaddr*>(&u4), sizeof u4), 0);

  SocketQuery tcp6;
  tcp6.udp = false;
  tcp6.ipv4 = false;
  tcp6.congestion = true;
  const auto tcp = ListSockets(*ns_, tcp6);
  ASSERT_EQ(tcp.size(), 1u);
  EXPECT_EQ(tcp[0].localPort, 7000);
  EXPECT_EQ(tcp[0].state, TcpListen);
  EXPECT_EQ(tcp[0].family, Family::Ipv6);
  EXPECT_EQ(tcp[0].congestion + "\n", Exec("sysctl -n net.ipv4.tcp_congestion_control").out);
  EXPECT_NE(tcp[0].inode, 0u);

  SocketQuery udpOnly;
  udpOnly.tcp = false;
  const auto udps = ListSockets(*ns_, udpOnly);
  ASSERT_EQ(udps.size(), 1u);
  EXPECT_EQ(udps[0].local.ToString(), "127.0.0.1");
  EXPECT_EQ(SocketStateName(udps[0].protocol, udps[0].state), "UNCONN");
  EXPECT_EQ(udps[0].uid, 0u);
}

} // namespace
