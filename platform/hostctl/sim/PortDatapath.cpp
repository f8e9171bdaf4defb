//===- PortDatapath.cpp - Clients, filters and counters of ports ----------===//
//
// What the datapath knows of a port: its client's MAC and IPv4 addresses
// (a VM adapter's from the datapath tables, a kernel interface's or an
// uplink NIC's from theirs), the uplink the team scheduler chose, the packet
// filters and the counters. Also the uplink port of a physical NIC and the
// names of worlds.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "model/Store.h"
#include "sim/PnicImpl.h"
#include "sim/Switching.h"
#include "sim/WorldImpl.h"
#include <nlohmann/json.hpp>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::FilterStats;
using HostCtl::Network::Ipv4Address;
using HostCtl::Network::MacAddress;
using Model::Statement;
using Model::Store;

namespace {

/// A counter stored as a signed 64-bit column.
uint64_t Counter(const Statement& row, int column) {
  return static_cast<uint64_t>(row.Int(column));
}

std::string PortObject(int64_t id) {
  return std::to_string(id);
}

} // namespace

std::vector<MacAddress> PortImpl::GetMacAddresses() const {
  Store& store = Store::Host();
  store.CheckFault("GetMacAddresses", PortObject(data_.id));
  return store.Read([&] {
    std::vector<MacAddress> macs;
    const char* sql = nullptr;
    if (data_.clientKind == "vm")
      sql = "SELECT mac FROM vm_port_mac WHERE port_id = ?1 ORDER BY ord";
    else if (data_.clientKind == "tvknic")
      sql = "SELECT mac FROM tvknic WHERE port_id = ?1";
    else
      sql = "SELECT mac FROM pnic WHERE name = (SELECT client FROM port WHERE id = ?1)";
    Statement rows = store.Prepare(sql);
    enum { kMac };
    rows.Bind(1, data_.id);
    while (rows.Step())
      macs.emplace_back(rows.Text(kMac));
    return macs;
  });
}

Ipv4Address PortImpl::GetPortClientIpv4Address() const {
  Store& store = Store::Host();
  store.CheckFault("GetPortClientIpv4Address", PortObject(data_.id));
  return store.Read([&] {
    if (data_.clientKind == "vm") {
      Statement row = store.Prepare("SELECT ipv4 FROM port WHERE id = ? AND ipv4 IS NOT NULL");
      enum { kIpv4 };
      row.Bind(1, data_.id);
      return row.Step() ? Ipv4Address(static_cast<uint32_t>(row.Int(kIpv4))) : Ipv4Address();
    }
    if (data_.clientKind != "tvknic")
      return Ipv4Address();
    Statement row = store.Prepare("SELECT ipv4_address FROM tvknic WHERE port_id = ?");
    enum { kIpv4Address };
    row.Bind(1, data_.id);
    if (!row.Step() || !Ipv4Address::IsValidAddress(row.Text(kIpv4Address)))
      return Ipv4Address();
    return Ipv4Address(row.Text(kIpv4Address));
  });
}

std::string PortImpl::GetSchedTeamUplink() const {
  Store& store = Store::Host();
  store.CheckFault("GetSchedTeamUplink", PortObject(data_.id));
  return store.Read([&] {
    Statement row = store.Prepare("SELECT coalesce(team_uplink, '') FROM port WHERE id = ?");
    enum { kTeamUplink };
    row.Bind(1, data_.id);
    return row.Step() ? row.Text(kTeamUplink) : std::string();
  });
}

std::vector<std::unique_ptr<FilterStats>> PortImpl::GetFilterStats() const {
  Store& store = Store::Host();
  store.CheckFault("GetFilterStats", PortObject(data_.id));
  return store.Read([&] {
    std::vector<std::unique_ptr<FilterStats>> filters;
    Statement row = store.Prepare("SELECT filters FROM port WHERE id = ? AND filters IS NOT NULL");
    enum { kFilters };
    row.Bind(1, data_.id);
    if (!row.Step())
      return filters;
    for (const nlohmann::json& entry : nlohmann::json::parse(row.Text(kFilters))) {
      auto filter = std::make_unique<FilterStats>();
      filter->name = entry.at("name").get<std::string>();
      filter->sortKey = entry.at("sortKey").get<std::string>();
      filter->active = entry.at("active").get<bool>();
      filter->direction = entry.at("outbound").get<bool>();
      filter->extended = entry.at("extended").get<bool>();
      filter->packetsIn = entry.at("packetsIn").get<uint64_t>();
      filter->packetsOut = entry.at("packetsOut").get<uint64_t>();
      filter->packetsDropped = entry.at("packetsDropped").get<uint64_t>();
      filter->packetsFiltered = entry.at("packetsFiltered").get<uint64_t>();
      filter->packetsFaulted = entry.at("packetsFaulted").get<uint64_t>();
      filter->packetsQueued = entry.at("packetsQueued").get<uint64_t>();
      filter->packetsInjected = entry.at("packetsInjected").get<uint64_t>();
      filter->packetErrors = entry.at("packetErrors").get<uint64_t>();
      filters.push_back(std::move(filter));
    }
    return filters;
  });
}

