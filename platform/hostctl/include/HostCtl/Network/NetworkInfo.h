//===- HostCtl/Network/NetworkInfo.h - The host's network information -----===//
//
// The root through which commands reach the host's network objects. Each
// area adds its operations in its own section below.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/NetstackInstance.h"
#include "HostCtl/Network/Pnic.h"
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
