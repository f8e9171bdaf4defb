//===- model/SwitchingPart.cpp - Switches, port groups, policies, LACP ----===//
//
// The switching part fills the shared switching tables (portset, uplink,
// portgroup, dvport, and the uplink rows of port) from the "vswitches",
// "dvswitches" and "opaqueSwitches" keys of the host description, and keeps
// side tables of its own: the settings and policies of standard switches,
// the policy overrides of port groups, the identity of distributed switches,
// the LACP settings of their uplink ports, their LAGs and the LACP runtime
// state of each NIC of a LAG.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "HostCtl/Network/Switching.h"
#include "model/CoreModel.h"
#include "model/JsonRead.h"
#include "model/Part.h"
#include "model/SwitchingModel.h"

#include <algorithm>
#include <cstddef>
#include <set>

namespace Model {

using HostCtl::Network::NicCapabilities;
using HostCtl::Network::NicTeamingPolicy;
using HostCtl::Network::PortSecurityPolicy;
using HostCtl::Network::ShapingPolicy;
using nlohmann::ordered_json;

namespace {

const char* const kSwitchingSchema = R"sql(
-- Settings and policies of standard switches. Policies are JSON documents in
-- the form of the host description (a field is present when it is set).
CREATE TABLE vswitch(
  portset_id INTEGER PRIMARY KEY REFERENCES portset(id) ON DELETE CASCADE,
  cdp INTEGER NOT NULL,
  beacon_interval INTEGER NOT NULL,
  beacon_threshold INTEGER NOT NULL,
  teaming TEXT NOT NULL,
  security TEXT NOT NULL,
  shaping TEXT NOT NULL,
  capabilities TEXT NOT NULL
);

-- Policy overrides of port groups (only the overridden fields are present).
CREATE TABLE portgroup_policy(
  portgroup_id INTEGER PRIMARY KEY REFERENCES portgroup(id) ON DELETE CASCADE,
  teaming TEXT NOT NULL DEFAULT '{}',
  security TEXT NOT NULL DEFAULT '{}',
  shaping TEXT NOT NULL DEFAULT '{}'
);

-- Identity and settings of distributed and opaque switches.
CREATE TABLE dvswitch(
  portset_id INTEGER PRIMARY KEY REFERENCES portset(id) ON DELETE CASCADE,
  uuid TEXT NOT NULL UNIQUE,
  display_name TEXT NOT NULL,
  class_name TEXT NOT NULL,
  configured_ports INTEGER NOT NULL,
  cdp TEXT NOT NULL,
  beacon_timeout INTEGER NOT NULL,
  branded INTEGER NOT NULL,
  lacp_on_dpu INTEGER NOT NULL
);

-- Link aggregation groups of distributed switches. `nics` holds the LACP
-- runtime state of each NIC of the LAG, a JSON array of objects in the form
-- of the host description (bit 1 of actorState is the short timeout).
CREATE TABLE lag(
  portset_id INTEGER NOT NULL REFERENCES portset(id) ON DELETE CASCADE,
  lag_id INTEGER NOT NULL,
  name TEXT NOT NULL,
  mode INTEGER NOT NULL,
  load_balancing INTEGER NOT NULL,
  uplink_count INTEGER NOT NULL,
  ord INTEGER NOT NULL,
  nics TEXT NOT NULL,
  PRIMARY KEY(portset_id, lag_id)
) WITHOUT ROWID;

)sql";

/// CDP status names of standard switches, by index.
const char* const kCdpNames[] = {"down", "listen", "advertise", "both"};

struct TeamName {
  const char* name;                      ///< Name in the description.
  NicTeamingPolicy::TeamPolicyType type; ///< Value.
};
const TeamName kTeamNames[] = {
    {"iphash", NicTeamingPolicy::TEAM_IP_HASH},
    {"srcmac", NicTeamingPolicy::TEAM_SRC_MAC},
    {"srcport", NicTeamingPolicy::TEAM_SRC_PORT},
    {"explicit", NicTeamingPolicy::TEAM_EXPLICIT},
};

/// Fields of one LACP NIC record, in column order after `state`.
struct LacpField {
  const char* key; ///< Description key.
  int64_t max;     ///< Largest value.
};
const LacpField kLacpFields[] = {
    {"actorPortNumber", 65535},   {"actorPortPriority", 65535},
    {"actorAdminKey", 65535},     {"actorOperKey", 65535},
    {"actorState", 255},          {"partnerAge", 4294967295},
    {"partnerPortNumber", 65535}, {"partnerPortPriority", 65535},
    {"partnerOperKey", 65535},    {"partnerState", 255},
};
const char* const kLacpCounters[] = {"rxLacpdus", "txLacpdus", "rxErrors", "txErrors"};

std::string Dump(const ordered_json& json) {
  return json.dump();
}

int CdpIndex(const JsonObject& object, const char* key) {
  std::string name = object.String(key, "listen");
  for (int i = 0; i < 4; ++i)
    if (name == kCdpNames[i])
      return i;
  object.Fail(key, "expected one of down, listen, advertise, both");
}

/// Whether NIC \p nic is an uplink of any switch already imported.
bool IsClaimedUplink(Store& store, const std::string& nic) {
  Statement row = store.Prepare("SELECT 1 FROM uplink WHERE nic = ?");
  row.Bind(1, nic);
  return row.Step();
}

bool IsHostNic(Store& store, const std::string& nic) {
  Statement row = store.Prepare("SELECT 1 FROM pnic WHERE name = ?");
  row.Bind(1, nic);
  return row.Step();
}

int64_t InsertPortset(Store& store, const JsonObject& object, const std::string& name,
                      const char* kind, int ord, int64_t numPorts, int64_t mtu, bool system) {
  if (name.empty())
    object.Fail("name", "must not be empty");
  if (name.size() > 127)
    object.Fail("name", "must not be longer than 127 bytes");
  Statement exists = store.Prepare("SELECT 1 FROM portset WHERE name = ?");
  exists.Bind(1, name);
  if (exists.Step())
    object.Fail("name", "\"" + name + "\" is used by another switch");
  store
      .Prepare("INSERT INTO portset(name, kind, system, ord, num_ports, mtu) "
               "VALUES(?, ?, ?, ?, ?, ?)")
      .BindAll(name, kind, system, ord, numPorts, mtu)
      .Run();
  return store.LastInsertId();
}

/// Inserts the port that uplink \p nic uses on switch \p portsetId.
void InsertUplinkPort(Store& store, int64_t portsetId, const std::string& nic,
                      const std::string* dvportKey) {
  Statement insert = store.Prepare("INSERT INTO port(id, portset_id, portgroup_id, dvport_key, "
                                   "client_kind, client) VALUES(?, ?, NULL, ?, 'uplink', ?)");
  insert.BindAll(AllocatePortId(store), portsetId);
  if (dvportKey)
    insert.Bind(3, *dvportKey);
  else
    insert.BindNull(3);
  insert.Bind(4, nic).Run();
}

/// Checks that every uplink a teaming order names is in \p uplinks.
void CheckOrder(const JsonObject& object, const NicTeamingPolicy& policy,
                const std::vector<std::string>& uplinks) {
  std::set<std::string> seen;
  for (const std::string& name : policy.GetUplinkOrder()) {
    if (std::find(uplinks.begin(), uplinks.end(), name) == uplinks.end())
      object.Fail("activeUplinks", "\"" + name + "\" is not an uplink of the switch");
    if (!seen.insert(name).second)
      object.Fail("activeUplinks", "\"" + name + "\" is listed twice");
  }
}

void ImportPortGroups(Store& store, const JsonObject& vswitch, int64_t portsetId,
                      const std::vector<std::string>& uplinks, int& ord) {
  for (const JsonObject& pg : vswitch.Objects("portgroups")) {
    std::string name = pg.String("name");
    if (name.empty())
      pg.Fail("name", "must not be empty");
    if (name.size() > 127)
      pg.Fail("name", "must not be longer than 127 bytes");
    Statement exists = store.Prepare("SELECT 1 FROM portgroup WHERE name = ?");
    exists.Bind(1, name);
    if (exists.Step())
      pg.Fail("name", "\"" + name + "\" is used by another port group");
    store
        .Prepare("INSERT INTO portgroup(name, portset_id, vlan_id, system, ord) "
                 "VALUES(?, ?, ?, ?, ?)")
        .BindAll(name, portsetId,
                 pg.Int("vlanId", HostCtl::Network::PortGroup::MIN_VLAN_ID,
                        HostCtl::Network::PortGroup::MAX_VLAN_ID, 0),
                 pg.Bool("system", false), ord++)
        .Run();
    int64_t id = store.LastInsertId();
    NicTeamingPolicy teaming;
    PortSecurityPolicy security;
    ShapingPolicy shaping;
    if (auto object = pg.Object("teaming")) {
      teaming = TeamingFromJson(*object);
      CheckOrder(*object, teaming, uplinks);
    }
    if (auto object = pg.Object("security"))
      security = SecurityFromJson(*object);
    if (auto object = pg.Object("shaping"))
      shaping = ShapingFromJson(*object);
    store
        .Prepare("INSERT INTO portgroup_policy(portgroup_id, teaming, security, shaping) "
                 "VALUES(?, ?, ?, ?)")
        .BindAll(id, Dump(TeamingToJson(teaming)), Dump(SecurityToJson(security)),
                 Dump(ShapingToJson(shaping)))
        .Run();
  }
}

void ImportStandard(const JsonObject& root, Store& store) {
  int ord = 0;
  int pgOrd = 0;
  int64_t hostPorts = 0;
  for (const JsonObject& vs : root.Objects("vswitches")) {
    std::string name = vs.String("name");
    int64_t ports = vs.Int("ports", 1, HostCtl::Network::VirtualSwitch::MAX_PORTS,
                           HostCtl::Network::Portset::DEF_NUM_PORTS);
    hostPorts += ports;
    if (hostPorts > HostCtl::Network::VirtualSwitch::MAX_HOST_PORTS)
      vs.Fail("ports", "the standard switches of a host have at most " +
                           std::to_string(HostCtl::Network::VirtualSwitch::MAX_HOST_PORTS) +
                           " ports together");
    int64_t mtu = vs.Int("mtu", HostCtl::Network::VirtualSwitch::MIN_MTU,
                         HostCtl::Network::VirtualSwitch::MAX_MTU, 1500);
    int64_t id =
        InsertPortset(store, vs, name, "standard", ord++, ports, mtu, vs.Bool("system", false));
    std::vector<std::string> uplinks = vs.Strings("uplinks");
    if (static_cast<int64_t>(uplinks.size()) > ports)
      vs.Fail("uplinks", "more uplinks than ports");
    int uplinkOrd = 0;
    for (const std::string& nic : uplinks) {
      if (!IsHostNic(store, nic))
        vs.Fail("uplinks", "\"" + nic + "\" is not a NIC of the host");
      if (IsClaimedUplink(store, nic))
        vs.Fail("uplinks", "\"" + nic + "\" is already an uplink of a switch");
      store.Prepare("INSERT INTO uplink(portset_id, nic, ord) VALUES(?, ?, ?)")
          .BindAll(id, nic, uplinkOrd++)
          .Run();
      InsertUplinkPort(store, id, nic, nullptr);
    }
    NicTeamingPolicy teaming = NicTeamingPolicy::GetDefaultPolicy();
    PortSecurityPolicy security = PortSecurityPolicy::GetDefaultPolicy();
    ShapingPolicy shaping = ShapingPolicy::GetDefaultPolicy();
    NicCapabilities caps = NicCapabilities::GetDefaultPolicy();
    if (auto object = vs.Object("teaming")) {
      teaming = TeamingFromJson(*object).MergedOver(teaming);
      CheckOrder(*object, teaming, uplinks);
    }
    if (auto object = vs.Object("security"))
      security = SecurityFromJson(*object).MergedOver(security);
    if (auto object = vs.Object("shaping"))
      shaping = ShapingFromJson(*object).MergedOver(shaping);
    if (auto object = vs.Object("capabilities"))
      caps = CapabilitiesFromJson(*object);
    store
        .Prepare("INSERT INTO vswitch(portset_id, cdp, beacon_interval, beacon_threshold, "
                 "teaming, security, shaping, capabilities) VALUES(?, ?, ?, ?, ?, ?, ?, ?)")
        .BindAll(id, CdpIndex(vs, "cdp"), vs.Int("beaconInterval", 1, 3600, 1),
                 vs.Int("beaconThreshold", 1, 60, 3), Dump(TeamingToJson(teaming)),
                 Dump(SecurityToJson(security)), Dump(ShapingToJson(shaping)),
                 Dump(CapabilitiesToJson(caps)))
        .Run();
    ImportPortGroups(store, vs, id, uplinks, pgOrd);
  }
}

void ImportLags(Store& store, const JsonObject& dvs, int64_t id) {
  int ord = 0;
  for (const JsonObject& lag : dvs.Objects("lags")) {
    int64_t lagId = lag.Int("id", 0, 4294967295);
    std::string mode = lag.String("mode", "active");
    if (mode != "active" && mode != "passive")
      lag.Fail("mode", "expected active or passive");
    Statement exists = store.Prepare("SELECT 1 FROM lag WHERE portset_id = ? AND lag_id = ?");
    exists.BindAll(id, lagId);
    if (exists.Step())
      lag.Fail("id", "is used by another LAG of the switch");
    std::string name = lag.String("name");
    if (name.empty() || name.size() >= sizeof(HostCtl::Network::LagConfig::lagName))
      lag.Fail("name", "expected 1 to 63 bytes");
    ordered_json nics = ordered_json::array();
    std::set<std::string> names;
    for (const JsonObject& nic : lag.Objects("nics")) {
      std::string nicName = nic.String("name");
      if (nicName.empty() || nicName.size() >= 32)
        nic.Fail("name", "expected 1 to 31 bytes");
      std::string state = nic.String("state", "");
      if (state.size() >= 32)
        nic.Fail("state", "expected at most 31 bytes");
      std::string device = nic.String("partnerDeviceId", "");
      if (device.size() >= 32)
        nic.Fail("partnerDeviceId", "expected at most 31 bytes");
      if (!names.insert(nicName).second)
        nic.Fail("name", "\"" + nicName + "\" is listed twice in the LAG");
      ordered_json entry = {{"name", nicName}, {"state", state}};
      for (const LacpField& field : kLacpFields)
        entry[field.key] = nic.Int(field.key, 0, field.max, 0);
      entry["partnerDeviceId"] = device;
      for (const char* counter : kLacpCounters)
        entry[counter] = nic.Counter(counter);
      nics.push_back(std::move(entry));
    }
    store
        .Prepare("INSERT INTO lag(portset_id, lag_id, name, mode, load_balancing, uplink_count, "
                 "ord, nics) VALUES(?, ?, ?, ?, ?, ?, ?, ?)")
        .BindAll(id, lagId, name, mode == "active" ? 1 : 2, lag.Int("loadBalancing", 0, 20, 0),
                 lag.Int("uplinkCount", 0, 32, 0), ord++, nics.dump())
        .Run();
  }
}

void ImportDistributed(const JsonObject& root, Store& store, const char* key, const char* kind,
                       int& ord) {
  for (const JsonObject& dvs : root.Objects(key)) {
    std::string name = dvs.String("name");
    int64_t numPorts = dvs.Int("numPorts", 0, 65536, 512);
    int64_t id = InsertPortset(store, dvs, name, kind, ord++, numPorts,
                               dvs.Int("mtu", HostCtl::Network::VirtualSwitch::MIN_MTU,
                                       HostCtl::Network::VirtualSwitch::MAX_MTU, 1500),
                               dvs.Bool("system", false));
    std::string uuid = dvs.String("uuid");
    Statement uuidUsed = store.Prepare("SELECT 1 FROM dvswitch WHERE uuid = ?");
    uuidUsed.Bind(1, uuid);
    if (uuid.empty() || uuidUsed.Step())
      dvs.Fail("uuid", "must be present and unique");
    store
        .Prepare("INSERT INTO dvswitch(portset_id, uuid, display_name, class_name, "
                 "configured_ports, cdp, beacon_timeout, branded, lacp_on_dpu) "
                 "VALUES(?, ?, ?, ?, ?, ?, ?, ?, ?)")
        .BindAll(id, uuid, dvs.String("displayName", name), dvs.String("class", "corvex-dvs"),
                 dvs.Int("configuredPorts", 0, 65536, 0), dvs.String("cdp", "listen"),
                 dvs.Int("beaconTimeout", -1, 3600, -1), dvs.Bool("branded", true),
                 dvs.Bool("lacpOnDpu", false))
        .Run();
    std::vector<std::string> uplinks = dvs.Strings("uplinks");
    int uplinkOrd = 0;
    for (const std::string& nic : uplinks) {
      if (nic.empty())
        dvs.Fail("uplinks", "an uplink name must not be empty");
      if (IsClaimedUplink(store, nic))
        dvs.Fail("uplinks", "\"" + nic + "\" is already an uplink of a switch");
      store.Prepare("INSERT INTO uplink(portset_id, nic, ord) VALUES(?, ?, ?)")
          .BindAll(id, nic, uplinkOrd++)
          .Run();
    }
    int portOrd = 0;
    std::set<std::string> uplinkPorts;
    for (const JsonObject& port : dvs.Objects("dvports")) {
      std::string portKey = port.String("key");
      if (portKey.empty())
        port.Fail("key", "must not be empty");
      Statement exists =
          store.Prepare("SELECT 1 FROM dvport WHERE portset_id = ? AND port_key = ?");
      exists.BindAll(id, portKey);
      if (exists.Step())
        port.Fail("key", "\"" + portKey + "\" is used by another port of the switch");
      bool isUplink = port.Bool("uplink", false) || port.Has("nic");
      store
          .Prepare("INSERT INTO dvport(portset_id, port_key, portgroup_key, connection_id, "
                   "is_uplink, ord, name, lacp_enabled, lacp_mode, uplink_pg_key) "
                   "VALUES(?, ?, ?, ?, ?, ?, ?, ?, ?, ?)")
          .BindAll(id, portKey, port.String("portgroupKey", ""),
                   port.Int("connectionId", 0, 4294967295, 0), isUplink, portOrd++,
                   port.String("name", ""), port.Bool("lacpEnabled", false),
                   port.Int("lacpMode", 0, 2, 0), port.String("uplinkPortgroupKey", ""))
          .Run();
      if (port.Has("nic")) {
        std::string nic = port.String("nic");
        if (std::find(uplinks.begin(), uplinks.end(), nic) == uplinks.end())
          port.Fail("nic", "\"" + nic + "\" is not an uplink of the switch");
        if (!uplinkPorts.insert(nic).second)
          port.Fail("nic", "\"" + nic + "\" already has an uplink port");
        InsertUplinkPort(store, id, nic, &portKey);
      }
    }
    ImportLags(store, dvs, id);
  }
}

void ImportSwitching(const ordered_json& host, Store& store) {
  JsonObject root(host, "");
  ImportStandard(root, store);
  int ord = 0;
  ImportDistributed(root, store, "dvswitches", "dvs", ord);
  ImportDistributed(root, store, "opaqueSwitches", "opaque", ord);
  // The NIC part checked that a NIC that turns VLAN statistics on is an
  // uplink of a switch of the description; its uplink row exists now.
  for (const JsonObject& nic : root.Objects("nics"))
    if (nic.Bool("vlanStats", false))
      store.Prepare("UPDATE uplink SET vlan_stats = 1 WHERE nic = ?")
          .Bind(1, nic.String("name"))
          .Run();
}

std::vector<std::string> UplinksOf(Store& store, int64_t id) {
  std::vector<std::string> names;
  Statement rows = store.Prepare("SELECT nic FROM uplink WHERE portset_id = ? ORDER BY ord");
  enum { kNic };
  rows.Bind(1, id);
  while (rows.Step())
    names.push_back(rows.Text(kNic));
  return names;
}

ordered_json ExportPortGroups(Store& store, int64_t id) {
  ordered_json pgs = ordered_json::array();
  Statement rows = store.Prepare(
      "SELECT g.name, g.vlan_id, g.system, p.teaming, p.security, p.shaping FROM portgroup g "
      "JOIN portgroup_policy p ON p.portgroup_id = g.id WHERE g.portset_id = ? ORDER BY g.ord");
  enum { kName, kVlanId, kSystem, kTeaming, kSecurity, kShaping };
  rows.Bind(1, id);
  while (rows.Step()) {
    ordered_json pg = ordered_json::object();
    pg["name"] = rows.Text(kName);
    pg["vlanId"] = rows.Int(kVlanId);
    if (rows.Bool(kSystem))
      pg["system"] = true;
    const char* keys[] = {"teaming", "security", "shaping"};
    for (int i = 0; i < 3; ++i) {
      ordered_json policy = ordered_json::parse(rows.Text(kTeaming + i));
      if (!policy.empty())
        pg[keys[i]] = std::move(policy);
    }
    pgs.push_back(std::move(pg));
  }
  return pgs;
}

void ExportStandard(ordered_json& host, Store& store) {
  ordered_json list = ordered_json::array();
  Statement rows = store.Prepare(
      "SELECT p.id, p.name, p.system, p.num_ports, p.mtu, v.cdp, v.beacon_interval, "
      "v.beacon_threshold, v.teaming, v.security, v.shaping, v.capabilities FROM portset p "
      "JOIN vswitch v ON v.portset_id = p.id WHERE p.kind = 'standard' ORDER BY p.ord");
  enum {
    kId,
    kName,
    kSystem,
    kNumPorts,
    kMtu,
    kCdp,
    kBeaconInterval,
    kBeaconThreshold,
    kTeaming,
    kSecurity,
    kShaping,
    kCapabilities
  };
  while (rows.Step()) {
    int64_t id = rows.Int(kId);
    ordered_json vs = ordered_json::object();
    vs["name"] = rows.Text(kName);
    if (rows.Bool(kSystem))
      vs["system"] = true;
    vs["ports"] = rows.Int(kNumPorts);
    vs["mtu"] = rows.Int(kMtu);
    vs["cdp"] = kCdpNames[rows.Int(kCdp) & 3];
    vs["beaconInterval"] = rows.Int(kBeaconInterval);
    vs["beaconThreshold"] = rows.Int(kBeaconThreshold);
    vs["uplinks"] = UplinksOf(store, id);
    vs["teaming"] = ordered_json::parse(rows.Text(kTeaming));
    vs["security"] = ordered_json::parse(rows.Text(kSecurity));
    vs["shaping"] = ordered_json::parse(rows.Text(kShaping));
    vs["capabilities"] = ordered_json::parse(rows.Text(kCapabilities));
    vs["portgroups"] = ExportPortGroups(store, id);
    list.push_back(std::move(vs));
  }
  if (!list.empty())
    host["vswitches"] = std::move(list);
}

ordered_json ExportLags(Store& store, int64_t id) {
  ordered_json lags = ordered_json::array();
  Statement rows = store.Prepare("SELECT lag_id, name, mode, load_balancing, uplink_count, nics "
                                 "FROM lag WHERE portset_id = ? ORDER BY ord");
  enum { kLagId, kName, kMode, kLoadBalancing, kUplinkCount, kNics };
  rows.Bind(1, id);
  while (rows.Step()) {
    ordered_json lag = ordered_json::object();
    lag["id"] = rows.Int(kLagId);
    lag["name"] = rows.Text(kName);
    lag["mode"] = rows.Int(kMode) == 2 ? "passive" : "active";
    lag["loadBalancing"] = rows.Int(kLoadBalancing);
    lag["uplinkCount"] = rows.Int(kUplinkCount);
    ordered_json nics = ordered_json::parse(rows.Text(kNics));
    lag["nics"] = std::move(nics);
    lags.push_back(std::move(lag));
  }
  return lags;
}

void ExportDistributed(ordered_json& host, Store& store, const char* key, const char* kind) {
  ordered_json list = ordered_json::array();
  Statement rows = store.Prepare(
      "SELECT p.id, p.name, p.system, p.num_ports, p.mtu, d.uuid, d.display_name, d.class_name, "
      "d.configured_ports, d.cdp, d.beacon_timeout, d.branded, d.lacp_on_dpu FROM portset p "
      "JOIN dvswitch d ON d.portset_id = p.id WHERE p.kind = ? ORDER BY p.ord");
  enum {
    kId,
    kName,
    kSystem,
    kNumPorts,
    kMtu,
    kUuid,
    kDisplayName,
    kClassName,
    kConfiguredPorts,
    kCdp,
    kBeaconTimeout,
    kBranded,
    kLacpOnDpu
  };
  rows.Bind(1, kind);
  while (rows.Step()) {
    int64_t id = rows.Int(kId);
    ordered_json dvs = ordered_json::object();
    dvs["name"] = rows.Text(kName);
    if (rows.Bool(kSystem))
      dvs["system"] = true;
    dvs["numPorts"] = rows.Int(kNumPorts);
    dvs["mtu"] = rows.Int(kMtu);
    dvs["uuid"] = rows.Text(kUuid);
    dvs["displayName"] = rows.Text(kDisplayName);
    dvs["class"] = rows.Text(kClassName);
    dvs["configuredPorts"] = rows.Int(kConfiguredPorts);
    dvs["cdp"] = rows.Text(kCdp);
    dvs["beaconTimeout"] = rows.Int(kBeaconTimeout);
    dvs["branded"] = rows.Bool(kBranded);
    dvs["lacpOnDpu"] = rows.Bool(kLacpOnDpu);
    dvs["uplinks"] = UplinksOf(store, id);
    ordered_json ports = ordered_json::array();
    Statement port = store.Prepare(
        "SELECT d.port_key, d.portgroup_key, d.connection_id, d.is_uplink, d.name, "
        "d.lacp_enabled, d.lacp_mode, d.uplink_pg_key, "
        "(SELECT client FROM port WHERE portset_id = d.portset_id AND dvport_key = d.port_key "
        " AND client_kind = 'uplink') AS nic FROM dvport d "
        "WHERE d.portset_id = ? ORDER BY d.ord");
    enum {
      kPortKey,
      kPortgroupKey,
      kConnectionId,
      kIsUplink,
      kPortName,
      kLacpEnabled,
      kLacpMode,
      kUplinkPgKey,
      kNic
    };
    port.Bind(1, id);
    while (port.Step()) {
      ordered_json entry = ordered_json::object();
      entry["key"] = port.Text(kPortKey);
      entry["name"] = port.Text(kPortName);
      entry["portgroupKey"] = port.Text(kPortgroupKey);
      entry["connectionId"] = port.Int(kConnectionId);
      entry["uplink"] = port.Bool(kIsUplink);
      if (!port.IsNull(kNic))
        entry["nic"] = port.Text(kNic);
      entry["lacpEnabled"] = port.Bool(kLacpEnabled);
      entry["lacpMode"] = port.Int(kLacpMode);
      entry["uplinkPortgroupKey"] = port.Text(kUplinkPgKey);
      ports.push_back(std::move(entry));
    }
    dvs["dvports"] = std::move(ports);
    dvs["lags"] = ExportLags(store, id);
    list.push_back(std::move(dvs));
  }
  if (!list.empty())
    host[key] = std::move(list);
}

void ExportSwitching(ordered_json& host, Store& store, ExportStreams& /*streams*/) {
  ExportStandard(host, store);
  ExportDistributed(host, store, "dvswitches", "dvs");
  ExportDistributed(host, store, "opaqueSwitches", "opaque");
}

// --- Policy documents.

void ReadTeamOrder(const JsonObject& object, NicTeamingPolicy& policy) {
  if (!object.Has("activeUplinks") && !object.Has("standbyUplinks"))
    return;
  std::vector<std::string> order = object.Strings("activeUplinks");
  auto active = static_cast<int32_t>(order.size());
  for (std::string& name : object.Strings("standbyUplinks"))
    order.push_back(std::move(name));
  policy.SetUplinkOrder(std::move(order));
  policy.SetMaxActiveUplinks(active);
}

} // namespace

