//===- TvkCtl/Network/RoutingInfoImpl.h - Routing of one netstack ---------===//
//
// The routing service of one netstack instance: its IPv4 and IPv6 routing
// tables (static routes, the routes of the interfaces' own subnets and the
// default route), its running and configured default gateways, and its
// neighbour caches. Every operation reads or changes the host at once.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/PortsetGetType.h"
#include "HostCtl/Network/Routing.h"
#include "backend/Backend.h"

#include <cstdint>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

namespace Sim {

/// The sources of the routes of one listing, by network key. A listing can
/// hold millions of routes but only a few distinct sources, so each route
/// costs one sorted (key, source number) pair: 16 bytes instead of a hash
/// node with its own string.
class RouteSources {
public:
  void Clear();
  /// Adds the source of the route with \p key; the first one of a key stays.
  void Add(uint64_t key, const std::string& source);
  /// The source added first for \p key, or nullptr.
  const std::string* Find(uint64_t key);

private:
  std::vector<std::pair<uint64_t, uint32_t>> entries_; ///< Key, index into names_.
  std::vector<std::string> names_;                     ///< Distinct sources.
  std::unordered_map<std::string, uint32_t> numbers_;  ///< Index of each name.
  bool sorted_ = true; ///< entries_ is in key order (stable: first added first).
};

class RoutingInfoImpl : public HostCtl::Backend::Routing {
public:
  /// The service of netstack \p netstackKey (checked when first used).
  explicit RoutingInfoImpl(std::string netstackKey);

  void SetNetstackInstanceKey(const std::string& key) override;
  const std::string& GetNetstackInstanceKey() const { return netstack_; }
  /// Drops what the service remembers of earlier reads.
  void Refresh() override;

  // --- IPv4 routes.
  /// The routes of the netstack: the subnets of its interfaces, then its
  /// static routes in the order they were added. The selector picks the
  /// ordinary or the system routes.
  std::vector<HostCtl::Network::Ipv4Route>
  GetCurrentTarvikRoutes(HostCtl::Network::PortsetGetType selector) override;
  /// Adds a static route through \p gateway; the outgoing interface is the
  /// interface whose subnet holds the gateway. Refuses a gateway that no
  /// interface reaches and a network that already has a route.
  void AddTarvikRoute(const HostCtl::Network::Ipv4Network& network,
                      const HostCtl::Network::Ipv4Address& gateway) override;
  /// Removes the static route to \p network through \p gateway.
  void RemoveTarvikRoute(const HostCtl::Network::Ipv4Network& network,
                         const HostCtl::Network::Ipv4Address& gateway) override;
  /// The gateway of the default route in use, or 0.0.0.0.
  HostCtl::Network::Ipv4Address GetTvKernelDefaultGateway() override;
  /// The configured default gateway, or 0.0.0.0.
  HostCtl::Network::Ipv4Address GetTvKernelConfigDefaultGateway() override;
  /// Sets the default gateway (0.0.0.0 clears it): the default route is
  /// replaced and, unless \p runningOnly, the configuration too.
  void SetTvKernelDefaultGateway(const HostCtl::Network::Ipv4Address& gateway,
                                 bool runningOnly) override;
  /// Where the route to \p network came from ("user", "config", "dhcp",
  /// "connected"); empty when the netstack has no route to it.
  std::string GetDefaultGatewaySource(const HostCtl::Network::Ipv4Network& network) override;

  // --- IPv6 routes (empty, and refused, while IPv6 is not running).
  std::vector<HostCtl::Network::Ipv6Route>
  GetCurrentIpv6TarvikRoutes(HostCtl::Network::PortsetGetType selector) override;
  void AddIpv6TarvikRoute(const HostCtl::Network::Ipv6Network& network,
                          const HostCtl::Network::Ipv6Address& gateway) override;
  void RemoveIpv6TarvikRoute(const HostCtl::Network::Ipv6Network& network,
                             const HostCtl::Network::Ipv6Address& gateway) override;
  HostCtl::Network::Ipv6Address GetIpv6TvKernelDefaultGateway() override;
  HostCtl::Network::Ipv6Address GetIpv6TvKernelConfigDefaultGateway() override;
  /// Sets the default gateway and its configuration; :: clears both.
  void SetIpv6TvKernelDefaultGateway(const HostCtl::Network::Ipv6Address& gateway) override;

  // --- Neighbour caches.
  /// Appends the entries of \p interfaceName (every interface of the netstack
  /// when empty) to \p list; the selector picks ordinary or system interfaces.
  void GetCurrentIpv4TarvikNeighbors(std::vector<HostCtl::Network::Ipv4Neighbor>& list,
                                     const std::string& interfaceName,
                                     HostCtl::Network::PortsetGetType selector) override;
  void GetCurrentIpv6TarvikNeighbors(std::vector<HostCtl::Network::Ipv6Neighbor>& list,
                                     const std::string& interfaceName,
                                     HostCtl::Network::PortsetGetType selector) override;
  /// Removes the entries of that address (on that interface, or on every
  /// interface of the netstack); refuses when there is none.
  void RemoveIpv4Neighbor(const HostCtl::Network::Ipv4Neighbor& neighbor) override;
  void RemoveIpv6Neighbor(const HostCtl::Network::Ipv6Neighbor& neighbor) override;

private:
  std::string netstack_; ///< Key of the netstack instance.
  /// The key of \p network in sources_: its address and prefix length.
  static uint64_t SourceKey(const HostCtl::Network::Ipv4Network& network);
  /// Sources of the routes the last IPv4 listing returned, by SourceKey.
  RouteSources sources_;
};

} // namespace Sim
