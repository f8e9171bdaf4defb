//===- TvkCtl/System/SystemInfoImpl.h - System information of the host ----===//
#pragma once

#include "HostCtl/System/SystemInfo.h"
#include "backend/Backend.h"

namespace Sim {

/// The system-information root of the simulated host.
class SystemInfoImpl : public HostCtl::Backend::System {
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
  bool AreFirewallFiltersActive() override;
};

} // namespace Sim
