//===- model/NicHwModel.h - Hardware records of the simulated NICs --------===//
//
// Each physical NIC may hold one record of every hardware kind: offloads,
// coalescing, rings, NetQueue, software simulation, EEPROM, registers, self
// test, DCB and hardware capabilities. A record is kept as JSON text in the
// side table pnic_record, in the same form as the NIC's key of that name in the
// host description; a NIC without a record of a kind does not have that
// feature. The codecs below turn the JSON into host records and back, and
// check every value on the way in.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/DcbRecords.h"
#include "HostCtl/Network/PnicHwRecords.h"
#include "HostCtl/Network/PnicRecords.h"
#include "model/Store.h"

#include <nlohmann/json.hpp>

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace Model {

/// Preset maximum and current ring sizes.
struct RingState {
  HostCtl::Network::PnicRingParams maximums; ///< Preset maximums; 0 = no such ring.
  HostCtl::Network::PnicRingParams current;  ///< Current sizes.
};

/// NetQueue state: the record as GetNetqueueInfo returns it (changedPlugins
/// holds the enabled plugins) and the NIC's queue limits.
struct NetqueueState {
  HostCtl::Network::PnicNetqueueInfo info; ///< Counts, flags and plugins.
  uint32_t maxTxQueues = 0;                ///< Most TX netqueues the NIC has.
  uint32_t maxRxQueues = 0;                ///< Most RX netqueues the NIC has.
};

/// EEPROM contents and its magic key.
struct EepromState {
  uint32_t magic = 0;        ///< Key a write must present.
  std::vector<uint8_t> data; ///< Contents; its size is the EEPROM's.
};

/// Register words of a NIC.
struct RegisterState {
  std::vector<uint32_t> words; ///< In register order.
};

/// The tests of a NIC's self test.
struct SelfTestState {
  struct Test {
    std::string name;   ///< Shown in the result's information lines.
    bool passed = true; ///< Outcome when run.
    bool online = true; ///< Part of the limited online set.
  };
  std::vector<Test> tests; ///< In the order they run.
};

/// DCB state of a NIC.
struct DcbState {
  uint32_t mode = 0;                              ///< DcbMode code.
  bool enabled = false;                           ///< DCB is on.
  HostCtl::Network::DcbCapabilities caps;         ///< Capabilities.
  bool pfcEnabled = false;                        ///< PFC is on.
  uint8_t pfcConfig = 0;                          ///< PFC enable bit per priority.
  HostCtl::Network::DcbIeeeEtsConfig ets;         ///< IEEE ETS configuration.
  HostCtl::Network::DcbIeeePfcConfig pfc;         ///< IEEE PFC configuration.
  std::vector<HostCtl::Network::DcbAppInfo> apps; ///< Application entries.
};

/// Names of the NetQueue load-balancer settings, in record order.
extern const std::array<const char*, HostCtl::Network::kNetqueueSettingCount> kNetqueueSettingNames;
/// Names of the NetQueue filter classes, in record order.
extern const std::array<const char*, HostCtl::Network::kNetqueueFilterClassCount>
    kNetqueueFilterClassNames;
/// Names of the software-simulated features, in record order.
extern const std::array<const char*, HostCtl::Network::kSoftwareFeatureCount> kSoftwareFeatureNames;
/// Names of the hardware capabilities, by bit.
const std::vector<std::string>& HwCapNames();

// Codecs: Decode reads and checks a record's JSON (\p path names it in
// errors, which are ImportError); Encode writes the canonical JSON.
void Decode(const nlohmann::ordered_json& json, const std::string& path,
            HostCtl::Network::PnicOffloadSettings& out);
void Decode(const nlohmann::ordered_json& json, const std::string& path,
            HostCtl::Network::PnicCoalesceParams& out);
void Decode(const nlohmann::ordered_json& json, const std::string& path, RingState& out);
void Decode(const nlohmann::ordered_json& json, const std::string& path, NetqueueState& out);
void Decode(const nlohmann::ordered_json& json, const std::string& path,
            HostCtl::Network::PnicSoftwareSimulation& out);
void Decode(const nlohmann::ordered_json& json, const std::string& path, EepromState& out);
void Decode(const nlohmann::ordered_json& json, const std::string& path, RegisterState& out);
void Decode(const nlohmann::ordered_json& json, const std::string& path, SelfTestState& out);
void Decode(const nlohmann::ordered_json& json, const std::string& path, DcbState& out);
void Decode(const nlohmann::ordered_json& json, const std::string& path,
            HostCtl::Network::PnicHwCapabilities& out);

nlohmann::ordered_json Encode(const HostCtl::Network::PnicOffloadSettings& in);
nlohmann::ordered_json Encode(const HostCtl::Network::PnicCoalesceParams& in);
nlohmann::ordered_json Encode(const RingState& in);
nlohmann::ordered_json Encode(const NetqueueState& in);
nlohmann::ordered_json Encode(const HostCtl::Network::PnicSoftwareSimulation& in);
nlohmann::ordered_json Encode(const EepromState& in);
nlohmann::ordered_json Encode(const RegisterState& in);
nlohmann::ordered_json Encode(const SelfTestState& in);
nlohmann::ordered_json Encode(const DcbState& in);
nlohmann::ordered_json Encode(const HostCtl::Network::PnicHwCapabilities& in);

/// A ring of the ring record and its name in messages.
struct RingSlot {
  const char* name;                                   ///< "RX", "RX mini", ...
  uint32_t HostCtl::Network::PnicRingParams::*member; ///< Field.
  bool required; ///< A NIC that has this ring holds at least one entry in it.
};
/// The rings, in record order.
extern const std::array<RingSlot, 4> kRingSlots;

// The host's rules for the state a record may be in, which the operations
// that change a record keep and import checks: the problem with the record of
// NIC \p nic, or "" when it keeps them.

/// Counts and delays at most 0x7fffffff; adaptive coalescing with a sample
/// interval of 1 to 3600; the low packet rate below the high one when both
/// are set.
std::string CoalesceProblem(const std::string& nic, const HostCtl::Network::PnicCoalesceParams& p);
/// No ring above its maximum, no size for a ring the NIC lacks, and RX and TX
/// rings that the NIC has hold at least one entry.
std::string RingProblem(const std::string& nic, const RingState& state);
/// Queue counts from 1 to the NIC's limit (0 without queues), and only
/// supported load-balancer settings allowed.
std::string NetqueueProblem(const std::string& nic, const NetqueueState& state);

/// Whether the host has a physical NIC named \p nic.
bool NicHwPnicExists(Store& store, const std::string& nic);

/// The record of kind \p kind (a host-description key such as "coalesce") of
/// NIC \p nic as JSON text; false when the NIC has none. The NIC must exist.
bool LoadNicHwRecord(Store& store, const std::string& nic, const char* kind, std::string& text);
/// Stores the record of kind \p kind of NIC \p nic.
void SaveNicHwRecord(Store& store, const std::string& nic, const char* kind,
                     const nlohmann::ordered_json& record);

} // namespace Model
