//===- IpModelTest.cpp - Netstacks, kernel interfaces and IP configuration -===//
//
// Host-library tests of the IP area on a small imported host: one standard
// switch with three port groups and a small MTU, a distributed switch with
// two ports, the default and one service netstack, and two interfaces.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "HostCtl/Network/Switching.h"
#include "TvkCtl/Network/NetstackInstanceImpl.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/Switching.h"
#include "TvkCtl/Network/TvkNicImpl.h"
#include "TvkCtl/Util.h"
#include "model/CoreModel.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <string>

namespace {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::IpConfig;
using HostCtl::Network::Ipv4Address;
using HostCtl::Network::Ipv6Address;
using HostCtl::Network::Ipv6Network;
using HostCtl::Network::MacAddress;
using HostCtl::Network::TvkNic;
using TvkCtl::Network::NetstackInstanceImpl;
using TvkCtl::Network::NetworkInfoImpl;
using TvkCtl::Network::PortGroupImpl;
using TvkCtl::Network::TvKernelNicInfoImpl;

const char* const kHost = R"json({
  "nics": [{"name": "vmnic0", "mac": "0c:42:a1:00:00:01"}],
  "vswitches": [{"name": "sw0", "ports": 8, "mtu": 1500, "uplinks": ["vmnic0"],
                 "portgroups": [{"name": "Mgmt"}, {"name": "Spare"}, {"name": "Third"}]}],
  "dvswitches": [{"name": "dvs0", "uuid": "aa bb", "mtu": 9000,
                  "dvports": [{"key": "1"}, {"key": "2"}]}],
  "netstacks": [{"key": "driftway"}, {"key": "cold", "enabled": false}],
  "interfaces": [
    {"name": "tvk0", "portgroup": "Mgmt", "mac": "02:00:00:00:00:10", "ipv4Type": "static",
     "ipv4Address": "10.0.0.5", "ipv4Netmask": "255.255.255.0", "ipv4Gateway": "10.0.0.1",
     "tags": ["HostConsole"]},
    {"name": "tvk1", "netstack": "driftway", "dvs": "dvs0", "dvport": "1",
     "mac": "02:00:00:00:00:11", "mtu": 9000, "tags": ["Driftway"]}
  ]
})json";

class IpModelTest : public ::testing::Test {
protected:
  void SetUp() override {
    path_ = ::testing::TempDir() + "ipmodel-" +
            ::testing::UnitTest::GetInstance()->current_test_info()->name() + ".db";
    std::remove(path_.c_str());
    {
      std::unique_ptr<Model::Store> store = Model::Store::Create(path_);
      Model::ImportHost(*store, nlohmann::ordered_json::parse(kHost));
    }
    Model::Store::SetPath(path_);
  }
  void TearDown() override {
    Model::Store::CloseHost();
    for (const char* suffix : {"", "-wal", "-shm"})
      std::remove((path_ + suffix).c_str());
  }

  /// Runs \p fn and expects a refusal whose message contains \p text.
  template <typename Fn> void ExpectRefused(Fn&& fn, const std::string& text) {
    try {
      fn();
      ADD_FAILURE() << "not refused: " << text;
    } catch (const HostCtlException& e) {
      EXPECT_NE(std::string(e.what()).find(text), std::string::npos) << e.what();
    }
  }

  std::unique_ptr<TvkNic> Nic(const std::string& name) {
    auto nic = service_.GetTvKernelNicByInterface(name, false, 0);
    EXPECT_TRUE(nic) << name;
    return nic;
  }

  std::string Query(const std::string& sql) {
    Model::Store& store = Model::Store::Host();
    return store.Read([&] {
      Model::Statement row = store.Prepare(sql.c_str());
      return row.Step() ? row.Text(0) : std::string("<none>");
    });
  }

  std::string path_;            ///< Store file of the test.
  TvKernelNicInfoImpl service_; ///< Kernel interface service.
};

