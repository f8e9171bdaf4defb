//===- linux/host/Network.cpp - The network root: NICs, netstacks, sockets -===//
//
// NIC listings are one link dump; SR-IOV functions come with the link
// message (IFLA_VFINFO_LIST). Netstacks are network namespaces, their
// settings the namespace's net.* sysctls, their connections a sock_diag dump.
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "HostCtl/Network/NetstackInstance.h"
#include "LinuxNet/Files.h"
#include "LinuxNet/Namespace.h"
#include "LinuxNet/Sockets.h"
#include "LinuxNet/Sysctl.h"

#include <algorithm>
#include <climits>
#include <unistd.h>

namespace LinuxHost {

using namespace HostCtl::Network;
namespace Ops = HostCtl::Backend;

namespace {

/// ECN modes by net.ipv4.tcp_ecn value.
const char* const kEcn[] = {"disabled", "enabled", "echo-only"};

/// One network namespace as a netstack instance. Its settings are the
/// namespace's; setters change the kernel at once (a Linux host keeps no
/// configuration apart from the running one).
class Netstack final : public NetstackInstance {
public:
  Netstack(Context& ctx, std::string key) : ctx_(ctx), key_(std::move(key)) {}

  std::string GetKey() override { return key_; }
  std::string GetInstanceName() override { return key_; }
  uint32_t GetState() override { return STATE_ENABLED; }
  uint32_t GetMaxConnections() override { Ops::Unavailable("GetMaxConnections"); }
  uint32_t GetCurrentMaxConnections() override { Ops::Unavailable("GetCurrentMaxConnections"); }
  std::string GetCongestionControlAlgorithm() override {
    return Read("net.ipv4.tcp_congestion_control");
  }
  bool GetIpv6Enabled() override { return Ipv6Enabled(Ns()); }
  bool GetCurrentIpv6Enabled() override { return Ipv6Enabled(Ns()); }
  std::string GetEcnStatus() override {
    std::string value = Read("net.ipv4.tcp_ecn");
    return value.size() == 1 && value[0] >= '0' && value[0] <= '2' ? kEcn[value[0] - '0'] : value;
  }
  void SetInstanceName(const std::string& name, bool) override {
    if (name != key_)
      Refuse("A netstack on a Linux host is named by its network namespace, " + key_);
  }
  void Enable() override {}
  void Disable() override {
    Refuse("A netstack on a Linux host is a network namespace, which exists or not; remove it "
           "instead");
  }
  void SetMaxConnections(uint32_t, bool) override { Ops::Unavailable("SetMaxConnections"); }
  void SetCongestionControlAlgorithm(const std::string& name, bool) override {
    std::vector<std::string> known = CongestionControlAlgorithms(Ns());
    if (std::find(known.begin(), known.end(), name) == known.end())
      Refuse("The congestion control algorithm " + name + " is not available in " + key_);
    Write("net.ipv4.tcp_congestion_control", name);
  }
  void SetIpv6Enabled(bool enabled, bool) override { SetIpv6(Ns(), enabled); }
  void SetEcnStatus(const std::string& status) override {
    for (int i = 0; i < 3; ++i)
      if (status == kEcn[i])
        return Write("net.ipv4.tcp_ecn", std::to_string(i));
    Refuse("Invalid ECN status " + status);
  }

