//===- AddressTest.cpp - Parsing and printing of MAC and IP addresses -----===//
//
// A corpus of tricky inputs for the strict address parsers that every
// command shares: leading zeros, wrong group counts, "::" twice, IPv4 tails,
// prefix bounds, case and blanks.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Network/Address.h"
#include "HostCtl/Lib.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using namespace HostCtl::Network;

/// One input with whether it parses and, when it does, its canonical text.
struct Case {
  std::string text;      ///< Input.
  bool valid;            ///< Whether the parser accepts it.
  std::string canonical; ///< Printed form of an accepted input ("" = input itself).
};

TEST(AddressTest, MacCorpus) {
  const std::vector<Case> cases = {
      {"00:50:56:01:02:03", true, ""},
      {"0C:42:A1:5E:10:00", true, "0c:42:a1:5e:10:00"},
      {"0c-42-a1-5e-10-00", true, "0c:42:a1:5e:10:00"},
      {"0c:42-a1:5e:10:00", false, ""}, // Mixed separators.
      {"0c:42:a1:5e:10", false, ""},    // Five groups.
      {"0c:42:a1:5e:10:00:01", false, ""},
      {"0:42:a1:5e:10:00", false, ""}, // One-digit group.
      {"0g:42:a1:5e:10:00", false, ""},
      {" 0c:42:a1:5e:10:00", false, ""},
      {"0c:42:a1:5e:10:00 ", false, ""},
      {"0c42.a15e.1000", false, ""},
      {"", false, ""},
  };
  for (const Case& c : cases) {
    std::array<uint8_t, 6> bytes{};
    EXPECT_EQ(c.valid, MacAddress::Parse(c.text, bytes)) << c.text;
    if (c.valid)
      EXPECT_EQ(c.canonical.empty() ? c.text : c.canonical, MacAddress(c.text).GetStringAddress());
    else
      EXPECT_THROW(MacAddress{c.text}, HostCtl::Lib::HostCtlException) << c.text;
  }
}

TEST(AddressTest, MacValidityRequiresUnicastAndNotZero) {
  EXPECT_TRUE(MacAddress::IsValid("02:4f:53:00:00:01"));
  EXPECT_FALSE(MacAddress::IsValid("01:00:5e:00:00:01")); // Multicast.
  EXPECT_FALSE(MacAddress::IsValid("ff:ff:ff:ff:ff:ff")); // Broadcast.
  EXPECT_FALSE(MacAddress::IsValid("00:00:00:00:00:00"));
  EXPECT_TRUE(MacAddress().IsUnset());
}

TEST(AddressTest, Ipv4Corpus) {
  const std::vector<Case> cases = {
      {"1.2.3.4", true, ""},     {"0.0.0.0", true, ""},     {"255.255.255.255", true, ""},
      {"01.2.3.4", false, ""}, // Leading zero.
      {"1.2.3.00", false, ""},   {"256.1.1.1", false, ""},  {"1.2.3", false, ""},
      {"1.2.3.4.5", false, ""},  {"1..3.4", false, ""},     {".1.2.3", false, ""},
      {"1.2.3.4.", false, ""},   {"+1.2.3.4", false, ""},   {"1.2.3.-4", false, ""},
      {"0x1.2.3.4", false, ""},  {"1.2.3.4/24", false, ""}, {" 1.2.3.4", false, ""},
      {"1.2.3.4 ", false, ""},   {"4294967295", false, ""}, {"99999999999.1.1.1", false, ""},
      {"", false, ""},           {"10.0.100.0", true, ""},  {"1.2.3.256", false, ""},
      {"1.2.3.0255", false, ""}, {"1.2.3.4..", false, ""},  {"1.2.3.", false, ""},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(c.valid, Ipv4Address::IsValidAddress(c.text)) << c.text;
    if (c.valid) {
      EXPECT_EQ(c.text, Ipv4Address(c.text).GetStringAddress());
    }
  }
}

