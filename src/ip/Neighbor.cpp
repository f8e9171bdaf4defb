//===- Neighbor.cpp - network ip neighbor list|remove, connection list ----===//
//
// Views of a netstack's live state: the neighbour caches (ARP and IPv6
// neighbour discovery) and the open TCP, UDP and raw IP sockets with the
// worlds that own them.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/RoutingInfoImpl.h"
#include "TvkCtl/Resource/ResourceInfoImpl.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"
#include "ip/IpCommon.h"

#include <array>

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::TcpIpConnection;
using TvkCtl::Network::RoutingInfoImpl;

namespace {

const EnumChoice kListVersionChoices[] = {{"4"}, {"6"}, {"all"}};
const EnumChoice kRemoveVersionChoices[] = {{"4"}, {"6"}};
const EnumChoice kConnectionTypeChoices[] = {{"ip"}, {"tcp"}, {"udp"}, {"all"}};

const std::string kDefaultNetstack = "defaultTcpipStack";
const std::string kNoInterface = "Unable to find a Tarvik interface with the name ";

// Fields of "NetworkNeighbor".
const std::string kNeighbor = "Neighbor";
const std::string kMacAddress = "Mac Address";
const std::string kTvknic = "Tvknic";
const std::string kExpiry = "Expiry";
const std::string kState = "State";
const std::string kType = "Type";

// Fields of "IpConnection".
const std::string kProto = "Proto";
const std::string kRecvQ = "Recv Q";
const std::string kSendQ = "Send Q";
const std::string kLocalAddress = "Local Address";
const std::string kForeignAddress = "Foreign Address";
const std::string kWorldId = "World ID";
const std::string kCcAlgo = "CC Algo";
const std::string kWorldName = "World Name";

/// TCP state names by state value.
const std::array<const char*, 11> kTcpStates = {
    "CLOSED",     "LISTEN",  "SYN_SENT", "RCVD",       "ESTABLISHED", "CLOSE_WAIT",
    "FIN_WAIT_1", "CLOSING", "LAST_ACK", "FIN_WAIT_2", "TIME_WAIT"};

/// One protocol of the connection listing.
struct ConnectionSource {
  const char* proto; ///< "tcp", "udp" or "ip".
  void (TvkCtl::Network::NetworkInfoImpl::*fetch)(std::vector<TcpIpConnection>&,
                                                  const std::string&);
};

/// Protocols in listing order.
const std::array<ConnectionSource, 3> kConnectionSources = {{
    {"tcp", &TvkCtl::Network::NetworkInfoImpl::GetCurrentTcpTarvikConnections},
    {"udp", &TvkCtl::Network::NetworkInfoImpl::GetCurrentUdpTarvikConnections},
    {"ip", &TvkCtl::Network::NetworkInfoImpl::GetCurrentIpTarvikConnections},
}};

/// One neighbour row.
template <typename Neighbor>
std::shared_ptr<MetaStruct> NeighborRow(IpNeighborList& command, const Neighbor& neighbor,
                                        const std::string& state, const std::string& type) {
  auto row = command.GetOutputStructure();
  row->SetField(kNeighbor, neighbor.GetAddress().GetStringAddress());
  row->SetField(kMacAddress, neighbor.GetMacAddress());
  row->SetField(kTvknic, neighbor.GetInterfaceName());
  row->SetField(kExpiry, static_cast<long>(neighbor.GetExpiry()));
  row->SetField(kState, state);
  row->SetField(kType, type);
  return row;
}

} // namespace

std::string TcpStateName(uint32_t state) {
  return state < kTcpStates.size() ? kTcpStates[state] : "";
}

std::string ConnectionEndpointText(const std::string& address, uint16_t port) {
  if (address.find(':') != std::string::npos)
    return "[" + address + "]:" + std::to_string(port);
  return address + ":" + std::to_string(port);
}

// network ip neighbor list

CORVEX_DEFINE_NEW(IpNeighborList)

IpNeighborList::IpNeighborList() {
  SetDescription("List ARP table entries");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:NetworkNeighbor", kNeighbor + "," + kMacAddress + "," +
                                                          kTvknic + "," + kExpiry + "," + kState +
                                                          "," + kType);
  SetDefaultOutputParameter("units:NetworkNeighbor." + kExpiry, "sec");
}

