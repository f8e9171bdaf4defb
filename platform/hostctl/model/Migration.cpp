//===- model/Migration.cpp - Bringing older host files to the current layout ===//
//
// Layout 3 keeps the fixed-size records of the host in fewer, narrower
// tables than layout 2 (the side tables of NICs, interfaces, distributed
// ports and VM ports went into their owners' rows or into one document per
// record), and keeps route addresses as numbers. SQLite parses the whole
// schema before the first statement of every process, so each table and
// index it does not have to parse shortens every command.
//
// The migration renames every table of the old file to "layout2_NAME",
// creates the current schema exactly as a new file has it, copies the rows
// across (converting what changed form) and drops the old tables, all inside
// the caller's transaction. Layout 1 differs from layout 2 only in the column
// order of the resolver tables and one index, so rows are copied by column
// name and both migrate the same way.
//
//===----------------------------------------------------------------------===//
#include "model/Migration.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/Address.h"
#include "model/CoreModel.h"
#include "model/IpServicesModel.h"
#include "model/NicModel.h"
#include "model/Part.h"

#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace Model {

using HostCtl::Lib::HostCtlException;

namespace {

constexpr const char* kOld = "layout2_";

/// The names that \p sql, a SELECT of one column, returns.
std::vector<std::string> Names(Store& store, const char* sql) {
  std::vector<std::string> names;
  Statement rows = store.Prepare(sql);
  enum { kName };
  while (rows.Step())
    names.push_back(rows.Text(kName));
  return names;
}

std::vector<std::string> Columns(Store& store, const std::string& table) {
  std::vector<std::string> columns;
  Statement rows = store.Prepare("SELECT name FROM pragma_table_info(?) ORDER BY cid");
  enum { kName };
  rows.Bind(1, table);
  while (rows.Step())
    columns.push_back(rows.Text(kName));
  return columns;
}

/// Moves the old tables aside: indexes and triggers go (the new schema makes
/// its own), tables are renamed.
void SetOldTablesAside(Store& store) {
  for (const std::string& index :
       Names(store, "SELECT name FROM sqlite_schema WHERE type = 'index' AND sql IS NOT NULL"))
    store.Exec(("DROP INDEX \"" + index + "\"").c_str());
  for (const std::string& trigger :
       Names(store, "SELECT name FROM sqlite_schema WHERE type = 'trigger'"))
    store.Exec(("DROP TRIGGER \"" + trigger + "\"").c_str());
  for (const std::string& table : Names(store, "SELECT name FROM sqlite_schema WHERE type = "
                                               "'table' AND name NOT LIKE 'sqlite_%'"))
    store.Exec(("ALTER TABLE \"" + table + "\" RENAME TO \"" + kOld + table + "\"").c_str());
}

/// Copies the rows of every table that kept its name and columns.
void CopyUnchanged(Store& store) {
  static const char* const kTables[] = {
      "setting",          "portset",     "uplink",          "portgroup",         "world",
      "tvknic_ipv6",      "sriov_vf",    "pnic_attachment", "pnic_vlan_counter", "vswitch",
      "portgroup_policy", "dvswitch",    "tvknic_tag",      "tvknic_mcast",      "ipsvc_dns_server",
      "ipsvc_dns_search",

      "ipsvc_connection", "ipsvc_world", "ipsvc_ipsec_sa",  "ipsvc_ipsec_sp",    "vm_port_mac",
      "ens_lcore",        "kmodule",     "fw_ruleset",      "fw_rule",           "fw_allowed_ip"};
  for (const char* table : kTables) {
    std::string columns;
    for (const std::string& column : Columns(store, table))
      columns += (columns.empty() ? "" : ", ") + column;
    store.Exec(("INSERT INTO " + std::string(table) + "(" + columns + ") SELECT " + columns +
                " FROM " + kOld + table)
                   .c_str());
  }
}

/// Rows whose owners absorbed a side table: a missing side row takes the
/// defaults the old reads used.
void CopyMerged(Store& store) {
  store.Exec(
      "INSERT INTO pnic(name, ord, pci_address, vendor, device, pseudo_desc, driver, admin_up, "
      "link_up, speed, duplex, mac, mtu, dpu_id, sriov) "
      "SELECT name, ord, pci_address, vendor, device, pseudo_desc, driver, admin_up, link_up, "
      "speed, duplex, mac, mtu, dpu_id, name IN (SELECT nic FROM layout2_sriov_nic) "
      "FROM layout2_pnic;"
      "INSERT INTO pnic_record(nic, kind, value) SELECT nic, kind, value FROM layout2_pnic_hw;"
      "INSERT INTO pnic_record(nic, kind, value) "
      "SELECT nic, 'stats', counters FROM layout2_pnic_stats;"
      "INSERT INTO netstack(key, ord, name, state, max_conn, cur_max_conn, ccalgo, ipv6, "
      "cur_ipv6, ecn, predefined, gateway4, gateway6) "
      "SELECT key, ord, name, state, max_conn, cur_max_conn, ccalgo, ipv6, cur_ipv6, ecn, "
      "predefined, "
      "(SELECT gateway FROM layout2_ipsvc_gateway g WHERE g.netstack = n.key AND g.family = 4), "
      "(SELECT gateway FROM layout2_ipsvc_gateway g WHERE g.netstack = n.key AND g.family = 6) "
      "FROM layout2_netstack n;"
      "INSERT INTO dvport(portset_id, port_key, portgroup_key, connection_id, is_uplink, ord, "
      "name, lacp_enabled, lacp_mode, uplink_pg_key) "
      "SELECT d.portset_id, d.port_key, d.portgroup_key, d.connection_id, d.is_uplink, d.ord, "
      "coalesce(l.name, ''), coalesce(l.lacp_enabled, 0), coalesce(l.lacp_mode, 0), "
      "coalesce(l.uplink_pg_key, '') FROM layout2_dvport d LEFT JOIN layout2_dvport_lacp l "
      "ON l.portset_id = d.portset_id AND l.port_key = d.port_key;"
      "INSERT INTO port(id, portset_id, portgroup_id, dvport_key, client_kind, client, world_id, "
      "port_type, team_uplink, rx_bytes, tx_bytes, rx_packets, rx_multicast, rx_broadcast, "
      "tx_packets, tx_multicast, tx_broadcast, rx_dropped, tx_dropped) "
      "SELECT p.id, p.portset_id, p.portgroup_id, p.dvport_key, p.client_kind, p.client, "
      "p.world_id, p.port_type, v.team_uplink, c.rx_bytes, c.tx_bytes, c.rx_packets, "
      "c.rx_multicast, c.rx_broadcast, c.tx_packets, c.tx_multicast, c.tx_broadcast, "
      "c.rx_dropped, c.tx_dropped FROM layout2_port p "
      "LEFT JOIN layout2_vm_port v ON v.port_id = p.id "
      "LEFT JOIN layout2_port_counter c ON c.port_id = p.id;"
      "INSERT INTO tvknic(name, ord, netstack, port_id, mac, mtu, enabled, system, ipv4_mode, "
      "ipv4_address, ipv4_netmask, ipv4_gateway, tso_mss, rx_queues, dhcp_dns, ipv6_enabled, "
      "ipv6_dhcp, ipv6_ra, ipv6_dhcp_dns, ipv6_gateway, opaque_id, opaque_type, external_id) "
      "SELECT t.name, t.ord, t.netstack, t.port_id, t.mac, t.mtu, t.enabled, t.system, "
      "t.ipv4_mode, t.ipv4_address, t.ipv4_netmask, t.ipv4_gateway, coalesce(e.tso_mss, 65535), "
      "coalesce(e.rx_queues, 1), coalesce(e.dhcp_dns, 0), coalesce(e.ipv6_enabled, 1), "
      "coalesce(e.ipv6_dhcp, 0), coalesce(e.ipv6_ra, 0), coalesce(e.ipv6_dhcp_dns, 0), "
      "coalesce(e.ipv6_gateway, '::'), coalesce(e.opaque_id, ''), coalesce(e.opaque_type, ''), "
      "coalesce(e.external_id, '') FROM layout2_tvknic t "
      "LEFT JOIN layout2_tvknic_ext e ON e.name = t.name;"
      "INSERT INTO setting(key, value) "
      "SELECT 'firewall.enabled', enabled FROM layout2_fw_state WHERE id = 1 UNION ALL "
      "SELECT 'firewall.defaultPass', default_pass FROM layout2_fw_state WHERE id = 1 UNION ALL "
      "SELECT 'firewall.filtersActive', filters_active FROM layout2_fw_state WHERE id = 1;");
}

/// The declared faults become one setting, in the order they were declared.
void CopyFaults(Store& store) {
  nlohmann::ordered_json faults = nlohmann::ordered_json::array();
  Statement row =
      store.Prepare("SELECT operation, object, message FROM layout2_fault ORDER BY rowid");
  enum { kOperation, kObject, kMessage };
  while (row.Step())
    faults.push_back({{"operation", row.Text(kOperation)},
                      {"object", row.Text(kObject)},
                      {"message", row.Text(kMessage)}});
  if (!faults.empty())
    PutSetting(store, kFaultsSetting, faults.dump());
}

/// The generic information of each NIC becomes its "info" document.
void CopyNicInfo(Store& store) {
  Statement row = store.Prepare(
      "SELECT nic, supported_ports, supports_autoneg, advertised_modes, advertised_autoneg, port, "
      "phy_address, transceiver, autoneg, supports_wakeon, wakeon, msglvl_supported, msglvl, "
      "virtual_address, driver_version, firmware_version, pause_supported, pause_autoneg, "
      "pause_rx, pause_tx FROM layout2_pnic_info");
  enum {
    kNic,
    kSupportedPorts,
    kSupportsAutoneg,
    kAdvertisedModes,
    kAdvertisedAutoneg,
    kPort,
    kPhyAddress,
    kTransceiver,
    kAutoneg,
    kSupportsWakeOn,
    kWakeOn,
    kMessageLevelSupported,
    kMessageLevel,
    kVirtualAddress,
    kDriverVersion,
    kFirmwareVersion,
    kPauseSupported,
    kPauseAutoneg,
    kPauseRx,
    kPauseTx
  };
  auto u32 = [&](int column) { return static_cast<uint32_t>(row.Int(column)); };
  while (row.Step()) {
    NicSettings settings;
    HostCtl::Network::PnicInfo& info = settings.info;
    info.supportedPorts =
        nlohmann::json::parse(row.Text(kSupportedPorts)).get<std::vector<uint32_t>>();
    info.supportsAutoNegotiation = row.Bool(kSupportsAutoneg);
    for (const auto& mode : nlohmann::json::parse(row.Text(kAdvertisedModes)))
      info.advertisedModes.push_back(
          {mode.at(0).get<uint32_t>(), mode.at(1).get<uint32_t>(), mode.at(2).get<uint32_t>()});
    info.advertisedAutoNegotiation = row.Bool(kAdvertisedAutoneg);
    info.port = u32(kPort);
    info.phyAddress = u32(kPhyAddress);
    info.transceiver = u32(kTransceiver);
    info.autoNegotiation = row.Bool(kAutoneg);
    info.supportsWakeOn = row.Bool(kSupportsWakeOn);
    info.wakeOn = nlohmann::json::parse(row.Text(kWakeOn)).get<std::vector<uint32_t>>();
    info.messageLevelSupported = row.Bool(kMessageLevelSupported);
    info.messageLevel = u32(kMessageLevel);
    info.virtualAddress = row.Text(kVirtualAddress);
    settings.driverVersion = row.Text(kDriverVersion);
    settings.firmwareVersion = row.Text(kFirmwareVersion);
    settings.pause.supported = row.Bool(kPauseSupported);
    settings.pause.autoNegotiation = row.Bool(kPauseAutoneg);
    settings.pause.rx = row.Bool(kPauseRx);
    settings.pause.tx = row.Bool(kPauseTx);
    SaveNicSettings(store, row.Text(kNic), settings);
  }
}

/// The LACP state of the NICs of each LAG becomes the LAG's "nics" document.
void CopyLags(Store& store) {
  store.Exec("INSERT INTO lag(portset_id, lag_id, name, mode, load_balancing, uplink_count, ord, "
             "nics) SELECT portset_id, lag_id, name, mode, load_balancing, uplink_count, ord, "
             "'[]' FROM layout2_lag");
  Statement row = store.Prepare(
      "SELECT portset_id, lag_id, nic, state, actor_port_number, actor_port_priority, "
      "actor_admin_key, actor_oper_key, actor_state, partner_age, partner_port_number, "
      "partner_port_priority, partner_oper_key, partner_state, partner_device_id, rx_lacpdus, "
      "tx_lacpdus, rx_errors, tx_errors FROM layout2_lacp_nic ORDER BY portset_id, lag_id, ord");
  enum { kPortset, kLag, kNic, kState, kFirstField };
  static const char* const kFields[] = {
      "actorPortNumber", "actorPortPriority", "actorAdminKey",     "actorOperKey",
      "actorState",      "partnerAge",        "partnerPortNumber", "partnerPortPriority",
      "partnerOperKey",  "partnerState"};
  static const char* const kCounters[] = {"rxLacpdus", "txLacpdus", "rxErrors", "txErrors"};
  Statement update = store.Prepare("UPDATE lag SET nics = ? WHERE portset_id = ? AND lag_id = ?");
  auto flush = [&](int64_t portset, int64_t lag, nlohmann::ordered_json& nics) {
    update.BindAll(nics.dump(), portset, lag);
    update.Run();
    update.Reset();
    nics = nlohmann::ordered_json::array();
  };
  nlohmann::ordered_json nics = nlohmann::ordered_json::array();
  int64_t portset = -1;
  int64_t lag = -1;
  while (row.Step()) {
    if (row.Int(kPortset) != portset || row.Int(kLag) != lag) {
      if (!nics.empty())
        flush(portset, lag, nics);
      portset = row.Int(kPortset);
      lag = row.Int(kLag);
    }
    nlohmann::ordered_json nic = {{"name", row.Text(kNic)}, {"state", row.Text(kState)}};
    int column = kFirstField;
    for (const char* field : kFields)
      nic[field] = row.Int(column++);
    nic["partnerDeviceId"] = row.Text(column++);
    for (const char* counter : kCounters)
      nic[counter] = static_cast<uint64_t>(row.Int(column++));
    nics.push_back(std::move(nic));
  }
  if (!nics.empty())
    flush(portset, lag, nics);
}

/// The packet filters of each port become the port's "filters" document.
void CopyFilters(Store& store) {
  Statement row = store.Prepare(
      "SELECT port_id, name, sort_key, active, direction, extended, packets_in, packets_out, "
      "packets_dropped, packets_filtered, packets_faulted, packets_queued, packets_injected, "
      "packet_errors FROM layout2_port_filter ORDER BY port_id, ord");
  enum { kPort, kName, kSortKey, kActive, kOutbound, kExtended, kFirstCounter };
  static const char* const kCounters[] = {"packetsIn",       "packetsOut",     "packetsDropped",
                                          "packetsFiltered", "packetsFaulted", "packetsQueued",
                                          "packetsInjected", "packetErrors"};
  Statement update = store.Prepare("UPDATE port SET filters = ? WHERE id = ?");
  auto flush = [&](int64_t port, nlohmann::ordered_json& filters) {
    update.BindAll(filters.dump(), port);
    update.Run();
    update.Reset();
    filters = nlohmann::ordered_json::array();
  };
  nlohmann::ordered_json filters = nlohmann::ordered_json::array();
  int64_t port = -1;
  while (row.Step()) {
    if (row.Int(kPort) != port) {
      if (!filters.empty())
        flush(port, filters);
      port = row.Int(kPort);
    }
    nlohmann::ordered_json filter = {{"name", row.Text(kName)},
                                     {"sortKey", row.Text(kSortKey)},
                                     {"active", row.Bool(kActive)},
                                     {"outbound", row.Bool(kOutbound)},
                                     {"extended", row.Bool(kExtended)}};
    int column = kFirstCounter;
    for (const char* counter : kCounters)
      filter[counter] = static_cast<uint64_t>(row.Int(column++));
    filters.push_back(std::move(filter));
  }
  if (!filters.empty())
    flush(port, filters);
}

/// The IPv4 address of each VM port becomes a number.
void CopyVmPortAddresses(Store& store) {
  Statement row = store.Prepare("SELECT port_id, ipv4 FROM layout2_vm_port");
  enum { kPortId, kIpv4 };
  Statement update = store.Prepare("UPDATE port SET ipv4 = ? WHERE id = ?");
  uint32_t address = 0;
  while (row.Step()) {
    // The import checked the address; a value it would refuse reads as none.
    if (!HostCtl::Network::Ipv4Address::Parse(row.Text(kIpv4), address))
      address = 0;
    update.BindAll(static_cast<int64_t>(address), row.Int(kPortId));
    update.Run();
    update.Reset();
  }
}

/// Neighbour entries keep their ids (their listing order); their addresses
/// become numbers.
void CopyNeighbors(Store& store) {
  Statement row = store.Prepare("SELECT id, family, interface, address, mac, expiry, type, state "
                                "FROM layout2_ipsvc_neighbor ORDER BY id");
  enum { kId, kFamily, kInterface, kAddress, kMac, kExpiry, kType, kState };
  Statement insert = store.Prepare(
      "INSERT INTO ipsvc_neighbor(id, family, interface, address, mac, expiry, type, state) "
      "VALUES(?, ?, ?, ?, ?, ?, ?, ?)");
  while (row.Step()) {
    insert.BindAll(row.Int(kId), row.Int(kFamily), row.Text(kInterface));
    try {
      if (row.Int(kFamily) == 6)
        IpSvc::BindAddress(insert, 4, HostCtl::Network::Ipv6Address(row.Text(kAddress)));
      else
        IpSvc::BindAddress(insert, 4, HostCtl::Network::Ipv4Address(row.Text(kAddress)));
    } catch (const HostCtlException&) {
      throw HostCtlException("The host state at " + store.GetPath() + " has a neighbour " +
                             row.Text(kAddress) + " that cannot be read; it was left as it was");
    }
    insert.Bind(5, row.Text(kMac))
        .Bind(6, row.Int(kExpiry))
        .Bind(7, row.Int(kType))
        .Bind(8, row.Int(kState))
        .Run();
    insert.Reset();
  }
}

/// Hosts entries keep their ids (their listing order); their addresses
/// become numbers.
void CopyHostsEntries(Store& store) {
  Statement row = store.Prepare("SELECT id, address, hostname, aliases, comment, system FROM "
                                "layout2_ipsvc_hosts ORDER BY id");
  enum { kId, kAddress, kHostname, kAliases, kComment, kSystem };
  Statement insert = store.Prepare("INSERT INTO ipsvc_hosts(id, address, hostname, aliases, "
                                   "comment, system) VALUES(?, ?, ?, ?, ?, ?)");
  while (row.Step()) {
    insert.Bind(1, row.Int(kId));
    try {
      IpSvc::BindAddress(insert, 2, row.Text(kAddress));
    } catch (const HostCtlException&) {
      throw HostCtlException("The host state at " + store.GetPath() + " has a hosts entry " +
                             row.Text(kAddress) + " that cannot be read; it was left as it was");
    }
    insert.Bind(3, row.Text(kHostname))
        .Bind(4, row.Text(kAliases))
        .Bind(5, row.Text(kComment))
        .Bind(6, row.Int(kSystem))
        .Run();
    insert.Reset();
  }
}

/// Routes keep their ids (their listing order); their addresses become
/// numbers.
void CopyRoutes(Store& store) {
  Statement row =
      store.Prepare("SELECT id, netstack, family, system, network, prefix, gateway, interface, "
                    "source FROM layout2_ipsvc_route ORDER BY id");
  enum { kId, kNetstack, kFamily, kSystem, kNetwork, kPrefix, kGateway, kInterface, kSource };
  Statement insert = store.Prepare(
      "INSERT INTO ipsvc_route(id, netstack, family, system, network, prefix, gateway, "
      "interface, source) VALUES(?, ?, ?, ?, ?, ?, ?, ?, ?)");
  while (row.Step()) {
    insert.BindAll(row.Int(kId), row.Text(kNetstack), row.Int(kFamily), row.Int(kSystem));
    insert.Bind(6, row.Int(kPrefix)).Bind(8, row.Text(kInterface)).Bind(9, row.Text(kSource));
    try {
      if (row.Int(kFamily) == 6) {
        IpSvc::BindAddress(insert, 5, HostCtl::Network::Ipv6Address(row.Text(kNetwork)));
        IpSvc::BindAddress(insert, 7, HostCtl::Network::Ipv6Address(row.Text(kGateway)));
      } else {
        IpSvc::BindAddress(insert, 5, HostCtl::Network::Ipv4Address(row.Text(kNetwork)));
        IpSvc::BindAddress(insert, 7, HostCtl::Network::Ipv4Address(row.Text(kGateway)));
      }
    } catch (const HostCtlException&) {
      throw HostCtlException("The host state at " + store.GetPath() + " has a route " +
                             row.Text(kNetwork) + "/" + std::to_string(row.Int(kPrefix)) +
                             " that cannot be read; it was left as it was");
    }
    insert.Run();
    insert.Reset();
  }
}

} // namespace

