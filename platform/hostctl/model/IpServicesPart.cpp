//===- model/IpServicesPart.cpp - Routes, DNS, hosts, neighbours, IPsec ---===//
//
// The IP services part owns the per-netstack routing tables, configured
// default gateways, resolver configurations, neighbour caches and
// connections, and the host-wide hosts table and IPsec databases. Rows of a
// netstack or of an interface go away with it (foreign keys with cascade).
//
// Host description keys (all top-level arrays of objects):
//   routes          {netstack, network ("a/len" or "default"), gateway,
//                    interface (chosen from the subnets when absent), source
//                    ("user", "config", "dhcp"), system}
//   defaultGateways {netstack, ipv4, ipv6}: the configured default gateways
//   dns             {netstack, servers [..], searchDomains [..]}
//   hostsEntries    {address, hostname, aliases [..], comment, system}
//   neighbors       {interface, address, mac, expiry, type, state}
//   connections     {netstack, protocol ("tcp", "udp", "ip"), recvQueue,
//                    sendQueue, localAddress, localPort, foreignAddress,
//                    foreignPort, worldId, state, ccAlgorithm}
//   serviceWorlds   {id, name}: worlds of host services that own sockets
//   ipsecSAs        {name, source, destination, spi, mode, encryption,
//                    encryptionKey, integrity, integrityKey, state, lifetime}
//   ipsecSPs        {name, source, sourcePort, destination, destinationPort,
//                    protocol, direction, action, mode, saName}
//
//===----------------------------------------------------------------------===//
#include "model/IpServicesModel.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Misc.h"
#include "HostCtl/Network/IpAddress.h"
#include "TvkCtl/Network/IpSecConfigImpl.h"
#include "TvkCtl/Network/RoutingInfoImpl.h"
#include "model/JsonRead.h"
#include "model/Part.h"

#include <algorithm>

