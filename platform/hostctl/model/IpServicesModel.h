//===- model/IpServicesModel.h - Rules of routes, DNS, hosts and IPsec ----===//
//
// The invariants of the IP services area, as functions over a store inside a
// transaction. The host operations (RoutingInfoImpl, DnsConfigImpl,
// HostsFile, IpSecConfigImpl) and the import of a host description both go
// through them, so that a description cannot create what a command could
// not. Refusals throw HostCtl::Lib::HostCtlException.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Address.h"
#include "HostCtl/Network/IpSec.h"
#include "model/Store.h"

#include <string>
#include <vector>

namespace Model::IpSvc {

/// Route addresses are kept as numbers: an IPv4 address as its value, an
/// IPv6 address as its 16 bytes in network order (a blob).
void BindAddress(Statement& statement, int index, const HostCtl::Network::Ipv4Address& address);
void BindAddress(Statement& statement, int index, const HostCtl::Network::Ipv6Address& address);
/// Binds the address \p text (IPv4 or IPv6, canonical or not) in its kept
/// form; throws HostCtlException for text that is neither.
void BindAddress(Statement& statement, int index, const std::string& text);
/// The canonical text of the address kept in \p column, of either family.
std::string AddressText(const Statement& row, int column);
/// The address kept in \p column (the unspecified address for anything else).
HostCtl::Network::Ipv4Address Ipv4Column(const Statement& row, int column);
HostCtl::Network::Ipv6Address Ipv6Column(const Statement& row, int column);

/// The key of the default netstack instance.
inline constexpr const char* kDefaultNetstack = "defaultTcpipStack";

/// Refuses a netstack instance that does not exist.
void RequireNetstack(Store& store, const std::string& netstack);
/// Whether IPv6 runs on \p netstack: the kernel switch and the netstack's own.
bool Ipv6Running(Store& store, const std::string& netstack);
/// Refuses an IPv6 change while IPv6 does not run on \p netstack.
void RequireIpv6(Store& store, const std::string& netstack);

/// The interface of \p netstack whose subnet holds \p gateway (longest
/// prefix first); throws when no interface reaches it.
std::string ReachingInterface(Store& store, const std::string& netstack,
                              const HostCtl::Network::Ipv4Address& gateway);
std::string ReachingInterface(Store& store, const std::string& netstack,
                              const HostCtl::Network::Ipv6Address& gateway);

/// Stores a route. An empty \p interfaceName is chosen by the gateway; a
/// given one must be an interface of the netstack. Refuses a network with
/// host bits set and a network that already has a route.
void InsertRoute(Store& store, const std::string& netstack,
                 const HostCtl::Network::Ipv4Network& network,
                 const HostCtl::Network::Ipv4Address& gateway, std::string interfaceName,
                 const std::string& source, bool system);
void InsertRoute(Store& store, const std::string& netstack,
                 const HostCtl::Network::Ipv6Network& network,
                 const HostCtl::Network::Ipv6Address& gateway, std::string interfaceName,
                 const std::string& source, bool system);
/// Whether \p source is a route source a description may give.
bool IsStoredRouteSource(const std::string& source);

/// The configured default gateway of one family, as text ("" when none).
std::string ConfiguredGateway(Store& store, const std::string& netstack, int family);
void PutConfiguredGateway(Store& store, const std::string& netstack, int family,
                          const std::string& gateway);

/// The resolver configuration of a netstack.
void LoadDns(Store& store, const std::string& netstack, std::vector<std::string>& servers,
             std::vector<std::string>& domains);
void SaveDns(Store& store, const std::string& netstack, const std::vector<std::string>& servers,
             const std::vector<std::string>& domains);
/// Refuses a malformed search domain.
/// Whether the resolver of \p netstack lists \p value: a server address, or
/// with \p domain a search domain in any case. Refuses a missing netstack.
bool HasDnsEntry(Store& store, const std::string& netstack, bool domain, const std::string& value);
/// Appends a server (or, with \p domain, a search domain) to the resolver of
/// \p netstack; an index keeps this O(log n).
void AppendDnsEntry(Store& store, const std::string& netstack, bool domain,
                    const std::string& value);
/// Removes a server (or, with \p domain, a search domain in any case).
void RemoveDnsEntry(Store& store, const std::string& netstack, bool domain,
                    const std::string& value);
/// Removes every server of \p netstack.
void ClearDnsServers(Store& store, const std::string& netstack);
void CheckSearchDomain(const std::string& domain);

/// Stores a hosts entry after checking it (see HostsFile::AddEntryFromUser).
void InsertHostsEntry(Store& store, const std::string& ip, const std::string& hostname,
                      const std::vector<std::string>& aliases, const std::string& comment,
                      bool system);

/// Stores an SA or an SP after checking it (see IpSecConfigImpl).
void InsertSa(Store& store, const HostCtl::Network::IpSecSadParam& sa);
void InsertSp(Store& store, const HostCtl::Network::IpSecSpdParam& sp);

} // namespace Model::IpSvc
