//===- Ring.cpp - Interim ring and pause commands -------------------------===//
//
// Interim definitions of the commands of the Ring family: Rings and pause
// parameters. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/nic/Ring.cpp replaces this file.
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

// network nic ring preset get

CORVEX_DEFINE_NEW(NicRingPresetGet)

NicRingPresetGet::NicRingPresetGet() {
  SetDescription("Get preset maximums for RX/TX ring buffer parameters of a NIC.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:RingInfo", "Max RX,Max RX Mini,Max RX Jumbo,Max TX");
}

CORVEX_PENDING_OPERATIONS(NicRingPresetGet)

std::shared_ptr<MetaStruct> NicRingPresetGet::GetOutputStructure() {
  auto structure = MetaStruct::New("RingInfo");
  structure->SetField("RX", MetaInt::New());
  structure->SetField("RX Mini", MetaInt::New());
  structure->SetField("RX Jumbo", MetaInt::New());
  structure->SetField("TX", MetaInt::New());
  structure->SetField("Max RX", MetaInt::New());
  structure->SetField("Max RX Mini", MetaInt::New());
  structure->SetField("Max RX Jumbo", MetaInt::New());
  structure->SetField("Max TX", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicRingPresetGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network nic ring current get

CORVEX_DEFINE_NEW(NicRingCurrentGet)

NicRingCurrentGet::NicRingCurrentGet() {
  SetDescription("Get current RX/TX ring buffer parameters of a NIC");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:RingInfo", "RX,RX Mini,RX Jumbo,TX");
}

CORVEX_PENDING_OPERATIONS(NicRingCurrentGet)

std::shared_ptr<MetaStruct> NicRingCurrentGet::GetOutputStructure() {
  auto structure = MetaStruct::New("RingInfo");
  structure->SetField("RX", MetaInt::New());
  structure->SetField("RX Mini", MetaInt::New());
  structure->SetField("RX Jumbo", MetaInt::New());
  structure->SetField("TX", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicRingCurrentGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network nic ring current set

CORVEX_DEFINE_NEW(NicRingCurrentSet)

NicRingCurrentSet::NicRingCurrentSet() {
  SetDescription("Set current RX/TX ring buffer parameters of a NIC");
}

CORVEX_PENDING_OPERATIONS(NicRingCurrentSet)

std::shared_ptr<OutputSpec> NicRingCurrentSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic pauseParams list

CORVEX_DEFINE_NEW(NicPauseParamsList)

NicPauseParamsList::NicPauseParamsList() {
  SetDescription("List pause parameters of all NICs");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter(
      "fields:PauseParamsSettings",
      "NIC,Pause Params Supported,Pause RX,Pause TX,Auto Negotiation,Auto Negotiation Resolution "
      "Avail,RX Auto Negotiation Resolution,TX Auto Negotiation Resolution");
}

CORVEX_PENDING_OPERATIONS(NicPauseParamsList)

std::shared_ptr<MetaStruct> NicPauseParamsList::GetOutputStructure() {
  auto structure = MetaStruct::New("PauseParamsSettings");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("Pause Params Supported", MetaBool::New());
  structure->SetField("Auto Negotiation", MetaBool::New());
  structure->SetField("Pause RX", MetaBool::New());
  structure->SetField("Pause TX", MetaBool::New());
  structure->SetField("Auto Negotiation Resolution Avail", MetaBool::New());
  structure->SetField("RX Auto Negotiation Resolution", MetaBool::New());
  structure->SetField("TX Auto Negotiation Resolution", MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicPauseParamsList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic pauseParams set

CORVEX_DEFINE_NEW(NicPauseParamsSet)

NicPauseParamsSet::NicPauseParamsSet() {
  SetDescription("Set pause parameters for a NIC");
}

CORVEX_PENDING_OPERATIONS(NicPauseParamsSet)

std::shared_ptr<OutputSpec> NicPauseParamsSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
