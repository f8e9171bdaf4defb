//===- HostCtl/Network/IpConfig.h - IP configuration of a kernel interface -===//
//
// IpConfig is the whole IP configuration of one kernel network interface as a
// value: the IPv4 mode (static, DHCP or none) with address, netmask and
// gateway, the DHCP DNS flags, and the IPv6 switches, gateway and addresses.
// An interface hands out its running and its configured configuration and is
// changed by applying a whole configuration (TvkNic::SetIpConfig).
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Address.h"

#include <vector>

namespace HostCtl::Network {

/// IPv6 address type codes of Ipv6Network::GetIpv6AddressType.
enum Ipv6AddressType : int {
  Ipv6AddressStatic = 0,
  Ipv6AddressAutoconf = 7,
  Ipv6AddressDhcp = 9,
};

/// IPv6 address status codes of Ipv6Network::GetIpv6AddressStatus.
enum Ipv6AddressStatus : int {
  Ipv6StatusPreferred = 0,
  Ipv6StatusTentative = 2,
  Ipv6StatusDuplicated = 3,
  Ipv6StatusDeprecated = 5,
};

/// The IP configuration of a kernel network interface. A default IpConfig has
/// no IPv4 address (mode none), IPv6 enabled without DHCPv6 or router
/// advertisement, no gateways and no IPv6 addresses.
class IpConfig {
public:
  /// How the interface gets its IPv4 address.
  enum class Ipv4Mode { None, Static, Dhcp };

  // --- IPv4.
  Ipv4Mode GetIpv4Mode() const { return mode_; }
  bool GetUseDhcp() const { return mode_ == Ipv4Mode::Dhcp; }
  /// true switches to DHCP; false leaves DHCP for a static configuration with
  /// the current address.
  void SetUseDhcp(bool use);
  bool GetIpv4UseNone() const { return mode_ == Ipv4Mode::None; }
  /// Removes the IPv4 configuration: mode none, every address 0.0.0.0.
  void SetIpv4UseNone();
  const Ipv4Address& GetIpv4Address() const { return address_; }
  /// Sets a static address (the mode becomes static).
  void SetIpv4Address(const Ipv4Address& address);
  const Ipv4Address& GetIpv4Netmask() const { return netmask_; }
  void SetIpv4Netmask(const Ipv4Address& netmask) { netmask_ = netmask; }
  /// The directed broadcast address of address and netmask (0.0.0.0 without an
  /// address).
  Ipv4Address GetIpv4Broadcast() const;
  const Ipv4Address& GetIpv4Gateway() const { return gateway_; }
  void SetIpv4Gateway(const Ipv4Address& gateway) { gateway_ = gateway; }
  /// Use of DNS servers learnt by DHCPv4.
  bool GetDhcpDns() const { return dhcpDns_; }
  void SetDhcpDns(bool use) { dhcpDns_ = use; }

  // --- IPv6.
  bool GetUseIpv6() const { return useIpv6_; }
  void SetUseIpv6(bool use) { useIpv6_ = use; }
  bool GetUseIpv6Dhcp() const { return useIpv6Dhcp_; }
  void SetUseIpv6Dhcp(bool use) { useIpv6Dhcp_ = use; }
  bool GetUseIpv6RouterAdvertised() const { return useIpv6RouterAdv_; }
  void SetUseIpv6RouterAdvertised(bool use) { useIpv6RouterAdv_ = use; }
  /// Use of DNS servers learnt by DHCPv6 or router advertisement.
  bool GetIpv6DhcpDns() const { return ipv6DhcpDns_; }
  void SetIpv6DhcpDns(bool use) { ipv6DhcpDns_ = use; }
  /// The IPv6 gateway; the unspecified address when there is none.
  const Ipv6Address& GetIpv6Gateway() const { return ipv6Gateway_; }
  void SetIpv6Gateway(const Ipv6Address& gateway) { ipv6Gateway_ = gateway; }
  /// The interface's IPv6 addresses, in order.
  const std::vector<Ipv6Network>& GetIpv6Network() const { return ipv6Networks_; }
  /// Adds a static address; throws HostCtlException when the address is
  /// unspecified, multicast or already present (with any prefix length).
  void AddIpv6Network(const Ipv6Network& network);
  /// Removes the address with that prefix length; throws HostCtlException when
  /// it is not present.
  void RemoveIpv6Network(const Ipv6Network& network);
  /// Replaces the whole address list (as read from the host).
  void SetIpv6Networks(std::vector<Ipv6Network> networks) { ipv6Networks_ = std::move(networks); }

private:
  Ipv4Mode mode_ = Ipv4Mode::None;        ///< IPv4 mode.
  Ipv4Address address_;                   ///< IPv4 address.
  Ipv4Address netmask_;                   ///< IPv4 netmask.
  Ipv4Address gateway_;                   ///< IPv4 gateway; 0.0.0.0 for none.
  bool dhcpDns_ = false;                  ///< Use DHCPv4 DNS servers.
  bool useIpv6_ = true;                   ///< IPv6 enabled.
  bool useIpv6Dhcp_ = false;              ///< DHCPv6 enabled.
  bool useIpv6RouterAdv_ = false;         ///< Router advertisement enabled.
  bool ipv6DhcpDns_ = false;              ///< Use DHCPv6/RA DNS servers.
  Ipv6Address ipv6Gateway_;               ///< IPv6 gateway; "::" for none.
  std::vector<Ipv6Network> ipv6Networks_; ///< IPv6 addresses.
};

} // namespace HostCtl::Network
