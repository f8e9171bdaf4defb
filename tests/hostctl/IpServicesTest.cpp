//===- IpServicesTest.cpp - Routes, DNS, hosts, neighbours, IPsec ---------===//
//
// Host-library tests of the IP services area on a small host made directly in
// the store: two netstacks, ordinary and system kernel interfaces with IPv4
// subnets and one IPv6 prefix.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "TvkCtl/Network/DnsConfigImpl.h"
#include "TvkCtl/Network/HostsFile.h"
#include "TvkCtl/Network/IpSecConfigImpl.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/RoutingInfoImpl.h"
#include "TvkCtl/Resource/ResourceInfoImpl.h"
#include "model/CoreModel.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <string>

namespace {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::IpAddress;
using HostCtl::Network::IpSecSadParam;
using HostCtl::Network::IpSecSpdParam;
using HostCtl::Network::Ipv4Address;
using HostCtl::Network::Ipv4Network;
using HostCtl::Network::Ipv6Address;
using HostCtl::Network::Ipv6Network;
using HostCtl::Network::PortsetGetRegular;
using HostCtl::Network::PortsetGetSystem;
using TvkCtl::Network::DnsConfigImpl;
using TvkCtl::Network::HostsFile;
using TvkCtl::Network::IpSecConfigImpl;
using TvkCtl::Network::RoutingInfoImpl;

const char* const kHostRows = R"sql(
INSERT INTO netstack(key, ord, name, state) VALUES('defaultTcpipStack', 0, 'defaultTcpipStack', 4660),
  ('ops', 1, 'ops', 4660);
INSERT INTO tvknic(name, ord, netstack, mac, system, ipv4_mode, ipv4_address, ipv4_netmask) VALUES
  ('vmk0', 0, 'defaultTcpipStack', '00:50:56:60:00:01', 0, 'static', '10.0.0.5', '255.255.255.0'),
  ('vmk1', 1, 'defaultTcpipStack', '00:50:56:60:00:02', 0, 'static', '10.0.0.77', '255.255.0.0'),
  ('vmk2', 2, 'ops', '00:50:56:60:00:03', 0, 'static', '172.16.0.5', '255.255.255.0'),
  ('vmk9', 3, 'defaultTcpipStack', '00:50:56:60:00:09', 1, 'static', '169.254.1.1', '255.255.0.0');
INSERT INTO tvknic_ipv6(nic, address, prefix, ord) VALUES('vmk0', '2001:db8:1::5', 64, 0);
INSERT INTO ipsvc_neighbor(family, interface, address, mac, expiry, type, state) VALUES
  (4, 'vmk1', 0x0A000909, '00:50:56:aa:00:02', 300, 1, 0),
  (4, 'vmk0', 0x0A000001, '00:50:56:aa:00:01', 1200, 1, 0),
  (6, 'vmk0', X'20010DB8000100000000000000000001', '00:50:56:aa:00:01', 30, 4, 2),
  (4, 'vmk2', 0xAC100001, '00:50:56:aa:00:03', 20, 2, 0),
  (4, 'vmk9', 0xA9FE0102, '00:50:56:aa:00:09', 0, 3, 0);
INSERT INTO ipsvc_world(id, name) VALUES(2101, 'sshd');
INSERT INTO world(id, name) VALUES(3300, 'vm-web01');
INSERT INTO ipsvc_connection(netstack, protocol, local_address, local_port, foreign_address,
  foreign_port, world_id, state, ccalgo) VALUES
  ('defaultTcpipStack', 0, '10.0.0.5', 22, '10.0.0.99', 50122, 2101, 4, 'newreno'),
  ('defaultTcpipStack', 1, '0.0.0.0', 123, '0.0.0.0', 0, 3300, 0, ''),
  ('ops', 0, '172.16.0.5', 80, '0.0.0.0', 0, 0, 1, 'cubic');
)sql";

