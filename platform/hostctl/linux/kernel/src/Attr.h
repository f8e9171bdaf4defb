//===- Attr.h - Reading netlink attributes safely (internal) --------------===//
//
// Attributes are parsed without a libnl policy, so every read checks the
// attribute's length before it copies.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <netlink/attr.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <string>

namespace LinuxNet::Detail {

/// Copies a fixed-size payload; false when the attribute is absent or short.
template <typename T> bool Get(const nlattr* a, T& out) {
  if (!a || nla_len(a) < static_cast<int>(sizeof(T)))
    return false;
  memcpy(&out, nla_data(a), sizeof(T));
  return true;
}

/// Copies a structure that grows with kernel versions: a shorter payload
/// (older kernel) fills the front, a longer one (newer kernel) is cut.
template <typename T> bool GetGrowing(const nlattr* a, T& out) {
  if (!a)
    return false;
  out = T{};
  memcpy(&out, nla_data(a), std::min(sizeof(T), static_cast<std::size_t>(nla_len(a))));
  return true;
}

/// The value of an integer attribute, or \p fallback.
template <typename T> T Value(const nlattr* a, T fallback = 0) {
  T v{};
  return Get(a, v) ? v : fallback;
}

/// A string attribute (NUL-terminated or not).
inline std::string String(const nlattr* a) {
  if (!a)
    return {};
  const auto* p = static_cast<const char*>(nla_data(a));
  return std::string(p, strnlen(p, static_cast<std::size_t>(nla_len(a))));
}

/// The payload of an attribute as bytes.
inline std::basic_string<uint8_t> Bytes(const nlattr* a) {
  if (!a)
    return {};
  const auto* p = static_cast<const uint8_t*>(nla_data(a));
  return std::basic_string<uint8_t>(p, p + nla_len(a));
}

/// Parses the attributes nested in \p a into \p tb[0..max].
inline bool ParseNested(nlattr** tb, int max, const nlattr* a) {
  for (int i = 0; i <= max; ++i)
    tb[i] = nullptr;
  return a && nla_parse_nested(tb, max, const_cast<nlattr*>(a), nullptr) == 0;
}

} // namespace LinuxNet::Detail
