//===- HostCtl/Network/NetworkInfo.h - The host's network information -----===//
//
// The root through which commands reach the host's network objects. Each
// area adds its operations in its own section below.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/NetstackInstance.h"
#include "HostCtl/Network/Pnic.h"
#include "HostCtl/Network/Sriov.h"
#include "HostCtl/Network/Switching.h"
#include "HostCtl/Network/TvkNic.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Network {

class NetworkInfo {
public:
  virtual ~NetworkInfo() = default;

  // --- Physical NICs.
  /// Every physical NIC, in the host's order (both selection codes select all).
  virtual std::vector<std::unique_ptr<Pnic>> GetPnics(PnicGetType type) = 0;
  /// The NIC of that name, or null.
  virtual std::unique_ptr<Pnic> GetPnicByName(const std::string& name) = 0;

  // --- SR-IOV.
  /// The physical NICs with SR-IOV enabled (physical functions), in the
  /// host's order.
  virtual std::vector<std::unique_ptr<Pnic>> GetSriovNics() = 0;
  /// The SR-IOV enabled NIC of that name, or null (also for a NIC of the host
  /// that does not have SR-IOV enabled).
  virtual std::unique_ptr<Pnic> GetSriovNicByName(const std::string& name) = 0;
  /// The virtual functions of SR-IOV NIC \p name, by VF ID; throws
  /// HostCtlException when \p name is no SR-IOV NIC.
  virtual std::vector<SriovNicVFInfo> GetSriovNicVFInfo(const std::string& name) = 0;
  /// Fills \p stats with the counters of VF \p vfId of SR-IOV NIC \p name;
  /// throws HostCtlException for an unknown NIC or VF ID.
  virtual void GetSriovNicVFStats(SriovNicVFStats& stats, const std::string& name, int vfId) = 0;

  // --- Netstacks and the kernel IPv6 switch.
  /// Every netstack instance, in the host's order.
  virtual std::vector<std::unique_ptr<NetstackInstance>> ListNetstackInstances() = 0;
  /// The instance with that key, or null.
  virtual std::unique_ptr<NetstackInstance> LookupNetstackInstanceByKey(const std::string& key) = 0;
  /// Adds \p instance; with \p disabled only to the configuration. Refused
  /// for a key in use or a key that is not a word of letters, digits, "-" and
  /// "_" of at most 32 characters.
  virtual void AddNetstackInstance(NetstackInstance& instance, bool disabled) = 0;
  /// Removes an instance; refused for the default instance and while it has
  /// interfaces.
  virtual void RemoveNetstackInstance(const std::string& key, bool force) = 0;
  /// The state of instance \p key (NetstackInstance::STATE_ENABLED when it is
  /// created in the kernel); STATE_DISABLED for a key that names no instance.
  virtual uint32_t GetNetstackInstanceState(const std::string& key) = 0;
  /// Keys of the pre-defined (service) netstack instances.
  virtual std::vector<std::string> GetPredefinedNetstackInstances() = 0;
  /// The kernel's IPv6 switch as configured (it takes effect on the next boot).
  virtual bool IsTvkIpv6Enabled() = 0;
  /// Configures the kernel's IPv6 switch for the next boot.
  virtual void SetTvkIpv6Enabled(bool enabled) = 0;

  // --- Kernel interfaces.
  /// The kernel interface service, owned by the caller.
  virtual std::unique_ptr<TvKernelNicInfo> GetTvKernelNicInfo() = 0;

  // --- Port groups.
  /// Port groups of every standard switch of the selector's kind, in host order.
  virtual std::vector<std::unique_ptr<PortGroup>> GetAllPortGroups(PortsetGetType type) = 0;

  // --- ENS contexts.
  // The host's fast-path (ENS) contexts, their maximum number, their switch
  // and their NUMA node. An argument that can never be valid on this host (an
  // id out of range, a context, switch or NUMA node the host does not have)
  // throws HostCtlException; a valid request that the host declines in its
  // current state answers false (docs/ens.md).
  /// The maximum number of ENS contexts.
  virtual int64_t GetEnsMaxLcores() = 0;
  /// Sets the maximum; false when more contexts exist than \p count.
  virtual bool SetEnsMaxLcores(int64_t count) = 0;
  /// The ids of the existing contexts, in ascending order.
  virtual std::vector<int64_t> GetEnsLcores() = 0;
  /// Creates a context; false when it exists or the maximum is reached.
  virtual bool AddEnsLcore(int64_t id) = 0;
  /// Destroys a context; false while it is associated with a switch.
  virtual bool RemoveEnsLcore(int64_t id) = 0;
  /// The switch of a context, or "" when it has none.
  virtual std::string GetEnsLcoreSwitch(int64_t id) = 0;
  /// The NUMA node of a context.
  virtual int32_t GetEnsLcoreAffinity(int64_t id) = 0;
  /// Associates a context with switch \p name; "null" clears the association.
  virtual bool SetEnsLcoreSwitch(const std::string& name, int64_t id) = 0;
  /// Sets the NUMA node of a context.
  virtual bool SetEnsLcoreAffinity(int64_t affinity, int64_t id) = 0;
};

/// Opens network roots and looks up switching objects by name.
class NetworkFactory {
public:
  /// The network information root, owned by the caller.
  static std::unique_ptr<NetworkInfo> GetNetworkInfo();

  // --- Switching lookups.
  /// The distributed or opaque switch of that name, or null.
  static std::unique_ptr<DVSwitch> GetDVSwitchByName(const std::string& name);
  /// The standard switch of that name and selector kind, or null.
  static std::unique_ptr<VirtualSwitch> GetVirtualSwitchById(const std::string& name,
                                                             PortsetGetType type);
  /// The port group of that name, or null.
  static std::unique_ptr<PortGroup> GetPortGroupByName(const std::string& name);
  /// The distributed port \p param names, or null when the host has none.
  static std::unique_ptr<DVPort> GetDVPort(const DVPortParam& param);
};

} // namespace HostCtl::Network
