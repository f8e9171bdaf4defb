//===- tests/linux/host/BackendUnit.cpp - The Linux backend linked in ------===//
//
// The classification of links, the state file beside a namespace, and the
// backend chosen through the session with its factory registered directly.
//
//===----------------------------------------------------------------------===//
#include "Host.h"
#include "State.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Session.h"
#include "LinuxNet/Files.h"
#include "TvkCtl/Network/Switching.h"

#include <cstdlib>
#include <filesystem>
#include <gtest/gtest.h>
#include <unistd.h>

extern "C" void OstraHost_Register();

namespace {

LinuxNet::Link MakeLink(const std::string& name, const std::string& kind,
                        const std::string& bus = "") {
  LinuxNet::Link link;
  link.name = name;
  link.kind = kind;
  link.parentBus = bus;
  return link;
}

TEST(LinuxHostClassification, DeviceBackedLinksAndLabVethEndsAreNics) {
  EXPECT_TRUE(LinuxHost::IsNic(MakeLink("eth0", "", "pci")));
  EXPECT_TRUE(LinuxHost::IsNic(MakeLink("enx0", "", "usb")));
  EXPECT_TRUE(LinuxHost::IsNic(MakeLink("vmnic0", "veth")));
  EXPECT_TRUE(LinuxHost::IsNic(MakeLink("vmnic17", "veth")));
  EXPECT_FALSE(LinuxHost::IsNic(MakeLink("vmnic", "veth")));
  EXPECT_FALSE(LinuxHost::IsNic(MakeLink("vmnic1a", "veth")));
  EXPECT_FALSE(LinuxHost::IsNic(MakeLink("peer0", "veth")));
  EXPECT_FALSE(LinuxHost::IsNic(MakeLink("vmnic0", "bridge")));
  EXPECT_FALSE(LinuxHost::IsNic(MakeLink("lo", "")));
  LinuxNet::Link port = MakeLink("vmnic0", "veth");
  port.master = 4;
  EXPECT_TRUE(LinuxHost::IsNic(port));
  EXPECT_FALSE(LinuxHost::IsKernelInterface(port));
}

class StateFile : public ::testing::Test {
protected:
  void SetUp() override {
    dir_ = std::filesystem::temp_directory_path() / ("lhstate" + std::to_string(::getpid()));
    path_ = (dir_ / "sub" / "state").string();
  }
  void TearDown() override { std::filesystem::remove_all(dir_); }
  std::filesystem::path dir_;
  std::string path_;
};

TEST_F(StateFile, RecordsSurviveARewriteAndARefusedEditChangesNothing) {
  EXPECT_TRUE(LinuxHost::ReadState(path_).empty());
  LinuxHost::UpdateState(path_, [](auto& records) {
    records.push_back({"portgroup", {"br0", "pg one", "10"}});
    records.push_back({"sa", {"s1", "2001:db8::2 0x100 50"}});
  });
  std::vector<LinuxHost::StateRecord> records = LinuxHost::ReadState(path_);
  ASSERT_EQ(records.size(), 2u);
  EXPECT_EQ(records[0].fields, (std::vector<std::string>{"br0", "pg one", "10"}));
  EXPECT_EQ(records[1].kind, "sa");
  std::string before = LinuxNet::ReadTextFile(path_);
  EXPECT_THROW(LinuxHost::UpdateState(path_,
                                      [](auto& kept) {
                                        kept.clear();
                                        LinuxHost::Refuse("no");
                                      }),
               HostCtl::Lib::HostCtlException);
  EXPECT_EQ(LinuxNet::ReadTextFile(path_), before);
  EXPECT_FALSE(LinuxHost::IsStateField("a\tb"));
  EXPECT_FALSE(LinuxHost::IsStateField(""));
}

TEST(LinuxHostSession, TheFactoriesServeLinuxAndNetnsOnly) {
  OstraHost_Register();
  EXPECT_THROW(
      {
        try {
          HostCtl::Session::SetHost("netns:no-such-unit-ns");
        } catch (const HostCtl::Lib::HostCtlException& e) {
          EXPECT_STREQ(e.what(), "the network namespace no-such-unit-ns does not exist");
          throw;
        }
      },
      HostCtl::Lib::HostCtlException);
  EXPECT_THROW(HostCtl::Session::SetHost("netns:../x"), HostCtl::Lib::HostCtlException);
  HostCtl::Session::SetHost("linux");
  EXPECT_FALSE(HostCtl::Session::HasTransactions());
  EXPECT_THROW(HostCtl::Session::EndBatch(false), HostCtl::Lib::HostCtlException);
  // An operation without a mapping names the command, never a made-up value.
  HostCtl::Session::ClearNotAvailable();
  TvkCtl::Network::VirtualSwitchInfoImpl switches;
  EXPECT_THROW(switches.GetDVSwitches(), HostCtl::Lib::NotAvailableException);
  EXPECT_EQ(HostCtl::Session::NotAvailableLine("network vswitch dvs corvex list"),
            "network vswitch dvs corvex list is not available on a Linux host");
  HostCtl::Backend::ResetCurrent();
}

} // namespace
