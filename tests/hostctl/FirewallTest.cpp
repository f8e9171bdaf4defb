//===- FirewallTest.cpp - Firewall module, state and rulesets -------------===//
#include "HostCtl/Lib.h"
#include "HostCtl/System/Host.h"
#include "TvkCtl/System/ModuleImpl.h"
#include "TvkCtl/System/SystemInfoImpl.h"
#include "model/FirewallModel.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <unistd.h>

namespace {

using HostCtl::Lib::HostCtlException;
using HostCtl::System::FirewallRuleset;
using nlohmann::ordered_json;
using TvkCtl::System::ModuleImpl;
using TvkCtl::System::SystemInfoImpl;

/// A host with a loaded firewall and three rulesets.
const char* const kHost = R"({
  "firewall": {"loaded": true, "enabled": true, "defaultAction": "DROP"},
  "firewallRulesets": [
    {"name": "open", "enabled": true, "allowedAll": true, "enableFixed": true,
     "rules": [{"portType": "dst", "portBegin": 80, "portEnd": 81, "direction": "inbound",
                "protocol": "tcp"},
               {"portType": "src", "portBegin": 5, "direction": "outbound", "protocol": "udp"}]},
    {"name": "listed", "allowedAll": false, "allowedIps": ["10.0.0.9/8", "192.168.1.5"]},
    {"name": "pinned", "allowedAll": false, "allowedIpFixed": true}
  ],
  "faults": [{"operation": "GetFirewallRulesetById", "object": "broken", "message": "gone"}]
})";

class FirewallTest : public ::testing::Test {
protected:
  void SetUp() override {
    char pattern[] = "/tmp/ostra-fw-XXXXXX";
    dir_ = ::mkdtemp(pattern);
    std::string path = dir_ + "/host.db";
    auto store = Model::Store::Create(path);
    Model::ImportHost(*store, ordered_json::parse(kHost));
    store.reset();
    Model::Store::SetPath(path);
  }
  void TearDown() override {
    Model::Store::CloseHost();
    std::system(("rm -rf " + dir_).c_str());
  }

  std::unique_ptr<FirewallRuleset> Ruleset(const std::string& id) {
    return system_.GetFirewallRulesetById(id);
  }

  /// The allowed-IP list of \p id as texts, by kind in the set's order.
  std::vector<std::string> AllowedIps(const std::string& id) {
    auto ips = Ruleset(id)->GetAllowedIps();
    std::vector<std::string> out;
    for (const auto& a : ips->ipv4Addresses)
      out.push_back(a.GetStringAddress());
    for (const auto& n : ips->ipv4Networks)
      out.push_back(n.GetStringAddress());
    for (const auto& a : ips->ipv6Addresses)
      out.push_back(a.GetStringAddress());
    for (const auto& n : ips->ipv6Networks)
      out.push_back(n.GetStringAddress());
    return out;
  }

  std::string dir_;       ///< Scratch directory.
  SystemInfoImpl system_; ///< The root under test.
};

TEST_F(FirewallTest, ModuleUnloadTakesTheFiltersAndRefusesStateChanges) {
  ModuleImpl module(HostCtl::System::FirewallModuleName);
  EXPECT_TRUE(module.IsLoaded());
  EXPECT_TRUE(system_.AreFirewallFiltersActive());
  system_.DestroyFirewallFilters();
  EXPECT_FALSE(system_.AreFirewallFiltersActive());
  module.Unload();
  EXPECT_FALSE(module.IsLoaded());
  EXPECT_THROW(module.Unload(), HostCtlException);
  EXPECT_THROW(system_.SetFirewallEnabled(false), HostCtlException);
  // Without the module there is nothing to load the configuration into.
  system_.LoadFirewallRulesets();
  EXPECT_FALSE(system_.AreFirewallFiltersActive());
  // The configuration survives: the flags read as they were.
  EXPECT_TRUE(system_.IsFirewallEnabled());
  EXPECT_FALSE(system_.GetFirewallDefaultAction());

  module.Load("", false);
  EXPECT_TRUE(module.IsLoaded());
  EXPECT_FALSE(system_.AreFirewallFiltersActive());
  system_.LoadFirewallRulesets();
  EXPECT_TRUE(system_.AreFirewallFiltersActive());
  system_.SetFirewallDefaultAction(true);
  EXPECT_TRUE(system_.GetFirewallDefaultAction());
  EXPECT_THROW(ModuleImpl("nosuchmod").IsLoaded(), HostCtlException);
}

