//===- TvkCtl/Network/TvkNicImpl.h - Kernel interfaces of the host --------===//
//
// TvkNicImpl is one kernel interface of the simulated host; it caches the
// interface's attributes and reloads them when stale. TvKernelNicInfoImpl is
// the service that lists, adds and removes interfaces. The tag functions
// translate between tag types and their names.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/TvkNic.h"
#include "TvkCtl/Network/TvkNicImpl.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace Sim {

// Tag names are the same on every host.
using TvkCtl::Network::TvkNicTagIdToName;
using TvkCtl::Network::TvkNicTagNameToId;

/// The cached attributes of a kernel interface.
struct TvkNicData {
  std::string name;      ///< Interface name.
  std::string netstack;  ///< Netstack key.
  std::string mac;       ///< MAC address text.
  uint32_t mtu = 0;      ///< MTU.
  uint32_t tsoMss = 0;   ///< TSO maximum segment size.
  uint32_t rxQueues = 0; ///< Receive dispatch queues.
  bool enabled = false;  ///< Administratively enabled.
  int64_t portId = 0;    ///< Port id; 0 without a port.
};

class TvkNicImpl : public HostCtl::Network::TvkNic, public HostCtl::Network::TvkNicAnnounce {
public:
  /// The interface of that name (read on first use).
  explicit TvkNicImpl(std::string name);
  explicit TvkNicImpl(TvkNicData data);
  ~TvkNicImpl() override;

  void Refresh() override;
  std::string GetInterfaceName() override;
  HostCtl::Network::MacAddress GetMacAddress() override;
  uint32_t GetMtu() override;
  void SetMtu(uint32_t mtu) override;
  uint32_t GetTsoMss() override;
  uint32_t GetNumRxQueue() override;
  bool IsEnabled() override;
  void Enable() override;
  void Disable() override;
  std::unique_ptr<HostCtl::Network::ConnectionPoint> GetConnectionPoint() override;
  std::unique_ptr<HostCtl::Network::TvkNicPort> GetPort() override;
  std::string GetNetstackInstanceName() override;
  HostCtl::Network::IpConfig GetIpConfig() override;
  HostCtl::Network::IpConfig GetConfiguredIpConfig() override;
  void SetIpConfig(const HostCtl::Network::IpConfig& config) override;
  void Remove() override;
  void AddTag(HostCtl::Network::TvkNicTagType tag, bool persistOnly) override;
  void RemoveTag(HostCtl::Network::TvkNicTagType tag) override;
  void GetTags(std::vector<HostCtl::Network::TvkNicTagType>& tags) override;
  std::vector<HostCtl::Network::MulticastGroup> GetMulticastGroups() override;

  void Announce() override;

private:
  void Load();
  void SetEnabled(bool enabled);
  TvkNicData data_; ///< Cached attributes.
  bool stale_;      ///< Reload before the next read.
};

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
};

} // namespace Sim
