//===- SystemInfoImpl.cpp - Firewall state and the host object -------------===//
#include "sim/SystemInfoImpl.h"

#include "HostCtl/Lib.h"
#include "HostCtl/System/Host.h"
#include "model/FirewallModel.h"
#include "sim/FirewallRulesetImpl.h"

namespace Sim {

using HostCtl::Lib::HostCtlException;
using HostCtl::System::FirewallModuleName;
using HostCtl::System::FirewallRuleset;
using Model::Statement;
using Model::Store;

namespace {

/// Refuses a firewall operation while the firewall module is not loaded.
void RequireModule(Store& store) {
  if (!Model::IsFirewallModuleLoaded(store))
    throw HostCtlException(std::string("The firewall module ") + FirewallModuleName +
                           " is not loaded");
}

/// One column of the firewall's state row.
bool ReadState(const char* operation, const char* sql) {
  Store& store = Store::Host();
  store.CheckFault(operation, FirewallModuleName);
  return store.Read([&] {
    Statement row = store.Prepare(sql);
    enum { kState };
    if (!row.Step())
      throw HostCtlException("The host has no firewall state");
    return row.Bool(kState);
  });
}

/// Changes one column of the firewall's state row, with the module loaded.
void WriteState(const char* operation, const char* sql, bool value) {
  Store& store = Store::Host();
  store.CheckFault(operation, FirewallModuleName);
  store.Write([&] {
    RequireModule(store);
    store.Prepare(sql).Bind(1, value).Run();
  });
}

} // namespace

SystemInfoImpl::SystemInfoImpl() = default;
SystemInfoImpl::~SystemInfoImpl() = default;

bool SystemInfoImpl::IsFirewallEnabled() {
  return ReadState("IsFirewallEnabled", "SELECT value FROM setting WHERE key = 'firewall.enabled'");
}

bool SystemInfoImpl::GetFirewallDefaultAction() {
  return ReadState("GetFirewallDefaultAction",
                   "SELECT value FROM setting WHERE key = 'firewall.defaultPass'");
}

bool SystemInfoImpl::AreFirewallFiltersActive() {
  return ReadState("AreFirewallFiltersActive",
                   "SELECT value FROM setting WHERE key = 'firewall.filtersActive'");
}

void SystemInfoImpl::SetFirewallEnabled(bool enabled) {
  WriteState("SetFirewallEnabled", "UPDATE setting SET value = ? WHERE key = 'firewall.enabled'",
             enabled);
}

void SystemInfoImpl::SetFirewallDefaultAction(bool pass) {
  WriteState("SetFirewallDefaultAction",
             "UPDATE setting SET value = ? WHERE key = 'firewall.defaultPass'", pass);
}

void SystemInfoImpl::LoadFirewallRulesets() {
  // The simulated firewall applies ruleset changes at once; loading the
  // configuration puts the filters (back) in place. Without the module there
  // is nothing to load it into: the module reads the configuration when it is
  // loaded, so this changes nothing then.
  Store& store = Store::Host();
  store.CheckFault("LoadFirewallRulesets", FirewallModuleName);
  store.Write([&] {
    if (Model::IsFirewallModuleLoaded(store))
      store.Prepare("UPDATE setting SET value = 1 WHERE key = 'firewall.filtersActive'").Run();
  });
}

void SystemInfoImpl::DestroyFirewallFilters() {
  WriteState("DestroyFirewallFilters",
             "UPDATE setting SET value = ? WHERE key = 'firewall.filtersActive'", false);
}

std::vector<std::unique_ptr<FirewallRuleset>> SystemInfoImpl::GetFirewallRulesets() {
  Store& store = Store::Host();
  store.CheckFault("GetFirewallRulesets", "*");
  std::vector<std::unique_ptr<FirewallRuleset>> sets;
  store.Read([&] {
    Statement rows = store.Prepare("SELECT id FROM fw_ruleset ORDER BY ord");
    enum { kId };
    while (rows.Step())
      sets.push_back(std::make_unique<FirewallRulesetImpl>(rows.Text(kId)));
  });
  return sets;
}

std::unique_ptr<FirewallRuleset> SystemInfoImpl::GetFirewallRulesetById(const std::string& id) {
  Store::Host().CheckFault("GetFirewallRulesetById", id);
  return std::make_unique<FirewallRulesetImpl>(id);
}

} // namespace Sim
