//===- Firewall.cpp - Interim firewall state commands ---------------------===//
//
// Interim definitions of the commands of the Firewall family: Firewall state.
// Each command is a complete node of the tree, with its description, default
// output settings and result schema, but running it only reports that it is not
// available yet. src/firewall/Firewall.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "firewall.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network firewall get

CORVEX_DEFINE_NEW(FirewallGet)

FirewallGet::FirewallGet() {
  SetDescription("Get the firewall status.");
  SetDefaultOutputFormatter("simple");
}

CORVEX_PENDING_OPERATIONS(FirewallGet)

std::shared_ptr<MetaStruct> FirewallGet::GetOutputStructure() {
  auto structure = MetaStruct::New("Firewall");
  structure->SetField("Loaded", MetaBool::New());
  structure->SetField("Enabled", MetaBool::New());
  structure->SetField("DefaultAction", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> FirewallGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network firewall set

CORVEX_DEFINE_NEW(FirewallSet)

FirewallSet::FirewallSet() {
  SetDescription("Set firewall enabled status and default action.");
}

CORVEX_PENDING_OPERATIONS(FirewallSet)

std::shared_ptr<OutputSpec> FirewallSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network firewall load

CORVEX_DEFINE_NEW(FirewallLoad)

FirewallLoad::FirewallLoad() {
  SetDescription("Load firewall module and rulesets configuration.");
}

CORVEX_PENDING_OPERATIONS(FirewallLoad)

std::shared_ptr<OutputSpec> FirewallLoad::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network firewall refresh

CORVEX_DEFINE_NEW(FirewallRefresh)

FirewallRefresh::FirewallRefresh() {
  SetDescription("Load ruleset configuration for firewall.");
}

CORVEX_PENDING_OPERATIONS(FirewallRefresh)

std::shared_ptr<OutputSpec> FirewallRefresh::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network firewall unload

CORVEX_DEFINE_NEW(FirewallUnload)

FirewallUnload::FirewallUnload() {
  SetDescription("Allow unload firewall module.");
}

CORVEX_PENDING_OPERATIONS(FirewallUnload)

std::shared_ptr<OutputSpec> FirewallUnload::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
