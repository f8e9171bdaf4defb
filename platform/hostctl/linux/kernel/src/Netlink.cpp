//===- Netlink.cpp - Sockets, the receive loop and refusal messages -------===//
#include "Netlink.h"

#include <linux/ethtool.h>
#include <linux/sockios.h>
#include <net/if.h>
#include <netlink/genl/ctrl.h>
#include <netlink/genl/genl.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include <linux/netlink.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <fcntl.h>
#include <sched.h>
#include <unistd.h>

namespace LinuxNet::Detail {

namespace {

/// The reason for errno \p err in the words of a message.
std::string Reason(int err) {
  switch (err) {
  case EEXIST:
    return "already exists";
  case ESRCH:
  case ENOENT:
    return "not found";
  case ENODEV:
    return "no such device";
  case EBUSY:
    return "busy";
  case EADDRNOTAVAIL:
    return "no such address";
  case EOPNOTSUPP:
    return "not supported";
  default:
    break;
  }
  std::string text = strerror(err);
  // "Invalid argument" reads "invalid argument" after a colon; names such as
  // "IPv6" keep their case.
  if (text.size() > 1 && isupper(static_cast<unsigned char>(text[0])) &&
      islower(static_cast<unsigned char>(text[1])))
    text[0] = static_cast<char>(tolower(static_cast<unsigned char>(text[0])));
  return text;
}

/// errno for a libnl error code (libnl keeps only its own codes).
int ErrnoOf(int nlError) {
  switch (nlError < 0 ? -nlError : nlError) {
  case NLE_NOMEM:
    return ENOMEM;
  case NLE_PERM:
    return EPERM;
  case NLE_EXIST:
    return EEXIST;
  case NLE_OBJ_NOTFOUND:
    return ENOENT;
  case NLE_NODEV:
    return ENODEV;
  case NLE_OPNOTSUPP:
    return EOPNOTSUPP;
  case NLE_BUSY:
    return EBUSY;
  case NLE_RANGE:
    return ERANGE;
  case NLE_AGAIN:
    return EAGAIN;
  case NLE_MSGSIZE:
    return EMSGSIZE;
  case NLE_NOADDR:
    return EADDRNOTAVAIL;
  case NLE_INVAL:
  case NLE_MISSING_ATTR:
  case NLE_AF_NOSUPPORT:
    return EINVAL;
  default:
    return EIO;
  }
}

/// The kernel's extended-ack message of an error or done message, if any.
std::string ExtackText(const nlmsghdr* h) {
  if (!(h->nlmsg_flags & NLM_F_ACK_TLVS))
    return {};
  const auto* data = static_cast<const char*>(nlmsg_data(h));
  std::size_t offset = 0;
  if (h->nlmsg_type == NLMSG_ERROR) {
    const auto* e = reinterpret_cast<const nlmsgerr*>(data);
    offset = sizeof(nlmsgerr);
    if (!(h->nlmsg_flags & NLM_F_CAPPED))
      offset += e->msg.nlmsg_len - NLMSG_HDRLEN;
  } else {
    offset = sizeof(int);
  }
  const int length = nlmsg_datalen(h) - static_cast<int>(offset);
  if (length <= 0)
    return {};
  nlattr* tb[NLMSGERR_ATTR_MAX + 1] = {};
  if (nla_parse(tb, NLMSGERR_ATTR_MAX, reinterpret_cast<nlattr*>(const_cast<char*>(data + offset)),
                length, nullptr) < 0 ||
      !tb[NLMSGERR_ATTR_MSG])
    return {};
  return nla_get_string(tb[NLMSGERR_ATTR_MSG]);
}

/// libnl's error callback: keeps errno and text for NlSocket::Check.
int KeepError(sockaddr_nl*, nlmsgerr* e, void* arg) {
  auto* socket = static_cast<NlSocket*>(arg);
  socket->lastError = -e->error;
  const auto* h =
      reinterpret_cast<const nlmsghdr*>(reinterpret_cast<const char*>(e) - NLMSG_HDRLEN);
  socket->lastText = ExtackText(h);
  return NL_STOP;
}

void SetFlag(int fd, int option) {
  int on = 1;
  // Older kernels lack some options; the library works without them.
  (void)setsockopt(fd, SOL_NETLINK, option, &on, sizeof on);
}

} // namespace

void Fail(int err, const Subject& subject, const std::string& kernelText) {
  std::string message;
  if (err == EPERM || err == EACCES) {
    message = "permission denied: " + std::string(subject.change ? "changing " : "reading ") +
              subject.object + " needs CAP_NET_ADMIN";
  } else if (err == EOPNOTSUPP && !subject.feature.empty()) {
    message = subject.object + ": the driver " +
              (subject.driver.empty() ? "" : subject.driver + " ") + "does not support " +
              subject.feature;
  } else {
    // The kernel's words where they say more than the errno; plain ones for
    // the everyday refusals.
    const bool plain =
        err == EEXIST || err == ENOENT || err == ESRCH || err == EADDRNOTAVAIL || err == ENODEV;
    std::string reason = kernelText.empty() || plain ? Reason(err) : kernelText;
    if (!plain && !kernelText.empty() && reason.size() > 1 &&
        isupper(static_cast<unsigned char>(reason[0])) &&
        islower(static_cast<unsigned char>(reason[1])))
      reason[0] = static_cast<char>(tolower(static_cast<unsigned char>(reason[0])));
    message = subject.object + ": " + reason;
  }
  throw Error(err, message);
}

void Invalid(const std::string& message) {
  throw Error(EINVAL, message);
}

MsgPtr NewMsg(int type, int flags) {
  MsgPtr msg(nlmsg_alloc_simple(type, flags));
  if (!msg)
    throw Error(ENOMEM, "out of memory building a netlink request");
  return msg;
}

AddrPtr ToNlAddr(const IpAddress& address, int prefixLength) {
  AddrPtr a(
      nl_addr_build(static_cast<int>(address.family), address.bytes.data(), address.Length()));
  if (!a)
    throw Error(ENOMEM, "out of memory building an address");
  if (prefixLength >= 0)
    nl_addr_set_prefixlen(a.get(), prefixLength);
  return a;
}

AddrPtr ToNlAddr(const HwAddress& address) {
  AddrPtr a(nl_addr_build(AF_LLC, address.data(), address.size()));
  if (!a)
    throw Error(ENOMEM, "out of memory building an address");
  return a;
}

IpAddress FromNlAddr(const nl_addr* address) {
  if (!address)
    return {};
  return IpAddress::FromBytes(nl_addr_get_binary_addr(address), nl_addr_get_len(address));
}

NlSocket::NlSocket(int protocol) {
  sk_ = nl_socket_alloc();
  if (!sk_)
    throw Error(ENOMEM, "out of memory making a netlink socket");
  int rc = nl_connect(sk_, protocol);
  if (rc < 0) {
    int err = errno ? errno : ErrnoOf(rc);
    nl_socket_free(sk_);
    throw Error(err, std::string("cannot open a netlink socket: ") + strerror(err));
  }
  // One receive per kernel batch: a 32 KiB buffer without peeking first,
  // which is what the kernel fills dumps up to.
  nl_socket_set_msg_buf_size(sk_, 32768);
  nl_socket_disable_msg_peek(sk_);
  // Replies are matched to requests by the receive loop; libnl's own check
  // does not see the requests that loop sends.
  nl_socket_disable_seq_check(sk_);
  const int fd = nl_socket_get_fd(sk_);
  SetFlag(fd, NETLINK_EXT_ACK);
  SetFlag(fd, NETLINK_CAP_ACK);
  if (protocol == NETLINK_ROUTE)
    SetFlag(fd, NETLINK_GET_STRICT_CHK);
  nl_socket_modify_err_cb(sk_, NL_CB_CUSTOM, KeepError, this);
}

NlSocket::~NlSocket() {
  nl_socket_free(sk_);
}

void NlSocket::Check(int rc, const Subject& subject) {
  const int err = lastError;
  const std::string text = lastText;
  lastError = 0;
  lastText.clear();
  if (rc >= 0)
    return;
  if (err)
    Fail(err, subject, text);
  Fail(ErrnoOf(rc), subject, nl_geterror(rc));
}

void NlSocket::Request(nl_msg* msg, const Subject& subject,
                       const std::function<void(nlmsghdr*)>& onReply) {
  nl_complete_msg(sk_, msg);
  nlmsg_hdr(msg)->nlmsg_flags |= NLM_F_ACK;
  const uint32_t seq = nlmsg_hdr(msg)->nlmsg_seq;
  int rc = nl_send(sk_, msg);
  if (rc < 0)
    Fail(errno ? errno : ErrnoOf(rc), subject);
  Receive(seq, subject, onReply);
}

void NlSocket::Dump(nl_msg* msg, const Subject& subject,
                    const std::function<void(nlmsghdr*)>& onReply) {
  nl_complete_msg(sk_, msg);
  // A dump ends with NLMSG_DONE; no acknowledgement follows it.
  nlmsg_hdr(msg)->nlmsg_flags &= ~NLM_F_ACK;
  nlmsg_hdr(msg)->nlmsg_flags |= NLM_F_DUMP;
  const uint32_t seq = nlmsg_hdr(msg)->nlmsg_seq;
  int rc = nl_send(sk_, msg);
  if (rc < 0)
    Fail(errno ? errno : ErrnoOf(rc), subject);
  Receive(seq, subject, onReply);
}

void NlSocket::Receive(uint32_t seq, const Subject& subject,
                       const std::function<void(nlmsghdr*)>& onReply) {
  // A callback that throws must not leave the rest of a dump in the socket:
  // the exception waits until the kernel has finished.
  std::exception_ptr pending;
  int refusal = 0;
  std::string refusalText;
  for (bool finished = false; !finished;) {
    unsigned char* buffer = nullptr;
    sockaddr_nl peer{};
    int n = nl_recv(sk_, &peer, &buffer, nullptr);
    std::unique_ptr<unsigned char, decltype(&free)> owned(buffer, &free);
    if (n <= 0) {
      if (n == -NLE_INTR || n == -NLE_AGAIN)
        continue;
      Fail(n == 0 ? EIO : (errno ? errno : ErrnoOf(n)), subject);
    }
    for (auto* h = reinterpret_cast<nlmsghdr*>(buffer); nlmsg_ok(h, n); h = nlmsg_next(h, &n)) {
      if (h->nlmsg_seq != seq)
        continue;
      if (h->nlmsg_type == NLMSG_DONE) {
        int err = 0;
        if (nlmsg_datalen(h) >= static_cast<int>(sizeof err))
          memcpy(&err, nlmsg_data(h), sizeof err);
        if (err < 0 && !refusal) {
          refusal = -err;
          refusalText = ExtackText(h);
        }
        finished = true;
        break;
      }
      if (h->nlmsg_type == NLMSG_ERROR) {
        const auto* e = static_cast<const nlmsgerr*>(nlmsg_data(h));
        if (e->error && !refusal) {
          refusal = -e->error;
          refusalText = ExtackText(h);
        }
        finished = true;
        break;
      }
      if (h->nlmsg_type < NLMSG_MIN_TYPE || !onReply || pending)
        continue;
      try {
        onReply(h);
      } catch (...) {
        pending = std::current_exception();
      }
    }
  }
  if (refusal)
    Fail(refusal, subject, refusalText);
  if (pending)
    std::rethrow_exception(pending);
}

Sockets::~Sockets() {
  if (ioctlFd >= 0)
    close(ioctlFd);
  if (fd >= 0)
    close(fd);
}

namespace {
std::unique_ptr<NlSocket> MakeSocket(const Sockets& s, int protocol) {
  Entered inside(s);
  return std::make_unique<NlSocket>(protocol);
}
} // namespace

NlSocket& Sockets::Route() {
  if (!route)
    route = MakeSocket(*this, NETLINK_ROUTE);
  return *route;
}

NlSocket& Sockets::Genl() {
  if (!genl)
    genl = MakeSocket(*this, NETLINK_GENERIC);
  return *genl;
}

NlSocket& Sockets::Xfrm() {
  if (!xfrm)
    xfrm = MakeSocket(*this, NETLINK_XFRM);
  return *xfrm;
}

NlSocket& Sockets::Diag() {
  if (!diag)
    diag = MakeSocket(*this, NETLINK_SOCK_DIAG);
  return *diag;
}

int Sockets::Ioctl() {
  if (ioctlFd < 0) {
    Entered inside(*this);
    // Any socket reaches the device ioctls of its namespace; an IPv4 one is
    // what ethtool uses, a netlink one works where IPv4 is compiled out.
    ioctlFd = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (ioctlFd < 0)
      ioctlFd = socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC, NETLINK_GENERIC);
    if (ioctlFd < 0)
      throw Error(errno, std::string("cannot open a socket: ") + strerror(errno));
  }
  return ioctlFd;
}

