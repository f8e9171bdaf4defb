//===- HostCtl/Network/IpSec.h - IPsec security associations and policies -===//
//
// The records of the kernel's IPsec databases for IPv6 traffic: a security
// association (SA) holds the keys and algorithms of one flow, a security
// policy (SP) says which traffic is protected, discarded or passed. Codes are
// indexes into the text tables of TvkCtl::Network::IpSecConfigImpl.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <string>

namespace HostCtl::Network {

/// One security association.
struct IpSecSadParam {
  std::string name;              ///< Unique name; "auto" for SAs made by key exchange.
  std::string srcAddress = "::"; ///< Source IPv6 address.
  std::string dstAddress = "::"; ///< Destination IPv6 address.
  uint32_t spi = 0;              ///< Security parameter index.
  int mode = 0;                  ///< Mode code.
  int encryptionAlgorithm = 0;   ///< Encryption algorithm code.
  int integrityAlgorithm = 0;    ///< Integrity algorithm code.
  std::string encryptionKey;     ///< ASCII, or hex after "0x"; never listed.
  std::string integrityKey;      ///< ASCII, or hex after "0x"; never listed.
  int state = 1;                 ///< State code.
  uint64_t lifetime = 0;         ///< Seconds; 0 is infinite.
};

/// One security policy.
struct IpSecSpdParam {
  std::string name;              ///< Unique name.
  std::string srcAddress = "::"; ///< Source network address.
  int srcPrefixLength = 0;       ///< Source prefix length.
  uint32_t srcPort = 0;          ///< Source port; 0 is any.
  std::string dstAddress = "::"; ///< Destination network address.
  int dstPrefixLength = 0;       ///< Destination prefix length.
  uint32_t dstPort = 0;          ///< Destination port; 0 is any.
  int ulProto = 0;               ///< Upper-layer protocol code.
  int direction = 0;             ///< Direction code.
  int action = 0;                ///< Action code.
  int mode = 2;                  ///< Mode code; 2 ("any") unless the action is ipsec.
  std::string saName;            ///< Bound SA; empty lets the kernel choose one.
};

} // namespace HostCtl::Network
