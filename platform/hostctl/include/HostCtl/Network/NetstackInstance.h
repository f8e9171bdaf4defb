//===- HostCtl/Network/NetstackInstance.h - A TCP/IP stack of the kernel ---===//
//
// The kernel runs one or more independent TCP/IP stacks, netstack instances,
// each known by its key. An instance has a configured and a running value of
// its maximum connection count and IPv6 switch: the configured value becomes
// the running one when the instance is created in the kernel (Enable).
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <string>

namespace HostCtl::Network {

/// One netstack instance.
class NetstackInstance {
public:
  /// The state of an instance created in the kernel.
  static constexpr uint32_t STATE_ENABLED = 4660;
  /// The state of an instance that exists only in the configuration.
  static constexpr uint32_t STATE_DISABLED = 0;

  virtual ~NetstackInstance() = default;

  virtual std::string GetKey() = 0;
  virtual std::string GetInstanceName() = 0;
  virtual uint32_t GetState() = 0;
  /// Configured maximum number of connections.
  virtual uint32_t GetMaxConnections() = 0;
  /// Running maximum number of connections.
  virtual uint32_t GetCurrentMaxConnections() = 0;
  virtual std::string GetCongestionControlAlgorithm() = 0;
  /// Configured IPv6 switch.
  virtual bool GetIpv6Enabled() = 0;
  /// Running IPv6 switch (off also while the kernel's IPv6 is off).
  virtual bool GetCurrentIpv6Enabled() = 0;
  virtual std::string GetEcnStatus() = 0;

  /// The setters change the host at once when \p persist is true; with false
  /// they change only this object.
  virtual void SetInstanceName(const std::string& name, bool persist) = 0;
  /// Creates the instance in the kernel; the configured values become running.
  virtual void Enable() = 0;
  /// Takes the instance out of the kernel, keeping its configuration; refused
  /// while it has interfaces and for the default instance.
  virtual void Disable() = 0;
  virtual void SetMaxConnections(uint32_t value, bool persist) = 0;
  virtual void SetCongestionControlAlgorithm(const std::string& name, bool persist) = 0;
  virtual void SetIpv6Enabled(bool enabled, bool persist) = 0;
  /// "disabled", "enabled" or "echo-only".
  virtual void SetEcnStatus(const std::string& status) = 0;
};

} // namespace HostCtl::Network
