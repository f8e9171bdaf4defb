//===- Software.cpp - Interim software simulation commands ----------------===//
//
// Interim definitions of the commands of the Software family: Software
// simulation of offloads. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/nic/Software.cpp replaces this
// file.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network nic software list

CORVEX_DEFINE_NEW(NicSoftwareList)

NicSoftwareList::NicSoftwareList() {
  SetDescription("List software simulation settings of physical NICs currently installed and "
                 "loaded on the system.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Settings",
                            "NIC,IPv4 CSO,IPv4 TSO,Scatter Gather,Offset Based Offload,VXLAN "
                            "Encap,Geneve Offload,IPv6 TSO,IPv6 TSO Ext,IPv6 CSO,IPv6 CSO Ext,High "
                            "DMA,Scatter Gather MP,VLAN Tagging,VLAN Untagging");
}

CORVEX_PENDING_OPERATIONS(NicSoftwareList)

std::shared_ptr<MetaStruct> NicSoftwareList::GetOutputStructure() {
  auto structure = MetaStruct::New("Settings");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("IPv4 CSO", MetaString::New());
  structure->SetField("IPv4 TSO", MetaString::New());
  structure->SetField("Scatter Gather", MetaString::New());
  structure->SetField("Offset Based Offload", MetaString::New());
  structure->SetField("VXLAN Encap", MetaString::New());
  structure->SetField("Geneve Offload", MetaString::New());
  structure->SetField("IPv6 TSO", MetaString::New());
  structure->SetField("IPv6 TSO Ext", MetaString::New());
  structure->SetField("IPv6 CSO", MetaString::New());
  structure->SetField("IPv6 CSO Ext", MetaString::New());
  structure->SetField("High DMA", MetaString::New());
  structure->SetField("Scatter Gather MP", MetaString::New());
  structure->SetField("VLAN Tagging", MetaString::New());
  structure->SetField("VLAN Untagging", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicSoftwareList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic software set

CORVEX_DEFINE_NEW(NicSoftwareSet)

NicSoftwareSet::NicSoftwareSet() {
  SetDescription("Enable and disable software simulation settings on a NIC.");
}

CORVEX_PENDING_OPERATIONS(NicSoftwareSet)

std::shared_ptr<OutputSpec> NicSoftwareSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
