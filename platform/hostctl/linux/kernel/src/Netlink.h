//===- Netlink.h - Sockets, requests and refusals (internal) --------------===//
//
// The library's plumbing: the sockets of one namespace, made on first use
// while the calling thread is inside it; a receive loop over libnl's buffers
// that hands each reply to a callback without copying it; and the one place
// where a kernel refusal becomes a LinuxNet::Error message.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "LinuxNet/Error.h"
#include "LinuxNet/Ip.h"
#include "LinuxNet/Namespace.h"

#include <netlink/addr.h>
#include <netlink/msg.h>
#include <netlink/netlink.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace LinuxNet::Detail {

/// What a request acts on, so that a refusal can name it.
struct Subject {
  std::string object;       ///< "vmnic0", "route 10.1.0.0/24", "the IPsec policies".
  bool change = true;       ///< A change (false: a read).
  std::string feature = {}; ///< "ring parameters": what a driver may lack.
  std::string driver = {};  ///< The driver, when known, for "does not support".
};

/// Throws the Error for errno \p err on \p subject; \p kernelText is the
/// kernel's own reason (netlink extended ack), if it gave one.
[[noreturn]] void Fail(int err, const Subject& subject, const std::string& kernelText = {});
/// Throws Error(EINVAL, message).
[[noreturn]] void Invalid(const std::string& message);

/// Owns an nl_msg.
struct MsgDeleter {
  void operator()(nl_msg* m) const { nlmsg_free(m); }
};
using MsgPtr = std::unique_ptr<nl_msg, MsgDeleter>;
/// Allocates a message or throws ENOMEM.
MsgPtr NewMsg(int type, int flags);
/// Owns an nl_addr.
struct AddrDeleter {
  void operator()(nl_addr* a) const { nl_addr_put(a); }
};
using AddrPtr = std::unique_ptr<nl_addr, AddrDeleter>;
AddrPtr ToNlAddr(const IpAddress& address, int prefixLength = -1);
AddrPtr ToNlAddr(const HwAddress& address);
IpAddress FromNlAddr(const nl_addr* address);

/// A netlink socket of one protocol with a receive loop that keeps the
/// kernel's errno and extended-ack text.
class NlSocket {
public:
  /// Connects a socket of \p protocol in the calling thread's namespace.
  explicit NlSocket(int protocol);
  ~NlSocket();
  NlSocket(const NlSocket&) = delete;
  NlSocket& operator=(const NlSocket&) = delete;

  nl_sock* Get() const { return sk_; }
  /// Sends \p msg and waits for the acknowledgement; \p onReply sees every
  /// reply that comes before it. Throws on a refusal.
  void Request(nl_msg* msg, const Subject& subject,
               const std::function<void(nlmsghdr*)>& onReply = {});
  /// Sends a dump request (NLM_F_DUMP set by the caller) and calls \p onReply
  /// for each message until the dump is done. Throws on a refusal.
  void Dump(nl_msg* msg, const Subject& subject, const std::function<void(nlmsghdr*)>& onReply);
  /// Checks the result of a libnl call made on this socket; throws with the
  /// errno the kernel gave when \p rc is negative.
  void Check(int rc, const Subject& subject);

  /// Error callback state (the kernel's last refusal).
  int lastError = 0;
  std::string lastText;

private:
  void Receive(uint32_t seq, const Subject& subject, const std::function<void(nlmsghdr*)>& onReply);
  nl_sock* sk_ = nullptr;
};

/// The descriptor of a namespace and the sockets made in it.
struct Sockets {
  std::string name; ///< "" for the process's own namespace.
  int fd = -1;      ///< /run/netns/NAME, or -1 for the own namespace.
  std::unique_ptr<NlSocket> route, genl, xfrm, diag;
  int ioctlFd = -1;      ///< For SIOCETHTOOL.
  int ethtoolFamily = 0; ///< Generic netlink family id of "ethtool".
  ~Sockets();

  NlSocket& Route();
  NlSocket& Genl();
  NlSocket& Xfrm();
  NlSocket& Diag();
  int Ioctl();
  /// Resolves the "ethtool" family once.
  int EthtoolFamily();
};

/// While alive, the calling thread is inside the namespace of \p sockets (no
/// effect for the own namespace); the destructor returns it to where it was.
class Entered {
public:
  explicit Entered(const Sockets& sockets);
  ~Entered();
  Entered(const Entered&) = delete;
  Entered& operator=(const Entered&) = delete;

private:
  int saved_ = -1; ///< The thread's namespace before, or -1.
};

/// The interface index of \p name in the namespace; throws ENODEV
/// "the link NAME does not exist" when there is none.
int IfIndex(Namespace& ns, const std::string& name);
/// Link names by interface index (one light dump); missing indexes are "".
class NameTable {
public:
  explicit NameTable(Namespace& ns);
  const std::string& operator[](int index) const {
    static const std::string none;
    return index > 0 && static_cast<std::size_t>(index) < names_.size() ? names_[index] : none;
  }

private:
  std::vector<std::string> names_; ///< Indexed by ifindex.
};

/// The driver name of a link (empty when unknown); used in messages.
std::string DriverName(Namespace& ns, const std::string& name);
/// Rethrows \p e, a refusal of an operation on link \p dev: a missing
/// device as "the link DEV does not exist", a missing operation naming the
/// driver and \p subject's feature, anything else as it is.
[[noreturn]] void RethrowForLink(Namespace& ns, const std::string& dev, Subject subject,
                                 const Error& e);

} // namespace LinuxNet::Detail
