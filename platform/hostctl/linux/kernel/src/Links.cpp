//===- Links.cpp - Link dumps and link changes -----------------------------===//
#include "LinuxNet/Links.h"
#include "LinuxNet/Namespace.h"

#include "Attr.h"
#include "Netlink.h"

#include <linux/if.h>
#include <linux/if_link.h>
#include <linux/rtnetlink.h>
#include <netlink/route/link.h>
#include <netlink/route/link/bridge.h>
#include <netlink/route/link/veth.h>

#include <cerrno>

namespace LinuxNet {

using namespace Detail;

namespace {

struct LinkDeleter {
  void operator()(rtnl_link* l) const { rtnl_link_put(l); }
};
using LinkPtr = std::unique_ptr<rtnl_link, LinkDeleter>;

LinkPtr NewLink() {
  LinkPtr link(rtnl_link_alloc());
  if (!link)
    throw Error(ENOMEM, "out of memory building a link request");
  return link;
}

HwAddress HwBytes(const nlattr* a) {
  if (!a)
    return {};
  const auto* p = static_cast<const uint8_t*>(nla_data(a));
  return HwAddress(p, p + nla_len(a));
}

Link ParseLink(nlmsghdr* h);

void ParseVfs(const nlattr* list, std::size_t macLength, std::vector<VfInfo>& vfs) {
  int remaining = 0;
  const nlattr* vf = nullptr;
  nla_for_each_nested(vf, list, remaining) {
    if (nla_type(vf) != IFLA_VF_INFO)
      continue;
    nlattr* tb[IFLA_VF_MAX + 1];
    if (!ParseNested(tb, IFLA_VF_MAX, vf))
      continue;
    VfInfo info;
    ifla_vf_mac mac{};
    if (Get(tb[IFLA_VF_MAC], mac)) {
      info.index = mac.vf;
      info.mac.assign(mac.mac, mac.mac + std::min<std::size_t>(macLength ? macLength : 6, 32));
    }
    ifla_vf_vlan vlan{};
    if (Get(tb[IFLA_VF_VLAN], vlan)) {
      info.vlan = vlan.vlan;
      info.qos = vlan.qos;
    }
    ifla_vf_rate rate{};
    ifla_vf_tx_rate txRate{};
    if (Get(tb[IFLA_VF_RATE], rate)) {
      info.minTxRate = rate.min_tx_rate;
      info.maxTxRate = rate.max_tx_rate;
    } else if (Get(tb[IFLA_VF_TX_RATE], txRate)) {
      info.maxTxRate = txRate.rate;
    }
    ifla_vf_spoofchk spoof{};
    if (Get(tb[IFLA_VF_SPOOFCHK], spoof) && spoof.setting != static_cast<uint32_t>(-1))
      info.spoofCheck = spoof.setting ? 1 : 0;
    ifla_vf_trust trust{};
    if (Get(tb[IFLA_VF_TRUST], trust) && trust.setting != static_cast<uint32_t>(-1))
      info.trust = trust.setting ? 1 : 0;
    ifla_vf_link_state state{};
    if (Get(tb[IFLA_VF_LINK_STATE], state))
      info.linkState = state.link_state;
    nlattr* st[IFLA_VF_STATS_MAX + 1];
    if (ParseNested(st, IFLA_VF_STATS_MAX, tb[IFLA_VF_STATS])) {
      info.hasStats = true;
      info.rxPackets = Value<uint64_t>(st[IFLA_VF_STATS_RX_PACKETS]);
      info.txPackets = Value<uint64_t>(st[IFLA_VF_STATS_TX_PACKETS]);
      info.rxBytes = Value<uint64_t>(st[IFLA_VF_STATS_RX_BYTES]);
      info.txBytes = Value<uint64_t>(st[IFLA_VF_STATS_TX_BYTES]);
      info.broadcast = Value<uint64_t>(st[IFLA_VF_STATS_BROADCAST]);
      info.multicast = Value<uint64_t>(st[IFLA_VF_STATS_MULTICAST]);
      info.rxDropped = Value<uint64_t>(st[IFLA_VF_STATS_RX_DROPPED]);
      info.txDropped = Value<uint64_t>(st[IFLA_VF_STATS_TX_DROPPED]);
    }
    vfs.push_back(std::move(info));
  }
}

} // namespace

Link ParseLinkMessage(std::span<const uint8_t> message) {
  if (message.size() < NLMSG_HDRLEN + sizeof(ifinfomsg) || message.size() > (1u << 20))
    throw Error(EPROTO,
                "a link message of " + std::to_string(message.size()) + " bytes cannot be read");
  std::vector<uint64_t> storage((message.size() + 7) / 8);
  std::copy(message.begin(), message.end(), reinterpret_cast<uint8_t*>(storage.data()));
  auto* h = reinterpret_cast<nlmsghdr*>(storage.data());
  if (h->nlmsg_type != RTM_NEWLINK || h->nlmsg_len > message.size() ||
      h->nlmsg_len < NLMSG_HDRLEN + sizeof(ifinfomsg))
    throw Error(EPROTO, "a link message is malformed");
  return ParseLink(h);
}

namespace {

Link ParseLink(nlmsghdr* h) {
  Link link;
  const auto* ifi = static_cast<const ifinfomsg*>(nlmsg_data(h));
  link.index = ifi->ifi_index;
  link.type = ifi->ifi_type;
  link.flags = ifi->ifi_flags;
  link.adminUp = ifi->ifi_flags & IFF_UP;
  link.lowerUp = ifi->ifi_flags & IFF_LOWER_UP;
  nlattr* tb[IFLA_MAX + 1] = {};
  if (nlmsg_parse(h, sizeof(ifinfomsg), tb, IFLA_MAX, nullptr) < 0)
    return link;
  link.name = String(tb[IFLA_IFNAME]);
  link.master = static_cast<int>(Value<uint32_t>(tb[IFLA_MASTER]));
  link.link = static_cast<int>(Value<uint32_t>(tb[IFLA_LINK]));
  link.linkInOtherNamespace = tb[IFLA_LINK_NETNSID] != nullptr;
  link.carrier = Value<uint8_t>(tb[IFLA_CARRIER]) != 0;
  link.operState = static_cast<OperState>(Value<uint8_t>(tb[IFLA_OPERSTATE]));
  link.mtu = Value<uint32_t>(tb[IFLA_MTU]);
  link.minMtu = Value<uint32_t>(tb[IFLA_MIN_MTU]);
  link.maxMtu = Value<uint32_t>(tb[IFLA_MAX_MTU]);
  link.address = HwBytes(tb[IFLA_ADDRESS]);
  link.broadcast = HwBytes(tb[IFLA_BROADCAST]);
  link.permAddress = HwBytes(tb[IFLA_PERM_ADDRESS]);
  link.alias = String(tb[IFLA_IFALIAS]);
  link.qdisc = String(tb[IFLA_QDISC]);
  link.txQueueLength = Value<uint32_t>(tb[IFLA_TXQLEN]);
  link.numTxQueues = Value<uint32_t>(tb[IFLA_NUM_TX_QUEUES]);
  link.numRxQueues = Value<uint32_t>(tb[IFLA_NUM_RX_QUEUES]);
  link.parentDevice = String(tb[IFLA_PARENT_DEV_NAME]);
  link.parentBus = String(tb[IFLA_PARENT_DEV_BUS_NAME]);
  link.numVfs = Value<uint32_t>(tb[IFLA_NUM_VF]);
  nlattr* info[IFLA_INFO_MAX + 1];
  if (ParseNested(info, IFLA_INFO_MAX, tb[IFLA_LINKINFO])) {
    link.kind = String(info[IFLA_INFO_KIND]);
    link.slaveKind = String(info[IFLA_INFO_SLAVE_KIND]);
  }
  if (tb[IFLA_PROP_LIST]) {
    int remaining = 0;
    const nlattr* prop = nullptr;
    nla_for_each_nested(prop, tb[IFLA_PROP_LIST], remaining) {
      if (nla_type(prop) == IFLA_ALT_IFNAME)
        link.altNames.push_back(String(prop));
    }
  }
  rtnl_link_stats64 s{};
  if (GetGrowing(tb[IFLA_STATS64], s)) {
    link.hasStats = true;
    link.stats = {
        s.rx_packets,        s.tx_packets,        s.rx_bytes,         s.tx_bytes,
        s.rx_errors,         s.tx_errors,         s.rx_dropped,       s.tx_dropped,
        s.multicast,         s.collisions,        s.rx_length_errors, s.rx_over_errors,
        s.rx_crc_errors,     s.rx_frame_errors,   s.rx_fifo_errors,   s.rx_missed_errors,
        s.tx_aborted_errors, s.tx_carrier_errors, s.tx_fifo_errors,   s.tx_heartbeat_errors,
        s.tx_window_errors,  s.rx_compressed,     s.tx_compressed,    s.rx_nohandler};
  }
  if (tb[IFLA_VFINFO_LIST])
    ParseVfs(tb[IFLA_VFINFO_LIST], link.address.size(), link.vfs);
  return link;
}

MsgPtr LinkRequest(int flags, bool withVfs) {
  MsgPtr msg = NewMsg(RTM_GETLINK, flags);
  ifinfomsg ifi{};
  ifi.ifi_family = AF_UNSPEC;
  if (nlmsg_append(msg.get(), &ifi, sizeof ifi, NLMSG_ALIGNTO) < 0 ||
      nla_put_u32(msg.get(), IFLA_EXT_MASK, withVfs ? RTEXT_FILTER_VF : 0) < 0)
    throw Error(ENOMEM, "out of memory building a link request");
  return msg;
}

} // namespace

std::vector<Link> ListLinks(Namespace& ns, bool withVfs) {
  std::vector<Link> links;
  MsgPtr msg = LinkRequest(NLM_F_DUMP, withVfs);
  ns.Internals().Route().Dump(msg.get(), {"the links", false}, [&](nlmsghdr* h) {
    if (h->nlmsg_type == RTM_NEWLINK)
      links.push_back(ParseLink(h));
  });
  return links;
}

std::optional<Link> GetLink(Namespace& ns, const std::string& name, bool withVfs) {
  if (name.empty() || name.size() >= IFNAMSIZ)
    return std::nullopt;
  MsgPtr msg = LinkRequest(0, withVfs);
  if (nla_put_string(msg.get(), IFLA_IFNAME, name.c_str()) < 0)
    throw Error(ENOMEM, "out of memory building a link request");
  std::optional<Link> link;
  try {
    ns.Internals().Route().Request(msg.get(), {name, false}, [&](nlmsghdr* h) {
      if (h->nlmsg_type == RTM_NEWLINK)
        link = ParseLink(h);
    });
  } catch (const Error& e) {
    if (e.Code() == ENODEV)
      return std::nullopt;
    throw;
  }
  return link;
}

void ChangeLink(Namespace& ns, const std::string& name, const LinkChange& change) {
  NlSocket& s = ns.Internals().Route();
  const int index = IfIndex(ns, name);
  LinkPtr orig = NewLink();
  LinkPtr request = NewLink();
  rtnl_link_set_ifindex(orig.get(), index);
  if (change.up)
    *change.up ? rtnl_link_set_flags(request.get(), IFF_UP)
               : rtnl_link_unset_flags(request.get(), IFF_UP);
  if (change.mtu)
    rtnl_link_set_mtu(request.get(), *change.mtu);
  if (change.address) {
    AddrPtr a = ToNlAddr(*change.address);
    rtnl_link_set_addr(request.get(), a.get());
  }
  if (change.alias)
    rtnl_link_set_ifalias(request.get(), change.alias->c_str());
  if (change.master)
    rtnl_link_set_master(request.get(), change.master->empty() ? 0 : IfIndex(ns, *change.master));
  if (change.name)
    rtnl_link_set_name(request.get(), change.name->c_str());
  try {
    s.Check(rtnl_link_change(s.Get(), orig.get(), request.get(), 0), {name});
  } catch (const Error& e) {
    if (e.Code() == EEXIST && change.name)
      throw Error(EEXIST, name + ": the name " + *change.name + " is taken");
    throw;
  }
}

void CreateVeth(Namespace& ns, const std::string& name, const std::string& peer) {
  NlSocket& s = ns.Internals().Route();
  LinkPtr link(rtnl_link_veth_alloc());
  if (!link)
    throw Error(ENOMEM, "out of memory building a link request");
  rtnl_link_set_name(link.get(), name.c_str());
  LinkPtr peerLink(rtnl_link_veth_get_peer(link.get()));
  rtnl_link_set_name(peerLink.get(), peer.c_str());
  s.Check(rtnl_link_add(s.Get(), link.get(), NLM_F_CREATE | NLM_F_EXCL), {name});
}

void CreateBridge(Namespace& ns, const std::string& name, uint32_t mtu) {
  NlSocket& s = ns.Internals().Route();
  LinkPtr link(rtnl_link_bridge_alloc());
  if (!link)
    throw Error(ENOMEM, "out of memory building a link request");
  rtnl_link_set_name(link.get(), name.c_str());
  if (mtu)
    rtnl_link_set_mtu(link.get(), mtu);
  s.Check(rtnl_link_add(s.Get(), link.get(), NLM_F_CREATE | NLM_F_EXCL), {name});
}

void DeleteLink(Namespace& ns, const std::string& name) {
  NlSocket& s = ns.Internals().Route();
  LinkPtr link = NewLink();
  rtnl_link_set_ifindex(link.get(), IfIndex(ns, name));
  s.Check(rtnl_link_delete(s.Get(), link.get()), {name});
}

void AddBridgePort(Namespace& ns, const std::string& bridge, const std::string& port) {
  auto master = GetLink(ns, bridge, false);
  if (!master)
    throw Error(ENODEV, "the link " + bridge + " does not exist");
  if (master->kind != "bridge")
    throw Error(EINVAL, bridge + " is not a bridge");
  LinkChange change;
  change.master = bridge;
  ChangeLink(ns, port, change);
}

void RemoveBridgePort(Namespace& ns, const std::string& port) {
  auto link = GetLink(ns, port, false);
  if (!link)
    throw Error(ENODEV, "the link " + port + " does not exist");
  if (!link->master || link->slaveKind != "bridge")
    throw Error(EINVAL, port + " is not a port of a bridge");
  LinkChange change;
  change.master = "";
  ChangeLink(ns, port, change);
}

std::vector<std::string> BridgePorts(Namespace& ns, const std::string& bridge) {
  const int index = IfIndex(ns, bridge);
  std::vector<std::string> ports;
  for (const Link& link : ListLinks(ns))
    if (link.master == index && link.slaveKind == "bridge")
      ports.push_back(link.name);
  return ports;
}

Detail::NameTable::NameTable(Namespace& ns) {
  MsgPtr msg = NewMsg(RTM_GETLINK, NLM_F_DUMP);
  ifinfomsg ifi{};
  if (nlmsg_append(msg.get(), &ifi, sizeof ifi, NLMSG_ALIGNTO) < 0 ||
      nla_put_u32(msg.get(), IFLA_EXT_MASK, RTEXT_FILTER_SKIP_STATS) < 0)
    throw Error(ENOMEM, "out of memory building a link request");
  ns.Internals().Route().Dump(msg.get(), {"the links", false}, [&](nlmsghdr* h) {
    if (h->nlmsg_type != RTM_NEWLINK)
      return;
    const int index = static_cast<const ifinfomsg*>(nlmsg_data(h))->ifi_index;
    const nlattr* name = nlmsg_find_attr(h, sizeof(ifinfomsg), IFLA_IFNAME);
    if (index <= 0 || !name)
      return;
    if (static_cast<std::size_t>(index) >= names_.size())
      names_.resize(static_cast<std::size_t>(index) + 1);
    names_[static_cast<std::size_t>(index)] = String(name);
  });
}

const char* OperStateName(OperState state) {
  static const char* const names[] = {"UNKNOWN", "NOTPRESENT", "DOWN", "LOWERLAYERDOWN",
                                      "TESTING", "DORMANT",    "UP"};
  const auto i = static_cast<std::size_t>(state);
  return i < std::size(names) ? names[i] : "UNKNOWN";
}

} // namespace LinuxNet
