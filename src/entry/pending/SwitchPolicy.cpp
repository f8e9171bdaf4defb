//===- SwitchPolicy.cpp - Interim switch policy commands ------------------===//
//
// Interim definitions of the commands of the SwitchPolicy family: Standard
// virtual switch policies. Each command is a complete node of the tree, with
// its description, default output settings and result schema, but running it
// only reports that it is not available yet. src/vswitch/SwitchPolicy.cpp
// replaces this file.
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

// network vswitch standard policy shaping get

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicyShapingGet)

VirtualSwitchStandardPolicyShapingGet::VirtualSwitchStandardPolicyShapingGet() {
  SetDescription("Get the shaping policy settings for the given virtual switch");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:VirtualSwitchTrafficShapingPolicy",
                            "Enabled,Average Bandwidth,Peak Bandwidth,Burst Size");
  SetDefaultOutputParameter("header:VirtualSwitchTrafficShapingPolicy", "<NONE>");
  SetDefaultOutputParameter("units:VirtualSwitchTrafficShapingPolicy.Average Bandwidth", "Kbps");
  SetDefaultOutputParameter("units:VirtualSwitchTrafficShapingPolicy.Peak Bandwidth", "Kbps");
  SetDefaultOutputParameter("units:VirtualSwitchTrafficShapingPolicy.Burst Size", "Kib");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardPolicyShapingGet)

std::shared_ptr<MetaStruct> VirtualSwitchStandardPolicyShapingGet::GetOutputStructure() {
  auto structure = MetaStruct::New("VirtualSwitchTrafficShapingPolicy");
  structure->SetField("Enabled", MetaBool::New());
  structure->SetField("Average Bandwidth", MetaInt::New());
  structure->SetField("Peak Bandwidth", MetaInt::New());
  structure->SetField("Burst Size", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicyShapingGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network vswitch standard policy shaping set

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicyShapingSet)

VirtualSwitchStandardPolicyShapingSet::VirtualSwitchStandardPolicyShapingSet() {
  SetDescription("Set the shaping policy settings for the given virtual switch");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardPolicyShapingSet)

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicyShapingSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard policy security get

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicySecurityGet)

VirtualSwitchStandardPolicySecurityGet::VirtualSwitchStandardPolicySecurityGet() {
  SetDescription("Get the Security Policy governing the given virtual switch.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:VirtualSwitchSecurityPolicy",
                            "Allow Promiscuous,Allow MAC Address Change,Allow Forged Transmits");
  SetDefaultOutputParameter("header:VirtualSwitchSecurityPolicy", "<NONE>");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardPolicySecurityGet)

std::shared_ptr<MetaStruct> VirtualSwitchStandardPolicySecurityGet::GetOutputStructure() {
  auto structure = MetaStruct::New("VirtualSwitchSecurityPolicy");
  structure->SetField("Allow Promiscuous", MetaBool::New());
  structure->SetField("Allow MAC Address Change", MetaBool::New());
  structure->SetField("Allow Forged Transmits", MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicySecurityGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network vswitch standard policy security set

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicySecuritySet)

VirtualSwitchStandardPolicySecuritySet::VirtualSwitchStandardPolicySecuritySet() {
  SetDescription("Set the security policy for a given virtual switch");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardPolicySecuritySet)

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicySecuritySet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network vswitch standard policy failover get

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicyFailoverGet)

VirtualSwitchStandardPolicyFailoverGet::VirtualSwitchStandardPolicyFailoverGet() {
  SetDescription("Get the failover policy settings governing the given virtual switch");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:VirtualSwitchFailoverPolicy",
                            "Load Balancing,Network Failure Detection,Notify "
                            "Switches,Failback,Active Adapters,Standby Adapters,Unused Adapters");
  SetDefaultOutputParameter("header:VirtualSwitchFailoverPolicy", "<NONE>");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardPolicyFailoverGet)

std::shared_ptr<MetaStruct> VirtualSwitchStandardPolicyFailoverGet::GetOutputStructure() {
  auto structure = MetaStruct::New("VirtualSwitchFailoverPolicy");
  structure->SetField("Load Balancing", MetaString::New());
  structure->SetField("Network Failure Detection", MetaString::New());
  structure->SetField("Notify Switches", MetaBool::New());
  structure->SetField("Failback", MetaBool::New());
  structure->SetField("Active Adapters", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Standby Adapters", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Unused Adapters", MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicyFailoverGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network vswitch standard policy failover set

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicyFailoverSet)

VirtualSwitchStandardPolicyFailoverSet::VirtualSwitchStandardPolicyFailoverSet() {
  SetDescription("Configure the Failover policy for a virtual switch.");
}

CORVEX_PENDING_OPERATIONS(VirtualSwitchStandardPolicyFailoverSet)

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicyFailoverSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
