//===- TvkCtl/Network/Switching.h - Switching objects of the host ---------===//
//
// The switch service VirtualSwitchInfoImpl and the port objects that callers
// construct by name (PortGroupImpl, DVPortImpl) are handles: every operation
// is the session's host's. PortsetImpl and DVSwitchImpl are what every
// backend's switch objects implement beyond the HostCtl interfaces, so that
// a caller may use a listed switch as one; every backend hands out its
// distributed ports as DVPortImpl.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Switching.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Backend {
class DVPort;
class PortGroup;
class Switches;
} // namespace HostCtl::Backend

namespace TvkCtl::Network {

/// What every switch of a backend is besides a HostCtl::Network::Portset.
class PortsetImpl : public virtual HostCtl::Network::Portset {
public:
  ~PortsetImpl() override = default;

  /// Whether the host has a switch (of any kind) of that name.
  static bool IsValidVirtualSwitch(const std::string& name);
  /// The id other objects use for the switch: the UUID of a distributed or
  /// opaque switch, the name of a standard one.
  virtual std::string GetIdentifier() const = 0;
};

/// A distributed or opaque switch of a backend.
class DVSwitchImpl : public virtual HostCtl::Network::DVSwitch, public virtual PortsetImpl {
public:
  ~DVSwitchImpl() override = default;
};

/// A port group, by name. It is valid while the host has a port group of that
/// name; operations on one it does not have throw HostCtlException.
class PortGroupImpl : public virtual HostCtl::Network::PortGroup {
public:
  explicit PortGroupImpl(const std::string& name);
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
  std::unique_ptr<HostCtl::Backend::PortGroup> ops_; ///< The host's port group.
};

/// A distributed port, by switch UUID and port key.
class DVPortImpl : public virtual HostCtl::Network::DVPort {
public:
  explicit DVPortImpl(const HostCtl::Network::DVPortParam& param);
  DVPortImpl(const std::string& switchId, const std::string& dvPortId);
  /// A backend's port (how backends hand out the ports they list).
  explicit DVPortImpl(std::unique_ptr<HostCtl::Backend::DVPort> port);
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
  std::unique_ptr<HostCtl::Backend::DVPort> ops_; ///< The host's port.
};

/// The switch service: lists, looks up, adds and removes switches.
class VirtualSwitchInfoImpl {
public:
  VirtualSwitchInfoImpl();
  ~VirtualSwitchInfoImpl();

  /// Every switch of every kind, standard switches first, in host order.
  std::vector<std::unique_ptr<HostCtl::Network::Portset>> GetAllSwitches();
  /// Standard switches of the selector's kind.
  std::vector<std::unique_ptr<HostCtl::Network::VirtualSwitch>>
  GetVirtualSwitches(HostCtl::Network::PortsetGetType type);
  std::unique_ptr<HostCtl::Network::VirtualSwitch>
  GetVirtualSwitchByName(const std::string& name, HostCtl::Network::PortsetGetType type);
  /// Creates standard switch \p name with \p ports ports and the given policies.
  std::unique_ptr<HostCtl::Network::VirtualSwitch>
  AddVirtualSwitchWithPolicy(const HostCtl::Network::NicTeamingPolicy& teaming,
                             const HostCtl::Network::PortSecurityPolicy& security,
                             const HostCtl::Network::ShapingPolicy& shaping,
                             const HostCtl::Network::NicCapabilities& capabilities,
                             const std::string& name, uint32_t ports);
  /// Removes standard switch \p name; refused while kernel interfaces or VM
  /// ports use its port groups.
  void RemoveVirtualSwitch(const std::string& name);

  std::vector<std::unique_ptr<HostCtl::Network::DVSwitch>> GetDVSwitches();
  std::vector<std::unique_ptr<HostCtl::Network::DVSwitch>> GetOpaqueDVSwitches();
  /// The distributed or opaque switch of that name (or display name), or null.
  std::unique_ptr<HostCtl::Network::DVSwitch> GetDVSwitchByName(const std::string& name);

  bool IsLegacySwitch(const std::string& name);
  bool IsDVSwitch(const std::string& name);
  bool IsOpaqueSwitch(const std::string& name);

private:
  std::unique_ptr<HostCtl::Backend::Switches> ops_; ///< The host's operations.
};

} // namespace TvkCtl::Network