void MigrateLayout(Store& store, int64_t from) {
  if (from < 1 || from >= kLayoutVersion)
    throw HostCtlException("Internal error: no migration from layout " + std::to_string(from));
  SetOldTablesAside(store);
  for (const Part* part : AllParts())
    store.Exec(part->schema);
  CopyUnchanged(store);
  CopyMerged(store);
  CopyFaults(store);
  CopyNicInfo(store);
  CopyLags(store);
  CopyFilters(store);
  CopyVmPortAddresses(store);
  CopyRoutes(store);
  CopyNeighbors(store);
  CopyHostsEntries(store);
  for (const std::string& table :
       Names(store, "SELECT name FROM sqlite_schema WHERE type = 'table' AND name LIKE "
                    "'layout2!_%' ESCAPE '!'"))
    store.Exec(("DROP TABLE \"" + table + "\"").c_str());
  Statement broken = store.Prepare("PRAGMA foreign_key_check");
  enum { kTable, kRowId, kParent, kForeignKey };
  if (broken.Step())
    throw HostCtlException("The host state at " + store.GetPath() +
                           " cannot be brought to layout " + std::to_string(kLayoutVersion) +
                           ": a row of " + broken.Text(kTable) + " refers to a missing row of " +
                           broken.Text(kParent) + "; it was left as it was");
}

} // namespace Model
