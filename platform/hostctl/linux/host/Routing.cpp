//===- linux/host/Routing.cpp - Routes and neighbours of a netstack --------===//
//
// Routes are those of the main table (ip route show), of every type; a route
// with several next hops is shown with its first. The source of a route is
// the kernel's protocol: "connected" for the kernel's own, "dhcp" for a DHCP
// client's or a router advertisement's, "user" for the rest. Neighbours are
// those `ip neigh show` lists (entries that need no resolution left out).
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "HostCtl/Network/Routing.h"
#include "LinuxNet/Neighbours.h"
#include "LinuxNet/Routes.h"
#include "TvkCtl/Network/RoutingInfoImpl.h"

#include <algorithm>
#include <unordered_map>

namespace LinuxHost {

using namespace HostCtl::Network;
namespace Ops = HostCtl::Backend;
using TvkCtl::Network::RoutingInfoImpl;

namespace {

const char* SourceOf(uint8_t protocol) {
  switch (protocol) {
  case 2:
    return RoutingInfoImpl::SOURCE_CONNECTED; // kernel
  case 9:                                     // router advertisement
  case 16:
    return RoutingInfoImpl::SOURCE_DHCP; // dhcp
  default:
    return RoutingInfoImpl::SOURCE_USER;
  }
}

/// The gateway and device of a route, its first hop for a multipath one.
std::pair<LinuxNet::IpAddress, std::string> HopOf(const LinuxNet::Route& route) {
  if (route.nextHops.empty())
    return {route.gateway, route.device};
  return {route.nextHops[0].gateway, route.nextHops[0].device};
}

/// Neighbour type codes of the routing service's table.
int TypeCode(const LinuxNet::Neighbour& n) {
  if (n.flags & 0x80)
    return 4; // Router
  if (n.state & LinuxNet::NudPermanent)
    return 2; // Static
  return 1;   // Dynamic
}
int StateCode(uint16_t state) {
  if (state & LinuxNet::NudIncomplete)
    return 0;
  if (state & LinuxNet::NudStale)
    return 2;
  if (state & LinuxNet::NudDelay)
    return 3;
  if (state & LinuxNet::NudProbe)
    return 4;
  if (state & LinuxNet::NudFailed)
    return 5;
  return 1; // Reachable, and permanent entries that need no probing.
}

class Routing final : public Ops::Routing {
public:
  Routing(Context& ctx, std::string netstack) : ctx_(ctx), netstack_(std::move(netstack)) {}

  void SetNetstackInstanceKey(const std::string& key) override {
    netstack_ = key;
    holder_.reset();
    ns_ = nullptr;
  }

  std::vector<Ipv4Route> GetCurrentTarvikRoutes(PortsetGetType selector) override {
    std::vector<Ipv4Route> routes;
    if (selector != PortsetGetRegular)
      return routes;
    for (const LinuxNet::Route& route : Routes(LinuxNet::Family::Ipv4)) {
      auto [gateway, device] = HopOf(route);
      Ipv4Network network(ToIpv4(route.destination.address),
                          Ipv4Address::FromPrefixLength(route.destination.length));
      routes.emplace_back(network, gateway.IsSet() ? ToIpv4(gateway) : Ipv4Address(), device);
    }
    return routes;
  }
  void AddTarvikRoute(const Ipv4Network& network, const Ipv4Address& gateway) override {
    Add(FromIpv4(network.GetNetwork()), network.GetPrefixLength(), FromIpv4(gateway),
        gateway.GetValue() == 0);
  }
  void RemoveTarvikRoute(const Ipv4Network& network, const Ipv4Address& gateway) override {
    Remove(FromIpv4(network.GetNetwork()), network.GetPrefixLength(), FromIpv4(gateway),
           gateway.GetValue() == 0);
  }
  Ipv4Address GetTvKernelDefaultGateway() override {
    for (const LinuxNet::Route& route : Routes(LinuxNet::Family::Ipv4))
      if (route.destination.length == 0 && HopOf(route).first.IsSet())
        return ToIpv4(HopOf(route).first);
    return Ipv4Address();
  }
  Ipv4Address GetTvKernelConfigDefaultGateway() override { return GetTvKernelDefaultGateway(); }
  void SetTvKernelDefaultGateway(const Ipv4Address& gateway, bool) override {
    SetDefault(LinuxNet::Family::Ipv4, FromIpv4(gateway), gateway.GetValue() == 0);
  }
  /// Asked once per listed route: the sources are indexed on first use.
  std::string GetDefaultGatewaySource(const Ipv4Network& network) override {
    if (!sources_) {
      sources_.emplace();
      sources_->reserve(Routes(LinuxNet::Family::Ipv4).size());
      for (const LinuxNet::Route& route : Routes(LinuxNet::Family::Ipv4))
        sources_->emplace(
            SourceKey(ToIpv4(route.destination.address).GetValue(), route.destination.length),
            route.protocol);
    }
    auto found =
        sources_->find(SourceKey(network.GetNetwork().GetValue(), network.GetPrefixLength()));
    return found == sources_->end() ? "" : SourceOf(found->second);
  }

