//===- NicModelTest.cpp - NIC information, counters, SR-IOV, attachments --===//
//
// Host-model tests of the NIC part: import and export of its records, and the
// invariants the host enforces when NIC settings, link modes, attachments and
// SR-IOV functions are read or changed.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/PnicImpl.h"
#include "TvkCtl/Network/Switching.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <unistd.h>

namespace {

using HostCtl::Lib::HostCtlException;
using namespace HostCtl::Network;
using nlohmann::ordered_json;
using TvkCtl::Network::NetworkInfoImpl;
using TvkCtl::Network::PnicImpl;

/// A fresh host store per test, made from a description.
class NicModelTest : public ::testing::Test {
protected:
  void SetUp() override {
    path_ = std::filesystem::temp_directory_path() /
            ("nic-model-" + std::to_string(getpid()) + "-" +
             ::testing::UnitTest::GetInstance()->current_test_info()->name() + ".db");
    Load(Model::Profile("demo"));
  }
  void TearDown() override {
    Model::Store::CloseHost();
    Remove();
  }
  void Remove() {
    for (const char* suffix : {"", "-wal", "-shm"})
      std::filesystem::remove(path_.string() + suffix);
  }
  void Load(const ordered_json& host) {
    Model::Store::CloseHost();
    Remove();
    {
      std::unique_ptr<Model::Store> store = Model::Store::Create(path_.string());
      Model::ImportHost(*store, host);
    }
    Model::Store::SetPath(path_.string());
  }
  /// Imports \p host into a scratch store and returns the import error text.
  std::string ImportError(const ordered_json& host) {
    std::string scratch = path_.string() + ".scratch";
    std::filesystem::remove(scratch);
    std::unique_ptr<Model::Store> store = Model::Store::Create(scratch);
    std::string message;
    try {
      Model::ImportHost(*store, host);
    } catch (const Model::ImportError& error) {
      message = error.what();
    }
    store.reset();
    for (const char* suffix : {"", "-wal", "-shm"})
      std::filesystem::remove(scratch + suffix);
    return message;
  }
  static std::string Refusal(const std::function<void()>& operation) {
    try {
      operation();
    } catch (const HostCtlException& refusal) {
      return refusal.what();
    }
    return "";
  }

