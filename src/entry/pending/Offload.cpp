//===- Offload.cpp - Interim NIC offload commands -------------------------===//
//
// Interim definitions of the commands of the Offload family: Checksum,
// segmentation and scatter-gather offloads. Each command is a complete node of
// the tree, with its description, default output settings and result schema,
// but running it only reports that it is not available yet. src/nic/Offload.cpp
// replaces this file.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network nic cso get

CORVEX_DEFINE_NEW(NicCsoGet)

NicCsoGet::NicCsoGet() {
  SetDescription("Get checksum offload settings");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:CSOSettings", "NIC,RX Checksum Offload,TX Checksum Offload");
}

CORVEX_PENDING_OPERATIONS(NicCsoGet)

std::shared_ptr<MetaStruct> NicCsoGet::GetOutputStructure() {
  auto structure = MetaStruct::New("CSOSettings");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("RX Checksum Offload", MetaString::New());
  structure->SetField("TX Checksum Offload", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicCsoGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic cso set

CORVEX_DEFINE_NEW(NicCsoSet)

NicCsoSet::NicCsoSet() {
  SetDescription("Set checksum offload settings on a nic, which is not persistent.");
}

CORVEX_PENDING_OPERATIONS(NicCsoSet)

std::shared_ptr<OutputSpec> NicCsoSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic tso get

CORVEX_DEFINE_NEW(NicTsoGet)

NicTsoGet::NicTsoGet() {
  SetDescription("Get TCP segmentation offload settings");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:TSOSettings", "NIC,Value");
}

CORVEX_PENDING_OPERATIONS(NicTsoGet)

std::shared_ptr<MetaStruct> NicTsoGet::GetOutputStructure() {
  auto structure = MetaStruct::New("TSOSettings");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("Value", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicTsoGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic tso set

CORVEX_DEFINE_NEW(NicTsoSet)

NicTsoSet::NicTsoSet() {
  SetDescription("Set TCP segmentation offload settings on a nic, which is not persistent.");
}

CORVEX_PENDING_OPERATIONS(NicTsoSet)

std::shared_ptr<OutputSpec> NicTsoSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic sg get

CORVEX_DEFINE_NEW(NicSgGet)

NicSgGet::NicSgGet() {
  SetDescription("Get scatter-gather settings");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:ScatterGatherSetting", "NIC,Value");
}

CORVEX_PENDING_OPERATIONS(NicSgGet)

std::shared_ptr<MetaStruct> NicSgGet::GetOutputStructure() {
  auto structure = MetaStruct::New("ScatterGatherSetting");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("Value", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicSgGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic sg set

CORVEX_DEFINE_NEW(NicSgSet)

NicSgSet::NicSgSet() {
  SetDescription("Set scatter-gatter settings on a nic, which is not persistent.");
}

CORVEX_PENDING_OPERATIONS(NicSgSet)

std::shared_ptr<OutputSpec> NicSgSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
