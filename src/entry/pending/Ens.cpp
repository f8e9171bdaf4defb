//===- Ens.cpp - Interim fast-path core commands --------------------------===//
//
// Interim definitions of the commands of the Ens family: Fast-path logical
// cores. Each command is a complete node of the tree, with its description,
// default output settings and result schema, but running it only reports that
// it is not available yet. src/datapath/Ens.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "datapath.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network ens maxLcores get

CORVEX_DEFINE_MAKE_SHARED(EnsMaxlcoresGet)

EnsMaxlcoresGet::EnsMaxlcoresGet() {
  SetDescription("Get the maximum number of ENS contexts (lcores).");
  SetDefaultOutputFormatter("simple");
}

CORVEX_PENDING_OPERATIONS(EnsMaxlcoresGet)

std::shared_ptr<OutputSpec> EnsMaxlcoresGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaInt::New());
  return spec;
}

// network ens maxLcores set

CORVEX_DEFINE_MAKE_SHARED(EnsMaxlcoresSet)

EnsMaxlcoresSet::EnsMaxlcoresSet() {
  SetDescription("Set the maximum number of ENS contexts.");
}

CORVEX_PENDING_OPERATIONS(EnsMaxlcoresSet)

std::shared_ptr<OutputSpec> EnsMaxlcoresSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ens lcore add

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreAdd)

EnsLcoreAdd::EnsLcoreAdd() {
  SetDescription("Create ENS context.");
}

CORVEX_PENDING_OPERATIONS(EnsLcoreAdd)

std::shared_ptr<OutputSpec> EnsLcoreAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ens lcore remove

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreRemove)

EnsLcoreRemove::EnsLcoreRemove() {
  SetDescription("Destroy ENS context.");
}

CORVEX_PENDING_OPERATIONS(EnsLcoreRemove)

std::shared_ptr<OutputSpec> EnsLcoreRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ens lcore list

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreList)

EnsLcoreList::EnsLcoreList() {
  SetDescription("List ENS contexts.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Ens", "Lcore ID,Switch,Affinity");
}

CORVEX_PENDING_OPERATIONS(EnsLcoreList)

std::shared_ptr<MetaStruct> EnsLcoreList::GetOutputStructure() {
  auto structure = MetaStruct::New("Ens");
  structure->SetField("Lcore ID", MetaInt::New());
  structure->SetField("Switch", MetaString::New());
  structure->SetField("Affinity", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> EnsLcoreList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ens lcore switch get

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreSwitchGet)

EnsLcoreSwitchGet::EnsLcoreSwitchGet() {
  SetDescription("Get the switch associated with given ENS context.");
  SetDefaultOutputFormatter("simple");
}

CORVEX_PENDING_OPERATIONS(EnsLcoreSwitchGet)

std::shared_ptr<OutputSpec> EnsLcoreSwitchGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaString::New());
  return spec;
}

// network ens lcore switch add

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreSwitchAdd)

EnsLcoreSwitchAdd::EnsLcoreSwitchAdd() {
  SetDescription("Associate given ENS context with given switch.");
}

CORVEX_PENDING_OPERATIONS(EnsLcoreSwitchAdd)

std::shared_ptr<OutputSpec> EnsLcoreSwitchAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ens lcore switch remove

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreSwitchRemove)

EnsLcoreSwitchRemove::EnsLcoreSwitchRemove() {
  SetDescription("Disassociate given ENS context from virtual switch.");
}

CORVEX_PENDING_OPERATIONS(EnsLcoreSwitchRemove)

std::shared_ptr<OutputSpec> EnsLcoreSwitchRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ens lcore affinity get

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreAffinityGet)

EnsLcoreAffinityGet::EnsLcoreAffinityGet() {
  SetDescription("Get the affinity for given ENS context.");
  SetDefaultOutputFormatter("simple");
}

CORVEX_PENDING_OPERATIONS(EnsLcoreAffinityGet)

std::shared_ptr<OutputSpec> EnsLcoreAffinityGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaInt::New());
  return spec;
}

// network ens lcore affinity set

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreAffinitySet)

EnsLcoreAffinitySet::EnsLcoreAffinitySet() {
  SetDescription("Set affinity for given ENS context.");
}

CORVEX_PENDING_OPERATIONS(EnsLcoreAffinitySet)

std::shared_ptr<OutputSpec> EnsLcoreAffinitySet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
