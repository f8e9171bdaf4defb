//===- PortsetVlanStats.cpp - Per-VLAN counters of a switch's uplinks -----===//
//
// Whether a switch collects VLAN counters on one of its uplinks is the
// uplink.vlan_stats column; the counters themselves are the NIC part's
// pnic_vlan_counter rows. While collection is on, an uplink reports one entry
// per VLAN it has counted and per VLAN of the switch's port groups; turning
// collection off drops the counters, so they start again from zero.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "model/Store.h"
#include "sim/Switching.h"

#include <map>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::VlanStats;
using Model::Statement;
using Model::Store;

namespace {

/// Whether VLAN counting is on for uplink \p nic of switch \p portsetId;
/// throws when the NIC is no uplink of the switch.
bool VlanStatsEnabled(Store& store, int64_t portsetId, const std::string& switchName,
                      const std::string& nic) {
  Statement row = store.Prepare("SELECT vlan_stats FROM uplink WHERE portset_id = ? AND nic = ?");
  enum { kVlanStats };
  row.BindAll(portsetId, nic);
  if (!row.Step())
    throw HostCtlException(nic + " is not an uplink of virtual switch " + switchName);
  return row.Bool(kVlanStats);
}

} // namespace

std::vector<VlanStats> PortsetImpl::GetVlanStats(const std::string& nicName) const {
  Store& store = Store::Host();
  store.CheckFault("GetVlanStats", nicName);
  return store.Read([&] {
    std::vector<VlanStats> stats;
    if (!VlanStatsEnabled(store, data_.id, data_.name, nicName))
      return stats;
    std::map<uint16_t, VlanStats> byVlan;
    {
      Statement groups = store.Prepare("SELECT DISTINCT vlan_id FROM portgroup WHERE portset_id = "
                                       "? AND vlan_id BETWEEN 1 AND 4094");
      enum { kVlanId };
      groups.Bind(1, data_.id);
      while (groups.Step()) {
        auto vlan = static_cast<uint16_t>(groups.Int(kVlanId));
        byVlan[vlan] = {vlan, 0, 0};
      }
    }
    Statement counters = store.Prepare(
        "SELECT vlan_id, rx_packets, tx_packets FROM pnic_vlan_counter WHERE nic = ?");
    enum { kCountersVlanId, kCountersRxPackets, kCountersTxPackets };
    counters.Bind(1, nicName);
    while (counters.Step()) {
      auto vlan = static_cast<uint16_t>(counters.Int(kCountersVlanId));
      byVlan[vlan] = {vlan, static_cast<uint64_t>(counters.Int(kCountersRxPackets)),
                      static_cast<uint64_t>(counters.Int(kCountersTxPackets))};
    }
    for (const auto& [vlan, entry] : byVlan)
      stats.push_back(entry);
    return stats;
  });
}

void PortsetImpl::SetVlanStatsEnabled(const std::string& nicName, bool enabled) {
  Store& store = Store::Host();
  store.CheckFault("SetVlanStatsEnabled", nicName);
  store.Write([&] {
    bool current = VlanStatsEnabled(store, data_.id, data_.name, nicName);
    store.Prepare("UPDATE uplink SET vlan_stats = ? WHERE portset_id = ? AND nic = ?")
        .BindAll(enabled, data_.id, nicName)
        .Run();
    if (current && !enabled)
      store.Prepare("DELETE FROM pnic_vlan_counter WHERE nic = ?").BindAll(nicName).Run();
  });
}

} // namespace Sim
