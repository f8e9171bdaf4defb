//===- model/GeneratedHost.cpp - Large hosts for scale tests ---------------===//
//
// A generated host is the demo host grown to given sizes: many IPv4 routes on
// the default netstack, many port groups on the standard switches, many VMs
// with their ports, and optionally many neighbours and hosts entries. The demo
// host is imported first; the generated rows are then inserted through
// prepared statements that are bound and run once per row, all in the same
// write transaction, so that a host of 100,000 routes takes well under a
// second to build.
//
// Every generated row is one the host description could hold: export then
// import gives the same host.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "HostCtl/Network/Switching.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"
#include "model/SwitchingModel.h"

#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

namespace Model {

using HostCtl::Lib::HostCtlException;
using nlohmann::ordered_json;

namespace {

/// The interface and netstack that carry the generated routes and neighbours.
const char* const kRouteNetstack = "defaultTcpipStack";
const char* const kRouteInterface = "tvk0";

/// A unicast MAC address with prefix \p oui (three bytes) and \p serial.
std::string Mac(uint32_t oui, uint32_t serial) {
  char text[18];
  std::snprintf(text, sizeof text, "%02x:%02x:%02x:%02x:%02x:%02x", (oui >> 16) & 255,
                (oui >> 8) & 255, oui & 255, (serial >> 16) & 255, (serial >> 8) & 255,
                serial & 255);
  return text;
}

/// Zero-padded decimal text of \p value with prefix \p prefix.
std::string Numbered(const char* prefix, int64_t value, int width) {
  char text[32];
  std::snprintf(text, sizeof text, "%s%0*lld", prefix, width, static_cast<long long>(value));
  return text;
}

void Require(bool ok, const std::string& message) {
  if (!ok)
    throw HostCtlException(message);
}

/// IPv4 routes in 10.128.0.0/9, /24 networks while they fit, then longer
/// prefixes; the gateways are the routers of tvk0's subnet.
void GenerateRoutes(Store& store, int64_t count) {
  int step = 256;
  while (step > 4 && count * step > (int64_t{1} << 23))
    step /= 4;
  int prefix = 32;
  for (int size = step; size > 1; size /= 2)
    --prefix;
  Statement insert = store.Prepare(
      "INSERT INTO ipsvc_route(netstack, family, system, network, prefix, gateway, interface, "
      "source) VALUES(?, 4, 0, ?, ?, ?, ?, 'user')");
  const int64_t base = 0x0A800000;     // 10.128.0.0
  const int64_t gateways = 0x0A1400FB; // 10.20.0.251 to .254
  for (int64_t i = 0; i < count; ++i) {
    insert.BindAll(kRouteNetstack, base + i * step, prefix, gateways + i % 4, kRouteInterface);
    insert.Run();
    insert.Reset();
  }
}

/// A standard switch of the demo host with what the generator adds to it.
struct Switch {
  int64_t id = 0;                   ///< portset id.
  std::string name;                 ///< Switch name.
  int64_t numPorts = 0;             ///< Configured ports.
  int64_t usedPorts = 0;            ///< Ports in use before the VMs are added.
  std::vector<std::string> uplinks; ///< Uplink NICs, in order.
  std::vector<int64_t> portgroups;  ///< Port groups that take VM ports.
  int64_t vmPorts = 0;              ///< VM ports the generator puts on it.
};

std::vector<Switch> StandardSwitches(Store& store) {
  std::vector<Switch> switches;
  Statement rows = store.Prepare(
      "SELECT id, name, num_ports, (SELECT count(*) FROM port WHERE portset_id = p.id) AS used "
      "FROM portset p WHERE kind = 'standard' AND system = 0 ORDER BY ord");
  enum { kId, kName, kNumPorts, kUsed };
  while (rows.Step()) {
    Switch s;
    s.id = rows.Int(kId);
    s.name = rows.Text(kName);
    s.numPorts = rows.Int(kNumPorts);
    s.usedPorts = rows.Int(kUsed);
    switches.push_back(std::move(s));
  }
  for (Switch& s : switches) {
    Statement uplinks = store.Prepare("SELECT nic FROM uplink WHERE portset_id = ? ORDER BY ord");
    enum { kNic };
    uplinks.Bind(1, s.id);
    while (uplinks.Step())
      s.uplinks.push_back(uplinks.Text(kNic));
  }
  return switches;
}

/// The stored text of each policy override the generated port groups cycle
/// through, made by the same conversions as an imported description.
struct PolicyVariant {
  std::string teaming, security, shaping;
};

std::vector<PolicyVariant> PolicyVariants() {
  auto teaming = [](const char* text) {
    ordered_json json = ordered_json::parse(text);
    return TeamingToJson(TeamingFromJson(JsonObject(json, "teaming"))).dump();
  };
  auto security = [](const char* text) {
    ordered_json json = ordered_json::parse(text);
    return SecurityToJson(SecurityFromJson(JsonObject(json, "security"))).dump();
  };
  auto shaping = [](const char* text) {
    ordered_json json = ordered_json::parse(text);
    return ShapingToJson(ShapingFromJson(JsonObject(json, "shaping"))).dump();
  };
  const std::string noTeaming = teaming("{}");
  const std::string noSecurity = security("{}");
  const std::string noShaping = shaping("{}");
  return {
      {noTeaming, noSecurity, noShaping},
      {teaming(R"({"loadBalancing": "iphash"})"), noSecurity, noShaping},
      {noTeaming, security(R"({"allowMacChange": false, "allowForgedTransmits": false})"),
       noShaping},
      {teaming(R"({"failureDetection": "beacon", "failback": false})"), noSecurity,
       shaping(R"({"enabled": true, "averageBps": 1000000000, "peakBps": 2000000000,
                   "burstSize": 10485760})")},
  };
}

/// Port groups spread round robin over the standard switches, with VLAN ids
/// 100 to 3999 and one of four policy overrides each.
void GeneratePortGroups(Store& store, int64_t count, std::vector<Switch>& switches) {
  if (count == 0)
    return;
  Require(!switches.empty(), "The host has no standard switch for the port groups");
  std::vector<PolicyVariant> variants = PolicyVariants();
  Statement ord = store.Prepare("SELECT coalesce(max(ord), -1) + 1 AS next_ord FROM portgroup");
  enum { kNextOrd };
  ord.Step();
  int64_t nextOrd = ord.Int(kNextOrd);
  Statement insert = store.Prepare(
      "INSERT INTO portgroup(name, portset_id, vlan_id, system, ord) VALUES(?, ?, ?, 0, ?)");
  Statement policy = store.Prepare(
      "INSERT INTO portgroup_policy(portgroup_id, teaming, security, shaping) VALUES(?, ?, ?, ?)");
  for (int64_t i = 0; i < count; ++i) {
    Switch& s = switches[i % switches.size()];
    insert.BindAll(Numbered("PG-", i + 1, 5), s.id, 100 + i % 3900, nextOrd++);
    insert.Run();
    insert.Reset();
    int64_t id = store.LastInsertId();
    const PolicyVariant& variant = variants[i % variants.size()];
    policy.BindAll(id, variant.teaming, variant.security, variant.shaping);
    policy.Run();
    policy.Reset();
    s.portgroups.push_back(id);
  }
}

/// VMs spread round robin over the standard switches, each with its ports on
/// port groups of its switch. The switches grow to hold the ports, within
/// the host's limit of ports on standard switches.
void GenerateVms(Store& store, int64_t vms, int64_t portsPerVm, std::vector<Switch>& switches) {
  if (vms == 0 || portsPerVm == 0)
    return;
  Require(!switches.empty(), "The host has no standard switch for the VMs");
  for (int64_t vm = 0; vm < vms; ++vm)
    switches[vm % switches.size()].vmPorts += portsPerVm;
  int64_t total = 0;
  for (Switch& s : switches) {
    if (s.portgroups.empty()) {
      Statement groups = store.Prepare(
          "SELECT id FROM portgroup WHERE portset_id = ? AND system = 0 ORDER BY ord");
      enum { kId };
      groups.Bind(1, s.id);
      while (groups.Step())
        s.portgroups.push_back(groups.Int(kId));
    }
    Require(!s.portgroups.empty() || s.vmPorts == 0,
            "Switch " + s.name + " has no port group for the VM ports");
    int64_t needed = std::max(s.numPorts, s.usedPorts + s.vmPorts);
    Require(needed <= HostCtl::Network::VirtualSwitch::MAX_PORTS,
            std::to_string(vms * portsPerVm) + " VM ports do not fit: switch " + s.name +
                " would need " + std::to_string(needed) + " ports (at most " +
                std::to_string(HostCtl::Network::VirtualSwitch::MAX_PORTS) + ")");
    s.numPorts = needed;
    total += needed;
  }
  Statement others = store.Prepare(
      "SELECT coalesce(sum(num_ports), 0) AS ports FROM portset WHERE kind = 'standard' AND "
      "system = 1");
  enum { kPorts };
  others.Step();
  total += others.Int(kPorts);
  Require(total <= HostCtl::Network::VirtualSwitch::MAX_HOST_PORTS,
          std::to_string(vms * portsPerVm) +
              " VM ports do not fit: the standard switches would need " + std::to_string(total) +
              " ports (the host has at most " +
              std::to_string(HostCtl::Network::VirtualSwitch::MAX_HOST_PORTS) + ")");
  Statement grow = store.Prepare("UPDATE portset SET num_ports = ? WHERE id = ?");
  for (const Switch& s : switches) {
    grow.BindAll(s.numPorts, s.id);
    grow.Run();
    grow.Reset();
  }

  Statement firstId = store.Prepare("SELECT coalesce(max(id), 33554431) + 1 AS next_id FROM port");
  enum { kNextId };
  firstId.Step();
  int64_t portId = firstId.Int(kNextId);
  Statement world = store.Prepare("INSERT INTO world(id, name) VALUES(?, ?)");
  Statement port = store.Prepare(
      "INSERT INTO port(id, portset_id, portgroup_id, dvport_key, client_kind, client, world_id, "
      "port_type, ipv4, team_uplink, rx_bytes, tx_bytes, rx_packets, rx_multicast, "
      "rx_broadcast, tx_packets, tx_multicast, tx_broadcast, rx_dropped, tx_dropped) "
      "VALUES(?, ?, ?, NULL, 'vm', ?, ?, 0, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)");
  Statement mac = store.Prepare("INSERT INTO vm_port_mac(port_id, ord, mac) VALUES(?, 0, ?)");
  std::vector<int64_t> used(switches.size(), 0);
  int64_t serial = 0;
  for (int64_t vm = 0; vm < vms; ++vm) {
    std::size_t which = vm % switches.size();
    Switch& s = switches[which];
    int64_t worldId = 3000001 + vm;
    std::string name = Numbered("ovm0:app-", vm + 1, 5);
    world.BindAll(worldId, name);
    world.Run();
    world.Reset();
    for (int64_t adapter = 0; adapter < portsPerVm; ++adapter, ++serial, ++portId) {
      int64_t group = s.portgroups[used[which]++ % s.portgroups.size()];
      std::string uplink =
          s.uplinks.empty() ? std::string() : s.uplinks[adapter % s.uplinks.size()];
      int64_t packets = 1000 + serial * 37 % 100000;
      // 10.64.0.0/10 holds the VMs' addresses, one per port.
      port.BindAll(portId, s.id, group, name + ".eth" + std::to_string(adapter), worldId,
                   int64_t{0x0A400000} + serial + 1, uplink, packets * 900, packets * 600, packets,
                   packets / 50, packets / 100, packets * 2 / 3, packets / 200, packets / 400,
                   serial % 7, int64_t{0});
      port.Run();
      port.Reset();
      mac.BindAll(portId, Mac(0x00505A, static_cast<uint32_t>(serial)));
      mac.Run();
      mac.Reset();
    }
  }
}

/// IPv4 neighbours of tvk0 in 10.32.0.0/11.
void GenerateNeighbours(Store& store, int64_t count) {
  Statement insert = store.Prepare(
      "INSERT INTO ipsvc_neighbor(family, interface, address, mac, expiry, type, state) "
      "VALUES(4, ?, ?, ?, ?, 1, 0)");
  for (int64_t i = 0; i < count; ++i) {
    insert.BindAll(kRouteInterface, int64_t{0x0A200000} + i + 1,
                   Mac(0x001C74, static_cast<uint32_t>(i)), i % 1200);
    insert.Run();
    insert.Reset();
  }
}

/// Hosts entries for addresses in 172.16.0.0/12, each with a short alias.
void GenerateHostsEntries(Store& store, int64_t count) {
  Statement insert =
      store.Prepare("INSERT INTO ipsvc_hosts(address, hostname, aliases, comment, system) "
                    "VALUES(?, ?, ?, '', 0)");
  for (int64_t i = 0; i < count; ++i) {
    std::string alias = Numbered("node", i + 1, 6);
    insert.BindAll(int64_t{0xAC100000} + i + 1, alias + ".lab.example", alias);
    insert.Run();
    insert.Reset();
  }
}

} // namespace

void CheckHostSizes(const HostSizes& sizes) {
  auto check = [](const char* what, int64_t value, int64_t max) {
    if (value < 0 || value > max)
      throw HostCtlException(std::string(what) + " must be from 0 to " + std::to_string(max));
  };
  check("routes", sizes.routes, HostSizes::kMaxRoutes);
  check("portgroups", sizes.portgroups, HostSizes::kMaxPortGroups);
  check("vms", sizes.vms, HostSizes::kMaxVms);
  check("ports-per-vm", sizes.portsPerVm, HostSizes::kMaxPortsPerVm);
  check("neighbours", sizes.neighbours, HostSizes::kMaxNeighbours);
  check("hosts-entries", sizes.hostsEntries, HostSizes::kMaxHostsEntries);
}

void GenerateHost(Store& store, const HostSizes& sizes) {
  CheckHostSizes(sizes);
  store.Write([&] {
    ImportHost(store, Profile("demo"));
    GenerateRoutes(store, sizes.routes);
    std::vector<Switch> switches = StandardSwitches(store);
    GeneratePortGroups(store, sizes.portgroups, switches);
    GenerateVms(store, sizes.vms, sizes.portsPerVm, switches);
    GenerateNeighbours(store, sizes.neighbours);
    GenerateHostsEntries(store, sizes.hostsEntries);
  });
}

} // namespace Model
