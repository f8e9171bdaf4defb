//===- VswitchPolicyTest.cpp - The shared teaming, security, shaping layer -===//
//
// SplitUplinks, the failover arithmetic of SetFailoverPolicy, the shaping
// rules and unit conversions, and the LACP text conversions, run directly on
// policy values against a small host whose switch has vmnic0..vmnic2 as
// uplinks (vmnic3 is a NIC of the host that is no uplink).
//
//===----------------------------------------------------------------------===//
#include "common/PolicyParams.h"
#include "vswitch.h"

#include "model/HostDescription.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <unistd.h>

namespace {

using namespace CorvexCli::NetworkNamespace;
using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::Output;
using HostCtl::Network::NicTeamingPolicy;
using HostCtl::Network::ShapingPolicy;
using Names = std::vector<std::string>;

class PolicyParamsTest : public ::testing::Test {
protected:
  static void SetUpTestSuite() {
    path_ = std::filesystem::temp_directory_path() /
            ("vswitch-policy-test-" + std::to_string(getpid()) + ".db");
    std::filesystem::remove(path_);
    nlohmann::ordered_json host = nlohmann::ordered_json::parse(R"({
      "nics": [
        {"name": "vmnic0", "mac": "00:50:56:00:00:01"},
        {"name": "vmnic1", "mac": "00:50:56:00:00:02"},
        {"name": "vmnic2", "mac": "00:50:56:00:00:03"},
        {"name": "vmnic3", "mac": "00:50:56:00:00:04"}
      ]})");
    {
      auto store = Model::Store::Create(path_.string());
      Model::ImportHost(*store, host);
    }
    Model::Store::CloseHost();
    Model::Store::SetPath(path_.string());
  }
  static void TearDownTestSuite() {
    Model::Store::CloseHost();
    for (const char* suffix : {"", "-wal", "-shm"})
      std::filesystem::remove(path_.string() + suffix);
  }

  /// Order vmnic0, vmnic1, vmnic2 with two active.
  static NicTeamingPolicy Current() {
    NicTeamingPolicy policy;
    policy.SetUplinkOrder({"vmnic0", "vmnic1", "vmnic2"});
    policy.SetMaxActiveUplinks(2);
    return policy;
  }

  /// Runs SetFailoverPolicy on a copy of Current(); returns the errors.
  Names Failover(const std::shared_ptr<Input>& input, NicTeamingPolicy& policy,
                 const NicTeamingPolicy& current = Current()) {
    auto output = Output::New();
    policy = NicTeamingPolicy();
    SetFailoverPolicy(input, output, policy, current, {"vmnic0", "vmnic1", "vmnic2"});
    return output->GetErrorMessages();
  }

  static inline std::filesystem::path path_;
};

TEST(SplitUplinksTest, KeepsEveryFieldButATrailingEmptyOne) {
  EXPECT_EQ(SplitUplinks(""), Names{});
  EXPECT_EQ(SplitUplinks("vmnic0"), Names{"vmnic0"});
  EXPECT_EQ(SplitUplinks("vmnic0,vmnic1"), (Names{"vmnic0", "vmnic1"}));
  EXPECT_EQ(SplitUplinks("a,"), Names{"a"});
  EXPECT_EQ(SplitUplinks("vmnic0,,vmnic1"), (Names{"vmnic0", "", "vmnic1"}));
  EXPECT_EQ(SplitUplinks(",a"), (Names{"", "a"}));
  EXPECT_EQ(SplitUplinks(" a , b"), (Names{" a ", " b"}));
}

TEST_F(PolicyParamsTest, ActiveUplinksKeepTheStandbyOnes) {
  auto input = Input::New();
  input->SetString("active-uplinks", "vmnic1,vmnic0");
  NicTeamingPolicy policy;
  EXPECT_EQ(Failover(input, policy), Names{});
  EXPECT_EQ(policy.GetUplinkOrder(), (Names{"vmnic1", "vmnic0", "vmnic2"}));
  EXPECT_EQ(policy.GetMaxActiveUplinks(), 2);
  EXPECT_EQ(policy.GetSetMask(), NicTeamingPolicy::MASK_UPLINK_ORDER);

  // A standby uplink named active moves out of the standby part.
  input = Input::New();
  input->SetString("active-uplinks", "vmnic2");
  EXPECT_EQ(Failover(input, policy), Names{});
  EXPECT_EQ(policy.GetUplinkOrder(), Names{"vmnic2"});
  EXPECT_EQ(policy.GetMaxActiveUplinks(), 1);
}

