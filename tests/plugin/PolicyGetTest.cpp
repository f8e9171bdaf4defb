//===- PolicyGetTest.cpp - Policy gets of switches and port groups --------===//
//
// The failover, security and shaping gets of a standard switch and of its
// port groups build one result shape: the port group shows the same value
// fields, in the same order, followed by one override flag per field. A port
// group that overrides nothing shows its switch's values with every flag
// off; one that overrides a field shows its own value there and that flag
// alone on. The sets are checked for what they store and what they refuse.
//
//===----------------------------------------------------------------------===//
#include "CommandRun.h"
#include "vswitch.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>

namespace {

using namespace CorvexCli::NetworkNamespace;
using nlohmann::ordered_json;
using PluginTest::Keys;
using PluginTest::Params;
using PluginTest::RunCommand;
using PluginTest::ScratchHost;

const char* const kHost = R"json({
  "nics": [{"name": "vmnic0", "mac": "00:50:56:00:10:01"},
           {"name": "vmnic1", "mac": "00:50:56:00:10:02"},
           {"name": "vmnic2", "mac": "00:50:56:00:10:03"}],
  "vswitches": [{"name": "vs0", "uplinks": ["vmnic0", "vmnic1", "vmnic2"],
    "teaming": {"loadBalancing": "iphash", "failureDetection": "beacon",
                "notifySwitches": false, "failback": false,
                "activeUplinks": ["vmnic0"], "standbyUplinks": ["vmnic1"]},
    "security": {"allowPromiscuous": true, "allowMacChange": false, "allowForgedTransmits": true},
    "shaping": {"enabled": true, "averageBps": 5000000, "peakBps": 8000000, "burstSize": 12800},
    "portgroups": [
      {"name": "Inherit"},
      {"name": "Own", "teaming": {"loadBalancing": "srcmac"},
       "security": {"allowMacChange": true}, "shaping": {"peakBps": 16000000}}]}]
})json";

/// One policy kind: its get commands and what the test host holds for it.
struct PolicyKind {
  const char* name;                                                     ///< For messages.
  std::function<std::shared_ptr<Fabrik::AutoCli::Command>()> switchGet; ///< Switch get.
  std::function<std::shared_ptr<Fabrik::AutoCli::Command>()> groupGet;  ///< Port group get.
  ordered_json switchValues;           ///< The switch's value fields, in order.
  const char* ownField;                ///< The field port group "Own" overrides.
  ordered_json ownValue;               ///< Its value there.
  std::vector<std::string> extraFlags; ///< Flags after the per-field ones.
};

std::vector<PolicyKind> Kinds() {
  return {
      {"failover",
       [] { return VirtualSwitchStandardPolicyFailoverGet::New(); },
       [] { return VirtualSwitchPortGroupPolicyFailoverGet::New(); },
       ordered_json::parse(R"({"Load Balancing": "iphash",
         "Network Failure Detection": "beacon", "Notify Switches": false, "Failback": false,
         "Active Adapters": ["vmnic0"], "Standby Adapters": ["vmnic1"],
         "Unused Adapters": ["vmnic2"]})"),
       "Load Balancing",
       "srcmac",
       {"Override Vswitch Uplinks"}},
      {"security",
       [] { return VirtualSwitchStandardPolicySecurityGet::New(); },
       [] { return VirtualSwitchPortGroupPolicySecurityGet::New(); },
       ordered_json::parse(R"({"Allow Promiscuous": true,
         "Allow MAC Address Change": false, "Allow Forged Transmits": true})"),
       "Allow MAC Address Change",
       true,
       {}},
      {"shaping",
       [] { return VirtualSwitchStandardPolicyShapingGet::New(); },
       [] { return VirtualSwitchPortGroupPolicyShapingGet::New(); },
       ordered_json::parse(R"({"Enabled": true, "Average Bandwidth": 5000,
         "Peak Bandwidth": 8000, "Burst Size": 100})"),
       "Peak Bandwidth",
       16000,
       {}},
  };
}

