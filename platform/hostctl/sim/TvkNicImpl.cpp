//===- TvkNicImpl.cpp - Kernel interfaces of the simulated host -----------===//
//
// One kernel interface: its attributes, IP configuration, tags and multicast
// memberships. The running IPv4 configuration is kept in tvknic.ipv4_* (for
// DHCP the lease of the simulated DHCP server), so that other areas of the
// host read it directly.
//
//===----------------------------------------------------------------------===//
#include "sim/TvkNicImpl.h"

#include "HostCtl/Lib.h"
#include "model/IpModel.h"
#include "model/Store.h"

#include <cctype>
#include <cstdio>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::IpConfig;
using HostCtl::Network::Ipv4Address;
using HostCtl::Network::Ipv6Address;
using HostCtl::Network::Ipv6Network;
using HostCtl::Network::MacAddress;
using HostCtl::Network::TvkNicTagType;
using Model::Statement;
using Model::Store;

// --- Reading and writing interface rows --------------------------------------

/// Reads the attributes of interface \p name; false when there is none.
bool LoadTvkNicData(Store& store, const std::string& name, TvkNicData& data) {
  Statement row = store.Prepare("SELECT t.netstack, t.mac, t.mtu, t.tso_mss, t.rx_queues, "
                                "t.enabled, coalesce(t.port_id, 0) FROM tvknic t "
                                "WHERE t.name = ?");
  enum { kNetstack, kMac, kMtu, kTsoMss, kRxQueues, kEnabled, kPortId };
  row.Bind(1, name);
  if (!row.Step())
    return false;
  data.name = name;
  data.netstack = row.Text(kNetstack);
  data.mac = row.Text(kMac);
  data.mtu = static_cast<uint32_t>(row.Int(kMtu));
  data.tsoMss = static_cast<uint32_t>(row.Int(kTsoMss));
  data.rxQueues = static_cast<uint32_t>(row.Int(kRxQueues));
  data.enabled = row.Bool(kEnabled);
  data.portId = row.Int(kPortId);
  return true;
}

/// The running (\p running true) or configured IP configuration of \p name.
IpConfig ReadIpConfig(Store& store, const std::string& name, bool running) {
  Statement row =
      store.Prepare("SELECT t.ipv4_mode, t.ipv4_address, t.ipv4_netmask, t.ipv4_gateway, "
                    "t.dhcp_dns, t.ipv6_enabled, t.ipv6_dhcp, "
                    "t.ipv6_ra, t.ipv6_dhcp_dns, t.ipv6_gateway "
                    "FROM tvknic t WHERE t.name = ?");
  enum {
    kIpv4Mode,
    kIpv4Address,
    kIpv4Netmask,
    kIpv4Gateway,
    kDhcpDns,
    kIpv6Enabled,
    kIpv6Dhcp,
    kIpv6Ra,
    kIpv6DhcpDns,
    kIpv6Gateway
  };
  row.Bind(1, name);
  if (!row.Step())
    throw HostCtlException("Tarvik network interface " + name + " does not exist");
  IpConfig config;
  std::string mode = row.Text(kIpv4Mode);
  if (mode == "dhcp") {
    // The running configuration holds the lease; the configured one asks for
    // DHCP only.
    if (running) {
      config.SetIpv4Address(Ipv4Address(row.Text(kIpv4Address)));
      config.SetIpv4Netmask(Ipv4Address(row.Text(kIpv4Netmask)));
      config.SetIpv4Gateway(Ipv4Address(row.Text(kIpv4Gateway)));
    }
    config.SetUseDhcp(true);
  } else if (mode == "static") {
    config.SetIpv4Address(Ipv4Address(row.Text(kIpv4Address)));
    config.SetIpv4Netmask(Ipv4Address(row.Text(kIpv4Netmask)));
    config.SetIpv4Gateway(Ipv4Address(row.Text(kIpv4Gateway)));
  } else {
    config.SetIpv4UseNone();
  }
  config.SetDhcpDns(row.Bool(kDhcpDns));
  config.SetUseIpv6(row.Bool(kIpv6Enabled));
  config.SetUseIpv6Dhcp(row.Bool(kIpv6Dhcp));
  config.SetUseIpv6RouterAdvertised(row.Bool(kIpv6Ra));
  config.SetIpv6DhcpDns(row.Bool(kIpv6DhcpDns));
  config.SetIpv6Gateway(Ipv6Address(row.Text(kIpv6Gateway)));
  std::vector<Ipv6Network> networks;
  Statement v6 = store.Prepare(
      "SELECT address, prefix, type, status FROM tvknic_ipv6 WHERE nic = ? ORDER BY ord");
  enum { kAddress, kPrefix, kType, kStatus };
  v6.Bind(1, name);
  while (v6.Step()) {
    Ipv6Network network(Ipv6Address(v6.Text(kAddress)), static_cast<int>(v6.Int(kPrefix)));
    network.SetIpv6AddressType(static_cast<int>(v6.Int(kType)));
    network.SetIpv6AddressStatus(static_cast<int>(v6.Int(kStatus)));
    networks.push_back(network);
  }
  config.SetIpv6Networks(std::move(networks));
  return config;
}

