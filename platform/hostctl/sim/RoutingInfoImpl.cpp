//===- RoutingInfoImpl.cpp - Routes and neighbours of one netstack --------===//
#include "sim/RoutingInfoImpl.h"

#include "TvkCtl/Network/RoutingInfoImpl.h"

#include "HostCtl/Lib.h"
#include "model/IpServicesModel.h"
#include "model/Store.h"

#include <algorithm>
#include <optional>
#include <type_traits>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::Ipv4Address;
using HostCtl::Network::Ipv4Neighbor;
using HostCtl::Network::Ipv4Network;
using HostCtl::Network::Ipv4Route;
using HostCtl::Network::Ipv6Address;
using HostCtl::Network::Ipv6Neighbor;
using HostCtl::Network::Ipv6Network;
using HostCtl::Network::Ipv6Route;
using HostCtl::Network::PortsetGetType;
using Model::Statement;
using Model::Store;
namespace IpSvc = Model::IpSvc;

// The constants every host shares.
const Ipv4Network& DEFAULT_IPV4_ROUTE = TvkCtl::Network::RoutingInfoImpl::DEFAULT_IPV4_ROUTE;
const Ipv6Network& DEFAULT_IPV6_ROUTE = TvkCtl::Network::RoutingInfoImpl::DEFAULT_IPV6_ROUTE;
constexpr const char* SOURCE_USER = TvkCtl::Network::RoutingInfoImpl::SOURCE_USER;
constexpr const char* SOURCE_CONFIG = TvkCtl::Network::RoutingInfoImpl::SOURCE_CONFIG;
constexpr const char* SOURCE_CONNECTED = TvkCtl::Network::RoutingInfoImpl::SOURCE_CONNECTED;

namespace {

/// The text of a route's destination for messages.
template <typename Network> std::string Destination(const Network& network, const Network& dflt) {
  return network == dflt ? std::string("default") : network.GetStringAddress();
}

/// The text of a neighbour entry for messages.
template <typename Neighbor>
std::string NeighborText(const char* family, const Neighbor& neighbor,
                         const std::string& netstack) {
  std::string text =
      std::string("No ") + family + " neighbor " + neighbor.GetAddress().GetStringAddress();
  if (neighbor.GetInterfaceName().empty())
    return text + " in netstack " + netstack;
  return text + " on interface " + neighbor.GetInterfaceName() + " in netstack " + netstack;
}

/// Deletes the neighbour entries of one address; true when there were any.
template <typename Neighbor>
bool DeleteNeighbors(Store& store, int family, const Neighbor& neighbor,
                     const std::string& netstack) {
  Statement remove = store.Prepare(
      "DELETE FROM ipsvc_neighbor WHERE family = ?1 AND address = ?2 AND interface IN "
      "(SELECT name FROM tvknic WHERE netstack = ?3) AND (?4 = '' OR interface = ?4)");
  remove.Bind(1, family);
  IpSvc::BindAddress(remove, 2, neighbor.GetAddress());
  remove.Bind(3, netstack).Bind(4, neighbor.GetInterfaceName()).Run();
  return store.Changes() > 0;
}

/// The columns of NeighborRows.
enum NeighborColumn {
  kNeighborAddress,
  kNeighborMac,
  kNeighborInterface,
  kNeighborExpiry,
  kNeighborType,
  kNeighborState
};

/// The neighbour rows of a netstack (NeighborColumn).
Statement NeighborRows(Store& store, int family, const std::string& netstack,
                       const std::string& interfaceName, PortsetGetType selector) {
  Statement rows = store.Prepare(
      "SELECT n.address, n.mac, n.interface, n.expiry, n.type, n.state FROM ipsvc_neighbor n "
      "JOIN tvknic t ON t.name = n.interface WHERE t.netstack = ?1 AND t.system = ?2 AND "
      "n.family = ?3 AND (?4 = '' OR n.interface = ?4) ORDER BY t.ord, n.id");
  rows.BindAll(netstack, selector == HostCtl::Network::PortsetGetSystem, family, interfaceName);
  return rows;
}

} // namespace

RoutingInfoImpl::RoutingInfoImpl(std::string netstackKey) : netstack_(std::move(netstackKey)) {}

void RoutingInfoImpl::SetNetstackInstanceKey(const std::string& key) {
  netstack_ = key;
  Refresh();
}

void RoutingInfoImpl::Refresh() {
  sources_.Clear();
}

