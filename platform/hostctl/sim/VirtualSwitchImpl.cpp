//===- VirtualSwitchImpl.cpp - Standard switches of the host --------------===//
//
// Standard switches: settings, uplinks, port groups and policies, and their
// creation and removal through the switch service. The host refuses what a
// real one refuses: unknown or claimed uplinks, port counts beyond its
// limits, duplicate names, and removing what is still in use.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "model/CoreModel.h"
#include "model/SwitchingModel.h"
#include "sim/SwitchingStore.h"

#include <algorithm>
#include <set>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using namespace HostCtl::Network;
using Model::Statement;
using Model::Store;

namespace {

/// The one column that \p sql selects of switch \p id, as text.
std::string ReadColumn(Store& store, int64_t id, const char* sql) {
  Statement row = store.Prepare(sql);
  enum { kValue };
  row.Bind(1, id);
  if (!row.Step())
    throw HostCtlException("The virtual switch no longer exists");
  return row.Text(kValue);
}

/// The one column that \p sql selects of switch \p id, as a number.
int64_t ReadInt(Store& store, int64_t id, const char* sql) {
  Statement row = store.Prepare(sql);
  enum { kValue };
  row.Bind(1, id);
  if (!row.Step())
    throw HostCtlException("The virtual switch no longer exists");
  return row.Int(kValue);
}

std::vector<std::string> Uplinks(Store& store, int64_t id) {
  std::vector<std::string> names;
  Statement rows = store.Prepare("SELECT nic FROM uplink WHERE portset_id = ? ORDER BY ord");
  enum { kNic };
  rows.Bind(1, id);
  while (rows.Step())
    names.push_back(rows.Text(kNic));
  return names;
}

/// Refuses an uplink order that names something other than the uplinks of
/// the switch, or one uplink twice.
void CheckTeamOrder(const NicTeamingPolicy& policy, const std::vector<std::string>& uplinks,
                    const std::string& owner) {
  if (!policy.IsSet(NicTeamingPolicy::MASK_UPLINK_ORDER))
    return;
  std::set<std::string> seen;
  for (const std::string& name : policy.GetUplinkOrder()) {
    if (std::find(uplinks.begin(), uplinks.end(), name) == uplinks.end())
      throw HostCtlException("Unable to set the teaming policy of " + owner + ": " + name +
                             " is not an uplink of its virtual switch");
    if (!seen.insert(name).second)
      throw HostCtlException("Unable to set the teaming policy of " + owner + ": " + name +
                             " appears more than once");
  }
  if (policy.GetMaxActiveUplinks() < 0)
    throw HostCtlException("Unable to set the teaming policy of " + owner +
                           ": the number of active uplinks is negative");
}

/// Takes uplink \p nic out of a teaming order; true when the order changed.
bool DropFromOrder(NicTeamingPolicy& policy, const std::string& nic) {
  if (!policy.IsSet(NicTeamingPolicy::MASK_UPLINK_ORDER))
    return false;
  std::vector<std::string> order = policy.GetUplinkOrder();
  auto it = std::find(order.begin(), order.end(), nic);
  if (it == order.end())
    return false;
  int32_t active = policy.GetMaxActiveUplinks();
  if (it - order.begin() < active)
    --active;
  order.erase(it);
  policy.SetUplinkOrder(std::move(order));
  policy.SetMaxActiveUplinks(active);
  return true;
}

std::string Dump(const nlohmann::ordered_json& json) {
  return json.dump();
}

} // namespace

// --- Policies of a standard switch, for the port groups too.

NicTeamingPolicy SwitchConfiguredTeaming(Store& store, int64_t portsetId) {
  return Model::ParseTeaming(
      ReadColumn(store, portsetId, "SELECT teaming FROM vswitch WHERE portset_id = ?"));
}

NicTeamingPolicy SwitchTeaming(Store& store, int64_t portsetId) {
  NicTeamingPolicy policy = SwitchConfiguredTeaming(store, portsetId);
  if (!policy.IsSet(NicTeamingPolicy::MASK_UPLINK_ORDER)) {
    std::vector<std::string> uplinks = Uplinks(store, portsetId);
    auto count = static_cast<int32_t>(uplinks.size());
    policy.SetUplinkOrder(std::move(uplinks));
    policy.SetMaxActiveUplinks(count);
  }
  return policy;
}