/// Applies \p config to interface \p name (inside a write transaction).
void WriteIpConfig(Store& store, const std::string& name, const IpConfig& config) {
  Statement nic = store.Prepare("SELECT mac, netstack FROM tvknic WHERE name = ?");
  enum { kMac, kNetstack };
  nic.Bind(1, name);
  if (!nic.Step())
    throw HostCtlException("Tarvik network interface " + name + " does not exist");
  std::string mac = nic.Text(kMac);
  std::string netstack = nic.Text(kNetstack);
  uint32_t address = 0, netmask = 0, gateway = 0;
  const char* mode = "none";
  if (config.GetUseDhcp()) {
    mode = "dhcp";
    Model::Ip::DhcpLease lease = Model::Ip::LeaseFor(mac);
    address = lease.address;
    netmask = lease.netmask;
    gateway = lease.gateway;
  } else if (!config.GetIpv4UseNone()) {
    mode = "static";
    address = config.GetIpv4Address().GetValue();
    netmask = config.GetIpv4Netmask().GetValue();
    gateway = config.GetIpv4Gateway().GetValue();
    std::string problem = Model::Ip::CheckStaticIpv4(address, netmask, gateway);
    if (!problem.empty()) {
      problem[0] = static_cast<char>(std::toupper(static_cast<unsigned char>(problem[0])));
      throw HostCtlException(problem);
    }
  }
  if (address != 0) {
    Statement clash = store.Prepare("SELECT name FROM tvknic WHERE netstack = ? AND name <> ? "
                                    "AND ipv4_mode <> 'none' AND ipv4_address = ?");
    enum { kName };
    clash.BindAll(netstack, name, Ipv4Address(address).GetStringAddress());
    if (clash.Step())
      throw HostCtlException("IPv4 address " + Ipv4Address(address).GetStringAddress() +
                             " is already used by Tarvik network interface " + clash.Text(kName));
  }
  const Ipv6Address& v6Gateway = config.GetIpv6Gateway();
  if (v6Gateway.GetBytes()[0] == 0xff)
    throw HostCtlException("Multicast address " + v6Gateway.GetStringAddress() +
                           " cannot be a gateway");
  store
      .Prepare("UPDATE tvknic SET ipv4_mode = ?, ipv4_address = ?, ipv4_netmask = ?, "
               "ipv4_gateway = ? WHERE name = ?")
      .BindAll(mode, Ipv4Address(address).GetStringAddress(),
               Ipv4Address(netmask).GetStringAddress(), Ipv4Address(gateway).GetStringAddress(),
               name)
      .Run();
  store
      .Prepare("UPDATE tvknic SET dhcp_dns = ?, ipv6_enabled = ?, ipv6_dhcp = ?, ipv6_ra = ?, "
               "ipv6_dhcp_dns = ?, ipv6_gateway = ? WHERE name = ?")
      .BindAll(config.GetDhcpDns(), config.GetUseIpv6(), config.GetUseIpv6Dhcp(),
               config.GetUseIpv6RouterAdvertised(), config.GetIpv6DhcpDns(),
               v6Gateway.GetStringAddress(), name)
      .Run();
  store.Prepare("DELETE FROM tvknic_ipv6 WHERE nic = ?").Bind(1, name).Run();
  int ord = 0;
  for (const Ipv6Network& network : config.GetIpv6Network()) {
    const Ipv6Address& a = network.GetAddress();
    if (a.IsUnspecified() || a.GetBytes()[0] == 0xff || network.GetNetmask() < 1 ||
        network.GetNetmask() > 128)
      throw HostCtlException("Address " + network.GetStringAddress() +
                             " cannot be assigned to an interface");
    Statement insert = store.Prepare("INSERT INTO tvknic_ipv6(nic, address, prefix, type, "
                                     "status, ord) VALUES(?,?,?,?,?,?)");
    insert.BindAll(name, a.GetStringAddress(), network.GetNetmask(), network.GetIpv6AddressType(),
                   network.GetIpv6AddressStatus(), ord++);
    try {
      insert.Run();
    } catch (const HostCtlException&) {
      throw HostCtlException("Address " + network.GetStringAddress() + " is listed twice");
    }
  }
}

