//===- TvkCtl/Network/NetstackInstanceImpl.h - A netstack of the host -----===//
//
// NetstackInstanceImpl is either a netstack instance of the host (as
// NetworkInfoImpl hands it out) or a new instance not yet added to the host
// (built with its settings and passed to NetworkInfoImpl::AddNetstackInstance).
// It caches the instance's settings; the getters reload them first when the
// object is stale.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/NetstackInstance.h"

#include <cstdint>
#include <string>
#include <vector>

namespace Sim {

/// The settings of one netstack instance as the host stores them.
struct NetstackData {
  std::string key;                ///< Instance key.
  std::string name;               ///< Display name.
  uint32_t state = 0;             ///< STATE_ENABLED or STATE_DISABLED.
  uint32_t maxConnections = 0;    ///< Configured maximum connections.
  uint32_t curMaxConnections = 0; ///< Running maximum connections.
  std::string ccAlgorithm;        ///< Congestion control algorithm.
  bool ipv6 = true;               ///< Configured IPv6 switch.
  bool curIpv6 = true;            ///< Running IPv6 switch.
  std::string ecn;                ///< ECN mode.
};

class NetstackInstanceImpl : public HostCtl::Network::NetstackInstance {
public:
  /// Smallest and largest maximum connection count the kernel accepts.
  static constexpr uint32_t MIN_MAX_CONNECTIONS = 1000;
  static constexpr uint32_t MAX_MAX_CONNECTIONS = 100000;

  /// A new instance, not yet on the host. \p layoutVersion is the version of
  /// the settings layout (2 is the current one).
  NetstackInstanceImpl(std::string key, uint32_t maxConnections, std::string ccAlgorithm,
                       bool ipv6Enabled, uint32_t layoutVersion, std::string ecn);
  /// An instance of the host, with its settings as read.
  explicit NetstackInstanceImpl(NetstackData data);
  ~NetstackInstanceImpl() override;

  /// The supported congestion control algorithms.
  static std::vector<std::string> GetCongestionControlAlgorithmList();

  /// Marks the cached settings stale; the next getter reloads them.
  void Invalidate() { stale_ = true; }
  const NetstackData& GetData() const { return data_; }

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
  void Refresh();
  NetstackData data_;  ///< Cached settings.
  bool onHost_;        ///< The instance was read from the host.
  bool stale_ = false; ///< Reload before the next read.
};

} // namespace Sim
