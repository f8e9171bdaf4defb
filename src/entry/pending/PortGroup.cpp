//===- PortGroup.cpp - Interim port group commands ------------------------===//
//
// Interim definitions of the commands of the PortGroup family: Port groups and
// their policies. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/vswitch/PortGroup.cpp replaces this
// file.
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

// network vswitch standard portgroup list

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupList)

VirtualSwitchPortGroupList::VirtualSwitchPortGroupList() {
  SetDescription("List all of the port groups currently on the system.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:PortGroup", "Name,Virtual Switch,Active Clients,VLAN ID");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchPortGroupList)

std::shared_ptr<MetaStruct> VirtualSwitchPortGroupList::GetOutputStructure() {
  auto structure = MetaStruct::New("PortGroup");
  structure->SetField("Name", MetaString::New());
  structure->SetField("Virtual Switch", MetaString::New());
  structure->SetField("Active Clients", MetaInt::New());
  structure->SetField("VLAN ID", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network vswitch standard portgroup add

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupAdd)

VirtualSwitchPortGroupAdd::VirtualSwitchPortGroupAdd() {
  SetDescription("Allows the addition of a standard port group to a virtual switch.");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchPortGroupAdd)

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard portgroup remove

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupRemove)

VirtualSwitchPortGroupRemove::VirtualSwitchPortGroupRemove() {
  SetDescription("Remove a port group from the given virtual switch");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchPortGroupRemove)

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard portgroup set

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupSet)

VirtualSwitchPortGroupSet::VirtualSwitchPortGroupSet() {
  SetDescription("Set the vlan id for the given port group");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchPortGroupSet)

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard portgroup policy shaping get

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicyShapingGet)

VirtualSwitchPortGroupPolicyShapingGet::VirtualSwitchPortGroupPolicyShapingGet() {
  SetDescription("Get the network shaping policy settings governing the given port group");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter(
      "fields:PortGroupTrafficShapingPolicy",
      "Enabled,Average Bandwidth,Peak Bandwidth,Burst Size,Override Vswitch Enabled,Override "
      "Vswitch Average Bandwidth,Override Vswitch Peak Bandwidth,Override Vswitch Burst Size");
  SetDefaultOutputParameter("header:PortGroupTrafficShapingPolicy", "<NONE>");
  SetDefaultOutputParameter("units:PortGroupTrafficShapingPolicy.Average Bandwidth", "Kbps");
  SetDefaultOutputParameter("units:PortGroupTrafficShapingPolicy.Peak Bandwidth", "Kbps");
  SetDefaultOutputParameter("units:PortGroupTrafficShapingPolicy.Burst Size", "Kib");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchPortGroupPolicyShapingGet)

std::shared_ptr<MetaStruct> VirtualSwitchPortGroupPolicyShapingGet::GetOutputStructure() {
  auto structure = MetaStruct::New("PortGroupTrafficShapingPolicy");
  structure->SetField("Enabled", MetaBool::New());
  structure->SetField("Average Bandwidth", MetaInt::New());
  structure->SetField("Peak Bandwidth", MetaInt::New());
  structure->SetField("Burst Size", MetaInt::New());
  structure->SetField("Override Vswitch Enabled", MetaBool::New());
  structure->SetField("Override Vswitch Average Bandwidth", MetaBool::New());
  structure->SetField("Override Vswitch Peak Bandwidth", MetaBool::New());
  structure->SetField("Override Vswitch Burst Size", MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicyShapingGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network vswitch standard portgroup policy shaping set

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicyShapingSet)

VirtualSwitchPortGroupPolicyShapingSet::VirtualSwitchPortGroupPolicyShapingSet() {
  SetDescription("Set the shaping policy settings for the given port group");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchPortGroupPolicyShapingSet)

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicyShapingSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard portgroup policy failover get

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicyFailoverGet)

VirtualSwitchPortGroupPolicyFailoverGet::VirtualSwitchPortGroupPolicyFailoverGet() {
  SetDescription("Get the network failover policy settings governing the given port group");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter(
      "fields:PortGroupFailoverPolicy",
      "Load Balancing,Network Failure Detection,Notify Switches,Failback,Active Adapters,Standby "
      "Adapters,Unused Adapters,Override Vswitch Load Balancing,Override Vswitch Network Failure "
      "Detection,Override Vswitch Notify Switches,Override Vswitch Failback,Override Vswitch "
      "Uplinks");
  SetDefaultOutputParameter("header:PortGroupFailoverPolicy", "<NONE>");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchPortGroupPolicyFailoverGet)

std::shared_ptr<MetaStruct> VirtualSwitchPortGroupPolicyFailoverGet::GetOutputStructure() {
  auto structure = MetaStruct::New("PortGroupFailoverPolicy");
  structure->SetField("Load Balancing", MetaString::New());
  structure->SetField("Network Failure Detection", MetaString::New());
  structure->SetField("Notify Switches", MetaBool::New());
  structure->SetField("Failback", MetaBool::New());
  structure->SetField("Active Adapters", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Standby Adapters", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Unused Adapters", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Override Vswitch Load Balancing", MetaBool::New());
  structure->SetField("Override Vswitch Network Failure Detection", MetaBool::New());
  structure->SetField("Override Vswitch Notify Switches", MetaBool::New());
  structure->SetField("Override Vswitch Failback", MetaBool::New());
  structure->SetField("Override Vswitch Uplinks", MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicyFailoverGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network vswitch standard portgroup policy failover set

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicyFailoverSet)

VirtualSwitchPortGroupPolicyFailoverSet::VirtualSwitchPortGroupPolicyFailoverSet() {
  SetDescription("Configure the Failover policy for a port group. These setting may potentially "
                 "override virtual switch settings.");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchPortGroupPolicyFailoverSet)

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicyFailoverSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard portgroup policy security get

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicySecurityGet)

VirtualSwitchPortGroupPolicySecurityGet::VirtualSwitchPortGroupPolicySecurityGet() {
  SetDescription("Get the Security Policy governing the given port group. ");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:PortGroupSecurityPolicy",
                            "Allow Promiscuous,Allow MAC Address Change,Allow Forged "
                            "Transmits,Override Vswitch Allow Promiscuous,Override Vswitch Allow "
                            "MAC Address Change,Override Vswitch Allow Forged Transmits");
  SetDefaultOutputParameter("header:PortGroupSecurityPolicy", "<NONE>");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchPortGroupPolicySecurityGet)

std::shared_ptr<MetaStruct> VirtualSwitchPortGroupPolicySecurityGet::GetOutputStructure() {
  auto structure = MetaStruct::New("PortGroupSecurityPolicy");
  structure->SetField("Allow Promiscuous", MetaBool::New());
  structure->SetField("Allow MAC Address Change", MetaBool::New());
  structure->SetField("Allow Forged Transmits", MetaBool::New());
  structure->SetField("Override Vswitch Allow Promiscuous", MetaBool::New());
  structure->SetField("Override Vswitch Allow MAC Address Change", MetaBool::New());
  structure->SetField("Override Vswitch Allow Forged Transmits", MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicySecurityGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network vswitch standard portgroup policy security set

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicySecuritySet)

VirtualSwitchPortGroupPolicySecuritySet::VirtualSwitchPortGroupPolicySecuritySet() {
  SetDescription("Set the security policy for a given port group");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchPortGroupPolicySecuritySet)

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicySecuritySet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
