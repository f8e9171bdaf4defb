//===- TvkCtl/Network/HostsFile.h - The host's name table -----------------===//
//
// The host's table of IP address to host name associations. Users add and
// remove their own entries; the host's system entries (its own names and the
// loopback names) are kept beside them and are neither listed nor removable
// through the user operations. HostsFile is a handle: every operation is the
// session's host's.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Backend {
class HostsTable;
} // namespace HostCtl::Backend

namespace TvkCtl::Network {

/// One entry of the hosts table.
class HostsFileEntry {
public:
  HostsFileEntry(std::string ipAddress, std::string hostName, std::vector<std::string> aliases,
                 std::string comment)
      : ip_(std::move(ipAddress)), host_(std::move(hostName)), aliases_(std::move(aliases)),
        comment_(std::move(comment)) {}
  const std::string& GetIpAddress() const { return ip_; }
  const std::string& GetHostName() const { return host_; }
  const std::vector<std::string>& GetAliases() const { return aliases_; }
  const std::string& GetComment() const { return comment_; }

private:
  std::string ip_;                   ///< Canonical address text.
  std::string host_;                 ///< Host name.
  std::vector<std::string> aliases_; ///< Further names, in order.
  std::string comment_;              ///< One line of text; may be empty.
};

class HostsFile {
public:
  HostsFile();
  ~HostsFile();

  /// Adds a user entry. Refuses a malformed address, host name or alias, a
  /// comment of more than one line, and an entry whose address and host name
  /// are already in the table.
  void AddEntryFromUser(const std::string& ip, const std::string& hostname,
                        const std::vector<std::string>& aliases, const std::string& comment);
  /// Removes the user entry of that address and host name; refuses when there
  /// is none (or it is a system entry).
  void RemoveEntryFromUser(const std::string& ip, const std::string& hostname);
  /// The user entries in the order they were added.
  std::vector<std::shared_ptr<HostsFileEntry>> GetEntriesFromConfig();

  /// Whether \p name is a valid host name (RFC 1123 labels).
  static bool IsValidHostName(const std::string& name);

private:
  std::unique_ptr<HostCtl::Backend::HostsTable> ops_; ///< The host's operations.
};

} // namespace TvkCtl::Network
