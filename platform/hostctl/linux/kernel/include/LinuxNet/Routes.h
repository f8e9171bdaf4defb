//===- LinuxNet/Routes.h - Routes of a routing table -----------------------===//
//
// What `ip route` shows and changes, by default in the main table. A listing
// is one dump per family, filtered by table in the kernel.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "LinuxNet/Ip.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace LinuxNet {

class Namespace;

/// The main routing table.
inline constexpr uint32_t kMainTable = 254;

/// One next hop of a multipath route.
struct NextHop {
  IpAddress gateway;  ///< Unset for a directly connected hop.
  int index = 0;      ///< Outgoing interface index.
  std::string device; ///< Its name.
  uint8_t weight = 1; ///< Relative weight.
  uint8_t flags = 0;  ///< RTNH_F_* (1 dead, 4 onlink, 16 linkdown).
};

/// One route.
struct Route {
  Family family = Family::None; ///< IPv4 or IPv6.
  IpPrefix destination;         ///< Destination; length 0 is the default route.
  IpAddress gateway;            ///< Next hop; unset for a directly connected route.
  int index = 0;                ///< Outgoing interface index; 0 for none (blackhole) or multipath.
  std::string device;           ///< Its name.
  uint8_t protocol = 0;         ///< RTPROT_* (2 kernel, 3 boot, 4 static, 16 dhcp, 9 ra).
  uint8_t scope = 0;            ///< RT_SCOPE_* (0 universe, 253 link, 254 host).
  uint8_t type = 0;     ///< RTN_* (1 unicast, 2 local, 3 broadcast, 6 blackhole, 7 unreachable).
  uint32_t table = 0;   ///< Routing table.
  uint32_t metric = 0;  ///< RTA_PRIORITY.
  IpAddress prefSource; ///< Preferred source address; unset when none.
  uint32_t flags = 0;   ///< rtm_flags (RTNH_F_* of a single hop, RTM_F_*).
  uint32_t mtu = 0;     ///< Path MTU metric; 0 when none.
  std::vector<NextHop> nextHops; ///< Hops of a multipath route; empty otherwise.
};

/// The routes of \p table, of \p family or of both.
std::vector<Route> ListRoutes(Namespace& ns, Family family = Family::None,
                              uint32_t table = kMainTable);

/// A route to add or delete. For a delete, unset members match any route.
struct RouteSpec {
  IpPrefix destination;         ///< Destination.
  IpAddress gateway;            ///< Next hop; unset for a direct route.
  std::string device;           ///< Outgoing interface; empty lets the kernel find it.
  uint32_t metric = 0;          ///< 0: the kernel's default (0 for IPv4, 1024 for IPv6).
  uint8_t protocol = 4;         ///< RTPROT_STATIC unless told otherwise.
  uint8_t type = 1;             ///< RTN_UNICAST unless told otherwise.
  std::optional<uint8_t> scope; ///< Unset: link for a direct route, universe otherwise.
  IpAddress prefSource;         ///< Preferred source; unset for none.
  uint32_t table = kMainTable;  ///< Routing table.
};
/// Adds a route; refuses one that exists, unless \p replace.
void AddRoute(Namespace& ns, const RouteSpec& wanted, bool replace = false);
/// Deletes the route that \p wanted names.
void DeleteRoute(Namespace& ns, const RouteSpec& wanted);

/// Text of codes as `ip` prints them ("static", "link", "unicast").
std::string RouteProtocolName(uint8_t protocol);
std::string RouteScopeName(uint8_t scope);
std::string RouteTypeName(uint8_t type);

} // namespace LinuxNet
