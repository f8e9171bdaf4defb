//===- IpTest.cpp - Addresses, routes and neighbours against ip -----------===//
#include "Lab.h"

#include "LinuxNet/Addresses.h"
#include "LinuxNet/Error.h"
#include "LinuxNet/Neighbours.h"
#include "LinuxNet/Routes.h"

#include <cerrno>
#include <set>
#include <tuple>

using namespace LinuxNet;
using namespace LinuxNetTest;

namespace {

using AddressTest = LabTest;
using RouteTest = LabTest;
using NeighbourTest = LabTest;

/// ifname, address, prefix, scope, label, nodad, dynamic, valid lifetime.
using AddressKey =
    std::tuple<std::string, std::string, int, std::string, std::string, bool, bool, uint32_t>;

std::string ScopeText(uint8_t scope) {
  switch (scope) {
  case 0:
    return "global";
  case 253:
    return "link";
  case 254:
    return "host";
  default:
    return std::to_string(scope);
  }
}

std::set<AddressKey> OracleAddresses(const nlohmann::json& links) {
  std::set<AddressKey> keys;
  for (const auto& link : links)
    for (const auto& a : link["addr_info"])
      keys.emplace(link["ifname"], a["local"], a["prefixlen"], a["scope"], a.value("label", ""),
                   a.value("nodad", false), a.value("dynamic", false),
                   a.value("valid_life_time", 0u) == 4294967295u ? 0u : 1u);
  return keys;
}

std::set<AddressKey> OurAddresses(const std::vector<Address>& addresses) {
  std::set<AddressKey> keys;
  for (const Address& a : addresses)
    keys.emplace(a.device, a.local.ToString(), a.prefixLength, ScopeText(a.scope), a.label,
                 (a.flags & AddrNoDad) != 0, a.IsDynamic(), a.validLifetime == kForever ? 0u : 1u);
  return keys;
}

TEST_F(AddressTest, ListMatchesIpAddressShow) {
  // The IPv6 link-local addresses of links that are up come and go with
  // duplicate address detection; both reads see the same settled set.
  ExpectAgree([&] { return OurAddresses(ListAddresses(*ns_)); },
              [&] { return OracleAddresses(IpJson("address show")); });
  const auto ours = OurAddresses(ListAddresses(*ns_));
  EXPECT_TRUE(ours.count({"br0", "10.1.0.2", 24, "global", "br0", false, false, 0}));
  EXPECT_TRUE(ours.count({"br0", "2001:db8::2", 64, "global", "", true, false, 0}));
  for (const Address& a : ListAddresses(*ns_, Family::Ipv6))
    EXPECT_EQ(a.local.family, Family::Ipv6);
}

TEST_F(AddressTest, AddAndDeleteReachTheKernel) {
  AddressSpec v4;
  v4.device = "vmnic1";
  v4.prefix = IpPrefix::Parse("10.2.0.5/16");
  v4.broadcast = IpAddress::Parse("10.2.255.255");
  v4.label = "vmnic1:lab";
  v4.validLifetime = 600;
  v4.preferredLifetime = 300;
  AddAddress(*ns_, v4);
  AddressSpec v6;
  v6.device = "vmnic1";
  v6.prefix = IpPrefix::Parse("2001:db8:5::5/80");
  v6.noDad = true;
  AddAddress(*ns_, v6);

  const auto oracle = IpJson("address show vmnic1")[0]["addr_info"];
  ASSERT_EQ(oracle.size(), 2u);
  EXPECT_EQ(oracle[0]["local"], "10.2.0.5");
  EXPECT_EQ(oracle[0]["broadcast"], "10.2.255.255");
  EXPECT_EQ(oracle[0]["label"], "vmnic1:lab");
  EXPECT_TRUE(oracle[0].value("dynamic", false));
  EXPECT_LE(oracle[0]["valid_life_time"], 600);
  EXPECT_EQ(oracle[1]["local"], "2001:db8:5::5");
  EXPECT_EQ(oracle[1]["prefixlen"], 80);
  EXPECT_TRUE(oracle[1].value("nodad", false));
  ExpectAgree([&] { return OurAddresses(ListAddresses(*ns_)); },
              [&] { return OracleAddresses(IpJson("address show")); });
  for (const Address& a : ListAddresses(*ns_))
    if (a.device == "vmnic1" && a.local.family == Family::Ipv4) {
      EXPECT_TRUE(a.IsDynamic());
      EXPECT_EQ(a.broadcast.ToString(), "10.2.255.255");
    }

  ExpectError([&] { AddAddress(*ns_, v6); }, EEXIST,
              "address 2001:db8:5::5/80 on vmnic1: already exists");
  DeleteAddress(*ns_, "vmnic1", v4.prefix);
  DeleteAddress(*ns_, "vmnic1", v6.prefix);
  EXPECT_TRUE(IpJson("address show vmnic1")[0]["addr_info"].empty());
  ExpectError([&] { DeleteAddress(*ns_, "vmnic1", v4.prefix); }, EADDRNOTAVAIL,
              "address 10.2.0.5/16 on vmnic1: no such address");
  ExpectError([&] { DeleteAddress(*ns_, "nosuch0", v4.prefix); }, ENODEV,
              "the link nosuch0 does not exist");
}

/// dst, gateway, dev, protocol, scope, type, metric, as ip prints them.
using RouteKey = std::tuple<std::string, std::string, std::string, std::string, std::string,
                            std::string, uint32_t>;

std::set<RouteKey> OracleRoutes(const nlohmann::json& routes, int family) {
  std::set<RouteKey> keys;
  for (const auto& r : routes) {
    std::string dst = r["dst"];
    if (dst != "default" && dst.find('/') == std::string::npos)
      dst += family == 4 ? "/32" : "/128";
    keys.emplace(dst, r.value("gateway", ""), r.value("dev", ""), r.value("protocol", "boot"),
                 r.value("scope", "global"), r.value("type", "unicast"), r.value("metric", 0u));
  }
  return keys;
}

std::set<RouteKey> OurRoutes(const std::vector<Route>& routes) {
  std::set<RouteKey> keys;
  for (const Route& r : routes)
    keys.emplace(r.destination.ToString(), r.gateway.ToString(), r.device,
                 RouteProtocolName(r.protocol), RouteScopeName(r.scope), RouteTypeName(r.type),
                 r.metric);
  return keys;
}

TEST_F(RouteTest, MainTableMatchesIpRouteShow) {
  Ip("route add blackhole 203.0.113.0/24");
  Ip("route add 10.9.9.9 dev br0 metric 7");
  Ip("route add default via 10.1.0.1 proto dhcp");
  ExpectAgree([&] { return OurRoutes(ListRoutes(*ns_, Family::Ipv4)); },
              [&] { return OracleRoutes(IpJson("-4 route show"), 4); });
  ExpectAgree([&] { return OurRoutes(ListRoutes(*ns_, Family::Ipv6)); },
              [&] { return OracleRoutes(IpJson("-6 route show"), 6); });
  // The local table is not the main one.
  for (const Route& r : ListRoutes(*ns_))
    EXPECT_EQ(r.table, kMainTable);
  EXPECT_EQ(ListRoutes(*ns_, Family::Ipv4, 255).size(), IpJson("-4 route show table local").size());
}

TEST_F(RouteTest, ThousandsOfRoutesAreAllListed) {
  std::string batch;
  for (int i = 0; i < 3000; ++i)
    batch += "route add 172.16." + std::to_string(i / 250) + "." + std::to_string(i % 250) +
             "/32 via 10.1.0.1\n";
  ASSERT_EQ(Shell("printf '" + batch + "' | ip -n " + name_ + " -batch -").status, 0);
  const auto routes = ListRoutes(*ns_, Family::Ipv4);
  EXPECT_EQ(routes.size(), IpJson("-4 route show").size());
  EXPECT_EQ(OurRoutes(routes), OracleRoutes(IpJson("-4 route show"), 4));
}

TEST_F(RouteTest, AddReplaceAndDeleteReachTheKernel) {
  RouteSpec wanted;
  wanted.destination = IpPrefix::Parse("203.0.113.0/24");
  wanted.gateway = IpAddress::Parse("10.1.0.1");
  wanted.metric = 50;
  AddRoute(*ns_, wanted);
  auto j = IpJson("route show 203.0.113.0/24");
  ASSERT_EQ(j.size(), 1u);
  EXPECT_EQ(j[0]["gateway"], "10.1.0.1");
  EXPECT_EQ(j[0]["dev"], "br0");
  EXPECT_EQ(j[0]["metric"], 50);
  EXPECT_EQ(j[0]["protocol"], "static");
  ExpectError([&] { AddRoute(*ns_, wanted); }, EEXIST,
              "route 203.0.113.0/24 via 10.1.0.1: already exists");
  wanted.gateway = IpAddress::Parse("10.1.0.254");
  AddRoute(*ns_, wanted, true);
  EXPECT_EQ(IpJson("route show 203.0.113.0/24")[0]["gateway"], "10.1.0.254");

  RouteSpec direct;
  direct.destination = IpPrefix::Parse("2001:db8:7::/48");
  direct.device = "br0";
  AddRoute(*ns_, direct);
  j = IpJson("-6 route show 2001:db8:7::/48");
  ASSERT_EQ(j.size(), 1u);
  EXPECT_EQ(j[0]["dev"], "br0");

  RouteSpec far;
  far.destination = IpPrefix::Parse("192.0.2.0/24");
  far.gateway = IpAddress::Parse("192.168.77.1");
  try {
    AddRoute(*ns_, far);
    ADD_FAILURE() << "a route through an unreachable gateway was taken";
  } catch (const Error& e) {
    EXPECT_EQ(e.Code(), ENETUNREACH);
    EXPECT_EQ(std::string(e.what()).rfind("route 192.0.2.0/24 via 192.168.77.1: ", 0), 0u)
        << e.what();
  }

  RouteSpec gone;
  gone.destination = wanted.destination;
  DeleteRoute(*ns_, gone);
  DeleteRoute(*ns_, direct);
  EXPECT_TRUE(IpJson("route show 203.0.113.0/24").empty());
  EXPECT_TRUE(IpJson("-6 route show 2001:db8:7::/48").empty());
  ExpectError([&] { DeleteRoute(*ns_, gone); }, ESRCH, "route 203.0.113.0/24: not found");
}

/// dst, dev, lladdr, state.
using NeighbourKey = std::tuple<std::string, std::string, std::string, std::string>;

TEST_F(NeighbourTest, ListMatchesIpNeighShow) {
  auto oracle = [&] {
    std::set<NeighbourKey> keys;
    for (const auto& n : IpJson("neigh show"))
      keys.emplace(n["dst"], n["dev"], n.value("lladdr", ""), n["state"][0]);
    return keys;
  };
  auto ours = [&] {
    std::set<NeighbourKey> keys;
    for (const Neighbour& n : ListNeighbours(*ns_))
      if (!(n.state & NudNoArp))
        keys.emplace(n.address.ToString(), n.device, FormatHwAddress(n.lladdr),
                     NeighbourStateName(n.state));
    return keys;
  };
  ExpectAgree(ours, oracle);
  EXPECT_TRUE(ours().count({"2001:db8::9", "br0", "02:00:00:00:00:0a", "PERMANENT"}));
}

TEST_F(NeighbourTest, AddAndDeleteReachTheKernel) {
  NeighbourSpec wanted;
  wanted.device = "br0";
  wanted.address = IpAddress::Parse("10.1.0.20");
  wanted.lladdr = ParseHwAddress("02:00:00:00:00:20");
  AddNeighbour(*ns_, wanted);
  NeighbourSpec router;
  router.device = "br0";
  router.address = IpAddress::Parse("2001:db8::20");
  router.lladdr = ParseHwAddress("02:00:00:00:00:21");
  router.state = NudStale;
  router.router = true;
  AddNeighbour(*ns_, router);
  auto j = IpJson("neigh show 10.1.0.20");
  ASSERT_EQ(j.size(), 1u);
  EXPECT_EQ(j[0]["lladdr"], "02:00:00:00:00:20");
  EXPECT_EQ(j[0]["state"][0], "PERMANENT");
  j = IpJson("-6 neigh show 2001:db8::20");
  ASSERT_EQ(j.size(), 1u);
  EXPECT_EQ(j[0]["state"][0], "STALE");
  EXPECT_TRUE(j[0].contains("router"));

  ExpectError([&] { AddNeighbour(*ns_, wanted); }, EEXIST,
              "neighbour 10.1.0.20 on br0: already exists");
  wanted.lladdr = ParseHwAddress("02:00:00:00:00:22");
  AddNeighbour(*ns_, wanted, true);
  EXPECT_EQ(IpJson("neigh show 10.1.0.20")[0]["lladdr"], "02:00:00:00:00:22");
  DeleteNeighbour(*ns_, "br0", wanted.address);
  DeleteNeighbour(*ns_, "br0", router.address);
  EXPECT_TRUE(IpJson("neigh show 10.1.0.20").empty());
  ExpectError([&] { DeleteNeighbour(*ns_, "br0", wanted.address); }, ENOENT,
              "neighbour 10.1.0.20 on br0: not found");
}

TEST(IpText, AddressesAndPrefixesRoundTripAndRefuseJunk) {
  EXPECT_EQ(IpAddress::Parse("2001:DB8:0::1").ToString(), "2001:db8::1");
  EXPECT_EQ(IpPrefix::Parse("10.0.0.0/8").ToString(), "10.0.0.0/8");
  EXPECT_EQ(IpPrefix::Parse("0.0.0.0/0").ToString(), "default");
  EXPECT_EQ(IpPrefix::Parse("10.0.0.1").length, 32);
  for (const char* bad : {"10.0.0.0/33", "10.0.0.0/", "10.0.0.0/8x", "1.2.3", "::1/129", "x"})
    EXPECT_THROW(IpPrefix::Parse(bad), Error) << bad;
  EXPECT_EQ(FormatHwAddress(ParseHwAddress("02:AB:cd:00:00:01")), "02:ab:cd:00:00:01");
  for (const char* bad : {"", "02:ab:", "0g:00:00:00:00:00", "02-00-00-00-00-00", "2:00"})
    EXPECT_THROW(ParseHwAddress(bad), Error) << bad;
}

} // namespace