// --- TvkNicImpl --------------------------------------------------------------

namespace {

class TvkNicPortImpl : public HostCtl::Network::TvkNicPort {
public:
  explicit TvkNicPortImpl(int64_t id) : id_(id) {}
  int64_t GetId() const override { return id_; }

private:
  int64_t id_; ///< Port id.
};

/// Throws when \p name is no interface of the host.
void RequireTvkNic(Store& store, const std::string& name) {
  Statement row = store.Prepare("SELECT 1 FROM tvknic WHERE name = ?");
  row.Bind(1, name);
  if (!row.Step())
    throw HostCtlException("Tarvik network interface " + name + " does not exist");
}

} // namespace

TvkNicImpl::TvkNicImpl(std::string name) : stale_(true) {
  data_.name = std::move(name);
}

TvkNicImpl::TvkNicImpl(TvkNicData data) : data_(std::move(data)), stale_(false) {}

TvkNicImpl::~TvkNicImpl() = default;

void TvkNicImpl::Refresh() {
  Store& store = Store::Host();
  store.CheckFault("Refresh", data_.name);
  TvkNicData fresh;
  if (!store.Read([&] { return LoadTvkNicData(store, data_.name, fresh); }))
    throw HostCtlException("Tarvik network interface " + data_.name + " does not exist");
  data_ = std::move(fresh);
  stale_ = false;
}

void TvkNicImpl::Load() {
  if (stale_)
    Refresh();
}

std::string TvkNicImpl::GetInterfaceName() {
  return data_.name;
}

MacAddress TvkNicImpl::GetMacAddress() {
  Load();
  return MacAddress(data_.mac);
}

uint32_t TvkNicImpl::GetMtu() {
  Load();
  return data_.mtu;
}

void TvkNicImpl::SetMtu(uint32_t mtu) {
  Store& store = Store::Host();
  store.CheckFault("SetMtu", data_.name);
  if (mtu < MIN_MTU || mtu > MAX_MTU)
    throw HostCtlException("MTU " + std::to_string(mtu) + " is out of range; it must be " +
                           std::to_string(MIN_MTU) + " to " + std::to_string(MAX_MTU));
  store.Write([&] {
    RequireTvkNic(store, data_.name);
    Model::Ip::Attachment a = Model::Ip::AttachmentOf(store, data_.name);
    if (a.kind != 0 && mtu > a.portsetMtu)
      throw HostCtlException("MTU " + std::to_string(mtu) + " is above the MTU " +
                             std::to_string(a.portsetMtu) + " of switch " + a.portsetName);
    store.Prepare("UPDATE tvknic SET mtu = ? WHERE name = ?").BindAll(mtu, data_.name).Run();
  });
  stale_ = true;
}

