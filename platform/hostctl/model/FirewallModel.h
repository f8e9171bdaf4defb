//===- model/FirewallModel.h - Helpers of the firewall part ---------------===//
#pragma once

#include "model/Store.h"

#include <string>

namespace Model {

/// Kinds of allowed-IP entries, in the order of the allowed-IP set.
enum AllowedIpKind : int {
  AllowedIpv4Address = 0,
  AllowedIpv4Network = 1,
  AllowedIpv6Address = 2,
  AllowedIpv6Network = 3,
};

/// One parsed allowed-IP entry in its canonical text (networks with their
/// host bits cleared, "address/length").
struct AllowedIpEntry {
  AllowedIpKind kind = AllowedIpv4Address; ///< What the text names.
  std::string text;                        ///< Canonical text.
};

/// Parses a single IPv4 or IPv6 address or an IPv4 or IPv6 network; false
/// for anything else.
bool ParseAllowedIp(const std::string& text, AllowedIpEntry& entry);

/// Whether the firewall module is loaded.
bool IsFirewallModuleLoaded(Store& store);

} // namespace Model
