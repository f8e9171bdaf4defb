//===- backend/Backend.h - What a host implementation provides -------------===//
//
// The TvkCtl root classes and the HostCtl factories are handles: each holds
// an operations object made by the session's Backend and forwards every call
// to it. A backend (the simulated host, the Linux kernel, a test's fake)
// derives from Backend and from the operation classes below and overrides
// what it can do. Every operation it leaves alone throws
// HostCtl::Lib::NotAvailableException, so a partial backend never invents a
// result; the session notes that it happened and the command host names the
// command that is not available (HostCtl/Session.h).
//
// This header is internal to the host library and its backends; the plug-in
// never sees it. docs/backends.md tells how to add a backend.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Host.h"
#include "HostCtl/Network/Connection.h"
#include "HostCtl/Network/DcbRecords.h"
#include "HostCtl/Network/IpAddress.h"
#include "HostCtl/Network/IpSec.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "HostCtl/Network/PnicHwRecords.h"
#include "HostCtl/Network/PortsetGetType.h"
#include "HostCtl/Network/Routing.h"
#include "HostCtl/SmartNic.h"
#include "HostCtl/System/SystemInfo.h"
#include "TvkCtl/Network/HostsFile.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Backend {

/// Throws NotAvailableException for \p operation on the session's host.
[[noreturn]] void Unavailable(const char* operation);

/// The network root: NICs, SR-IOV, netstacks, kernel interfaces, port
/// groups, ENS contexts and the connections of a netstack.
class Network : public HostCtl::Network::NetworkInfo {
public:
  ~Network() override;

  std::vector<std::unique_ptr<HostCtl::Network::Pnic>>
  GetPnics(HostCtl::Network::PnicGetType type) override;
  std::unique_ptr<HostCtl::Network::Pnic> GetPnicByName(const std::string& name) override;
  std::vector<std::unique_ptr<HostCtl::Network::Pnic>> GetSriovNics() override;
  std::unique_ptr<HostCtl::Network::Pnic> GetSriovNicByName(const std::string& name) override;
  std::vector<HostCtl::Network::SriovNicVFInfo> GetSriovNicVFInfo(const std::string& name) override;
  void GetSriovNicVFStats(HostCtl::Network::SriovNicVFStats& stats, const std::string& name,
                          int vfId) override;
  std::vector<std::unique_ptr<HostCtl::Network::NetstackInstance>> ListNetstackInstances() override;
  std::unique_ptr<HostCtl::Network::NetstackInstance>
  LookupNetstackInstanceByKey(const std::string& key) override;
  void AddNetstackInstance(HostCtl::Network::NetstackInstance& instance, bool disabled) override;
  void RemoveNetstackInstance(const std::string& key, bool force) override;
  uint32_t GetNetstackInstanceState(const std::string& key) override;
  std::vector<std::string> GetPredefinedNetstackInstances() override;
  bool IsTvkIpv6Enabled() override;
  void SetTvkIpv6Enabled(bool enabled) override;
  /// By default the handle over this backend's kernel interfaces
  /// (MakeKernelNics), so that the factory's road and the direct one meet.
  std::unique_ptr<HostCtl::Network::TvKernelNicInfo> GetTvKernelNicInfo() override;
  std::vector<std::unique_ptr<HostCtl::Network::PortGroup>>
  GetAllPortGroups(HostCtl::Network::PortsetGetType type) override;
  int64_t GetEnsMaxLcores() override;
  bool SetEnsMaxLcores(int64_t count) override;
  std::vector<int64_t> GetEnsLcores() override;
  bool AddEnsLcore(int64_t id) override;
  bool RemoveEnsLcore(int64_t id) override;
  std::string GetEnsLcoreSwitch(int64_t id) override;
  int32_t GetEnsLcoreAffinity(int64_t id) override;
  bool SetEnsLcoreSwitch(const std::string& name, int64_t id) override;
  bool SetEnsLcoreAffinity(int64_t affinity, int64_t id) override;

