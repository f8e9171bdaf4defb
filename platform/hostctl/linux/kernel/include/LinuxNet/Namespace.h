//===- LinuxNet/Namespace.h - A network namespace to work in --------------===//
//
// Every operation of the library acts on one Namespace: the network namespace
// the process runs in, or one that `ip netns` named (/run/netns/NAME). The
// library enters a named namespace only to create the sockets it needs and
// returns to the caller's namespace at once; sockets stay bound to the
// namespace they were made in. Sockets are made on first use, so opening a
// Namespace costs one open(2).
//
//===----------------------------------------------------------------------===//
#pragma once

#include <memory>
#include <string>
#include <vector>

namespace LinuxNet {

namespace Detail {
struct Sockets;
}

class Namespace {
public:
  /// "" opens the namespace of the calling thread; "NAME" opens
  /// /run/netns/NAME. Throws Error(ENOENT) "the network namespace NAME does
  /// not exist" when it is missing.
  static Namespace Open(const std::string& name);

  Namespace(Namespace&&) noexcept;
  Namespace& operator=(Namespace&&) noexcept;
  ~Namespace();

  /// The name given to Open ("" for the process's own namespace).
  const std::string& Name() const;
  /// Whether this is the process's own namespace.
  bool IsOwn() const { return Name().empty(); }
  /// The resolver file as `ip netns exec` arranges it: /etc/resolv.conf, or
  /// /etc/netns/NAME/resolv.conf for a named namespace.
  std::string ResolvConfPath() const;
  /// /etc/hosts, or /etc/netns/NAME/hosts.
  std::string HostsPath() const;
  /// A socket(2) made inside the namespace; the caller owns the descriptor.
  int OpenSocket(int domain, int type, int protocol) const;

  /// The library's sockets (internal).
  Detail::Sockets& Internals() const { return *sockets_; }

private:
  explicit Namespace(std::unique_ptr<Detail::Sockets> sockets);
  std::unique_ptr<Detail::Sockets> sockets_; ///< Descriptor and sockets.
};

/// The names under /run/netns that are network namespaces, sorted.
std::vector<std::string> ListNamespaces();
/// Creates /run/netns/NAME as `ip netns add` does; refuses an existing name.
/// The calling thread never leaves its namespace.
void CreateNamespace(const std::string& name);
/// Removes /run/netns/NAME as `ip netns delete` does (the namespace itself
/// goes when its last user does). /etc/netns/NAME is left alone.
void DeleteNamespace(const std::string& name);

} // namespace LinuxNet
