//===- LacpListTest.cpp - What the LACP lists refuse to show --------------===//
//
// The LACP config, status and stats lists share one loop over the selected
// distributed switches and differ in what stands instead of an empty result.
// Each is run on a host without distributed switches, on a switch without
// LACP, and on a switch whose one LAG has no NIC.
//
//===----------------------------------------------------------------------===//
#include "CommandRun.h"
#include "vswitch.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>

namespace {

using namespace CorvexCli::NetworkNamespace;
using PluginTest::RunCommand;
using PluginTest::ScratchHost;
using Names = std::vector<std::string>;

const char* const kNoLacp = R"json({
  "dvswitches": [{"name": "plain", "uuid": "01 02", "dvports": [{"key": "1"}]}]
})json";

const char* const kEmptyLag = R"json({
  "dvswitches": [{"name": "lagged", "uuid": "03 04", "uplinks": ["up0"],
    "dvports": [{"key": "0", "name": "lag1-0", "uplink": true, "nic": "up0"}],
    "lags": [{"id": 1, "name": "lag1", "mode": "passive", "loadBalancing": 3,
              "uplinkCount": 1}]}]
})json";

/// The three lists and what each refuses with on every host.
struct Lists {
  const char* name;                                                ///< For messages.
  std::function<std::shared_ptr<Fabrik::AutoCli::Command>()> make; ///< The command.
  std::string noLacp;                                              ///< On "plain".
  std::string emptyLag; ///< On "lagged" ("" when it lists the LAG).
};

const std::vector<Lists>& All() {
  static const std::vector<Lists> lists = {
      {"config", [] { return LacpGetConfig::New(); }, "LACP is disabled on DVSwitch.", ""},
      {"status", [] { return LacpGetStatus::New(); }, "No running LACP group on the host.", ""},
      {"stats", [] { return LacpGetStats::New(); }, "No running LACP group on the host.",
       "No pnic is connected to DVSwitch."},
  };
  return lists;
}

TEST(LacpListTest, WithoutDistributedSwitchesEveryListSaysSo) {
  ScratchHost host("lacp-list-none", "{}");
  for (const Lists& list : All()) {
    SCOPED_TRACE(list.name);
    PluginTest::Result result = RunCommand(*list.make());
    EXPECT_EQ(result.errors, Names{"LACP is supported on Corvex DVSwitch only, and there is no "
                                   "DVSwitch configured on host."});
    EXPECT_TRUE(result.root.is_null());
  }
}

TEST(LacpListTest, SwitchWithoutLacpGivesEachListsOwnRefusal) {
  ScratchHost host("lacp-list-plain", kNoLacp);
  for (const Lists& list : All()) {
    SCOPED_TRACE(list.name);
    PluginTest::Result result = RunCommand(*list.make());
    EXPECT_EQ(result.errors, Names{list.noLacp});
    EXPECT_TRUE(result.root.is_null());
    PluginTest::Result named = RunCommand(*list.make(), {{"dvs", std::string("nope")}});
    EXPECT_EQ(named.errors, Names{"Unable to find DVSwitch nope"});
  }
}

TEST(LacpListTest, LagWithoutNicsIsListedExceptByTheStats) {
  ScratchHost host("lacp-list-lagged", kEmptyLag);
  for (const Lists& list : All()) {
    SCOPED_TRACE(list.name);
    PluginTest::Result result = RunCommand(*list.make(), {{"dvs", std::string("lagged")}});
    if (list.emptyLag.empty()) {
      EXPECT_EQ(result.errors, Names{});
      ASSERT_EQ(result.root.size(), 1u);
    } else {
      EXPECT_EQ(result.errors, Names{list.emptyLag});
      EXPECT_TRUE(result.root.is_null());
    }
  }
  PluginTest::Result config = RunCommand(*LacpGetConfig::New());
  ASSERT_EQ(config.root.size(), 1u);
  EXPECT_EQ(config.root.at(0).at("LAG Name"), "lag1");
  EXPECT_EQ(config.root.at(0).at("NICs"), "up0");
  EXPECT_EQ(config.root.at(0).at("Mode"), "Passive");
}

} // namespace
