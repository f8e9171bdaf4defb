//===- firewall.h - Host firewall command classes -------------------------===//
//
// The command classes of `network firewall`: one block per class, grouped
// by family in the order of the family source files of src/firewall/.
// Each class is defined in its family file.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "CommandBase.h"

#include <memory>
#include <vector>

namespace HostCtl::System {
class FirewallRuleset;
class SystemInfo;
} // namespace HostCtl::System

namespace CorvexCli::NetworkNamespace {

// Firewall state (Firewall.cpp).

/// network firewall get
class FirewallGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network firewall set
class FirewallSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallSet)
};

/// network firewall load
class FirewallLoad : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallLoad)
};

/// network firewall refresh
class FirewallRefresh : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallRefresh)
};

/// network firewall unload
class FirewallUnload : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallUnload)
};

// Firewall rulesets and rules (Ruleset.cpp).

/// network firewall ruleset list
class FirewallRulesetList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallRulesetList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network firewall ruleset set
class FirewallRulesetSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallRulesetSet)
};

/// network firewall ruleset rule list
class FirewallRulesetRuleList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallRulesetRuleList)
  CORVEX_OUTPUT_STRUCTURE
};

// Ruleset allowed IPs and clients (AllowedIp.cpp).

/// network firewall ruleset allowedip list
class FirewallRulesetAllowedipList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallRulesetAllowedipList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network firewall ruleset allowedip add
class FirewallRulesetAllowedipAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallRulesetAllowedipAdd)
};

/// network firewall ruleset allowedip remove
class FirewallRulesetAllowedipRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallRulesetAllowedipRemove)
};

/// network firewall ruleset client get
class FirewallRulesetClientGet : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallRulesetClientGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network firewall ruleset client add
class FirewallRulesetClientAdd : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallRulesetClientAdd)
};

/// network firewall ruleset client remove
class FirewallRulesetClientRemove : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(FirewallRulesetClientRemove)
};

} // namespace CorvexCli::NetworkNamespace
