//===- model/IpModel.h - Rules of the IP part of the host model -----------===//
//
// Helpers shared by the IP part's import and the kernel interface and netstack
// operations: the host's fixed lists (pre-defined netstacks, congestion
// control algorithms, tag names), the validity rules of names and IPv4
// configurations, the simulated DHCP server, MAC allocation and the
// connection points of kernel interfaces.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "model/Store.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace Model::Ip {

/// The default netstack instance.
inline constexpr const char* kDefaultNetstack = "defaultTcpipStack";
/// Settings keys of the kernel's IPv6 switch ("1" or "0").
inline constexpr const char* kIpv6RunningSetting = "tvk.ipv6.running";
inline constexpr const char* kIpv6ConfiguredSetting = "tvk.ipv6.configured";
/// Setting that records the running file-copy daemon and its options.
inline constexpr const char* kQuilldSetting = "tvk.service.quilld";

/// Keys of the pre-defined (service) netstack instances.
const std::vector<std::string>& PredefinedNetstacks();
/// Names of the supported congestion control algorithms.
const std::vector<std::string>& CongestionControlAlgorithms();
/// ECN modes.
const std::vector<std::string>& EcnModes();
/// Tag names by type (index 0 is type 1).
const std::vector<std::string>& TagNames();

/// A netstack key: 1 to 32 letters, digits, "-" or "_".
bool IsValidNetstackKey(const std::string& key);
/// tvk0 to tvk255 without leading zeros.
bool IsValidTvkNicName(const std::string& name);
/// The number of a valid interface name.
int TvkNicNumber(const std::string& name);

/// The problem with a static IPv4 configuration, or "" when it is usable:
/// a unicast address, a contiguous non-zero netmask, the address neither the
/// network nor the broadcast address of its subnet, a gateway (when not
/// 0.0.0.0) in the subnet and other than the address.
std::string CheckStaticIpv4(uint32_t address, uint32_t netmask, uint32_t gateway);

/// The lease the simulated DHCP server gives the interface with \p mac:
/// derived from the MAC alone, so the same interface always gets the same one.
struct DhcpLease {
  uint32_t address = 0; ///< Leased address.
  uint32_t netmask = 0; ///< Subnet mask.
  uint32_t gateway = 0; ///< Router of the subnet.
};
DhcpLease LeaseFor(const std::string& mac);

/// A MAC address for a new interface that no interface or NIC of the host
/// uses; the search starts from \p seed.
std::string FreshMac(Store& store, uint32_t seed);
/// Whether an interface or physical NIC uses \p mac.
bool MacInUse(Store& store, const std::string& mac);

/// Where a kernel interface is attached, as its rows say.
struct Attachment {
  int kind = 0;              ///< 1 port group, 2 DV port, 3 opaque network, 0 none.
  int64_t portsetId = 0;     ///< The switch.
  std::string portsetName;   ///< Its name.
  int64_t portgroupId = 0;   ///< Kind 1.
  std::string portgroupName; ///< Kind 1.
  std::string dvportKey;     ///< Kind 2.
  uint32_t connectionId = 0; ///< Kind 2.
  std::string opaqueId;      ///< Kind 3.
  std::string opaqueType;    ///< Kind 3.
  std::string externalId;    ///< Kind 3.
  int64_t portsetMtu = 0;    ///< MTU of the switch.
};

/// The attachment of interface \p name.
Attachment AttachmentOf(Store& store, const std::string& name);

/// Creates the port of interface \p name on \p attachment (portsetId and
/// portgroupId or dvportKey filled in) and returns its id. Throws
/// HostCtlException when the switch has no free port or the point is taken.
int64_t AttachPort(Store& store, const std::string& name, const Attachment& attachment,
                   std::optional<int64_t> portId);

/// The interface on a port group or DV port, or nothing.
std::optional<std::string> InterfaceOnPoint(Store& store, const Attachment& attachment);

/// Deletes interface \p name with its port and side rows.
void DeleteInterface(Store& store, const std::string& name);

} // namespace Model::Ip
