//===- StandardSwitchTest.cpp - Standard switch and port group commands ---===//
//
// network vswitch standard set, list and portgroup list/set run in-process
// against a host with a 9000-byte switch: MTU values that do not fit the
// 32 bits the command reads are refused instead of being wrapped into a
// small valid MTU, the CDP names map to their codes, and the list's type
// selector and uplink column behave as the host describes them.
//
//===----------------------------------------------------------------------===//
#include "CommandRun.h"
#include "vswitch.h"

#include <gtest/gtest.h>

#include <optional>

namespace {

using namespace CorvexCli::NetworkNamespace;
using nlohmann::ordered_json;
using PluginTest::RunCommand;
using PluginTest::ScratchHost;
using Names = std::vector<std::string>;

const char* const kHost = R"json({
  "nics": [{"name": "vmnic0", "mac": "00:50:56:00:40:01"},
           {"name": "vmnic1", "mac": "00:50:56:00:40:02"}],
  "vswitches": [
    {"name": "big", "mtu": 9000, "cdp": "listen", "uplinks": ["vmnic0"],
     "portgroups": [{"name": "Data", "vlanId": 12}]},
    {"name": "sys", "system": true, "portgroups": [{"name": "Hidden", "system": true}]}]
})json";

class StandardSwitchTest : public ::testing::Test {
protected:
  /// The "MTU" and "CDP Status" of switch "big" as the list shows them.
  std::pair<long, std::string> BigSwitch() {
    auto list = VirtualSwitchStandardList::New();
    ordered_json rows = RunCommand(*list, {{"vswitch-name", std::string("big")}}).root;
    return {rows.at(0).at("MTU").get<long>(), rows.at(0).at("CDP Status").get<std::string>()};
  }

  ScratchHost host_{"standard-switch-test", kHost};
};

TEST_F(StandardSwitchTest, MtuOutsideThirtyTwoBitsIsNeverWrapped) {
  const std::string positive = "MTU size should be a positive value";
  const std::string range = " is out of range [0 - 2147483647]";
  struct Case {
    long mtu;
    std::string error; ///< The command's message.
  };
  const std::vector<Case> cases = {
      {-1, positive},
      {-4294965796L, positive},                                // -2^32 + 1500: would wrap to 1500.
      {2147483648L, "option --mtu: value 2147483648" + range}, // Negative as 32 bits.
      {4294968796L, "option --mtu: value 4294968796" + range}, // 2^32 + 1500.
      {9223372036854775807L, "option --mtu: value 9223372036854775807" + range},
  };
  auto set = VirtualSwitchStandardSet::New();
  for (const Case& c : cases) {
    SCOPED_TRACE(c.mtu);
    PluginTest::Result result =
        RunCommand(*set, {{"vswitch-name", std::string("big")}, {"mtu", c.mtu}});
    EXPECT_EQ(result.errors, Names{c.error});
    EXPECT_TRUE(result.root.is_null());
    EXPECT_EQ(BigSwitch().first, 9000);
  }
  PluginTest::Result ok = RunCommand(*set, {{"vswitch-name", std::string("big")}, {"mtu", 1500L}});
  EXPECT_EQ(ok.errors, Names{});
  EXPECT_EQ(BigSwitch().first, 1500);
}

TEST_F(StandardSwitchTest, CdpNamesMapToTheirCodesAndMtuComesFirst) {
  auto set = VirtualSwitchStandardSet::New();
  for (const char* status : {"down", "listen", "advertise", "both"}) {
    SCOPED_TRACE(status);
    EXPECT_EQ(RunCommand(
                  *set, {{"vswitch-name", std::string("big")}, {"cdp-status", std::string(status)}})
                  .errors,
              Names{});
    EXPECT_EQ(BigSwitch().second, status);
  }
  // A refused MTU stops the command before the CDP status changes.
  PluginTest::Result refused = RunCommand(
      *set,
      {{"vswitch-name", std::string("big")}, {"mtu", -5L}, {"cdp-status", std::string("down")}});
  EXPECT_EQ(refused.errors, Names{"MTU size should be a positive value"});
  EXPECT_EQ(BigSwitch().second, "both");

  EXPECT_EQ(RunCommand(*set, {{"vswitch-name", std::string("nope")}}).errors,
            Names{"nope is not a valid name for a virtual switch"});
}

TEST_F(StandardSwitchTest, ListsSelectRegularOrSystemObjects) {
  auto switches = VirtualSwitchStandardList::New();
  auto groups = VirtualSwitchPortGroupList::New();
  struct Case {
    std::shared_ptr<Fabrik::AutoCli::Command> command;
    const char* nameField;
    std::optional<std::string> type;
    Names names;
    Names errors;
  };
  const std::vector<Case> cases = {
      {switches, "Name", std::nullopt, {"big"}, {}},
      {switches, "Name", "system", {"sys"}, {}},
      {switches, "Name", "System", {}, {"Invalid type value, should be 'system'."}},
      {groups, "Name", std::nullopt, {"Data"}, {}},
      {groups, "Name", "system", {"Hidden"}, {}},
      {groups, "Name", "regular", {}, {"Invalid type value, should be 'system'."}},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.type.value_or("<none>"));
    PluginTest::Params params;
    if (c.type)
      params.push_back({"type", *c.type});
    PluginTest::Result result = RunCommand(*c.command, params);
    EXPECT_EQ(result.errors, c.errors);
    Names names;
    for (const ordered_json& row : result.root)
      names.push_back(row.at(c.nameField).get<std::string>());
    EXPECT_EQ(names, c.names);
  }
}

TEST_F(StandardSwitchTest, PortGroupRowsAndVlanChanges) {
  auto groups = VirtualSwitchPortGroupList::New();
  EXPECT_EQ(RunCommand(*groups).root, ordered_json::parse(R"([{"Name": "Data",
    "Virtual Switch": "big", "Active Clients": 0, "VLAN ID": 12}])"));

  auto set = VirtualSwitchPortGroupSet::New();
  EXPECT_EQ(RunCommand(*set, {{"portgroup-name", std::string("Data")}}).errors,
            Names{"The --vlan-id option is required"});
  EXPECT_EQ(RunCommand(*set, {{"portgroup-name", std::string("Data")}, {"vlan-id", 4095L}}).errors,
            Names{});
  EXPECT_EQ(RunCommand(*groups).root.at(0).at("VLAN ID"), 4095);
  EXPECT_EQ(RunCommand(*set, {{"portgroup-name", std::string("Nope")}, {"vlan-id", 1L}}).errors,
            Names{"Unable to find a port group with the name Nope"});
}

} // namespace
