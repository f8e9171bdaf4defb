//===- TvkCtl/Network/NetstackInstanceImpl.h - A new netstack instance ----===//
//
// A netstack instance not yet added to the host, built with its settings and
// passed to NetworkInfoImpl::AddNetstackInstance. A handle: the session's
// host checks the settings it is given.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/NetstackInstance.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace TvkCtl::Network {

class NetstackInstanceImpl : public HostCtl::Network::NetstackInstance {
public:
  /// A new instance, not yet on the host. \p layoutVersion is the version of
  /// the settings layout (2 is the current one).
  NetstackInstanceImpl(const std::string& key, uint32_t maxConnections,
                       const std::string& ccAlgorithm, bool ipv6Enabled, uint32_t layoutVersion,
                       const std::string& ecn);
  ~NetstackInstanceImpl() override;

  /// The congestion control algorithms the host supports.
  static std::vector<std::string> GetCongestionControlAlgorithmList();

  std::string GetKey() override;
  std::string GetInstanceName() override;
  uint32_t GetState() override;
  uint32_t GetMaxConnections() override;
  uint32_t GetCurrentMaxConnections() override;
  std::string GetCongestionControlAlgorithm() override;
  bool GetIpv6Enabled() override;
  bool GetCurrentIpv6Enabled() override;
  std::string GetEcnStatus() override;

  void SetInstanceName(const std::string& name, bool persist) override;
  void Enable() override;
  void Disable() override;
  void SetMaxConnections(uint32_t value, bool persist) override;
  void SetCongestionControlAlgorithm(const std::string& name, bool persist) override;
  void SetIpv6Enabled(bool enabled, bool persist) override;
  void SetEcnStatus(const std::string& status) override;

private:
  std::unique_ptr<HostCtl::Network::NetstackInstance> ops_; ///< The host's new instance.
};

} // namespace TvkCtl::Network
