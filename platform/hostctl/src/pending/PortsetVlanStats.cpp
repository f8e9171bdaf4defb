//===- PortsetVlanStats.cpp - VLAN counters awaiting their model ----------===//
//
// Interim definitions: the VLAN counters of uplinks answer with one clear
// refusal until the NIC counters model is built.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "TvkCtl/Network/Switching.h"

namespace TvkCtl::Network {

using HostCtl::Lib::HostCtlException;

std::vector<HostCtl::Network::VlanStats> PortsetImpl::GetVlanStats(const std::string&) const {
  throw HostCtlException("This operation is not available on this host yet");
}

void PortsetImpl::SetVlanStatsEnabled(const std::string&, bool) {
  throw HostCtlException("This operation is not available on this host yet");
}

} // namespace TvkCtl::Network
