//===- IpAddress.cpp - IPv4 or IPv6 address values -------------------------===//
#include "HostCtl/Network/IpAddress.h"

#include "HostCtl/Lib.h"

namespace HostCtl::Network {

IpAddress IpAddress::FromString(const std::string& text) {
  if (Ipv4Address::IsValidAddress(text))
    return IpAddress(Ipv4Address(text));
  if (Ipv6Address::IsValidAddress(text))
    return IpAddress(Ipv6Address(text));
  throw HostCtl::Lib::HostCtlException("Invalid IP address: " + text);
}

std::string IpAddress::GetStringAddress() const {
  return IsIpv4() ? GetIpv4().GetStringAddress() : GetIpv6().GetStringAddress();
}

} // namespace HostCtl::Network
