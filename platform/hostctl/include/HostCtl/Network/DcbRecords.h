//===- HostCtl/Network/DcbRecords.h - DCB records of a NIC ----------------===//
//
// The records that TvkCtl::Network::DcbInfoImpl returns: DCB capabilities,
// the IEEE ETS and PFC configurations and application priority entries.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <array>
#include <cstdint>
#include <string>

namespace HostCtl::Network {

/// DCB modes of DcbInfoImpl::GetMode.
enum DcbMode : uint32_t {
  DcbModeUnknown = 0, ///< No mode determined.
  DcbModeCen = 1,     ///< Pre-standard CEN.
  DcbModeCee = 2,     ///< Pre-standard CEE.
  DcbModeIeee = 3,    ///< IEEE.
};

/// One value per traffic class or priority.
using DcbClassArray = std::array<uint8_t, 8>;

/// What the NIC's DCB implementation can do.
struct DcbCapabilities {
  bool priorityGroup = false;       ///< Priority groups.
  bool priorityFlowControl = false; ///< Priority-based flow control.
  bool upToTcMap = false;           ///< User-priority to traffic-class map.
  uint8_t pgTrafficClasses = 0;     ///< Traffic classes of priority groups.
  uint8_t pfcTrafficClasses = 0;    ///< Traffic classes with PFC.
};

/// IEEE enhanced transmission selection configuration.
struct DcbIeeeEtsConfig {
  uint8_t willing = 0;                  ///< Willing bit of the ETS TLV.
  uint8_t supportedCapacity = 0;        ///< Number of traffic classes supported.
  std::string creditBasedShaper;        ///< Credit-based shaper support, as text.
  DcbClassArray txBandwidth{};          ///< TX bandwidth per TC, percent.
  DcbClassArray rxBandwidth{};          ///< RX bandwidth per TC, percent.
  DcbClassArray tsaTable{};             ///< Transmission selection algorithm per TC.
  DcbClassArray priorityAssignment{};   ///< Traffic class per priority.
  DcbClassArray recommendedBandwidth{}; ///< Recommended bandwidth per TC.
  DcbClassArray recommendedTsa{};       ///< Recommended algorithm per TC.
  DcbClassArray recommendedPriority{};  ///< Recommended traffic class per priority.
};

/// IEEE priority-based flow control configuration.
struct DcbIeeePfcConfig {
  uint8_t trafficClasses = 0;     ///< Traffic classes that can have PFC.
  uint8_t mask = 0;               ///< PFC enable bit per priority.
  uint8_t macsecBypass = 0;       ///< MACsec bypass capability.
  uint8_t delay = 0;              ///< Round-trip propagation delay of the link.
  DcbClassArray sentFrames{};     ///< PFC frames sent per priority.
  DcbClassArray receivedFrames{}; ///< PFC frames received per priority.
};

/// One application priority entry.
struct DcbAppInfo {
  std::string appType;      ///< Selector, such as "Ethertype".
  std::string protocolId;   ///< Protocol id, as text.
  std::string userPriority; ///< User priority, as text.
};

} // namespace HostCtl::Network
