//===- model/NicPart.cpp - Information, counters, SR-IOV and attachments --===//
//
// The NIC part keeps what the host knows of each physical NIC beyond its
// basic state: the generic information record (ports, link modes, PHY,
// transceiver, wake-on, message level), pause settings and driver versions
// and the packet counters (documents of kinds "info" and "stats" in
// pnic_record), SR-IOV virtual functions with their counters, the branches
// attached to a trunk uplink, and the per-VLAN counters of an uplink.
//
// Host description keys, inside each object of "nics":
//   "info": {"supportedPorts": [port codes 0-6], "supportsAutoNegotiation",
//            "advertisedModes": [{"speed", "duplex" 0-255, "media" 0-38}],
//            "advertisedAutoNegotiation", "port", "phyAddress" 0-31,
//            "transceiver" 0-1, "autoNegotiation", "supportsWakeOn",
//            "wakeOn": [codes 0-8], "messageLevelSupported", "messageLevel",
//            "virtualAddress"}
//   "driverInfo": {"version", "firmwareVersion"}
//   "pause": {"supported", "autoNegotiation", "rx", "tx"}
//   "stats": {counter name: count}
//   "sriov": true for an SR-IOV enabled NIC, with
//   "vfs": [{"id" 0-255, "active", "pciAddress", "ownerWorldId", "stats"}]
//   "attachments": [{"branch", "vlanId"}] (on the trunk)
//   "vlanStats": true to count packets per VLAN on the NIC's uplink
//   "vlanCounters": [{"vlanId", "rxPackets", "txPackets"}]
//
//===----------------------------------------------------------------------===//
#include "model/NicModel.h"

#include "HostCtl/Lib.h"
#include "model/JsonRead.h"
#include "model/Part.h"

#include <algorithm>
#include <initializer_list>
#include <optional>

