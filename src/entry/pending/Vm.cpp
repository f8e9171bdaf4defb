//===- Vm.cpp - Interim VM commands ---------------------------------------===//
//
// Interim definitions of the commands of the Vm family: VMs and their ports.
// Each command is a complete node of the tree, with its description, default
// output settings and result schema, but running it only reports that it is not
// available yet. src/datapath/Vm.cpp replaces this file.
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

// network vm list

CORVEX_DEFINE_NEW(VMList)

VMList::VMList() {
  SetDescription("List networking information for the VM's that have active ports.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:VM", "World ID,Name,Num Ports,Networks");
}

CORVEX_PENDING_OPERATIONS(VMList)

std::shared_ptr<MetaStruct> VMList::GetOutputStructure() {
  auto structure = MetaStruct::New("VM");
  structure->SetField("World ID", MetaInt::New());
  structure->SetField("Name", MetaString::New());
  structure->SetField("Num Ports", MetaInt::New());
  structure->SetField("Networks", MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> VMList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network vm port list

CORVEX_DEFINE_NEW(VMPortList)

VMPortList::VMPortList() {
  SetDescription("List of active ports for a given VM.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:Port", "Port ID,vSwitch,Portgroup,DVPort ID,MAC Address,IP "
                                           "Address,Team Uplink,Uplink Port ID,Active Filters");
}

CORVEX_PENDING_OPERATIONS(VMPortList)

std::shared_ptr<MetaStruct> VMPortList::GetOutputStructure() {
  auto structure = MetaStruct::New("Port");
  structure->SetField("Port ID", MetaInt::New());
  structure->SetField("vSwitch", MetaString::New());
  structure->SetField("Portgroup", MetaString::New());
  structure->SetField("DVPort ID", MetaString::New());
  structure->SetField("MAC Address", MetaString::New());
  structure->SetField("IP Address", MetaString::New());
  structure->SetField("Team Uplink", MetaString::New());
  structure->SetField("Uplink Port ID", MetaInt::New());
  structure->SetField("Active Filters", MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> VMPortList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