  std::filesystem::path path_; ///< The test's store file.
};

TEST_F(NicModelTest, ExportThenImportGivesTheSameHost) {
  ordered_json first = Model::ExportHost(Model::Store::Host());
  Load(first);
  ordered_json second = Model::ExportHost(Model::Store::Host());
  EXPECT_EQ(first.dump(), second.dump());
  // The demo's records are all there.
  const ordered_json& vmnic0 = first["nics"][0];
  EXPECT_EQ(vmnic0["info"]["port"], 5);
  EXPECT_EQ(vmnic0["vfs"].size(), 4u);
  EXPECT_EQ(vmnic0["attachments"][0]["branch"], "vmnic5");
  EXPECT_EQ(vmnic0["vlanCounters"].size(), 3u);
  EXPECT_EQ(vmnic0["vlanStats"], true);
}

TEST_F(NicModelTest, AnOddDuplexCodeSurvivesExportAndImport) {
  // A NIC without advertised modes gets one from its own speed and duplex;
  // the exported mode must import again whatever the NIC's code is.
  ordered_json host = Model::Profile("demo");
  host["nics"][5]["duplex"] = 4;
  host["nics"][5].erase("info");
  Load(host);
  ordered_json first = Model::ExportHost(Model::Store::Host());
  EXPECT_EQ(first["nics"][5]["info"]["advertisedModes"][0]["duplex"], 4);
  Load(first);
  EXPECT_EQ(Model::ExportHost(Model::Store::Host()).dump(), first.dump());
}

TEST_F(NicModelTest, ImportNamesTheBadField) {
  ordered_json host = Model::Profile("demo");
  host["nics"][0]["info"]["phyAddress"] = 32;
  EXPECT_NE(ImportError(host).find("nics[0].info.phyAddress"), std::string::npos);

  host = Model::Profile("demo");
  host["nics"][1]["info"]["colour"] = "blue";
  EXPECT_EQ(ImportError(host), "nics[1].info.colour: unknown field");

  host = Model::Profile("demo");
  host["nics"][2]["vfs"] = ordered_json::array({{{"id", 0}}});
  EXPECT_NE(ImportError(host).find("nics[2].vfs"), std::string::npos);

  host = Model::Profile("demo");
  host["nics"][1]["vfs"][0]["ownerWorldId"] = "2107453";
  EXPECT_EQ(ImportError(host), "nics[1].vfs[0].ownerWorldId: an inactive VF has no owner world");

  host = Model::Profile("demo");
  host["nics"][1]["attachments"] = ordered_json::array({{{"branch", "vmnic5"}, {"vlanId", 7}}});
  EXPECT_NE(ImportError(host).find("already attached to vmnic0"), std::string::npos);

  host = Model::Profile("demo");
  host["nics"][2]["vlanStats"] = true; // vmnic2 is no uplink of a standard switch
  host.erase("dvswitches");
  EXPECT_EQ(ImportError(host),
            "nics[2].vlanStats: VLAN statistics need the NIC to be an uplink of a switch");

  host = Model::Profile("demo");
  host["nics"][0]["stats"]["rxPackets"] = -1;
  EXPECT_NE(ImportError(host).find("nics[0].stats.rxPackets"), std::string::npos);
}

TEST_F(NicModelTest, SetPnicInfoAppliesOnlyChangedSettings) {
  PnicImpl nic("vmnic4");
  PnicInfo info;
  nic.GetPnicInfo(info, 0, 0);
  EXPECT_EQ(info.linkStatus, "Up");
  info.port = 3;
  info.portChanged = true;
  info.phyAddress = 9;             // not flagged: stays 3
  info.messageLevel = 0xffffffffu; // every bit, as "-l -1" sets it
  info.messageLevelChanged = true;
  nic.SetPnicInfo(info);

  PnicInfo after;
  PnicImpl("vmnic4").GetPnicInfo(after, 0, 0);
  EXPECT_EQ(after.port, 3u);
  EXPECT_EQ(after.phyAddress, 3u);
  EXPECT_EQ(after.messageLevel, 0xffffffffu);
  EXPECT_FALSE(after.portChanged);

  // What a change leaves can be exported and imported again.
  ordered_json exported = Model::ExportHost(Model::Store::Host());
  Load(exported);
  EXPECT_EQ(Model::ExportHost(Model::Store::Host()).dump(), exported.dump());
}

TEST_F(NicModelTest, SetPnicInfoRefusesWhatTheNicCannotDo) {
  PnicInfo info;
  PnicImpl("vmnic0").GetPnicInfo(info, 0, 0);
  info.port = 0;
  info.portChanged = true;
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic0").SetPnicInfo(info); }),
            "Port TP is not supported by NIC vmnic0");

  PnicInfo phy;
  phy.phyAddress = 40;
  phy.phyAddressChanged = true;
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic0").SetPnicInfo(phy); }),
            "Invalid PHY address 40 for NIC vmnic0: PHY addresses are 0 to 31");

  PnicInfo wol;
  wol.wakeOn = {WakeOnMagic};
  wol.wakeOnChanged = true;
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic5").SetPnicInfo(wol); }),
            "NIC vmnic5 does not support wake-on-LAN");

  PnicInfo level;
  level.messageLevelChanged = true;
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic2").SetPnicInfo(level); }),
            "The driver of NIC vmnic2 has no message level");

  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic9").SetPnicInfo(level); }),
            "There is no physical NIC named vmnic9 on this host");
}

