//===- TvkCtl/Network/DcbInfoImpl.h - DCB state of one NIC ----------------===//
//
// DcbInfoImpl reads the Data Center Bridging state of one physical NIC of the
// session's host. Every operation reads the host when called; a NIC that does
// not exist or has no DCB support makes it throw HostCtlException.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/DcbRecords.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Backend {
class Dcb;
} // namespace HostCtl::Backend

namespace TvkCtl::Network {

class DcbInfoImpl {
public:
  /// The DCB state of NIC \p nic; nothing is read until an operation is called.
  explicit DcbInfoImpl(const std::string& nic);
  ~DcbInfoImpl();

  /// A HostCtl::Network::DcbMode code.
  uint32_t GetMode() const;
  bool IsEnabled() const;
  HostCtl::Network::DcbCapabilities GetCapabilities() const;
  bool IsPfcEnabled() const;
  /// PFC enable bit per priority (bit i = priority i).
  uint8_t GetPfcConfig() const;
  HostCtl::Network::DcbIeeeEtsConfig GetIeeeEtsConfig() const;
  HostCtl::Network::DcbIeeePfcConfig GetIeeePfcConfig() const;
  std::vector<HostCtl::Network::DcbAppInfo> GetAppInfo() const;

private:
  std::unique_ptr<HostCtl::Backend::Dcb> ops_; ///< The host's operations.
};

} // namespace TvkCtl::Network
