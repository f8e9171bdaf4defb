//===- EthtoolWireTest.cpp - Parsing ethtool replies of real NICs ---------===//
//
// The lab's veth links lack rings, coalescing, pause, EEPROM, registers and
// self tests; their replies are read here from bytes as a NIC driver gives
// them.
//
//===----------------------------------------------------------------------===//
#include "LinuxNet/Error.h"
#include "LinuxNet/Ethtool.h"

#include <gtest/gtest.h>

#include <cerrno>

using namespace LinuxNet;
using namespace LinuxNet::EthtoolWire;

namespace {

#include "EthtoolReplies.inc"

template <std::size_t N> std::span<const uint8_t> Bytes(const uint8_t (&a)[N]) {
  return {a, N};
}

TEST(EthtoolWire, RingsChannelsPauseAndCoalescingOfANic) {
  const Rings rings = ParseRings(Bytes(kRings));
  EXPECT_EQ(rings.rxMax, 4096u);
  EXPECT_EQ(rings.txMax, 4096u);
  EXPECT_EQ(rings.rx, 512u);
  EXPECT_EQ(rings.tx, 1024u);
  EXPECT_EQ(rings.rxJumbo, 0u);

  const Channels channels = ParseChannels(Bytes(kChannels));
  EXPECT_EQ(channels.combinedMax, 63u);
  EXPECT_EQ(channels.combined, 8u);
  EXPECT_EQ(channels.other, 1u);
  EXPECT_FALSE(channels.rx.has_value()); // the driver has no separate RX channels

  const Pause pause = ParsePause(Bytes(kPause));
  EXPECT_EQ(pause.autoneg, false);
  EXPECT_EQ(pause.rx, true);
  EXPECT_EQ(pause.tx, false);

  // Only what the driver supports is present.
  const Coalesce c = ParseCoalesce(Bytes(kCoalesce));
  EXPECT_EQ(c.rxUsecs, 50u);
  EXPECT_EQ(c.txUsecs, 64u);
  EXPECT_EQ(c.rxMaxFrames, 0u);
  EXPECT_EQ(c.adaptiveRx, true);
  EXPECT_EQ(c.adaptiveTx, false);
  EXPECT_EQ(c.sampleInterval, 2u);
  EXPECT_FALSE(c.txMaxFrames.has_value());
  EXPECT_FALSE(c.pktRateHigh.has_value());
}

TEST(EthtoolWire, LinkModesWakeOnLanAndMessageLevel) {
  const LinkModes m = ParseLinkModes(Bytes(kLinkModes));
  EXPECT_EQ(m.ifindex, 3);
  EXPECT_EQ(m.device, "eth2");
  EXPECT_TRUE(m.autoneg);
  EXPECT_EQ(m.speed, 10000u);
  EXPECT_EQ(m.duplex, DuplexFull);
  EXPECT_EQ(m.supported, (std::vector<uint32_t>{3, 5, 6, 7, 12}));
  EXPECT_EQ(m.advertised, (std::vector<uint32_t>{5, 6, 12}));
  EXPECT_EQ(m.peerAdvertised, (std::vector<uint32_t>{5, 12}));
  ASSERT_NE(FindLinkMode(12), nullptr);
  EXPECT_STREQ(FindLinkMode(12)->name, "10000baseT/Full");
  EXPECT_EQ(FindLinkMode(12)->speed, 10000u);
  EXPECT_EQ(FindLinkMode(3)->duplex, DuplexFull); // 100baseT/Full
  EXPECT_EQ(FindLinkMode(6)->speed, 0u);          // Autoneg is no speed
  EXPECT_EQ(FindLinkMode(100000), nullptr);

  const WakeOnLan wol = ParseWakeOnLan(Bytes(kWol));
  EXPECT_EQ(wol.supported, 0x21u);
  EXPECT_EQ(wol.enabled, 0x20u);
  EXPECT_EQ(ParseMessageLevel(Bytes(kDebug)), 7u);
}

TEST(EthtoolWire, FeaturesFromVerboseBitsetsAndTheStringSet) {
  const auto named = ParseFeatures(Bytes(kFeatures));
  ASSERT_EQ(named.size(), 5u);
  auto find = [](const std::vector<Feature>& all, const std::string& name) {
    for (const Feature& f : all)
      if (f.name == name)
        return f;
    return Feature{"missing"};
  };
  const Feature tso6 = find(named, "tx-tcp6-segmentation");
  EXPECT_TRUE(tso6.changeable);
  EXPECT_FALSE(tso6.active);
  EXPECT_FALSE(tso6.wanted);
  const Feature ipv4 = find(named, "tx-checksum-ipv4");
  EXPECT_TRUE(ipv4.active);
  EXPECT_FALSE(ipv4.changeable); // active without being changeable: fixed on
  const Offloads o = SummarizeOffloads(named);
  EXPECT_TRUE(o.rxChecksum && o.txChecksum && o.scatterGather && o.tso);
  EXPECT_FALSE(o.tso6);
  // With the string set, fixed features that are off are listed too.
  std::vector<std::string> names(41, "");
  names[0] = "tx-scatter-gather";
  names[2] = "tx-checksum-ip-generic";
  const auto all = ParseFeatures(Bytes(kFeatures), names);
  EXPECT_EQ(find(all, "tx-checksum-ip-generic").name, "tx-checksum-ip-generic");
  EXPECT_FALSE(find(all, "tx-checksum-ip-generic").active);
}

TEST(EthtoolWire, IoctlStructuresOfDriverEepromRegistersSelfTestAndStatistics) {
  const DriverInfo info = ParseDriverInfo(Bytes(kDrvinfo));
  EXPECT_EQ(info.driver, "ixgbe");
  EXPECT_EQ(info.version, "5.19.6");
  EXPECT_EQ(info.firmwareVersion, "0x800003e2");
  EXPECT_EQ(info.busInfo, "0000:3b:00.0");
  EXPECT_EQ(info.statsCount, 100u);
  EXPECT_EQ(info.testCount, 5u);
  EXPECT_EQ(info.eepromLength, 512u);
  EXPECT_EQ(info.registerLength, 4556u);

  const auto eeprom = ParseEeprom(Bytes(kEeprom));
  ASSERT_EQ(eeprom.size(), 16u);
  EXPECT_EQ(eeprom.front(), 0x10);
  EXPECT_EQ(eeprom.back(), 0x1f);

  const RegisterDump regs = ParseRegisters(Bytes(kRegs));
  EXPECT_EQ(regs.version, 1u);
  EXPECT_EQ(regs.data, (std::vector<uint8_t>{1, 0, 0, 0, 0xef, 0xbe, 0xad, 0xde}));

  const SelfTestResult test = ParseSelfTest(Bytes(kSelfTest), Bytes(kTestNames));
  EXPECT_TRUE(test.failed);
  ASSERT_EQ(test.results.size(), 5u);
  EXPECT_EQ(test.results[3], (std::pair<std::string, uint64_t>{"Loopback test  (offline)", 1}));
  EXPECT_EQ(test.results[4].first, "Link test   (on/offline)");

  const auto stats = ParseStats(Bytes(kStats), Bytes(kStatNames));
  ASSERT_EQ(stats.size(), 3u);
  EXPECT_EQ(stats[0], (std::pair<std::string, uint64_t>{"rx_packets", 123456789012ULL}));
  EXPECT_EQ(stats[2], (std::pair<std::string, uint64_t>{"rx_missed_errors", 7}));
}

TEST(EthtoolWire, TruncatedOrCorruptRepliesAreErrorsNotCrashes) {
  // Every prefix of a reply is either refused or read without reading past it.
  for (std::size_t n = 0; n < sizeof kRings; ++n) {
    try {
      const Rings r = ParseRings({kRings, n});
      (void)r;
    } catch (const Error& e) {
      EXPECT_EQ(e.Code(), EPROTO);
    }
  }
  EXPECT_THROW(ParseRings({kRings, 10}), Error);
  std::vector<uint8_t> longer(kLinkModes, kLinkModes + sizeof kLinkModes);
  longer[0] = 0xff; // claims more bytes than there are
  EXPECT_THROW(ParseLinkModes(longer), Error);
  EXPECT_THROW(ParseDriverInfo({kDrvinfo, 20}), Error);
  // An EEPROM reply whose length word exceeds its data yields what is there.
  EXPECT_EQ(ParseEeprom({kEeprom, sizeof kEeprom - 6}).size(), 10u);
}

} // namespace
