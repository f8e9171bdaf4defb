//===- LinuxNet/Sockets.h - TCP and UDP sockets through sock_diag ---------===//
//
// What `ss -tuna` shows: every TCP and UDP socket of the namespace, IPv4 and
// IPv6, listening or connected. One sock_diag dump per protocol and family.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "LinuxNet/Ip.h"

#include <cstdint>
#include <string>
#include <vector>

namespace LinuxNet {

class Namespace;

/// TCP states as the kernel numbers them (UDP uses Established and Close).
enum TcpState : uint8_t {
  TcpEstablished = 1,
  TcpSynSent = 2,
  TcpSynRecv = 3,
  TcpFinWait1 = 4,
  TcpFinWait2 = 5,
  TcpTimeWait = 6,
  TcpClose = 7,
  TcpCloseWait = 8,
  TcpLastAck = 9,
  TcpListen = 10,
  TcpClosing = 11,
  TcpNewSynRecv = 12,
};

/// One socket.
struct Socket {
  uint8_t protocol = 0;         ///< 6 TCP, 17 UDP.
  Family family = Family::None; ///< Of the socket (an IPv6 socket may carry IPv4-mapped addresses).
  uint8_t state = 0;            ///< TcpState.
  IpAddress local;              ///< Local address (unspecified when bound to any).
  uint16_t localPort = 0;       ///< Local port.
  IpAddress remote;             ///< Remote address (unspecified when not connected).
  uint16_t remotePort = 0;      ///< Remote port.
  uint32_t recvQueue = 0;       ///< Bytes not yet read; for a listener, connections waiting.
  uint32_t sendQueue = 0;       ///< Bytes not yet acknowledged; for a listener, the backlog.
  uint32_t uid = 0;             ///< Owner's user id.
  uint64_t inode = 0;           ///< Socket inode (0 for time-wait sockets).
  uint32_t boundDevice = 0;     ///< Interface index the socket is bound to; 0 for none.
  std::string congestion;       ///< TCP congestion control algorithm, when asked for.
};

/// What to list.
struct SocketQuery {
  bool tcp = true, udp = true;   ///< Protocols.
  bool ipv4 = true, ipv6 = true; ///< Families.
  bool congestion = false;       ///< Ask TCP sockets for their algorithm (larger replies).
};

/// Every socket that \p query selects, in any state, TCP before UDP and IPv4
/// before IPv6.
std::vector<Socket> ListSockets(Namespace& ns, const SocketQuery& query = {});

/// "ESTAB", "LISTEN", "TIME-WAIT", ... as `ss` prints a state ("UNCONN" for
/// an unconnected UDP socket).
std::string SocketStateName(uint8_t protocol, uint8_t state);

} // namespace LinuxNet