  virtual void GetCurrentTcpTarvikConnections(std::vector<HostCtl::Network::TcpIpConnection>& list,
                                              const std::string& netstack);
  virtual void GetCurrentUdpTarvikConnections(std::vector<HostCtl::Network::TcpIpConnection>& list,
                                              const std::string& netstack);
  virtual void GetCurrentIpTarvikConnections(std::vector<HostCtl::Network::TcpIpConnection>& list,
                                             const std::string& netstack);
};

/// The kernel interface service.
class KernelNics : public HostCtl::Network::TvKernelNicInfo {
public:
  ~KernelNics() override;

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

/// A netstack instance (a new one, made for NetworkInfo::AddNetstackInstance).
class NetstackInstance : public HostCtl::Network::NetstackInstance {
public:
  ~NetstackInstance() override;
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
};

/// The routing service of one netstack (TvkCtl::Network::RoutingInfoImpl).
class Routing {
public:
  virtual ~Routing();

  /// Works on another netstack from now on; the default does nothing.
  virtual void SetNetstackInstanceKey(const std::string& key);
  /// Forgets earlier reads; the default does nothing.
  virtual void Refresh();

  virtual std::vector<HostCtl::Network::Ipv4Route>
  GetCurrentTarvikRoutes(HostCtl::Network::PortsetGetType selector);
  virtual void AddTarvikRoute(const HostCtl::Network::Ipv4Network& network,
                              const HostCtl::Network::Ipv4Address& gateway);
  virtual void RemoveTarvikRoute(const HostCtl::Network::Ipv4Network& network,
                                 const HostCtl::Network::Ipv4Address& gateway);
  virtual HostCtl::Network::Ipv4Address GetTvKernelDefaultGateway();
  virtual HostCtl::Network::Ipv4Address GetTvKernelConfigDefaultGateway();
  virtual void SetTvKernelDefaultGateway(const HostCtl::Network::Ipv4Address& gateway,
                                         bool runningOnly);
  virtual std::string GetDefaultGatewaySource(const HostCtl::Network::Ipv4Network& network);

  virtual std::vector<HostCtl::Network::Ipv6Route>
  GetCurrentIpv6TarvikRoutes(HostCtl::Network::PortsetGetType selector);
  virtual void AddIpv6TarvikRoute(const HostCtl::Network::Ipv6Network& network,
                                  const HostCtl::Network::Ipv6Address& gateway);
  virtual void RemoveIpv6TarvikRoute(const HostCtl::Network::Ipv6Network& network,
                                     const HostCtl::Network::Ipv6Address& gateway);
  virtual HostCtl::Network::Ipv6Address GetIpv6TvKernelDefaultGateway();
  virtual HostCtl::Network::Ipv6Address GetIpv6TvKernelConfigDefaultGateway();
  virtual void SetIpv6TvKernelDefaultGateway(const HostCtl::Network::Ipv6Address& gateway);

  virtual void GetCurrentIpv4TarvikNeighbors(std::vector<HostCtl::Network::Ipv4Neighbor>& list,
                                             const std::string& interfaceName,
                                             HostCtl::Network::PortsetGetType selector);
  virtual void GetCurrentIpv6TarvikNeighbors(std::vector<HostCtl::Network::Ipv6Neighbor>& list,
                                             const std::string& interfaceName,
                                             HostCtl::Network::PortsetGetType selector);
  virtual void RemoveIpv4Neighbor(const HostCtl::Network::Ipv4Neighbor& neighbor);
  virtual void RemoveIpv6Neighbor(const HostCtl::Network::Ipv6Neighbor& neighbor);
};

/// The switch service (TvkCtl::Network::VirtualSwitchInfoImpl).
class Switches {
public:
  virtual ~Switches();

