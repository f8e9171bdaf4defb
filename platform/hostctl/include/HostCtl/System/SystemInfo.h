//===- HostCtl/System/SystemInfo.h - System information of the host -------===//
//
// The system-information root holds the host firewall's global state (enabled
// flag, default action, filters) and its rulesets.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/System/FirewallRuleset.h"

#include <memory>
#include <string>
#include <vector>

namespace HostCtl::System {

/// Name of the firewall's kernel module.
inline constexpr const char* FirewallModuleName = "ostrafw";

class SystemInfo {
public:
  virtual ~SystemInfo() = default;

  /// Whether the firewall is enabled.
  virtual bool IsFirewallEnabled() = 0;
  /// True when the default action is PASS, false for DROP.
  virtual bool GetFirewallDefaultAction() = 0;
  /// Enables or disables the firewall; refused when the module is not loaded.
  virtual void SetFirewallEnabled(bool enabled) = 0;
  /// Sets the default action (true PASS, false DROP); refused when the module
  /// is not loaded.
  virtual void SetFirewallDefaultAction(bool pass) = 0;
  /// Rebuilds the firewall's filters from the ruleset configuration; refused
  /// when the module is not loaded.
  virtual void LoadFirewallRulesets() = 0;
  /// Removes the firewall's filters; refused when the module is not loaded.
  virtual void DestroyFirewallFilters() = 0;
  /// Every ruleset, in the host's order.
  virtual std::vector<std::unique_ptr<FirewallRuleset>> GetFirewallRulesets() = 0;
  /// The ruleset with label \p id; when there is none the object's IsValid()
  /// answers false.
  virtual std::unique_ptr<FirewallRuleset> GetFirewallRulesetById(const std::string& id) = 0;
};

} // namespace HostCtl::System
