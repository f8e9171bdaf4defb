//===- AllowedIp.cpp - Interim allowed IP and client commands -------------===//
//
// Interim definitions of the commands of the AllowedIp family: Ruleset allowed
// IPs and clients. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/firewall/AllowedIp.cpp replaces
// this file.
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

// network firewall ruleset allowedip list

CORVEX_DEFINE_NEW(FirewallRulesetAllowedipList)

FirewallRulesetAllowedipList::FirewallRulesetAllowedipList() {
  SetDescription("List allowed IP addresses for rulesets.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:FirewallRulesetAllowedip", "Ruleset,Allowed IP Addresses");
}

CORVEX_PENDING_OPERATIONS(FirewallRulesetAllowedipList)

std::shared_ptr<MetaStruct> FirewallRulesetAllowedipList::GetOutputStructure() {
  auto structure = MetaStruct::New("FirewallRulesetAllowedip");
  structure->SetField("Ruleset", MetaString::New());
  structure->SetField("Allowed IP Addresses", MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> FirewallRulesetAllowedipList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network firewall ruleset allowedip add

CORVEX_DEFINE_NEW(FirewallRulesetAllowedipAdd)

FirewallRulesetAllowedipAdd::FirewallRulesetAllowedipAdd() {
  SetDescription("Add allowed IP address/range to the ruleset.");
}

CORVEX_PENDING_OPERATIONS(FirewallRulesetAllowedipAdd)

std::shared_ptr<OutputSpec> FirewallRulesetAllowedipAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network firewall ruleset allowedip remove

CORVEX_DEFINE_NEW(FirewallRulesetAllowedipRemove)

FirewallRulesetAllowedipRemove::FirewallRulesetAllowedipRemove() {
  SetDescription("Remove allowed IP address/range from the ruleset.");
}

CORVEX_PENDING_OPERATIONS(FirewallRulesetAllowedipRemove)

std::shared_ptr<OutputSpec> FirewallRulesetAllowedipRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network firewall ruleset client get

CORVEX_DEFINE_MAKE_SHARED(FirewallRulesetClientGet)

FirewallRulesetClientGet::FirewallRulesetClientGet() {
  SetDescription("Show the number of clients using a firewall ruleset.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:FirewallRulesetClientGet", "Ruleset Client Count");
}

CORVEX_PENDING_OPERATIONS(FirewallRulesetClientGet)

std::shared_ptr<MetaStruct> FirewallRulesetClientGet::GetOutputStructure() {
  auto structure = MetaStruct::New("FirewallRulesetClientGet");
  structure->SetField("Ruleset Client Count", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> FirewallRulesetClientGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network firewall ruleset client add

CORVEX_DEFINE_MAKE_SHARED(FirewallRulesetClientAdd)

FirewallRulesetClientAdd::FirewallRulesetClientAdd() {
  SetDescription("Add a new client to a firewall ruleset. This enables the firewall ruleset and "
                 "increments the number of clients using the ruleset.");
}

CORVEX_PENDING_OPERATIONS(FirewallRulesetClientAdd)

std::shared_ptr<OutputSpec> FirewallRulesetClientAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network firewall ruleset client remove

CORVEX_DEFINE_MAKE_SHARED(FirewallRulesetClientRemove)

FirewallRulesetClientRemove::FirewallRulesetClientRemove() {
  SetDescription("Remove a client from a firewall ruleset. This decrements the number of clients "
                 "using the ruleset and if the number reaches zero the ruleset is disabled.");
}

CORVEX_PENDING_OPERATIONS(FirewallRulesetClientRemove)

std::shared_ptr<OutputSpec> FirewallRulesetClientRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
