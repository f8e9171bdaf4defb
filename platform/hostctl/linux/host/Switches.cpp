//===- linux/host/Switches.cpp - Bridges as standard switches, port groups -===//
//
// A standard switch is a Linux bridge; its uplinks are the NICs among its
// ports; its MTU is the bridge's (and its ports'). A bridge has room for
// 1024 ports (the kernel's BR_MAX_PORTS). It neither speaks CDP nor sends
// beacons, so it reports CDP "down" and beaconing off; teaming, security and
// shaping policies have no bridge counterpart and are not available.
//
// A port group is a name with a VLAN id on one bridge, kept in the state
// file (State.h): the kernel has no object for it. No client attaches to a
// bridge through a port group, so a port group has no active clients.
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "HostCtl/Network/Switching.h"
#include "State.h"
#include "TvkCtl/Network/Switching.h"

#include <algorithm>

namespace LinuxHost {

using namespace HostCtl::Network;
namespace Ops = HostCtl::Backend;

namespace {

/// Ports a Linux bridge can have.
constexpr uint32_t kBridgePorts = 1024;

/// A port group record: bridge, name, VLAN id.
struct GroupRecord {
  std::string bridge, name;
  uint16_t vlan = 0;
};

std::vector<GroupRecord> Groups(Context& ctx) {
  std::vector<GroupRecord> groups;
  for (const StateRecord& record : ReadState(ctx.stateFile))
    if (record.kind == "portgroup" && record.fields.size() == 3)
      groups.push_back({record.fields[0], record.fields[1],
                        static_cast<uint16_t>(std::atoi(record.fields[2].c_str()))});
  return groups;
}

bool IsGroup(const StateRecord& record, const std::string& name) {
  return record.kind == "portgroup" && record.fields.size() == 3 && record.fields[1] == name;
}

class Group final : public Ops::PortGroup {
public:
  Group(Context& ctx, std::string name) : ctx_(ctx), name_(std::move(name)) {}

  std::string GetPortsetName() const override { return Record().bridge; }
  int GetType() const override { return CONNECTION_PORTGROUP; }
  std::string GetPortGroupName() const override { return name_; }
  bool IsValid() const override {
    auto groups = Groups(ctx_);
    return std::any_of(groups.begin(), groups.end(),
                       [&](const auto& g) { return g.name == name_; });
  }
  std::string GetName() const override { return name_; }
  uint32_t GetActiveClients() const override {
    Record();
    return 0;
  }
  uint16_t GetVlanId() const override { return Record().vlan; }
  void SetVlanId(uint16_t vlanId) override {
    Record();
    UpdateState(ctx_.stateFile, [&](std::vector<StateRecord>& records) {
      for (StateRecord& record : records)
        if (IsGroup(record, name_))
          record.fields[2] = std::to_string(vlanId);
    });
  }
  std::unique_ptr<VirtualSwitch> GetVirtualSwitch() const override {
    return FindBridge(ctx_, Record().bridge);
  }

private:
  GroupRecord Record() const {
    for (GroupRecord& group : Groups(ctx_))
      if (group.name == name_)
        return group;
    Refuse("There is no port group named " + name_ + " on " + ctx_.spec);
  }
  Context& ctx_;     ///< The host.
  std::string name_; ///< As asked for.
};

class Bridge final : public TvkCtl::Network::PortsetImpl, public VirtualSwitch {
public:
  Bridge(Context& ctx, LinuxNet::Link link) : ctx_(ctx), link_(std::move(link)) {}

  std::string GetIdentifier() const override { return link_.name; }
  std::string GetName() const override { return link_.name; }
  std::string GetClassName() const override { return "bridge"; }
  uint32_t GetNumPorts() const override { return kBridgePorts; }
  uint32_t GetConfiguredPorts() const override { return kBridgePorts; }
  uint32_t GetUsedPorts() const override { return static_cast<uint32_t>(Ports().size()); }
  std::vector<std::string> GetUplinks() const override {
    std::vector<std::string> uplinks;
    for (const LinuxNet::Link& link : Kernel([&] { return LinuxNet::ListLinks(ctx_.ns); }))
      if (link.master == link_.index && IsNic(link))
        uplinks.push_back(link.name);
    return uplinks;
  }
  std::vector<std::unique_ptr<Port>> GetPorts() const override { Ops::Unavailable("GetPorts"); }
  std::vector<VlanStats> GetVlanStats(const std::string&) const override {
    Ops::Unavailable("GetVlanStats");
  }
  void SetVlanStatsEnabled(const std::string&, bool) override {
    Ops::Unavailable("SetVlanStatsEnabled");
  }

