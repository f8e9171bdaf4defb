//===- Policy.cpp - Defaults and merging of switch policies ---------------===//
#include "HostCtl/Network/Policy.h"

namespace HostCtl::Network {

NicTeamingPolicy NicTeamingPolicy::GetDefaultPolicy() {
  NicTeamingPolicy policy;
  policy.SetTeamingPolicy(TEAM_SRC_PORT);
  LinkCriteriaSelectionPolicy criteria;
  criteria.SetBeacon(true);
  policy.SetLinkCriteria(criteria);
  policy.SetNotifySwitchOnFailure(true);
  policy.SetRollingRestoration(false);
  return policy;
}

NicTeamingPolicy NicTeamingPolicy::MergedOver(const NicTeamingPolicy& parent) const {
  NicTeamingPolicy merged = parent;
  if (IsSet(MASK_LOAD_BALANCING))
    merged.SetTeamingPolicy(type_);
  if (IsSet(MASK_FAILURE_DETECTION))
    merged.SetLinkCriteria(criteria_);
  if (IsSet(MASK_NOTIFY_SWITCHES))
    merged.SetNotifySwitchOnFailure(notify_);
  if (IsSet(MASK_FAILBACK))
    merged.SetRollingRestoration(rolling_);
  if (IsSet(MASK_UPLINK_ORDER)) {
    merged.SetUplinkOrder(order_);
    merged.SetMaxActiveUplinks(maxActive_);
  }
  return merged;
}

PortSecurityPolicy PortSecurityPolicy::GetDefaultPolicy() {
  PortSecurityPolicy policy;
  policy.SetAllowPromiscuous(false);
  policy.SetAllowMacAddressChange(false);
  policy.SetAllowForgedTransmits(false);
  return policy;
}

PortSecurityPolicy PortSecurityPolicy::MergedOver(const PortSecurityPolicy& parent) const {
  PortSecurityPolicy merged = parent;
  if (IsSet(MASK_PROMISCUOUS))
    merged.SetAllowPromiscuous(promiscuous_);
  if (IsSet(MASK_MAC_CHANGE))
    merged.SetAllowMacAddressChange(macChange_);
  if (IsSet(MASK_FORGED_TRANSMITS))
    merged.SetAllowForgedTransmits(forged_);
  return merged;
}

ShapingPolicy ShapingPolicy::GetDefaultPolicy() {
  ShapingPolicy policy;
  policy.SetEnabled(false);
  return policy;
}

ShapingPolicy ShapingPolicy::MergedOver(const ShapingPolicy& parent) const {
  ShapingPolicy merged = parent;
  if (IsSet(MASK_ENABLED))
    merged.SetEnabled(enabled_);
  if (IsSet(MASK_AVERAGE))
    merged.SetAverageBps(static_cast<uint64_t>(averageBps_));
  if (IsSet(MASK_PEAK))
    merged.SetPeakBps(static_cast<uint64_t>(peakBps_));
  if (IsSet(MASK_BURST))
    merged.SetBurstSize(static_cast<uint64_t>(burstSize_));
  return merged;
}

NicCapabilities NicCapabilities::GetDefaultPolicy() {
  NicCapabilities caps;
  caps.SetChecksumOffload(true);
  caps.SetTcpSegmentation(true);
  caps.SetZeroCopyTransmit(true);
  return caps;
}

} // namespace HostCtl::Network
