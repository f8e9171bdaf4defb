//===- Dcb.cpp - dcbnl requests and replies --------------------------------===//
//
// libnl has no dcbnl module; requests are built and replies read with its
// message and attribute helpers, on the rtnetlink socket.
//
//===----------------------------------------------------------------------===//
#include "LinuxNet/Dcb.h"
#include "LinuxNet/Namespace.h"

#include "Attr.h"
#include "Netlink.h"

#include <linux/dcbnl.h>
#include <linux/rtnetlink.h>

#include <cerrno>

namespace LinuxNet {

using namespace Detail;

namespace {

/// A reply copied to aligned storage with its top-level attributes parsed.
class DcbReply {
public:
  explicit DcbReply(std::span<const uint8_t> bytes) {
    if (bytes.size() < NLMSG_HDRLEN + sizeof(dcbmsg) || bytes.size() > (1u << 20))
      throw Error(EPROTO,
                  "a DCB reply of " + std::to_string(bytes.size()) + " bytes cannot be read");
    storage_.resize((bytes.size() + 7) / 8);
    std::copy(bytes.begin(), bytes.end(), reinterpret_cast<uint8_t*>(storage_.data()));
    auto* h = reinterpret_cast<nlmsghdr*>(storage_.data());
    if (h->nlmsg_len > bytes.size() || h->nlmsg_len < NLMSG_HDRLEN + sizeof(dcbmsg) ||
        nlmsg_parse(h, sizeof(dcbmsg), tb, DCB_ATTR_MAX, nullptr) < 0)
      throw Error(EPROTO, "a DCB reply is malformed");
  }
  nlattr* tb[DCB_ATTR_MAX + 1] = {}; ///< Attributes by type.

private:
  std::vector<uint64_t> storage_; ///< The message, 8-byte aligned.
};

/// The reply to dcbnl command \p cmd for \p dev; \p capabilityRequest asks for
/// every capability.
std::vector<uint8_t> Ask(Namespace& ns, const std::string& dev, uint8_t cmd, const Subject& subject,
                         bool capabilityRequest = false) {
  MsgPtr msg = NewMsg(RTM_GETDCB, 0);
  dcbmsg d{};
  d.dcb_family = AF_UNSPEC;
  d.cmd = cmd;
  bool ok = nlmsg_append(msg.get(), &d, sizeof d, NLMSG_ALIGNTO) == 0 &&
            nla_put_string(msg.get(), DCB_ATTR_IFNAME, dev.c_str()) == 0;
  if (ok && capabilityRequest) {
    nlattr* caps = nla_nest_start(msg.get(), DCB_ATTR_CAP);
    ok = caps && nla_put_flag(msg.get(), DCB_CAP_ATTR_ALL) == 0;
    if (ok)
      nla_nest_end(msg.get(), caps);
  }
  if (!ok)
    throw Error(ENOMEM, "out of memory building a DCB request");
  std::vector<uint8_t> reply;
  ns.Internals().Route().Request(msg.get(), subject, [&](nlmsghdr* h) {
    const auto* p = reinterpret_cast<const uint8_t*>(h);
    reply.assign(p, p + h->nlmsg_len);
  });
  if (reply.empty())
    throw Error(EPROTO, dev + ": the kernel sent no DCB reply");
  return reply;
}

template <std::size_t N> void Copy(std::array<uint8_t, N>& to, const uint8_t (&from)[N]) {
  std::copy(std::begin(from), std::end(from), to.begin());
}

} // namespace

namespace DcbWire {

DcbCapabilities ParseCapabilities(std::span<const uint8_t> message) {
  DcbReply r(message);
  nlattr* cap[DCB_CAP_ATTR_MAX + 1];
  DcbCapabilities c;
  if (!ParseNested(cap, DCB_CAP_ATTR_MAX, r.tb[DCB_ATTR_CAP]))
    return c;
  c.priorityGroups = Value<uint8_t>(cap[DCB_CAP_ATTR_PG]) != 0;
  c.priorityFlowControl = Value<uint8_t>(cap[DCB_CAP_ATTR_PFC]) != 0;
  c.upToTc = Value<uint8_t>(cap[DCB_CAP_ATTR_UP2TC]) != 0;
  c.pgTrafficClasses = Value<uint8_t>(cap[DCB_CAP_ATTR_PG_TCS]);
  c.pfcTrafficClasses = Value<uint8_t>(cap[DCB_CAP_ATTR_PFC_TCS]);
  c.groupStrictPriority = Value<uint8_t>(cap[DCB_CAP_ATTR_GSP]) != 0;
  c.dcbx = Value<uint8_t>(cap[DCB_CAP_ATTR_DCBX]);
  return c;
}

DcbIeee ParseIeee(std::span<const uint8_t> message) {
  DcbReply r(message);
  nlattr* ieee[DCB_ATTR_IEEE_MAX + 1];
  DcbIeee result;
  if (!ParseNested(ieee, DCB_ATTR_IEEE_MAX, r.tb[DCB_ATTR_IEEE]))
    return result;
  ieee_ets ets{};
  if (Get(ieee[DCB_ATTR_IEEE_ETS], ets)) {
    DcbEts& e = result.ets.emplace();
    e.willing = ets.willing;
    e.etsCapability = ets.ets_cap;
    e.creditBasedShaper = ets.cbs;
    Copy(e.txBandwidth, ets.tc_tx_bw);
    Copy(e.rxBandwidth, ets.tc_rx_bw);
    Copy(e.tsa, ets.tc_tsa);
    Copy(e.priorityTc, ets.prio_tc);
    Copy(e.recommendedBandwidth, ets.tc_reco_bw);
    Copy(e.recommendedTsa, ets.tc_reco_tsa);
    Copy(e.recommendedPriorityTc, ets.reco_prio_tc);
  }
  ieee_pfc pfc{};
  if (Get(ieee[DCB_ATTR_IEEE_PFC], pfc)) {
    DcbPfc& p = result.pfc.emplace();
    p.capability = pfc.pfc_cap;
    p.enabled = pfc.pfc_en;
    p.macsecBypass = pfc.mbc;
    p.delay = pfc.delay;
    std::copy(std::begin(pfc.requests), std::end(pfc.requests), p.requests.begin());
    std::copy(std::begin(pfc.indications), std::end(pfc.indications), p.indications.begin());
  }
  if (const nlattr* table = ieee[DCB_ATTR_IEEE_APP_TABLE]) {
    int remaining = 0;
    const nlattr* app = nullptr;
    nla_for_each_nested(app, table, remaining) {
      dcb_app entry{};
      if (nla_type(app) == DCB_ATTR_IEEE_APP && Get(app, entry))
        result.apps.push_back({entry.selector, entry.priority, entry.protocol});
    }
  }
  return result;
}

} // namespace DcbWire

DcbInfo GetDcb(Namespace& ns, const std::string& dev) {
  Subject subject{dev, false, "DCB"};
  DcbInfo info;
  try {
    DcbReply state(Ask(ns, dev, DCB_CMD_GSTATE, subject));
    info.enabled = Value<uint8_t>(state.tb[DCB_ATTR_STATE]) != 0;
  } catch (const Error& e) {
    RethrowForLink(ns, dev, subject, e);
  }
  // A driver with DCB may still lack one of the parts.
  auto optional = [&](auto read) {
    try {
      read();
    } catch (const Error& e) {
      if (e.Code() != EOPNOTSUPP && e.Code() != EINVAL)
        throw;
    }
  };
  optional([&] {
    DcbReply dcbx(Ask(ns, dev, DCB_CMD_GDCBX, subject));
    if (dcbx.tb[DCB_ATTR_DCBX])
      info.dcbx = Value<uint8_t>(dcbx.tb[DCB_ATTR_DCBX]);
  });
  optional([&] {
    info.capabilities = DcbWire::ParseCapabilities(Ask(ns, dev, DCB_CMD_GCAP, subject, true));
  });
  optional([&] { info.ieee = DcbWire::ParseIeee(Ask(ns, dev, DCB_CMD_IEEE_GET, subject)); });
  return info;
}

} // namespace LinuxNet
