//===- Attachment.cpp - Interim NIC attachment commands -------------------===//
//
// Interim definitions of the commands of the Attachment family: Uplink
// attachments. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/nic/Attachment.cpp replaces this
// file.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network nic attachment add

CORVEX_DEFINE_MAKE_SHARED(NicAttachmentAdd)

NicAttachmentAdd::NicAttachmentAdd() {
  SetDescription("Attach one uplink as a branch to a trunk uplink with specified VLAN ID.");
}

CORVEX_PENDING_OPERATIONS(NicAttachmentAdd)

std::shared_ptr<OutputSpec> NicAttachmentAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic attachment list

CORVEX_DEFINE_MAKE_SHARED(NicAttachmentList)

NicAttachmentList::NicAttachmentList() {
  SetDescription("Show uplink attachment information.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:AttachmentInfo", "Trunk,Branch,Branch MAC,VLAN ID");
}

CORVEX_PENDING_OPERATIONS(NicAttachmentList)

std::shared_ptr<MetaStruct> NicAttachmentList::GetOutputStructure() {
  auto structure = MetaStruct::New("AttachmentInfo");
  structure->SetField("Trunk", MetaString::New());
  structure->SetField("Branch", MetaString::New());
  structure->SetField("Branch MAC", MetaString::New());
  structure->SetField("VLAN ID", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicAttachmentList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic attachment remove

CORVEX_DEFINE_MAKE_SHARED(NicAttachmentRemove)

NicAttachmentRemove::NicAttachmentRemove() {
  SetDescription("Detach a branch uplink from its trunk.");
}

CORVEX_PENDING_OPERATIONS(NicAttachmentRemove)

std::shared_ptr<OutputSpec> NicAttachmentRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
