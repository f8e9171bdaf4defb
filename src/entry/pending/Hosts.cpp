//===- Hosts.cpp - Interim hosts entry commands ---------------------------===//
//
// Interim definitions of the commands of the Hosts family: Hosts entries. Each
// command is a complete node of the tree, with its description, default output
// settings and result schema, but running it only reports that it is not
// available yet. src/ip/Hosts.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network ip hosts list

CORVEX_DEFINE_MAKE_SHARED(IpHostsList)

IpHostsList::IpHostsList() {
  SetDescription("List the user specified associations of IP addresses with host names.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:IpHostList", "IP address,HostName,Aliases,Comment");
}

CORVEX_PENDING_OPERATIONS(IpHostsList)

std::shared_ptr<MetaStruct> IpHostsList::GetOutputStructure() {
  auto structure = MetaStruct::New("IpHostList");
  structure->SetField("IP address", MetaString::New());
  structure->SetField("HostName", MetaString::New());
  structure->SetField("Aliases", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Comment", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpHostsList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ip hosts add

CORVEX_DEFINE_MAKE_SHARED(IpHostsAdd)

IpHostsAdd::IpHostsAdd() {
  SetDescription("Add association of IP addresses with host names.");
}

CORVEX_PENDING_OPERATIONS(IpHostsAdd)

std::shared_ptr<OutputSpec> IpHostsAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip hosts remove

CORVEX_DEFINE_MAKE_SHARED(IpHostsRemove)

IpHostsRemove::IpHostsRemove() {
  SetDescription("Remove association of IP addresses with host names.");
}

CORVEX_PENDING_OPERATIONS(IpHostsRemove)

std::shared_ptr<OutputSpec> IpHostsRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