class IpServicesTest : public ::testing::Test {
protected:
  void SetUp() override {
    path_ = ::testing::TempDir() + "ipsvc-" +
            ::testing::UnitTest::GetInstance()->current_test_info()->name() + ".db";
    RemoveFiles();
    {
      std::unique_ptr<Model::Store> store = Model::Store::Create(path_);
      store->Write([&] { store->Exec(kHostRows); });
    }
    Model::Store::SetPath(path_);
  }
  void TearDown() override {
    Model::Store::CloseHost();
    RemoveFiles();
  }
  void RemoveFiles() {
    for (const char* suffix : {"", "-wal", "-shm"})
      std::remove((path_ + suffix).c_str());
  }
  static void Exec(const char* sql) {
    Model::Store& store = Model::Store::Host();
    store.Write([&] { store.Exec(sql); });
  }
  /// The routes of a netstack as "network/len via gateway dev interface".
  static std::vector<std::string> Routes4(RoutingInfoImpl& routing,
                                          HostCtl::Network::PortsetGetType selector) {
    std::vector<std::string> out;
    for (const auto& route : routing.GetCurrentTarvikRoutes(selector))
      out.push_back(route.GetNetwork().GetStringAddress() + " via " +
                    route.GetGateway().GetStringAddress() + " dev " + route.GetInterfaceName() +
                    " " + routing.GetDefaultGatewaySource(route.GetNetwork()));
    return out;
  }
  std::string path_; ///< The store of the test.
};

/// Expects \p fn to throw HostCtlException with exactly \p message.
template <typename Fn> void ExpectRefused(Fn&& fn, const std::string& message) {
  try {
    fn();
    ADD_FAILURE() << "expected the refusal: " << message;
  } catch (const HostCtlException& e) {
    EXPECT_EQ(message, e.what());
  }
}

TEST_F(IpServicesTest, RoutesTakeTheInterfaceOfTheLongestMatchingSubnet) {
  RoutingInfoImpl routing("defaultTcpipStack");
  routing.AddTarvikRoute(Ipv4Network("192.168.0.0/16"), Ipv4Address("10.0.0.1"));
  routing.AddTarvikRoute(Ipv4Network("172.20.0.0/24"), Ipv4Address("10.0.200.1"));
  routing.AddTarvikRoute(RoutingInfoImpl::DEFAULT_IPV4_ROUTE, Ipv4Address("10.0.0.254"));
  EXPECT_EQ((std::vector<std::string>{
                "10.0.0.0/24 via 0.0.0.0 dev vmk0 connected",
                "10.0.0.0/16 via 0.0.0.0 dev vmk1 connected",
                "192.168.0.0/16 via 10.0.0.1 dev vmk0 user",
                "172.20.0.0/24 via 10.0.200.1 dev vmk1 user",
                "0.0.0.0/0 via 10.0.0.254 dev vmk0 user",
            }),
            Routes4(routing, PortsetGetRegular));
  EXPECT_EQ("10.0.0.254", routing.GetTvKernelDefaultGateway().GetStringAddress());
  // Adding the default route does not configure it.
  EXPECT_EQ("0.0.0.0", routing.GetTvKernelConfigDefaultGateway().GetStringAddress());
  // The system selector shows the system interfaces' routes only.
  EXPECT_EQ((std::vector<std::string>{"169.254.0.0/16 via 0.0.0.0 dev vmk9 connected"}),
            Routes4(routing, PortsetGetSystem));
  // Routes are per netstack.
  routing.SetNetstackInstanceKey("ops");
  EXPECT_EQ((std::vector<std::string>{"172.16.0.0/24 via 0.0.0.0 dev vmk2 connected"}),
            Routes4(routing, PortsetGetRegular));
}

TEST_F(IpServicesTest, RouteChangesThatABadHostWouldNotAcceptAreRefused) {
  RoutingInfoImpl routing("defaultTcpipStack");
  ExpectRefused(
      [&] { routing.AddTarvikRoute(Ipv4Network("192.168.0.0/16"), Ipv4Address("172.16.0.1")); },
      "The gateway 172.16.0.1 is not reachable through any interface of netstack "
      "defaultTcpipStack");
  ExpectRefused(
      [&] { routing.AddTarvikRoute(Ipv4Network("192.168.1.0/16"), Ipv4Address("10.0.0.1")); },
      "Invalid route network 192.168.1.0/16: the address has bits set beyond the "
      "prefix length");
  ExpectRefused(
      [&] { routing.AddTarvikRoute(Ipv4Network("10.0.0.0/24"), Ipv4Address("10.0.0.1")); },
      "A route to 10.0.0.0/24 already exists in netstack defaultTcpipStack");
  routing.AddTarvikRoute(RoutingInfoImpl::DEFAULT_IPV4_ROUTE, Ipv4Address("10.0.0.254"));
  ExpectRefused(
      [&] {
        routing.AddTarvikRoute(RoutingInfoImpl::DEFAULT_IPV4_ROUTE, Ipv4Address("10.0.0.253"));
      },
      "A route to default already exists in netstack defaultTcpipStack");
  ExpectRefused(
      [&] {
        routing.RemoveTarvikRoute(RoutingInfoImpl::DEFAULT_IPV4_ROUTE, Ipv4Address("10.0.0.253"));
      },
      "No route to default through 10.0.0.253 in netstack defaultTcpipStack");
  routing.RemoveTarvikRoute(RoutingInfoImpl::DEFAULT_IPV4_ROUTE, Ipv4Address("10.0.0.254"));
  EXPECT_EQ("0.0.0.0", routing.GetTvKernelDefaultGateway().GetStringAddress());
  routing.SetNetstackInstanceKey("nosuch");
  ExpectRefused([&] { routing.GetCurrentTarvikRoutes(PortsetGetRegular); },
                "Netstack instance nosuch does not exist");
}

