//===- TvkCtl/Network/DnsConfigImpl.h - Resolver configuration -----------===//
//
// The resolver configuration of one netstack instance: its ordered DNS
// servers and search domains. Changes are checked when they are made and
// written by SaveConfig, which applies them, in order, to the configuration
// as it is stored at that moment (so that changes made meanwhile by another
// process are kept). A handle: every operation is the session's host's.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/IpAddress.h"

#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Backend {
class Dns;
} // namespace HostCtl::Backend

namespace TvkCtl::Network {

class DnsConfigImpl {
public:
  /// The configuration of netstack \p netstackKey (checked when first used).
  explicit DnsConfigImpl(const std::string& netstackKey);
  ~DnsConfigImpl();

  /// Reads the stored configuration again; refuses a netstack that does not
  /// exist. Changes not yet saved are kept.
  void Refresh();

  /// Appends a server; refuses one already in the list.
  void AddUserNameServer(const HostCtl::Network::IpAddress& address);
  /// Removes a server; refuses one not in the list.
  void RemoveNameServer(const HostCtl::Network::IpAddress& address);
  /// Removes every server.
  void RemoveNameServers();
  /// The servers in order of use.
  std::vector<std::string> GetNameServers();

  /// Appends a search domain; refuses a malformed or duplicate one.
  void AddUserSearchDomain(const std::string& domain);
  /// Removes a search domain; refuses one not in the list.
  void RemoveSearchDomain(const std::string& domain);
  /// The search domains in search order, separated by blanks.
  std::string GetSearchDomainsString();

  /// Writes the changes made through this object.
  void SaveConfig();

private:
  std::unique_ptr<HostCtl::Backend::Dns> ops_; ///< The host's operations.
};

} // namespace TvkCtl::Network
