//===- model/IpServicesModel.cpp - Rules of routes, DNS, hosts and IPsec --===//
#include "model/IpServicesModel.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/Network/HostsFile.h"
#include "TvkCtl/Network/IpSecConfigImpl.h"
#include "TvkCtl/Network/RoutingInfoImpl.h"
#include "model/CoreModel.h"

#include <algorithm>
#include <cctype>

namespace Model::IpSvc {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::IpSecSadParam;
using HostCtl::Network::IpSecSpdParam;
using HostCtl::Network::Ipv4Address;
using HostCtl::Network::Ipv4Network;
using HostCtl::Network::Ipv6Address;
using HostCtl::Network::Ipv6Network;
using TvkCtl::Network::IpSecConfigImpl;
using TvkCtl::Network::RoutingInfoImpl;

namespace {

/// The text of a route's destination for messages.
std::string Destination(const Ipv4Network& network) {
  return network == RoutingInfoImpl::DEFAULT_IPV4_ROUTE ? std::string("default")
                                                        : network.GetStringAddress();
}
std::string Destination(const Ipv6Network& network) {
  return network == RoutingInfoImpl::DEFAULT_IPV6_ROUTE ? std::string("default")
                                                        : network.GetStringAddress();
}

/// Whether the interfaces' own subnets of \p netstack include \p network.
bool IsConnectedNetwork(Store& store, const std::string& netstack, const Ipv4Network& network) {
  Statement rows = store.Prepare("SELECT ipv4_address, ipv4_netmask FROM tvknic WHERE netstack = "
                                 "? AND enabled = 1 AND ipv4_address <> '0.0.0.0'");
  enum { kIpv4Address, kIpv4Netmask };
  rows.Bind(1, netstack);
  while (rows.Step()) {
    uint32_t address = 0;
    uint32_t mask = 0;
    if (!Ipv4Address::Parse(rows.Text(kIpv4Address), address) ||
        !Ipv4Address::Parse(rows.Text(kIpv4Netmask), mask))
      continue;
    if (Ipv4Network(Ipv4Address(address & mask), Ipv4Address(mask)) == network)
      return true;
  }
  return false;
}

bool IsConnectedNetwork(Store& store, const std::string& netstack, const Ipv6Network& network) {
  Statement rows =
      store.Prepare("SELECT a.address, a.prefix FROM tvknic_ipv6 a JOIN tvknic t ON t.name = "
                    "a.nic WHERE t.netstack = ? AND t.enabled = 1 AND a.status <> 3");
  enum { kAddress, kPrefix };
  rows.Bind(1, netstack);
  while (rows.Step()) {
    std::array<uint8_t, 16> bytes{};
    if (!Ipv6Address::Parse(rows.Text(kAddress), bytes))
      continue;
    int prefix = static_cast<int>(rows.Int(kPrefix));
    const auto mask = Ipv6Network::NetmaskFromNumber(prefix).GetBytes();
    for (int i = 0; i < 16; ++i)
      bytes[i] &= mask[i];
    if (Ipv6Network(Ipv6Address(bytes), prefix) == network)
      return true;
  }
  return false;
}

/// Refuses an interface name that is not an interface of \p netstack.
void RequireInterfaceOf(Store& store, const std::string& netstack, const std::string& name) {
  Statement row = store.Prepare("SELECT netstack FROM tvknic WHERE name = ?");
  enum { kNetstack };
  row.Bind(1, name);
  if (!row.Step())
    throw HostCtlException("Interface " + name + " does not exist");
  if (row.Text(kNetstack) != netstack)
    throw HostCtlException("Interface " + name + " is not on netstack " + netstack);
}

template <typename Address>
void StoreRoute(Store& store, const std::string& netstack, int family, const Address& network,
                int prefix, const Address& gateway, const std::string& interfaceName,
                const std::string& source, bool system) {
  Statement insert =
      store.Prepare("INSERT INTO ipsvc_route(netstack, family, system, network, prefix, gateway, "
                    "interface, source) VALUES(?1, ?2, ?3, ?4, ?5, ?6, ?7, ?8)");
  insert.BindAll(netstack, family, system);
  BindAddress(insert, 4, network);
  insert.Bind(5, prefix);
  BindAddress(insert, 6, gateway);
  insert.Bind(7, interfaceName).Bind(8, source).Run();
}

template <typename Address>
bool RouteExists(Store& store, const std::string& netstack, int family, bool system,
                 const Address& network, int prefix) {
  Statement row = store.Prepare("SELECT 1 FROM ipsvc_route WHERE netstack = ?1 AND family = ?2 "
                                "AND system = ?3 AND network = ?4 AND prefix = ?5");
  row.BindAll(netstack, family, system);
  BindAddress(row, 4, network);
  row.Bind(5, prefix);
  return row.Step();
}

bool IsHexDigits(const std::string& text, std::size_t from) {
  return std::all_of(text.begin() + static_cast<std::ptrdiff_t>(from), text.end(),
                     [](unsigned char c) { return std::isxdigit(c) != 0; });
}

/// Refuses a key that does not have \p bytes bytes, given as ASCII text or as
/// "0x" followed by hex digits.
void CheckKey(const std::string& what, const std::string& algorithm, const std::string& key,
              int bytes) {
  if (bytes == 0) {
    if (!key.empty())
      throw HostCtlException("The " + algorithm + " " + what + " algorithm takes no key");
    return;
  }
  std::string expected = "The " + what + " key of " + algorithm + " must be " +
                         std::to_string(bytes) + " ASCII characters or 0x followed by " +
                         std::to_string(bytes * 2) + " hex digits";
  bool hex = key.size() > 2 && key[0] == '0' && (key[1] == 'x' || key[1] == 'X');
  if (hex) {
    if (key.size() != 2 + static_cast<std::size_t>(bytes) * 2 || !IsHexDigits(key, 2))
      throw HostCtlException(expected);
    return;
  }
  bool printable =
      std::all_of(key.begin(), key.end(), [](unsigned char c) { return c >= 0x20 && c < 0x7f; });
  if (key.size() != static_cast<std::size_t>(bytes) || !printable)
    throw HostCtlException(expected);
}

/// Canonical text of an IPv6 address; throws on malformed text.
std::string CanonicalIpv6(const std::string& text) {
  return Ipv6Address(text).GetStringAddress();
}

} // namespace

void BindAddress(Statement& statement, int index, const Ipv4Address& address) {
  statement.Bind(index, static_cast<int64_t>(address.GetValue()));
}

void BindAddress(Statement& statement, int index, const Ipv6Address& address) {
  statement.BindBlob(index, address.GetBytes().data(), 16);
}

void BindAddress(Statement& statement, int index, const std::string& text) {
  if (Ipv4Address::IsValidAddress(text))
    BindAddress(statement, index, Ipv4Address(text));
  else if (Ipv6Address::IsValidAddress(text))
    BindAddress(statement, index, Ipv6Address(text));
  else
    throw HostCtlException("Invalid IP address '" + text + "'");
}

std::string AddressText(const Statement& row, int column) {
  std::array<uint8_t, 16> bytes{};
  if (row.Blob(column, bytes.data(), bytes.size()))
    return Ipv6Address(bytes).GetStringAddress();
  return Ipv4Column(row, column).GetStringAddress();
}

Ipv4Address Ipv4Column(const Statement& row, int column) {
  return Ipv4Address(static_cast<uint32_t>(row.Int(column)));
}

Ipv6Address Ipv6Column(const Statement& row, int column) {
  std::array<uint8_t, 16> bytes{};
  row.Blob(column, bytes.data(), bytes.size());
  return Ipv6Address(bytes);
}

void RequireNetstack(Store& store, const std::string& netstack) {
  Statement row = store.Prepare("SELECT 1 FROM netstack WHERE key = ?");
  row.Bind(1, netstack);
  if (!row.Step())
    throw HostCtlException("Netstack instance " + netstack + " does not exist");
}

bool Ipv6Running(Store& store, const std::string& netstack) {
  std::optional<std::string> kernel = GetSetting(store, "tvk.ipv6.running");
  if (kernel && *kernel == "0")
    return false;
  Statement row = store.Prepare("SELECT cur_ipv6 FROM netstack WHERE key = ?");
  enum { kCurIpv6 };
  row.Bind(1, netstack);
  return row.Step() && row.Bool(kCurIpv6);
}

void RequireIpv6(Store& store, const std::string& netstack) {
  std::optional<std::string> kernel = GetSetting(store, "tvk.ipv6.running");
  if (kernel && *kernel == "0")
    throw HostCtlException("IPv6 is disabled in the kernel");
  if (!Ipv6Running(store, netstack))
    throw HostCtlException("IPv6 is disabled on netstack " + netstack);
}

std::string ReachingInterface(Store& store, const std::string& netstack,
                              const Ipv4Address& gateway) {
  Statement rows = store.Prepare(
      "SELECT name, ipv4_address, ipv4_netmask FROM tvknic WHERE netstack = ? AND enabled = 1 "
      "AND ipv4_address <> '0.0.0.0' ORDER BY ord");
  enum { kName, kIpv4Address, kIpv4Netmask };
  rows.Bind(1, netstack);
  std::string best;
  int bestLength = -1;
  while (rows.Step()) {
    uint32_t address = 0;
    uint32_t mask = 0;
    if (!Ipv4Address::Parse(rows.Text(kIpv4Address), address) ||
        !Ipv4Address::Parse(rows.Text(kIpv4Netmask), mask))
      continue;
    Ipv4Address netmask(mask);
    if (!netmask.IsNetmask() || mask == 0)
      continue;
    if (Ipv4Network(Ipv4Address(address), netmask).Contains(gateway) &&
        netmask.PrefixLength() > bestLength) {
      best = rows.Text(kName);
      bestLength = netmask.PrefixLength();
    }
  }
  if (best.empty())
    throw HostCtlException("The gateway " + gateway.GetStringAddress() +
                           " is not reachable through any interface of netstack " + netstack);
  return best;
}

std::string ReachingInterface(Store& store, const std::string& netstack,
                              const Ipv6Address& gateway) {
  Statement rows = store.Prepare(
      "SELECT t.name, a.address, a.prefix FROM tvknic_ipv6 a JOIN tvknic t ON t.name = a.nic "
      "WHERE t.netstack = ? AND t.enabled = 1 AND a.status <> 3 ORDER BY t.ord, a.ord");
  enum { kName, kAddress, kPrefix };
  rows.Bind(1, netstack);
  std::string best;
  int bestLength = -1;
  while (rows.Step()) {
    std::array<uint8_t, 16> bytes{};
    int prefix = static_cast<int>(rows.Int(kPrefix));
    if (!Ipv6Address::Parse(rows.Text(kAddress), bytes) || prefix <= 0 || prefix >= 128)
      continue;
    if (Ipv6Network(Ipv6Address(bytes), prefix).Contains(gateway) && prefix > bestLength) {
      best = rows.Text(kName);
      bestLength = prefix;
    }
  }
  if (best.empty())
    throw HostCtlException("The gateway " + gateway.GetStringAddress() +
                           " is not reachable through any interface of netstack " + netstack);
  return best;
}

void InsertRoute(Store& store, const std::string& netstack, const Ipv4Network& network,
                 const Ipv4Address& gateway, std::string interfaceName, const std::string& source,
                 bool system) {
  RequireNetstack(store, netstack);
  uint32_t mask = network.GetNetmask().GetValue();
  if ((network.GetNetwork().GetValue() & ~mask) != 0)
    throw HostCtlException("Invalid route network " + network.GetStringAddress() +
                           ": the address has bits set beyond the prefix length");
  if (interfaceName.empty()) {
    if (gateway.GetValue() == 0)
      throw HostCtlException("A route needs a gateway other than 0.0.0.0");
    interfaceName = ReachingInterface(store, netstack, gateway);
  } else {
    RequireInterfaceOf(store, netstack, interfaceName);
  }
  int prefix = network.GetPrefixLength();
  if (RouteExists(store, netstack, 4, system, network.GetNetwork(), prefix) ||
      (!system && IsConnectedNetwork(store, netstack, network)))
    throw HostCtlException("A route to " + Destination(network) + " already exists in netstack " +
                           netstack);
  StoreRoute(store, netstack, 4, network.GetNetwork(), prefix, gateway, interfaceName, source,
             system);
}

void InsertRoute(Store& store, const std::string& netstack, const Ipv6Network& network,
                 const Ipv6Address& gateway, std::string interfaceName, const std::string& source,
                 bool system) {
  RequireNetstack(store, netstack);
  int prefix = network.GetNetmask();
  const auto mask = Ipv6Network::NetmaskFromNumber(prefix).GetBytes();
  for (int i = 0; i < 16; ++i)
    if ((network.GetAddress().GetBytes()[i] & ~mask[i]) != 0)
      throw HostCtlException("Invalid route network " + network.GetStringAddress() +
                             ": the address has bits set beyond the prefix length");
  if (interfaceName.empty()) {
    if (gateway.IsUnspecified())
      throw HostCtlException("A route needs a gateway other than ::");
    interfaceName = ReachingInterface(store, netstack, gateway);
  } else {
    RequireInterfaceOf(store, netstack, interfaceName);
  }
  if (RouteExists(store, netstack, 6, system, network.GetAddress(), prefix) ||
      (!system && IsConnectedNetwork(store, netstack, network)))
    throw HostCtlException("A route to " + Destination(network) + " already exists in netstack " +
                           netstack);
  StoreRoute(store, netstack, 6, network.GetAddress(), prefix, gateway, interfaceName, source,
             system);
}

bool IsStoredRouteSource(const std::string& source) {
  return source == RoutingInfoImpl::SOURCE_USER || source == RoutingInfoImpl::SOURCE_CONFIG ||
         source == RoutingInfoImpl::SOURCE_DHCP;
}

std::string ConfiguredGateway(Store& store, const std::string& netstack, int family) {
  Statement row = store.Prepare(family == 4 ? "SELECT gateway4 FROM netstack WHERE key = ?"
                                            : "SELECT gateway6 FROM netstack WHERE key = ?");
  enum { kGateway };
  row.Bind(1, netstack);
  return row.Step() ? row.Text(kGateway) : std::string();
}

void PutConfiguredGateway(Store& store, const std::string& netstack, int family,
                          const std::string& gateway) {
  Statement update = store.Prepare(family == 4 ? "UPDATE netstack SET gateway4 = ? WHERE key = ?"
                                               : "UPDATE netstack SET gateway6 = ? WHERE key = ?");
  if (gateway.empty())
    update.BindNull(1);
  else
    update.Bind(1, gateway);
  update.Bind(2, netstack).Run();
}

void LoadDns(Store& store, const std::string& netstack, std::vector<std::string>& servers,
             std::vector<std::string>& domains) {
  RequireNetstack(store, netstack);
  servers.clear();
  domains.clear();
  Statement server =
      store.Prepare("SELECT address FROM ipsvc_dns_server WHERE netstack = ? ORDER BY ord");
  enum { kAddress };
  server.Bind(1, netstack);
  while (server.Step())
    servers.push_back(server.Text(kAddress));
  Statement domain =
      store.Prepare("SELECT domain FROM ipsvc_dns_search WHERE netstack = ? ORDER BY ord");
  enum { kDomain };
  domain.Bind(1, netstack);
  while (domain.Step())
    domains.push_back(domain.Text(kDomain));
}

void SaveDns(Store& store, const std::string& netstack, const std::vector<std::string>& servers,
             const std::vector<std::string>& domains) {
  RequireNetstack(store, netstack);
  store.Prepare("DELETE FROM ipsvc_dns_server WHERE netstack = ?").Bind(1, netstack).Run();
  store.Prepare("DELETE FROM ipsvc_dns_search WHERE netstack = ?").Bind(1, netstack).Run();
  int ord = 0;
  for (const std::string& server : servers)
    store.Prepare("INSERT INTO ipsvc_dns_server(netstack, ord, address) VALUES(?, ?, ?)")
        .BindAll(netstack, ord++, server)
        .Run();
  ord = 0;
  for (const std::string& domain : domains)
    store.Prepare("INSERT INTO ipsvc_dns_search(netstack, ord, domain) VALUES(?, ?, ?)")
        .BindAll(netstack, ord++, domain)
        .Run();
}

bool HasDnsEntry(Store& store, const std::string& netstack, bool domain, const std::string& value) {
  RequireNetstack(store, netstack);
  Statement find =
      domain ? store.Prepare("SELECT 1 FROM ipsvc_dns_search WHERE netstack = ? AND "
                             "domain = ? COLLATE NOCASE")
             : store.Prepare("SELECT 1 FROM ipsvc_dns_server WHERE netstack = ? AND address = ?");
  return find.BindAll(netstack, value).Step();
}

void AppendDnsEntry(Store& store, const std::string& netstack, bool domain,
                    const std::string& value) {
  Statement insert =
      domain
          ? store.Prepare("INSERT INTO ipsvc_dns_search(netstack, domain, ord) SELECT ?1, ?2, "
                          "coalesce(max(ord), -1) + 1 FROM ipsvc_dns_search WHERE netstack = ?1")
          : store.Prepare("INSERT INTO ipsvc_dns_server(netstack, address, ord) SELECT ?1, ?2, "
                          "coalesce(max(ord), -1) + 1 FROM ipsvc_dns_server WHERE netstack = ?1");
  insert.BindAll(netstack, value).Run();
}

void RemoveDnsEntry(Store& store, const std::string& netstack, bool domain,
                    const std::string& value) {
  Statement remove =
      domain ? store.Prepare("DELETE FROM ipsvc_dns_search WHERE netstack = ? AND "
                             "domain = ? COLLATE NOCASE")
             : store.Prepare("DELETE FROM ipsvc_dns_server WHERE netstack = ? AND address = ?");
  remove.BindAll(netstack, value).Run();
}

void ClearDnsServers(Store& store, const std::string& netstack) {
  store.Prepare("DELETE FROM ipsvc_dns_server WHERE netstack = ?").Bind(1, netstack).Run();
}

void CheckSearchDomain(const std::string& domain) {
  if (!TvkCtl::Network::HostsFile::IsValidHostName(domain))
    throw HostCtlException("Invalid search domain '" + domain +
                           "': expected a domain name made of letters, digits, hyphens and dots");
}

void InsertHostsEntry(Store& store, const std::string& ip, const std::string& hostname,
                      const std::vector<std::string>& aliases, const std::string& comment,
                      bool system) {
  std::string address;
  if (Ipv4Address::IsValidAddress(ip))
    address = Ipv4Address(ip).GetStringAddress();
  else if (Ipv6Address::IsValidAddress(ip))
    address = Ipv6Address(ip).GetStringAddress();
  else
    throw HostCtlException("Invalid IP address '" + ip + "'");
  if (!TvkCtl::Network::HostsFile::IsValidHostName(hostname))
    throw HostCtlException("Invalid host name '" + hostname + "'");
  std::string joined;
  for (const std::string& alias : aliases) {
    if (!TvkCtl::Network::HostsFile::IsValidHostName(alias))
      throw HostCtlException("Invalid alias '" + alias + "'");
    joined += (joined.empty() ? "" : " ") + alias;
  }
  if (comment.find_first_of("\r\n") != std::string::npos)
    throw HostCtlException("The comment must be a single line");
  Statement existing = store.Prepare(
      "SELECT system FROM ipsvc_hosts WHERE address = ? AND hostname = ? COLLATE NOCASE");
  BindAddress(existing, 1, address);
  existing.Bind(2, hostname);
  if (existing.Step())
    throw HostCtlException("An entry for " + address + " " + hostname + " already exists");
  Statement insert = store.Prepare("INSERT INTO ipsvc_hosts(address, hostname, aliases, comment, "
                                   "system) VALUES(?, ?, ?, ?, ?)");
  BindAddress(insert, 1, address);
  insert.Bind(2, hostname).Bind(3, joined).Bind(4, comment).Bind(5, system).Run();
}

void InsertSa(Store& store, const IpSecSadParam& sa) {
  if (sa.name.empty())
    throw HostCtlException("An SA needs a name");
  if (sa.name.size() > 127)
    throw HostCtlException("An SA name is at most 127 bytes long");
  if (sa.name == "UNKNOWN")
    throw HostCtlException("The SA name UNKNOWN is reserved");
  std::string source = CanonicalIpv6(sa.srcAddress);
  std::string destination = CanonicalIpv6(sa.dstAddress);
  auto inRange = [](int code, std::size_t size) {
    return code >= 0 && static_cast<std::size_t>(code) < size;
  };
  if (!inRange(sa.mode, 2) ||
      !inRange(sa.encryptionAlgorithm, IpSecConfigImpl::SA_ENCPT_ALG.size()) ||
      !inRange(sa.integrityAlgorithm, IpSecConfigImpl::SA_AUTH_ALG.size()) ||
      !inRange(sa.state, IpSecConfigImpl::SA_STATE.size()))
    throw HostCtlException("Invalid code in the SA " + sa.name);
  CheckKey("encryption", IpSecConfigImpl::SA_ENCPT_ALG[sa.encryptionAlgorithm], sa.encryptionKey,
           IpSecConfigImpl::EncryptionKeyLength(sa.encryptionAlgorithm));
  CheckKey("integrity", IpSecConfigImpl::SA_AUTH_ALG[sa.integrityAlgorithm], sa.integrityKey,
           IpSecConfigImpl::IntegrityKeyLength(sa.integrityAlgorithm));
  if (sa.spi < 256)
    throw HostCtlException("SPI values 0 to 255 are reserved");
  if (sa.name != "auto") {
    Statement named = store.Prepare("SELECT 1 FROM ipsvc_ipsec_sa WHERE name = ?");
    named.Bind(1, sa.name);
    if (named.Step())
      throw HostCtlException("An SA named " + sa.name + " already exists");
  }
  Statement same =
      store.Prepare("SELECT name FROM ipsvc_ipsec_sa WHERE destination = ? AND spi = ?");
  enum { kName };
  same.BindAll(destination, static_cast<int64_t>(sa.spi));
  if (same.Step())
    throw HostCtlException("The SA " + same.Text(kName) + " already uses destination " +
                           destination + " with that SPI");
  store
      .Prepare("INSERT INTO ipsvc_ipsec_sa(name, source, destination, spi, mode, encryption, "
               "integrity, encryption_key, integrity_key, state, lifetime) "
               "VALUES(?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)")
      .BindAll(sa.name, source, destination, static_cast<int64_t>(sa.spi), sa.mode,
               sa.encryptionAlgorithm, sa.integrityAlgorithm, sa.encryptionKey, sa.integrityKey,
               sa.state, static_cast<int64_t>(sa.lifetime))
      .Run();
}

void InsertSp(Store& store, const IpSecSpdParam& sp) {
  if (sp.name.empty())
    throw HostCtlException("An SP needs a name");
  if (sp.name.size() > 127)
    throw HostCtlException("An SP name is at most 127 bytes long");
  std::string source = CanonicalIpv6(sp.srcAddress);
  std::string destination = CanonicalIpv6(sp.dstAddress);
  auto inRange = [](int code, std::size_t size) {
    return code >= 0 && static_cast<std::size_t>(code) < size;
  };
  if (!inRange(sp.ulProto, IpSecConfigImpl::SP_UL_PROTO_TYPE.size()) ||
      !inRange(sp.direction, IpSecConfigImpl::SP_DIRECTION.size()) ||
      !inRange(sp.action, IpSecConfigImpl::SP_ACTION.size()) ||
      !inRange(sp.mode, IpSecConfigImpl::SA_MODE.size()))
    throw HostCtlException("Invalid code in the SP " + sp.name);
  if (sp.srcPrefixLength < 0 || sp.srcPrefixLength > 128 || sp.dstPrefixLength < 0 ||
      sp.dstPrefixLength > 128)
    throw HostCtlException("Invalid prefix length in the SP " + sp.name);
  if (sp.srcPort > 65535 || sp.dstPort > 65535)
    throw HostCtlException("Ports must be in the range 0 to 65535");
  const std::string& proto = IpSecConfigImpl::SP_UL_PROTO_TYPE[sp.ulProto];
  if ((sp.srcPort != 0 || sp.dstPort != 0) && proto != "tcp" && proto != "udp")
    throw HostCtlException("Ports can only be given with the tcp or udp protocol");
  Statement named = store.Prepare("SELECT 1 FROM ipsvc_ipsec_sp WHERE name = ?");
  named.Bind(1, sp.name);
  if (named.Step())
    throw HostCtlException("An SP named " + sp.name + " already exists");
  bool lost = sp.saName == "UNKNOWN";
  if (!sp.saName.empty() && !lost) {
    Statement sa = store.Prepare("SELECT 1 FROM ipsvc_ipsec_sa WHERE name = ?");
    sa.Bind(1, sp.saName);
    if (!sa.Step() || sp.saName == "auto")
      throw HostCtlException("No SA named " + sp.saName + " exists");
  }
  Statement same = store.Prepare(
      "SELECT name FROM ipsvc_ipsec_sp WHERE source = ? AND source_prefix = ? AND source_port = "
      "? AND destination = ? AND destination_prefix = ? AND destination_port = ? AND protocol = "
      "? AND direction = ?");
  enum { kName };
  same.BindAll(source, sp.srcPrefixLength, static_cast<int64_t>(sp.srcPort), destination,
               sp.dstPrefixLength, static_cast<int64_t>(sp.dstPort), sp.ulProto, sp.direction);
  if (same.Step())
    throw HostCtlException("The SP " + same.Text(kName) +
                           " already covers that traffic in that direction");
  store
      .Prepare("INSERT INTO ipsvc_ipsec_sp(name, source, source_prefix, source_port, "
               "destination, destination_prefix, destination_port, protocol, direction, action, "
               "mode, sa_name, sa_lost) VALUES(?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)")
      .BindAll(sp.name, source, sp.srcPrefixLength, static_cast<int64_t>(sp.srcPort), destination,
               sp.dstPrefixLength, static_cast<int64_t>(sp.dstPort), sp.ulProto, sp.direction,
               sp.action, sp.mode, lost ? std::string() : sp.saName, lost)
      .Run();
}

} // namespace Model::IpSvc