IpNeighborList::~IpNeighborList() = default;

std::shared_ptr<InputSpec> IpNeighborList::GetInputSpecInternal() {
  return MakeInputSpec({
      {"version", "v", Fabrik::CallSpec::String, false, "IP version: %ENUM%",
       ParameterCheck::OneOf(kListVersionChoices)},
      {"netstack", "N", Fabrik::CallSpec::String, false, kNetstackDescription},
      {"interface-name", "i", Fabrik::CallSpec::String, false,
       "The name of the Tarvik network interface to limit the output of this command to; if "
       "unspecified, list neighbors on all interfaces."},
      {"type", "t", Fabrik::CallSpec::String, false,
       "List IP neighbors with given type(e.g. system)."},
  });
}

std::shared_ptr<MetaStruct> IpNeighborList::GetOutputStructure() {
  return MakeStructure("NetworkNeighbor", {{kNeighbor, FieldKind::String},
                                           {kMacAddress, FieldKind::String},
                                           {kTvknic, FieldKind::String},
                                           {kExpiry, FieldKind::Integer},
                                           {kState, FieldKind::String},
                                           {kType, FieldKind::String}});
}

std::shared_ptr<OutputSpec> IpNeighborList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpNeighborList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  // Failures of the host are not caught here: they reach the command host,
  // which reports them.
  std::string version = input->HasParameter("version") ? input->GetParameter("version") : "all";
  RoutingInfoImpl routing(kDefaultNetstack);
  routing.SetNetstackInstanceKey(NetstackParameter(*input));
  HostCtl::Network::PortsetGetType selector;
  if (!ReadListType(*input, *output, selector))
    return;
  std::string interfaceName =
      input->HasParameter("interface-name") ? input->GetParameter("interface-name") : "";
  if (!interfaceName.empty()) {
    if (!KernelNicService()->GetTvKernelNicByInterface(interfaceName, false, selector)) {
      output->AddErrorMessage(kNoInterface + interfaceName);
      return;
    }
  }
  auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
  if (version == "4" || version == "all") {
    std::vector<HostCtl::Network::Ipv4Neighbor> neighbors;
    routing.GetCurrentIpv4TarvikNeighbors(neighbors, interfaceName, selector);
    for (const auto& neighbor : neighbors)
      list->Add(NeighborRow(*this, neighbor, "", routing.GetIpv4NeighborType(neighbor)));
  }
  if ((version == "6" || version == "all") &&
      TvkCtl::Network::NetworkInfoImpl().IsTvkIpv6Enabled()) {
    std::vector<HostCtl::Network::Ipv6Neighbor> neighbors;
    routing.GetCurrentIpv6TarvikNeighbors(neighbors, interfaceName, selector);
    for (const auto& neighbor : neighbors)
      list->Add(NeighborRow(*this, neighbor, routing.GetIpv6NeighborState(neighbor),
                            routing.GetIpv6NeighborType(neighbor)));
  }
  output->SetRootObject(list);
}

// network ip neighbor remove

CORVEX_DEFINE_NEW(IpNeighborRemove)

IpNeighborRemove::IpNeighborRemove() {
  SetDescription("Remove ARP table entries");
}

IpNeighborRemove::~IpNeighborRemove() = default;

std::shared_ptr<InputSpec> IpNeighborRemove::GetInputSpecInternal() {
  return MakeInputSpec({
      {"version", "v", Fabrik::CallSpec::String, true, "IP version: %ENUM%",
       ParameterCheck::OneOf(kRemoveVersionChoices)},
      {"netstack", "N", Fabrik::CallSpec::String, false, kNetstackDescription},
      {"interface-name", "i", Fabrik::CallSpec::String, false,
       "The name of the Tarvik network interface to remove the neighbor entry from. If not "
       "specified, neighbor will be removed from all interfaces"},
      {"neighbor-addr", "a", Fabrik::CallSpec::String, true,
       "The IPv4/IPv6 address of the neighbor."},
  });
}