TEST(AddressTest, Ipv4Netmasks) {
  EXPECT_TRUE(Ipv4Address("255.255.255.0").IsNetmask());
  EXPECT_TRUE(Ipv4Address("0.0.0.0").IsNetmask());
  EXPECT_TRUE(Ipv4Address("255.255.255.255").IsNetmask());
  EXPECT_FALSE(Ipv4Address("255.0.255.0").IsNetmask());
  EXPECT_FALSE(Ipv4Address("0.0.0.255").IsNetmask());
  EXPECT_EQ(20, Ipv4Address("255.255.240.0").PrefixLength());
  EXPECT_EQ("255.255.240.0", Ipv4Address::FromPrefixLength(20).GetStringAddress());
  EXPECT_EQ("0.0.0.0", Ipv4Address::FromPrefixLength(0).GetStringAddress());
  EXPECT_EQ("255.255.255.255", Ipv4Address::FromPrefixLength(32).GetStringAddress());
}

TEST(AddressTest, Ipv4Networks) {
  EXPECT_TRUE(Ipv4Network::IsValidNetwork("10.0.0.0/8"));
  EXPECT_TRUE(Ipv4Network::IsValidNetwork("10.0.0.0/255.0.0.0"));
  EXPECT_TRUE(Ipv4Network::IsValidNetwork("0.0.0.0/0"));
  EXPECT_TRUE(Ipv4Network::IsValidNetwork("10.1.2.3/32"));
  EXPECT_FALSE(Ipv4Network::IsValidNetwork("10.0.0.0/33"));
  EXPECT_FALSE(Ipv4Network::IsValidNetwork("10.0.0.0/08"));
  EXPECT_FALSE(Ipv4Network::IsValidNetwork("10.0.0.0/255.0.255.0"));
  EXPECT_FALSE(Ipv4Network::IsValidNetwork("10.0.0.0/"));
  EXPECT_FALSE(Ipv4Network::IsValidNetwork("10.0.0.0"));
  EXPECT_FALSE(Ipv4Network::IsValidNetwork("10.0.0.0/-1"));
  EXPECT_FALSE(Ipv4Network::IsValidNetwork("10.0.0.0/8/8"));
  Ipv4Network network("10.20.0.0/255.255.0.0");
  EXPECT_EQ("10.20.0.0/16", network.GetStringAddress());
  EXPECT_TRUE(network.Contains(Ipv4Address("10.20.255.1")));
  EXPECT_FALSE(network.Contains(Ipv4Address("10.21.0.1")));
}

