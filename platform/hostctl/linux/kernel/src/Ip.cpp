//===- Ip.cpp - Address text and binary forms ------------------------------===//
#include "LinuxNet/Ip.h"
#include "LinuxNet/Error.h"

#include <arpa/inet.h>

#include <cerrno>
#include <cstring>

namespace LinuxNet {

std::optional<IpAddress> IpAddress::TryParse(const std::string& text) {
  IpAddress a;
  if (text.find(':') != std::string::npos) {
    if (inet_pton(AF_INET6, text.c_str(), a.bytes.data()) != 1)
      return std::nullopt;
    a.family = Family::Ipv6;
  } else {
    if (inet_pton(AF_INET, text.c_str(), a.bytes.data()) != 1)
      return std::nullopt;
    a.family = Family::Ipv4;
  }
  return a;
}

IpAddress IpAddress::Parse(const std::string& text) {
  auto a = TryParse(text);
  if (!a)
    throw Error(EINVAL, "'" + text + "' is not an IPv4 or IPv6 address");
  return *a;
}

IpAddress IpAddress::FromBytes(const void* data, std::size_t length) {
  IpAddress a;
  if (length == 4)
    a.family = Family::Ipv4;
  else if (length == 16)
    a.family = Family::Ipv6;
  else
    return a;
  memcpy(a.bytes.data(), data, length);
  return a;
}

std::string IpAddress::ToString() const {
  char text[INET6_ADDRSTRLEN] = {};
  if (family == Family::None ||
      !inet_ntop(static_cast<int>(family), bytes.data(), text, sizeof text))
    return {};
  return text;
}

IpPrefix IpPrefix::Parse(const std::string& text) {
  IpPrefix p;
  const auto slash = text.find('/');
  p.address = IpAddress::Parse(text.substr(0, slash));
  const unsigned max = p.address.family == Family::Ipv4 ? 32 : 128;
  if (slash == std::string::npos) {
    p.length = static_cast<uint8_t>(max);
    return p;
  }
  const std::string digits = text.substr(slash + 1);
  unsigned length = 0;
  bool ok = !digits.empty() && digits.size() <= 3;
  for (char c : digits) {
    ok = ok && c >= '0' && c <= '9';
    length = length * 10 + static_cast<unsigned>(c - '0');
  }
  if (!ok || length > max)
    throw Error(EINVAL, "'" + text + "' is not a valid prefix");
  p.length = static_cast<uint8_t>(length);
  return p;
}

std::string IpPrefix::ToString() const {
  if (length == 0)
    return "default";
  return address.ToString() + "/" + std::to_string(length);
}

std::string FormatHwAddress(const HwAddress& bytes) {
  static const char digits[] = "0123456789abcdef";
  std::string text;
  text.reserve(bytes.size() * 3);
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    if (i)
      text += ':';
    text += digits[bytes[i] >> 4];
    text += digits[bytes[i] & 15];
  }
  return text;
}

HwAddress ParseHwAddress(const std::string& text) {
  HwAddress bytes;
  auto hex = [](char c) -> int {
    if (c >= '0' && c <= '9')
      return c - '0';
    if (c >= 'a' && c <= 'f')
      return c - 'a' + 10;
    if (c >= 'A' && c <= 'F')
      return c - 'A' + 10;
    return -1;
  };
  std::size_t i = 0;
  while (i < text.size()) {
    int hi = hex(text[i]);
    int lo = i + 1 < text.size() ? hex(text[i + 1]) : -1;
    if (hi < 0 || lo < 0)
      break;
    bytes.push_back(static_cast<uint8_t>(hi * 16 + lo));
    i += 2;
    if (i == text.size())
      return bytes;
    if (text[i] != ':')
      break;
    ++i;
  }
  throw Error(EINVAL, "'" + text + "' is not a hardware address");
}

} // namespace LinuxNet
