//===- NicStats.cpp - Interim NIC statistics commands ---------------------===//
//
// Interim definitions of the commands of the NicStats family: NIC and VLAN
// statistics. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/nic/NicStats.cpp replaces this
// file.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network nic stats get

CORVEX_DEFINE_NEW(NicStatsGet)

NicStatsGet::NicStatsGet() {
  SetDescription("Get NIC statistics for a given interface.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:Nic", "NIC statistics for %NIC Name%");
  SetDefaultOutputParameter(
      "fields:Nic",
      "Packets received,Packets sent,Bytes received,Bytes sent,Receive packets dropped,Transmit "
      "packets dropped,Multicast packets received,Broadcast packets received,Multicast packets "
      "sent,Broadcast packets sent,Total receive errors,Receive length errors,Receive over "
      "errors,Receive CRC errors,Receive frame errors,Receive FIFO errors,Receive missed "
      "errors,Total transmit errors,Transmit aborted errors,Transmit carrier errors,Transmit FIFO "
      "errors,Transmit heartbeat errors,Transmit window errors");
}

CORVEX_PENDING_OPERATIONS(NicStatsGet)

std::shared_ptr<MetaStruct> NicStatsGet::GetOutputStructure() {
  auto structure = MetaStruct::New("Nic");
  structure->SetField("NIC Name", MetaString::New());
  structure->SetField("Packets received", MetaInt::New());
  structure->SetField("Packets sent", MetaInt::New());
  structure->SetField("Bytes received", MetaInt::New());
  structure->SetField("Bytes sent", MetaInt::New());
  structure->SetField("Receive packets dropped", MetaInt::New());
  structure->SetField("Transmit packets dropped", MetaInt::New());
  structure->SetField("Multicast packets received", MetaInt::New());
  structure->SetField("Broadcast packets received", MetaInt::New());
  structure->SetField("Multicast packets sent", MetaInt::New());
  structure->SetField("Broadcast packets sent", MetaInt::New());
  structure->SetField("Total receive errors", MetaInt::New());
  structure->SetField("Receive length errors", MetaInt::New());
  structure->SetField("Receive over errors", MetaInt::New());
  structure->SetField("Receive CRC errors", MetaInt::New());
  structure->SetField("Receive frame errors", MetaInt::New());
  structure->SetField("Receive FIFO errors", MetaInt::New());
  structure->SetField("Receive missed errors", MetaInt::New());
  structure->SetField("Total transmit errors", MetaInt::New());
  structure->SetField("Transmit aborted errors", MetaInt::New());
  structure->SetField("Transmit carrier errors", MetaInt::New());
  structure->SetField("Transmit FIFO errors", MetaInt::New());
  structure->SetField("Transmit heartbeat errors", MetaInt::New());
  structure->SetField("Transmit window errors", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicStatsGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic vlan stats get

CORVEX_DEFINE_NEW(NicVlanStatsGet)

NicVlanStatsGet::NicVlanStatsGet() {
  SetDescription("List VLAN statistics for active VLAN's on the NIC.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:NIC", "VLAN %VLAN ID%");
  SetDefaultOutputParameter("fields:NIC", "Packets received,Packets sent");
}

CORVEX_PENDING_OPERATIONS(NicVlanStatsGet)

std::shared_ptr<MetaStruct> NicVlanStatsGet::GetOutputStructure() {
  auto structure = MetaStruct::New("NIC");
  structure->SetField("VLAN ID", MetaInt::New());
  structure->SetField("Packets received", MetaInt::New());
  structure->SetField("Packets sent", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicVlanStatsGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic vlan stats set

CORVEX_DEFINE_NEW(NicVlanStatsSet)

NicVlanStatsSet::NicVlanStatsSet() {
  SetDescription("Enable/disable VLAN statistics collection on the NIC.");
}

CORVEX_PENDING_OPERATIONS(NicVlanStatsSet)

std::shared_ptr<OutputSpec> NicVlanStatsSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
