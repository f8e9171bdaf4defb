//===- TvkCtl/Network/Switching.h - Switching objects of the host ---------===//
//
// Implementations of the switching interfaces over the simulated host, and
// the switch service VirtualSwitchInfoImpl. Objects remember the key of what
// they stand for (a switch id, a port group name, a port id) and read the
// host on every call, so they always show the current state.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Switching.h"
#include "TvkCtl/Network/Switching.h"
#include "backend/Backend.h"

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace Sim {

/// What kind of switch a portset is.
enum class PortsetKind { Standard, Distributed, Opaque };

/// Identity of a switch as the host keeps it.
struct PortsetData {
  int64_t id = 0;                           ///< Host switch id.
  std::string name;                         ///< Switch name.
  PortsetKind kind = PortsetKind::Standard; ///< Kind.
  bool system = false;                      ///< A system switch.
};

/// Common part of every switch.
class PortsetImpl : public virtual TvkCtl::Network::PortsetImpl {
public:
  explicit PortsetImpl(PortsetData data);
  ~PortsetImpl() override;

  /// Whether the host has a switch (of any kind) of that name.
  static bool IsValidVirtualSwitch(const std::string& name);
  /// The id other objects use for the switch: the UUID of a distributed or
  /// opaque switch, the name of a standard one.
  std::string GetIdentifier() const override;
  int64_t GetPortsetId() const { return data_.id; }
  PortsetKind GetKind() const { return data_.kind; }
  bool IsSystem() const { return data_.system; }

  std::string GetName() const override;
  std::string GetClassName() const override;
  uint32_t GetNumPorts() const override;
  uint32_t GetConfiguredPorts() const override;
  uint32_t GetUsedPorts() const override;
  std::vector<std::string> GetUplinks() const override;
  std::vector<std::unique_ptr<HostCtl::Network::Port>> GetPorts() const override;

  // --- VLAN statistics of uplinks.
  std::vector<HostCtl::Network::VlanStats> GetVlanStats(const std::string& nicName) const override;
  void SetVlanStatsEnabled(const std::string& nicName, bool enabled) override;

protected:
  PortsetData data_; ///< Identity of the switch.
};

/// A standard switch.
class VirtualSwitchImpl : public virtual HostCtl::Network::VirtualSwitch, public PortsetImpl {
public:
  explicit VirtualSwitchImpl(PortsetData data);
  ~VirtualSwitchImpl() override;

  uint32_t GetMtu() const override;
  void SetMtu(uint32_t mtu) override;
  uint32_t GetCdpStatus() const override;
  void SetCdpStatus(uint32_t status) override;
  bool IsBeaconEnabled() const override;
  uint32_t GetBeaconInterval() const override;
  uint32_t GetBeaconThreshold() const override;
  std::vector<std::string> GetBeaconRequiredBy() const override;
  std::vector<std::unique_ptr<HostCtl::Network::PortGroup>> GetPortGroups() const override;
  void AddUplink(const std::string& name, bool teamAdd) override;
  void RemoveUplink(const std::string& name, bool force) override;
  std::unique_ptr<HostCtl::Network::PortGroup> AddPortGroup(const std::string& name) override;
  void RemovePortGroup(const std::string& name) override;

  HostCtl::Network::NicTeamingPolicy GetNicTeamingPolicy() const override;
  HostCtl::Network::NicTeamingPolicy GetConfiguredNicTeamingPolicy() const override;
  void SetNicTeamingPolicy(const HostCtl::Network::NicTeamingPolicy& policy) override;
  HostCtl::Network::PortSecurityPolicy GetPortSecurityPolicy() const override;
  void SetPortSecurityPolicy(const HostCtl::Network::PortSecurityPolicy& policy) override;
  HostCtl::Network::ShapingPolicy GetTrafficShapingPolicy() const override;
  void SetTrafficShapingPolicy(const HostCtl::Network::ShapingPolicy& policy) override;
  HostCtl::Network::NicCapabilities GetNicCapabilities() const override;
};

/// A distributed or opaque switch.
class DVSwitchImpl : public virtual TvkCtl::Network::DVSwitchImpl, public PortsetImpl {
public:
  explicit DVSwitchImpl(PortsetData data);
  ~DVSwitchImpl() override;

  std::string GetUuid() const override;
  std::string GetDisplayName() const override;
  std::string GetDvsName() const override;
  std::string GetDvsId() const override;
  uint32_t GetNumConfiguredPorts() const override;
  uint32_t GetMTU() const override;
  std::string GetCdpStatusString() const override;
  int32_t GetBeaconTimeout() const override;
  bool IsCorvexBranded() const override;
  std::vector<std::unique_ptr<HostCtl::Network::DVPort>> GetDVPorts() const override;

  // --- LACP.
  std::vector<HostCtl::Network::LagConfig> GetLagConfigs() const override;
  std::map<std::string, HostCtl::Network::DVPortParam> GetUplinkPortMap() const override;
  std::vector<HostCtl::Network::DVUplinkPortLacp> GetUplinkPortLacp() const override;
  void GetLacpInfo(std::vector<HostCtl::Network::LacpLagInfo>& lags) const override;
  bool IsLacpOnDpu() const override;
  void SetLacpTimeout(uint32_t lagId, bool shortTimeout, const std::string& nicName) override;
};

/// What a listing of port groups reads of each at once.
struct PortGroupData {
  std::string name;           ///< Port group name.
  std::string portsetName;    ///< Its switch.
  uint16_t vlanId = 0;        ///< VLAN ID.
  uint32_t activeClients = 0; ///< Kernel interfaces and VM ports on it.
};

/// A port group, by name. It is valid while the host has a port group of that
/// name; operations on one it does not have throw HostCtlException.
class PortGroupImpl : public HostCtl::Backend::PortGroup {
public:
  explicit PortGroupImpl(std::string name);
  /// A port group as a listing read it; its switch, VLAN ID and client count
  /// are answered from \p data until SetVlanId.
  explicit PortGroupImpl(PortGroupData data);
  ~PortGroupImpl() override;

  // --- Connection point.
  std::string GetPortsetName() const override;
  int GetType() const override;
  std::string GetPortGroupName() const override;
  HostCtl::Network::DVPortParam GetDVPortParam() const override;
  HostCtl::Network::OpaqueNetworkParam GetOpaqueNetworkParam() const override;
  bool IsValid() const override;

  // --- Port group.
  std::string GetName() const override;
  uint32_t GetActiveClients() const override;
  uint16_t GetVlanId() const override;
  void SetVlanId(uint16_t vlanId) override;
  std::unique_ptr<HostCtl::Network::VirtualSwitch> GetVirtualSwitch() const override;
  HostCtl::Network::NicTeamingPolicy GetNicTeamingPolicy() const override;
  HostCtl::Network::NicTeamingPolicy GetConfiguredNicTeamingPolicy() const override;
  void SetNicTeamingPolicy(const HostCtl::Network::NicTeamingPolicy& policy) override;
  HostCtl::Network::PortSecurityPolicy GetPortSecurityPolicy() const override;
  HostCtl::Network::PortSecurityPolicy GetConfiguredPortSecurityPolicy() const override;
  void SetPortSecurityPolicy(const HostCtl::Network::PortSecurityPolicy& policy) override;
  HostCtl::Network::ShapingPolicy GetTrafficShapingPolicy() const override;
  HostCtl::Network::ShapingPolicy GetConfiguredTrafficShapingPolicy() const override;
  void SetTrafficShapingPolicy(const HostCtl::Network::ShapingPolicy& policy) override;

private:
  std::string name_;                    ///< Port group name.
  std::optional<PortGroupData> listed_; ///< Values read by a listing.
};

/// What a listing of distributed ports reads of each at once.
struct DVPortData {
  std::string name;                 ///< Port name.
  std::string portgroupKey;         ///< Distributed port group key.
  std::vector<std::string> clients; ///< Clients using the port.
};

/// A distributed port, by switch UUID and port key.
class DVPortImpl : public HostCtl::Backend::DVPort {
public:
  explicit DVPortImpl(HostCtl::Network::DVPortParam param);
  DVPortImpl(std::string switchId, std::string dvPortId);
  /// A port as a listing read it; name, port group and clients are answered
  /// from \p data.
  DVPortImpl(HostCtl::Network::DVPortParam param, DVPortData data);
  ~DVPortImpl() override;

  // --- Connection point.
  std::string GetPortsetName() const override;
  int GetType() const override;
  std::string GetPortGroupName() const override;
  HostCtl::Network::DVPortParam GetDVPortParam() const override;
  HostCtl::Network::OpaqueNetworkParam GetOpaqueNetworkParam() const override;
  /// Whether the switch has the port.
  bool IsValid() const override;

  // --- Distributed port.
  std::string GetPortId() const override;
  std::string GetName() const override;
  std::string GetDVPortgroupId() const override;
  bool IsInUse(std::vector<std::string>& clients) const override;
  /// The connection id the host keeps for the port.
  uint32_t GetConnectionId() const override;
  void SetConnectionId(uint32_t connectionId) override;

private:
  HostCtl::Network::DVPortParam param_; ///< Switch UUID, port key, connection.
  std::optional<DVPortData> listed_;    ///< Values read by a listing.
};

/// What the host keeps of a virtual port.
struct PortData {
  int64_t id = 0;         ///< Port id.
  int64_t portsetId = 0;  ///< Switch id.
  std::string portGroup;  ///< Port group name ("" on a distributed switch).
  std::string dvPortId;   ///< Distributed port key ("" on a standard switch).
  std::string clientKind; ///< "uplink", "tvknic" or "vm".
  std::string client;     ///< Client name.
  int64_t worldId = 0;    ///< Owning world, 0 for none.
  int type = 0;           ///< Port kind code.
};

/// A virtual port in use.
class PortImpl : public virtual HostCtl::Network::Port {
public:
  explicit PortImpl(PortData data);
  ~PortImpl() override;

  int64_t GetId() const override;
  int64_t GetWorldLeader() const override;
  std::string GetPortGroupName() const override;
  std::string GetDVPortID() const override;
  int GetType() const override;
  const PortData& GetData() const { return data_; }

  // --- Datapath.
  std::vector<HostCtl::Network::MacAddress> GetMacAddresses() const override;
  HostCtl::Network::Ipv4Address GetPortClientIpv4Address() const override;
  std::string GetSchedTeamUplink() const override;
  std::vector<std::unique_ptr<HostCtl::Network::FilterStats>> GetFilterStats() const override;
  void GetPortStats(HostCtl::Network::PortStats& stats) const override;
  void GetPacketStats(HostCtl::Network::PacketStats& stats) const override;

private:
  PortData data_; ///< The port as read from the host.
};

/// The switch service: lists, looks up, adds and removes switches.
class VirtualSwitchInfoImpl : public HostCtl::Backend::Switches {
public:
  VirtualSwitchInfoImpl();
  ~VirtualSwitchInfoImpl();

  /// Every switch of every kind, standard switches first, in host order.
  std::vector<std::unique_ptr<HostCtl::Network::Portset>> GetAllSwitches() override;
  /// Standard switches of the selector's kind.
  std::vector<std::unique_ptr<HostCtl::Network::VirtualSwitch>>
  GetVirtualSwitches(HostCtl::Network::PortsetGetType type) override;
  std::unique_ptr<HostCtl::Network::VirtualSwitch>
  GetVirtualSwitchByName(const std::string& name, HostCtl::Network::PortsetGetType type) override;
  /// Creates standard switch \p name with \p ports ports and the given policies.
  std::unique_ptr<HostCtl::Network::VirtualSwitch>
  AddVirtualSwitchWithPolicy(const HostCtl::Network::NicTeamingPolicy& teaming,
                             const HostCtl::Network::PortSecurityPolicy& security,
                             const HostCtl::Network::ShapingPolicy& shaping,
                             const HostCtl::Network::NicCapabilities& capabilities,
                             const std::string& name, uint32_t ports) override;
  /// Removes standard switch \p name; refused while kernel interfaces or VM
  /// ports use its port groups.
  void RemoveVirtualSwitch(const std::string& name) override;

  std::vector<std::unique_ptr<HostCtl::Network::DVSwitch>> GetDVSwitches() override;
  std::vector<std::unique_ptr<HostCtl::Network::DVSwitch>> GetOpaqueDVSwitches() override;
  /// The distributed or opaque switch of that name (or display name), or null.
  std::unique_ptr<HostCtl::Network::DVSwitch> GetDVSwitchByName(const std::string& name) override;

  bool IsLegacySwitch(const std::string& name) override;
  bool IsDVSwitch(const std::string& name) override;
  bool IsOpaqueSwitch(const std::string& name) override;
};

} // namespace Sim
