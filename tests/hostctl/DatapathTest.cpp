//===- DatapathTest.cpp - VMs, port datapath records and ENS contexts -----===//
#include "HostCtl/Lib.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/PnicImpl.h"
#include "TvkCtl/Network/Switching.h"
#include "TvkCtl/Resource/WorldImpl.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <unistd.h>

namespace {

using HostCtl::Lib::HostCtlException;
using nlohmann::ordered_json;
using TvkCtl::Network::NetworkInfoImpl;

/// Two NICs, a standard switch with a port group, a distributed switch with
/// two ports, one VM on each, and ENS contexts.
const char* const kHost = R"({
  "nics": [{"name": "vmnic0", "mac": "00:11:22:33:44:00"},
           {"name": "vmnic1", "mac": "00:11:22:33:44:01"}],
  "vswitches": [{"name": "vs0", "uplinks": ["vmnic0"], "portgroups": [{"name": "pg"}]}],
  "dvswitches": [{"name": "dvs", "uuid": "aa bb", "displayName": "dvs", "uplinks": ["vmnic1"],
                  "dvports": [{"key": "1", "portgroupKey": "dvpg-1"},
                              {"key": "2", "portgroupKey": "dvpg-2"}]}],
  "vms": [
    {"worldId": 7, "name": "ovm0:alpha", "ports": [
      {"switch": "vs0", "portgroup": "pg", "macs": ["00:aa:00:00:00:01", "00:aa:00:00:00:02"],
       "ipv4": "10.0.0.7", "teamUplink": "vmnic0",
       "stats": {"rxPackets": 10, "rxMulticast": 3, "rxBroadcast": 2, "rxBytes": 9000000000},
       "filters": [{"name": "f", "sortKey": "k", "outbound": true, "extended": true,
                    "packetErrors": 4}]}]},
    {"worldId": 8, "name": "b", "ports": [{"switch": "dvs", "dvport": "2", "type": 4}]}
  ],
  "ens": {"maxLcores": 2, "lcoreLimit": 8, "numaNodes": 2,
          "lcores": [{"id": 3, "switch": "vs0", "affinity": 1}]}
})";