TEST_F(FirewallTest, ClientsEnableOnFirstAndDisableOnLast) {
  auto listed = Ruleset("listed");
  EXPECT_FALSE(listed->IsEnabled());
  EXPECT_THROW(listed->RemoveClient(), HostCtlException);
  listed->AddClient();
  EXPECT_TRUE(listed->IsEnabled());
  listed->AddClient();
  EXPECT_EQ(listed->GetClientCount(), 2);
  listed->RemoveClient();
  EXPECT_TRUE(listed->IsEnabled());
  listed->RemoveClient();
  EXPECT_EQ(listed->GetClientCount(), 0);
  EXPECT_FALSE(listed->IsEnabled());
  // Clients are the host's own services: they may enable a fixed ruleset.
  auto open = Ruleset("open");
  open->AddClient();
  open->RemoveClient();
  EXPECT_FALSE(open->IsEnabled());
}

TEST_F(FirewallTest, FixedPropertiesAreRefused) {
  auto open = Ruleset("open");
  EXPECT_TRUE(open->IsEnableDisableFixed());
  EXPECT_FALSE(open->IsAllowedIpFixed());
  try {
    open->CheckConfigurable(HostCtl::System::FirewallEnabledState, false);
    FAIL() << "a fixed enabled state was accepted";
  } catch (const HostCtlException& e) {
    EXPECT_STREQ(e.what(), "The enabled state of ruleset open is fixed and cannot be changed");
  }
  EXPECT_NO_THROW(open->CheckConfigurable(HostCtl::System::FirewallEnabledState, true));
  EXPECT_NO_THROW(open->CheckConfigurable(HostCtl::System::FirewallAllowedIpMode, false));
  EXPECT_THROW(open->Disable(), HostCtlException);
  EXPECT_TRUE(open->IsEnabled());
  EXPECT_THROW(open->CheckConfigurable(7, false), HostCtlException);

  auto pinned = Ruleset("pinned");
  EXPECT_THROW(pinned->SetAllowedAll(true), HostCtlException);
  EXPECT_THROW(pinned->AddAllowedIp("10.1.1.1"), HostCtlException);
  EXPECT_FALSE(pinned->IsAllowedAll());
}

TEST_F(FirewallTest, AllowedIpsAreParsedCanonicalAndKeptByKind) {
  auto listed = Ruleset("listed");
  // Imported networks lose their host bits.
  EXPECT_EQ(AllowedIps("listed"), (std::vector<std::string>{"192.168.1.5", "10.0.0.0/8"}));
  listed->AddAllowedIp("FE80::1");
  listed->AddAllowedIp("2001:db8:0:0:1::/64");
  listed->AddAllowedIp("172.16.0.1/255.255.0.0");
  listed->AddAllowedIp("10.0.0.1");
  EXPECT_EQ(AllowedIps("listed"),
            (std::vector<std::string>{"192.168.1.5", "10.0.0.1", "10.0.0.0/8", "172.16.0.0/16",
                                      "fe80::1", "2001:db8::/64"}));

  struct Refusal {
    const char* text;    ///< Address given.
    const char* message; ///< Expected refusal.
  } refusals[] = {
      {"10.0.0.0/8", "10.0.0.0/8 is already in the allowed IP list of ruleset listed"},
      {"10.200.0.0/8", "10.0.0.0/8 is already in the allowed IP list of ruleset listed"},
      {"fe80:0::1", "fe80::1 is already in the allowed IP list of ruleset listed"},
      {"10.0.0.256", "Invalid IP address or network: 10.0.0.256"},
      {"10.0.0.0/33", "Invalid IP address or network: 10.0.0.0/33"},
      {"host.example", "Invalid IP address or network: host.example"},
      {" 10.0.0.1", "Invalid IP address or network:  10.0.0.1"},
  };
  for (const Refusal& r : refusals) {
    try {
      listed->AddAllowedIp(r.text);
      ADD_FAILURE() << r.text << " was accepted";
    } catch (const HostCtlException& e) {
      EXPECT_STREQ(e.what(), r.message) << r.text;
    }
  }

  listed->RemoveAllowedIp("10.0.0.7/8");
  listed->RemoveAllowedIp("fe80::1");
  EXPECT_THROW(listed->RemoveAllowedIp("fe80::1"), HostCtlException);
  EXPECT_THROW(listed->RemoveAllowedIp("192.168.1.5/32"), HostCtlException);
  EXPECT_EQ(AllowedIps("listed"), (std::vector<std::string>{"192.168.1.5", "10.0.0.1",
                                                            "172.16.0.0/16", "2001:db8::/64"}));

  auto open = Ruleset("open");
  EXPECT_THROW(open->AddAllowedIp("10.0.0.1"), HostCtlException);
}

