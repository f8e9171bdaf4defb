//===- NetworkRoots.cpp - Handles on the network roots of the host --------===//
//
// Every handle makes its operations object from the session's backend when
// it is constructed and forwards each call to it. What is the same on every
// host (the code-to-text tables, the default routes, host name rules) is
// answered here.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "TvkCtl/Network/DcbInfoImpl.h"
#include "TvkCtl/Network/DnsConfigImpl.h"
#include "TvkCtl/Network/HostsFile.h"
#include "TvkCtl/Network/IpSecConfigImpl.h"
#include "TvkCtl/Network/NetstackInstanceImpl.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/RoutingInfoImpl.h"
#include "TvkCtl/Network/TvkNicImpl.h"
#include "backend/Backend.h"

#include <algorithm>
#include <cctype>

namespace TvkCtl::Network {

using HostCtl::Backend::Current;
using HostCtl::Lib::HostCtlException;

// --- NetworkInfoImpl.

NetworkInfoImpl::NetworkInfoImpl() : ops_(Current().MakeNetwork()) {}
NetworkInfoImpl::~NetworkInfoImpl() = default;

std::vector<std::unique_ptr<HostCtl::Network::Pnic>>
NetworkInfoImpl::GetPnics(HostCtl::Network::PnicGetType type) {
  return ops_->GetPnics(type);
}
std::unique_ptr<HostCtl::Network::Pnic> NetworkInfoImpl::GetPnicByName(const std::string& name) {
  return ops_->GetPnicByName(name);
}
std::vector<std::unique_ptr<HostCtl::Network::Pnic>> NetworkInfoImpl::GetSriovNics() {
  return ops_->GetSriovNics();
}
std::unique_ptr<HostCtl::Network::Pnic>
NetworkInfoImpl::GetSriovNicByName(const std::string& name) {
  return ops_->GetSriovNicByName(name);
}
std::vector<HostCtl::Network::SriovNicVFInfo>
NetworkInfoImpl::GetSriovNicVFInfo(const std::string& name) {
  return ops_->GetSriovNicVFInfo(name);
}
void NetworkInfoImpl::GetSriovNicVFStats(HostCtl::Network::SriovNicVFStats& stats,
                                         const std::string& name, int vfId) {
  ops_->GetSriovNicVFStats(stats, name, vfId);
}
std::vector<std::unique_ptr<HostCtl::Network::NetstackInstance>>
NetworkInfoImpl::ListNetstackInstances() {
  return ops_->ListNetstackInstances();
}
std::unique_ptr<HostCtl::Network::NetstackInstance>
NetworkInfoImpl::LookupNetstackInstanceByKey(const std::string& key) {
  return ops_->LookupNetstackInstanceByKey(key);
}
void NetworkInfoImpl::AddNetstackInstance(HostCtl::Network::NetstackInstance& instance,
                                          bool disabled) {
  ops_->AddNetstackInstance(instance, disabled);
}
void NetworkInfoImpl::RemoveNetstackInstance(const std::string& key, bool force) {
  ops_->RemoveNetstackInstance(key, force);
}
uint32_t NetworkInfoImpl::GetNetstackInstanceState(const std::string& key) {
  return ops_->GetNetstackInstanceState(key);
}
std::vector<std::string> NetworkInfoImpl::GetPredefinedNetstackInstances() {
  return ops_->GetPredefinedNetstackInstances();
}
bool NetworkInfoImpl::IsTvkIpv6Enabled() {
  return ops_->IsTvkIpv6Enabled();
}
void NetworkInfoImpl::SetTvkIpv6Enabled(bool enabled) {
  ops_->SetTvkIpv6Enabled(enabled);
}
std::unique_ptr<HostCtl::Network::TvKernelNicInfo> NetworkInfoImpl::GetTvKernelNicInfo() {
  return ops_->GetTvKernelNicInfo();
}
std::vector<std::unique_ptr<HostCtl::Network::PortGroup>>
NetworkInfoImpl::GetAllPortGroups(HostCtl::Network::PortsetGetType type) {
  return ops_->GetAllPortGroups(type);
}
int64_t NetworkInfoImpl::GetEnsMaxLcores() {
  return ops_->GetEnsMaxLcores();
}
bool NetworkInfoImpl::SetEnsMaxLcores(int64_t count) {
  return ops_->SetEnsMaxLcores(count);
}
std::vector<int64_t> NetworkInfoImpl::GetEnsLcores() {
  return ops_->GetEnsLcores();
}
bool NetworkInfoImpl::AddEnsLcore(int64_t id) {
  return ops_->AddEnsLcore(id);
}
bool NetworkInfoImpl::RemoveEnsLcore(int64_t id) {
  return ops_->RemoveEnsLcore(id);
}
std::string NetworkInfoImpl::GetEnsLcoreSwitch(int64_t id) {
  return ops_->GetEnsLcoreSwitch(id);
}
int32_t NetworkInfoImpl::GetEnsLcoreAffinity(int64_t id) {
  return ops_->GetEnsLcoreAffinity(id);
}
bool NetworkInfoImpl::SetEnsLcoreSwitch(const std::string& name, int64_t id) {
  return ops_->SetEnsLcoreSwitch(name, id);
}
bool NetworkInfoImpl::SetEnsLcoreAffinity(int64_t affinity, int64_t id) {
  return ops_->SetEnsLcoreAffinity(affinity, id);
}
void NetworkInfoImpl::GetCurrentTcpTarvikConnections(
    std::vector<HostCtl::Network::TcpIpConnection>& list, const std::string& netstack) {
  ops_->GetCurrentTcpTarvikConnections(list, netstack);
}
void NetworkInfoImpl::GetCurrentUdpTarvikConnections(
    std::vector<HostCtl::Network::TcpIpConnection>& list, const std::string& netstack) {
  ops_->GetCurrentUdpTarvikConnections(list, netstack);
}
void NetworkInfoImpl::GetCurrentIpTarvikConnections(
    std::vector<HostCtl::Network::TcpIpConnection>& list, const std::string& netstack) {
  ops_->GetCurrentIpTarvikConnections(list, netstack);
}

// --- TvKernelNicInfoImpl and tag names.

namespace {

/// Tag names by type (index 0 is type 1). The plug-in builds help texts
/// from them when it registers, before any host is chosen.
const char* const kTagNames[] = {"HostConsole", "Driftway", "TwinRun",      "Replica",
                                 "ReplicaCopy", "Ambrel",   "SharedStore",  "StoreWitness",
                                 "ArchiveCopy", "TimeSync", "BlockOverTcp", "BlockOverRdma"};
constexpr int kTagCount = static_cast<int>(sizeof kTagNames / sizeof kTagNames[0]);

} // namespace

const char* TvkNicTagIdToName(HostCtl::Network::TvkNicTagType type) {
  if (type < 1 || type > kTagCount)
    return nullptr;
  return kTagNames[type - 1];
}

HostCtl::Network::TvkNicTagType TvkNicTagNameToId(const std::string& name) {
  for (int i = 0; i < kTagCount; ++i)
    if (name == kTagNames[i])
      return static_cast<HostCtl::Network::TvkNicTagType>(i + 1);
  return HostCtl::Network::TvkNicTagInvalid;
}

TvKernelNicInfoImpl::TvKernelNicInfoImpl() : ops_(Current().MakeKernelNics()) {}
TvKernelNicInfoImpl::~TvKernelNicInfoImpl() = default;

std::vector<std::unique_ptr<HostCtl::Network::TvkNic>>
TvKernelNicInfoImpl::GetTvKernelNics(int selector) {
  return ops_->GetTvKernelNics(selector);
}
std::vector<std::unique_ptr<HostCtl::Network::TvkNic>>
TvKernelNicInfoImpl::GetTvKernelNicsByInstanceKey(const std::string& netstack, int selector) {
  return ops_->GetTvKernelNicsByInstanceKey(netstack, selector);
}
std::unique_ptr<HostCtl::Network::TvkNic>
TvKernelNicInfoImpl::GetTvKernelNicByInterface(const std::string& name, bool refresh,
                                               int selector) {
  return ops_->GetTvKernelNicByInterface(name, refresh, selector);
}
std::vector<std::unique_ptr<HostCtl::Network::TvkNic>>
TvKernelNicInfoImpl::GetTvKernelNicsByTag(HostCtl::Network::TvkNicTagType tag) {
  return ops_->GetTvKernelNicsByTag(tag);
}
void TvKernelNicInfoImpl::GetTvkernelNicNamesByInstanceKey(std::vector<std::string>& names,
                                                           const std::string& netstack,
                                                           int selector) {
  ops_->GetTvkernelNicNamesByInstanceKey(names, netstack, selector);
}
std::unique_ptr<HostCtl::Network::TvkNic> TvKernelNicInfoImpl::AddTvKernelNic(
    HostCtl::Network::ConnectionPoint* point, const std::string& netstack,
    const HostCtl::Network::IpConfig& config, const HostCtl::Network::MacAddress& mac,
    uint32_t flags, uint32_t mtu, uint32_t rxQueues, const std::string& name, bool persistOnly) {
  return ops_->AddTvKernelNic(point, netstack, config, mac, flags, mtu, rxQueues, name,
                              persistOnly);
}
void TvKernelNicInfoImpl::RemoveTvKernelNic(HostCtl::Network::ConnectionPoint* point,
                                            const std::string& netstack) {
  ops_->RemoveTvKernelNic(point, netstack);
}

// --- RoutingInfoImpl.

const HostCtl::Network::Ipv4Network
    RoutingInfoImpl::DEFAULT_IPV4_ROUTE(HostCtl::Network::Ipv4Address(0u),
                                        HostCtl::Network::Ipv4Address(0u));
const HostCtl::Network::Ipv6Network
    RoutingInfoImpl::DEFAULT_IPV6_ROUTE(HostCtl::Network::Ipv6Address(), 0);

RoutingInfoImpl::RoutingInfoImpl(std::string netstackKey)
    : netstack_(std::move(netstackKey)), ops_(Current().MakeRouting(netstack_)) {}
RoutingInfoImpl::~RoutingInfoImpl() = default;
RoutingInfoImpl::RoutingInfoImpl(RoutingInfoImpl&& other) noexcept = default;
RoutingInfoImpl& RoutingInfoImpl::operator=(RoutingInfoImpl&& other) noexcept = default;

void RoutingInfoImpl::SetNetstackInstanceKey(const std::string& key) {
  ops_->SetNetstackInstanceKey(key);
  netstack_ = key;
}

void RoutingInfoImpl::Refresh() {
  ops_->Refresh();
}
std::vector<HostCtl::Network::Ipv4Route>
RoutingInfoImpl::GetCurrentTarvikRoutes(HostCtl::Network::PortsetGetType selector) {
  return ops_->GetCurrentTarvikRoutes(selector);
}
void RoutingInfoImpl::AddTarvikRoute(const HostCtl::Network::Ipv4Network& network,
                                     const HostCtl::Network::Ipv4Address& gateway) {
  ops_->AddTarvikRoute(network, gateway);
}
void RoutingInfoImpl::RemoveTarvikRoute(const HostCtl::Network::Ipv4Network& network,
                                        const HostCtl::Network::Ipv4Address& gateway) {
  ops_->RemoveTarvikRoute(network, gateway);
}
HostCtl::Network::Ipv4Address RoutingInfoImpl::GetTvKernelDefaultGateway() {
  return ops_->GetTvKernelDefaultGateway();
}
HostCtl::Network::Ipv4Address RoutingInfoImpl::GetTvKernelConfigDefaultGateway() {
  return ops_->GetTvKernelConfigDefaultGateway();
}
void RoutingInfoImpl::SetTvKernelDefaultGateway(const HostCtl::Network::Ipv4Address& gateway,
                                                bool runningOnly) {
  ops_->SetTvKernelDefaultGateway(gateway, runningOnly);
}
std::string RoutingInfoImpl::GetDefaultGatewaySource(const HostCtl::Network::Ipv4Network& network) {
  return ops_->GetDefaultGatewaySource(network);
}
std::vector<HostCtl::Network::Ipv6Route>
RoutingInfoImpl::GetCurrentIpv6TarvikRoutes(HostCtl::Network::PortsetGetType selector) {
  return ops_->GetCurrentIpv6TarvikRoutes(selector);
}
void RoutingInfoImpl::AddIpv6TarvikRoute(const HostCtl::Network::Ipv6Network& network,
                                         const HostCtl::Network::Ipv6Address& gateway) {
  ops_->AddIpv6TarvikRoute(network, gateway);
}
void RoutingInfoImpl::RemoveIpv6TarvikRoute(const HostCtl::Network::Ipv6Network& network,
                                            const HostCtl::Network::Ipv6Address& gateway) {
  ops_->RemoveIpv6TarvikRoute(network, gateway);
}
HostCtl::Network::Ipv6Address RoutingInfoImpl::GetIpv6TvKernelDefaultGateway() {
  return ops_->GetIpv6TvKernelDefaultGateway();
}
HostCtl::Network::Ipv6Address RoutingInfoImpl::GetIpv6TvKernelConfigDefaultGateway() {
  return ops_->GetIpv6TvKernelConfigDefaultGateway();
}
void RoutingInfoImpl::SetIpv6TvKernelDefaultGateway(const HostCtl::Network::Ipv6Address& gateway) {
  ops_->SetIpv6TvKernelDefaultGateway(gateway);
}
void RoutingInfoImpl::GetCurrentIpv4TarvikNeighbors(
    std::vector<HostCtl::Network::Ipv4Neighbor>& list, const std::string& interfaceName,
    HostCtl::Network::PortsetGetType selector) {
  ops_->GetCurrentIpv4TarvikNeighbors(list, interfaceName, selector);
}
void RoutingInfoImpl::GetCurrentIpv6TarvikNeighbors(
    std::vector<HostCtl::Network::Ipv6Neighbor>& list, const std::string& interfaceName,
    HostCtl::Network::PortsetGetType selector) {
  ops_->GetCurrentIpv6TarvikNeighbors(list, interfaceName, selector);
}
void RoutingInfoImpl::RemoveIpv4Neighbor(const HostCtl::Network::Ipv4Neighbor& neighbor) {
  ops_->RemoveIpv4Neighbor(neighbor);
}
void RoutingInfoImpl::RemoveIpv6Neighbor(const HostCtl::Network::Ipv6Neighbor& neighbor) {
  ops_->RemoveIpv6Neighbor(neighbor);
}

const std::vector<std::string>& RoutingInfoImpl::NeighborTypeNames() {
  static const std::vector<std::string> names = {"Unknown", "Dynamic", "Static", "Local", "Router"};
  return names;
}

const std::vector<std::string>& RoutingInfoImpl::NeighborStateNames() {
  static const std::vector<std::string> names = {"Incomplete", "Reachable", "Stale",
                                                 "Delay",      "Probe",     "Unreachable"};
  return names;
}

namespace {
std::string NameOf(const std::vector<std::string>& names, int code) {
  return code >= 0 && static_cast<std::size_t>(code) < names.size() ? names[code] : names[0];
}
} // namespace

std::string
RoutingInfoImpl::GetIpv4NeighborType(const HostCtl::Network::Ipv4Neighbor& neighbor) const {
  return NameOf(NeighborTypeNames(), neighbor.GetTypeCode());
}

std::string
RoutingInfoImpl::GetIpv6NeighborType(const HostCtl::Network::Ipv6Neighbor& neighbor) const {
  return NameOf(NeighborTypeNames(), neighbor.GetTypeCode());
}

std::string
RoutingInfoImpl::GetIpv6NeighborState(const HostCtl::Network::Ipv6Neighbor& neighbor) const {
  return NameOf(NeighborStateNames(), neighbor.GetStateCode());
}

// --- NetstackInstanceImpl.

NetstackInstanceImpl::NetstackInstanceImpl(const std::string& key, uint32_t maxConnections,
                                           const std::string& ccAlgorithm, bool ipv6Enabled,
                                           uint32_t layoutVersion, const std::string& ecn)
    : ops_(Current().MakeNewNetstackInstance(key, maxConnections, ccAlgorithm, ipv6Enabled,
                                             layoutVersion, ecn)) {}
NetstackInstanceImpl::~NetstackInstanceImpl() = default;

std::vector<std::string> NetstackInstanceImpl::GetCongestionControlAlgorithmList() {
  return Current().GetCongestionControlAlgorithmList();
}

std::string NetstackInstanceImpl::GetKey() {
  return ops_->GetKey();
}
std::string NetstackInstanceImpl::GetInstanceName() {
  return ops_->GetInstanceName();
}
uint32_t NetstackInstanceImpl::GetState() {
  return ops_->GetState();
}
uint32_t NetstackInstanceImpl::GetMaxConnections() {
  return ops_->GetMaxConnections();
}
uint32_t NetstackInstanceImpl::GetCurrentMaxConnections() {
  return ops_->GetCurrentMaxConnections();
}
std::string NetstackInstanceImpl::GetCongestionControlAlgorithm() {
  return ops_->GetCongestionControlAlgorithm();
}
bool NetstackInstanceImpl::GetIpv6Enabled() {
  return ops_->GetIpv6Enabled();
}
bool NetstackInstanceImpl::GetCurrentIpv6Enabled() {
  return ops_->GetCurrentIpv6Enabled();
}
std::string NetstackInstanceImpl::GetEcnStatus() {
  return ops_->GetEcnStatus();
}
void NetstackInstanceImpl::SetInstanceName(const std::string& name, bool persist) {
  ops_->SetInstanceName(name, persist);
}
void NetstackInstanceImpl::Enable() {
  ops_->Enable();
}
void NetstackInstanceImpl::Disable() {
  ops_->Disable();
}
void NetstackInstanceImpl::SetMaxConnections(uint32_t value, bool persist) {
  ops_->SetMaxConnections(value, persist);
}
void NetstackInstanceImpl::SetCongestionControlAlgorithm(const std::string& name, bool persist) {
  ops_->SetCongestionControlAlgorithm(name, persist);
}
void NetstackInstanceImpl::SetIpv6Enabled(bool enabled, bool persist) {
  ops_->SetIpv6Enabled(enabled, persist);
}
void NetstackInstanceImpl::SetEcnStatus(const std::string& status) {
  ops_->SetEcnStatus(status);
}

// --- DnsConfigImpl.

DnsConfigImpl::DnsConfigImpl(const std::string& netstackKey)
    : ops_(Current().MakeDns(netstackKey)) {}
DnsConfigImpl::~DnsConfigImpl() = default;

void DnsConfigImpl::Refresh() {
  ops_->Refresh();
}
void DnsConfigImpl::AddUserNameServer(const HostCtl::Network::IpAddress& address) {
  ops_->AddUserNameServer(address);
}
void DnsConfigImpl::RemoveNameServer(const HostCtl::Network::IpAddress& address) {
  ops_->RemoveNameServer(address);
}
void DnsConfigImpl::RemoveNameServers() {
  ops_->RemoveNameServers();
}
std::vector<std::string> DnsConfigImpl::GetNameServers() {
  return ops_->GetNameServers();
}
void DnsConfigImpl::AddUserSearchDomain(const std::string& domain) {
  ops_->AddUserSearchDomain(domain);
}
void DnsConfigImpl::RemoveSearchDomain(const std::string& domain) {
  ops_->RemoveSearchDomain(domain);
}
std::string DnsConfigImpl::GetSearchDomainsString() {
  return ops_->GetSearchDomainsString();
}
void DnsConfigImpl::SaveConfig() {
  ops_->SaveConfig();
}

// --- DcbInfoImpl.

DcbInfoImpl::DcbInfoImpl(const std::string& nic) : ops_(Current().MakeDcb(nic)) {}
DcbInfoImpl::~DcbInfoImpl() = default;

uint32_t DcbInfoImpl::GetMode() const {
  return ops_->GetMode();
}
bool DcbInfoImpl::IsEnabled() const {
  return ops_->IsEnabled();
}
HostCtl::Network::DcbCapabilities DcbInfoImpl::GetCapabilities() const {
  return ops_->GetCapabilities();
}
bool DcbInfoImpl::IsPfcEnabled() const {
  return ops_->IsPfcEnabled();
}
uint8_t DcbInfoImpl::GetPfcConfig() const {
  return ops_->GetPfcConfig();
}
HostCtl::Network::DcbIeeeEtsConfig DcbInfoImpl::GetIeeeEtsConfig() const {
  return ops_->GetIeeeEtsConfig();
}
HostCtl::Network::DcbIeeePfcConfig DcbInfoImpl::GetIeeePfcConfig() const {
  return ops_->GetIeeePfcConfig();
}
std::vector<HostCtl::Network::DcbAppInfo> DcbInfoImpl::GetAppInfo() const {
  return ops_->GetAppInfo();
}

// --- HostsFile.

HostsFile::HostsFile() : ops_(Current().MakeHostsTable()) {}
HostsFile::~HostsFile() = default;

void HostsFile::AddEntryFromUser(const std::string& ip, const std::string& hostname,
                                 const std::vector<std::string>& aliases,
                                 const std::string& comment) {
  ops_->AddEntryFromUser(ip, hostname, aliases, comment);
}
void HostsFile::RemoveEntryFromUser(const std::string& ip, const std::string& hostname) {
  ops_->RemoveEntryFromUser(ip, hostname);
}
std::vector<std::shared_ptr<HostsFileEntry>> HostsFile::GetEntriesFromConfig() {
  return ops_->GetEntriesFromConfig();
}

bool HostsFile::IsValidHostName(const std::string& name) {
  if (name.empty() || name.size() > 253)
    return false;
  std::size_t start = 0;
  while (true) {
    std::size_t dot = name.find('.', start);
    std::size_t end = dot == std::string::npos ? name.size() : dot;
    std::size_t length = end - start;
    if (length == 0 || length > 63 || name[start] == '-' || name[end - 1] == '-')
      return false;
    for (std::size_t i = start; i < end; ++i) {
      unsigned char c = static_cast<unsigned char>(name[i]);
      if (!std::isalnum(c) && c != '-')
        return false;
    }
    if (dot == std::string::npos)
      return true;
    start = dot + 1;
  }
}

// --- IpSecConfigImpl.

const std::array<std::string, 4> IpSecConfigImpl::SA_STATE = {"larval", "mature", "dying", "dead"};
const std::array<std::string, 3> IpSecConfigImpl::SA_MODE = {"transport", "tunnel", "any"};
const std::array<std::string, 3> IpSecConfigImpl::SA_ENCPT_ALG = {"null", "3des-cbc", "aes128-cbc"};
const std::array<std::string, 2> IpSecConfigImpl::SA_AUTH_ALG = {"hmac-sha1", "hmac-sha2-256"};
const std::array<std::string, 3> IpSecConfigImpl::SP_ACTION = {"none", "discard", "ipsec"};
const std::array<std::string, 2> IpSecConfigImpl::SP_DIRECTION = {"in", "out"};
const std::array<std::string, 4> IpSecConfigImpl::SP_UL_PROTO_TYPE = {"any", "tcp", "udp", "icmp6"};

namespace {

/// The code of \p text in the first \p count entries of \p table; \p dflt for
/// the empty text.
template <std::size_t N>
int ToCode(const std::array<std::string, N>& table, std::size_t count, const std::string& text,
           int dflt, const char* what) {
  if (text.empty())
    return dflt;
  auto end = table.begin() + static_cast<std::ptrdiff_t>(count);
  auto it = std::find(table.begin(), end, text);
  if (it == end)
    throw HostCtlException("Unknown IPsec " + std::string(what) + " '" + text + "'");
  return static_cast<int>(it - table.begin());
}

} // namespace

int IpSecConfigImpl::StringToIpSecMode(const std::string& text) {
  return ToCode(SA_MODE, 2, text, 0, "mode");
}
int IpSecConfigImpl::StringToIpSecEncyptAlgo(const std::string& text) {
  return ToCode(SA_ENCPT_ALG, SA_ENCPT_ALG.size(), text, 0, "encryption algorithm");
}
int IpSecConfigImpl::StringToIpSecAuthAlgo(const std::string& text) {
  return ToCode(SA_AUTH_ALG, SA_AUTH_ALG.size(), text, 0, "integrity algorithm");
}
int IpSecConfigImpl::StringToIpSecAction(const std::string& text) {
  return ToCode(SP_ACTION, SP_ACTION.size(), text, 0, "action");
}
int IpSecConfigImpl::StringToIpSecDirection(const std::string& text) {
  return ToCode(SP_DIRECTION, SP_DIRECTION.size(), text, 1, "direction");
}
int IpSecConfigImpl::StringToIpSecULProtoType(const std::string& text) {
  return ToCode(SP_UL_PROTO_TYPE, SP_UL_PROTO_TYPE.size(), text, 0, "protocol");
}

int IpSecConfigImpl::EncryptionKeyLength(int algorithm) {
  switch (algorithm) {
  case 1:
    return 24; // 3des-cbc: three 64-bit keys.
  case 2:
    return 16; // aes128-cbc.
  default:
    return 0; // null.
  }
}

int IpSecConfigImpl::IntegrityKeyLength(int algorithm) {
  return algorithm == 1 ? 32 : 20; // hmac-sha2-256, hmac-sha1.
}

IpSecConfigImpl::IpSecConfigImpl() : ops_(Current().MakeIpSec()) {}
IpSecConfigImpl::~IpSecConfigImpl() = default;

void IpSecConfigImpl::AddSADConfig(const HostCtl::Network::IpSecSadParam& sa) {
  ops_->AddSADConfig(sa);
}
void IpSecConfigImpl::RemoveSADConfig(const std::string& name) {
  ops_->RemoveSADConfig(name);
}
void IpSecConfigImpl::RemoveAutoSADConfig(const HostCtl::Network::IpSecSadParam& sa) {
  ops_->RemoveAutoSADConfig(sa);
}
void IpSecConfigImpl::FlushSADConfig() {
  ops_->FlushSADConfig();
}
void IpSecConfigImpl::GetSADConfigList(std::vector<HostCtl::Network::IpSecSadParam>& list) {
  ops_->GetSADConfigList(list);
}
void IpSecConfigImpl::AddSPDConfig(const HostCtl::Network::IpSecSpdParam& sp) {
  ops_->AddSPDConfig(sp);
}
void IpSecConfigImpl::RemoveSPDConfig(const std::string& name) {
  ops_->RemoveSPDConfig(name);
}
void IpSecConfigImpl::FlushSPDConfig() {
  ops_->FlushSPDConfig();
}
void IpSecConfigImpl::GetSPDConfigList(std::vector<HostCtl::Network::IpSecSpdParam>& list) {
  ops_->GetSPDConfigList(list);
}

} // namespace TvkCtl::Network
