//===- linux/host/Interfaces.cpp - Kernel interfaces and their addresses ---===//
//
// A kernel interface is a link that is no bridge port (IsKernelInterface).
// Its IP configuration is what the kernel holds: the link's addresses, the
// default routes through it and its IPv6 sysctls. The kernel keeps only the
// running configuration, so the configured one is the same.
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "HostCtl/Network/IpConfig.h"
#include "HostCtl/Network/TvkNic.h"
#include "LinuxNet/Addresses.h"
#include "LinuxNet/Routes.h"
#include "LinuxNet/Sysctl.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

namespace LinuxHost {

using namespace HostCtl::Network;
namespace Ops = HostCtl::Backend;

namespace {

/// The IPv6 address type the kernel can tell: set by router advertisement
/// or made by the kernel (link-local), expiring (a DHCPv6 lease), else static.
int Ipv6Type(const LinuxNet::Address& address) {
  if (address.protocol == 2 || address.protocol == 3 || address.scope == 253)
    return Ipv6AddressAutoconf;
  if (address.IsDynamic())
    return Ipv6AddressDhcp;
  return Ipv6AddressStatic;
}
int Ipv6Status(const LinuxNet::Address& address) {
  if (address.flags & LinuxNet::AddrDadFailed)
    return Ipv6StatusDuplicated;
  if (address.flags & LinuxNet::AddrTentative)
    return Ipv6StatusTentative;
  if (address.flags & LinuxNet::AddrDeprecated)
    return Ipv6StatusDeprecated;
  return Ipv6StatusPreferred;
}

class Interface final : public TvkNic {
public:
  Interface(std::shared_ptr<LinuxNet::Namespace> ns, std::string netstack, LinuxNet::Link link)
      : holder_(std::move(ns)), ns_(*holder_), netstack_(std::move(netstack)),
        link_(std::move(link)) {}

  void Refresh() override {
    std::optional<LinuxNet::Link> link =
        Kernel([&] { return LinuxNet::GetLink(ns_, link_.name, false); });
    if (!link)
      Refuse("The interface " + link_.name + " is gone");
    link_ = std::move(*link);
  }
  std::string GetInterfaceName() override { return link_.name; }
  MacAddress GetMacAddress() override {
    std::array<uint8_t, 6> mac{};
    if (link_.address.size() == mac.size())
      std::copy(link_.address.begin(), link_.address.end(), mac.begin());
    return MacAddress(mac);
  }
  uint32_t GetMtu() override { return link_.mtu; }
  void SetMtu(uint32_t mtu) override {
    Change([&](LinuxNet::LinkChange& change) { change.mtu = mtu; });
  }
  /// The TCP segment the MTU allows over IPv4 (MTU less 40 bytes of headers).
  uint32_t GetTsoMss() override { return link_.mtu > 40 ? link_.mtu - 40 : 0; }
  uint32_t GetNumRxQueue() override { return link_.numRxQueues; }
  bool IsEnabled() override { return link_.adminUp; }
  void Enable() override {
    Change([](LinuxNet::LinkChange& change) { change.up = true; });
  }
  void Disable() override {
    Change([](LinuxNet::LinkChange& change) { change.up = false; });
  }
  std::unique_ptr<ConnectionPoint> GetConnectionPoint() override { return nullptr; }
  std::unique_ptr<TvkNicPort> GetPort() override { return nullptr; }
  std::string GetNetstackInstanceName() override { return netstack_; }