PortSecurityPolicy SwitchSecurity(Store& store, int64_t portsetId) {
  return Model::ParseSecurity(
      ReadColumn(store, portsetId, "SELECT security FROM vswitch WHERE portset_id = ?"));
}

ShapingPolicy SwitchShaping(Store& store, int64_t portsetId) {
  return Model::ParseShaping(
      ReadColumn(store, portsetId, "SELECT shaping FROM vswitch WHERE portset_id = ?"));
}

/// Refuses a shaping policy in force that is enabled without all its rates,
/// or whose peak is below its average.
void CheckShapingInForce(const ShapingPolicy& policy, const std::string& owner) {
  if (!policy.IsEnabled())
    return;
  if (!policy.IsSet(ShapingPolicy::MASK_AVERAGE) || !policy.IsSet(ShapingPolicy::MASK_PEAK) ||
      !policy.IsSet(ShapingPolicy::MASK_BURST))
    throw HostCtlException("Unable to enable traffic shaping on " + owner +
                           ": the average bandwidth, peak bandwidth and burst size must be set");
  if (policy.GetPeakBps() < policy.GetAverageBps())
    throw HostCtlException("Unable to set the shaping policy of " + owner +
                           ": the peak bandwidth must not be lower than the average bandwidth");
}

// --- VirtualSwitchImpl.

VirtualSwitchImpl::VirtualSwitchImpl(PortsetData data) : PortsetImpl(std::move(data)) {}
VirtualSwitchImpl::~VirtualSwitchImpl() = default;

uint32_t VirtualSwitchImpl::GetMtu() const {
  Store& store = Store::Host();
  store.CheckFault("GetMtu", data_.name);
  return store.Read([&] {
    return static_cast<uint32_t>(ReadInt(store, data_.id, "SELECT mtu FROM portset WHERE id = ?"));
  });
}

void VirtualSwitchImpl::SetMtu(uint32_t mtu) {
  Store& store = Store::Host();
  store.CheckFault("SetMtu", data_.name);
  if (mtu < MIN_MTU || mtu > MAX_MTU)
    throw HostCtlException("Unable to set the MTU of " + data_.name + " to " + std::to_string(mtu) +
                           ": the MTU must be between " + std::to_string(MIN_MTU) + " and " +
                           std::to_string(MAX_MTU));
  store.Write([&] {
    RequirePortset(store, data_);
    store.Prepare("UPDATE portset SET mtu = ? WHERE id = ?").BindAll(mtu, data_.id).Run();
  });
}

uint32_t VirtualSwitchImpl::GetCdpStatus() const {
  Store& store = Store::Host();
  store.CheckFault("GetCdpStatus", data_.name);
  return store.Read([&] {
    return static_cast<uint32_t>(
        ReadInt(store, data_.id, "SELECT cdp FROM vswitch WHERE portset_id = ?"));
  });
}

void VirtualSwitchImpl::SetCdpStatus(uint32_t status) {
  Store& store = Store::Host();
  store.CheckFault("SetCdpStatus", data_.name);
  if (status > 3)
    throw HostCtlException("Unable to set the CDP status of " + data_.name + ": " +
                           std::to_string(status) + " is not a CDP status");
  store.Write([&] {
    RequirePortset(store, data_);
    store.Prepare("UPDATE vswitch SET cdp = ? WHERE portset_id = ?")
        .BindAll(status, data_.id)
        .Run();
  });
}

std::vector<std::string> VirtualSwitchImpl::GetBeaconRequiredBy() const {
  Store& store = Store::Host();
  store.CheckFault("GetBeaconRequiredBy", data_.name);
  return store.Read([&] {
    std::vector<std::string> names;
    NicTeamingPolicy own = SwitchTeaming(store, data_.id);
    if (own.GetLinkCriteria().IsBeacon())
      names.push_back(data_.name);
    Statement rows = store.Prepare(
        "SELECT g.name, p.teaming FROM portgroup g JOIN portgroup_policy p ON p.portgroup_id = "
        "g.id WHERE g.portset_id = ? ORDER BY g.ord");
    enum { kName, kTeaming };
    rows.Bind(1, data_.id);
    while (rows.Step())
      if (Model::ParseTeaming(rows.Text(kTeaming)).MergedOver(own).GetLinkCriteria().IsBeacon())
        names.push_back(rows.Text(kName));
    return names;
  });
}