  static bool Ipv6Enabled(LinuxNet::Namespace& ns) {
    try {
      return LinuxNet::ReadSysctl(ns, "net.ipv6.conf.all.disable_ipv6") == "0";
    } catch (const LinuxNet::Error&) {
      return false; // The kernel was built or booted without IPv6.
    }
  }
  static void SetIpv6(LinuxNet::Namespace& ns, bool enabled) {
    for (const char* key : {"net.ipv6.conf.all.disable_ipv6", "net.ipv6.conf.default.disable_ipv6"})
      Kernel([&] { LinuxNet::WriteSysctl(ns, key, enabled ? "0" : "1"); });
  }

private:
  LinuxNet::Namespace& Ns() { return NetstackNamespace(ctx_, key_, holder_); }
  std::string Read(const char* key) {
    return Kernel([&] { return LinuxNet::ReadSysctl(Ns(), key); });
  }
  void Write(const char* key, const std::string& value) {
    Kernel([&] { LinuxNet::WriteSysctl(Ns(), key, value); });
  }
  Context& ctx_;                                ///< The host.
  std::string key_;                             ///< Namespace name or the default.
  std::unique_ptr<LinuxNet::Namespace> holder_; ///< Opened on first use.
};

/// Connection state codes as the host library numbers them.
uint32_t StateCode(const LinuxNet::Socket& socket) {
  if (socket.protocol == 17)
    return socket.state == LinuxNet::TcpEstablished ? 4 : 0;
  switch (socket.state) {
  case LinuxNet::TcpEstablished:
    return 4;
  case LinuxNet::TcpSynSent:
    return 2;
  case LinuxNet::TcpSynRecv:
  case LinuxNet::TcpNewSynRecv:
    return 3;
  case LinuxNet::TcpFinWait1:
    return 6;
  case LinuxNet::TcpFinWait2:
    return 9;
  case LinuxNet::TcpTimeWait:
    return 10;
  case LinuxNet::TcpCloseWait:
    return 5;
  case LinuxNet::TcpLastAck:
    return 8;
  case LinuxNet::TcpListen:
    return 1;
  case LinuxNet::TcpClosing:
    return 7;
  default:
    return 0;
  }
}

std::string AddressText(const LinuxNet::IpAddress& address, LinuxNet::Family family) {
  if (address.IsSet())
    return address.ToString();
  return family == LinuxNet::Family::Ipv6 ? "::" : "0.0.0.0";
}

class Network final : public Ops::Network {
public:
  explicit Network(Context& ctx) : ctx_(ctx) {}

  /// One link dump and one ethtool dump of link modes for all NICs.
  std::vector<std::unique_ptr<Pnic>> GetPnics(PnicGetType) override {
    std::vector<std::unique_ptr<Pnic>> nics;
    std::vector<LinuxNet::LinkModes> modes;
    for (const LinuxNet::Link& link : Kernel([&] { return LinuxNet::ListLinks(ctx_.ns); })) {
      if (!IsNic(link))
        continue;
      if (nics.empty())
        modes = Kernel([&] { return LinuxNet::DumpLinkModes(ctx_.ns); });
      auto found = std::find_if(modes.begin(), modes.end(), [&](const LinuxNet::LinkModes& m) {
        return m.ifindex == link.index;
      });
      nics.push_back(MakeListedPnic(ctx_, link, found == modes.end() ? nullptr : &*found));
    }
    return nics;
  }
  std::unique_ptr<Pnic> GetPnicByName(const std::string& name) override {
    std::optional<LinuxNet::Link> link = FindLink(ctx_, name);
    if (!link || !IsNic(*link))
      return nullptr;
    return MakeListedPnic(ctx_, *link);
  }
  std::vector<std::unique_ptr<Pnic>> GetSriovNics() override {
    std::vector<std::unique_ptr<Pnic>> nics;
    for (const LinuxNet::Link& link : Kernel([&] { return LinuxNet::ListLinks(ctx_.ns); }))
      if (IsNic(link) && link.numVfs > 0)
        nics.push_back(MakeListedPnic(ctx_, link));
    return nics;
  }
  std::unique_ptr<Pnic> GetSriovNicByName(const std::string& name) override {
    std::optional<LinuxNet::Link> link = FindLink(ctx_, name);
    if (!link || !IsNic(*link) || link->numVfs == 0)
      return nullptr;
    return MakeListedPnic(ctx_, *link);
  }
  /// A VF's PCI function is the PF's virtfnN in sysfs; it is active while a
  /// driver is bound to it. The kernel knows no owner world.
  std::vector<SriovNicVFInfo> GetSriovNicVFInfo(const std::string& name) override {
    std::optional<LinuxNet::Link> link =
        Kernel([&] { return LinuxNet::GetLink(ctx_.ns, name, true); });
    if (!link)
      Refuse("There is no physical NIC named " + name + " on " + ctx_.spec);
    std::vector<SriovNicVFInfo> vfs;
    for (const LinuxNet::VfInfo& vf : link->vfs) {
      SriovNicVFInfo info;
      info.vfId = static_cast<uint8_t>(vf.index);
      if (link->parentBus == "pci") {
        std::string dir =
            "/sys/bus/pci/devices/" + link->parentDevice + "/virtfn" + std::to_string(vf.index);
        char target[PATH_MAX];
        ssize_t length = ::readlink(dir.c_str(), target, sizeof target - 1);
        if (length > 0) {
          std::string path(target, static_cast<std::size_t>(length));
          info.pciAddress = path.substr(path.find_last_of('/') + 1);
        }
        info.active = ::access((dir + "/driver").c_str(), F_OK) == 0;
      }
      vfs.push_back(std::move(info));
    }
    return vfs;
  }

