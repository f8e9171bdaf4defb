//===- DVSwitchImpl.cpp - Distributed switches, their ports and LACP ------===//
#include "HostCtl/Lib.h"
#include "sim/SwitchingStore.h"

#include <nlohmann/json.hpp>

#include <cstring>
#include <map>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using namespace HostCtl::Network;
using Model::Statement;
using Model::Store;

namespace {

/// The identity and settings of a distributed switch.
struct DvsRow {
  std::string uuid;         ///< UUID.
  std::string displayName;  ///< Display name.
  uint32_t configuredPorts; ///< Configured ports.
  std::string cdp;          ///< CDP status text.
  int32_t beaconTimeout;    ///< Beacon timeout, -1 for none.
  bool branded;             ///< Branded by the maker.
  bool lacpOnDpu;           ///< LACP runs on the DPU.
};

DvsRow ReadDvs(Store& store, const PortsetData& data) {
  Statement row = store.Prepare("SELECT uuid, display_name, configured_ports, cdp, "
                                "beacon_timeout, branded, lacp_on_dpu FROM dvswitch "
                                "WHERE portset_id = ?");
  enum { kUuid, kDisplayName, kConfiguredPorts, kCdp, kBeaconTimeout, kBranded, kLacpOnDpu };
  row.Bind(1, data.id);
  if (!row.Step())
    throw HostCtlException("The distributed switch " + data.name + " no longer exists");
  return DvsRow{row.Text(kUuid),
                row.Text(kDisplayName),
                static_cast<uint32_t>(row.Int(kConfiguredPorts)),
                row.Text(kCdp),
                static_cast<int32_t>(row.Int(kBeaconTimeout)),
                row.Bool(kBranded),
                row.Bool(kLacpOnDpu)};
}

DvsRow LoadDvs(const char* operation, const PortsetData& data) {
  Store& store = Store::Host();
  store.CheckFault(operation, data.name);
  return store.Read([&] { return ReadDvs(store, data); });
}

/// Copies \p text into the fixed text field \p field, always NUL-terminated.
template <std::size_t N> void CopyText(char (&field)[N], const std::string& text) {
  std::size_t length = std::min(text.size(), N - 1);
  std::memcpy(field, text.data(), length);
  field[length] = '\0';
}

/// Flag letters of an LACP state: S or F for the timeout, A or P for the mode.
std::string FlagLetters(uint8_t state) {
  std::string flags = (state & 0x02) ? "F" : "S";
  flags += (state & 0x01) ? "A" : "P";
  return flags;
}

} // namespace

DVSwitchImpl::DVSwitchImpl(PortsetData data) : PortsetImpl(std::move(data)) {}
DVSwitchImpl::~DVSwitchImpl() = default;

std::string DVSwitchImpl::GetUuid() const {
  return LoadDvs("GetUuid", data_).uuid;
}
std::string DVSwitchImpl::GetDisplayName() const {
  return LoadDvs("GetDisplayName", data_).displayName;
}
std::string DVSwitchImpl::GetDvsName() const {
  return LoadDvs("GetDvsName", data_).displayName;
}
std::string DVSwitchImpl::GetDvsId() const {
  return LoadDvs("GetDvsId", data_).uuid;
}
uint32_t DVSwitchImpl::GetNumConfiguredPorts() const {
  return LoadDvs("GetNumConfiguredPorts", data_).configuredPorts;
}
std::string DVSwitchImpl::GetCdpStatusString() const {
  return LoadDvs("GetCdpStatusString", data_).cdp;
}
int32_t DVSwitchImpl::GetBeaconTimeout() const {
  return LoadDvs("GetBeaconTimeout", data_).beaconTimeout;
}
bool DVSwitchImpl::IsCorvexBranded() const {
  return LoadDvs("IsCorvexBranded", data_).branded;
}
bool DVSwitchImpl::IsLacpOnDpu() const {
  return LoadDvs("IsLacpOnDpu", data_).lacpOnDpu;
}

uint32_t DVSwitchImpl::GetMTU() const {
  Store& store = Store::Host();
  store.CheckFault("GetMTU", data_.name);
  return store.Read([&] {
    Statement row = store.Prepare("SELECT mtu FROM portset WHERE id = ?");
    enum { kMtu };
    row.Bind(1, data_.id);
    return row.Step() ? static_cast<uint32_t>(row.Int(kMtu)) : 0u;
  });
}

