//===- NetqueueTest.cpp - The NetQueue lists and sets run in-process ------===//
//
// A host with four NICs: vmnic0 with NetQueue, vmnic1 whose NetQueue record
// cannot be read, vmnic2 without NetQueue, and vmnic3 whose record can be
// read but not written. The named lists fail on the NIC they name; the lists
// over every NIC leave out what they cannot read; a set that selects nothing
// sends nothing to the NIC.
//
//===----------------------------------------------------------------------===//
#include "CommandRun.h"
#include "nic.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <memory>

namespace {

using namespace CorvexCli::NetworkNamespace;
using nlohmann::ordered_json;
using PluginTest::Params;
using PluginTest::RunCommand;
using PluginTest::ScratchHost;
using Names = std::vector<std::string>;

const char* const kHost = R"json({
  "nics": [
    {"name": "vmnic0", "mac": "00:50:56:00:20:01",
     "netqueue": {"txQueues": 8, "rxQueues": 4, "maxTxQueues": 16, "maxRxQueues": 16,
                  "balancerEnabled": true, "supportedSettings": ["RxQPair", "RSS"],
                  "allowedSettings": ["RSS"], "filterClasses": ["macOnly", "vxlan"],
                  "plugins": [{"module": "nqcore", "plugin": "default",
                               "description": "Default balancer", "enabled": true},
                              {"module": "nqcore", "plugin": "rsslb",
                               "description": "RSS balancer", "enabled": false}]}},
    {"name": "vmnic1", "mac": "00:50:56:00:20:02",
     "netqueue": {"txQueues": 2, "rxQueues": 2, "maxTxQueues": 4, "maxRxQueues": 4}},
    {"name": "vmnic2", "mac": "00:50:56:00:20:03"},
    {"name": "vmnic3", "mac": "00:50:56:00:20:04",
     "netqueue": {"txQueues": 1, "rxQueues": 1, "maxTxQueues": 2, "maxRxQueues": 2,
                  "balancerEnabled": false}}],
  "faults": [
    {"operation": "GetNetqueueInfo", "object": "vmnic1", "message": "netqueue read failed"},
    {"operation": "SetNetqueueInfo", "object": "vmnic3", "message": "netqueue write failed"}]
})json";

class NetqueueTest : public ::testing::Test {
protected:
  ScratchHost host_{"netqueue-test", kHost};
};

/// The "NIC" column of each row of a list result.
Names NicColumn(const ordered_json& rows) {
  Names names;
  for (const ordered_json& row : rows)
    names.push_back(row.at("NIC").get<std::string>());
  return names;
}

/// A named list: its command and the message for a NIC that does not exist.
struct NamedList {
  const char* name;                                                ///< For messages.
  std::function<std::shared_ptr<Fabrik::AutoCli::Command>()> make; ///< The command.
  std::string unknownNic;                                          ///< Error for "vmnic9".
};

const std::vector<NamedList>& NamedLists() {
  static const std::vector<NamedList> lists = {
      {"count get", [] { return NicQueueCountGet::New(); }, "Pnic with name vmnic9 not found"},
      {"state list", [] { return NicQueueLbStateList::New(); }, "Invalid PNIC name vmnic9"},
      {"plugin list", [] { return NicQueueLbPluginList::New(); }, "Invalid PNIC name vmnic9"},
  };
  return lists;
}

TEST_F(NetqueueTest, NamedListsFailOnTheNamedNicAndSkipUnreadableOnesOtherwise) {
  for (const NamedList& list : NamedLists()) {
    SCOPED_TRACE(list.name);
    auto command = list.make();

    // Every NIC: the unreadable and the unsupported ones are left out quietly.
    PluginTest::Result all = RunCommand(*command);
    EXPECT_EQ(all.errors, Names{});
    Names nics = NicColumn(all.root);
    EXPECT_EQ(std::count(nics.begin(), nics.end(), "vmnic1"), 0);
    EXPECT_EQ(std::count(nics.begin(), nics.end(), "vmnic2"), 0);
    EXPECT_GE(std::count(nics.begin(), nics.end(), "vmnic0"), 1);

    // The named NIC's failure is the command's, with no result.
    PluginTest::Result named = RunCommand(*command, {{"vmnic", std::string("vmnic1")}});
    EXPECT_EQ(named.errors, Names{"netqueue read failed"});
    EXPECT_TRUE(named.root.is_null());

    PluginTest::Result unknown = RunCommand(*command, {{"vmnic", std::string("vmnic9")}});
    EXPECT_EQ(unknown.errors, Names{list.unknownNic});
    EXPECT_TRUE(unknown.root.is_null());
  }
}

TEST_F(NetqueueTest, ListRowsCarryTheRecordOfTheirNic) {
  auto count = NicQueueCountGet::New();
  EXPECT_EQ(RunCommand(*count, {{"vmnic", std::string("vmnic0")}}).root,
            ordered_json::parse(
                R"([{"NIC": "vmnic0", "Tx netqueue count": 8, "Rx netqueue count": 4}])"));
  EXPECT_EQ(RunCommand(*count).root, ordered_json::parse(R"([
    {"NIC": "vmnic0", "Tx netqueue count": 8, "Rx netqueue count": 4},
    {"NIC": "vmnic3", "Tx netqueue count": 1, "Rx netqueue count": 1}])"));

  auto state = NicQueueLbStateList::New();
  EXPECT_EQ(RunCommand(*state).root, ordered_json::parse(R"([
    {"NIC": "vmnic0", "Enabled": true}, {"NIC": "vmnic3", "Enabled": false}])"));

  // One row per plugin; a plugin is enabled when the NIC lists it as changed on.
  auto plugins = NicQueueLbPluginList::New();
  EXPECT_EQ(RunCommand(*plugins, {{"vmnic", std::string("vmnic0")}}).root, ordered_json::parse(R"([
    {"NIC": "vmnic0", "Module Name": "nqcore", "Plugin Name": "default", "Enabled": true,
     "Description": "Default balancer"},
    {"NIC": "vmnic0", "Module Name": "nqcore", "Plugin Name": "rsslb", "Enabled": false,
     "Description": "RSS balancer"}])"));
  EXPECT_EQ(RunCommand(*plugins, {{"vmnic", std::string("vmnic3")}}).root, ordered_json::array());
}

