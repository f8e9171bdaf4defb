//===- linux/host/Host.cpp - The Linux host backend and its registration ---===//
//
// "linux" acts in the network namespace ostracli runs in, "netns:NAME" in
// /run/netns/NAME. The namespace is opened once per session; linuxnet enters
// it only to make its sockets, so the process never stays in another one.
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "LinuxNet/Namespace.h"
#include "LinuxNet/Sysctl.h"
#include "State.h"

#include <algorithm>
#include <cerrno>
#include <sstream>

namespace LinuxHost {

using HostCtl::Lib::HostCtlException;

bool IsNic(const LinuxNet::Link& link) {
  if (!link.parentBus.empty() || !link.parentDevice.empty())
    return true;
  // Lab NICs: veth ends named vmnic followed by digits.
  if (link.kind != "veth" || link.name.rfind("vmnic", 0) != 0 || link.name.size() == 5)
    return false;
  return link.name.find_first_not_of("0123456789", 5) == std::string::npos;
}

bool IsKernelInterface(const LinuxNet::Link& link) {
  return link.master == 0;
}

std::optional<LinuxNet::Link> FindLink(Context& ctx, const std::string& name) {
  if (name.empty() || name.size() >= 16 || name.find('/') != std::string::npos)
    return std::nullopt;
  return Kernel([&] { return LinuxNet::GetLink(ctx.ns, name, false); });
}

std::string LinkName(const std::vector<LinuxNet::Link>& links, int index) {
  for (const LinuxNet::Link& link : links)
    if (link.index == index)
      return link.name;
  return "";
}

LinuxNet::IpAddress FromIpv4(const HostCtl::Network::Ipv4Address& address) {
  uint32_t v = address.GetValue();
  uint8_t bytes[4] = {static_cast<uint8_t>(v >> 24), static_cast<uint8_t>(v >> 16),
                      static_cast<uint8_t>(v >> 8), static_cast<uint8_t>(v)};
  return LinuxNet::IpAddress::FromBytes(bytes, 4);
}
LinuxNet::IpAddress FromIpv6(const HostCtl::Network::Ipv6Address& address) {
  return LinuxNet::IpAddress::FromBytes(address.GetBytes().data(), 16);
}
HostCtl::Network::Ipv4Address ToIpv4(const LinuxNet::IpAddress& address) {
  const auto& b = address.bytes;
  return HostCtl::Network::Ipv4Address((uint32_t{b[0]} << 24) | (uint32_t{b[1]} << 16) |
                                       (uint32_t{b[2]} << 8) | b[3]);
}
HostCtl::Network::Ipv6Address ToIpv6(const LinuxNet::IpAddress& address) {
  std::array<uint8_t, 16> bytes{};
  std::copy(address.bytes.begin(), address.bytes.end(), bytes.begin());
  return HostCtl::Network::Ipv6Address(bytes);
}

void Refuse(const std::string& message) {
  throw HostCtlException(message);
}

std::vector<std::string> NetstackKeys(Context& ctx) {
  std::vector<std::string> keys = {kDefaultNetstack};
  // A host inside a named namespace sees no other namespace: ostracli never
  // touches a namespace other than the one it was given.
  if (ctx.netns.empty())
    for (const std::string& name : Kernel([] { return LinuxNet::ListNamespaces(); }))
      if (name != kDefaultNetstack)
        keys.push_back(name);
  return keys;
}

LinuxNet::Namespace& NetstackNamespace(Context& ctx, const std::string& key,
                                       std::unique_ptr<LinuxNet::Namespace>& holder) {
  if (key.empty() || key == kDefaultNetstack)
    return ctx.ns;
  std::vector<std::string> keys = NetstackKeys(ctx);
  if (std::find(keys.begin(), keys.end(), key) == keys.end())
    Refuse("The netstack " + key + " does not exist on " + ctx.spec);
  holder =
      std::make_unique<LinuxNet::Namespace>(Kernel([&] { return LinuxNet::Namespace::Open(key); }));
  return *holder;
}

std::vector<std::string> CongestionControlAlgorithms(LinuxNet::Namespace& ns) {
  std::string text =
      Kernel([&] { return LinuxNet::ReadSysctl(ns, "net.ipv4.tcp_available_congestion_control"); });
  std::vector<std::string> names;
  std::istringstream words(text);
  for (std::string word; words >> word;)
    names.push_back(word);
  return names;
}

namespace {

namespace Ops = HostCtl::Backend;

/// Names of hardware capabilities by bit, as ethtool features give them
/// (Nics.cpp reads them in this order).
const std::vector<std::string> kCapabilityNames = {
    "RxChecksumV4",   "TxChecksumV4",   "RxChecksumV6",    "TxChecksumV6",     "SegmentationV4",
    "SegmentationV6", "ScatterGather",  "MultiPageGather", "VlanInsert",       "VlanStrip",
    "LargeReceive",   "ReceiveScaling", "TunnelVxlan",     "TunnelGeneve",     "EncapOffset",
    "HighDmaAddress", "PreciseClock",   "WakeOnLan",       "FlowSteering",     "PauseFrames",
    "EnergySaving",   "QueuePairs",     "DcbPriority",     "VirtualFunctions", "PacketPacing",
    "JumboFrames"};

/// Resources: sockets name no process, so no world is ever named.
class Resource final : public Ops::Resource {
public:
  std::string GetWorldName(int64_t worldId) override {
    return worldId == 0 ? std::string() : Ops::Resource::GetWorldName(worldId);
  }
};

class LinuxBackend final : public Ops::Backend {
public:
  explicit LinuxBackend(std::unique_ptr<Context> ctx) : ctx_(std::move(ctx)) {}