extern const Part kSwitchingPart;
const Part kSwitchingPart = {
    "switching",
    kSwitchingSchema,
    {{"", {"vswitches", "dvswitches", "opaqueSwitches"}},
     {"vswitches",
      {"name", "system", "ports", "mtu", "cdp", "beaconInterval", "beaconThreshold", "uplinks",
       "teaming", "security", "shaping", "capabilities", "portgroups"}},
     {"vswitches.portgroups", {"name", "vlanId", "system", "teaming", "security", "shaping"}},
     {"dvswitches",
      {"name", "system", "numPorts", "mtu", "uuid", "displayName", "class", "configuredPorts",
       "cdp", "beaconTimeout", "branded", "lacpOnDpu", "uplinks", "dvports", "lags"}},
     {"dvswitches.dvports",
      {"key", "name", "portgroupKey", "connectionId", "uplink", "nic", "lacpEnabled", "lacpMode",
       "uplinkPortgroupKey"}},
     {"dvswitches.lags", {"id", "name", "mode", "loadBalancing", "uplinkCount", "nics"}},
     {"dvswitches.lags.nics",
      {"name", "state", "actorPortNumber", "actorPortPriority", "actorAdminKey", "actorOperKey",
       "actorState", "partnerAge", "partnerPortNumber", "partnerPortPriority", "partnerOperKey",
       "partnerState", "partnerDeviceId", "rxLacpdus", "txLacpdus", "rxErrors", "txErrors"}},
     {"opaqueSwitches",
      {"name", "system", "numPorts", "mtu", "uuid", "displayName", "class", "configuredPorts",
       "cdp", "beaconTimeout", "branded", "lacpOnDpu", "uplinks", "dvports", "lags"}},
     {"opaqueSwitches.dvports",
      {"key", "name", "portgroupKey", "connectionId", "uplink", "nic", "lacpEnabled", "lacpMode",
       "uplinkPortgroupKey"}},
     {"opaqueSwitches.lags", {"id", "name", "mode", "loadBalancing", "uplinkCount", "nics"}},
     {"opaqueSwitches.lags.nics",
      {"name", "state", "actorPortNumber", "actorPortPriority", "actorAdminKey", "actorOperKey",
       "actorState", "partnerAge", "partnerPortNumber", "partnerPortPriority", "partnerOperKey",
       "partnerState", "partnerDeviceId", "rxLacpdus", "txLacpdus", "rxErrors", "txErrors"}}},
    ImportSwitching,
    ExportSwitching,
};