std::shared_ptr<OutputSpec> IpNeighborRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpNeighborRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                       const std::shared_ptr<Output>& output) {
  try {
    RoutingInfoImpl routing(kDefaultNetstack);
    std::string interfaceName =
        input->HasParameter("interface-name") ? input->GetParameter("interface-name") : "";
    if (interfaceName.empty()) {
      routing.SetNetstackInstanceKey(NetstackParameter(*input));
    } else {
      std::unique_ptr<HostCtl::Network::TvkNic> nic =
          KernelNicService()->GetTvKernelNicByInterface(interfaceName, false, 0);
      if (!nic) {
        output->AddErrorMessage(kNoInterface + interfaceName);
        return;
      }
      routing.SetNetstackInstanceKey(nic->GetNetstackInstanceName());
    }
    const std::string& address = input->GetParameter("neighbor-addr");
    if (input->GetParameter("version") == "4") {
      routing.RemoveIpv4Neighbor(HostCtl::Network::Ipv4Neighbor(address, interfaceName));
    } else if (TvkCtl::Network::NetworkInfoImpl().IsTvkIpv6Enabled()) {
      routing.RemoveIpv6Neighbor(HostCtl::Network::Ipv6Neighbor(address, interfaceName));
    }
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network ip connection list

CORVEX_DEFINE_NEW(IpConnectionList)

IpConnectionList::IpConnectionList() {
  SetDescription("List active TCP/IP connections");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:IpConnection", kProto + "," + kRecvQ + "," + kSendQ + "," +
                                                       kLocalAddress + "," + kForeignAddress + "," +
                                                       kState + "," + kWorldId + "," + kCcAlgo +
                                                       "," + kWorldName);
}

IpConnectionList::~IpConnectionList() = default;

std::shared_ptr<InputSpec> IpConnectionList::GetInputSpecInternal() {
  return MakeInputSpec({
      {"netstack", "N", Fabrik::CallSpec::String, false, kNetstackDescription},
      {"type", "t", Fabrik::CallSpec::String, false, "Connection type: %ENUM%",
       ParameterCheck::OneOf(kConnectionTypeChoices)},
  });
}

std::shared_ptr<MetaStruct> IpConnectionList::GetOutputStructure() {
  return MakeStructure("IpConnection", {{kProto, FieldKind::String},
                                        {kRecvQ, FieldKind::Integer},
                                        {kSendQ, FieldKind::Integer},
                                        {kLocalAddress, FieldKind::String},
                                        {kForeignAddress, FieldKind::String},
                                        {kState, FieldKind::String},
                                        {kWorldId, FieldKind::Integer},
                                        {kCcAlgo, FieldKind::String},
                                        {kWorldName, FieldKind::String}});
}

std::shared_ptr<OutputSpec> IpConnectionList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpConnectionList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                       const std::shared_ptr<Output>& output) {
  try {
    std::string type = input->HasParameter("type") ? input->GetParameter("type") : "all";
    std::string netstack = NetstackParameter(*input);
    TvkCtl::Network::NetworkInfoImpl network;
    TvkCtl::Resource::ResourceInfoImpl resources;
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    for (const ConnectionSource& source : kConnectionSources) {
      if (type != "all" && type != source.proto)
        continue;
      std::vector<TcpIpConnection> connections;
      (network.*source.fetch)(connections, netstack);
      for (const TcpIpConnection& connection : connections) {
        auto row = GetOutputStructure();
        row->SetField(kProto, source.proto);
        row->SetField(kRecvQ, static_cast<long>(connection.recvQueue));
        row->SetField(kSendQ, static_cast<long>(connection.sendQueue));
        row->SetField(kLocalAddress,
                      ConnectionEndpointText(connection.localAddress, connection.localPort));
        row->SetField(kForeignAddress,
                      ConnectionEndpointText(connection.foreignAddress, connection.foreignPort));
        row->SetField(kState, TcpStateName(connection.state));
        row->SetField(kCcAlgo, connection.ccAlgorithm);
        row->SetField(kWorldId, static_cast<long>(connection.worldId));
        row->SetField(kWorldName, resources.GetWorldName(connection.worldId));
        list->Add(row);
      }
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to get connection list.\n") + e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
