//===- Netqueue.cpp - Interim NetQueue commands ---------------------------===//
//
// Interim definitions of the commands of the Netqueue family: NetQueue count,
// filter classes and load balancer. Each command is a complete node of the
// tree, with its description, default output settings and result schema, but
// running it only reports that it is not available yet. src/nic/Netqueue.cpp
// replaces this file.
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

// network nic queue count get

CORVEX_DEFINE_NEW(NicQueueCountGet)

NicQueueCountGet::NicQueueCountGet() {
  SetDescription("Get netqueue count on a nic");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:NetqueueCount", "NIC,Tx netqueue count,Rx netqueue count");
}

CORVEX_PENDING_OPERATIONS(NicQueueCountGet)

std::shared_ptr<MetaStruct> NicQueueCountGet::GetOutputStructure() {
  auto structure = MetaStruct::New("NetqueueCount");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("Tx netqueue count", MetaInt::New());
  structure->SetField("Rx netqueue count", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicQueueCountGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic queue count set

CORVEX_DEFINE_NEW(NicQueueCountSet)

NicQueueCountSet::NicQueueCountSet() {
  SetDescription("Set number of netqueues on a nic");
}

CORVEX_PENDING_OPERATIONS(NicQueueCountSet)

std::shared_ptr<OutputSpec> NicQueueCountSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic queue filterclass list

CORVEX_DEFINE_NEW(NicQueueFilterClassList)

NicQueueFilterClassList::NicQueueFilterClassList() {
  SetDescription("List the netqueue supported filterclass of all physical NICs currently installed "
                 "and loaded on the system.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Settings",
                            "NIC,MacOnly,VlanOnly,VlanMac,Vxlan,Geneve,GenericEncap");
}

CORVEX_PENDING_OPERATIONS(NicQueueFilterClassList)

std::shared_ptr<MetaStruct> NicQueueFilterClassList::GetOutputStructure() {
  auto structure = MetaStruct::New("Settings");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("MacOnly", MetaBool::New());
  structure->SetField("VlanOnly", MetaBool::New());
  structure->SetField("VlanMac", MetaBool::New());
  structure->SetField("Vxlan", MetaBool::New());
  structure->SetField("Geneve", MetaBool::New());
  structure->SetField("GenericEncap", MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicQueueFilterClassList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic queue loadbalancer list

CORVEX_DEFINE_NEW(NicQueueLbSettingList)

NicQueueLbSettingList::NicQueueLbSettingList() {
  SetDescription("List the load balancer settings of all the installed and loaded physical NICs. "
                 "(S:supported, U:unsupported, N:not-applicable, A:allowed, D:disallowed).");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Settings",
                            "NIC,RxQPair,RxQNoFeature,PreEmptibleQ,RxQLatency,RxDynamicLB,"
                            "DynamicQPool,MacLearnLB,RSS,LRO,GeneveOAM,RSSLRO");
}

CORVEX_PENDING_OPERATIONS(NicQueueLbSettingList)

std::shared_ptr<MetaStruct> NicQueueLbSettingList::GetOutputStructure() {
  auto structure = MetaStruct::New("Settings");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("RxQPair", MetaString::New());
  structure->SetField("RxQNoFeature", MetaString::New());
  structure->SetField("PreEmptibleQ", MetaString::New());
  structure->SetField("RxQLatency", MetaString::New());
  structure->SetField("RxDynamicLB", MetaString::New());
  structure->SetField("DynamicQPool", MetaString::New());
  structure->SetField("MacLearnLB", MetaString::New());
  structure->SetField("RSS", MetaString::New());
  structure->SetField("LRO", MetaString::New());
  structure->SetField("GeneveOAM", MetaString::New());
  structure->SetField("RSSLRO", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicQueueLbSettingList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic queue loadbalancer set

CORVEX_DEFINE_NEW(NicQueueLbSettingSet)

NicQueueLbSettingSet::NicQueueLbSettingSet() {
  SetDescription("Enable/disable netqueue load balancer setting on a NIC.");
}

CORVEX_PENDING_OPERATIONS(NicQueueLbSettingSet)

std::shared_ptr<OutputSpec> NicQueueLbSettingSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic queue loadbalancer state list

CORVEX_DEFINE_NEW(NicQueueLbStateList)

NicQueueLbStateList::NicQueueLbStateList() {
  SetDescription(
      "Netqueue balancer state of all physical NICs currently installed and loaded on the system");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:NetqBalState", "NIC,Enabled");
}

CORVEX_PENDING_OPERATIONS(NicQueueLbStateList)

std::shared_ptr<MetaStruct> NicQueueLbStateList::GetOutputStructure() {
  auto structure = MetaStruct::New("NetqBalState");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("Enabled", MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicQueueLbStateList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic queue loadbalancer state set

CORVEX_DEFINE_NEW(NicQueueLbStateSet)

NicQueueLbStateSet::NicQueueLbStateSet() {
  SetDescription("Enable/disable netqueue balancer on a NIC");
}

CORVEX_PENDING_OPERATIONS(NicQueueLbStateSet)

std::shared_ptr<OutputSpec> NicQueueLbStateSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network nic queue loadbalancer plugin list

CORVEX_DEFINE_NEW(NicQueueLbPluginList)

NicQueueLbPluginList::NicQueueLbPluginList() {
  SetDescription("Details of netqueue balancer plugins on all physical NICs currently installed "
                 "and loaded on the system");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:NetqBalPlugin",
                            "NIC,Module Name,Plugin Name,Enabled,Description");
  SetDefaultOutputParameter("wrap-last", "true");
}

CORVEX_PENDING_OPERATIONS(NicQueueLbPluginList)

std::shared_ptr<MetaStruct> NicQueueLbPluginList::GetOutputStructure() {
  auto structure = MetaStruct::New("NetqBalPlugin");
  structure->SetField("NIC", MetaString::New());
  structure->SetField("Module Name", MetaString::New());
  structure->SetField("Plugin Name", MetaString::New());
  structure->SetField("Enabled", MetaBool::New());
  structure->SetField("Description", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicQueueLbPluginList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network nic queue loadbalancer plugin set

CORVEX_DEFINE_NEW(NicQueueLbPluginSet)

NicQueueLbPluginSet::NicQueueLbPluginSet() {
  SetDescription("Enable/disable netqueue balancer plugin on a NIC");
}

CORVEX_PENDING_OPERATIONS(NicQueueLbPluginSet)

std::shared_ptr<OutputSpec> NicQueueLbPluginSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
