//===- linux/host/Services.cpp - Resolver, hosts table and IPsec -----------===//
//
// DNS servers and search domains are the netstack's resolv.conf, host
// entries its hosts file, as `ip netns exec` shows them to programs; both are
// rewritten atomically, keeping every line this tool does not manage. IPsec
// SAs and SPs are the kernel's xfrm states and policies; their names, which
// the kernel has no place for, are kept in the state file (State.h).
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "HostCtl/Network/IpAddress.h"
#include "LinuxNet/Files.h"
#include "LinuxNet/Xfrm.h"
#include "State.h"

#include <algorithm>
#include <cstdio>

#ifdef OSTRA_SANITIZED
#include <sanitizer/lsan_interface.h>
#endif

namespace LinuxHost {

using namespace HostCtl::Network;
namespace Ops = HostCtl::Backend;

namespace {

/// The files of netstack \p key: the host's own namespace's, else those of
/// the named namespace.
std::string NetstackFile(Context& ctx, const std::string& key, bool resolv) {
  if (key.empty() || key == kDefaultNetstack)
    return resolv ? ctx.ns.ResolvConfPath() : ctx.ns.HostsPath();
  std::unique_ptr<LinuxNet::Namespace> holder;
  NetstackNamespace(ctx, key, holder);
  return resolv ? holder->ResolvConfPath() : holder->HostsPath();
}

class Dns final : public Ops::Dns {
public:
  Dns(Context& ctx, const std::string& netstack) : path_(NetstackFile(ctx, netstack, true)) {}

  void Refresh() override {}
  void AddUserNameServer(const IpAddress& address) override {
    Edit([&](LinuxNet::ResolvConf& conf) { conf.AddNameserver(address.GetStringAddress()); });
  }
  void RemoveNameServer(const IpAddress& address) override {
    Edit([&](LinuxNet::ResolvConf& conf) { conf.RemoveNameserver(address.GetStringAddress()); });
  }
  void RemoveNameServers() override {
    Edit([](LinuxNet::ResolvConf& conf) { conf.RemoveAllNameservers(); });
  }
  std::vector<std::string> GetNameServers() override { return Load().Nameservers(); }
  void AddUserSearchDomain(const std::string& domain) override {
    Edit([&](LinuxNet::ResolvConf& conf) { conf.AddSearchDomain(domain); });
  }
  void RemoveSearchDomain(const std::string& domain) override {
    Edit([&](LinuxNet::ResolvConf& conf) { conf.RemoveSearchDomain(domain); });
  }
  std::string GetSearchDomainsString() override {
    std::string text;
    for (const std::string& domain : Load().SearchDomains())
      text += (text.empty() ? "" : " ") + domain;
    return text;
  }
  /// Every change is written as it is made.
  void SaveConfig() override {}

private:
  LinuxNet::ResolvConf Load() {
    return Kernel([&] { return LinuxNet::ResolvConf::Load(path_); });
  }
  template <typename Fn> void Edit(Fn fn) {
    Kernel([&] { LinuxNet::UpdateResolvConf(path_, fn); });
  }
  std::string path_; ///< The resolv.conf.
};

/// Whether \p address is a loopback address: its entries are the system's
/// own ("localhost", "ip6-localhost"), neither listed nor removable.
bool IsSystemAddress(const std::string& address) {
  return address.rfind("127.", 0) == 0 || address == "::1";
}

class Hosts final : public Ops::HostsTable {
public:
  explicit Hosts(Context& ctx) : path_(ctx.ns.HostsPath()) {}

