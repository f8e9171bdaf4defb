//===- Addresses.cpp - Address dumps and changes ---------------------------===//
#include "LinuxNet/Addresses.h"
#include "LinuxNet/Namespace.h"

#include "Attr.h"
#include "Netlink.h"

#include <linux/if_addr.h>
#include <linux/rtnetlink.h>
#include <netlink/route/addr.h>

#include <cerrno>

namespace LinuxNet {

using namespace Detail;

namespace {

struct AddrObjDeleter {
  void operator()(rtnl_addr* a) const { rtnl_addr_put(a); }
};
using AddrObjPtr = std::unique_ptr<rtnl_addr, AddrObjDeleter>;

std::string Describe(const std::string& device, const IpPrefix& prefix) {
  return "address " + prefix.address.ToString() + "/" + std::to_string(prefix.length) + " on " +
         device;
}

AddrObjPtr Build(Namespace& ns, const std::string& device, const IpPrefix& prefix) {
  AddrObjPtr a(rtnl_addr_alloc());
  if (!a)
    throw Error(ENOMEM, "out of memory building an address request");
  rtnl_addr_set_ifindex(a.get(), IfIndex(ns, device));
  rtnl_addr_set_family(a.get(), static_cast<int>(prefix.address.family));
  AddrPtr local = ToNlAddr(prefix.address, prefix.length);
  rtnl_addr_set_local(a.get(), local.get());
  rtnl_addr_set_prefixlen(a.get(), prefix.length);
  return a;
}

} // namespace

std::vector<Address> ListAddresses(Namespace& ns, Family family) {
  std::vector<Address> addresses;
  NameTable names(ns);
  MsgPtr msg = NewMsg(RTM_GETADDR, NLM_F_DUMP);
  ifaddrmsg req{};
  req.ifa_family = static_cast<uint8_t>(family);
  if (nlmsg_append(msg.get(), &req, sizeof req, NLMSG_ALIGNTO) < 0)
    throw Error(ENOMEM, "out of memory building an address request");
  ns.Internals().Route().Dump(msg.get(), {"the addresses", false}, [&](nlmsghdr* h) {
    if (h->nlmsg_type != RTM_NEWADDR)
      return;
    const auto* ifa = static_cast<const ifaddrmsg*>(nlmsg_data(h));
    nlattr* tb[IFA_MAX + 1] = {};
    if (nlmsg_parse(h, sizeof(ifaddrmsg), tb, IFA_MAX, nullptr) < 0)
      return;
    Address a;
    a.index = static_cast<int>(ifa->ifa_index);
    a.device = names[a.index];
    a.prefixLength = ifa->ifa_prefixlen;
    a.scope = ifa->ifa_scope;
    a.flags = tb[IFA_FLAGS] ? Value<uint32_t>(tb[IFA_FLAGS]) : ifa->ifa_flags;
    const nlattr* local = tb[IFA_LOCAL] ? tb[IFA_LOCAL] : tb[IFA_ADDRESS];
    if (local)
      a.local = IpAddress::FromBytes(nla_data(local), static_cast<std::size_t>(nla_len(local)));
    if (tb[IFA_LOCAL] && tb[IFA_ADDRESS] &&
        (nla_len(tb[IFA_LOCAL]) != nla_len(tb[IFA_ADDRESS]) ||
         memcmp(nla_data(tb[IFA_LOCAL]), nla_data(tb[IFA_ADDRESS]),
                static_cast<std::size_t>(nla_len(tb[IFA_LOCAL]))) != 0))
      a.peer = IpAddress::FromBytes(nla_data(tb[IFA_ADDRESS]),
                                    static_cast<std::size_t>(nla_len(tb[IFA_ADDRESS])));
    if (tb[IFA_BROADCAST])
      a.broadcast = IpAddress::FromBytes(nla_data(tb[IFA_BROADCAST]),
                                         static_cast<std::size_t>(nla_len(tb[IFA_BROADCAST])));
    a.label = String(tb[IFA_LABEL]);
    ifa_cacheinfo ci{};
    if (Get(tb[IFA_CACHEINFO], ci)) {
      a.validLifetime = ci.ifa_valid;
      a.preferredLifetime = ci.ifa_prefered;
    }
    a.protocol = Value<uint8_t>(tb[IFA_PROTO]);
    addresses.push_back(std::move(a));
  });
  return addresses;
}

void AddAddress(Namespace& ns, const AddressSpec& wanted) {
  NlSocket& s = ns.Internals().Route();
  AddrObjPtr a = Build(ns, wanted.device, wanted.prefix);
  if (wanted.broadcast.IsSet()) {
    AddrPtr b = ToNlAddr(wanted.broadcast);
    rtnl_addr_set_broadcast(a.get(), b.get());
  }
  if (wanted.scope)
    rtnl_addr_set_scope(a.get(), *wanted.scope);
  if (wanted.noDad)
    rtnl_addr_set_flags(a.get(), IFA_F_NODAD);
  if (wanted.validLifetime != kForever || wanted.preferredLifetime != kForever) {
    rtnl_addr_set_valid_lifetime(a.get(), wanted.validLifetime);
    rtnl_addr_set_preferred_lifetime(a.get(), wanted.preferredLifetime);
  }
  if (!wanted.label.empty())
    rtnl_addr_set_label(a.get(), wanted.label.c_str());
  s.Check(rtnl_addr_add(s.Get(), a.get(), NLM_F_EXCL), {Describe(wanted.device, wanted.prefix)});
}

void DeleteAddress(Namespace& ns, const std::string& device, const IpPrefix& prefix) {
  NlSocket& s = ns.Internals().Route();
  AddrObjPtr a = Build(ns, device, prefix);
  s.Check(rtnl_addr_delete(s.Get(), a.get(), 0), {Describe(device, prefix)});
}

} // namespace LinuxNet
