//===- SwitchingRoots.cpp - Handles on the switching objects of the host --===//
#include "HostCtl/Network/NetworkInfo.h"
#include "TvkCtl/Network/Switching.h"
#include "backend/Backend.h"

namespace TvkCtl::Network {

using HostCtl::Backend::Current;

bool PortsetImpl::IsValidVirtualSwitch(const std::string& name) {
  return Current().IsValidVirtualSwitch(name);
}

// --- PortGroupImpl.

PortGroupImpl::PortGroupImpl(const std::string& name) : ops_(Current().MakePortGroup(name)) {}
PortGroupImpl::~PortGroupImpl() = default;

std::string PortGroupImpl::GetPortsetName() const {
  return ops_->GetPortsetName();
}
int PortGroupImpl::GetType() const {
  return ops_->GetType();
}
std::string PortGroupImpl::GetPortGroupName() const {
  return ops_->GetPortGroupName();
}
HostCtl::Network::DVPortParam PortGroupImpl::GetDVPortParam() const {
  return ops_->GetDVPortParam();
}
HostCtl::Network::OpaqueNetworkParam PortGroupImpl::GetOpaqueNetworkParam() const {
  return ops_->GetOpaqueNetworkParam();
}
bool PortGroupImpl::IsValid() const {
  return ops_->IsValid();
}
std::string PortGroupImpl::GetName() const {
  return ops_->GetName();
}
uint32_t PortGroupImpl::GetActiveClients() const {
  return ops_->GetActiveClients();
}
uint16_t PortGroupImpl::GetVlanId() const {
  return ops_->GetVlanId();
}
void PortGroupImpl::SetVlanId(uint16_t vlanId) {
  ops_->SetVlanId(vlanId);
}
std::unique_ptr<HostCtl::Network::VirtualSwitch> PortGroupImpl::GetVirtualSwitch() const {
  return ops_->GetVirtualSwitch();
}
HostCtl::Network::NicTeamingPolicy PortGroupImpl::GetNicTeamingPolicy() const {
  return ops_->GetNicTeamingPolicy();
}
HostCtl::Network::NicTeamingPolicy PortGroupImpl::GetConfiguredNicTeamingPolicy() const {
  return ops_->GetConfiguredNicTeamingPolicy();
}
void PortGroupImpl::SetNicTeamingPolicy(const HostCtl::Network::NicTeamingPolicy& policy) {
  ops_->SetNicTeamingPolicy(policy);
}
HostCtl::Network::PortSecurityPolicy PortGroupImpl::GetPortSecurityPolicy() const {
  return ops_->GetPortSecurityPolicy();
}
HostCtl::Network::PortSecurityPolicy PortGroupImpl::GetConfiguredPortSecurityPolicy() const {
  return ops_->GetConfiguredPortSecurityPolicy();
}
void PortGroupImpl::SetPortSecurityPolicy(const HostCtl::Network::PortSecurityPolicy& policy) {
  ops_->SetPortSecurityPolicy(policy);
}
HostCtl::Network::ShapingPolicy PortGroupImpl::GetTrafficShapingPolicy() const {
  return ops_->GetTrafficShapingPolicy();
}
HostCtl::Network::ShapingPolicy PortGroupImpl::GetConfiguredTrafficShapingPolicy() const {
  return ops_->GetConfiguredTrafficShapingPolicy();
}
void PortGroupImpl::SetTrafficShapingPolicy(const HostCtl::Network::ShapingPolicy& policy) {
  ops_->SetTrafficShapingPolicy(policy);
}

// --- DVPortImpl.

DVPortImpl::DVPortImpl(const HostCtl::Network::DVPortParam& param)
    : ops_(Current().MakeDVPort(param)) {}
DVPortImpl::DVPortImpl(const std::string& switchId, const std::string& dvPortId)
    : ops_(Current().MakeDVPort(switchId, dvPortId)) {}
DVPortImpl::DVPortImpl(std::unique_ptr<HostCtl::Backend::DVPort> port) : ops_(std::move(port)) {}
DVPortImpl::~DVPortImpl() = default;

std::string DVPortImpl::GetPortsetName() const {
  return ops_->GetPortsetName();
}
int DVPortImpl::GetType() const {
  return ops_->GetType();
}
std::string DVPortImpl::GetPortGroupName() const {
  return ops_->GetPortGroupName();
}
HostCtl::Network::DVPortParam DVPortImpl::GetDVPortParam() const {
  return ops_->GetDVPortParam();
}
HostCtl::Network::OpaqueNetworkParam DVPortImpl::GetOpaqueNetworkParam() const {
  return ops_->GetOpaqueNetworkParam();
}
bool DVPortImpl::IsValid() const {
  return ops_->IsValid();
}
std::string DVPortImpl::GetPortId() const {
  return ops_->GetPortId();
}
std::string DVPortImpl::GetName() const {
  return ops_->GetName();
}
std::string DVPortImpl::GetDVPortgroupId() const {
  return ops_->GetDVPortgroupId();
}
bool DVPortImpl::IsInUse(std::vector<std::string>& clients) const {
  return ops_->IsInUse(clients);
}
uint32_t DVPortImpl::GetConnectionId() const {
  return ops_->GetConnectionId();
}
void DVPortImpl::SetConnectionId(uint32_t connectionId) {
  ops_->SetConnectionId(connectionId);
}

// --- VirtualSwitchInfoImpl.

VirtualSwitchInfoImpl::VirtualSwitchInfoImpl() : ops_(Current().MakeSwitches()) {}
VirtualSwitchInfoImpl::~VirtualSwitchInfoImpl() = default;

std::vector<std::unique_ptr<HostCtl::Network::Portset>> VirtualSwitchInfoImpl::GetAllSwitches() {
  return ops_->GetAllSwitches();
}
std::vector<std::unique_ptr<HostCtl::Network::VirtualSwitch>>
VirtualSwitchInfoImpl::GetVirtualSwitches(HostCtl::Network::PortsetGetType type) {
  return ops_->GetVirtualSwitches(type);
}
std::unique_ptr<HostCtl::Network::VirtualSwitch>
VirtualSwitchInfoImpl::GetVirtualSwitchByName(const std::string& name,
                                              HostCtl::Network::PortsetGetType type) {
  return ops_->GetVirtualSwitchByName(name, type);
}
std::unique_ptr<HostCtl::Network::VirtualSwitch> VirtualSwitchInfoImpl::AddVirtualSwitchWithPolicy(
    const HostCtl::Network::NicTeamingPolicy& teaming,
    const HostCtl::Network::PortSecurityPolicy& security,
    const HostCtl::Network::ShapingPolicy& shaping,
    const HostCtl::Network::NicCapabilities& capabilities, const std::string& name,
    uint32_t ports) {
  return ops_->AddVirtualSwitchWithPolicy(teaming, security, shaping, capabilities, name, ports);
}
void VirtualSwitchInfoImpl::RemoveVirtualSwitch(const std::string& name) {
  ops_->RemoveVirtualSwitch(name);
}
std::vector<std::unique_ptr<HostCtl::Network::DVSwitch>> VirtualSwitchInfoImpl::GetDVSwitches() {
  return ops_->GetDVSwitches();
}
std::vector<std::unique_ptr<HostCtl::Network::DVSwitch>>
VirtualSwitchInfoImpl::GetOpaqueDVSwitches() {
  return ops_->GetOpaqueDVSwitches();
}
std::unique_ptr<HostCtl::Network::DVSwitch>
VirtualSwitchInfoImpl::GetDVSwitchByName(const std::string& name) {
  return ops_->GetDVSwitchByName(name);
}
bool VirtualSwitchInfoImpl::IsLegacySwitch(const std::string& name) {
  return ops_->IsLegacySwitch(name);
}
bool VirtualSwitchInfoImpl::IsDVSwitch(const std::string& name) {
  return ops_->IsDVSwitch(name);
}
bool VirtualSwitchInfoImpl::IsOpaqueSwitch(const std::string& name) {
  return ops_->IsOpaqueSwitch(name);
}

} // namespace TvkCtl::Network

namespace HostCtl::Network {

std::unique_ptr<NetworkInfo> NetworkFactory::GetNetworkInfo() {
  return HostCtl::Backend::Current().MakeNetwork();
}

std::unique_ptr<DVSwitch> NetworkFactory::GetDVSwitchByName(const std::string& name) {
  return HostCtl::Backend::Current().GetDVSwitchByName(name);
}

std::unique_ptr<VirtualSwitch> NetworkFactory::GetVirtualSwitchById(const std::string& name,
                                                                    PortsetGetType type) {
  return HostCtl::Backend::Current().GetVirtualSwitchById(name, type);
}

std::unique_ptr<PortGroup> NetworkFactory::GetPortGroupByName(const std::string& name) {
  return HostCtl::Backend::Current().GetPortGroupByName(name);
}

std::unique_ptr<DVPort> NetworkFactory::GetDVPort(const DVPortParam& param) {
  return HostCtl::Backend::Current().GetDVPort(param);
}

} // namespace HostCtl::Network
