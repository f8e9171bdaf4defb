//===- model/DatapathPart.cpp - VMs, their ports, and ENS contexts ----------===//
//
// The datapath part owns the VMs (worlds and the rows of their ports in the
// shared port table), what the datapath knows of ports (client addresses, the
// team uplink, counters, packet filters) and the fast-path (ENS) contexts.
//
// Host description:
//   "vms": [{"worldId": 2100401, "name": "ovm0:web-frontend", "ports": [
//       {"id": 33554440, "switch": "coreSwitch", "portgroup": "VM Traffic",
//        "type": 0, "macs": ["00:1a:7d:10:00:01"], "ipv4": "10.120.0.21",
//        "teamUplink": "vmnic0",
//        "stats": {"rxBytes": 1, "txBytes": 2, "rxPackets": 3, "rxMulticast": 0,
//                  "rxBroadcast": 0, "txPackets": 4, "txMulticast": 0,
//                  "txBroadcast": 0, "rxDropped": 0, "txDropped": 0},
//        "filters": [{"name": "fw-guard", "sortKey": "10", "active": true,
//                     "outbound": false, "extended": true, "packetsIn": 5, ...}]},
//       {"switch": "dvs-west", "dvport": "10", ...}]}]
// A port on a standard switch names its port group, one on a distributed or
// opaque switch its distributed port; "id" is optional (a free id is taken).
//   "ens": {"maxLcores": 4, "lcoreLimit": 16, "numaNodes": 2,
//           "lcores": [{"id": 0, "switch": "vSwitch1", "affinity": 1}]}
// "lcoreLimit" is the number of logical cores the host can dedicate to the
// fast path (context ids lie below it), "numaNodes" the NUMA nodes of the
// host.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Network/Address.h"
#include "model/CoreModel.h"
#include "model/DatapathModel.h"
#include "model/JsonRead.h"
#include "model/Part.h"

#include <set>

