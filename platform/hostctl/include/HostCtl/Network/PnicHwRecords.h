//===- HostCtl/Network/PnicHwRecords.h - Hardware records of a NIC --------===//
//
// The records that the hardware-setting operations of Pnic exchange:
// offloads, interrupt coalescing, ring sizes, NetQueue, software simulation
// of offloads and self-test results. Callers value-initialise a record
// before a Get call. Set calls apply exactly what the record's mask or
// selection flags name (offloads, NetQueue, software simulation) or the whole
// record (coalescing, rings).
//
//===----------------------------------------------------------------------===//
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace HostCtl::Network {

/// Mask bits of PnicOffloadSettings::mask.
enum PnicOffloadMask : uint8_t {
  OffloadRxChecksum = 0x01,    ///< Apply rxChecksum.
  OffloadTxChecksum = 0x02,    ///< Apply txChecksum.
  OffloadScatterGather = 0x04, ///< Apply scatterGather.
  OffloadTso = 0x08,           ///< Apply tso.
};

/// Offload flags of a NIC.
struct PnicOffloadSettings {
  uint8_t mask = 0;           ///< PnicOffloadMask bits that a set applies.
  bool rxChecksum = false;    ///< RX checksum offload.
  bool txChecksum = false;    ///< TX checksum offload.
  bool scatterGather = false; ///< Scatter-gather.
  bool tso = false;           ///< TCP segmentation offload.
  bool tso6 = false;          ///< TCP segmentation offload over IPv6 (read only).
  bool encapOffload = false;  ///< Offload of encapsulated traffic (read only).
  std::string text;           ///< The driver's summary of its offloads (read only).
};

/// Interrupt coalescing parameters; counts are unsigned 32-bit.
struct PnicCoalesceParams {
  bool adaptiveRx = false;      ///< Adaptive RX coalescing on.
  bool adaptiveTx = false;      ///< Adaptive TX coalescing on.
  uint32_t statsBlockUsecs = 0; ///< Microseconds between statistics updates.
  uint32_t sampleInterval = 0;  ///< Seconds between packet-rate samples.
  uint32_t pktRateLow = 0;      ///< Packets per second below which the low set applies.
  uint32_t pktRateHigh = 0;     ///< Packets per second above which the high set applies.
  uint32_t rxUsecs = 0;         ///< RX interrupt delay.
  uint32_t rxMaxFrames = 0;     ///< RX frames gathered before an interrupt.
  uint32_t rxUsecsIrq = 0;      ///< RX interrupt delay while an interrupt is served.
  uint32_t rxMaxFramesIrq = 0;  ///< RX frames while an interrupt is served.
  uint32_t txUsecs = 0;         ///< TX interrupt delay.
  uint32_t txMaxFrames = 0;     ///< TX frames gathered before an interrupt.
  uint32_t txUsecsIrq = 0;      ///< TX interrupt delay while an interrupt is served.
  uint32_t txMaxFramesIrq = 0;  ///< TX frames while an interrupt is served.
  uint32_t rxUsecsLow = 0;      ///< RX delay time at low packet rate.
  uint32_t rxMaxFramesLow = 0;  ///< RX delay packets at low packet rate.
  uint32_t txUsecsLow = 0;      ///< TX delay time at low packet rate.
  uint32_t txMaxFramesLow = 0;  ///< TX delay packets at low packet rate.
  uint32_t rxUsecsHigh = 0;     ///< RX delay time at high packet rate.
  uint32_t rxMaxFramesHigh = 0; ///< RX delay packets at high packet rate.
  uint32_t txUsecsHigh = 0;     ///< TX delay time at high packet rate.
  uint32_t txMaxFramesHigh = 0; ///< TX delay packets at high packet rate.
};

/// Sizes of a NIC's descriptor rings, in ring entries.
struct PnicRingParams {
  uint8_t flags = 0;    ///< Not used.
  uint32_t rx = 0;      ///< RX ring.
  uint32_t rxMini = 0;  ///< RX mini ring.
  uint32_t rxJumbo = 0; ///< RX jumbo ring.
  uint32_t tx = 0;      ///< TX ring.
};

/// A NetQueue balancer plugin.
struct PnicNetqueuePluginInfo {
  std::string moduleName;  ///< Kernel module that supplies the plugin.
  std::string pluginName;  ///< Plugin name, unique within its module.
  std::string description; ///< Text for the user.
};

/// Number of load-balancer settings of a NetQueue record.
inline constexpr std::size_t kNetqueueSettingCount = 11;
/// Number of filter classes of a NetQueue record.
inline constexpr std::size_t kNetqueueFilterClassCount = 6;

/// NetQueue state of a NIC. A set applies the queue counts, balancer state
/// and plugin state whose selected flag is set, and the allowed flag of every
/// setting whose bit is set in settingMask.
struct PnicNetqueueInfo {
  uint32_t settingMask = 0;           ///< Bit i selects settingAllowed[i].
  uint32_t txQueueCount = 0;          ///< Number of TX netqueues.
  uint32_t rxQueueCount = 0;          ///< Number of RX netqueues.
  bool txCountSelected = false;       ///< A set changes txQueueCount.
  bool rxCountSelected = false;       ///< A set changes rxQueueCount.
  bool balancerStateSelected = false; ///< A set changes balancerEnabled.
  bool pluginStateSelected = false;   ///< A set changes the plugins of changedPlugins.
  bool balancerEnabled = false;       ///< The balancer is enabled.
  bool pluginEnabled = false;         ///< State a set gives to changedPlugins.
  std::array<bool, kNetqueueSettingCount> settingAllowed{};   ///< Per setting: allowed.
  std::array<bool, kNetqueueSettingCount> settingSupported{}; ///< Per setting: supported.
  /// MAC only, VLAN only, VLAN and MAC, VXLAN, Geneve, generic encapsulation.
  std::array<bool, kNetqueueFilterClassCount> filterClasses{};
  std::vector<PnicNetqueuePluginInfo> plugins; ///< All balancer plugins of the NIC.
  /// Read: the enabled plugins. Set: the plugins whose state changes.
  std::vector<PnicNetqueuePluginInfo> changedPlugins;
};

/// Number of features of a software simulation record.
inline constexpr std::size_t kSoftwareFeatureCount = 14;

/// Offload features that the host performs in software for a NIC. Feature i
/// is selected by mask bit i: IPv4 CSO, IPv4 TSO, scatter-gather, offset-based
/// offload, VXLAN encapsulation, IPv6 TSO, IPv6 TSO with extension headers,
/// IPv6 CSO, IPv6 CSO with extension headers, high DMA, scatter-gather over
/// pages, TX VLAN tagging, RX VLAN untagging, Geneve encapsulation.
struct PnicSoftwareSimulation {
  uint32_t mask = 0;                                  ///< Bit i selects features[i].
  std::array<bool, kSoftwareFeatureCount> features{}; ///< Simulated in software.
};

/// Result of a NIC self test.
struct PnicSelfTestResult {
  bool failed = false;           ///< The test failed.
  std::vector<std::string> info; ///< Information lines, in the NIC's order.
};

} // namespace HostCtl::Network