TEST_F(IpServicesTest, DefaultGatewayKeepsRunningAndConfiguredValues) {
  RoutingInfoImpl routing("defaultTcpipStack");
  routing.SetTvKernelDefaultGateway(Ipv4Address("10.0.0.1"), false);
  EXPECT_EQ("10.0.0.1", routing.GetTvKernelDefaultGateway().GetStringAddress());
  EXPECT_EQ("10.0.0.1", routing.GetTvKernelConfigDefaultGateway().GetStringAddress());
  EXPECT_EQ("config", routing.GetDefaultGatewaySource(RoutingInfoImpl::DEFAULT_IPV4_ROUTE));
  // A running-only change leaves the configuration as it was.
  routing.SetTvKernelDefaultGateway(Ipv4Address("10.0.0.2"), true);
  EXPECT_EQ("10.0.0.2", routing.GetTvKernelDefaultGateway().GetStringAddress());
  EXPECT_EQ("10.0.0.1", routing.GetTvKernelConfigDefaultGateway().GetStringAddress());
  routing.SetTvKernelDefaultGateway(Ipv4Address("0.0.0.0"), false);
  EXPECT_EQ("0.0.0.0", routing.GetTvKernelDefaultGateway().GetStringAddress());
  EXPECT_EQ("0.0.0.0", routing.GetTvKernelConfigDefaultGateway().GetStringAddress());
  ExpectRefused([&] { routing.SetTvKernelDefaultGateway(Ipv4Address("8.8.8.8"), false); },
                "The gateway 8.8.8.8 is not reachable through any interface of netstack "
                "defaultTcpipStack");
}

TEST_F(IpServicesTest, RoutesGoAwayWithTheirInterfaceAndNetstack) {
  RoutingInfoImpl routing("defaultTcpipStack");
  routing.AddTarvikRoute(Ipv4Network("192.168.0.0/16"), Ipv4Address("10.0.200.1"));
  routing.SetNetstackInstanceKey("ops");
  routing.AddTarvikRoute(Ipv4Network("192.168.0.0/16"), Ipv4Address("172.16.0.1"));
  Exec("DELETE FROM tvknic WHERE name = 'vmk1'");
  Exec("DELETE FROM tvknic WHERE name = 'vmk2'; DELETE FROM netstack WHERE key = 'ops'");
  Model::Store& store = Model::Store::Host();
  int64_t left = store.Read([&] {
    Model::Statement count = store.Prepare("SELECT count(*) FROM ipsvc_route");
    count.Step();
    return count.Int(0);
  });
  EXPECT_EQ(0, left);
}