namespace Model {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::PnicStats;
using HostCtl::Network::SriovNicVFStats;
using nlohmann::ordered_json;

const std::array<CounterKey<PnicStats>, 24> kPnicStatsKeys = {{
    {"txPackets", &PnicStats::txPackets},
    {"rxPackets", &PnicStats::rxPackets},
    {"txBytes", &PnicStats::txBytes},
    {"rxBytes", &PnicStats::rxBytes},
    {"txErrors", &PnicStats::txErrors},
    {"rxErrors", &PnicStats::rxErrors},
    {"txDropped", &PnicStats::txDropped},
    {"rxDropped", &PnicStats::rxDropped},
    {"rxMulticast", &PnicStats::rxMulticast},
    {"rxBroadcast", &PnicStats::rxBroadcast},
    {"txMulticast", &PnicStats::txMulticast},
    {"txBroadcast", &PnicStats::txBroadcast},
    {"rxLengthErrors", &PnicStats::rxLengthErrors},
    {"rxOverErrors", &PnicStats::rxOverErrors},
    {"rxCrcErrors", &PnicStats::rxCrcErrors},
    {"rxFrameErrors", &PnicStats::rxFrameErrors},
    {"rxFifoErrors", &PnicStats::rxFifoErrors},
    {"rxMissedErrors", &PnicStats::rxMissedErrors},
    {"txAbortedErrors", &PnicStats::txAbortedErrors},
    {"txFifoErrors", &PnicStats::txFifoErrors},
    {"txCarrierErrors", &PnicStats::txCarrierErrors},
    {"txHeartbeatErrors", &PnicStats::txHeartbeatErrors},
    {"txWindowErrors", &PnicStats::txWindowErrors},
    {"collisions", &PnicStats::collisions},
}};

const std::array<CounterKey<SriovNicVFStats>, 20> kVfStatsKeys = {{
    {"rxUnicastPkts", &SriovNicVFStats::rxUnicastPkts},
    {"rxUnicastBytes", &SriovNicVFStats::rxUnicastBytes},
    {"rxMulticastPkts", &SriovNicVFStats::rxMulticastPkts},
    {"rxMulticastBytes", &SriovNicVFStats::rxMulticastBytes},
    {"rxBroadcastPkts", &SriovNicVFStats::rxBroadcastPkts},
    {"rxBroadcastBytes", &SriovNicVFStats::rxBroadcastBytes},
    {"rxOutOfBufferDrops", &SriovNicVFStats::rxOutOfBufferDrops},
    {"rxErrorDrops", &SriovNicVFStats::rxErrorDrops},
    {"rxLroPkts", &SriovNicVFStats::rxLroPkts},
    {"rxLroBytes", &SriovNicVFStats::rxLroBytes},
    {"txUnicastPkts", &SriovNicVFStats::txUnicastPkts},
    {"txUnicastBytes", &SriovNicVFStats::txUnicastBytes},
    {"txMulticastPkts", &SriovNicVFStats::txMulticastPkts},
    {"txMulticastBytes", &SriovNicVFStats::txMulticastBytes},
    {"txBroadcastPkts", &SriovNicVFStats::txBroadcastPkts},
    {"txBroadcastBytes", &SriovNicVFStats::txBroadcastBytes},
    {"txErrors", &SriovNicVFStats::txErrors},
    {"txDiscards", &SriovNicVFStats::txDiscards},
    {"txTsoPkts", &SriovNicVFStats::txTsoPkts},
    {"txTsoBytes", &SriovNicVFStats::txTsoBytes},
}};

namespace {

const char* const kNicSchema = R"sql(
-- Virtual functions of SR-IOV NICs, with their counters as a JSON object.
CREATE TABLE sriov_vf(
  nic TEXT NOT NULL REFERENCES pnic(name) ON DELETE CASCADE,
  vf_id INTEGER NOT NULL,
  active INTEGER NOT NULL,
  pci_address TEXT NOT NULL,
  owner_world TEXT NOT NULL,
  counters TEXT NOT NULL,
  PRIMARY KEY(nic, vf_id)
) WITHOUT ROWID;

-- Branch uplinks attached to trunk uplinks: a branch has one trunk, and a
-- trunk has one branch per VLAN.
CREATE TABLE pnic_attachment(
  branch TEXT PRIMARY KEY REFERENCES pnic(name) ON DELETE CASCADE,
  trunk TEXT NOT NULL REFERENCES pnic(name) ON DELETE CASCADE,
  vlan_id INTEGER NOT NULL,
  ord INTEGER NOT NULL,
  UNIQUE(trunk, vlan_id)
) WITHOUT ROWID;

-- Per-VLAN packet counters of an uplink NIC; they are shown while VLAN
-- statistics are enabled on the uplink (uplink.vlan_stats).
CREATE TABLE pnic_vlan_counter(
  nic TEXT NOT NULL REFERENCES pnic(name) ON DELETE CASCADE,
  vlan_id INTEGER NOT NULL,
  rx_packets INTEGER NOT NULL,
  tx_packets INTEGER NOT NULL,
  PRIMARY KEY(nic, vlan_id)
) WITHOUT ROWID;
)sql";

/// Whether the description names \p nic as an uplink of any switch.
bool IsDescribedUplink(const ordered_json& host, const std::string& nic) {
  for (const char* kind : {"vswitches", "dvswitches", "opaqueSwitches"}) {
    auto switches = host.find(kind);
    if (switches == host.end() || !switches->is_array())
      continue;
    for (const ordered_json& vswitch : *switches) {
      if (!vswitch.is_object() || !vswitch.contains("uplinks") || !vswitch["uplinks"].is_array())
        continue;
      for (const ordered_json& uplink : vswitch["uplinks"])
        if (uplink.is_string() && uplink.get<std::string>() == nic)
          return true;
    }
  }
  return false;
}

ordered_json CodesToJson(const std::vector<uint32_t>& codes) {
  ordered_json array = ordered_json::array();
  for (uint32_t code : codes)
    array.push_back(code);
  return array;
}

/// Refuses keys of a nested object that are not in \p allowed.
void CheckObjectKeys(const JsonObject& object, std::initializer_list<const char*> allowed) {
  for (const auto& item : object.Json().items()) {
    const std::string& key = item.key();
    bool known =
        std::any_of(allowed.begin(), allowed.end(), [&](const char* name) { return key == name; });
    if (!known)
      throw ImportError(object.Path() + "." + key + ": unknown field");
  }
}

/// Reads a JSON object of counters (\p object may be absent) into \p record.
template <typename Record, std::size_t N>
void ReadCounters(const std::optional<JsonObject>& object,
                  const std::array<CounterKey<Record>, N>& keys, Record& record) {
  if (!object)
    return;
  for (const auto& item : object->Json().items()) {
    const std::string& key = item.key();
    bool known = std::any_of(keys.begin(), keys.end(),
                             [&](const CounterKey<Record>& k) { return key == k.key; });
    if (!known)
      throw ImportError(object->Path() + "." + key + ": unknown counter");
  }
  for (const CounterKey<Record>& key : keys)
    record.*key.member = object->Counter(key.key, 0);
}

template <typename Record, std::size_t N>
std::string CountersToText(const std::array<CounterKey<Record>, N>& keys, const Record& record) {
  ordered_json object = ordered_json::object();
  for (const CounterKey<Record>& key : keys)
    object[key.key] = record.*key.member;
  return object.dump();
}

/// The settings of a NIC as its description writes them: "info",
/// "driverInfo" and "pause".
ordered_json SettingsToJson(const NicSettings& settings) {
  const HostCtl::Network::PnicInfo& record = settings.info;
  ordered_json info = ordered_json::object();
  info["supportedPorts"] = CodesToJson(record.supportedPorts);
  info["supportsAutoNegotiation"] = record.supportsAutoNegotiation;
  ordered_json modes = ordered_json::array();
  for (const HostCtl::Network::PnicLinkMode& mode : record.advertisedModes)
    modes.push_back({{"speed", mode.speed}, {"duplex", mode.duplex}, {"media", mode.media}});
  info["advertisedModes"] = std::move(modes);
  info["advertisedAutoNegotiation"] = record.advertisedAutoNegotiation;
  info["port"] = record.port;
  info["phyAddress"] = record.phyAddress;
  info["transceiver"] = record.transceiver;
  info["autoNegotiation"] = record.autoNegotiation;
  info["supportsWakeOn"] = record.supportsWakeOn;
  info["wakeOn"] = CodesToJson(record.wakeOn);
  info["messageLevelSupported"] = record.messageLevelSupported;
  info["messageLevel"] = record.messageLevel;
  info["virtualAddress"] = record.virtualAddress;
  return {{"info", std::move(info)},
          {"driverInfo",
           {{"version", settings.driverVersion}, {"firmwareVersion", settings.firmwareVersion}}},
          {"pause",
           {{"supported", settings.pause.supported},
            {"autoNegotiation", settings.pause.autoNegotiation},
            {"rx", settings.pause.rx},
            {"tx", settings.pause.tx}}}};
}

/// Reads what SettingsToJson wrote.
NicSettings SettingsFromJson(const ordered_json& json) {
  NicSettings settings;
  const ordered_json& info = json.at("info");
  HostCtl::Network::PnicInfo& record = settings.info;
  record.supportedPorts = info.at("supportedPorts").get<std::vector<uint32_t>>();
  record.supportsAutoNegotiation = info.at("supportsAutoNegotiation").get<bool>();
  for (const ordered_json& mode : info.at("advertisedModes"))
    record.advertisedModes.push_back({mode.at("speed").get<uint32_t>(),
                                      mode.at("duplex").get<uint32_t>(),
                                      mode.at("media").get<uint32_t>()});
  record.advertisedAutoNegotiation = info.at("advertisedAutoNegotiation").get<bool>();
  record.port = info.at("port").get<uint32_t>();
  record.phyAddress = info.at("phyAddress").get<uint32_t>();
  record.transceiver = info.at("transceiver").get<uint32_t>();
  record.autoNegotiation = info.at("autoNegotiation").get<bool>();
  record.supportsWakeOn = info.at("supportsWakeOn").get<bool>();
  record.wakeOn = info.at("wakeOn").get<std::vector<uint32_t>>();
  record.messageLevelSupported = info.at("messageLevelSupported").get<bool>();
  record.messageLevel = info.at("messageLevel").get<uint32_t>();
  record.virtualAddress = info.at("virtualAddress").get<std::string>();
  const ordered_json& driver = json.at("driverInfo");
  settings.driverVersion = driver.at("version").get<std::string>();
  settings.firmwareVersion = driver.at("firmwareVersion").get<std::string>();
  const ordered_json& pause = json.at("pause");
  settings.pause.supported = pause.at("supported").get<bool>();
  settings.pause.autoNegotiation = pause.at("autoNegotiation").get<bool>();
  settings.pause.rx = pause.at("rx").get<bool>();
  settings.pause.tx = pause.at("tx").get<bool>();
  return settings;
}

/// The settings a NIC has when its description gives none: its current link
/// mode advertised, and nothing else supported.
NicSettings DefaultSettings(Store& store, const std::string& nic) {
  NicSettings settings;
  Statement row = store.Prepare("SELECT speed, duplex FROM pnic WHERE name = ?");
  enum { kSpeed, kDuplex };
  row.Bind(1, nic);
  if (row.Step() && row.Int(kSpeed) > 0)
    settings.info.advertisedModes.push_back(
        {static_cast<uint32_t>(row.Int(kSpeed)), static_cast<uint32_t>(row.Int(kDuplex)), 1});
  return settings;
}

NicSettings ReadSettings(const JsonObject& nic, Store& store, const std::string& name) {
  NicSettings settings = DefaultSettings(store, name);
  if (std::optional<JsonObject> info = nic.Object("info")) {
    CheckObjectKeys(*info, {"supportedPorts", "supportsAutoNegotiation", "advertisedModes",
                            "advertisedAutoNegotiation", "port", "phyAddress", "transceiver",
                            "autoNegotiation", "supportsWakeOn", "wakeOn", "messageLevelSupported",
                            "messageLevel", "virtualAddress"});
    HostCtl::Network::PnicInfo& record = settings.info;
    record.supportedPorts.clear();
    for (int64_t code : info->Ints("supportedPorts", 0, 6))
      record.supportedPorts.push_back(static_cast<uint32_t>(code));
    record.supportsAutoNegotiation = info->Bool("supportsAutoNegotiation", false);
    if (info->Has("advertisedModes")) {
      record.advertisedModes.clear();
      for (const JsonObject& mode : info->Objects("advertisedModes")) {
        CheckObjectKeys(mode, {"speed", "duplex", "media"});
        record.advertisedModes.push_back({static_cast<uint32_t>(mode.Int("speed", 0, 400000)),
                                          // Any code the NIC's own duplex may have: a
                                          // NIC's default mode carries its duplex code.
                                          static_cast<uint32_t>(mode.Int("duplex", 0, 255)),
                                          static_cast<uint32_t>(mode.Int("media", 0, 38))});
      }
    }
    record.advertisedAutoNegotiation = info->Bool("advertisedAutoNegotiation", false);
    record.port = static_cast<uint32_t>(info->Int("port", 0, 6, 0));
    if (!record.supportedPorts.empty() &&
        std::find(record.supportedPorts.begin(), record.supportedPorts.end(), record.port) ==
            record.supportedPorts.end())
      info->Fail("port", "must be one of supportedPorts");
    record.phyAddress = static_cast<uint32_t>(info->Int("phyAddress", 0, 31, 0));
    record.transceiver = static_cast<uint32_t>(info->Int("transceiver", 0, 1, 0));
    record.autoNegotiation = info->Bool("autoNegotiation", false);
    record.supportsWakeOn = info->Bool("supportsWakeOn", false);
    for (int64_t code : info->Ints("wakeOn", 0, 8))
      record.wakeOn.push_back(static_cast<uint32_t>(code));
    if (!record.wakeOn.empty() && !record.supportsWakeOn)
      info->Fail("wakeOn", "requires supportsWakeOn");
    record.messageLevelSupported = info->Bool("messageLevelSupported", false);
    record.messageLevel = static_cast<uint32_t>(info->Int("messageLevel", 0, 0xffffffffLL, 0));
    record.virtualAddress = info->String("virtualAddress", "");
  }
  if (std::optional<JsonObject> driver = nic.Object("driverInfo")) {
    CheckObjectKeys(*driver, {"version", "firmwareVersion"});
    settings.driverVersion = driver->String("version", "");
    settings.firmwareVersion = driver->String("firmwareVersion", "");
  }
  if (std::optional<JsonObject> pause = nic.Object("pause")) {
    CheckObjectKeys(*pause, {"supported", "autoNegotiation", "rx", "tx"});
    settings.pause.supported = pause->Bool("supported", true);
    settings.pause.autoNegotiation = pause->Bool("autoNegotiation", false);
    settings.pause.rx = pause->Bool("rx", false);
    settings.pause.tx = pause->Bool("tx", false);
    if (!settings.pause.supported &&
        (settings.pause.autoNegotiation || settings.pause.rx || settings.pause.tx))
      pause->Fail("supported", "must be true when any pause setting is on");
  }
  return settings;
}

void ImportNic(const ordered_json& host, Store& store) {
  JsonObject root(host, "");
  std::vector<JsonObject> nics = root.Objects("nics");
  for (const JsonObject& nic : nics) {
    std::string name = nic.String("name");
    SaveNicSettings(store, name, ReadSettings(nic, store, name));

    PnicStats stats;
    ReadCounters(nic.Object("stats"), kPnicStatsKeys, stats);
    store.Prepare("INSERT INTO pnic_record(nic, kind, value) VALUES(?, 'stats', ?)")
        .BindAll(name, CountersToText(kPnicStatsKeys, stats))
        .Run();

    bool sriov = nic.Bool("sriov", false);
    std::vector<JsonObject> vfs = nic.Objects("vfs");
    if (!sriov && !vfs.empty())
      nic.Fail("vfs", "requires \"sriov\": true");
    if (sriov)
      store.Prepare("UPDATE pnic SET sriov = 1 WHERE name = ?").BindAll(name).Run();
    for (const JsonObject& vf : vfs) {
      int64_t id = vf.Int("id", 0, 255);
      if (!vf.Bool("active", false) && !vf.String("ownerWorldId", "").empty())
        vf.Fail("ownerWorldId", "an inactive VF has no owner world");
      SriovNicVFStats counters;
      ReadCounters(vf.Object("stats"), kVfStatsKeys, counters);
      Statement insert = store.Prepare(
          "INSERT INTO sriov_vf(nic, vf_id, active, pci_address, owner_world, counters) "
          "VALUES(?, ?, ?, ?, ?, ?) ON CONFLICT DO NOTHING");
      insert
          .BindAll(name, id, vf.Bool("active", false), vf.String("pciAddress", ""),
                   vf.String("ownerWorldId", ""), CountersToText(kVfStatsKeys, counters))
          .Run();
      if (store.Changes() == 0)
        vf.Fail("id", "VF " + std::to_string(id) + " is listed twice");
    }

    // The switching part turns counting on as it adds the uplinks.
    if (nic.Bool("vlanStats", false) && !IsDescribedUplink(host, name))
      nic.Fail("vlanStats", "VLAN statistics need the NIC to be an uplink of a switch");
    for (const JsonObject& counter : nic.Objects("vlanCounters")) {
      int64_t vlan = counter.Int("vlanId", 0, 4094);
      store
          .Prepare("INSERT INTO pnic_vlan_counter(nic, vlan_id, rx_packets, tx_packets) "
                   "VALUES(?, ?, ?, ?) ON CONFLICT DO NOTHING")
          .BindAll(name, vlan, static_cast<int64_t>(counter.Counter("rxPackets")),
                   static_cast<int64_t>(counter.Counter("txPackets")))
          .Run();
      if (store.Changes() == 0)
        counter.Fail("vlanId", "VLAN " + std::to_string(vlan) + " is listed twice");
    }
  }
  // Attachments refer to other NICs, so they are read once every NIC is in.
  for (const JsonObject& nic : nics) {
    std::string trunk = nic.String("name");
    for (const JsonObject& attachment : nic.Objects("attachments")) {
      std::string branch = attachment.String("branch");
      int64_t vlan = attachment.Int("vlanId", 1, 4094);
      try {
        AddAttachment(store, trunk, branch, vlan);
      } catch (const HostCtlException& refusal) {
        attachment.Fail("branch", refusal.what());
      }
    }
  }
}

void ExportNic(ordered_json& host, Store& store, ExportStreams& /*streams*/) {
  if (!host.contains("nics"))
    return;
  for (ordered_json& nic : host["nics"]) {
    std::string name = nic["name"].get<std::string>();
    ordered_json settings = SettingsToJson(LoadNicSettings(store, name));
    for (auto& [key, value] : settings.items())
      nic[key] = std::move(value);

    Statement stats =
        store.Prepare("SELECT value FROM pnic_record WHERE nic = ? AND kind = 'stats'");
    enum { kValue };
    stats.Bind(1, name);
    if (stats.Step())
      nic["stats"] = ordered_json::parse(stats.Text(kValue));

    Statement sriov = store.Prepare("SELECT 1 FROM pnic WHERE name = ? AND sriov = 1");
    sriov.Bind(1, name);
    if (sriov.Step()) {
      nic["sriov"] = true;
      ordered_json vfs = ordered_json::array();
      Statement rows = store.Prepare("SELECT vf_id, active, pci_address, owner_world, counters "
                                     "FROM sriov_vf WHERE nic = ? ORDER BY vf_id");
      enum { kVfId, kActive, kPciAddress, kOwnerWorld, kCounters };
      rows.Bind(1, name);
      while (rows.Step())
        vfs.push_back({{"id", rows.Int(kVfId)},
                       {"active", rows.Bool(kActive)},
                       {"pciAddress", rows.Text(kPciAddress)},
                       {"ownerWorldId", rows.Text(kOwnerWorld)},
                       {"stats", ordered_json::parse(rows.Text(kCounters))}});
      if (!vfs.empty())
        nic["vfs"] = std::move(vfs);
    }

    ordered_json attachments = ordered_json::array();
    Statement branches =
        store.Prepare("SELECT branch, vlan_id FROM pnic_attachment WHERE trunk = ? ORDER BY ord");
    enum { kBranch, kVlanId };
    branches.Bind(1, name);
    while (branches.Step())
      attachments.push_back(
          {{"branch", branches.Text(kBranch)}, {"vlanId", branches.Int(kVlanId)}});
    if (!attachments.empty())
      nic["attachments"] = std::move(attachments);

    Statement enabled =
        store.Prepare("SELECT 1 FROM uplink WHERE nic = ? AND vlan_stats != 0 LIMIT 1");
    enabled.Bind(1, name);
    if (enabled.Step())
      nic["vlanStats"] = true;

    ordered_json counters = ordered_json::array();
    Statement vlans = store.Prepare("SELECT vlan_id, rx_packets, tx_packets FROM "
                                    "pnic_vlan_counter WHERE nic = ? ORDER BY vlan_id");
    enum { kVlansVlanId, kVlansRxPackets, kVlansTxPackets };
    vlans.Bind(1, name);
    while (vlans.Step())
      counters.push_back({{"vlanId", vlans.Int(kVlansVlanId)},
                          {"rxPackets", vlans.Int(kVlansRxPackets)},
                          {"txPackets", vlans.Int(kVlansTxPackets)}});
    if (!counters.empty())
      nic["vlanCounters"] = std::move(counters);
  }
}

} // namespace