TEST_F(IpModelTest, ImportAddsTheDefaultNetstackAndRefusesBadInterfaces) {
  NetworkInfoImpl info;
  auto stacks = info.ListNetstackInstances();
  ASSERT_EQ(3u, stacks.size());
  EXPECT_EQ("defaultTcpipStack", stacks[0]->GetKey());
  EXPECT_EQ(4660u, stacks[0]->GetState());
  EXPECT_EQ(0u, info.GetNetstackInstanceState("cold"));

  const std::vector<std::pair<std::string, std::string>> bad = {
      {R"({"interfaces": [{"name": "tvk01"}]})", "interfaces[0].name"},
      {R"({"interfaces": [{"name": "tvk1", "netstack": "nope"}]})", "interfaces[0].netstack"},
      {R"({"interfaces": [{"name": "tvk1", "portgroup": "nope"}]})", "interfaces[0].portgroup"},
      {R"({"interfaces": [{"name": "tvk1", "ipv4Type": "static", "ipv4Address": "10.0.0.0",
           "ipv4Netmask": "255.255.255.0"}]})",
       "interfaces[0].ipv4Address"},
      {R"({"interfaces": [{"name": "tvk1", "mac": "02:00:00:00:00:01"},
                          {"name": "tvk2", "mac": "02:00:00:00:00:01"}]})",
       "interfaces[1].mac"},
      {R"({"netstacks": [{"key": "defaultTcpipStack", "enabled": false}]})",
       "netstacks[0].enabled"},
      {R"({"netstacks": [{"key": "a b"}]})", "netstacks[0].key"},
  };
  for (const auto& [json, field] : bad) {
    std::string path = path_ + ".bad";
    std::remove(path.c_str());
    auto store = Model::Store::Create(path);
    try {
      Model::ImportHost(*store, nlohmann::ordered_json::parse(json));
      ADD_FAILURE() << "imported: " << json;
    } catch (const Model::ImportError& e) {
      EXPECT_EQ(0u, std::string(e.what()).find(field)) << e.what();
    }
    store.reset();
    std::remove(path.c_str());
  }
}

TEST_F(IpModelTest, ExportThenImportGivesTheSameHost) {
  Model::Store& store = Model::Store::Host();
  nlohmann::ordered_json first = Model::ExportHost(store);
  std::string path = path_ + ".copy";
  std::remove(path.c_str());
  {
    auto copy = Model::Store::Create(path);
    Model::ImportHost(*copy, first);
    EXPECT_EQ(first.dump(), Model::ExportHost(*copy).dump());
  }
  std::remove(path.c_str());
}

TEST_F(IpModelTest, AddPicksFreeNameAndMacAndRefusesTakenPoints) {
  PortGroupImpl spare("Spare");
  auto nic = service_.AddTvKernelNic(&spare, "defaultTcpipStack", IpConfig(), MacAddress(), 0, 0, 0,
                                     "", false);
  EXPECT_EQ("tvk2", nic->GetInterfaceName());
  EXPECT_EQ(1500u, nic->GetMtu());
  EXPECT_EQ(1u, nic->GetNumRxQueue());
  EXPECT_TRUE(MacAddress::IsValid(nic->GetMacAddress().GetStringAddress()));
  ASSERT_TRUE(nic->GetPort());
  EXPECT_EQ("tvknic", Query("SELECT client_kind FROM port WHERE client = 'tvk2'"));
  EXPECT_EQ(1u, spare.GetActiveClients());

  PortGroupImpl third("Third"), mgmt("Mgmt"), missing("Missing");
  auto add = [&](HostCtl::Network::ConnectionPoint* point, const std::string& netstack,
                 MacAddress mac, uint32_t mtu, const std::string& name) {
    service_.AddTvKernelNic(point, netstack, IpConfig(), mac, 0, mtu, 0, name, false);
  };
  ExpectRefused([&] { add(&spare, "defaultTcpipStack", MacAddress(), 0, ""); },
                "Port group Spare is already used by Tarvik network interface tvk2");
  ExpectRefused([&] { add(&third, "defaultTcpipStack", MacAddress(), 0, "tvk0"); },
                "tvk0 already exists");
  ExpectRefused([&] { add(&third, "defaultTcpipStack", MacAddress("0c:42:a1:00:00:01"), 0, ""); },
                "already used by another interface or NIC");
  ExpectRefused([&] { add(&missing, "defaultTcpipStack", MacAddress(), 0, ""); },
                "Port group Missing does not exist");
  ExpectRefused([&] { add(&third, "defaultTcpipStack", MacAddress(), 9000, ""); },
                "above the MTU 1500 of switch sw0");
  ExpectRefused([&] { add(&third, "cold", MacAddress(), 0, ""); }, "enable it first");
  ExpectRefused([&] { add(&third, "defaultTcpipStack", MacAddress(), 0, "tvk256"); },
                "Invalid interface name tvk256");

  // Removing an interface frees its port group for another one.
  nic->Remove();
  EXPECT_EQ(0u, spare.GetActiveClients());
  EXPECT_EQ("<none>", Query("SELECT id FROM port WHERE client = 'tvk2'"));
  add(&spare, "defaultTcpipStack", MacAddress("02:00:00:00:00:99"), 0, "tvk255");
  EXPECT_EQ("02:00:00:00:00:99", Nic("tvk255")->GetMacAddress().GetStringAddress());
}

