//===- model/FirewallPart.cpp - The host firewall ---------------------------===//
//
// The firewall part owns the kernel modules of the host (of which the firewall
// module "ostrafw" is the one that matters), the firewall's global state and
// its rulesets with their port rules and allowed-IP lists.
//
// Host description:
//   "firewall": {"loaded": true, "enabled": true, "defaultAction": "DROP",
//                "filtersActive": true}
//   "firewallRulesets": [{"name": "shellAccess", "enabled": true,
//       "allowedAll": false, "enableFixed": false, "allowedIpFixed": false,
//       "clients": 0, "allowedIps": ["10.20.0.0/16", "fd00:20::7"],
//       "rules": [{"portType": "dst", "portBegin": 22, "portEnd": 22,
//                  "direction": "inbound", "protocol": "tcp"}]}]
// The filters are active when the module is loaded unless "filtersActive"
// says otherwise.
//
//===----------------------------------------------------------------------===//
#include "model/FirewallModel.h"

#include "HostCtl/Network/Address.h"
#include "HostCtl/System/SystemInfo.h"
#include "model/JsonRead.h"
#include "model/Part.h"

#include <set>

namespace Model {

using nlohmann::ordered_json;

namespace {

const char* const kFirewallSchema = R"sql(
-- Kernel modules of the host and whether they are loaded.
CREATE TABLE kmodule(
  name TEXT PRIMARY KEY,
  loaded INTEGER NOT NULL,
  options TEXT NOT NULL DEFAULT ''
) WITHOUT ROWID;

-- The firewall's global state is kept in `setting`: "firewall.enabled",
-- "firewall.defaultPass" and "firewall.filtersActive" (whether the filters
-- built from the rulesets are in place), each 0 or 1.

-- Rulesets by label, in the host's order.
CREATE TABLE fw_ruleset(
  id TEXT PRIMARY KEY,
  ord INTEGER NOT NULL,
  enabled INTEGER NOT NULL,
  allowed_all INTEGER NOT NULL,
  enable_fixed INTEGER NOT NULL,
  allowed_ip_fixed INTEGER NOT NULL,
  clients INTEGER NOT NULL
) WITHOUT ROWID;

-- Port rules of a ruleset, in order (codes as FirewallPortRule has them).
CREATE TABLE fw_rule(
  ruleset TEXT NOT NULL REFERENCES fw_ruleset(id) ON DELETE CASCADE,
  ord INTEGER NOT NULL,
  port_type INTEGER NOT NULL,
  port_begin INTEGER NOT NULL,
  port_end INTEGER NOT NULL,
  direction INTEGER NOT NULL,
  protocol INTEGER NOT NULL,
  PRIMARY KEY(ruleset, ord)
) WITHOUT ROWID;

-- Allowed-IP entries of a ruleset in canonical text; `kind` is an
-- AllowedIpKind and `ord` the order of addition.
CREATE TABLE fw_allowed_ip(
  ruleset TEXT NOT NULL REFERENCES fw_ruleset(id) ON DELETE CASCADE,
  kind INTEGER NOT NULL,
  value TEXT NOT NULL,
  ord INTEGER NOT NULL,
  PRIMARY KEY(ruleset, kind, value)
) WITHOUT ROWID;
)sql";

/// A word of the description and the code it stands for.
struct CodeWord {
  const char* word; ///< Text in the description.
  int code;         ///< Stored code.
};

const CodeWord kPortTypes[] = {{"dst", 1}, {"src", 0}};
const CodeWord kDirections[] = {{"inbound", 0}, {"outbound", 1}};
const CodeWord kProtocols[] = {{"tcp", 0}, {"udp", 1}};

template <std::size_t N>
int ReadCode(const JsonObject& object, const char* key, const CodeWord (&words)[N]) {
  std::string text = object.String(key);
  std::string accepted;
  for (const CodeWord& word : words) {
    if (text == word.word)
      return word.code;
    accepted += accepted.empty() ? "" : " or ";
    accepted += std::string("\"") + word.word + "\"";
  }
  object.Fail(key, "expected " + accepted);
}

template <std::size_t N> const char* WordOf(int code, const CodeWord (&words)[N]) {
  for (const CodeWord& word : words)
    if (word.code == code)
      return word.word;
  return words[N - 1].word;
}

/// Refuses keys of a plain object that the part does not read.
void CheckObjectKeys(const JsonObject& object, const std::set<std::string>& known) {
  for (const auto& [key, value] : object.Json().items())
    if (!known.count(key))
      object.Fail(key.c_str(), "unknown field");
}

void ImportFirewall(const ordered_json& host, Store& store) {
  JsonObject root(host, "");
  bool loaded = false, enabled = true, pass = false, filters = false;
  if (std::optional<JsonObject> fw = root.Object("firewall")) {
    CheckObjectKeys(*fw, {"loaded", "enabled", "defaultAction", "filtersActive"});
    loaded = fw->Bool("loaded", true);
    enabled = fw->Bool("enabled", true);
    std::string action = fw->String("defaultAction", "DROP");
    if (action != "PASS" && action != "DROP")
      fw->Fail("defaultAction", "expected \"PASS\" or \"DROP\"");
    pass = action == "PASS";
    filters = fw->Bool("filtersActive", loaded);
    if (filters && !loaded)
      fw->Fail("filtersActive", "the filters cannot be active while the module is not loaded");
  }
  store.Prepare("INSERT INTO kmodule(name, loaded) VALUES(?, ?)")
      .BindAll(HostCtl::System::FirewallModuleName, loaded)
      .Run();
  store
      .Prepare("INSERT INTO setting(key, value) VALUES('firewall.enabled', ?), "
               "('firewall.defaultPass', ?), ('firewall.filtersActive', ?)")
      .BindAll(enabled, pass, filters)
      .Run();

  int ord = 0;
  std::set<std::string> seen;
  for (const JsonObject& set : root.Objects("firewallRulesets")) {
    std::string id = set.String("name");
    if (id.empty())
      set.Fail("name", "must not be empty");
    if (!seen.insert(id).second)
      set.Fail("name", "\"" + id + "\" is used by another ruleset");
    int64_t clients = set.Int("clients", 0, 1000000, 0);
    bool setEnabled = set.Bool("enabled", clients > 0);
    if (clients > 0 && !setEnabled)
      set.Fail("enabled", "a ruleset with clients is enabled");
    bool allowedAll = set.Bool("allowedAll", true);
    store
        .Prepare("INSERT INTO fw_ruleset(id, ord, enabled, allowed_all, enable_fixed, "
                 "allowed_ip_fixed, clients) VALUES(?,?,?,?,?,?,?)")
        .BindAll(id, ord++, setEnabled, allowedAll, set.Bool("enableFixed", false),
                 set.Bool("allowedIpFixed", false), clients)
        .Run();
    int ruleOrd = 0;
    for (const JsonObject& rule : set.Objects("rules")) {
      int64_t begin = rule.Int("portBegin", 0, 65535);
      int64_t end = rule.Int("portEnd", begin, 65535, begin);
      store
          .Prepare("INSERT INTO fw_rule(ruleset, ord, port_type, port_begin, port_end, "
                   "direction, protocol) VALUES(?,?,?,?,?,?,?)")
          .BindAll(id, ruleOrd++, ReadCode(rule, "portType", kPortTypes), begin, end,
                   ReadCode(rule, "direction", kDirections), ReadCode(rule, "protocol", kProtocols))
          .Run();
    }
    int ipOrd = 0;
    std::set<std::pair<int, std::string>> ips;
    for (const std::string& text : set.Strings("allowedIps")) {
      AllowedIpEntry entry;
      if (!ParseAllowedIp(text, entry))
        set.Fail("allowedIps", "\"" + text + "\" is not an IPv4 or IPv6 address or network");
      if (!ips.insert({entry.kind, entry.text}).second)
        set.Fail("allowedIps", "\"" + text + "\" is listed twice");
      store.Prepare("INSERT INTO fw_allowed_ip(ruleset, kind, value, ord) VALUES(?,?,?,?)")
          .BindAll(id, static_cast<int>(entry.kind), entry.text, ipOrd++)
          .Run();
    }
  }
}

void ExportFirewall(ordered_json& host, Store& store, ExportStreams& /*streams*/) {
  Statement state =
      store.Prepare("SELECT m.loaded, e.value AS enabled, p.value AS default_pass, "
                    "f.value AS filters_active FROM kmodule m, setting e, "
                    "setting p, setting f WHERE m.name = ? AND e.key = 'firewall.enabled' AND "
                    "p.key = 'firewall.defaultPass' AND f.key = 'firewall.filtersActive'");
  enum { kLoaded, kFirewallEnabled, kDefaultPass, kFiltersActive };
  state.Bind(1, HostCtl::System::FirewallModuleName);
  if (state.Step())
    host["firewall"] = {{"loaded", state.Bool(kLoaded)},
                        {"enabled", state.Bool(kFirewallEnabled)},
                        {"defaultAction", state.Bool(kDefaultPass) ? "PASS" : "DROP"},
                        {"filtersActive", state.Bool(kFiltersActive)}};
  ordered_json sets = ordered_json::array();
  Statement rows =
      store.Prepare("SELECT id, enabled, allowed_all, enable_fixed, allowed_ip_fixed, clients "
                    "FROM fw_ruleset ORDER BY ord");
  enum { kId, kEnabled, kAllowedAll, kEnableFixed, kAllowedIpFixed, kClients };
  while (rows.Step()) {
    std::string id = rows.Text(kId);
    ordered_json set = {{"name", id},
                        {"enabled", rows.Bool(kEnabled)},
                        {"allowedAll", rows.Bool(kAllowedAll)},
                        {"enableFixed", rows.Bool(kEnableFixed)},
                        {"allowedIpFixed", rows.Bool(kAllowedIpFixed)},
                        {"clients", rows.Int(kClients)}};
    ordered_json ips = ordered_json::array();
    Statement ip = store.Prepare("SELECT value FROM fw_allowed_ip WHERE ruleset = ? ORDER BY ord");
    enum { kValue };
    ip.Bind(1, id);
    while (ip.Step())
      ips.push_back(ip.Text(kValue));
    set["allowedIps"] = std::move(ips);
    ordered_json rules = ordered_json::array();
    Statement rule = store.Prepare("SELECT port_type, port_begin, port_end, direction, protocol "
                                   "FROM fw_rule WHERE ruleset = ? ORDER BY ord");
    enum { kPortType, kPortBegin, kPortEnd, kDirection, kProtocol };
    rule.Bind(1, id);
    while (rule.Step())
      rules.push_back({{"portType", WordOf(static_cast<int>(rule.Int(kPortType)), kPortTypes)},
                       {"portBegin", rule.Int(kPortBegin)},
                       {"portEnd", rule.Int(kPortEnd)},
                       {"direction", WordOf(static_cast<int>(rule.Int(kDirection)), kDirections)},
                       {"protocol", WordOf(static_cast<int>(rule.Int(kProtocol)), kProtocols)}});
    set["rules"] = std::move(rules);
    sets.push_back(std::move(set));
  }
  if (!sets.empty())
    host["firewallRulesets"] = std::move(sets);
}

} // namespace

