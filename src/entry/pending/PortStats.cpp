//===- PortStats.cpp - Interim port statistics commands -------------------===//
//
// Interim definitions of the commands of the PortStats family: Port and port
// filter statistics. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/datapath/PortStats.cpp replaces
// this file.
//
//===----------------------------------------------------------------------===//
#include "datapath.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network port stats get

CORVEX_DEFINE_NEW(PortStatsGet)

PortStatsGet::PortStatsGet() {
  SetDescription("Packet statistics for a given port.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:Port", "Packet statistics for port %Port ID%");
  SetDefaultOutputParameter(
      "fields:Port",
      "Packets received,Packets sent,Bytes received,Bytes sent,Broadcast packets "
      "received,Broadcast packets sent,Multicast packets received,Multicast packets sent,Unicast "
      "packets received,Unicast packets sent,Receive packets dropped,Transmit packets dropped");
}

CORVEX_PENDING_OPERATIONS(PortStatsGet)

std::shared_ptr<MetaStruct> PortStatsGet::GetOutputStructure() {
  auto structure = MetaStruct::New("Port");
  structure->SetField("Port ID", MetaInt::New());
  structure->SetField("Packets received", MetaInt::New());
  structure->SetField("Packets sent", MetaInt::New());
  structure->SetField("Bytes received", MetaInt::New());
  structure->SetField("Bytes sent", MetaInt::New());
  structure->SetField("Broadcast packets received", MetaInt::New());
  structure->SetField("Broadcast packets sent", MetaInt::New());
  structure->SetField("Multicast packets received", MetaInt::New());
  structure->SetField("Multicast packets sent", MetaInt::New());
  structure->SetField("Unicast packets received", MetaInt::New());
  structure->SetField("Unicast packets sent", MetaInt::New());
  structure->SetField("Receive packets dropped", MetaInt::New());
  structure->SetField("Transmit packets dropped", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> PortStatsGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network port filter stats get

CORVEX_DEFINE_NEW(PortFilterStatsGet)

PortFilterStatsGet::PortFilterStatsGet() {
  SetDescription("Filter statistics for a given port.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:Filter", "Filter statistics for %Filter name%");
  SetDefaultOutputParameter(
      "fields:Filter", "Filter direction,Packets in,Packets out,Packets dropped,Packets "
                       "filtered,Packets faulted,Packets queued,Packets injected,Packet errors");
}

CORVEX_PENDING_OPERATIONS(PortFilterStatsGet)

std::shared_ptr<MetaStruct> PortFilterStatsGet::GetOutputStructure() {
  auto structure = MetaStruct::New("Filter");
  structure->SetField("Filter name", MetaString::New());
  structure->SetField("Filter direction", MetaString::New());
  structure->SetField("Packets in", MetaInt::New());
  structure->SetField("Packets out", MetaInt::New());
  structure->SetField("Packets dropped", MetaInt::New());
  structure->SetField("Packets filtered", MetaInt::New());
  structure->SetField("Packets faulted", MetaInt::New());
  structure->SetField("Packets queued", MetaInt::New());
  structure->SetField("Packets injected", MetaInt::New());
  structure->SetField("Packet errors", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> PortFilterStatsGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