  virtual std::vector<std::unique_ptr<HostCtl::Network::Portset>> GetAllSwitches();
  virtual std::vector<std::unique_ptr<HostCtl::Network::VirtualSwitch>>
  GetVirtualSwitches(HostCtl::Network::PortsetGetType type);
  virtual std::unique_ptr<HostCtl::Network::VirtualSwitch>
  GetVirtualSwitchByName(const std::string& name, HostCtl::Network::PortsetGetType type);
  virtual std::unique_ptr<HostCtl::Network::VirtualSwitch>
  AddVirtualSwitchWithPolicy(const HostCtl::Network::NicTeamingPolicy& teaming,
                             const HostCtl::Network::PortSecurityPolicy& security,
                             const HostCtl::Network::ShapingPolicy& shaping,
                             const HostCtl::Network::NicCapabilities& capabilities,
                             const std::string& name, uint32_t ports);
  virtual void RemoveVirtualSwitch(const std::string& name);
  virtual std::vector<std::unique_ptr<HostCtl::Network::DVSwitch>> GetDVSwitches();
  virtual std::vector<std::unique_ptr<HostCtl::Network::DVSwitch>> GetOpaqueDVSwitches();
  virtual std::unique_ptr<HostCtl::Network::DVSwitch> GetDVSwitchByName(const std::string& name);
  virtual bool IsLegacySwitch(const std::string& name);
  virtual bool IsDVSwitch(const std::string& name);
  virtual bool IsOpaqueSwitch(const std::string& name);
};

/// A port group by name (TvkCtl::Network::PortGroupImpl).
class PortGroup : public virtual HostCtl::Network::PortGroup {
public:
  ~PortGroup() override;

  std::string GetPortsetName() const override;
  int GetType() const override;
  std::string GetPortGroupName() const override;
  HostCtl::Network::DVPortParam GetDVPortParam() const override;
  HostCtl::Network::OpaqueNetworkParam GetOpaqueNetworkParam() const override;
  bool IsValid() const override;
  std::string GetName() const override;
  uint32_t GetActiveClients() const override;
  uint16_t GetVlanId() const override;
  void SetVlanId(uint16_t vlanId) override;
  std::unique_ptr<HostCtl::Network::VirtualSwitch> GetVirtualSwitch() const override;
  HostCtl::Network::NicTeamingPolicy GetNicTeamingPolicy() const override;
  HostCtl::Network::NicTeamingPolicy GetConfiguredNicTeamingPolicy() const override;
  void SetNicTeamingPolicy(const HostCtl::Network::NicTeamingPolicy& policy) override;
  HostCtl::Network::PortSecurityPolicy GetPortSecurityPolicy() const override;
  HostCtl::Network::PortSecurityPolicy GetConfiguredPortSecurityPolicy() const override;
  void SetPortSecurityPolicy(const HostCtl::Network::PortSecurityPolicy& policy) override;
  HostCtl::Network::ShapingPolicy GetTrafficShapingPolicy() const override;
  HostCtl::Network::ShapingPolicy GetConfiguredTrafficShapingPolicy() const override;
  void SetTrafficShapingPolicy(const HostCtl::Network::ShapingPolicy& policy) override;
};

/// A distributed port (TvkCtl::Network::DVPortImpl).
class DVPort : public virtual HostCtl::Network::DVPort {
public:
  ~DVPort() override;

  std::string GetPortsetName() const override;
  int GetType() const override;
  std::string GetPortGroupName() const override;
  HostCtl::Network::DVPortParam GetDVPortParam() const override;
  HostCtl::Network::OpaqueNetworkParam GetOpaqueNetworkParam() const override;
  bool IsValid() const override;
  std::string GetPortId() const override;
  std::string GetName() const override;
  std::string GetDVPortgroupId() const override;
  bool IsInUse(std::vector<std::string>& clients) const override;
  uint32_t GetConnectionId() const override;
  void SetConnectionId(uint32_t connectionId) override;
};

/// A physical NIC by name (TvkCtl::Network::PnicImpl); a backend's listed
/// NICs may be the same class.
class Pnic : public HostCtl::Network::Pnic {
public:
  ~Pnic() override;

