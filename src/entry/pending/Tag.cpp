//===- Tag.cpp - Interim interface tag commands ---------------------------===//
//
// Interim definitions of the commands of the Tag family: Interface tags. Each
// command is a complete node of the tree, with its description, default output
// settings and result schema, but running it only reports that it is not
// available yet. src/ip/Tag.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaStruct;

// network ip interface tag add

CORVEX_DEFINE_NEW(IpInterfaceTagAdd)

IpInterfaceTagAdd::IpInterfaceTagAdd() {
  SetDescription("Adds a tag on a given Tarvik network interface. Supported tags are: ");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceTagAdd)

std::shared_ptr<OutputSpec> IpInterfaceTagAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip interface tag remove

CORVEX_DEFINE_NEW(IpInterfaceTagRemove)

IpInterfaceTagRemove::IpInterfaceTagRemove() {
  SetDescription("Removes a tag on a given Tarvik network interface.");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceTagRemove)

std::shared_ptr<OutputSpec> IpInterfaceTagRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip interface tag get

CORVEX_DEFINE_NEW(IpInterfaceTagGet)

IpInterfaceTagGet::IpInterfaceTagGet() {
  SetDescription("Gets the tags set on the given Tarvik network interface.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:IntefaceTag", "Tags");
  SetDefaultOutputParameter("header:InterfaceTag", "<NONE>");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceTagGet)

std::shared_ptr<MetaStruct> IpInterfaceTagGet::GetOutputStructure() {
  auto structure = MetaStruct::New("InterfaceTag");
  structure->SetField("Tags", MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> IpInterfaceTagGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
