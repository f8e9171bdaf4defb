//===- LinksTest.cpp - Links and bridges against ip and bridge ------------===//
#include "Lab.h"

#include "LinuxNet/Error.h"
#include "LinuxNet/Links.h"

#include <cerrno>
#include <map>

using namespace LinuxNet;
using namespace LinuxNetTest;

namespace {

using LinksTest = LabTest;

TEST_F(LinksTest, ListMatchesIpLinkShow) {
  const auto oracle = IpJson("-details -stats link show");
  const auto links = ListLinks(*ns_);
  ASSERT_EQ(links.size(), oracle.size());
  std::map<std::string, nlohmann::json> byName;
  for (const auto& j : oracle)
    byName[j["ifname"]] = j;
  for (const Link& link : links) {
    SCOPED_TRACE(link.name);
    ASSERT_TRUE(byName.count(link.name));
    const auto& j = byName[link.name];
    EXPECT_EQ(link.index, j["ifindex"]);
    EXPECT_EQ(link.mtu, j["mtu"]);
    EXPECT_EQ(link.minMtu, j.value("min_mtu", 0u));
    EXPECT_EQ(link.maxMtu, j.value("max_mtu", 0u));
    EXPECT_EQ(FormatHwAddress(link.address), j["address"]);
    EXPECT_EQ(OperStateName(link.operState), j["operstate"]);
    const auto& flags = j["flags"];
    EXPECT_EQ(link.adminUp, std::find(flags.begin(), flags.end(), "UP") != flags.end());
    EXPECT_EQ(link.lowerUp, std::find(flags.begin(), flags.end(), "LOWER_UP") != flags.end());
    EXPECT_EQ(link.txQueueLength, j.value("txqlen", 0u));
    EXPECT_EQ(link.numTxQueues, j["num_tx_queues"]);
    EXPECT_EQ(link.numRxQueues, j["num_rx_queues"]);
    const std::string kind = j.contains("linkinfo") ? j["linkinfo"].value("info_kind", "") : "";
    EXPECT_EQ(link.kind, kind);
    const std::string slaveKind =
        j.contains("linkinfo") ? j["linkinfo"].value("info_slave_kind", "") : "";
    EXPECT_EQ(link.slaveKind, slaveKind);
    if (j.contains("master")) {
      EXPECT_EQ(byName[j["master"]]["ifindex"], link.master);
    } else {
      EXPECT_EQ(link.master, 0);
    }
    ASSERT_TRUE(link.hasStats);
    // Counters of links that are up may move between the two reads.
    const uint64_t rx = j["stats64"]["rx"]["packets"], tx = j["stats64"]["tx"]["packets"];
    EXPECT_GE(link.stats.rxPackets, rx);
    EXPECT_LE(link.stats.rxPackets, rx + 20);
    EXPECT_GE(link.stats.txPackets, tx);
    EXPECT_LE(link.stats.txPackets, tx + 20);
    if (!link.adminUp) {
      EXPECT_EQ(link.stats.txBytes, j["stats64"]["tx"]["bytes"]);
    }
  }
}

TEST_F(LinksTest, GetLinkFindsOneAndMissesAMissingOne) {
  auto link = GetLink(*ns_, "vmnic1");
  ASSERT_TRUE(link);
  EXPECT_EQ(link->kind, "veth");
  EXPECT_FALSE(link->adminUp);
  EXPECT_EQ(link->numRxQueues, 4u);
  // A veth's IFLA_LINK is its peer.
  EXPECT_EQ(link->link, IpJson("link show peer1")[0]["ifindex"]);
  EXPECT_FALSE(GetLink(*ns_, "nosuch0").has_value());
}

TEST_F(LinksTest, ChangesReachTheKernel) {
  LinkChange change;
  change.up = true;
  change.mtu = 1400;
  change.alias = "uplink one";
  change.address = ParseHwAddress("02:11:22:33:44:55");
  ChangeLink(*ns_, "vmnic1", change);
  auto j = IpJson("link show vmnic1")[0];
  EXPECT_EQ(j["mtu"], 1400);
  EXPECT_EQ(j["ifalias"], "uplink one");
  EXPECT_EQ(j["address"], "02:11:22:33:44:55");
  EXPECT_NE(std::find(j["flags"].begin(), j["flags"].end(), "UP"), j["flags"].end());

  LinkChange back;
  back.up = false;
  back.alias = "";
  back.name = "vmnic7";
  ChangeLink(*ns_, "vmnic1", back);
  j = IpJson("link show vmnic7")[0];
  EXPECT_EQ(j["operstate"], "DOWN");
  EXPECT_FALSE(j.contains("ifalias"));
}

TEST_F(LinksTest, RefusalsNameTheLinkAndTheReason) {
  LinkChange huge;
  huge.mtu = 70000;
  try {
    ChangeLink(*ns_, "vmnic1", huge);
    ADD_FAILURE() << "an MTU of 70000 was taken";
  } catch (const Error& e) {
    EXPECT_EQ(e.Code(), EINVAL);
    EXPECT_EQ(std::string(e.what()).rfind("vmnic1: ", 0), 0u) << e.what();
  }
  EXPECT_EQ(IpJson("link show vmnic1")[0]["mtu"], 1500);
  ExpectError([&] { ChangeLink(*ns_, "nosuch0", huge); }, ENODEV,
              "the link nosuch0 does not exist");
  ExpectError([&] { CreateVeth(*ns_, "vmnic0", "peer9"); }, EEXIST, "vmnic0: already exists");
  ExpectError([&] { DeleteLink(*ns_, "nosuch0"); }, ENODEV, "the link nosuch0 does not exist");
  LinkChange rename;
  rename.name = "peer0";
  ExpectError([&] { ChangeLink(*ns_, "vmnic1", rename); }, EEXIST,
              "vmnic1: the name peer0 is taken");
  EXPECT_FALSE(GetLink(*ns_, "a-name-longer-than-fifteen").has_value());
}

TEST_F(LinksTest, BridgesAndTheirPortsAgreeWithBridgeLink) {
  CreateBridge(*ns_, "br9", 1400);
  auto br = IpJson("-details link show br9")[0];
  EXPECT_EQ(br["linkinfo"]["info_kind"], "bridge");
  EXPECT_EQ(br["mtu"], 1400);

  AddBridgePort(*ns_, "br9", "vmnic1");
  const Output ports = Shell("bridge -n " + name_ + " -json link show");
  std::map<std::string, std::string> masters;
  for (const auto& p : nlohmann::json::parse(ports.out))
    masters[p["ifname"]] = p["master"];
  EXPECT_EQ(masters["vmnic1"], "br9");
  EXPECT_EQ(masters["vmnic0"], "br0");
  EXPECT_EQ(BridgePorts(*ns_, "br9"), std::vector<std::string>{"vmnic1"});
  EXPECT_EQ(BridgePorts(*ns_, "br0"), std::vector<std::string>{"vmnic0"});

  ExpectError([&] { AddBridgePort(*ns_, "vmnic0", "peer1"); }, EINVAL, "vmnic0 is not a bridge");
  RemoveBridgePort(*ns_, "vmnic1");
  EXPECT_FALSE(IpJson("link show vmnic1")[0].contains("master"));
  ExpectError([&] { RemoveBridgePort(*ns_, "vmnic1"); }, EINVAL,
              "vmnic1 is not a port of a bridge");

  CreateVeth(*ns_, "vmnic5", "peer5");
  EXPECT_EQ(IpJson("-details link show peer5")[0]["linkinfo"]["info_kind"], "veth");
  DeleteLink(*ns_, "vmnic5");
  DeleteLink(*ns_, "br9");
  EXPECT_EQ(IpJson("link show").size(), 6u);
}

#include "LinkReplies.inc"

TEST(LinkMessage, SriovFunctionsParentDeviceAndOlderCounters) {
  const Link link = ParseLinkMessage({kSriovLink, sizeof kSriovLink});
  EXPECT_EQ(link.name, "eth2");
  EXPECT_EQ(link.index, 3);
  EXPECT_EQ(link.mtu, 9000u);
  EXPECT_TRUE(link.adminUp);
  EXPECT_TRUE(link.lowerUp);
  EXPECT_TRUE(link.carrier);
  EXPECT_EQ(link.operState, OperState::Up);
  EXPECT_EQ(FormatHwAddress(link.address), "3c:fd:fe:12:34:56");
  EXPECT_EQ(link.permAddress, link.address);
  EXPECT_EQ(link.parentDevice, "0000:3b:00.0");
  EXPECT_EQ(link.parentBus, "pci");
  EXPECT_EQ(link.kind, "");
  EXPECT_EQ(link.altNames, std::vector<std::string>{"enp59s0f0"});
  // 23 counters of an older kernel: those it sent, and zero for the rest.
  ASSERT_TRUE(link.hasStats);
  EXPECT_EQ(link.stats.rxPackets, 1000u);
  EXPECT_EQ(link.stats.txWindowErrors, 1020u);
  EXPECT_EQ(link.stats.txCompressed, 1022u);
  EXPECT_EQ(link.stats.rxNoHandler, 0u);

  EXPECT_EQ(link.numVfs, 2u);
  ASSERT_EQ(link.vfs.size(), 2u);
  const VfInfo& vf0 = link.vfs[0];
  EXPECT_EQ(vf0.index, 0u);
  EXPECT_EQ(FormatHwAddress(vf0.mac), "02:00:00:00:00:10");
  EXPECT_EQ(vf0.vlan, 100u);
  EXPECT_EQ(vf0.qos, 3u);
  EXPECT_EQ(vf0.maxTxRate, 1000u);
  EXPECT_EQ(vf0.spoofCheck, 1);
  EXPECT_EQ(vf0.trust, 0);
  EXPECT_EQ(vf0.linkState, 2u);
  ASSERT_TRUE(vf0.hasStats);
  EXPECT_EQ(vf0.rxPackets, 10u);
  EXPECT_EQ(vf0.txBytes, 2000u);
  EXPECT_EQ(link.vfs[1].index, 1u);
  EXPECT_EQ(link.vfs[1].trust, 1);

  EXPECT_THROW(ParseLinkMessage({kSriovLink, 20}), Error);
  std::vector<uint8_t> lying(kSriovLink, kSriovLink + sizeof kSriovLink);
  lying[1] = 0x7f; // a length beyond the bytes
  EXPECT_THROW(ParseLinkMessage(lying), Error);
}

} // namespace
