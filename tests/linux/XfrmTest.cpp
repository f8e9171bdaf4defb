//===- XfrmTest.cpp - IPsec policies and states against ip xfrm -----------===//
#include "Lab.h"

#include "LinuxNet/Error.h"
#include "LinuxNet/Xfrm.h"

#include <cerrno>
#include <netinet/in.h>

using namespace LinuxNet;
using namespace LinuxNetTest;

namespace {

using XfrmTest = LabTest;

/// ip xfrm's text with runs of blanks and line breaks made single blanks.
std::string Flat(const std::string& text) {
  std::string flat;
  for (char c : text) {
    const bool blank = c == ' ' || c == '\t' || c == '\n';
    if (blank && (flat.empty() || flat.back() == ' '))
      continue;
    flat += blank ? ' ' : c;
  }
  return flat;
}

XfrmPolicy WebPolicy() {
  XfrmPolicy p;
  p.selector.source = IpPrefix::Parse("10.1.0.0/24");
  p.selector.destination = IpPrefix::Parse("198.51.100.0/24");
  p.selector.protocol = IPPROTO_TCP;
  p.selector.destinationPort = 443;
  p.direction = XfrmOut;
  p.priority = 100;
  XfrmTemplate t;
  t.source = IpAddress::Parse("10.1.0.2");
  t.destination = IpAddress::Parse("198.51.100.1");
  t.reqid = 7;
  p.templates.push_back(t);
  return p;
}

TEST_F(XfrmTest, PoliciesAddListAndDeleteAgreeWithIpXfrm) {
  EXPECT_TRUE(ListXfrmPolicies(*ns_).empty());
  AddXfrmPolicy(*ns_, WebPolicy());
  XfrmPolicy block;
  block.selector.source = IpPrefix::Parse("2001:db8::/64");
  block.selector.destination = IpPrefix::Parse("2001:db8:1::/64");
  block.direction = XfrmIn;
  block.action = XfrmBlock;
  AddXfrmPolicy(*ns_, block);

  const std::string oracle = Flat(Ip("xfrm policy"));
  EXPECT_NE(oracle.find("src 10.1.0.0/24 dst 198.51.100.0/24 proto tcp dport 443 dir out "
                        "priority 100 ptype main tmpl src 10.1.0.2 dst 198.51.100.1 proto esp "
                        "reqid 7 mode transport"),
            std::string::npos)
      << oracle;
  EXPECT_NE(oracle.find("src 2001:db8::/64 dst 2001:db8:1::/64 dir in action block"),
            std::string::npos)
      << oracle;

  const auto policies = ListXfrmPolicies(*ns_);
  ASSERT_EQ(policies.size(), 2u);
  const XfrmPolicy& web = policies[0].direction == XfrmOut ? policies[0] : policies[1];
  EXPECT_EQ(web.selector.source.ToString(), "10.1.0.0/24");
  EXPECT_EQ(web.selector.destination.ToString(), "198.51.100.0/24");
  EXPECT_EQ(web.selector.destinationPort, 443);
  EXPECT_EQ(web.selector.protocol, IPPROTO_TCP);
  EXPECT_EQ(web.priority, 100u);
  EXPECT_NE(web.index, 0u);
  ASSERT_EQ(web.templates.size(), 1u);
  EXPECT_EQ(web.templates[0].destination.ToString(), "198.51.100.1");
  EXPECT_EQ(web.templates[0].reqid, 7u);
  EXPECT_EQ(web.templates[0].protocol, XfrmEsp);

  try {
    AddXfrmPolicy(*ns_, WebPolicy());
    ADD_FAILURE() << "a duplicate policy was taken";
  } catch (const Error& e) {
    EXPECT_EQ(e.Code(), EEXIST);
    EXPECT_STREQ(e.what(),
                 "the IPsec policy 10.1.0.0/24 -> 198.51.100.0/24 dir out: already exists");
  }
  DeleteXfrmPolicy(*ns_, WebPolicy().selector, XfrmOut);
  DeleteXfrmPolicy(*ns_, block.selector, XfrmIn);
  EXPECT_EQ(Flat(Ip("xfrm policy")), "");
  EXPECT_THROW(DeleteXfrmPolicy(*ns_, block.selector, XfrmIn), Error);
}

TEST_F(XfrmTest, StatesAddListAndDeleteAgreeWithIpXfrm) {
  XfrmState st;
  st.source = IpAddress::Parse("10.1.0.2");
  st.destination = IpAddress::Parse("198.51.100.1");
  st.spi = 0x100;
  st.reqid = 7;
  st.encryption = {"cbc(aes)", std::vector<uint8_t>(16, 0x11), 0};
  st.integrity = {"hmac(sha256)", std::vector<uint8_t>(32, 0x22), 128};
  EXPECT_TRUE(ListXfrmStates(*ns_).empty());
  try {
    AddXfrmState(*ns_, st);
  } catch (const Error& e) {
    // Kernels without the ESP module refuse every state; the refusal must
    // name the state, and nothing may be left behind.
    EXPECT_EQ(
        std::string(e.what()).rfind("the IPsec state esp spi 0x00000100 to 198.51.100.1: ", 0), 0u)
        << e.what();
    EXPECT_TRUE(ListXfrmStates(*ns_).empty());
    EXPECT_EQ(Flat(Ip("xfrm state")), "");
    GTEST_SKIP() << "this kernel cannot hold ESP states (" << e.what() << ")";
  }
  const std::string oracle = Flat(Ip("xfrm state"));
  EXPECT_NE(oracle.find("src 10.1.0.2 dst 198.51.100.1 proto esp spi 0x00000100 reqid 7 mode "
                        "transport"),
            std::string::npos)
      << oracle;
  const auto states = ListXfrmStates(*ns_);
  ASSERT_EQ(states.size(), 1u);
  EXPECT_EQ(states[0].spi, 0x100u);
  EXPECT_EQ(states[0].encryption.name, "cbc(aes)");
  EXPECT_EQ(states[0].encryption.key, st.encryption.key);
  EXPECT_EQ(states[0].integrity.truncationBits, 128u);
  DeleteXfrmState(*ns_, st.destination, st.spi, XfrmEsp);
  EXPECT_EQ(Flat(Ip("xfrm state")), "");
}

} // namespace
