//===- TvkCtl/Network/HostsFile.h - The host's name table -----------------===//
//
// The host's table of IP address to host name associations. Users add and
// remove their own entries; the host's system entries (its own names and the
// loopback names) are kept beside them and are neither listed nor removable
// through the user operations.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "backend/Backend.h"

#include <memory>
#include <string>
#include <vector>

namespace Sim {

using TvkCtl::Network::HostsFileEntry;

class HostsFile : public HostCtl::Backend::HostsTable {
public:
  HostsFile();
  ~HostsFile();

  /// Adds a user entry. Refuses a malformed address, host name or alias, a
  /// comment of more than one line, and an entry whose address and host name
  /// are already in the table.
  void AddEntryFromUser(const std::string& ip, const std::string& hostname,
                        const std::vector<std::string>& aliases,
                        const std::string& comment) override;
  /// Removes the user entry of that address and host name; refuses when there
  /// is none (or it is a system entry).
  void RemoveEntryFromUser(const std::string& ip, const std::string& hostname) override;
  /// The user entries in the order they were added.
  std::vector<std::shared_ptr<HostsFileEntry>> GetEntriesFromConfig() override;
};

} // namespace Sim