std::vector<std::unique_ptr<DVPort>> DVSwitchImpl::GetDVPorts() const {
  Store& store = Store::Host();
  store.CheckFault("GetDVPorts", data_.name);
  return store.Read([&] {
    std::string uuid = ReadDvs(store, data_).uuid;
    std::map<std::string, std::vector<std::string>> clients;
    Statement users = store.Prepare("SELECT dvport_key, client FROM port WHERE portset_id = ? "
                                    "AND dvport_key IS NOT NULL ORDER BY id");
    enum { kDvportKey, kClient };
    users.Bind(1, data_.id);
    while (users.Step())
      clients[users.Text(kDvportKey)].push_back(users.Text(kClient));
    std::vector<std::unique_ptr<DVPort>> ports;
    Statement rows =
        store.Prepare("SELECT d.port_key, d.connection_id, d.name, d.portgroup_key FROM dvport d "
                      "WHERE d.portset_id = ? ORDER BY d.ord");
    enum { kPortKey, kConnectionId, kName, kPortgroupKey };
    rows.Bind(1, data_.id);
    while (rows.Step()) {
      std::string key = rows.Text(kPortKey);
      auto used = clients.find(key);
      DVPortData port{rows.Text(kName), rows.Text(kPortgroupKey),
                      used == clients.end() ? std::vector<std::string>() : used->second};
      // Callers use a listed port as TvkCtl::Network::DVPortImpl.
      ports.push_back(std::make_unique<TvkCtl::Network::DVPortImpl>(std::make_unique<DVPortImpl>(
          DVPortParam{uuid, key, static_cast<uint32_t>(rows.Int(kConnectionId))},
          std::move(port))));
    }
    return ports;
  });
}

// --- LACP.

std::vector<LagConfig> DVSwitchImpl::GetLagConfigs() const {
  Store& store = Store::Host();
  store.CheckFault("GetLagConfigs", data_.name);
  return store.Read([&] {
    std::vector<LagConfig> configs;
    Statement rows = store.Prepare("SELECT lag_id, name, load_balancing, mode, uplink_count "
                                   "FROM lag WHERE portset_id = ? ORDER BY ord");
    enum { kLagId, kName, kLoadBalancing, kMode, kUplinkCount };
    rows.Bind(1, data_.id);
    while (rows.Step()) {
      LagConfig config;
      CopyText(config.lagId, std::to_string(rows.Int(kLagId)));
      CopyText(config.lagName, rows.Text(kName));
      config.loadBalancing = static_cast<uint32_t>(rows.Int(kLoadBalancing));
      config.mode = static_cast<uint32_t>(rows.Int(kMode));
      config.uplinkCount = static_cast<uint32_t>(rows.Int(kUplinkCount));
      configs.push_back(config);
    }
    return configs;
  });
}

std::map<std::string, DVPortParam> DVSwitchImpl::GetUplinkPortMap() const {
  Store& store = Store::Host();
  store.CheckFault("GetUplinkPortMap", data_.name);
  return store.Read([&] {
    std::string uuid = ReadDvs(store, data_).uuid;
    std::map<std::string, DVPortParam> map;
    Statement rows = store.Prepare(
        "SELECT p.client, d.port_key, d.connection_id FROM port p JOIN dvport d ON "
        "d.portset_id = p.portset_id AND d.port_key = p.dvport_key WHERE p.portset_id = ? AND "
        "p.client_kind = 'uplink'");
    enum { kClient, kPortKey, kConnectionId };
    rows.Bind(1, data_.id);
    while (rows.Step())
      map[rows.Text(kClient)] =
          DVPortParam{uuid, rows.Text(kPortKey), static_cast<uint32_t>(rows.Int(kConnectionId))};
    return map;
  });
}

std::vector<DVUplinkPortLacp> DVSwitchImpl::GetUplinkPortLacp() const {
  Store& store = Store::Host();
  store.CheckFault("GetUplinkPortLacp", data_.name);
  return store.Read([&] {
    std::vector<DVUplinkPortLacp> ports;
    Statement rows =
        store.Prepare("SELECT d.port_key, d.lacp_enabled, d.lacp_mode, "
                      "d.uplink_pg_key FROM dvport d WHERE d.portset_id = ? AND d.is_uplink = 1 "
                      "ORDER BY d.ord");
    enum { kPortKey, kLacpEnabled, kLacpMode, kUplinkPgKey };
    rows.Bind(1, data_.id);
    while (rows.Step())
      ports.push_back(DVUplinkPortLacp{rows.Text(kPortKey), rows.Bool(kLacpEnabled),
                                       static_cast<uint32_t>(rows.Int(kLacpMode)),
                                       rows.Text(kUplinkPgKey)});
    return ports;
  });
}

