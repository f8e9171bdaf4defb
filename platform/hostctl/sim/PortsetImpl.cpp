//===- PortsetImpl.cpp - Switch identity, ports and the switch service ----===//
#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "model/Store.h"
#include "sim/NetworkInfoImpl.h"
#include "sim/SwitchingStore.h"

namespace Sim {

using HostCtl::Lib::HostCtlException;
using namespace HostCtl::Network;
using Model::Statement;
using Model::Store;

namespace {

PortsetKind KindOf(const std::string& text) {
  if (text == "dvs")
    return PortsetKind::Distributed;
  if (text == "opaque")
    return PortsetKind::Opaque;
  return PortsetKind::Standard;
}

/// The columns ReadPortset reads: "SELECT id, name, kind, system FROM portset".
enum PortsetColumn { kRowPortsetId, kRowPortsetName, kRowPortsetKind, kRowPortsetSystem };

/// The next row of a statement that selects the PortsetColumn columns.
std::optional<PortsetData> ReadPortset(Statement& row) {
  if (!row.Step())
    return std::nullopt;
  PortsetData data;
  data.id = row.Int(kRowPortsetId);
  data.name = row.Text(kRowPortsetName);
  data.kind = KindOf(row.Text(kRowPortsetKind));
  data.system = row.Bool(kRowPortsetSystem);
  return data;
}

/// Switches of \p kind ("standard", "dvs", "opaque"); \p system -1 for both.
std::vector<PortsetData> ListPortsets(Store& store, const char* kind, int system) {
  std::vector<PortsetData> list;
  Statement rows = store.Prepare("SELECT id, name, kind, system FROM portset WHERE kind = ? AND "
                                 "(? < 0 OR system = ?) ORDER BY ord");
  rows.BindAll(kind, system, system);
  while (auto data = ReadPortset(rows))
    list.push_back(std::move(*data));
  return list;
}

} // namespace

std::optional<PortsetData> FindPortset(Store& store, const std::string& name) {
  Statement row = store.Prepare("SELECT id, name, kind, system FROM portset WHERE name = ?");
  row.Bind(1, name);
  return ReadPortset(row);
}

std::optional<PortsetData> FindPortsetById(Store& store, int64_t id) {
  Statement row = store.Prepare("SELECT id, name, kind, system FROM portset WHERE id = ?");
  row.Bind(1, id);
  return ReadPortset(row);
}

std::optional<PortsetData> FindPortsetByIdentifier(Store& store, const std::string& id) {
  Statement row = store.Prepare("SELECT p.id, p.name, p.kind, p.system FROM portset p "
                                "JOIN dvswitch d ON d.portset_id = p.id WHERE d.uuid = ?");
  row.Bind(1, id);
  if (auto data = ReadPortset(row))
    return data;
  auto data = FindPortset(store, id);
  if (data && data->kind != PortsetKind::Standard)
    return std::nullopt;
  return data;
}

std::unique_ptr<Portset> MakePortset(PortsetData data) {
  if (data.kind == PortsetKind::Standard)
    return std::make_unique<VirtualSwitchImpl>(std::move(data));
  return std::make_unique<DVSwitchImpl>(std::move(data));
}

void RequirePortset(Store& store, const PortsetData& data) {
  Statement row = store.Prepare("SELECT 1 FROM portset WHERE id = ?");
  row.Bind(1, data.id);
  if (!row.Step())
    throw HostCtlException("The virtual switch " + data.name + " no longer exists");
}

// --- PortsetImpl.

PortsetImpl::PortsetImpl(PortsetData data) : data_(std::move(data)) {}
PortsetImpl::~PortsetImpl() = default;

bool PortsetImpl::IsValidVirtualSwitch(const std::string& name) {
  Store& store = Store::Host();
  store.CheckFault("IsValidVirtualSwitch", name);
  return store.Read([&] { return FindPortset(store, name).has_value(); });
}

std::string PortsetImpl::GetIdentifier() const {
  if (data_.kind == PortsetKind::Standard)
    return data_.name;
  Store& store = Store::Host();
  return store.Read([&] {
    Statement row = store.Prepare("SELECT uuid FROM dvswitch WHERE portset_id = ?");
    enum { kUuid };
    row.Bind(1, data_.id);
    return row.Step() ? row.Text(kUuid) : data_.name;
  });
}

std::string PortsetImpl::GetName() const {
  return data_.name;
}

std::string PortsetImpl::GetClassName() const {
  if (data_.kind == PortsetKind::Standard)
    return "corvex-vswitch";
  Store& store = Store::Host();
  return store.Read([&] {
    Statement row = store.Prepare("SELECT class_name FROM dvswitch WHERE portset_id = ?");
    enum { kClassName };
    row.Bind(1, data_.id);
    return row.Step() ? row.Text(kClassName) : std::string("corvex-dvs");
  });
}

uint32_t PortsetImpl::GetNumPorts() const {
  Store& store = Store::Host();
  store.CheckFault("GetNumPorts", data_.name);
  return store.Read([&] {
    Statement row = store.Prepare("SELECT num_ports FROM portset WHERE id = ?");
    enum { kNumPorts };
    row.Bind(1, data_.id);
    return row.Step() ? static_cast<uint32_t>(row.Int(kNumPorts)) : 0u;
  });
}

uint32_t PortsetImpl::GetConfiguredPorts() const {
  if (data_.kind != PortsetKind::Standard)
    return dynamic_cast<const DVSwitch&>(*this).GetNumConfiguredPorts();
  return GetNumPorts();
}

uint32_t PortsetImpl::GetUsedPorts() const {
  Store& store = Store::Host();
  store.CheckFault("GetUsedPorts", data_.name);
  return store.Read([&] {
    Statement row = store.Prepare("SELECT count(*) FROM port WHERE portset_id = ?");
    enum { kCount };
    row.Bind(1, data_.id);
    row.Step();
    return static_cast<uint32_t>(row.Int(kCount));
  });
}

std::vector<std::string> PortsetImpl::GetUplinks() const {
  Store& store = Store::Host();
  store.CheckFault("GetUplinks", data_.name);
  return store.Read([&] {
    std::vector<std::string> names;
    Statement rows = store.Prepare("SELECT nic FROM uplink WHERE portset_id = ? ORDER BY ord");
    enum { kNic };
    rows.Bind(1, data_.id);
    while (rows.Step())
      names.push_back(rows.Text(kNic));
    return names;
  });
}

std::vector<std::unique_ptr<Port>> PortsetImpl::GetPorts() const {
  Store& store = Store::Host();
  store.CheckFault("GetPorts", data_.name);
  return store.Read([&] {
    std::vector<std::unique_ptr<Port>> ports;
    Statement rows = store.Prepare(
        "SELECT p.id, p.portset_id, coalesce(g.name, ''), coalesce(p.dvport_key, ''), "
        "p.client_kind, p.client, p.world_id, p.port_type FROM port p "
        "LEFT JOIN portgroup g ON g.id = p.portgroup_id WHERE p.portset_id = ? ORDER BY p.id");
    enum { kId, kPortsetId, kName, kDvportKey, kClientKind, kClient, kWorldId, kPortType };
    rows.Bind(1, data_.id);
    while (rows.Step()) {
      PortData port;
      port.id = rows.Int(kId);
      port.portsetId = rows.Int(kPortsetId);
      port.portGroup = rows.Text(kName);
      port.dvPortId = rows.Text(kDvportKey);
      port.clientKind = rows.Text(kClientKind);
      port.client = rows.Text(kClient);
      port.worldId = rows.Int(kWorldId);
      port.type = static_cast<int>(rows.Int(kPortType));
      ports.push_back(std::make_unique<PortImpl>(std::move(port)));
    }
    return ports;
  });
}

// --- PortImpl.

PortImpl::PortImpl(PortData data) : data_(std::move(data)) {}
PortImpl::~PortImpl() = default;

int64_t PortImpl::GetId() const {
  return data_.id;
}
int64_t PortImpl::GetWorldLeader() const {
  return data_.worldId;
}
std::string PortImpl::GetPortGroupName() const {
  return data_.portGroup;
}
std::string PortImpl::GetDVPortID() const {
  return data_.dvPortId;
}
int PortImpl::GetType() const {
  return data_.type;
}

// --- VirtualSwitchInfoImpl: listing and lookup.

VirtualSwitchInfoImpl::VirtualSwitchInfoImpl() = default;
VirtualSwitchInfoImpl::~VirtualSwitchInfoImpl() = default;

std::vector<std::unique_ptr<Portset>> VirtualSwitchInfoImpl::GetAllSwitches() {
  Store& store = Store::Host();
  store.CheckFault("GetAllSwitches", "*");
  std::vector<std::unique_ptr<Portset>> switches;
  store.Read([&] {
    for (const char* kind : {"standard", "dvs", "opaque"})
      for (PortsetData& data : ListPortsets(store, kind, -1))
        switches.push_back(MakePortset(std::move(data)));
  });
  return switches;
}

std::vector<std::unique_ptr<VirtualSwitch>>
VirtualSwitchInfoImpl::GetVirtualSwitches(PortsetGetType type) {
  Store& store = Store::Host();
  store.CheckFault("GetVirtualSwitches", "*");
  std::vector<std::unique_ptr<VirtualSwitch>> switches;
  store.Read([&] {
    for (PortsetData& data : ListPortsets(store, "standard", type == PortsetGetSystem ? 1 : 0))
      switches.push_back(std::make_unique<VirtualSwitchImpl>(std::move(data)));
  });
  return switches;
}

std::unique_ptr<VirtualSwitch>
VirtualSwitchInfoImpl::GetVirtualSwitchByName(const std::string& name, PortsetGetType type) {
  Store& store = Store::Host();
  store.CheckFault("GetVirtualSwitchByName", name);
  auto data = store.Read([&] { return FindPortset(store, name); });
  if (!data || data->kind != PortsetKind::Standard || data->system != (type == PortsetGetSystem))
    return nullptr;
  return std::make_unique<VirtualSwitchImpl>(std::move(*data));
}

namespace {
std::vector<std::unique_ptr<DVSwitch>> ListDistributed(const char* operation, const char* kind) {
  Store& store = Store::Host();
  store.CheckFault(operation, "*");
  std::vector<std::unique_ptr<DVSwitch>> switches;
  store.Read([&] {
    for (PortsetData& data : ListPortsets(store, kind, -1))
      switches.push_back(std::make_unique<DVSwitchImpl>(std::move(data)));
  });
  return switches;
}

std::unique_ptr<DVSwitch> FindDistributed(const char* operation, const std::string& name) {
  Store& store = Store::Host();
  store.CheckFault(operation, name);
  auto data = store.Read([&]() -> std::optional<PortsetData> {
    auto found = FindPortset(store, name);
    if (found && found->kind != PortsetKind::Standard)
      return found;
    Statement row = store.Prepare("SELECT p.id, p.name, p.kind, p.system FROM portset p JOIN "
                                  "dvswitch d ON d.portset_id = p.id WHERE d.display_name = ? "
                                  "ORDER BY p.ord LIMIT 1");
    row.Bind(1, name);
    return ReadPortset(row);
  });
  if (!data)
    return nullptr;
  return std::make_unique<DVSwitchImpl>(std::move(*data));
}

bool IsKind(const char* operation, const std::string& name, PortsetKind kind) {
  Store& store = Store::Host();
  store.CheckFault(operation, name);
  auto data = store.Read([&] { return FindPortset(store, name); });
  return data && data->kind == kind;
}
} // namespace

std::vector<std::unique_ptr<DVSwitch>> VirtualSwitchInfoImpl::GetDVSwitches() {
  return ListDistributed("GetDVSwitches", "dvs");
}

std::vector<std::unique_ptr<DVSwitch>> VirtualSwitchInfoImpl::GetOpaqueDVSwitches() {
  return ListDistributed("GetOpaqueDVSwitches", "opaque");
}

std::unique_ptr<DVSwitch> VirtualSwitchInfoImpl::GetDVSwitchByName(const std::string& name) {
  return FindDistributed("GetDVSwitchByName", name);
}

bool VirtualSwitchInfoImpl::IsLegacySwitch(const std::string& name) {
  return IsKind("IsLegacySwitch", name, PortsetKind::Standard);
}

bool VirtualSwitchInfoImpl::IsDVSwitch(const std::string& name) {
  return IsKind("IsDVSwitch", name, PortsetKind::Distributed);
}

bool VirtualSwitchInfoImpl::IsOpaqueSwitch(const std::string& name) {
  return IsKind("IsOpaqueSwitch", name, PortsetKind::Opaque);
}

// --- Lookups of the network root and factory.

std::vector<std::unique_ptr<PortGroup>> NetworkInfoImpl::GetAllPortGroups(PortsetGetType type) {
  Store& store = Store::Host();
  store.CheckFault("GetAllPortGroups", "*");
  std::vector<std::unique_ptr<PortGroup>> groups;
  store.Read([&] {
    Statement rows = store.Prepare(
        "SELECT g.name, p.name, g.vlan_id, (SELECT count(*) FROM port WHERE portgroup_id = g.id "
        "AND client_kind IN ('tvknic', 'vm')) AS clients FROM portgroup g JOIN portset p ON p.id "
        "= g.portset_id WHERE g.system = ? ORDER BY p.ord, g.ord");
    enum { kGroupName, kSwitchName, kVlanId, kClients };
    rows.Bind(1, type == PortsetGetSystem ? 1 : 0);
    while (rows.Step())
      groups.push_back(std::make_unique<PortGroupImpl>(PortGroupData{
          rows.Text(kGroupName), rows.Text(kSwitchName), static_cast<uint16_t>(rows.Int(kVlanId)),
          static_cast<uint32_t>(rows.Int(kClients))}));
  });
  return groups;
}

// --- Lookups of the network factory.

std::unique_ptr<DVSwitch> GetDVSwitchByName(const std::string& name) {
  return FindDistributed("GetDVSwitchByName", name);
}

std::unique_ptr<VirtualSwitch> GetVirtualSwitchById(const std::string& name, PortsetGetType type) {
  Model::Store& store = Model::Store::Host();
  store.CheckFault("GetVirtualSwitchById", name);
  auto data = store.Read([&] { return FindPortset(store, name); });
  if (!data || data->kind != PortsetKind::Standard || data->system != (type == PortsetGetSystem))
    return nullptr;
  return std::make_unique<VirtualSwitchImpl>(std::move(*data));
}

std::unique_ptr<PortGroup> GetPortGroupByName(const std::string& name) {
  Model::Store& store = Model::Store::Host();
  store.CheckFault("GetPortGroupByName", name);
  bool found = store.Read([&] {
    Model::Statement row = store.Prepare("SELECT 1 FROM portgroup WHERE name = ?");
    row.Bind(1, name);
    return row.Step();
  });
  if (!found)
    return nullptr;
  return std::make_unique<PortGroupImpl>(name);
}

std::unique_ptr<DVPort> GetDVPort(const DVPortParam& param) {
  auto port = std::make_unique<DVPortImpl>(param);
  if (!port->IsValid())
    return nullptr;
  return std::make_unique<TvkCtl::Network::DVPortImpl>(std::move(port));
}

} // namespace Sim
