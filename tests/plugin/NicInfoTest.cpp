//===- NicInfoTest.cpp - Record conversions of the NIC commands -----------===//
//
// The code-to-text tables of network nic get, the merge of network nic set's
// parameters into the NIC information record, and the reading of vf-id.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "HostCtl/Network/PnicRecords.h"
#include "nic.h"
#include "nic/NicText.h"

#include <gtest/gtest.h>

namespace {

using namespace CorvexCli::NetworkNamespace;
using Fabrik::CallSpec::Input;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::PnicInfo;
using HostCtl::Network::PnicLinkMode;

TEST(NicTextTest, PortCableAndWakeOnTables) {
  EXPECT_EQ(PortToString(0), "TP");
  EXPECT_EQ(PortToString(6), "BACKPLANE");
  EXPECT_EQ(PortToString(7), "UNKNOWN");
  EXPECT_EQ(CableTypeToString(0), "Twisted Pair");
  EXPECT_EQ(CableTypeToString(5), "DA");
  EXPECT_EQ(CableTypeToString(7), "");
  EXPECT_EQ(WakeOnToString(1), "Unicast Messagess");
  EXPECT_EQ(WakeOnToString(6),
            "Enable SecureOn(tm) Password for" + std::string(28, ' ') + "MagicPacket(tm)");
  EXPECT_EQ(WakeOnToString(8), "Disabled");
  EXPECT_EQ(WakeOnToString(9), "None");
}

TEST(NicTextTest, LinkModes) {
  EXPECT_EQ(LinkModeToString(PnicLinkMode{1000, 1, 2}), "1000BaseT/Full");
  EXPECT_EQ(LinkModeToString(PnicLinkMode{100, 2, 2}), "100BaseT/Half");
  EXPECT_EQ(LinkModeToString(PnicLinkMode{25000, 0, 14}), "25000BaseCR1/Auto");
  EXPECT_EQ(LinkModeToString(PnicLinkMode{0, 1, 2}), "Auto");
  EXPECT_EQ(LinkModeToString(PnicLinkMode{10000, 1, 38}), "10000BaseCR2/Full");
  EXPECT_EQ(LinkModeToString(PnicLinkMode{10000, 1, 39}), "10000Unknown/Full");
  EXPECT_EQ(LinkModeToString(PnicLinkMode{10000, 3, 24}), "10000BaseSFI/");
}

TEST(NicTextTest, VfIdIsReadAsStrtolDoes) {
  EXPECT_EQ(ParseVfId("3"), 3);
  EXPECT_EQ(ParseVfId("  12abc"), 12);
  EXPECT_EQ(ParseVfId("+7"), 7);
  EXPECT_EQ(ParseVfId("-1"), -1);
  EXPECT_EQ(ParseVfId("abc"), 0);
  EXPECT_EQ(ParseVfId(""), 0);
  EXPECT_EQ(ParseVfId("4294967296"), 4294967296L);
}

/// NicSet::GetInfoFromParam on a record as the host would give it.
class GetInfoFromParamTest : public ::testing::Test {
protected:
  void SetUp() override {
    record_.port = 0;
    record_.phyAddress = 3;
    record_.transceiver = 0;
    record_.supportsWakeOn = true;
    record_.wakeOn = {5};
    record_.messageLevelSupported = true;
    record_.messageLevel = 7;
  }
  bool Merge() { return command_->GetInfoFromParam(input_, record_); }
  std::string Refusal() {
    try {
      Merge();
    } catch (const HostCtlException& refusal) {
      return refusal.what();
    }
    return "";
  }

  std::shared_ptr<NicSet> command_ = NicSet::New();
  std::shared_ptr<Input> input_ = Input::New();
  PnicInfo record_;
};

TEST_F(GetInfoFromParamTest, SamePortAloneIsNoChange) {
  input_->SetString("port", "tp");
  EXPECT_FALSE(Merge());
  EXPECT_FALSE(record_.portChanged);
}

TEST_F(GetInfoFromParamTest, SamePortWithNewPhyAddressIsApplied) {
  input_->SetString("port", "tp");
  input_->SetInt("phy-address", 9);
  EXPECT_TRUE(Merge());
  EXPECT_FALSE(record_.portChanged);
  EXPECT_TRUE(record_.phyAddressChanged);
  EXPECT_EQ(record_.phyAddress, 9u);
}

TEST_F(GetInfoFromParamTest, SettingsChangeTheirFlagsOnly) {
  input_->SetString("port", "backplane");
  input_->SetString("virtual-address", "02:00:00:00:00:01");
  input_->SetString("transceiver-type", "external");
  input_->SetInt("message-level", 7);
  EXPECT_TRUE(Merge());
  EXPECT_EQ(record_.port, 6u);
  EXPECT_TRUE(record_.portChanged);
  EXPECT_TRUE(record_.virtualAddressChanged);
  EXPECT_EQ(record_.transceiver, 1u);
  EXPECT_TRUE(record_.transceiverChanged);
  EXPECT_FALSE(record_.messageLevelChanged); // same level
  EXPECT_FALSE(record_.wakeOnChanged);
}

TEST_F(GetInfoFromParamTest, PhyAddressBounds) {
  input_->SetInt("phy-address", -1);
  EXPECT_FALSE(Merge());
  input_->SetInt("phy-address", 0);
  EXPECT_EQ(Refusal(), "Invalid PHY address value.");
  input_->SetInt("phy-address", -2);
  EXPECT_EQ(Refusal(), "Invalid PHY address value.");
  // 2^32 + 1 must not be taken for address 1: the record holds 32 bits.
  input_->SetInt("phy-address", 4294967297L);
  EXPECT_EQ(Refusal(), "option --phy-address: value 4294967297 is out of range [1 - 4294967295]");
  input_->SetInt("phy-address", 4294967295L);
  EXPECT_TRUE(Merge());
  EXPECT_EQ(record_.phyAddress, 4294967295u);
}

TEST_F(GetInfoFromParamTest, MessageLevelMustFitThirtyTwoBits) {
  input_->SetInt("message-level", 4294967295L);
  EXPECT_TRUE(Merge());
  EXPECT_EQ(record_.messageLevel, 0xffffffffu);
  record_.messageLevelChanged = false;
  for (long outside : {-1L, 4294967296L}) {
    input_->SetInt("message-level", outside);
    EXPECT_EQ(Refusal(), "option --message-level: value " + std::to_string(outside) +
                             " is out of range [0 - 4294967295]");
  }
}

TEST_F(GetInfoFromParamTest, WakeOnLettersBecomeCodesInOrder) {
  input_->SetString("wake-on-lan", "pgp");
  EXPECT_TRUE(Merge());
  EXPECT_TRUE(record_.wakeOnChanged);
  EXPECT_EQ(record_.wakeOn, (std::vector<uint32_t>{0, 5, 0}));
  input_->SetString("wake-on-lan", "umbas");
  Merge();
  EXPECT_EQ(record_.wakeOn, (std::vector<uint32_t>{1, 2, 3, 4, 6}));
  input_->SetString("wake-on-lan", "pd");
  EXPECT_EQ(Refusal(), "Invalid wol value.");
}

TEST_F(GetInfoFromParamTest, UnsupportedFeaturesAreRefused) {
  record_.supportsWakeOn = false;
  record_.messageLevelSupported = false;
  input_->SetString("wake-on-lan", "g");
  EXPECT_EQ(Refusal(), "Not Support wol.");
  input_ = Input::New();
  input_->SetInt("message-level", 1);
  EXPECT_EQ(Refusal(), "Not Support msglvl.");
}

} // namespace