TEST_F(NicModelTest, SpeedAndDuplexMustBeAdvertised) {
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic2").SetSpeedDuplex(100, 2); }),
            "NIC vmnic2 does not support 100 Mbps at half duplex");
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic2").SetSpeedDuplex(40000, 1); }),
            "NIC vmnic2 does not support 40000 Mbps at full duplex");

  PnicImpl("vmnic2").SetSpeedDuplex(1000, 1);
  PnicImpl fixed("vmnic2");
  EXPECT_EQ(fixed.GetSpeed(), 1000u);
  EXPECT_EQ(fixed.GetDuplex(), 1u);
  PnicInfo info;
  fixed.GetPnicInfo(info, 0, 0);
  EXPECT_FALSE(info.autoNegotiation);
  EXPECT_EQ(Refusal([&] { fixed.RestartNegotiation(); }),
            "Cannot restart negotiation on NIC vmnic2: autonegotiation is off");

  // Autonegotiation is always accepted and settles on the fastest mode.
  PnicImpl("vmnic2").SetSpeedDuplex(0, 0);
  PnicImpl negotiated("vmnic2");
  EXPECT_EQ(negotiated.GetSpeed(), 10000u);
  negotiated.GetPnicInfo(info, 0, 0);
  EXPECT_TRUE(info.autoNegotiation);
  negotiated.RestartNegotiation();
}

TEST_F(NicModelTest, NegotiationRestartIsRefusedOnADownNic) {
  PnicImpl nic("vmnic1");
  nic.RestartNegotiation();
  nic.SetAdminStatus(false);
  EXPECT_FALSE(nic.IsLinkUp());
  EXPECT_EQ(Refusal([&] { nic.RestartNegotiation(); }),
            "Cannot restart negotiation on NIC vmnic1: the NIC is down");
}

TEST_F(NicModelTest, PauseResolutionFollowsTheLink) {
  PnicPauseParams pause;
  PnicImpl("vmnic1").GetPauseParams(pause);
  EXPECT_TRUE(pause.supported);
  EXPECT_EQ(pause.rxResolution, 1u);
  EXPECT_EQ(pause.txResolution, 2u);
  PnicImpl("vmnic3").GetPauseParams(pause); // no autonegotiation
  EXPECT_EQ(pause.rxResolution, 0u);

  PnicPauseParams change;
  change.autoNegotiation = true;
  change.rx = true;
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic4").SetPauseParams(change); }),
            "NIC vmnic4 does not support pause parameters");
  PnicImpl("vmnic2").SetPauseParams(change);
  PnicImpl("vmnic2").GetPauseParams(pause);
  EXPECT_TRUE(pause.autoNegotiation);
  EXPECT_TRUE(pause.rx);
  EXPECT_FALSE(pause.tx);
}

TEST_F(NicModelTest, AttachmentRules) {
  PnicImpl trunk("vmnic1");
  EXPECT_EQ(Refusal([&] { trunk.AttachBranch("vmnic1", 10); }),
            "An uplink cannot be attached to itself");
  EXPECT_EQ(Refusal([&] { trunk.AttachBranch("vmnic5", 10); }),
            "Uplink vmnic5 is already attached to vmnic0");
  EXPECT_EQ(Refusal([&] { trunk.AttachBranch("vmnic2", 4095); }),
            "VLAN ID 4095 is out of range; a branch needs a VLAN ID from 1 to 4094");
  EXPECT_EQ(Refusal([&] { trunk.AttachBranch("vmnic0", 10); }),
            "Uplink vmnic0 is a trunk and cannot be attached as a branch");
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic5").AttachBranch("vmnic2", 10); }),
            "Uplink vmnic5 is a branch of vmnic0 and cannot be a trunk");
  EXPECT_EQ(Refusal([&] { trunk.AttachBranch("vmnic7", 10); }),
            "There is no physical NIC named vmnic7 on this host");
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic0").AttachBranch("vmnic2", 200); }),
            "VLAN 200 of trunk vmnic0 is already used by branch vmnic5");

  trunk.AttachBranch("vmnic3", 30);
  trunk.AttachBranch("vmnic2", 20);
  std::vector<PnicAttachment> attachments = PnicImpl("vmnic1").GetAttachments();
  ASSERT_EQ(attachments.size(), 2u);
  EXPECT_EQ(attachments[0].branch, "vmnic3");
  EXPECT_EQ(attachments[1].vlanId, 20);

  EXPECT_EQ(Refusal([&] { trunk.DetachBranch("vmnic5"); }),
            "Uplink vmnic5 is not attached to vmnic1");
  trunk.DetachBranch("vmnic3");
  EXPECT_EQ(PnicImpl("vmnic1").GetAttachments().size(), 1u);
}