TEST_F(PolicyParamsTest, StandbyUplinksKeepTheActiveOnes) {
  auto input = Input::New();
  input->SetString("standby-uplinks", "vmnic0");
  NicTeamingPolicy policy;
  EXPECT_EQ(Failover(input, policy), Names{});
  EXPECT_EQ(policy.GetUplinkOrder(), (Names{"vmnic1", "vmnic0"}));
  EXPECT_EQ(policy.GetMaxActiveUplinks(), 1);

  // A max-active count beyond the order is not read past the order's end.
  NicTeamingPolicy wide;
  wide.SetUplinkOrder({"vmnic0", "vmnic1"});
  wide.SetMaxActiveUplinks(5);
  input = Input::New();
  input->SetString("standby-uplinks", "vmnic2");
  EXPECT_EQ(Failover(input, policy, wide), Names{});
  EXPECT_EQ(policy.GetUplinkOrder(), (Names{"vmnic0", "vmnic1", "vmnic2"}));
  EXPECT_EQ(policy.GetMaxActiveUplinks(), 5);
}

TEST_F(PolicyParamsTest, BothListsGiveExactlyActiveThenStandby) {
  auto input = Input::New();
  input->SetString("active-uplinks", "vmnic2");
  input->SetString("standby-uplinks", "vmnic1");
  NicTeamingPolicy policy;
  EXPECT_EQ(Failover(input, policy), Names{});
  EXPECT_EQ(policy.GetUplinkOrder(), (Names{"vmnic2", "vmnic1"}));
  EXPECT_EQ(policy.GetMaxActiveUplinks(), 1);
}

TEST_F(PolicyParamsTest, DuplicatesAndBadNamesAreReported) {
  NicTeamingPolicy policy;
  auto input = Input::New();
  input->SetString("active-uplinks", "vmnic0,vmnic0");
  EXPECT_EQ(Failover(input, policy), Names{"some NICs appear in the input for more than once."});
  EXPECT_TRUE(policy.GetUplinkOrder().empty());

  input = Input::New();
  input->SetString("active-uplinks", "vmnic0");
  input->SetString("standby-uplinks", "vmnic0");
  EXPECT_EQ(Failover(input, policy), Names{"some NICs appear in the input for more than once."});

  input = Input::New();
  input->SetString("active-uplinks", "vmnic0,,vmnic9,vmnic3,vmnic1");
  EXPECT_EQ(
      Failover(input, policy),
      (Names{"Unknown NIC name in active uplinks : ", "Unknown NIC name in active uplinks : vmnic9",
             "NIC is not connected to the vswitch : vmnic3"}));
  EXPECT_EQ(policy.GetUplinkOrder(), (Names{"vmnic0", "vmnic1", "vmnic2"}));
  EXPECT_EQ(policy.GetMaxActiveUplinks(), 2);

  input = Input::New();
  input->SetString("standby-uplinks", "vmnic7");
  EXPECT_EQ(Failover(input, policy), Names{"Unknown NIC name in standby uplinks : vmnic7"});
}

TEST_F(PolicyParamsTest, ScalarFailoverOptions) {
  auto input = Input::New();
  input->SetString("load-balancing", "mac");
  input->SetString("failure-detection", "beacon");
  input->SetBool("notify-switches", false);
  input->SetBool("failback", false);
  NicTeamingPolicy policy;
  EXPECT_EQ(Failover(input, policy), Names{});
  EXPECT_EQ(policy.GetTeamingPolicy(), NicTeamingPolicy::TEAM_SRC_MAC);
  EXPECT_TRUE(policy.GetLinkCriteria().IsBeacon());
  EXPECT_FALSE(policy.GetNotifySwitchOnFailure());
  EXPECT_TRUE(policy.GetRollingRestoration());
  EXPECT_EQ(policy.GetSetMask(), static_cast<uint32_t>(NicTeamingPolicy::MASK_LOAD_BALANCING |
                                                       NicTeamingPolicy::MASK_FAILURE_DETECTION |
                                                       NicTeamingPolicy::MASK_NOTIFY_SWITCHES |
                                                       NicTeamingPolicy::MASK_FAILBACK));
  FailoverValues shown = DescribeFailover(policy, {});
  EXPECT_EQ(shown.loadBalancing, "srcmac");
  EXPECT_EQ(shown.failureDetection, "beacon");
  EXPECT_FALSE(shown.failback);

  input = Input::New();
  input->SetString("load-balancing", "roundrobin");
  input->SetString("failure-detection", "link");
  EXPECT_EQ(Failover(input, policy), Names{"Unknown Load Balancing policy: roundrobin"});
  EXPECT_EQ(DescribeFailover(policy, {}).failureDetection, "link");
}

