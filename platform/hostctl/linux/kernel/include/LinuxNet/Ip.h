//===- LinuxNet/Ip.h - IPv4 and IPv6 addresses and prefixes ---------------===//
//
// Addresses travel through the library in binary form, as the kernel hands
// them out; text is made only when a caller asks for it.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace LinuxNet {

/// Address family codes, the kernel's AF_INET and AF_INET6.
enum class Family : uint8_t { None = 0, Ipv4 = 2, Ipv6 = 10 };

/// An IPv4 or IPv6 address; a default one is unset (Family::None).
struct IpAddress {
  Family family = Family::None;    ///< Which of the two, or None.
  std::array<uint8_t, 16> bytes{}; ///< Network order; IPv4 uses the first 4.

  /// Parses dotted-quad IPv4 or RFC 4291 IPv6 text.
  static std::optional<IpAddress> TryParse(const std::string& text);
  /// As TryParse; throws Error(EINVAL) naming \p text when it is malformed.
  static IpAddress Parse(const std::string& text);
  /// Builds one from \p length bytes (4 or 16) in network order.
  static IpAddress FromBytes(const void* data, std::size_t length);

  bool IsSet() const { return family != Family::None; }
  std::size_t Length() const {
    return family == Family::Ipv4 ? 4 : family == Family::Ipv6 ? 16 : 0;
  }
  /// Canonical text ("10.0.0.1", "2001:db8::1"); empty when unset.
  std::string ToString() const;
  bool operator==(const IpAddress&) const = default;
};

/// An address with a prefix length, such as 10.1.0.0/24.
struct IpPrefix {
  IpAddress address;  ///< The address (host bits are kept as given).
  uint8_t length = 0; ///< Prefix length in bits.

  /// Parses "ADDRESS/LENGTH" or a bare address (full length); throws
  /// Error(EINVAL) when malformed or the length is out of range.
  static IpPrefix Parse(const std::string& text);
  /// "ADDRESS/LENGTH"; "default" for the zero-length prefix.
  std::string ToString() const;
  bool operator==(const IpPrefix&) const = default;
};

/// A link-layer address as the kernel holds it (6 bytes for Ethernet).
using HwAddress = std::vector<uint8_t>;

/// "aa:bb:cc:dd:ee:ff" for a hardware address of any length.
std::string FormatHwAddress(const HwAddress& bytes);
/// Parses colon-separated hex bytes; throws Error(EINVAL) when malformed.
HwAddress ParseHwAddress(const std::string& text);

} // namespace LinuxNet