bool ParseAllowedIp(const std::string& text, AllowedIpEntry& entry) {
  using namespace HostCtl::Network;
  if (text.find('/') != std::string::npos) {
    if (Ipv4Network::IsValidNetwork(text)) {
      Ipv4Network network(text);
      uint32_t masked = network.GetNetwork().GetValue() & network.GetNetmask().GetValue();
      entry.kind = AllowedIpv4Network;
      entry.text = Ipv4Network(Ipv4Address(masked), network.GetNetmask()).GetStringAddress();
      return true;
    }
    if (Ipv6Network::IsValidAddressAndNetmask(text)) {
      Ipv6Network network(text);
      std::array<uint8_t, 16> bytes = network.GetAddress().GetBytes();
      const std::array<uint8_t, 16> mask =
          Ipv6Network::NetmaskFromNumber(network.GetNetmask()).GetBytes();
      for (int i = 0; i < 16; ++i)
        bytes[i] &= mask[i];
      entry.kind = AllowedIpv6Network;
      entry.text = Ipv6Network(Ipv6Address(bytes), network.GetNetmask()).GetStringAddress();
      return true;
    }
    return false;
  }
  if (Ipv4Address::IsValidAddress(text)) {
    entry.kind = AllowedIpv4Address;
    entry.text = Ipv4Address(text).GetStringAddress();
    return true;
  }
  if (Ipv6Address::IsValidAddress(text)) {
    entry.kind = AllowedIpv6Address;
    entry.text = Ipv6Address(text).GetStringAddress();
    return true;
  }
  return false;
}

bool IsFirewallModuleLoaded(Store& store) {
  Statement row = store.Prepare("SELECT loaded FROM kmodule WHERE name = ?");
  enum { kLoaded };
  row.Bind(1, HostCtl::System::FirewallModuleName);
  return row.Step() && row.Bool(kLoaded);
}

extern const Part kFirewallPart;
const Part kFirewallPart = {
    "firewall",
    kFirewallSchema,
    {{"", {"firewall", "firewallRulesets"}},
     {"firewallRulesets",
      {"name", "enabled", "allowedAll", "enableFixed", "allowedIpFixed", "clients", "allowedIps",
       "rules"}},
     {"firewallRulesets.rules", {"portType", "portBegin", "portEnd", "direction", "protocol"}}},
    ImportFirewall,
    ExportFirewall,
};

} // namespace Model
