//===- HostCtl/Network/Routing.h - Route and neighbour records ------------===//
//
// The records that the routing service of a netstack hands out: routes of
// either IP family and entries of the neighbour caches (ARP for IPv4,
// neighbour discovery for IPv6).
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Address.h"

#include <cstdint>
#include <string>

namespace HostCtl::Network {

/// One IPv4 route: destination network, gateway and outgoing interface.
class Ipv4Route {
public:
  Ipv4Route() = default;
  Ipv4Route(Ipv4Network network, Ipv4Address gateway, std::string interfaceName)
      : network_(network), gateway_(gateway), interface_(std::move(interfaceName)) {}
  const Ipv4Network& GetNetwork() const { return network_; }
  const Ipv4Address& GetGateway() const { return gateway_; }
  /// The name of the outgoing kernel interface.
  const std::string& GetInterfaceName() const { return interface_; }

private:
  Ipv4Network network_;   ///< Destination.
  Ipv4Address gateway_;   ///< Next hop; 0.0.0.0 for a directly connected network.
  std::string interface_; ///< Outgoing kernel interface.
};

/// One IPv6 route: destination network, gateway and outgoing interface.
class Ipv6Route {
public:
  Ipv6Route() = default;
  Ipv6Route(Ipv6Network network, Ipv6Address gateway, std::string interfaceName)
      : network_(network), gateway_(gateway), interface_(std::move(interfaceName)) {}
  const Ipv6Network& GetNetwork() const { return network_; }
  const Ipv6Address& GetGateway() const { return gateway_; }
  /// The name of the outgoing kernel interface.
  const std::string& GetInterfaceName() const { return interface_; }

private:
  Ipv6Network network_;   ///< Destination.
  Ipv6Address gateway_;   ///< Next hop; :: for a directly connected network.
  std::string interface_; ///< Outgoing kernel interface.
};

/// One entry of a neighbour cache. Made from text, it names an entry to
/// remove: the address, and the interface (empty for every interface).
template <typename Address> class IpNeighbor {
public:
  IpNeighbor() = default;
  /// Parses \p address; throws HostCtlException when it is malformed.
  IpNeighbor(const std::string& address, std::string interfaceName)
      : address_(address), interface_(std::move(interfaceName)) {}
  IpNeighbor(Address address, std::string mac, std::string interfaceName, int64_t expiry, int type,
             int state)
      : address_(address), mac_(std::move(mac)), interface_(std::move(interfaceName)),
        expiry_(expiry), type_(type), state_(state) {}

  const Address& GetAddress() const { return address_; }
  /// "xx:xx:xx:xx:xx:xx".
  const std::string& GetMacAddress() const { return mac_; }
  const std::string& GetInterfaceName() const { return interface_; }
  /// Seconds until the entry expires.
  int64_t GetExpiry() const { return expiry_; }
  /// Type and state codes; their texts come from the routing service.
  int GetTypeCode() const { return type_; }
  int GetStateCode() const { return state_; }

private:
  Address address_;       ///< Neighbour's address.
  std::string mac_;       ///< Its link-layer address.
  std::string interface_; ///< Kernel interface it was learnt on.
  int64_t expiry_ = 0;    ///< Seconds until expiry.
  int type_ = 0;          ///< Type code.
  int state_ = 0;         ///< IPv6 reachability state code.
};

using Ipv4Neighbor = IpNeighbor<Ipv4Address>;
using Ipv6Neighbor = IpNeighbor<Ipv6Address>;

} // namespace HostCtl::Network