void PortImpl::GetPortStats(HostCtl::Network::PortStats& stats) const {
  Store& store = Store::Host();
  store.CheckFault("GetPortStats", PortObject(data_.id));
  store.Read([&] {
    Statement row = store.Prepare("SELECT rx_bytes, tx_bytes FROM port WHERE id = ?");
    enum { kRxBytes, kTxBytes };
    row.Bind(1, data_.id);
    stats = {};
    if (row.Step()) {
      stats.bytesReceived = Counter(row, kRxBytes);
      stats.bytesSent = Counter(row, kTxBytes);
    }
  });
}

void PortImpl::GetPacketStats(HostCtl::Network::PacketStats& stats) const {
  Store& store = Store::Host();
  store.CheckFault("GetPacketStats", PortObject(data_.id));
  store.Read([&] {
    Statement row = store.Prepare(
        "SELECT tx_packets, tx_multicast, tx_broadcast, rx_packets, rx_multicast, rx_broadcast, "
        "tx_dropped, rx_dropped FROM port WHERE id = ?");
    enum {
      kTxPackets,
      kTxMulticast,
      kTxBroadcast,
      kRxPackets,
      kRxMulticast,
      kRxBroadcast,
      kTxDropped,
      kRxDropped
    };
    row.Bind(1, data_.id);
    stats = {};
    if (row.Step()) {
      stats.packetsSent = Counter(row, kTxPackets);
      stats.multicastPacketsSent = Counter(row, kTxMulticast);
      stats.broadcastPacketsSent = Counter(row, kTxBroadcast);
      stats.packetsReceived = Counter(row, kRxPackets);
      stats.multicastPacketsReceived = Counter(row, kRxMulticast);
      stats.broadcastPacketsReceived = Counter(row, kRxBroadcast);
      stats.transmitDropped = Counter(row, kTxDropped);
      stats.receiveDropped = Counter(row, kRxDropped);
    }
  });
}

std::unique_ptr<HostCtl::Network::Port> PnicImpl::GetPort() const {
  std::string name = GetName();
  Store& store = Store::Host();
  store.CheckFault("GetPort", name);
  return store.Read([&]() -> std::unique_ptr<HostCtl::Network::Port> {
    Statement row = store.Prepare(
        "SELECT id, portset_id, coalesce(dvport_key, ''), world_id, port_type FROM port "
        "WHERE client_kind = 'uplink' AND client = ? ORDER BY id LIMIT 1");
    enum { kId, kPortsetId, kDvportKey, kWorldId, kPortType };
    row.Bind(1, name);
    if (!row.Step())
      return nullptr;
    PortData data;
    data.id = row.Int(kId);
    data.portsetId = row.Int(kPortsetId);
    data.dvPortId = row.Text(kDvportKey);
    data.clientKind = "uplink";
    data.client = name;
    data.worldId = row.Int(kWorldId);
    data.type = static_cast<int>(row.Int(kPortType));
    return std::make_unique<PortImpl>(std::move(data));
  });
}

} // namespace Sim

namespace Sim {

WorldImpl::WorldImpl(int64_t worldId) : worldId_(worldId) {}

std::string WorldImpl::GetWorldName() const {
  Model::Store& store = Model::Store::Host();
  store.CheckFault("GetWorldName", std::to_string(worldId_));
  return store.Read([&] {
    Model::Statement row = store.Prepare("SELECT name FROM world WHERE id = ?");
    enum { kName };
    row.Bind(1, worldId_);
    if (!row.Step())
      throw HostCtl::Lib::HostCtlException("There is no world with id " + std::to_string(worldId_));
    return row.Text(kName);
  });
}

} // namespace Sim
