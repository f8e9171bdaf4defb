//===- PortGroupPolicyReadTest.cpp - The six policy reads of a port group -===//
//
// A port group's teaming, security and shaping policies are read in force
// (its own fields over its switch's) or as configured (its own set mask, with
// the switch's values in the fields it does not set). Every read checks its
// declared fault and refuses a port group that has gone. The port group "own"
// overrides one field of each policy; "faulty" has a fault on every read.
//
//===----------------------------------------------------------------------===//
#include "../support/ScratchHost.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/Switching.h"

#include <gtest/gtest.h>

#include <functional>
#include <string>

namespace {

using namespace HostCtl::Network;
using HostCtl::Lib::HostCtlException;

const char* const kHost = R"json({
  "nics": [{"name": "vmnic0", "mac": "00:50:56:00:30:01"},
           {"name": "vmnic1", "mac": "00:50:56:00:30:02"}],
  "vswitches": [{"name": "sw0", "uplinks": ["vmnic0", "vmnic1"],
    "teaming": {"loadBalancing": "iphash", "notifySwitches": false},
    "security": {"allowPromiscuous": true, "allowMacChange": false},
    "shaping": {"enabled": true, "averageBps": 1000000, "peakBps": 2000000, "burstSize": 4096},
    "portgroups": [
      {"name": "own", "teaming": {"loadBalancing": "srcmac"},
       "security": {"allowMacChange": true}, "shaping": {"peakBps": 3000000}},
      {"name": "faulty"}]}],
  "faults": [
    {"operation": "GetNicTeamingPolicy", "object": "faulty", "message": "GetNicTeamingPolicy"},
    {"operation": "GetConfiguredNicTeamingPolicy", "object": "faulty",
     "message": "GetConfiguredNicTeamingPolicy"},
    {"operation": "GetPortSecurityPolicy", "object": "faulty", "message": "GetPortSecurityPolicy"},
    {"operation": "GetConfiguredPortSecurityPolicy", "object": "faulty",
     "message": "GetConfiguredPortSecurityPolicy"},
    {"operation": "GetTrafficShapingPolicy", "object": "faulty",
     "message": "GetTrafficShapingPolicy"},
    {"operation": "GetConfiguredTrafficShapingPolicy", "object": "faulty",
     "message": "GetConfiguredTrafficShapingPolicy"}]
})json";

/// One read: what it gives for port group "own", reduced to the overridden
/// field, one inherited field and the set mask.
struct Read {
  const char* operation;                          ///< Host operation and fault message.
  std::function<std::string(PortGroup&)> summary; ///< "overridden inherited mask".
  std::string expected;                           ///< Its value for "own".
};

/// "a b m": the overridden value, the inherited value and the set mask.
template <typename A, typename B>
std::string Summary(const A& overridden, const B& inherited, uint32_t mask) {
  std::string text;
  for (const std::string& part : {std::to_string(overridden), std::to_string(inherited)})
    text += part + " ";
  return text + std::to_string(mask);
}

const std::vector<Read>& Reads() {
  using Team = NicTeamingPolicy;
  static const std::vector<Read> reads = {
      {"GetNicTeamingPolicy",
       [](PortGroup& g) {
         Team p = g.GetNicTeamingPolicy();
         return Summary(p.GetTeamingPolicy(), p.GetNotifySwitchOnFailure(), 0);
       },
       Summary(Team::TEAM_SRC_MAC, false, 0)},
      {"GetConfiguredNicTeamingPolicy",
       [](PortGroup& g) {
         Team p = g.GetConfiguredNicTeamingPolicy();
         return Summary(p.GetTeamingPolicy(), p.GetNotifySwitchOnFailure(), p.GetSetMask());
       },
       Summary(Team::TEAM_SRC_MAC, false, Team::MASK_LOAD_BALANCING)},
      {"GetPortSecurityPolicy",
       [](PortGroup& g) {
         PortSecurityPolicy p = g.GetPortSecurityPolicy();
         return Summary(p.GetAllowMacAddressChange(), p.GetAllowPromiscuous(), 0);
       },
       Summary(true, true, 0)},
      {"GetConfiguredPortSecurityPolicy",
       [](PortGroup& g) {
         PortSecurityPolicy p = g.GetConfiguredPortSecurityPolicy();
         return Summary(p.GetAllowMacAddressChange(), p.GetAllowPromiscuous(), p.GetSetMask());
       },
       Summary(true, true, PortSecurityPolicy::MASK_MAC_CHANGE)},
      {"GetTrafficShapingPolicy",
       [](PortGroup& g) {
         ShapingPolicy p = g.GetTrafficShapingPolicy();
         return Summary(p.GetPeakBps(), p.GetAverageBps(), 0);
       },
       Summary(3000000, 1000000, 0)},
      {"GetConfiguredTrafficShapingPolicy",
       [](PortGroup& g) {
         ShapingPolicy p = g.GetConfiguredTrafficShapingPolicy();
         return Summary(p.GetPeakBps(), p.GetAverageBps(), p.GetSetMask());
       },
       Summary(3000000, 1000000, ShapingPolicy::MASK_PEAK)},
  };
  return reads;
}

class PortGroupPolicyReadTest : public ::testing::Test {
protected:
  /// The message \p read throws on port group \p group, or "" when it does not.
  static std::string Refusal(const Read& read, PortGroup& group) {
    try {
      read.summary(group);
    } catch (const HostCtlException& e) {
      return e.what();
    }
    return "";
  }

  TestSupport::ScratchHost host_{"portgroup-policy-read-test", kHost}; ///< The test host.
};

TEST_F(PortGroupPolicyReadTest, InForceAndConfiguredReadsMergeTheSwitchDifferently) {
  auto own = NetworkFactory::GetPortGroupByName("own");
  ASSERT_TRUE(own);
  for (const Read& read : Reads()) {
    SCOPED_TRACE(read.operation);
    EXPECT_EQ(read.summary(*own), read.expected);
  }
}

TEST_F(PortGroupPolicyReadTest, EachReadChecksItsFaultAndTheGroup) {
  auto faulty = NetworkFactory::GetPortGroupByName("faulty");
  auto own = NetworkFactory::GetPortGroupByName("own");
  ASSERT_TRUE(faulty && own);
  for (const Read& read : Reads()) {
    SCOPED_TRACE(read.operation);
    EXPECT_EQ(Refusal(read, *faulty), read.operation);
  }
  TvkCtl::Network::VirtualSwitchInfoImpl switches;
  switches.GetVirtualSwitchByName("sw0", PortsetGetRegular)->RemovePortGroup("own");
  for (const Read& read : Reads()) {
    SCOPED_TRACE(read.operation);
    EXPECT_EQ(Refusal(read, *own), "The host has no port group named own");
  }
}

} // namespace
