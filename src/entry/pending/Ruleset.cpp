//===- Ruleset.cpp - Interim firewall ruleset commands --------------------===//
//
// Interim definitions of the commands of the Ruleset family: Firewall rulesets
// and rules. Each command is a complete node of the tree, with its description,
// default output settings and result schema, but running it only reports that
// it is not available yet. src/firewall/Ruleset.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "firewall.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network firewall ruleset list

CORVEX_DEFINE_NEW(FirewallRulesetList)

FirewallRulesetList::FirewallRulesetList() {
  SetDescription("List the rulesets in firewall.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Ruleset",
                            "Name,Enabled,Enable/Disable configurable,Allowed IP configurable");
}

CORVEX_PENDING_OPERATIONS(FirewallRulesetList)

std::shared_ptr<MetaStruct> FirewallRulesetList::GetOutputStructure() {
  auto structure = MetaStruct::New("Ruleset");
  structure->SetField("Name", MetaString::New());
  structure->SetField("Enabled", MetaBool::New());
  structure->SetField("Enable/Disable configurable", MetaBool::New());
  structure->SetField("Allowed IP configurable", MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> FirewallRulesetList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network firewall ruleset set

CORVEX_DEFINE_NEW(FirewallRulesetSet)

FirewallRulesetSet::FirewallRulesetSet() {
  SetDescription("Set firewall ruleset status (allowedAll flag and enabled status).");
}

CORVEX_PENDING_OPERATIONS(FirewallRulesetSet)

std::shared_ptr<OutputSpec> FirewallRulesetSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network firewall ruleset rule list

CORVEX_DEFINE_NEW(FirewallRulesetRuleList)

FirewallRulesetRuleList::FirewallRulesetRuleList() {
  SetDescription("List the rules of each ruleset in firewall.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:FirewallPortRule",
                            "Ruleset,Direction,Protocol,Port Type,Port Begin,Port End");
}

CORVEX_PENDING_OPERATIONS(FirewallRulesetRuleList)

std::shared_ptr<MetaStruct> FirewallRulesetRuleList::GetOutputStructure() {
  auto structure = MetaStruct::New("FirewallPortRule");
  structure->SetField("Ruleset", MetaString::New());
  structure->SetField("Port Type", MetaString::New());
  structure->SetField("Port Begin", MetaInt::New());
  structure->SetField("Port End", MetaInt::New());
  structure->SetField("Direction", MetaString::New());
  structure->SetField("Protocol", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> FirewallRulesetRuleList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
