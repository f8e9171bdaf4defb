//===- HwCap.cpp - Interim hardware capability commands -------------------===//
//
// Interim definitions of the commands of the HwCap family: Hardware
// capabilities. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/nic/HwCap.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network nic hwCap supported list

CORVEX_DEFINE_MAKE_SHARED(NicHwCapSupportedList)

NicHwCapSupportedList::NicHwCapSupportedList() {
  SetDescription("List supported hardware capabilities of physical NICs.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Settings", "NIC,Device Hardware Cap Supported");
}

CORVEX_PENDING_OPERATIONS(NicHwCapSupportedList)

std::shared_ptr<MetaStruct> NicHwCapSupportedList::GetOutputStructure() {
  auto structure = MetaStruct::New("Settings");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("Device Hardware Cap Supported", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicHwCapSupportedList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic hwCap activated list

CORVEX_DEFINE_MAKE_SHARED(NicHwCapActivatedList)

NicHwCapActivatedList::NicHwCapActivatedList() {
  SetDescription("List activated hardware capabilities of physical NICs.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Settings", "NIC,Device Hardware Cap Activated");
}

CORVEX_PENDING_OPERATIONS(NicHwCapActivatedList)

std::shared_ptr<MetaStruct> NicHwCapActivatedList::GetOutputStructure() {
  auto structure = MetaStruct::New("Settings");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("Device Hardware Cap Activated", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicHwCapActivatedList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
