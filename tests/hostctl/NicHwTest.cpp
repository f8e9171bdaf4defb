//===- NicHwTest.cpp - Hardware settings of the simulated NICs ------------===//
//
// Checks the NIC hardware part: import validation, export round trip, and the
// host's behaviour for every hardware operation (mask and selection
// semantics, refusals, persistence and injected faults).
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "HostCtl/Network/PnicHwRecords.h"
#include "TvkCtl/Network/DcbInfoImpl.h"
#include "TvkCtl/Network/PnicImpl.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <unistd.h>

namespace {

using HostCtl::Lib::HostCtlException;
using nlohmann::ordered_json;
using TvkCtl::Network::DcbInfoImpl;
using TvkCtl::Network::PnicImpl;
using namespace HostCtl::Network;

/// A host with two hardware-rich NICs and one NIC without hardware records.
ordered_json TestHost() {
  return ordered_json::parse(R"json({
    "nics": [
      {"name": "vmnic0", "mac": "00:50:56:00:00:01",
       "offload": {"rxChecksum": true, "txChecksum": true, "scatterGather": true, "tso": false,
                   "tso6": true, "encapOffload": true, "text": "csum sg tso6"},
       "coalesce": {"adaptiveRx": true, "sampleInterval": 4, "pktRateLow": 2000,
                    "pktRateHigh": 90000, "rxUsecs": 18, "rxMaxFrames": 32, "rxUsecsIrq": 7,
                    "txUsecsIrq": 9, "statsBlockUsecs": 1000000},
       "ring": {"maximums": {"rx": 4096, "tx": 4096, "rxJumbo": 1024},
                "current": {"rx": 1024, "tx": 1024}},
       "netqueue": {"txQueues": 4, "rxQueues": 8, "maxTxQueues": 8, "maxRxQueues": 16,
                    "balancerEnabled": true, "supportedSettings": ["RxQPair", "RSS"],
                    "allowedSettings": ["RxQPair"], "filterClasses": ["macOnly", "vxlan"],
                    "plugins": [{"module": "nqa", "plugin": "rss", "description": "Spread",
                                 "enabled": true},
                                {"module": "nqa", "plugin": "lro", "description": "Merge"},
                                {"module": "nqb", "plugin": "rss", "description": "Other"}]},
       "softwareSimulation": {"simulated": ["sg", "geneveoffload"]},
       "eeprom": {"magic": 305419896, "data": "00112233445566778899aabbccddeeff0102030405060708"},
       "registers": [1, 26, 4294967295],
       "selfTest": {"tests": [{"name": "Link", "passed": true},
                              {"name": "Loopback", "passed": false, "online": false}]},
       "dcb": {"mode": 3, "enabled": true,
               "capabilities": {"priorityGroup": true, "pgTrafficClasses": 8},
               "pfcEnabled": true, "pfcConfig": 9,
               "ieeeEts": {"willing": 1, "creditBasedShaper": "no",
                           "txBandwidth": [12, 13, 12, 13, 12, 13, 12, 13]},
               "ieeePfc": {"trafficClasses": 8, "mask": 9, "delay": 255},
               "apps": [{"appType": "Ethertype", "protocolId": "0x8906", "userPriority": "3"}]},
       "hwCap": {"supported": ["RxChecksumV4", "ScatterGather", "PortMirroring"],
                 "activated": ["ScatterGather"]}},
      {"name": "vmnic1", "mac": "00:50:56:00:00:02",
       "offload": {}, "coalesce": {}, "ring": {"maximums": {"rx": 512, "tx": 512},
                                               "current": {"rx": 512, "tx": 512}}},
      {"name": "vmnic2", "mac": "00:50:56:00:00:03"}
    ]})json");
}

class NicHwTest : public ::testing::Test {
protected:
  void SetUp() override { Load(TestHost()); }
  void TearDown() override {
    Model::Store::CloseHost();
    std::filesystem::remove_all(dir_);
  }

  /// Makes \p host the process's host.
  void Load(const ordered_json& host) {
    Model::Store::CloseHost();
    if (!dir_.empty())
      std::filesystem::remove_all(dir_);
    char pattern[] = "/tmp/nichw-test-XXXXXX";
    dir_ = ::mkdtemp(pattern);
    std::string path = dir_ + "/host.db";
    {
      auto store = Model::Store::Create(path);
      Model::ImportHost(*store, host);
    }
    Model::Store::SetPath(path);
  }