TEST_F(IpServicesTest, Ipv6RoutesFollowTheKernelSwitch) {
  RoutingInfoImpl routing("defaultTcpipStack");
  routing.AddIpv6TarvikRoute(Ipv6Network("2001:db8:99::/48"), Ipv6Address("2001:db8:1::1"));
  routing.SetIpv6TvKernelDefaultGateway(Ipv6Address("2001:db8:1::fe"));
  auto routes = routing.GetCurrentIpv6TarvikRoutes(PortsetGetRegular);
  ASSERT_EQ(3u, routes.size());
  EXPECT_EQ("2001:db8:1::/64", routes[0].GetNetwork().GetStringAddress());
  EXPECT_EQ("2001:db8:99::/48", routes[1].GetNetwork().GetStringAddress());
  EXPECT_EQ("vmk0", routes[1].GetInterfaceName());
  EXPECT_TRUE(routes[2].GetNetwork() == RoutingInfoImpl::DEFAULT_IPV6_ROUTE);
  EXPECT_EQ("2001:db8:1::fe", routing.GetIpv6TvKernelConfigDefaultGateway().GetStringAddress());

  Model::Store& store = Model::Store::Host();
  store.Write([&] { Model::PutSetting(store, "tvk.ipv6.running", "0"); });
  EXPECT_TRUE(routing.GetCurrentIpv6TarvikRoutes(PortsetGetRegular).empty());
  EXPECT_TRUE(routing.GetIpv6TvKernelDefaultGateway().IsUnspecified());
  ExpectRefused(
      [&] {
        routing.AddIpv6TarvikRoute(Ipv6Network("2001:db8:98::/48"), Ipv6Address("2001:db8:1::1"));
      },
      "IPv6 is disabled in the kernel");
}

TEST_F(IpServicesTest, DnsKeepsOrderRefusesDuplicatesAndSavesPerNetstack) {
  {
    DnsConfigImpl dns("defaultTcpipStack");
    dns.AddUserNameServer(IpAddress::FromString("10.0.0.53"));
    dns.AddUserNameServer(IpAddress::FromString("2001:DB8::35"));
    ExpectRefused([&] { dns.AddUserNameServer(IpAddress::FromString("10.0.0.53")); },
                  "The DNS server 10.0.0.53 is already configured for netstack "
                  "defaultTcpipStack");
    dns.AddUserSearchDomain("lab.example");
    dns.AddUserSearchDomain("example");
    ExpectRefused([&] { dns.AddUserSearchDomain("bad domain"); },
                  "Invalid search domain 'bad domain': expected a domain name made of letters, "
                  "digits, hyphens and dots");
    ExpectRefused([&] { dns.RemoveSearchDomain("other.example"); },
                  "The search domain other.example is not configured for netstack "
                  "defaultTcpipStack");
    dns.SaveConfig();
  }
  DnsConfigImpl reread("defaultTcpipStack");
  EXPECT_EQ((std::vector<std::string>{"10.0.0.53", "2001:db8::35"}), reread.GetNameServers());
  EXPECT_EQ("lab.example example", reread.GetSearchDomainsString());
  DnsConfigImpl ops("ops");
  EXPECT_TRUE(ops.GetNameServers().empty());
  DnsConfigImpl missing("nosuch");
  ExpectRefused([&] { missing.GetNameServers(); }, "Netstack instance nosuch does not exist");
}

TEST_F(IpServicesTest, DnsChangesOfTwoWritersAreBothKept) {
  DnsConfigImpl first("defaultTcpipStack");
  DnsConfigImpl second("defaultTcpipStack");
  first.AddUserNameServer(IpAddress::FromString("10.0.0.53"));
  second.AddUserNameServer(IpAddress::FromString("10.0.0.54"));
  first.SaveConfig();
  second.SaveConfig();
  EXPECT_EQ((std::vector<std::string>{"10.0.0.53", "10.0.0.54"}),
            DnsConfigImpl("defaultTcpipStack").GetNameServers());
  DnsConfigImpl clear("defaultTcpipStack");
  clear.RemoveNameServers();
  clear.SaveConfig();
  EXPECT_TRUE(DnsConfigImpl("defaultTcpipStack").GetNameServers().empty());
}

