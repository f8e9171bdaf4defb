//===- HostCtl/Network/NetworkInfo.h - The host's network information -----===//
//
// The root through which commands reach the host's network objects. Each
// area adds its operations in its own section below.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Pnic.h"
#include "HostCtl/Network/Sriov.h"

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

  // --- Kernel interfaces.

  // --- Port groups.

  // --- ENS contexts.
};

/// Opens network roots and looks up switching objects by name.
class NetworkFactory {
public:
  /// The network information root, owned by the caller.
  static std::unique_ptr<NetworkInfo> GetNetworkInfo();

  // --- Switching lookups.
};

} // namespace HostCtl::Network
