//===- HostCtl/Network/TvkNic.h - Kernel network interfaces ----------------===//
//
// A kernel network interface ("tvknic", tvk0 to tvk255) belongs to one
// netstack instance and is attached to a switch through a connection point (a
// port group, a DV port or an opaque network). TvkNic is one interface as the
// host library hands it out; TvKernelNicInfo is the service that lists, adds
// and removes them. Every operation reads the current state of the host or
// changes it at once; a refusal throws HostCtl::Lib::HostCtlException.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Address.h"
#include "HostCtl/Network/IpConfig.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Network {

class ConnectionPoint;

/// Tags of kernel interfaces; TvkNicTagInvalid names no tag.
enum TvkNicTagType : int {
  TvkNicTagHostConsole = 1,
  TvkNicTagDriftway = 2,
  TvkNicTagTwinRun = 3,
  TvkNicTagReplica = 4,
  TvkNicTagReplicaCopy = 5,
  TvkNicTagAmbrel = 6,
  TvkNicTagSharedStore = 7,
  TvkNicTagStoreWitness = 8,
  TvkNicTagArchiveTransfer = 9,
  TvkNicTagTimeSync = 10,
  TvkNicTagBlockOverTcp = 11,
  TvkNicTagBlockOverRdma = 12,
  TvkNicTagInvalid = 13,
};

/// One multicast group membership of a kernel interface.
struct MulticastGroup {
  std::string interfaceName; ///< The interface, such as tvk0.
  std::string groupAddress;  ///< IPv4 or IPv6 group address.
  std::string linkLayer;     ///< The group's link-layer (MAC) address.
  uint32_t refCount = 0;     ///< Number of joins of the group.
};

/// The virtual port a kernel interface uses on its switch.
class TvkNicPort {
public:
  virtual ~TvkNicPort() = default;
  /// The numeric port id.
  virtual int64_t GetId() const = 0;
};

/// One kernel network interface.
class TvkNic {
public:
  /// Smallest and largest MTU a kernel interface accepts.
  static constexpr uint32_t MIN_MTU = 1280;
  static constexpr uint32_t MAX_MTU = 9000;

  virtual ~TvkNic() = default;

  /// Reloads the cached attributes from the host.
  virtual void Refresh() = 0;
  virtual std::string GetInterfaceName() = 0;
  virtual MacAddress GetMacAddress() = 0;
  virtual uint32_t GetMtu() = 0;
  /// Sets the MTU; refused outside [MIN_MTU, MAX_MTU] or above the MTU of the
  /// interface's switch.
  virtual void SetMtu(uint32_t mtu) = 0;
  /// TCP segmentation offload maximum segment size.
  virtual uint32_t GetTsoMss() = 0;
  /// Number of receive dispatch queues.
  virtual uint32_t GetNumRxQueue() = 0;
  virtual bool IsEnabled() = 0;
  virtual void Enable() = 0;
  virtual void Disable() = 0;
  /// The connection point, or null for an interface that has none.
  virtual std::unique_ptr<ConnectionPoint> GetConnectionPoint() = 0;
  /// The virtual port, or null for an interface that has none.
  virtual std::unique_ptr<TvkNicPort> GetPort() = 0;
  virtual std::string GetNetstackInstanceName() = 0;
  /// The running configuration (for DHCP the lease).
  virtual IpConfig GetIpConfig() = 0;
  /// The configuration as configured (for DHCP without address).
  virtual IpConfig GetConfiguredIpConfig() = 0;
  /// Applies a whole configuration; refused when an address, netmask or
  /// gateway is unusable or an address is in use by another interface.
  virtual void SetIpConfig(const IpConfig& config) = 0;
  /// Deletes the interface and frees its port.
  virtual void Remove() = 0;
  /// Adds a tag (nothing happens when the interface has it already).
  virtual void AddTag(TvkNicTagType tag, bool persistOnly) = 0;
  /// Removes a tag; refused when the interface does not have it.
  virtual void RemoveTag(TvkNicTagType tag) = 0;
  /// Fills \p tags with the interface's tags, in the order they were added.
  virtual void GetTags(std::vector<TvkNicTagType>& tags) = 0;
  /// The interface's multicast memberships.
  virtual std::vector<MulticastGroup> GetMulticastGroups() = 0;
};

/// The second face of a new kernel interface: once its IP configuration is
/// applied, Announce() brings it onto the network, which joins the all-hosts
/// multicast groups (and, with IPv6, the all-nodes group).
class TvkNicAnnounce {
public:
  virtual ~TvkNicAnnounce() = default;
  virtual void Announce() = 0;
};

/// The service that lists, adds and removes kernel interfaces. A selector of 0
/// (PortsetGetType's ordinary objects) picks the ordinary interfaces, 1 the
/// system ones.
class TvKernelNicInfo {
public:
  virtual ~TvKernelNicInfo() = default;
  /// The interfaces of every netstack of kind \p selector, by name order.
  virtual std::vector<std::unique_ptr<TvkNic>> GetTvKernelNics(int selector) = 0;
  /// The interfaces of one netstack.
  virtual std::vector<std::unique_ptr<TvkNic>>
  GetTvKernelNicsByInstanceKey(const std::string& netstack, int selector) = 0;
  /// The interface of that name and kind, or null.
  virtual std::unique_ptr<TvkNic> GetTvKernelNicByInterface(const std::string& name, bool refresh,
                                                            int selector) = 0;
  /// The interfaces that carry \p tag.
  virtual std::vector<std::unique_ptr<TvkNic>> GetTvKernelNicsByTag(TvkNicTagType tag) = 0;
  /// Fills \p names with the names of the interfaces of one netstack.
  virtual void GetTvkernelNicNamesByInstanceKey(std::vector<std::string>& names,
                                                const std::string& netstack, int selector) = 0;
  /// Creates an interface on \p point in \p netstack. An unset \p mac, an mtu
  /// or rxQueues of 0 and an empty \p name choose the defaults (a fresh MAC,
  /// MTU 1500, one queue, the lowest free name).
  virtual std::unique_ptr<TvkNic> AddTvKernelNic(ConnectionPoint* point,
                                                 const std::string& netstack,
                                                 const IpConfig& config, const MacAddress& mac,
                                                 uint32_t flags, uint32_t mtu, uint32_t rxQueues,
                                                 const std::string& name, bool persistOnly) = 0;
  /// Removes the interface of \p netstack attached to \p point.
  virtual void RemoveTvKernelNic(ConnectionPoint* point, const std::string& netstack) = 0;
};

} // namespace HostCtl::Network
