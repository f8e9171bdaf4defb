//===- HostCtl/Network/Address.h - MAC, IPv4 and IPv6 values ---------------===//
//
// Value types for link-layer and IP addresses and networks. Parsing is strict:
// IPv4 only in dotted decimal with four parts and no leading zeros, IPv6 in the
// text forms of RFC 4291 (with an embedded dotted IPv4 tail allowed), prefix
// lengths in decimal without sign or leading zeros. Every command that parses
// an address goes through these types.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <array>
#include <cstdint>
#include <string>

namespace HostCtl::Network {

/// A 48-bit MAC address; a default-constructed one is "unset" (all zero).
class MacAddress {
public:
  MacAddress() = default;
  explicit MacAddress(const std::array<uint8_t, 6>& bytes) : bytes_(bytes) {}
  /// Six groups of two hex digits separated by ":" (or "-"); throws
  /// HostCtlException on anything else.
  explicit MacAddress(const std::string& text);
  /// Whether \p text is a valid unicast MAC address in the accepted form.
  static bool IsValid(const std::string& text);
  /// Whether \p text parses as a MAC address at all.
  static bool Parse(const std::string& text, std::array<uint8_t, 6>& bytes);
  /// Lower-case "xx:xx:xx:xx:xx:xx".
  std::string GetStringAddress() const;
  bool IsUnset() const;
  bool IsMulticast() const { return (bytes_[0] & 1) != 0; }
  const std::array<uint8_t, 6>& GetBytes() const& { return bytes_; }
  /// A temporary hands out a copy, so that a reference bound to the result
  /// of MacAddress(...).GetBytes() never outlives the bytes.
  std::array<uint8_t, 6> GetBytes() const&& { return bytes_; }
  bool operator==(const MacAddress& other) const { return bytes_ == other.bytes_; }

private:
  std::array<uint8_t, 6> bytes_{}; ///< Network byte order.
};

/// An IPv4 address; default-constructed it is 0.0.0.0.
class Ipv4Address {
public:
  Ipv4Address() = default;
  explicit Ipv4Address(uint32_t hostOrder) : value_(hostOrder) {}
  /// Throws HostCtlException when \p text is not a dotted-decimal address.
  explicit Ipv4Address(const std::string& text);
  static bool IsValidAddress(const std::string& text);
  static bool Parse(const std::string& text, uint32_t& hostOrder);
  std::string GetStringAddress() const;
  uint32_t GetValue() const { return value_; }
  /// Whether this is a contiguous netmask (ones then zeros).
  bool IsNetmask() const;
  /// Prefix length of a contiguous netmask.
  int PrefixLength() const;
  static Ipv4Address FromPrefixLength(int length);
  bool operator==(const Ipv4Address& other) const { return value_ == other.value_; }
  bool operator<(const Ipv4Address& other) const { return value_ < other.value_; }

private:
  uint32_t value_ = 0; ///< Host byte order.
};

/// An IPv6 address; default-constructed it is the unspecified address "::".
class Ipv6Address {
public:
  Ipv6Address() = default;
  explicit Ipv6Address(const std::array<uint8_t, 16>& bytes) : bytes_(bytes) {}
  /// Throws HostCtlException when \p text is not an IPv6 address.
  explicit Ipv6Address(const std::string& text);
  static bool IsValidAddress(const std::string& text);
  static bool Parse(const std::string& text, std::array<uint8_t, 16>& bytes);
  /// RFC 5952 canonical text (lower case, longest zero run compressed).
  std::string GetStringAddress() const;
  bool IsUnspecified() const;
  const std::array<uint8_t, 16>& GetBytes() const& { return bytes_; }
  /// A temporary hands out a copy (see MacAddress::GetBytes).
  std::array<uint8_t, 16> GetBytes() const&& { return bytes_; }
  bool operator==(const Ipv6Address& other) const { return bytes_ == other.bytes_; }
  bool operator<(const Ipv6Address& other) const { return bytes_ < other.bytes_; }

private:
  std::array<uint8_t, 16> bytes_{}; ///< Network byte order.
};

/// An IPv4 network: address and netmask.
class Ipv4Network {
public:
  Ipv4Network() = default;
  Ipv4Network(Ipv4Address network, Ipv4Address netmask) : network_(network), netmask_(netmask) {}
  /// "a.b.c.d/len" or "a.b.c.d/m.m.m.m"; throws HostCtlException otherwise.
  /// The host bits of the address are kept as given.
  explicit Ipv4Network(const std::string& text);
  static bool IsValidNetwork(const std::string& text);
  const Ipv4Address& GetNetwork() const { return network_; }
  const Ipv4Address& GetNetmask() const { return netmask_; }
  int GetPrefixLength() const { return netmask_.PrefixLength(); }
  /// "a.b.c.d/len".
  std::string GetStringAddress() const;
  /// Whether \p address lies in this network.
  bool Contains(const Ipv4Address& address) const;
  bool operator==(const Ipv4Network& other) const {
    return network_ == other.network_ && netmask_ == other.netmask_;
  }

private:
  Ipv4Address network_; ///< Network address.
  Ipv4Address netmask_; ///< Contiguous netmask.
};

/// An IPv6 address with its prefix length, and the address's type and status
/// as the kernel reports them.
class Ipv6Network {
public:
  Ipv6Network() = default;
  Ipv6Network(Ipv6Address address, int prefixLength)
      : address_(address), prefixLength_(prefixLength) {}
  /// "address/len"; throws HostCtlException otherwise.
  explicit Ipv6Network(const std::string& text);
  static bool IsValidAddressAndNetmask(const std::string& text);
  /// The mask with \p length leading one bits.
  static Ipv6Address NetmaskFromNumber(int length);
  const Ipv6Address& GetAddress() const { return address_; }
  int GetNetmask() const { return prefixLength_; }
  /// "address/len".
  std::string GetStringAddress() const;
  bool Contains(const Ipv6Address& address) const;
  int GetIpv6AddressType() const { return type_; }
  int GetIpv6AddressStatus() const { return status_; }
  void SetIpv6AddressType(int type) { type_ = type; }
  void SetIpv6AddressStatus(int status) { status_ = status; }
  bool operator==(const Ipv6Network& other) const {
    return address_ == other.address_ && prefixLength_ == other.prefixLength_;
  }

private:
  Ipv6Address address_;  ///< The address (host bits kept).
  int prefixLength_ = 0; ///< 0 to 128.
  int type_ = 0;         ///< Address type code (7 autoconf, 9 DHCP, else static).
  int status_ = 0;       ///< Status code (2 tentative, 3 duplicated, 5 deprecated).
};

} // namespace HostCtl::Network
