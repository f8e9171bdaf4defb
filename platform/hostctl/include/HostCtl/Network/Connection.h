//===- HostCtl/Network/Connection.h - An open TCP, UDP or raw IP socket ---===//
#pragma once

#include <cstdint>
#include <string>

namespace HostCtl::Network {

/// One connection (or listening socket) of a netstack.
struct TcpIpConnection {
  int64_t recvQueue = 0;      ///< Bytes waiting to be read.
  int64_t sendQueue = 0;      ///< Bytes waiting to be acknowledged.
  std::string localAddress;   ///< Local IP address text.
  uint16_t localPort = 0;     ///< Local port.
  std::string foreignAddress; ///< Remote IP address text.
  uint16_t foreignPort = 0;   ///< Remote port.
  int64_t worldId = 0;        ///< The world (process) that owns the socket.
  uint32_t state = 0;         ///< TCP state code (0 CLOSED ... 10 TIME_WAIT).
  std::string ccAlgorithm;    ///< Congestion control algorithm; empty for UDP and raw IP.
};

} // namespace HostCtl::Network