const char* TeamTypeName(NicTeamingPolicy::TeamPolicyType type) {
  for (const TeamName& entry : kTeamNames)
    if (entry.type == type)
      return entry.name;
  return "srcport";
}

ordered_json TeamingToJson(const NicTeamingPolicy& policy) {
  ordered_json out = ordered_json::object();
  if (policy.IsSet(NicTeamingPolicy::MASK_LOAD_BALANCING))
    out["loadBalancing"] = TeamTypeName(policy.GetTeamingPolicy());
  if (policy.IsSet(NicTeamingPolicy::MASK_FAILURE_DETECTION))
    out["failureDetection"] = policy.GetLinkCriteria().IsBeacon() ? "beacon" : "link";
  if (policy.IsSet(NicTeamingPolicy::MASK_NOTIFY_SWITCHES))
    out["notifySwitches"] = policy.GetNotifySwitchOnFailure();
  if (policy.IsSet(NicTeamingPolicy::MASK_FAILBACK))
    out["failback"] = !policy.GetRollingRestoration();
  if (policy.IsSet(NicTeamingPolicy::MASK_UPLINK_ORDER)) {
    const std::vector<std::string>& order = policy.GetUplinkOrder();
    std::size_t active = static_cast<std::size_t>(std::max(0, policy.GetMaxActiveUplinks()));
    active = std::min(active, order.size());
    auto split = order.begin() + static_cast<std::ptrdiff_t>(active);
    out["activeUplinks"] = std::vector<std::string>(order.begin(), split);
    out["standbyUplinks"] = std::vector<std::string>(split, order.end());
  }
  return out;
}