  std::vector<Ipv6Route> GetCurrentIpv6TarvikRoutes(PortsetGetType selector) override {
    std::vector<Ipv6Route> routes;
    if (selector != PortsetGetRegular)
      return routes;
    for (const LinuxNet::Route& route : Routes(LinuxNet::Family::Ipv6)) {
      auto [gateway, device] = HopOf(route);
      routes.emplace_back(Ipv6Network(ToIpv6(route.destination.address), route.destination.length),
                          gateway.IsSet() ? ToIpv6(gateway) : Ipv6Address(), device);
    }
    return routes;
  }
  void AddIpv6TarvikRoute(const Ipv6Network& network, const Ipv6Address& gateway) override {
    Add(FromIpv6(network.GetAddress()), network.GetNetmask(), FromIpv6(gateway),
        gateway.IsUnspecified());
  }
  void RemoveIpv6TarvikRoute(const Ipv6Network& network, const Ipv6Address& gateway) override {
    Remove(FromIpv6(network.GetAddress()), network.GetNetmask(), FromIpv6(gateway),
           gateway.IsUnspecified());
  }
  Ipv6Address GetIpv6TvKernelDefaultGateway() override {
    for (const LinuxNet::Route& route : Routes(LinuxNet::Family::Ipv6))
      if (route.destination.length == 0 && HopOf(route).first.IsSet())
        return ToIpv6(HopOf(route).first);
    return Ipv6Address();
  }
  Ipv6Address GetIpv6TvKernelConfigDefaultGateway() override {
    return GetIpv6TvKernelDefaultGateway();
  }
  void SetIpv6TvKernelDefaultGateway(const Ipv6Address& gateway) override {
    SetDefault(LinuxNet::Family::Ipv6, FromIpv6(gateway), gateway.IsUnspecified());
  }

