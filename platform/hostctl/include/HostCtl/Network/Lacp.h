//===- HostCtl/Network/Lacp.h - LACP records of distributed switches ------===//
//
// Link aggregation groups (LAGs) of a distributed switch: their configuration
// records and the LACP runtime records, whose layout is fixed (packed, with
// the field offsets the readers rely on).
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Network {

/// Configuration of one LAG (128 bytes). Texts are NUL-terminated.
struct LagConfig {
  char lagId[48] = {};        ///< LAG id.
  char lagName[64] = {};      ///< LAG name.
  uint32_t loadBalancing = 0; ///< Load-balancing index (0 to 20).
  uint32_t mode = 0;          ///< 1 active, 2 passive.
  uint32_t uplinkCount = 0;   ///< Uplink ports of the LAG.
  uint32_t reserved = 0;      ///< Zero.
};
static_assert(sizeof(LagConfig) == 128);

/// LACP settings of one uplink port of a distributed switch.
struct DVUplinkPortLacp {
  std::string portId;             ///< Port key.
  bool lacpEnabled = false;       ///< LACP runs on the port.
  uint32_t mode = 0;              ///< 1 active, 2 passive.
  std::string uplinkPortgroupKey; ///< Key of the uplink port group.
};

#pragma pack(push, 1)
/// LACP runtime state of one NIC of a LAG (213 bytes, packed). Texts are
/// NUL-terminated.
struct LacpNicInfo {
  char nicName[32];             ///< 0x00 NIC name.
  char state[32];               ///< 0x20 LACP state text.
  uint16_t actorPortNumber;     ///< 0x40
  uint16_t actorPortPriority;   ///< 0x42
  uint16_t actorAdminKey;       ///< 0x44
  uint16_t actorOperKey;        ///< 0x46
  uint8_t actorState;           ///< 0x48 LACP state bits (bit 0 ACT ... bit 7 EXP).
  uint8_t reserved;             ///< 0x49
  char actorFlags[32];          ///< 0x4a Flag letters.
  uint32_t partnerAge;          ///< 0x6a Seconds.
  uint16_t partnerPortNumber;   ///< 0x6e
  uint16_t partnerPortPriority; ///< 0x70
  uint16_t partnerOperKey;      ///< 0x72
  uint8_t partnerState;         ///< 0x74 LACP state bits.
  char partnerDeviceId[32];     ///< 0x75
  char partnerFlags[32];        ///< 0x95 Flag letters.
  uint64_t rxLacpdus;           ///< 0xb5 LACPDUs received.
  uint64_t txLacpdus;           ///< 0xbd LACPDUs sent.
  uint64_t rxErrors;            ///< 0xc5 Receive errors.
  uint64_t txErrors;            ///< 0xcd Send errors.
};
#pragma pack(pop)
static_assert(sizeof(LacpNicInfo) == 213);
static_assert(offsetof(LacpNicInfo, actorFlags) == 0x4a);
static_assert(offsetof(LacpNicInfo, partnerAge) == 0x6a);
static_assert(offsetof(LacpNicInfo, partnerDeviceId) == 0x75);
static_assert(offsetof(LacpNicInfo, partnerFlags) == 0x95);
static_assert(offsetof(LacpNicInfo, rxLacpdus) == 0xb5);
static_assert(offsetof(LacpNicInfo, txErrors) == 0xcd);

/// LACP runtime state of one LAG (168 bytes).
struct LacpLagInfo {
  uint32_t lagId = 0;                             ///< 0x00 LAG id.
  uint32_t reserved = 0;                          ///< 0x04
  uint32_t mode = 0;                              ///< 0x08 1 active, 2 passive.
  char lagName[132] = {};                         ///< 0x0c LAG name.
  std::vector<std::unique_ptr<LacpNicInfo>> nics; ///< 0x90 NICs of the LAG.
};
static_assert(offsetof(LacpLagInfo, mode) == 8);
static_assert(offsetof(LacpLagInfo, nics) == 0x90);
static_assert(sizeof(LacpLagInfo) == 168);

} // namespace HostCtl::Network
