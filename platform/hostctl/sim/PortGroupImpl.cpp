//===- PortGroupImpl.cpp - Port groups of standard switches ---------------===//
//
// A port group keeps only the policy fields it overrides; the policy in
// force is computed on every read as the override merged over the switch's
// policy in force, so it follows later changes of the switch. The configured
// policy handed out carries the override's set mask, and in the fields it
// does not set the values in force, so that an edit starts from what the
// port group has now.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "model/SwitchingModel.h"
#include "sim/SwitchingStore.h"

#include <algorithm>
#include <optional>
#include <set>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using namespace HostCtl::Network;
using Model::Statement;
using Model::Store;

void CheckShapingInForce(const ShapingPolicy& policy, const std::string& owner);

namespace {

/// What the host keeps of a port group.
struct GroupRow {
  int64_t id = 0;             ///< Port group id.
  int64_t portsetId = 0;      ///< Its switch.
  std::string portsetName;    ///< Its switch's name.
  bool portsetSystem = false; ///< Its switch is a system switch.
  uint16_t vlanId = 0;        ///< VLAN ID.
};

std::optional<GroupRow> FindGroup(Store& store, const std::string& name) {
  Statement row = store.Prepare("SELECT g.id, g.portset_id, p.name, p.system, g.vlan_id FROM "
                                "portgroup g JOIN portset p ON p.id = g.portset_id "
                                "WHERE g.name = ?");
  enum { kId, kPortsetId, kName, kSystem, kVlanId };
  row.Bind(1, name);
  if (!row.Step())
    return std::nullopt;
  return GroupRow{row.Int(kId), row.Int(kPortsetId), row.Text(kName), row.Bool(kSystem),
                  static_cast<uint16_t>(row.Int(kVlanId))};
}

GroupRow RequireGroup(Store& store, const std::string& name) {
  auto group = FindGroup(store, name);
  if (!group)
    throw HostCtlException("The host has no port group named " + name);
  return *group;
}

std::string PolicyText(Store& store, int64_t id, const char* sql) {
  Statement row = store.Prepare(sql);
  enum { kPolicy };
  row.Bind(1, id);
  return row.Step() ? row.Text(kPolicy) : std::string("{}");
}

NicTeamingPolicy ConfiguredTeaming(Store& store, int64_t id) {
  return Model::ParseTeaming(
      PolicyText(store, id, "SELECT teaming FROM portgroup_policy WHERE portgroup_id = ?"));
}
PortSecurityPolicy ConfiguredSecurity(Store& store, int64_t id) {
  return Model::ParseSecurity(
      PolicyText(store, id, "SELECT security FROM portgroup_policy WHERE portgroup_id = ?"));
}
ShapingPolicy ConfiguredShaping(Store& store, int64_t id) {
  return Model::ParseShaping(
      PolicyText(store, id, "SELECT shaping FROM portgroup_policy WHERE portgroup_id = ?"));
}

/// \p configured with the fields it does not set holding \p parent's values;
/// the set mask stays the port group's own.
template <typename Policy> Policy WithParentValues(const Policy& configured, const Policy& parent) {
  Policy filled = configured.MergedOver(parent);
  filled.SetSetMask(configured.GetSetMask());
  return filled;
}

/// A policy of port group \p name, read as host operation \p operation in one
/// read transaction: in force (\p inForce: its own fields over its switch's)
/// or as configured (WithParentValues). \p configured reads the port group's
/// own fields, \p ofSwitch those of its switch.
template <typename Policy>
Policy ReadGroupPolicy(const char* operation, const std::string& name, bool inForce,
                       Policy (*configured)(Store&, int64_t), Policy (*ofSwitch)(Store&, int64_t)) {
  Store& store = Store::Host();
  store.CheckFault(operation, name);
  return store.Read([&] {
    GroupRow group = RequireGroup(store, name);
    Policy own = configured(store, group.id);
    Policy parent = ofSwitch(store, group.portsetId);
    return inForce ? own.MergedOver(parent) : WithParentValues(own, parent);
  });
}

/// Stores the JSON \p text of one policy of port group \p id with \p updateSql,
/// an UPDATE of its column whose parameters are the text and the id.
void StorePolicy(Store& store, int64_t id, const char* updateSql, const std::string& text) {
  store
      .Prepare("INSERT INTO portgroup_policy(portgroup_id) VALUES(?) "
               "ON CONFLICT(portgroup_id) DO NOTHING")
      .Bind(1, id)
      .Run();
  store.Prepare(updateSql).BindAll(text, id).Run();
}

} // namespace

