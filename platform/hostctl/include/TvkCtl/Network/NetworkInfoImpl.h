//===- TvkCtl/Network/NetworkInfoImpl.h - Network root of the host --------===//
#pragma once

#include "HostCtl/Network/NetworkInfo.h"

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

  // --- Kernel interfaces.

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
};

} // namespace TvkCtl::Network
