//===- IpServices.cpp - Connections, world names and IP address values ----===//
#include "HostCtl/Lib.h"
#include "HostCtl/Network/IpAddress.h"
#include "model/IpServicesModel.h"
#include "model/Store.h"
#include "sim/NetworkInfoImpl.h"
#include "sim/ResourceInfoImpl.h"

namespace Sim {

using HostCtl::Network::TcpIpConnection;
using Model::Statement;
using Model::Store;

namespace {

/// Appends the sockets of one protocol (0 tcp, 1 udp, 2 raw ip) of a netstack.
void LoadConnections(const char* operation, int protocol, std::vector<TcpIpConnection>& list,
                     const std::string& netstack) {
  Store& store = Store::Host();
  store.CheckFault(operation, netstack);
  store.Read([&] {
    Model::IpSvc::RequireNetstack(store, netstack);
    Statement rows = store.Prepare(
        "SELECT recv_queue, send_queue, local_address, local_port, foreign_address, "
        "foreign_port, world_id, state, ccalgo FROM ipsvc_connection WHERE netstack = ? AND "
        "protocol = ? ORDER BY id");
    rows.BindAll(netstack, protocol);
    while (rows.Step()) {
      TcpIpConnection connection;
      connection.recvQueue = rows.Int(0);
      connection.sendQueue = rows.Int(1);
      connection.localAddress = rows.Text(2);
      connection.localPort = static_cast<uint16_t>(rows.Int(3));
      connection.foreignAddress = rows.Text(4);
      connection.foreignPort = static_cast<uint16_t>(rows.Int(5));
      connection.worldId = rows.Int(6);
      connection.state = static_cast<uint32_t>(rows.Int(7));
      connection.ccAlgorithm = rows.Text(8);
      list.push_back(std::move(connection));
    }
  });
}

} // namespace

void NetworkInfoImpl::GetCurrentTcpTarvikConnections(std::vector<TcpIpConnection>& list,
                                                     const std::string& netstack) {
  LoadConnections("GetCurrentTcpTarvikConnections", 0, list, netstack);
}

void NetworkInfoImpl::GetCurrentUdpTarvikConnections(std::vector<TcpIpConnection>& list,
                                                     const std::string& netstack) {
  LoadConnections("GetCurrentUdpTarvikConnections", 1, list, netstack);
}

void NetworkInfoImpl::GetCurrentIpTarvikConnections(std::vector<TcpIpConnection>& list,
                                                    const std::string& netstack) {
  LoadConnections("GetCurrentIpTarvikConnections", 2, list, netstack);
}

} // namespace Sim

namespace Sim {

ResourceInfoImpl::ResourceInfoImpl() = default;
ResourceInfoImpl::~ResourceInfoImpl() = default;

std::string ResourceInfoImpl::GetWorldName(int64_t worldId) {
  Model::Store& store = Model::Store::Host();
  store.CheckFault("GetWorldName", std::to_string(worldId));
  if (!loaded_) {
    store.Read([&] {
      Model::Statement services = store.Prepare("SELECT id, name FROM ipsvc_world");
      while (services.Step())
        names_[services.Int(0)] = services.Text(1);
      Model::Statement vms = store.Prepare("SELECT id, name FROM world");
      while (vms.Step())
        names_[vms.Int(0)] = vms.Text(1);
    });
    loaded_ = true;
  }
  auto it = names_.find(worldId);
  return it == names_.end() ? std::string() : it->second;
}

} // namespace Sim
