//===- EthtoolTest.cpp - Driver settings of veth links against ethtool ----===//
#include "Lab.h"

#include "LinuxNet/Error.h"
#include "LinuxNet/Ethtool.h"

#include <cerrno>
#include <functional>
#include <map>
#include <sstream>

using namespace LinuxNet;
using namespace LinuxNetTest;

namespace {

class EthtoolTest : public LabTest {
protected:
  /// "key: value" lines of an ethtool report, keys trimmed; a key seen twice
  /// is numbered ("RX", "RX#2").
  std::map<std::string, std::string> Report(const std::string& args) {
    const Output out = Exec("ethtool " + args);
    EXPECT_EQ(out.status, 0) << "ethtool " << args;
    std::map<std::string, std::string> values;
    std::istringstream lines(out.out);
    for (std::string line; std::getline(lines, line);) {
      const auto colon = line.find(':');
      if (colon == std::string::npos)
        continue;
      auto trim = [](std::string s) {
        const auto a = s.find_first_not_of(" \t");
        const auto b = s.find_last_not_of(" \t");
        return a == std::string::npos ? std::string() : s.substr(a, b - a + 1);
      };
      std::string key = trim(line.substr(0, colon));
      if (values.count(key))
        key += "#2";
      values[key] = trim(line.substr(colon + 1));
    }
    return values;
  }
};

TEST_F(EthtoolTest, DriverInformationMatchesEthtoolI) {
  const DriverInfo info = GetDriverInfo(*ns_, "vmnic0");
  auto oracle = Report("-i vmnic0");
  EXPECT_EQ(info.driver, "veth");
  EXPECT_EQ(info.driver, oracle["driver"]);
  EXPECT_EQ(info.version, oracle["version"]);
  EXPECT_EQ(info.firmwareVersion, oracle["firmware-version"]);
  EXPECT_EQ(info.busInfo, oracle["bus-info"]);
  EXPECT_EQ(info.statsCount > 0, oracle["supports-statistics"] == "yes");
  EXPECT_EQ(info.eepromLength > 0, oracle["supports-eeprom-access"] == "yes");
  EXPECT_EQ(info.registerLength > 0, oracle["supports-register-dump"] == "yes");
}

TEST_F(EthtoolTest, LinkSettingsMatchEthtoolAndTheDump) {
  const LinkSettings settings = GetLinkSettings(*ns_, "vmnic0");
  auto oracle = Report("vmnic0");
  EXPECT_EQ(std::to_string(settings.modes.speed) + "Mb/s", oracle["Speed"]);
  EXPECT_EQ(settings.modes.duplex == DuplexFull ? "Full" : "Half", oracle["Duplex"]);
  EXPECT_EQ(settings.modes.autoneg ? "on" : "off", oracle["Auto-negotiation"]);
  ASSERT_TRUE(settings.info);
  EXPECT_EQ(settings.info->port == PortTp ? "Twisted Pair" : "other", oracle["Port"]);
  EXPECT_EQ(std::to_string(settings.info->phyAddress), oracle["PHYAD"]);
  EXPECT_EQ(settings.info->transceiver == 0 ? "internal" : "external", oracle["Transceiver"]);
  ASSERT_TRUE(settings.link);
  EXPECT_EQ(*settings.link ? "yes" : "no", oracle["Link detected"]);
  // vmnic1's peer is down: no link.
  EXPECT_EQ(GetLinkSettings(*ns_, "vmnic1").link, std::optional<bool>(false));

  const auto all = DumpLinkModes(*ns_);
  std::map<std::string, LinkModes> byName;
  for (const LinkModes& m : all)
    byName[m.device] = m;
  ASSERT_TRUE(byName.count("vmnic0"));
  EXPECT_EQ(byName["vmnic0"].speed, settings.modes.speed);
  EXPECT_EQ(byName["vmnic0"].duplex, settings.modes.duplex);
  EXPECT_EQ(byName["vmnic0"].ifindex, IpJson("link show vmnic0")[0]["ifindex"]);
  EXPECT_TRUE(byName.count("peer1"));
  // The loopback device has no link settings and is left out.
  EXPECT_FALSE(byName.count("lo"));
}

TEST_F(EthtoolTest, FeaturesMatchEthtoolJsonAndChangesReachTheKernel) {
  const auto features = GetFeatures(*ns_, "vmnic0");
  const auto oracle = nlohmann::json::parse(Exec("ethtool --json -k vmnic0").out)[0];
  int compared = 0;
  for (const Feature& f : features) {
    if (!oracle.contains(f.name))
      continue;
    SCOPED_TRACE(f.name);
    const auto& j = oracle[f.name];
    EXPECT_EQ(f.active, j["active"].get<bool>());
    EXPECT_EQ(f.changeable, !j["fixed"].get<bool>());
    EXPECT_EQ(f.wanted, j["requested"].get<bool>());
    ++compared;
  }
  EXPECT_GT(compared, 30);
  const Offloads groups = SummarizeOffloads(features);
  EXPECT_EQ(groups.rxChecksum, oracle["rx-checksumming"]["active"].get<bool>());
  EXPECT_EQ(groups.txChecksum, oracle["tx-checksumming"]["active"].get<bool>());
  EXPECT_EQ(groups.scatterGather, oracle["scatter-gather"]["active"].get<bool>());
  EXPECT_EQ(groups.tso, oracle["tcp-segmentation-offload"]["active"].get<bool>());

  SetOffload(*ns_, "vmnic0", OffloadGroup::Tso, false);
  SetOffload(*ns_, "vmnic0", OffloadGroup::ScatterGather, false);
  auto after = nlohmann::json::parse(Exec("ethtool --json -k vmnic0").out)[0];
  EXPECT_FALSE(after["tcp-segmentation-offload"]["active"].get<bool>());
  EXPECT_FALSE(after["scatter-gather"]["active"].get<bool>());
  SetFeatures(*ns_, "vmnic0", {{"tx-scatter-gather", true}, {"tx-tcp-segmentation", true}});
  after = nlohmann::json::parse(Exec("ethtool --json -k vmnic0").out)[0];
  EXPECT_TRUE(after["tx-tcp-segmentation"]["active"].get<bool>());
  EXPECT_FALSE(after["tx-tcp6-segmentation"]["active"].get<bool>());

  try {
    SetFeatures(*ns_, "vmnic0", {{"tx-checksum-ipv4", true}});
    ADD_FAILURE() << "a fixed feature was changed";
  } catch (const Error& e) {
    EXPECT_EQ(e.Code(), EOPNOTSUPP);
    EXPECT_STREQ(e.what(), "vmnic0: the driver veth cannot turn tx-checksum-ipv4 on");
  }
  EXPECT_THROW(SetFeatures(*ns_, "vmnic0", {{"no-such-feature", true}}), Error);
}

TEST_F(EthtoolTest, ChannelsMatchEthtoolL) {
  Channels change;
  change.rx = 2;
  change.tx = 3;
  SetChannels(*ns_, "vmnic1", change);
  const Channels c = GetChannels(*ns_, "vmnic1");
  auto oracle = Report("-l vmnic1");
  EXPECT_EQ(std::to_string(c.rxMax), oracle["RX"]);
  EXPECT_EQ(std::to_string(c.txMax), oracle["TX"]);
  EXPECT_EQ(std::to_string(c.rx.value_or(0)), oracle["RX#2"]);
  EXPECT_EQ(std::to_string(c.tx.value_or(0)), oracle["TX#2"]);
  EXPECT_EQ(c.rx, 2u);
  EXPECT_EQ(c.tx, 3u);
  change.rx = 9;
  try {
    SetChannels(*ns_, "vmnic1", change);
    ADD_FAILURE() << "9 RX channels of 4 were taken";
  } catch (const Error& e) {
    EXPECT_EQ(e.Code(), EINVAL);
    EXPECT_EQ(std::string(e.what()).rfind("vmnic1: ", 0), 0u) << e.what();
  }
}

TEST_F(EthtoolTest, DriverStatisticsMatchEthtoolS) {
  const auto stats = GetDriverStats(*ns_, "vmnic1");
  auto oracle = Report("-S vmnic1");
  ASSERT_FALSE(stats.empty());
  for (const auto& [name, value] : stats) {
    ASSERT_TRUE(oracle.count(name)) << name;
    EXPECT_EQ(std::to_string(value), oracle[name]) << name;
  }
  EXPECT_EQ(stats.size() + 1, oracle.size()); // and the "NIC statistics" title
}

TEST_F(EthtoolTest, WhatVethLacksIsRefusedNamingTheDriver) {
  struct Case {
    const char* what;
    std::function<void()> call;
  };
  const std::string dev = "vmnic0";
  const Case cases[] = {
      {"ring parameters", [&] { GetRings(*ns_, dev); }},
      {"ring parameters",
       [&] {
         SetRings(*ns_, dev, Rings{0, 0, 0, 0, 512, {}, {}, 512});
       }},
      {"interrupt coalescing", [&] { GetCoalesce(*ns_, dev); }},
      {"interrupt coalescing",
       [&] {
         Coalesce c;
         c.rxUsecs = 10;
         SetCoalesce(*ns_, dev, c);
       }},
      {"pause parameters", [&] { GetPause(*ns_, dev); }},
      {"pause parameters",
       [&] {
         SetPause(*ns_, dev, Pause{false, true, true});
       }},
      {"EEPROM access", [&] { ReadEeprom(*ns_, dev, 0, 16); }},
      {"EEPROM access",
       [&] {
         WriteEeprom(*ns_, dev, 0x1234, 0, {1, 2});
       }},
      {"register dumps", [&] { DumpRegisters(*ns_, dev); }},
      {"self tests", [&] { RunSelfTest(*ns_, dev, false); }},
      {"restarting autonegotiation", [&] { RestartNegotiation(*ns_, dev); }},
      {"wake-on-LAN", [&] { SetWakeOnLan(*ns_, dev, 32); }},
      {"message levels", [&] { SetMessageLevel(*ns_, dev, 1); }},
  };
  for (const Case& c : cases) {
    try {
      c.call();
      ADD_FAILURE() << c.what << ": no error";
    } catch (const Error& e) {
      EXPECT_EQ(e.Code(), EOPNOTSUPP) << e.what();
      EXPECT_EQ(std::string(e.what()),
                "vmnic0: the driver veth does not support " + std::string(c.what));
    }
  }
  // The same requests on a link that does not exist say so.
  for (auto call : {std::function<void()>([&] { GetRings(*ns_, "nosuch0"); }),
                    std::function<void()>([&] { GetDriverInfo(*ns_, "nosuch0"); }),
                    std::function<void()>([&] { DumpRegisters(*ns_, "nosuch0"); })}) {
    try {
      call();
      ADD_FAILURE() << "no error for a missing link";
    } catch (const Error& e) {
      EXPECT_EQ(e.Code(), ENODEV);
      EXPECT_STREQ(e.what(), "the link nosuch0 does not exist");
    }
  }
}

} // namespace