  void GetCurrentIpv4TarvikNeighbors(std::vector<Ipv4Neighbor>& list,
                                     const std::string& interfaceName,
                                     PortsetGetType selector) override {
    list.clear();
    if (selector != PortsetGetRegular)
      return;
    for (const LinuxNet::Neighbour& n : Neighbours(LinuxNet::Family::Ipv4, interfaceName))
      list.emplace_back(ToIpv4(n.address), LinuxNet::FormatHwAddress(n.lladdr), n.device, 0,
                        TypeCode(n), StateCode(n.state));
  }
  void GetCurrentIpv6TarvikNeighbors(std::vector<Ipv6Neighbor>& list,
                                     const std::string& interfaceName,
                                     PortsetGetType selector) override {
    list.clear();
    if (selector != PortsetGetRegular)
      return;
    for (const LinuxNet::Neighbour& n : Neighbours(LinuxNet::Family::Ipv6, interfaceName))
      list.emplace_back(ToIpv6(n.address), LinuxNet::FormatHwAddress(n.lladdr), n.device, 0,
                        TypeCode(n), StateCode(n.state));
  }
  void RemoveIpv4Neighbor(const Ipv4Neighbor& neighbor) override {
    RemoveNeighbour(FromIpv4(neighbor.GetAddress()), neighbor.GetInterfaceName());
  }
  void RemoveIpv6Neighbor(const Ipv6Neighbor& neighbor) override {
    RemoveNeighbour(FromIpv6(neighbor.GetAddress()), neighbor.GetInterfaceName());
  }

private:
  LinuxNet::Namespace& Ns() {
    if (!ns_)
      ns_ = &NetstackNamespace(ctx_, netstack_, holder_);
    return *ns_;
  }
  /// The main table of one family, read once per object.
  const std::vector<LinuxNet::Route>& Routes(LinuxNet::Family family) {
    auto& cache = family == LinuxNet::Family::Ipv4 ? v4_ : v6_;
    if (!cache)
      cache = Kernel([&] { return LinuxNet::ListRoutes(Ns(), family); });
    return *cache;
  }
  std::vector<LinuxNet::Neighbour> Neighbours(LinuxNet::Family family, const std::string& device) {
    std::vector<LinuxNet::Neighbour> all =
        Kernel([&] { return LinuxNet::ListNeighbours(Ns(), family); });
    std::erase_if(all, [&](const LinuxNet::Neighbour& n) {
      return (n.state & LinuxNet::NudNoArp) || (!device.empty() && n.device != device);
    });
    return all;
  }
  void Add(const LinuxNet::IpAddress& network, int length, const LinuxNet::IpAddress& gateway,
           bool direct) {
    if (direct)
      Refuse("A route on a Linux host needs a gateway; a directly connected network is the route "
             "of an interface's address");
    LinuxNet::RouteSpec spec;
    spec.destination = {network, static_cast<uint8_t>(length)};
    spec.gateway = gateway;
    Kernel([&] { LinuxNet::AddRoute(Ns(), spec); });
    Forget();
  }
  void Remove(const LinuxNet::IpAddress& network, int length, const LinuxNet::IpAddress& gateway,
              bool direct) {
    LinuxNet::RouteSpec spec;
    spec.destination = {network, static_cast<uint8_t>(length)};
    if (!direct)
      spec.gateway = gateway;
    spec.protocol = 0;
    Kernel([&] { LinuxNet::DeleteRoute(Ns(), spec); });
    Forget();
  }
  void SetDefault(LinuxNet::Family family, const LinuxNet::IpAddress& gateway, bool none) {
    LinuxNet::RouteSpec spec;
    spec.destination.address.family = family;
    if (none) {
      bool any = false;
      for (const LinuxNet::Route& route : Routes(family))
        any = any || route.destination.length == 0;
      if (any) {
        spec.protocol = 0;
        Kernel([&] { LinuxNet::DeleteRoute(Ns(), spec); });
      }
    } else {
      spec.gateway = gateway;
      Kernel([&] { LinuxNet::AddRoute(Ns(), spec, true); });
    }
    Forget();
  }
  void RemoveNeighbour(const LinuxNet::IpAddress& address, const std::string& device) {
    std::string dev = device;
    if (dev.empty())
      for (const LinuxNet::Neighbour& n : Neighbours(address.family, ""))
        if (n.address == address)
          dev = n.device;
    if (dev.empty())
      Refuse("neighbour " + address.ToString() + ": not found");
    Kernel([&] { LinuxNet::DeleteNeighbour(Ns(), dev, address); });
  }
  void Forget() {
    v4_.reset();
    v6_.reset();
    sources_.reset();
  }
  static uint64_t SourceKey(uint32_t network, int length) {
    return (uint64_t{network} << 8) | static_cast<uint8_t>(length);
  }

  Context& ctx_;                                   ///< The host.
  std::string netstack_;                           ///< Key.
  std::unique_ptr<LinuxNet::Namespace> holder_;    ///< Another netstack, opened.
  LinuxNet::Namespace* ns_ = nullptr;              ///< The netstack's namespace.
  std::optional<std::vector<LinuxNet::Route>> v4_; ///< Routes read.
  std::optional<std::vector<LinuxNet::Route>> v6_; ///< Routes read.
  /// Kernel protocol of each IPv4 route, by network and length.
  std::optional<std::unordered_map<uint64_t, uint8_t>> sources_;
};

} // namespace

std::unique_ptr<Ops::Routing> MakeRouting(Context& ctx, const std::string& netstack) {
  return std::make_unique<Routing>(ctx, netstack);
}

} // namespace LinuxHost
