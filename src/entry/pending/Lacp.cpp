//===- Lacp.cpp - Interim LACP commands -----------------------------------===//
//
// Interim definitions of the commands of the Lacp family: LACP. Each command is
// a complete node of the tree, with its description, default output settings
// and result schema, but running it only reports that it is not available yet.
// src/vswitch/Lacp.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "vswitch.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

namespace {

/// The "Local Information" of a "NicStatus".
std::shared_ptr<MetaStruct> LocalInfoStructure() {
  auto structure = MetaStruct::New("LocalInfo");
  structure->SetField("Port State", MetaString::New());
  structure->SetField("Flags", MetaString::New());
  structure->SetField("Admin Key", MetaInt::New());
  structure->SetField("Oper Key", MetaInt::New());
  structure->SetField("Port Priority", MetaInt::New());
  structure->SetField("Port Number", MetaInt::New());
  return structure;
}

/// The "Partner Information" of a "NicStatus".
std::shared_ptr<MetaStruct> PartnerInfoStructure() {
  auto structure = MetaStruct::New("PartnerInfo");
  structure->SetField("Device ID", MetaString::New());
  structure->SetField("Port State", MetaString::New());
  structure->SetField("Flags", MetaString::New());
  structure->SetField("Age", MetaString::New());
  structure->SetField("Oper Key", MetaInt::New());
  structure->SetField("Port Priority", MetaInt::New());
  structure->SetField("Port Number", MetaInt::New());
  return structure;
}

/// One entry of the "Nic List" of a "LAG" row.
std::shared_ptr<MetaStruct> NicStatusStructure() {
  auto structure = MetaStruct::New("NicStatus");
  structure->SetField("Nic", MetaString::New());
  structure->SetField("State", MetaString::New());
  structure->SetField("Local Information", LocalInfoStructure());
  structure->SetField("Partner Information", PartnerInfoStructure());
  return structure;
}

} // namespace

// network vswitch dvs corvex lacp config get

CORVEX_DEFINE_NEW(LacpGetConfig)

LacpGetConfig::LacpGetConfig() {
  SetDescription("Get LACP configuration on DVS");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:LACP",
                            "DVS Name,LAG Name,LAG ID,NICs,Enabled,Mode,Load balance");
}

CORVEX_PENDING_OPERATIONS(LacpGetConfig)

std::shared_ptr<MetaStruct> LacpGetConfig::GetOutputStructure() {
  auto structure = MetaStruct::New("LACP");
  structure->SetField("DVS Name", MetaString::New());
  structure->SetField("LAG Name", MetaString::New());
  structure->SetField("LAG ID", MetaString::New());
  structure->SetField("NICs", MetaString::New());
  structure->SetField("Enabled", MetaBool::New());
  structure->SetField("Mode", MetaString::New());
  structure->SetField("Load balance", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> LacpGetConfig::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network vswitch dvs corvex lacp status get

CORVEX_DEFINE_NEW(LacpGetStatus)

LacpGetStatus::LacpGetStatus() {
  SetDescription("Get LACP status on DVS");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:LAG", "%DVSwitch%");
  SetDefaultOutputParameter("header:NicStatus", "<NONE>");
  SetDefaultOutputParameter("header:LocalInfo", "<NONE>");
  SetDefaultOutputParameter("header:PartnerInfo", "<NONE>");
  SetDefaultOutputParameter("table-columns:LAG", "DVSwitch,LAG ID,Mode,Age,Flags,Nic List");
  SetDefaultOutputParameter("table-columns:NicStatus",
                            "Nic,State,Local Information,Partner Information");
  SetDefaultOutputParameter("table-columns:LocalInfo",
                            "Flags,Admin Key,Oper Key,Port Priority,Port Number,Port State");
  SetDefaultOutputParameter("table-columns:PartnerInfo",
                            "Device ID,Age,Flags,Oper Key,Port Priority,Port Number,Port State");
}

CORVEX_PENDING_OPERATIONS(LacpGetStatus)

std::shared_ptr<MetaStruct> LacpGetStatus::GetOutputStructure() {
  auto structure = MetaStruct::New("LAG");
  structure->SetField("DVSwitch", MetaString::New());
  structure->SetField("LAG ID", MetaInt::New());
  structure->SetField("Mode", MetaString::New());
  structure->SetField("Flags", MetaList::New(Fabrik::MetaObj::String));
  structure->SetField("Nic List", MetaList::New(Fabrik::MetaObj::Struct, NicStatusStructure()));
  return structure;
}

std::shared_ptr<OutputSpec> LacpGetStatus::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network vswitch dvs corvex lacp stats get

CORVEX_DEFINE_NEW(LacpGetStats)

LacpGetStats::LacpGetStats() {
  SetDescription("Get LACP stats on DVS uplinks");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:LACP", "Uplink, Tx LACPDUs, Tx Errors, Rx LACPDUs, Rx Errors");
}

CORVEX_PENDING_OPERATIONS(LacpGetStats)

std::shared_ptr<MetaStruct> LacpGetStats::GetOutputStructure() {
  auto structure = MetaStruct::New("LACPStats");
  structure->SetField("DVSwitch", MetaString::New());
  structure->SetField("NIC", MetaString::New());
  structure->SetField("LAG ID", MetaInt::New());
  structure->SetField("Tx LACPDUs", MetaInt::New());
  structure->SetField("Tx Errors", MetaInt::New());
  structure->SetField("Rx LACPDUs", MetaInt::New());
  structure->SetField("Rx Errors", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> LacpGetStats::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network vswitch dvs corvex lacp timeout set

CORVEX_DEFINE_NEW(LacpSetTimeout)

LacpSetTimeout::LacpSetTimeout() {
  SetDescription("Set long/short timeout for vmnics in one LACP LAG");
}

CORVEX_PENDING_OPERATIONS(LacpSetTimeout)

std::shared_ptr<OutputSpec> LacpSetTimeout::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