void DVSwitchImpl::GetLacpInfo(std::vector<LacpLagInfo>& lags) const {
  Store& store = Store::Host();
  store.CheckFault("GetLacpInfo", data_.name);
  store.Read([&] {
    Statement rows =
        store.Prepare("SELECT lag_id, name, mode, nics FROM lag WHERE portset_id = ? ORDER BY ord");
    enum { kLagId, kName, kMode, kNics };
    rows.Bind(1, data_.id);
    while (rows.Step()) {
      LacpLagInfo& lag = lags.emplace_back();
      lag.lagId = static_cast<uint32_t>(rows.Int(kLagId));
      lag.mode = static_cast<uint32_t>(rows.Int(kMode));
      CopyText(lag.lagName, rows.Text(kName));
      for (const nlohmann::json& entry : nlohmann::json::parse(rows.Text(kNics))) {
        auto nic = std::make_unique<LacpNicInfo>();
        std::memset(nic.get(), 0, sizeof(LacpNicInfo));
        CopyText(nic->nicName, entry.at("name").get<std::string>());
        CopyText(nic->state, entry.at("state").get<std::string>());
        nic->actorPortNumber = entry.at("actorPortNumber").get<uint16_t>();
        nic->actorPortPriority = entry.at("actorPortPriority").get<uint16_t>();
        nic->actorAdminKey = entry.at("actorAdminKey").get<uint16_t>();
        nic->actorOperKey = entry.at("actorOperKey").get<uint16_t>();
        nic->actorState = entry.at("actorState").get<uint8_t>();
        CopyText(nic->actorFlags, FlagLetters(nic->actorState));
        nic->partnerAge = entry.at("partnerAge").get<uint32_t>();
        nic->partnerPortNumber = entry.at("partnerPortNumber").get<uint16_t>();
        nic->partnerPortPriority = entry.at("partnerPortPriority").get<uint16_t>();
        nic->partnerOperKey = entry.at("partnerOperKey").get<uint16_t>();
        nic->partnerState = entry.at("partnerState").get<uint8_t>();
        CopyText(nic->partnerDeviceId, entry.at("partnerDeviceId").get<std::string>());
        CopyText(nic->partnerFlags, FlagLetters(nic->partnerState));
        nic->rxLacpdus = entry.at("rxLacpdus").get<uint64_t>();
        nic->txLacpdus = entry.at("txLacpdus").get<uint64_t>();
        nic->rxErrors = entry.at("rxErrors").get<uint64_t>();
        nic->txErrors = entry.at("txErrors").get<uint64_t>();
        lag.nics.push_back(std::move(nic));
      }
    }
  });
}

void DVSwitchImpl::SetLacpTimeout(uint32_t lagId, bool shortTimeout, const std::string& nicName) {
  Store& store = Store::Host();
  store.CheckFault("SetLacpTimeout", data_.name);
  store.Write([&] {
    std::string displayName = ReadDvs(store, data_).displayName;
    Statement lag = store.Prepare("SELECT nics FROM lag WHERE portset_id = ? AND lag_id = ?");
    enum { kNics };
    lag.BindAll(data_.id, static_cast<int64_t>(lagId));
    if (!lag.Step())
      throw HostCtlException("Unable to set the LACP timeout: " + displayName +
                             " has no LAG with ID " + std::to_string(lagId));
    // Bit 1 of the actor state is the short timeout.
    nlohmann::ordered_json nics = nlohmann::ordered_json::parse(lag.Text(kNics));
    bool found = false;
    for (nlohmann::ordered_json& nic : nics) {
      if (!nicName.empty() && nic.at("name") != nicName)
        continue;
      found = true;
      uint64_t state = nic.at("actorState").get<uint64_t>();
      nic["actorState"] = shortTimeout ? (state | 2u) : (state & ~uint64_t{2});
    }
    if (!nicName.empty() && !found)
      throw HostCtlException("Unable to set the LACP timeout: " + nicName +
                             " is not a NIC of LAG " + std::to_string(lagId) + " on " +
                             displayName);
    store.Prepare("UPDATE lag SET nics = ? WHERE portset_id = ? AND lag_id = ?")
        .BindAll(nics.dump(), data_.id, static_cast<int64_t>(lagId))
        .Run();
  });
}

// --- DVPortImpl.

DVPortImpl::DVPortImpl(DVPortParam param) : param_(std::move(param)) {}