/// The fields a port group result holds: the values, then one flag per
/// overridable value (the failover adapter lists share one), then the rest.
std::vector<std::string> GroupFields(const PolicyKind& kind) {
  std::vector<std::string> fields = Keys(kind.switchValues);
  for (const std::string& field : Keys(kind.switchValues))
    if (field.find("Adapters") == std::string::npos)
      fields.push_back("Override Vswitch " + field);
  fields.insert(fields.end(), kind.extraFlags.begin(), kind.extraFlags.end());
  return fields;
}

/// Whether \p field is an override flag.
bool IsFlag(const std::string& field) {
  return field.rfind("Override Vswitch ", 0) == 0;
}

/// The value part of a port group result.
ordered_json Values(const ordered_json& result, const PolicyKind& kind) {
  ordered_json values = ordered_json::object();
  for (const std::string& field : Keys(kind.switchValues))
    values[field] = result.at(field);
  return values;
}

class PolicyGetTest : public ::testing::Test {
protected:
  ScratchHost host_{"policy-get-test", kHost};
};

TEST_F(PolicyGetTest, SwitchResultsHoldTheValueFieldsInOrder) {
  for (const PolicyKind& kind : Kinds()) {
    SCOPED_TRACE(kind.name);
    auto command = kind.switchGet();
    PluginTest::Result result = RunCommand(*command, {{"vswitch-name", std::string("vs0")}});
    EXPECT_EQ(result.errors, std::vector<std::string>{});
    EXPECT_EQ(result.root, kind.switchValues);
    EXPECT_EQ(Keys(result.root), Keys(kind.switchValues));
  }
}

TEST_F(PolicyGetTest, PortGroupsShowTheSwitchValuesWithOneFlagPerOverriddenField) {
  for (const PolicyKind& kind : Kinds()) {
    SCOPED_TRACE(kind.name);
    auto command = kind.groupGet();

    PluginTest::Result inherit = RunCommand(*command, {{"portgroup-name", std::string("Inherit")}});
    EXPECT_EQ(inherit.errors, std::vector<std::string>{});
    EXPECT_EQ(Keys(inherit.root), GroupFields(kind));
    EXPECT_EQ(Values(inherit.root, kind), kind.switchValues);
    for (const std::string& field : GroupFields(kind)) {
      if (IsFlag(field)) {
        EXPECT_EQ(inherit.root.at(field), false) << field;
      }
    }

    PluginTest::Result own = RunCommand(*command, {{"portgroup-name", std::string("Own")}});
    EXPECT_EQ(own.errors, std::vector<std::string>{});
    ordered_json expected = kind.switchValues;
    expected[kind.ownField] = kind.ownValue;
    EXPECT_EQ(Values(own.root, kind), expected);
    for (const std::string& field : GroupFields(kind)) {
      if (IsFlag(field)) {
        EXPECT_EQ(own.root.at(field), field == "Override Vswitch " + std::string(kind.ownField))
            << field;
      }
    }
  }
}

TEST_F(PolicyGetTest, MissingSwitchOrPortGroupGivesOnlyTheError) {
  for (const PolicyKind& kind : Kinds()) {
    SCOPED_TRACE(kind.name);
    PluginTest::Result bySwitch =
        RunCommand(*kind.switchGet(), {{"vswitch-name", std::string("vs9")}});
    EXPECT_EQ(bySwitch.errors,
              std::vector<std::string>{"Unable to find a legacy virtual switch with the name vs9"});
    EXPECT_TRUE(bySwitch.root.is_null());
    PluginTest::Result byGroup =
        RunCommand(*kind.groupGet(), {{"portgroup-name", std::string("Nope")}});
    EXPECT_EQ(byGroup.errors,
              std::vector<std::string>{"Unable to find a port group with the name Nope"});
    EXPECT_TRUE(byGroup.root.is_null());
  }
}

