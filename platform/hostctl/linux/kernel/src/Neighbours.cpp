//===- Neighbours.cpp - Neighbour dumps and changes ------------------------===//
#include "LinuxNet/Neighbours.h"
#include "LinuxNet/Namespace.h"

#include "Attr.h"
#include "Netlink.h"

#include <linux/neighbour.h>
#include <linux/rtnetlink.h>
#include <netlink/route/neighbour.h>

#include <cerrno>

namespace LinuxNet {

using namespace Detail;

namespace {

struct NeighDeleter {
  void operator()(rtnl_neigh* n) const { rtnl_neigh_put(n); }
};
using NeighPtr = std::unique_ptr<rtnl_neigh, NeighDeleter>;

void DumpFamily(Namespace& ns, Family family, const NameTable& names,
                std::vector<Neighbour>& neighbours) {
  MsgPtr msg = NewMsg(RTM_GETNEIGH, NLM_F_DUMP);
  ndmsg req{};
  req.ndm_family = static_cast<uint8_t>(family);
  if (nlmsg_append(msg.get(), &req, sizeof req, NLMSG_ALIGNTO) < 0)
    throw Error(ENOMEM, "out of memory building a neighbour request");
  ns.Internals().Route().Dump(msg.get(), {"the neighbours", false}, [&](nlmsghdr* h) {
    if (h->nlmsg_type != RTM_NEWNEIGH)
      return;
    const auto* ndm = static_cast<const ndmsg*>(nlmsg_data(h));
    nlattr* tb[NDA_MAX + 1] = {};
    if (nlmsg_parse(h, sizeof(ndmsg), tb, NDA_MAX, nullptr) < 0 || !tb[NDA_DST])
      return;
    Neighbour& n = neighbours.emplace_back();
    n.index = ndm->ndm_ifindex;
    n.device = names[n.index];
    n.address =
        IpAddress::FromBytes(nla_data(tb[NDA_DST]), static_cast<std::size_t>(nla_len(tb[NDA_DST])));
    if (tb[NDA_LLADDR]) {
      const auto* p = static_cast<const uint8_t*>(nla_data(tb[NDA_LLADDR]));
      n.lladdr.assign(p, p + nla_len(tb[NDA_LLADDR]));
    }
    n.state = ndm->ndm_state;
    n.flags = ndm->ndm_flags;
    n.type = ndm->ndm_type;
    nda_cacheinfo ci{};
    if (Get(tb[NDA_CACHEINFO], ci)) {
      n.confirmedAge = ci.ndm_confirmed;
      n.usedAge = ci.ndm_used;
      n.updatedAge = ci.ndm_updated;
    }
    n.probes = Value<uint32_t>(tb[NDA_PROBES]);
  });
}

NeighPtr Build(Namespace& ns, const std::string& device, const IpAddress& address) {
  NeighPtr n(rtnl_neigh_alloc());
  if (!n)
    throw Error(ENOMEM, "out of memory building a neighbour request");
  rtnl_neigh_set_ifindex(n.get(), IfIndex(ns, device));
  rtnl_neigh_set_family(n.get(), static_cast<int>(address.family));
  AddrPtr dst = ToNlAddr(address);
  rtnl_neigh_set_dst(n.get(), dst.get());
  return n;
}

} // namespace

std::vector<Neighbour> ListNeighbours(Namespace& ns, Family family) {
  NameTable names(ns);
  std::vector<Neighbour> neighbours;
  if (family != Family::Ipv6)
    DumpFamily(ns, Family::Ipv4, names, neighbours);
  if (family != Family::Ipv4)
    DumpFamily(ns, Family::Ipv6, names, neighbours);
  return neighbours;
}

void AddNeighbour(Namespace& ns, const NeighbourSpec& wanted, bool replace) {
  NlSocket& s = ns.Internals().Route();
  if (!wanted.address.IsSet())
    throw Error(EINVAL, "a neighbour needs an address");
  NeighPtr n = Build(ns, wanted.device, wanted.address);
  if (!wanted.lladdr.empty()) {
    AddrPtr ll = ToNlAddr(wanted.lladdr);
    rtnl_neigh_set_lladdr(n.get(), ll.get());
  }
  rtnl_neigh_set_state(n.get(), wanted.state);
  if (wanted.router)
    rtnl_neigh_set_flags(n.get(), NTF_ROUTER);
  s.Check(rtnl_neigh_add(s.Get(), n.get(), NLM_F_CREATE | (replace ? NLM_F_REPLACE : NLM_F_EXCL)),
          {"neighbour " + wanted.address.ToString() + " on " + wanted.device});
}

void DeleteNeighbour(Namespace& ns, const std::string& device, const IpAddress& address) {
  NlSocket& s = ns.Internals().Route();
  NeighPtr n = Build(ns, device, address);
  s.Check(rtnl_neigh_delete(s.Get(), n.get(), 0),
          {"neighbour " + address.ToString() + " on " + device});
}

std::string NeighbourStateName(uint16_t state) {
  static const std::pair<uint16_t, const char*> names[] = {
      {NudIncomplete, "INCOMPLETE"}, {NudReachable, "REACHABLE"}, {NudStale, "STALE"},
      {NudDelay, "DELAY"},           {NudProbe, "PROBE"},         {NudFailed, "FAILED"},
      {NudNoArp, "NOARP"},           {NudPermanent, "PERMANENT"}};
  std::string text;
  for (const auto& [bit, name] : names)
    if (state & bit)
      text += text.empty() ? name : std::string(",") + name;
  return text.empty() ? "NONE" : text;
}

} // namespace LinuxNet
