//===- HostCtl/Host.h - The host object ------------------------------------===//
//
// The host object gives the roots of the host library: its network
// information and its system information.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/NetworkInfo.h"
#include "HostCtl/System/SystemInfo.h"

#include <memory>

namespace HostCtl {

/// The host this process manages.
class Host {
public:
  virtual ~Host() = default;
  /// The network information root, owned by the caller.
  virtual std::unique_ptr<Network::NetworkInfo> GetNetworkInfo() = 0;
  /// The system information root, owned by the caller.
  virtual std::unique_ptr<System::SystemInfo> GetSystemInfo() = 0;
};

/// Opens the host object.
class HostFactory {
public:
  /// The host, owned by the caller.
  static std::unique_ptr<Host> GetHost();
};

} // namespace HostCtl