bool VirtualSwitchImpl::IsBeaconEnabled() const {
  return !GetBeaconRequiredBy().empty();
}

uint32_t VirtualSwitchImpl::GetBeaconInterval() const {
  Store& store = Store::Host();
  store.CheckFault("GetBeaconInterval", data_.name);
  return store.Read([&] {
    return static_cast<uint32_t>(
        ReadInt(store, data_.id, "SELECT beacon_interval FROM vswitch WHERE portset_id = ?"));
  });
}

uint32_t VirtualSwitchImpl::GetBeaconThreshold() const {
  Store& store = Store::Host();
  store.CheckFault("GetBeaconThreshold", data_.name);
  return store.Read([&] {
    return static_cast<uint32_t>(
        ReadInt(store, data_.id, "SELECT beacon_threshold FROM vswitch WHERE portset_id = ?"));
  });
}

std::vector<std::unique_ptr<PortGroup>> VirtualSwitchImpl::GetPortGroups() const {
  Store& store = Store::Host();
  store.CheckFault("GetPortGroups", data_.name);
  return store.Read([&] {
    std::vector<std::unique_ptr<PortGroup>> groups;
    Statement rows = store.Prepare("SELECT name FROM portgroup WHERE portset_id = ? ORDER BY ord");
    enum { kName };
    rows.Bind(1, data_.id);
    while (rows.Step())
      groups.push_back(std::make_unique<PortGroupImpl>(rows.Text(kName)));
    return groups;
  });
}

void VirtualSwitchImpl::AddUplink(const std::string& name, bool /*teamAdd*/) {
  Store& store = Store::Host();
  store.CheckFault("AddUplink", data_.name);
  store.Write([&] {
    RequirePortset(store, data_);
    Statement nic = store.Prepare("SELECT 1 FROM pnic WHERE name = ?");
    nic.Bind(1, name);
    if (!nic.Step())
      throw HostCtlException("Unable to add uplink " + name + " to " + data_.name +
                             ": the host has no physical NIC of that name");
    Statement owner = store.Prepare(
        "SELECT p.name FROM uplink u JOIN portset p ON p.id = u.portset_id WHERE u.nic = ?");
    enum { kName };
    owner.Bind(1, name);
    if (owner.Step())
      throw HostCtlException("Unable to add uplink " + name + " to " + data_.name +
                             ": it is already an uplink of " + owner.Text(kName));
    Statement ports = store.Prepare(
        "SELECT (SELECT count(*) FROM port WHERE portset_id = ?1) AS used, num_ports FROM "
        "portset WHERE id = ?1");
    enum { kUsed, kNumPorts };
    ports.Bind(1, data_.id);
    ports.Step();
    if (ports.Int(kUsed) >= ports.Int(kNumPorts))
      throw HostCtlException("Unable to add uplink " + name + " to " + data_.name +
                             ": all of its ports are in use");
    store
        .Prepare("INSERT INTO uplink(portset_id, nic, ord) VALUES(?1, ?2, (SELECT "
                 "coalesce(max(ord), -1) + 1 FROM uplink WHERE portset_id = ?1))")
        .BindAll(data_.id, name)
        .Run();
    store
        .Prepare("INSERT INTO port(id, portset_id, client_kind, client) "
                 "VALUES(?, ?, 'uplink', ?)")
        .BindAll(Model::AllocatePortId(store), data_.id, name)
        .Run();
  });
}