  IpConfig GetIpConfig() override {
    IpConfig config;
    std::vector<LinuxNet::Address> addresses = Kernel([&] { return LinuxNet::ListAddresses(ns_); });
    for (const LinuxNet::Address& a : addresses) {
      if (a.index != link_.index)
        continue;
      if (a.local.family == LinuxNet::Family::Ipv4 && config.GetIpv4UseNone() &&
          !(a.flags & LinuxNet::AddrSecondary)) {
        config.SetIpv4Address(ToIpv4(a.local));
        config.SetIpv4Netmask(Ipv4Address::FromPrefixLength(a.prefixLength));
        if (a.IsDynamic())
          config.SetUseDhcp(true);
      } else if (a.local.family == LinuxNet::Family::Ipv6) {
        networks_.emplace_back(ToIpv6(a.local), a.prefixLength);
        networks_.back().SetIpv6AddressType(Ipv6Type(a));
        networks_.back().SetIpv6AddressStatus(Ipv6Status(a));
      }
    }
    config.SetIpv6Networks(std::move(networks_));
    networks_.clear();
    for (const LinuxNet::Route& route : Kernel([&] { return LinuxNet::ListRoutes(ns_); })) {
      if (route.destination.length != 0 || route.index != link_.index || !route.gateway.IsSet())
        continue;
      if (route.family == LinuxNet::Family::Ipv4)
        config.SetIpv4Gateway(ToIpv4(route.gateway));
      else
        config.SetIpv6Gateway(ToIpv6(route.gateway));
    }
    config.SetUseIpv6(Sysctl("disable_ipv6") == "0");
    config.SetUseIpv6RouterAdvertised(Sysctl("accept_ra") != "0" && Sysctl("autoconf") != "0");
    config.SetUseIpv6Dhcp(false);
    return config;
  }
  IpConfig GetConfiguredIpConfig() override { return GetIpConfig(); }

  void SetIpConfig(const IpConfig& wanted) override {
    IpConfig current = GetIpConfig();
    if (wanted.GetUseDhcp() && !current.GetUseDhcp())
      Refuse(link_.name + ": a Linux host runs no DHCP client of its own; an address with a "
                          "lifetime comes from the DHCP client of the machine");
    if (wanted.GetUseIpv6Dhcp())
      Refuse(link_.name + ": a Linux host runs no DHCPv6 client of its own");
    SetIpv4(current, wanted);
    if (wanted.GetUseIpv6() != current.GetUseIpv6())
      SetSysctl("disable_ipv6", wanted.GetUseIpv6() ? "0" : "1");
    if (wanted.GetUseIpv6RouterAdvertised() != current.GetUseIpv6RouterAdvertised()) {
      SetSysctl("accept_ra", wanted.GetUseIpv6RouterAdvertised() ? "1" : "0");
      SetSysctl("autoconf", wanted.GetUseIpv6RouterAdvertised() ? "1" : "0");
    }
    SetIpv6(current, wanted);
  }