  /// A file of \p size bytes in the test directory.
  std::string File(const std::string& name, std::size_t size, char fill) {
    std::string path = dir_ + "/" + name;
    std::ofstream(path, std::ios::binary) << std::string(size, fill);
    return path;
  }

  std::string dir_;
};

/// Expects \p fn to throw HostCtlException with exactly \p message.
template <typename Fn> void ExpectRefusal(Fn fn, const std::string& message) {
  try {
    fn();
    ADD_FAILURE() << "no exception; expected: " << message;
  } catch (const HostCtlException& e) {
    EXPECT_EQ(e.what(), message);
  }
}

TEST_F(NicHwTest, ExportThenImportGivesTheSameHost) {
  ordered_json first;
  {
    Model::Store& store = Model::Store::Host();
    first = store.Read([&] { return Model::ExportHost(store); });
  }
  EXPECT_EQ(first["nics"][0]["eeprom"]["data"], "00112233445566778899aabbccddeeff0102030405060708");
  EXPECT_FALSE(first["nics"][2].contains("offload"));
  Load(first);
  Model::Store& store = Model::Store::Host();
  EXPECT_EQ(store.Read([&] { return Model::ExportHost(store); }), first);
}

TEST_F(NicHwTest, DemoNicsDifferFromEachOther) {
  Load(Model::Profile("demo"));
  PnicHwCapabilities caps0{}, caps2{};
  PnicImpl("vmnic0").GetHwCapabilities(caps0);
  PnicImpl("vmnic2").GetHwCapabilities(caps2);
  EXPECT_NE(caps0.supported, caps2.supported);
  PnicNetqueueInfo info{};
  ExpectRefusal([&] { PnicImpl("vmnic4").GetNetqueueInfo(info); },
                "vmnic4 does not support NetQueue");
  EXPECT_EQ(DcbInfoImpl("vmnic0").GetMode(), 3u);
  EXPECT_EQ(DcbInfoImpl("vmnic2").GetMode(), 2u);
}

TEST_F(NicHwTest, ImportNamesTheBadField) {
  struct Case {
    const char* key;      ///< Key of vmnic0 to replace.
    const char* value;    ///< Its new JSON.
    const char* expected; ///< Error text.
  };
  const Case cases[] = {
      {"offload", R"({"gso": true})", "nics[0].offload.gso: unknown field"},
      {"ring", R"({"maximums": {"rx": 8}, "current": {"rx": 16}})",
       "nics[0].ring.current.rx: exceeds the preset maximum"},
      {"hwCap", R"({"supported": [], "activated": ["ScatterGather"]})",
       "nics[0].hwCap.activated: names a capability that is not supported"},
      {"eeprom", R"({"magic": 1, "data": "abc"})",
       "nics[0].eeprom.data: expected pairs of hexadecimal digits"},
      {"netqueue", R"({"supportedSettings": ["Turbo"]})",
       "nics[0].netqueue.supportedSettings: unknown name \"Turbo\""},
      {"registers", R"([1, -2])", "nics[0].registers[1]: expected an integer in [0 - 4294967295]"},
      {"dcb", R"({"mode": 4})", "nics[0].dcb.mode: expected an integer in [0 - 3]"},
  };
  for (const Case& c : cases) {
    ordered_json host = TestHost();
    host["nics"][0][c.key] = ordered_json::parse(c.value);
    auto store = Model::Store::Create(dir_ + "/bad-" + c.key + ".db");
    try {
      Model::ImportHost(*store, host);
      ADD_FAILURE() << c.key << ": imported";
    } catch (const Model::ImportError& e) {
      EXPECT_EQ(e.what(), std::string(c.expected));
    }
  }
}