void VirtualSwitchImpl::RemoveUplink(const std::string& name, bool /*force*/) {
  Store& store = Store::Host();
  store.CheckFault("RemoveUplink", data_.name);
  store.Write([&] {
    RequirePortset(store, data_);
    store.Prepare("DELETE FROM uplink WHERE portset_id = ? AND nic = ?")
        .BindAll(data_.id, name)
        .Run();
    if (store.Changes() == 0)
      throw HostCtlException("Unable to remove uplink " + name + " from " + data_.name +
                             ": it is not an uplink of this virtual switch");
    store.Prepare("DELETE FROM port WHERE portset_id = ? AND client_kind = 'uplink' AND client = ?")
        .BindAll(data_.id, name)
        .Run();
    NicTeamingPolicy own = SwitchConfiguredTeaming(store, data_.id);
    if (DropFromOrder(own, name))
      store.Prepare("UPDATE vswitch SET teaming = ? WHERE portset_id = ?")
          .BindAll(Dump(Model::TeamingToJson(own)), data_.id)
          .Run();
    std::vector<std::pair<int64_t, NicTeamingPolicy>> changed;
    Statement rows = store.Prepare(
        "SELECT g.id, p.teaming FROM portgroup g JOIN portgroup_policy p ON p.portgroup_id = "
        "g.id WHERE g.portset_id = ?");
    enum { kId, kTeaming };
    rows.Bind(1, data_.id);
    while (rows.Step()) {
      NicTeamingPolicy policy = Model::ParseTeaming(rows.Text(kTeaming));
      if (DropFromOrder(policy, name))
        changed.emplace_back(rows.Int(kId), std::move(policy));
    }
    for (const auto& [id, policy] : changed)
      store.Prepare("UPDATE portgroup_policy SET teaming = ? WHERE portgroup_id = ?")
          .BindAll(Dump(Model::TeamingToJson(policy)), id)
          .Run();
  });
}

std::unique_ptr<PortGroup> VirtualSwitchImpl::AddPortGroup(const std::string& name) {
  Store& store = Store::Host();
  store.CheckFault("AddPortGroup", data_.name);
  if (name.empty())
    throw HostCtlException("Unable to add a port group to " + data_.name +
                           ": the port group name is empty");
  if (name.size() > 127)
    throw HostCtlException("Unable to add a port group to " + data_.name +
                           ": the port group name is longer than 127 bytes");
  store.Write([&] {
    RequirePortset(store, data_);
    Statement owner = store.Prepare(
        "SELECT p.name FROM portgroup g JOIN portset p ON p.id = g.portset_id WHERE g.name = ?");
    enum { kName };
    owner.Bind(1, name);
    if (owner.Step())
      throw HostCtlException("Unable to add port group " + name + " to " + data_.name +
                             ": a port group of that name already exists on " + owner.Text(kName));
    store
        .Prepare("INSERT INTO portgroup(name, portset_id, vlan_id, system, ord) VALUES(?1, ?2, 0, "
                 "0, (SELECT coalesce(max(ord), -1) + 1 FROM portgroup))")
        .BindAll(name, data_.id)
        .Run();
    store.Prepare("INSERT INTO portgroup_policy(portgroup_id) VALUES(?)")
        .Bind(1, store.LastInsertId())
        .Run();
  });
  return std::make_unique<PortGroupImpl>(name);
}

void VirtualSwitchImpl::RemovePortGroup(const std::string& name) {
  Store& store = Store::Host();
  store.CheckFault("RemovePortGroup", data_.name);
  store.Write([&] {
    RequirePortset(store, data_);
    Statement row = store.Prepare(
        "SELECT id, (SELECT count(*) FROM port WHERE portgroup_id = portgroup.id) AS clients "
        "FROM portgroup WHERE name = ? AND portset_id = ?");
    enum { kId, kClients };
    row.BindAll(name, data_.id);
    if (!row.Step())
      throw HostCtlException("Unable to remove port group " + name + ": " + data_.name +
                             " has no port group of that name");
    int64_t id = row.Int(kId);
    int64_t clients = row.Int(kClients);
    if (clients > 0)
      throw HostCtlException("Unable to remove port group " + name + ": it is in use by " +
                             std::to_string(clients) + (clients == 1 ? " client" : " clients"));
    store.Prepare("DELETE FROM portgroup WHERE id = ?").Bind(1, id).Run();
  });
}

NicTeamingPolicy VirtualSwitchImpl::GetNicTeamingPolicy() const {
  Store& store = Store::Host();
  store.CheckFault("GetNicTeamingPolicy", data_.name);
  return store.Read([&] { return SwitchTeaming(store, data_.id); });
}

NicTeamingPolicy VirtualSwitchImpl::GetConfiguredNicTeamingPolicy() const {
  Store& store = Store::Host();
  store.CheckFault("GetConfiguredNicTeamingPolicy", data_.name);
  return store.Read([&] { return SwitchConfiguredTeaming(store, data_.id); });
}

