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
    enum {
      kRecvQueue,
      kSendQueue,
      kLocalAddress,
      kLocalPort,
      kForeignAddress,
      kForeignPort,
      kWorldId,
      kState,
      kCcalgo
    };
    rows.BindAll(netstack, protocol);
    while (rows.Step()) {
      TcpIpConnection connection;
      connection.recvQueue = rows.Int(kRecvQueue);
      connection.sendQueue = rows.Int(kSendQueue);
      connection.localAddress = rows.Text(kLocalAddress);
      connection.localPort = static_cast<uint16_t>(rows.Int(kLocalPort));
      connection.foreignAddress = rows.Text(kForeignAddress);
      connection.foreignPort = static_cast<uint16_t>(rows.Int(kForeignPort));
      connection.worldId = rows.Int(kWorldId);
      connection.state = static_cast<uint32_t>(rows.Int(kState));
      connection.ccAlgorithm = rows.Text(kCcalgo);
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
      enum { kId, kName };
      while (services.Step())
        names_[services.Int(kId)] = services.Text(kName);
      Model::Statement vms = store.Prepare("SELECT id, name FROM world");
      enum { kVmsId, kVmsName };
      while (vms.Step())
        names_[vms.Int(kVmsId)] = vms.Text(kVmsName);
    });
    loaded_ = true;
  }
  auto it = names_.find(worldId);
  return it == names_.end() ? std::string() : it->second;
}

} // namespace Sim
