//===- Standard.cpp - Interim standard switch commands --------------------===//
//
// Interim definitions of the commands of the Standard family: Standard virtual
// switches and their uplinks. Each command is a complete node of the tree, with
// its description, default output settings and result schema, but running it
// only reports that it is not available yet. src/vswitch/Standard.cpp replaces
// this file.
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

// network vswitch standard add

CORVEX_DEFINE_NEW(VirtualSwitchStandardAdd)

VirtualSwitchStandardAdd::VirtualSwitchStandardAdd() {
  SetDescription("Add a new virtual switch to the Ostra networking system.");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardAdd)

std::shared_ptr<OutputSpec> VirtualSwitchStandardAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard set

CORVEX_DEFINE_NEW(VirtualSwitchStandardSet)

VirtualSwitchStandardSet::VirtualSwitchStandardSet() {
  SetDescription("This command sets the MTU size and CDP status of a given virtual switch.");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardSet)

std::shared_ptr<OutputSpec> VirtualSwitchStandardSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard list

CORVEX_DEFINE_NEW(VirtualSwitchStandardList)

VirtualSwitchStandardList::VirtualSwitchStandardList() {
  SetDescription("List the virtual switches current on the Ostra host.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:VirtualSwitch", "%Name%");
  SetDefaultOutputParameter(
      "fields:VirtualSwitch",
      "Name,Class,Num Ports,Used Ports,Configured Ports,MTU,CDP Status,Beacon Enabled,Beacon "
      "Interval,Beacon Threshold,Beacon Required By,Uplinks,Portgroups");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardList)

std::shared_ptr<MetaStruct> VirtualSwitchStandardList::GetOutputStructure() {
  auto structure = MetaStruct::New("VirtualSwitch");
  structure->SetField("Name", MetaString::New());
  structure->SetField("Class", MetaString::New());
  structure->SetField("Num Ports", MetaInt::New());
  structure->SetField("Used Ports", MetaInt::New());
  structure->SetField("Configured Ports", MetaInt::New());
  structure->SetField("MTU", MetaInt::New());
  structure->SetField("CDP Status", MetaString::New());
  structure->SetField("Beacon Enabled", MetaBool::New());
  structure->SetField("Beacon Interval", MetaInt::New());
  structure->SetField("Beacon Threshold", MetaInt::New());
  structure->SetField("Beacon Required By", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Uplinks", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Portgroups", MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network vswitch standard remove

CORVEX_DEFINE_NEW(VirtualSwitchStandardRemove)

VirtualSwitchStandardRemove::VirtualSwitchStandardRemove() {
  SetDescription("Remove a virtual switch from the Ostra networking system.");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardRemove)

std::shared_ptr<OutputSpec> VirtualSwitchStandardRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard uplink add

CORVEX_DEFINE_NEW(VirtualSwitchStandardUplinkAdd)

VirtualSwitchStandardUplinkAdd::VirtualSwitchStandardUplinkAdd() {
  SetDescription("Add an uplink to the given virtual switch. Note if this virtual switch has a NIC "
                 "teaming policy assigned to it then the policy must also be modified to enable "
                 "use of this uplink on this virtual switch");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardUplinkAdd)

std::shared_ptr<OutputSpec> VirtualSwitchStandardUplinkAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard uplink remove

CORVEX_DEFINE_NEW(VirtualSwitchStandardUplinkRemove)

VirtualSwitchStandardUplinkRemove::VirtualSwitchStandardUplinkRemove() {
  SetDescription("Remove an uplink from the given virtual switch. Note if this virtual switch has "
                 "a NIC teaming policy assigned to it then the policy must also be modified to "
                 "disable use of this uplink on this virtual switch");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardUplinkRemove)

std::shared_ptr<OutputSpec> VirtualSwitchStandardUplinkRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