  uint32_t GetMtu() const override { return link_.mtu; }
  /// The ports first: a bridge's MTU cannot exceed its smallest port's.
  void SetMtu(uint32_t mtu) override {
    LinuxNet::LinkChange change;
    change.mtu = mtu;
    for (const std::string& port : Ports())
      Kernel([&] { LinuxNet::ChangeLink(ctx_.ns, port, change); });
    Kernel([&] { LinuxNet::ChangeLink(ctx_.ns, link_.name, change); });
    link_.mtu = mtu;
  }
  uint32_t GetCdpStatus() const override { return 0; }
  void SetCdpStatus(uint32_t status) override {
    if (status != 0)
      Ops::Unavailable("SetCdpStatus");
  }
  bool IsBeaconEnabled() const override { return false; }
  uint32_t GetBeaconInterval() const override { return 0; }
  uint32_t GetBeaconThreshold() const override { return 0; }
  std::vector<std::string> GetBeaconRequiredBy() const override { return {}; }
  std::vector<std::unique_ptr<PortGroup>> GetPortGroups() const override {
    return ListPortGroups(ctx_, link_.name);
  }
  void AddUplink(const std::string& name, bool) override {
    std::optional<LinuxNet::Link> nic = FindLink(ctx_, name);
    if (!nic || !IsNic(*nic))
      Refuse("There is no physical NIC named " + name + " on " + ctx_.spec);
    if (nic->master != 0)
      Refuse("The NIC " + name + " is an uplink of another switch already");
    Kernel([&] { LinuxNet::AddBridgePort(ctx_.ns, link_.name, name); });
  }
  void RemoveUplink(const std::string& name, bool) override {
    std::vector<std::string> uplinks = GetUplinks();
    if (std::find(uplinks.begin(), uplinks.end(), name) == uplinks.end())
      Refuse("The NIC " + name + " is not an uplink of " + link_.name);
    Kernel([&] { LinuxNet::RemoveBridgePort(ctx_.ns, name); });
  }
  std::unique_ptr<PortGroup> AddPortGroup(const std::string& name) override {
    if (!IsStateField(name))
      Refuse("Invalid port group name \"" + name + "\"");
    UpdateState(ctx_.stateFile, [&](std::vector<StateRecord>& records) {
      for (const StateRecord& record : records)
        if (IsGroup(record, name))
          Refuse("A port group named " + name + " exists already on " + record.fields[0]);
      records.push_back({"portgroup", {link_.name, name, "0"}});
    });
    return std::make_unique<Group>(ctx_, name);
  }
  void RemovePortGroup(const std::string& name) override {
    UpdateState(ctx_.stateFile, [&](std::vector<StateRecord>& records) {
      auto before = records.size();
      std::erase_if(records, [&](const StateRecord& r) {
        return IsGroup(r, name) && r.fields[0] == link_.name;
      });
      if (records.size() == before)
        Refuse("There is no port group named " + name + " on " + link_.name);
    });
  }
  NicTeamingPolicy GetNicTeamingPolicy() const override { Ops::Unavailable("GetNicTeamingPolicy"); }
  NicTeamingPolicy GetConfiguredNicTeamingPolicy() const override {
    Ops::Unavailable("GetConfiguredNicTeamingPolicy");
  }
  void SetNicTeamingPolicy(const NicTeamingPolicy&) override {
    Ops::Unavailable("SetNicTeamingPolicy");
  }
  PortSecurityPolicy GetPortSecurityPolicy() const override {
    Ops::Unavailable("GetPortSecurityPolicy");
  }
  void SetPortSecurityPolicy(const PortSecurityPolicy&) override {
    Ops::Unavailable("SetPortSecurityPolicy");
  }
  ShapingPolicy GetTrafficShapingPolicy() const override {
    Ops::Unavailable("GetTrafficShapingPolicy");
  }
  void SetTrafficShapingPolicy(const ShapingPolicy&) override {
    Ops::Unavailable("SetTrafficShapingPolicy");
  }
  NicCapabilities GetNicCapabilities() const override { Ops::Unavailable("GetNicCapabilities"); }

private:
  std::vector<std::string> Ports() const {
    return Kernel([&] { return LinuxNet::BridgePorts(ctx_.ns, link_.name); });
  }
  Context& ctx_;        ///< The host.
  LinuxNet::Link link_; ///< The bridge.
};

class Switches final : public Ops::Switches {
public:
  explicit Switches(Context& ctx) : ctx_(ctx) {}

