//===- HostCtl/Network/Policy.h - Teaming, security and shaping policies --===//
//
// Value types of the three policies a standard switch applies to its ports,
// and the capabilities it offers them. Each policy carries a set mask naming
// the fields it sets: a switch's policy sets every field, a port group's
// configured policy sets only the fields it overrides. The policy in force on
// a port group is its configured policy merged over its switch's, field by
// field (MergedOver).
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace HostCtl::Network {

/// How a team detects that an uplink failed. The beacon criterion lives in
/// bit 4 of the two flag words: set in the first word it asks for beacon
/// probing, set in the second it lets the link state alone decide. Beacon
/// probing is in force when the bit is set in the first word and clear in the
/// second.
class LinkCriteriaSelectionPolicy {
public:
  /// The beacon bit of both flag words.
  static constexpr uint32_t BEACON_BIT = 1u << 4;

  /// Link state only (no word has the beacon bit).
  LinkCriteriaSelectionPolicy() = default;
  LinkCriteriaSelectionPolicy(uint32_t requested, uint32_t linkOnly)
      : flags_{requested, linkOnly} {}

  /// Configures the beacon criterion: \p linkStateOnly true makes the link
  /// state alone decide, false turns beacon probing on.
  void SetBeacon(bool linkStateOnly) {
    flags_[0] |= BEACON_BIT;
    if (linkStateOnly)
      flags_[1] |= BEACON_BIT;
    else
      flags_[1] &= ~BEACON_BIT;
  }
  /// Flag word \p index (0 or 1).
  uint32_t GetFlagWord(int index) const { return flags_[index & 1]; }
  /// Whether beacon probing is in force.
  bool IsBeacon() const { return (flags_[0] & BEACON_BIT) != 0 && (flags_[1] & BEACON_BIT) == 0; }
  bool operator==(const LinkCriteriaSelectionPolicy&) const = default;

private:
  uint32_t flags_[2] = {0, 0}; ///< Requested criteria; criteria left to link state.
};

/// NIC teaming and failover.
class NicTeamingPolicy {
public:
  /// How traffic is spread over the active uplinks.
  enum TeamPolicyType : uint32_t {
    TEAM_IP_HASH = 1,  ///< Hash of source and destination IP addresses.
    TEAM_SRC_MAC = 2,  ///< Source MAC address.
    TEAM_SRC_PORT = 3, ///< Originating virtual port.
    TEAM_EXPLICIT = 4, ///< Highest uplink of the order that works.
  };
  /// Bits of the set mask.
  enum MaskBit : uint32_t {
    MASK_LOAD_BALANCING = 1u << 0,
    MASK_NOTIFY_SWITCHES = 1u << 2,
    MASK_FAILURE_DETECTION = 1u << 3,
    MASK_UPLINK_ORDER = 1u << 4, ///< Uplink order and the number of active uplinks.
    MASK_FAILBACK = 1u << 5,
    MASK_ALL = MASK_LOAD_BALANCING | MASK_NOTIFY_SWITCHES | MASK_FAILURE_DETECTION |
               MASK_UPLINK_ORDER | MASK_FAILBACK,
  };

  /// The policy of a new switch: every field set except the uplink order,
  /// which then follows the switch's uplinks (all active).
  static NicTeamingPolicy GetDefaultPolicy();

  uint32_t GetSetMask() const { return mask_; }
  bool IsSet(MaskBit bit) const { return (mask_ & bit) != 0; }
  TeamPolicyType GetTeamingPolicy() const { return type_; }
  bool GetNotifySwitchOnFailure() const { return notify_; }
  bool GetRollingRestoration() const { return rolling_; }
  const LinkCriteriaSelectionPolicy& GetLinkCriteria() const { return criteria_; }
  const std::vector<std::string>& GetUplinkOrder() const { return order_; }
  int32_t GetMaxActiveUplinks() const { return maxActive_; }

  void SetTeamingPolicy(TeamPolicyType type) {
    type_ = type;
    mask_ |= MASK_LOAD_BALANCING;
  }
  void SetLinkCriteria(const LinkCriteriaSelectionPolicy& criteria) {
    criteria_ = criteria;
    mask_ |= MASK_FAILURE_DETECTION;
  }
  void SetNotifySwitchOnFailure(bool notify) {
    notify_ = notify;
    mask_ |= MASK_NOTIFY_SWITCHES;
  }
  void SetRollingRestoration(bool rolling) {
    rolling_ = rolling;
    mask_ |= MASK_FAILBACK;
  }
  void SetMaxActiveUplinks(int32_t count) {
    maxActive_ = count;
    mask_ |= MASK_UPLINK_ORDER;
  }
  void SetUplinkOrder(std::vector<std::string> order) {
    order_ = std::move(order);
    mask_ |= MASK_UPLINK_ORDER;
  }
  /// Clears the set mask (every field follows the parent again).
  void UnsetAll() { mask_ = 0; }
  /// Replaces the set mask (used when a stored policy is read back).
  void SetSetMask(uint32_t mask) { mask_ = mask & MASK_ALL; }

  /// This policy's set fields over \p parent's: the result sets what either sets.
  NicTeamingPolicy MergedOver(const NicTeamingPolicy& parent) const;
  bool operator==(const NicTeamingPolicy&) const = default;

private:
  uint32_t mask_ = 0;                    ///< Fields this policy sets.
  TeamPolicyType type_ = TEAM_SRC_PORT;  ///< Load balancing.
  bool notify_ = true;                   ///< Notify physical switches on failover.
  bool rolling_ = false;                 ///< No failback when true.
  LinkCriteriaSelectionPolicy criteria_; ///< Failure detection.
  std::vector<std::string> order_;       ///< Uplinks: active ones first, then standby.
  int32_t maxActive_ = 0;                ///< How many of the order are active.
};

/// Port security.
class PortSecurityPolicy {
public:
  /// Bits of the set mask.
  enum MaskBit : uint32_t {
    MASK_PROMISCUOUS = 1u << 0,
    MASK_MAC_CHANGE = 1u << 1,
    MASK_FORGED_TRANSMITS = 1u << 2,
    MASK_ALL = MASK_PROMISCUOUS | MASK_MAC_CHANGE | MASK_FORGED_TRANSMITS,
  };

  /// The policy of a new switch: everything refused, every field set.
  static PortSecurityPolicy GetDefaultPolicy();

  uint32_t GetSetMask() const { return mask_; }
  bool IsSet(MaskBit bit) const { return (mask_ & bit) != 0; }
  bool GetAllowPromiscuous() const { return promiscuous_; }
  bool GetAllowMacAddressChange() const { return macChange_; }
  bool GetAllowForgedTransmits() const { return forged_; }

  void SetAllowPromiscuous(bool allow) {
    promiscuous_ = allow;
    mask_ |= MASK_PROMISCUOUS;
  }
  void SetAllowMacAddressChange(bool allow) {
    macChange_ = allow;
    mask_ |= MASK_MAC_CHANGE;
  }
  void SetAllowForgedTransmits(bool allow) {
    forged_ = allow;
    mask_ |= MASK_FORGED_TRANSMITS;
  }
  void UnsetAll() { mask_ = 0; }
  void SetSetMask(uint32_t mask) { mask_ = mask & MASK_ALL; }

  /// This policy's set fields over \p parent's.
  PortSecurityPolicy MergedOver(const PortSecurityPolicy& parent) const;
  bool operator==(const PortSecurityPolicy&) const = default;

private:
  uint32_t mask_ = 0;        ///< Fields this policy sets.
  bool promiscuous_ = false; ///< Ports may enter promiscuous mode.
  bool macChange_ = false;   ///< Ports may change their MAC address.
  bool forged_ = false;      ///< Ports may send with a forged source MAC.
};

/// Traffic shaping. Rates are in bits per second, the burst in bytes.
class ShapingPolicy {
public:
  /// Bits of the set mask.
  enum MaskBit : uint32_t {
    MASK_PEAK = 1u << 0,
    MASK_AVERAGE = 1u << 1,
    MASK_BURST = 1u << 2,
    MASK_ENABLED = 1u << 3,
    MASK_ALL = MASK_PEAK | MASK_AVERAGE | MASK_BURST | MASK_ENABLED,
  };

  /// The policy of a new switch: disabled, with no rate set.
  static ShapingPolicy GetDefaultPolicy();

  uint32_t GetSetMask() const { return mask_; }
  bool IsSet(MaskBit bit) const { return (mask_ & bit) != 0; }
  bool IsEnabled() const { return enabled_; }
  int64_t GetPeakBps() const { return peakBps_; }
  int64_t GetAverageBps() const { return averageBps_; }
  int64_t GetBurstSize() const { return burstSize_; }

  void SetEnabled(bool enabled) {
    enabled_ = enabled;
    mask_ |= MASK_ENABLED;
  }
  void SetAverageBps(uint64_t bps) {
    averageBps_ = static_cast<int64_t>(bps);
    mask_ |= MASK_AVERAGE;
  }
  void SetPeakBps(uint64_t bps) {
    peakBps_ = static_cast<int64_t>(bps);
    mask_ |= MASK_PEAK;
  }
  void SetBurstSize(uint64_t bytes) {
    burstSize_ = static_cast<int64_t>(bytes);
    mask_ |= MASK_BURST;
  }
  void UnsetAll() { mask_ = 0; }
  void SetSetMask(uint32_t mask) { mask_ = mask & MASK_ALL; }

  /// This policy's set fields over \p parent's.
  ShapingPolicy MergedOver(const ShapingPolicy& parent) const;
  bool operator==(const ShapingPolicy&) const = default;

private:
  uint32_t mask_ = 0;      ///< Fields this policy sets.
  bool enabled_ = false;   ///< Shaping is applied.
  int64_t peakBps_ = 0;    ///< Peak rate, bits per second.
  int64_t averageBps_ = 0; ///< Average rate, bits per second.
  int64_t burstSize_ = 0;  ///< Largest burst, bytes.
};

/// Offloads a switch offers to the ports on it.
class NicCapabilities {
public:
  /// Everything offered.
  static NicCapabilities GetDefaultPolicy();

  bool GetChecksumOffload() const { return checksum_; }
  bool GetTcpSegmentation() const { return tso_; }
  bool GetZeroCopyTransmit() const { return zeroCopy_; }
  void SetChecksumOffload(bool on) { checksum_ = on; }
  void SetTcpSegmentation(bool on) { tso_ = on; }
  void SetZeroCopyTransmit(bool on) { zeroCopy_ = on; }
  bool operator==(const NicCapabilities&) const = default;

private:
  bool checksum_ = false; ///< Checksum offload.
  bool tso_ = false;      ///< TCP segmentation offload.
  bool zeroCopy_ = false; ///< Zero-copy transmit.
};

} // namespace HostCtl::Network