void VirtualSwitchImpl::SetNicTeamingPolicy(const NicTeamingPolicy& policy) {
  Store& store = Store::Host();
  store.CheckFault("SetNicTeamingPolicy", data_.name);
  store.Write([&] {
    RequirePortset(store, data_);
    CheckTeamOrder(policy, Uplinks(store, data_.id), data_.name);
    NicTeamingPolicy stored = policy.MergedOver(NicTeamingPolicy::GetDefaultPolicy());
    if (!policy.IsSet(NicTeamingPolicy::MASK_UPLINK_ORDER))
      stored.SetSetMask(stored.GetSetMask() & ~NicTeamingPolicy::MASK_UPLINK_ORDER);
    store.Prepare("UPDATE vswitch SET teaming = ? WHERE portset_id = ?")
        .BindAll(Dump(Model::TeamingToJson(stored)), data_.id)
        .Run();
  });
}

PortSecurityPolicy VirtualSwitchImpl::GetPortSecurityPolicy() const {
  Store& store = Store::Host();
  store.CheckFault("GetPortSecurityPolicy", data_.name);
  return store.Read([&] { return SwitchSecurity(store, data_.id); });
}

void VirtualSwitchImpl::SetPortSecurityPolicy(const PortSecurityPolicy& policy) {
  Store& store = Store::Host();
  store.CheckFault("SetPortSecurityPolicy", data_.name);
  store.Write([&] {
    RequirePortset(store, data_);
    PortSecurityPolicy stored = policy.MergedOver(SwitchSecurity(store, data_.id));
    store.Prepare("UPDATE vswitch SET security = ? WHERE portset_id = ?")
        .BindAll(Dump(Model::SecurityToJson(stored)), data_.id)
        .Run();
  });
}

ShapingPolicy VirtualSwitchImpl::GetTrafficShapingPolicy() const {
  Store& store = Store::Host();
  store.CheckFault("GetTrafficShapingPolicy", data_.name);
  return store.Read([&] { return SwitchShaping(store, data_.id); });
}

void VirtualSwitchImpl::SetTrafficShapingPolicy(const ShapingPolicy& policy) {
  Store& store = Store::Host();
  store.CheckFault("SetTrafficShapingPolicy", data_.name);
  store.Write([&] {
    RequirePortset(store, data_);
    ShapingPolicy stored = policy.MergedOver(SwitchShaping(store, data_.id));
    CheckShapingInForce(stored, data_.name);
    store.Prepare("UPDATE vswitch SET shaping = ? WHERE portset_id = ?")
        .BindAll(Dump(Model::ShapingToJson(stored)), data_.id)
        .Run();
  });
}

NicCapabilities VirtualSwitchImpl::GetNicCapabilities() const {
  Store& store = Store::Host();
  store.CheckFault("GetNicCapabilities", data_.name);
  return store.Read([&] {
    nlohmann::ordered_json json = nlohmann::ordered_json::parse(
        ReadColumn(store, data_.id, "SELECT capabilities FROM vswitch WHERE portset_id = ?"),
        nullptr, false);
    if (!json.is_object())
      return NicCapabilities::GetDefaultPolicy();
    return Model::CapabilitiesFromJson(Model::JsonObject(json, "capabilities"));
  });
}

// --- Creation and removal of standard switches.