namespace Model {

using nlohmann::ordered_json;

namespace {

const char* const kDatapathSchema = R"sql(
-- MAC addresses of a VM port's adapter, in order.
CREATE TABLE vm_port_mac(
  port_id INTEGER NOT NULL REFERENCES port(id) ON DELETE CASCADE,
  ord INTEGER NOT NULL,
  mac TEXT NOT NULL,
  PRIMARY KEY(port_id, ord)
) WITHOUT ROWID;

-- ENS contexts: the switch they serve (none when NULL) and their NUMA node.
CREATE TABLE ens_lcore(
  id INTEGER PRIMARY KEY,
  portset_id INTEGER REFERENCES portset(id) ON DELETE SET NULL,
  affinity INTEGER NOT NULL DEFAULT 0
);
)sql";

void ImportEns(const JsonObject& root, Store& store) {
  std::optional<JsonObject> ens = root.Object("ens");
  if (!ens)
    return;
  for (const auto& [key, value] : ens->Json().items())
    if (key != "maxLcores" && key != "lcoreLimit" && key != "numaNodes" && key != "lcores")
      ens->Fail(key.c_str(), "unknown field");
  int64_t limit = ens->Int("lcoreLimit", 1, 1024, kEnsDefaultLcoreLimit);
  int64_t max = ens->Int("maxLcores", 0, limit, kEnsDefaultMaxLcores);
  int64_t nodes = ens->Int("numaNodes", 1, 64, kEnsDefaultNumaNodes);
  PutSetting(store, kEnsLcoreLimitKey, std::to_string(limit));
  PutSetting(store, kEnsMaxLcoresKey, std::to_string(max));
  PutSetting(store, kEnsNumaNodesKey, std::to_string(nodes));
  std::vector<JsonObject> lcores = ens->Objects("lcores");
  if (static_cast<int64_t>(lcores.size()) > max)
    ens->Fail("lcores", "more contexts than maxLcores allows");
  std::set<int64_t> seen;
  for (const JsonObject& lcore : lcores) {
    for (const auto& [key, value] : lcore.Json().items())
      if (key != "id" && key != "switch" && key != "affinity")
        lcore.Fail(key.c_str(), "unknown field");
    int64_t id = lcore.Int("id", 0, limit - 1);
    if (!seen.insert(id).second)
      lcore.Fail("id", std::to_string(id) + " is used by another context");
    Statement insert =
        store.Prepare("INSERT INTO ens_lcore(id, portset_id, affinity) VALUES(?, ?, ?)");
    insert.BindAll(id).BindNull(2).Bind(3, lcore.Int("affinity", 0, nodes - 1, 0));
    if (lcore.Has("switch")) {
      std::string name = lcore.String("switch");
      Statement portset = store.Prepare("SELECT id FROM portset WHERE name = ?");
      enum { kId };
      portset.Bind(1, name);
      if (!portset.Step())
        lcore.Fail("switch", "there is no switch named \"" + name + "\"");
      insert.Bind(2, portset.Int(kId));
    }
    insert.Run();
  }
}

void ExportEns(ordered_json& host, Store& store) {
  std::optional<std::string> limit = GetSetting(store, kEnsLcoreLimitKey);
  if (!limit)
    return;
  ordered_json ens = {{"maxLcores", std::stoll(GetSetting(store, kEnsMaxLcoresKey).value())},
                      {"lcoreLimit", std::stoll(*limit)},
                      {"numaNodes", std::stoll(GetSetting(store, kEnsNumaNodesKey).value())}};
  ordered_json lcores = ordered_json::array();
  Statement rows = store.Prepare("SELECT l.id, p.name, l.affinity FROM ens_lcore l "
                                 "LEFT JOIN portset p ON p.id = l.portset_id ORDER BY l.id");
  enum { kId, kName, kAffinity };
  while (rows.Step()) {
    ordered_json lcore = {{"id", rows.Int(kId)}};
    if (!rows.IsNull(kName))
      lcore["switch"] = rows.Text(kName);
    lcore["affinity"] = rows.Int(kAffinity);
    lcores.push_back(std::move(lcore));
  }
  ens["lcores"] = std::move(lcores);
  host["ens"] = std::move(ens);
}

/// Description keys of a port's counters, in the order of the counter
/// columns of port.
const char* const kCounterKeys[] = {"rxBytes",     "txBytes",   "rxPackets",   "rxMulticast",
                                    "rxBroadcast", "txPackets", "txMulticast", "txBroadcast",
                                    "rxDropped",   "txDropped"};

/// Description keys of a filter's counters.
const char* const kFilterCounterKeys[] = {"packetsIn",       "packetsOut",     "packetsDropped",
                                          "packetsFiltered", "packetsFaulted", "packetsQueued",
                                          "packetsInjected", "packetErrors"};

/// A counter of the description; counters are shown as signed 64-bit
/// integers, so larger values are refused.
int64_t ReadCounter(const JsonObject& object, const char* key) {
  uint64_t value = object.Counter(key);
  if (value > static_cast<uint64_t>(INT64_MAX))
    object.Fail(key, "expected an unsigned integer up to 9223372036854775807");
  return static_cast<int64_t>(value);
}

/// Refuses keys of \p object that are not in \p known.
template <std::size_t N>
void CheckPlainKeys(const JsonObject& object, const char* const (&known)[N]) {
  for (const auto& [key, value] : object.Json().items()) {
    bool found = false;
    for (const char* k : known)
      found = found || key == k;
    if (!found)
      object.Fail(key.c_str(), "unknown field");
  }
}

/// Where a VM port sits: its switch and its port group or distributed port.
struct PortPlace {
  int64_t portsetId = 0;             ///< Switch id.
  std::optional<int64_t> pg;         ///< Port group id (standard switch).
  std::optional<std::string> dvport; ///< Distributed port key (other switches).
};

PortPlace PlacePort(const JsonObject& port, Store& store) {
  PortPlace place;
  std::string name = port.String("switch");
  Statement portset = store.Prepare("SELECT id, kind FROM portset WHERE name = ?");
  enum { kId, kKind };
  portset.Bind(1, name);
  if (!portset.Step())
    port.Fail("switch", "there is no switch named \"" + name + "\"");
  place.portsetId = portset.Int(kId);
  if (portset.Text(kKind) == "standard") {
    std::string group = port.String("portgroup");
    Statement pg = store.Prepare("SELECT id FROM portgroup WHERE name = ? AND portset_id = ?");
    enum { kPgId };
    pg.BindAll(group, place.portsetId);
    if (!pg.Step())
      port.Fail("portgroup", "switch \"" + name + "\" has no port group \"" + group + "\"");
    place.pg = pg.Int(kPgId);
    if (port.Has("dvport"))
      port.Fail("dvport", "a port on a standard switch has no distributed port");
  } else {
    std::string key = port.String("dvport");
    Statement dv =
        store.Prepare("SELECT is_uplink FROM dvport WHERE portset_id = ? AND port_key = ?");
    enum { kIsUplink };
    dv.BindAll(place.portsetId, key);
    if (!dv.Step())
      port.Fail("dvport", "switch \"" + name + "\" has no distributed port \"" + key + "\"");
    if (dv.Bool(kIsUplink))
      port.Fail("dvport", "distributed port \"" + key + "\" is an uplink port");
    Statement used = store.Prepare("SELECT 1 FROM port WHERE portset_id = ? AND dvport_key = ?");
    used.BindAll(place.portsetId, key);
    if (used.Step())
      port.Fail("dvport", "distributed port \"" + key + "\" is used by another client");
    place.dvport = key;
    if (port.Has("portgroup"))
      port.Fail("portgroup", "a port on a distributed switch names its distributed port");
  }
  return place;
}

void ImportPort(const JsonObject& port, Store& store, int64_t worldId, const std::string& client) {
  PortPlace place = PlacePort(port, store);
  int64_t id = port.Has("id") ? port.Int("id", 1, INT32_MAX) : AllocatePortId(store);
  Statement exists = store.Prepare("SELECT 1 FROM port WHERE id = ?");
  exists.Bind(1, id);
  if (exists.Step())
    port.Fail("id", std::to_string(id) + " is used by another port");
  Statement insert =
      store.Prepare("INSERT INTO port(id, portset_id, portgroup_id, dvport_key, client_kind, "
                    "client, world_id, port_type) VALUES(?, ?, ?, ?, 'vm', ?, ?, ?)");
  insert.BindAll(id, place.portsetId);
  if (place.pg)
    insert.Bind(3, *place.pg);
  else
    insert.BindNull(3);
  if (place.dvport)
    insert.Bind(4, *place.dvport);
  else
    insert.BindNull(4);
  insert.Bind(5, client).Bind(6, worldId).Bind(7, port.Int("type", 0, 255, 0)).Run();

  std::string ipv4 = port.String("ipv4", "0.0.0.0");
  if (!HostCtl::Network::Ipv4Address::IsValidAddress(ipv4))
    port.Fail("ipv4", "expected a dotted-decimal IPv4 address");
  std::string uplink = port.String("teamUplink", "");
  if (!uplink.empty()) {
    Statement up = store.Prepare("SELECT 1 FROM uplink WHERE portset_id = ? AND nic = ?");
    up.BindAll(place.portsetId, uplink);
    if (!up.Step())
      port.Fail("teamUplink", "\"" + uplink + "\" is no uplink of the port's switch");
  }
  store.Prepare("UPDATE port SET ipv4 = ?, team_uplink = ? WHERE id = ?")
      .BindAll(static_cast<int64_t>(HostCtl::Network::Ipv4Address(ipv4).GetValue()), uplink, id)
      .Run();
  int ord = 0;
  for (const std::string& mac : port.Strings("macs")) {
    if (!HostCtl::Network::MacAddress::IsValid(mac))
      port.Fail("macs", "\"" + mac + "\" is not a unicast MAC address");
    store.Prepare("INSERT INTO vm_port_mac(port_id, ord, mac) VALUES(?, ?, ?)")
        .BindAll(id, ord++, HostCtl::Network::MacAddress(mac).GetStringAddress())
        .Run();
  }
  if (std::optional<JsonObject> stats = port.Object("stats")) {
    CheckPlainKeys(*stats, kCounterKeys);
    Statement counters = store.Prepare(
        "UPDATE port SET rx_bytes = ?, tx_bytes = ?, rx_packets = ?, rx_multicast = ?, "
        "rx_broadcast = ?, tx_packets = ?, tx_multicast = ?, tx_broadcast = ?, rx_dropped = ?, "
        "tx_dropped = ? WHERE id = ?");
    int column = 1;
    for (const char* key : kCounterKeys)
      counters.Bind(column++, ReadCounter(*stats, key));
    counters.Bind(column, id);
    // Multicast and broadcast packets are part of all packets, so that the
    // unicast count (the rest) is never negative.
    for (const char* direction : {"rx", "tx"}) {
      std::string total = std::string(direction) + "Packets";
      std::string multicast = std::string(direction) + "Multicast";
      std::string broadcast = std::string(direction) + "Broadcast";
      if (ReadCounter(*stats, multicast.c_str()) + ReadCounter(*stats, broadcast.c_str()) >
          ReadCounter(*stats, total.c_str()))
        stats->Fail(total.c_str(), "less than " + multicast + " and " + broadcast + " together");
    }
    counters.Run();
  }
  // The packet filters, in the host's order, as the description has them.
  ordered_json filters = ordered_json::array();
  for (const JsonObject& filter : port.Objects("filters")) {
    ordered_json f = {{"name", filter.String("name")},
                      {"sortKey", filter.String("sortKey", "")},
                      {"active", filter.Bool("active", true)},
                      {"outbound", filter.Bool("outbound", false)},
                      {"extended", filter.Bool("extended", false)}};
    for (const char* key : kFilterCounterKeys)
      f[key] = static_cast<uint64_t>(ReadCounter(filter, key));
    filters.push_back(std::move(f));
  }
  if (!filters.empty())
    store.Prepare("UPDATE port SET filters = ? WHERE id = ?").BindAll(filters.dump(), id).Run();
}

void ImportVms(const JsonObject& root, Store& store) {
  for (const JsonObject& vm : root.Objects("vms")) {
    int64_t worldId = vm.Int("worldId", 1, INT32_MAX);
    std::string name = vm.String("name");
    Statement exists = store.Prepare("SELECT 1 FROM world WHERE id = ?");
    exists.Bind(1, worldId);
    if (exists.Step())
      vm.Fail("worldId", std::to_string(worldId) + " is used by another VM");
    store.Prepare("INSERT INTO world(id, name) VALUES(?, ?)").BindAll(worldId, name).Run();
    int adapter = 0;
    for (const JsonObject& port : vm.Objects("ports"))
      ImportPort(port, store, worldId, name + ".eth" + std::to_string(adapter++));
  }
}

/// The ports of one VM, in the columns ExportPort reads.
constexpr const char* kVmPortsSql =
    "SELECT p.id, s.name, g.name, p.dvport_key, p.port_type FROM port p "
    "JOIN portset s ON s.id = p.portset_id LEFT JOIN portgroup g ON g.id = p.portgroup_id "
    "WHERE p.world_id = ? AND p.client_kind = 'vm' ORDER BY p.id";
enum VmPortColumn { kPortId, kPortSwitch, kPortGroup, kPortDvport, kPortType };

/// One row of kVmPortsSql as the host description holds it.
ordered_json ExportPort(Store& store, const Statement& port) {
  int64_t id = port.Int(kPortId);
  ordered_json out = {{"id", id}, {"switch", port.Text(kPortSwitch)}};
  if (!port.IsNull(kPortGroup))
    out["portgroup"] = port.Text(kPortGroup);
  if (!port.IsNull(kPortDvport))
    out["dvport"] = port.Text(kPortDvport);
  out["type"] = port.Int(kPortType);
  ordered_json macs = ordered_json::array();
  Statement mac = store.Prepare("SELECT mac FROM vm_port_mac WHERE port_id = ? ORDER BY ord");
  enum { kMac };
  mac.Bind(1, id);
  while (mac.Step())
    macs.push_back(mac.Text(kMac));
  out["macs"] = std::move(macs);
  Statement vmPort =
      store.Prepare("SELECT ipv4, team_uplink FROM port WHERE id = ? AND ipv4 IS NOT NULL");
  enum { kIpv4, kTeamUplink };
  vmPort.Bind(1, id);
  if (vmPort.Step()) {
    out["ipv4"] =
        HostCtl::Network::Ipv4Address(static_cast<uint32_t>(vmPort.Int(kIpv4))).GetStringAddress();
    out["teamUplink"] = vmPort.Text(kTeamUplink);
  }
  Statement counters = store.Prepare(
      "SELECT rx_bytes, tx_bytes, rx_packets, rx_multicast, rx_broadcast, tx_packets, "
      "tx_multicast, tx_broadcast, rx_dropped, tx_dropped FROM port WHERE id = ? "
      "AND rx_bytes IS NOT NULL");
  counters.Bind(1, id);
  if (counters.Step()) {
    ordered_json stats = ordered_json::object();
    int column = 0;
    for (const char* key : kCounterKeys)
      stats[key] = static_cast<uint64_t>(counters.Int(column++));
    out["stats"] = std::move(stats);
  }
  Statement filter = store.Prepare("SELECT filters FROM port WHERE id = ?");
  enum { kFilters };
  filter.Bind(1, id);
  ordered_json filters = filter.Step() && !filter.IsNull(kFilters)
                             ? ordered_json::parse(filter.Text(kFilters))
                             : ordered_json::array();
  out["filters"] = std::move(filters);
  return out;
}

void ExportVms(ordered_json& host, Store& store) {
  ordered_json vms = ordered_json::array();
  Statement world = store.Prepare("SELECT id, name FROM world ORDER BY id");
  enum { kId, kName };
  while (world.Step()) {
    int64_t worldId = world.Int(kId);
    ordered_json ports = ordered_json::array();
    Statement port = store.Prepare(kVmPortsSql);
    port.Bind(1, worldId);
    while (port.Step())
      ports.push_back(ExportPort(store, port));
    vms.push_back({{"worldId", worldId}, {"name", world.Text(kName)}, {"ports", std::move(ports)}});
  }
  if (!vms.empty())
    host["vms"] = std::move(vms);
}

void ImportDatapath(const ordered_json& host, Store& store) {
  JsonObject root(host, "");
  ImportVms(root, store);
  ImportEns(root, store);
}

void ExportDatapath(ordered_json& host, Store& store, ExportStreams& /*streams*/) {
  ExportVms(host, store);
  ExportEns(host, store);
}

} // namespace

extern const Part kDatapathPart;
const Part kDatapathPart = {
    "datapath",
    kDatapathSchema,
    {{"", {"vms", "ens"}},
     {"vms", {"worldId", "name", "ports"}},
     {"vms.ports",
      {"id", "switch", "portgroup", "dvport", "type", "macs", "ipv4", "teamUplink", "stats",
       "filters"}},
     {"vms.ports.filters",
      {"name", "sortKey", "active", "outbound", "extended", "packetsIn", "packetsOut",
       "packetsDropped", "packetsFiltered", "packetsFaulted", "packetsQueued", "packetsInjected",
       "packetErrors"}}},
    ImportDatapath,
    ExportDatapath,
};

} // namespace Model
