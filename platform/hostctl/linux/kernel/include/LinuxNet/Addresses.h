//===- LinuxNet/Addresses.h - IPv4 and IPv6 addresses of links ------------===//
//
// What `ip address` shows and changes. The kernel cannot tell how an address
// was configured; what it can tell is kept here: permanent addresses have no
// lifetime (configured by hand or by a tool acting as a user would), others
// expire unless renewed (a DHCP client or router advertisement sets them),
// and newer kernels record the protocol that added an address.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "LinuxNet/Ip.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace LinuxNet {

class Namespace;

/// Address flags (IFA_F_*).
enum AddressFlag : uint32_t {
  AddrSecondary = 0x01,
  AddrNoDad = 0x02,
  AddrOptimistic = 0x04,
  AddrDadFailed = 0x08,
  AddrHomeAddress = 0x10,
  AddrDeprecated = 0x20,
  AddrTentative = 0x40,
  AddrPermanent = 0x80,
  AddrManageTempAddr = 0x100,
  AddrNoPrefixRoute = 0x200,
  AddrMcAutoJoin = 0x400,
  AddrStablePrivacy = 0x800,
};

/// Lifetime value meaning "forever".
inline constexpr uint32_t kForever = 0xFFFFFFFFu;

/// One address of a link.
struct Address {
  int index = 0;                         ///< Interface index.
  std::string device;                    ///< Interface name.
  IpAddress local;                       ///< The address (IFA_LOCAL, else IFA_ADDRESS).
  IpAddress peer;                        ///< Peer of a point-to-point address; unset otherwise.
  uint8_t prefixLength = 0;              ///< Prefix length.
  uint8_t scope = 0;                     ///< 0 global, 200 site, 253 link, 254 host.
  uint32_t flags = 0;                    ///< AddressFlag bits.
  IpAddress broadcast;                   ///< IPv4 broadcast; unset when none.
  std::string label;                     ///< IPv4 label ("br0:1").
  uint32_t validLifetime = kForever;     ///< Seconds left, or kForever.
  uint32_t preferredLifetime = kForever; ///< Seconds left, or kForever.
  uint8_t protocol = 0;                  ///< IFA_PROTO (0 unknown, 1 loopback, 2 RA, 3 link-local).

  bool IsPermanent() const { return flags & AddrPermanent; }
  /// Expires unless renewed: set by DHCP or autoconfiguration.
  bool IsDynamic() const { return !IsPermanent() && validLifetime != kForever; }
};

/// Every address of the namespace, of \p family or of both.
std::vector<Address> ListAddresses(Namespace& ns, Family family = Family::None);

/// An address to add.
struct AddressSpec {
  std::string device;                    ///< Interface name.
  IpPrefix prefix;                       ///< Address and prefix length.
  IpAddress broadcast;                   ///< IPv4 broadcast; unset for none.
  std::optional<uint8_t> scope;          ///< Unset: the kernel's choice (global).
  bool noDad = false;                    ///< IPv6: skip duplicate address detection.
  uint32_t validLifetime = kForever;     ///< Seconds.
  uint32_t preferredLifetime = kForever; ///< Seconds.
  std::string label;                     ///< IPv4 label; empty for the device name.
};
/// Adds an address; refuses one the link has already.
void AddAddress(Namespace& ns, const AddressSpec& wanted);
/// Removes an address of \p device.
void DeleteAddress(Namespace& ns, const std::string& device, const IpPrefix& prefix);

} // namespace LinuxNet
