//===- FirewallRulesetImpl.cpp - Rulesets of the simulated firewall --------===//
#include "sim/FirewallRulesetImpl.h"

#include "HostCtl/Lib.h"
#include "model/FirewallModel.h"

namespace Sim {

using HostCtl::Lib::HostCtlException;
using HostCtl::System::FirewallAllowedIps;
using HostCtl::System::FirewallPortRule;
using Model::Statement;
using Model::Store;

namespace {

/// The stored state of one ruleset.
struct RulesetRow {
  bool enabled = false;        ///< Enabled.
  bool allowedAll = false;     ///< Every remote address is allowed.
  bool enableFixed = false;    ///< The enabled state cannot be configured.
  bool allowedIpFixed = false; ///< The allowed-IP setting cannot be configured.
  int64_t clients = 0;         ///< Clients using the ruleset.
};

/// Reads the ruleset \p id; throws when the host has no such ruleset.
RulesetRow ReadRow(Store& store, const std::string& id) {
  Statement row = store.Prepare("SELECT enabled, allowed_all, enable_fixed, allowed_ip_fixed, "
                                "clients FROM fw_ruleset WHERE id = ?");
  enum { kEnabled, kAllowedAll, kEnableFixed, kAllowedIpFixed, kClients };
  row.Bind(1, id);
  if (!row.Step())
    throw HostCtlException("There is no firewall ruleset with id " + id);
  return {row.Bool(kEnabled), row.Bool(kAllowedAll), row.Bool(kEnableFixed),
          row.Bool(kAllowedIpFixed), row.Int(kClients)};
}

/// Reads the ruleset in a read transaction, after the operation's fault.
RulesetRow Load(const char* operation, const std::string& id) {
  Store& store = Store::Host();
  store.CheckFault(operation, id);
  return store.Read([&] { return ReadRow(store, id); });
}

/// The refusal of a change of \p kind, or nothing when it is allowed.
void Check(const RulesetRow& row, const std::string& id, int kind, bool system) {
  if (kind == HostCtl::System::FirewallEnabledState) {
    if (row.enableFixed && !system)
      throw HostCtlException("The enabled state of ruleset " + id +
                             " is fixed and cannot be changed");
  } else if (kind == HostCtl::System::FirewallAllowedIpMode) {
    if (row.allowedIpFixed && !system)
      throw HostCtlException("The allowed IP setting of ruleset " + id +
                             " is fixed and cannot be changed");
  } else {
    throw HostCtlException("Unknown ruleset property " + std::to_string(kind));
  }
}

void SetEnabled(const char* operation, const std::string& id, bool enabled) {
  Store& store = Store::Host();
  store.CheckFault(operation, id);
  store.Write([&] {
    Check(ReadRow(store, id), id, HostCtl::System::FirewallEnabledState, false);
    store.Prepare("UPDATE fw_ruleset SET enabled = ? WHERE id = ?").BindAll(enabled, id).Run();
  });
}

/// Parses an allowed-IP entry or refuses the text.
Model::AllowedIpEntry ParseEntry(const std::string& text) {
  Model::AllowedIpEntry entry;
  if (!Model::ParseAllowedIp(text, entry))
    throw HostCtlException("Invalid IP address or network: " + text);
  return entry;
}

/// Refuses a change of the allowed-IP list of ruleset \p id.
void CheckListChange(Store& store, const std::string& id) {
  RulesetRow row = ReadRow(store, id);
  Check(row, id, HostCtl::System::FirewallAllowedIpMode, false);
  if (row.allowedAll)
    throw HostCtlException("The allowed IP list of ruleset " + id +
                           " cannot be changed while it allows all IP addresses");
}

} // namespace

FirewallRulesetImpl::FirewallRulesetImpl(std::string id) : id_(std::move(id)) {}
FirewallRulesetImpl::~FirewallRulesetImpl() = default;

bool FirewallRulesetImpl::IsValid() const {
  Store& store = Store::Host();
  store.CheckFault("IsValid", id_);
  return store.Read([&] {
    Statement row = store.Prepare("SELECT 1 FROM fw_ruleset WHERE id = ?");
    row.Bind(1, id_);
    return row.Step();
  });
}

bool FirewallRulesetImpl::IsEnabled() const {
  return Load("IsEnabled", id_).enabled;
}

bool FirewallRulesetImpl::IsAllowedAll() const {
  return Load("IsAllowedAll", id_).allowedAll;
}

bool FirewallRulesetImpl::IsEnableDisableFixed() const {
  return Load("IsEnableDisableFixed", id_).enableFixed;
}

bool FirewallRulesetImpl::IsAllowedIpFixed() const {
  return Load("IsAllowedIpFixed", id_).allowedIpFixed;
}

int64_t FirewallRulesetImpl::GetClientCount() const {
  return Load("GetClientCount", id_).clients;
}

void FirewallRulesetImpl::CheckConfigurable(int kind, bool system) const {
  Check(Load("CheckConfigurable", id_), id_, kind, system);
}

void FirewallRulesetImpl::Enable() {
  SetEnabled("Enable", id_, true);
}

void FirewallRulesetImpl::Disable() {
  SetEnabled("Disable", id_, false);
}

void FirewallRulesetImpl::SetAllowedAll(bool allowed) {
  Store& store = Store::Host();
  store.CheckFault("SetAllowedAll", id_);
  store.Write([&] {
    Check(ReadRow(store, id_), id_, HostCtl::System::FirewallAllowedIpMode, false);
    store.Prepare("UPDATE fw_ruleset SET allowed_all = ? WHERE id = ?").BindAll(allowed, id_).Run();
  });
}

void FirewallRulesetImpl::AddClient() {
  Store& store = Store::Host();
  store.CheckFault("AddClient", id_);
  store.Write([&] {
    ReadRow(store, id_);
    // A client is one of the host's own services: it enables the ruleset even
    // when users cannot.
    store.Prepare("UPDATE fw_ruleset SET clients = clients + 1, enabled = 1 WHERE id = ?")
        .Bind(1, id_)
        .Run();
  });
}

void FirewallRulesetImpl::RemoveClient() {
  Store& store = Store::Host();
  store.CheckFault("RemoveClient", id_);
  store.Write([&] {
    if (ReadRow(store, id_).clients == 0)
      throw HostCtlException("Ruleset " + id_ + " has no clients");
    store
        .Prepare("UPDATE fw_ruleset SET clients = clients - 1, "
                 "enabled = CASE WHEN clients = 1 THEN 0 ELSE enabled END WHERE id = ?")
        .Bind(1, id_)
        .Run();
  });
}

std::vector<std::unique_ptr<FirewallPortRule>> FirewallRulesetImpl::GetRules() const {
  Store& store = Store::Host();
  store.CheckFault("GetRules", id_);
  std::vector<std::unique_ptr<FirewallPortRule>> rules;
  store.Read([&] {
    ReadRow(store, id_);
    Statement rows = store.Prepare("SELECT port_type, port_begin, port_end, direction, protocol "
                                   "FROM fw_rule WHERE ruleset = ? ORDER BY ord");
    enum { kPortType, kPortBegin, kPortEnd, kDirection, kProtocol };
    rows.Bind(1, id_);
    while (rows.Step()) {
      auto rule = std::make_unique<FirewallPortRule>();
      rule->portType = static_cast<int32_t>(rows.Int(kPortType));
      rule->portBegin = static_cast<int32_t>(rows.Int(kPortBegin));
      rule->portEnd = static_cast<int32_t>(rows.Int(kPortEnd));
      rule->direction = static_cast<int32_t>(rows.Int(kDirection));
      rule->protocol = static_cast<int32_t>(rows.Int(kProtocol));
      rules.push_back(std::move(rule));
    }
  });
  return rules;
}

std::unique_ptr<FirewallAllowedIps> FirewallRulesetImpl::GetAllowedIps() const {
  using namespace HostCtl::Network;
  Store& store = Store::Host();
  store.CheckFault("GetAllowedIps", id_);
  auto ips = std::make_unique<FirewallAllowedIps>();
  store.Read([&] {
    ReadRow(store, id_);
    Statement rows =
        store.Prepare("SELECT kind, value FROM fw_allowed_ip WHERE ruleset = ? ORDER BY ord");
    enum { kKind, kValue };
    rows.Bind(1, id_);
    while (rows.Step()) {
      std::string value = rows.Text(kValue);
      switch (rows.Int(kKind)) {
      case Model::AllowedIpv4Address:
        ips->ipv4Addresses.emplace_back(value);
        break;
      case Model::AllowedIpv4Network:
        ips->ipv4Networks.emplace_back(value);
        break;
      case Model::AllowedIpv6Address:
        ips->ipv6Addresses.emplace_back(value);
        break;
      default:
        ips->ipv6Networks.emplace_back(value);
        break;
      }
    }
  });
  return ips;
}

void FirewallRulesetImpl::AddAllowedIp(const std::string& text) {
  Store& store = Store::Host();
  store.CheckFault("AddAllowedIp", id_);
  Model::AllowedIpEntry entry = ParseEntry(text);
  store.Write([&] {
    CheckListChange(store, id_);
    Statement exists =
        store.Prepare("SELECT 1 FROM fw_allowed_ip WHERE ruleset = ? AND kind = ? AND value = ?");
    exists.BindAll(id_, static_cast<int>(entry.kind), entry.text);
    if (exists.Step())
      throw HostCtlException(entry.text + " is already in the allowed IP list of ruleset " + id_);
    store
        .Prepare("INSERT INTO fw_allowed_ip(ruleset, kind, value, ord) SELECT ?1, ?2, ?3, "
                 "coalesce(max(ord), -1) + 1 FROM fw_allowed_ip WHERE ruleset = ?1")
        .BindAll(id_, static_cast<int>(entry.kind), entry.text)
        .Run();
  });
}

void FirewallRulesetImpl::RemoveAllowedIp(const std::string& text) {
  Store& store = Store::Host();
  store.CheckFault("RemoveAllowedIp", id_);
  Model::AllowedIpEntry entry = ParseEntry(text);
  store.Write([&] {
    CheckListChange(store, id_);
    store.Prepare("DELETE FROM fw_allowed_ip WHERE ruleset = ? AND kind = ? AND value = ?")
        .BindAll(id_, static_cast<int>(entry.kind), entry.text)
        .Run();
    if (store.Changes() == 0)
      throw HostCtlException(entry.text + " is not in the allowed IP list of ruleset " + id_);
  });
}

} // namespace Sim
