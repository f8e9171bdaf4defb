//===- Diagnostics.cpp - Interim NIC diagnostics --------------------------===//
//
// Interim definitions of the commands of the Diagnostics family: EEPROM,
// registers and self test. Each command is a complete node of the tree, with
// its description, default output settings and result schema, but running it
// only reports that it is not available yet. src/nic/Diagnostics.cpp replaces
// this file.
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

// network nic eeprom dump

CORVEX_DEFINE_NEW(NicEepromDump)

NicEepromDump::NicEepromDump() {
  SetDescription("Dump device EEPROM");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:EepromDump", "Offset,Value");
}

CORVEX_PENDING_OPERATIONS(NicEepromDump)

std::shared_ptr<MetaStruct> NicEepromDump::GetOutputStructure() {
  auto structure = MetaStruct::New("EepromDump");
  structure->SetField("Offset", MetaString::New());
  structure->SetField("Value", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicEepromDump::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic eeprom change

CORVEX_DEFINE_NEW(NicEepromChange)

NicEepromChange::NicEepromChange() {
  SetDescription("Change EEPROM on a nic");
}

CORVEX_PENDING_OPERATIONS(NicEepromChange)

std::shared_ptr<OutputSpec> NicEepromChange::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic register dump

CORVEX_DEFINE_NEW(NicRegisterDump)

NicRegisterDump::NicRegisterDump() {
  SetDescription("Dump device registers");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:RegisterDump", "Offset,Value");
}

CORVEX_PENDING_OPERATIONS(NicRegisterDump)

std::shared_ptr<MetaStruct> NicRegisterDump::GetOutputStructure() {
  auto structure = MetaStruct::New("RegisterDump");
  structure->SetField("Offset", MetaString::New());
  structure->SetField("Value", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicRegisterDump::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic selftest run

CORVEX_DEFINE_NEW(NicSelfTestRun)

NicSelfTestRun::NicSelfTestRun() {
  SetDescription("Run self test");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:EepromDump", "Item,Value");
}

CORVEX_PENDING_OPERATIONS(NicSelfTestRun)

std::shared_ptr<MetaStruct> NicSelfTestRun::GetOutputStructure() {
  auto structure = MetaStruct::New("EepromDump");
  structure->SetField("Item", MetaString::New());
  structure->SetField("Value", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicSelfTestRun::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