TEST_F(NicModelTest, SriovFunctionsAndCounters) {
  NetworkInfoImpl root;
  std::vector<std::unique_ptr<Pnic>> nics = root.GetSriovNics();
  ASSERT_EQ(nics.size(), 2u);
  EXPECT_EQ(nics[1]->GetName(), "vmnic1");
  EXPECT_EQ(root.GetSriovNicByName("vmnic2"), nullptr);
  EXPECT_NE(root.GetSriovNicByName("vmnic0"), nullptr);

  std::vector<SriovNicVFInfo> vfs = root.GetSriovNicVFInfo("vmnic0");
  ASSERT_EQ(vfs.size(), 4u);
  EXPECT_EQ(vfs[1].ownerWorldId, "2107488");
  EXPECT_FALSE(vfs[2].active);

  SriovNicVFStats stats;
  root.GetSriovNicVFStats(stats, "vmnic0", 0);
  EXPECT_EQ(stats.rxUnicastPkts, 771204u);
  EXPECT_EQ(stats.txTsoBytes, 157204880u);
  EXPECT_EQ(Refusal([&] { root.GetSriovNicVFStats(stats, "vmnic0", 4); }),
            "NIC vmnic0 has no VF with ID 4");
  EXPECT_EQ(Refusal([&] { root.GetSriovNicVFInfo("vmnic2"); }),
            "NIC vmnic2 does not have SR-IOV enabled");
}

TEST_F(NicModelTest, CountersAndDeclaredFaults) {
  PnicStats stats;
  PnicImpl("vmnic0").GetPnicStats(stats);
  EXPECT_EQ(stats.rxPackets, 25519302u);
  EXPECT_EQ(stats.rxCrcErrors, 9u);
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnicX").GetPnicStats(stats); }),
            "There is no physical NIC named vmnicX on this host");

  ordered_json host = Model::Profile("demo");
  host["faults"] = ordered_json::array(
      {{{"operation", "GetPnicInfo"}, {"object", "vmnic1"}, {"message", "PHY not responding"}}});
  Load(host);
  PnicInfo info;
  EXPECT_EQ(Refusal([&] { PnicImpl("vmnic1").GetPnicInfo(info, 0, 0); }), "PHY not responding");
  PnicImpl("vmnic0").GetPnicInfo(info, 0, 0);
}

/// The switch whose uplinks include \p nic.
std::unique_ptr<Portset> SwitchOf(const std::string& nic) {
  TvkCtl::Network::VirtualSwitchInfoImpl switches;
  for (auto& portset : switches.GetAllSwitches()) {
    std::vector<std::string> uplinks = portset->GetUplinks();
    if (std::find(uplinks.begin(), uplinks.end(), nic) != uplinks.end())
      return std::move(portset);
  }
  return nullptr;
}

TEST_F(NicModelTest, VlanCountersFollowTheUplinkSetting) {
  std::unique_ptr<Portset> core = SwitchOf("vmnic0");
  ASSERT_NE(core, nullptr);
  std::vector<VlanStats> stats = core->GetVlanStats("vmnic0");
  ASSERT_EQ(stats.size(), 3u);
  EXPECT_EQ(stats[0].vlanId, 120);
  EXPECT_EQ(stats[0].received, 402113u);
  EXPECT_EQ(core->GetVlanStats("vmnic1").size(), 0u);
  EXPECT_EQ(Refusal([&] { core->GetVlanStats("vmnic4"); }),
            "vmnic4 is not an uplink of virtual switch " + core->GetName());

  // Turning counting off drops the counters; on again, the port groups'
  // VLANs count from zero.
  core->SetVlanStatsEnabled("vmnic0", false);
  EXPECT_TRUE(core->GetVlanStats("vmnic0").empty());
  core->SetVlanStatsEnabled("vmnic0", true);
  stats = SwitchOf("vmnic0")->GetVlanStats("vmnic0");
  ASSERT_EQ(stats.size(), 2u);
  EXPECT_EQ(stats[1].vlanId, 130);
  EXPECT_EQ(stats[1].sent, 0u);

  ordered_json exported = Model::ExportHost(Model::Store::Host());
  EXPECT_EQ(exported["nics"][0]["vlanStats"], true);
  EXPECT_FALSE(exported["nics"][0].contains("vlanCounters"));
}

} // namespace
