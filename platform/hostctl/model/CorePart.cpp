//===- model/CorePart.cpp - Tables shared by every area of the host --------===//
//
// The core part owns the tables that several areas read: host-wide settings,
// declared faults, physical NICs, and the skeleton of the switching world
// (switches, uplinks, port groups, distributed ports, ports, worlds) and of
// the IP world (netstacks, kernel interfaces and their addresses). Other parts
// add side tables keyed by these; they do not change these tables' layout.
//
// Import of the shared tables is done by the part that owns the description
// keys (vswitches by the switching part, interfaces by the IP part, ...); the
// core part imports "faults" and the basic fields of "nics".
//
//===----------------------------------------------------------------------===//
#include "model/CoreModel.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/Address.h"
#include "model/JsonRead.h"
#include "model/Part.h"

namespace Model {

using nlohmann::ordered_json;

namespace {

const char* const kCoreSchema = R"sql(
-- Host-wide values by key (each area names its own keys; the declared faults
-- are the JSON array under "faults").
CREATE TABLE setting(key TEXT PRIMARY KEY, value NOT NULL) WITHOUT ROWID;

-- Physical NICs. A NIC without PCI function has pci_address NULL and a
-- pseudo-device description. `link_up` is the carrier of the PHY; the
-- effective link is up when the NIC is administratively up and has carrier.
-- `sriov` is set for the physical functions of SR-IOV NICs.
CREATE TABLE pnic(
  name TEXT PRIMARY KEY,
  ord INTEGER NOT NULL,
  pci_address TEXT,
  vendor TEXT NOT NULL,
  device TEXT NOT NULL,
  pseudo_desc TEXT NOT NULL,
  driver TEXT NOT NULL,
  admin_up INTEGER NOT NULL,
  link_up INTEGER NOT NULL,
  speed INTEGER NOT NULL,
  duplex INTEGER NOT NULL,
  mac TEXT NOT NULL,
  mtu INTEGER NOT NULL,
  dpu_id TEXT,
  sriov INTEGER NOT NULL
) WITHOUT ROWID;

-- Netstack instances (TCP/IP stacks of the kernel), with their configured
-- default gateways (NULL for none).
CREATE TABLE netstack(
  key TEXT PRIMARY KEY,
  ord INTEGER NOT NULL,
  name TEXT NOT NULL,
  state INTEGER NOT NULL,
  max_conn INTEGER NOT NULL DEFAULT 11000,
  cur_max_conn INTEGER NOT NULL DEFAULT 11000,
  ccalgo TEXT NOT NULL DEFAULT 'newreno',
  ipv6 INTEGER NOT NULL DEFAULT 1,
  cur_ipv6 INTEGER NOT NULL DEFAULT 1,
  ecn TEXT NOT NULL DEFAULT 'enabled',
  predefined INTEGER NOT NULL DEFAULT 0,
  gateway4 TEXT,
  gateway6 TEXT
) WITHOUT ROWID;

-- Switches of every kind ("portsets"): kind is 'standard', 'dvs' or 'opaque'.
CREATE TABLE portset(
  id INTEGER PRIMARY KEY,
  name TEXT NOT NULL UNIQUE,
  kind TEXT NOT NULL,
  system INTEGER NOT NULL,
  ord INTEGER NOT NULL,
  num_ports INTEGER NOT NULL,
  mtu INTEGER NOT NULL
);

-- Uplinks of a switch, in order. A distributed switch may name uplinks that
-- are not NICs of this host.
CREATE TABLE uplink(
  portset_id INTEGER NOT NULL REFERENCES portset(id) ON DELETE CASCADE,
  nic TEXT NOT NULL,
  ord INTEGER NOT NULL,
  vlan_stats INTEGER NOT NULL DEFAULT 0,
  PRIMARY KEY(portset_id, nic)
) WITHOUT ROWID;

-- Port groups of standard switches; names are unique on the host. A new port
-- group goes after the last one, found by the order index in O(log n).
CREATE TABLE portgroup(
  id INTEGER PRIMARY KEY,
  name TEXT NOT NULL UNIQUE,
  portset_id INTEGER NOT NULL REFERENCES portset(id) ON DELETE CASCADE,
  vlan_id INTEGER NOT NULL,
  system INTEGER NOT NULL,
  ord INTEGER NOT NULL
);
CREATE INDEX portgroup_by_portset ON portgroup(portset_id);
CREATE INDEX portgroup_by_ord ON portgroup(ord);

-- Ports of distributed switches, by their port key (a string), with their
-- names and LACP settings.
CREATE TABLE dvport(
  portset_id INTEGER NOT NULL REFERENCES portset(id) ON DELETE CASCADE,
  port_key TEXT NOT NULL,
  portgroup_key TEXT NOT NULL,
  connection_id INTEGER NOT NULL,
  is_uplink INTEGER NOT NULL,
  ord INTEGER NOT NULL,
  name TEXT NOT NULL,
  lacp_enabled INTEGER NOT NULL,
  lacp_mode INTEGER NOT NULL,
  uplink_pg_key TEXT NOT NULL,
  PRIMARY KEY(portset_id, port_key)
) WITHOUT ROWID;

-- Virtual ports in use: each has one client (client_kind 'uplink', 'tvknic'
-- or 'vm') and sits on a port group (standard switch) or a distributed port.
-- A VM's port has its adapter's IPv4 address (a number) and the uplink the
-- team scheduler chose ('' for none); other ports have them NULL. The
-- counters are unsigned 64-bit values kept in signed columns, all NULL for
-- a port whose counters were never set (they read as zero). `filters` holds
-- the port's packet filters in the host's order with their counters, a JSON
-- array in the form of the host description (NULL for none).
CREATE TABLE port(
  id INTEGER PRIMARY KEY,
  portset_id INTEGER NOT NULL REFERENCES portset(id) ON DELETE CASCADE,
  portgroup_id INTEGER REFERENCES portgroup(id),
  dvport_key TEXT,
  client_kind TEXT NOT NULL,
  client TEXT NOT NULL,
  world_id INTEGER NOT NULL DEFAULT 0,
  port_type INTEGER NOT NULL DEFAULT 0,
  ipv4 INTEGER,
  team_uplink TEXT,
  rx_bytes, tx_bytes, rx_packets, rx_multicast, rx_broadcast,
  tx_packets, tx_multicast, tx_broadcast, rx_dropped, tx_dropped,
  filters TEXT
);
CREATE INDEX port_by_portset ON port(portset_id);
CREATE INDEX port_by_portgroup ON port(portgroup_id);
CREATE INDEX port_by_world ON port(world_id);

-- Worlds (processes) of the host that own ports: the VMs.
CREATE TABLE world(id INTEGER PRIMARY KEY, name TEXT NOT NULL);

-- Kernel network interfaces. The ipv4_* columns hold the running IPv4
-- configuration (for DHCP the lease); ipv4_mode is 'static', 'dhcp' or 'none'.
-- Further: TSO segment size, receive queues, the DHCP DNS and IPv6 switches,
-- the IPv6 gateway ('::' for none), and the opaque network of an interface
-- attached to one.
CREATE TABLE tvknic(
  name TEXT PRIMARY KEY,
  ord INTEGER NOT NULL,
  netstack TEXT NOT NULL REFERENCES netstack(key),
  port_id INTEGER REFERENCES port(id),
  mac TEXT NOT NULL,
  mtu INTEGER NOT NULL DEFAULT 1500,
  enabled INTEGER NOT NULL DEFAULT 1,
  system INTEGER NOT NULL DEFAULT 0,
  ipv4_mode TEXT NOT NULL DEFAULT 'none',
  ipv4_address TEXT NOT NULL DEFAULT '0.0.0.0',
  ipv4_netmask TEXT NOT NULL DEFAULT '0.0.0.0',
  ipv4_gateway TEXT NOT NULL DEFAULT '0.0.0.0',
  tso_mss INTEGER NOT NULL DEFAULT 65535,
  rx_queues INTEGER NOT NULL DEFAULT 1,
  dhcp_dns INTEGER NOT NULL DEFAULT 0,
  ipv6_enabled INTEGER NOT NULL DEFAULT 1,
  ipv6_dhcp INTEGER NOT NULL DEFAULT 0,
  ipv6_ra INTEGER NOT NULL DEFAULT 0,
  ipv6_dhcp_dns INTEGER NOT NULL DEFAULT 0,
  ipv6_gateway TEXT NOT NULL DEFAULT '::',
  opaque_id TEXT NOT NULL DEFAULT '',
  opaque_type TEXT NOT NULL DEFAULT '',
  external_id TEXT NOT NULL DEFAULT ''
) WITHOUT ROWID;

-- IPv6 addresses of kernel interfaces, in order.
CREATE TABLE tvknic_ipv6(
  nic TEXT NOT NULL REFERENCES tvknic(name) ON DELETE CASCADE,
  address TEXT NOT NULL,
  prefix INTEGER NOT NULL,
  type INTEGER NOT NULL DEFAULT 0,
  status INTEGER NOT NULL DEFAULT 0,
  ord INTEGER NOT NULL,
  PRIMARY KEY(nic, address, prefix)
) WITHOUT ROWID;
)sql";

void ImportCore(const ordered_json& host, Store& store) {
  JsonObject root(host, "");
  ordered_json faults = ordered_json::array();
  for (const JsonObject& fault : root.Objects("faults"))
    faults.push_back({{"operation", fault.String("operation")},
                      {"object", fault.String("object", "*")},
                      {"message", fault.String("message")}});
  if (!faults.empty())
    PutSetting(store, kFaultsSetting, faults.dump());
  int ord = 0;
  for (const JsonObject& nic : root.Objects("nics")) {
    std::string name = nic.String("name");
    if (name.empty())
      nic.Fail("name", "must not be empty");
    std::string mac = nic.String("mac");
    if (!HostCtl::Network::MacAddress::IsValid(mac))
      nic.Fail("mac", "expected a unicast MAC address such as 00:50:56:01:02:03");
    Statement insert = store.Prepare(
        "INSERT INTO pnic(name, ord, pci_address, vendor, device, pseudo_desc, driver, admin_up, "
        "link_up, speed, duplex, mac, mtu, dpu_id, sriov) VALUES(?,?,?,?,?,?,?,?,?,?,?,?,?,?,0)");
    insert.BindAll(name, ord++);
    if (nic.Has("pciAddress"))
      insert.Bind(3, nic.String("pciAddress"));
    else
      insert.BindNull(3);
    insert.Bind(4, nic.String("vendor", ""))
        .Bind(5, nic.String("device", ""))
        .Bind(6, nic.String("pseudoDevice", ""))
        .Bind(7, nic.String("driver", ""))
        .Bind(8, nic.Bool("adminUp", true))
        .Bind(9, nic.Bool("linkUp", true))
        .Bind(10, nic.Int("speed", 0, 400000, 0))
        .Bind(11, nic.Int("duplex", 0, 255, 1))
        .Bind(12, HostCtl::Network::MacAddress(mac).GetStringAddress())
        .Bind(13, nic.Int("mtu", 68, 9000, 1500));
    if (nic.Has("dpuId"))
      insert.Bind(14, nic.String("dpuId"));
    else
      insert.BindNull(14);
    try {
      insert.Run();
    } catch (const HostCtl::Lib::HostCtlException&) {
      nic.Fail("name", "\"" + name + "\" is used by another NIC");
    }
  }
}

void ExportCore(ordered_json& host, Store& store, ExportStreams& /*streams*/) {
  ordered_json nics = ordered_json::array();
  Statement rows = store.Prepare(
      "SELECT name, pci_address, vendor, device, pseudo_desc, driver, admin_up, link_up, speed, "
      "duplex, mac, mtu, dpu_id FROM pnic ORDER BY ord");
  enum {
    kName,
    kPciAddress,
    kVendor,
    kDevice,
    kPseudoDesc,
    kDriver,
    kAdminUp,
    kLinkUp,
    kSpeed,
    kDuplex,
    kMac,
    kMtu,
    kDpuId
  };
  while (rows.Step()) {
    ordered_json nic = ordered_json::object();
    nic["name"] = rows.Text(kName);
    if (!rows.IsNull(kPciAddress))
      nic["pciAddress"] = rows.Text(kPciAddress);
    nic["vendor"] = rows.Text(kVendor);
    nic["device"] = rows.Text(kDevice);
    if (!rows.Text(kPseudoDesc).empty())
      nic["pseudoDevice"] = rows.Text(kPseudoDesc);
    nic["driver"] = rows.Text(kDriver);
    nic["adminUp"] = rows.Bool(kAdminUp);
    nic["linkUp"] = rows.Bool(kLinkUp);
    nic["speed"] = rows.Int(kSpeed);
    nic["duplex"] = rows.Int(kDuplex);
    nic["mac"] = rows.Text(kMac);
    nic["mtu"] = rows.Int(kMtu);
    if (!rows.IsNull(kDpuId))
      nic["dpuId"] = rows.Text(kDpuId);
    nics.push_back(std::move(nic));
  }
  host["nics"] = std::move(nics);
  if (std::optional<std::string> faults = GetSetting(store, kFaultsSetting))
    host["faults"] = ordered_json::parse(*faults);
}

} // namespace

