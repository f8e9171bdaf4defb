//===- IpCommonTest.cpp - The netstack and type selectors of IP listings --===//
//
// ReadListType decides, for every IP listing, between regular and system
// objects and refuses the combinations a host does not have: any type other
// than "system", and system objects of a netstack other than the default
// one (an empty netstack being the default one).
//
//===----------------------------------------------------------------------===//
#include "ip/IpCommon.h"

#include <gtest/gtest.h>

#include <optional>
#include <string>
#include <vector>

namespace {

using namespace CorvexCli::NetworkNamespace;
using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::Output;
using HostCtl::Network::PortsetGetRegular;
using HostCtl::Network::PortsetGetSystem;
using HostCtl::Network::PortsetGetType;

const std::string kBadType = "Invalid type value, should be 'system'.";
const std::string kBadNetstack = "Invalid netstack value, should be 'defaultTcpipStack'.";

std::shared_ptr<Input> MakeInput(std::optional<std::string> type,
                                 std::optional<std::string> netstack) {
  auto input = Input::New();
  if (type)
    input->SetString("type", *type);
  if (netstack)
    input->SetString("netstack", *netstack);
  return input;
}

TEST(IpCommonTest, NetstackParameterFallsBackToTheDefaultInstance) {
  EXPECT_EQ(NetstackParameter(*MakeInput(std::nullopt, std::nullopt)), "defaultTcpipStack");
  EXPECT_EQ(NetstackParameter(*MakeInput(std::nullopt, "")), "defaultTcpipStack");
  EXPECT_EQ(NetstackParameter(*MakeInput(std::nullopt, "ops")), "ops");
}

TEST(IpCommonTest, ListTypeSelectsSystemObjectsOfTheDefaultNetstackOnly) {
  struct Case {
    std::optional<std::string> type;
    std::optional<std::string> netstack;
    bool netstackMatters;
    bool ok;
    PortsetGetType selector;
    std::vector<std::string> errors;
  };
  const std::vector<Case> cases = {
      {std::nullopt, std::nullopt, true, true, PortsetGetRegular, {}},
      {std::nullopt, "ops", true, true, PortsetGetRegular, {}}, // No type: any netstack.
      {"system", std::nullopt, true, true, PortsetGetSystem, {}},
      {"system", "", true, true, PortsetGetSystem, {}},
      {"system", "defaultTcpipStack", true, true, PortsetGetSystem, {}},
      {"system", "ops", true, false, PortsetGetRegular, {kBadNetstack}},
      {"system", "ops", false, true, PortsetGetSystem, {}},
      {"System", std::nullopt, true, false, PortsetGetRegular, {kBadType}}, // Case matters.
      {"", std::nullopt, true, false, PortsetGetRegular, {kBadType}},
      {"regular", "ops", true, false, PortsetGetRegular, {kBadType}}, // Type is checked first.
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.type.value_or("<none>") + " / " + c.netstack.value_or("<none>") + " / " +
                 (c.netstackMatters ? "matters" : "ignored"));
    auto output = Output::New();
    // Start from the other selector so that a path that leaves it alone shows.
    PortsetGetType selector = c.selector == PortsetGetSystem ? PortsetGetRegular : PortsetGetSystem;
    EXPECT_EQ(ReadListType(*MakeInput(c.type, c.netstack), *output, selector, c.netstackMatters),
              c.ok);
    EXPECT_EQ(selector, c.selector);
    EXPECT_EQ(output->GetErrorMessages(), c.errors);
  }
}

} // namespace