TEST_F(NicHwTest, ImportRefusesWhatTheHostRefuses) {
  struct Case {
    const char* key;      ///< Key of vmnic0 to replace.
    const char* value;    ///< Its new JSON.
    const char* expected; ///< Error text.
  };
  const Case refused[] = {
      {"coalesce", R"({"adaptiveTx": true})",
       "nics[0].coalesce: Adaptive coalescing on vmnic0 needs a sample interval of 1 to 3600 "
       "seconds, not 0"},
      {"coalesce", R"({"pktRateLow": 5000, "pktRateHigh": 5000})",
       "nics[0].coalesce: The low packet rate of vmnic0 (5000 pps) must be below its high packet "
       "rate (5000 pps)"},
      {"coalesce", R"({"txUsecsHigh": 4294967295})",
       "nics[0].coalesce: The coalescing high-rate TX delay time of vmnic0 must be at most "
       "2147483647, not 4294967295"},
      {"ring", R"({"maximums": {"rx": 512, "tx": 512}, "current": {"tx": 512}})",
       "nics[0].ring: The RX ring of vmnic0 needs at least one entry"},
      {"netqueue", R"({"maxTxQueues": 8, "txQueues": 0})",
       "nics[0].netqueue: The TX netqueue count of vmnic0 must be between 1 and 8, not 0"},
      {"netqueue", R"({"supportedSettings": ["RSS"], "allowedSettings": ["RSS", "MacLearnLB"]})",
       "nics[0].netqueue: vmnic0 does not support the NetQueue load balancer setting MacLearnLB, "
       "so it cannot be allowed"},
  };
  for (const Case& c : refused) {
    ordered_json host = TestHost();
    host["nics"][0][c.key] = ordered_json::parse(c.value);
    auto store = Model::Store::Create(dir_ + "/refused.db");
    EXPECT_THROW(
        {
          try {
            Model::ImportHost(*store, host);
          } catch (const Model::ImportError& e) {
            EXPECT_EQ(e.what(), std::string(c.expected));
            throw;
          }
        },
        Model::ImportError)
        << c.value;
    store.reset();
    std::filesystem::remove_all(dir_ + "/refused.db");
  }
  // What the rules allow: no rings, no queues, rates of which one is unset.
  ordered_json host = TestHost();
  host["nics"][0]["ring"] = ordered_json::parse(R"({"maximums": {}, "current": {}})");
  host["nics"][0]["netqueue"] = ordered_json::parse(R"({"supportedSettings": ["RSS"]})");
  host["nics"][0]["coalesce"] = ordered_json::parse(R"({"pktRateLow": 9000})");
  auto store = Model::Store::Create(dir_ + "/allowed.db");
  EXPECT_NO_THROW(Model::ImportHost(*store, host));
}

TEST_F(NicHwTest, OffloadSetChangesOnlyMaskedFlags) {
  PnicImpl nic("vmnic0");
  PnicOffloadSettings settings{};
  nic.GetOffloadSettings(settings);
  EXPECT_EQ(settings.mask, 0x0f);
  PnicOffloadSettings change{};
  change.mask = OffloadRxChecksum | OffloadTxChecksum;
  change.scatterGather = false; // not selected: must stay on
  change.tso = true;            // not selected: must stay off
  nic.SetOffloadSettings(change);
  PnicOffloadSettings after{};
  PnicImpl("vmnic0").GetOffloadSettings(after);
  EXPECT_FALSE(after.rxChecksum);
  EXPECT_FALSE(after.txChecksum);
  EXPECT_TRUE(after.scatterGather);
  EXPECT_FALSE(after.tso);
  EXPECT_TRUE(after.tso6);
  EXPECT_EQ(after.text, "csum sg tso6");
  change.mask = 0x10;
  ExpectRefusal([&] { nic.SetOffloadSettings(change); }, "Unknown offload mask bits 0x10");
}

TEST_F(NicHwTest, CoalesceKeepsTheWholeRecordAndChecksRates) {
  PnicImpl nic("vmnic0");
  PnicCoalesceParams params{};
  nic.GetCoalesceParams(params);
  EXPECT_EQ(params.rxUsecsIrq, 7u);
  EXPECT_EQ(params.statsBlockUsecs, 1000000u);
  params.pktRateLow = 3000;
  nic.SetCoalesceParams(params);
  PnicCoalesceParams after{};
  nic.GetCoalesceParams(after);
  EXPECT_EQ(after.pktRateLow, 3000u);
  EXPECT_EQ(after.txUsecsIrq, 9u);
  EXPECT_EQ(after.pktRateHigh, 90000u);
  params.pktRateLow = 90000;
  ExpectRefusal([&] { nic.SetCoalesceParams(params); },
                "The low packet rate of vmnic0 (90000 pps) must be below its high packet rate "
                "(90000 pps)");
  params.pktRateLow = 10;
  params.sampleInterval = 0;
  ExpectRefusal(
      [&] { nic.SetCoalesceParams(params); },
      "Adaptive coalescing on vmnic0 needs a sample interval of 1 to 3600 seconds, not 0");
  // A negative delay given to a command arrives as its low 32 bits.
  params.sampleInterval = 4;
  params.txMaxFramesHigh = static_cast<uint32_t>(-1);
  ExpectRefusal([&] { nic.SetCoalesceParams(params); },
                "The coalescing high-rate TX delay packets of vmnic0 must be at most 2147483647, "
                "not 4294967295");
  params.txMaxFramesHigh = 0x7fffffff;
  nic.SetCoalesceParams(params);
}

