//===- LinuxNet/Files.h - resolv.conf and hosts of a namespace ------------===//
//
// The resolver configuration and the hosts table are files
// (Namespace::ResolvConfPath, HostsPath). Each is parsed into its lines; an
// edit changes only the lines it manages (nameserver, search and domain
// lines; the host entries it adds or removes) and keeps every other line,
// comments included, as it was. A file is rewritten atomically: a
// temporary file in the same directory is written and synced, renamed over
// the old one, and the directory synced, so a crash leaves the old or the
// new file. Writers through this library are serialised by a lock on the
// directory, so two of them never lose each other's edits.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace LinuxNet {

/// A resolv.conf.
class ResolvConf {
public:
  static ResolvConf Parse(const std::string& text);
  /// The file's lines; a missing file is an empty one.
  static ResolvConf Load(const std::string& path);

  /// Server addresses, in order.
  std::vector<std::string> Nameservers() const;
  /// The search list in effect (the last search or domain line).
  std::vector<std::string> SearchDomains() const;

  /// Appends a server after the last one; refuses a malformed address and
  /// one already listed.
  void AddNameserver(const std::string& address);
  /// Removes a server; refuses one not listed.
  void RemoveNameserver(const std::string& address);
  void RemoveAllNameservers();
  /// Appends a domain to the search list; refuses a malformed or listed one.
  void AddSearchDomain(const std::string& domain);
  /// Removes a domain from the search list; refuses one not listed.
  void RemoveSearchDomain(const std::string& domain);
  /// Replaces the search list (one search line, where the last one was).
  void SetSearchDomains(const std::vector<std::string>& domains);

  /// The file's text.
  std::string Text() const;

private:
  std::vector<std::string> lines_; ///< Lines without their newline.
};

/// One entry of a hosts file.
struct HostsEntry {
  std::string address;            ///< Address as written.
  std::vector<std::string> names; ///< Canonical name, then aliases.
  std::string comment;            ///< Text after '#', trimmed; empty for none.
};

/// A hosts file.
class HostsFile {
public:
  static HostsFile Parse(const std::string& text);
  static HostsFile Load(const std::string& path);

  /// Every entry, in file order.
  std::vector<HostsEntry> Entries() const;
  /// Appends an entry; refuses a malformed address or name, a comment of more
  /// than one line, and an entry with the same address and name.
  void Add(const std::string& address, const std::vector<std::string>& names,
           const std::string& comment = {});
  /// Removes the entries of \p address whose canonical name is \p name;
  /// refuses when there is none.
  void Remove(const std::string& address, const std::string& name);

  std::string Text() const;

private:
  std::vector<std::string> lines_; ///< Lines without their newline.
};

/// Whether \p name is a valid host or domain name (RFC 1123 labels).
bool IsValidHostName(const std::string& name);

/// The file's content; "" for a missing file.
std::string ReadTextFile(const std::string& path);
/// Replaces \p path atomically (a symbolic link's target is replaced); keeps
/// the old file's mode and owner; creates missing parent directories.
void WriteFileAtomically(const std::string& path, const std::string& content);
/// Under the directory's lock: reads the file, calls \p edit with its text,
/// and writes what \p edit returns when it differs.
void UpdateTextFile(const std::string& path,
                    const std::function<std::string(const std::string&)>& edit);
/// UpdateTextFile for the two kinds of file.
void UpdateResolvConf(const std::string& path, const std::function<void(ResolvConf&)>& edit);
void UpdateHostsFile(const std::string& path, const std::function<void(HostsFile&)>& edit);

} // namespace LinuxNet
