//===- NicInfo.cpp - Interim NIC information commands ---------------------===//
//
// Interim definitions of the commands of the NicInfo family: NIC information,
// link state and negotiation. Each command is a complete node of the tree, with
// its description, default output settings and result schema, but running it
// only reports that it is not available yet. src/nic/NicInfo.cpp replaces this
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

namespace {

/// The "Driver Info" structure of `network nic get`.
std::shared_ptr<MetaStruct> NICDriverInfoStructure() {
  auto structure = MetaStruct::New("NICDriverInfo");
  structure->SetField("Driver", MetaString::New());
  structure->SetField("Version", MetaString::New());
  structure->SetField("Firmware Version", MetaString::New());
  structure->SetField("Bus Info", MetaString::New());
  return structure;
}

} // namespace

// network nic get

CORVEX_DEFINE_NEW(NicGet)

NicGet::NicGet() {
  SetDescription("Get the generic configuration of a network device");
  SetDefaultOutputFormatter("simple");
}

CORVEX_PENDING_OPERATIONS(NicGet)

std::shared_ptr<MetaStruct> NicGet::GetOutputStructure() {
  auto structure = MetaStruct::New("NICInfo");
  structure->SetField("Name", MetaString::New());
  structure->SetField("Supported Ports", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Supports Auto Negotiation", MetaBool::New());
  structure->SetField("Advertised Link Modes", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Advertised Auto Negotiation", MetaBool::New());
  structure->SetField("Cable Type", MetaString::New());
  structure->SetField("PHY Address", MetaInt::New());
  structure->SetField("Virtual Address", MetaString::New());
  structure->SetField("Transceiver", MetaString::New());
  structure->SetField("Auto Negotiation", MetaBool::New());
  structure->SetField("Supports Wakeon", MetaBool::New());
  structure->SetField("Wakeon", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Current Message Level", MetaInt::New());
  structure->SetField("Link Detected", MetaBool::New());
  structure->SetField("Supports Pause", MetaBool::New());
  structure->SetField("Pause Autonegotiate", MetaBool::New());
  structure->SetField("Pause RX", MetaBool::New());
  structure->SetField("Pause TX", MetaBool::New());
  structure->SetField("Link Status", MetaString::New());
  structure->SetField("Driver Info", NICDriverInfoStructure());
  structure->SetField("Backing DPU Id", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network nic set

CORVEX_DEFINE_NEW(NicSet)

NicSet::NicSet() {
  SetDescription("Set the general options for the specified ethernet device.");
}

CORVEX_PENDING_OPERATIONS(NicSet)

std::shared_ptr<OutputSpec> NicSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic up

CORVEX_DEFINE_NEW(NicUp)

NicUp::NicUp() {
  SetDescription("Bring up the specified network device.");
}

CORVEX_PENDING_OPERATIONS(NicUp)

std::shared_ptr<OutputSpec> NicUp::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic down

CORVEX_DEFINE_NEW(NicDown)

NicDown::NicDown() {
  SetDescription("Bring down the specified network device.");
}

CORVEX_PENDING_OPERATIONS(NicDown)

std::shared_ptr<OutputSpec> NicDown::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic negotiate restart

CORVEX_DEFINE_NEW(NicNegotiationRestart)

NicNegotiationRestart::NicNegotiationRestart() {
  SetDescription("Restart N-Way negotiation on a nic");
}

CORVEX_PENDING_OPERATIONS(NicNegotiationRestart)

std::shared_ptr<OutputSpec> NicNegotiationRestart::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