DVPortImpl::DVPortImpl(std::string switchId, std::string dvPortId) {
  param_.switchUuid = std::move(switchId);
  param_.portId = std::move(dvPortId);
}

DVPortImpl::DVPortImpl(DVPortParam param, DVPortData data)
    : param_(std::move(param)), listed_(std::move(data)) {}

DVPortImpl::~DVPortImpl() = default;

namespace {

/// The switch and port row a distributed port names.
struct DVPortRow {
  PortsetData portset;      ///< Its switch.
  std::string portgroupKey; ///< Distributed port group key.
  uint32_t connectionId;    ///< Connection id kept by the host.
  std::string name;         ///< Port name.
};

std::optional<DVPortRow> FindDVPort(Store& store, const DVPortParam& param) {
  auto portset = FindPortsetByIdentifier(store, param.switchUuid);
  if (!portset)
    return std::nullopt;
  Statement row = store.Prepare("SELECT d.portgroup_key, d.connection_id, d.name FROM dvport d "
                                "WHERE d.portset_id = ? AND d.port_key = ?");
  enum { kPortgroupKey, kConnectionId, kName };
  row.BindAll(portset->id, param.portId);
  if (!row.Step())
    return std::nullopt;
  return DVPortRow{*portset, row.Text(kPortgroupKey), static_cast<uint32_t>(row.Int(kConnectionId)),
                   row.Text(kName)};
}

DVPortRow RequireDVPort(const char* operation, const DVPortParam& param) {
  Store& store = Store::Host();
  store.CheckFault(operation, param.portId);
  auto row = store.Read([&] { return FindDVPort(store, param); });
  if (!row)
    throw HostCtlException("The distributed switch " + param.switchUuid + " has no port " +
                           param.portId);
  return *row;
}

} // namespace

std::string DVPortImpl::GetPortsetName() const {
  Store& store = Store::Host();
  auto portset = store.Read([&] { return FindPortsetByIdentifier(store, param_.switchUuid); });
  return portset ? portset->name : std::string();
}

int DVPortImpl::GetType() const {
  return ConnectionPoint::CONNECTION_DVPORT;
}

std::string DVPortImpl::GetPortGroupName() const {
  return {};
}

DVPortParam DVPortImpl::GetDVPortParam() const {
  return param_;
}

OpaqueNetworkParam DVPortImpl::GetOpaqueNetworkParam() const {
  return {};
}

bool DVPortImpl::IsValid() const {
  Store& store = Store::Host();
  return store.Read([&] { return FindDVPort(store, param_).has_value(); });
}

std::string DVPortImpl::GetPortId() const {
  return param_.portId;
}

std::string DVPortImpl::GetName() const {
  if (listed_)
    return listed_->name;
  return RequireDVPort("GetName", param_).name;
}

std::string DVPortImpl::GetDVPortgroupId() const {
  if (listed_)
    return listed_->portgroupKey;
  return RequireDVPort("GetDVPortgroupId", param_).portgroupKey;
}

bool DVPortImpl::IsInUse(std::vector<std::string>& clients) const {
  if (listed_) {
    clients.insert(clients.end(), listed_->clients.begin(), listed_->clients.end());
    return !listed_->clients.empty();
  }
  DVPortRow port = RequireDVPort("IsInUse", param_);
  Store& store = Store::Host();
  return store.Read([&] {
    Statement rows = store.Prepare(
        "SELECT client FROM port WHERE portset_id = ? AND dvport_key = ? ORDER BY id");
    enum { kClient };
    rows.BindAll(port.portset.id, param_.portId);
    bool used = false;
    while (rows.Step()) {
      clients.push_back(rows.Text(kClient));
      used = true;
    }
    return used;
  });
}

uint32_t DVPortImpl::GetConnectionId() const {
  return RequireDVPort("GetConnectionId", param_).connectionId;
}

void DVPortImpl::SetConnectionId(uint32_t connectionId) {
  Store& store = Store::Host();
  store.CheckFault("SetConnectionId", param_.portId);
  store.Write([&] {
    auto port = FindDVPort(store, param_);
    if (!port)
      throw HostCtlException("The distributed switch " + param_.switchUuid + " has no port " +
                             param_.portId);
    store.Prepare("UPDATE dvport SET connection_id = ? WHERE portset_id = ? AND port_key = ?")
        .BindAll(connectionId, port->portset.id, param_.portId)
        .Run();
  });
  param_.connectionId = connectionId;
}

} // namespace Sim
