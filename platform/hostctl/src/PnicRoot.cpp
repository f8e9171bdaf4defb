//===- PnicRoot.cpp - Handle on a physical NIC of the host ----------------===//
#include "TvkCtl/Network/PnicImpl.h"

#include "backend/Backend.h"

namespace TvkCtl::Network {

using HostCtl::Backend::Current;

PnicImpl::PnicImpl(const std::string& name) : ops_(Current().MakePnic(name)) {}
PnicImpl::~PnicImpl() = default;

bool PnicImpl::IsValidPnic(const std::string& name) {
  return Current().IsValidPnic(name);
}

std::string PnicImpl::GetHwCapName(int bit) {
  return Current().GetHwCapName(bit);
}

void PnicImpl::Refresh() {
  ops_->Refresh();
}
std::string PnicImpl::GetName() const {
  return ops_->GetName();
}
std::unique_ptr<HostCtl::Network::PciDevice> PnicImpl::GetPciDevice() const {
  return ops_->GetPciDevice();
}
uint32_t PnicImpl::GetDuplex() const {
  return ops_->GetDuplex();
}
bool PnicImpl::IsLinkUp() const {
  return ops_->IsLinkUp();
}
bool PnicImpl::IsLinkStatusUp() const {
  return ops_->IsLinkStatusUp();
}
bool PnicImpl::IsAdminUp() const {
  return ops_->IsAdminUp();
}
uint32_t PnicImpl::GetSpeed() const {
  return ops_->GetSpeed();
}
void PnicImpl::SetSpeedDuplex(uint32_t speed, uint32_t duplex) {
  ops_->SetSpeedDuplex(speed, duplex);
}
std::string PnicImpl::GetDriverName() const {
  return ops_->GetDriverName();
}
HostCtl::Network::MacAddress PnicImpl::GetMacAddress() const {
  return ops_->GetMacAddress();
}
void PnicImpl::SetAdminStatus(bool up) {
  ops_->SetAdminStatus(up);
}
uint32_t PnicImpl::GetMtu() const {
  return ops_->GetMtu();
}
std::string PnicImpl::GetPseudoDeviceDescription() const {
  return ops_->GetPseudoDeviceDescription();
}
void PnicImpl::GetPnicInfo(HostCtl::Network::PnicInfo& info, int flags, int reserved) const {
  ops_->GetPnicInfo(info, flags, reserved);
}
void PnicImpl::GetPauseParams(HostCtl::Network::PnicPauseParams& params) const {
  ops_->GetPauseParams(params);
}
void PnicImpl::GetDriverInfo(HostCtl::Network::PnicDriverInfo& info) const {
  ops_->GetDriverInfo(info);
}
void PnicImpl::GetHwCapabilities(HostCtl::Network::PnicHwCapabilities& caps) const {
  ops_->GetHwCapabilities(caps);
}
void PnicImpl::SetPnicInfo(const HostCtl::Network::PnicInfo& info) {
  ops_->SetPnicInfo(info);
}
void PnicImpl::RestartNegotiation() {
  ops_->RestartNegotiation();
}
void PnicImpl::AttachBranch(const std::string& branch, uint16_t vlanId) {
  ops_->AttachBranch(branch, vlanId);
}
void PnicImpl::DetachBranch(const std::string& branch) {
  ops_->DetachBranch(branch);
}
std::vector<HostCtl::Network::PnicAttachment> PnicImpl::GetAttachments() const {
  return ops_->GetAttachments();
}
void PnicImpl::GetPnicStats(HostCtl::Network::PnicStats& stats) const {
  ops_->GetPnicStats(stats);
}
void PnicImpl::GetOffloadSettings(HostCtl::Network::PnicOffloadSettings& settings) const {
  ops_->GetOffloadSettings(settings);
}
void PnicImpl::SetOffloadSettings(const HostCtl::Network::PnicOffloadSettings& settings) {
  ops_->SetOffloadSettings(settings);
}
void PnicImpl::GetCoalesceParams(HostCtl::Network::PnicCoalesceParams& params) const {
  ops_->GetCoalesceParams(params);
}
void PnicImpl::SetCoalesceParams(const HostCtl::Network::PnicCoalesceParams& params) {
  ops_->SetCoalesceParams(params);
}
void PnicImpl::GetRingParams(HostCtl::Network::PnicRingParams& maximums,
                             HostCtl::Network::PnicRingParams& current) const {
  ops_->GetRingParams(maximums, current);
}
void PnicImpl::SetRingParams(const HostCtl::Network::PnicRingParams& params) {
  ops_->SetRingParams(params);
}
void PnicImpl::SetPauseParams(const HostCtl::Network::PnicPauseParams& params) {
  ops_->SetPauseParams(params);
}
void PnicImpl::GetNetqueueInfo(HostCtl::Network::PnicNetqueueInfo& info) const {
  ops_->GetNetqueueInfo(info);
}
void PnicImpl::SetNetqueueInfo(const HostCtl::Network::PnicNetqueueInfo& info) {
  ops_->SetNetqueueInfo(info);
}
void PnicImpl::GetSoftwareSimulation(HostCtl::Network::PnicSoftwareSimulation& settings) const {
  ops_->GetSoftwareSimulation(settings);
}
void PnicImpl::SetSoftwareSimulation(const HostCtl::Network::PnicSoftwareSimulation& settings) {
  ops_->SetSoftwareSimulation(settings);
}
void PnicImpl::GetEepromDump(std::vector<uint8_t>& data, uint32_t length, uint32_t offset) const {
  ops_->GetEepromDump(data, length, offset);
}
void PnicImpl::SetEepromValue(uint32_t magic, uint32_t offset, uint32_t value) {
  ops_->SetEepromValue(magic, offset, value);
}
void PnicImpl::SetEepromFromFile(uint32_t magic, const std::string& file) {
  ops_->SetEepromFromFile(magic, file);
}
void PnicImpl::GetRegisterDump(std::vector<uint32_t>& words) const {
  ops_->GetRegisterDump(words);
}
void PnicImpl::RunSelfTest(HostCtl::Network::PnicSelfTestResult& result, bool online) {
  ops_->RunSelfTest(result, online);
}
std::unique_ptr<HostCtl::Network::Port> PnicImpl::GetPort() const {
  return ops_->GetPort();
}

} // namespace TvkCtl::Network
