//===- HostCtl/Host.h - The host as a whole --------------------------------===//
//
// HostFactory::GetHost() opens the host; Host::GetNetworkInfo() is one more
// way to reach the network information root.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/NetworkInfo.h"

#include <memory>

namespace HostCtl {

/// The host.
class Host {
public:
  virtual ~Host() = default;
  /// The network information root, owned by the caller.
  virtual std::unique_ptr<Network::NetworkInfo> GetNetworkInfo() = 0;
};

/// Opens the host.
class HostFactory {
public:
  static std::unique_ptr<Host> GetHost();
};

} // namespace HostCtl
