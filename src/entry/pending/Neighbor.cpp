//===- Neighbor.cpp - Interim neighbour and connection commands -----------===//
//
// Interim definitions of the commands of the Neighbor family: Neighbours and
// connections. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/ip/Neighbor.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network ip neighbor list

CORVEX_DEFINE_NEW(IpNeighborList)

IpNeighborList::IpNeighborList() {
  SetDescription("List ARP table entries");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:NetworkNeighbor",
                            "Neighbor,Mac Address,Tvknic,Expiry,State,Type");
  SetDefaultOutputParameter("units:NetworkNeighbor.Expiry", "sec");
}

CORVEX_PENDING_OPERATIONS(IpNeighborList)

std::shared_ptr<MetaStruct> IpNeighborList::GetOutputStructure() {
  auto structure = MetaStruct::New("NetworkNeighbor");
  structure->SetField("Neighbor", MetaString::New());
  structure->SetField("Mac Address", MetaString::New());
  structure->SetField("Tvknic", MetaString::New());
  structure->SetField("Expiry", MetaInt::New());
  structure->SetField("State", MetaString::New());
  structure->SetField("Type", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpNeighborList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ip neighbor remove

CORVEX_DEFINE_NEW(IpNeighborRemove)

IpNeighborRemove::IpNeighborRemove() {
  SetDescription("Remove ARP table entries");
}

CORVEX_PENDING_OPERATIONS(IpNeighborRemove)

std::shared_ptr<OutputSpec> IpNeighborRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip connection list

CORVEX_DEFINE_NEW(IpConnectionList)

IpConnectionList::IpConnectionList() {
  SetDescription("List active TCP/IP connections");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter(
      "fields:IpConnection",
      "Proto,Recv Q,Send Q,Local Address,Foreign Address,State,World ID,CC Algo,World Name");
}

CORVEX_PENDING_OPERATIONS(IpConnectionList)

std::shared_ptr<MetaStruct> IpConnectionList::GetOutputStructure() {
  auto structure = MetaStruct::New("IpConnection");
  structure->SetField("Proto", MetaString::New());
  structure->SetField("Recv Q", MetaInt::New());
  structure->SetField("Send Q", MetaInt::New());
  structure->SetField("Local Address", MetaString::New());
  structure->SetField("Foreign Address", MetaString::New());
  structure->SetField("State", MetaString::New());
  structure->SetField("World ID", MetaInt::New());
  structure->SetField("CC Algo", MetaString::New());
  structure->SetField("World Name", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpConnectionList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
