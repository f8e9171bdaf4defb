//===- LinuxNet/Neighbours.h - ARP and neighbour discovery caches ---------===//
#pragma once

#include "LinuxNet/Ip.h"

#include <cstdint>
#include <string>
#include <vector>

namespace LinuxNet {

class Namespace;

/// Neighbour states (NUD_*).
enum NeighbourState : uint16_t {
  NudIncomplete = 0x01,
  NudReachable = 0x02,
  NudStale = 0x04,
  NudDelay = 0x08,
  NudProbe = 0x10,
  NudFailed = 0x20,
  NudNoArp = 0x40,
  NudPermanent = 0x80,
};

/// One neighbour cache entry.
struct Neighbour {
  int index = 0;             ///< Interface index.
  std::string device;        ///< Interface name.
  IpAddress address;         ///< The neighbour's address.
  HwAddress lladdr;          ///< Its link-layer address; empty while unresolved.
  uint16_t state = 0;        ///< NeighbourState bits.
  uint8_t flags = 0;         ///< NTF_* (0x80 router, 0x08 proxy, 0x02 self).
  uint8_t type = 0;          ///< RTN_* of the entry.
  uint32_t confirmedAge = 0; ///< Hundredths of a second since last confirmed.
  uint32_t usedAge = 0;      ///< Hundredths of a second since last used.
  uint32_t updatedAge = 0;   ///< Hundredths of a second since last updated.
  uint32_t probes = 0;       ///< Probes sent.
};

/// The neighbours of \p family or of both, NOARP entries (multicast,
/// loopback) included.
std::vector<Neighbour> ListNeighbours(Namespace& ns, Family family = Family::None);

/// A neighbour to add.
struct NeighbourSpec {
  std::string device;            ///< Interface name.
  IpAddress address;             ///< Neighbour address.
  HwAddress lladdr;              ///< Link-layer address.
  uint16_t state = NudPermanent; ///< State to give the entry.
  bool router = false;           ///< IPv6: the neighbour is a router.
};
/// Adds an entry; refuses one that exists, unless \p replace.
void AddNeighbour(Namespace& ns, const NeighbourSpec& wanted, bool replace = false);
/// Deletes the entry of \p address on \p device.
void DeleteNeighbour(Namespace& ns, const std::string& device, const IpAddress& address);

/// "PERMANENT", "REACHABLE", ... as `ip neigh` prints a state.
std::string NeighbourStateName(uint16_t state);

} // namespace LinuxNet
