//===- TvkCtl/System/FirewallRulesetImpl.h - A firewall ruleset -----------===//
#pragma once

#include "HostCtl/System/FirewallRuleset.h"

namespace Sim {

/// A ruleset of the simulated host, identified by its label. Every operation
/// except GetRulesetId reads or changes the host; operations other than
/// GetRulesetId and IsValid on a label that names no ruleset throw
/// HostCtlException.
class FirewallRulesetImpl : public HostCtl::System::FirewallRuleset {
public:
  explicit FirewallRulesetImpl(std::string id);
  ~FirewallRulesetImpl() override;

  std::string GetRulesetId() const override { return id_; }
  bool IsEnabled() const override;
  void Enable() override;
  int64_t GetClientCount() const override;
  void AddClient() override;
  void RemoveClient() override;
  void Disable() override;
  std::vector<std::unique_ptr<HostCtl::System::FirewallPortRule>> GetRules() const override;
  std::unique_ptr<HostCtl::System::FirewallAllowedIps> GetAllowedIps() const override;
  void AddAllowedIp(const std::string& text) override;
  void RemoveAllowedIp(const std::string& text) override;
  bool IsValid() const override;
  void SetAllowedAll(bool allowed) override;
  bool IsAllowedAll() const override;
  void CheckConfigurable(int kind, bool system) const override;
  bool IsEnableDisableFixed() const override;
  bool IsAllowedIpFixed() const override;

private:
  std::string id_; ///< The ruleset's label.
};

} // namespace Sim