TEST_F(IpServicesTest, HostsEntriesAreCheckedAndSystemEntriesStayHidden) {
  Exec("INSERT INTO ipsvc_hosts(address, hostname, system) VALUES(0x7F000001, 'localhost', 1)");
  HostsFile hosts;
  hosts.AddEntryFromUser("10.0.0.20", "build01.lab.example", {"build01", "ci", "b1"}, "");
  hosts.AddEntryFromUser("2001:DB8::20", "build02", {}, "second builder");
  ExpectRefused([&] { hosts.AddEntryFromUser("10.0.0.20", "BUILD01.lab.example", {}, ""); },
                "An entry for 10.0.0.20 BUILD01.lab.example already exists");
  ExpectRefused([&] { hosts.AddEntryFromUser("10.0.0.256", "x", {}, ""); },
                "Invalid IP address '10.0.0.256'");
  ExpectRefused([&] { hosts.AddEntryFromUser("10.0.0.21", "-bad", {}, ""); },
                "Invalid host name '-bad'");
  ExpectRefused([&] { hosts.AddEntryFromUser("10.0.0.21", "ok", {"no_underscore"}, ""); },
                "Invalid alias 'no_underscore'");
  ExpectRefused([&] { hosts.AddEntryFromUser("10.0.0.21", "ok", {}, "two\nlines"); },
                "The comment must be a single line");
  auto entries = hosts.GetEntriesFromConfig();
  ASSERT_EQ(2u, entries.size());
  EXPECT_EQ((std::vector<std::string>{"build01", "ci", "b1"}), entries[0]->GetAliases());
  EXPECT_EQ("2001:db8::20", entries[1]->GetIpAddress());
  EXPECT_EQ("second builder", entries[1]->GetComment());

  ExpectRefused([&] { hosts.RemoveEntryFromUser("127.0.0.1", "localhost"); },
                "The entry for 127.0.0.1 localhost is a system entry and cannot be removed");
  ExpectRefused([&] { hosts.RemoveEntryFromUser("10.0.0.30", "build01"); },
                "No entry for 10.0.0.30 build01 exists");
  hosts.RemoveEntryFromUser("2001:db8:0::20", "build02");
  EXPECT_EQ(1u, hosts.GetEntriesFromConfig().size());
}

TEST_F(IpServicesTest, NeighborsAreListedPerNetstackAndRemovedOnlyWhenPresent) {
  RoutingInfoImpl routing("defaultTcpipStack");
  std::vector<HostCtl::Network::Ipv4Neighbor> v4;
  routing.GetCurrentIpv4TarvikNeighbors(v4, "", PortsetGetRegular);
  ASSERT_EQ(2u, v4.size());
  EXPECT_EQ("10.0.0.1", v4[0].GetAddress().GetStringAddress()); // vmk0 comes before vmk1
  EXPECT_EQ("10.0.9.9", v4[1].GetAddress().GetStringAddress());
  EXPECT_EQ("Dynamic", routing.GetIpv4NeighborType(v4[0]));
  std::vector<HostCtl::Network::Ipv6Neighbor> v6;
  routing.GetCurrentIpv6TarvikNeighbors(v6, "vmk0", PortsetGetRegular);
  ASSERT_EQ(1u, v6.size());
  EXPECT_EQ("Router", routing.GetIpv6NeighborType(v6[0]));
  EXPECT_EQ("Stale", routing.GetIpv6NeighborState(v6[0]));
  std::vector<HostCtl::Network::Ipv4Neighbor> system;
  routing.GetCurrentIpv4TarvikNeighbors(system, "", PortsetGetSystem);
  ASSERT_EQ(1u, system.size());
  EXPECT_EQ("vmk9", system[0].GetInterfaceName());

  ExpectRefused(
      [&] {
        routing.RemoveIpv4Neighbor({"172.16.0.1", ""});
      },
      "No IPv4 neighbor 172.16.0.1 in netstack defaultTcpipStack");
  ExpectRefused(
      [&] {
        routing.RemoveIpv4Neighbor({"10.0.0.1", "vmk1"});
      },
      "No IPv4 neighbor 10.0.0.1 on interface vmk1 in netstack defaultTcpipStack");
  ExpectRefused(
      [&] {
        routing.RemoveIpv4Neighbor({"10.0.0.300", ""});
      },
      "Invalid IPv4 address: 10.0.0.300");
  routing.RemoveIpv4Neighbor({"10.0.0.1", ""});
  v4.clear();
  routing.GetCurrentIpv4TarvikNeighbors(v4, "", PortsetGetRegular);
  EXPECT_EQ(1u, v4.size());
}

TEST_F(IpServicesTest, ConnectionsComeByProtocolWithTheirWorldNames) {
  TvkCtl::Network::NetworkInfoImpl network;
  std::vector<HostCtl::Network::TcpIpConnection> tcp;
  network.GetCurrentTcpTarvikConnections(tcp, "defaultTcpipStack");
  ASSERT_EQ(1u, tcp.size());
  EXPECT_EQ(22, tcp[0].localPort);
  std::vector<HostCtl::Network::TcpIpConnection> udp;
  network.GetCurrentUdpTarvikConnections(udp, "defaultTcpipStack");
  ASSERT_EQ(1u, udp.size());
  TvkCtl::Resource::ResourceInfoImpl resources;
  EXPECT_EQ("sshd", resources.GetWorldName(tcp[0].worldId));
  EXPECT_EQ("vm-web01", resources.GetWorldName(udp[0].worldId));
  EXPECT_EQ("", resources.GetWorldName(4242));
  ExpectRefused([&] { network.GetCurrentIpTarvikConnections(tcp, "nosuch"); },
                "Netstack instance nosuch does not exist");
}

