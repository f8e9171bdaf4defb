//===- Backend.cpp - Operations a backend has not overridden ---------------===//
//
// Every default throws NotAvailableException naming the operation, except the
// Make functions, which hand out these defaults, the few operations whose
// doing nothing is the honest answer (documented in Backend.h), and the
// network root's kernel-interface service, which is the handle over the
// backend's own kernel interfaces.
//
//===----------------------------------------------------------------------===//
#include "backend/Backend.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/Network/TvkNicImpl.h"

namespace HostCtl::Backend {

using namespace HostCtl::Network;

#define NOT_AVAILABLE(op) Unavailable(#op)

// --- Network root.
Network::~Network() = default;
std::vector<std::unique_ptr<HostCtl::Network::Pnic>> Network::GetPnics(PnicGetType) {
  NOT_AVAILABLE(GetPnics);
}
std::unique_ptr<HostCtl::Network::Pnic> Network::GetPnicByName(const std::string&) {
  NOT_AVAILABLE(GetPnicByName);
}
std::vector<std::unique_ptr<HostCtl::Network::Pnic>> Network::GetSriovNics() {
  NOT_AVAILABLE(GetSriovNics);
}
std::unique_ptr<HostCtl::Network::Pnic> Network::GetSriovNicByName(const std::string&) {
  NOT_AVAILABLE(GetSriovNicByName);
}
std::vector<SriovNicVFInfo> Network::GetSriovNicVFInfo(const std::string&) {
  NOT_AVAILABLE(GetSriovNicVFInfo);
}
void Network::GetSriovNicVFStats(SriovNicVFStats&, const std::string&, int) {
  NOT_AVAILABLE(GetSriovNicVFStats);
}
std::vector<std::unique_ptr<HostCtl::Network::NetstackInstance>> Network::ListNetstackInstances() {
  NOT_AVAILABLE(ListNetstackInstances);
}
std::unique_ptr<HostCtl::Network::NetstackInstance>
Network::LookupNetstackInstanceByKey(const std::string&) {
  NOT_AVAILABLE(LookupNetstackInstanceByKey);
}
void Network::AddNetstackInstance(HostCtl::Network::NetstackInstance&, bool) {
  NOT_AVAILABLE(AddNetstackInstance);
}
void Network::RemoveNetstackInstance(const std::string&, bool) {
  NOT_AVAILABLE(RemoveNetstackInstance);
}
uint32_t Network::GetNetstackInstanceState(const std::string&) {
  NOT_AVAILABLE(GetNetstackInstanceState);
}
std::vector<std::string> Network::GetPredefinedNetstackInstances() {
  NOT_AVAILABLE(GetPredefinedNetstackInstances);
}
bool Network::IsTvkIpv6Enabled() {
  NOT_AVAILABLE(IsTvkIpv6Enabled);
}
void Network::SetTvkIpv6Enabled(bool) {
  NOT_AVAILABLE(SetTvkIpv6Enabled);
}
std::unique_ptr<TvKernelNicInfo> Network::GetTvKernelNicInfo() {
  // The kernel-interface service of the same host: the handle over this
  // backend's kernel interfaces, which are not available where it has none.
  return std::make_unique<TvkCtl::Network::TvKernelNicInfoImpl>();
}
std::vector<std::unique_ptr<HostCtl::Network::PortGroup>>
Network::GetAllPortGroups(PortsetGetType) {
  NOT_AVAILABLE(GetAllPortGroups);
}
int64_t Network::GetEnsMaxLcores() {
  NOT_AVAILABLE(GetEnsMaxLcores);
}
bool Network::SetEnsMaxLcores(int64_t) {
  NOT_AVAILABLE(SetEnsMaxLcores);
}
std::vector<int64_t> Network::GetEnsLcores() {
  NOT_AVAILABLE(GetEnsLcores);
}
bool Network::AddEnsLcore(int64_t) {
  NOT_AVAILABLE(AddEnsLcore);
}
bool Network::RemoveEnsLcore(int64_t) {
  NOT_AVAILABLE(RemoveEnsLcore);
}
std::string Network::GetEnsLcoreSwitch(int64_t) {
  NOT_AVAILABLE(GetEnsLcoreSwitch);
}
int32_t Network::GetEnsLcoreAffinity(int64_t) {
  NOT_AVAILABLE(GetEnsLcoreAffinity);
}
bool Network::SetEnsLcoreSwitch(const std::string&, int64_t) {
  NOT_AVAILABLE(SetEnsLcoreSwitch);
}
bool Network::SetEnsLcoreAffinity(int64_t, int64_t) {
  NOT_AVAILABLE(SetEnsLcoreAffinity);
}
void Network::GetCurrentTcpTarvikConnections(std::vector<TcpIpConnection>&, const std::string&) {
  NOT_AVAILABLE(GetCurrentTcpTarvikConnections);
}
void Network::GetCurrentUdpTarvikConnections(std::vector<TcpIpConnection>&, const std::string&) {
  NOT_AVAILABLE(GetCurrentUdpTarvikConnections);
}
void Network::GetCurrentIpTarvikConnections(std::vector<TcpIpConnection>&, const std::string&) {
  NOT_AVAILABLE(GetCurrentIpTarvikConnections);
}

// --- Kernel interfaces.
KernelNics::~KernelNics() = default;
std::vector<std::unique_ptr<TvkNic>> KernelNics::GetTvKernelNics(int) {
  NOT_AVAILABLE(GetTvKernelNics);
}
std::vector<std::unique_ptr<TvkNic>> KernelNics::GetTvKernelNicsByInstanceKey(const std::string&,
                                                                              int) {
  NOT_AVAILABLE(GetTvKernelNicsByInstanceKey);
}
std::unique_ptr<TvkNic> KernelNics::GetTvKernelNicByInterface(const std::string&, bool, int) {
  NOT_AVAILABLE(GetTvKernelNicByInterface);
}
std::vector<std::unique_ptr<TvkNic>> KernelNics::GetTvKernelNicsByTag(TvkNicTagType) {
  NOT_AVAILABLE(GetTvKernelNicsByTag);
}
void KernelNics::GetTvkernelNicNamesByInstanceKey(std::vector<std::string>&, const std::string&,
                                                  int) {
  NOT_AVAILABLE(GetTvkernelNicNamesByInstanceKey);
}
std::unique_ptr<TvkNic> KernelNics::AddTvKernelNic(ConnectionPoint*, const std::string&,
                                                   const IpConfig&, const MacAddress&, uint32_t,
                                                   uint32_t, uint32_t, const std::string&, bool) {
  NOT_AVAILABLE(AddTvKernelNic);
}
void KernelNics::RemoveTvKernelNic(ConnectionPoint*, const std::string&) {
  NOT_AVAILABLE(RemoveTvKernelNic);
}

// --- New netstack instances.
NetstackInstance::~NetstackInstance() = default;
std::string NetstackInstance::GetKey() {
  NOT_AVAILABLE(GetKey);
}
std::string NetstackInstance::GetInstanceName() {
  NOT_AVAILABLE(GetInstanceName);
}
uint32_t NetstackInstance::GetState() {
  NOT_AVAILABLE(GetState);
}
uint32_t NetstackInstance::GetMaxConnections() {
  NOT_AVAILABLE(GetMaxConnections);
}
uint32_t NetstackInstance::GetCurrentMaxConnections() {
  NOT_AVAILABLE(GetCurrentMaxConnections);
}
std::string NetstackInstance::GetCongestionControlAlgorithm() {
  NOT_AVAILABLE(GetCongestionControlAlgorithm);
}
bool NetstackInstance::GetIpv6Enabled() {
  NOT_AVAILABLE(GetIpv6Enabled);
}
bool NetstackInstance::GetCurrentIpv6Enabled() {
  NOT_AVAILABLE(GetCurrentIpv6Enabled);
}
std::string NetstackInstance::GetEcnStatus() {
  NOT_AVAILABLE(GetEcnStatus);
}
void NetstackInstance::SetInstanceName(const std::string&, bool) {
  NOT_AVAILABLE(SetInstanceName);
}
void NetstackInstance::Enable() {
  NOT_AVAILABLE(Enable);
}
void NetstackInstance::Disable() {
  NOT_AVAILABLE(Disable);
}
void NetstackInstance::SetMaxConnections(uint32_t, bool) {
  NOT_AVAILABLE(SetMaxConnections);
}
void NetstackInstance::SetCongestionControlAlgorithm(const std::string&, bool) {
  NOT_AVAILABLE(SetCongestionControlAlgorithm);
}
void NetstackInstance::SetIpv6Enabled(bool, bool) {
  NOT_AVAILABLE(SetIpv6Enabled);
}
void NetstackInstance::SetEcnStatus(const std::string&) {
  NOT_AVAILABLE(SetEcnStatus);
}

// --- Routing.
Routing::~Routing() = default;
void Routing::SetNetstackInstanceKey(const std::string&) {}
void Routing::Refresh() {}
std::vector<Ipv4Route> Routing::GetCurrentTarvikRoutes(PortsetGetType) {
  NOT_AVAILABLE(GetCurrentTarvikRoutes);
}
void Routing::AddTarvikRoute(const Ipv4Network&, const Ipv4Address&) {
  NOT_AVAILABLE(AddTarvikRoute);
}
void Routing::RemoveTarvikRoute(const Ipv4Network&, const Ipv4Address&) {
  NOT_AVAILABLE(RemoveTarvikRoute);
}
Ipv4Address Routing::GetTvKernelDefaultGateway() {
  NOT_AVAILABLE(GetTvKernelDefaultGateway);
}
Ipv4Address Routing::GetTvKernelConfigDefaultGateway() {
  NOT_AVAILABLE(GetTvKernelConfigDefaultGateway);
}
void Routing::SetTvKernelDefaultGateway(const Ipv4Address&, bool) {
  NOT_AVAILABLE(SetTvKernelDefaultGateway);
}
std::string Routing::GetDefaultGatewaySource(const Ipv4Network&) {
  NOT_AVAILABLE(GetDefaultGatewaySource);
}
std::vector<Ipv6Route> Routing::GetCurrentIpv6TarvikRoutes(PortsetGetType) {
  NOT_AVAILABLE(GetCurrentIpv6TarvikRoutes);
}
void Routing::AddIpv6TarvikRoute(const Ipv6Network&, const Ipv6Address&) {
  NOT_AVAILABLE(AddIpv6TarvikRoute);
}
void Routing::RemoveIpv6TarvikRoute(const Ipv6Network&, const Ipv6Address&) {
  NOT_AVAILABLE(RemoveIpv6TarvikRoute);
}
Ipv6Address Routing::GetIpv6TvKernelDefaultGateway() {
  NOT_AVAILABLE(GetIpv6TvKernelDefaultGateway);
}
Ipv6Address Routing::GetIpv6TvKernelConfigDefaultGateway() {
  NOT_AVAILABLE(GetIpv6TvKernelConfigDefaultGateway);
}
void Routing::SetIpv6TvKernelDefaultGateway(const Ipv6Address&) {
  NOT_AVAILABLE(SetIpv6TvKernelDefaultGateway);
}
void Routing::GetCurrentIpv4TarvikNeighbors(std::vector<Ipv4Neighbor>&, const std::string&,
                                            PortsetGetType) {
  NOT_AVAILABLE(GetCurrentIpv4TarvikNeighbors);
}
void Routing::GetCurrentIpv6TarvikNeighbors(std::vector<Ipv6Neighbor>&, const std::string&,
                                            PortsetGetType) {
  NOT_AVAILABLE(GetCurrentIpv6TarvikNeighbors);
}
void Routing::RemoveIpv4Neighbor(const Ipv4Neighbor&) {
  NOT_AVAILABLE(RemoveIpv4Neighbor);
}
void Routing::RemoveIpv6Neighbor(const Ipv6Neighbor&) {
  NOT_AVAILABLE(RemoveIpv6Neighbor);
}

// --- Switches.
Switches::~Switches() = default;
std::vector<std::unique_ptr<Portset>> Switches::GetAllSwitches() {
  NOT_AVAILABLE(GetAllSwitches);
}
std::vector<std::unique_ptr<VirtualSwitch>> Switches::GetVirtualSwitches(PortsetGetType) {
  NOT_AVAILABLE(GetVirtualSwitches);
}
std::unique_ptr<VirtualSwitch> Switches::GetVirtualSwitchByName(const std::string&,
                                                                PortsetGetType) {
  NOT_AVAILABLE(GetVirtualSwitchByName);
}
std::unique_ptr<VirtualSwitch> Switches::AddVirtualSwitchWithPolicy(const NicTeamingPolicy&,
                                                                    const PortSecurityPolicy&,
                                                                    const ShapingPolicy&,
                                                                    const NicCapabilities&,
                                                                    const std::string&, uint32_t) {
  NOT_AVAILABLE(AddVirtualSwitchWithPolicy);
}
void Switches::RemoveVirtualSwitch(const std::string&) {
  NOT_AVAILABLE(RemoveVirtualSwitch);
}
std::vector<std::unique_ptr<DVSwitch>> Switches::GetDVSwitches() {
  NOT_AVAILABLE(GetDVSwitches);
}
std::vector<std::unique_ptr<DVSwitch>> Switches::GetOpaqueDVSwitches() {
  NOT_AVAILABLE(GetOpaqueDVSwitches);
}
std::unique_ptr<DVSwitch> Switches::GetDVSwitchByName(const std::string&) {
  NOT_AVAILABLE(GetDVSwitchByName);
}
bool Switches::IsLegacySwitch(const std::string&) {
  NOT_AVAILABLE(IsLegacySwitch);
}
bool Switches::IsDVSwitch(const std::string&) {
  NOT_AVAILABLE(IsDVSwitch);
}
bool Switches::IsOpaqueSwitch(const std::string&) {
  NOT_AVAILABLE(IsOpaqueSwitch);
}

// --- Port groups.
PortGroup::~PortGroup() = default;
std::string PortGroup::GetPortsetName() const {
  NOT_AVAILABLE(GetPortsetName);
}
int PortGroup::GetType() const {
  NOT_AVAILABLE(GetType);
}
std::string PortGroup::GetPortGroupName() const {
  NOT_AVAILABLE(GetPortGroupName);
}
DVPortParam PortGroup::GetDVPortParam() const {
  NOT_AVAILABLE(GetDVPortParam);
}
OpaqueNetworkParam PortGroup::GetOpaqueNetworkParam() const {
  NOT_AVAILABLE(GetOpaqueNetworkParam);
}
bool PortGroup::IsValid() const {
  NOT_AVAILABLE(IsValid);
}
std::string PortGroup::GetName() const {
  NOT_AVAILABLE(GetName);
}
uint32_t PortGroup::GetActiveClients() const {
  NOT_AVAILABLE(GetActiveClients);
}
uint16_t PortGroup::GetVlanId() const {
  NOT_AVAILABLE(GetVlanId);
}
void PortGroup::SetVlanId(uint16_t) {
  NOT_AVAILABLE(SetVlanId);
}
std::unique_ptr<VirtualSwitch> PortGroup::GetVirtualSwitch() const {
  NOT_AVAILABLE(GetVirtualSwitch);
}
NicTeamingPolicy PortGroup::GetNicTeamingPolicy() const {
  NOT_AVAILABLE(GetNicTeamingPolicy);
}
NicTeamingPolicy PortGroup::GetConfiguredNicTeamingPolicy() const {
  NOT_AVAILABLE(GetConfiguredNicTeamingPolicy);
}
void PortGroup::SetNicTeamingPolicy(const NicTeamingPolicy&) {
  NOT_AVAILABLE(SetNicTeamingPolicy);
}
PortSecurityPolicy PortGroup::GetPortSecurityPolicy() const {
  NOT_AVAILABLE(GetPortSecurityPolicy);
}
PortSecurityPolicy PortGroup::GetConfiguredPortSecurityPolicy() const {
  NOT_AVAILABLE(GetConfiguredPortSecurityPolicy);
}
void PortGroup::SetPortSecurityPolicy(const PortSecurityPolicy&) {
  NOT_AVAILABLE(SetPortSecurityPolicy);
}
ShapingPolicy PortGroup::GetTrafficShapingPolicy() const {
  NOT_AVAILABLE(GetTrafficShapingPolicy);
}
ShapingPolicy PortGroup::GetConfiguredTrafficShapingPolicy() const {
  NOT_AVAILABLE(GetConfiguredTrafficShapingPolicy);
}
void PortGroup::SetTrafficShapingPolicy(const ShapingPolicy&) {
  NOT_AVAILABLE(SetTrafficShapingPolicy);
}

// --- Distributed ports.
DVPort::~DVPort() = default;
std::string DVPort::GetPortsetName() const {
  NOT_AVAILABLE(GetPortsetName);
}
int DVPort::GetType() const {
  NOT_AVAILABLE(GetType);
}
std::string DVPort::GetPortGroupName() const {
  NOT_AVAILABLE(GetPortGroupName);
}
DVPortParam DVPort::GetDVPortParam() const {
  NOT_AVAILABLE(GetDVPortParam);
}
OpaqueNetworkParam DVPort::GetOpaqueNetworkParam() const {
  NOT_AVAILABLE(GetOpaqueNetworkParam);
}
bool DVPort::IsValid() const {
  NOT_AVAILABLE(IsValid);
}
std::string DVPort::GetPortId() const {
  NOT_AVAILABLE(GetPortId);
}
std::string DVPort::GetName() const {
  NOT_AVAILABLE(GetName);
}
std::string DVPort::GetDVPortgroupId() const {
  NOT_AVAILABLE(GetDVPortgroupId);
}
bool DVPort::IsInUse(std::vector<std::string>&) const {
  NOT_AVAILABLE(IsInUse);
}
uint32_t DVPort::GetConnectionId() const {
  NOT_AVAILABLE(GetConnectionId);
}
void DVPort::SetConnectionId(uint32_t) {
  NOT_AVAILABLE(SetConnectionId);
}

// --- Physical NICs.
Pnic::~Pnic() = default;
void Pnic::Refresh() {
  NOT_AVAILABLE(Refresh);
}
std::string Pnic::GetName() const {
  NOT_AVAILABLE(GetName);
}
std::unique_ptr<PciDevice> Pnic::GetPciDevice() const {
  NOT_AVAILABLE(GetPciDevice);
}
uint32_t Pnic::GetDuplex() const {
  NOT_AVAILABLE(GetDuplex);
}
bool Pnic::IsLinkUp() const {
  NOT_AVAILABLE(IsLinkUp);
}
bool Pnic::IsLinkStatusUp() const {
  NOT_AVAILABLE(IsLinkStatusUp);
}
bool Pnic::IsAdminUp() const {
  NOT_AVAILABLE(IsAdminUp);
}
uint32_t Pnic::GetSpeed() const {
  NOT_AVAILABLE(GetSpeed);
}
void Pnic::SetSpeedDuplex(uint32_t, uint32_t) {
  NOT_AVAILABLE(SetSpeedDuplex);
}
std::string Pnic::GetDriverName() const {
  NOT_AVAILABLE(GetDriverName);
}
MacAddress Pnic::GetMacAddress() const {
  NOT_AVAILABLE(GetMacAddress);
}
void Pnic::SetAdminStatus(bool) {
  NOT_AVAILABLE(SetAdminStatus);
}
uint32_t Pnic::GetMtu() const {
  NOT_AVAILABLE(GetMtu);
}
std::string Pnic::GetPseudoDeviceDescription() const {
  NOT_AVAILABLE(GetPseudoDeviceDescription);
}
void Pnic::GetPnicInfo(PnicInfo&, int, int) const {
  NOT_AVAILABLE(GetPnicInfo);
}
void Pnic::GetPauseParams(PnicPauseParams&) const {
  NOT_AVAILABLE(GetPauseParams);
}
void Pnic::GetDriverInfo(PnicDriverInfo&) const {
  NOT_AVAILABLE(GetDriverInfo);
}
void Pnic::GetHwCapabilities(PnicHwCapabilities&) const {
  NOT_AVAILABLE(GetHwCapabilities);
}
void Pnic::SetPnicInfo(const PnicInfo&) {
  NOT_AVAILABLE(SetPnicInfo);
}
void Pnic::RestartNegotiation() {
  NOT_AVAILABLE(RestartNegotiation);
}
void Pnic::AttachBranch(const std::string&, uint16_t) {
  NOT_AVAILABLE(AttachBranch);
}
void Pnic::DetachBranch(const std::string&) {
  NOT_AVAILABLE(DetachBranch);
}
std::vector<PnicAttachment> Pnic::GetAttachments() const {
  NOT_AVAILABLE(GetAttachments);
}
void Pnic::GetOffloadSettings(PnicOffloadSettings&) const {
  NOT_AVAILABLE(GetOffloadSettings);
}
void Pnic::SetOffloadSettings(const PnicOffloadSettings&) {
  NOT_AVAILABLE(SetOffloadSettings);
}
void Pnic::GetCoalesceParams(PnicCoalesceParams&) const {
  NOT_AVAILABLE(GetCoalesceParams);
}
void Pnic::SetCoalesceParams(const PnicCoalesceParams&) {
  NOT_AVAILABLE(SetCoalesceParams);
}
void Pnic::GetRingParams(PnicRingParams&, PnicRingParams&) const {
  NOT_AVAILABLE(GetRingParams);
}
void Pnic::SetRingParams(const PnicRingParams&) {
  NOT_AVAILABLE(SetRingParams);
}
void Pnic::SetPauseParams(const PnicPauseParams&) {
  NOT_AVAILABLE(SetPauseParams);
}
void Pnic::GetNetqueueInfo(PnicNetqueueInfo&) const {
  NOT_AVAILABLE(GetNetqueueInfo);
}
void Pnic::SetNetqueueInfo(const PnicNetqueueInfo&) {
  NOT_AVAILABLE(SetNetqueueInfo);
}
void Pnic::GetSoftwareSimulation(PnicSoftwareSimulation&) const {
  NOT_AVAILABLE(GetSoftwareSimulation);
}
void Pnic::SetSoftwareSimulation(const PnicSoftwareSimulation&) {
  NOT_AVAILABLE(SetSoftwareSimulation);
}
void Pnic::GetEepromDump(std::vector<uint8_t>&, uint32_t, uint32_t) const {
  NOT_AVAILABLE(GetEepromDump);
}
void Pnic::SetEepromValue(uint32_t, uint32_t, uint32_t) {
  NOT_AVAILABLE(SetEepromValue);
}
void Pnic::SetEepromFromFile(uint32_t, const std::string&) {
  NOT_AVAILABLE(SetEepromFromFile);
}
void Pnic::GetRegisterDump(std::vector<uint32_t>&) const {
  NOT_AVAILABLE(GetRegisterDump);
}
void Pnic::RunSelfTest(PnicSelfTestResult&, bool) {
  NOT_AVAILABLE(RunSelfTest);
}
void Pnic::GetPnicStats(PnicStats&) const {
  NOT_AVAILABLE(GetPnicStats);
}
std::unique_ptr<Port> Pnic::GetPort() const {
  NOT_AVAILABLE(GetPort);
}

// --- DCB.
Dcb::~Dcb() = default;
uint32_t Dcb::GetMode() const {
  NOT_AVAILABLE(GetMode);
}
bool Dcb::IsEnabled() const {
  NOT_AVAILABLE(IsEnabled);
}
DcbCapabilities Dcb::GetCapabilities() const {
  NOT_AVAILABLE(GetCapabilities);
}
bool Dcb::IsPfcEnabled() const {
  NOT_AVAILABLE(IsPfcEnabled);
}
uint8_t Dcb::GetPfcConfig() const {
  NOT_AVAILABLE(GetPfcConfig);
}
DcbIeeeEtsConfig Dcb::GetIeeeEtsConfig() const {
  NOT_AVAILABLE(GetIeeeEtsConfig);
}
DcbIeeePfcConfig Dcb::GetIeeePfcConfig() const {
  NOT_AVAILABLE(GetIeeePfcConfig);
}
std::vector<DcbAppInfo> Dcb::GetAppInfo() const {
  NOT_AVAILABLE(GetAppInfo);
}

// --- DNS.
Dns::~Dns() = default;
void Dns::Refresh() {
  NOT_AVAILABLE(Refresh);
}
void Dns::AddUserNameServer(const IpAddress&) {
  NOT_AVAILABLE(AddUserNameServer);
}
void Dns::RemoveNameServer(const IpAddress&) {
  NOT_AVAILABLE(RemoveNameServer);
}
void Dns::RemoveNameServers() {
  NOT_AVAILABLE(RemoveNameServers);
}
std::vector<std::string> Dns::GetNameServers() {
  NOT_AVAILABLE(GetNameServers);
}
void Dns::AddUserSearchDomain(const std::string&) {
  NOT_AVAILABLE(AddUserSearchDomain);
}
void Dns::RemoveSearchDomain(const std::string&) {
  NOT_AVAILABLE(RemoveSearchDomain);
}
std::string Dns::GetSearchDomainsString() {
  NOT_AVAILABLE(GetSearchDomainsString);
}
void Dns::SaveConfig() {
  NOT_AVAILABLE(SaveConfig);
}

// --- Hosts table.
HostsTable::~HostsTable() = default;
void HostsTable::AddEntryFromUser(const std::string&, const std::string&,
                                  const std::vector<std::string>&, const std::string&) {
  NOT_AVAILABLE(AddEntryFromUser);
}
void HostsTable::RemoveEntryFromUser(const std::string&, const std::string&) {
  NOT_AVAILABLE(RemoveEntryFromUser);
}
std::vector<std::shared_ptr<TvkCtl::Network::HostsFileEntry>> HostsTable::GetEntriesFromConfig() {
  NOT_AVAILABLE(GetEntriesFromConfig);
}

// --- IPsec.
IpSec::~IpSec() = default;
void IpSec::AddSADConfig(const IpSecSadParam&) {
  NOT_AVAILABLE(AddSADConfig);
}
void IpSec::RemoveSADConfig(const std::string&) {
  NOT_AVAILABLE(RemoveSADConfig);
}
void IpSec::RemoveAutoSADConfig(const IpSecSadParam&) {
  NOT_AVAILABLE(RemoveAutoSADConfig);
}
void IpSec::FlushSADConfig() {
  NOT_AVAILABLE(FlushSADConfig);
}
void IpSec::GetSADConfigList(std::vector<IpSecSadParam>&) {
  NOT_AVAILABLE(GetSADConfigList);
}
void IpSec::AddSPDConfig(const IpSecSpdParam&) {
  NOT_AVAILABLE(AddSPDConfig);
}
void IpSec::RemoveSPDConfig(const std::string&) {
  NOT_AVAILABLE(RemoveSPDConfig);
}
void IpSec::FlushSPDConfig() {
  NOT_AVAILABLE(FlushSPDConfig);
}
void IpSec::GetSPDConfigList(std::vector<IpSecSpdParam>&) {
  NOT_AVAILABLE(GetSPDConfigList);
}

// --- System.
System::~System() = default;
bool System::IsFirewallEnabled() {
  NOT_AVAILABLE(IsFirewallEnabled);
}
bool System::GetFirewallDefaultAction() {
  NOT_AVAILABLE(GetFirewallDefaultAction);
}
void System::SetFirewallEnabled(bool) {
  NOT_AVAILABLE(SetFirewallEnabled);
}
void System::SetFirewallDefaultAction(bool) {
  NOT_AVAILABLE(SetFirewallDefaultAction);
}
void System::LoadFirewallRulesets() {
  NOT_AVAILABLE(LoadFirewallRulesets);
}
void System::DestroyFirewallFilters() {
  NOT_AVAILABLE(DestroyFirewallFilters);
}
std::vector<std::unique_ptr<HostCtl::System::FirewallRuleset>> System::GetFirewallRulesets() {
  NOT_AVAILABLE(GetFirewallRulesets);
}
std::unique_ptr<HostCtl::System::FirewallRuleset>
System::GetFirewallRulesetById(const std::string&) {
  NOT_AVAILABLE(GetFirewallRulesetById);
}
bool System::AreFirewallFiltersActive() {
  NOT_AVAILABLE(AreFirewallFiltersActive);
}

// --- Modules and worlds.
Module::~Module() = default;
bool Module::IsLoaded() {
  NOT_AVAILABLE(IsLoaded);
}
void Module::Refresh() {
  NOT_AVAILABLE(Refresh);
}
void Module::Load(const std::string&, bool) {
  NOT_AVAILABLE(Load);
}
void Module::Unload() {
  NOT_AVAILABLE(Unload);
}

Resource::~Resource() = default;
std::string Resource::GetWorldName(int64_t) {
  NOT_AVAILABLE(GetWorldName);
}

// --- The backend.
Backend::~Backend() = default;
std::unique_ptr<Network> Backend::MakeNetwork() {
  return std::make_unique<Network>();
}
std::unique_ptr<TvKernelNicInfo> Backend::MakeKernelNics() {
  return std::make_unique<KernelNics>();
}
std::unique_ptr<HostCtl::Network::NetstackInstance>
Backend::MakeNewNetstackInstance(const std::string&, uint32_t, const std::string&, bool, uint32_t,
                                 const std::string&) {
  return std::make_unique<NetstackInstance>();
}
std::unique_ptr<Routing> Backend::MakeRouting(const std::string&) {
  return std::make_unique<Routing>();
}
std::unique_ptr<Switches> Backend::MakeSwitches() {
  return std::make_unique<Switches>();
}
std::unique_ptr<PortGroup> Backend::MakePortGroup(const std::string&) {
  return std::make_unique<PortGroup>();
}
std::unique_ptr<DVPort> Backend::MakeDVPort(const DVPortParam&) {
  return std::make_unique<DVPort>();
}
std::unique_ptr<DVPort> Backend::MakeDVPort(const std::string&, const std::string&) {
  return std::make_unique<DVPort>();
}
std::unique_ptr<Pnic> Backend::MakePnic(const std::string&) {
  return std::make_unique<Pnic>();
}
std::unique_ptr<Dcb> Backend::MakeDcb(const std::string&) {
  return std::make_unique<Dcb>();
}
std::unique_ptr<Dns> Backend::MakeDns(const std::string&) {
  return std::make_unique<Dns>();
}
std::unique_ptr<HostsTable> Backend::MakeHostsTable() {
  return std::make_unique<HostsTable>();
}
std::unique_ptr<IpSec> Backend::MakeIpSec() {
  return std::make_unique<IpSec>();
}
std::unique_ptr<System> Backend::MakeSystem() {
  return std::make_unique<System>();
}
std::unique_ptr<Module> Backend::MakeModule(const std::string&) {
  return std::make_unique<Module>();
}
std::unique_ptr<Resource> Backend::MakeResource() {
  return std::make_unique<Resource>();
}

std::unique_ptr<DVSwitch> Backend::GetDVSwitchByName(const std::string&) {
  NOT_AVAILABLE(GetDVSwitchByName);
}
std::unique_ptr<VirtualSwitch> Backend::GetVirtualSwitchById(const std::string&, PortsetGetType) {
  NOT_AVAILABLE(GetVirtualSwitchById);
}
std::unique_ptr<HostCtl::Network::PortGroup> Backend::GetPortGroupByName(const std::string&) {
  NOT_AVAILABLE(GetPortGroupByName);
}
std::unique_ptr<HostCtl::Network::DVPort> Backend::GetDVPort(const DVPortParam&) {
  NOT_AVAILABLE(GetDVPort);
}
std::unique_ptr<HostCtl::SmartNic::SmartNic> Backend::GetSmartNicByPnic(const std::string&) {
  NOT_AVAILABLE(GetSmartNicByPnic);
}
bool Backend::IsValidPnic(const std::string&) {
  NOT_AVAILABLE(IsValidPnic);
}
bool Backend::IsValidVirtualSwitch(const std::string&) {
  NOT_AVAILABLE(IsValidVirtualSwitch);
}
std::string Backend::GetHwCapName(int) {
  NOT_AVAILABLE(GetHwCapName);
}
std::vector<std::string> Backend::GetCongestionControlAlgorithmList() {
  NOT_AVAILABLE(GetCongestionControlAlgorithmList);
}
std::string Backend::GetWorldName(int64_t) {
  NOT_AVAILABLE(GetWorldName);
}
int Backend::Exec(const std::string&, bool, bool, bool) {
  NOT_AVAILABLE(TvkCtl_Exec);
}

bool Backend::HasTransactions() const {
  return false;
}
void Backend::SetLockTimeout(int milliseconds) {}
void Backend::BeginCommand(bool changes) {}
void Backend::EndCommand(bool keep) {}
void Backend::BeginBatch() {}
void Backend::EndBatch(bool commit) {
  if (!commit)
    throw HostCtl::Lib::HostCtlException(
        "Cannot undo the batch: " + Describe() +
        " has no transactions, so the changes of the lines that ran are kept");
}
bool Backend::BatchLost() const {
  return false;
}

} // namespace HostCtl::Backend
