//===- HostCtl/Network/Switching.h - Switches, port groups and ports ------===//
//
// The switching objects of the host: switches of every kind (Portset, with
// the standard VirtualSwitch and the distributed DVSwitch), port groups of
// standard switches, distributed ports, the virtual ports in use, and the
// connection points through which kernel interfaces attach to a switch.
// Objects are handed out as owned pointers and read the host when asked; a
// refusal throws HostCtl::Lib::HostCtlException.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Address.h"
#include "HostCtl/Network/Lacp.h"
#include "HostCtl/Network/Policy.h"
#include "HostCtl/Network/PortsetGetType.h"

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Network {


/// Where a distributed port is: the switch's UUID, the port's key and the
/// connection id of the client attached to it (0 for none).
struct DVPortParam {
  std::string switchUuid;    ///< UUID of the distributed switch.
  std::string portId;        ///< Port key, such as "12".
  uint32_t connectionId = 0; ///< Connection of the attached client; 0 for none.
};

/// An opaque network, managed outside the host.
struct OpaqueNetworkParam {
  std::string networkId;   ///< Network id.
  std::string networkType; ///< Network type.
  std::string externalId;  ///< Id of the attachment outside the host.
};

/// A place on a switch where a client attaches: a port group (type 1), a
/// distributed port (type 2) or an opaque network (type 3).
class ConnectionPoint {
public:
  /// Kinds returned by GetType.
  enum Kind : int {
    CONNECTION_PORTGROUP = 1,
    CONNECTION_DVPORT = 2,
    CONNECTION_OPAQUE = 3,
  };
  virtual ~ConnectionPoint() = default;
  /// The name of the switch the point belongs to; empty when it has none.
  virtual std::string GetPortsetName() const = 0;
  virtual int GetType() const = 0;
  /// The port group's name (type 1).
  virtual std::string GetPortGroupName() const = 0;
  /// The distributed port (type 2).
  virtual DVPortParam GetDVPortParam() const = 0;
  /// The opaque network (type 3).
  virtual OpaqueNetworkParam GetOpaqueNetworkParam() const = 0;
  /// Whether the point names something the host has.
  virtual bool IsValid() const = 0;
};

/// Packet counts of one VLAN on an uplink.
struct VlanStats {
  uint16_t vlanId = 0;   ///< VLAN ID.
  uint64_t received = 0; ///< Packets received on the VLAN.
  uint64_t sent = 0;     ///< Packets sent on the VLAN.
};

/// A virtual port in use on a switch.
class Port {
public:
  virtual ~Port() = default;
  /// Port id (ids of the host start at 33554432).
  virtual int64_t GetId() const = 0;
  /// The world (VM) owning the port; 0 when none does.
  virtual int64_t GetWorldLeader() const = 0;
  /// The port group the port is on; empty on a distributed switch.
  virtual std::string GetPortGroupName() const = 0;
  /// The distributed port the port is on; empty on a standard switch.
  virtual std::string GetDVPortID() const = 0;
  /// Port kind code.
  virtual int GetType() const = 0;

  // --- Datapath.
};

/// A switch of any kind.
class Portset {
public:
  /// Ports of a new standard switch when none are asked for.
  static constexpr uint32_t DEF_NUM_PORTS = 128;

  virtual ~Portset() = default;
  virtual std::string GetName() const = 0;
  /// The switch implementation's class name.
  virtual std::string GetClassName() const = 0;
  virtual uint32_t GetNumPorts() const = 0;
  virtual uint32_t GetConfiguredPorts() const = 0;
  virtual uint32_t GetUsedPorts() const = 0;
  /// Names of the uplinks, in order.
  virtual std::vector<std::string> GetUplinks() const = 0;
  /// The ports in use, in port id order.
  virtual std::vector<std::unique_ptr<Port>> GetPorts() const = 0;

  // --- VLAN statistics of uplinks.
  /// Counters per VLAN of uplink \p nicName; empty while collection is off.
  virtual std::vector<VlanStats> GetVlanStats(const std::string& nicName) const = 0;
  /// Turns collection of VLAN counters on uplink \p nicName on or off.
  virtual void SetVlanStatsEnabled(const std::string& nicName, bool enabled) = 0;
};

class PortGroup;

/// A standard switch.
class VirtualSwitch : public virtual Portset {
public:
  /// MTU bounds of a standard switch on this host.
  static constexpr uint32_t MIN_MTU = 1280;
  static constexpr uint32_t MAX_MTU = 9000;
  /// Most ports of one standard switch, and of all of them together.
  static constexpr uint32_t MAX_PORTS = 4096;
  static constexpr uint32_t MAX_HOST_PORTS = 4608;

  virtual uint32_t GetMtu() const = 0;
  virtual void SetMtu(uint32_t mtu) = 0;
  /// CDP status: 0 down, 1 listen, 2 advertise, 3 both.
  virtual uint32_t GetCdpStatus() const = 0;
  virtual void SetCdpStatus(uint32_t status) = 0;
  virtual bool IsBeaconEnabled() const = 0;
  /// Seconds between beacons.
  virtual uint32_t GetBeaconInterval() const = 0;
  /// Missed beacons that mark an uplink failed.
  virtual uint32_t GetBeaconThreshold() const = 0;
  /// What asks for beaconing (port groups or the switch itself).
  virtual std::vector<std::string> GetBeaconRequiredBy() const = 0;
  virtual std::vector<std::unique_ptr<PortGroup>> GetPortGroups() const = 0;
  /// Adds physical NIC \p name as uplink; \p teamAdd is accepted for the call
  /// sites' sake: the uplink joins the team only where the order follows the
  /// uplinks.
  virtual void AddUplink(const std::string& name, bool teamAdd) = 0;
  /// Removes uplink \p name; it leaves every teaming order of the switch and
  /// of its port groups. \p force is accepted for the call sites' sake.
  virtual void RemoveUplink(const std::string& name, bool force) = 0;
  virtual std::unique_ptr<PortGroup> AddPortGroup(const std::string& name) = 0;
  virtual void RemovePortGroup(const std::string& name) = 0;

  // Policies: the switch's own policies are the ones in force.
  virtual NicTeamingPolicy GetNicTeamingPolicy() const = 0;
  virtual NicTeamingPolicy GetConfiguredNicTeamingPolicy() const = 0;
  virtual void SetNicTeamingPolicy(const NicTeamingPolicy& policy) = 0;
  virtual PortSecurityPolicy GetPortSecurityPolicy() const = 0;
  virtual void SetPortSecurityPolicy(const PortSecurityPolicy& policy) = 0;
  virtual ShapingPolicy GetTrafficShapingPolicy() const = 0;
  virtual void SetTrafficShapingPolicy(const ShapingPolicy& policy) = 0;
  virtual NicCapabilities GetNicCapabilities() const = 0;
};

/// A port group of a standard switch; it is also the connection point of the
/// clients on it.
class PortGroup : public virtual ConnectionPoint {
public:
  static constexpr uint16_t MIN_VLAN_ID = 0;
  static constexpr uint16_t MAX_VLAN_ID = 4095;

  virtual std::string GetName() const = 0;
  /// Clients (kernel interfaces and VM ports) on the port group.
  virtual uint32_t GetActiveClients() const = 0;
  virtual uint16_t GetVlanId() const = 0;
  virtual void SetVlanId(uint16_t vlanId) = 0;
  virtual std::unique_ptr<VirtualSwitch> GetVirtualSwitch() const = 0;

  /// In force: the configured override merged over the switch's policy.
  virtual NicTeamingPolicy GetNicTeamingPolicy() const = 0;
  virtual NicTeamingPolicy GetConfiguredNicTeamingPolicy() const = 0;
  virtual void SetNicTeamingPolicy(const NicTeamingPolicy& policy) = 0;
  virtual PortSecurityPolicy GetPortSecurityPolicy() const = 0;
  virtual PortSecurityPolicy GetConfiguredPortSecurityPolicy() const = 0;
  virtual void SetPortSecurityPolicy(const PortSecurityPolicy& policy) = 0;
  virtual ShapingPolicy GetTrafficShapingPolicy() const = 0;
  virtual ShapingPolicy GetConfiguredTrafficShapingPolicy() const = 0;
  virtual void SetTrafficShapingPolicy(const ShapingPolicy& policy) = 0;
};

/// A port of a distributed switch; it is also the connection point of the
/// client on it.
class DVPort : public virtual ConnectionPoint {
public:
  /// The port key.
  virtual std::string GetPortId() const = 0;
  /// The port's name (uplink ports of a LAG are named "<lag>-<index>").
  virtual std::string GetName() const = 0;
  /// Key of the distributed port group the port belongs to.
  virtual std::string GetDVPortgroupId() const = 0;
  /// Whether a client uses the port; fills \p clients with their names.
  virtual bool IsInUse(std::vector<std::string>& clients) const = 0;
  virtual uint32_t GetConnectionId() const = 0;
  virtual void SetConnectionId(uint32_t connectionId) = 0;
};

/// A distributed switch (or an opaque switch, whose configuration is owned
/// outside the host).
class DVSwitch : public virtual Portset {
public:
  virtual std::string GetUuid() const = 0;
  virtual std::string GetDisplayName() const = 0;
  virtual std::string GetDvsName() const = 0;
  virtual std::string GetDvsId() const = 0;
  virtual uint32_t GetNumConfiguredPorts() const = 0;
  virtual uint32_t GetMTU() const = 0;
  virtual std::string GetCdpStatusString() const = 0;
  virtual int32_t GetBeaconTimeout() const = 0;
  virtual bool IsCorvexBranded() const = 0;
  virtual std::vector<std::unique_ptr<DVPort>> GetDVPorts() const = 0;

  // --- LACP.
  virtual std::vector<LagConfig> GetLagConfigs() const = 0;
  /// NIC name to its uplink port, in NIC-name order.
  virtual std::map<std::string, DVPortParam> GetUplinkPortMap() const = 0;
  /// LACP settings of the uplink ports, in port order.
  virtual std::vector<DVUplinkPortLacp> GetUplinkPortLacp() const = 0;
  /// Runtime state of every LAG; appends to \p lags.
  virtual void GetLacpInfo(std::vector<LacpLagInfo>& lags) const = 0;
  /// Whether LACP runs on the DPU behind the uplinks.
  virtual bool IsLacpOnDpu() const = 0;
  /// Sets the LACP timeout (true short, false long) of LAG \p lagId, on NIC
  /// \p nicName only or on all of its NICs when it is empty.
  virtual void SetLacpTimeout(uint32_t lagId, bool shortTimeout, const std::string& nicName) = 0;
};

} // namespace HostCtl::Network
