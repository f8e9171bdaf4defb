//===- Coalesce.cpp - Interim coalescing commands -------------------------===//
//
// Interim definitions of the commands of the Coalesce family: Interrupt
// coalescing. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/nic/Coalesce.cpp replaces this
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

// network nic coalesce get

CORVEX_DEFINE_NEW(NicCoalesceGet)

NicCoalesceGet::NicCoalesceGet() {
  SetDescription("Get coalesce parameters");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:CoalesceParams",
                            "NIC,RX microseconds,RX maximum frames,TX microseconds,TX Maximum "
                            "frames,Adaptive RX,Adaptive TX,Sample interval seconds");
}

CORVEX_PENDING_OPERATIONS(NicCoalesceGet)

std::shared_ptr<MetaStruct> NicCoalesceGet::GetOutputStructure() {
  auto structure = MetaStruct::New("CoalesceParams");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("RX microseconds", MetaString::New());
  structure->SetField("RX maximum frames", MetaString::New());
  structure->SetField("TX microseconds", MetaString::New());
  structure->SetField("TX Maximum frames", MetaString::New());
  structure->SetField("Adaptive RX", MetaString::New());
  structure->SetField("Adaptive TX", MetaString::New());
  structure->SetField("Sample interval seconds", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicCoalesceGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic coalesce set

CORVEX_DEFINE_NEW(NicCoalesceSet)

NicCoalesceSet::NicCoalesceSet() {
  SetDescription("Set coalesce parameters on a nic");
}

CORVEX_PENDING_OPERATIONS(NicCoalesceSet)

std::shared_ptr<OutputSpec> NicCoalesceSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic coalesce high get

CORVEX_DEFINE_NEW(NicCoalesceHighGet)

NicCoalesceHighGet::NicCoalesceHighGet() {
  SetDescription("Get information about the behavior of a NIC when it sends or receives packets at "
                 "high packet rate.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter(
      "fields:CoalesceParamsAtHighPacketRate",
      "NIC,Packet rate,RX delay time,RX delay packets,TX delay time,TX delay packets");
  SetDefaultOutputParameter("units:CoalesceParamsAtHighPacketRate.Packet rate", "pps");
  SetDefaultOutputParameter("units:CoalesceParamsAtHighPacketRate.RX delay time", "microsecond");
  SetDefaultOutputParameter("units:CoalesceParamsAtHighPacketRate.TX delay time", "microsecond");
}

CORVEX_PENDING_OPERATIONS(NicCoalesceHighGet)

std::shared_ptr<MetaStruct> NicCoalesceHighGet::GetOutputStructure() {
  auto structure = MetaStruct::New("CoalesceParamsAtHighPacketRate");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("Packet rate", MetaInt::New());
  structure->SetField("RX delay time", MetaInt::New());
  structure->SetField("RX delay packets", MetaInt::New());
  structure->SetField("TX delay time", MetaInt::New());
  structure->SetField("TX delay packets", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicCoalesceHighGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network nic coalesce high set

CORVEX_DEFINE_NEW(NicCoalesceHighSet)

NicCoalesceHighSet::NicCoalesceHighSet() {
  SetDescription("Set parameters to control the behavior of a NIC when it sends or receives "
                 "packets at high packet rate.");
}

CORVEX_PENDING_OPERATIONS(NicCoalesceHighSet)

std::shared_ptr<OutputSpec> NicCoalesceHighSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic coalesce low get

CORVEX_DEFINE_NEW(NicCoalesceLowGet)

NicCoalesceLowGet::NicCoalesceLowGet() {
  SetDescription("Get information about the behavior of a NIC when it sends or receives packets at "
                 "low packet rate.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter(
      "fields:CoalesceParamsAtLowPacketRate",
      "NIC,Packet rate,RX delay time,RX delay packets,TX delay time,TX delay packets");
  SetDefaultOutputParameter("units:CoalesceParamsAtLowPacketRate.Packet rate", "pps");
  SetDefaultOutputParameter("units:CoalesceParamsAtLowPacketRate.RX delay time", "microsecond");
  SetDefaultOutputParameter("units:CoalesceParamsAtLowPacketRate.TX delay time", "microsecond");
}

CORVEX_PENDING_OPERATIONS(NicCoalesceLowGet)

std::shared_ptr<MetaStruct> NicCoalesceLowGet::GetOutputStructure() {
  auto structure = MetaStruct::New("CoalesceParamsAtLowPacketRate");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("Packet rate", MetaInt::New());
  structure->SetField("RX delay time", MetaInt::New());
  structure->SetField("RX delay packets", MetaInt::New());
  structure->SetField("TX delay time", MetaInt::New());
  structure->SetField("TX delay packets", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicCoalesceLowGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network nic coalesce low set

CORVEX_DEFINE_NEW(NicCoalesceLowSet)

NicCoalesceLowSet::NicCoalesceLowSet() {
  SetDescription("Set parameters to control the behavior of a NIC when it sends or receives "
                 "packets at low packet rate.");
}

CORVEX_PENDING_OPERATIONS(NicCoalesceLowSet)

std::shared_ptr<OutputSpec> NicCoalesceLowSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
