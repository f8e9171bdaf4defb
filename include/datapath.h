//===- datapath.h - Datapath and fast-path command classes ----------------===//
//
// The command classes of `network vm`, `network port`, `network multicast`
// and `network ens`: one block per class, grouped by family in the order of
// the family source files of src/datapath/. Each class is defined in its
// family file.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "common/CommandBase.h"

namespace CorvexCli::NetworkNamespace {

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
