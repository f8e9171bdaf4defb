//===- HostCtl/Network/PnicRecords.h - Records a physical NIC exchanges ---===//
//
// Plain records that Pnic operations fill or apply. Callers zero-fill them
// (value-initialise) before a Get call.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace HostCtl::Network {

/// Wake-on-LAN mode codes.
enum WakeOnMode : uint32_t {
  WakeOnPhy = 0,
  WakeOnUnicast = 1,
  WakeOnMulticast = 2,
  WakeOnBroadcast = 3,
  WakeOnArp = 4,
  WakeOnMagic = 5,
  WakeOnSecureOn = 6,
  WakeOnUnsupported = 7,
  WakeOnDisabled = 8,
};

/// One advertised link mode.
struct PnicLinkMode {
  uint32_t speed = 0;  ///< Mbps; 0 stands for autonegotiation.
  uint32_t duplex = 0; ///< 0 auto, 1 full, 2 half.
  uint32_t media = 0;  ///< Media code, 0 to 38.
};

/// Generic NIC information. A set applies only the settings whose changed
/// flag is set.
struct PnicInfo {
  std::vector<uint32_t> supportedPorts;      ///< Port codes (0 TP ... 6 backplane).
  std::vector<uint32_t> reserved;            ///< Not used by the commands.
  bool supportsAutoNegotiation = false;      ///< The NIC can autonegotiate.
  std::vector<PnicLinkMode> advertisedModes; ///< Advertised link modes.
  bool advertisedAutoNegotiation = false;    ///< Autonegotiation is advertised.
  bool portChanged = false;                  ///< Apply `port`.
  bool phyAddressChanged = false;            ///< Apply `phyAddress`.
  bool virtualAddressChanged = false;        ///< Apply `virtualAddress`.
  bool transceiverChanged = false;           ///< Apply `transceiver`.
  uint32_t port = 0;                         ///< Current port code.
  uint32_t phyAddress = 0;                   ///< PHY address.
  uint32_t transceiver = 0;                  ///< 0 internal, 1 external.
  bool autoNegotiation = false;              ///< Autonegotiation is on.
  bool wakeOnChanged = false;                ///< Apply `wakeOn`.
  bool supportsWakeOn = false;               ///< The NIC supports wake-on.
  std::vector<uint32_t> wakeOn;              ///< WakeOnMode codes.
  bool messageLevelChanged = false;          ///< Apply `messageLevel`.
  bool messageLevelSupported = false;        ///< The driver has a message level.
  uint32_t messageLevel = 0;                 ///< Driver message level.
  std::string virtualAddress;                ///< Virtual address text.
  std::string linkStatus;                    ///< Link status text.
};

/// Ethernet pause (flow control) parameters.
struct PnicPauseParams {
  bool supported = false;       ///< The NIC has pause parameters.
  bool autoNegotiation = false; ///< Pause autonegotiation is on.
  bool rx = false;              ///< Pause RX is on.
  bool tx = false;              ///< Pause TX is on.
  uint32_t rxResolution = 0;    ///< 0 none yet, 1 on, other off.
  uint32_t txResolution = 0;    ///< 0 none yet, 1 on, other off.
};

/// Driver information.
struct PnicDriverInfo {
  std::string driver;          ///< Driver name.
  std::string version;         ///< Driver version.
  std::string firmwareVersion; ///< Firmware version.
  std::string busInfo;         ///< Bus address text.
};

/// Hardware capability masks; bit n names PnicImpl::GetHwCapName(n).
struct PnicHwCapabilities {
  uint64_t supported = 0; ///< Capabilities the NIC has.
  uint64_t activated = 0; ///< Capabilities in use.
};

/// Packet counters of a NIC, in record order.
struct PnicStats {
  uint64_t txPackets = 0;         ///< Packets sent.
  uint64_t rxPackets = 0;         ///< Packets received.
  uint64_t txBytes = 0;           ///< Bytes sent.
  uint64_t rxBytes = 0;           ///< Bytes received.
  uint64_t txErrors = 0;          ///< Total transmit errors.
  uint64_t rxErrors = 0;          ///< Total receive errors.
  uint64_t txDropped = 0;         ///< Transmit packets dropped.
  uint64_t rxDropped = 0;         ///< Receive packets dropped.
  uint64_t rxMulticast = 0;       ///< Multicast packets received.
  uint64_t rxBroadcast = 0;       ///< Broadcast packets received.
  uint64_t txMulticast = 0;       ///< Multicast packets sent.
  uint64_t txBroadcast = 0;       ///< Broadcast packets sent.
  uint64_t rxLengthErrors = 0;    ///< Receive length errors.
  uint64_t rxOverErrors = 0;      ///< Receive over errors.
  uint64_t rxCrcErrors = 0;       ///< Receive CRC errors.
  uint64_t rxFrameErrors = 0;     ///< Receive frame errors.
  uint64_t rxFifoErrors = 0;      ///< Receive FIFO errors.
  uint64_t rxMissedErrors = 0;    ///< Receive missed errors.
  uint64_t txAbortedErrors = 0;   ///< Transmit aborted errors.
  uint64_t txFifoErrors = 0;      ///< Transmit FIFO errors.
  uint64_t txCarrierErrors = 0;   ///< Transmit carrier errors.
  uint64_t txHeartbeatErrors = 0; ///< Transmit heartbeat errors.
  uint64_t txWindowErrors = 0;    ///< Transmit window errors.
  uint64_t collisions = 0;        ///< Collisions (not shown).
};

/// A branch attached to a trunk.
struct PnicAttachment {
  std::string branch; ///< Branch NIC name.
  uint16_t vlanId = 0; ///< VLAN of the branch on the trunk.
};

} // namespace HostCtl::Network