void RouteSources::Clear() {
  entries_.clear();
  entries_.shrink_to_fit();
  names_.clear();
  numbers_.clear();
  sorted_ = true;
}

void RouteSources::Add(uint64_t key, const std::string& source) {
  auto [name, added] = numbers_.try_emplace(source, static_cast<uint32_t>(names_.size()));
  if (added)
    names_.push_back(source);
  if (!entries_.empty() && key < entries_.back().first)
    sorted_ = false;
  entries_.emplace_back(key, name->second);
}

const std::string* RouteSources::Find(uint64_t key) {
  if (!sorted_) {
    // Stable, so that of the routes of one network the first listed counts.
    std::stable_sort(entries_.begin(), entries_.end(),
                     [](const auto& a, const auto& b) { return a.first < b.first; });
    sorted_ = true;
  }
  auto found = std::lower_bound(entries_.begin(), entries_.end(), key,
                                [](const auto& entry, uint64_t k) { return entry.first < k; });
  if (found == entries_.end() || found->first != key)
    return nullptr;
  return &names_[found->second];
}

uint64_t RoutingInfoImpl::SourceKey(const Ipv4Network& network) {
  return (uint64_t{network.GetNetwork().GetValue()} << 8) |
         static_cast<uint64_t>(network.GetPrefixLength());
}

// --- IPv4 routes -------------------------------------------------------------

std::vector<Ipv4Route> RoutingInfoImpl::GetCurrentTarvikRoutes(PortsetGetType selector) {
  Store& store = Store::Host();
  store.CheckFault("GetCurrentTarvikRoutes", netstack_);
  std::vector<Ipv4Route> routes;
  sources_.Clear();
  store.Read([&] {
    IpSvc::RequireNetstack(store, netstack_);
    bool system = selector == HostCtl::Network::PortsetGetSystem;
    Statement nics = store.Prepare(
        "SELECT name, ipv4_address, ipv4_netmask FROM tvknic WHERE netstack = ? AND system = ? "
        "AND enabled = 1 AND ipv4_address <> '0.0.0.0' ORDER BY ord");
    enum { kName, kIpv4Address, kIpv4Netmask };
    nics.BindAll(netstack_, system);
    while (nics.Step()) {
      uint32_t address = 0;
      uint32_t mask = 0;
      if (!Ipv4Address::Parse(nics.Text(kIpv4Address), address) ||
          !Ipv4Address::Parse(nics.Text(kIpv4Netmask), mask) || mask == 0 ||
          !Ipv4Address(mask).IsNetmask())
        continue;
      Ipv4Network network(Ipv4Address(address & mask), Ipv4Address(mask));
      sources_.Add(SourceKey(network), SOURCE_CONNECTED);
      routes.emplace_back(network, Ipv4Address(), nics.Text(kName));
    }
    Statement rows = store.Prepare(
        "SELECT network, prefix, gateway, interface, source FROM ipsvc_route WHERE netstack = ? "
        "AND family = 4 AND system = ? ORDER BY id");
    enum { kNetwork, kPrefix, kGateway, kInterface, kSource };
    rows.BindAll(netstack_, system);
    while (rows.Step()) {
      Ipv4Network network(IpSvc::Ipv4Column(rows, kNetwork),
                          Ipv4Address::FromPrefixLength(static_cast<int>(rows.Int(kPrefix))));
      sources_.Add(SourceKey(network), rows.Text(kSource));
      routes.emplace_back(network, IpSvc::Ipv4Column(rows, kGateway), rows.Text(kInterface));
    }
  });
  return routes;
}

void RoutingInfoImpl::AddTarvikRoute(const Ipv4Network& network, const Ipv4Address& gateway) {
  Store& store = Store::Host();
  store.CheckFault("AddTarvikRoute", netstack_);
  store.Write(
      [&] { IpSvc::InsertRoute(store, netstack_, network, gateway, "", SOURCE_USER, false); });
}

void RoutingInfoImpl::RemoveTarvikRoute(const Ipv4Network& network, const Ipv4Address& gateway) {
  Store& store = Store::Host();
  store.CheckFault("RemoveTarvikRoute", netstack_);
  store.Write([&] {
    IpSvc::RequireNetstack(store, netstack_);
    Statement remove =
        store.Prepare("DELETE FROM ipsvc_route WHERE netstack = ? AND family = 4 AND system = 0 "
                      "AND network = ? AND prefix = ? AND gateway = ?");
    remove.Bind(1, netstack_);
    IpSvc::BindAddress(remove, 2, network.GetNetwork());
    remove.Bind(3, network.GetPrefixLength());
    IpSvc::BindAddress(remove, 4, gateway);
    remove.Run();
    if (store.Changes() == 0)
      throw HostCtlException("No route to " + Destination(network, DEFAULT_IPV4_ROUTE) +
                             " through " + gateway.GetStringAddress() + " in netstack " +
                             netstack_);
  });
}