NicTeamingPolicy TeamingFromJson(const JsonObject& object) {
  NicTeamingPolicy policy;
  if (object.Has("loadBalancing")) {
    std::string name = object.String("loadBalancing");
    bool known = false;
    for (const TeamName& entry : kTeamNames)
      if (name == entry.name) {
        policy.SetTeamingPolicy(entry.type);
        known = true;
      }
    if (!known)
      object.Fail("loadBalancing", "expected one of iphash, srcmac, srcport, explicit");
  }
  if (object.Has("failureDetection")) {
    std::string name = object.String("failureDetection");
    if (name != "link" && name != "beacon")
      object.Fail("failureDetection", "expected link or beacon");
    HostCtl::Network::LinkCriteriaSelectionPolicy criteria;
    criteria.SetBeacon(name == "link");
    policy.SetLinkCriteria(criteria);
  }
  if (object.Has("notifySwitches"))
    policy.SetNotifySwitchOnFailure(object.Bool("notifySwitches"));
  if (object.Has("failback"))
    policy.SetRollingRestoration(!object.Bool("failback"));
  ReadTeamOrder(object, policy);
  return policy;
}

ordered_json SecurityToJson(const PortSecurityPolicy& policy) {
  ordered_json out = ordered_json::object();
  if (policy.IsSet(PortSecurityPolicy::MASK_PROMISCUOUS))
    out["allowPromiscuous"] = policy.GetAllowPromiscuous();
  if (policy.IsSet(PortSecurityPolicy::MASK_MAC_CHANGE))
    out["allowMacChange"] = policy.GetAllowMacAddressChange();
  if (policy.IsSet(PortSecurityPolicy::MASK_FORGED_TRANSMITS))
    out["allowForgedTransmits"] = policy.GetAllowForgedTransmits();
  return out;
}