IpSecSadParam MakeSa(const std::string& name, uint32_t spi) {
  IpSecSadParam sa;
  sa.name = name;
  sa.srcAddress = "2001:db8:1::5";
  sa.dstAddress = "2001:db8:2::9";
  sa.spi = spi;
  sa.encryptionAlgorithm = IpSecConfigImpl::StringToIpSecEncyptAlgo("aes128-cbc");
  sa.encryptionKey = "0123456789abcdef";
  sa.integrityAlgorithm = IpSecConfigImpl::StringToIpSecAuthAlgo("hmac-sha1");
  sa.integrityKey = "0x00112233445566778899aabbccddeeff00112233";
  return sa;
}

TEST_F(IpServicesTest, SecurityAssociationsCheckKeysAndUniqueness) {
  IpSecConfigImpl ipsec;
  ipsec.AddSADConfig(MakeSa("sa1", 500));
  ExpectRefused([&] { ipsec.AddSADConfig(MakeSa("sa1", 501)); }, "An SA named sa1 already exists");
  ExpectRefused([&] { ipsec.AddSADConfig(MakeSa(std::string(128, 's'), 501)); },
                "An SA name is at most 127 bytes long");
  ExpectRefused([&] { ipsec.AddSADConfig(MakeSa("sa2", 500)); },
                "The SA sa1 already uses destination 2001:db8:2::9 with that SPI");
  IpSecSadParam shortKey = MakeSa("sa3", 502);
  shortKey.encryptionKey = "0x0011";
  ExpectRefused([&] { ipsec.AddSADConfig(shortKey); },
                "The encryption key of aes128-cbc must be 16 ASCII characters or 0x followed by "
                "32 hex digits");
  IpSecSadParam nullWithKey = MakeSa("sa4", 503);
  nullWithKey.encryptionAlgorithm = 0;
  ExpectRefused([&] { ipsec.AddSADConfig(nullWithKey); },
                "The null encryption algorithm takes no key");
  nullWithKey.encryptionKey.clear();
  ipsec.AddSADConfig(nullWithKey);
  ExpectRefused([&] { IpSecConfigImpl::StringToIpSecMode("beet"); }, "Unknown IPsec mode 'beet'");
  std::vector<IpSecSadParam> list;
  ipsec.GetSADConfigList(list);
  ASSERT_EQ(2u, list.size());
  EXPECT_EQ("mature", IpSecConfigImpl::SA_STATE[list[0].state]);
  ExpectRefused([&] { ipsec.RemoveSADConfig("nosuch"); }, "No SA named nosuch exists");
}

TEST_F(IpServicesTest, PoliciesLoseTheirSaWhenItIsRemoved) {
  IpSecConfigImpl ipsec;
  ipsec.AddSADConfig(MakeSa("sa1", 500));
  IpSecSpdParam sp;
  sp.name = "sp1";
  sp.srcAddress = "2001:db8:1::";
  sp.srcPrefixLength = 64;
  sp.ulProto = IpSecConfigImpl::StringToIpSecULProtoType("tcp");
  sp.dstPort = 443;
  sp.action = IpSecConfigImpl::StringToIpSecAction("ipsec");
  sp.mode = 0;
  sp.saName = "sa1";
  ipsec.AddSPDConfig(sp);
  IpSecSpdParam same = sp;
  same.name = "sp2";
  ExpectRefused([&] { ipsec.AddSPDConfig(same); },
                "The SP sp1 already covers that traffic in that direction");
  same.ulProto = IpSecConfigImpl::StringToIpSecULProtoType("icmp6");
  ExpectRefused([&] { ipsec.AddSPDConfig(same); },
                "Ports can only be given with the tcp or udp protocol");
  same.dstPort = 0;
  same.saName = "sa9";
  ExpectRefused([&] { ipsec.AddSPDConfig(same); }, "No SA named sa9 exists");
  same.name = std::string(128, 'p');
  ExpectRefused([&] { ipsec.AddSPDConfig(same); }, "An SP name is at most 127 bytes long");

  ipsec.RemoveSADConfig("sa1");
  // A new SA of the same name does not take over the lost binding.
  ipsec.AddSADConfig(MakeSa("sa1", 600));
  std::vector<IpSecSpdParam> list;
  ipsec.GetSPDConfigList(list);
  ASSERT_EQ(1u, list.size());
  EXPECT_EQ("UNKNOWN", list[0].saName);
  ipsec.FlushSPDConfig();
  list.clear();
  ipsec.GetSPDConfigList(list);
  EXPECT_TRUE(list.empty());
  ExpectRefused([&] { ipsec.RemoveSPDConfig("sp1"); }, "No SP named sp1 exists");
}

