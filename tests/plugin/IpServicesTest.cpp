//===- IpServicesTest.cpp - Conversions of the IP service commands --------===//
#include "ip.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>

namespace {

using namespace CorvexCli::NetworkNamespace;

TEST(IpServicesConversionTest, LifetimeShowsOnlyTheNonZeroParts) {
  EXPECT_EQ("infinite", ConvertToHrsMinsAndSecs(0));
  EXPECT_EQ("59s ", ConvertToHrsMinsAndSecs(59));
  EXPECT_EQ("1m ", ConvertToHrsMinsAndSecs(60));
  EXPECT_EQ("1h ", ConvertToHrsMinsAndSecs(3600));
  EXPECT_EQ("1h 1m 1s ", ConvertToHrsMinsAndSecs(3661));
  EXPECT_EQ("1h 1s ", ConvertToHrsMinsAndSecs(3601));
  EXPECT_EQ("27h 46m 40s ", ConvertToHrsMinsAndSecs(100000));
}

TEST(IpServicesConversionTest, EndpointsBracketAddressesWithColons) {
  EXPECT_EQ("10.0.0.5:22", ConnectionEndpointText("10.0.0.5", 22));
  EXPECT_EQ("[2001:db8::5]:22", ConnectionEndpointText("2001:db8::5", 22));
  EXPECT_EQ("[::]:0", ConnectionEndpointText("::", 0));
  EXPECT_EQ("0.0.0.0:65535", ConnectionEndpointText("0.0.0.0", 65535));
}

TEST(IpServicesConversionTest, TcpStatesAreNamedUpToTimeWait) {
  EXPECT_EQ("CLOSED", TcpStateName(0));
  EXPECT_EQ("RCVD", TcpStateName(3));
  EXPECT_EQ("ESTABLISHED", TcpStateName(4));
  EXPECT_EQ("TIME_WAIT", TcpStateName(10));
  EXPECT_EQ("", TcpStateName(11));
  EXPECT_EQ("", TcpStateName(UINT32_MAX));
}

TEST(IpServicesConversionTest, SpiIsReadAsWholeHexNumber) {
  uint32_t spi = 0;
  EXPECT_TRUE(ParseSpiText("1f4", spi));
  EXPECT_EQ(500u, spi);
  EXPECT_TRUE(ParseSpiText("0x1F4", spi));
  EXPECT_EQ(500u, spi);
  EXPECT_TRUE(ParseSpiText("ffffffff", spi));
  EXPECT_EQ(0xffffffffu, spi);
  // Leading blanks and a plus sign are taken, as a stream extraction takes them.
  for (const char* signedOrBlank : {" 1f6", "\t 1f6", "+1f6", "  +0x1F6"}) {
    spi = 0;
    EXPECT_TRUE(ParseSpiText(signedOrBlank, spi)) << signedOrBlank;
    EXPECT_EQ(0x1f6u, spi) << signedOrBlank;
  }
  spi = 7;
  for (const char* bad :
       {"1f4g", "", " ", "g", "100000000", "-1", " -1", "+-1", "+ 1f4", "1f4 ", "0x", "--1"}) {
    EXPECT_FALSE(ParseSpiText(bad, spi)) << bad;
    EXPECT_EQ(7u, spi) << bad;
  }
}

} // namespace