namespace Model {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::Ipv4Address;
using HostCtl::Network::Ipv4Network;
using HostCtl::Network::Ipv6Address;
using HostCtl::Network::Ipv6Network;
using nlohmann::ordered_json;
using TvkCtl::Network::IpSecConfigImpl;
using TvkCtl::Network::RoutingInfoImpl;

namespace {

const char* const kIpServicesSchema = R"sql(
-- Static and default routes of a netstack, one row each; the routes of the
-- interfaces' own subnets are not stored (they follow the interfaces).
-- Addresses are numbers: for family 4 the address's value, for family 6 its
-- 16 bytes. `source` is "user", "config" or "dhcp".
CREATE TABLE ipsvc_route(
  id INTEGER PRIMARY KEY,
  netstack TEXT NOT NULL REFERENCES netstack(key) ON DELETE CASCADE,
  family INTEGER NOT NULL,
  system INTEGER NOT NULL,
  network NOT NULL,
  prefix INTEGER NOT NULL,
  gateway NOT NULL,
  interface TEXT NOT NULL REFERENCES tvknic(name) ON DELETE CASCADE,
  source TEXT NOT NULL,
  UNIQUE(netstack, family, system, network, prefix)
);
CREATE INDEX ipsvc_route_list ON ipsvc_route(netstack, family, system, id);
CREATE INDEX ipsvc_route_by_interface ON ipsvc_route(interface);

-- Resolver configuration of a netstack, in order. The key columns come
-- first: SQLite 3.40's integrity check misreads a NOT NULL column placed
-- between the key columns of a WITHOUT ROWID table. The order index makes an
-- addition at the end cost O(log n); the domain index finds a domain in any
-- case.
CREATE TABLE ipsvc_dns_server(
  netstack TEXT NOT NULL REFERENCES netstack(key) ON DELETE CASCADE,
  address TEXT NOT NULL,
  ord INTEGER NOT NULL,
  PRIMARY KEY(netstack, address)
) WITHOUT ROWID;
CREATE UNIQUE INDEX ipsvc_dns_server_by_ord ON ipsvc_dns_server(netstack, ord);
CREATE TABLE ipsvc_dns_search(
  netstack TEXT NOT NULL REFERENCES netstack(key) ON DELETE CASCADE,
  domain TEXT NOT NULL,
  ord INTEGER NOT NULL,
  PRIMARY KEY(netstack, domain)
) WITHOUT ROWID;
CREATE UNIQUE INDEX ipsvc_dns_search_by_ord ON ipsvc_dns_search(netstack, ord);
CREATE INDEX ipsvc_dns_search_by_domain ON ipsvc_dns_search(netstack, domain COLLATE NOCASE);

-- The hosts table; the address is a number as in ipsvc_route (an IPv6
-- address is the blob), `aliases` are separated by blanks. System entries are
-- the host's own and are not shown to or removable by users.
CREATE TABLE ipsvc_hosts(
  id INTEGER PRIMARY KEY,
  address NOT NULL,
  hostname TEXT NOT NULL,
  aliases TEXT NOT NULL DEFAULT '',
  comment TEXT NOT NULL DEFAULT '',
  system INTEGER NOT NULL
);
CREATE UNIQUE INDEX ipsvc_hosts_key ON ipsvc_hosts(address, hostname COLLATE NOCASE);
CREATE INDEX ipsvc_hosts_list ON ipsvc_hosts(system, id);

-- Neighbour caches; the netstack is the interface's. The address is a number
-- as in ipsvc_route. `type` and `state` index
-- RoutingInfoImpl::NeighborTypeNames() and NeighborStateNames().
CREATE TABLE ipsvc_neighbor(
  id INTEGER PRIMARY KEY,
  family INTEGER NOT NULL,
  interface TEXT NOT NULL REFERENCES tvknic(name) ON DELETE CASCADE,
  address NOT NULL,
  mac TEXT NOT NULL,
  expiry INTEGER NOT NULL,
  type INTEGER NOT NULL,
  state INTEGER NOT NULL,
  UNIQUE(interface, family, address)
);
CREATE INDEX ipsvc_neighbor_by_address ON ipsvc_neighbor(family, address);

-- Sockets of a netstack; `protocol` 0 tcp, 1 udp, 2 raw ip.
CREATE TABLE ipsvc_connection(
  id INTEGER PRIMARY KEY,
  netstack TEXT NOT NULL REFERENCES netstack(key) ON DELETE CASCADE,
  protocol INTEGER NOT NULL,
  recv_queue INTEGER NOT NULL DEFAULT 0,
  send_queue INTEGER NOT NULL DEFAULT 0,
  local_address TEXT NOT NULL,
  local_port INTEGER NOT NULL,
  foreign_address TEXT NOT NULL,
  foreign_port INTEGER NOT NULL,
  world_id INTEGER NOT NULL,
  state INTEGER NOT NULL,
  ccalgo TEXT NOT NULL
);

-- Worlds of host services (the VMs are in the core table `world`).
CREATE TABLE ipsvc_world(id INTEGER PRIMARY KEY, name TEXT NOT NULL);

-- IPsec databases. SAs named "auto" come from key exchange and may repeat.
-- An SP whose SA was removed keeps sa_lost = 1 and no SA name.
CREATE TABLE ipsvc_ipsec_sa(
  id INTEGER PRIMARY KEY,
  name TEXT NOT NULL,
  source TEXT NOT NULL,
  destination TEXT NOT NULL,
  spi INTEGER NOT NULL,
  mode INTEGER NOT NULL,
  encryption INTEGER NOT NULL,
  integrity INTEGER NOT NULL,
  encryption_key TEXT NOT NULL,
  integrity_key TEXT NOT NULL,
  state INTEGER NOT NULL,
  lifetime INTEGER NOT NULL,
  UNIQUE(destination, spi)
);
CREATE UNIQUE INDEX ipsvc_ipsec_sa_name ON ipsvc_ipsec_sa(name) WHERE name <> 'auto';
CREATE TABLE ipsvc_ipsec_sp(
  id INTEGER PRIMARY KEY,
  name TEXT NOT NULL UNIQUE,
  source TEXT NOT NULL,
  source_prefix INTEGER NOT NULL,
  source_port INTEGER NOT NULL,
  destination TEXT NOT NULL,
  destination_prefix INTEGER NOT NULL,
  destination_port INTEGER NOT NULL,
  protocol INTEGER NOT NULL,
  direction INTEGER NOT NULL,
  action INTEGER NOT NULL,
  mode INTEGER NOT NULL,
  sa_name TEXT NOT NULL,
  sa_lost INTEGER NOT NULL
);
)sql";

/// Runs \p fn, turning a refusal of the host into an ImportError on \p key.
template <typename Fn> void AsField(const JsonObject& object, const char* key, Fn&& fn) {
  try {
    fn();
  } catch (const HostCtlException& e) {
    object.Fail(key, e.what());
  }
}

/// The index of \p text in \p table; fails on \p key otherwise.
template <typename Table>
int CodeOf(const JsonObject& object, const char* key, const Table& table, const std::string& text) {
  auto it = std::find(std::begin(table), std::end(table), text);
  if (it == std::end(table)) {
    std::string known;
    for (const auto& name : table)
      known += (known.empty() ? "" : ", ") + std::string(name);
    object.Fail(key, "expected one of " + known);
  }
  return static_cast<int>(it - std::begin(table));
}

const std::vector<std::string> kProtocols = {"tcp", "udp", "ip"};

void ImportRoute(const JsonObject& route, Store& store) {
  std::string netstack = route.String("netstack", IpSvc::kDefaultNetstack);
  std::string network = route.String("network");
  std::string gateway = route.String("gateway");
  std::string interfaceName = route.String("interface", "");
  std::string source = route.String("source", RoutingInfoImpl::SOURCE_USER);
  bool system = route.Bool("system", false);
  if (!IpSvc::IsStoredRouteSource(source))
    route.Fail("source", "expected one of user, config, dhcp");
  bool ipv6 = network == "default" ? gateway.find(':') != std::string::npos
                                   : network.find(':') != std::string::npos;
  AsField(route, "network", [&] {
    if (ipv6) {
      Ipv6Network net =
          network == "default" ? RoutingInfoImpl::DEFAULT_IPV6_ROUTE : Ipv6Network(network);
      IpSvc::InsertRoute(store, netstack, net, Ipv6Address(gateway), interfaceName, source, system);
    } else {
      Ipv4Network net =
          network == "default" ? RoutingInfoImpl::DEFAULT_IPV4_ROUTE : Ipv4Network(network);
      IpSvc::InsertRoute(store, netstack, net, Ipv4Address(gateway), interfaceName, source, system);
    }
  });
}

void ImportGateway(const JsonObject& gateways, Store& store) {
  std::string netstack = gateways.String("netstack", IpSvc::kDefaultNetstack);
  AsField(gateways, "netstack", [&] { IpSvc::RequireNetstack(store, netstack); });
  if (gateways.Has("ipv4"))
    AsField(gateways, "ipv4", [&] {
      IpSvc::PutConfiguredGateway(store, netstack, 4,
                                  Ipv4Address(gateways.String("ipv4")).GetStringAddress());
    });
  if (gateways.Has("ipv6"))
    AsField(gateways, "ipv6", [&] {
      IpSvc::PutConfiguredGateway(store, netstack, 6,
                                  Ipv6Address(gateways.String("ipv6")).GetStringAddress());
    });
}

void ImportDnsOfNetstack(const JsonObject& dns, Store& store) {
  std::string netstack = dns.String("netstack", IpSvc::kDefaultNetstack);
  AsField(dns, "netstack", [&] { IpSvc::RequireNetstack(store, netstack); });
  std::vector<std::string> servers;
  for (const std::string& server : dns.Strings("servers")) {
    AsField(dns, "servers", [&] {
      servers.push_back(HostCtl::Network::IpAddress::FromString(server).GetStringAddress());
    });
    if (std::count(servers.begin(), servers.end(), servers.back()) > 1)
      dns.Fail("servers", servers.back() + " is listed twice");
  }
  std::vector<std::string> domains = dns.Strings("searchDomains");
  for (const std::string& domain : domains) {
    AsField(dns, "searchDomains", [&] { IpSvc::CheckSearchDomain(domain); });
    if (std::count(domains.begin(), domains.end(), domain) > 1)
      dns.Fail("searchDomains", domain + " is listed twice");
  }
  std::vector<std::string> stored;
  std::vector<std::string> ignored;
  IpSvc::LoadDns(store, netstack, stored, ignored);
  if (!stored.empty() || !ignored.empty())
    dns.Fail("netstack", "netstack " + netstack + " is described twice");
  IpSvc::SaveDns(store, netstack, servers, domains);
}

void ImportHostsEntry(const JsonObject& entry, Store& store) {
  AsField(entry, "address", [&] {
    IpSvc::InsertHostsEntry(store, entry.String("address"), entry.String("hostname"),
                            entry.Strings("aliases"), entry.String("comment", ""),
                            entry.Bool("system", false));
  });
}

void ImportNeighbor(const JsonObject& neighbor, Store& store) {
  const auto& types = RoutingInfoImpl::NeighborTypeNames();
  const auto& states = RoutingInfoImpl::NeighborStateNames();
  std::string interfaceName = neighbor.String("interface");
  Statement nic = store.Prepare("SELECT 1 FROM tvknic WHERE name = ?");
  nic.Bind(1, interfaceName);
  if (!nic.Step())
    neighbor.Fail("interface", "no kernel interface is named " + interfaceName);
  std::string text = neighbor.String("address");
  int family = 4;
  std::string address;
  if (Ipv4Address::IsValidAddress(text)) {
    address = Ipv4Address(text).GetStringAddress();
  } else if (Ipv6Address::IsValidAddress(text)) {
    address = Ipv6Address(text).GetStringAddress();
    family = 6;
  } else {
    neighbor.Fail("address", "expected an IPv4 or IPv6 address");
  }
  std::string mac = neighbor.String("mac");
  if (!HostCtl::Network::MacAddress::IsValid(mac))
    neighbor.Fail("mac", "expected a unicast MAC address such as 00:50:56:01:02:03");
  int type = CodeOf(neighbor, "type", types, neighbor.String("type", types[1]));
  int state = 0;
  if (neighbor.Has("state")) {
    if (family == 4)
      neighbor.Fail("state", "only IPv6 neighbours have a state");
    state = CodeOf(neighbor, "state", states, neighbor.String("state"));
  }
  Statement insert = store.Prepare(
      "INSERT INTO ipsvc_neighbor(family, interface, address, mac, expiry, type, state) "
      "VALUES(?, ?, ?, ?, ?, ?, ?)");
  insert.BindAll(family, interfaceName);
  if (family == 6)
    IpSvc::BindAddress(insert, 3, Ipv6Address(address));
  else
    IpSvc::BindAddress(insert, 3, Ipv4Address(address));
  insert.Bind(4, HostCtl::Network::MacAddress(mac).GetStringAddress())
      .Bind(5, neighbor.Int("expiry", 0, int64_t{86400} * 365, 0))
      .Bind(6, type)
      .Bind(7, state);
  AsField(neighbor, "address", [&] {
    try {
      insert.Run();
    } catch (const HostCtlException&) {
      throw HostCtlException(address + " is listed twice on " + interfaceName);
    }
  });
}

void ImportServiceWorld(const JsonObject& world, Store& store) {
  int64_t id = world.Int("id", 1, INT32_MAX);
  Statement insert = store.Prepare("INSERT INTO ipsvc_world(id, name) VALUES(?, ?)");
  insert.BindAll(id, world.String("name"));
  AsField(world, "id", [&] {
    try {
      insert.Run();
    } catch (const HostCtlException&) {
      throw HostCtlException("world " + std::to_string(id) + " is listed twice");
    }
  });
}

void ImportConnection(const JsonObject& connection, Store& store) {
  std::string netstack = connection.String("netstack", IpSvc::kDefaultNetstack);
  AsField(connection, "netstack", [&] { IpSvc::RequireNetstack(store, netstack); });
  int protocol = CodeOf(connection, "protocol", kProtocols, connection.String("protocol"));
  std::string local;
  std::string foreign;
  AsField(connection, "localAddress", [&] {
    local = HostCtl::Network::IpAddress::FromString(connection.String("localAddress"))
                .GetStringAddress();
  });
  AsField(connection, "foreignAddress", [&] {
    foreign = HostCtl::Network::IpAddress::FromString(connection.String("foreignAddress"))
                  .GetStringAddress();
  });
  store
      .Prepare("INSERT INTO ipsvc_connection(netstack, protocol, recv_queue, send_queue, "
               "local_address, local_port, foreign_address, foreign_port, world_id, state, "
               "ccalgo) VALUES(?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)")
      .BindAll(netstack, protocol, connection.Int("recvQueue", 0, INT32_MAX, 0),
               connection.Int("sendQueue", 0, INT32_MAX, 0), local,
               connection.Int("localPort", 0, 65535, 0), foreign,
               connection.Int("foreignPort", 0, 65535, 0),
               connection.Int("worldId", 0, INT32_MAX, 0),
               connection.Int("state", 0, UINT32_MAX, 0), connection.String("ccAlgorithm", ""))
      .Run();
}

void ImportSa(const JsonObject& object, Store& store) {
  HostCtl::Network::IpSecSadParam sa;
  sa.name = object.String("name");
  sa.srcAddress = object.String("source");
  sa.dstAddress = object.String("destination");
  sa.spi = static_cast<uint32_t>(object.Int("spi", 256, UINT32_MAX));
  sa.mode = CodeOf(object, "mode",
                   std::vector<std::string>(IpSecConfigImpl::SA_MODE.begin(),
                                            IpSecConfigImpl::SA_MODE.begin() + 2),
                   object.String("mode", IpSecConfigImpl::SA_MODE[0]));
  sa.encryptionAlgorithm =
      CodeOf(object, "encryption", IpSecConfigImpl::SA_ENCPT_ALG, object.String("encryption"));
  sa.encryptionKey = object.String("encryptionKey", "");
  sa.integrityAlgorithm =
      CodeOf(object, "integrity", IpSecConfigImpl::SA_AUTH_ALG, object.String("integrity"));
  sa.integrityKey = object.String("integrityKey");
  sa.state = CodeOf(object, "state", IpSecConfigImpl::SA_STATE,
                    object.String("state", IpSecConfigImpl::SA_STATE[1]));
  sa.lifetime = static_cast<uint64_t>(object.Int("lifetime", 0, INT64_MAX, 0));
  AsField(object, "name", [&] { IpSvc::InsertSa(store, sa); });
}

void ImportSp(const JsonObject& object, Store& store) {
  HostCtl::Network::IpSecSpdParam sp;
  sp.name = object.String("name");
  auto network = [&](const char* key, std::string& address, int& prefix) {
    std::string text = object.String(key);
    if (text == "any")
      return;
    AsField(object, key, [&] {
      Ipv6Network parsed(text);
      address = parsed.GetAddress().GetStringAddress();
      prefix = parsed.GetNetmask();
    });
  };
  network("source", sp.srcAddress, sp.srcPrefixLength);
  network("destination", sp.dstAddress, sp.dstPrefixLength);
  sp.srcPort = static_cast<uint32_t>(object.Int("sourcePort", 0, 65535, 0));
  sp.dstPort = static_cast<uint32_t>(object.Int("destinationPort", 0, 65535, 0));
  sp.ulProto = CodeOf(object, "protocol", IpSecConfigImpl::SP_UL_PROTO_TYPE,
                      object.String("protocol", IpSecConfigImpl::SP_UL_PROTO_TYPE[0]));
  sp.direction = CodeOf(object, "direction", IpSecConfigImpl::SP_DIRECTION,
                        object.String("direction", IpSecConfigImpl::SP_DIRECTION[1]));
  sp.action = CodeOf(object, "action", IpSecConfigImpl::SP_ACTION,
                     object.String("action", IpSecConfigImpl::SP_ACTION[0]));
  sp.mode = CodeOf(object, "mode", IpSecConfigImpl::SA_MODE,
                   object.String("mode", IpSecConfigImpl::SA_MODE[2]));
  sp.saName = object.String("saName", "");
  AsField(object, "name", [&] { IpSvc::InsertSp(store, sp); });
}

/// One kind of object of the IP services that the part imports from the
/// whole document: its top-level key and the reader of one element.
struct ImportKind {
  const char* key;                                                ///< Top-level key of the array.
  void (*importElement)(const JsonObject& element, Store& store); ///< Reads one element.
};

/// The kinds in import order (SPs name SAs). Routes, hosts entries and
/// neighbours are streamed (the part's `streamed` list) and come after.
const ImportKind kImportKinds[] = {
    {"defaultGateways", ImportGateway},
    {"dns", ImportDnsOfNetstack},
    {"serviceWorlds", ImportServiceWorld},
    {"connections", ImportConnection},
    {"ipsecSAs", ImportSa},
    {"ipsecSPs", ImportSp},
};

void ImportIpServices(const ordered_json& host, Store& store) {
  JsonObject root(host, "");
  for (const ImportKind& kind : kImportKinds)
    for (const JsonObject& element : root.Objects(kind.key))
      kind.importElement(element, store);
}

/// The routes, in the order they were added.
void EmitRoutes(Store& store, const ExportStreams::Emit& emit) {
  Statement route = store.Prepare("SELECT netstack, family, network, prefix, gateway, interface, "
                                  "source, system FROM ipsvc_route ORDER BY id");
  enum { kNetstack, kFamily, kNetwork, kPrefix, kGateway, kInterface, kSource, kSystem };
  while (route.Step()) {
    ordered_json object = {{"netstack", route.Text(kNetstack)}};
    bool ipv6 = route.Int(kFamily) == 6;
    auto address = [&](int column) {
      return ipv6 ? IpSvc::Ipv6Column(route, column).GetStringAddress()
                  : IpSvc::Ipv4Column(route, column).GetStringAddress();
    };
    // A route of prefix length 0 is a default route (host bits are refused).
    int64_t prefix = route.Int(kPrefix);
    object["network"] =
        prefix == 0 ? std::string("default") : address(kNetwork) + "/" + std::to_string(prefix);
    object["gateway"] = address(kGateway);
    object["interface"] = route.Text(kInterface);
    object["source"] = route.Text(kSource);
    if (route.Bool(kSystem))
      object["system"] = true;
    emit(object);
  }
}

/// The hosts entries, in the order they were added.
void EmitHostsEntries(Store& store, const ExportStreams::Emit& emit) {
  Statement entry = store.Prepare(
      "SELECT address, hostname, aliases, comment, system FROM ipsvc_hosts ORDER BY id");
  enum { kAddress, kHostname, kAliases, kComment, kSystem };
  while (entry.Step()) {
    ordered_json object = {{"address", IpSvc::AddressText(entry, kAddress)},
                           {"hostname", entry.Text(kHostname)}};
    std::vector<std::string> aliases = HostCtl::Misc::StringTokenize(entry.Text(kAliases), " ");
    if (!aliases.empty())
      object["aliases"] = aliases;
    if (std::string comment = entry.Text(kComment); !comment.empty())
      object["comment"] = comment;
    if (entry.Bool(kSystem))
      object["system"] = true;
    emit(object);
  }
}

/// The neighbour caches, in the order the entries were added.
void EmitNeighbors(Store& store, const ExportStreams::Emit& emit) {
  Statement neighbor = store.Prepare("SELECT family, interface, address, mac, expiry, type, state "
                                     "FROM ipsvc_neighbor ORDER BY id");
  enum { kFamily, kInterface, kAddress, kMac, kExpiry, kType, kState };
  while (neighbor.Step()) {
    bool ipv6 = neighbor.Int(kFamily) == 6;
    ordered_json object = {
        {"interface", neighbor.Text(kInterface)},
        {"address", ipv6 ? IpSvc::Ipv6Column(neighbor, kAddress).GetStringAddress()
                         : IpSvc::Ipv4Column(neighbor, kAddress).GetStringAddress()},
        {"mac", neighbor.Text(kMac)},
        {"expiry", neighbor.Int(kExpiry)},
        {"type", RoutingInfoImpl::NeighborTypeNames().at(neighbor.Int(kType))}};
    if (ipv6)
      object["state"] = RoutingInfoImpl::NeighborStateNames().at(neighbor.Int(kState));
    emit(object);
  }
}

/// The configured default gateways, one object per netstack that has any.
void EmitGateways(Store& store, const ExportStreams::Emit& emit) {
  Statement gateway = store.Prepare("SELECT key, gateway4, gateway6 FROM netstack WHERE gateway4 "
                                    "IS NOT NULL OR gateway6 IS NOT NULL ORDER BY key");
  enum { kNetstack, kIpv4, kIpv6 };
  while (gateway.Step()) {
    ordered_json object = {{"netstack", gateway.Text(kNetstack)}};
    if (!gateway.IsNull(kIpv4))
      object["ipv4"] = gateway.Text(kIpv4);
    if (!gateway.IsNull(kIpv6))
      object["ipv6"] = gateway.Text(kIpv6);
    emit(object);
  }
}

/// The resolver configuration of each netstack that has one.
void EmitDns(Store& store, const ExportStreams::Emit& emit) {
  Statement netstacks = store.Prepare(
      "SELECT key FROM netstack WHERE key IN (SELECT netstack FROM ipsvc_dns_server UNION "
      "SELECT netstack FROM ipsvc_dns_search) ORDER BY ord");
  enum { kKey };
  while (netstacks.Step()) {
    std::string netstack = netstacks.Text(kKey);
    std::vector<std::string> servers;
    std::vector<std::string> domains;
    IpSvc::LoadDns(store, netstack, servers, domains);
    emit({{"netstack", netstack}, {"servers", servers}, {"searchDomains", domains}});
  }
}

/// The worlds of host services.
void EmitServiceWorlds(Store& store, const ExportStreams::Emit& emit) {
  Statement world = store.Prepare("SELECT id, name FROM ipsvc_world ORDER BY id");
  enum { kId, kName };
  while (world.Step())
    emit({{"id", world.Int(kId)}, {"name", world.Text(kName)}});
}

/// The sockets of every netstack, in the order they were described.
void EmitConnections(Store& store, const ExportStreams::Emit& emit) {
  Statement connection = store.Prepare(
      "SELECT netstack, protocol, recv_queue, send_queue, local_address, local_port, "
      "foreign_address, foreign_port, world_id, state, ccalgo FROM ipsvc_connection ORDER BY id");
  enum {
    kNetstack,
    kProtocol,
    kRecvQueue,
    kSendQueue,
    kLocalAddress,
    kLocalPort,
    kForeignAddress,
    kForeignPort,
    kWorldId,
    kState,
    kCcAlgorithm
  };
  while (connection.Step())
    emit({{"netstack", connection.Text(kNetstack)},
          {"protocol", kProtocols.at(connection.Int(kProtocol))},
          {"recvQueue", connection.Int(kRecvQueue)},
          {"sendQueue", connection.Int(kSendQueue)},
          {"localAddress", connection.Text(kLocalAddress)},
          {"localPort", connection.Int(kLocalPort)},
          {"foreignAddress", connection.Text(kForeignAddress)},
          {"foreignPort", connection.Int(kForeignPort)},
          {"worldId", connection.Int(kWorldId)},
          {"state", connection.Int(kState)},
          {"ccAlgorithm", connection.Text(kCcAlgorithm)}});
}

/// The IPsec security associations.
void EmitSas(Store& store, const ExportStreams::Emit& emit) {
  Statement sa = store.Prepare(
      "SELECT name, source, destination, spi, mode, encryption, encryption_key, integrity, "
      "integrity_key, state, lifetime FROM ipsvc_ipsec_sa ORDER BY id");
  enum {
    kName,
    kSource,
    kDestination,
    kSpi,
    kMode,
    kEncryption,
    kEncryptionKey,
    kIntegrity,
    kIntegrityKey,
    kState,
    kLifetime
  };
  while (sa.Step()) {
    ordered_json object = {{"name", sa.Text(kName)},
                           {"source", sa.Text(kSource)},
                           {"destination", sa.Text(kDestination)},
                           {"spi", sa.Int(kSpi)},
                           {"mode", IpSecConfigImpl::SA_MODE.at(sa.Int(kMode))},
                           {"encryption", IpSecConfigImpl::SA_ENCPT_ALG.at(sa.Int(kEncryption))}};
    if (std::string key = sa.Text(kEncryptionKey); !key.empty())
      object["encryptionKey"] = key;
    object["integrity"] = IpSecConfigImpl::SA_AUTH_ALG.at(sa.Int(kIntegrity));
    object["integrityKey"] = sa.Text(kIntegrityKey);
    object["state"] = IpSecConfigImpl::SA_STATE.at(sa.Int(kState));
    object["lifetime"] = sa.Int(kLifetime);
    emit(object);
  }
}

/// The IPsec security policies.
void EmitSps(Store& store, const ExportStreams::Emit& emit) {
  Statement sp = store.Prepare(
      "SELECT name, source, source_prefix, source_port, destination, destination_prefix, "
      "destination_port, protocol, direction, action, mode, sa_name, sa_lost FROM ipsvc_ipsec_sp "
      "ORDER BY id");
  enum {
    kName,
    kSource,
    kSourcePrefix,
    kSourcePort,
    kDestination,
    kDestinationPrefix,
    kDestinationPort,
    kProtocol,
    kDirection,
    kAction,
    kMode,
    kSaName,
    kSaLost
  };
  while (sp.Step()) {
    ordered_json object = {
        {"name", sp.Text(kName)},
        {"source", sp.Text(kSource) + "/" + std::to_string(sp.Int(kSourcePrefix))},
        {"sourcePort", sp.Int(kSourcePort)},
        {"destination", sp.Text(kDestination) + "/" + std::to_string(sp.Int(kDestinationPrefix))},
        {"destinationPort", sp.Int(kDestinationPort)},
        {"protocol", IpSecConfigImpl::SP_UL_PROTO_TYPE.at(sp.Int(kProtocol))},
        {"direction", IpSecConfigImpl::SP_DIRECTION.at(sp.Int(kDirection))},
        {"action", IpSecConfigImpl::SP_ACTION.at(sp.Int(kAction))},
        {"mode", IpSecConfigImpl::SA_MODE.at(sp.Int(kMode))}};
    if (sp.Bool(kSaLost))
      object["saName"] = "UNKNOWN";
    else if (std::string name = sp.Text(kSaName); !name.empty())
      object["saName"] = name;
    emit(object);
  }
}

/// One kind of object of the IP services in the host description: its
/// top-level key, whether the host has any (an array is left out when
/// empty), and its writer.
struct ExportKind {
  const char* key; ///< Top-level key of the array.
  const char* any; ///< SQL that tells whether there is an element.
  void (*emit)(Store& store, const ExportStreams::Emit& emit); ///< Writes the elements.
};

/// The kinds in the order of the description.
const ExportKind kExportKinds[] = {
    {"routes", "SELECT EXISTS(SELECT 1 FROM ipsvc_route)", EmitRoutes},
    {"defaultGateways",
     "SELECT EXISTS(SELECT 1 FROM netstack WHERE gateway4 IS NOT NULL OR gateway6 IS NOT NULL)",
     EmitGateways},
    {"dns",
     "SELECT EXISTS(SELECT 1 FROM ipsvc_dns_server) OR EXISTS(SELECT 1 FROM ipsvc_dns_search)",
     EmitDns},
    {"hostsEntries", "SELECT EXISTS(SELECT 1 FROM ipsvc_hosts)", EmitHostsEntries},
    {"neighbors", "SELECT EXISTS(SELECT 1 FROM ipsvc_neighbor)", EmitNeighbors},
    {"serviceWorlds", "SELECT EXISTS(SELECT 1 FROM ipsvc_world)", EmitServiceWorlds},
    {"connections", "SELECT EXISTS(SELECT 1 FROM ipsvc_connection)", EmitConnections},
    {"ipsecSAs", "SELECT EXISTS(SELECT 1 FROM ipsvc_ipsec_sa)", EmitSas},
    {"ipsecSPs", "SELECT EXISTS(SELECT 1 FROM ipsvc_ipsec_sp)", EmitSps},
};

void ExportIpServices(ordered_json& host, Store& store, ExportStreams& streams) {
  for (const ExportKind& kind : kExportKinds) {
    Statement any = store.Prepare(kind.any);
    enum { kAny };
    if (any.Step() && any.Bool(kAny))
      streams.Put(host, kind.key, kind.emit);
  }
}

} // namespace