  std::vector<std::unique_ptr<Portset>> GetAllSwitches() override {
    std::vector<std::unique_ptr<Portset>> all;
    for (auto& bridge : GetVirtualSwitches(PortsetGetRegular))
      all.push_back(std::move(bridge));
    return all;
  }
  std::vector<std::unique_ptr<VirtualSwitch>> GetVirtualSwitches(PortsetGetType type) override {
    std::vector<std::unique_ptr<VirtualSwitch>> bridges;
    if (type != PortsetGetRegular)
      return bridges;
    for (LinuxNet::Link& link : Kernel([&] { return LinuxNet::ListLinks(ctx_.ns); }))
      if (IsBridge(link))
        bridges.push_back(std::make_unique<Bridge>(ctx_, std::move(link)));
    return bridges;
  }
  std::unique_ptr<VirtualSwitch> GetVirtualSwitchByName(const std::string& name,
                                                        PortsetGetType type) override {
    return type == PortsetGetRegular ? FindBridge(ctx_, name) : nullptr;
  }
  std::unique_ptr<VirtualSwitch>
  AddVirtualSwitchWithPolicy(const NicTeamingPolicy&, const PortSecurityPolicy&,
                             const ShapingPolicy&, const NicCapabilities&, const std::string& name,
                             uint32_t ports) override {
    if (ports != Portset::DEF_NUM_PORTS && ports != kBridgePorts)
      Refuse("A Linux bridge has room for " + std::to_string(kBridgePorts) +
             " ports; its number of ports cannot be set");
    if (FindLink(ctx_, name))
      Refuse("A link named " + name + " exists already");
    Kernel([&] { LinuxNet::CreateBridge(ctx_.ns, name); });
    LinuxNet::LinkChange up;
    up.up = true;
    Kernel([&] { LinuxNet::ChangeLink(ctx_.ns, name, up); });
    return FindBridge(ctx_, name);
  }
  void RemoveVirtualSwitch(const std::string& name) override {
    if (!FindBridge(ctx_, name))
      Refuse("There is no standard switch named " + name + " on " + ctx_.spec);
    Kernel([&] { LinuxNet::DeleteLink(ctx_.ns, name); });
    UpdateState(ctx_.stateFile, [&](std::vector<StateRecord>& records) {
      std::erase_if(records, [&](const StateRecord& r) {
        return r.kind == "portgroup" && !r.fields.empty() && r.fields[0] == name;
      });
    });
  }
  bool IsLegacySwitch(const std::string& name) override {
    return FindBridge(ctx_, name) != nullptr;
  }
  bool IsDVSwitch(const std::string&) override { return false; }
  bool IsOpaqueSwitch(const std::string&) override { return false; }

private:
  Context& ctx_; ///< The host.
};

} // namespace

std::unique_ptr<VirtualSwitch> FindBridge(Context& ctx, const std::string& name) {
  std::optional<LinuxNet::Link> link = FindLink(ctx, name);
  if (!link || !IsBridge(*link))
    return nullptr;
  return std::make_unique<Bridge>(ctx, std::move(*link));
}

std::unique_ptr<PortGroup> FindPortGroup(Context& ctx, const std::string& name) {
  for (const GroupRecord& group : Groups(ctx))
    if (group.name == name)
      return std::make_unique<Group>(ctx, name);
  return nullptr;
}

std::vector<std::unique_ptr<PortGroup>> ListPortGroups(Context& ctx, const std::string& bridge) {
  std::vector<std::unique_ptr<PortGroup>> groups;
  for (const GroupRecord& group : Groups(ctx))
    if (bridge.empty() || group.bridge == bridge)
      groups.push_back(std::make_unique<Group>(ctx, group.name));
  return groups;
}

std::unique_ptr<Ops::Switches> MakeSwitches(Context& ctx) {
  return std::make_unique<Switches>(ctx);
}

std::unique_ptr<Ops::PortGroup> MakePortGroup(Context& ctx, const std::string& name) {
  return std::make_unique<Group>(ctx, name);
}

} // namespace LinuxHost