TEST_F(FirewallTest, LookupsAndRules) {
  std::vector<std::string> ids;
  for (const auto& set : system_.GetFirewallRulesets())
    ids.push_back(set->GetRulesetId());
  EXPECT_EQ(ids, (std::vector<std::string>{"open", "listed", "pinned"}));

  auto missing = Ruleset("nosuch");
  EXPECT_FALSE(missing->IsValid());
  EXPECT_EQ(missing->GetRulesetId(), "nosuch");
  EXPECT_THROW(missing->IsEnabled(), HostCtlException);
  EXPECT_THROW(missing->AddClient(), HostCtlException);
  EXPECT_THROW(Ruleset("broken"), HostCtlException);

  auto rules = Ruleset("open")->GetRules();
  ASSERT_EQ(rules.size(), 2u);
  EXPECT_EQ(rules[0]->portType, 1);
  EXPECT_EQ(rules[0]->portEnd, 81);
  EXPECT_EQ(rules[1]->portType, 0);
  EXPECT_EQ(rules[1]->portEnd, 5);
  EXPECT_EQ(rules[1]->direction, 1);
  EXPECT_EQ(rules[1]->protocol, 1);

  // The host object reaches the same rulesets.
  auto host = HostCtl::HostFactory::GetHost();
  EXPECT_TRUE(host->GetSystemInfo()->GetFirewallRulesetById("pinned")->IsValid());
}

TEST_F(FirewallTest, ExportThenImportKeepsTheFirewall) {
  Model::Store& store = Model::Store::Host();
  Ruleset("listed")->AddAllowedIp("fd00::5");
  Ruleset("listed")->AddClient();
  system_.DestroyFirewallFilters();
  ordered_json first = Model::ExportHost(store);
  EXPECT_EQ(first["firewall"]["filtersActive"], false);
  EXPECT_EQ(first["firewallRulesets"][1]["allowedIps"],
            ordered_json::parse(R"(["10.0.0.0/8", "192.168.1.5", "fd00::5"])"));
  Model::ImportHost(store, first);
  EXPECT_EQ(Model::ExportHost(store), first);
}

TEST_F(FirewallTest, ImportRefusesBadRulesets) {
  Model::Store& store = Model::Store::Host();
  struct Case {
    const char* json;    ///< Description.
    const char* message; ///< Expected refusal.
  } cases[] = {
      {R"({"firewallRulesets": [{"name": "a"}, {"name": "a"}]})",
       "firewallRulesets[1].name: \"a\" is used by another ruleset"},
      {R"({"firewallRulesets": [{"name": "a", "allowedIps": ["1.2.3"]}]})",
       "firewallRulesets[0].allowedIps: \"1.2.3\" is not an IPv4 or IPv6 address or network"},
      {R"({"firewallRulesets": [{"name": "a", "rules": [{"portType": "dst", "portBegin": 9,
          "portEnd": 8, "direction": "inbound", "protocol": "tcp"}]}]})",
       "firewallRulesets[0].rules[0].portEnd: expected an integer in [9 - 65535]"},
      {R"({"firewallRulesets": [{"name": "a", "rules": [{"portType": "any", "portBegin": 9,
          "direction": "inbound", "protocol": "tcp"}]}]})",
       "firewallRulesets[0].rules[0].portType: expected \"dst\" or \"src\""},
      {R"({"firewall": {"loaded": false, "filtersActive": true}})",
       "firewall.filtersActive: the filters cannot be active while the module is not loaded"},
      {R"({"firewall": {"colour": 1}})", "firewall.colour: unknown field"},
      {R"({"firewallRulesets": [{"name": "a", "clients": 2, "enabled": false}]})",
       "firewallRulesets[0].enabled: a ruleset with clients is enabled"},
  };
  for (const Case& c : cases) {
    try {
      Model::ImportHost(store, ordered_json::parse(c.json));
      ADD_FAILURE() << c.json << " was imported";
    } catch (const Model::ImportError& e) {
      EXPECT_STREQ(e.what(), c.message);
    }
  }
  EXPECT_TRUE(Ruleset("listed")->IsValid());
}

} // namespace