namespace {

/// The gateway of the ordinary default route of one family, if any (a route
/// of prefix length 0 has network 0.0.0.0 or ::, since host bits are refused).
template <typename Address>
std::optional<Address> RunningGateway(Store& store, const std::string& netstack, int family) {
  Statement row = store.Prepare("SELECT gateway FROM ipsvc_route WHERE netstack = ? AND family = ? "
                                "AND system = 0 AND prefix = 0");
  enum { kGateway };
  row.BindAll(netstack, family);
  if (!row.Step())
    return std::nullopt;
  if constexpr (std::is_same_v<Address, Ipv4Address>)
    return IpSvc::Ipv4Column(row, kGateway);
  else
    return IpSvc::Ipv6Column(row, kGateway);
}

} // namespace

Ipv4Address RoutingInfoImpl::GetTvKernelDefaultGateway() {
  Store& store = Store::Host();
  store.CheckFault("GetTvKernelDefaultGateway", netstack_);
  return store.Read([&] {
    IpSvc::RequireNetstack(store, netstack_);
    return RunningGateway<Ipv4Address>(store, netstack_, 4).value_or(Ipv4Address());
  });
}

Ipv4Address RoutingInfoImpl::GetTvKernelConfigDefaultGateway() {
  Store& store = Store::Host();
  store.CheckFault("GetTvKernelConfigDefaultGateway", netstack_);
  std::string gateway = store.Read([&] {
    IpSvc::RequireNetstack(store, netstack_);
    return IpSvc::ConfiguredGateway(store, netstack_, 4);
  });
  return gateway.empty() ? Ipv4Address() : Ipv4Address(gateway);
}

void RoutingInfoImpl::SetTvKernelDefaultGateway(const Ipv4Address& gateway, bool runningOnly) {
  Store& store = Store::Host();
  store.CheckFault("SetTvKernelDefaultGateway", netstack_);
  store.Write([&] {
    IpSvc::RequireNetstack(store, netstack_);
    store
        .Prepare("DELETE FROM ipsvc_route WHERE netstack = ? AND family = 4 AND system = 0 AND "
                 "prefix = 0")
        .Bind(1, netstack_)
        .Run();
    bool clear = gateway.GetValue() == 0;
    if (!clear)
      IpSvc::InsertRoute(store, netstack_, DEFAULT_IPV4_ROUTE, gateway, "", SOURCE_CONFIG, false);
    if (!runningOnly)
      IpSvc::PutConfiguredGateway(store, netstack_, 4, clear ? "" : gateway.GetStringAddress());
  });
}

std::string RoutingInfoImpl::GetDefaultGatewaySource(const Ipv4Network& network) {
  Store& store = Store::Host();
  store.CheckFault("GetDefaultGatewaySource", netstack_);
  if (const std::string* known = sources_.Find(SourceKey(network)))
    return *known;
  return store.Read([&] {
    Statement row = store.Prepare(
        "SELECT source FROM ipsvc_route WHERE netstack = ? AND family = 4 AND network = ? AND "
        "prefix = ? ORDER BY system");
    enum { kSource };
    row.Bind(1, netstack_);
    IpSvc::BindAddress(row, 2, network.GetNetwork());
    row.Bind(3, network.GetPrefixLength());
    if (row.Step())
      return row.Text(kSource);
    Statement nics = store.Prepare("SELECT ipv4_address, ipv4_netmask FROM tvknic WHERE netstack "
                                   "= ? AND enabled = 1 AND ipv4_address <> '0.0.0.0'");
    enum { kIpv4Address, kIpv4Netmask };
    nics.Bind(1, netstack_);
    while (nics.Step()) {
      uint32_t address = 0;
      uint32_t mask = 0;
      if (Ipv4Address::Parse(nics.Text(kIpv4Address), address) &&
          Ipv4Address::Parse(nics.Text(kIpv4Netmask), mask) &&
          Ipv4Network(Ipv4Address(address & mask), Ipv4Address(mask)) == network)
        return std::string(SOURCE_CONNECTED);
    }
    return std::string();
  });
}

