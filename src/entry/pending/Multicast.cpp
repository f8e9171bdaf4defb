//===- Multicast.cpp - Interim multicast command --------------------------===//
//
// Interim definitions of the commands of the Multicast family: Multicast
// groups. Each command is a complete node of the tree, with its description,
// default output settings and result schema, but running it only reports that
// it is not available yet. src/datapath/Multicast.cpp replaces this file.
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

// network multicast group list

CORVEX_DEFINE_NEW(MulticastGroupList)

MulticastGroupList::MulticastGroupList() {
  SetDescription("List all the multicast group members.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Interface", "Interface,Refcount,Group,Link Layer");
}

CORVEX_PENDING_OPERATIONS(MulticastGroupList)

std::shared_ptr<MetaStruct> MulticastGroupList::GetOutputStructure() {
  auto structure = MetaStruct::New("Nic");
  structure->SetField("Interface", MetaString::New());
  structure->SetField("Refcount", MetaInt::New());
  structure->SetField("Group", MetaString::New());
  structure->SetField("Link Layer", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> MulticastGroupList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