TEST_F(IpServicesTest, FaultsDeclaredForAnOperationAreThrown) {
  Exec("INSERT INTO setting(key, value) VALUES('faults', '[{\"operation\": "
       "\"GetCurrentTarvikRoutes\", \"object\": \"defaultTcpipStack\", \"message\": "
       "\"routing table unreadable\"}]')");
  Model::Store::CloseHost();
  RoutingInfoImpl routing("defaultTcpipStack");
  ExpectRefused([&] { routing.GetCurrentTarvikRoutes(PortsetGetRegular); },
                "routing table unreadable");
  routing.SetNetstackInstanceKey("ops");
  EXPECT_EQ(1u, routing.GetCurrentTarvikRoutes(PortsetGetRegular).size());
}

/// A host description using every key of the IP services part.
const char* const kDescription = R"json({
  "netstacks": [{"key": "defaultTcpipStack"}, {"key": "ops"}],
  "interfaces": [
    {"name": "tvk0", "ipv4Type": "static", "ipv4Address": "10.20.0.5", "ipv4Netmask": "255.255.255.0",
     "ipv6Addresses": [{"address": "2001:db8:20::5", "prefix": 64}]},
    {"name": "tvk2", "netstack": "ops", "ipv4Type": "static", "ipv4Address": "172.16.0.5",
     "ipv4Netmask": "255.255.255.0"}
  ],
  "routes": [
    {"netstack": "defaultTcpipStack", "network": "default", "gateway": "10.20.0.1", "interface": "tvk0", "source": "config"},
    {"netstack": "ops", "network": "10.9.0.0/16", "gateway": "172.16.0.1", "interface": "tvk2", "source": "user"},
    {"netstack": "defaultTcpipStack", "network": "2001:db8:99::/48", "gateway": "2001:db8:20::1", "interface": "tvk0", "source": "user"}
  ],
  "defaultGateways": [{"netstack": "defaultTcpipStack", "ipv4": "10.20.0.1", "ipv6": "2001:db8:20::1"}],
  "dns": [{"netstack": "ops", "servers": ["172.16.0.53", "2001:db8::53"], "searchDomains": ["ops.example"]}],
  "hostsEntries": [
    {"address": "127.0.0.1", "hostname": "localhost", "system": true},
    {"address": "10.20.0.40", "hostname": "store01", "aliases": ["nas", "s1"], "comment": "storage"}
  ],
  "neighbors": [
    {"interface": "tvk0", "address": "10.20.0.1", "mac": "00:50:56:aa:00:01", "expiry": 60, "type": "Dynamic"},
    {"interface": "tvk0", "address": "2001:db8:20::1", "mac": "00:50:56:aa:00:01", "expiry": 30, "type": "Router", "state": "Probe"}
  ],
  "serviceWorlds": [{"id": 2101, "name": "remote-shell"}],
  "connections": [
    {"netstack": "ops", "protocol": "udp", "recvQueue": 1, "sendQueue": 2, "localAddress": "172.16.0.5", "localPort": 53,
     "foreignAddress": "0.0.0.0", "foreignPort": 0, "worldId": 2101, "state": 0, "ccAlgorithm": ""}
  ],
  "ipsecSAs": [
    {"name": "sa1", "source": "2001:db8:20::5", "destination": "2001:db8:20::9", "spi": 4096, "mode": "tunnel",
     "encryption": "3des-cbc", "encryptionKey": "abcdefghijklmnopqrstuvwx", "integrity": "hmac-sha1",
     "integrityKey": "abcdefghijklmnopqrst", "state": "dying", "lifetime": 600}
  ],
  "ipsecSPs": [
    {"name": "sp1", "source": "2001:db8:20::/64", "sourcePort": 0, "destination": "::/0", "destinationPort": 22,
     "protocol": "tcp", "direction": "in", "action": "ipsec", "mode": "tunnel", "saName": "sa1"},
    {"name": "sp2", "source": "::/0", "sourcePort": 0, "destination": "::/0", "destinationPort": 0,
     "protocol": "any", "direction": "out", "action": "none", "mode": "any", "saName": "UNKNOWN"}
  ]
})json";

