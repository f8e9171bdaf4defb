//===- HostCtl/Network/PortStats.h - Counters of a virtual port -----------===//
#pragma once

#include <cstdint>
#include <string>

namespace HostCtl::Network {

/// Packet counters of a port, in the host's order.
struct PacketStats {
  uint64_t packetsSent = 0;              ///< Packets sent.
  uint64_t multicastPacketsSent = 0;     ///< Multicast packets sent.
  uint64_t broadcastPacketsSent = 0;     ///< Broadcast packets sent.
  uint64_t packetsReceived = 0;          ///< Packets received.
  uint64_t multicastPacketsReceived = 0; ///< Multicast packets received.
  uint64_t broadcastPacketsReceived = 0; ///< Broadcast packets received.
  uint64_t transmitDropped = 0;          ///< Transmit packets dropped.
  uint64_t receiveDropped = 0;           ///< Receive packets dropped.
};

/// Byte counters of a port.
struct PortStats {
  uint64_t bytesReceived = 0; ///< Bytes received.
  uint64_t bytesSent = 0;     ///< Bytes sent.
};

/// A packet filter attached to a port, with its counters.
struct FilterStats {
  std::string name;             ///< Filter name.
  std::string sortKey;          ///< Key that orders the filters of one direction.
  bool active = false;          ///< The filter is active.
  bool direction = false;       ///< Direction flag: set for the outbound side of the client.
  bool extended = false;        ///< The last five counters are kept.
  uint64_t packetsIn = 0;       ///< Packets in.
  uint64_t packetsOut = 0;      ///< Packets out.
  uint64_t packetsDropped = 0;  ///< Packets dropped.
  uint64_t packetsFiltered = 0; ///< Packets filtered (extended).
  uint64_t packetsFaulted = 0;  ///< Packets faulted (extended).
  uint64_t packetsQueued = 0;   ///< Packets queued (extended).
  uint64_t packetsInjected = 0; ///< Packets injected (extended).
  uint64_t packetErrors = 0;    ///< Packet errors (extended).
};

} // namespace HostCtl::Network
