//===- PnicHw.cpp - NIC hardware operations awaiting their model ----------===//
//
// Interim definitions: these operations answer with one clear refusal until
// the NIC hardware model is built.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "TvkCtl/Network/PnicImpl.h"

namespace TvkCtl::Network {

using HostCtl::Lib::HostCtlException;
using namespace HostCtl::Network;

namespace {
[[noreturn]] void Unavailable() {
  throw HostCtlException("This operation is not available on this host yet");
}
} // namespace

void PnicImpl::GetOffloadSettings(PnicOffloadSettings&) const {
  Unavailable();
}
void PnicImpl::SetOffloadSettings(const PnicOffloadSettings&) {
  Unavailable();
}
void PnicImpl::GetCoalesceParams(PnicCoalesceParams&) const {
  Unavailable();
}
void PnicImpl::SetCoalesceParams(const PnicCoalesceParams&) {
  Unavailable();
}
void PnicImpl::GetRingParams(PnicRingParams&, PnicRingParams&) const {
  Unavailable();
}
void PnicImpl::SetRingParams(const PnicRingParams&) {
  Unavailable();
}
void PnicImpl::GetNetqueueInfo(PnicNetqueueInfo&) const {
  Unavailable();
}
void PnicImpl::SetNetqueueInfo(const PnicNetqueueInfo&) {
  Unavailable();
}
void PnicImpl::GetSoftwareSimulation(PnicSoftwareSimulation&) const {
  Unavailable();
}
void PnicImpl::SetSoftwareSimulation(const PnicSoftwareSimulation&) {
  Unavailable();
}
void PnicImpl::GetEepromDump(std::vector<uint8_t>&, uint32_t, uint32_t) const {
  Unavailable();
}
void PnicImpl::SetEepromValue(uint32_t, uint32_t, uint32_t) {
  Unavailable();
}
void PnicImpl::SetEepromFromFile(uint32_t, const std::string&) {
  Unavailable();
}
void PnicImpl::GetRegisterDump(std::vector<uint32_t>&) const {
  Unavailable();
}
void PnicImpl::RunSelfTest(PnicSelfTestResult&, bool) {
  Unavailable();
}

void PnicImpl::GetHwCapabilities(PnicHwCapabilities&) const {
  Unavailable();
}
std::string PnicImpl::GetHwCapName(int) {
  Unavailable();
}

} // namespace TvkCtl::Network
