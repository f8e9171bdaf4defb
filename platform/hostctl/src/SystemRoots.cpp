//===- SystemRoots.cpp - Handles on the system roots and host entry points -===//
#include "HostCtl/Host.h"
#include "HostCtl/SmartNic.h"
#include "TvkCtl/Resource/ResourceInfoImpl.h"
#include "TvkCtl/Resource/WorldImpl.h"
#include "TvkCtl/System/ModuleImpl.h"
#include "TvkCtl/System/SystemInfoImpl.h"
#include "TvkCtl/Util.h"
#include "backend/Backend.h"

namespace TvkCtl::System {

using HostCtl::Backend::Current;

SystemInfoImpl::SystemInfoImpl() : ops_(Current().MakeSystem()) {}
SystemInfoImpl::~SystemInfoImpl() = default;

bool SystemInfoImpl::IsFirewallEnabled() {
  return ops_->IsFirewallEnabled();
}
bool SystemInfoImpl::GetFirewallDefaultAction() {
  return ops_->GetFirewallDefaultAction();
}
void SystemInfoImpl::SetFirewallEnabled(bool enabled) {
  ops_->SetFirewallEnabled(enabled);
}
void SystemInfoImpl::SetFirewallDefaultAction(bool pass) {
  ops_->SetFirewallDefaultAction(pass);
}
void SystemInfoImpl::LoadFirewallRulesets() {
  ops_->LoadFirewallRulesets();
}
void SystemInfoImpl::DestroyFirewallFilters() {
  ops_->DestroyFirewallFilters();
}
std::vector<std::unique_ptr<HostCtl::System::FirewallRuleset>>
SystemInfoImpl::GetFirewallRulesets() {
  return ops_->GetFirewallRulesets();
}
std::unique_ptr<HostCtl::System::FirewallRuleset>
SystemInfoImpl::GetFirewallRulesetById(const std::string& id) {
  return ops_->GetFirewallRulesetById(id);
}
bool SystemInfoImpl::AreFirewallFiltersActive() {
  return ops_->AreFirewallFiltersActive();
}

ModuleImpl::ModuleImpl(std::string name)
    : name_(std::move(name)), ops_(Current().MakeModule(name_)) {}
ModuleImpl::~ModuleImpl() = default;

bool ModuleImpl::IsLoaded() {
  return ops_->IsLoaded();
}
void ModuleImpl::Refresh() {
  ops_->Refresh();
}
void ModuleImpl::Load(const std::string& options, bool force) {
  ops_->Load(options, force);
}
void ModuleImpl::Unload() {
  ops_->Unload();
}

} // namespace TvkCtl::System

namespace TvkCtl::Resource {

ResourceInfoImpl::ResourceInfoImpl() : ops_(HostCtl::Backend::Current().MakeResource()) {}
ResourceInfoImpl::~ResourceInfoImpl() = default;

std::string ResourceInfoImpl::GetWorldName(int64_t worldId) {
  return ops_->GetWorldName(worldId);
}

WorldImpl::WorldImpl(int64_t worldId) : worldId_(worldId) {}

std::string WorldImpl::GetWorldName() const {
  return HostCtl::Backend::Current().GetWorldName(worldId_);
}

} // namespace TvkCtl::Resource

namespace TvkCtl::Util {

std::string MakeChildRpTvkOption(int pool) {
  return "++respool=host/system/tvkservices/child" + std::to_string(pool);
}

int TvkCtl_Exec(const std::string& command, bool background, bool wait, bool captureOutput) {
  return HostCtl::Backend::Current().Exec(command, background, wait, captureOutput);
}

} // namespace TvkCtl::Util

namespace HostCtl {

namespace {

/// The host object: its roots are the session's host's.
class SessionHost : public Host {
public:
  std::unique_ptr<Network::NetworkInfo> GetNetworkInfo() override {
    return Backend::Current().MakeNetwork();
  }
  std::unique_ptr<System::SystemInfo> GetSystemInfo() override {
    return Backend::Current().MakeSystem();
  }
};

} // namespace

std::unique_ptr<Host> HostFactory::GetHost() {
  return std::make_unique<SessionHost>();
}

std::unique_ptr<SmartNic::SmartNic>
SmartNic::SmartNicInfo::GetSmartNicByPnic(const std::string& pnicName) {
  return Backend::Current().GetSmartNicByPnic(pnicName);
}

} // namespace HostCtl