  void Refresh() override;
  std::string GetName() const override;
  std::unique_ptr<HostCtl::Network::PciDevice> GetPciDevice() const override;
  uint32_t GetDuplex() const override;
  bool IsLinkUp() const override;
  bool IsLinkStatusUp() const override;
  bool IsAdminUp() const override;
  uint32_t GetSpeed() const override;
  void SetSpeedDuplex(uint32_t speed, uint32_t duplex) override;
  std::string GetDriverName() const override;
  HostCtl::Network::MacAddress GetMacAddress() const override;
  void SetAdminStatus(bool up) override;
  uint32_t GetMtu() const override;
  std::string GetPseudoDeviceDescription() const override;
  void GetPnicInfo(HostCtl::Network::PnicInfo& info, int flags, int reserved) const override;
  void GetPauseParams(HostCtl::Network::PnicPauseParams& params) const override;
  void GetDriverInfo(HostCtl::Network::PnicDriverInfo& info) const override;
  void GetHwCapabilities(HostCtl::Network::PnicHwCapabilities& caps) const override;
  void SetPnicInfo(const HostCtl::Network::PnicInfo& info) override;
  void RestartNegotiation() override;
  void AttachBranch(const std::string& branch, uint16_t vlanId) override;
  void DetachBranch(const std::string& branch) override;
  std::vector<HostCtl::Network::PnicAttachment> GetAttachments() const override;
  void GetOffloadSettings(HostCtl::Network::PnicOffloadSettings& settings) const override;
  void SetOffloadSettings(const HostCtl::Network::PnicOffloadSettings& settings) override;
  void GetCoalesceParams(HostCtl::Network::PnicCoalesceParams& params) const override;
  void SetCoalesceParams(const HostCtl::Network::PnicCoalesceParams& params) override;
  void GetRingParams(HostCtl::Network::PnicRingParams& maximums,
                     HostCtl::Network::PnicRingParams& current) const override;
  void SetRingParams(const HostCtl::Network::PnicRingParams& params) override;
  void SetPauseParams(const HostCtl::Network::PnicPauseParams& params) override;
  void GetNetqueueInfo(HostCtl::Network::PnicNetqueueInfo& info) const override;
  void SetNetqueueInfo(const HostCtl::Network::PnicNetqueueInfo& info) override;
  void GetSoftwareSimulation(HostCtl::Network::PnicSoftwareSimulation& settings) const override;
  void SetSoftwareSimulation(const HostCtl::Network::PnicSoftwareSimulation& settings) override;
  void GetEepromDump(std::vector<uint8_t>& data, uint32_t length, uint32_t offset) const override;
  void SetEepromValue(uint32_t magic, uint32_t offset, uint32_t value) override;
  void SetEepromFromFile(uint32_t magic, const std::string& file) override;
  void GetRegisterDump(std::vector<uint32_t>& words) const override;
  void RunSelfTest(HostCtl::Network::PnicSelfTestResult& result, bool online) override;