class DatapathTest : public ::testing::Test {
protected:
  void SetUp() override {
    char pattern[] = "/tmp/ostra-dp-XXXXXX";
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

  /// The VM port of world \p world.
  std::unique_ptr<HostCtl::Network::Port> VmPort(int64_t world) {
    TvkCtl::Network::VirtualSwitchInfoImpl switches;
    for (const auto& portset : switches.GetAllSwitches())
      for (auto& port : portset->GetPorts())
        if (port->GetWorldLeader() == world)
          return std::move(port);
    return nullptr;
  }

  std::string dir_;         ///< Scratch directory.
  NetworkInfoImpl network_; ///< The root under test.
};

TEST_F(DatapathTest, VmPortsCarryTheirClientRecords) {
  auto port = VmPort(7);
  ASSERT_TRUE(port);
  auto macs = port->GetMacAddresses();
  ASSERT_EQ(macs.size(), 2u);
  EXPECT_EQ(macs[1].GetStringAddress(), "00:aa:00:00:00:02");
  EXPECT_EQ(port->GetPortClientIpv4Address().GetStringAddress(), "10.0.0.7");
  EXPECT_EQ(port->GetSchedTeamUplink(), "vmnic0");
  HostCtl::Network::PacketStats packets;
  port->GetPacketStats(packets);
  EXPECT_EQ(packets.packetsReceived, 10u);
  EXPECT_EQ(packets.broadcastPacketsReceived, 2u);
  HostCtl::Network::PortStats bytes;
  port->GetPortStats(bytes);
  EXPECT_EQ(bytes.bytesReceived, 9000000000u);
  auto filters = port->GetFilterStats();
  ASSERT_EQ(filters.size(), 1u);
  EXPECT_TRUE(filters[0]->direction);
  EXPECT_EQ(filters[0]->packetErrors, 4u);

  auto other = VmPort(8);
  ASSERT_TRUE(other);
  EXPECT_EQ(other->GetType(), 4);
  EXPECT_EQ(other->GetDVPortID(), "2");
  EXPECT_TRUE(other->GetMacAddresses().empty());
  EXPECT_EQ(other->GetPortClientIpv4Address().GetStringAddress(), "0.0.0.0");
  EXPECT_EQ(TvkCtl::Resource::WorldImpl(8).GetWorldName(), "b");
  EXPECT_THROW(TvkCtl::Resource::WorldImpl(9).GetWorldName(), HostCtlException);

  // The uplink port of a NIC, and none for a NIC that is no uplink.
  auto uplink = TvkCtl::Network::PnicImpl("vmnic0").GetPort();
  ASSERT_TRUE(uplink);
  EXPECT_EQ(uplink->GetMacAddresses().at(0).GetStringAddress(), "00:11:22:33:44:00");
}

TEST_F(DatapathTest, EnsRefusalsAnswerFalseOrThrowByTheRule) {
  EXPECT_EQ(network_.GetEnsLcores(), std::vector<int64_t>{3});
  EXPECT_EQ(network_.GetEnsLcoreSwitch(3), "vs0");
  EXPECT_EQ(network_.GetEnsLcoreAffinity(3), 1);
  // Declined by the current state: false.
  EXPECT_FALSE(network_.AddEnsLcore(3));
  EXPECT_FALSE(network_.RemoveEnsLcore(3));
  EXPECT_TRUE(network_.AddEnsLcore(0));
  EXPECT_FALSE(network_.AddEnsLcore(1));
  EXPECT_FALSE(network_.SetEnsMaxLcores(1));
  EXPECT_EQ(network_.GetEnsMaxLcores(), 2);
  // Never valid on this host: an error.
  EXPECT_THROW(network_.AddEnsLcore(8), HostCtlException);
  EXPECT_THROW(network_.AddEnsLcore(-1), HostCtlException);
  EXPECT_THROW(network_.SetEnsMaxLcores(9), HostCtlException);
  EXPECT_THROW(network_.GetEnsLcoreSwitch(5), HostCtlException);
  EXPECT_THROW(network_.SetEnsLcoreSwitch("nosuch", 0), HostCtlException);
  EXPECT_THROW(network_.SetEnsLcoreAffinity(2, 0), HostCtlException);
  EXPECT_THROW(network_.RemoveEnsLcore(4), HostCtlException);

  EXPECT_TRUE(network_.SetEnsLcoreSwitch("dvs", 0));
  EXPECT_TRUE(network_.SetEnsLcoreAffinity(1, 0));
  EXPECT_TRUE(network_.SetEnsLcoreSwitch("null", 3));
  EXPECT_TRUE(network_.SetEnsLcoreSwitch("null", 3));
  EXPECT_EQ(network_.GetEnsLcoreSwitch(3), "");
  EXPECT_TRUE(network_.RemoveEnsLcore(3));
  EXPECT_TRUE(network_.SetEnsMaxLcores(1));
  EXPECT_EQ(network_.GetEnsLcores(), std::vector<int64_t>{0});
}

TEST_F(DatapathTest, ExportThenImportKeepsVmsAndContexts) {
  Model::Store& store = Model::Store::Host();
  network_.AddEnsLcore(6);
  ordered_json first = Model::ExportHost(store);
  EXPECT_EQ(first["vms"][0]["ports"][0]["stats"]["rxBytes"], 9000000000u);
  EXPECT_EQ(first["ens"]["lcores"].size(), 2u);
  Model::ImportHost(store, first);
  EXPECT_EQ(Model::ExportHost(store), first);
}

TEST_F(DatapathTest, ImportRefusesBadVmsAndContexts) {
  Model::Store& store = Model::Store::Host();
  ordered_json base = ordered_json::parse(kHost);
  struct Case {
    const char* patch;   ///< Replaces "vms" or "ens" of the base host.
    const char* message; ///< Expected refusal.
  } cases[] = {
      {R"({"vms": [{"worldId": 1, "name": "x", "ports": [{"switch": "vs9", "portgroup": "pg"}]}]})",
       "vms[0].ports[0].switch: there is no switch named \"vs9\""},
      {R"({"vms": [{"worldId": 1, "name": "x", "ports": [{"switch": "vs0", "portgroup": "nope"}]}]})",
       "vms[0].ports[0].portgroup: switch \"vs0\" has no port group \"nope\""},
      {R"({"vms": [{"worldId": 1, "name": "x", "ports": [{"switch": "dvs", "dvport": "1"},
                                                          {"switch": "dvs", "dvport": "1"}]}]})",
       "vms[0].ports[1].dvport: distributed port \"1\" is used by another client"},
      {R"({"vms": [{"worldId": 1, "name": "x"}, {"worldId": 1, "name": "y"}]})",
       "vms[1].worldId: 1 is used by another VM"},
      {R"({"vms": [{"worldId": 1, "name": "x", "ports": [{"switch": "vs0", "portgroup": "pg",
           "teamUplink": "vmnic1"}]}]})",
       "vms[0].ports[0].teamUplink: \"vmnic1\" is no uplink of the port's switch"},
      {R"({"vms": [{"worldId": 1, "name": "x", "ports": [{"switch": "vs0", "portgroup": "pg",
           "stats": {"txPackets": 1, "txBroadcast": 2}}]}]})",
       "vms[0].ports[0].stats.txPackets: less than txMulticast and txBroadcast together"},
      {R"({"vms": [{"worldId": 1, "name": "x", "ports": [{"switch": "vs0", "portgroup": "pg",
           "stats": {"rxBytes": 18446744073709551615}}]}]})",
       "vms[0].ports[0].stats.rxBytes: expected an unsigned integer up to 9223372036854775807"},
      {R"({"ens": {"maxLcores": 1, "lcores": [{"id": 0}, {"id": 1}]}})",
       "ens.lcores: more contexts than maxLcores allows"},
      {R"({"ens": {"maxLcores": 2, "numaNodes": 1, "lcores": [{"id": 0, "affinity": 1}]}})",
       "ens.lcores[0].affinity: expected an integer in [0 - 0]"},
      {R"({"ens": {"maxLcores": 1, "lcores": [{"id": 0, "switch": "gone"}]}})",
       "ens.lcores[0].switch: there is no switch named \"gone\""},
  };
  for (const Case& c : cases) {
    ordered_json host = base;
    ordered_json patch = ordered_json::parse(c.patch);
    for (const auto& [key, value] : patch.items())
      host[key] = value;
    try {
      Model::ImportHost(store, host);
      ADD_FAILURE() << c.patch << " was imported";
    } catch (const Model::ImportError& e) {
      EXPECT_STREQ(e.what(), c.message);
    }
  }
  EXPECT_TRUE(VmPort(7));
}

TEST_F(DatapathTest, RemovingASwitchFreesItsContexts) {
  TvkCtl::Network::VirtualSwitchInfoImpl switches;
  // The port group still has a VM port: the switch cannot go yet.
  EXPECT_THROW(switches.RemoveVirtualSwitch("vs0"), HostCtlException);
  Model::Store& store = Model::Store::Host();
  ordered_json host = Model::ExportHost(store);
  host["vms"].erase(0);
  Model::ImportHost(store, host);
  switches.RemoveVirtualSwitch("vs0");
  EXPECT_EQ(network_.GetEnsLcoreSwitch(3), "");
  EXPECT_TRUE(network_.RemoveEnsLcore(3));
}

} // namespace
