//===- Dvs.cpp - Interim distributed switch list --------------------------===//
//
// Interim definitions of the commands of the Dvs family: Distributed switch
// list. Each command is a complete node of the tree, with its description,
// default output settings and result schema, but running it only reports that
// it is not available yet. src/vswitch/Dvs.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "vswitch.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

namespace {

/// One distributed port of a "KRX" row.
std::shared_ptr<MetaStruct> DVPortStructure() {
  auto structure = MetaStruct::New("DVPort");
  structure->SetField("Port ID", MetaString::New());
  structure->SetField("In Use", MetaBool::New());
  structure->SetField("DVPortgroup ID", MetaString::New());
  structure->SetField("Client", MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

} // namespace

// network vswitch dvs corvex list

CORVEX_DEFINE_NEW(VirtualSwitchDVSCorvexList)

VirtualSwitchDVSCorvexList::VirtualSwitchDVSCorvexList() {
  SetDescription(
      "List the Corvex Ambrel Distributed Switch currently configured on the Ostra host.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:KRX", "%Name%");
  SetDefaultOutputParameter("table-columns",
                            "Name,KRX ID,Class,Num Ports,Used Ports,Configured Ports,MTU,CDP "
                            "Status,Beacon Timeout,Uplinks,Corvex Branded,DVPort");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchDVSCorvexList)

std::shared_ptr<MetaStruct> VirtualSwitchDVSCorvexList::GetOutputStructure() {
  auto structure = MetaStruct::New("KRX");
  structure->SetField("Name", MetaString::New());
  structure->SetField("KRX ID", MetaString::New());
  structure->SetField("Class", MetaString::New());
  structure->SetField("Num Ports", MetaInt::New());
  structure->SetField("Used Ports", MetaInt::New());
  structure->SetField("Configured Ports", MetaInt::New());
  structure->SetField("MTU", MetaInt::New());
  structure->SetField("CDP Status", MetaString::New());
  structure->SetField("Beacon Timeout", MetaInt::New());
  structure->SetField("Uplinks", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Corvex Branded", MetaBool::New());
  structure->SetField("DVPort", MetaList::New(Fabrik::MetaObj::Struct, DVPortStructure()));
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchDVSCorvexList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