NicSettings LoadNicSettings(Store& store, const std::string& nic) {
  Statement row = store.Prepare("SELECT value FROM pnic_record WHERE nic = ? AND kind = 'info'");
  enum { kValue };
  row.Bind(1, nic);
  if (!row.Step())
    return DefaultSettings(store, nic);
  return SettingsFromJson(ordered_json::parse(row.Text(kValue)));
}

void SaveNicSettings(Store& store, const std::string& nic, const NicSettings& settings) {
  store
      .Prepare("INSERT INTO pnic_record(nic, kind, value) VALUES(?, 'info', ?) "
               "ON CONFLICT(nic, kind) DO UPDATE SET value = excluded.value")
      .BindAll(nic, SettingsToJson(settings).dump())
      .Run();
}

bool PnicExists(Store& store, const std::string& nic) {
  Statement row = store.Prepare("SELECT 1 FROM pnic WHERE name = ?");
  row.Bind(1, nic);
  return row.Step();
}

void AddAttachment(Store& store, const std::string& trunk, const std::string& branch,
                   int64_t vlanId) {
  if (!PnicExists(store, trunk))
    throw HostCtlException("There is no physical NIC named " + trunk + " on this host");
  if (!PnicExists(store, branch))
    throw HostCtlException("There is no physical NIC named " + branch + " on this host");
  if (trunk == branch)
    throw HostCtlException("An uplink cannot be attached to itself");
  if (vlanId < 1 || vlanId > 4094)
    throw HostCtlException("VLAN ID " + std::to_string(vlanId) +
                           " is out of range; a branch needs a VLAN ID from 1 to 4094");
  // The cached statement is reset when each look-up's Statement goes away.
  auto trunkOf = [&](const std::string& nic) -> std::optional<std::string> {
    Statement row = store.Prepare("SELECT trunk FROM pnic_attachment WHERE branch = ?");
    enum { kTrunk };
    row.Bind(1, nic);
    return row.Step() ? std::optional<std::string>(row.Text(kTrunk)) : std::nullopt;
  };
  if (std::optional<std::string> current = trunkOf(branch))
    throw HostCtlException("Uplink " + branch + " is already attached to " + *current);
  if (std::optional<std::string> current = trunkOf(trunk))
    throw HostCtlException("Uplink " + trunk + " is a branch of " + *current +
                           " and cannot be a trunk");
  {
    Statement branchAsTrunk = store.Prepare("SELECT 1 FROM pnic_attachment WHERE trunk = ?");
    branchAsTrunk.Bind(1, branch);
    if (branchAsTrunk.Step())
      throw HostCtlException("Uplink " + branch + " is a trunk and cannot be attached as a branch");
  }
  {
    Statement sameVlan =
        store.Prepare("SELECT branch FROM pnic_attachment WHERE trunk = ? AND vlan_id = ?");
    enum { kBranch };
    sameVlan.BindAll(trunk, vlanId);
    if (sameVlan.Step())
      throw HostCtlException("VLAN " + std::to_string(vlanId) + " of trunk " + trunk +
                             " is already used by branch " + sameVlan.Text(kBranch));
  }
  int64_t ord = 0;
  {
    Statement next =
        store.Prepare("SELECT coalesce(max(ord), -1) + 1 AS next_ord FROM pnic_attachment WHERE "
                      "trunk = ?");
    enum { kNextOrd };
    next.Bind(1, trunk);
    next.Step();
    ord = next.Int(kNextOrd);
  }
  store.Prepare("INSERT INTO pnic_attachment(branch, trunk, vlan_id, ord) VALUES(?, ?, ?, ?)")
      .BindAll(branch, trunk, vlanId, ord)
      .Run();
}

extern const Part kNicPart;
const Part kNicPart = {
    "nic",
    kNicSchema,
    {{"nics",
      {"info", "driverInfo", "pause", "stats", "sriov", "vfs", "attachments", "vlanStats",
       "vlanCounters"}},
     {"nics.vfs", {"id", "active", "pciAddress", "ownerWorldId", "stats"}},
     {"nics.attachments", {"branch", "vlanId"}},
     {"nics.vlanCounters", {"vlanId", "rxPackets", "txPackets"}}},
    ImportNic,
    ExportNic,
};

} // namespace Model