uint32_t TvkNicImpl::GetTsoMss() {
  Load();
  return data_.tsoMss;
}

uint32_t TvkNicImpl::GetNumRxQueue() {
  Load();
  return data_.rxQueues;
}

bool TvkNicImpl::IsEnabled() {
  Load();
  return data_.enabled;
}

void TvkNicImpl::SetEnabled(bool enabled) {
  Store& store = Store::Host();
  store.CheckFault(enabled ? "Enable" : "Disable", data_.name);
  store.Write([&] {
    RequireTvkNic(store, data_.name);
    store.Prepare("UPDATE tvknic SET enabled = ? WHERE name = ?")
        .BindAll(enabled, data_.name)
        .Run();
  });
  stale_ = true;
}

void TvkNicImpl::Enable() {
  SetEnabled(true);
}

void TvkNicImpl::Disable() {
  SetEnabled(false);
}

std::unique_ptr<HostCtl::Network::TvkNicPort> TvkNicImpl::GetPort() {
  Load();
  if (data_.portId == 0)
    return nullptr;
  return std::make_unique<TvkNicPortImpl>(data_.portId);
}

std::string TvkNicImpl::GetNetstackInstanceName() {
  Load();
  return data_.netstack;
}

IpConfig TvkNicImpl::GetIpConfig() {
  Store& store = Store::Host();
  store.CheckFault("GetIpConfig", data_.name);
  return store.Read([&] { return ReadIpConfig(store, data_.name, true); });
}

IpConfig TvkNicImpl::GetConfiguredIpConfig() {
  Store& store = Store::Host();
  store.CheckFault("GetConfiguredIpConfig", data_.name);
  return store.Read([&] { return ReadIpConfig(store, data_.name, false); });
}

void TvkNicImpl::SetIpConfig(const IpConfig& config) {
  Store& store = Store::Host();
  store.CheckFault("SetIpConfig", data_.name);
  store.Write([&] { WriteIpConfig(store, data_.name, config); });
}

void TvkNicImpl::Remove() {
  Store& store = Store::Host();
  store.CheckFault("Remove", data_.name);
  store.Write([&] {
    RequireTvkNic(store, data_.name);
    Model::Ip::DeleteInterface(store, data_.name);
  });
  stale_ = true;
}

void TvkNicImpl::AddTag(TvkNicTagType tag, bool /*persistOnly*/) {
  Store& store = Store::Host();
  store.CheckFault("AddTag", data_.name);
  if (!TvkNicTagIdToName(tag))
    throw HostCtlException("Tag type " + std::to_string(static_cast<int>(tag)) + " is not a tag");
  store.Write([&] {
    RequireTvkNic(store, data_.name);
    store
        .Prepare("INSERT OR IGNORE INTO tvknic_tag(nic, tag, ord) SELECT ?1, ?2, "
                 "coalesce(max(ord), -1) + 1 FROM tvknic_tag WHERE nic = ?1")
        .BindAll(data_.name, static_cast<int>(tag))
        .Run();
  });
}

void TvkNicImpl::RemoveTag(TvkNicTagType tag) {
  Store& store = Store::Host();
  store.CheckFault("RemoveTag", data_.name);
  store.Write([&] {
    RequireTvkNic(store, data_.name);
    store.Prepare("DELETE FROM tvknic_tag WHERE nic = ? AND tag = ?")
        .BindAll(data_.name, static_cast<int>(tag))
        .Run();
    if (store.Changes() == 0) {
      const char* tagName = TvkNicTagIdToName(tag);
      throw HostCtlException("Tarvik network interface " + data_.name + " has no tag " +
                             (tagName ? tagName : std::to_string(static_cast<int>(tag))));
    }
  });
}

