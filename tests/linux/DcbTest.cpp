//===- DcbTest.cpp - DCB state: refusal on veth, replies of a DCB NIC -----===//
#include "Lab.h"

#include "LinuxNet/Dcb.h"

#include <cerrno>

using namespace LinuxNet;
using namespace LinuxNetTest;

namespace {

#include "DcbReplies.inc"

using DcbTest = LabTest;

TEST_F(DcbTest, ADriverWithoutDcbIsRefusedByName) {
  ExpectError([&] { GetDcb(*ns_, "vmnic0"); }, EOPNOTSUPP,
              "vmnic0: the driver veth does not support DCB");
  ExpectError([&] { GetDcb(*ns_, "nosuch0"); }, ENODEV, "the link nosuch0 does not exist");
}

TEST(DcbWire, CapabilitiesAndIeeeConfigurationOfANic) {
  const DcbCapabilities caps =
      DcbWire::ParseCapabilities({kDcbCapabilities, sizeof kDcbCapabilities});
  EXPECT_TRUE(caps.priorityGroups);
  EXPECT_TRUE(caps.priorityFlowControl);
  EXPECT_TRUE(caps.upToTc);
  EXPECT_FALSE(caps.groupStrictPriority);
  EXPECT_EQ(caps.pgTrafficClasses, 0x80);
  EXPECT_EQ(caps.dcbx, DcbxHost | DcbxIeee | DcbxCee);

  const DcbIeee ieee = DcbWire::ParseIeee({kDcbIeee, sizeof kDcbIeee});
  ASSERT_TRUE(ieee.ets);
  EXPECT_EQ(ieee.ets->willing, 1);
  EXPECT_EQ(ieee.ets->etsCapability, 8);
  EXPECT_EQ(ieee.ets->txBandwidth, (std::array<uint8_t, 8>{50, 30, 20, 0, 0, 0, 0, 0}));
  EXPECT_EQ(ieee.ets->priorityTc, (std::array<uint8_t, 8>{0, 0, 1, 1, 2, 2, 2, 2}));
  EXPECT_EQ(ieee.ets->tsa[2], 2); // ETS
  ASSERT_TRUE(ieee.pfc);
  EXPECT_EQ(ieee.pfc->enabled, 0x08);
  EXPECT_EQ(ieee.pfc->delay, 32);
  EXPECT_EQ(ieee.pfc->requests[3], 1234u);
  EXPECT_EQ(ieee.pfc->indications[3], 56u);
  ASSERT_EQ(ieee.apps.size(), 2u);
  EXPECT_EQ(ieee.apps[0].selector, 1);
  EXPECT_EQ(ieee.apps[0].protocol, 0x8906); // FCoE
  EXPECT_EQ(ieee.apps[0].priority, 3);
  EXPECT_EQ(ieee.apps[1].protocol, 4791); // RoCEv2

  EXPECT_THROW(DcbWire::ParseIeee({kDcbIeee, 12}), Error);
  std::vector<uint8_t> lying(kDcbIeee, kDcbIeee + sizeof kDcbIeee);
  lying[1] = 0x40; // longer than the bytes
  EXPECT_THROW(DcbWire::ParseIeee(lying), Error);
}

} // namespace