TEST_F(NetqueueTest, ListsOverEveryNicShowEachReadableNicOnce) {
  auto classes = NicQueueFilterClassList::New();
  PluginTest::Result result = RunCommand(*classes);
  EXPECT_EQ(result.errors, Names{});
  EXPECT_EQ(NicColumn(result.root), (Names{"vmnic0", "vmnic3"}));
  EXPECT_EQ(result.root.at(0), ordered_json::parse(R"({"NIC": "vmnic0", "MacOnly": true,
    "VlanOnly": false, "VlanMac": false, "Vxlan": true, "Geneve": false,
    "GenericEncap": false})"));
  // vmnic3 has no filter class: its row does not keep vmnic0's.
  for (const char* field : {"MacOnly", "Vxlan"})
    EXPECT_EQ(result.root.at(1).at(field), false) << field;

  auto settings = NicQueueLbSettingList::New();
  result = RunCommand(*settings);
  EXPECT_EQ(NicColumn(result.root), (Names{"vmnic0", "vmnic3"}));
  EXPECT_EQ(result.root.at(0).at("RxQPair"), "SD");
  EXPECT_EQ(result.root.at(0).at("RSS"), "SA");
  EXPECT_EQ(result.root.at(0).at("RxQNoFeature"), "ND");
  EXPECT_EQ(result.root.at(1).at("RSS"), "UD");
}

TEST_F(NetqueueTest, SetsSendOnlyWhatTheyAreGiven) {
  // vmnic3 refuses every write: a set that reaches it fails with that
  // message and no result, one that selects nothing succeeds without
  // reaching it.
  struct Case {
    const char* name;
    std::shared_ptr<Fabrik::AutoCli::Command> command;
    Params params;
    bool sent;
  };
  const std::vector<Case> cases = {
      {"count without tx or rx", NicQueueCountSet::New(), {{"num", 2L}}, false},
      {"count with tx", NicQueueCountSet::New(), {{"num", 2L}, {"tx", true}}, true},
      {"count with rx", NicQueueCountSet::New(), {{"num", 2L}, {"rx", true}}, true},
      {"settings without any", NicQueueLbSettingSet::New(), {}, false},
      {"settings with one", NicQueueLbSettingSet::New(), {{"rsslb", false}}, true},
      {"state", NicQueueLbStateSet::New(), {{"enable", true}}, true},
      {"plugin",
       NicQueueLbPluginSet::New(),
       {{"enable", true}, {"module", std::string("m")}, {"plugin", std::string("p")}},
       true},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    Params params = {{"vmnic", std::string("vmnic3")}};
    params.insert(params.end(), c.params.begin(), c.params.end());
    PluginTest::Result result = RunCommand(*c.command, params);
    if (c.sent) {
      EXPECT_EQ(result.errors, Names{"netqueue write failed"});
      EXPECT_TRUE(result.root.is_null());
    } else {
      EXPECT_EQ(result.errors, Names{});
      EXPECT_EQ(result.root, true);
    }
  }
}

TEST_F(NetqueueTest, SetsChangeTheNamedNicOnly) {
  auto count = NicQueueCountSet::New();
  EXPECT_EQ(
      RunCommand(*count, {{"vmnic", std::string("vmnic0")}, {"num", 3L}, {"rx", true}}).errors,
      Names{});
  auto get = NicQueueCountGet::New();
  EXPECT_EQ(RunCommand(*get, {{"vmnic", std::string("vmnic0")}}).root.at(0).at("Rx netqueue count"),
            3);
  EXPECT_EQ(RunCommand(*get, {{"vmnic", std::string("vmnic0")}}).root.at(0).at("Tx netqueue count"),
            8);

  // Beyond the NIC's limit the host refuses and nothing changes.
  PluginTest::Result tooMany =
      RunCommand(*count, {{"vmnic", std::string("vmnic0")}, {"num", 17L}, {"tx", true}});
  EXPECT_EQ(tooMany.errors.size(), 1u);
  EXPECT_EQ(RunCommand(*get, {{"vmnic", std::string("vmnic0")}}).root.at(0).at("Tx netqueue count"),
            8);

  auto plugin = NicQueueLbPluginSet::New();
  EXPECT_EQ(RunCommand(*plugin, {{"vmnic", std::string("vmnic0")},
                                 {"enable", true},
                                 {"module", std::string("nqcore")},
                                 {"plugin", std::string("rsslb")}})
                .errors,
            Names{});
  auto plugins = NicQueueLbPluginList::New();
  EXPECT_EQ(RunCommand(*plugins, {{"vmnic", std::string("vmnic0")}}).root.at(1).at("Enabled"),
            true);

  PluginTest::Result missing = RunCommand(*count, {{"vmnic", std::string("vmnic2")}, {"num", 1L}});
  EXPECT_EQ(missing.errors, Names{});
  PluginTest::Result unknown = RunCommand(*count, {{"vmnic", std::string("vmnic9")}, {"num", 1L}});
  EXPECT_EQ(unknown.errors, Names{"Pnic with name vmnic9 not found"});
  EXPECT_TRUE(unknown.root.is_null());
}

} // namespace
