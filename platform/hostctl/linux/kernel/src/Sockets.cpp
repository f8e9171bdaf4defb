//===- Sockets.cpp - sock_diag dumps ---------------------------------------===//
//
// libnl's idiag module speaks only the old TCP-only request, so the dumps
// are built with libnl's message helpers and sent as SOCK_DIAG_BY_FAMILY.
//
//===----------------------------------------------------------------------===//
#include "LinuxNet/Sockets.h"
#include "LinuxNet/Namespace.h"

#include "Attr.h"
#include "Netlink.h"

#include <linux/inet_diag.h>
#include <linux/sock_diag.h>
#include <netinet/in.h>

#include <cerrno>

namespace LinuxNet {

using namespace Detail;

namespace {

void DumpOne(Namespace& ns, uint8_t protocol, Family family, bool congestion,
             std::vector<Socket>& sockets) {
  MsgPtr msg = NewMsg(SOCK_DIAG_BY_FAMILY, NLM_F_DUMP);
  inet_diag_req_v2 req{};
  req.sdiag_family = static_cast<uint8_t>(family);
  req.sdiag_protocol = protocol;
  req.idiag_states = ~0u;
  if (congestion && protocol == IPPROTO_TCP)
    req.idiag_ext = 1 << (INET_DIAG_CONG - 1);
  if (nlmsg_append(msg.get(), &req, sizeof req, NLMSG_ALIGNTO) < 0)
    throw Error(ENOMEM, "out of memory building a socket request");
  const std::size_t length = family == Family::Ipv4 ? 4 : 16;
  ns.Internals().Diag().Dump(msg.get(), {"the sockets", false}, [&](nlmsghdr* h) {
    if (h->nlmsg_type != SOCK_DIAG_BY_FAMILY ||
        nlmsg_datalen(h) < static_cast<int>(sizeof(inet_diag_msg)))
      return;
    const auto* m = static_cast<const inet_diag_msg*>(nlmsg_data(h));
    Socket& s = sockets.emplace_back();
    s.protocol = protocol;
    s.family = family;
    s.state = m->idiag_state;
    s.local = IpAddress::FromBytes(m->id.idiag_src, length);
    s.localPort = ntohs(m->id.idiag_sport);
    s.remote = IpAddress::FromBytes(m->id.idiag_dst, length);
    s.remotePort = ntohs(m->id.idiag_dport);
    s.recvQueue = m->idiag_rqueue;
    s.sendQueue = m->idiag_wqueue;
    s.uid = m->idiag_uid;
    s.inode = m->idiag_inode;
    s.boundDevice = m->id.idiag_if;
    if (congestion && protocol == IPPROTO_TCP)
      if (const nlattr* cong = nlmsg_find_attr(h, sizeof(inet_diag_msg), INET_DIAG_CONG))
        s.congestion = String(cong);
  });
}

} // namespace

std::vector<Socket> ListSockets(Namespace& ns, const SocketQuery& query) {
  std::vector<Socket> sockets;
  for (uint8_t protocol : {uint8_t{IPPROTO_TCP}, uint8_t{IPPROTO_UDP}}) {
    if ((protocol == IPPROTO_TCP && !query.tcp) || (protocol == IPPROTO_UDP && !query.udp))
      continue;
    if (query.ipv4)
      DumpOne(ns, protocol, Family::Ipv4, query.congestion, sockets);
    if (query.ipv6) {
      try {
        DumpOne(ns, protocol, Family::Ipv6, query.congestion, sockets);
      } catch (const Error& e) {
        // A kernel without IPv6 has no IPv6 sockets to list.
        if (e.Code() != ENOENT && e.Code() != EAFNOSUPPORT)
          throw;
      }
    }
  }
  return sockets;
}

std::string SocketStateName(uint8_t protocol, uint8_t state) {
  if (protocol == IPPROTO_UDP && state == TcpClose)
    return "UNCONN";
  static const char* const names[] = {
      "UNKNOWN", "ESTAB",      "SYN-SENT", "SYN-RECV", "FIN-WAIT-1", "FIN-WAIT-2", "TIME-WAIT",
      "UNCONN",  "CLOSE-WAIT", "LAST-ACK", "LISTEN",   "CLOSING",    "SYN-RECV"};
  return state < std::size(names) ? names[state] : "UNKNOWN";
}

} // namespace LinuxNet
