CREATE TABLE setting(key TEXT PRIMARY KEY, value TEXT NOT NULL) WITHOUT ROWID;
CREATE TABLE fault(operation TEXT NOT NULL, object TEXT NOT NULL, message TEXT NOT NULL);
CREATE TABLE pnic(
  name TEXT PRIMARY KEY,
  ord INTEGER NOT NULL,
  pci_address TEXT,
  vendor TEXT NOT NULL DEFAULT '',
  device TEXT NOT NULL DEFAULT '',
  pseudo_desc TEXT NOT NULL DEFAULT '',
  driver TEXT NOT NULL DEFAULT '',
  admin_up INTEGER NOT NULL DEFAULT 1,
  link_up INTEGER NOT NULL DEFAULT 1,
  speed INTEGER NOT NULL DEFAULT 0,
  duplex INTEGER NOT NULL DEFAULT 1,
  mac TEXT NOT NULL,
  mtu INTEGER NOT NULL DEFAULT 1500,
  dpu_id TEXT
) WITHOUT ROWID;
CREATE TABLE netstack(
  key TEXT PRIMARY KEY,
  ord INTEGER NOT NULL,
  name TEXT NOT NULL,
  state INTEGER NOT NULL DEFAULT 4660,
  max_conn INTEGER NOT NULL DEFAULT 11000,
  cur_max_conn INTEGER NOT NULL DEFAULT 11000,
  ccalgo TEXT NOT NULL DEFAULT 'newreno',
  ipv6 INTEGER NOT NULL DEFAULT 1,
  cur_ipv6 INTEGER NOT NULL DEFAULT 1,
  ecn TEXT NOT NULL DEFAULT 'enabled',
  predefined INTEGER NOT NULL DEFAULT 0
) WITHOUT ROWID;
CREATE TABLE portset(
  id INTEGER PRIMARY KEY,
  name TEXT NOT NULL UNIQUE,
  kind TEXT NOT NULL CHECK(kind IN ('standard', 'dvs', 'opaque')),
  system INTEGER NOT NULL DEFAULT 0,
  ord INTEGER NOT NULL,
  num_ports INTEGER NOT NULL DEFAULT 128,
  mtu INTEGER NOT NULL DEFAULT 1500
);
CREATE TABLE uplink(
  portset_id INTEGER NOT NULL REFERENCES portset(id) ON DELETE CASCADE,
  nic TEXT NOT NULL,
  ord INTEGER NOT NULL,
  vlan_stats INTEGER NOT NULL DEFAULT 0,
  PRIMARY KEY(portset_id, nic)
) WITHOUT ROWID;
CREATE TABLE portgroup(
  id INTEGER PRIMARY KEY,
  name TEXT NOT NULL UNIQUE,
  portset_id INTEGER NOT NULL REFERENCES portset(id) ON DELETE CASCADE,
  vlan_id INTEGER NOT NULL DEFAULT 0,
  system INTEGER NOT NULL DEFAULT 0,
  ord INTEGER NOT NULL
);
CREATE INDEX portgroup_by_portset ON portgroup(portset_id);
CREATE INDEX portgroup_by_ord ON portgroup(ord);
CREATE TABLE dvport(
  portset_id INTEGER NOT NULL REFERENCES portset(id) ON DELETE CASCADE,
  port_key TEXT NOT NULL,
  portgroup_key TEXT NOT NULL DEFAULT '',
  connection_id INTEGER NOT NULL DEFAULT 0,
  is_uplink INTEGER NOT NULL DEFAULT 0,
  ord INTEGER NOT NULL,
  PRIMARY KEY(portset_id, port_key)
) WITHOUT ROWID;
CREATE TABLE port(
  id INTEGER PRIMARY KEY,
  portset_id INTEGER NOT NULL REFERENCES portset(id) ON DELETE CASCADE,
  portgroup_id INTEGER REFERENCES portgroup(id),
  dvport_key TEXT,
  client_kind TEXT NOT NULL CHECK(client_kind IN ('uplink', 'tvknic', 'vm')),
  client TEXT NOT NULL,
  world_id INTEGER NOT NULL DEFAULT 0,
  port_type INTEGER NOT NULL DEFAULT 0
);
CREATE INDEX port_by_portset ON port(portset_id);
CREATE INDEX port_by_portgroup ON port(portgroup_id);
CREATE INDEX port_by_world ON port(world_id);
CREATE TABLE world(id INTEGER PRIMARY KEY, name TEXT NOT NULL);
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
  ipv4_gateway TEXT NOT NULL DEFAULT '0.0.0.0'
) WITHOUT ROWID;
CREATE INDEX tvknic_by_netstack ON tvknic(netstack);
CREATE TABLE tvknic_ipv6(
  nic TEXT NOT NULL REFERENCES tvknic(name) ON DELETE CASCADE,
  address TEXT NOT NULL,
  prefix INTEGER NOT NULL,
  type INTEGER NOT NULL DEFAULT 0,
  status INTEGER NOT NULL DEFAULT 0,
  ord INTEGER NOT NULL,
  PRIMARY KEY(nic, address, prefix)
) WITHOUT ROWID;
CREATE TABLE pnic_info(
  nic TEXT PRIMARY KEY REFERENCES pnic(name) ON DELETE CASCADE,
  supported_ports TEXT NOT NULL DEFAULT '[]',
  supports_autoneg INTEGER NOT NULL DEFAULT 0,
  advertised_modes TEXT NOT NULL DEFAULT '[]',
  advertised_autoneg INTEGER NOT NULL DEFAULT 0,
  port INTEGER NOT NULL DEFAULT 0,
  phy_address INTEGER NOT NULL DEFAULT 0,
  transceiver INTEGER NOT NULL DEFAULT 0,
  autoneg INTEGER NOT NULL DEFAULT 0,
  supports_wakeon INTEGER NOT NULL DEFAULT 0,
  wakeon TEXT NOT NULL DEFAULT '[]',
  msglvl_supported INTEGER NOT NULL DEFAULT 0,
  msglvl INTEGER NOT NULL DEFAULT 0,
  virtual_address TEXT NOT NULL DEFAULT '',
  driver_version TEXT NOT NULL DEFAULT '',
  firmware_version TEXT NOT NULL DEFAULT '',
  pause_supported INTEGER NOT NULL DEFAULT 0,
  pause_autoneg INTEGER NOT NULL DEFAULT 0,
  pause_rx INTEGER NOT NULL DEFAULT 0,
  pause_tx INTEGER NOT NULL DEFAULT 0
) WITHOUT ROWID;
CREATE TABLE pnic_stats(
  nic TEXT PRIMARY KEY REFERENCES pnic(name) ON DELETE CASCADE,
  counters TEXT NOT NULL DEFAULT '{}'
) WITHOUT ROWID;
CREATE TABLE sriov_nic(
  nic TEXT PRIMARY KEY REFERENCES pnic(name) ON DELETE CASCADE
) WITHOUT ROWID;
CREATE TABLE sriov_vf(
  nic TEXT NOT NULL REFERENCES sriov_nic(nic) ON DELETE CASCADE,
  vf_id INTEGER NOT NULL,
  active INTEGER NOT NULL DEFAULT 0,
  pci_address TEXT NOT NULL DEFAULT '',
  owner_world TEXT NOT NULL DEFAULT '',
  counters TEXT NOT NULL DEFAULT '{}',
  PRIMARY KEY(nic, vf_id)
) WITHOUT ROWID;
CREATE TABLE pnic_attachment(
  branch TEXT PRIMARY KEY REFERENCES pnic(name) ON DELETE CASCADE,
  trunk TEXT NOT NULL REFERENCES pnic(name) ON DELETE CASCADE,
  vlan_id INTEGER NOT NULL,
  ord INTEGER NOT NULL,
  UNIQUE(trunk, vlan_id)
) WITHOUT ROWID;
CREATE INDEX pnic_attachment_by_trunk ON pnic_attachment(trunk, ord);
CREATE TABLE pnic_vlan_counter(
  nic TEXT NOT NULL REFERENCES pnic(name) ON DELETE CASCADE,
  vlan_id INTEGER NOT NULL,
  rx_packets INTEGER NOT NULL DEFAULT 0,
  tx_packets INTEGER NOT NULL DEFAULT 0,
  PRIMARY KEY(nic, vlan_id)
) WITHOUT ROWID;
CREATE TABLE pnic_vlan_stats_import(nic TEXT PRIMARY KEY) WITHOUT ROWID;
CREATE TRIGGER uplink_vlan_stats_import AFTER INSERT ON uplink
WHEN EXISTS(SELECT 1 FROM pnic_vlan_stats_import WHERE nic = NEW.nic)
BEGIN
  UPDATE uplink SET vlan_stats = 1 WHERE portset_id = NEW.portset_id AND nic = NEW.nic;
  DELETE FROM pnic_vlan_stats_import WHERE nic = NEW.nic;
