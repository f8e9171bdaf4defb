//===- Sriov.cpp - Interim SR-IOV commands --------------------------------===//
//
// Interim definitions of the commands of the Sriov family: SR-IOV NICs and
// virtual functions. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/nic/Sriov.cpp replaces this file.
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

// network sriovnic list

CORVEX_DEFINE_NEW(SriovNicList)

SriovNicList::SriovNicList() {
  SetDescription("This command will list the SRIOV Enabled NICs (PFs) currently installed and "
                 "loaded on the system.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:SriovNic",
                            "Name,PCI Device,Driver,Link,Speed,Duplex,MAC Address,MTU,Description");
}

CORVEX_PENDING_OPERATIONS(SriovNicList)

std::shared_ptr<MetaStruct> SriovNicList::GetOutputStructure() {
  auto structure = MetaStruct::New("SriovNic");
  structure->SetField("Name", MetaString::New());
  structure->SetField("PCI Device", MetaString::New());
  structure->SetField("Driver", MetaString::New());
  structure->SetField("Link", MetaString::New());
  structure->SetField("Speed", MetaInt::New());
  structure->SetField("Duplex", MetaString::New());
  structure->SetField("MAC Address", MetaString::New());
  structure->SetField("MTU", MetaInt::New());
  structure->SetField("Description", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> SriovNicList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network sriovnic vf list

CORVEX_DEFINE_NEW(VfList)

VfList::VfList() {
  SetDescription("Get the generic configuration of VFs for SRIOV NIC.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:VFList", "VF ID,Active,PCI Address,Owner World ID");
}

CORVEX_PENDING_OPERATIONS(VfList)

std::shared_ptr<MetaStruct> VfList::GetOutputStructure() {
  auto structure = MetaStruct::New("VFList");
  structure->SetField("VF ID", MetaInt::New());
  structure->SetField("Active", MetaBool::New());
  structure->SetField("PCI Address", MetaString::New());
  structure->SetField("Owner World ID", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> VfList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network sriovnic vf stats

CORVEX_DEFINE_NEW(VfStats)

VfStats::VfStats() {
  SetDescription("Get statistics for given VF of a SRIOV NIC.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:VF", "Statistics for %vf% VF of %NIC Name%");
  SetDefaultOutputParameter(
      "fields:VFStats",
      "Rx Unicast Pkt,Rx Unicast Bytes,Rx Multicast Pkts,Rx Multicast Bytes,Rx Broadcast Pkts,Rx "
      "Broadcast Bytes,Rx Out of Buffer drops,Rx Error drops,Rx LRO Pkts,Rx LRO Bytes,Tx Unicast "
      "Pkt,Tx Unicast Bytes,Tx Multicast Pkts,Tx Multicast Bytes,Tx Broadcast Pkts,Tx Broadcast "
      "Bytes,Tx Errors,Tx Discards,Tx TSO Pkts,Tx TSO Bytes");
}

CORVEX_PENDING_OPERATIONS(VfStats)

std::shared_ptr<MetaStruct> VfStats::GetOutputStructure() {
  auto structure = MetaStruct::New("VfStats");
  structure->SetField("NIC Name", MetaString::New());
  structure->SetField("VF ID", MetaInt::New());
  structure->SetField("Rx Unicast Pkt", MetaInt::New());
  structure->SetField("Rx Unicast Bytes", MetaInt::New());
  structure->SetField("Rx Multicast Pkts", MetaInt::New());
  structure->SetField("Rx Multicast Bytes", MetaInt::New());
  structure->SetField("Rx Broadcast Pkts", MetaInt::New());
  structure->SetField("Rx Broadcast Bytes", MetaInt::New());
  structure->SetField("Rx Out of Buffer drops", MetaInt::New());
  structure->SetField("Rx Error drops", MetaInt::New());
  structure->SetField("Rx LRO Pkts", MetaInt::New());
  structure->SetField("Rx LRO Bytes", MetaInt::New());
  structure->SetField("Tx Unicast Pkt", MetaInt::New());
  structure->SetField("Tx Unicast Bytes", MetaInt::New());
  structure->SetField("Tx Multicast Pkts", MetaInt::New());
  structure->SetField("Tx Multicast Bytes", MetaInt::New());
  structure->SetField("Tx Broadcast Pkts", MetaInt::New());
  structure->SetField("Tx Broadcast Bytes", MetaInt::New());
  structure->SetField("Tx Errors", MetaInt::New());
  structure->SetField("Tx Discards", MetaInt::New());
  structure->SetField("Tx TSO Pkts", MetaInt::New());
  structure->SetField("Tx TSO Bytes", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> VfStats::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
