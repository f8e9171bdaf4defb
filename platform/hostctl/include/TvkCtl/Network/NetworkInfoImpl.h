//===- TvkCtl/Network/NetworkInfoImpl.h - Network root of the host --------===//
//
// A handle: every operation is the session's host's (HostCtl/Session.h).
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Connection.h"
#include "HostCtl/Network/NetworkInfo.h"

namespace HostCtl::Backend {
class Network;
} // namespace HostCtl::Backend

namespace TvkCtl::Network {

class NetworkInfoImpl : public HostCtl::Network::NetworkInfo {
public:
  NetworkInfoImpl();
  ~NetworkInfoImpl() override;

  // --- Physical NICs.
  std::vector<std::unique_ptr<HostCtl::Network::Pnic>>
  GetPnics(HostCtl::Network::PnicGetType type) override;
  std::unique_ptr<HostCtl::Network::Pnic> GetPnicByName(const std::string& name) override;

  // --- SR-IOV.
  std::vector<std::unique_ptr<HostCtl::Network::Pnic>> GetSriovNics() override;
  std::unique_ptr<HostCtl::Network::Pnic> GetSriovNicByName(const std::string& name) override;
  std::vector<HostCtl::Network::SriovNicVFInfo> GetSriovNicVFInfo(const std::string& name) override;
  void GetSriovNicVFStats(HostCtl::Network::SriovNicVFStats& stats, const std::string& name,
                          int vfId) override;

  // --- Netstacks and the kernel IPv6 switch.
  std::vector<std::unique_ptr<HostCtl::Network::NetstackInstance>> ListNetstackInstances() override;
  std::unique_ptr<HostCtl::Network::NetstackInstance>
  LookupNetstackInstanceByKey(const std::string& key) override;
  void AddNetstackInstance(HostCtl::Network::NetstackInstance& instance, bool disabled) override;
  void RemoveNetstackInstance(const std::string& key, bool force) override;
  uint32_t GetNetstackInstanceState(const std::string& key) override;
  std::vector<std::string> GetPredefinedNetstackInstances() override;
  bool IsTvkIpv6Enabled() override;
  void SetTvkIpv6Enabled(bool enabled) override;

  // --- Kernel interfaces.
  std::unique_ptr<HostCtl::Network::TvKernelNicInfo> GetTvKernelNicInfo() override;

  // --- Port groups.
  std::vector<std::unique_ptr<HostCtl::Network::PortGroup>>
  GetAllPortGroups(HostCtl::Network::PortsetGetType type) override;

  // --- ENS contexts.
  int64_t GetEnsMaxLcores() override;
  bool SetEnsMaxLcores(int64_t count) override;
  std::vector<int64_t> GetEnsLcores() override;
  bool AddEnsLcore(int64_t id) override;
  bool RemoveEnsLcore(int64_t id) override;
  std::string GetEnsLcoreSwitch(int64_t id) override;
  int32_t GetEnsLcoreAffinity(int64_t id) override;
  bool SetEnsLcoreSwitch(const std::string& name, int64_t id) override;
  bool SetEnsLcoreAffinity(int64_t affinity, int64_t id) override;

  // --- Connections of a netstack (IP services).
  /// Append the netstack's TCP, UDP or raw IP sockets to \p list, in the
  /// host's order; a netstack that does not exist is refused.
  void GetCurrentTcpTarvikConnections(std::vector<HostCtl::Network::TcpIpConnection>& list,
                                      const std::string& netstack);
  void GetCurrentUdpTarvikConnections(std::vector<HostCtl::Network::TcpIpConnection>& list,
                                      const std::string& netstack);
  void GetCurrentIpTarvikConnections(std::vector<HostCtl::Network::TcpIpConnection>& list,
                                     const std::string& netstack);

private:
  std::unique_ptr<HostCtl::Backend::Network> ops_; ///< The host's operations.
};

} // namespace TvkCtl::Network