  void AddEntryFromUser(const std::string& ip, const std::string& hostname,
                        const std::vector<std::string>& aliases,
                        const std::string& comment) override {
    std::vector<std::string> names = {hostname};
    names.insert(names.end(), aliases.begin(), aliases.end());
    Kernel([&] {
      LinuxNet::UpdateHostsFile(path_,
                                [&](LinuxNet::HostsFile& file) { file.Add(ip, names, comment); });
    });
  }
  void RemoveEntryFromUser(const std::string& ip, const std::string& hostname) override {
    if (IsSystemAddress(ip))
      Refuse("The entry " + ip + " " + hostname + " is a system entry and cannot be removed");
    Kernel([&] {
      LinuxNet::UpdateHostsFile(path_,
                                [&](LinuxNet::HostsFile& file) { file.Remove(ip, hostname); });
    });
  }
  std::vector<std::shared_ptr<TvkCtl::Network::HostsFileEntry>> GetEntriesFromConfig() override {
    std::vector<std::shared_ptr<TvkCtl::Network::HostsFileEntry>> entries;
    LinuxNet::HostsFile file = Kernel([&] { return LinuxNet::HostsFile::Load(path_); });
    for (const LinuxNet::HostsEntry& entry : file.Entries()) {
      if (IsSystemAddress(entry.address) || entry.names.empty())
        continue;
      std::vector<std::string> aliases(entry.names.begin() + 1, entry.names.end());
      entries.push_back(std::make_shared<TvkCtl::Network::HostsFileEntry>(
          entry.address, entry.names[0], std::move(aliases), entry.comment));
    }
    return entries;
  }

private:
  std::string path_; ///< The hosts file.
};

// --- IPsec.

/// Kernel names of the algorithms, by the host library's codes.
const char* const kCiphers[] = {"ecb(cipher_null)", "cbc(des3_ede)", "cbc(aes)"};
const char* const kIntegrity[] = {"hmac(sha1)", "hmac(sha256)"};
/// Upper-layer protocols by code: any, TCP, UDP, ICMPv6.
const uint8_t kProtocols[] = {0, 6, 17, 58};

/// Key bytes of "0x..." hex or ASCII text.
std::vector<uint8_t> KeyBytes(const std::string& text) {
  if (text.rfind("0x", 0) != 0 && text.rfind("0X", 0) != 0)
    return {text.begin(), text.end()};
  std::vector<uint8_t> bytes;
  for (std::size_t i = 2; i + 1 < text.size(); i += 2)
    bytes.push_back(static_cast<uint8_t>(std::stoul(text.substr(i, 2), nullptr, 16)));
  return bytes;
}

template <std::size_t N> int CodeOf(const char* const (&names)[N], const std::string& name) {
  for (std::size_t i = 0; i < N; ++i)
    if (name == names[i])
      return static_cast<int>(i);
  return -1;
}

std::string SaKey(const LinuxNet::IpAddress& destination, uint32_t spi, uint8_t protocol) {
  char spiText[16];
  std::snprintf(spiText, sizeof spiText, "0x%x", spi);
  return destination.ToString() + " " + spiText + " " + std::to_string(protocol);
}
std::string SpKey(const LinuxNet::XfrmSelector& s, uint8_t direction) {
  return std::to_string(direction) + " " + s.source.ToString() + " " +
         std::to_string(s.sourcePort) + " " + s.destination.ToString() + " " +
         std::to_string(s.destinationPort) + " " + std::to_string(s.protocol);
}

class IpSec final : public Ops::IpSec {
public:
  explicit IpSec(Context& ctx) : ctx_(ctx) {}