TEST_F(PolicyGetTest, SwitchSecuritySetChangesOnlyTheGivenFields) {
  auto set = VirtualSwitchStandardPolicySecuritySet::New();
  auto get = VirtualSwitchStandardPolicySecurityGet::New();
  PluginTest::Result result =
      RunCommand(*set, {{"vswitch-name", std::string("vs0")}, {"allow-forged-transmits", false}});
  EXPECT_EQ(result.errors, std::vector<std::string>{});
  EXPECT_EQ(result.root, true);
  EXPECT_EQ(RunCommand(*get, {{"vswitch-name", std::string("vs0")}}).root,
            ordered_json::parse(R"({"Allow Promiscuous": true,
              "Allow MAC Address Change": false, "Allow Forged Transmits": false})"));

  // The port group that inherits follows the switch; the one that overrides
  // the MAC change keeps its own value.
  auto groupGet = VirtualSwitchPortGroupPolicySecurityGet::New();
  EXPECT_EQ(RunCommand(*groupGet, {{"portgroup-name", std::string("Inherit")}})
                .root.at("Allow Forged Transmits"),
            false);
  RunCommand(*set, {{"vswitch-name", std::string("vs0")}, {"allow-mac-change", false}});
  EXPECT_EQ(RunCommand(*groupGet, {{"portgroup-name", std::string("Own")}})
                .root.at("Allow MAC Address Change"),
            true);
}

TEST_F(PolicyGetTest, UseVswitchDropsEveryOverrideBeforeTheGivenOnes) {
  struct Case {
    const char* name;
    std::shared_ptr<Fabrik::AutoCli::Command> set;
    std::shared_ptr<Fabrik::AutoCli::Command> get;
    Params extra;     ///< Given with --use-vswitch.
    const char* kept; ///< The one flag left on, or null.
  };
  const std::vector<Case> cases = {
      {"failover",
       VirtualSwitchPortGroupPolicyFailoverSet::New(),
       VirtualSwitchPortGroupPolicyFailoverGet::New(),
       {},
       nullptr},
      {"security",
       VirtualSwitchPortGroupPolicySecuritySet::New(),
       VirtualSwitchPortGroupPolicySecurityGet::New(),
       {{"allow-promiscuous", false}},
       "Override Vswitch Allow Promiscuous"},
      {"shaping",
       VirtualSwitchPortGroupPolicyShapingSet::New(),
       VirtualSwitchPortGroupPolicyShapingGet::New(),
       {},
       nullptr},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    Params params = {{"portgroup-name", std::string("Own")}, {"use-vswitch", PluginTest::Flag{}}};
    params.insert(params.end(), c.extra.begin(), c.extra.end());
    PluginTest::Result set = RunCommand(*c.set, params);
    EXPECT_EQ(set.errors, std::vector<std::string>{});
    PluginTest::Result got = RunCommand(*c.get, {{"portgroup-name", std::string("Own")}});
    EXPECT_FALSE(got.root.is_null());
    for (const auto& item : got.root.items()) {
      if (IsFlag(item.key())) {
        EXPECT_EQ(item.value(), c.kept && item.key() == c.kept) << item.key();
      }
    }
  }
}

TEST_F(PolicyGetTest, PortGroupShapingNeedsEveryRateFromOneSide) {
  // A port group of a switch without shaping that turns shaping on must name
  // every rate itself; the error names each one missing and nothing is stored.
  auto disable = VirtualSwitchStandardPolicyShapingSet::New();
  EXPECT_EQ(RunCommand(*disable, {{"vswitch-name", std::string("vs0")}, {"enabled", false}}).errors,
            std::vector<std::string>{});
  auto set = VirtualSwitchPortGroupPolicyShapingSet::New();
  PluginTest::Result result = RunCommand(
      *set,
      {{"portgroup-name", std::string("Inherit")}, {"enabled", true}, {"avg-bandwidth", 1000L}});
  EXPECT_EQ(result.errors, (std::vector<std::string>{
                               "Missing required parameter --peak-bandwidth",
                               "Missing required parameter --burst-size",
                           }));
  auto get = VirtualSwitchPortGroupPolicyShapingGet::New();
  EXPECT_EQ(RunCommand(*get, {{"portgroup-name", std::string("Inherit")}}).root.at("Enabled"),
            false);
}

} // namespace