extern const Part kCorePart;
const Part kCorePart = {
    "core",
    kCoreSchema,
    {{"", {"nics", "faults"}},
     {"nics",
      {"name", "pciAddress", "vendor", "device", "pseudoDevice", "driver", "adminUp", "linkUp",
       "speed", "duplex", "mac", "mtu", "dpuId"}},
     {"faults", {"operation", "object", "message"}}},
    ImportCore,
    ExportCore,
};

int64_t AllocatePortId(Store& store) {
  Statement next = store.Prepare("SELECT coalesce(max(id), 33554431) + 1 AS next_id FROM port");
  enum { kNextId };
  next.Step();
  return next.Int(kNextId);
}

std::optional<std::string> GetSetting(Store& store, std::string_view key) {
  Statement get = store.Prepare("SELECT value FROM setting WHERE key = ?");
  enum { kValue };
  get.Bind(1, key);
  if (!get.Step())
    return std::nullopt;
  return get.Text(kValue);
}

void PutSetting(Store& store, std::string_view key, std::string_view value) {
  store
      .Prepare("INSERT INTO setting(key, value) VALUES(?, ?) "
               "ON CONFLICT(key) DO UPDATE SET value = excluded.value")
      .BindAll(key, value)
      .Run();
}

} // namespace Model