  void AddSADConfig(const IpSecSadParam& sa) override {
    CheckNewName("sa", sa.name);
    LinuxNet::XfrmState state;
    state.source = Parse(sa.srcAddress);
    state.destination = Parse(sa.dstAddress);
    state.spi = sa.spi;
    state.mode = sa.mode == 1 ? LinuxNet::XfrmTunnel : LinuxNet::XfrmTransport;
    if (sa.encryptionAlgorithm < 0 || sa.encryptionAlgorithm > 2 || sa.integrityAlgorithm < 0 ||
        sa.integrityAlgorithm > 1)
      Refuse("Invalid IPsec algorithm code");
    state.encryption = {kCiphers[sa.encryptionAlgorithm], KeyBytes(sa.encryptionKey), 0};
    state.integrity = {kIntegrity[sa.integrityAlgorithm], KeyBytes(sa.integrityKey), 0};
    state.hardLifetime = sa.lifetime;
    std::string key = SaKey(state.destination, state.spi, state.protocol);
    Kernel([&] { LinuxNet::AddXfrmState(ctx_.ns, state); });
    Remember("sa", sa.name, key);
  }
  void RemoveSADConfig(const std::string& name) override {
    for (const LinuxNet::XfrmState& state : States())
      if (NameOf("sa", SaKey(state.destination, state.spi, state.protocol), "spi-") == name)
        return DeleteState(state);
    Refuse("There is no security association named " + name);
  }
  void RemoveAutoSADConfig(const IpSecSadParam& sa) override {
    LinuxNet::IpAddress destination = Parse(sa.dstAddress);
    for (const LinuxNet::XfrmState& state : States())
      if (state.destination == destination && state.spi == sa.spi &&
          state.source == Parse(sa.srcAddress))
        return DeleteState(state);
    Refuse("There is no security association with SPI " + std::to_string(sa.spi));
  }
  void FlushSADConfig() override {
    for (const LinuxNet::XfrmState& state : States())
      DeleteState(state);
  }
  /// A state that this tool did not add is named after its SPI, "spi-0x...".
  void GetSADConfigList(std::vector<IpSecSadParam>& list) override {
    list.clear();
    for (const LinuxNet::XfrmState& state : States()) {
      IpSecSadParam& sa = list.emplace_back();
      sa.name = NameOf("sa", SaKey(state.destination, state.spi, state.protocol), "spi-");
      sa.srcAddress = state.source.ToString();
      sa.dstAddress = state.destination.ToString();
      sa.spi = state.spi;
      sa.mode = state.mode == LinuxNet::XfrmTunnel ? 1 : 0;
      sa.encryptionAlgorithm = std::max(0, CodeOf(kCiphers, state.encryption.name));
      sa.integrityAlgorithm = std::max(0, CodeOf(kIntegrity, state.integrity.name));
      sa.state = 1; // The kernel lists mature states only.
      sa.lifetime = state.hardLifetime;
    }
  }
  void AddSPDConfig(const IpSecSpdParam& sp) override {
    CheckNewName("sp", sp.name);
    LinuxNet::XfrmPolicy policy;
    policy.selector.source = {Parse(sp.srcAddress), static_cast<uint8_t>(sp.srcPrefixLength)};
    policy.selector.destination = {Parse(sp.dstAddress), static_cast<uint8_t>(sp.dstPrefixLength)};
    policy.selector.sourcePort = static_cast<uint16_t>(sp.srcPort);
    policy.selector.destinationPort = static_cast<uint16_t>(sp.dstPort);
    if (sp.ulProto < 0 || sp.ulProto > 3 || sp.direction < 0 || sp.direction > 1 || sp.action < 0 ||
        sp.action > 2)
      Refuse("Invalid IPsec policy code");
    policy.selector.protocol = kProtocols[sp.ulProto];
    policy.direction = sp.direction == 0 ? LinuxNet::XfrmIn : LinuxNet::XfrmOut;
    policy.action = sp.action == 1 ? LinuxNet::XfrmBlock : LinuxNet::XfrmAllow;
    if (sp.action == 2) {
      LinuxNet::XfrmTemplate& t = policy.templates.emplace_back();
      t.mode = sp.mode == 1 ? LinuxNet::XfrmTunnel : LinuxNet::XfrmTransport;
      if (!sp.saName.empty()) {
        bool found = false;
        for (const LinuxNet::XfrmState& state : States())
          if (NameOf("sa", SaKey(state.destination, state.spi, state.protocol), "spi-") ==
              sp.saName) {
            t.spi = state.spi;
            t.source = state.source;
            t.destination = state.destination;
            found = true;
          }
        if (!found)
          Refuse("There is no security association named " + sp.saName);
      }
    }
    std::string key = SpKey(policy.selector, policy.direction);
    Kernel([&] { LinuxNet::AddXfrmPolicy(ctx_.ns, policy); });
    Remember("sp", sp.name, key);
  }
  void RemoveSPDConfig(const std::string& name) override {
    for (const LinuxNet::XfrmPolicy& policy : Policies())
      if (PolicyName(policy) == name)
        return DeletePolicy(policy);
    Refuse("There is no security policy named " + name);
  }
  void FlushSPDConfig() override {
    for (const LinuxNet::XfrmPolicy& policy : Policies())
      DeletePolicy(policy);
  }
  /// A policy that this tool did not add is named after the kernel's index,
  /// "index-N". Forwarding policies have no direction code and are left out.
  void GetSPDConfigList(std::vector<IpSecSpdParam>& list) override {
    list.clear();
    for (const LinuxNet::XfrmPolicy& policy : Policies()) {
      IpSecSpdParam& sp = list.emplace_back();
      sp.name = PolicyName(policy);
      sp.srcAddress = AddressText(policy.selector.source.address);
      sp.srcPrefixLength = policy.selector.source.length;
      sp.srcPort = policy.selector.sourcePort;
      sp.dstAddress = AddressText(policy.selector.destination.address);
      sp.dstPrefixLength = policy.selector.destination.length;
      sp.dstPort = policy.selector.destinationPort;
      auto proto =
          std::find(std::begin(kProtocols), std::end(kProtocols), policy.selector.protocol);
      sp.ulProto = proto == std::end(kProtocols) ? 0 : static_cast<int>(proto - kProtocols);
      sp.direction = policy.direction == LinuxNet::XfrmIn ? 0 : 1;
      sp.action = policy.action == LinuxNet::XfrmBlock ? 1 : policy.templates.empty() ? 0 : 2;
      sp.mode =
          policy.templates.empty() ? 2 : (policy.templates[0].mode == LinuxNet::XfrmTunnel ? 1 : 0);
      if (!policy.templates.empty() && policy.templates[0].spi != 0)
        for (const LinuxNet::XfrmState& state : States())
          if (state.spi == policy.templates[0].spi)
            sp.saName = NameOf("sa", SaKey(state.destination, state.spi, state.protocol), "spi-");
    }
  }

private:
  static LinuxNet::IpAddress Parse(const std::string& text) {
    return Kernel([&] { return LinuxNet::IpAddress::Parse(text); });
  }
  static std::string AddressText(const LinuxNet::IpAddress& address) {
    return address.IsSet() ? address.ToString() : "::";
  }
  std::vector<LinuxNet::XfrmState> States() {
    return Kernel([&] { return LinuxNet::ListXfrmStates(ctx_.ns); });
  }
  std::vector<LinuxNet::XfrmPolicy> Policies() {
#ifdef OSTRA_SANITIZED
    // libnl-xfrm 3.7 leaks the selector addresses of every policy it parses
    // (docs/linux-host.md); a sanitized command host must not report that.
    __lsan::ScopedDisabler libnlLeaks;
#endif
    std::vector<LinuxNet::XfrmPolicy> all =
        Kernel([&] { return LinuxNet::ListXfrmPolicies(ctx_.ns); });
    std::erase_if(all,
                  [](const LinuxNet::XfrmPolicy& p) { return p.direction == LinuxNet::XfrmFwd; });
    return all;
  }
  std::string PolicyName(const LinuxNet::XfrmPolicy& policy) {
    std::string name = NameOf("sp", SpKey(policy.selector, policy.direction), "");
    return name.empty() ? "index-" + std::to_string(policy.index) : name;
  }
  /// The recorded name of the object with \p key; else \p prefix and the
  /// key's second word (the SPI), or "" without a prefix.
  std::string NameOf(const char* kind, const std::string& key, const char* prefix) {
    if (!records_)
      records_ = ReadState(ctx_.stateFile);
    for (const StateRecord& record : *records_)
      if (record.kind == kind && record.fields.size() == 2 && record.fields[1] == key)
        return record.fields[0];
    if (!*prefix)
      return "";
    std::size_t start = key.find(' ') + 1;
    return prefix + key.substr(start, key.find(' ', start) - start);
  }
  void CheckNewName(const char* kind, const std::string& name) {
    if (!IsStateField(name) || name.find(' ') != std::string::npos)
      Refuse("Invalid name \"" + name + "\"");
    std::vector<IpSecSadParam> sas;
    std::vector<IpSecSpdParam> sps;
    bool taken = false;
    if (std::string(kind) == "sa") {
      GetSADConfigList(sas);
      taken = std::any_of(sas.begin(), sas.end(), [&](const auto& sa) { return sa.name == name; });
    } else {
      GetSPDConfigList(sps);
      taken = std::any_of(sps.begin(), sps.end(), [&](const auto& sp) { return sp.name == name; });
    }
    if (taken)
      Refuse("The name " + name + " is in use");
  }
  void Remember(const char* kind, const std::string& name, const std::string& key) {
    UpdateState(ctx_.stateFile, [&](std::vector<StateRecord>& records) {
      std::erase_if(records, [&](const StateRecord& r) {
        return r.kind == kind && r.fields.size() == 2 && r.fields[1] == key;
      });
      records.push_back({kind, {name, key}});
    });
    records_.reset();
  }
  void Forget(const char* kind, const std::string& key) {
    UpdateState(ctx_.stateFile, [&](std::vector<StateRecord>& records) {
      std::erase_if(records, [&](const StateRecord& r) {
        return r.kind == kind && r.fields.size() == 2 && r.fields[1] == key;
      });
    });
    records_.reset();
  }
  void DeleteState(const LinuxNet::XfrmState& state) {
    Kernel(
        [&] { LinuxNet::DeleteXfrmState(ctx_.ns, state.destination, state.spi, state.protocol); });
    Forget("sa", SaKey(state.destination, state.spi, state.protocol));
  }
  void DeletePolicy(const LinuxNet::XfrmPolicy& policy) {
    Kernel([&] { LinuxNet::DeleteXfrmPolicy(ctx_.ns, policy.selector, policy.direction); });
    Forget("sp", SpKey(policy.selector, policy.direction));
  }

  Context& ctx_;                                    ///< The host.
  std::optional<std::vector<StateRecord>> records_; ///< The state file, read once.
};

} // namespace

std::unique_ptr<Ops::Dns> MakeDns(Context& ctx, const std::string& netstack) {
  return std::make_unique<Dns>(ctx, netstack);
}
std::unique_ptr<Ops::HostsTable> MakeHostsTable(Context& ctx) {
  return std::make_unique<Hosts>(ctx);
}
std::unique_ptr<Ops::IpSec> MakeIpSec(Context& ctx) {
  return std::make_unique<IpSec>(ctx);
}

} // namespace LinuxHost
