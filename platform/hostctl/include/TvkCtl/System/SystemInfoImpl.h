//===- TvkCtl/System/SystemInfoImpl.h - System information of the host ----===//
//
// A handle: every operation is the session's host's.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/System/SystemInfo.h"

namespace HostCtl::Backend {
class System;
} // namespace HostCtl::Backend

namespace TvkCtl::System {

/// The system-information root of the host.
class SystemInfoImpl : public HostCtl::System::SystemInfo {
public:
  SystemInfoImpl();
  ~SystemInfoImpl() override;

  bool IsFirewallEnabled() override;
  bool GetFirewallDefaultAction() override;
  void SetFirewallEnabled(bool enabled) override;
  void SetFirewallDefaultAction(bool pass) override;
  void LoadFirewallRulesets() override;
  void DestroyFirewallFilters() override;
  std::vector<std::unique_ptr<HostCtl::System::FirewallRuleset>> GetFirewallRulesets() override;
  std::unique_ptr<HostCtl::System::FirewallRuleset>
  GetFirewallRulesetById(const std::string& id) override;

  /// Whether the firewall's filters are in place (built by
  /// LoadFirewallRulesets, removed by DestroyFirewallFilters).
  bool AreFirewallFiltersActive();

private:
  std::unique_ptr<HostCtl::Backend::System> ops_; ///< The host's operations.
};

} // namespace TvkCtl::System