END;
CREATE TABLE pnic_hw(
  nic TEXT NOT NULL REFERENCES pnic(name) ON DELETE CASCADE,
  kind TEXT NOT NULL,
  value TEXT NOT NULL,
  PRIMARY KEY(nic, kind)
) WITHOUT ROWID;
CREATE TABLE vswitch(
  portset_id INTEGER PRIMARY KEY REFERENCES portset(id) ON DELETE CASCADE,
  cdp INTEGER NOT NULL DEFAULT 1,
  beacon_interval INTEGER NOT NULL DEFAULT 1,
  beacon_threshold INTEGER NOT NULL DEFAULT 3,
  teaming TEXT NOT NULL,
  security TEXT NOT NULL,
  shaping TEXT NOT NULL,
  capabilities TEXT NOT NULL
);
CREATE TABLE portgroup_policy(
  portgroup_id INTEGER PRIMARY KEY REFERENCES portgroup(id) ON DELETE CASCADE,
  teaming TEXT NOT NULL DEFAULT '{}',
  security TEXT NOT NULL DEFAULT '{}',
  shaping TEXT NOT NULL DEFAULT '{}'
);
CREATE TABLE dvswitch(
  portset_id INTEGER PRIMARY KEY REFERENCES portset(id) ON DELETE CASCADE,
  uuid TEXT NOT NULL UNIQUE,
  display_name TEXT NOT NULL,
  class_name TEXT NOT NULL,
  configured_ports INTEGER NOT NULL,
  cdp TEXT NOT NULL,
  beacon_timeout INTEGER NOT NULL,
  branded INTEGER NOT NULL,
  lacp_on_dpu INTEGER NOT NULL
);
CREATE TABLE dvport_lacp(
  portset_id INTEGER NOT NULL,
  port_key TEXT NOT NULL,
  name TEXT NOT NULL DEFAULT '',
  lacp_enabled INTEGER NOT NULL DEFAULT 0,
  lacp_mode INTEGER NOT NULL DEFAULT 0,
  uplink_pg_key TEXT NOT NULL DEFAULT '',
  PRIMARY KEY(portset_id, port_key),
  FOREIGN KEY(portset_id, port_key) REFERENCES dvport(portset_id, port_key) ON DELETE CASCADE
) WITHOUT ROWID;
CREATE TABLE lag(
  portset_id INTEGER NOT NULL REFERENCES portset(id) ON DELETE CASCADE,
  lag_id INTEGER NOT NULL,
  name TEXT NOT NULL,
  mode INTEGER NOT NULL,
  load_balancing INTEGER NOT NULL,
  uplink_count INTEGER NOT NULL,
  ord INTEGER NOT NULL,
  PRIMARY KEY(portset_id, lag_id)
) WITHOUT ROWID;
CREATE TABLE lacp_nic(
  portset_id INTEGER NOT NULL,
  lag_id INTEGER NOT NULL,
  nic TEXT NOT NULL,
  ord INTEGER NOT NULL,
  state TEXT NOT NULL,
  actor_port_number INTEGER NOT NULL,
  actor_port_priority INTEGER NOT NULL,
  actor_admin_key INTEGER NOT NULL,
  actor_oper_key INTEGER NOT NULL,
  actor_state INTEGER NOT NULL,
  partner_age INTEGER NOT NULL,
  partner_port_number INTEGER NOT NULL,
  partner_port_priority INTEGER NOT NULL,
  partner_oper_key INTEGER NOT NULL,
  partner_state INTEGER NOT NULL,
  partner_device_id TEXT NOT NULL,
  rx_lacpdus INTEGER NOT NULL,
  tx_lacpdus INTEGER NOT NULL,
  rx_errors INTEGER NOT NULL,
  tx_errors INTEGER NOT NULL,
  PRIMARY KEY(portset_id, lag_id, nic),
  FOREIGN KEY(portset_id, lag_id) REFERENCES lag(portset_id, lag_id) ON DELETE CASCADE
) WITHOUT ROWID;
CREATE TABLE tvknic_ext(
  name TEXT PRIMARY KEY REFERENCES tvknic(name) ON DELETE CASCADE,
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
CREATE TABLE tvknic_tag(
  nic TEXT NOT NULL REFERENCES tvknic(name) ON DELETE CASCADE,
  tag INTEGER NOT NULL,
  ord INTEGER NOT NULL,
  PRIMARY KEY(nic, tag)
) WITHOUT ROWID;
CREATE INDEX tvknic_tag_by_tag ON tvknic_tag(tag);
CREATE TABLE tvknic_mcast(
  nic TEXT NOT NULL REFERENCES tvknic(name) ON DELETE CASCADE,
  grp TEXT NOT NULL,
  link_layer TEXT NOT NULL,
  refcount INTEGER NOT NULL DEFAULT 1,
  ord INTEGER NOT NULL,
  PRIMARY KEY(nic, grp)
) WITHOUT ROWID;
CREATE TABLE ipsvc_route(
  id INTEGER PRIMARY KEY,
  netstack TEXT NOT NULL REFERENCES netstack(key) ON DELETE CASCADE,
  family INTEGER NOT NULL CHECK(family IN (4, 6)),
  system INTEGER NOT NULL DEFAULT 0,
  network TEXT NOT NULL,
  prefix INTEGER NOT NULL,
  gateway TEXT NOT NULL,
  interface TEXT NOT NULL REFERENCES tvknic(name) ON DELETE CASCADE,
  source TEXT NOT NULL,
  UNIQUE(netstack, family, system, network, prefix)
);
CREATE INDEX ipsvc_route_list ON ipsvc_route(netstack, family, system, id);
CREATE INDEX ipsvc_route_by_interface ON ipsvc_route(interface);
CREATE TABLE ipsvc_gateway(
  netstack TEXT NOT NULL REFERENCES netstack(key) ON DELETE CASCADE,
  family INTEGER NOT NULL,
  gateway TEXT NOT NULL,
  PRIMARY KEY(netstack, family)
) WITHOUT ROWID;
CREATE TABLE ipsvc_dns_server(
  netstack TEXT NOT NULL REFERENCES netstack(key) ON DELETE CASCADE,
  address TEXT NOT NULL,
  ord INTEGER NOT NULL,
  PRIMARY KEY(netstack, address)
) WITHOUT ROWID;
CREATE UNIQUE INDEX ipsvc_dns_server_by_ord ON ipsvc_dns_server(netstack, ord);
CREATE TABLE ipsvc_dns_search(
  netstack TEXT NOT NULL REFERENCES netstack(key) ON DELETE CASCADE,
  domain TEXT NOT NULL,
  ord INTEGER NOT NULL,
  PRIMARY KEY(netstack, domain)
) WITHOUT ROWID;
CREATE UNIQUE INDEX ipsvc_dns_search_by_ord ON ipsvc_dns_search(netstack, ord);
CREATE INDEX ipsvc_dns_search_by_domain ON ipsvc_dns_search(netstack, domain COLLATE NOCASE);
CREATE TABLE ipsvc_hosts(
  id INTEGER PRIMARY KEY,
  address TEXT NOT NULL,
  hostname TEXT NOT NULL,
  aliases TEXT NOT NULL DEFAULT '',
  comment TEXT NOT NULL DEFAULT '',
  system INTEGER NOT NULL DEFAULT 0
);
CREATE UNIQUE INDEX ipsvc_hosts_key ON ipsvc_hosts(address, hostname COLLATE NOCASE);
CREATE INDEX ipsvc_hosts_list ON ipsvc_hosts(system, id);
CREATE TABLE ipsvc_neighbor(
  id INTEGER PRIMARY KEY,
  family INTEGER NOT NULL CHECK(family IN (4, 6)),
  interface TEXT NOT NULL REFERENCES tvknic(name) ON DELETE CASCADE,
  address TEXT NOT NULL,
  mac TEXT NOT NULL,
  expiry INTEGER NOT NULL DEFAULT 0,
  type INTEGER NOT NULL DEFAULT 1,
  state INTEGER NOT NULL DEFAULT 0,
  UNIQUE(interface, family, address)
);
CREATE INDEX ipsvc_neighbor_by_address ON ipsvc_neighbor(family, address);
CREATE TABLE ipsvc_connection(
  id INTEGER PRIMARY KEY,
  netstack TEXT NOT NULL REFERENCES netstack(key) ON DELETE CASCADE,
  protocol INTEGER NOT NULL CHECK(protocol IN (0, 1, 2)),
  recv_queue INTEGER NOT NULL DEFAULT 0,
  send_queue INTEGER NOT NULL DEFAULT 0,
  local_address TEXT NOT NULL,
  local_port INTEGER NOT NULL DEFAULT 0,
  foreign_address TEXT NOT NULL,
  foreign_port INTEGER NOT NULL DEFAULT 0,
  world_id INTEGER NOT NULL DEFAULT 0,
  state INTEGER NOT NULL DEFAULT 0,
  ccalgo TEXT NOT NULL DEFAULT ''
);
CREATE INDEX ipsvc_connection_list ON ipsvc_connection(netstack, protocol, id);
CREATE TABLE ipsvc_world(id INTEGER PRIMARY KEY, name TEXT NOT NULL);
CREATE TABLE ipsvc_ipsec_sa(
  id INTEGER PRIMARY KEY,
  name TEXT NOT NULL,
  source TEXT NOT NULL,
  destination TEXT NOT NULL,
  spi INTEGER NOT NULL,
  mode INTEGER NOT NULL,
  encryption INTEGER NOT NULL,
  integrity INTEGER NOT NULL,
  encryption_key TEXT NOT NULL,
  integrity_key TEXT NOT NULL,
  state INTEGER NOT NULL,
  lifetime INTEGER NOT NULL,
  UNIQUE(destination, spi)
);
CREATE UNIQUE INDEX ipsvc_ipsec_sa_name ON ipsvc_ipsec_sa(name) WHERE name <> 'auto';
CREATE TABLE ipsvc_ipsec_sp(
  id INTEGER PRIMARY KEY,
  name TEXT NOT NULL UNIQUE,
  source TEXT NOT NULL,
  source_prefix INTEGER NOT NULL,
  source_port INTEGER NOT NULL,
  destination TEXT NOT NULL,
  destination_prefix INTEGER NOT NULL,
  destination_port INTEGER NOT NULL,
  protocol INTEGER NOT NULL,
  direction INTEGER NOT NULL,
  action INTEGER NOT NULL,
  mode INTEGER NOT NULL,
  sa_name TEXT NOT NULL DEFAULT '',
  sa_lost INTEGER NOT NULL DEFAULT 0
);
CREATE INDEX ipsvc_ipsec_sp_by_sa ON ipsvc_ipsec_sp(sa_name);
CREATE TABLE vm_port(
  port_id INTEGER PRIMARY KEY REFERENCES port(id) ON DELETE CASCADE,
  ipv4 TEXT NOT NULL DEFAULT '0.0.0.0',
  team_uplink TEXT NOT NULL DEFAULT ''
);
CREATE TABLE vm_port_mac(
  port_id INTEGER NOT NULL REFERENCES port(id) ON DELETE CASCADE,
  ord INTEGER NOT NULL,
  mac TEXT NOT NULL,
  PRIMARY KEY(port_id, ord)
) WITHOUT ROWID;
CREATE TABLE port_counter(
  port_id INTEGER PRIMARY KEY REFERENCES port(id) ON DELETE CASCADE,
  rx_bytes INTEGER NOT NULL DEFAULT 0, tx_bytes INTEGER NOT NULL DEFAULT 0,
  rx_packets INTEGER NOT NULL DEFAULT 0, rx_multicast INTEGER NOT NULL DEFAULT 0,
  rx_broadcast INTEGER NOT NULL DEFAULT 0, tx_packets INTEGER NOT NULL DEFAULT 0,
  tx_multicast INTEGER NOT NULL DEFAULT 0, tx_broadcast INTEGER NOT NULL DEFAULT 0,
  rx_dropped INTEGER NOT NULL DEFAULT 0, tx_dropped INTEGER NOT NULL DEFAULT 0
);
CREATE TABLE port_filter(
  port_id INTEGER NOT NULL REFERENCES port(id) ON DELETE CASCADE,
  ord INTEGER NOT NULL,
  name TEXT NOT NULL,
  sort_key TEXT NOT NULL DEFAULT '',
  active INTEGER NOT NULL DEFAULT 1,
  direction INTEGER NOT NULL DEFAULT 0,
  extended INTEGER NOT NULL DEFAULT 0,
  packets_in INTEGER NOT NULL DEFAULT 0, packets_out INTEGER NOT NULL DEFAULT 0,
  packets_dropped INTEGER NOT NULL DEFAULT 0, packets_filtered INTEGER NOT NULL DEFAULT 0,
  packets_faulted INTEGER NOT NULL DEFAULT 0, packets_queued INTEGER NOT NULL DEFAULT 0,
  packets_injected INTEGER NOT NULL DEFAULT 0, packet_errors INTEGER NOT NULL DEFAULT 0,
  PRIMARY KEY(port_id, ord)
) WITHOUT ROWID;
CREATE TABLE ens_lcore(
  id INTEGER PRIMARY KEY,
  portset_id INTEGER REFERENCES portset(id) ON DELETE SET NULL,
  affinity INTEGER NOT NULL DEFAULT 0
);
CREATE INDEX ens_lcore_by_portset ON ens_lcore(portset_id);
CREATE TABLE kmodule(
  name TEXT PRIMARY KEY,
  loaded INTEGER NOT NULL DEFAULT 0,
  options TEXT NOT NULL DEFAULT ''
) WITHOUT ROWID;
CREATE TABLE fw_state(
  id INTEGER PRIMARY KEY CHECK(id = 1),
  enabled INTEGER NOT NULL,
  default_pass INTEGER NOT NULL,
  filters_active INTEGER NOT NULL
);
CREATE TABLE fw_ruleset(
  id TEXT PRIMARY KEY,
  ord INTEGER NOT NULL,
  enabled INTEGER NOT NULL DEFAULT 0,
  allowed_all INTEGER NOT NULL DEFAULT 1,
  enable_fixed INTEGER NOT NULL DEFAULT 0,
  allowed_ip_fixed INTEGER NOT NULL DEFAULT 0,
  clients INTEGER NOT NULL DEFAULT 0
) WITHOUT ROWID;
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
CREATE TABLE fw_allowed_ip(
  ruleset TEXT NOT NULL REFERENCES fw_ruleset(id) ON DELETE CASCADE,
  kind INTEGER NOT NULL,
  value TEXT NOT NULL,
  ord INTEGER NOT NULL,
  PRIMARY KEY(ruleset, kind, value)
) WITHOUT ROWID;
CREATE INDEX fw_allowed_ip_by_ord ON fw_allowed_ip(ruleset, ord);