  virtual void GetPnicStats(HostCtl::Network::PnicStats& stats) const;
  /// The NIC's uplink port, or null when it is no uplink of a switch.
  virtual std::unique_ptr<HostCtl::Network::Port> GetPort() const;
};

/// DCB state of one NIC (TvkCtl::Network::DcbInfoImpl).
class Dcb {
public:
  virtual ~Dcb();
  virtual uint32_t GetMode() const;
  virtual bool IsEnabled() const;
  virtual HostCtl::Network::DcbCapabilities GetCapabilities() const;
  virtual bool IsPfcEnabled() const;
  virtual uint8_t GetPfcConfig() const;
  virtual HostCtl::Network::DcbIeeeEtsConfig GetIeeeEtsConfig() const;
  virtual HostCtl::Network::DcbIeeePfcConfig GetIeeePfcConfig() const;
  virtual std::vector<HostCtl::Network::DcbAppInfo> GetAppInfo() const;
};

/// Resolver configuration of one netstack (TvkCtl::Network::DnsConfigImpl).
class Dns {
public:
  virtual ~Dns();
  virtual void Refresh();
  virtual void AddUserNameServer(const HostCtl::Network::IpAddress& address);
  virtual void RemoveNameServer(const HostCtl::Network::IpAddress& address);
  virtual void RemoveNameServers();
  virtual std::vector<std::string> GetNameServers();
  virtual void AddUserSearchDomain(const std::string& domain);
  virtual void RemoveSearchDomain(const std::string& domain);
  virtual std::string GetSearchDomainsString();
  virtual void SaveConfig();
};

/// The hosts table (TvkCtl::Network::HostsFile).
class HostsTable {
public:
  virtual ~HostsTable();
  virtual void AddEntryFromUser(const std::string& ip, const std::string& hostname,
                                const std::vector<std::string>& aliases,
                                const std::string& comment);
  virtual void RemoveEntryFromUser(const std::string& ip, const std::string& hostname);
  virtual std::vector<std::shared_ptr<TvkCtl::Network::HostsFileEntry>> GetEntriesFromConfig();
};

/// The IPsec databases (TvkCtl::Network::IpSecConfigImpl).
class IpSec {
public:
  virtual ~IpSec();
  virtual void AddSADConfig(const HostCtl::Network::IpSecSadParam& sa);
  virtual void RemoveSADConfig(const std::string& name);
  virtual void RemoveAutoSADConfig(const HostCtl::Network::IpSecSadParam& sa);
  virtual void FlushSADConfig();
  virtual void GetSADConfigList(std::vector<HostCtl::Network::IpSecSadParam>& list);
  virtual void AddSPDConfig(const HostCtl::Network::IpSecSpdParam& sp);
  virtual void RemoveSPDConfig(const std::string& name);
  virtual void FlushSPDConfig();
  virtual void GetSPDConfigList(std::vector<HostCtl::Network::IpSecSpdParam>& list);
};

/// The system root: the firewall (TvkCtl::System::SystemInfoImpl).
class System : public HostCtl::System::SystemInfo {
public:
  ~System() override;
  bool IsFirewallEnabled() override;
  bool GetFirewallDefaultAction() override;
  void SetFirewallEnabled(bool enabled) override;
  void SetFirewallDefaultAction(bool pass) override;
  void LoadFirewallRulesets() override;
  void DestroyFirewallFilters() override;
  std::vector<std::unique_ptr<HostCtl::System::FirewallRuleset>> GetFirewallRulesets() override;
  std::unique_ptr<HostCtl::System::FirewallRuleset>
  GetFirewallRulesetById(const std::string& id) override;
  virtual bool AreFirewallFiltersActive();
};

/// A kernel module by name (TvkCtl::System::ModuleImpl).
class Module {
public:
  virtual ~Module();
  virtual bool IsLoaded();
  virtual void Refresh();
  virtual void Load(const std::string& options, bool force);
  virtual void Unload();
};

/// World names (TvkCtl::Resource::ResourceInfoImpl and WorldImpl).
class Resource {
public:
  virtual ~Resource();
  /// The name of the world, or "" when no world has that id.
  virtual std::string GetWorldName(int64_t worldId);
};

/// One host implementation, made per session from the --host value.
class Backend {
public:
  virtual ~Backend();

  /// The host as a message names it, such as "a Linux host".
  virtual std::string Describe() const = 0;

