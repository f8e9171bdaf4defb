//===- model/NicModel.h - Side tables of physical NICs ---------------------===//
//
// Helpers over the tables of the NIC part (model/NicPart.cpp): the generic
// information, pause and driver record of a NIC, its packet counters, SR-IOV
// virtual functions, uplink attachments and per-VLAN counters. The host
// library's NIC operations and the part's import both go through these, so
// that the host enforces the same invariants whatever changes it.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/PnicRecords.h"
#include "HostCtl/Network/Sriov.h"
#include "model/Store.h"

#include <array>
#include <cstdint>
#include <string>

namespace Model {

/// One counter of a record: its key in the host description and its member.
template <typename Record> struct CounterKey {
  const char* key;          ///< Key in the host description.
  uint64_t Record::*member; ///< Member of the record.
};

/// The counters of a NIC, in record order.
extern const std::array<CounterKey<HostCtl::Network::PnicStats>, 24> kPnicStatsKeys;
/// The counters of a virtual function, in record order.
extern const std::array<CounterKey<HostCtl::Network::SriovNicVFStats>, 20> kVfStatsKeys;

/// The stored settings of a NIC that PnicInfo and the pause record carry.
struct NicSettings {
  HostCtl::Network::PnicInfo info;         ///< Changed flags and link status unused.
  HostCtl::Network::PnicPauseParams pause; ///< Resolutions unused.
  std::string driverVersion;               ///< Driver version text.
  std::string firmwareVersion;             ///< Firmware version text.
};

/// Reads the settings of NIC \p nic (defaults when it has none stored).
NicSettings LoadNicSettings(Store& store, const std::string& nic);
/// Stores the settings of NIC \p nic (inside a write).
void SaveNicSettings(Store& store, const std::string& nic, const NicSettings& settings);

/// Whether the host has a physical NIC of that name.
bool PnicExists(Store& store, const std::string& nic);

/// Attaches \p branch to \p trunk under \p vlanId, enforcing the host's rules
/// (both are NICs, they differ, the VLAN ID is in 1..4094, a branch has one
/// trunk, a trunk is no branch and a branch no trunk, one branch per VLAN of
/// a trunk). Throws HostCtlException on a violation. Call inside a write.
void AddAttachment(Store& store, const std::string& trunk, const std::string& branch,
                   int64_t vlanId);

} // namespace Model
