//===- HostCtl/System/FirewallRuleset.h - One ruleset of the host firewall -===//
//
// The host firewall groups its port rules into rulesets, one per service. A
// ruleset is enabled or disabled, allows every remote address or only those on
// its allowed-IP list, and counts the clients that use it.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Address.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace HostCtl::System {

/// One port rule of a ruleset.
struct FirewallPortRule {
  int32_t portType = 0;  ///< 1 destination port, any other value source port.
  int32_t portBegin = 0; ///< First port of the range.
  int32_t portEnd = 0;   ///< Last port of the range.
  int32_t direction = 0; ///< 0 inbound, any other value outbound.
  int32_t protocol = 0;  ///< 0 TCP, any other value UDP.
};

/// The allowed-IP list of a ruleset, by kind; each sequence keeps the order in
/// which its entries were added.
struct FirewallAllowedIps {
  std::vector<Network::Ipv4Address> ipv4Addresses; ///< Single IPv4 addresses.
  std::vector<Network::Ipv4Network> ipv4Networks;  ///< IPv4 networks.
  std::vector<Network::Ipv6Address> ipv6Addresses; ///< Single IPv6 addresses.
  std::vector<Network::Ipv6Network> ipv6Networks;  ///< IPv6 networks.
};

/// The properties CheckConfigurable can be asked about.
enum FirewallRulesetProperty : int {
  FirewallEnabledState = 0,  ///< Whether the ruleset is enabled.
  FirewallAllowedIpMode = 1, ///< Allow-all flag and the allowed-IP list.
};

/// One firewall ruleset. Every operation reads the current state of the host
/// or changes it at once; a refusal throws HostCtl::Lib::HostCtlException.
class FirewallRuleset {
public:
  virtual ~FirewallRuleset() = default;

  /// The ruleset's label.
  virtual std::string GetRulesetId() const = 0;
  virtual bool IsEnabled() const = 0;
  /// Enables the ruleset (refused when its enabled state is fixed).
  virtual void Enable() = 0;
  /// Number of clients using the ruleset.
  virtual int64_t GetClientCount() const = 0;
  /// Adds a client; the first client enables the ruleset.
  virtual void AddClient() = 0;
  /// Removes a client; removing the last one disables the ruleset. Refused
  /// when the ruleset has no clients.
  virtual void RemoveClient() = 0;
  /// Disables the ruleset (refused when its enabled state is fixed).
  virtual void Disable() = 0;
  /// The port rules, in the ruleset's order.
  virtual std::vector<std::unique_ptr<FirewallPortRule>> GetRules() const = 0;
  /// The allowed-IP list.
  virtual std::unique_ptr<FirewallAllowedIps> GetAllowedIps() const = 0;
  /// Adds a single IPv4 or IPv6 address or a network ("address/length") to
  /// the allowed-IP list; refuses bad text and entries already on the list.
  virtual void AddAllowedIp(const std::string& text) = 0;
  /// Removes an entry from the allowed-IP list; refuses bad text and entries
  /// that are not on the list.
  virtual void RemoveAllowedIp(const std::string& text) = 0;
  /// Whether the ruleset exists (a lookup by id always returns an object).
  virtual bool IsValid() const = 0;
  /// Sets the allow-all flag (refused when the allowed-IP mode is fixed).
  virtual void SetAllowedAll(bool allowed) = 0;
  virtual bool IsAllowedAll() const = 0;
  /// Throws HostCtlException when a change of \p kind (a
  /// FirewallRulesetProperty) is refused. \p system is true for the host's own
  /// services, which may change fixed properties; users pass false.
  virtual void CheckConfigurable(int kind, bool system) const = 0;
  /// Whether the enabled state cannot be configured.
  virtual bool IsEnableDisableFixed() const = 0;
  /// Whether the allowed-IP setting cannot be configured.
  virtual bool IsAllowedIpFixed() const = 0;
};

} // namespace HostCtl::System
