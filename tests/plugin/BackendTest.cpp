//===- BackendTest.cpp - Commands on a host other than the simulated one ---===//
//
// A fake backend, registered for "linux" as the Linux host's module would
// register its own, holds two NICs in memory and overrides only what the NIC
// list and the NIC up and down commands use. Real plug-in commands run on it
// through the command host: their results come from the fake, and a command
// that needs an operation the fake leaves alone is reported as not available
// on this host.
//
//===----------------------------------------------------------------------===//
#include "backend/Backend.h"
#include "Fabrik/AutoCli.h"
#include "Host.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Session.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/RoutingInfoImpl.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <map>

extern "C" void AutoCli_RegisterNamespaces(Fabrik::AutoCli::NamespaceNodePtr& root);

namespace {

using namespace HostCtl;
namespace Net = HostCtl::Network;
namespace Ops = HostCtl::Backend;

/// The fake host's NICs by name: administrative state.
std::map<std::string, bool>& FakeNics() {
  static std::map<std::string, bool> nics;
  return nics;
}

class FakePnic : public Ops::Pnic {
public:
  explicit FakePnic(std::string name) : name_(std::move(name)) {}
  std::string GetName() const override { return name_; }
  std::unique_ptr<Net::PciDevice> GetPciDevice() const override { return nullptr; }
  std::string GetPseudoDeviceDescription() const override { return "PhyDev:Fake Labs:Virtual NIC"; }
  std::string GetDriverName() const override { return "fakenet"; }
  bool IsAdminUp() const override { return FakeNics().at(name_); }
  bool IsLinkUp() const override { return IsAdminUp(); }
  bool IsLinkStatusUp() const override { return IsAdminUp(); }
  uint32_t GetSpeed() const override { return 1000; }
  uint32_t GetDuplex() const override { return 1; }
  Net::MacAddress GetMacAddress() const override {
    return Net::MacAddress(name_ == "eth0" ? "02:00:00:00:00:01" : "02:00:00:00:00:02");
  }
  uint32_t GetMtu() const override { return 1500; }
  void SetAdminStatus(bool up) override { FakeNics().at(name_) = up; }

private:
  std::string name_; ///< NIC name.
};

class FakeNetwork : public Ops::Network {
public:
  std::vector<std::unique_ptr<Net::Pnic>> GetPnics(Net::PnicGetType) override {
    std::vector<std::unique_ptr<Net::Pnic>> nics;
    for (const auto& [name, up] : FakeNics())
      nics.push_back(std::make_unique<FakePnic>(name));
    return nics;
  }
  std::unique_ptr<Net::Pnic> GetPnicByName(const std::string& name) override {
    if (!FakeNics().count(name))
      return nullptr;
    return std::make_unique<FakePnic>(name);
  }
};

class FakeHost : public Ops::Backend {
public:
  std::string Describe() const override { return "a Linux host"; }
  std::unique_ptr<Ops::Network> MakeNetwork() override { return std::make_unique<FakeNetwork>(); }
  std::unique_ptr<SmartNic::SmartNic> GetSmartNicByPnic(const std::string&) override {
    return nullptr;
  }
};

std::unique_ptr<Ops::Backend> MakeFakeHost(const std::string&) {
  return std::make_unique<FakeHost>();
}

class BackendTest : public ::testing::Test {
protected:
  void SetUp() override {
    FakeNics() = {{"eth0", true}, {"eth1", false}};
    // No Linux host module may be found by accident.
    ::setenv("OSTRACLI_LINUX_MODULE", "/nonexistent/host-linux.so", 1);
    auto root = Fabrik::AutoCli::Namespace::New();
    AutoCli_RegisterNamespaces(root);
    tree_ = std::make_unique<Ostra::CommandTree>(root);
  }
  void TearDown() override {
    Ops::RegisterFactory("linux", nullptr);
    Ops::ResetCurrent();
    ::unsetenv("OSTRACLI_HOST");
    ::unsetenv("OSTRACLI_LINUX_MODULE");
  }
  /// Runs one command line; out_ and err_ hold what it printed.
  int Run(std::vector<std::string> args) {
    out_.clear();
    err_.clear();
    return Ostra::RunCommandLine(*tree_, args, out_, err_);
  }