int Sockets::EthtoolFamily() {
  if (!ethtoolFamily) {
    NlSocket& s = Genl();
    int id = genl_ctrl_resolve(s.Get(), "ethtool");
    if (id < 0)
      throw Error(EOPNOTSUPP, "the kernel has no ethtool netlink interface");
    ethtoolFamily = id;
  }
  return ethtoolFamily;
}

Entered::Entered(const Sockets& sockets) {
  if (sockets.fd < 0)
    return;
  saved_ = open("/proc/thread-self/ns/net", O_RDONLY | O_CLOEXEC);
  if (saved_ < 0)
    throw Error(errno,
                std::string("cannot open this thread's network namespace: ") + strerror(errno));
  if (setns(sockets.fd, CLONE_NEWNET) != 0) {
    const int err = errno;
    close(saved_);
    saved_ = -1;
    if (err == EPERM)
      throw Error(err, "permission denied: entering the network namespace " + sockets.name +
                           " needs CAP_SYS_ADMIN");
    throw Error(err, "cannot enter the network namespace " + sockets.name + ": " + strerror(err));
  }
}

Entered::~Entered() {
  if (saved_ < 0)
    return;
  // Returning to a namespace the thread was in cannot fail short of a broken
  // kernel; going on in the wrong namespace would act on the wrong host.
  if (setns(saved_, CLONE_NEWNET) != 0) {
    fprintf(stderr, "linuxnet: cannot return to the caller's network namespace: %s\n",
            strerror(errno));
    abort();
  }
  close(saved_);
}

