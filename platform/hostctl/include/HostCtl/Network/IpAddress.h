//===- HostCtl/Network/IpAddress.h - An IPv4 or an IPv6 address -----------===//
//
// IpAddress holds either kind of IP address, for the operations that accept
// both (DNS servers). It is made from an Ipv4Address or an Ipv6Address.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Address.h"

#include <string>
#include <variant>

namespace HostCtl::Network {

/// An IPv4 or an IPv6 address.
class IpAddress {
public:
  IpAddress(const Ipv4Address& address) : value_(address) {}
  IpAddress(const Ipv6Address& address) : value_(address) {}
  /// Parses \p text as IPv4 first, then IPv6; throws HostCtlException when
  /// neither accepts it.
  static IpAddress FromString(const std::string& text);

  bool IsIpv4() const { return std::holds_alternative<Ipv4Address>(value_); }
  bool IsIpv6() const { return !IsIpv4(); }
  const Ipv4Address& GetIpv4() const { return std::get<Ipv4Address>(value_); }
  const Ipv6Address& GetIpv6() const { return std::get<Ipv6Address>(value_); }
  /// The canonical text of the address.
  std::string GetStringAddress() const;
  bool operator==(const IpAddress& other) const { return value_ == other.value_; }

private:
  std::variant<Ipv4Address, Ipv6Address> value_; ///< The address.
};

} // namespace HostCtl::Network
