//===- linux/host/Host.h - The Linux kernel as a host backend --------------===//
//
// The Linux host maps the host library's concepts onto the kernel's
// networking in one network namespace, through linuxnet (../kernel). Every
// operation object holds the backend's Context: the namespace, and the
// classification of links into NICs, kernel interfaces and bridges that
// docs/linux-host.md describes. Refusals of the kernel reach the commands as
// HostCtlException with linuxnet's message; operations without an honest
// mapping are left to the not-available defaults of backend/Backend.h.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Lib.h"
#include "HostCtl/Network/Address.h"
#include "LinuxNet/Error.h"
#include "LinuxNet/Ethtool.h"
#include "LinuxNet/Links.h"
#include "LinuxNet/Namespace.h"
#include "backend/Backend.h"

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace LinuxHost {

/// What every operation object of one backend shares.
struct Context {
  std::string spec;       ///< The --host value ("linux", "netns:NAME").
  std::string netns;      ///< The namespace's name; "" for the process's own.
  LinuxNet::Namespace ns; ///< Where every operation acts.
  std::string stateFile;  ///< Names the kernel cannot hold (port groups, IPsec).
};

/// Runs \p fn; a refusal of the kernel becomes the host library's exception
/// with the same message.
template <typename Fn> decltype(auto) Kernel(Fn&& fn) {
  try {
    return fn();
  } catch (const LinuxNet::Error& e) {
    throw HostCtl::Lib::HostCtlException(e.what(), e.Code(), 0);
  }
}

/// Whether \p link is a physical NIC: backed by a device (it has a parent
/// device on a bus), or in a lab, a veth end named vmnicN. Addresses, state
/// and bridge membership never change the answer.
bool IsNic(const LinuxNet::Link& link);
/// Whether \p link is a kernel interface: every link that is not a bridge
/// port (NICs included, the loopback and bridges themselves too).
bool IsKernelInterface(const LinuxNet::Link& link);
/// Whether \p link is a Linux bridge (a standard switch).
inline bool IsBridge(const LinuxNet::Link& link) {
  return link.kind == "bridge";
}
/// The link named \p name, or nullopt.
std::optional<LinuxNet::Link> FindLink(Context& ctx, const std::string& name);
/// The name of link \p index in \p links; "" when there is none.
std::string LinkName(const std::vector<LinuxNet::Link>& links, int index);

/// Addresses between the host library's values and linuxnet's.
LinuxNet::IpAddress FromIpv4(const HostCtl::Network::Ipv4Address& address);
LinuxNet::IpAddress FromIpv6(const HostCtl::Network::Ipv6Address& address);
HostCtl::Network::Ipv4Address ToIpv4(const LinuxNet::IpAddress& address);
HostCtl::Network::Ipv6Address ToIpv6(const LinuxNet::IpAddress& address);

/// The refusal of a change that a Linux host cannot make, such as
/// "the MTU of a kernel interface must be 1280 to 9000".
[[noreturn]] void Refuse(const std::string& message);

// --- Operation objects (one file each).
std::unique_ptr<HostCtl::Backend::Network> MakeNetwork(Context& ctx);
std::unique_ptr<HostCtl::Backend::Pnic> MakePnic(Context& ctx, const std::string& name);
/// A NIC whose link was read already (listings).
/// A NIC whose link (and link modes, when given) were read already: listings.
std::unique_ptr<HostCtl::Backend::Pnic> MakeListedPnic(Context& ctx, const LinuxNet::Link& link,
                                                       const LinuxNet::LinkModes* modes = nullptr);
std::unique_ptr<HostCtl::Backend::Dcb> MakeDcb(Context& ctx, const std::string& name);
std::unique_ptr<HostCtl::Network::TvKernelNicInfo> MakeKernelNics(Context& ctx);
std::unique_ptr<HostCtl::Backend::Routing> MakeRouting(Context& ctx, const std::string& netstack);
std::unique_ptr<HostCtl::Backend::Dns> MakeDns(Context& ctx, const std::string& netstack);
std::unique_ptr<HostCtl::Backend::HostsTable> MakeHostsTable(Context& ctx);
std::unique_ptr<HostCtl::Backend::IpSec> MakeIpSec(Context& ctx);
std::unique_ptr<HostCtl::Backend::Switches> MakeSwitches(Context& ctx);
std::unique_ptr<HostCtl::Backend::PortGroup> MakePortGroup(Context& ctx, const std::string& name);
std::unique_ptr<HostCtl::Network::VirtualSwitch> FindBridge(Context& ctx, const std::string& name);
std::unique_ptr<HostCtl::Network::PortGroup> FindPortGroup(Context& ctx, const std::string& name);
std::vector<std::unique_ptr<HostCtl::Network::PortGroup>> ListPortGroups(Context& ctx,
                                                                         const std::string& bridge);

// --- Netstacks: the host's namespace is "defaultTcpipStack"; on the
// process's own namespace, every named namespace is a netstack too.
inline const std::string kDefaultNetstack = "defaultTcpipStack";
/// The namespace that netstack \p key names, opened; throws when there is
/// no such netstack.
LinuxNet::Namespace& NetstackNamespace(Context& ctx, const std::string& key,
                                       std::unique_ptr<LinuxNet::Namespace>& holder);
/// The netstacks, the default first.
std::vector<std::string> NetstackKeys(Context& ctx);
std::vector<std::string> CongestionControlAlgorithms(LinuxNet::Namespace& ns);

/// Makes the backend for --host \p spec ("linux" or "netns:NAME").
std::unique_ptr<HostCtl::Backend::Backend> MakeBackend(const std::string& spec);

} // namespace LinuxHost