void TvkNicImpl::GetTags(std::vector<TvkNicTagType>& tags) {
  Store& store = Store::Host();
  store.CheckFault("GetTags", data_.name);
  tags.clear();
  store.Read([&] {
    RequireTvkNic(store, data_.name);
    Statement rows = store.Prepare("SELECT tag FROM tvknic_tag WHERE nic = ? ORDER BY ord");
    enum { kTag };
    rows.Bind(1, data_.name);
    while (rows.Step())
      tags.push_back(static_cast<TvkNicTagType>(rows.Int(kTag)));
  });
}

std::vector<HostCtl::Network::MulticastGroup> TvkNicImpl::GetMulticastGroups() {
  Store& store = Store::Host();
  store.CheckFault("GetMulticastGroups", data_.name);
  std::vector<HostCtl::Network::MulticastGroup> groups;
  store.Read([&] {
    Statement rows = store.Prepare(
        "SELECT grp, link_layer, refcount FROM tvknic_mcast WHERE nic = ? ORDER BY ord");
    enum { kGrp, kLinkLayer, kRefcount };
    rows.Bind(1, data_.name);
    while (rows.Step())
      groups.push_back({data_.name, rows.Text(kGrp), rows.Text(kLinkLayer),
                        static_cast<uint32_t>(rows.Int(kRefcount))});
  });
  return groups;
}

void TvkNicImpl::Announce() {
  Store& store = Store::Host();
  store.CheckFault("Announce", data_.name);
  store.Write([&] {
    RequireTvkNic(store, data_.name);
    IpConfig config = ReadIpConfig(store, data_.name, true);
    stale_ = !LoadTvkNicData(store, data_.name, data_);
    const std::array<uint8_t, 6> mac = MacAddress(data_.mac).GetBytes();
    char text[40];
    std::vector<std::pair<std::string, std::string>> groups = {{"224.0.0.1", "01:00:5e:00:00:01"}};
    if (config.GetUseIpv6()) {
      groups.emplace_back("ff02::1", "33:33:00:00:00:01");
      std::snprintf(text, sizeof text, "ff02::1:ff%02x:%02x%02x", mac[3], mac[4], mac[5]);
      char link[18];
      std::snprintf(link, sizeof link, "33:33:ff:%02x:%02x:%02x", mac[3], mac[4], mac[5]);
      groups.emplace_back(Ipv6Address(std::string(text)).GetStringAddress(), link);
      // The link-local address made from the MAC (modified EUI-64).
      std::snprintf(text, sizeof text, "fe80::%02x%02x:%02xff:fe%02x:%02x%02x", mac[0] ^ 0x02,
                    mac[1], mac[2], mac[3], mac[4], mac[5]);
      store
          .Prepare("INSERT OR IGNORE INTO tvknic_ipv6(nic, address, prefix, type, status, ord) "
                   "SELECT ?1, ?2, 64, 7, 0, coalesce(max(ord), -1) + 1 FROM tvknic_ipv6 "
                   "WHERE nic = ?1")
          .BindAll(data_.name, Ipv6Address(std::string(text)).GetStringAddress())
          .Run();
    }
    for (const auto& [group, link] : groups)
      store
          .Prepare("INSERT OR IGNORE INTO tvknic_mcast(nic, grp, link_layer, refcount, ord) "
                   "SELECT ?1, ?2, ?3, 1, coalesce(max(ord), -1) + 1 FROM tvknic_mcast "
                   "WHERE nic = ?1")
          .BindAll(data_.name, group, link)
          .Run();
  });
}

} // namespace Sim
