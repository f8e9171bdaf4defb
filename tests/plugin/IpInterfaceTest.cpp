//===- IpInterfaceTest.cpp - Checks of the kernel interface commands ------===//
//
// The checks the IP interface, tag and netstack commands make before they
// reach the host, and their declared parameters. The host is pointed at a
// file that does not exist, so a command that reached it would report that
// instead of the expected message.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "Fabrik/Call.h"
#include "HostCtl/Network/TvkNic.h"
#include "TvkCtl/Network/NetstackInstanceImpl.h"

#include "HostCtl/Session.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

namespace {

using namespace CorvexCli::NetworkNamespace;
using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::Output;

class IpInterfaceTest : public ::testing::Test {
protected:
  void SetUp() override { HostCtl::Session::SetHost("/nonexistent/ip-interface-test.db"); }

  /// Runs \p command with \p input; expects exactly \p errors and no result.
  void ExpectRefused(Fabrik::AutoCli::Command& command, const std::shared_ptr<Input>& input,
                     const std::vector<std::string>& errors) {
    auto output = Output::New();
    command.Execute(input, output);
    EXPECT_EQ(errors, output->GetErrorMessages());
    EXPECT_FALSE(output->GetRootObject());
  }
};

const std::string kNeedPoint =
    "A connection point of either vswitch port group name or dvs-name/dvport-id should be "
    "specified. If connection point is DVPort, --dvs-name and --dvport-id must be specified at "
    "the same time.";

TEST_F(IpInterfaceTest, AddChoosesExactlyOneConnectionPoint) {
  auto add = IpInterfaceAdd::New();
  struct Selectors {
    bool portgroup, dvs, dvport;
    std::string error;
  };
  const std::vector<Selectors> cases = {
      {false, false, false, kNeedPoint},
      {true, true, false, kNeedPoint}, // A port group and half a DV port.
      {true, false, true, kNeedPoint},
      {false, true, false, kNeedPoint},
      {false, false, true, kNeedPoint},
      {true, true, true,
       "Only one connection point can be specified, vswitch port group or DVPort."},
  };
  for (const Selectors& c : cases) {
    auto input = Input::New();
    if (c.portgroup)
      input->SetString("portgroup-name", "Mgmt");
    if (c.dvs)
      input->SetString("dvs-name", "dvs0");
    if (c.dvport)
      input->SetString("dvport-id", "1");
    ExpectRefused(*add, input, {c.error});
  }
  auto input = Input::New();
  input->SetString("portgroup-name", "Mgmt");
  input->SetString("mac-address", "ff:ff:ff:ff:ff:ff");
  ExpectRefused(*add, input, {"Invalid unicast MAC address specified."});
}

TEST_F(IpInterfaceTest, RemoveNeedsOneUniqueSelector) {
  auto remove = IpInterfaceRemove::New();
  const std::string ambiguous =
      "Please correctly and uniquely specify a way to remove it. A TarVik network interface can "
      "be uniquely specified by --interface-name or --portgroup-name or --dvs-name/--dvport-id. "
      "i.e. Providing its name or its connection point are two ways to uniquely specify a TarVik "
      "network interface.";
  auto byNameAndGroup = Input::New();
  byNameAndGroup->SetString("interface-name", "tvk1");
  byNameAndGroup->SetString("portgroup-name", "Mgmt");
  ExpectRefused(*remove, byNameAndGroup, {ambiguous});
  auto byNameAndPort = Input::New();
  byNameAndPort->SetString("interface-name", "tvk1");
  byNameAndPort->SetString("dvport-id", "1");
  ExpectRefused(*remove, byNameAndPort, {ambiguous});
  ExpectRefused(*remove, Input::New(), {ambiguous});
  // Only a DV port id passes the first test and fails the choice of point.
  auto onlyPort = Input::New();
  onlyPort->SetString("dvport-id", "1");
  ExpectRefused(*remove, onlyPort, {kNeedPoint});
}

TEST_F(IpInterfaceTest, UnknownTagNamesGiveTwoErrors) {
  std::string supported = "Supported tags are: HostConsole, Driftway, TwinRun, Replica, "
                          "ReplicaCopy, Ambrel, SharedStore, StoreWitness, ArchiveCopy, "
                          "TimeSync, BlockOverTcp, BlockOverRdma";
  for (auto command : std::vector<std::shared_ptr<Fabrik::AutoCli::Command>>{
           IpInterfaceTagAdd::New(), IpInterfaceTagRemove::New()}) {
    auto input = Input::New();
    input->SetString("interface-name", "tvk0");
    input->SetString("tagname", "hostconsole"); // Names match exactly.
    ExpectRefused(*command, input, {"Invalid tag name hostconsole", supported});
  }
  EXPECT_EQ("Adds a tag on a given Tarvik network interface. " + supported,
            IpInterfaceTagAdd::New()->GetDescription());
}

TEST_F(IpInterfaceTest, Ipv6AddressFormatIsCheckedBeforeTheInterface) {
  const std::string format = "Invalid format for IPv6 address. Address must be in the format "
                             "<ipv6-address>/<prefix-length>   Example: 1:2:3:4::/64";
  for (const char* text :
       {"2001:db8::5", "2001:db8::5/129", "2001:db8::5/064", "1.2.3.4/24", "2001:db8::5/64 "}) {
    for (auto command : std::vector<std::shared_ptr<Fabrik::AutoCli::Command>>{
             IpInterfaceIpv6AddressAdd::New(), IpInterfaceIpv6AddressRemove::New()}) {
      auto input = Input::New();
      input->SetString("interface-name", "tvk99");
      input->SetString("ipv6", text);
      ExpectRefused(*command, input, {format});
    }
  }
}

TEST_F(IpInterfaceTest, ListingsRefuseTypesOtherThanSystem) {
  auto wrongType = Input::New();
  wrongType->SetString("type", "System");
  auto wrongStack = Input::New();
  wrongStack->SetString("type", "system");
  wrongStack->SetString("netstack", "driftway");
  for (auto command : std::vector<std::shared_ptr<Fabrik::AutoCli::Command>>{
           IpInterfaceList::New(), IpInterfaceIpv4Get::New(), IpInterfaceIpv6Get::New()}) {
    ExpectRefused(*command, wrongType, {"Invalid type value, should be 'system'."});
    ExpectRefused(*command, wrongStack, {"Invalid netstack value, should be 'defaultTcpipStack'."});
  }
  ExpectRefused(*IpInterfaceIpv6AddressList::New(), wrongType,
                {"Invalid type value, should be 'system'."});
}

TEST_F(IpInterfaceTest, DeclaredParametersFollowTheHostLibrary) {
  auto add = IpInterfaceAdd::New()->GetInputSpec();
  auto mtu = add->FindParameter("mtu")->GetConstraint();
  EXPECT_EQ(static_cast<long>(HostCtl::Network::TvkNic::MIN_MTU), mtu->GetMin());
  EXPECT_EQ(static_cast<long>(HostCtl::Network::TvkNic::MAX_MTU), mtu->GetMax());
  auto name = add->FindParameter("interface-name")->GetConstraint();
  for (const char* good : {"tvk0", "tvk9", "tvk10", "tvk199", "tvk255"})
    EXPECT_FALSE(name->CheckString(good)) << good;
  for (const char* bad : {"tvk", "tvk00", "tvk07", "tvk256", "tvk1000", "TVK1", "vmk1", "tvk1 "})
    EXPECT_TRUE(name->CheckString(bad)) << bad;

  auto ipv6Get = IpInterfaceIpv6Get::New()->GetInputSpec();
  EXPECT_EQ("n", ipv6Get->FindParameter("interface-name")->GetShortName());
  auto set = IpNetstackInstanceSet::New()->GetInputSpec();
  EXPECT_EQ("", set->FindParameter("ecn")->GetShortName());
  std::vector<std::string> algorithms;
  for (const auto& value : set->FindParameter("ccalgo")->GetConstraint()->GetEnumValues()) {
    algorithms.push_back(value.value);
    EXPECT_EQ("Set " + value.value + " as the algorithm", value.description);
  }
  EXPECT_EQ(TvkCtl::Network::NetstackInstanceImpl::GetCongestionControlAlgorithmList(), algorithms);
}

} // namespace