TEST_F(IpModelTest, RemoveByConnectionPointMatchesTheNetstack) {
  TvkCtl::Network::DVPortImpl port(HostCtl::Network::DVPortParam{"aa bb", "1", 0});
  ExpectRefused([&] { service_.RemoveTvKernelNic(&port, "defaultTcpipStack"); },
                "No Tarvik network interface of netstack defaultTcpipStack");
  service_.RemoveTvKernelNic(&port, "driftway");
  EXPECT_FALSE(service_.GetTvKernelNicByInterface("tvk1", false, 0));
}

TEST_F(IpModelTest, StaticConfigurationIsCheckedAndStored) {
  auto nic = Nic("tvk0");
  IpConfig config = nic->GetIpConfig();
  EXPECT_EQ("10.0.0.255", config.GetIpv4Broadcast().GetStringAddress());
  auto refused = [&](const char* address, const char* mask, const char* gateway,
                     const std::string& text) {
    IpConfig c;
    c.SetIpv4Address(Ipv4Address(address));
    c.SetIpv4Netmask(Ipv4Address(mask));
    c.SetIpv4Gateway(Ipv4Address(gateway));
    ExpectRefused([&] { nic->SetIpConfig(c); }, text);
  };
  refused("10.0.0.5", "255.0.255.0", "0.0.0.0", "is not a valid netmask");
  refused("10.0.0.255", "255.255.255.0", "0.0.0.0", "network or broadcast address");
  refused("224.0.0.5", "255.255.255.0", "0.0.0.0", "is not a unicast address");
  refused("10.0.0.5", "255.255.255.0", "10.0.1.1", "is not in the subnet of 10.0.0.5/24");
  refused("10.0.0.5", "255.255.255.0", "10.0.0.5", "the interface's own address");
  // The refused changes left the stored configuration alone.
  EXPECT_EQ("10.0.0.1", nic->GetIpConfig().GetIpv4Gateway().GetStringAddress());

  // Two interfaces of one netstack cannot share an address.
  auto other = Nic("tvk1");
  IpConfig clash;
  clash.SetIpv4Address(Ipv4Address("10.0.0.5"));
  clash.SetIpv4Netmask(Ipv4Address("255.255.255.0"));
  other->SetIpConfig(clash); // Another netstack: allowed.
  PortGroupImpl spare("Spare");
  auto third = service_.AddTvKernelNic(&spare, "defaultTcpipStack", IpConfig(), MacAddress(), 0, 0,
                                       0, "", false);
  ExpectRefused([&] { third->SetIpConfig(clash); },
                "already used by Tarvik network interface tvk0");
}

TEST_F(IpModelTest, DhcpLeaseIsRunningAndStableWhileConfiguredAsksOnlyForDhcp) {
  auto nic = Nic("tvk0");
  IpConfig config = nic->GetIpConfig();
  config.SetUseDhcp(true);
  config.SetDhcpDns(true);
  nic->SetIpConfig(config);
  IpConfig running = nic->GetIpConfig();
  IpConfig configured = nic->GetConfiguredIpConfig();
  EXPECT_TRUE(running.GetUseDhcp());
  EXPECT_TRUE(configured.GetUseDhcp());
  EXPECT_NE("0.0.0.0", running.GetIpv4Address().GetStringAddress());
  EXPECT_EQ("0.0.0.0", configured.GetIpv4Address().GetStringAddress());
  EXPECT_TRUE(configured.GetDhcpDns());
  // The routes engineer reads the running address from the interface row.
  EXPECT_EQ(running.GetIpv4Address().GetStringAddress(),
            Query("SELECT ipv4_address FROM tvknic WHERE name = 'tvk0'"));
  EXPECT_EQ("dhcp", Query("SELECT ipv4_mode FROM tvknic WHERE name = 'tvk0'"));
  // Re-applying the configuration gives the same lease.
  nic->SetIpConfig(configured);
  EXPECT_TRUE(nic->GetIpConfig().GetIpv4Address() == running.GetIpv4Address());

  IpConfig none = nic->GetIpConfig();
  none.SetIpv4UseNone();
  nic->SetIpConfig(none);
  EXPECT_EQ("0.0.0.0", Query("SELECT ipv4_address FROM tvknic WHERE name = 'tvk0'"));
}