PortSecurityPolicy SecurityFromJson(const JsonObject& object) {
  PortSecurityPolicy policy;
  if (object.Has("allowPromiscuous"))
    policy.SetAllowPromiscuous(object.Bool("allowPromiscuous"));
  if (object.Has("allowMacChange"))
    policy.SetAllowMacAddressChange(object.Bool("allowMacChange"));
  if (object.Has("allowForgedTransmits"))
    policy.SetAllowForgedTransmits(object.Bool("allowForgedTransmits"));
  return policy;
}

ordered_json ShapingToJson(const ShapingPolicy& policy) {
  ordered_json out = ordered_json::object();
  if (policy.IsSet(ShapingPolicy::MASK_ENABLED))
    out["enabled"] = policy.IsEnabled();
  if (policy.IsSet(ShapingPolicy::MASK_AVERAGE))
    out["averageBps"] = policy.GetAverageBps();
  if (policy.IsSet(ShapingPolicy::MASK_PEAK))
    out["peakBps"] = policy.GetPeakBps();
  if (policy.IsSet(ShapingPolicy::MASK_BURST))
    out["burstSize"] = policy.GetBurstSize();
  return out;
}

ShapingPolicy ShapingFromJson(const JsonObject& object) {
  ShapingPolicy policy;
  if (object.Has("enabled"))
    policy.SetEnabled(object.Bool("enabled"));
  if (object.Has("averageBps"))
    policy.SetAverageBps(static_cast<uint64_t>(object.Int("averageBps", 0, INT64_MAX)));
  if (object.Has("peakBps"))
    policy.SetPeakBps(static_cast<uint64_t>(object.Int("peakBps", 0, INT64_MAX)));
  if (object.Has("burstSize"))
    policy.SetBurstSize(static_cast<uint64_t>(object.Int("burstSize", 0, INT64_MAX)));
  return policy;
}