std::unique_ptr<VirtualSwitch> VirtualSwitchInfoImpl::AddVirtualSwitchWithPolicy(
    const NicTeamingPolicy& teaming, const PortSecurityPolicy& security,
    const ShapingPolicy& shaping, const NicCapabilities& capabilities, const std::string& name,
    uint32_t ports) {
  Store& store = Store::Host();
  store.CheckFault("AddVirtualSwitchWithPolicy", name);
  if (name.empty())
    throw HostCtlException("Unable to add a virtual switch: the name is empty");
  if (name.size() > 127)
    throw HostCtlException("Unable to add virtual switch " + name +
                           ": the name is longer than 127 bytes");
  if (ports < 1 || ports > VirtualSwitch::MAX_PORTS)
    throw HostCtlException("Unable to add virtual switch " + name + " with " +
                           std::to_string(ports) + " ports: a virtual switch has 1 to " +
                           std::to_string(VirtualSwitch::MAX_PORTS) + " ports");
  if (teaming.IsSet(NicTeamingPolicy::MASK_UPLINK_ORDER) && !teaming.GetUplinkOrder().empty())
    throw HostCtlException("Unable to add virtual switch " + name +
                           ": a new virtual switch has no uplinks to order");
  ShapingPolicy shapingStored = shaping.MergedOver(ShapingPolicy::GetDefaultPolicy());
  CheckShapingInForce(shapingStored, name);
  int64_t id = store.Write([&] {
    if (FindPortset(store, name))
      throw HostCtlException("Unable to add virtual switch " + name +
                             ": a virtual switch of that name already exists");
    Statement used =
        store.Prepare("SELECT coalesce(sum(num_ports), 0) AS ports FROM portset WHERE kind = "
                      "'standard'");
    enum { kPorts };
    used.Step();
    int64_t allocated = used.Int(kPorts);
    if (allocated + ports > VirtualSwitch::MAX_HOST_PORTS)
      throw HostCtlException("Unable to add virtual switch " + name + " with " +
                             std::to_string(ports) + " ports: " + std::to_string(allocated) +
                             " of the host's " + std::to_string(VirtualSwitch::MAX_HOST_PORTS) +
                             " ports are already allocated");
    store
        .Prepare("INSERT INTO portset(name, kind, system, ord, num_ports, mtu) VALUES(?, "
                 "'standard', 0, (SELECT coalesce(max(ord), -1) + 1 FROM portset), ?, 1500)")
        .BindAll(name, ports)
        .Run();
    int64_t newId = store.LastInsertId();
    NicTeamingPolicy teamingStored = teaming.MergedOver(NicTeamingPolicy::GetDefaultPolicy());
    teamingStored.SetSetMask(teamingStored.GetSetMask() & ~NicTeamingPolicy::MASK_UPLINK_ORDER);
    store
        .Prepare("INSERT INTO vswitch(portset_id, cdp, beacon_interval, beacon_threshold, "
                 "teaming, security, shaping, capabilities) VALUES(?, 1, 1, 3, ?, ?, ?, ?)")
        .BindAll(newId, Dump(Model::TeamingToJson(teamingStored)),
                 Dump(Model::SecurityToJson(
                     security.MergedOver(PortSecurityPolicy::GetDefaultPolicy()))),
                 Dump(Model::ShapingToJson(shapingStored)),
                 Dump(Model::CapabilitiesToJson(capabilities)))
        .Run();
    return newId;
  });
  return std::make_unique<VirtualSwitchImpl>(PortsetData{id, name, PortsetKind::Standard, false});
}

void VirtualSwitchInfoImpl::RemoveVirtualSwitch(const std::string& name) {
  Store& store = Store::Host();
  store.CheckFault("RemoveVirtualSwitch", name);
  store.Write([&] {
    auto data = FindPortset(store, name);
    if (!data)
      throw HostCtlException("Unable to remove virtual switch " + name +
                             ": the host has no virtual switch of that name");
    if (data->kind != PortsetKind::Standard)
      throw HostCtlException("Unable to remove virtual switch " + name +
                             ": it is not a standard virtual switch");
    if (data->system)
      throw HostCtlException("Unable to remove virtual switch " + name +
                             ": it is a system switch, which the host keeps");
    Statement clients = store.Prepare(
        "SELECT client_kind, client FROM port WHERE portset_id = ? AND client_kind != 'uplink' "
        "ORDER BY client_kind, client");
    enum { kClientKind, kClient };
    clients.Bind(1, data->id);
    std::string tvknics;
    std::string vms;
    while (clients.Step()) {
      std::string& list = clients.Text(kClientKind) == "tvknic" ? tvknics : vms;
      list += (list.empty() ? "" : ", ") + clients.Text(kClient);
    }
    if (!tvknics.empty())
      throw HostCtlException("Unable to remove virtual switch " + name +
                             ": kernel interfaces are connected to its port groups (" + tvknics +
                             ")");
    if (!vms.empty())
      throw HostCtlException("Unable to remove virtual switch " + name +
                             ": virtual machine ports are connected to it (" + vms + ")");
    store.Prepare("DELETE FROM port WHERE portset_id = ?").Bind(1, data->id).Run();
    store.Prepare("DELETE FROM portset WHERE id = ?").Bind(1, data->id).Run();
  });
}

} // namespace Sim