TEST_F(NicHwTest, RingSizesAreCheckedAgainstThePresetMaximums) {
  PnicImpl nic("vmnic0");
  PnicRingParams ring{};
  ring.rx = 4097;
  ring.tx = 512;
  ExpectRefusal([&] { nic.SetRingParams(ring); },
                "The RX ring of vmnic0 takes at most 4096 entries, not 4097");
  ring.rx = 512;
  ring.rxMini = 1;
  ExpectRefusal([&] { nic.SetRingParams(ring); },
                "vmnic0 has no RX mini ring; its size cannot be set");
  ring.rxMini = 0;
  ring.tx = 2048;
  nic.SetRingParams(ring);
  PnicRingParams max{}, cur{};
  PnicImpl("vmnic0").GetRingParams(max, cur);
  EXPECT_EQ(max.rx, 4096u);
  EXPECT_EQ(max.rxJumbo, 1024u);
  EXPECT_EQ(cur.rx, 512u);
  EXPECT_EQ(cur.rxJumbo, 0u);
  EXPECT_EQ(cur.tx, 2048u);
}

TEST_F(NicHwTest, RingSizeZeroLeavesThatRingAsItIs) {
  PnicImpl nic("vmnic0");
  PnicRingParams ring{};
  ring.tx = 1024;
  nic.SetRingParams(ring); // RX and the rings the NIC lacks stay as they are.
  PnicRingParams max{}, before{}, after{};
  nic.GetRingParams(max, before);
  EXPECT_EQ(before.tx, 1024u);
  ring = {};
  ring.rx = 256;
  nic.SetRingParams(ring);
  nic.GetRingParams(max, after);
  EXPECT_EQ(after.rx, 256u);
  EXPECT_EQ(after.tx, 1024u);
  nic.SetRingParams(PnicRingParams{});
  nic.GetRingParams(max, before);
  EXPECT_EQ(before.rx, 256u);
  EXPECT_EQ(before.tx, 1024u);
}

TEST_F(NicHwTest, NetqueueSetChangesExactlyWhatItSelects) {
  PnicImpl nic("vmnic0");
  PnicNetqueueInfo change{};
  change.txQueueCount = 2; // not selected
  change.rxCountSelected = true;
  change.rxQueueCount = 16;
  change.settingMask = 1u << 7;
  change.settingAllowed[7] = true;
  change.settingAllowed[0] = false; // not selected
  nic.SetNetqueueInfo(change);
  PnicNetqueueInfo info{};
  nic.GetNetqueueInfo(info);
  EXPECT_EQ(info.txQueueCount, 4u);
  EXPECT_EQ(info.rxQueueCount, 16u);
  EXPECT_TRUE(info.settingAllowed[0]);
  EXPECT_TRUE(info.settingAllowed[7]);
  EXPECT_TRUE(info.balancerEnabled);
  EXPECT_TRUE(info.filterClasses[0]);
  EXPECT_TRUE(info.filterClasses[3]);
  EXPECT_FALSE(info.filterClasses[4]);

  PnicNetqueueInfo bad{};
  bad.txCountSelected = true;
  bad.txQueueCount = 9;
  ExpectRefusal([&] { nic.SetNetqueueInfo(bad); },
                "The TX netqueue count of vmnic0 must be between 1 and 8, not 9");
  bad = {};
  bad.settingMask = 1u << 8;
  bad.settingAllowed[8] = true;
  ExpectRefusal([&] { nic.SetNetqueueInfo(bad); },
                "vmnic0 does not support the NetQueue load balancer setting LRO");
  bad.settingMask = 1u << 11;
  ExpectRefusal([&] { nic.SetNetqueueInfo(bad); },
                "Unknown NetQueue load balancer setting mask 0x800");
}

