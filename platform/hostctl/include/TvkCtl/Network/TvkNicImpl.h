//===- TvkCtl/Network/TvkNicImpl.h - Kernel interfaces of the host --------===//
//
// TvKernelNicInfoImpl is the service that lists, adds and removes the kernel
// interfaces of the session's host; the tag functions translate between tag
// types and their names on that host. Handles: every operation is the
// host's.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/TvkNic.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace TvkCtl::Network {

/// The name of tag \p type, or null for a value that is no tag.
const char* TvkNicTagIdToName(HostCtl::Network::TvkNicTagType type);
/// The tag of that name (matched exactly), or TvkNicTagInvalid.
HostCtl::Network::TvkNicTagType TvkNicTagNameToId(const std::string& name);

class TvKernelNicInfoImpl : public HostCtl::Network::TvKernelNicInfo {
public:
  TvKernelNicInfoImpl();
  ~TvKernelNicInfoImpl() override;

  std::vector<std::unique_ptr<HostCtl::Network::TvkNic>> GetTvKernelNics(int selector) override;
  std::vector<std::unique_ptr<HostCtl::Network::TvkNic>>
  GetTvKernelNicsByInstanceKey(const std::string& netstack, int selector) override;
  std::unique_ptr<HostCtl::Network::TvkNic>
  GetTvKernelNicByInterface(const std::string& name, bool refresh, int selector) override;
  std::vector<std::unique_ptr<HostCtl::Network::TvkNic>>
  GetTvKernelNicsByTag(HostCtl::Network::TvkNicTagType tag) override;
  void GetTvkernelNicNamesByInstanceKey(std::vector<std::string>& names,
                                        const std::string& netstack, int selector) override;
  std::unique_ptr<HostCtl::Network::TvkNic>
  AddTvKernelNic(HostCtl::Network::ConnectionPoint* point, const std::string& netstack,
                 const HostCtl::Network::IpConfig& config, const HostCtl::Network::MacAddress& mac,
                 uint32_t flags, uint32_t mtu, uint32_t rxQueues, const std::string& name,
                 bool persistOnly) override;
  void RemoveTvKernelNic(HostCtl::Network::ConnectionPoint* point,
                         const std::string& netstack) override;

private:
  std::unique_ptr<HostCtl::Network::TvKernelNicInfo> ops_; ///< The host's operations.
};

} // namespace TvkCtl::Network