ordered_json CapabilitiesToJson(const NicCapabilities& caps) {
  return {{"checksumOffload", caps.GetChecksumOffload()},
          {"tcpSegmentation", caps.GetTcpSegmentation()},
          {"zeroCopyTransmit", caps.GetZeroCopyTransmit()}};
}

NicCapabilities CapabilitiesFromJson(const JsonObject& object) {
  NicCapabilities caps = NicCapabilities::GetDefaultPolicy();
  caps.SetChecksumOffload(object.Bool("checksumOffload", caps.GetChecksumOffload()));
  caps.SetTcpSegmentation(object.Bool("tcpSegmentation", caps.GetTcpSegmentation()));
  caps.SetZeroCopyTransmit(object.Bool("zeroCopyTransmit", caps.GetZeroCopyTransmit()));
  return caps;
}

namespace {
ordered_json ParseStored(const std::string& text) {
  ordered_json json = ordered_json::parse(text, nullptr, false);
  if (!json.is_object())
    throw HostCtl::Lib::HostCtlException("The host's stored policy is damaged");
  return json;
}

template <typename Fn> auto FromStored(const std::string& text, const char* what, Fn fn) {
  ordered_json json = ParseStored(text);
  try {
    return fn(JsonObject(json, what));
  } catch (const ImportError& error) {
    throw HostCtl::Lib::HostCtlException(std::string("The host's stored policy is damaged: ") +
                                         error.what());
  }
}
} // namespace

NicTeamingPolicy ParseTeaming(const std::string& text) {
  return FromStored(text, "teaming", TeamingFromJson);
}

PortSecurityPolicy ParseSecurity(const std::string& text) {
  return FromStored(text, "security", SecurityFromJson);
}

ShapingPolicy ParseShaping(const std::string& text) {
  return FromStored(text, "shaping", ShapingFromJson);
}

} // namespace Model