PortGroupImpl::PortGroupImpl(std::string name) : name_(std::move(name)) {}
PortGroupImpl::PortGroupImpl(PortGroupData data) : name_(data.name), listed_(std::move(data)) {}
PortGroupImpl::~PortGroupImpl() = default;

// --- Connection point.

std::string PortGroupImpl::GetPortsetName() const {
  Store& store = Store::Host();
  store.CheckFault("GetPortsetName", name_);
  if (listed_)
    return listed_->portsetName;
  auto group = store.Read([&] { return FindGroup(store, name_); });
  return group ? group->portsetName : std::string();
}

int PortGroupImpl::GetType() const {
  return ConnectionPoint::CONNECTION_PORTGROUP;
}

std::string PortGroupImpl::GetPortGroupName() const {
  return name_;
}

DVPortParam PortGroupImpl::GetDVPortParam() const {
  return {};
}

OpaqueNetworkParam PortGroupImpl::GetOpaqueNetworkParam() const {
  return {};
}

bool PortGroupImpl::IsValid() const {
  Store& store = Store::Host();
  return store.Read([&] { return FindGroup(store, name_).has_value(); });
}

// --- Port group.

std::string PortGroupImpl::GetName() const {
  return name_;
}

uint32_t PortGroupImpl::GetActiveClients() const {
  Store& store = Store::Host();
  store.CheckFault("GetActiveClients", name_);
  if (listed_)
    return listed_->activeClients;
  return store.Read([&] {
    GroupRow group = RequireGroup(store, name_);
    Statement row = store.Prepare("SELECT count(*) FROM port WHERE portgroup_id = ? AND "
                                  "client_kind IN ('tvknic', 'vm')");
    enum { kCount };
    row.Bind(1, group.id);
    row.Step();
    return static_cast<uint32_t>(row.Int(kCount));
  });
}

uint16_t PortGroupImpl::GetVlanId() const {
  Store& store = Store::Host();
  store.CheckFault("GetVlanId", name_);
  if (listed_)
    return listed_->vlanId;
  return store.Read([&] { return RequireGroup(store, name_).vlanId; });
}

void PortGroupImpl::SetVlanId(uint16_t vlanId) {
  Store& store = Store::Host();
  store.CheckFault("SetVlanId", name_);
  if (vlanId < MIN_VLAN_ID || vlanId > MAX_VLAN_ID)
    throw HostCtlException("Unable to set the VLAN ID of port group " + name_ + " to " +
                           std::to_string(vlanId) + ": VLAN IDs are " +
                           std::to_string(MIN_VLAN_ID) + " to " + std::to_string(MAX_VLAN_ID));
  store.Write([&] {
    GroupRow group = RequireGroup(store, name_);
    store.Prepare("UPDATE portgroup SET vlan_id = ? WHERE id = ?")
        .BindAll(static_cast<int>(vlanId), group.id)
        .Run();
  });
  if (listed_)
    listed_->vlanId = vlanId;
}

std::unique_ptr<VirtualSwitch> PortGroupImpl::GetVirtualSwitch() const {
  Store& store = Store::Host();
  store.CheckFault("GetVirtualSwitch", name_);
  GroupRow group = store.Read([&] { return RequireGroup(store, name_); });
  return std::make_unique<VirtualSwitchImpl>(
      PortsetData{group.portsetId, group.portsetName, PortsetKind::Standard, group.portsetSystem});
}

