//===- TvkCtl/Network/RoutingInfoImpl.h - Routing of one netstack ---------===//
//
// The routing service of one netstack instance: its IPv4 and IPv6 routing
// tables (static routes, the routes of the interfaces' own subnets and the
// default route), its running and configured default gateways, and its
// neighbour caches. A handle: every operation is the session's host's and
// reads or changes the host at once.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/PortsetGetType.h"
#include "HostCtl/Network/Routing.h"

#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Backend {
class Routing;
} // namespace HostCtl::Backend

namespace TvkCtl::Network {

class RoutingInfoImpl {
public:
  /// The network of the default route: 0.0.0.0/0.
  static const HostCtl::Network::Ipv4Network DEFAULT_IPV4_ROUTE;
  /// The network of the default route: ::/0.
  static const HostCtl::Network::Ipv6Network DEFAULT_IPV6_ROUTE;

  /// Sources of routes, as GetDefaultGatewaySource names them.
  static constexpr const char* SOURCE_USER = "user";           ///< Added by a user.
  static constexpr const char* SOURCE_CONFIG = "config";       ///< The configured default gateway.
  static constexpr const char* SOURCE_DHCP = "dhcp";           ///< Learnt from a DHCP lease.
  static constexpr const char* SOURCE_CONNECTED = "connected"; ///< An interface's own subnet.

  /// The service of netstack \p netstackKey (checked when first used).
  explicit RoutingInfoImpl(std::string netstackKey);
  ~RoutingInfoImpl();
  RoutingInfoImpl(RoutingInfoImpl&& other) noexcept;
  RoutingInfoImpl& operator=(RoutingInfoImpl&& other) noexcept;

  void SetNetstackInstanceKey(const std::string& key);
  const std::string& GetNetstackInstanceKey() const { return netstack_; }
  /// Drops what the service remembers of earlier reads.
  void Refresh();

  // --- IPv4 routes.
  /// The routes of the netstack: the subnets of its interfaces, then its
  /// static routes in the order they were added. The selector picks the
  /// ordinary or the system routes.
  std::vector<HostCtl::Network::Ipv4Route>
  GetCurrentTarvikRoutes(HostCtl::Network::PortsetGetType selector);
  /// Adds a static route through \p gateway; the outgoing interface is the
  /// interface whose subnet holds the gateway. Refuses a gateway that no
  /// interface reaches and a network that already has a route.
  void AddTarvikRoute(const HostCtl::Network::Ipv4Network& network,
                      const HostCtl::Network::Ipv4Address& gateway);
  /// Removes the static route to \p network through \p gateway.
  void RemoveTarvikRoute(const HostCtl::Network::Ipv4Network& network,
                         const HostCtl::Network::Ipv4Address& gateway);
  /// The gateway of the default route in use, or 0.0.0.0.
  HostCtl::Network::Ipv4Address GetTvKernelDefaultGateway();
  /// The configured default gateway, or 0.0.0.0.
  HostCtl::Network::Ipv4Address GetTvKernelConfigDefaultGateway();
  /// Sets the default gateway (0.0.0.0 clears it): the default route is
  /// replaced and, unless \p runningOnly, the configuration too.
  void SetTvKernelDefaultGateway(const HostCtl::Network::Ipv4Address& gateway, bool runningOnly);
  /// Where the route to \p network came from ("user", "config", "dhcp",
  /// "connected"); empty when the netstack has no route to it.
  std::string GetDefaultGatewaySource(const HostCtl::Network::Ipv4Network& network);

  // --- IPv6 routes (empty, and refused, while IPv6 is not running).
  std::vector<HostCtl::Network::Ipv6Route>
  GetCurrentIpv6TarvikRoutes(HostCtl::Network::PortsetGetType selector);
  void AddIpv6TarvikRoute(const HostCtl::Network::Ipv6Network& network,
                          const HostCtl::Network::Ipv6Address& gateway);
  void RemoveIpv6TarvikRoute(const HostCtl::Network::Ipv6Network& network,
                             const HostCtl::Network::Ipv6Address& gateway);
  HostCtl::Network::Ipv6Address GetIpv6TvKernelDefaultGateway();
  HostCtl::Network::Ipv6Address GetIpv6TvKernelConfigDefaultGateway();
  /// Sets the default gateway and its configuration; :: clears both.
  void SetIpv6TvKernelDefaultGateway(const HostCtl::Network::Ipv6Address& gateway);

  // --- Neighbour caches.
  /// Appends the entries of \p interfaceName (every interface of the netstack
  /// when empty) to \p list; the selector picks ordinary or system interfaces.
  void GetCurrentIpv4TarvikNeighbors(std::vector<HostCtl::Network::Ipv4Neighbor>& list,
                                     const std::string& interfaceName,
                                     HostCtl::Network::PortsetGetType selector);
  void GetCurrentIpv6TarvikNeighbors(std::vector<HostCtl::Network::Ipv6Neighbor>& list,
                                     const std::string& interfaceName,
                                     HostCtl::Network::PortsetGetType selector);
  std::string GetIpv4NeighborType(const HostCtl::Network::Ipv4Neighbor& neighbor) const;
  std::string GetIpv6NeighborType(const HostCtl::Network::Ipv6Neighbor& neighbor) const;
  std::string GetIpv6NeighborState(const HostCtl::Network::Ipv6Neighbor& neighbor) const;
  /// Removes the entries of that address (on that interface, or on every
  /// interface of the netstack); refuses when there is none.
  void RemoveIpv4Neighbor(const HostCtl::Network::Ipv4Neighbor& neighbor);
  void RemoveIpv6Neighbor(const HostCtl::Network::Ipv6Neighbor& neighbor);

  /// Texts of the neighbour type and IPv6 state codes, indexed by code.
  static const std::vector<std::string>& NeighborTypeNames();
  static const std::vector<std::string>& NeighborStateNames();

private:
  std::string netstack_;                           ///< Key of the netstack instance.
  std::unique_ptr<HostCtl::Backend::Routing> ops_; ///< The host's operations.
};

} // namespace TvkCtl::Network
