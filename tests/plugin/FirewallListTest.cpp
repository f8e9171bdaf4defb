//===- FirewallListTest.cpp - The ruleset, rule and allowed-IP lists ------===//
//
// The three firewall lists show rows for every ruleset, or for the one that
// "ruleset-id" names. A named ruleset that does not exist, or whose look-up
// fails, ends the list with its own message and no result; a failure while
// the rows are read ends it with the host's message. Each list is run on a
// host with an open ruleset, a restricted one, and one whose rules and
// allowed IPs cannot be read.
//
//===----------------------------------------------------------------------===//
#include "CommandRun.h"
#include "firewall.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>

namespace {

using namespace CorvexCli::NetworkNamespace;
using nlohmann::ordered_json;
using PluginTest::RunCommand;
using PluginTest::ScratchHost;
using Names = std::vector<std::string>;

const char* const kHost = R"json({
  "firewall": {"loaded": true},
  "firewallRulesets": [
    {"name": "open", "enabled": true, "allowedAll": true, "enableFixed": true,
     "rules": [{"portType": "dst", "portBegin": 80, "direction": "inbound", "protocol": "tcp"},
               {"portType": "src", "portBegin": 5000, "portEnd": 5010,
                "direction": "outbound", "protocol": "udp"}]},
    {"name": "restricted", "enabled": false, "allowedAll": false, "allowedIpFixed": true,
     "allowedIps": ["10.20.0.0/16", "192.168.40.7", "fd00:20::/64", "fd00::7"]},
    {"name": "broken", "allowedAll": false}],
  "faults": [
    {"operation": "GetRules", "object": "broken", "message": "rules unreadable"},
    {"operation": "GetAllowedIps", "object": "broken", "message": "allowed IPs unreadable"},
    {"operation": "GetFirewallRulesetById", "object": "ghost", "message": "lookup failed"}]
})json";

class FirewallListTest : public ::testing::Test {
protected:
  ScratchHost host_{"firewall-list-test", kHost};
};

/// One list and what it shows.
struct List {
  const char* name;                                                ///< For messages.
  std::function<std::shared_ptr<Fabrik::AutoCli::Command>()> make; ///< The command.
  const char* idField;                                             ///< Column of the id.
};

const std::vector<List>& Lists() {
  static const std::vector<List> lists = {
      {"ruleset list", [] { return FirewallRulesetList::New(); }, "Name"},
      {"rule list", [] { return FirewallRulesetRuleList::New(); }, "Ruleset"},
      {"allowedip list", [] { return FirewallRulesetAllowedipList::New(); }, "Ruleset"},
  };
  return lists;
}

TEST_F(FirewallListTest, NamedRulesetsThatCannotBeSelectedEndTheListWithTheirMessage) {
  for (const List& list : Lists()) {
    SCOPED_TRACE(list.name);
    auto command = list.make();
    PluginTest::Result missing = RunCommand(*command, {{"ruleset-id", std::string("nope")}});
    EXPECT_EQ(missing.errors, Names{"Ruleset Not Found: nope"});
    EXPECT_TRUE(missing.root.is_null());
    PluginTest::Result failing = RunCommand(*command, {{"ruleset-id", std::string("ghost")}});
    EXPECT_EQ(failing.errors, Names{"Failed to check loaded status: ghost"});
    EXPECT_TRUE(failing.root.is_null());
  }
}

TEST_F(FirewallListTest, NamedRulesetGivesOnlyItsRows) {
  for (const List& list : Lists()) {
    SCOPED_TRACE(list.name);
    PluginTest::Result result =
        RunCommand(*list.make(), {{"ruleset-id", std::string("restricted")}});
    EXPECT_EQ(result.errors, Names{});
    ASSERT_TRUE(result.root.is_array());
    for (const ordered_json& row : result.root)
      EXPECT_EQ(row.at(list.idField), "restricted");
  }
}

TEST_F(FirewallListTest, RowsShowTheRulesetState) {
  auto rulesets = FirewallRulesetList::New();
  EXPECT_EQ(RunCommand(*rulesets, {{"ruleset-id", std::string("open")}}).root,
            ordered_json::parse(R"([{"Name": "open", "Enabled": true,
              "Enable/Disable configurable": false, "Allowed IP configurable": true}])"));
  EXPECT_EQ(RunCommand(*rulesets, {{"ruleset-id", std::string("restricted")}}).root,
            ordered_json::parse(R"([{"Name": "restricted", "Enabled": false,
              "Enable/Disable configurable": true, "Allowed IP configurable": false}])"));

  // One row per rule, with the codes as words and the end port defaulting to the begin port.
  auto rules = FirewallRulesetRuleList::New();
  EXPECT_EQ(RunCommand(*rules, {{"ruleset-id", std::string("open")}}).root, ordered_json::parse(R"([
    {"Ruleset": "open", "Port Type": "Dst", "Port Begin": 80, "Port End": 80,
     "Direction": "Inbound", "Protocol": "TCP"},
    {"Ruleset": "open", "Port Type": "Src", "Port Begin": 5000, "Port End": 5010,
     "Direction": "Outbound", "Protocol": "UDP"}])"));
  EXPECT_EQ(RunCommand(*rules, {{"ruleset-id", std::string("restricted")}}).root,
            ordered_json::array());

  // "All" for an open ruleset; otherwise addresses first, then networks,
  // IPv4 before IPv6 within each.
  auto allowed = FirewallRulesetAllowedipList::New();
  EXPECT_EQ(RunCommand(*allowed, {{"ruleset-id", std::string("open")}}).root,
            ordered_json::parse(R"([{"Ruleset": "open", "Allowed IP Addresses": ["All"]}])"));
  EXPECT_EQ(RunCommand(*allowed, {{"ruleset-id", std::string("restricted")}}).root,
            ordered_json::parse(R"([{"Ruleset": "restricted", "Allowed IP Addresses":
              ["192.168.40.7", "fd00::7", "10.20.0.0/16", "fd00:20::/64"]}])"));
}

TEST_F(FirewallListTest, UnreadableRowsEndTheListWithTheHostMessage) {
  struct Case {
    std::shared_ptr<Fabrik::AutoCli::Command> command;
    std::string error;
  };
  const std::vector<Case> cases = {
      {FirewallRulesetRuleList::New(), "rules unreadable"},
      {FirewallRulesetAllowedipList::New(), "allowed IPs unreadable"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.error);
    PluginTest::Result all = RunCommand(*c.command);
    EXPECT_EQ(all.errors, Names{c.error});
    EXPECT_TRUE(all.root.is_null());
  }
  // The ruleset list reads neither, so it shows every ruleset.
  PluginTest::Result all = RunCommand(*FirewallRulesetList::New());
  EXPECT_EQ(all.errors, Names{});
  EXPECT_EQ(all.root.size(), 3u);
}

} // namespace