  // --- Roots. The defaults make operation objects whose every operation is
  // not available, so constructing a root never fails.
  virtual std::unique_ptr<Network> MakeNetwork();
  virtual std::unique_ptr<HostCtl::Network::TvKernelNicInfo> MakeKernelNics();
  virtual std::unique_ptr<HostCtl::Network::NetstackInstance>
  MakeNewNetstackInstance(const std::string& key, uint32_t maxConnections,
                          const std::string& ccAlgorithm, bool ipv6Enabled, uint32_t layoutVersion,
                          const std::string& ecn);
  virtual std::unique_ptr<Routing> MakeRouting(const std::string& netstack);
  virtual std::unique_ptr<Switches> MakeSwitches();
  virtual std::unique_ptr<PortGroup> MakePortGroup(const std::string& name);
  virtual std::unique_ptr<DVPort> MakeDVPort(const HostCtl::Network::DVPortParam& param);
  virtual std::unique_ptr<DVPort> MakeDVPort(const std::string& switchId,
                                             const std::string& dvPortId);
  virtual std::unique_ptr<Pnic> MakePnic(const std::string& name);
  virtual std::unique_ptr<Dcb> MakeDcb(const std::string& nic);
  virtual std::unique_ptr<Dns> MakeDns(const std::string& netstack);
  virtual std::unique_ptr<HostsTable> MakeHostsTable();
  virtual std::unique_ptr<IpSec> MakeIpSec();
  virtual std::unique_ptr<System> MakeSystem();
  virtual std::unique_ptr<Module> MakeModule(const std::string& name);
  virtual std::unique_ptr<Resource> MakeResource();

  // --- Entry points that are no method of a root.
  virtual std::unique_ptr<HostCtl::Network::DVSwitch> GetDVSwitchByName(const std::string& name);
  virtual std::unique_ptr<HostCtl::Network::VirtualSwitch>
  GetVirtualSwitchById(const std::string& name, HostCtl::Network::PortsetGetType type);
  virtual std::unique_ptr<HostCtl::Network::PortGroup> GetPortGroupByName(const std::string& name);
  virtual std::unique_ptr<HostCtl::Network::DVPort>
  GetDVPort(const HostCtl::Network::DVPortParam& param);
  virtual std::unique_ptr<HostCtl::SmartNic::SmartNic> GetSmartNicByPnic(const std::string& pnic);
  virtual bool IsValidPnic(const std::string& name);
  virtual bool IsValidVirtualSwitch(const std::string& name);
  virtual std::string GetHwCapName(int bit);
  virtual std::vector<std::string> GetCongestionControlAlgorithmList();
  /// The world's name; throws when no world has that id.
  virtual std::string GetWorldName(int64_t worldId);
  /// Runs a host command line; see TvkCtl::Util::TvkCtl_Exec.
  virtual int Exec(const std::string& command, bool background, bool wait, bool captureOutput);

  // --- Transactions (HostCtl/Session.h). A backend with transactions runs a
  // command, and a batch, in one; the default has none: every change is kept
  // as it is made, BeginCommand and BeginBatch do nothing, EndCommand cannot
  // undo a command's changes, and EndBatch(false) is refused.
  virtual bool HasTransactions() const;
  /// How long a change waits for another process's lock (no effect without
  /// transactions).
  virtual void SetLockTimeout(int milliseconds);
  virtual void BeginCommand(bool changes);
  virtual void EndCommand(bool keep);
  virtual void BeginBatch();
  virtual void EndBatch(bool commit);
  /// Whether the batch's transaction was lost (never without transactions).
  virtual bool BatchLost() const;
};

/// Makes the backend for a --host value that the factory was registered for.
/// Throws HostCtl::Lib::HostCtlException when the host cannot be used.
using Factory = std::unique_ptr<Backend> (*)(const std::string& spec);

/// Installs \p factory for the --host values \p scheme and "scheme:..." (the
/// Linux module registers "linux" and "netns"); null removes it. A value no
/// factory claims is a simulated host's database path.
void RegisterFactory(const std::string& scheme, Factory factory);

/// The session's backend, made from the host chosen with
/// HostCtl::Session::SetHost (else the simulated host whose store was pointed
/// at its database, as unit tests do) on first use. Throws HostCtlException
/// when that host cannot be used.
Backend& Current();

/// Drops the session's backend and its choice of host: the next use makes
/// the backend again as if nothing had been chosen (tests).
void ResetCurrent();

/// Makes the simulated host's backend for database \p path (sim/): with
/// \p createDemo a missing database is created from the demo profile on first
/// use. An empty \p path keeps the store's current choice.
std::unique_ptr<Backend> MakeSimulatedHost(const std::string& path, bool createDemo);

} // namespace HostCtl::Backend
