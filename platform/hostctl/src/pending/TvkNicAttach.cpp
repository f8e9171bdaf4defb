//===- TvkNicAttach.cpp - Interface attachment awaiting connection points -===//
//
// Interim definitions: attaching kernel interfaces to connection points needs
// the switching model's connection points; until then these operations answer
// with one clear refusal.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "TvkCtl/Network/TvkNicImpl.h"

namespace TvkCtl::Network {

using HostCtl::Lib::HostCtlException;

namespace {
[[noreturn]] void Unavailable() {
  throw HostCtlException("This operation is not available on this host yet");
}
} // namespace

std::unique_ptr<HostCtl::Network::ConnectionPoint> TvkNicImpl::GetConnectionPoint() {
  Unavailable();
}

std::unique_ptr<HostCtl::Network::TvkNic> TvKernelNicInfoImpl::AddTvKernelNic(
    HostCtl::Network::ConnectionPoint*, const std::string&, const HostCtl::Network::IpConfig&,
    const HostCtl::Network::MacAddress&, uint32_t, uint32_t, uint32_t, const std::string&, bool) {
  Unavailable();
}

void TvKernelNicInfoImpl::RemoveTvKernelNic(HostCtl::Network::ConnectionPoint*,
                                            const std::string&) {
  Unavailable();
}

} // namespace TvkCtl::Network
