//===- Xfrm.cpp - IPsec states and policies through libnl-xfrm ------------===//
#include "LinuxNet/Xfrm.h"
#include "LinuxNet/Namespace.h"

#include "Netlink.h"

#include <netlink/cache.h>
#include <netlink/xfrm/lifetime.h>
#include <netlink/xfrm/sa.h>
#include <netlink/xfrm/selector.h>
#include <netlink/xfrm/sp.h>
#include <netlink/xfrm/template.h>

#include <cerrno>

namespace LinuxNet {

using namespace Detail;

namespace {

struct CacheDeleter {
  void operator()(nl_cache* c) const { nl_cache_free(c); }
};
using CachePtr = std::unique_ptr<nl_cache, CacheDeleter>;
struct SaDeleter {
  void operator()(xfrmnl_sa* s) const { xfrmnl_sa_put(s); }
};
struct SpDeleter {
  void operator()(xfrmnl_sp* s) const { xfrmnl_sp_put(s); }
};
struct SelDeleter {
  void operator()(xfrmnl_sel* s) const { xfrmnl_sel_put(s); }
};
struct LtimeDeleter {
  void operator()(xfrmnl_ltime_cfg* l) const { xfrmnl_ltime_cfg_put(l); }
};

void Check(void* p) {
  if (!p)
    throw Error(ENOMEM, "out of memory building an IPsec request");
}

IpPrefix PrefixOf(nl_addr* a, int length) {
  IpPrefix p;
  p.address = FromNlAddr(a);
  p.length = static_cast<uint8_t>(length);
  return p;
}

XfrmSelector ReadSelector(xfrmnl_sel* sel) {
  XfrmSelector s;
  if (!sel)
    return s;
  s.source = PrefixOf(xfrmnl_sel_get_saddr(sel), xfrmnl_sel_get_prefixlen_s(sel));
  s.destination = PrefixOf(xfrmnl_sel_get_daddr(sel), xfrmnl_sel_get_prefixlen_d(sel));
  s.sourcePort = static_cast<uint16_t>(xfrmnl_sel_get_sport(sel));
  s.destinationPort = static_cast<uint16_t>(xfrmnl_sel_get_dport(sel));
  s.protocol = static_cast<uint8_t>(xfrmnl_sel_get_proto(sel));
  s.ifindex = xfrmnl_sel_get_ifindex(sel);
  return s;
}

/// A libnl selector; an empty prefix of no family takes \p family.
std::unique_ptr<xfrmnl_sel, SelDeleter> BuildSelector(const XfrmSelector& s, Family family) {
  std::unique_ptr<xfrmnl_sel, SelDeleter> sel(xfrmnl_sel_alloc());
  Check(sel.get());
  auto address = [&](const IpPrefix& p) {
    IpAddress a = p.address;
    if (!a.IsSet())
      a.family = family;
    return ToNlAddr(a, p.length);
  };
  AddrPtr src = address(s.source);
  AddrPtr dst = address(s.destination);
  xfrmnl_sel_set_saddr(sel.get(), src.get());
  xfrmnl_sel_set_daddr(sel.get(), dst.get());
  xfrmnl_sel_set_prefixlen_s(sel.get(), s.source.length);
  xfrmnl_sel_set_prefixlen_d(sel.get(), s.destination.length);
  xfrmnl_sel_set_family(sel.get(), static_cast<unsigned>(family));
  if (s.sourcePort) {
    xfrmnl_sel_set_sport(sel.get(), s.sourcePort);
    xfrmnl_sel_set_sportmask(sel.get(), 0xffff);
  }
  if (s.destinationPort) {
    xfrmnl_sel_set_dport(sel.get(), s.destinationPort);
    xfrmnl_sel_set_dportmask(sel.get(), 0xffff);
  }
  xfrmnl_sel_set_proto(sel.get(), s.protocol);
  xfrmnl_sel_set_ifindex(sel.get(), static_cast<unsigned>(s.ifindex));
  return sel;
}

Family SelectorFamily(const XfrmSelector& s) {
  return s.source.address.IsSet() ? s.source.address.family : s.destination.address.family;
}

std::string DescribeSelector(const XfrmSelector& s, uint8_t direction) {
  static const char* const dirs[] = {"in", "out", "fwd"};
  auto text = [](const IpPrefix& p) {
    return p.address.IsSet() ? p.address.ToString() + "/" + std::to_string(p.length)
                             : std::string("any");
  };
  return "the IPsec policy " + text(s.source) + " -> " + text(s.destination) + " dir " +
         (direction < 3 ? dirs[direction] : std::to_string(direction));
}

std::string DescribeState(const IpAddress& dst, uint32_t spi, uint8_t protocol) {
  char hex[16];
  snprintf(hex, sizeof hex, "0x%08x", spi);
  return std::string("the IPsec state ") + (protocol == XfrmAh ? "ah" : "esp") + " spi " + hex +
         " to " + dst.ToString();
}

/// Lifetime limits of none: limits left at zero would expire a state or a
/// policy at once, and the kernel's "no limit" is all ones.
std::unique_ptr<xfrmnl_ltime_cfg, LtimeDeleter> NoLimits() {
  std::unique_ptr<xfrmnl_ltime_cfg, LtimeDeleter> life(xfrmnl_ltime_cfg_alloc());
  Check(life.get());
  const unsigned long long infinity = ~0ULL;
  xfrmnl_ltime_cfg_set_soft_bytelimit(life.get(), infinity);
  xfrmnl_ltime_cfg_set_hard_bytelimit(life.get(), infinity);
  xfrmnl_ltime_cfg_set_soft_packetlimit(life.get(), infinity);
  xfrmnl_ltime_cfg_set_hard_packetlimit(life.get(), infinity);
  return life;
}

XfrmAlgorithm ReadAlgorithm(xfrmnl_sa* sa, bool integrity) {
  char name[128] = {};
  unsigned int bits = 0;
  unsigned int truncation = 0;
  std::vector<char> key(1024);
  const int rc = integrity ? xfrmnl_sa_get_auth_params(sa, name, &bits, &truncation, key.data())
                           : xfrmnl_sa_get_crypto_params(sa, name, &bits, key.data());
  XfrmAlgorithm alg;
  if (rc < 0)
    return alg;
  alg.name = name;
  alg.key.assign(key.begin(), key.begin() + static_cast<std::ptrdiff_t>(
                                                std::min<std::size_t>((bits + 7) / 8, key.size())));
  alg.truncationBits = truncation;
  return alg;
}

} // namespace

std::vector<XfrmState> ListXfrmStates(Namespace& ns) {
  NlSocket& s = ns.Internals().Xfrm();
  nl_cache* raw = nullptr;
  s.Check(xfrmnl_sa_alloc_cache(s.Get(), &raw), {"the IPsec states", false});
  CachePtr cache(raw);
  std::vector<XfrmState> states;
  for (nl_object* o = nl_cache_get_first(cache.get()); o; o = nl_cache_get_next(o)) {
    auto* sa = reinterpret_cast<xfrmnl_sa*>(o);
    XfrmState st;
    st.source = FromNlAddr(xfrmnl_sa_get_saddr(sa));
    st.destination = FromNlAddr(xfrmnl_sa_get_daddr(sa));
    st.spi = static_cast<uint32_t>(xfrmnl_sa_get_spi(sa));
    st.protocol = static_cast<uint8_t>(xfrmnl_sa_get_proto(sa));
    st.mode = static_cast<uint8_t>(xfrmnl_sa_get_mode(sa));
    st.reqid = static_cast<uint32_t>(xfrmnl_sa_get_reqid(sa));
    st.encryption = ReadAlgorithm(sa, false);
    st.integrity = ReadAlgorithm(sa, true);
    if (xfrmnl_ltime_cfg* life = xfrmnl_sa_get_lifetime_cfg(sa)) {
      st.softLifetime = xfrmnl_ltime_cfg_get_soft_addexpires(life);
      st.hardLifetime = xfrmnl_ltime_cfg_get_hard_addexpires(life);
    }
    st.selector = ReadSelector(xfrmnl_sa_get_sel(sa));
    states.push_back(std::move(st));
  }
  return states;
}

void AddXfrmState(Namespace& ns, const XfrmState& state) {
  NlSocket& s = ns.Internals().Xfrm();
  const std::string what = DescribeState(state.destination, state.spi, state.protocol);
  if (!state.source.IsSet() || state.source.family != state.destination.family)
    throw Error(EINVAL, what + ": source and destination must be addresses of one family");
  std::unique_ptr<xfrmnl_sa, SaDeleter> sa(xfrmnl_sa_alloc());
  Check(sa.get());
  AddrPtr src = ToNlAddr(state.source);
  AddrPtr dst = ToNlAddr(state.destination);
  xfrmnl_sa_set_saddr(sa.get(), src.get());
  xfrmnl_sa_set_daddr(sa.get(), dst.get());
  xfrmnl_sa_set_spi(sa.get(), state.spi);
  xfrmnl_sa_set_proto(sa.get(), state.protocol);
  xfrmnl_sa_set_mode(sa.get(), state.mode);
  xfrmnl_sa_set_reqid(sa.get(), state.reqid);
  xfrmnl_sa_set_family(sa.get(), static_cast<unsigned>(state.destination.family));
  auto sel = BuildSelector(state.selector, state.destination.family);
  xfrmnl_sa_set_sel(sa.get(), sel.get());
  auto life = NoLimits();
  xfrmnl_ltime_cfg_set_soft_addexpires(life.get(), state.softLifetime);
  xfrmnl_ltime_cfg_set_hard_addexpires(life.get(), state.hardLifetime);
  xfrmnl_sa_set_lifetime_cfg(sa.get(), life.get());
  auto keyText = [](const XfrmAlgorithm& a) { return std::string(a.key.begin(), a.key.end()); };
  if (!state.encryption.name.empty()) {
    const std::string key = keyText(state.encryption);
    xfrmnl_sa_set_crypto_params(sa.get(), state.encryption.name.c_str(),
                                static_cast<unsigned>(key.size() * 8), key.data());
  }
  if (!state.integrity.name.empty()) {
    const std::string key = keyText(state.integrity);
    xfrmnl_sa_set_auth_params(sa.get(), state.integrity.name.c_str(),
                              static_cast<unsigned>(key.size() * 8), state.integrity.truncationBits,
                              key.data());
  }
  s.Check(xfrmnl_sa_add(s.Get(), sa.get(), NLM_F_EXCL), {what});
}

void DeleteXfrmState(Namespace& ns, const IpAddress& destination, uint32_t spi, uint8_t protocol) {
  NlSocket& s = ns.Internals().Xfrm();
  std::unique_ptr<xfrmnl_sa, SaDeleter> sa(xfrmnl_sa_alloc());
  Check(sa.get());
  AddrPtr dst = ToNlAddr(destination);
  xfrmnl_sa_set_daddr(sa.get(), dst.get());
  xfrmnl_sa_set_spi(sa.get(), spi);
  xfrmnl_sa_set_proto(sa.get(), protocol);
  xfrmnl_sa_set_family(sa.get(), static_cast<unsigned>(destination.family));
  s.Check(xfrmnl_sa_delete(s.Get(), sa.get(), 0), {DescribeState(destination, spi, protocol)});
}

std::vector<XfrmPolicy> ListXfrmPolicies(Namespace& ns) {
  NlSocket& s = ns.Internals().Xfrm();
  nl_cache* raw = nullptr;
  s.Check(xfrmnl_sp_alloc_cache(s.Get(), &raw), {"the IPsec policies", false});
  CachePtr cache(raw);
  std::vector<XfrmPolicy> policies;
  for (nl_object* o = nl_cache_get_first(cache.get()); o; o = nl_cache_get_next(o)) {
    auto* sp = reinterpret_cast<xfrmnl_sp*>(o);
    XfrmPolicy p;
    p.selector = ReadSelector(xfrmnl_sp_get_sel(sp));
    p.direction = static_cast<uint8_t>(xfrmnl_sp_get_dir(sp));
    p.action = static_cast<uint8_t>(xfrmnl_sp_get_action(sp));
    p.priority = static_cast<uint32_t>(xfrmnl_sp_get_priority(sp));
    p.index = static_cast<uint32_t>(xfrmnl_sp_get_index(sp));
    const int n = xfrmnl_sp_get_nusertemplates(sp);
    for (int i = 0; i < n; ++i) {
      xfrmnl_user_tmpl* t = xfrmnl_sp_usertemplate_n(sp, i);
      if (!t)
        continue;
      XfrmTemplate tmpl;
      tmpl.source = FromNlAddr(xfrmnl_user_tmpl_get_saddr(t));
      tmpl.destination = FromNlAddr(xfrmnl_user_tmpl_get_daddr(t));
      tmpl.protocol = static_cast<uint8_t>(xfrmnl_user_tmpl_get_proto(t));
      tmpl.mode = static_cast<uint8_t>(xfrmnl_user_tmpl_get_mode(t));
      tmpl.spi = static_cast<uint32_t>(xfrmnl_user_tmpl_get_spi(t));
      tmpl.reqid = static_cast<uint32_t>(xfrmnl_user_tmpl_get_reqid(t));
      tmpl.optional = xfrmnl_user_tmpl_get_optional(t) != 0;
      p.templates.push_back(tmpl);
    }
    policies.push_back(std::move(p));
  }
  return policies;
}

void AddXfrmPolicy(Namespace& ns, const XfrmPolicy& policy) {
  NlSocket& s = ns.Internals().Xfrm();
  const std::string what = DescribeSelector(policy.selector, policy.direction);
  const Family family = SelectorFamily(policy.selector);
  if (family == Family::None)
    throw Error(EINVAL, what + ": the selector needs a source or destination address");
  std::unique_ptr<xfrmnl_sp, SpDeleter> sp(xfrmnl_sp_alloc());
  Check(sp.get());
  auto sel = BuildSelector(policy.selector, family);
  xfrmnl_sp_set_sel(sp.get(), sel.get());
  xfrmnl_sp_set_dir(sp.get(), policy.direction);
  xfrmnl_sp_set_action(sp.get(), policy.action);
  xfrmnl_sp_set_priority(sp.get(), policy.priority);
  auto life = NoLimits();
  xfrmnl_sp_set_lifetime_cfg(sp.get(), life.get());
  for (const XfrmTemplate& t : policy.templates) {
    xfrmnl_user_tmpl* tmpl = xfrmnl_user_tmpl_alloc();
    Check(tmpl);
    IpAddress src = t.source, dst = t.destination;
    if (!src.IsSet())
      src.family = family;
    if (!dst.IsSet())
      dst.family = family;
    AddrPtr s1 = ToNlAddr(src), d1 = ToNlAddr(dst);
    xfrmnl_user_tmpl_set_saddr(tmpl, s1.get());
    xfrmnl_user_tmpl_set_daddr(tmpl, d1.get());
    xfrmnl_user_tmpl_set_family(tmpl, static_cast<unsigned>(dst.family));
    xfrmnl_user_tmpl_set_proto(tmpl, t.protocol);
    xfrmnl_user_tmpl_set_mode(tmpl, t.mode);
    xfrmnl_user_tmpl_set_spi(tmpl, t.spi);
    xfrmnl_user_tmpl_set_reqid(tmpl, t.reqid);
    xfrmnl_user_tmpl_set_optional(tmpl, t.optional ? 1 : 0);
    xfrmnl_user_tmpl_set_aalgos(tmpl, ~0u);
    xfrmnl_user_tmpl_set_ealgos(tmpl, ~0u);
    xfrmnl_user_tmpl_set_calgos(tmpl, ~0u);
    xfrmnl_sp_add_usertemplate(sp.get(), tmpl);
  }
  s.Check(xfrmnl_sp_add(s.Get(), sp.get(), NLM_F_EXCL), {what});
}

void DeleteXfrmPolicy(Namespace& ns, const XfrmSelector& selector, uint8_t direction) {
  NlSocket& s = ns.Internals().Xfrm();
  const std::string what = DescribeSelector(selector, direction);
  const Family family = SelectorFamily(selector);
  if (family == Family::None)
    throw Error(EINVAL, what + ": the selector needs a source or destination address");
  std::unique_ptr<xfrmnl_sp, SpDeleter> sp(xfrmnl_sp_alloc());
  Check(sp.get());
  auto sel = BuildSelector(selector, family);
  xfrmnl_sp_set_sel(sp.get(), sel.get());
  xfrmnl_sp_set_dir(sp.get(), direction);
  s.Check(xfrmnl_sp_delete(s.Get(), sp.get(), 0), {what});
}

} // namespace LinuxNet
