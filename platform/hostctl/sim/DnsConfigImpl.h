//===- TvkCtl/Network/DnsConfigImpl.h - Resolver configuration -----------===//
//
// The resolver configuration of one netstack instance: its ordered DNS
// servers and search domains. Changes are checked when they are made and
// written by SaveConfig, which applies them, in order, to the configuration
// as it is stored at that moment (so that changes made meanwhile by another
// process are kept).
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/IpAddress.h"
#include "backend/Backend.h"

#include <string>
#include <vector>

namespace Sim {

class DnsConfigImpl : public HostCtl::Backend::Dns {
public:
  /// The configuration of netstack \p netstackKey (checked when first used).
  explicit DnsConfigImpl(std::string netstackKey);

  /// Reads the stored configuration again; refuses a netstack that does not
  /// exist. Changes not yet saved are kept.
  void Refresh() override;

  /// Appends a server; refuses one already in the list.
  void AddUserNameServer(const HostCtl::Network::IpAddress& address) override;
  /// Removes a server; refuses one not in the list.
  void RemoveNameServer(const HostCtl::Network::IpAddress& address) override;
  /// Removes every server.
  void RemoveNameServers() override;
  /// The servers in order of use.
  std::vector<std::string> GetNameServers() override;

  /// Appends a search domain; refuses a malformed or duplicate one.
  void AddUserSearchDomain(const std::string& domain) override;
  /// Removes a search domain; refuses one not in the list.
  void RemoveSearchDomain(const std::string& domain) override;
  /// The search domains in search order, separated by blanks.
  std::string GetSearchDomainsString() override;

  /// Writes the changes made through this object.
  void SaveConfig() override;

private:
  /// One change not yet saved.
  struct Change {
    enum Kind { AddServer, RemoveServer, RemoveAllServers, AddDomain, RemoveDomain } kind;
    std::string value; ///< Server address text or domain.
  };

  /// Whether the list (the search domains with \p domain) holds \p value,
  /// changes not yet saved included.
  bool Has(bool domain, const std::string& value);
  /// Checks \p change against the list and keeps it for SaveConfig.
  void Record(Change change);
  /// Applies \p change to \p servers and \p domains; throws when it is refused.
  void Apply(const Change& change, std::vector<std::string>& servers,
             std::vector<std::string>& domains) const;

  std::string netstack_;             ///< Key of the netstack instance.
  bool loaded_ = false;              ///< servers_ and domains_ are current.
  std::vector<std::string> servers_; ///< Servers, changes included.
  std::vector<std::string> domains_; ///< Search domains, changes included.
  std::vector<Change> changes_;      ///< Changes not yet saved, in order.
};

} // namespace Sim