TEST_F(NicHwTest, NetqueuePluginsAndBalancerState) {
  PnicImpl nic("vmnic0");
  PnicNetqueueInfo change{};
  change.pluginStateSelected = true;
  change.pluginEnabled = true;
  change.changedPlugins.push_back({"nqb", "rss", ""});
  change.balancerStateSelected = true;
  change.balancerEnabled = false;
  nic.SetNetqueueInfo(change);
  change = {};
  change.pluginStateSelected = true;
  change.pluginEnabled = false;
  change.changedPlugins.push_back({"nqa", "rss", ""});
  nic.SetNetqueueInfo(change);
  PnicNetqueueInfo info{};
  nic.GetNetqueueInfo(info);
  ASSERT_EQ(info.changedPlugins.size(), 1u);
  EXPECT_EQ(info.changedPlugins[0].moduleName, "nqb");
  EXPECT_EQ(info.changedPlugins[0].description, "Other");
  EXPECT_FALSE(info.balancerEnabled);
  ASSERT_EQ(info.plugins.size(), 3u);

  change.changedPlugins = {{"nqb", "lro", ""}};
  ExpectRefusal([&] { nic.SetNetqueueInfo(change); },
                "vmnic0 has no NetQueue balancer plugin lro in module nqb");
}

TEST_F(NicHwTest, SoftwareSimulationAppliesTheMask) {
  PnicImpl nic("vmnic0");
  PnicSoftwareSimulation change{};
  change.mask = 0x2001; // IPv4 CSO on, Geneve off
  change.features[0] = true;
  change.features[2] = false; // not selected
  nic.SetSoftwareSimulation(change);
  PnicSoftwareSimulation after{};
  nic.GetSoftwareSimulation(after);
  EXPECT_TRUE(after.features[0]);
  EXPECT_TRUE(after.features[2]);
  EXPECT_FALSE(after.features[13]);
  change.mask = 1u << 14;
  ExpectRefusal([&] { nic.SetSoftwareSimulation(change); },
                "Unknown software simulation mask 0x4000");
}

TEST_F(NicHwTest, EepromReadsAndWrites) {
  PnicImpl nic("vmnic0");
  std::vector<uint8_t> data;
  nic.GetEepromDump(data, 3, 0x10);
  EXPECT_EQ(data, (std::vector<uint8_t>{0x01, 0x02, 0x03}));
  nic.GetEepromDump(data, 0, 24);
  EXPECT_TRUE(data.empty());
  ExpectRefusal([&] { nic.GetEepromDump(data, 2, 23); },
                "The EEPROM of vmnic0 has 24 bytes; cannot read 2 bytes at offset 0x17");

  ExpectRefusal([&] { nic.SetEepromValue(1, 0, 0); }, "Wrong magic key for the EEPROM of vmnic0");
  ExpectRefusal([&] { nic.SetEepromValue(0x12345678, 21, 0); },
                "The EEPROM of vmnic0 has 24 bytes; cannot write a double word at offset 0x15");
  nic.SetEepromValue(0x12345678, 4, 0xa1b2c3d4);
  nic.GetEepromDump(data, 6, 3);
  EXPECT_EQ(data, (std::vector<uint8_t>{0x33, 0xd4, 0xc3, 0xb2, 0xa1, 0x88}));
}

TEST_F(NicHwTest, EepromFromFile) {
  PnicImpl nic("vmnic0");
  ExpectRefusal([&] { nic.SetEepromFromFile(0x12345678, dir_ + "/missing.bin"); },
                "Cannot read EEPROM file " + dir_ + "/missing.bin: No such file or directory");
  ExpectRefusal([&] { nic.SetEepromFromFile(0x12345678, dir_); },
                "Cannot read EEPROM file " + dir_ + ": not a regular file");
  std::string big = File("big.bin", 25, 'x');
  ExpectRefusal([&] { nic.SetEepromFromFile(0x12345678, big); },
                "EEPROM file " + big + " holds 25 bytes; the EEPROM of vmnic0 has 24");
  std::string small = File("small.bin", 2, '\x7f');
  ExpectRefusal([&] { nic.SetEepromFromFile(7, small); },
                "Wrong magic key for the EEPROM of vmnic0");
  nic.SetEepromFromFile(0x12345678, small);
  std::vector<uint8_t> data;
  nic.GetEepromDump(data, 3, 0);
  EXPECT_EQ(data, (std::vector<uint8_t>{0x7f, 0x7f, 0x22}));
}

