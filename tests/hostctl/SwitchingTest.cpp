//===- SwitchingTest.cpp - Switches, port groups and policies of the host --===//
//
// The switching objects over the demo host: listing and lookup, the host's
// refusals (limits, duplicates, unknown or claimed uplinks, objects in use),
// policy inheritance of port groups, LACP records, and the description's
// export then import.
//
//===----------------------------------------------------------------------===//
#include "TvkCtl/Network/Switching.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "model/CoreModel.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <cstring>
#include <filesystem>
#include <functional>
#include <unistd.h>

namespace {

using namespace HostCtl::Network;
using namespace TvkCtl::Network;
using HostCtl::Lib::HostCtlException;
using Names = std::vector<std::string>;

/// A fresh host store in a temporary file, made the process's host.
class SwitchingTest : public ::testing::Test {
protected:
  void Load(const nlohmann::ordered_json& host) {
    Model::Store::CloseHost();
    Remove();
    path_ = std::filesystem::temp_directory_path() / ("switching-test-" + std::to_string(getpid()) +
                                                      "-" + std::to_string(counter_++) + ".db");
    {
      auto store = Model::Store::Create(path_.string());
      Model::ImportHost(*store, host);
    }
    Model::Store::SetPath(path_.string());
  }
  /// The demo host without its kernel interfaces (and what refers to them),
  /// so that port counts and clients are those the tests make.
  void SetUp() override {
    nlohmann::ordered_json host = Model::Profile("demo");
    for (const char* key : {"interfaces", "routes", "neighbors"})
      host.erase(key);
    Load(host);
  }
  void TearDown() override {
    Model::Store::CloseHost();
    Remove();
  }
  void Remove() {
    if (path_.empty())
      return;
    for (const char* suffix : {"", "-wal", "-shm"})
      std::filesystem::remove(path_.string() + suffix);
  }
  /// Attaches a kernel interface to port group \p group, as the IP area does.
  void AttachTvknic(const std::string& group) {
    Model::Store& store = Model::Store::Host();
    store.Write([&] {
      store.Exec("INSERT OR IGNORE INTO netstack(key, ord, name, state) "
                 "VALUES('defaultTcpipStack', 0, 'defaultTcpipStack', 4660)");
      int64_t port = Model::AllocatePortId(store);
      store
          .Prepare("INSERT INTO port(id, portset_id, portgroup_id, client_kind, client) "
                   "SELECT ?, portset_id, id, 'tvknic', 'tvk7' FROM portgroup WHERE name = ?")
          .BindAll(port, group)
          .Run();
      store
          .Prepare("INSERT INTO tvknic(name, ord, netstack, port_id, mac) "
                   "VALUES('tvk7', 0, 'defaultTcpipStack', ?, '00:50:56:aa:bb:cc')")
          .Bind(1, port)
          .Run();
    });
  }
  static std::string Message(const std::function<void()>& fn) {
    try {
      fn();
    } catch (const HostCtlException& e) {
      return e.what();
    }
    return "";
  }