extern const Part kIpServicesPart;
const Part kIpServicesPart = {
    "ipsvc",
    kIpServicesSchema,
    {{"",
      {"routes", "defaultGateways", "dns", "hostsEntries", "neighbors", "connections",
       "serviceWorlds", "ipsecSAs", "ipsecSPs"}},
     {"routes", {"netstack", "network", "gateway", "interface", "source", "system"}},
     {"defaultGateways", {"netstack", "ipv4", "ipv6"}},
     {"dns", {"netstack", "servers", "searchDomains"}},
     {"hostsEntries", {"address", "hostname", "aliases", "comment", "system"}},
     {"neighbors", {"interface", "address", "mac", "expiry", "type", "state"}},
     {"connections",
      {"netstack", "protocol", "recvQueue", "sendQueue", "localAddress", "localPort",
       "foreignAddress", "foreignPort", "worldId", "state", "ccAlgorithm"}},
     {"serviceWorlds", {"id", "name"}},
     {"ipsecSAs",
      {"name", "source", "destination", "spi", "mode", "encryption", "encryptionKey", "integrity",
       "integrityKey", "state", "lifetime"}},
     {"ipsecSPs",
      {"name", "source", "sourcePort", "destination", "destinationPort", "protocol", "direction",
       "action", "mode", "saName"}}},
    ImportIpServices,
    ExportIpServices,
    {{"routes", ImportRoute}, {"hostsEntries", ImportHostsEntry}, {"neighbors", ImportNeighbor}},
};

} // namespace Model