  std::vector<std::unique_ptr<NetstackInstance>> ListNetstackInstances() override {
    std::vector<std::unique_ptr<NetstackInstance>> list;
    for (const std::string& key : NetstackKeys(ctx_))
      list.push_back(std::make_unique<Netstack>(ctx_, key));
    return list;
  }
  std::unique_ptr<NetstackInstance> LookupNetstackInstanceByKey(const std::string& key) override {
    std::vector<std::string> keys = NetstackKeys(ctx_);
    if (std::find(keys.begin(), keys.end(), key) == keys.end())
      return nullptr;
    return std::make_unique<Netstack>(ctx_, key);
  }
  void AddNetstackInstance(NetstackInstance& instance, bool disabled) override {
    if (disabled)
      Refuse("A Linux host keeps no netstack that is not in the kernel: a netstack is a network "
             "namespace");
    if (!ctx_.netns.empty())
      Refuse("A host inside the network namespace " + ctx_.netns +
             " has no netstacks besides its own");
    std::string key = instance.GetKey();
    if (key == kDefaultNetstack)
      Refuse("The netstack " + key + " exists already");
    Kernel([&] { LinuxNet::CreateNamespace(key); });
  }
  void RemoveNetstackInstance(const std::string& key, bool) override {
    if (key == kDefaultNetstack)
      Refuse("The netstack " + kDefaultNetstack + " is the host's own and cannot be removed");
    std::unique_ptr<LinuxNet::Namespace> holder;
    NetstackNamespace(ctx_, key, holder);
    holder.reset();
    Kernel([&] { LinuxNet::DeleteNamespace(key); });
  }
  uint32_t GetNetstackInstanceState(const std::string& key) override {
    std::vector<std::string> keys = NetstackKeys(ctx_);
    return std::find(keys.begin(), keys.end(), key) == keys.end() ? NetstackInstance::STATE_DISABLED
                                                                  : NetstackInstance::STATE_ENABLED;
  }
  std::vector<std::string> GetPredefinedNetstackInstances() override { return {}; }
  bool IsTvkIpv6Enabled() override { return Netstack::Ipv6Enabled(ctx_.ns); }
  void SetTvkIpv6Enabled(bool enabled) override { Netstack::SetIpv6(ctx_.ns, enabled); }
  std::vector<std::unique_ptr<PortGroup>> GetAllPortGroups(PortsetGetType type) override {
    if (type != PortsetGetRegular)
      return {};
    return ListPortGroups(ctx_, "");
  }

  void GetCurrentTcpTarvikConnections(std::vector<TcpIpConnection>& list,
                                      const std::string& netstack) override {
    Sockets(list, netstack, true);
  }
  void GetCurrentUdpTarvikConnections(std::vector<TcpIpConnection>& list,
                                      const std::string& netstack) override {
    Sockets(list, netstack, false);
  }
  /// Raw sockets are not listed: the kernel's socket dump has them only with
  /// the raw_diag module (docs/linux-host.md).
  void GetCurrentIpTarvikConnections(std::vector<TcpIpConnection>& list,
                                     const std::string& netstack) override {
    std::unique_ptr<LinuxNet::Namespace> holder;
    NetstackNamespace(ctx_, netstack, holder);
    list.clear();
  }

private:
  void Sockets(std::vector<TcpIpConnection>& list, const std::string& netstack, bool tcp) {
    std::unique_ptr<LinuxNet::Namespace> holder;
    LinuxNet::Namespace& ns = NetstackNamespace(ctx_, netstack, holder);
    LinuxNet::SocketQuery query;
    query.tcp = tcp;
    query.udp = !tcp;
    query.congestion = tcp;
    std::vector<LinuxNet::Socket> sockets =
        Kernel([&] { return LinuxNet::ListSockets(ns, query); });
    list.clear();
    list.reserve(sockets.size());
    for (const LinuxNet::Socket& socket : sockets) {
      TcpIpConnection& c = list.emplace_back();
      c.recvQueue = socket.recvQueue;
      c.sendQueue = socket.sendQueue;
      c.localAddress = AddressText(socket.local, socket.family);
      c.localPort = socket.localPort;
      c.foreignAddress = AddressText(socket.remote, socket.family);
      c.foreignPort = socket.remotePort;
      c.state = StateCode(socket);
      c.ccAlgorithm = socket.congestion;
    }
  }
  Context& ctx_; ///< The host.
};

} // namespace

std::unique_ptr<Ops::Network> MakeNetwork(Context& ctx) {
  return std::make_unique<Network>(ctx);
}

} // namespace LinuxHost
