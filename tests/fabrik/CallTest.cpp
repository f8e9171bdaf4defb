//===- CallTest.cpp - Constraints, parameter specs and input ----------------===//
#include "Fabrik/Call.h"

#include <gtest/gtest.h>

#include <optional>
#include <string>
#include <vector>

using namespace Fabrik::CallSpec;

namespace {

std::shared_ptr<ParameterConstraint> PortEnum() {
  auto constraint = ParameterConstraint::New(StringEnum);
  constraint->AddStringEnum("tp", "Select TP (Twisted Pair) as the device port");
  constraint->AddStringEnum("aui", "Select AUI (Attachment Unit Interface) as the device port");
  constraint->AddStringEnum("bnc");
  return constraint;
}

std::shared_ptr<ParameterConstraint> InterfaceRegex() {
  auto constraint = ParameterConstraint::New(StringRegex);
  constraint->SetStringRegex("tvk([0-9]|[1-9][0-9]|1[0-9][0-9]|2[0-4][0-9]|25[0-5])");
  return constraint;
}

} // namespace

TEST(ParameterConstraintTest, IntRangeIncludesBothBounds) {
  auto range = ParameterConstraint::New(IntRange);
  range->SetIntRange(1, 4096);
  EXPECT_EQ(range->CheckInt(1), std::nullopt);
  EXPECT_EQ(range->CheckInt(4096), std::nullopt);
  EXPECT_EQ(range->CheckInt(0), "value 0 is out of range [1 - 4096]");
  EXPECT_EQ(range->CheckInt(4097), "value 4097 is out of range [1 - 4096]");
  // Text is read as a whole decimal integer.
  EXPECT_EQ(range->CheckString("+12"), std::nullopt);
  EXPECT_EQ(range->CheckString("-3"), "value -3 is out of range [1 - 4096]");
  EXPECT_EQ(range->CheckString("12x"), "value \"12x\" is not an integer");
  EXPECT_EQ(range->CheckString(" 12"), "value \" 12\" is not an integer");
  EXPECT_EQ(range->CheckString(""), "value \"\" is not an integer");
  EXPECT_EQ(range->CheckString("99999999999999999999"),
            "value \"99999999999999999999\" is not an integer");
}

TEST(ParameterConstraintTest, EnumerationsAcceptExactValuesOnly) {
  auto port = PortEnum();
  EXPECT_EQ(port->CheckString("aui"), std::nullopt);
  EXPECT_EQ(port->CheckString("TP"), "value \"TP\" is not one of: tp, aui, bnc");
  EXPECT_EQ(port->CheckString("tp "), "value \"tp \" is not one of: tp, aui, bnc");

  auto speed = ParameterConstraint::New(IntEnum);
  speed->AddIntEnum(10);
  speed->AddIntEnum(-100);
  EXPECT_EQ(speed->CheckInt(-100), std::nullopt);
  EXPECT_EQ(speed->CheckString("10"), std::nullopt);
  EXPECT_EQ(speed->CheckInt(100), "value 100 is not one of: 10, -100");
}

TEST(ParameterConstraintTest, RegexMustMatchTheWholeValue) {
  auto name = InterfaceRegex();
  EXPECT_EQ(name->CheckString("tvk0"), std::nullopt);
  EXPECT_EQ(name->CheckString("tvk255"), std::nullopt);
  const std::string pattern = name->GetPattern();
  EXPECT_EQ(name->CheckString("tvk256"), "value \"tvk256\" does not match the pattern " + pattern);
  EXPECT_EQ(name->CheckString("tvk01"), "value \"tvk01\" does not match the pattern " + pattern);
  EXPECT_EQ(name->CheckString("xtvk1"), "value \"xtvk1\" does not match the pattern " + pattern);
  EXPECT_EQ(name->CheckInt(7), "value \"7\" does not match the pattern " + pattern);

  auto broken = ParameterConstraint::New(StringRegex);
  broken->SetStringRegex("tvk(");
  EXPECT_EQ(broken->CheckString("tvk"),
            "value \"tvk\" cannot be checked: the pattern tvk( is not a valid regular expression");
}

TEST(ParameterConstraintTest, RegexRefusesOverlongValuesWithoutCrashing) {
  auto wol = ParameterConstraint::New(StringRegex);
  wol->SetStringRegex("[pumbagsd]+");
  EXPECT_EQ(wol->CheckString(std::string(4096, 'p')), std::nullopt);
  EXPECT_EQ(wol->CheckString(std::string(200000, 'p')),
            "value is too long (200000 characters, at most 4096) to match the pattern "
            "[pumbagsd]+");
}