// --- IPv6 routes -------------------------------------------------------------

std::vector<Ipv6Route> RoutingInfoImpl::GetCurrentIpv6TarvikRoutes(PortsetGetType selector) {
  Store& store = Store::Host();
  store.CheckFault("GetCurrentIpv6TarvikRoutes", netstack_);
  std::vector<Ipv6Route> routes;
  store.Read([&] {
    IpSvc::RequireNetstack(store, netstack_);
    if (!IpSvc::Ipv6Running(store, netstack_))
      return;
    bool system = selector == HostCtl::Network::PortsetGetSystem;
    Statement nics = store.Prepare(
        "SELECT t.name, a.address, a.prefix FROM tvknic_ipv6 a JOIN tvknic t ON t.name = a.nic "
        "WHERE t.netstack = ? AND t.system = ? AND t.enabled = 1 AND a.status <> 3 AND "
        "a.prefix > 0 AND a.prefix < 128 ORDER BY t.ord, a.ord");
    enum { kName, kAddress, kPrefix };
    nics.BindAll(netstack_, system);
    while (nics.Step()) {
      std::array<uint8_t, 16> bytes{};
      if (!Ipv6Address::Parse(nics.Text(kAddress), bytes))
        continue;
      int prefix = static_cast<int>(nics.Int(kPrefix));
      const auto mask = Ipv6Network::NetmaskFromNumber(prefix).GetBytes();
      for (int i = 0; i < 16; ++i)
        bytes[i] &= mask[i];
      routes.emplace_back(Ipv6Network(Ipv6Address(bytes), prefix), Ipv6Address(), nics.Text(kName));
    }
    Statement rows = store.Prepare(
        "SELECT network, prefix, gateway, interface FROM ipsvc_route WHERE netstack = ? AND "
        "family = 6 AND system = ? ORDER BY id");
    enum { kRowsNetwork, kRowsPrefix, kRowsGateway, kRowsInterface };
    rows.BindAll(netstack_, system);
    while (rows.Step())
      routes.emplace_back(Ipv6Network(IpSvc::Ipv6Column(rows, kRowsNetwork),
                                      static_cast<int>(rows.Int(kRowsPrefix))),
                          IpSvc::Ipv6Column(rows, kRowsGateway), rows.Text(kRowsInterface));
  });
  return routes;
}

void RoutingInfoImpl::AddIpv6TarvikRoute(const Ipv6Network& network, const Ipv6Address& gateway) {
  Store& store = Store::Host();
  store.CheckFault("AddIpv6TarvikRoute", netstack_);
  store.Write([&] {
    IpSvc::RequireNetstack(store, netstack_);
    IpSvc::RequireIpv6(store, netstack_);
    IpSvc::InsertRoute(store, netstack_, network, gateway, "", SOURCE_USER, false);
  });
}

void RoutingInfoImpl::RemoveIpv6TarvikRoute(const Ipv6Network& network,
                                            const Ipv6Address& gateway) {
  Store& store = Store::Host();
  store.CheckFault("RemoveIpv6TarvikRoute", netstack_);
  store.Write([&] {
    IpSvc::RequireNetstack(store, netstack_);
    IpSvc::RequireIpv6(store, netstack_);
    Statement remove =
        store.Prepare("DELETE FROM ipsvc_route WHERE netstack = ? AND family = 6 AND system = 0 "
                      "AND network = ? AND prefix = ? AND gateway = ?");
    remove.Bind(1, netstack_);
    IpSvc::BindAddress(remove, 2, network.GetAddress());
    remove.Bind(3, network.GetNetmask());
    IpSvc::BindAddress(remove, 4, gateway);
    remove.Run();
    if (store.Changes() == 0)
      throw HostCtlException("No route to " + Destination(network, DEFAULT_IPV6_ROUTE) +
                             " through " + gateway.GetStringAddress() + " in netstack " +
                             netstack_);
  });
}

Ipv6Address RoutingInfoImpl::GetIpv6TvKernelDefaultGateway() {
  Store& store = Store::Host();
  store.CheckFault("GetIpv6TvKernelDefaultGateway", netstack_);
  return store.Read([&] {
    IpSvc::RequireNetstack(store, netstack_);
    if (!IpSvc::Ipv6Running(store, netstack_))
      return Ipv6Address();
    return RunningGateway<Ipv6Address>(store, netstack_, 6).value_or(Ipv6Address());
  });
}