  std::filesystem::path path_;
  static inline int counter_ = 0;
  VirtualSwitchInfoImpl info_;
};

TEST_F(SwitchingTest, ListsAndFindsSwitchesOfEveryKind) {
  Names names;
  for (const auto& portset : info_.GetAllSwitches())
    names.push_back(portset->GetName());
  EXPECT_EQ(names, (Names{"coreSwitch", "storageSwitch", "dvs-west"}));
  EXPECT_TRUE(info_.IsLegacySwitch("coreSwitch"));
  EXPECT_TRUE(info_.IsDVSwitch("dvs-west"));
  EXPECT_FALSE(info_.IsOpaqueSwitch("dvs-west"));
  EXPECT_FALSE(info_.GetVirtualSwitchByName("dvs-west", PortsetGetRegular));
  EXPECT_FALSE(info_.GetVirtualSwitchByName("coreSwitch", PortsetGetSystem));
  EXPECT_TRUE(PortsetImpl::IsValidVirtualSwitch("dvs-west"));
  EXPECT_FALSE(PortsetImpl::IsValidVirtualSwitch("nope"));

  auto core = NetworkFactory::GetVirtualSwitchById("coreSwitch", PortsetGetRegular);
  ASSERT_TRUE(core);
  EXPECT_EQ(core->GetUplinks(), (Names{"vmnic0", "vmnic1"}));
  EXPECT_EQ(core->GetUsedPorts(), 2u);
  auto ports = core->GetPorts();
  ASSERT_EQ(ports.size(), 2u);
  EXPECT_EQ(ports[0]->GetWorldLeader(), 0);
  EXPECT_GE(ports[0]->GetId(), 33554432);

  auto dvs = NetworkFactory::GetDVSwitchByName("dvs-west");
  ASSERT_TRUE(dvs);
  EXPECT_EQ(dvs->GetUuid(), "6d 2e 11 a0 4c 9f 3b 71-8e 05 d2 44 19 6a c0 f3");
  EXPECT_EQ(dynamic_cast<PortsetImpl&>(*dvs).GetIdentifier(), dvs->GetUuid());
  EXPECT_EQ(dvs->GetNumConfiguredPorts(), 64u);
}

TEST_F(SwitchingTest, AddSwitchKeepsNamesUniqueAndPortsWithinLimits) {
  auto added = info_.AddVirtualSwitchWithPolicy(
      NicTeamingPolicy::GetDefaultPolicy(), PortSecurityPolicy::GetDefaultPolicy(),
      ShapingPolicy::GetDefaultPolicy(), NicCapabilities::GetDefaultPolicy(), "labSwitch",
      Portset::DEF_NUM_PORTS);
  EXPECT_EQ(added->GetNumPorts(), 128u);
  EXPECT_EQ(added->GetMtu(), 1500u);
  EXPECT_EQ(added->GetNicTeamingPolicy().GetUplinkOrder(), Names{});
  auto add = [&](const std::string& name, uint32_t ports) {
    return Message([&] {
      info_.AddVirtualSwitchWithPolicy(
          NicTeamingPolicy::GetDefaultPolicy(), PortSecurityPolicy::GetDefaultPolicy(),
          ShapingPolicy::GetDefaultPolicy(), NicCapabilities::GetDefaultPolicy(), name, ports);
    });
  };
  EXPECT_EQ(add("labSwitch", 64),
            "Unable to add virtual switch labSwitch: a virtual switch of that name already "
            "exists");
  EXPECT_EQ(add("dvs-west", 64),
            "Unable to add virtual switch dvs-west: a virtual switch of that name already "
            "exists");
  // 128 + 256 + 128 are allocated: 4096 more reach the host's 4608 exactly.
  EXPECT_EQ(add("huge", 4097), "Unable to add virtual switch huge with 4097 ports: a virtual "
                               "switch has 1 to 4096 ports");
  EXPECT_EQ(add("edge", 4096), "");
  EXPECT_EQ(add("more", 1), "Unable to add virtual switch more with 1 ports: 4608 of the host's "
                            "4608 ports are already allocated");
  EXPECT_EQ(add(std::string(128, 'x'), 1), "Unable to add virtual switch " + std::string(128, 'x') +
                                               ": the name is longer than 127 bytes");
}

TEST_F(SwitchingTest, UplinksAreHostNicsOnOneSwitchOnly) {
  auto core = info_.GetVirtualSwitchByName("coreSwitch", PortsetGetRegular);
  EXPECT_EQ(Message([&] { core->AddUplink("vmnic9", true); }),
            "Unable to add uplink vmnic9 to coreSwitch: the host has no physical NIC of that name");
  EXPECT_EQ(Message([&] { core->AddUplink("vmnic4", true); }),
            "Unable to add uplink vmnic4 to coreSwitch: it is already an uplink of storageSwitch");
  EXPECT_EQ(Message([&] { core->AddUplink("vmnic2", true); }),
            "Unable to add uplink vmnic2 to coreSwitch: it is already an uplink of dvs-west");
  EXPECT_EQ(Message([&] { core->RemoveUplink("vmnic4", false); }),
            "Unable to remove uplink vmnic4 from coreSwitch: it is not an uplink of this virtual "
            "switch");

  // Removing an uplink takes it out of every teaming order that names it.
  core->RemoveUplink("vmnic0", false);
  EXPECT_EQ(core->GetUplinks(), Names{"vmnic1"});
  EXPECT_EQ(core->GetUsedPorts(), 1u);
  NicTeamingPolicy own = core->GetNicTeamingPolicy();
  EXPECT_EQ(own.GetUplinkOrder(), Names{"vmnic1"});
  EXPECT_EQ(own.GetMaxActiveUplinks(), 0);
  auto migration = NetworkFactory::GetPortGroupByName("Migration");
  NicTeamingPolicy pg = migration->GetConfiguredNicTeamingPolicy();
  EXPECT_EQ(pg.GetUplinkOrder(), Names{"vmnic1"});
  EXPECT_EQ(pg.GetMaxActiveUplinks(), 1);

  // The NIC is free again for another switch, where it follows the uplinks.
  auto storage = info_.GetVirtualSwitchByName("storageSwitch", PortsetGetRegular);
  storage->AddUplink("vmnic0", true);
  EXPECT_EQ(storage->GetNicTeamingPolicy().GetUplinkOrder(), (Names{"vmnic4", "vmnic5", "vmnic0"}));
}

TEST_F(SwitchingTest, PortGroupsAreUniqueAndCannotBeRemovedInUse) {
  auto core = info_.GetVirtualSwitchByName("coreSwitch", PortsetGetRegular);
  EXPECT_EQ(Message([&] { core->AddPortGroup("Storage A"); }),
            "Unable to add port group Storage A to coreSwitch: a port group of that name already "
            "exists on storageSwitch");
  EXPECT_EQ(Message([&] { core->AddPortGroup(std::string(128, 'b')); }),
            "Unable to add a port group to coreSwitch: the port group name is longer than 127 "
            "bytes");
  core->AddPortGroup(std::string(127, 'b'));
  core->AddPortGroup("Backup");
  auto backup = NetworkFactory::GetPortGroupByName("Backup");
  ASSERT_TRUE(backup);
  EXPECT_EQ(backup->GetPortsetName(), "coreSwitch");
  EXPECT_EQ(backup->GetType(), ConnectionPoint::CONNECTION_PORTGROUP);
  EXPECT_EQ(backup->GetVlanId(), 0);
  backup->SetVlanId(4095);
  EXPECT_EQ(backup->GetVlanId(), 4095);
  EXPECT_NE(Message([&] { backup->SetVlanId(4096); }), "");
  EXPECT_EQ(backup->GetVlanId(), 4095);

  AttachTvknic("Backup");
  EXPECT_EQ(backup->GetActiveClients(), 1u);
  EXPECT_EQ(Message([&] { core->RemovePortGroup("Backup"); }),
            "Unable to remove port group Backup: it is in use by 1 client");
  EXPECT_EQ(Message([&] { info_.RemoveVirtualSwitch("coreSwitch"); }),
            "Unable to remove virtual switch coreSwitch: kernel interfaces are connected to its "
            "port groups (tvk7)");
  EXPECT_EQ(Message([&] { core->RemovePortGroup("Storage A"); }),
            "Unable to remove port group Storage A: coreSwitch has no port group of that name");

  info_.RemoveVirtualSwitch("storageSwitch");
  EXPECT_FALSE(NetworkFactory::GetPortGroupByName("Storage A"));
  EXPECT_FALSE(PortGroupImpl("Storage A").IsValid());
  EXPECT_EQ(Message([&] { info_.RemoveVirtualSwitch("dvs-west"); }),
            "Unable to remove virtual switch dvs-west: it is not a standard virtual switch");
}

TEST_F(SwitchingTest, PortGroupPoliciesFollowTheirSwitch) {
  auto core = info_.GetVirtualSwitchByName("coreSwitch", PortsetGetRegular);
  auto traffic = NetworkFactory::GetPortGroupByName("VM Traffic");
  EXPECT_EQ(traffic->GetNicTeamingPolicy().GetTeamingPolicy(), NicTeamingPolicy::TEAM_IP_HASH);
  EXPECT_TRUE(traffic->GetNicTeamingPolicy().GetNotifySwitchOnFailure());

  // A field the port group does not override follows a later switch change.
  NicTeamingPolicy policy = core->GetConfiguredNicTeamingPolicy();
  policy.SetNotifySwitchOnFailure(false);
  policy.SetTeamingPolicy(NicTeamingPolicy::TEAM_EXPLICIT);
  core->SetNicTeamingPolicy(policy);
  EXPECT_FALSE(traffic->GetNicTeamingPolicy().GetNotifySwitchOnFailure());
  EXPECT_EQ(traffic->GetNicTeamingPolicy().GetTeamingPolicy(), NicTeamingPolicy::TEAM_IP_HASH);

  PortSecurityPolicy security = core->GetPortSecurityPolicy();
  security.SetAllowForgedTransmits(false);
  core->SetPortSecurityPolicy(security);
  EXPECT_FALSE(traffic->GetPortSecurityPolicy().GetAllowForgedTransmits());
  EXPECT_EQ(traffic->GetConfiguredPortSecurityPolicy().GetSetMask(), 0u);

  // An order naming a NIC that is no uplink of the switch is refused.
  NicTeamingPolicy bad;
  bad.SetUplinkOrder({"vmnic4"});
  bad.SetMaxActiveUplinks(1);
  EXPECT_EQ(Message([&] { traffic->SetNicTeamingPolicy(bad); }),
            "Unable to set the teaming policy of port group VM Traffic: vmnic4 is not an uplink "
            "of coreSwitch");
}

TEST_F(SwitchingTest, ShapingNeedsEveryRateWhenEnabled) {
  auto core = info_.GetVirtualSwitchByName("coreSwitch", PortsetGetRegular);
  ShapingPolicy on = core->GetTrafficShapingPolicy();
  on.SetEnabled(true);
  on.SetAverageBps(1000);
  EXPECT_EQ(Message([&] { core->SetTrafficShapingPolicy(on); }),
            "Unable to enable traffic shaping on coreSwitch: the average bandwidth, peak "
            "bandwidth and burst size must be set");
  EXPECT_FALSE(core->GetTrafficShapingPolicy().IsEnabled());

  // Storage B turns shaping off over a switch that has every rate; turning
  // it back on needs no rate of its own.
  auto storageB = NetworkFactory::GetPortGroupByName("Storage B");
  EXPECT_FALSE(storageB->GetTrafficShapingPolicy().IsEnabled());
  ShapingPolicy pg = storageB->GetConfiguredTrafficShapingPolicy();
  pg.SetEnabled(true);
  storageB->SetTrafficShapingPolicy(pg);
  ShapingPolicy inForce = storageB->GetTrafficShapingPolicy();
  EXPECT_TRUE(inForce.IsEnabled());
  EXPECT_EQ(inForce.GetPeakBps(), 8000000000);
}

TEST_F(SwitchingTest, SettingsStayInTheHostsRanges) {
  auto core = info_.GetVirtualSwitchByName("coreSwitch", PortsetGetRegular);
  EXPECT_EQ(Message([&] { core->SetMtu(0); }),
            "Unable to set the MTU of coreSwitch to 0: the MTU must be between 1280 and 9000");
  core->SetMtu(9000);
  core->SetCdpStatus(3);
  auto again = NetworkFactory::GetVirtualSwitchById("coreSwitch", PortsetGetRegular);
  EXPECT_EQ(again->GetMtu(), 9000u);
  EXPECT_EQ(again->GetCdpStatus(), 3u);
  EXPECT_NE(Message([&] { core->SetCdpStatus(4); }), "");
}

TEST_F(SwitchingTest, DistributedPortsAndLacp) {
  auto dvs = NetworkFactory::GetDVSwitchByName("dvs-west");
  auto ports = dvs->GetDVPorts();
  ASSERT_EQ(ports.size(), 6u);
  std::vector<std::string> clients;
  EXPECT_TRUE(ports[0]->IsInUse(clients));
  EXPECT_EQ(clients, Names{"vmnic2"});
  clients.clear();
  EXPECT_FALSE(ports[2]->IsInUse(clients));
  EXPECT_EQ(ports[2]->GetDVPortgroupId(), "dvportgroup-101");

  DVPortImpl port(DVPortParam{dvs->GetUuid(), "11", 0});
  EXPECT_TRUE(port.IsValid());
  EXPECT_EQ(port.GetPortsetName(), "dvs-west");
  port.SetConnectionId(1234);
  EXPECT_EQ(DVPortImpl(dvs->GetUuid(), "11").GetConnectionId(), 1234u);
  EXPECT_FALSE(DVPortImpl(dvs->GetUuid(), "99").IsValid());
  EXPECT_FALSE(NetworkFactory::GetDVPort(DVPortParam{"no-such-uuid", "11", 0}));

  auto map = dvs->GetUplinkPortMap();
  ASSERT_EQ(map.size(), 2u);
  EXPECT_EQ(NetworkFactory::GetDVPort(map["vmnic3"])->GetName(), "lag1-1");

  std::vector<LacpLagInfo> lags;
  dvs->GetLacpInfo(lags);
  ASSERT_EQ(lags.size(), 1u);
  ASSERT_EQ(lags[0].nics.size(), 2u);
  const LacpNicInfo& first = *lags[0].nics[0];
  EXPECT_STREQ(first.nicName, "vmnic2");
  // The record is packed: read its wider fields by value.
  uint8_t actorState = first.actorState;
  uint32_t partnerAge = first.partnerAge;
  uint64_t txErrors = first.txErrors;
  EXPECT_EQ(actorState, 0x3D);
  EXPECT_STREQ(first.actorFlags, "SA");
  EXPECT_EQ(partnerAge, 3725u);
  EXPECT_EQ(txErrors, 1u);

  // The timeout persists and shows in the actor's state and flags.
  dvs->SetLacpTimeout(1, true, "vmnic2");
  lags.clear();
  NetworkFactory::GetDVSwitchByName("dvs-west")->GetLacpInfo(lags);
  EXPECT_STREQ(lags[0].nics[0]->actorFlags, "FA");
  EXPECT_STREQ(lags[0].nics[1]->actorFlags, "SA");
  dvs->SetLacpTimeout(1, true, "");
  lags.clear();
  dvs->GetLacpInfo(lags);
  EXPECT_STREQ(lags[0].nics[1]->actorFlags, "FA");
  EXPECT_EQ(Message([&] { dvs->SetLacpTimeout(7, false, ""); }),
            "Unable to set the LACP timeout: dvs-west has no LAG with ID 7");
  EXPECT_EQ(Message([&] { dvs->SetLacpTimeout(1, false, "vmnic0"); }),
            "Unable to set the LACP timeout: vmnic0 is not a NIC of LAG 1 on dvs-west");

  std::vector<LagConfig> configs = dvs->GetLagConfigs();
  ASSERT_EQ(configs.size(), 1u);
  EXPECT_STREQ(configs[0].lagId, "1");
  EXPECT_EQ(configs[0].loadBalancing, 16u);
  EXPECT_EQ(configs[0].uplinkCount, 2u);
}

TEST_F(SwitchingTest, DescriptionSurvivesExportAndImport) {
  auto core = info_.GetVirtualSwitchByName("coreSwitch", PortsetGetRegular);
  core->AddPortGroup("Extra");
  NetworkFactory::GetPortGroupByName("Extra")->SetVlanId(77);
  nlohmann::ordered_json first = Model::ExportHost(Model::Store::Host());
  Load(first);
  nlohmann::ordered_json second = Model::ExportHost(Model::Store::Host());
  EXPECT_EQ(first.dump(), second.dump());
  EXPECT_EQ(NetworkFactory::GetPortGroupByName("Extra")->GetVlanId(), 77);
}

TEST_F(SwitchingTest, ImportNamesTheBadField) {
  auto importError = [&](const char* text) {
    try {
      Load(nlohmann::ordered_json::parse(text));
    } catch (const Model::ImportError& e) {
      return std::string(e.what());
    }
    return std::string();
  };
  EXPECT_EQ(importError(R"({"vswitches": [{"name": "a", "uplinks": ["vmnic0"]}]})"),
            "vswitches[0].uplinks: \"vmnic0\" is not a NIC of the host");
  EXPECT_EQ(importError(R"({"vswitches": [{"name": "a", "ports": 4097}]})"),
            "vswitches[0].ports: expected an integer in [1 - 4096]");
  EXPECT_EQ(importError(R"({"vswitches": [{"name": "a", "portgroups": [{"name": "p"}]},
                                          {"name": "b", "portgroups": [{"name": "p"}]}]})"),
            "vswitches[1].portgroups[0].name: \"p\" is used by another port group");
}

} // namespace