  // Tags and multicast memberships have no Linux counterpart.
  void Remove() override { Ops::Unavailable("RemoveTvKernelNic"); }
  void AddTag(TvkNicTagType, bool) override { Ops::Unavailable("AddTag"); }
  void RemoveTag(TvkNicTagType) override { Ops::Unavailable("RemoveTag"); }
  void GetTags(std::vector<TvkNicTagType>&) override { Ops::Unavailable("GetTags"); }
  std::vector<MulticastGroup> GetMulticastGroups() override {
    Ops::Unavailable("GetMulticastGroups");
  }

private:
  template <typename Edit> void Change(Edit edit) {
    LinuxNet::LinkChange change;
    edit(change);
    Kernel([&] { LinuxNet::ChangeLink(ns_, link_.name, change); });
    Refresh();
  }
  std::string Sysctl(const char* key) {
    try {
      return LinuxNet::ReadSysctl(ns_, "net.ipv6.conf." + link_.name + "." + key);
    } catch (const LinuxNet::Error&) {
      return "1"; // No IPv6 on this link (or in this kernel).
    }
  }
  void SetSysctl(const char* key, const char* value) {
    Kernel([&] { LinuxNet::WriteSysctl(ns_, "net.ipv6.conf." + link_.name + "." + key, value); });
  }
  void SetIpv4(const IpConfig& current, const IpConfig& wanted) {
    bool same = current.GetIpv4Mode() == wanted.GetIpv4Mode() &&
                current.GetIpv4Address() == wanted.GetIpv4Address() &&
                current.GetIpv4Netmask() == wanted.GetIpv4Netmask();
    if (!same && !wanted.GetUseDhcp()) {
      if (!wanted.GetIpv4UseNone() && !wanted.GetIpv4Netmask().IsNetmask())
        Refuse(link_.name + ": " + wanted.GetIpv4Netmask().GetStringAddress() +
               " is not a netmask");
      if (!current.GetIpv4UseNone())
        Kernel([&] {
          LinuxNet::DeleteAddress(ns_, link_.name,
                                  {FromIpv4(current.GetIpv4Address()),
                                   static_cast<uint8_t>(current.GetIpv4Netmask().PrefixLength())});
        });
      if (!wanted.GetIpv4UseNone()) {
        LinuxNet::AddressSpec spec;
        spec.device = link_.name;
        spec.prefix = {FromIpv4(wanted.GetIpv4Address()),
                       static_cast<uint8_t>(wanted.GetIpv4Netmask().PrefixLength())};
        if (spec.prefix.length < 31)
          spec.broadcast = FromIpv4(wanted.GetIpv4Broadcast());
        Kernel([&] { LinuxNet::AddAddress(ns_, spec); });
      }
    }
    SetGateway(FromIpv4(current.GetIpv4Gateway()), FromIpv4(wanted.GetIpv4Gateway()),
               current.GetIpv4Gateway().GetValue() == 0, wanted.GetIpv4Gateway().GetValue() == 0);
  }
  void SetIpv6(const IpConfig& current, const IpConfig& wanted) {
    auto has = [](const IpConfig& config, const Ipv6Network& network) {
      const auto& list = config.GetIpv6Network();
      return std::find(list.begin(), list.end(), network) != list.end();
    };
    for (const Ipv6Network& network : current.GetIpv6Network())
      if (network.GetIpv6AddressType() == Ipv6AddressStatic && !has(wanted, network))
        Kernel([&] {
          LinuxNet::DeleteAddress(
              ns_, link_.name,
              {FromIpv6(network.GetAddress()), static_cast<uint8_t>(network.GetNetmask())});
        });
    for (const Ipv6Network& network : wanted.GetIpv6Network())
      if (!has(current, network)) {
        LinuxNet::AddressSpec spec;
        spec.device = link_.name;
        spec.prefix = {FromIpv6(network.GetAddress()), static_cast<uint8_t>(network.GetNetmask())};
        spec.noDad = !DetectsDuplicates();
        Kernel([&] { LinuxNet::AddAddress(ns_, spec); });
      }
    SetGateway(FromIpv6(current.GetIpv6Gateway()), FromIpv6(wanted.GetIpv6Gateway()),
               current.GetIpv6Gateway().IsUnspecified(), wanted.GetIpv6Gateway().IsUnspecified());
  }
  /// Whether the kernel runs duplicate address detection for IPv6 addresses
  /// of this interface (it does unless accept_dad is off for the interface
  /// and for all). Where it does not, the address is added as not needing it,
  /// so that it is usable at once instead of tentative until the kernel's
  /// work queue gets to it.
  bool DetectsDuplicates() {
    auto enabled = [&](const std::string& key) {
      try {
        return std::atoi(LinuxNet::ReadSysctl(ns_, key).c_str()) > 0;
      } catch (const LinuxNet::Error&) {
        return true;
      }
    };
    return enabled("net.ipv6.conf.all.accept_dad") ||
           enabled("net.ipv6.conf." + link_.name + ".accept_dad");
  }
  /// The default route through this interface.
  void SetGateway(const LinuxNet::IpAddress& from, const LinuxNet::IpAddress& to, bool fromNone,
                  bool toNone) {
    if ((fromNone && toNone) || (!fromNone && !toNone && from == to))
      return;
    LinuxNet::RouteSpec route;
    route.destination.address.family = to.family;
    route.device = link_.name;
    if (!fromNone) {
      route.gateway = from;
      Kernel([&] { LinuxNet::DeleteRoute(ns_, route); });
    }
    if (!toNone) {
      route.gateway = to;
      Kernel([&] { LinuxNet::AddRoute(ns_, route, true); });
    }
  }