  std::unique_ptr<Ostra::CommandTree> tree_; ///< The network plug-in's tree.
  std::string out_;                          ///< Standard output of the last run.
  std::string err_;                          ///< Standard error of the last run.
};

TEST_F(BackendTest, CommandsRunOnTheRegisteredBackend) {
  Ops::RegisterFactory("linux", MakeFakeHost);
  EXPECT_EQ(Run({"--host", "linux", "--formatter", "csv", "network", "nic", "list"}), 0) << err_;
  EXPECT_EQ(out_, "Name,PCI Device,Driver,Link,Admin Status,Link Status,Speed,Duplex,MAC Address,"
                  "MTU,Description,DPU Id\n"
                  "eth0,Pseudo,fakenet,Up,Up,Up,1000,Full,02:00:00:00:00:01,1500,Fake Labs "
                  "Virtual NIC,N/A\n"
                  "eth1,Pseudo,fakenet,Down,Down,Down,1000,Full,02:00:00:00:00:02,1500,Fake Labs "
                  "Virtual NIC,N/A\n");

  // A change goes to the fake, and the next command sees it.
  EXPECT_EQ(Run({"--host", "linux", "network", "nic", "up", "-n", "eth1"}), 0) << err_;
  EXPECT_EQ(out_, "true\n");
  EXPECT_TRUE(FakeNics().at("eth1"));
  // A look-up the fake answers with nothing keeps the command's own message.
  EXPECT_EQ(Run({"--host", "linux", "network", "nic", "down", "-n", "eth9"}), 1);
  EXPECT_EQ(err_, "There is no pnic with name eth9\n");
}

TEST_F(BackendTest, OperationsTheHostLacksNameTheCommand) {
  Ops::RegisterFactory("linux", MakeFakeHost);
  // The command catches the failure and adds its own prefix; the command host
  // replaces the whole of it by one line.
  EXPECT_EQ(Run({"--host", "linux", "network", "vswitch", "dvs", "corvex", "list"}), 1);
  EXPECT_EQ(out_, "");
  EXPECT_EQ(err_, "network vswitch dvs corvex list is not available on a Linux host\n");
  // The note does not outlive its command.
  EXPECT_EQ(Run({"--host", "linux", "network", "nic", "down", "-n", "eth0"}), 0) << err_;
  EXPECT_EQ(Run({"--host", "linux", "network", "nic", "down", "-n", "eth7"}), 1);
  EXPECT_EQ(err_, "There is no pnic with name eth7\n");

  // A handle on a root the fake never made answers every operation so too.
  HostCtl::Session::SetHost("linux");
  TvkCtl::Network::RoutingInfoImpl routing("defaultTcpipStack");
  try {
    routing.GetTvKernelDefaultGateway();
    ADD_FAILURE() << "an operation the fake lacks returned";
  } catch (const Lib::NotAvailableException& e) {
    EXPECT_EQ(e.GetOperation(), "GetTvKernelDefaultGateway");
    EXPECT_STREQ(e.what(), "GetTvKernelDefaultGateway is not available on a Linux host");
  }
  // The shared constants need no host.
  EXPECT_EQ(TvkCtl::Network::RoutingInfoImpl::DEFAULT_IPV4_ROUTE.GetPrefixLength(), 0);
}

TEST_F(BackendTest, KernelHostWithoutItsModuleIsOneClearError) {
  EXPECT_EQ(Run({"--host", "netns:blue", "network", "nic", "list"}), 1);
  EXPECT_EQ(out_, "");
  EXPECT_EQ(err_, "ostracli: The host netns:blue needs the Linux host module (host-linux.so), "
                  "which this ostracli does not have\n");
  // The host that cannot be used stays refused: nothing falls back to the
  // simulated host.
  EXPECT_THROW({ TvkCtl::Network::NetworkInfoImpl network; }, Lib::HostCtlException);
}

TEST_F(BackendTest, BatchesOnAHostWithoutTransactions) {
  Ops::RegisterFactory("linux", MakeFakeHost);
  Session::SetHost("linux");
  EXPECT_FALSE(Session::HasTransactions());
  // A batch applies line by line: a change is there before the batch ends,
  // and undoing the batch is refused rather than pretended.
  Session::BeginBatch();
  EXPECT_EQ(Run({"--host", "linux", "network", "nic", "down", "-n", "eth0"}), 0) << err_;
  EXPECT_FALSE(FakeNics().at("eth0"));
  try {
    Session::EndBatch(false);
    ADD_FAILURE() << "a rollback was accepted";
  } catch (const Lib::HostCtlException& e) {
    EXPECT_STREQ(e.what(), "Cannot undo the batch: a Linux host has no transactions, so the "
                           "changes of the lines that ran are kept");
  }
  EXPECT_FALSE(FakeNics().at("eth0"));
  EXPECT_NO_THROW(Session::EndBatch(true));
}

} // namespace