TEST(DescribeFailoverTest, SplitsTheOrderAndFindsUnusedUplinks) {
  NicTeamingPolicy policy;
  policy.SetUplinkOrder({"vmnic2", "vmnic0", "vmnic1"});
  policy.SetMaxActiveUplinks(5);
  FailoverValues shown = DescribeFailover(policy, {"vmnic0", "vmnic1", "vmnic2", "vmnic3"});
  EXPECT_EQ(shown.active, (Names{"vmnic2", "vmnic0", "vmnic1"}));
  EXPECT_EQ(shown.standby, Names{});
  EXPECT_EQ(shown.unused, Names{"vmnic3"});
  policy.SetMaxActiveUplinks(1);
  shown = DescribeFailover(policy, {"vmnic0"});
  EXPECT_EQ(shown.active, Names{"vmnic2"});
  EXPECT_EQ(shown.standby, (Names{"vmnic0", "vmnic1"}));
  EXPECT_EQ(shown.unused, Names{});
  NicTeamingPolicy odd;
  odd.SetTeamingPolicy(static_cast<NicTeamingPolicy::TeamPolicyType>(9));
  EXPECT_EQ(DescribeFailover(odd, {}).loadBalancing, "unknown");
}

TEST(ShapingTest, RatesFollowTheEnabledFlag) {
  ShapingPolicy policy;
  auto input = Input::New();
  input->SetBool("enabled", false);
  input->SetInt("avg-bandwidth", 5);
  auto output = Output::New();
  SetShapingPolicy(input, output, policy, false);
  EXPECT_FALSE(output->HasError());
  EXPECT_FALSE(policy.IsEnabled());
  EXPECT_FALSE(policy.IsSet(ShapingPolicy::MASK_AVERAGE));

  input = Input::New();
  input->SetBool("enabled", true);
  input->SetInt("avg-bandwidth", 1000);
  output = Output::New();
  SetShapingPolicy(input, output, policy, false);
  EXPECT_EQ(policy.GetAverageBps(), 1000000);
  EXPECT_EQ(output->GetErrorMessages(), (Names{"Missing required parameter --peak-bandwidth",
                                               "Missing required parameter --burst-size"}));

  // Already enabled: a lone burst size is accepted and converted to bytes.
  input = Input::New();
  input->SetInt("burst-size", 4);
  output = Output::New();
  SetShapingPolicy(input, output, policy, false);
  EXPECT_FALSE(output->HasError());
  EXPECT_EQ(policy.GetBurstSize(), 512);

  // With requireAll every rate is needed while enabled.
  output = Output::New();
  SetShapingPolicy(Input::New(), output, policy, true);
  EXPECT_EQ(output->GetErrorMessages().size(), 3u);

  // A rate whose bps would not fit 64 bits is refused, not wrapped.
  input = Input::New();
  input->SetInt("peak-bandwidth", 9223372036854775807L);
  output = Output::New();
  SetShapingPolicy(input, output, policy, false);
  EXPECT_EQ(output->GetErrorMessages(),
            Names{"The value of --peak-bandwidth is out of range (1 - 9223372036854775)"});
  EXPECT_FALSE(policy.IsSet(ShapingPolicy::MASK_PEAK));
}

TEST(ShapingTest, ShownInKbpsAndKib) {
  ShapingPolicy policy;
  policy.SetEnabled(false);
  policy.SetAverageBps(1500);
  ShapingValues shown = DescribeShaping(policy);
  EXPECT_EQ(shown.average, -1);
  EXPECT_EQ(shown.peak, -1);
  EXPECT_EQ(shown.burst, -1);
  policy.SetEnabled(true);
  policy.SetPeakBps(999);
  policy.SetBurstSize(1000);
  shown = DescribeShaping(policy);
  EXPECT_EQ(shown.average, 1);
  EXPECT_EQ(shown.peak, 0);
  EXPECT_EQ(shown.burst, 7);
}

TEST(SecurityTest, OnlyGivenOptionsAreSet) {
  HostCtl::Network::PortSecurityPolicy policy;
  auto input = Input::New();
  input->SetBool("allow-mac-change", true);
  SetSecurityPolicy(input, Output::New(), policy);
  EXPECT_EQ(policy.GetSetMask(), HostCtl::Network::PortSecurityPolicy::MASK_MAC_CHANGE);
  EXPECT_TRUE(policy.GetAllowMacAddressChange());
}

TEST(LacpTextTest, PortStateAgeAndLoadBalance) {
  EXPECT_EQ(LacpPortStateToString(0x3D), "ACT,AGG,SYN,COL,DIST,");
  EXPECT_EQ(LacpPortStateToString(0), "");
  EXPECT_EQ(LacpPortStateToString(0xFF), "ACT,FTO,AGG,SYN,COL,DIST,DEF,EXP,");
  EXPECT_EQ(LacpAgeToString(3725), "01:02:05");
  EXPECT_EQ(LacpAgeToString(0), "00:00:00");
  EXPECT_EQ(LacpAgeToString(360000), "100:00:00");
  EXPECT_EQ(LacpLoadBalanceToString(0), "None");
  EXPECT_EQ(LacpLoadBalanceToString(16), "Src and dst ip, port");
  EXPECT_EQ(LacpLoadBalanceToString(20), "Src portID");
  EXPECT_EQ(LacpLoadBalanceToString(21), "Unknown");
}

} // namespace