TEST_F(IpModelTest, Ipv6AddressesAreKeptInOrderWithoutDuplicates) {
  auto nic = Nic("tvk0");
  IpConfig config = nic->GetIpConfig();
  config.AddIpv6Network(Ipv6Network("2001:db8::5/64"));
  config.AddIpv6Network(Ipv6Network("2001:DB8:1::5/48"));
  ExpectRefused([&] { config.AddIpv6Network(Ipv6Network("2001:db8:0::5/80")); },
                "Address 2001:db8::5 is already assigned to this interface as 2001:db8::5/64");
  ExpectRefused([&] { config.AddIpv6Network(Ipv6Network("ff02::1/64")); }, "Multicast address");
  ExpectRefused([&] { config.AddIpv6Network(Ipv6Network("::/64")); }, "unspecified address");
  ExpectRefused([&] { config.AddIpv6Network(Ipv6Network("2001:db8::9/0")); },
                "Prefix length 0 is out of range");
  ExpectRefused([&] { config.RemoveIpv6Network(Ipv6Network("2001:db8::5/65")); },
                "Address 2001:db8::5/65 is not assigned to this interface");
  config.SetIpv6Gateway(Ipv6Address("fe80::1"));
  nic->SetIpConfig(config);
  IpConfig stored = nic->GetIpConfig();
  ASSERT_EQ(2u, stored.GetIpv6Network().size());
  EXPECT_EQ("2001:db8::5/64", stored.GetIpv6Network()[0].GetStringAddress());
  EXPECT_EQ("2001:db8:1::5/48", stored.GetIpv6Network()[1].GetStringAddress());
  EXPECT_EQ("fe80::1", stored.GetIpv6Gateway().GetStringAddress());
  stored.RemoveIpv6Network(Ipv6Network("2001:db8::5/64"));
  nic->SetIpConfig(stored);
  EXPECT_EQ(1u, nic->GetIpConfig().GetIpv6Network().size());
}

TEST_F(IpModelTest, MtuAndEnabledStatePersist) {
  auto nic = Nic("tvk1");
  nic->SetMtu(1280);
  nic->Disable();
  auto again = Nic("tvk1");
  EXPECT_EQ(1280u, again->GetMtu());
  EXPECT_FALSE(again->IsEnabled());
  ExpectRefused([&] { nic->SetMtu(0); }, "MTU 0 is out of range; it must be 1280 to 9000");
  ExpectRefused([&] { Nic("tvk0")->SetMtu(9000); }, "above the MTU 1500 of switch sw0");
}

TEST_F(IpModelTest, NetstacksRefuseDuplicatesAndRemovalWhileInUse) {
  NetworkInfoImpl info;
  NetstackInstanceImpl fresh("twinRun", 11000, "newreno", true, 2, "enabled");
  info.AddNetstackInstance(fresh, true);
  ExpectRefused([&] { info.AddNetstackInstance(fresh, false); }, "twinRun already exists");
  ExpectRefused([&] { info.RemoveNetstackInstance("driftway", false); },
                "while it has Tarvik network interfaces (tvk1)");
  ExpectRefused([&] { info.RemoveNetstackInstance("defaultTcpipStack", false); },
                "cannot be removed");
  ExpectRefused([&] { info.RemoveNetstackInstance("nope", false); }, "nope does not exist");

  // Configured values become running when the instance is created in the kernel.
  auto twin = info.LookupNetstackInstanceByKey("twinRun");
  twin->SetMaxConnections(20000, true);
  twin->SetIpv6Enabled(false, true);
  twin = info.LookupNetstackInstanceByKey("twinRun");
  EXPECT_EQ(0u, twin->GetState());
  EXPECT_EQ(11000u, twin->GetCurrentMaxConnections());
  twin->Enable();
  EXPECT_EQ(4660u, twin->GetState());
  EXPECT_EQ(20000u, twin->GetCurrentMaxConnections());
  EXPECT_FALSE(twin->GetCurrentIpv6Enabled());
  ExpectRefused([&] { twin->SetCongestionControlAlgorithm("vegas", true); }, "vegas");
  ExpectRefused([&] { twin->SetMaxConnections(10, true); }, "out of range");
  info.RemoveNetstackInstance("twinRun", false);
  EXPECT_FALSE(info.LookupNetstackInstanceByKey("twinRun"));
}

