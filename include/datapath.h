//===- datapath.h - Datapath and fast-path command classes ----------------===//
//
// The command classes of `network vm`, `network port`, `network multicast`
// and `network ens`: one block per class, grouped by family in the order of
// the family source files of src/datapath/. Each class is defined in its
// family file.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "CommandBase.h"

#include <cstdint>
#include <string>

namespace HostCtl::Network {
struct FilterStats;
} // namespace HostCtl::Network

namespace CorvexCli::NetworkNamespace {

/// The VM name shown for world name \p worldName: the name without its first
/// five characters (the host's world prefix); empty for a shorter name.
std::string VmNameFromWorldName(const std::string& worldName);

/// Less-than of port filters: filters with the direction flag clear come
/// first, in ascending byte order of their sort keys, then those with the
/// flag set, in descending byte order of their sort keys.
bool sortFilterStats(const HostCtl::Network::FilterStats& a,
                     const HostCtl::Network::FilterStats& b);

/// Unicast packets: \p total less multicast and broadcast packets, in
/// unsigned 64-bit arithmetic.
uint64_t UnicastPackets(uint64_t total, uint64_t multicast, uint64_t broadcast);

// VMs and their ports (Vm.cpp).

/// network vm list
class VMList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VMList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vm port list
class VMPortList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VMPortList)
  CORVEX_OUTPUT_STRUCTURE
};

// Port and port filter statistics (PortStats.cpp).

/// network port stats get
class PortStatsGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(PortStatsGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network port filter stats get
class PortFilterStatsGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(PortFilterStatsGet)
  CORVEX_OUTPUT_STRUCTURE
};

// Multicast groups (Multicast.cpp).

/// network multicast group list
class MulticastGroupList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(MulticastGroupList)
  CORVEX_OUTPUT_STRUCTURE
};

// Fast-path logical cores (Ens.cpp).

/// network ens maxLcores get
class EnsMaxlcoresGet : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(EnsMaxlcoresGet)
};

/// network ens maxLcores set
class EnsMaxlcoresSet : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(EnsMaxlcoresSet)
};

/// network ens lcore add
class EnsLcoreAdd : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(EnsLcoreAdd)
};

/// network ens lcore remove
class EnsLcoreRemove : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(EnsLcoreRemove)
};

/// network ens lcore list
class EnsLcoreList : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(EnsLcoreList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ens lcore switch get
class EnsLcoreSwitchGet : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(EnsLcoreSwitchGet)
};

/// network ens lcore switch add
class EnsLcoreSwitchAdd : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(EnsLcoreSwitchAdd)
};

/// network ens lcore switch remove
class EnsLcoreSwitchRemove : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(EnsLcoreSwitchRemove)
};

/// network ens lcore affinity get
class EnsLcoreAffinityGet : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(EnsLcoreAffinityGet)
};

/// network ens lcore affinity set
class EnsLcoreAffinitySet : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(EnsLcoreAffinitySet)
};

} // namespace CorvexCli::NetworkNamespace
