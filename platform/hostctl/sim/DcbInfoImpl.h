//===- TvkCtl/Network/DcbInfoImpl.h - DCB state of one NIC ----------------===//
//
// DcbInfoImpl reads the Data Center Bridging state of one physical NIC of the
// simulated host. Every operation reads the host when called; a NIC that does
// not exist or has no DCB support makes it throw HostCtlException.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/DcbRecords.h"
#include "backend/Backend.h"

#include <cstdint>
#include <string>
#include <vector>

namespace Sim {

class DcbInfoImpl : public HostCtl::Backend::Dcb {
public:
  /// The DCB state of NIC \p nic; nothing is read until an operation is called.
  explicit DcbInfoImpl(std::string nic);
  ~DcbInfoImpl();

  /// A HostCtl::Network::DcbMode code.
  uint32_t GetMode() const override;
  bool IsEnabled() const override;
  HostCtl::Network::DcbCapabilities GetCapabilities() const override;
  bool IsPfcEnabled() const override;
  /// PFC enable bit per priority (bit i = priority i).
  uint8_t GetPfcConfig() const override;
  HostCtl::Network::DcbIeeeEtsConfig GetIeeeEtsConfig() const override;
  HostCtl::Network::DcbIeeePfcConfig GetIeeePfcConfig() const override;
  std::vector<HostCtl::Network::DcbAppInfo> GetAppInfo() const override;

private:
  std::string nic_; ///< NIC name.
};

} // namespace Sim