/// The IP services keys of an exported host.
nlohmann::ordered_json ServiceKeys(const nlohmann::ordered_json& host) {
  nlohmann::ordered_json keys = nlohmann::ordered_json::object();
  for (const char* key : {"routes", "defaultGateways", "dns", "hostsEntries", "neighbors",
                          "serviceWorlds", "connections", "ipsecSAs", "ipsecSPs"})
    if (host.contains(key))
      keys[key] = host[key];
  return keys;
}

TEST_F(IpServicesTest, ExportThenImportGivesTheSameServices) {
  Model::Store& store = Model::Store::Host();
  Model::ImportHost(store, nlohmann::ordered_json::parse(kDescription));
  nlohmann::ordered_json first = Model::ExportHost(store);
  EXPECT_EQ(ServiceKeys(nlohmann::ordered_json::parse(kDescription)), ServiceKeys(first));
  Model::ImportHost(store, first);
  EXPECT_EQ(ServiceKeys(first), ServiceKeys(Model::ExportHost(store)));
  std::vector<IpSecSpdParam> sps;
  IpSecConfigImpl().GetSPDConfigList(sps);
  ASSERT_EQ(2u, sps.size());
  EXPECT_EQ("UNKNOWN", sps[1].saName);
}

TEST_F(IpServicesTest, ImportNamesTheBadFieldAndKeepsTheHost) {
  struct Case {
    const char* change; ///< JSON merged into the description.
    const char* error;  ///< Expected message.
  };
  const Case cases[] = {
      {R"({"routes": [{"network": "10.1.0.0/16", "gateway": "10.99.0.1"}]})",
       "routes[3].network: The gateway 10.99.0.1 is not reachable through any interface of "
       "netstack defaultTcpipStack"},
      {R"({"routes": [{"network": "10.1.0.0/16", "gateway": "10.20.0.1", "source": "bgp"}]})",
       "routes[3].source: expected one of user, config, dhcp"},
      {R"({"dns": [{"netstack": "nosuch"}]})",
       "dns[1].netstack: Netstack instance nosuch does not exist"},
      {R"({"hostsEntries": [{"address": "10.20.0.40", "hostname": "STORE01"}]})",
       "hostsEntries[2].address: An entry for 10.20.0.40 STORE01 already exists"},
      {R"({"neighbors": [{"interface": "tvk0", "address": "10.20.0.2", "mac": "00:50:56:aa:00:02", "state": "Stale"}]})",
       "neighbors[2].state: only IPv6 neighbours have a state"},
      {R"({"connections": [{"protocol": "sctp", "localAddress": "::", "foreignAddress": "::"}]})",
       "connections[1].protocol: expected one of tcp, udp, ip"},
      {R"({"ipsecSAs": [{"name": "sa2", "source": "2001:db8:20::5", "destination": "2001:db8:20::8", "spi": 4097, "encryption": "aes128-cbc", "encryptionKey": "short", "integrity": "hmac-sha1", "integrityKey": "abcdefghijklmnopqrst"}]})",
       "ipsecSAs[1].name: The encryption key of aes128-cbc must be 16 ASCII characters or 0x "
       "followed by 32 hex digits"},
  };
  for (const Case& c : cases) {
    nlohmann::ordered_json host = nlohmann::ordered_json::parse(kDescription);
    nlohmann::ordered_json change = nlohmann::ordered_json::parse(c.change);
    for (auto& [key, value] : change.items())
      for (const auto& element : value)
        host[key].push_back(element);
    Model::Store& store = Model::Store::Host();
    try {
      Model::ImportHost(store, host);
      ADD_FAILURE() << "imported: " << c.change;
    } catch (const Model::ImportError& e) {
      EXPECT_EQ(std::string(c.error), e.what());
    }
    // The host made by the fixture is still there.
    EXPECT_EQ(
        2u, RoutingInfoImpl("defaultTcpipStack").GetCurrentTarvikRoutes(PortsetGetRegular).size());
  }
}

} // namespace