Ipv6Address RoutingInfoImpl::GetIpv6TvKernelConfigDefaultGateway() {
  Store& store = Store::Host();
  store.CheckFault("GetIpv6TvKernelConfigDefaultGateway", netstack_);
  std::string gateway = store.Read([&] {
    IpSvc::RequireNetstack(store, netstack_);
    return IpSvc::ConfiguredGateway(store, netstack_, 6);
  });
  return gateway.empty() ? Ipv6Address() : Ipv6Address(gateway);
}

void RoutingInfoImpl::SetIpv6TvKernelDefaultGateway(const Ipv6Address& gateway) {
  Store& store = Store::Host();
  store.CheckFault("SetIpv6TvKernelDefaultGateway", netstack_);
  store.Write([&] {
    IpSvc::RequireNetstack(store, netstack_);
    bool clear = gateway.IsUnspecified();
    if (!clear)
      IpSvc::RequireIpv6(store, netstack_);
    store
        .Prepare("DELETE FROM ipsvc_route WHERE netstack = ? AND family = 6 AND system = 0 AND "
                 "prefix = 0")
        .Bind(1, netstack_)
        .Run();
    if (!clear)
      IpSvc::InsertRoute(store, netstack_, DEFAULT_IPV6_ROUTE, gateway, "", SOURCE_CONFIG, false);
    IpSvc::PutConfiguredGateway(store, netstack_, 6, clear ? "" : gateway.GetStringAddress());
  });
}

// --- Neighbour caches --------------------------------------------------------

void RoutingInfoImpl::GetCurrentIpv4TarvikNeighbors(std::vector<Ipv4Neighbor>& list,
                                                    const std::string& interfaceName,
                                                    PortsetGetType selector) {
  Store& store = Store::Host();
  store.CheckFault("GetCurrentIpv4TarvikNeighbors", netstack_);
  store.Read([&] {
    IpSvc::RequireNetstack(store, netstack_);
    Statement rows = NeighborRows(store, 4, netstack_, interfaceName, selector);
    while (rows.Step())
      list.emplace_back(IpSvc::Ipv4Column(rows, kNeighborAddress), rows.Text(kNeighborMac),
                        rows.Text(kNeighborInterface), rows.Int(kNeighborExpiry),
                        static_cast<int>(rows.Int(kNeighborType)),
                        static_cast<int>(rows.Int(kNeighborState)));
  });
}

void RoutingInfoImpl::GetCurrentIpv6TarvikNeighbors(std::vector<Ipv6Neighbor>& list,
                                                    const std::string& interfaceName,
                                                    PortsetGetType selector) {
  Store& store = Store::Host();
  store.CheckFault("GetCurrentIpv6TarvikNeighbors", netstack_);
  store.Read([&] {
    IpSvc::RequireNetstack(store, netstack_);
    if (!IpSvc::Ipv6Running(store, netstack_))
      return;
    Statement rows = NeighborRows(store, 6, netstack_, interfaceName, selector);
    while (rows.Step())
      list.emplace_back(IpSvc::Ipv6Column(rows, kNeighborAddress), rows.Text(kNeighborMac),
                        rows.Text(kNeighborInterface), rows.Int(kNeighborExpiry),
                        static_cast<int>(rows.Int(kNeighborType)),
                        static_cast<int>(rows.Int(kNeighborState)));
  });
}

void RoutingInfoImpl::RemoveIpv4Neighbor(const Ipv4Neighbor& neighbor) {
  Store& store = Store::Host();
  store.CheckFault("RemoveIpv4Neighbor", netstack_);
  store.Write([&] {
    IpSvc::RequireNetstack(store, netstack_);
    if (!DeleteNeighbors(store, 4, neighbor, netstack_))
      throw HostCtlException(NeighborText("IPv4", neighbor, netstack_));
  });
}

void RoutingInfoImpl::RemoveIpv6Neighbor(const Ipv6Neighbor& neighbor) {
  Store& store = Store::Host();
  store.CheckFault("RemoveIpv6Neighbor", netstack_);
  store.Write([&] {
    IpSvc::RequireNetstack(store, netstack_);
    if (!DeleteNeighbors(store, 6, neighbor, netstack_))
      throw HostCtlException(NeighborText("IPv6", neighbor, netstack_));
  });
}

} // namespace Sim
