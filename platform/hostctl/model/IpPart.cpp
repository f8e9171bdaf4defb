//===- model/IpPart.cpp - Netstacks, kernel interfaces and their addresses --===//
//
// The IP part fills the core tables netstack, tvknic and tvknic_ipv6 and keeps
// its own side tables: the further attributes of each kernel interface (TSO,
// queues, DHCP DNS and IPv6 switches, opaque network), its tags and its
// multicast memberships. It reads the description keys "netstacks",
// "interfaces" and "kernel" (the kernel's IPv6 switch, kept in the settings
// tvk.ipv6.running and tvk.ipv6.configured). Each interface gets a port on
// its connection point (client_kind 'tvknic').
//
//===----------------------------------------------------------------------===//
#include "model/IpModel.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/Address.h"
#include "HostCtl/Network/NetstackInstance.h"
#include "TvkCtl/Network/TvkNicImpl.h"
#include "model/CoreModel.h"
#include "model/JsonRead.h"
#include "model/Part.h"

#include <algorithm>

namespace Model {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::Ipv4Address;
using HostCtl::Network::Ipv6Address;
using HostCtl::Network::MacAddress;
using HostCtl::Network::NetstackInstance;
using nlohmann::ordered_json;

namespace Ip {

const std::vector<std::string>& PredefinedNetstacks() {
  static const std::vector<std::string> keys = {"driftway", "twinRun", "AmbrelProvisioning",
                                                "mirrorPath"};
  return keys;
}

const std::vector<std::string>& CongestionControlAlgorithms() {
  static const std::vector<std::string> names = {"newreno", "cubic", "htcp"};
  return names;
}

const std::vector<std::string>& EcnModes() {
  static const std::vector<std::string> modes = {"disabled", "enabled", "echo-only"};
  return modes;
}

const std::vector<std::string>& TagNames() {
  // The names every host uses.
  static const std::vector<std::string> names = [] {
    std::vector<std::string> all;
    for (int type = 1; const char* name = TvkCtl::Network::TvkNicTagIdToName(
                           static_cast<HostCtl::Network::TvkNicTagType>(type));
         ++type)
      all.emplace_back(name);
    return all;
  }();
  return names;
}

bool IsValidNetstackKey(const std::string& key) {
  if (key.empty() || key.size() > 32)
    return false;
  return std::all_of(key.begin(), key.end(), [](char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '-' ||
           c == '_';
  });
}

bool IsValidTvkNicName(const std::string& name) {
  return TvkNicNumber(name) >= 0;
}

int TvkNicNumber(const std::string& name) {
  if (name.size() < 4 || name.size() > 6 || name.compare(0, 3, "tvk") != 0)
    return -1;
  if (name[3] == '0' && name.size() > 4)
    return -1;
  int number = 0;
  for (std::size_t i = 3; i < name.size(); ++i) {
    if (name[i] < '0' || name[i] > '9')
      return -1;
    number = number * 10 + (name[i] - '0');
  }
  return number <= 255 ? number : -1;
}

std::string CheckStaticIpv4(uint32_t address, uint32_t netmask, uint32_t gateway) {
  Ipv4Address mask(netmask);
  if (netmask == 0 || !mask.IsNetmask())
    return "netmask " + mask.GetStringAddress() + " is not a valid netmask";
  std::string text = Ipv4Address(address).GetStringAddress();
  if (address == 0 || address == 0xffffffffu || (address >> 24) == 127 || (address >> 28) == 0xe ||
      (address >> 28) == 0xf)
    return "address " + text + " is not a unicast address";
  if (netmask != 0xffffffffu && netmask != 0xfffffffeu &&
      ((address & ~netmask) == 0 || (address & ~netmask) == ~netmask))
    return "address " + text + " is the network or broadcast address of its subnet";
  if (gateway != 0) {
    std::string gw = Ipv4Address(gateway).GetStringAddress();
    if (gateway == address)
      return "gateway " + gw + " is the interface's own address";
    if ((gateway & netmask) != (address & netmask))
      return "gateway " + gw + " is not in the subnet of " + text + "/" +
             std::to_string(mask.PrefixLength());
  }
  return "";
}

namespace {
uint32_t Fnv1a(const std::string& text) {
  uint32_t hash = 2166136261u;
  for (unsigned char c : text) {
    hash ^= c;
    hash *= 16777619u;
  }
  return hash;
}
} // namespace

DhcpLease LeaseFor(const std::string& mac) {
  uint32_t h = Fnv1a(mac);
  DhcpLease lease;
  uint32_t subnet = (10u << 24) | ((64u + h % 64u) << 16) | (((h >> 8) & 0xffu) << 8);
  lease.address = subnet | (2u + (h >> 16) % 250u);
  lease.netmask = 0xffffff00u;
  lease.gateway = subnet | 1u;
  return lease;
}

bool MacInUse(Store& store, const std::string& mac) {
  Statement row = store.Prepare(
      "SELECT 1 FROM tvknic WHERE mac = ?1 UNION ALL SELECT 1 FROM pnic WHERE mac = ?1");
  row.Bind(1, mac);
  return row.Step();
}

std::string FreshMac(Store& store, uint32_t seed) {
  for (uint32_t i = 0; i < 0x1000000u; ++i) {
    uint32_t v = (seed + i) & 0xffffffu;
    std::array<uint8_t, 6> bytes = {0x02,
                                    0x4f,
                                    0x53,
                                    static_cast<uint8_t>(v >> 16),
                                    static_cast<uint8_t>(v >> 8),
                                    static_cast<uint8_t>(v)};
    std::string mac = MacAddress(bytes).GetStringAddress();
    if (!MacInUse(store, mac))
      return mac;
  }
  throw HostCtlException("No free MAC address is left for a Tarvik network interface");
}

Attachment AttachmentOf(Store& store, const std::string& name) {
  Attachment a;
  Statement row = store.Prepare(
      "SELECT p.portset_id, s.name, s.kind, p.portgroup_id, pg.name, p.dvport_key, "
      "coalesce(d.connection_id, 0), t.opaque_id, t.opaque_type, t.external_id, s.mtu "
      "FROM tvknic t JOIN port p ON p.id = t.port_id JOIN portset s ON s.id = p.portset_id "
      "LEFT JOIN portgroup pg ON pg.id = p.portgroup_id "
      "LEFT JOIN dvport d ON d.portset_id = p.portset_id AND d.port_key = p.dvport_key "
      "WHERE t.name = ?");
  enum {
    kPortsetId,
    kPortsetName,
    kKind,
    kPortgroupId,
    kPortgroupName,
    kDvportKey,
    kConnectionId,
    kOpaqueId,
    kOpaqueType,
    kExternalId,
    kMtu
  };
  row.Bind(1, name);
  if (!row.Step())
    return a;
  a.portsetId = row.Int(kPortsetId);
  a.portsetName = row.Text(kPortsetName);
  std::string kind = row.Text(kKind);
  a.portsetMtu = row.Int(kMtu);
  if (!row.IsNull(kPortgroupId)) {
    a.kind = 1;
    a.portgroupId = row.Int(kPortgroupId);
    a.portgroupName = row.Text(kPortgroupName);
  } else if (!row.IsNull(kDvportKey)) {
    a.kind = 2;
    a.dvportKey = row.Text(kDvportKey);
    a.connectionId = static_cast<uint32_t>(row.Int(kConnectionId));
  } else if (kind == "opaque") {
    a.kind = 3;
    a.opaqueId = row.Text(kOpaqueId);
    a.opaqueType = row.Text(kOpaqueType);
    a.externalId = row.Text(kExternalId);
  }
  return a;
}

std::optional<std::string> InterfaceOnPoint(Store& store, const Attachment& attachment) {
  if (attachment.kind == 1) {
    Statement row = store.Prepare(
        "SELECT client FROM port WHERE portgroup_id = ? AND client_kind = 'tvknic' LIMIT 1");
    enum { kClient };
    row.Bind(1, attachment.portgroupId);
    if (row.Step())
      return row.Text(kClient);
  } else if (attachment.kind == 2) {
    Statement row = store.Prepare(
        "SELECT client, client_kind FROM port WHERE portset_id = ? AND dvport_key = ? LIMIT 1");
    enum { kRowClient, kRowClientKind };
    row.BindAll(attachment.portsetId, attachment.dvportKey);
    if (row.Step())
      return row.Text(kRowClientKind) == "tvknic"
                 ? row.Text(kRowClient)
                 : row.Text(kRowClientKind) + " " + row.Text(kRowClient);
  }
  return std::nullopt;
}

int64_t AttachPort(Store& store, const std::string& name, const Attachment& attachment,
                   std::optional<int64_t> portId) {
  Statement limits =
      store.Prepare("SELECT s.num_ports, (SELECT count(*) FROM port p WHERE p.portset_id = s.id) "
                    "AS used FROM portset s WHERE s.id = ?");
  enum { kNumPorts, kUsed };
  limits.Bind(1, attachment.portsetId);
  if (!limits.Step())
    throw HostCtlException("The switch of the connection point does not exist");
  if (limits.Int(kUsed) >= limits.Int(kNumPorts))
    throw HostCtlException("Switch " + attachment.portsetName + " has no free port (" +
                           std::to_string(limits.Int(kNumPorts)) + " ports in use)");
  if (auto user = InterfaceOnPoint(store, attachment)) {
    if (attachment.kind == 1)
      throw HostCtlException("Port group " + attachment.portgroupName +
                             " is already used by Tarvik network interface " + *user);
    throw HostCtlException("DVPort " + attachment.dvportKey + " of " + attachment.portsetName +
                           " is already used by " + *user);
  }
  int64_t id = portId ? *portId : AllocatePortId(store);
  Statement insert =
      store.Prepare("INSERT INTO port(id, portset_id, portgroup_id, dvport_key, client_kind, "
                    "client) VALUES(?, ?, ?, ?, 'tvknic', ?)");
  insert.BindAll(id, attachment.portsetId);
  if (attachment.kind == 1)
    insert.Bind(3, attachment.portgroupId);
  else
    insert.BindNull(3);
  if (attachment.kind == 2)
    insert.Bind(4, attachment.dvportKey);
  else
    insert.BindNull(4);
  insert.Bind(5, name);
  insert.Run();
  return id;
}

void DeleteInterface(Store& store, const std::string& name) {
  Statement port = store.Prepare("SELECT port_id FROM tvknic WHERE name = ?");
  enum { kPortId };
  port.Bind(1, name);
  std::optional<int64_t> portId;
  if (port.Step() && !port.IsNull(kPortId))
    portId = port.Int(kPortId);
  for (const char* sql :
       {"DELETE FROM tvknic_tag WHERE nic = ?", "DELETE FROM tvknic_mcast WHERE nic = ?",
        "DELETE FROM tvknic_ipv6 WHERE nic = ?", "DELETE FROM tvknic WHERE name = ?"})
    store.Prepare(sql).Bind(1, name).Run();
  if (portId)
    store.Prepare("DELETE FROM port WHERE id = ?").Bind(1, *portId).Run();
}

} // namespace Ip

namespace {

const char* const kIpSchema = R"sql(
-- Tags of kernel interfaces (tag types 1 to 12), in the order they were added.
CREATE TABLE tvknic_tag(
  nic TEXT NOT NULL REFERENCES tvknic(name) ON DELETE CASCADE,
  tag INTEGER NOT NULL,
  ord INTEGER NOT NULL,
  PRIMARY KEY(nic, tag)
) WITHOUT ROWID;

-- Multicast group memberships of kernel interfaces.
CREATE TABLE tvknic_mcast(
  nic TEXT NOT NULL REFERENCES tvknic(name) ON DELETE CASCADE,
  grp TEXT NOT NULL,
  link_layer TEXT NOT NULL,
  refcount INTEGER NOT NULL DEFAULT 1,
  ord INTEGER NOT NULL,
  PRIMARY KEY(nic, grp)
) WITHOUT ROWID;
)sql";

bool Contains(const std::vector<std::string>& list, const std::string& value) {
  return std::find(list.begin(), list.end(), value) != list.end();
}

void ImportNetstacks(const JsonObject& root, Store& store) {
  int ord = 1;
  bool haveDefault = false;
  auto stacks = root.Objects("netstacks");
  for (const JsonObject& stack : stacks) {
    std::string key = stack.String("key");
    if (!Ip::IsValidNetstackKey(key))
      stack.Fail("key", "expected 1 to 32 letters, digits, \"-\" or \"_\"");
    bool enabled = stack.Bool("enabled", true);
    bool isDefault = key == Ip::kDefaultNetstack;
    if (isDefault && !enabled)
      stack.Fail("enabled", "the default netstack is always enabled");
    haveDefault = haveDefault || isDefault;
    std::string cc = stack.String("ccAlgorithm", "newreno");
    if (!Contains(Ip::CongestionControlAlgorithms(), cc))
      stack.Fail("ccAlgorithm", "expected one of newreno, cubic, htcp");
    std::string ecn = stack.String("ecn", "enabled");
    if (!Contains(Ip::EcnModes(), ecn))
      stack.Fail("ecn", "expected one of disabled, enabled, echo-only");
    int64_t maxConn = stack.Int("maxConnections", 1000, 100000, 11000);
    int64_t curMaxConn = stack.Int("currentMaxConnections", 1000, 100000, maxConn);
    bool ipv6 = stack.Bool("ipv6", true);
    bool curIpv6 = stack.Bool("currentIpv6", ipv6);
    Statement insert = store.Prepare(
        "INSERT INTO netstack(key, ord, name, state, max_conn, cur_max_conn, ccalgo, ipv6, "
        "cur_ipv6, ecn, predefined) VALUES(?,?,?,?,?,?,?,?,?,?,?)");
    insert.BindAll(key, isDefault ? 0 : ord++, stack.String("name", key),
                   enabled ? NetstackInstance::STATE_ENABLED : NetstackInstance::STATE_DISABLED,
                   maxConn, curMaxConn, cc, ipv6, curIpv6, ecn,
                   Contains(Ip::PredefinedNetstacks(), key));
    try {
      insert.Run();
    } catch (const HostCtlException&) {
      stack.Fail("key", "\"" + key + "\" is used by another netstack");
    }
  }
  if (!haveDefault)
    store.Prepare("INSERT INTO netstack(key, ord, name, state, predefined) VALUES(?, 0, ?, ?, 0)")
        .BindAll(Ip::kDefaultNetstack, Ip::kDefaultNetstack, NetstackInstance::STATE_ENABLED)
        .Run();
}

/// Reads the connection point of one interface into \p a (kind 0 for none).
Ip::Attachment ReadConnectionPoint(const JsonObject& nic, Store& store) {
  Ip::Attachment a;
  bool pg = nic.Has("portgroup"), dvs = nic.Has("dvs"), opaque = nic.Has("opaqueSwitch");
  if (int(pg) + int(dvs) + int(opaque) > 1)
    nic.Fail(pg ? "portgroup" : "dvs",
             "give at most one connection point: portgroup, dvs with dvport, or opaqueSwitch");
  if (pg) {
    Statement row = store.Prepare(
        "SELECT pg.id, pg.portset_id, s.name FROM portgroup pg JOIN portset s ON s.id = "
        "pg.portset_id WHERE pg.name = ?");
    enum { kId, kPortsetId, kName };
    row.Bind(1, nic.String("portgroup"));
    if (!row.Step())
      nic.Fail("portgroup", "no port group of that name");
    a.kind = 1;
    a.portgroupId = row.Int(kId);
    a.portsetId = row.Int(kPortsetId);
    a.portsetName = row.Text(kName);
    a.portgroupName = nic.String("portgroup");
  } else if (dvs) {
    Statement row = store.Prepare("SELECT id FROM portset WHERE name = ? AND kind = 'dvs'");
    enum { kRowId };
    row.Bind(1, nic.String("dvs"));
    if (!row.Step())
      nic.Fail("dvs", "no distributed switch of that name");
    a.kind = 2;
    a.portsetId = row.Int(kRowId);
    a.portsetName = nic.String("dvs");
    a.dvportKey = nic.String("dvport");
    Statement port = store.Prepare("SELECT 1 FROM dvport WHERE portset_id = ? AND port_key = ?");
    port.BindAll(a.portsetId, a.dvportKey);
    if (!port.Step())
      nic.Fail("dvport", "no port of that key on the distributed switch");
  } else if (opaque) {
    Statement row = store.Prepare("SELECT id FROM portset WHERE name = ? AND kind = 'opaque'");
    enum { kRowId };
    row.Bind(1, nic.String("opaqueSwitch"));
    if (!row.Step())
      nic.Fail("opaqueSwitch", "no opaque switch of that name");
    a.kind = 3;
    a.portsetId = row.Int(kRowId);
    a.portsetName = nic.String("opaqueSwitch");
    a.opaqueId = nic.String("opaqueNetworkId");
    a.opaqueType = nic.String("opaqueNetworkType", "");
    a.externalId = nic.String("externalId", "");
  }
  return a;
}

uint32_t ReadIpv4(const JsonObject& nic, const char* key) {
  std::string text = nic.String(key, "0.0.0.0");
  uint32_t value = 0;
  if (!Ipv4Address::Parse(text, value))
    nic.Fail(key, "expected a dotted IPv4 address");
  return value;
}

void ImportInterface(const JsonObject& nic, int ord, Store& store) {
  std::string name = nic.String("name");
  if (!Ip::IsValidTvkNicName(name))
    nic.Fail("name", "expected tvk0 to tvk255");
  std::string netstack = nic.String("netstack", Ip::kDefaultNetstack);
  Statement stack = store.Prepare("SELECT 1 FROM netstack WHERE key = ?");
  stack.Bind(1, netstack);
  if (!stack.Step())
    nic.Fail("netstack", "no netstack \"" + netstack + "\"");
  std::string mac;
  if (nic.Has("mac")) {
    if (!MacAddress::IsValid(nic.String("mac")))
      nic.Fail("mac", "expected a unicast MAC address");
    mac = MacAddress(nic.String("mac")).GetStringAddress();
    if (Ip::MacInUse(store, mac))
      nic.Fail("mac", mac + " is used by another interface or NIC");
  } else {
    mac = Ip::FreshMac(store, static_cast<uint32_t>(Ip::TvkNicNumber(name)) << 8);
  }
  int64_t mtu = nic.Int("mtu", 1280, 9000, 1500);

  std::string mode = nic.String("ipv4Type", "none");
  if (mode != "none" && mode != "static" && mode != "dhcp")
    nic.Fail("ipv4Type", "expected static, dhcp or none");
  uint32_t address = ReadIpv4(nic, "ipv4Address");
  uint32_t netmask = ReadIpv4(nic, "ipv4Netmask");
  uint32_t gateway = ReadIpv4(nic, "ipv4Gateway");
  if (mode == "static") {
    std::string problem = Ip::CheckStaticIpv4(address, netmask, gateway);
    if (!problem.empty())
      nic.Fail("ipv4Address", problem);
  } else if (mode == "dhcp") {
    Ip::DhcpLease lease = Ip::LeaseFor(mac);
    address = lease.address;
    netmask = lease.netmask;
    gateway = lease.gateway;
  } else {
    address = netmask = gateway = 0;
  }
  std::string ipv6Gateway = nic.String("ipv6Gateway", "::");
  if (!Ipv6Address::IsValidAddress(ipv6Gateway))
    nic.Fail("ipv6Gateway", "expected an IPv6 address");

  Statement insert =
      store.Prepare("INSERT INTO tvknic(name, ord, netstack, mac, mtu, enabled, system, ipv4_mode, "
                    "ipv4_address, ipv4_netmask, ipv4_gateway) VALUES(?,?,?,?,?,?,?,?,?,?,?)");
  insert.BindAll(name, ord, netstack, mac, mtu, nic.Bool("enabled", true),
                 nic.Bool("system", false), mode, Ipv4Address(address).GetStringAddress(),
                 Ipv4Address(netmask).GetStringAddress(), Ipv4Address(gateway).GetStringAddress());
  try {
    insert.Run();
  } catch (const HostCtlException&) {
    nic.Fail("name", "\"" + name + "\" is used by another interface");
  }

  Ip::Attachment point = ReadConnectionPoint(nic, store);
  store
      .Prepare("UPDATE tvknic SET tso_mss = ?, rx_queues = ?, dhcp_dns = ?, ipv6_enabled = ?, "
               "ipv6_dhcp = ?, ipv6_ra = ?, ipv6_dhcp_dns = ?, ipv6_gateway = ?, opaque_id = ?, "
               "opaque_type = ?, external_id = ? WHERE name = ?")
      .BindAll(nic.Int("tsoMss", 536, 65535, 65535), nic.Int("rxQueues", 1, 1000, 1),
               nic.Bool("dhcpDns", false), nic.Bool("ipv6Enabled", true), nic.Bool("dhcpv6", false),
               nic.Bool("routerAdv", false), nic.Bool("ipv6DhcpDns", false),
               Ipv6Address(ipv6Gateway).GetStringAddress(), point.opaqueId, point.opaqueType,
               point.externalId, name)
      .Run();
  if (point.kind != 0) {
    if (point.portsetId != 0 && mtu > 0) {
      Statement switchMtu = store.Prepare("SELECT mtu FROM portset WHERE id = ?");
      enum { kMtu };
      switchMtu.Bind(1, point.portsetId);
      if (switchMtu.Step() && mtu > switchMtu.Int(kMtu))
        nic.Fail("mtu", "above the MTU " + std::to_string(switchMtu.Int(kMtu)) + " of switch " +
                            point.portsetName);
    }
    std::optional<int64_t> portId;
    if (nic.Has("portId")) {
      portId = nic.Int("portId", 1, INT32_MAX);
      Statement used = store.Prepare("SELECT 1 FROM port WHERE id = ?");
      used.Bind(1, *portId);
      if (used.Step())
        nic.Fail("portId", "port " + std::to_string(*portId) + " is in use");
    }
    int64_t id = 0;
    try {
      id = Ip::AttachPort(store, name, point, portId);
    } catch (const HostCtlException& e) {
      nic.Fail(point.kind == 1   ? "portgroup"
               : point.kind == 2 ? "dvport"
                                 : "opaqueSwitch",
               e.what());
    }
    store.Prepare("UPDATE tvknic SET port_id = ? WHERE name = ?").BindAll(id, name).Run();
  }

  int index = 0;
  for (const JsonObject& entry : nic.Objects("ipv6Addresses")) {
    std::string text = entry.String("address");
    if (!Ipv6Address::IsValidAddress(text))
      entry.Fail("address", "expected an IPv6 address");
    Statement add = store.Prepare("INSERT INTO tvknic_ipv6(nic, address, prefix, type, status, "
                                  "ord) VALUES(?,?,?,?,?,?)");
    add.BindAll(name, Ipv6Address(text).GetStringAddress(), entry.Int("prefix", 0, 128),
                entry.Int("type", 0, 255, 0), entry.Int("status", 0, 255, 0), index++);
    try {
      add.Run();
    } catch (const HostCtlException&) {
      entry.Fail("address", "listed twice");
    }
  }
  index = 0;
  for (const std::string& tag : nic.Strings("tags")) {
    auto it = std::find(Ip::TagNames().begin(), Ip::TagNames().end(), tag);
    if (it == Ip::TagNames().end())
      nic.Fail("tags", "\"" + tag + "\" is not a tag");
    store.Prepare("INSERT OR IGNORE INTO tvknic_tag(nic, tag, ord) VALUES(?,?,?)")
        .BindAll(name, static_cast<int>(it - Ip::TagNames().begin()) + 1, index++)
        .Run();
  }
  index = 0;
  for (const JsonObject& group : nic.Objects("multicast")) {
    std::string groupAddress = group.String("group");
    if (!Ipv4Address::IsValidAddress(groupAddress) && !Ipv6Address::IsValidAddress(groupAddress))
      group.Fail("group", "expected an IPv4 or IPv6 group address");
    std::string link = group.String("linkLayer");
    std::array<uint8_t, 6> bytes{};
    if (!MacAddress::Parse(link, bytes))
      group.Fail("linkLayer", "expected a MAC address");
    Statement add = store.Prepare(
        "INSERT INTO tvknic_mcast(nic, grp, link_layer, refcount, ord) VALUES(?,?,?,?,?)");
    add.BindAll(name, groupAddress, MacAddress(bytes).GetStringAddress(),
                group.Int("refcount", 1, UINT32_MAX, 1), index++);
    try {
      add.Run();
    } catch (const HostCtlException&) {
      group.Fail("group", "listed twice");
    }
  }
}

void ImportIp(const ordered_json& host, Store& store) {
  JsonObject root(host, "");
  ImportNetstacks(root, store);
  bool running = true, configured = true;
  if (auto kernel = root.Object("kernel")) {
    running = kernel->Bool("ipv6Running", true);
    configured = kernel->Bool("ipv6Configured", running);
  }
  PutSetting(store, Ip::kIpv6RunningSetting, running ? "1" : "0");
  PutSetting(store, Ip::kIpv6ConfiguredSetting, configured ? "1" : "0");
  int ord = 0;
  for (const JsonObject& nic : root.Objects("interfaces"))
    ImportInterface(nic, ord++, store);
}

void ExportIp(ordered_json& host, Store& store, ExportStreams& /*streams*/) {
  ordered_json stacks = ordered_json::array();
  Statement rows =
      store.Prepare("SELECT key, name, state, max_conn, cur_max_conn, ccalgo, ipv6, cur_ipv6, ecn "
                    "FROM netstack ORDER BY ord, key");
  enum { kKey, kName, kState, kMaxConn, kCurMaxConn, kCcalgo, kIpv6, kCurIpv6, kEcn };
  while (rows.Step()) {
    stacks.push_back({{"key", rows.Text(kKey)},
                      {"name", rows.Text(kName)},
                      {"enabled", rows.Int(kState) == NetstackInstance::STATE_ENABLED},
                      {"maxConnections", rows.Int(kMaxConn)},
                      {"currentMaxConnections", rows.Int(kCurMaxConn)},
                      {"ccAlgorithm", rows.Text(kCcalgo)},
                      {"ipv6", rows.Bool(kIpv6)},
                      {"currentIpv6", rows.Bool(kCurIpv6)},
                      {"ecn", rows.Text(kEcn)}});
  }
  host["netstacks"] = std::move(stacks);
  host["kernel"] = {{"ipv6Running", GetSetting(store, Ip::kIpv6RunningSetting) != "0"},
                    {"ipv6Configured", GetSetting(store, Ip::kIpv6ConfiguredSetting) != "0"}};

  ordered_json nics = ordered_json::array();
  Statement nic =
      store.Prepare("SELECT t.name, t.netstack, t.mac, t.mtu, t.enabled, t.system, t.ipv4_mode, "
                    "t.ipv4_address, t.ipv4_netmask, t.ipv4_gateway, t.tso_mss, "
                    "t.rx_queues, t.dhcp_dns, t.ipv6_enabled, "
                    "t.ipv6_dhcp, t.ipv6_ra, t.ipv6_dhcp_dns, "
                    "t.ipv6_gateway, t.port_id "
                    "FROM tvknic t ORDER BY t.ord");
  enum {
    kNicName,
    kNicNetstack,
    kNicMac,
    kNicMtu,
    kNicEnabled,
    kNicSystem,
    kNicIpv4Mode,
    kNicIpv4Address,
    kNicIpv4Netmask,
    kNicIpv4Gateway,
    kNicTsoMss,
    kNicRxQueues,
    kNicDhcpDns,
    kNicIpv6Enabled,
    kNicIpv6Dhcp,
    kNicIpv6Ra,
    kNicIpv6DhcpDns,
    kNicIpv6Gateway,
    kNicPortId
  };
  while (nic.Step()) {
    std::string name = nic.Text(kNicName);
    ordered_json out = ordered_json::object();
    out["name"] = name;
    out["netstack"] = nic.Text(kNicNetstack);
    out["mac"] = nic.Text(kNicMac);
    out["mtu"] = nic.Int(kNicMtu);
    out["enabled"] = nic.Bool(kNicEnabled);
    if (nic.Bool(kNicSystem))
      out["system"] = true;
    Ip::Attachment a = Ip::AttachmentOf(store, name);
    if (a.kind == 1) {
      out["portgroup"] = a.portgroupName;
    } else if (a.kind == 2) {
      out["dvs"] = a.portsetName;
      out["dvport"] = a.dvportKey;
    } else if (a.kind == 3) {
      out["opaqueSwitch"] = a.portsetName;
      out["opaqueNetworkId"] = a.opaqueId;
      out["opaqueNetworkType"] = a.opaqueType;
      out["externalId"] = a.externalId;
    }
    if (!nic.IsNull(kNicPortId))
      out["portId"] = nic.Int(kNicPortId);
    out["tsoMss"] = nic.Int(kNicTsoMss);
    out["rxQueues"] = nic.Int(kNicRxQueues);
    std::string mode = nic.Text(kNicIpv4Mode);
    out["ipv4Type"] = mode;
    if (mode == "static") {
      out["ipv4Address"] = nic.Text(kNicIpv4Address);
      out["ipv4Netmask"] = nic.Text(kNicIpv4Netmask);
      out["ipv4Gateway"] = nic.Text(kNicIpv4Gateway);
    }
    out["dhcpDns"] = nic.Bool(kNicDhcpDns);
    out["ipv6Enabled"] = nic.Bool(kNicIpv6Enabled);
    out["dhcpv6"] = nic.Bool(kNicIpv6Dhcp);
    out["routerAdv"] = nic.Bool(kNicIpv6Ra);
    out["ipv6DhcpDns"] = nic.Bool(kNicIpv6DhcpDns);
    if (nic.Text(kNicIpv6Gateway) != "::")
      out["ipv6Gateway"] = nic.Text(kNicIpv6Gateway);
    ordered_json addresses = ordered_json::array();
    Statement v6 = store.Prepare(
        "SELECT address, prefix, type, status FROM tvknic_ipv6 WHERE nic = ? ORDER BY ord");
    enum { kAddress, kPrefix, kType, kStatus };
    v6.Bind(1, name);
    while (v6.Step())
      addresses.push_back({{"address", v6.Text(kAddress)},
                           {"prefix", v6.Int(kPrefix)},
                           {"type", v6.Int(kType)},
                           {"status", v6.Int(kStatus)}});
    if (!addresses.empty())
      out["ipv6Addresses"] = std::move(addresses);
    ordered_json tags = ordered_json::array();
    Statement tag = store.Prepare("SELECT tag FROM tvknic_tag WHERE nic = ? ORDER BY ord");
    enum { kTag };
    tag.Bind(1, name);
    while (tag.Step())
      tags.push_back(Ip::TagNames().at(static_cast<std::size_t>(tag.Int(kTag) - 1)));
    if (!tags.empty())
      out["tags"] = std::move(tags);
    ordered_json groups = ordered_json::array();
    Statement mc = store.Prepare(
        "SELECT grp, link_layer, refcount FROM tvknic_mcast WHERE nic = ? ORDER BY ord");
    enum { kGrp, kLinkLayer, kRefcount };
    mc.Bind(1, name);
    while (mc.Step())
      groups.push_back({{"group", mc.Text(kGrp)},
                        {"linkLayer", mc.Text(kLinkLayer)},
                        {"refcount", mc.Int(kRefcount)}});
    if (!groups.empty())
      out["multicast"] = std::move(groups);
    nics.push_back(std::move(out));
  }
  if (!nics.empty())
    host["interfaces"] = std::move(nics);
}

} // namespace

extern const Part kIpPart;
const Part kIpPart = {
    "ip",
    kIpSchema,
    {{"", {"netstacks", "interfaces", "kernel"}},
     {"netstacks",
      {"key", "name", "enabled", "maxConnections", "currentMaxConnections", "ccAlgorithm", "ipv6",
       "currentIpv6", "ecn"}},
     {"interfaces",
      {"name",
       "netstack",
       "mac",
       "mtu",
       "enabled",
       "system",
       "portgroup",
       "dvs",
       "dvport",
       "opaqueSwitch",
       "opaqueNetworkId",
       "opaqueNetworkType",
       "externalId",
       "portId",
       "tsoMss",
       "rxQueues",
       "ipv4Type",
       "ipv4Address",
       "ipv4Netmask",
       "ipv4Gateway",
       "dhcpDns",
       "ipv6Enabled",
       "dhcpv6",
       "routerAdv",
       "ipv6DhcpDns",
       "ipv6Gateway",
       "ipv6Addresses",
       "tags",
       "multicast"}},
     {"interfaces.ipv6Addresses", {"address", "prefix", "type", "status"}},
     {"interfaces.multicast", {"group", "linkLayer", "refcount"}}},
    ImportIp,
    ExportIp,
};

} // namespace Model