TEST_F(NicHwTest, RegistersAndSelfTest) {
  PnicImpl nic("vmnic0");
  std::vector<uint32_t> words;
  nic.GetRegisterDump(words);
  EXPECT_EQ(words, (std::vector<uint32_t>{1, 26, 4294967295u}));

  PnicSelfTestResult result{};
  nic.RunSelfTest(result, true);
  EXPECT_FALSE(result.failed);
  EXPECT_EQ(result.info, (std::vector<std::string>{"Link: passed"}));
  nic.RunSelfTest(result, false);
  EXPECT_TRUE(result.failed);
  EXPECT_EQ(result.info, (std::vector<std::string>{"Link: passed", "Loopback: failed"}));
}

TEST_F(NicHwTest, DcbState) {
  DcbInfoImpl dcb("vmnic0");
  EXPECT_EQ(dcb.GetMode(), 3u);
  EXPECT_TRUE(dcb.IsEnabled());
  EXPECT_TRUE(dcb.GetCapabilities().priorityGroup);
  EXPECT_EQ(dcb.GetCapabilities().pgTrafficClasses, 8);
  EXPECT_EQ(dcb.GetPfcConfig(), 9);
  EXPECT_EQ(dcb.GetIeeeEtsConfig().txBandwidth[1], 13);
  EXPECT_EQ(dcb.GetIeeeEtsConfig().creditBasedShaper, "no");
  EXPECT_EQ(dcb.GetIeeePfcConfig().delay, 255);
  ASSERT_EQ(dcb.GetAppInfo().size(), 1u);
  EXPECT_EQ(dcb.GetAppInfo()[0].protocolId, "0x8906");
  ExpectRefusal([] { DcbInfoImpl("vmnic2").GetMode(); }, "vmnic2 does not support DCB");
  ExpectRefusal([] { DcbInfoImpl("vmnic9").IsEnabled(); },
                "There is no physical NIC named vmnic9 on this host");
}

TEST_F(NicHwTest, HardwareCapabilities) {
  PnicHwCapabilities caps{};
  PnicImpl("vmnic0").GetHwCapabilities(caps);
  EXPECT_EQ(caps.supported, (1ull << 0) | (1ull << 6) | (1ull << 33));
  EXPECT_EQ(caps.activated, 1ull << 6);
  EXPECT_EQ(PnicImpl::GetHwCapName(6), "ScatterGather");
  EXPECT_EQ(PnicImpl::GetHwCapName(63), "");
}

TEST_F(NicHwTest, MissingRecordsAndNicsAreRefused) {
  PnicImpl bare("vmnic2");
  PnicCoalesceParams params{};
  ExpectRefusal([&] { bare.GetCoalesceParams(params); },
                "vmnic2 does not support interrupt coalescing");
  PnicNetqueueInfo info{};
  ExpectRefusal([&] { PnicImpl("vmnic1").GetNetqueueInfo(info); },
                "vmnic1 does not support NetQueue");
  std::vector<uint32_t> words;
  ExpectRefusal([&] { PnicImpl("vmnic7").GetRegisterDump(words); },
                "There is no physical NIC named vmnic7 on this host");
}

TEST_F(NicHwTest, DeclaredFaultsFailTheNamedOperation) {
  ordered_json host = TestHost();
  host["faults"] = ordered_json::parse(R"([
      {"operation": "GetOffloadSettings", "object": "vmnic1", "message": "offload read broke"},
      {"operation": "GetIeeePfcConfig", "object": "*", "message": "pfc broke"}])");
  Load(host);
  PnicOffloadSettings settings{};
  PnicImpl("vmnic0").GetOffloadSettings(settings);
  ExpectRefusal([&] { PnicImpl("vmnic1").GetOffloadSettings(settings); }, "offload read broke");
  EXPECT_EQ(DcbInfoImpl("vmnic0").GetMode(), 3u);
  ExpectRefusal([] { DcbInfoImpl("vmnic0").GetIeeePfcConfig(); }, "pfc broke");
}

} // namespace