TEST(AddressTest, Ipv6Corpus) {
  const std::vector<Case> cases = {
      {"::", true, ""},
      {"::1", true, ""},
      {"1::", true, ""},
      {"1:2:3:4:5:6:7:8", true, ""},
      {"FE80::ABCD", true, "fe80::abcd"},
      {"0000:0000::0001", true, "::1"},
      {"1:2:3:4:5:6:7::", true, "1:2:3:4:5:6:7:0"},
      {"::2:3:4:5:6:7:8", true, "0:2:3:4:5:6:7:8"},
      {"2001:db8:0:0:1:0:0:1", true, "2001:db8::1:0:0:1"}, // First of two equal runs.
      {"2001:0:0:1:0:0:0:1", true, "2001:0:0:1::1"},       // The longest run.
      {"1:0:2:3:4:5:6:7", true, ""},                       // A lone zero stays.
      {"::ffff:1.2.3.4", true, "::ffff:102:304"},
      {"::1.2.3.4", true, "::102:304"},
      {"1:2:3:4:5:6:1.2.3.4", true, "1:2:3:4:5:6:102:304"},
      {"1:2:3:4:5:6:7:8:9", false, ""}, // Nine groups.
      {"1:2:3:4:5:6:7", false, ""},     // Seven groups without "::".
      {"1:2:3:4:5:6:7:8::", false, ""}, // "::" standing for no group.
      {"1::2:3:4:5:6:7:8", false, ""},
      {"1::2::3", false, ""}, // "::" twice.
      {"::1::", false, ""},
      {":::", false, ""},
      {"1:::2", false, ""},
      {":1::", false, ""},
      {"1:", false, ""},
      {"1::2:", false, ""},
      {"12345::", false, ""}, // Five hex digits.
      {"00000::", false, ""},
      {"g::1", false, ""},
      {"1:2:3:4:5:6:7:1.2.3.4", false, ""}, // IPv4 tail after seven groups.
      {"1:2:3:4:5:6::1.2.3.4", false, ""},
      {"::1.2.3", false, ""},
      {"::01.2.3.4", false, ""},
      {"::1.2.3.4:5", false, ""}, // IPv4 tail not last.
      {"1.2.3.4::", false, ""},
      {"1.2.3.4", false, ""},
      {"fe80::1%eth0", false, ""},
      {"[::1]", false, ""},
      {" ::1", false, ""},
      {"::1 ", false, ""},
      {"", false, ""},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(c.valid, Ipv6Address::IsValidAddress(c.text)) << c.text;
    if (c.valid)
      EXPECT_EQ(c.canonical.empty() ? c.text : c.canonical, Ipv6Address(c.text).GetStringAddress())
          << c.text;
    else
      EXPECT_THROW(Ipv6Address{c.text}, HostCtl::Lib::HostCtlException) << c.text;
  }
}

TEST(AddressTest, Ipv6PrefixBounds) {
  const std::vector<std::pair<std::string, bool>> cases = {
      {"2001:db8::/64", true},
      {"::/0", true},
      {"2001:db8::1/128", true},
      {"2001:db8::/129", false},
      {"2001:db8::/064", false},
      {"2001:db8::/-1", false},
      {"2001:db8::/+64", false},
      {"2001:db8::/ 64", false},
      {"2001:db8::/64 ", false},
      {"2001:db8::", false},
      {"2001:db8::/", false},
      {"2001:db8::/64/64", false},
      {"/64", false},
      {"1.2.3.4/24", false},
      {"2001:db8::/1e2", false},
  };
  for (const auto& [text, valid] : cases) {
    EXPECT_EQ(valid, Ipv6Network::IsValidAddressAndNetmask(text)) << text;
    if (valid)
      EXPECT_NO_THROW(Ipv6Network{text}) << text;
    else
      EXPECT_THROW(Ipv6Network{text}, HostCtl::Lib::HostCtlException) << text;
  }
  Ipv6Network network("2001:DB8:0:0::5/64");
  EXPECT_EQ("2001:db8::5/64", network.GetStringAddress());
  EXPECT_EQ(64, network.GetNetmask());
}

TEST(AddressTest, Ipv6NetmasksAndContainment) {
  EXPECT_EQ("ffff:ffff:ffff:ffff::", Ipv6Network::NetmaskFromNumber(64).GetStringAddress());
  EXPECT_EQ("ffff:fe00::", Ipv6Network::NetmaskFromNumber(23).GetStringAddress());
  EXPECT_EQ("::", Ipv6Network::NetmaskFromNumber(0).GetStringAddress());
  // The mask bytes of a temporary are read through a reference: they must stay
  // alive for as long as it is used.
  const auto& mask = Ipv6Network::NetmaskFromNumber(48).GetBytes();
  EXPECT_EQ(0xff, mask[5]);
  EXPECT_EQ(0x00, mask[6]);
  Ipv6Network network("2001:db8:99::/48");
  EXPECT_TRUE(network.Contains(Ipv6Address("2001:db8:99:ffff::1")));
  EXPECT_FALSE(network.Contains(Ipv6Address("2001:db8:98::1")));
  EXPECT_TRUE(Ipv6Network("::/0").Contains(Ipv6Address("ff02::1")));
}

} // namespace
