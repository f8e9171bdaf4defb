//===- Address.cpp - MAC, IPv4 and IPv6 values -----------------------------===//
#include "HostCtl/Network/Address.h"

#include "HostCtl/Lib.h"

#include <cstdio>

namespace HostCtl::Network {

using HostCtl::Lib::HostCtlException;

namespace {

int HexValue(char c) {
  if (c >= '0' && c <= '9')
    return c - '0';
  if (c >= 'a' && c <= 'f')
    return c - 'a' + 10;
  if (c >= 'A' && c <= 'F')
    return c - 'A' + 10;
  return -1;
}

/// A decimal number without sign or leading zeros, at most \p max.
bool ParseDecimal(const std::string& text, std::size_t begin, std::size_t end, unsigned max,
                  unsigned& value) {
  if (begin >= end || end - begin > 10)
    return false;
  if (text[begin] == '0' && end - begin > 1)
    return false;
  unsigned long long n = 0;
  for (std::size_t i = begin; i < end; ++i) {
    if (text[i] < '0' || text[i] > '9')
      return false;
    n = n * 10 + static_cast<unsigned>(text[i] - '0');
  }
  if (n > max)
    return false;
  value = static_cast<unsigned>(n);
  return true;
}

/// Four decimal octets (0 to 255, no leading zeros) separated by dots, in one
/// pass: listings parse a stored address or two for every row.
bool ParseIpv4Range(const std::string& text, std::size_t begin, std::size_t end, uint32_t& value) {
  uint32_t result = 0;
  int dots = 0;
  unsigned octet = 0;
  std::size_t digits = 0;
  bool leadingZero = false;
  for (std::size_t i = begin; i <= end; ++i) {
    if (i == end || text[i] == '.') {
      if (digits == 0 || (leadingZero && digits > 1))
        return false;
      result = (result << 8) | octet;
      if (i == end)
        break;
      if (++dots > 3)
        return false;
      octet = 0;
      digits = 0;
      continue;
    }
    char c = text[i];
    if (c < '0' || c > '9')
      return false;
    if (digits == 0)
      leadingZero = c == '0';
    octet = octet * 10 + static_cast<unsigned>(c - '0');
    if (octet > 255)
      return false;
    ++digits;
  }
  if (dots != 3)
    return false;
  value = result;
  return true;
}

/// Splits "address/prefix"; false without exactly one "/".
bool SplitPrefix(const std::string& text, std::string& address, unsigned max, unsigned& prefix) {
  std::size_t slash = text.find('/');
  if (slash == std::string::npos || text.find('/', slash + 1) != std::string::npos)
    return false;
  address = text.substr(0, slash);
  return ParseDecimal(text, slash + 1, text.size(), max, prefix);
}

} // namespace

// --- MacAddress ------------------------------------------------------------

bool MacAddress::Parse(const std::string& text, std::array<uint8_t, 6>& bytes) {
  if (text.size() != 17)
    return false;
  char separator = text[2];
  if (separator != ':' && separator != '-')
    return false;
  for (std::size_t i = 0; i < 6; ++i) {
    int high = HexValue(text[i * 3]);
    int low = HexValue(text[i * 3 + 1]);
    if (high < 0 || low < 0)
      return false;
    if (i < 5 && text[i * 3 + 2] != separator)
      return false;
    bytes[i] = static_cast<uint8_t>(high * 16 + low);
  }
  return true;
}

MacAddress::MacAddress(const std::string& text) {
  if (!Parse(text, bytes_))
    throw HostCtlException("Invalid MAC address: " + text);
}

bool MacAddress::IsValid(const std::string& text) {
  std::array<uint8_t, 6> bytes{};
  if (!Parse(text, bytes))
    return false;
  MacAddress mac(bytes);
  return !mac.IsUnset() && !mac.IsMulticast();
}

std::string MacAddress::GetStringAddress() const {
  char text[18];
  std::snprintf(text, sizeof text, "%02x:%02x:%02x:%02x:%02x:%02x", bytes_[0], bytes_[1], bytes_[2],
                bytes_[3], bytes_[4], bytes_[5]);
  return text;
}

bool MacAddress::IsUnset() const {
  for (uint8_t b : bytes_)
    if (b != 0)
      return false;
  return true;
}

// --- Ipv4Address -----------------------------------------------------------

bool Ipv4Address::Parse(const std::string& text, uint32_t& hostOrder) {
  return ParseIpv4Range(text, 0, text.size(), hostOrder);
}

Ipv4Address::Ipv4Address(const std::string& text) {
  if (!Parse(text, value_))
    throw HostCtlException("Invalid IPv4 address: " + text);
}

bool Ipv4Address::IsValidAddress(const std::string& text) {
  uint32_t value = 0;
  return Parse(text, value);
}

std::string Ipv4Address::GetStringAddress() const {
  // Written by hand: listings of many routes format several addresses a row,
  // and snprintf was most of their cost.
  char text[16];
  char* end = text;
  for (int shift = 24; shift >= 0; shift -= 8) {
    unsigned byte = (value_ >> shift) & 0xff;
    if (byte >= 100)
      *end++ = static_cast<char>('0' + byte / 100);
    if (byte >= 10)
      *end++ = static_cast<char>('0' + byte / 10 % 10);
    *end++ = static_cast<char>('0' + byte % 10);
    if (shift)
      *end++ = '.';
  }
  return std::string(text, end);
}

bool Ipv4Address::IsNetmask() const {
  uint32_t inverted = ~value_;
  return (inverted & (inverted + 1)) == 0;
}

int Ipv4Address::PrefixLength() const {
  int length = 0;
  for (uint32_t v = value_; v & 0x80000000u; v <<= 1)
    ++length;
  return length;
}

Ipv4Address Ipv4Address::FromPrefixLength(int length) {
  if (length <= 0)
    return Ipv4Address(0u);
  if (length >= 32)
    return Ipv4Address(0xffffffffu);
  return Ipv4Address(~((1u << (32 - length)) - 1));
}

// --- Ipv6Address -----------------------------------------------------------

bool Ipv6Address::Parse(const std::string& text, std::array<uint8_t, 16>& bytes) {
  if (text.empty() || text.size() > 45)
    return false;
  uint16_t groups[8] = {};
  int count = 0;
  int gap = -1; // Index of the group where "::" stands.
  std::size_t pos = 0;
  const std::size_t end = text.size();
  if (text.compare(0, 2, "::") == 0) {
    gap = 0;
    pos = 2;
    if (pos == end) {
      bytes.fill(0);
      return true;
    }
  } else if (text[0] == ':') {
    return false;
  }
  while (pos < end) {
    std::size_t stop = text.find(':', pos);
    if (stop == std::string::npos)
      stop = end;
    std::string_view group(text.data() + pos, stop - pos);
    if (group.find('.') != std::string_view::npos) {
      // An IPv4 tail takes the last two groups.
      if (stop != end || count > 6)
        return false;
      uint32_t v4 = 0;
      if (!ParseIpv4Range(text, pos, end, v4))
        return false;
      groups[count++] = static_cast<uint16_t>(v4 >> 16);
      groups[count++] = static_cast<uint16_t>(v4 & 0xffff);
      pos = end;
      break;
    }
    if (group.empty() || group.size() > 4 || count >= 8)
      return false;
    unsigned value = 0;
    for (char c : group) {
      int h = HexValue(c);
      if (h < 0)
        return false;
      value = value * 16 + static_cast<unsigned>(h);
    }
    groups[count++] = static_cast<uint16_t>(value);
    if (stop == end) {
      pos = end;
      break;
    }
    // stop points at ':'; "::" marks the gap.
    if (stop + 1 < end && text[stop + 1] == ':') {
      if (gap >= 0)
        return false;
      gap = count;
      pos = stop + 2;
      if (pos == end)
        break;
      if (text[pos] == ':')
        return false;
    } else {
      pos = stop + 1;
      if (pos == end)
        return false; // A single trailing ':'.
    }
  }
  if (gap < 0 && count != 8)
    return false;
  if (gap >= 0 && count > 7)
    return false;
  uint16_t full[8] = {};
  if (gap < 0) {
    for (int i = 0; i < 8; ++i)
      full[i] = groups[i];
  } else {
    int tail = count - gap;
    for (int i = 0; i < gap; ++i)
      full[i] = groups[i];
    for (int i = 0; i < tail; ++i)
      full[8 - tail + i] = groups[gap + i];
  }
  for (std::size_t i = 0; i < 8; ++i) {
    bytes[i * 2] = static_cast<uint8_t>(full[i] >> 8);
    bytes[i * 2 + 1] = static_cast<uint8_t>(full[i] & 0xff);
  }
  return true;
}

Ipv6Address::Ipv6Address(const std::string& text) {
  if (!Parse(text, bytes_))
    throw HostCtlException("Invalid IPv6 address: " + text);
}

bool Ipv6Address::IsValidAddress(const std::string& text) {
  std::array<uint8_t, 16> bytes{};
  return Parse(text, bytes);
}

bool Ipv6Address::IsUnspecified() const {
  for (uint8_t b : bytes_)
    if (b != 0)
      return false;
  return true;
}

std::string Ipv6Address::GetStringAddress() const {
  uint16_t groups[8];
  for (std::size_t i = 0; i < 8; ++i)
    groups[i] = static_cast<uint16_t>((bytes_[i * 2] << 8) | bytes_[i * 2 + 1]);
  // The longest run of two or more zero groups is written as "::" (the first
  // one when runs tie).
  int bestStart = -1, bestLength = 0;
  for (int i = 0; i < 8;) {
    if (groups[i] != 0) {
      ++i;
      continue;
    }
    int j = i;
    while (j < 8 && groups[j] == 0)
      ++j;
    if (j - i > bestLength && j - i >= 2) {
      bestStart = i;
      bestLength = j - i;
    }
    i = j;
  }
  std::string out;
  char buffer[8];
  for (int i = 0; i < 8; ++i) {
    if (i == bestStart) {
      out += "::";
      i += bestLength - 1;
      continue;
    }
    if (!out.empty() && out.back() != ':')
      out += ':';
    std::snprintf(buffer, sizeof buffer, "%x", groups[i]);
    out += buffer;
  }
  return out;
}

// --- Ipv4Network -----------------------------------------------------------

Ipv4Network::Ipv4Network(const std::string& text) {
  std::size_t slash = text.find('/');
  if (slash == std::string::npos)
    throw HostCtlException("Invalid IPv4 network: " + text);
  std::string address = text.substr(0, slash);
  std::string mask = text.substr(slash + 1);
  uint32_t value = 0;
  if (!Ipv4Address::Parse(address, value))
    throw HostCtlException("Invalid IPv4 network: " + text);
  network_ = Ipv4Address(value);
  unsigned prefix = 0;
  uint32_t maskValue = 0;
  if (ParseDecimal(mask, 0, mask.size(), 32, prefix)) {
    netmask_ = Ipv4Address::FromPrefixLength(static_cast<int>(prefix));
  } else if (Ipv4Address::Parse(mask, maskValue) && Ipv4Address(maskValue).IsNetmask()) {
    netmask_ = Ipv4Address(maskValue);
  } else {
    throw HostCtlException("Invalid IPv4 network: " + text);
  }
}

bool Ipv4Network::IsValidNetwork(const std::string& text) {
  try {
    Ipv4Network network(text);
    return true;
  } catch (const HostCtlException&) {
    return false;
  }
}

std::string Ipv4Network::GetStringAddress() const {
  return network_.GetStringAddress() + "/" + std::to_string(netmask_.PrefixLength());
}

bool Ipv4Network::Contains(const Ipv4Address& address) const {
  uint32_t mask = netmask_.GetValue();
  return (address.GetValue() & mask) == (network_.GetValue() & mask);
}

// --- Ipv6Network -----------------------------------------------------------

Ipv6Network::Ipv6Network(const std::string& text) {
  std::string address;
  unsigned prefix = 0;
  std::array<uint8_t, 16> bytes{};
  if (!SplitPrefix(text, address, 128, prefix) || !Ipv6Address::Parse(address, bytes))
    throw HostCtlException("Invalid IPv6 network: " + text);
  address_ = Ipv6Address(bytes);
  prefixLength_ = static_cast<int>(prefix);
}

bool Ipv6Network::IsValidAddressAndNetmask(const std::string& text) {
  std::string address;
  unsigned prefix = 0;
  return SplitPrefix(text, address, 128, prefix) && Ipv6Address::IsValidAddress(address);
}

Ipv6Address Ipv6Network::NetmaskFromNumber(int length) {
  std::array<uint8_t, 16> bytes{};
  for (int i = 0; i < 16 && length > 0; ++i) {
    int bits = length >= 8 ? 8 : length;
    bytes[i] = static_cast<uint8_t>(0xff << (8 - bits));
    length -= bits;
  }
  return Ipv6Address(bytes);
}

std::string Ipv6Network::GetStringAddress() const {
  return address_.GetStringAddress() + "/" + std::to_string(prefixLength_);
}

bool Ipv6Network::Contains(const Ipv6Address& address) const {
  const auto mask = NetmaskFromNumber(prefixLength_).GetBytes();
  for (int i = 0; i < 16; ++i)
    if ((address.GetBytes()[i] & mask[i]) != (address_.GetBytes()[i] & mask[i]))
      return false;
  return true;
}

} // namespace HostCtl::Network