  std::shared_ptr<LinuxNet::Namespace> holder_; ///< Keeps the netstack open.
  LinuxNet::Namespace& ns_;                     ///< The interface's netstack.
  std::string netstack_;                        ///< Its key.
  LinuxNet::Link link_;                         ///< As last read.
  std::vector<Ipv6Network> networks_;           ///< Scratch of GetIpConfig.
};

class KernelNics final : public TvKernelNicInfo {
public:
  explicit KernelNics(Context& ctx) : ctx_(ctx) {}

  std::vector<std::unique_ptr<TvkNic>> GetTvKernelNics(int selector) override {
    return GetTvKernelNicsByInstanceKey(kDefaultNetstack, selector);
  }
  std::vector<std::unique_ptr<TvkNic>> GetTvKernelNicsByInstanceKey(const std::string& netstack,
                                                                    int selector) override {
    std::vector<std::unique_ptr<TvkNic>> nics;
    if (selector != 0)
      return nics; // A Linux host has no system interfaces.
    std::shared_ptr<LinuxNet::Namespace> ns = Namespace(netstack);
    for (LinuxNet::Link& link : Kernel([&] { return LinuxNet::ListLinks(*ns); }))
      if (IsKernelInterface(link))
        nics.push_back(std::make_unique<Interface>(ns, Key(netstack), std::move(link)));
    return nics;
  }
  std::unique_ptr<TvkNic> GetTvKernelNicByInterface(const std::string& name, bool,
                                                    int selector) override {
    if (selector != 0)
      return nullptr;
    std::optional<LinuxNet::Link> link = FindLink(ctx_, name);
    if (!link || !IsKernelInterface(*link))
      return nullptr;
    return std::make_unique<Interface>(Namespace(kDefaultNetstack), kDefaultNetstack,
                                       std::move(*link));
  }
  void GetTvkernelNicNamesByInstanceKey(std::vector<std::string>& names,
                                        const std::string& netstack, int selector) override {
    names.clear();
    for (const auto& nic : GetTvKernelNicsByInstanceKey(netstack, selector))
      names.push_back(nic->GetInterfaceName());
  }
  std::vector<std::unique_ptr<TvkNic>> GetTvKernelNicsByTag(TvkNicTagType) override {
    Ops::Unavailable("GetTvKernelNicsByTag");
  }
  std::unique_ptr<TvkNic> AddTvKernelNic(ConnectionPoint*, const std::string&, const IpConfig&,
                                         const MacAddress&, uint32_t, uint32_t, uint32_t,
                                         const std::string&, bool) override {
    Ops::Unavailable("AddTvKernelNic");
  }
  void RemoveTvKernelNic(ConnectionPoint*, const std::string&) override {
    Ops::Unavailable("RemoveTvKernelNic");
  }

private:
  static std::string Key(const std::string& netstack) {
    return netstack.empty() ? kDefaultNetstack : netstack;
  }
  /// The netstack's namespace, shared with the interfaces made from it.
  std::shared_ptr<LinuxNet::Namespace> Namespace(const std::string& netstack) {
    if (Key(netstack) == kDefaultNetstack)
      return std::shared_ptr<LinuxNet::Namespace>(&ctx_.ns, [](LinuxNet::Namespace*) {});
    std::unique_ptr<LinuxNet::Namespace> holder;
    NetstackNamespace(ctx_, netstack, holder);
    return std::shared_ptr<LinuxNet::Namespace>(std::move(holder));
  }
  Context& ctx_; ///< The host.
};

} // namespace

std::unique_ptr<TvKernelNicInfo> MakeKernelNics(Context& ctx) {
  return std::make_unique<KernelNics>(ctx);
}

} // namespace LinuxHost
