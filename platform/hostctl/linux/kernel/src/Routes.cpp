//===- Routes.cpp - Route dumps and changes --------------------------------===//
#include "LinuxNet/Routes.h"
#include "LinuxNet/Namespace.h"

#include "Attr.h"
#include "Netlink.h"

#include <linux/rtnetlink.h>
#include <netlink/route/nexthop.h>
#include <netlink/route/route.h>

#include <cerrno>

namespace LinuxNet {

using namespace Detail;

namespace {

struct RouteDeleter {
  void operator()(rtnl_route* r) const { rtnl_route_put(r); }
};
using RoutePtr = std::unique_ptr<rtnl_route, RouteDeleter>;

IpAddress AddressOf(const nlattr* a) {
  return a ? IpAddress::FromBytes(nla_data(a), static_cast<std::size_t>(nla_len(a))) : IpAddress{};
}

void DumpFamily(Namespace& ns, Family family, uint32_t table, const NameTable& names,
                std::vector<Route>& routes) {
  MsgPtr msg = NewMsg(RTM_GETROUTE, NLM_F_DUMP);
  rtmsg req{};
  req.rtm_family = static_cast<uint8_t>(family);
  req.rtm_table = table < 256 ? static_cast<uint8_t>(table) : uint8_t{RT_TABLE_UNSPEC};
  // With strict checking the kernel dumps only the table asked for.
  if (nlmsg_append(msg.get(), &req, sizeof req, NLMSG_ALIGNTO) < 0 ||
      nla_put_u32(msg.get(), RTA_TABLE, table) < 0)
    throw Error(ENOMEM, "out of memory building a route request");
  ns.Internals().Route().Dump(msg.get(), {"the routes", false}, [&](nlmsghdr* h) {
    if (h->nlmsg_type != RTM_NEWROUTE)
      return;
    const auto* rtm = static_cast<const rtmsg*>(nlmsg_data(h));
    nlattr* tb[RTA_MAX + 1] = {};
    if (nlmsg_parse(h, sizeof(rtmsg), tb, RTA_MAX, nullptr) < 0)
      return;
    const uint32_t routeTable = tb[RTA_TABLE] ? Value<uint32_t>(tb[RTA_TABLE]) : rtm->rtm_table;
    if (routeTable != table || (rtm->rtm_flags & RTM_F_CLONED))
      return;
    Route& r = routes.emplace_back();
    r.family = static_cast<Family>(rtm->rtm_family);
    r.destination.length = rtm->rtm_dst_len;
    r.destination.address = AddressOf(tb[RTA_DST]);
    if (!r.destination.address.IsSet())
      r.destination.address.family = r.family;
    r.gateway = AddressOf(tb[RTA_GATEWAY]);
    r.index = static_cast<int>(Value<uint32_t>(tb[RTA_OIF]));
    r.device = names[r.index];
    r.protocol = rtm->rtm_protocol;
    r.scope = rtm->rtm_scope;
    r.type = rtm->rtm_type;
    r.table = routeTable;
    r.metric = Value<uint32_t>(tb[RTA_PRIORITY]);
    r.prefSource = AddressOf(tb[RTA_PREFSRC]);
    r.flags = rtm->rtm_flags;
    nlattr* metrics[RTAX_MAX + 1];
    if (ParseNested(metrics, RTAX_MAX, tb[RTA_METRICS]))
      r.mtu = Value<uint32_t>(metrics[RTAX_MTU]);
    if (const nlattr* mp = tb[RTA_MULTIPATH]) {
      const auto* hop = static_cast<const rtnexthop*>(nla_data(mp));
      int left = nla_len(mp);
      while (left >= static_cast<int>(sizeof(rtnexthop)) && hop->rtnh_len >= sizeof(rtnexthop) &&
             hop->rtnh_len <= left) {
        NextHop& n = r.nextHops.emplace_back();
        n.index = hop->rtnh_ifindex;
        n.device = names[n.index];
        n.weight = static_cast<uint8_t>(hop->rtnh_hops + 1);
        n.flags = hop->rtnh_flags;
        nlattr* hb[RTA_MAX + 1] = {};
        const int attrLength = hop->rtnh_len - static_cast<int>(RTNH_ALIGN(sizeof(rtnexthop)));
        if (attrLength > 0 &&
            nla_parse(hb, RTA_MAX,
                      reinterpret_cast<nlattr*>(const_cast<char*>(
                          reinterpret_cast<const char*>(hop) + RTNH_ALIGN(sizeof(rtnexthop)))),
                      attrLength, nullptr) == 0)
          n.gateway = AddressOf(hb[RTA_GATEWAY]);
        left -= RTNH_ALIGN(hop->rtnh_len);
        hop = reinterpret_cast<const rtnexthop*>(reinterpret_cast<const char*>(hop) +
                                                 RTNH_ALIGN(hop->rtnh_len));
      }
    }
  });
}

std::string Describe(const RouteSpec& wanted) {
  std::string text = "route " + wanted.destination.ToString();
  if (wanted.gateway.IsSet())
    text += " via " + wanted.gateway.ToString();
  if (!wanted.device.empty())
    text += " dev " + wanted.device;
  return text;
}

RoutePtr Build(Namespace& ns, const RouteSpec& wanted) {
  RoutePtr r(rtnl_route_alloc());
  if (!r)
    throw Error(ENOMEM, "out of memory building a route request");
  const Family family = wanted.destination.address.family;
  if (wanted.gateway.IsSet() && wanted.gateway.family != family)
    throw Error(EINVAL, Describe(wanted) + ": the gateway is not of the destination's family");
  rtnl_route_set_family(r.get(), static_cast<uint8_t>(family));
  AddrPtr dst = ToNlAddr(wanted.destination.address, wanted.destination.length);
  rtnl_route_set_dst(r.get(), dst.get());
  rtnl_route_set_table(r.get(), wanted.table);
  if (wanted.metric)
    rtnl_route_set_priority(r.get(), wanted.metric);
  if (wanted.prefSource.IsSet()) {
    AddrPtr src = ToNlAddr(wanted.prefSource);
    rtnl_route_set_pref_src(r.get(), src.get());
  }
  if (wanted.gateway.IsSet() || !wanted.device.empty()) {
    rtnl_nexthop* nh = rtnl_route_nh_alloc();
    if (!nh)
      throw Error(ENOMEM, "out of memory building a route request");
    if (!wanted.device.empty())
      rtnl_route_nh_set_ifindex(nh, IfIndex(ns, wanted.device));
    if (wanted.gateway.IsSet()) {
      AddrPtr gw = ToNlAddr(wanted.gateway);
      rtnl_route_nh_set_gateway(nh, gw.get());
    }
    rtnl_route_add_nexthop(r.get(), nh);
  }
  return r;
}

} // namespace

std::vector<Route> ListRoutes(Namespace& ns, Family family, uint32_t table) {
  NameTable names(ns);
  std::vector<Route> routes;
  if (family != Family::Ipv6)
    DumpFamily(ns, Family::Ipv4, table, names, routes);
  if (family != Family::Ipv4)
    DumpFamily(ns, Family::Ipv6, table, names, routes);
  return routes;
}

void AddRoute(Namespace& ns, const RouteSpec& wanted, bool replace) {
  NlSocket& s = ns.Internals().Route();
  RoutePtr r = Build(ns, wanted);
  rtnl_route_set_protocol(r.get(), wanted.protocol);
  rtnl_route_set_type(r.get(), wanted.type);
  uint8_t scope = wanted.gateway.IsSet() || wanted.type != RTN_UNICAST ? uint8_t{RT_SCOPE_UNIVERSE}
                                                                       : uint8_t{RT_SCOPE_LINK};
  rtnl_route_set_scope(r.get(), wanted.scope.value_or(scope));
  s.Check(rtnl_route_add(s.Get(), r.get(), replace ? NLM_F_REPLACE : NLM_F_EXCL),
          {Describe(wanted)});
}

void DeleteRoute(Namespace& ns, const RouteSpec& wanted) {
  NlSocket& s = ns.Internals().Route();
  RoutePtr r = Build(ns, wanted);
  // As `ip route del`: scope, protocol and type left open match any route.
  rtnl_route_set_scope(r.get(), wanted.scope.value_or(uint8_t{RT_SCOPE_NOWHERE}));
  rtnl_route_set_protocol(r.get(), RTPROT_UNSPEC);
  rtnl_route_set_type(r.get(), RTN_UNSPEC);
  s.Check(rtnl_route_delete(s.Get(), r.get(), 0), {Describe(wanted)});
}

std::string RouteProtocolName(uint8_t protocol) {
  switch (protocol) {
  case 0:
    return "unspec";
  case 1:
    return "redirect";
  case 2:
    return "kernel";
  case 3:
    return "boot";
  case 4:
    return "static";
  case 8:
    return "gated";
  case 9:
    return "ra";
  case 10:
    return "mrt";
  case 11:
    return "zebra";
  case 12:
    return "bird";
  case 13:
    return "dnrouted";
  case 14:
    return "xorp";
  case 15:
    return "ntk";
  case 16:
    return "dhcp";
  case 17:
    return "mrouted";
  case 18:
    return "keepalived";
  case 42:
    return "babel";
  case 99:
    return "openr";
  case 186:
    return "bgp";
  case 187:
    return "isis";
  case 188:
    return "ospf";
  case 189:
    return "rip";
  case 192:
    return "eigrp";
  default:
    return std::to_string(protocol);
  }
}

std::string RouteScopeName(uint8_t scope) {
  switch (scope) {
  case 0:
    return "global";
  case 200:
    return "site";
  case 253:
    return "link";
  case 254:
    return "host";
  case 255:
    return "nowhere";
  default:
    return std::to_string(scope);
  }
}

std::string RouteTypeName(uint8_t type) {
  static const char* const names[] = {"unspec",   "unicast",   "local",     "broadcast",
                                      "anycast",  "multicast", "blackhole", "unreachable",
                                      "prohibit", "throw",     "nat",       "xresolve"};
  return type < std::size(names) ? names[type] : std::to_string(type);
}

} // namespace LinuxNet
