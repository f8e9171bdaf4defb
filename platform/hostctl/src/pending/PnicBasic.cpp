//===- PnicBasic.cpp - NIC information operations awaiting their model ----===//
//
// Interim definitions: these operations answer with one clear refusal until
// the NIC information model is built.
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

void PnicImpl::GetPnicInfo(PnicInfo&, int, int) const {
  Unavailable();
}
void PnicImpl::GetPauseParams(PnicPauseParams&) const {
  Unavailable();
}
void PnicImpl::GetDriverInfo(PnicDriverInfo&) const {
  Unavailable();
}
void PnicImpl::SetPnicInfo(const PnicInfo&) {
  Unavailable();
}
void PnicImpl::RestartNegotiation() {
  Unavailable();
}
void PnicImpl::AttachBranch(const std::string&, uint16_t) {
  Unavailable();
}
void PnicImpl::DetachBranch(const std::string&) {
  Unavailable();
}
std::vector<PnicAttachment> PnicImpl::GetAttachments() const {
  Unavailable();
}
void PnicImpl::GetPnicStats(PnicStats&) const {
  Unavailable();
}
void PnicImpl::SetSpeedDuplex(uint32_t, uint32_t) {
  Unavailable();
}

void PnicImpl::SetPauseParams(const PnicPauseParams&) {
  Unavailable();
}

} // namespace TvkCtl::Network
