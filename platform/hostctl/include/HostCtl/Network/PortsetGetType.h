//===- HostCtl/Network/PortsetGetType.h - Ordinary or system objects ------===//
//
// The selector that listings of switches, port groups, kernel interfaces,
// routes and neighbours take: ordinary objects or the host's system objects.
//
//===----------------------------------------------------------------------===//
#pragma once

namespace HostCtl::Network {

/// Which objects a listing returns.
enum PortsetGetType : int {
  PortsetGetRegular = 0, ///< Ordinary objects.
  PortsetGetSystem = 1,  ///< System objects (the "system" type of the commands).
};

} // namespace HostCtl::Network