TEST(ParameterConstraintTest, HelpTexts) {
  auto port = PortEnum();
  EXPECT_EQ(port->EnumText(), "tp, aui, bnc");
  EXPECT_EQ(port->FullEnumText(), "\n    tp: Select TP (Twisted Pair) as the device port"
                                  "\n    aui: Select AUI (Attachment Unit Interface) as the device "
                                  "port"
                                  "\n    bnc");
  EXPECT_EQ(port->Describe(), "one of: tp, aui, bnc");

  auto range = ParameterConstraint::New(IntRange);
  range->SetIntRange(1, 4094);
  EXPECT_EQ(range->EnumText(), "[1 - 4094]");
  EXPECT_EQ(range->FullEnumText(), "[1 - 4094]");
  EXPECT_EQ(range->Describe(), "integer in [1 - 4094]");

  auto speed = ParameterConstraint::New(IntEnum);
  speed->AddIntEnum(10);
  speed->AddIntEnum(100);
  EXPECT_EQ(speed->FullEnumText(), "\n    10\n    100");
  EXPECT_EQ(InterfaceRegex()->Describe(),
            "matches: tvk([0-9]|[1-9][0-9]|1[0-9][0-9]|2[0-4][0-9]|25[0-5])");
}

TEST(ParameterSpecTest, ExpandsEnumTokensOnce) {
  auto spec = ParameterSpec::New("duplex", String);
  auto constraint = ParameterConstraint::New(StringEnum);
  constraint->AddStringEnum("full", "Not %ENUM% again");
  constraint->AddStringEnum("half");
  spec->SetConstraint(constraint);
  spec->SetDescription("Values: %ENUM%. In full:%FULLENUM%");
  EXPECT_EQ(spec->GetExpandedDescription(),
            "Values: full, half. In full:\n    full: Not %ENUM% again\n    half");

  auto plain = ParameterSpec::New("name", String);
  plain->SetDescription("No values %ENUM%here");
  EXPECT_EQ(plain->GetExpandedDescription(), "No values here");
}

TEST(InputSpecTest, FindsParametersByLongAndShortName) {
  auto spec = InputSpec::New();
  auto nic = ParameterSpec::New("nic-name", String);
  nic->SetShortName("n");
  auto mtu = ParameterSpec::New("mtu", Integer);
  spec->AddParameter(nic);
  spec->AddParameter(mtu);
  EXPECT_EQ(spec->FindParameter("mtu"), mtu);
  EXPECT_EQ(spec->FindParameter("nic"), nullptr);
  EXPECT_EQ(spec->FindShortParameter("n"), nic);
  // A parameter without a short name is not found by the empty name.
  EXPECT_EQ(spec->FindShortParameter(""), nullptr);
}

TEST(InputTest, AbsentParametersReadAsEmpty) {
  auto input = Input::New();
  std::vector<std::string> list = {"left over"};
  input->GetParameterList("uplinks", list);
  EXPECT_TRUE(list.empty());
  EXPECT_EQ(input->GetParameter("nic-name"), "");
  EXPECT_EQ(input->GetParameterInt("mtu"), 0);
  EXPECT_FALSE(input->GetParameterBool("enabled"));
  EXPECT_FALSE(input->IsFlagSet("use-vswitch"));
  EXPECT_FALSE(input->HasParameter("nic-name"));
}

TEST(InputTest, PresentParametersKeepValueAndTypedText) {
  auto input = Input::New();
  input->SetString("nic-name", "vmnic0");
  input->SetInt("mtu", 9000, "+9000");
  input->SetInt("vlan-id", 12);
  input->SetBool("enabled", true, "YES");
  input->SetBool("peer-dns", false);
  input->SetFlag("use-vswitch");
  input->AddListValue("uplinks", "vmnic0");
  input->AddListValue("uplinks", "vmnic1");

  EXPECT_EQ(input->GetParameter("nic-name"), "vmnic0");
  EXPECT_EQ(input->GetParameterInt("mtu"), 9000);
  EXPECT_EQ(input->GetParameter("mtu"), "+9000");
  EXPECT_EQ(input->GetParameter("vlan-id"), "12");
  EXPECT_TRUE(input->GetParameterBool("enabled"));
  EXPECT_EQ(input->GetParameter("enabled"), "YES");
  EXPECT_EQ(input->GetParameter("peer-dns"), "false");
  EXPECT_TRUE(input->HasParameter("peer-dns"));
  EXPECT_TRUE(input->IsFlagSet("use-vswitch"));
  std::vector<std::string> list = {"left over"};
  input->GetParameterList("uplinks", list);
  EXPECT_EQ(list, (std::vector<std::string>{"vmnic0", "vmnic1"}));

  // A later value replaces the earlier one entirely.
  input->SetString("mtu", "1500");
  EXPECT_EQ(input->GetParameter("mtu"), "1500");
  EXPECT_EQ(input->GetParameterInt("mtu"), 0);
}