  std::string Describe() const override { return "a Linux host"; }

  std::unique_ptr<Ops::Network> MakeNetwork() override { return LinuxHost::MakeNetwork(*ctx_); }
  std::unique_ptr<HostCtl::Network::TvKernelNicInfo> MakeKernelNics() override {
    return LinuxHost::MakeKernelNics(*ctx_);
  }
  std::unique_ptr<Ops::Routing> MakeRouting(const std::string& netstack) override {
    return LinuxHost::MakeRouting(*ctx_, netstack);
  }
  std::unique_ptr<Ops::Switches> MakeSwitches() override { return LinuxHost::MakeSwitches(*ctx_); }
  std::unique_ptr<Ops::PortGroup> MakePortGroup(const std::string& name) override {
    return LinuxHost::MakePortGroup(*ctx_, name);
  }
  std::unique_ptr<Ops::Pnic> MakePnic(const std::string& name) override {
    return LinuxHost::MakePnic(*ctx_, name);
  }
  std::unique_ptr<Ops::Dcb> MakeDcb(const std::string& nic) override {
    return LinuxHost::MakeDcb(*ctx_, nic);
  }
  std::unique_ptr<Ops::Dns> MakeDns(const std::string& netstack) override {
    return LinuxHost::MakeDns(*ctx_, netstack);
  }
  std::unique_ptr<Ops::HostsTable> MakeHostsTable() override {
    return LinuxHost::MakeHostsTable(*ctx_);
  }
  std::unique_ptr<Ops::IpSec> MakeIpSec() override { return LinuxHost::MakeIpSec(*ctx_); }
  std::unique_ptr<Ops::Resource> MakeResource() override { return std::make_unique<Resource>(); }

  std::unique_ptr<HostCtl::Network::VirtualSwitch>
  GetVirtualSwitchById(const std::string& name, HostCtl::Network::PortsetGetType type) override {
    return type == HostCtl::Network::PortsetGetRegular ? FindBridge(*ctx_, name) : nullptr;
  }
  std::unique_ptr<HostCtl::Network::PortGroup>
  GetPortGroupByName(const std::string& name) override {
    return FindPortGroup(*ctx_, name);
  }
  /// No DPU backs a NIC that the kernel drives as a network device.
  std::unique_ptr<HostCtl::SmartNic::SmartNic> GetSmartNicByPnic(const std::string&) override {
    return nullptr;
  }
  bool IsValidPnic(const std::string& name) override {
    std::optional<LinuxNet::Link> link = FindLink(*ctx_, name);
    return link && IsNic(*link);
  }
  bool IsValidVirtualSwitch(const std::string& name) override {
    std::optional<LinuxNet::Link> link = FindLink(*ctx_, name);
    return link && IsBridge(*link);
  }
  std::string GetHwCapName(int bit) override {
    if (bit < 0 || static_cast<std::size_t>(bit) >= kCapabilityNames.size())
      return "";
    return kCapabilityNames[static_cast<std::size_t>(bit)];
  }
  std::vector<std::string> GetCongestionControlAlgorithmList() override {
    return CongestionControlAlgorithms(ctx_->ns);
  }
  std::string GetWorldName(int64_t worldId) override {
    if (worldId == 0)
      return "";
    Refuse("There is no world with id " + std::to_string(worldId) + " on a Linux host");
  }

private:
  std::unique_ptr<Context> ctx_; ///< Shared by every operation object.
};

} // namespace

std::unique_ptr<Ops::Backend> MakeBackend(const std::string& spec) {
  std::string name;
  if (spec.rfind("netns:", 0) == 0) {
    name = spec.substr(6);
    if (name.empty() || name == "." || name == ".." || name.find('/') != std::string::npos)
      throw HostCtlException("The network namespace \"" + name + "\" is not a valid name");
  } else if (spec != "linux") {
    throw HostCtlException("The host " + spec + " is not a Linux host");
  }
  auto ctx = std::unique_ptr<Context>(new Context{
      spec, name, Kernel([&] { return LinuxNet::Namespace::Open(name); }), StatePath(name)});
  return std::make_unique<LinuxBackend>(std::move(ctx));
}

} // namespace LinuxHost

namespace {

std::unique_ptr<HostCtl::Backend::Backend> Factory(const std::string& spec) {
  return LinuxHost::MakeBackend(spec);
}

} // namespace

/// Called by the session when the module is loaded: claims "linux" and
/// "netns:NAME".
extern "C" __attribute__((visibility("default"))) void OstraHost_Register() {
  HostCtl::Backend::RegisterFactory("linux", &Factory);
  HostCtl::Backend::RegisterFactory("netns", &Factory);
}
