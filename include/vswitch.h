//===- vswitch.h - Virtual switching command classes ----------------------===//
//
// The command classes of `network vswitch`: one block per class, grouped
// by family in the order of the family source files of src/vswitch/. Each
// class is defined in its family file.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "CommandBase.h"

#include "HostCtl/Network/Switching.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace CorvexCli::NetworkNamespace {

// Standard virtual switches and their uplinks (Standard.cpp).

/// network vswitch standard add
class VirtualSwitchStandardAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardAdd)
};

/// network vswitch standard set
class VirtualSwitchStandardSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardSet)
};

/// network vswitch standard list
class VirtualSwitchStandardList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch standard remove
class VirtualSwitchStandardRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardRemove)
};

/// network vswitch standard uplink add
class VirtualSwitchStandardUplinkAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardUplinkAdd)
};

/// network vswitch standard uplink remove
class VirtualSwitchStandardUplinkRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardUplinkRemove)
};

// Standard virtual switch policies (SwitchPolicy.cpp).

/// network vswitch standard policy shaping get
class VirtualSwitchStandardPolicyShapingGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardPolicyShapingGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch standard policy shaping set
class VirtualSwitchStandardPolicyShapingSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardPolicyShapingSet)
};

/// network vswitch standard policy security get
class VirtualSwitchStandardPolicySecurityGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardPolicySecurityGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch standard policy security set
class VirtualSwitchStandardPolicySecuritySet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardPolicySecuritySet)
};

/// network vswitch standard policy failover get
class VirtualSwitchStandardPolicyFailoverGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardPolicyFailoverGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch standard policy failover set
class VirtualSwitchStandardPolicyFailoverSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchStandardPolicyFailoverSet)
};

// Port groups and their policies (PortGroup.cpp).

/// network vswitch standard portgroup list
class VirtualSwitchPortGroupList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchPortGroupList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch standard portgroup add
class VirtualSwitchPortGroupAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchPortGroupAdd)
};

/// network vswitch standard portgroup remove
class VirtualSwitchPortGroupRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchPortGroupRemove)
};

/// network vswitch standard portgroup set
class VirtualSwitchPortGroupSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchPortGroupSet)
};

/// network vswitch standard portgroup policy shaping get
class VirtualSwitchPortGroupPolicyShapingGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchPortGroupPolicyShapingGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch standard portgroup policy shaping set
class VirtualSwitchPortGroupPolicyShapingSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchPortGroupPolicyShapingSet)
};

/// network vswitch standard portgroup policy failover get
class VirtualSwitchPortGroupPolicyFailoverGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchPortGroupPolicyFailoverGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch standard portgroup policy failover set
class VirtualSwitchPortGroupPolicyFailoverSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchPortGroupPolicyFailoverSet)
};

/// network vswitch standard portgroup policy security get
class VirtualSwitchPortGroupPolicySecurityGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchPortGroupPolicySecurityGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch standard portgroup policy security set
class VirtualSwitchPortGroupPolicySecuritySet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchPortGroupPolicySecuritySet)
};

// Distributed switch list (Dvs.cpp).

/// network vswitch dvs corvex list
class VirtualSwitchDVSCorvexList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VirtualSwitchDVSCorvexList)
  CORVEX_OUTPUT_STRUCTURE
  /// The template of one distributed port of a row.
  std::shared_ptr<Fabrik::MetaObj::MetaStruct> GetDVPortStructure();
  /// The "DVPort" values of \p ports, in order.
  std::shared_ptr<Fabrik::MetaObj::MetaList>
  GetDVPortList(const std::vector<std::unique_ptr<HostCtl::Network::DVPort>>& ports);
};

// LACP (Lacp.cpp).

/// network vswitch dvs corvex lacp config get
class LacpGetConfig : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(LacpGetConfig)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch dvs corvex lacp status get
class LacpGetStatus : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(LacpGetStatus)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch dvs corvex lacp stats get
class LacpGetStats : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(LacpGetStats)
  CORVEX_OUTPUT_STRUCTURE
};

/// network vswitch dvs corvex lacp timeout set
class LacpSetTimeout : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(LacpSetTimeout)
};

/// The names of the set bits of LACP state \p state ("ACT" for bit 0 to
/// "EXP" for bit 7), each followed by ",".
std::string LacpPortStateToString(uint8_t state);
/// A partner age in seconds as hours:minutes:seconds, two digits at least each.
std::string LacpAgeToString(uint32_t seconds);
/// The name of load-balancing index \p index of a LAG.
std::string LacpLoadBalanceToString(uint32_t index);

} // namespace CorvexCli::NetworkNamespace
