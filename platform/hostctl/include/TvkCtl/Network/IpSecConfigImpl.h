//===- TvkCtl/Network/IpSecConfigImpl.h - The kernel's IPsec databases ----===//
//
// Adds, removes and lists the security associations and policies of the
// kernel, and translates between the texts users type and the codes of the
// records. Keys are checked against the length each algorithm needs. The
// databases are the session's host's; the tables and translators are
// common to every host.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/IpSec.h"

#include <array>
#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Backend {
class IpSec;
} // namespace HostCtl::Backend

namespace TvkCtl::Network {

class IpSecConfigImpl {
public:
  IpSecConfigImpl();
  ~IpSecConfigImpl();

  /// Code-to-text tables, indexed by code.
  static const std::array<std::string, 4> SA_STATE;
  static const std::array<std::string, 3> SA_MODE;
  static const std::array<std::string, 3> SA_ENCPT_ALG;
  static const std::array<std::string, 2> SA_AUTH_ALG;
  static const std::array<std::string, 3> SP_ACTION;
  static const std::array<std::string, 2> SP_DIRECTION;
  static const std::array<std::string, 4> SP_UL_PROTO_TYPE;

  /// Text-to-code translators; an empty text gives the default, an unknown
  /// text throws HostCtlException.
  static int StringToIpSecMode(const std::string& text);
  static int StringToIpSecEncyptAlgo(const std::string& text);
  static int StringToIpSecAuthAlgo(const std::string& text);
  static int StringToIpSecAction(const std::string& text);
  static int StringToIpSecDirection(const std::string& text);
  static int StringToIpSecULProtoType(const std::string& text);

  /// Adds an SA. Refuses a duplicate name, a name reserved for key exchange,
  /// a destination and SPI already in use, bad addresses and keys of the
  /// wrong length for their algorithm.
  void AddSADConfig(const HostCtl::Network::IpSecSadParam& sa);
  /// Removes the SA of that name; the policies bound to it lose their SA.
  void RemoveSADConfig(const std::string& name);
  /// Removes the SA made by key exchange with these addresses and SPI.
  void RemoveAutoSADConfig(const HostCtl::Network::IpSecSadParam& sa);
  /// Removes every SA.
  void FlushSADConfig();
  /// Every SA, in the order they were added.
  void GetSADConfigList(std::vector<HostCtl::Network::IpSecSadParam>& list);

  /// Adds an SP. Refuses a duplicate name, a policy with the same selectors
  /// and direction, an SA name that no SA has, and ports with a protocol
  /// other than tcp or udp.
  void AddSPDConfig(const HostCtl::Network::IpSecSpdParam& sp);
  void RemoveSPDConfig(const std::string& name);
  void FlushSPDConfig();
  /// Every SP, in the order they were added; an SP whose SA was removed
  /// names the SA "UNKNOWN".
  void GetSPDConfigList(std::vector<HostCtl::Network::IpSecSpdParam>& list);

  /// The key length in bytes that an algorithm needs (0: no key).
  static int EncryptionKeyLength(int algorithm);
  static int IntegrityKeyLength(int algorithm);

private:
  std::unique_ptr<HostCtl::Backend::IpSec> ops_; ///< The host's operations.
};

} // namespace TvkCtl::Network
