//===- IpConfig.cpp - IP configuration of a kernel interface --------------===//
#include "HostCtl/Network/IpConfig.h"

#include "HostCtl/Lib.h"

#include <algorithm>

namespace HostCtl::Network {

using HostCtl::Lib::HostCtlException;

void IpConfig::SetUseDhcp(bool use) {
  if (use)
    mode_ = Ipv4Mode::Dhcp;
  else if (mode_ == Ipv4Mode::Dhcp)
    mode_ = Ipv4Mode::Static;
}

void IpConfig::SetIpv4UseNone() {
  mode_ = Ipv4Mode::None;
  address_ = Ipv4Address();
  netmask_ = Ipv4Address();
  gateway_ = Ipv4Address();
}

void IpConfig::SetIpv4Address(const Ipv4Address& address) {
  mode_ = Ipv4Mode::Static;
  address_ = address;
}

Ipv4Address IpConfig::GetIpv4Broadcast() const {
  if (address_.GetValue() == 0)
    return Ipv4Address();
  return Ipv4Address(address_.GetValue() | ~netmask_.GetValue());
}

void IpConfig::AddIpv6Network(const Ipv6Network& network) {
  const Ipv6Address& address = network.GetAddress();
  if (address.IsUnspecified())
    throw HostCtlException("The unspecified address :: cannot be assigned to an interface");
  if (address.GetBytes()[0] == 0xff)
    throw HostCtlException("Multicast address " + address.GetStringAddress() +
                           " cannot be assigned to an interface");
  if (network.GetNetmask() < 1 || network.GetNetmask() > 128)
    throw HostCtlException("Prefix length " + std::to_string(network.GetNetmask()) +
                           " is out of range; it must be 1 to 128");
  for (const Ipv6Network& present : ipv6Networks_)
    if (present.GetAddress() == address)
      throw HostCtlException("Address " + address.GetStringAddress() +
                             " is already assigned to this interface as " +
                             present.GetStringAddress());
  Ipv6Network added(address, network.GetNetmask());
  added.SetIpv6AddressType(Ipv6AddressStatic);
  added.SetIpv6AddressStatus(Ipv6StatusPreferred);
  ipv6Networks_.push_back(added);
}

void IpConfig::RemoveIpv6Network(const Ipv6Network& network) {
  auto it = std::find(ipv6Networks_.begin(), ipv6Networks_.end(), network);
  if (it == ipv6Networks_.end())
    throw HostCtlException("Address " + network.GetStringAddress() +
                           " is not assigned to this interface");
  ipv6Networks_.erase(it);
}

} // namespace HostCtl::Network
