//===- TvkCtl/Network/IpSecConfigImpl.h - The kernel's IPsec databases ----===//
//
// Adds, removes and lists the security associations and policies of the
// kernel, and translates between the texts users type and the codes of the
// records. Keys are checked against the length each algorithm needs.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/IpSec.h"
#include "backend/Backend.h"

#include <array>
#include <string>
#include <vector>

namespace Sim {

class IpSecConfigImpl : public HostCtl::Backend::IpSec {
public:
  IpSecConfigImpl();
  ~IpSecConfigImpl();

  /// Adds an SA. Refuses a duplicate name, a name reserved for key exchange,
  /// a destination and SPI already in use, bad addresses and keys of the
  /// wrong length for their algorithm.
  void AddSADConfig(const HostCtl::Network::IpSecSadParam& sa) override;
  /// Removes the SA of that name; the policies bound to it lose their SA.
  void RemoveSADConfig(const std::string& name) override;
  /// Removes the SA made by key exchange with these addresses and SPI.
  void RemoveAutoSADConfig(const HostCtl::Network::IpSecSadParam& sa) override;
  /// Removes every SA.
  void FlushSADConfig() override;
  /// Every SA, in the order they were added.
  void GetSADConfigList(std::vector<HostCtl::Network::IpSecSadParam>& list) override;

  /// Adds an SP. Refuses a duplicate name, a policy with the same selectors
  /// and direction, an SA name that no SA has, and ports with a protocol
  /// other than tcp or udp.
  void AddSPDConfig(const HostCtl::Network::IpSecSpdParam& sp) override;
  void RemoveSPDConfig(const std::string& name) override;
  void FlushSPDConfig() override;
  /// Every SP, in the order they were added; an SP whose SA was removed
  /// names the SA "UNKNOWN".
  void GetSPDConfigList(std::vector<HostCtl::Network::IpSecSpdParam>& list) override;
};

} // namespace Sim