NicTeamingPolicy PortGroupImpl::GetNicTeamingPolicy() const {
  return ReadGroupPolicy("GetNicTeamingPolicy", name_, true, ConfiguredTeaming, SwitchTeaming);
}

NicTeamingPolicy PortGroupImpl::GetConfiguredNicTeamingPolicy() const {
  return ReadGroupPolicy("GetConfiguredNicTeamingPolicy", name_, false, ConfiguredTeaming,
                         SwitchTeaming);
}

void PortGroupImpl::SetNicTeamingPolicy(const NicTeamingPolicy& policy) {
  Store& store = Store::Host();
  store.CheckFault("SetNicTeamingPolicy", name_);
  store.Write([&] {
    GroupRow group = RequireGroup(store, name_);
    if (policy.IsSet(NicTeamingPolicy::MASK_UPLINK_ORDER)) {
      std::vector<std::string> uplinks;
      Statement rows = store.Prepare("SELECT nic FROM uplink WHERE portset_id = ?");
      enum { kNic };
      rows.Bind(1, group.portsetId);
      while (rows.Step())
        uplinks.push_back(rows.Text(kNic));
      std::set<std::string> seen;
      for (const std::string& name : policy.GetUplinkOrder()) {
        if (std::find(uplinks.begin(), uplinks.end(), name) == uplinks.end())
          throw HostCtlException("Unable to set the teaming policy of port group " + name_ + ": " +
                                 name + " is not an uplink of " + group.portsetName);
        if (!seen.insert(name).second)
          throw HostCtlException("Unable to set the teaming policy of port group " + name_ + ": " +
                                 name + " appears more than once");
      }
      if (policy.GetMaxActiveUplinks() < 0)
        throw HostCtlException("Unable to set the teaming policy of port group " + name_ +
                               ": the number of active uplinks is negative");
    }
    StorePolicy(store, group.id, "UPDATE portgroup_policy SET teaming = ? WHERE portgroup_id = ?",
                Model::TeamingToJson(policy).dump());
  });
}

PortSecurityPolicy PortGroupImpl::GetPortSecurityPolicy() const {
  return ReadGroupPolicy("GetPortSecurityPolicy", name_, true, ConfiguredSecurity, SwitchSecurity);
}

PortSecurityPolicy PortGroupImpl::GetConfiguredPortSecurityPolicy() const {
  return ReadGroupPolicy("GetConfiguredPortSecurityPolicy", name_, false, ConfiguredSecurity,
                         SwitchSecurity);
}

void PortGroupImpl::SetPortSecurityPolicy(const PortSecurityPolicy& policy) {
  Store& store = Store::Host();
  store.CheckFault("SetPortSecurityPolicy", name_);
  store.Write([&] {
    GroupRow group = RequireGroup(store, name_);
    StorePolicy(store, group.id, "UPDATE portgroup_policy SET security = ? WHERE portgroup_id = ?",
                Model::SecurityToJson(policy).dump());
  });
}

ShapingPolicy PortGroupImpl::GetTrafficShapingPolicy() const {
  return ReadGroupPolicy("GetTrafficShapingPolicy", name_, true, ConfiguredShaping, SwitchShaping);
}

ShapingPolicy PortGroupImpl::GetConfiguredTrafficShapingPolicy() const {
  return ReadGroupPolicy("GetConfiguredTrafficShapingPolicy", name_, false, ConfiguredShaping,
                         SwitchShaping);
}

void PortGroupImpl::SetTrafficShapingPolicy(const ShapingPolicy& policy) {
  Store& store = Store::Host();
  store.CheckFault("SetTrafficShapingPolicy", name_);
  store.Write([&] {
    GroupRow group = RequireGroup(store, name_);
    CheckShapingInForce(policy.MergedOver(SwitchShaping(store, group.portsetId)),
                        "port group " + name_);
    StorePolicy(store, group.id, "UPDATE portgroup_policy SET shaping = ? WHERE portgroup_id = ?",
                Model::ShapingToJson(policy).dump());
  });
}

} // namespace Sim