TEST_F(IpModelTest, KernelIpv6SwitchTakesEffectOnTheNextBoot) {
  NetworkInfoImpl info;
  EXPECT_TRUE(info.IsTvkIpv6Enabled());
  info.SetTvkIpv6Enabled(false);
  EXPECT_FALSE(info.IsTvkIpv6Enabled());
  Model::Store& store = Model::Store::Host();
  EXPECT_EQ("1", store.Read([&] { return *Model::GetSetting(store, "tvk.ipv6.running"); }));
  EXPECT_TRUE(info.LookupNetstackInstanceByKey("driftway")->GetCurrentIpv6Enabled());
  // After the reboot the running value follows, and the netstacks lose IPv6.
  store.Write([&] { Model::PutSetting(store, "tvk.ipv6.running", "0"); });
  EXPECT_FALSE(info.LookupNetstackInstanceByKey("driftway")->GetCurrentIpv6Enabled());
  EXPECT_TRUE(info.LookupNetstackInstanceByKey("driftway")->GetIpv6Enabled());
}

TEST_F(IpModelTest, TagsAreListedInOrderAndFoundByTag) {
  auto nic = Nic("tvk0");
  nic->AddTag(HostCtl::Network::TvkNicTagTimeSync, false);
  nic->AddTag(HostCtl::Network::TvkNicTagHostConsole, false); // Present already.
  std::vector<HostCtl::Network::TvkNicTagType> tags;
  nic->GetTags(tags);
  ASSERT_EQ(2u, tags.size());
  EXPECT_EQ(HostCtl::Network::TvkNicTagHostConsole, tags[0]);
  EXPECT_EQ(HostCtl::Network::TvkNicTagTimeSync, tags[1]);
  auto tagged = service_.GetTvKernelNicsByTag(HostCtl::Network::TvkNicTagDriftway);
  ASSERT_EQ(1u, tagged.size());
  EXPECT_EQ("tvk1", tagged[0]->GetInterfaceName());
  ExpectRefused([&] { nic->RemoveTag(HostCtl::Network::TvkNicTagDriftway); },
                "tvk0 has no tag Driftway");
  EXPECT_STREQ("Driftway", TvkCtl::Network::TvkNicTagIdToName(HostCtl::Network::TvkNicTagDriftway));
  EXPECT_EQ(nullptr, TvkCtl::Network::TvkNicTagIdToName(HostCtl::Network::TvkNicTagInvalid));
  EXPECT_EQ(HostCtl::Network::TvkNicTagInvalid, TvkCtl::Network::TvkNicTagNameToId("driftway"));
}

TEST_F(IpModelTest, HostProgramsActOnTheModelOnly) {
  std::string command = "/etc/init.d/quilld " + TvkCtl::Util::MakeChildRpTvkOption(24);
  EXPECT_EQ(0, TvkCtl::Util::TvkCtl_Exec(command, false, true, false));
  EXPECT_EQ(TvkCtl::Util::MakeChildRpTvkOption(24),
            Query("SELECT value FROM setting WHERE key = 'tvk.service.quilld'"));
  EXPECT_EQ(127, TvkCtl::Util::TvkCtl_Exec("/bin/true", false, true, false));
  Model::Store& store = Model::Store::Host();
  store.Write([&] {
    Model::PutSetting(store, Model::kFaultsSetting,
                      R"([{"operation": "TvkCtl_Exec", "object": "/etc/init.d/quilld", )"
                      R"("message": "no daemon"}])");
  });
  Model::Store::CloseHost();
  EXPECT_EQ(1, TvkCtl::Util::TvkCtl_Exec(command, false, true, false));
}

TEST_F(IpModelTest, AnnounceJoinsTheAllHostsGroups) {
  PortGroupImpl spare("Spare");
  auto nic = service_.AddTvKernelNic(&spare, "defaultTcpipStack", IpConfig(), MacAddress(), 0, 0, 0,
                                     "tvk9", false);
  dynamic_cast<HostCtl::Network::TvkNicAnnounce&>(*nic).Announce();
  auto groups = nic->GetMulticastGroups();
  ASSERT_EQ(3u, groups.size());
  EXPECT_EQ("224.0.0.1", groups[0].groupAddress);
  EXPECT_EQ("01:00:5e:00:00:01", groups[0].linkLayer);
  EXPECT_EQ("ff02::1", groups[1].groupAddress);
  EXPECT_EQ("tvk9", groups[2].interfaceName);
  auto addresses = nic->GetIpConfig().GetIpv6Network();
  ASSERT_EQ(1u, addresses.size());
  EXPECT_EQ(7, addresses[0].GetIpv6AddressType());
  EXPECT_EQ(64, addresses[0].GetNetmask());
}

} // namespace
