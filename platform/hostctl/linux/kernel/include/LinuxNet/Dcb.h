//===- LinuxNet/Dcb.h - Data center bridging state of a NIC ---------------===//
//
// What `dcb` (iproute2) reads through the kernel's dcbnl interface: whether
// DCB is on, the DCBX mode, the device's capabilities, and the IEEE 802.1Qaz
// ETS, PFC and application priority configuration. Only drivers with DCB
// support answer; the others are refused as "DEV: the driver DRIVER does not
// support DCB". Read only.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

namespace LinuxNet {

class Namespace;

/// DCBX mode bits (DCB_CAP_DCBX_*).
enum : uint8_t {
  DcbxHost = 0x01,       ///< The host runs the DCBX engine.
  DcbxLldManaged = 0x02, ///< Firmware runs it.
  DcbxCee = 0x04,        ///< Pre-standard CEE.
  DcbxIeee = 0x08,       ///< IEEE 802.1Qaz.
  DcbxStatic = 0x10,     ///< No negotiation.
};

/// What the device's DCB implementation can do (DCB_CMD_GCAP).
struct DcbCapabilities {
  bool priorityGroups = false;      ///< DCB_CAP_ATTR_PG.
  bool priorityFlowControl = false; ///< DCB_CAP_ATTR_PFC.
  bool upToTc = false;              ///< DCB_CAP_ATTR_UP2TC.
  uint8_t pgTrafficClasses = 0;     ///< Bitmap of supported PG traffic-class counts.
  uint8_t pfcTrafficClasses = 0;    ///< Bitmap of supported PFC traffic-class counts.
  bool groupStrictPriority = false; ///< DCB_CAP_ATTR_GSP.
  uint8_t dcbx = 0;                 ///< DCBX modes the device supports.
};

/// IEEE ETS configuration (struct ieee_ets).
struct DcbEts {
  uint8_t willing = 0, etsCapability = 0, creditBasedShaper = 0;
  std::array<uint8_t, 8> txBandwidth{}, rxBandwidth{}, tsa{}, priorityTc{};
  std::array<uint8_t, 8> recommendedBandwidth{}, recommendedTsa{}, recommendedPriorityTc{};
};

/// IEEE PFC configuration (struct ieee_pfc).
struct DcbPfc {
  uint8_t capability = 0;   ///< Traffic classes that can have PFC.
  uint8_t enabled = 0;      ///< PFC enable bit per priority.
  uint8_t macsecBypass = 0; ///< MACsec bypass capability.
  uint16_t delay = 0;       ///< Allowance for round-trip delay, in bit times.
  std::array<uint64_t, 8> requests{}, indications{}; ///< PFC frames sent, received.
};

/// One application priority entry (struct dcb_app).
struct DcbApp {
  uint8_t selector = 0;  ///< 1 Ethertype, 2 TCP/SCTP port, 3 UDP/DCCP port, 4 any port, 5 DSCP.
  uint8_t priority = 0;  ///< User priority.
  uint16_t protocol = 0; ///< Ethertype, port or DSCP value.
};

/// The IEEE 802.1Qaz part (DCB_CMD_IEEE_GET).
struct DcbIeee {
  std::optional<DcbEts> ets; ///< Unset when the driver reports none.
  std::optional<DcbPfc> pfc; ///< Unset when the driver reports none.
  std::vector<DcbApp> apps;  ///< Application priority table.
};

/// Everything GetDcb reads; parts a driver lacks are unset.
struct DcbInfo {
  bool enabled = false;                        ///< DCB state.
  std::optional<uint8_t> dcbx;                 ///< DCBX mode bits in use.
  std::optional<DcbCapabilities> capabilities; ///< Capabilities.
  std::optional<DcbIeee> ieee;                 ///< IEEE configuration.
};
DcbInfo GetDcb(Namespace& ns, const std::string& dev);

/// Parsers of dcbnl replies (netlink header, dcbmsg, attributes).
namespace DcbWire {
DcbCapabilities ParseCapabilities(std::span<const uint8_t> message);
DcbIeee ParseIeee(std::span<const uint8_t> message);
} // namespace DcbWire

} // namespace LinuxNet