int IfIndex(Namespace& ns, const std::string& name) {
  if (name.empty() || name.size() >= IFNAMSIZ)
    throw Error(ENODEV, "the link " + name + " does not exist");
  ifreq request{};
  memcpy(request.ifr_name, name.data(), name.size());
  if (ioctl(ns.Internals().Ioctl(), SIOCGIFINDEX, &request) != 0) {
    if (errno == ENODEV)
      throw Error(ENODEV, "the link " + name + " does not exist");
    Fail(errno, {name, false});
  }
  return request.ifr_ifindex;
}

std::string DriverName(Namespace& ns, const std::string& name) {
  if (name.empty() || name.size() >= IFNAMSIZ)
    return {};
  ethtool_drvinfo info{};
  info.cmd = ETHTOOL_GDRVINFO;
  ifreq request{};
  memcpy(request.ifr_name, name.data(), name.size());
  request.ifr_data = reinterpret_cast<char*>(&info);
  if (ioctl(ns.Internals().Ioctl(), SIOCETHTOOL, &request) != 0)
    return {};
  return std::string(info.driver, strnlen(info.driver, sizeof info.driver));
}

void RethrowForLink(Namespace& ns, const std::string& dev, Subject subject, const Error& e) {
  if (e.Code() == ENODEV)
    throw Error(ENODEV, "the link " + dev + " does not exist");
  if (e.Code() == EOPNOTSUPP && !subject.feature.empty()) {
    subject.driver = DriverName(ns, dev);
    Fail(EOPNOTSUPP, subject);
  }
  throw e;
}

} // namespace LinuxNet::Detail
